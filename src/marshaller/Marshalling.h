#pragma once

// One call of the marshaller: objects become elements, driven by the mapping's plan. How a field is
// written is told by its kind of binding (FieldBinding.h). It holds the marshaller, which a getter
// of the host's may let go of.

#include <QXXMLMarshalling/QXXMLMarshaller.h>

#include "marshaller/LastChildByName.h"
#include "marshaller/ObjectAccess.h"
#include "marshaller/OutputNames.h"
#include "plan/MappingPlan.h"

namespace qx::detail {

class Marshalling {
public:
    using ErrorSlot = Ref<Error>*;

    explicit Marshalling(const QXXMLMarshaller& marshaller);
    // What is made goes into this element.
    Marshalling(const QXXMLMarshaller& marshaller, const XMLElement& inside);

    Ref<XMLElement> marshallObject(const Value& object, ErrorSlot error);
    // `name` is the element's; an empty one gives the class's name as written.
    Ref<XMLElement> element(const ClassPlan& plan, const String& name, const Value& object,
                            ErrorSlot error);
    // The same, if only the children of it will be taken, into an element that is being written.
    Ref<XMLElement> shell(const ClassPlan& plan, XMLElement& target, const Value& object,
                          ErrorSlot error);
    // The fields of the class and its ancestors, with what was kept when the object was read.
    bool writeFields(const ClassPlan& plan, XMLElement& element, Object& object, ErrorSlot error);
    bool writeField(const FieldPlan& field, XMLElement& element, Object& object, ErrorSlot error);

    // What the kinds of binding ask for.
    //
    // The class that the mapping has for the value; null for strings and numbers.
    const ClassPlan* classOf(const Value& value) const;
    // While it lives, an element is open that declares this: what is made is made inside it.
    class Opened {
    public:
        explicit Opened(Marshalling& writing,
                        const std::vector<OutputNames::Declaration>& declarations = {})
            : _names(writing._names.get()) {
            if (_names != nullptr)
                _names->enter(declarations);
        }
        ~Opened() {
            if (_names != nullptr)
                _names->leave();
        }
        Opened(const Opened&) = delete;
        Opened& operator=(const Opened&) = delete;

    private:
        OutputNames* const _names;
    };
    // What an object's element will declare of what was read; nothing where that does not matter
    // for names.
    std::vector<OutputNames::Declaration> keptDeclarations(const Object& object);
    // The element that is open; names are those of the mapping.
    Ref<XMLElement> newElement(const String& name, std::size_t attributes);
    Ref<XMLElement> textElement(const String& name, const String& text);
    // To the element that is open, or to a child of it.
    void addAttribute(XMLElement& element, const String& name, const String& text);
    // Null when no child has that name.
    XMLElement* lastChildNamed(const XMLElement& element, const String& name);
    // Whether an item of a collection is written (ObjectAccess.h).
    bool isToBeWritten(const Value& item);
    // Whether the field that is being written is left out as an attribute: nothing requires it, and
    // it is empty or zero. Numbers are cut to integers first.
    bool isLeftOut(const FieldPlan& field, const Value& value, const String& text) const noexcept {
        return _omitsZero && !field.isRequired &&
               ((value.isNumber() && value.intValue() == 0) || text.isEmpty());
    }

private:
    bool writeOwnFields(const ClassPlan& plan, XMLElement& element, Object& object,
                        ErrorSlot error);
    // The same, or else what its class declares.
    std::vector<OutputNames::Declaration> declarationsOf(const ClassPlan& plan,
                                                         const Object& object);
    void restoreUnknownXML(XMLElement& element, const Object& object);
    void restoreNamespaces(XMLElement& element, const Object& object);

    const qx::Ref<const QXXMLMarshaller> _marshaller;
    const MappingPlan& _plan;
    ObjectAccess _access;
    std::unique_ptr<OutputNames> _names; // null: names are written as the mapping has them
    std::size_t _depth = 0;
    bool _omitsZero = true; // of the field that is being written
    // Of the elements in which names were looked up among many children.
    std::unordered_map<const XMLElement*, LastChildByName> _lastChildren;
};

} // namespace qx::detail
