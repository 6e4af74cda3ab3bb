#pragma once

// The errors of one call, where the host wants to hear of more than the first. They stand here and
// not in the caller's slot until the call ends: steps look at the slot.

#include <QXXMLMarshalling/QXXMLMarshaller.h>

namespace qx::detail {

class ErrorCollector {
public:
    // Collects nothing for a caller without a slot.
    ErrorCollector(const QXXMLMarshaller& marshaller, const Ref<Error>* slot) noexcept;

    // Takes the error out of the slot, so that the reading may go on without what failed. False,
    // and it stays there, where it is the last one that is wanted.
    bool take(Ref<Error>& slot);
    std::size_t count() const noexcept { return _errors.size(); }
    bool isCollecting() const noexcept { return _most > 1; }
    bool keepsPartial() const noexcept { return _keepsPartial; }
    // Those from `begin` on let go of their document, which goes.
    void settle(std::size_t begin);
    // Leaves the first in the slot, with the others, and what stood there, behind it: in the order
    // of the document. True where there is one.
    bool giveTo(Ref<Error>* slot);

private:
    void sort(std::size_t begin);

    const std::size_t _most;
    const bool _keepsPartial;
    std::vector<Ref<Error>> _errors;
};

} // namespace qx::detail
