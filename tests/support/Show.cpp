#include "support/Show.h"

#include <QXXMLMarshalling/model/Array.h>
#include <QXXMLMarshalling/model/Class.h>
#include <QXXMLMarshalling/model/Dictionary.h>
#include <QXXMLMarshalling/xml/XMLNode.h>

#include <map>

namespace support {

namespace {

using Members = std::map<std::string, std::string>;

std::string joined(const Members& members) {
    std::string text = "{";
    for (const auto& [key, value] : members)
        text += (text.size() > 1 ? ", " : "") + key + ": " + value;
    return text + "}";
}

void addMember(Members& members, const std::string& key, const qx::Value& value) {
    if (!value.isNull())
        members[key] = show(value);
}

Members membersOf(const qx::Dictionary& dictionary) {
    Members members;
    for (const auto& entry : dictionary)
        addMember(members, entry.key.str(), entry.value);
    return members;
}

// A record's content is the dictionary under its property "contents"; any other object shows the
// properties that its class describes.
Members membersOf(const qx::Object& object) {
    if (object.isa().property("contents") != nullptr) {
        const auto contents = object.valueForKey("contents").as<qx::Dictionary>();
        return contents ? membersOf(*contents) : Members();
    }
    Members members;
    for (const qx::Class* type = &object.isa(); type != nullptr; type = type->superclass())
        for (const qx::Property& property : type->ownProperties())
            addMember(members, property.key.string().str(), property.get(property, object));
    return members;
}

std::string showArray(const qx::Array& array) {
    std::string text = "[";
    for (const qx::Value& item : array)
        text += (text.size() > 1 ? ", " : "") + show(item);
    return text + "]";
}

} // namespace

std::string show(const qx::Value& value) {
    switch (value.kind()) {
    case qx::Value::Kind::null:
        return "null";
    case qx::Value::Kind::boolean:
        return value.boolValue() ? "true" : "false";
    case qx::Value::Kind::string:
        return "\"" + value.string().str() + "\"";
    case qx::Value::Kind::integer:
    case qx::Value::Kind::real:
        return value.description().str();
    case qx::Value::Kind::object:
        break;
    }
    const qx::Object& object = *value.object();
    if (const auto* array = dynamic_cast<const qx::Array*>(&object))
        return showArray(*array);
    if (const auto* dictionary = dynamic_cast<const qx::Dictionary*>(&object))
        return joined(membersOf(*dictionary));
    if (const auto* node = dynamic_cast<const qx::XMLNode*>(&object))
        return node->description().str();
    return object.classNameForMarshalling().str() + joined(membersOf(object));
}

} // namespace support
