#include "saving/NewXML.h"

#include <QXXMLMarshalling/base/Exception.h>

#include "xml/Encoding.h"
#include "xml/XMLCharacters.h"

namespace qx::detail {

NewXML::NewXML(const SourceLayout& layout, const WritingTrace& shown, TextEncoder* encoder)
    : _layout(layout), _shown(shown), _encoder(encoder) {
    shown.forEachKeeping(
        [&](WritingTrace::Number at) { _objects[shown.element(at)].push_back(at); });
}

std::string NewXML::escaped(std::string_view value, std::string_view special, char quote) const {
    std::string result;
    for (std::size_t at = 0; at < value.size();) {
        const std::size_t start = at;
        const char32_t c = decodeCharacter(value, at);
        const std::string_view character = value.substr(start, at - start);
        if (!isXMLCharacter(c))
            throw Exception(Exception::invalidArgument, "a text holds what is no XML character");
        const bool isSpecial = c < 0x80 && (special.find(static_cast<char>(c)) != special.npos ||
                                            (quote != 0 && c == static_cast<char32_t>(quote)));
        const bool isLacking = _encoder != nullptr && (c >= 0x80 || _encoder->lacksASCII()) &&
                               !_encoder->canEncode(c, character);
        if (isSpecial || isLacking)
            result += referenceTo(c);
        else if (c == '\n')
            result += _layout.newline();
        else
            result += character;
    }
    return result;
}

// White space with a line break would be dropped as layout.
std::string NewXML::text(std::string_view value) const {
    return escaped(value, isWhite(value) ? "&<>\r\n" : "&<>\r", 0);
}

bool NewXML::mayBeCDATA(std::string_view value) const {
    return value.find("]]>") == value.npos && escaped(value, "\r", 0) == lines(value);
}

std::string NewXML::lines(std::string_view value) const {
    std::string result;
    for (const char c : value)
        c == '\n' ? result += _layout.newline() : result += c;
    return result;
}

std::string NewXML::attributeValue(std::string_view value, char quote) const {
    return escaped(value, "&<\r\n\t", quote);
}

std::string NewXML::attribute(std::string_view name, std::string_view value) const {
    if (!isXMLName(name))
        throw Exception(Exception::invalidArgument, "a name is no XML name");
    const char quote = _layout.quote();
    return " " + std::string(name) + "=" + quote + attributeValue(value, quote) + quote;
}

std::string NewXML::elementName(const String& name, const Around& around,
                                std::string& declarations) const {
    if (!isXMLName(name.view()))
        throw Exception(Exception::invalidArgument, "a name is no XML name");
    if (around.names == nullptr)
        return name.str();
    const OutputNames::Name written = around.names->elementName(name);
    if (written.declaration) {
        around.names->declare(*written.declaration);
        const String& prefix = written.declaration->prefix;
        declarations += attribute(prefix.isEmpty() ? "xmlns" : "xmlns:" + prefix.str(),
                                  written.declaration->URI.view());
    }
    return written.text.str();
}

std::string NewXML::attributeName(const String& name, const Around& around,
                                  std::string& declarations) const {
    if (around.names == nullptr)
        return name.str();
    const OutputNames::Name written = around.names->attributeName(name);
    if (written.declaration) {
        around.names->declare(*written.declaration);
        declarations += attribute("xmlns:" + written.declaration->prefix.str(),
                                  written.declaration->URI.view());
    }
    return written.text.str();
}

std::string NewXML::elementWithAttribute(const String& name, const String& attributeName,
                                         std::string_view value, const Around& around) {
    std::string declarations;
    const std::string written = elementName(name, around, declarations);
    const std::string own = this->attributeName(attributeName, around, declarations);
    const std::string tag = "<" + written + declarations + attribute(own, value);
    return _layout.emptyTag().empty() ? tag + "></" + written + ">"
                                      : tag + std::string(_layout.emptyTag());
}

std::string NewXML::element(const String& name, std::string_view text, const Around& around) {
    if (around.names != nullptr)
        around.names->enter({});
    std::string declarations;
    const std::string written = elementName(name, around, declarations);
    if (around.names != nullptr)
        around.names->leave();
    std::string output = "<" + written + declarations;
    if (text.empty() && !_layout.emptyTag().empty())
        return output + std::string(_layout.emptyTag());
    return output + ">" + this->text(text) + "</" + written + ">";
}

std::string NewXML::wrapper(const String& name, const std::string& inside, const Around& around) {
    std::string declarations;
    const std::string written = elementName(name, around, declarations);
    return "<" + written + declarations + ">" + inside + (around.line ? *around.line : "") + "</" +
           written + ">";
}

std::string NewXML::element(const XMLDraft::Element& element, const String* name,
                            const Around& around) {
    std::string output;
    append(element, name, around, output);
    return output;
}

void NewXML::append(const XMLDraft::Node& node, const String* name, const Around& around,
                    std::string& output) {
    if (node.kind() == XMLDraft::Kind::text) {
        output += text(node.value());
        return;
    }
    if (node.kind() == XMLDraft::Kind::leaf) {
        output += this->element(name != nullptr ? *name : *node.name, node.value(), around);
        return;
    }
    const XMLDraft::Element& element = node.element();
    // Declarations that are in force already are not made again.
    std::vector<OutputNames::Declaration> declared;
    const auto declare = [&](const String& prefix, std::string_view URI) {
        if (!around.isDeclared || !around.isDeclared(prefix, URI))
            declared.push_back({prefix, String(URI)});
    };
    const auto objects = _objects.find(&element);
    if (objects != _objects.end())
        for (const WritingTrace::Number object : objects->second)
            for (const auto& kept : _shown.keptOf(object)->declarations)
                declare(kept.node->name(), kept.node->stringValue().view());
    if (declared.empty() && around.names == nullptr)
        XMLDraft::forEach(element.lastAttribute, [&](const XMLDraft::Node& attribute) {
            if (attribute.kind() == XMLDraft::Kind::declaration)
                declare(*attribute.name, attribute.value());
        });
    if (around.names != nullptr)
        around.names->enter(declared);
    std::string declarations;
    for (const auto& [prefix, URI] : declared)
        declarations += attribute(prefix.isEmpty() ? "xmlns" : "xmlns:" + prefix.str(), URI.view());
    const std::string written =
        elementName(name != nullptr ? *name : *element.name, around, declarations);
    output += "<" + written + declarations;
    appendAttributes(element, around, output);
    std::string content;
    Around inside = around;
    if (!declared.empty())
        inside.isDeclared = nullptr;
    const bool isOnLines = appendContent(element, inside, content);
    if (content.empty() && !_layout.emptyTag().empty())
        output += _layout.emptyTag();
    else
        output += ">" + content + (isOnLines ? *around.line : "") + "</" + written + ">";
    if (around.names != nullptr)
        around.names->leave();
}

bool NewXML::mayPrint(WritingTrace::Number object, const WritingTrace::Kept& kept,
                      const Around& around) const {
    return !isTaken(_shown.plan(object), kept.text) &&
           (!around.mayKeep || around.mayKeep(object, kept));
}

void NewXML::appendAttributes(const XMLDraft::Element& element, const Around& around,
                              std::string& output) {
    std::unordered_set<std::string> names;
    XMLDraft::forEach(element.lastAttribute, [&](const XMLDraft::Node& node) {
        if (node.kind() != XMLDraft::Kind::attribute)
            return;
        std::string declarations;
        const std::string name = attributeName(*node.name, around, declarations);
        output += declarations + attribute(name, node.value());
        names.insert(name);
    });
    const auto objects = _objects.find(&element);
    if (objects == _objects.end())
        return;
    for (const WritingTrace::Number object : objects->second)
        for (const auto& kept : _shown.keptOf(object)->attributes)
            if (mayPrint(object, kept, around) && names.insert(kept.node->name().str()).second)
                output += attribute(kept.node->name().view(), kept.node->stringValue().view());
}

// Whether the children stand on lines of their own.
bool NewXML::appendContent(const XMLDraft::Element& element, const Around& around,
                           std::string& output) {
    Around inside = around;
    if (element.hasText || !around.line || around.isOnOneLine)
        inside.line = std::nullopt;
    else
        inside.line = *around.line + _layout.unit();
    bool isOnLines = false;
    const auto startLine = [&] {
        isOnLines = isOnLines || inside.line;
        output += inside.line ? *inside.line : "";
    };
    XMLDraft::forEach(element.lastChild, [&](const XMLDraft::Node& child) {
        if (child.kind() != XMLDraft::Kind::text)
            startLine();
        append(child, nullptr, inside, output);
    });
    const auto objects = _objects.find(&element);
    if (objects == _objects.end())
        return isOnLines;
    for (const WritingTrace::Number object : objects->second)
        for (const auto& kept : _shown.keptOf(object)->children)
            if (mayPrint(object, kept, around)) {
                startLine();
                output += markup(kept.text);
            }
    return isOnLines;
}

} // namespace qx::detail
