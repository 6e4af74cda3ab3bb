#include <QXXMLMarshalling/model/Null.h>

#include "model/LibraryClass.h"

#include <array>
#include <new>

namespace qx {

// Never destroyed, and built in place so that it does not count as a leak.
Null* Null::marker() {
    alignas(Null) static std::array<std::byte, sizeof(Null)> place;
    static Null* const shared = new (place.data()) Null;
    return shared;
}

String Null::description() const { return "<null>"; }

const Class& Null::describedClass() const { return libraryClass<Null>("qx::Null"); }

} // namespace qx
