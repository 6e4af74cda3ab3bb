#pragma once

// One look-up of a name by a manager: it asks a repository whether it has the name, then for what
// is there. While a look-up lives, a repository may leave the path that the first step found for
// the second, which then needs no search of its own. Nothing is kept beyond the look-up, since
// files come and go. Each thread has look-ups of its own, and they nest.

#include <QXXMLMarshalling/QXXMLDataRepository.h>

namespace qx::detail {

class NameLookUp {
public:
    NameLookUp() noexcept;
    ~NameLookUp();
    NameLookUp(const NameLookUp&) = delete;
    NameLookUp& operator=(const NameLookUp&) = delete;

    // Outside a look-up nothing happens.
    static void leave(const QXXMLDataRepository& repository, const String& name,
                      const String& path);
    // What that repository left for the name, once; else null.
    static String take(const QXXMLDataRepository& repository, const String& name);

private:
    NameLookUp* const _outer;
    const QXXMLDataRepository* _repository = nullptr;
    String _name;
    String _path;
};

} // namespace qx::detail
