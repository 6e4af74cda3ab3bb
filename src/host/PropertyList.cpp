#include "host/PropertyList.h"

#include <QXXMLMarshalling/model/Array.h>
#include <QXXMLMarshalling/model/Data.h>
#include <QXXMLMarshalling/xml/XMLDocument.h>

#include "base/Base64.h"
#include "files/Files.h"
#include "host/Log.h"

namespace qx {

namespace {

Value valueOf(const XMLElement& element);

std::vector<const XMLElement*> childElements(const XMLNode& node) {
    std::vector<const XMLElement*> elements;
    for (const XMLNode& child : node.children())
        if (const XMLElement* element = child.asElement())
            elements.push_back(element);
    return elements;
}

// Keys and values alternate; what has no partner is left out.
Ref<Dictionary> dictionaryOf(const XMLElement& element) {
    auto dictionary = make<Dictionary>();
    const auto children = childElements(element);
    for (std::size_t i = 0; i + 1 < children.size(); ++i) {
        if (children[i]->name() != "key" || children[i + 1]->name() == "key")
            continue;
        const String key = children[i]->stringValue();
        if (Value value = valueOf(*children[++i]); !value.isNull())
            dictionary->set(key.isNull() ? "" : key, std::move(value));
    }
    return dictionary;
}

Ref<Array> arrayOf(const XMLElement& element) {
    auto array = make<Array>();
    for (const XMLElement* child : childElements(element))
        if (Value value = valueOf(*child); !value.isNull())
            array->add(std::move(value));
    return array;
}

Value valueOf(const XMLElement& element) {
    const String& kind = element.name();
    if (kind == "dict")
        return dictionaryOf(element);
    if (kind == "array")
        return arrayOf(element);
    if (kind == "true")
        return true;
    if (kind == "false")
        return false;
    String text = element.stringValue();
    if (text.isNull())
        text = "";
    if (kind == "integer")
        return Value(text).intValue();
    if (kind == "real")
        return Value(text).doubleValue();
    if (kind == "data") {
        auto bytes = decodeBase64(text);
        return bytes ? make<Data>(std::move(*bytes)) : nullptr;
    }
    return kind == "string" || kind == "date" ? Value(text) : Value();
}

} // namespace

void PropertyList::warn() const {
    if (!problem.isNull())
        logWarningOrLine("%@", problem);
}

PropertyList readPropertyList(const String& path) {
    const auto none = [&path](const String& reason) {
        return PropertyList{make<Dictionary>(), String::concat({"Unable to read the property list ",
                                                                path, ": ", reason})};
    };
    if (!fileExists(path))
        return {make<Dictionary>(), {}};
    Ref<Error> error;
    const Ref<Data> file = readFile(path, &error, ReadableFiles::regular, largestResource);
    // White space may be all that a string holds.
    const auto document =
        file ? XMLDocument::initWithData(*file, {.keepWhiteSpace = true}, &error) : nullptr;
    if (!document)
        return none(String::concat(
            {error->localizedDescription(), " (", error->localizedFailureReason(), ")"}));
    const XMLElement* root = document->rootElement();
    if (root != nullptr && root->name() == "plist") {
        const auto values = childElements(*root);
        root = values.empty() ? nullptr : values.front();
    }
    if (root == nullptr || root->name() != "dict")
        return none("it holds no dictionary");
    return {dictionaryOf(*root), {}};
}

} // namespace qx
