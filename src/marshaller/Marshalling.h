#pragma once

// One call of the marshaller: objects become elements, driven by the mapping's plan. How a field is
// written is told by its kind of binding (FieldBinding.h). It holds the marshaller, which a getter
// of the host's may let go of.

#include <QXXMLMarshalling/QXXMLMarshaller.h>

#include "marshaller/ClassUses.h"
#include "marshaller/KeptPlacing.h"
#include "marshaller/ObjectAccess.h"
#include "marshaller/OutputNames.h"
#include "marshaller/Reporting.h"
#include "marshaller/WritingTrace.h"
#include "plan/MappingPlan.h"

namespace qx::detail {

class Marshalling {
public:
    using ErrorSlot = Ref<Error>*;

    // Writes into the draft, into nodes where there is none.
    explicit Marshalling(const QXXMLMarshaller& marshaller, XMLDraft* draft = nullptr);
    // Tells the trace, which outlives the call, and writes what that says; into a draft.
    Marshalling(const QXXMLMarshaller& marshaller, XMLDraft& draft, WritingTrace& trace);
    // Writes nodes that go into this element.
    Marshalling(const QXXMLMarshaller& marshaller, const XMLElement& inside);

    WrittenElement marshallObject(const Value& object, ErrorSlot error);
    // `name` is the element's; an empty one gives the class's name as written.
    WrittenElement element(const ClassPlan& plan, const String& name, const Value& object,
                           ErrorSlot error);
    // The same, if only the children of it will be taken, into an element that is being written.
    WrittenElement shell(const ClassPlan& plan, const WrittenElement& target, const Value& object,
                         ErrorSlot error);
    // The fields of the class and its ancestors, with what was kept when the object was read, into
    // an element that is the object's own; then into one of another object.
    [[gnu::always_inline]] bool writeObject(const ClassPlan& plan, const WrittenElement& element,
                                            Object& object, ErrorSlot error) {
        return _keepsExactly && _trace == nullptr ? writeObjectExactly(plan, element, object, error)
                                                  : writeFields(plan, element, object, error);
    }
    bool writeFields(const ClassPlan& plan, const WrittenElement& element, Object& object,
                     ErrorSlot error);
    bool writeField(const FieldPlan& field, const WrittenElement& element, Object& object,
                    ErrorSlot error);

    // What the kinds of binding ask for.
    //
    // The class that the mapping has for the value; null for strings and numbers.
    const ClassPlan* classOf(const Value& value) const;
    ElementWriter& output() noexcept { return _output; }
    // Null where nobody wants one.
    WritingTrace* trace() const noexcept { return _trace; }
    // Null where nothing that is kept has a place of its own.
    KeptPlacing* placing() const noexcept { return _placing; }
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
    // The element that is open. Names are those of the mapping, and last as long as this object.
    WrittenElement newElement(const String& name, std::size_t attributes);
    void addTextElement(const WrittenElement& parent, const String& name, const FieldText& text) {
        if (_trace == nullptr && !_names) [[likely]]
            return _output.addChild(parent, name, text);
        addNamedTextElement(parent, name, text);
    }
    // To the element that is open, or to a child of it.
    void addAttribute(const WrittenElement& element, const String& name, const FieldText& text) {
        if (_trace == nullptr && !_names) [[likely]]
            return _output.addAttribute(element, name, text);
        addNamedAttribute(element, name, text);
    }
    // None when no child has that name.
    WrittenElement lastChildNamed(const WrittenElement& element, const String& name);
    // Hands on what is wrong with that item of a collection; false.
    [[gnu::noinline]] bool failed(const FieldPlan& field, std::size_t item, Ref<Error>& problem,
                                  ErrorSlot error) const;
    // Whether an item of a collection is written (ObjectAccess.h).
    bool isToBeWritten(const Value& item);
    // Whether the field that is being written is left out as an attribute: nothing requires it, and
    // it is empty or zero. Numbers are cut to integers first.
    bool isLeftOut(const FieldPlan& field, const Value& value, const FieldText& text) const {
        const bool isLeft = _omitsZero && !field.isRequired &&
                            ((value.isNumber() && value.intValue() == 0) || text.isEmpty());
        if (isLeft && _trace == nullptr && _reports.isOn())
            _reports.tellOmitted(field);
        return isLeft;
    }

private:
    // Where an object has the value of a field.
    struct ValuePlace {
        const QXGenericRecord* record; // the object, where that is one of no subclass
        const Property* property;      // null where its class has none of that name
        std::size_t next = 0;          // among the contents of a record, if they come in order
    };
    bool writeField(const FieldPlan& field, const WrittenElement& element, Object& object,
                    ValuePlace& place, ErrorSlot error);
    [[gnu::noinline]] static bool failMissing(const FieldPlan& field, const Object& object,
                                              ErrorSlot error);
    [[gnu::noinline]] static bool failNameless(const Object& object, ErrorSlot error);
    // False with an error that knows its place. What fails keeps off the stack of what recurses.
    [[gnu::noinline]] bool failed(const ClassPlan& plan, const ErrorText& text,
                                  const Value& argument, ErrorSlot error) const;
    [[gnu::noinline]] bool failed(const FieldPlan& field, const ClassPlan& plan,
                                  Ref<Error>& problem, ErrorSlot error) const;
    [[gnu::noinline]] bool failTooDeep(const ClassPlan& plan, ErrorSlot error) const;
    [[gnu::noinline]] bool writeWithAncestors(const ClassPlan& plan, const WrittenElement& element,
                                              Object& object, ErrorSlot error);
    bool writeOwnFields(const ClassPlan& plan, const WrittenElement& element, Object& object,
                        ErrorSlot error);
    // The same, or else what its class declares.
    std::vector<OutputNames::Declaration> declarationsOf(const ClassPlan& plan,
                                                         const Object& object);
    void declare(const WrittenElement& element, const OutputNames::Declaration& declaration);
    // With a trace, or where the name is to be found.
    void addNamedTextElement(const WrittenElement& parent, const String& name,
                             const FieldText& text);
    void addNamedAttribute(const WrittenElement& element, const String& name,
                           const FieldText& text);
    // They stand apart, so that a level of nested objects takes less of the stack.
    [[gnu::noinline]] void placeKept(const FieldPlan& field, const WrittenElement& element);
    [[gnu::noinline]] bool writeObjectExactly(const ClassPlan& plan, const WrittenElement& element,
                                              Object& object, ErrorSlot error);
    // The wrapper around a field's items or its attribute, new where there is none.
    WrittenElement wrapperOf(const FieldPlan& field, const WrittenElement& element);
    void restoreXML(const WrittenElement& element, const Object& object);
    void restoreUnknownXML(const WrittenElement& element, const Object& object);
    void restoreNamespaces(const WrittenElement& element, const Object& object);

    const qx::Ref<const QXXMLMarshaller> _marshaller;
    const qx::Ref<const QXXMLMarshallingMapping> _mapping; // of the plan
    const MappingPlan& _plan;
    ObjectAccess _access;
    const std::shared_ptr<ClassUses> _classUses;
    ElementWriter _output;
    WritingTrace* _trace = nullptr;
    const bool _keepsExactly;
    KeptPlacing* _placing = nullptr;     // of the element that is open
    const Object* _placed = nullptr;     // whose kept XML that is
    std::unique_ptr<OutputNames> _names; // null: names are written as the mapping has them
    const Reporting _reports;
    std::size_t _depth = 0;
    bool _omitsZero = true; // of the field that is being written
};

} // namespace qx::detail
