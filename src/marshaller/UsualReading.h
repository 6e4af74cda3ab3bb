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

#include <QXXMLMarshalling/model/Class.h>

#include "marshaller/UsualElement.h"
#include "plan/ClassPlan.h"

#include <forward_list>
#include <vector>

namespace qx::detail {

class Unmarshalling;

class UsualReading {
public:
    using ErrorSlot = Ref<Error>*;
    using Number = IndexedXML::Number;

    explicit UsualReading(Unmarshalling& reading) noexcept : _reading(reading) {}

    // An element that has the form of the class, with what is kept of it.
    struct Source {
        const ClassPlan& plan;
        const UsualElement& element;
        Number number;
        IndexedXML::Nodes nodes;
    };
    // As Unmarshalling::readFields. Of a reading with a trace the second.
    bool readFields(const Source& source, Object& object, ErrorSlot error);
    bool readFieldsTraced(const Source& source, Object& object, ErrorSlot error);

private:
    // How the fields of a form are set in objects of one class.
    struct Setter {
        const Property* property; // null where the class has none
        const Class* placed;      // of the structs that are made in the property; null where boxed
    };
    struct Setters {
        const Class* type = nullptr;
        bool usesProperties = false; // while nobody observes the object
        bool appends = false;        // to the contents of a record that nobody has heard of
        std::vector<Setter> slots;
    };
    template <class Tracing>
    class Binding;

    const Setters& settersOf(const ClassPlan& plan, const Object& object);
    const Setters& lookUp(const ClassPlan& plan, const Object& object);
    const Class* placedClass(const UsualForm::Slot& slot, const Property* property) const;

    Unmarshalling& _reading;
    std::forward_list<Setters> _setters; // which stay where they are
    std::vector<const Setters*> _latest; // by plan index
};

} // namespace qx::detail
