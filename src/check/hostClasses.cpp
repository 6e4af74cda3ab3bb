// The classes that the program has described, beside those of the mapping. A class that it has not
// described is read into records, which take any key.

#include <QXXMLMarshalling/QXGenericRecord.h>
#include <QXXMLMarshalling/model/Array.h>
#include <QXXMLMarshalling/model/Class.h>

#include "check/ClassFields.h"
#include "check/Rules.h"

#include <QXXMLMarshalling/detail/TakenObjects.h>
#include <QXXMLMarshalling/detail/TakenTexts.h>

namespace qx::detail {

namespace {

std::vector<std::string_view> keysOf(const Class& type) {
    std::vector<std::string_view> keys;
    for (const Class* at = &type; at != nullptr; at = at->superclass())
        for (const Property& property : at->ownProperties())
            keys.push_back(property.key.view());
    return keys;
}

// Some value of the kind that reading would set; a null one where texts are taken as they come.
Value exampleOf(const FieldPlan& field) {
    if (field.typeClass != nullptr || field.valueType == ValueType::other)
        return {};
    switch (field.valueType) {
    case ValueType::boolean:
        return true;
    case ValueType::integer:
        return 1;
    default:
        return field.hasType() ? Value("1") : Value();
    }
}

class HostClassCheck {
public:
    HostClassCheck(MappingCheck& check, const Class& type) : _check(check), _type(type) {}

    void checkField(const FieldPlan& field) {
        const Subject subject = Subject::of(*field.mapping);
        const Property* const property = _type.property(field.key);
        if (property == nullptr)
            return _check.suggest(_check.nearest(field.key.view(), keysOf(_type)),
                                  _type.isStruct() ? findings::noSuchProperty
                                                   : findings::perhapsNoProperty,
                                  subject, _type.name(), field.key.string());
        if (property->set == nullptr)
            return _check.add(findings::notSettable, subject, field.key.string(), _type.name());
        if (field.typeClass != nullptr)
            checkObject(field, *property, subject);
        else if (_type.isStruct())
            checkValue(field, *property, subject);
    }

private:
    void checkObject(const FieldPlan& field, const Property& property, const Subject& subject);
    void checkFirstValue(const Property& property, Object& object, const Subject& subject);
    void checkValue(const FieldPlan& field, const Property& property, const Subject& subject);

    MappingCheck& _check;
    const Class& _type;
};

// An object of the field's class, as a reading would make it, is offered to the rule of the
// property's type. Nothing is set.
void HostClassCheck::checkObject(const FieldPlan& field, const Property& property,
                                 const Subject& subject) {
    if (property.objects == nullptr)
        return;
    const Class* const described = Class::named(field.typeClass->classNameToInstantiate.view());
    if (described != nullptr && !described->isStruct())
        return; // objects of the program's own are not made without need
    const Ref<Object> object =
        described != nullptr ? described->create() : QXGenericRecord::classObject().create();
    if (!object)
        return;
    Value value = object;
    if (field.isCollection())
        value = make<Array>(std::vector<Value>{value});
    if (!property.objects->firstRefused(value).isNull())
        _check.add(findings::objectNotTaken, subject, field.key.string(), _type.name(),
                   field.typeClass->className.string(), property.objects->names());
}

// A struct of its own is made and thrown away: that calls nothing of the program's but its
// constructor and its conversions.
void HostClassCheck::checkValue(const FieldPlan& field, const Property& property,
                                const Subject& subject) {
    const Ref<Object> object = _type.create();
    if (object && property.get != nullptr && property.texts != nullptr)
        checkFirstValue(property, *object, subject);
    Value value = exampleOf(field);
    if (field.isCollection())
        value = make<Array>(value.isNull() ? std::vector<Value>{} : std::vector<Value>{value});
    if (value.isNull())
        return;
    if (object && !property.set(property, *object, value))
        _check.add(findings::valueNotTaken, subject, field.key.string(), _type.name());
}

// A named enumeration gives a number where the value has no name.
void HostClassCheck::checkFirstValue(const Property& property, Object& object,
                                     const Subject& subject) {
    if (property.texts().words.empty())
        return;
    const Value first = property.get(property, object);
    if (first.kind() == Value::Kind::integer)
        _check.add(findings::valueWithoutName, subject, property.key.string(), _type.name(), first);
}

} // namespace

void checkHostClasses(MappingCheck& check) {
    for (const ClassPlan* type : check.classes()) {
        const Class* const described = Class::named(type->classNameToInstantiate.view());
        if (described == nullptr || described->isSubclassOf(QXGenericRecord::classObject()))
            continue;
        HostClassCheck ofClass(check, *described);
        for (const ClassField& field : fieldsAsRead(*type))
            ofClass.checkField(*field.field);
    }
}

} // namespace qx::detail
