#include "marshaller/Marshalling.h"

#include <QXXMLMarshalling/model/Array.h>
#include <QXXMLMarshalling/model/Class.h>

#include "model/Errors.h"

using qx::Ref;
using qx::String;
using qx::Value;
using qx::XMLElement;
using qx::XMLNode;

namespace {

// A value for which an optional attribute is left out: numbers are cut to integers first.
bool isZeroOrEmpty(const Value& value, const String& text) {
    return (value.isNumber() && value.intValue() == 0) || text.isEmpty();
}

XMLElement& appendNew(XMLElement& parent, const String& name) {
    auto child = XMLElement::initWithName(name);
    XMLElement& appended = *child;
    parent.addChild(std::move(child));
    return appended;
}

} // namespace

String Marshalling::text(const Value& value, ValueType type) {
    if (type == ValueType::boolean)
        return value.boolValue() ? "true" : "false";
    return value.description();
}

bool Marshalling::mapField(const FieldPlan& field, XMLElement& element, qx::Object& object,
                           ErrorSlot error) {
    Value value = ObjectDoor::get(object, field.key);
    if (value.isNull() && field.isContainer) {
        if (!field.isRequired)
            return true;
        if (field.valueType == ValueType::other)
            return qx::fail(error, qx::errors::requiredValueMissing, field.key.string(), &object);
        value = false;
    }
    if (const auto array = value.as<qx::Array>())
        return mapArray(field, element, *array, error);
    if (value.classNameForMarshalling().isNull())
        return qx::fail(error, qx::errors::noClassName, object.isa().name());
    switch (field.nodeType) {
    case QXXMLNodeTypeAttribute:
        return mapAsAttribute(field, element, value);
    case QXXMLNodeTypeElement:
        return mapAsElement(field, element, value, error);
    case QXXMLNodeTypeText:
        // Whatever stood in the element before goes: earlier children too.
        element.setStringValue(text(value, field.valueType));
        return true;
    case QXXMLNodeTypeUnknown:
        return mapAutomatically(field, element, value, error);
    }
    return true;
}

XMLElement* Marshalling::lastChildNamed(const XMLElement& element, const String& name) {
    // Up to so many, looking through the children costs no more than an index of them.
    constexpr std::size_t mostScanned = 64;
    if (element.childCount() > mostScanned)
        return _lastChildren[&element].named(element, name);
    for (XMLNode* child = element.lastChild(); child != nullptr; child = child->previousSibling())
        if (child->isElement() && child->name() == name)
            return child->asElement();
    return nullptr;
}

bool Marshalling::mapAsAttribute(const FieldPlan& field, XMLElement& element, const Value& value) {
    const String written = text(value, field.valueType);
    if (!field.isRequired && isZeroOrEmpty(value, written))
        return true;
    XMLElement* const target =
        field.location.isEmpty() ? &element : lastChildNamed(element, field.location);
    if (target != nullptr) {
        target->addAttribute(field.xmlName, written);
    } else {
        auto wrapper = XMLElement::initForAttributes(field.location, 1);
        wrapper->addAttribute(field.xmlName, written);
        element.addChild(std::move(wrapper));
    }
    return true;
}

// A declared class gives the element the field's name, a class found by the value its own.
bool Marshalling::mapAsElement(const FieldPlan& field, XMLElement& element, const Value& value,
                               ErrorSlot error) {
    const bool declared = field.valueType == ValueType::other;
    const ClassPlan* plan = declared ? field.typeClass : classOf(value);
    if (declared && plan == nullptr)
        return qx::fail(error, qx::errors::noMappingForClass, field.mapping->type());
    if (plan != nullptr) {
        if (!field.isContainer && value.isObject())
            return bindFields(*plan, element, *value.object(), error);
        auto child =
            this->element(*plan, declared ? field.xmlName : plan->elementName, value, error);
        if (child)
            element.addChild(child);
        return child.get() != nullptr;
    }
    if (!field.isRequired && value.isNullOrMarker())
        return true;
    element.addChild(XMLElement::initWithName(field.xmlName, text(value, field.valueType)));
    return true;
}

bool Marshalling::mapAutomatically(const FieldPlan& field, XMLElement& element, const Value& value,
                                   ErrorSlot error) {
    const ClassPlan* plan = classOf(value);
    if (plan == nullptr) {
        const String written = text(value, field.valueType);
        if (field.isRequired || !isZeroOrEmpty(value, written))
            element.addAttribute(field.xmlName, written);
        return true;
    }
    const auto child = this->element(*plan, plan->elementName, value, error);
    if (!child)
        return false;
    if (field.isContainer) {
        element.addChild(child);
        return true;
    }
    while (XMLNode* first = child->firstChild()) {
        Ref<XMLNode> node(first);
        node->detach();
        element.addChild(std::move(node));
    }
    return true;
}

// Items stand in the wrapper of the location; else, when nothing says what their elements are, in a
// wrapper of the item name; else in the element itself.
XMLElement& Marshalling::arrayTarget(const FieldPlan& field, XMLElement& element) {
    if (!field.location.isEmpty())
        return appendNew(element, field.location);
    if (field.typeClass == nullptr && !field.bindTo.isEmpty() &&
        field.bindings.front().classOfBindTo == nullptr)
        return appendNew(element, field.bindTo);
    return element;
}

// An item is written when it says that it cannot be removed, as records do; one that says nothing
// is not.
bool Marshalling::isToBeWritten(const Value& item) {
    qx::Object& object = *item.object();
    const qx::Operation* isRemovable = _door.hooksOf(object).isRemovable;
    return isRemovable != nullptr && !ObjectDoor::send(object, *isRemovable).boolValue();
}

bool Marshalling::mapArray(const FieldPlan& field, XMLElement& element, const qx::Array& array,
                           ErrorSlot error) {
    if (array.isEmpty() && !field.isRequired)
        return true;
    if (field.hasType() && field.typeClass == nullptr)
        return qx::fail(error, qx::errors::noMappingForDeclaredClass, field.mapping->type());
    XMLElement& target = arrayTarget(field, element);
    // An item's own accessors may change the array it stands in.
    for (std::size_t i = 0; i < array.count(); ++i) {
        // NOLINTNEXTLINE(performance-unnecessary-copy-initialization)
        const Value item = array.at(i);
        Ref<qx::Error> problem;
        auto child = field.typeClass != nullptr
                         ? this->element(*field.typeClass, field.bindTo, item, &problem)
                         : marshallObject(item, &problem);
        if (child) {
            if (isToBeWritten(item))
                target.addChild(std::move(child));
        } else if (error != nullptr && problem) {
            *error = std::move(problem);
            return false;
        }
    }
    return true;
}
