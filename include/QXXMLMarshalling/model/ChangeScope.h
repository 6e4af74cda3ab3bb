#pragma once

// Announcing a change of an object's value that is made in plain C++, so that its observers hear of
// it:
//
//     {
//         const qx::ChangeScope scope(order, "total");
//         order.addLine(line);
//     }
//
// Who hears of it, and what they are told, is in Observation.h.

#include <QXXMLMarshalling/model/Value.h>

#include <vector>

namespace qx {

// What happened to a value: the whole of it was set, or items of a collection came, went or
// changed.
enum class ChangeKind : std::uint8_t { setting = 1, insertion, removal, replacement };

// Announces a change that is made in its scope. The observed object must outlive it.
class QX_API ChangeScope {
public:
    [[nodiscard]] ChangeScope(Object& object, Key key);
    // Items inserted into, removed from or replaced in the collection under the key.
    [[nodiscard]] ChangeScope(Object& object, Key key, ChangeKind kind,
                              std::vector<std::size_t> indexes);
    // What observers throw comes out, unless another exception is on its way already.
    ~ChangeScope() noexcept(false);
    ChangeScope(const ChangeScope&) = delete;
    ChangeScope& operator=(const ChangeScope&) = delete;

private:
    void announceEnd();

    Object& _object;
    Key _key;
    ChangeKind _kind = ChangeKind::setting;
    std::vector<std::size_t> _indexes;
    int _exceptions;
};

} // namespace qx
