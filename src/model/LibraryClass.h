#pragma once

// Descriptions of the library's own classes: known by their C++ type only, so that no mapping can
// create one of them by its name.

#include <QXXMLMarshalling/model/Class.h>

namespace qx {

template <class T, class Base = Object>
const Class& libraryClass(const char* name, std::vector<Property> properties = {}) {
    // A pointer, here and wherever a description is kept: some compilers take a reference that came
    // of a call with temporaries for one to these.
    static const Class* const described = &detail::publish({.name = name,
                                                            .type = &typeid(T),
                                                            .superclass = &typeid(Base),
                                                            .properties = std::move(properties)},
                                                           false);
    return *described;
}

} // namespace qx
