#pragma once

// Descriptions of the library's own classes: known by their C++ type only, so that no mapping can
// create one of them by its name.

#include <QXXMLMarshalling/platform/Class.h>

namespace qx {

template <class T, class Base = Object>
const Class& libraryClass(const char* name, std::vector<Property> properties = {}) {
    // A pointer: compilers take a reference that a call with temporaries gave for one to those.
    static const Class* const described = &Class::publish({.name = name,
                                                           .type = &typeid(T),
                                                           .superclass = &typeid(Base),
                                                           .properties = std::move(properties)},
                                                          false);
    return *described;
}

} // namespace qx
