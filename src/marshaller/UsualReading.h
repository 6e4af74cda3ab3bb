#pragma once

// Elements of their class's usual form (UsualElement.h) are bound straight: what is found for each
// field is set, in the order of the fields. What has another form, or is read with reports or
// prefixes of the host's, goes the general way (Unmarshalling::readFields) before anything was
// made of it; so do elements with items of their own where errors have no slot. Both come to the
// same objects and errors, and tell a trace the same; the code is compiled apart for readings that
// have none.
//
// Records that nobody can have heard of get their values appended; objects whose class sets values
// as Object does get them by the property; structs in members of structs are made there.
//
// Without it, reading takes so many times as long (bench/orders_bench.cpp, read): records 1.3,
// structs 1.6, host classes 1.3.

#include "marshaller/UsualElement.h"
#include "plan/ClassPlan.h"

namespace qx::detail {

class Unmarshalling;

class UsualReading {
public:
    using ErrorSlot = Ref<Error>*;
    using Number = IndexedXML::Number;

    // An element that has the form of the class, with what is kept of it.
    struct Source {
        const ClassPlan& plan;
        const UsualElement& element;
        Number number;
        IndexedXML::Nodes nodes;
    };
    // As Unmarshalling::readFields. Of a reading with a trace the second.
    static bool readFields(Unmarshalling& reading, const Source& source, Object& object,
                           ErrorSlot error);
    static bool readFieldsTraced(Unmarshalling& reading, const Source& source, Object& object,
                                 ErrorSlot error);

private:
    template <class Tracing>
    class Binding;
};

} // namespace qx::detail
