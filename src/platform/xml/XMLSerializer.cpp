#include "platform/xml/XMLSerializer.h"

#include <QXXMLMarshalling/platform/Exception.h>

#include "platform/xml/Encoding.h"
#include "platform/xml/XMLCharacters.h"

#include <algorithm>
#include <array>

namespace qx {

namespace {

bool holds(std::string_view text, std::string_view part) {
    return text.find(part) != std::string_view::npos;
}

// "1." and digits.
bool isVersion(std::string_view text) {
    return text.size() > 2 && text.starts_with("1.") &&
           text.find_first_not_of("0123456789", 2) == std::string_view::npos;
}

// Bytes that can be copied from text as they are.
constexpr std::array<bool, 256> plainBytes = [] {
    std::array<bool, 256> plain{};
    for (std::size_t c = 0x20; c < 0x80; ++c)
        plain[c] = c != '&' && c != '<' && c != '>' && c != '"';
    return plain;
}();

std::string_view reference(char c) {
    switch (c) {
    case '&':
        return "&amp;";
    case '<':
        return "&lt;";
    case '>':
        return "&gt;";
    case '"':
        return "&quot;";
    case '\t':
        return "&#9;";
    case '\n':
        return "&#10;";
    default:
        return "&#13;";
    }
}

} // namespace

void XMLSerializer::write(const XMLNode& node) {
    if (node.kind() == XMLNodeKind::document)
        writeDocument(static_cast<const XMLDocument&>(node));
    else
        writeTree(node);
}

void XMLSerializer::writeDocument(const XMLDocument& document) {
    if (isChecked() && document.rootElement() == nullptr)
        throw Exception(Exception::invalidArgument, "the document has no root element");
    writeDeclaration(document);
    for (const XMLNode& node : document.children()) {
        writeTree(node);
        if (has(XMLPrettyPrint))
            _output += '\n';
    }
}

void XMLSerializer::writeDeclaration(const XMLDocument& document) {
    const String& version = document.version();
    const String& encoding = document.characterEncoding();
    const String& standalone = document.standalone();
    if (version.isEmpty() && encoding.isEmpty() && standalone.isEmpty())
        return;
    if (isChecked() && !version.isEmpty() && !isVersion(version))
        refuse("the version is no XML version", {document});
    if (isChecked() && !standalone.isEmpty() && standalone != "yes" && standalone != "no")
        refuse("standalone is neither yes nor no", {document});
    _output += "<?xml version=\"";
    _output += version.isEmpty() ? std::string_view("1.0") : version.view();
    for (const auto& [name, value] :
         {std::pair(" encoding=", &encoding), std::pair(" standalone=", &standalone)}) {
        if (value->isEmpty())
            continue;
        _output += '"';
        _output += name;
        _output += '"';
        _output += value->view();
    }
    _output += "\"?>";
    if (has(XMLPrettyPrint))
        _output += '\n';
}

void XMLSerializer::writeTree(const XMLNode& top) {
    const XMLNode* node = &top;
    while (true) {
        const XMLElement* element = node->asElement();
        if (element != nullptr && element->holdsText()) {
            startTag(*element);
            const String text = element->_value;
            writeEscaped(text, Where::text, isWhite(text), {*element, true});
            endTag(*element);
        } else if (element != nullptr) {
            startElement(*element);
            if (const XMLNode* child = element->firstChild()) {
                node = child;
                startLine(*node);
                continue;
            }
            endElement(*element);
        } else {
            writeLeaf(*node);
        }
        while (node != &top && node->nextSibling() == nullptr) {
            node = node->parent();
            endElement(*node->asElement());
        }
        if (node == &top)
            return;
        node = node->nextSibling();
        startLine(*node);
    }
}

void XMLSerializer::startTag(const XMLElement& element) {
    _output += '<';
    writeName(element.name(), {element});
    for (const XMLNode& declaration : element.namespaces()) {
        _output += ' ';
        writeNamespace(declaration);
    }
    element.forEachAttribute([&](const String& name, const String& value) {
        _output += ' ';
        writeAttribute(name, value, &element, {element, false, &name});
    });
    if (element.childCount() != 0 || !has(XMLCompactEmptyElements))
        _output += '>';
}

void XMLSerializer::startElement(const XMLElement& element) {
    startTag(element);
    if (has(XMLPrettyPrint))
        _levels.push_back(levelOf(element));
}

void XMLSerializer::endElement(const XMLElement& element) {
    if (has(XMLPrettyPrint)) {
        const bool ownLine = element.firstChild() != nullptr && !_levels.back().isInline();
        _levels.pop_back();
        if (ownLine)
            breakLine(_levels.size());
    }
    if (element.firstChild() == nullptr && has(XMLCompactEmptyElements)) {
        _output += "/>";
        return;
    }
    endTag(element);
}

void XMLSerializer::endTag(const XMLElement& element) {
    _output += "</";
    _output += element.name().view();
    _output += '>';
}

void XMLSerializer::writeLeaf(const XMLNode& node) {
    const String text = node.stringValue();
    switch (node.kind()) {
    case XMLNodeKind::attribute:
        writeAttribute(node.name(), text,
                       node.parent() != nullptr ? node.parent()->asElement() : nullptr, {node});
        break;
    case XMLNodeKind::namespaceDeclaration:
        writeNamespace(node);
        break;
    case XMLNodeKind::comment:
        if (isChecked() && (holds(text, "--") || text.view().ends_with('-')))
            refuse(R"(a comment holds "--" or ends in "-")", {node});
        _output += "<!--";
        writeLiteral(text, {node});
        _output += "-->";
        break;
    case XMLNodeKind::processingInstruction:
        if (isChecked() && (holds(text, "?>") || node.name().equalsIgnoringCase("xml") ||
                            (!text.isEmpty() && isWhite(text.view().front()))))
            refuse("a processing instruction would not be read back as it is", {node});
        _output += "<?";
        writeName(node.name(), {node});
        if (!text.isEmpty())
            _output += ' ';
        writeLiteral(text, {node});
        _output += "?>";
        break;
    default:
        writeText(node);
    }
}

void XMLSerializer::writeAttribute(const String& name, std::string_view value,
                                   const XMLElement* parent, const Place& place) {
    // An attribute that would declare a prefix a second time.
    if (isChecked() && parent != nullptr && name.view().starts_with("xmlns")) {
        const std::string_view prefix = name.view().substr(std::min<std::size_t>(name.size(), 6));
        if (name.size() == 5 || name.view()[5] == ':')
            for (const XMLNode& declared : parent->namespaces())
                if (declared.name() == prefix)
                    refuse("a namespace is declared twice", place);
    }
    writeName(name, place);
    _output += "=\"";
    writeEscaped(value, Where::attribute, true, place);
    _output += '"';
}

void XMLSerializer::writeNamespace(const XMLNode& declaration) {
    _output += "xmlns";
    if (!declaration.name().isEmpty()) {
        _output += ':';
        writeName(declaration.name(), {declaration});
    }
    _output += "=\"";
    writeEscaped(declaration.stringValue(), Where::attribute, true, {declaration});
    _output += '"';
}

// White space with a line break would be dropped as layout when the document is read again.
void XMLSerializer::writeText(const XMLNode& text) {
    const String value = text.stringValue();
    writeEscaped(value, Where::text, !text._isLayout && isWhite(value), {text});
}

void XMLSerializer::writeEscaped(std::string_view text, Where where, bool escapesBreaks,
                                 const Place& place) {
    std::size_t written = 0;
    const auto replace = [&](std::size_t from, std::size_t to, std::string_view by) {
        _output += text.substr(written, from - written);
        _output += by;
        written = to;
    };
    for (std::size_t at = 0; at < text.size();) {
        const char byte = text[at];
        if (plainBytes[static_cast<unsigned char>(byte)]) {
            ++at;
            continue;
        }
        const std::size_t start = at;
        const char32_t c = decodeCharacter(text, at);
        if (c >= 0x80) {
            if (isChecked() && !isXMLCharacter(c))
                refuse("a text holds what is no XML character", place);
            if (_encoder != nullptr && !_encoder->canEncode(c, text.substr(start, at - start)))
                replace(start, at, "&#" + std::to_string(static_cast<std::uint32_t>(c)) + ";");
        } else if (c == '&' || c == '<' || c == '\r' || (c == '>' && where == Where::text) ||
                   (c == '"' && where == Where::attribute) ||
                   (c == '\t' && where == Where::attribute) || (c == '\n' && escapesBreaks)) {
            replace(start, at, reference(byte));
        } else if (isChecked() && !isXMLCharacter(c)) {
            refuse("a text holds a control character", place);
        }
    }
    _output += text.substr(written);
}

void XMLSerializer::writeLiteral(std::string_view text, const Place& place) {
    if (isChecked() && !isXMLText(text))
        refuse("a text holds what is no XML character", place);
    if (_encoder != nullptr)
        for (std::size_t at = 0; at < text.size();) {
            const std::size_t start = at;
            const char32_t c = decodeCharacter(text, at);
            if (c >= 0x80 && !_encoder->canEncode(c, text.substr(start, at - start)))
                refuse("the encoding lacks a character that cannot be referred to", place);
        }
    _output += text;
}

void XMLSerializer::writeName(std::string_view name, const Place& place) {
    if (isChecked() && !isXMLName(name))
        refuse("a name is no XML name", place);
    if (_encoder != nullptr)
        return writeLiteral(name, place);
    _output += name;
}

// Empty texts, which no line would show, may stand among nodes that have lines of their own.
void XMLSerializer::startLine(const XMLNode& child) {
    if (has(XMLPrettyPrint) && !_levels.back().isInline() && child.kind() != XMLNodeKind::text)
        breakLine(_levels.size());
}

void XMLSerializer::breakLine(std::size_t depth) {
    // Deeper than documents are by default, blanks would outgrow all else.
    constexpr std::size_t deepestIndent = 256;
    _output += '\n';
    _output.append(std::min(depth, deepestIndent) * 4, ' ');
}

XMLSerializer::Level XMLSerializer::levelOf(const XMLElement& element) const {
    Level level = _levels.empty() ? Level{false, false} : _levels.back();
    element.forEachAttribute([&](const String& name, const String& value) {
        if (name == "xml:space")
            level.preserves = value == "preserve";
    });
    bool hasMarkup = false;
    for (const XMLNode& child : element.children()) {
        if (level.isMixed)
            break;
        const bool isText = child.kind() == XMLNodeKind::text;
        hasMarkup = hasMarkup || !isText;
        level.isMixed = isText && !child.stringValue().isEmpty();
    }
    level.isMixed = level.isMixed || !hasMarkup;
    return level;
}

const XMLNode& XMLSerializer::Place::spelledOut() const {
    if (attributeName != nullptr)
        return *node.asElement()->attributeForName(*attributeName);
    return isItsText ? *node.firstChild() : node;
}

void XMLSerializer::refuse(std::string_view what, const Place& place) {
    throw Exception(Exception::invalidArgument,
                    String::concat({what, " at ", placeOf(place.spelledOut())}));
}

std::string placeOf(const XMLNode& node) {
    // How many levels are named; what stands above them is left out.
    constexpr std::size_t namedLevels = 32;
    std::string place;
    std::size_t named = 0;
    const XMLNode* at = &node;
    for (; at != nullptr && at->kind() != XMLNodeKind::document && named < namedLevels;
         at = at->parent(), ++named) {
        std::size_t before = 0;
        bool isAlone = true;
        const auto isLike = [at](const XMLNode& other) {
            return &other != at && other.kind() == at->kind() && other.name() == at->name();
        };
        for (const XMLNode* other = at->previousSibling(); other; other = other->previousSibling())
            before += isLike(*other);
        for (const XMLNode* other = at->nextSibling(); other && isAlone;
             other = other->nextSibling())
            isAlone = !isLike(*other);
        std::string step = "/";
        switch (at->kind()) {
        case XMLNodeKind::attribute:
            step += '@';
            break;
        case XMLNodeKind::namespaceDeclaration:
            step += at->name().isEmpty() ? "@xmlns" : "@xmlns:";
            break;
        case XMLNodeKind::text:
            step += "text()";
            break;
        case XMLNodeKind::comment:
            step += "comment()";
            break;
        case XMLNodeKind::processingInstruction:
            step += '?';
            break;
        default:
            break;
        }
        step += at->name().view();
        if (before != 0 || !isAlone)
            step += "[" + std::to_string(before + 1) + "]";
        place.insert(0, step);
    }
    if (at != nullptr && at->kind() != XMLNodeKind::document)
        place.insert(0, "...");
    return place.empty() ? "/" : place;
}

} // namespace qx
