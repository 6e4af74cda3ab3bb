#include "qxxml/Json.h"

#include <QXXMLMarshalling/QXGenericRecord.h>
#include <QXXMLMarshalling/model/Class.h>
#include <QXXMLMarshalling/model/Data.h>
#include <QXXMLMarshalling/xml/XMLNode.h>

#include "qxxml/Failure.h"

#include <algorithm>

using nlohmann::ordered_json;

namespace qxxml {

namespace {

class JsonMaker {
public:
    ordered_json make(const qx::Value& value) {
        switch (value.kind()) {
        case qx::Value::Kind::null:
            return nullptr;
        case qx::Value::Kind::boolean:
            return value.boolValue();
        case qx::Value::Kind::integer:
            return value.intValue();
        case qx::Value::Kind::real:
            return value.doubleValue();
        case qx::Value::Kind::string:
            return value.view();
        case qx::Value::Kind::object:
            break;
        }
        const qx::Object& object = *value.object();
        if (value.isNullOrMarker())
            return nullptr;
        if (const auto* node = dynamic_cast<const qx::XMLNode*>(&object))
            return node->XMLString().view();
        if (dynamic_cast<const qx::Data*>(&object) != nullptr)
            return object.description().view();
        return makeContainer(object);
    }

private:
    ordered_json makeContainer(const qx::Object& object) {
        const auto above = std::find(_open.rbegin(), _open.rend(), &object);
        if (above != _open.rend())
            return ordered_json::object({{"@above", above - _open.rbegin() + 1}});
        if (_open.size() == deepestJson)
            throw Failure("-223: Objects nest deeper than the limit of " +
                          std::to_string(deepestJson) + ": " +
                          object.classNameForMarshalling().str());
        _open.push_back(&object);
        ordered_json json;
        if (const auto* array = dynamic_cast<const qx::Array*>(&object))
            json = ofArray(*array);
        else if (const auto* dictionary = dynamic_cast<const qx::Dictionary*>(&object))
            json = ofDictionary(*dictionary);
        else
            json = ofObject(object);
        _open.pop_back();
        return json;
    }

    ordered_json ofArray(const qx::Array& array) {
        ordered_json json = ordered_json::array();
        for (const qx::Value& item : array)
            json.push_back(make(item));
        return json;
    }

    ordered_json ofDictionary(const qx::Dictionary& dictionary) {
        ordered_json json = ordered_json::object();
        for (const auto& entry : dictionary)
            append(json, entry.key.str(), make(entry.value));
        return json;
    }

    ordered_json ofObject(const qx::Object& object) {
        ordered_json json = ordered_json::object();
        append(json, "@class", object.classNameForMarshalling().view());
        addProperties(json, object, &object.isa());
        if (const auto* record = dynamic_cast<const QXGenericRecord*>(&object)) {
            for (const qx::String& key : record->keys())
                if (object.isa().property(key) == nullptr)
                    append(json, escaped(key), make(record->contents()->get(key)));
        }
        return json;
    }

    // Base classes first. What a record class describes is about records, not content.
    void addProperties(ordered_json& json, const qx::Object& object, const qx::Class* type) {
        if (type == nullptr || type == &QXGenericRecord::classObject())
            return;
        addProperties(json, object, type->superclass());
        for (const qx::Property& property : type->ownProperties())
            if (object.isa().property(property.key) == &property) // not redefined further down
                append(json, escaped(property.key), make(property.get(property, object)));
    }

    static std::string escaped(const qx::String& key) {
        return key.view().starts_with('@') ? "@" + key.str() : key.str();
    }

    // Keys are distinct already: looking each up among those before would be quadratic.
    static void append(ordered_json& json, std::string key, ordered_json value) {
        ordered_json::object_t::Container& members = json.get_ref<ordered_json::object_t&>();
        members.emplace_back(std::move(key), std::move(value));
    }

    std::vector<const qx::Object*> _open; // from the outermost in
};

} // namespace

ordered_json jsonOf(const qx::Value& value) { return JsonMaker().make(value); }

std::string textOf(const ordered_json& json) {
    return json.dump(4, ' ', false, ordered_json::error_handler_t::replace);
}

std::string lineOf(const ordered_json& json) {
    return json.dump(-1, ' ', false, ordered_json::error_handler_t::replace);
}

} // namespace qxxml
