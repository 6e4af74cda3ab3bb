#pragma once

// One call of the marshaller: objects become elements, driven by the mapping's plan. How a field is
// written is told by its kind of binding (FieldBinding.h). It holds the marshaller, which a getter
// of the host's may let go of.

#include <QXXMLMarshalling/QXXMLMarshaller.h>

#include "marshaller/ElementWriter.h"
#include "marshaller/ObjectAccess.h"
#include "plan/MappingPlan.h"

namespace qx::detail {

class Marshalling {
public:
    using ErrorSlot = Ref<Error>*;

    // Writes into the draft, into nodes where there is none.
    explicit Marshalling(const QXXMLMarshaller& marshaller, XMLDraft* draft = nullptr);

    WrittenElement marshallObject(const Value& object, ErrorSlot error);
    // `name` is the element's; an empty one gives the class's name as written.
    WrittenElement element(const ClassPlan& plan, const String& name, const Value& object,
                           ErrorSlot error);
    // The fields of the class and its ancestors, with what was kept when the object was read.
    bool writeFields(const ClassPlan& plan, const WrittenElement& element, Object& object,
                     ErrorSlot error);
    bool writeField(const FieldPlan& field, const WrittenElement& element, Object& object,
                    ErrorSlot error);

    // What the kinds of binding ask for.
    //
    // The class that the mapping has for the value; null for strings and numbers.
    const ClassPlan* classOf(const Value& value) const;
    ElementWriter& output() noexcept { return _output; }
    // Whether an item of a collection is written (ObjectAccess.h).
    bool isToBeWritten(const Value& item);
    // Whether the field that is being written is left out as an attribute: nothing requires it, and
    // it is empty or zero. Numbers are cut to integers first.
    bool isLeftOut(const FieldPlan& field, const Value& value,
                   const FieldText& text) const noexcept {
        return _omitsZero && !field.isRequired &&
               ((value.isNumber() && value.intValue() == 0) || text.isEmpty());
    }

private:
    bool writeOwnFields(const ClassPlan& plan, const WrittenElement& element, Object& object,
                        ErrorSlot error);
    void restoreXML(const WrittenElement& element, const Object& object);
    void restoreUnknownXML(const WrittenElement& element, const Object& object);
    void restoreNamespaces(const WrittenElement& element, const Object& object);

    const qx::Ref<const QXXMLMarshaller> _marshaller;
    const qx::Ref<const QXXMLMarshallingMapping> _mapping; // of the plan
    const MappingPlan& _plan;
    ObjectAccess _access;
    ElementWriter _output;
    std::size_t _depth = 0;
    bool _omitsZero = true; // of the field that is being written
};

} // namespace qx::detail
