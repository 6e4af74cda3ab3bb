#include "xml/XMLSerializer.h"

#include <QXXMLMarshalling/base/Exception.h>

#include "xml/ByteRuns.h"
#include "xml/Encoding.h"
#include "xml/XMLCharacters.h"

#include <algorithm>

namespace qx {

namespace {

bool holds(std::string_view text, std::string_view part) {
    return text.find(part) != std::string_view::npos;
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
    const String& version = document.version();
    const String& standalone = document.standalone();
    if (isChecked() && !version.isEmpty() && !isXMLVersion(version))
        refuse("the version is no XML version", {document});
    if (isChecked() && !standalone.isEmpty() && standalone != "yes" && standalone != "no")
        refuse("standalone is neither yes nor no", {document});
    writeDeclaration(version, document.characterEncoding(), standalone);
    for (const XMLNode& node : document.children()) {
        writeTree(node);
        if (has(XMLPrettyPrint))
            _output += '\n';
    }
    _limits.requireDocument(_output.size(), document);
}

void XMLSerializer::writeDeclaration(std::string_view version, std::string_view encoding,
                                     std::string_view standalone) {
    if (version.empty() && encoding.empty() && standalone.empty())
        return;
    _output += "<?xml version=\"";
    _output += version.empty() ? "1.0" : version;
    for (const auto& [name, value] :
         {std::pair(" encoding=", encoding), std::pair(" standalone=", standalone)}) {
        if (value.empty())
            continue;
        _output += '"';
        _output += name;
        _output += '"';
        _output += value;
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
            _limits.requireSize(text.size(), "a text is larger than", {*element, true});
            writeEscaped(text, Where::text, isWhite(text), {*element, true});
            endTag(element->name());
            _limits.leave();
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
    std::size_t declarations = 0;
    for (const XMLNode& declaration : element.namespaces()) {
        _output += ' ';
        writeNamespace(declaration.name(), declaration._value, {declaration});
        ++declarations;
    }
    std::size_t attributes = declarations;
    element.forEachAttribute([&](const String& name, const String& value) {
        _output += ' ';
        writeAttribute(name, value, {element, false, &name}, [&](std::string_view prefix) {
            return element.findNode(element._firstNamespace, prefix) != nullptr;
        });
        ++attributes;
        declarations += isDeclaration(name) ? 1 : 0;
    });
    _limits.enter(element, attributes, declarations);
    if (element.childCount() != 0 || !has(XMLCompactEmptyElements))
        _output += '>';
}

void XMLSerializer::startElement(const XMLElement& element) {
    startTag(element);
    if (has(XMLPrettyPrint))
        _levels.push_back(levelOf(element));
}

void XMLSerializer::endElement(const XMLElement& element) {
    _limits.leave();
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
    endTag(element.name());
}

void XMLSerializer::endTag(const String& name, bool isOnLine) {
    const std::size_t start = lineStart(isOnLine);
    TextBuffer::Piece tag(_output, start + name.size() + 3);
    addLineStart(tag, start);
    tag += "</";
    tag += name;
    tag += '>';
    tag.keep();
}

void XMLSerializer::writeLeaf(const XMLNode& node) {
    const String text = node.stringValue();
    if (node.kind() != XMLNodeKind::text)
        _limits.endText();
    switch (node.kind()) {
    case XMLNodeKind::attribute:
        writeAttribute(node.name(), text, {node}, [&](std::string_view prefix) {
            const XMLElement* parent =
                node.parent() != nullptr ? node.parent()->asElement() : nullptr;
            return parent != nullptr &&
                   parent->findNode(parent->_firstNamespace, prefix) != nullptr;
        });
        break;
    case XMLNodeKind::namespaceDeclaration:
        writeNamespace(node.name(), text, {node});
        break;
    case XMLNodeKind::comment:
        if (isChecked() && (holds(text, "--") || text.view().ends_with('-')))
            refuse(R"(a comment holds "--" or ends in "-")", {node});
        _limits.requireSize(text.size(), "a comment is larger than", {node});
        _output += "<!--";
        writeLiteral(text, {node});
        _output += "-->";
        break;
    case XMLNodeKind::processingInstruction:
        if (isChecked() && (holds(text, "?>") || node.name().equalsIgnoringCase("xml") ||
                            (!text.isEmpty() && isWhite(text.view().front()))))
            refuse("a processing instruction would not be read back as it is", {node});
        _limits.requireSize(text.size(), "a processing instruction is larger than", {node});
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

void XMLSerializer::writeNamespace(const String& prefix, const String& URI, const XMLPlace& place) {
    _output += "xmlns";
    if (!prefix.isEmpty()) {
        _output += ':';
        writeName(prefix, place);
    }
    _output += "=\"";
    _limits.requireSize(URI.size(), "a namespace's URI is larger than", place);
    _limits.countURI(URI, place);
    writeEscaped(URI, Where::attribute, true, place);
    _output += '"';
}

// White space with a line break would be dropped as layout when the document is read again.
void XMLSerializer::writeText(const XMLNode& text) {
    const String value = text.stringValue();
    _limits.addText(value.size(), {text});
    writeEscaped(value, Where::text, !text._isLayout && isWhite(value), {text});
}

void XMLSerializer::writeEscaped(std::string_view text, Where where, bool escapesBreaks,
                                 const XMLPlace& place) {
    const bool lacksASCII = _encoder != nullptr && _encoder->lacksASCII();
    const char* const end = text.data() + text.size();
    std::size_t written = 0;
    const auto replace = [&](std::size_t from, std::size_t to, std::string_view by) {
        _output += text.substr(written, from - written);
        _output += by;
        written = to;
    };
    std::size_t at = 0;
    while (true) {
        if (!lacksASCII && at < text.size() && is(text[at], writtenByte))
            at = static_cast<std::size_t>(endOfRunBefore<writtenByte>(text.data() + at, end) -
                                          text.data());
        if (at == text.size())
            break;
        const char byte = text[at];
        const std::size_t start = at;
        const char32_t c = decodeCharacter(text, at);
        if (c == '&' || c == '<' || c == '\r' || (c == '>' && where == Where::text) ||
            (c == '"' && where == Where::attribute) || (c == '\t' && where == Where::attribute) ||
            (c == '\n' && escapesBreaks))
            replace(start, at, referenceTo(static_cast<unsigned char>(byte)));
        else if (isChecked() && !isXMLCharacter(c))
            refuse(c < 0x80 ? "a text holds a control character"
                            : "a text holds what is no XML character",
                   place);
        else if ((c >= 0x80 || lacksASCII) && !isEncodable(c, text.substr(start, at - start)))
            replace(start, at, "&#" + std::to_string(static_cast<std::uint32_t>(c)) + ";");
    }
    _output += text.substr(written);
}

bool XMLSerializer::isEncodable(char32_t c, std::string_view character) const {
    return _encoder == nullptr || _encoder->canEncode(c, character);
}

void XMLSerializer::writeLiteral(std::string_view text, const XMLPlace& place) {
    if (isChecked() && !isXMLText(text))
        refuse("a text holds what is no XML character", place);
    if (_encoder != nullptr)
        for (std::size_t at = 0; at < text.size();) {
            const std::size_t start = at;
            const char32_t c = decodeCharacter(text, at);
            if ((c >= 0x80 || _encoder->lacksASCII()) &&
                !isEncodable(c, text.substr(start, at - start)))
                refuse("the encoding lacks a character that cannot be referred to", place);
        }
    _output += text;
}

void XMLSerializer::writeName(const String& name, const XMLPlace& place) {
    requireName(name, place);
    if (_encoder != nullptr)
        return writeLiteral(name, place);
    _output += name;
}

void XMLSerializer::checkName(const String& name, const XMLPlace& place) {
    if (!isXMLName(name))
        refuse("a name is no XML name", place);
    _limits.countName(name, place);
}

// Empty texts, which no line would show, may stand among nodes that have lines of their own.
void XMLSerializer::startLine(const XMLNode& child) {
    if (has(XMLPrettyPrint) && !_levels.back().isInline() && child.kind() != XMLNodeKind::text)
        breakLine(_levels.size());
}

void XMLSerializer::breakLine(std::size_t depth) {
    _output += '\n';
    _output.append(indentOf(depth), ' ');
}

XMLSerializer::Level XMLSerializer::levelOf(const XMLElement& element) const {
    Level level = enclosingLevel();
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

} // namespace qx
