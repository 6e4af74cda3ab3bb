#include "qxxml/infer/Writers.h"

namespace qxxml {

namespace {

std::string escaped(std::string_view text) {
    std::string result;
    for (const char c : text) {
        if (c == '&')
            result += "&amp;";
        else if (c == '<')
            result += "&lt;";
        else if (c == '"')
            result += "&quot;";
        else if (c == '\t' || c == '\n' || c == '\r')
            result += "&#" + std::to_string(static_cast<int>(c)) + ";";
        else
            result += c;
    }
    return result;
}

std::string attribute(std::string_view name, std::string_view value) {
    return value.empty() ? "" : " " + std::string(name) + "=\"" + escaped(value) + "\"";
}

// Two hyphens would end it, and names may hold them.
std::string comment(std::string_view text) {
    std::string result;
    for (const char c : text) {
        if (c == '-' && result.ends_with('-'))
            result += ' ';
        result += c;
    }
    return "<!-- " + result + " -->\n";
}

// Texts that are a collection's items need the word: without a type those are objects.
std::string typeOf(const InferredField& field) {
    switch (field.type) {
    case InferredType::integer:
        return "integer";
    case InferredType::boolean:
        return "boolean";
    case InferredType::object:
        return field.className;
    case InferredType::text:
        break;
    }
    return field.kind == InferredKind::collection ? "string" : "";
}

std::string bindingOf(const InferredField& field) {
    switch (field.kind) {
    case InferredKind::attribute:
        return attribute("name", field.xmlName) + attribute("node", "attribute");
    case InferredKind::element:
        return attribute("name", field.xmlName) + attribute("node", "element");
    case InferredKind::text:
        return attribute("node", "text");
    default:
        return attribute("name", field.xmlName) + attribute("location", field.location);
    }
}

bool isCollection(const InferredField& field) {
    return field.kind == InferredKind::collection || field.kind == InferredKind::mixedCollection;
}

std::string countOf(const InferredField& field, const InferredClass& owner) {
    const std::string holders =
        std::to_string(field.holders) + " of " + std::to_string(owner.count);
    return isCollection(field) ? std::to_string(field.count) + " in " + holders : holders;
}

std::string fieldText(const InferredField& field, const InferredClass& owner) {
    std::string text = "        <field" + attribute("name", field.key) +
                       attribute("type", typeOf(field)) +
                       attribute("required", field.isRequired ? "true" : "") +
                       attribute("collection", isCollection(field) ? "array" : "");
    text += field.kind == InferredKind::mixedCollection
                ? "/>"
                : "><bind-xml" + bindingOf(field) + "/></field>";
    return text + " " + comment(countOf(field, owner));
}

} // namespace

std::string mappingText(const std::vector<InferredClass>& classes, std::size_t documentCount) {
    std::string text = "<?xml version=\"1.0\" encoding=\"UTF-8\"?>\n<mapping>\n    " +
                       comment("inferred; documents: " + std::to_string(documentCount));
    for (const InferredClass& made : classes) {
        text += "\n    " + comment("<" + made.xmlName + ">: " + std::to_string(made.count));
        text += "    <class" + attribute("name", made.name) + ">\n        <map-to" +
                attribute("xml", made.xmlName) + attribute("ns-uri", made.nsURI) +
                attribute("ns-prefix", made.nsPrefix) + "/>\n";
        for (const InferredField& field : made.fields)
            text += fieldText(field, made);
        for (const std::string& remark : made.remarks)
            text += "        " + comment(remark);
        text += "    </class>\n";
    }
    return text + "</mapping>\n";
}

} // namespace qxxml
