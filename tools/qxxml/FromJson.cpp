#include "qxxml/FromJson.h"

#include <QXXMLMarshalling/QXGenericRecord.h>
#include <QXXMLMarshalling/xml/XMLDocument.h>

#include "qxxml/Failure.h"
#include "qxxml/Json.h"

using nlohmann::ordered_json;

namespace qxxml {

namespace {

qx::Ref<qx::XMLElement> parsed(const std::string& xml) {
    qx::Ref<qx::Error> error;
    const auto document = qx::XMLDocument::initWithData(xml, {}, &error);
    if (!document)
        throw Failure(error, "JSON");
    qx::Ref<qx::XMLElement> root(document->rootElement());
    root->detach();
    return root;
}

class ObjectMaker {
public:
    qx::Value make(const ordered_json& json) {
        if (++_depth > deepestJson)
            throw Failure("-223: Objects nest deeper than the limit of " +
                          std::to_string(deepestJson));
        qx::Value value = makeAny(json);
        --_depth;
        return value;
    }

private:
    qx::Value makeAny(const ordered_json& json) {
        switch (json.type()) {
        case ordered_json::value_t::null:
            return {};
        case ordered_json::value_t::boolean:
            return json.get<bool>();
        case ordered_json::value_t::string:
            return json.get<std::string>();
        case ordered_json::value_t::number_integer:
        case ordered_json::value_t::number_unsigned:
            return json.get<std::int64_t>();
        case ordered_json::value_t::number_float:
            return json.get<double>();
        case ordered_json::value_t::array:
            return arrayOf(json, [&](const ordered_json& item) { return make(item); });
        default:
            return json.contains("@class") ? record(json) : dictionary(json);
        }
    }

    template <class Make>
    static qx::Value arrayOf(const ordered_json& json, Make make) {
        auto array = qx::make<qx::Array>();
        for (const ordered_json& item : json)
            array->add(make(item));
        return array;
    }

    qx::Value dictionary(const ordered_json& json) {
        if (json.contains("@above"))
            throw Failure(message("An object that stands in itself cannot be read: %@", "@above"));
        auto dictionary = qx::make<qx::Dictionary>();
        for (const auto& [key, value] : json.items())
            dictionary->set(key, make(value));
        return dictionary;
    }

    // The keys of unknown XML hold nodes, or nothing.
    qx::Value record(const ordered_json& json) {
        auto record = qx::make<QXGenericRecord>();
        record->setClassNameForMarshalling(json.at("@class").get<std::string>());
        for (const auto& [key, value] : json.items()) {
            if (key == "@class")
                continue;
            const std::string name = key.starts_with("@@") ? key.substr(1) : key;
            if (key == "unboundChildren" && value.is_object())
                record->setValueForKey(keptChildren(value), name);
            else if (key == "unboundAttributes" && value.is_array())
                record->setValueForKey(keptOf(value, false), name);
            else if (key == "__namespaces" && value.is_array())
                record->setValueForKey(keptOf(value, true), name);
            else
                record->setValueForKey(make(value), name);
        }
        return record;
    }
    static qx::Value keptChildren(const ordered_json& json) {
        auto kept = qx::make<qx::Dictionary>();
        for (const auto& [name, elements] : json.items())
            kept->set(name, arrayOf(elements, [](const ordered_json& element) {
                          return qx::Value(parsed(element.get<std::string>()));
                      }));
        return kept;
    }
    static qx::Value keptOf(const ordered_json& json, bool areDeclarations) {
        return arrayOf(json, [&](const ordered_json& text) {
            const auto holder = parsed("<a " + text.get<std::string>() + "/>");
            const auto nodes = areDeclarations ? holder->namespaces() : holder->attributes();
            if (nodes.empty())
                throw Failure(message("Not an attribute: %@", text.get<std::string>()));
            qx::Ref<qx::XMLNode> node(&*nodes.begin());
            node->detach();
            return qx::Value(node);
        });
    }

    std::size_t _depth = 0;
};

} // namespace

qx::Value objectOf(const std::string& json) try {
    return ObjectMaker().make(ordered_json::parse(json));
} catch (const nlohmann::json::exception& exception) {
    throw Failure(message("The JSON cannot be read: %@", exception.what()));
}

} // namespace qxxml
