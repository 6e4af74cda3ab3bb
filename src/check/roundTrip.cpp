// What is written other than it was read, and what is lost between: docs/round-trip.md shows each
// case.

#include <QXXMLMarshalling/model/Class.h>

#include "check/ClassFields.h"
#include "check/Rules.h"
#include "xml/XMLCharacters.h"

#include <algorithm>
#include <unordered_set>

namespace qx::detail {

namespace {

String typeOf(const ClassPlan& type) {
    return String::concat({"type=\"", type.className.view(), "\""});
}

// One class with its ancestors; what is found is told of its own fields.
class RoundTripCheck {
public:
    RoundTripCheck(MappingCheck& check, const ClassPlan& type)
        : _check(check), _type(type), _fields(fieldsAsRead(type)) {
        const Class* const described = Class::named(type.classNameToInstantiate.view());
        _keepsZero = described != nullptr && described->isStruct();
        _takesAny = !addTakenChildren(_fields, _taken);
        constexpr std::size_t enough = 2; // to find one beside a given one
        for (const auto& [owner, field] : _fields) {
            _takers += takesChildren(*field) ? 1 : 0;
            if (_mapped.size() < enough && takesMappedChildren(*field))
                _mapped.push_back(field);
        }
    }

    void run() {
        for (const FieldPlan& field : _type.fields) {
            if (field.isCollection())
                checkCollection(field);
            else if (!field.bindings.empty() || field.kind != BindingKind::attribute)
                checkSingle(field);
        }
        checkTexts();
    }

private:
    void checkSingle(const FieldPlan& field);
    void checkAttribute(const FieldPlan& field);
    void checkElement(const FieldPlan& field);
    void checkFlattened(const FieldPlan& field);
    void checkCollection(const FieldPlan& field);
    void checkUntyped(const FieldPlan& field);
    void checkTexts();

    // Another field that takes children that a class maps to; null where there is none.
    const FieldPlan* otherMapped(const FieldPlan& than) const {
        for (const FieldPlan* field : _mapped)
            if (field != &than)
                return field;
        return nullptr;
    }
    static Subject of(const FieldPlan& field) {
        return field.bindings.empty()
                   ? Subject::of(*field.mapping)
                   : Subject::of(*field.mapping, *field.mapping->bindToMappings().front());
    }

    MappingCheck& _check;
    const ClassPlan& _type;
    const std::vector<ClassField> _fields;
    bool _keepsZero;
    // Of all fields: the names of children that are taken, how many fields take some, and the first
    // of those that take children which a class maps to.
    std::unordered_set<String> _taken;
    bool _takesAny;
    std::size_t _takers = 0;
    std::vector<const FieldPlan*> _mapped;
};

void RoundTripCheck::checkSingle(const FieldPlan& field) {
    switch (field.kind) {
    case BindingKind::attribute:
        return checkAttribute(field);
    case BindingKind::text:
        if (!field.bindTo().isEmpty())
            _check.suggest("node=\"element\"", findings::textOfChild, of(field), field.bindTo());
        return;
    case BindingKind::element:
        return checkElement(field);
    case BindingKind::flattened:
        return checkFlattened(field);
    case BindingKind::automatic:
        return;
    }
}

void RoundTripCheck::checkAttribute(const FieldPlan& field) {
    const String& location = field.location();
    if (isXMLName(location) && !_takesAny && !_taken.contains(location))
        _check.add(findings::locationKept, of(field), location);
    const bool isNumber = field.valueType == ValueType::integer;
    if ((isNumber || field.valueType == ValueType::boolean) && !field.isRequired && !_keepsZero)
        _check.add(findings::zeroLeftOut, of(field), isNumber ? "0" : "false");
}

void RoundTripCheck::checkElement(const FieldPlan& field) {
    const bool hasClass =
        std::any_of(field.bindings.begin(), field.bindings.end(),
                    [](const BindingPlan& binding) { return binding.classOfName != nullptr; });
    if (field.typeClass == nullptr && (field.hasSimpleType() || !hasClass))
        _check.add(findings::onlyText, of(field), field.xmlName());
}

void RoundTripCheck::checkFlattened(const FieldPlan& field) {
    if (field.typeClass != nullptr && _takers > 1)
        _check.add(findings::flattenedKeeps, of(field));
}

void RoundTripCheck::checkCollection(const FieldPlan& field) {
    if (field.collection == CollectionKind::unknown)
        return;
    if (!field.hasType())
        return checkUntyped(field);
    if (!field.location().isEmpty())
        _check.add(findings::onlyItems, of(field), field.location());
}

void RoundTripCheck::checkUntyped(const FieldPlan& field) {
    const FieldPlan* const taken = otherMapped(field);
    if (field.bindTo().isEmpty()) {
        if (taken != nullptr)
            _check.add(findings::takesChildrenOf, of(field), taken->key.string());
        return;
    }
    if (field.bindings.front().classOfBindTo != nullptr)
        return _check.suggest(typeOf(*field.bindings.front().classOfBindTo), findings::itemsKept,
                              of(field));
    if (taken != nullptr)
        _check.add(findings::wrapperMayLackOthers, of(field), field.bindTo(), taken->key.string());
    else
        _check.add(findings::wrapperMayLack, of(field), field.bindTo());
    _check.add(findings::onlyItems, of(field), field.bindTo());
}

// The text of an element replaces the children that are there when it is written, and holds their
// texts when it is read.
void RoundTripCheck::checkTexts() {
    const auto written = fieldsAsWritten(_type);
    const FieldPlan* children = nullptr;
    const FieldPlan* text = nullptr;
    for (const auto& [owner, field] : written) {
        const bool isText = field->kind == BindingKind::text && !field->isCollection();
        const bool isTold = owner == &_type;
        if (isText && children != nullptr && isTold)
            _check.add(findings::textReplaces, of(*field), children->key.string());
        if (!isText && writesChildren(*field)) {
            if (text != nullptr && isTold)
                _check.add(findings::textHoldsChildren, of(*text), field->key.string());
            children = field;
            text = nullptr;
        }
        if (isText && field->bindTo().isEmpty() && children == nullptr)
            text = field;
    }
}

// Classes that stand for the elements of a field by its type: they need no name of their own.
std::unordered_set<const ClassPlan*> typedClasses(const MappingCheck& check) {
    std::unordered_set<const ClassPlan*> classes;
    for (const ClassPlan* type : check.classes()) {
        if (type->parent != nullptr)
            classes.insert(type->parent);
        for (const FieldPlan& field : type->fields)
            if (field.typeClass != nullptr)
                classes.insert(field.typeClass);
    }
    return classes;
}

void checkElementName(MappingCheck& check, const ClassPlan& type) {
    const String& name = type.mapping->className();
    const String read = MappingPlan::elementNameOf(*type.mapping);
    if (type.elementName.isEmpty() && read != name)
        check.add(findings::classNotReadBack, Subject::of(*type.mapping), name, read);
}

} // namespace

void checkRoundTrip(MappingCheck& check) {
    const auto typed = typedClasses(check);
    for (const ClassPlan* type : check.classes()) {
        if (!typed.contains(type))
            checkElementName(check, *type);
        RoundTripCheck(check, *type).run();
    }
}

} // namespace qx::detail
