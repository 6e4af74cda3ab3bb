// Prints drafts, with the layout and the limits that nodes have.

#include <QXXMLMarshalling/base/Exception.h>

#include "xml/ByteRuns.h"
#include "xml/XMLCharacters.h"
#include "xml/XMLSerializer.h"

namespace qx {

// What the start tag of an element told.
struct XMLSerializer::DraftTag {
    std::size_t attributes = 0;
    std::size_t declarations = 0;
    bool hasChildren = false;
    bool preserves; // xml:space="preserve" is in force
};

namespace {

// Places for what is kept are empty once others have taken it.
bool isThere(const XMLDraft::Node& child) {
    return child.kind() != XMLDraft::Kind::keptChildren || child.holder().childCount() != 0;
}

bool anyChild(const XMLDraft::Element& element, auto isWanted) {
    const XMLDraft::Node* node = element.lastChild;
    if (node == nullptr)
        return false;
    do {
        node = node->next;
        if (isWanted(*node))
            return true;
    } while (node != element.lastChild);
    return false;
}

// Calls visit(prefix, URI) for what the element declares.
template <class Visit>
void forEachDeclaration(const XMLDraft::Element& element, Visit visit) {
    const XMLElement* holder = nullptr;
    XMLDraft::forEach(element.lastAttribute, [&](const XMLDraft::Node& node) {
        if (node.kind() == XMLDraft::Kind::keptDeclarations)
            holder = &node.holder();
    });
    if (holder != nullptr) {
        for (const XMLNode& declaration : holder->namespaces())
            visit(declaration.name(), declaration.stringValue());
        return;
    }
    XMLDraft::forEach(element.lastAttribute, [&](const XMLDraft::Node& node) {
        if (node.kind() == XMLDraft::Kind::declaration)
            visit(*node.name, String(node.value()));
    });
}

bool declares(const XMLDraft::Element& element, std::string_view prefix) {
    bool found = false;
    if (element.hasDeclarations)
        forEachDeclaration(element, [&](const String& declared, const String&) {
            found = found || declared == prefix;
        });
    return found;
}

} // namespace

void XMLSerializer::write(const XMLDraft::Element& root) {
    writeDeclaration("1.0", "UTF-8", {});
    writeElement(root, false);
    if (has(XMLPrettyPrint))
        _output += '\n';
    _limits.requireDocument(_output.size(), {});
}

XMLSerializer::DraftTag XMLSerializer::startTag(const XMLDraft::Element& element, bool isOnLine) {
    const String& name = *element.name;
    requireName(name, {});
    const std::size_t start = lineStart(isOnLine);
    TextBuffer::Piece piece(_output, start + name.size() + 1);
    addLineStart(piece, start);
    piece += '<';
    piece += name;
    piece.keep();

    DraftTag tag{.preserves = enclosingLevel().preserves};
    if (element.hasDeclarations)
        forEachDeclaration(element, [&](const String& prefix, const String& URI) {
            _output += ' ';
            writeNamespace(prefix, URI, {});
            ++tag.declarations;
        });
    tag.attributes = tag.declarations;
    const auto add = [&](const String& attribute, std::string_view value) {
        addAttribute(element, attribute, value, tag);
    };
    XMLDraft::forEach(element.lastAttribute, [&](const XMLDraft::Node& node) {
        if (node.kind() == XMLDraft::Kind::attribute)
            add(*node.name, node.value());
        else if (node.kind() == XMLDraft::Kind::keptAttributes)
            node.holder().forEachAttribute(add);
    });
    _limits.enter({}, tag.attributes, tag.declarations);
    tag.hasChildren = element.hasKept ? anyChild(element, isThere) : element.lastChild != nullptr;
    if (tag.hasChildren || !has(XMLCompactEmptyElements))
        _output += '>';
    return tag;
}

// Names that begin so may mean more than a value.
void XMLSerializer::addAttribute(const XMLDraft::Element& element, const String& name,
                                 std::string_view value, DraftTag& tag) {
    ++tag.attributes;
    if (name.view().starts_with("xml")) {
        _output += ' ';
        writeAttribute(name, value, {},
                       [&](std::string_view prefix) { return declares(element, prefix); });
        tag.declarations += isDeclaration(name) ? 1 : 0;
        if (name.view() == "xml:space")
            tag.preserves = value == "preserve";
        return;
    }
    _limits.requireSize(value.size(), "an attribute's value is larger than", {});
    requireName(name, {});
    TextBuffer::Piece piece(_output, name.size() + value.size() + 4);
    piece += ' ';
    piece += name;
    piece += "=\"";
    const bool isPlain = copyRun<writtenByte>(value.data(), value.size(), piece.end());
    if (isPlain) {
        piece.advance(value.size());
        piece += '"';
    }
    piece.keep();
    if (isPlain)
        return;
    writeEscaped(value, Where::attribute, true, {});
    _output += '"';
}

// Drafts are as deep as objects may nest.
void XMLSerializer::writeElement(const XMLDraft::Element& element, bool isOnLine) {
    const DraftTag tag = startTag(element, isOnLine);
    bool isLaidOut = false;
    if (tag.hasChildren) {
        const bool isMixed = enclosingLevel().isMixed || element.hasText;
        isLaidOut = has(XMLPrettyPrint) && !isMixed && !tag.preserves;
        if (has(XMLPrettyPrint))
            _levels.push_back({tag.preserves, isMixed});
        writeChildren(element);
        if (has(XMLPrettyPrint))
            _levels.pop_back();
    }
    _limits.leave();
    if (tag.hasChildren || !has(XMLCompactEmptyElements))
        endTag(*element.name, isLaidOut);
    else
        _output += "/>";
}

void XMLSerializer::writeChildren(const XMLDraft::Element& element) {
    const bool isLaidOut = has(XMLPrettyPrint) && !_levels.back().isInline();
    XMLDraft::forEach(element.lastChild, [&](const XMLDraft::Node& node) {
        switch (node.kind()) {
        case XMLDraft::Kind::leaf:
            writeLeaf(node, isLaidOut);
            break;
        case XMLDraft::Kind::text:
            _limits.addText(node.value().size(), {});
            writeEscaped(node.value(), Where::text, isWhite(node.value()), {});
            break;
        case XMLDraft::Kind::keptChildren:
            for (const XMLNode& kept : node.holder().children()) {
                startLine(kept);
                writeTree(kept);
            }
            break;
        default:
            writeElement(node.element(), isLaidOut);
        }
    });
}

void XMLSerializer::writeLeaf(const XMLDraft::Node& leaf, bool isOnLine) {
    const String& name = *leaf.name;
    const std::string_view text = leaf.value();
    requireName(name, {});
    _limits.enter({}, 0, 0);
    _limits.requireSize(text.size(), "a text is larger than", {});
    const std::size_t start = lineStart(isOnLine);
    TextBuffer::Piece piece(_output, start + 2 * name.size() + text.size() + 5);
    addLineStart(piece, start);
    piece += '<';
    piece += name;
    piece += '>';
    const bool isPlain = copyRun<writtenByte>(text.data(), text.size(), piece.end());
    if (isPlain) {
        piece.advance(text.size());
        piece += "</";
        piece += name;
        piece += '>';
    }
    piece.keep();
    _limits.leave();
    if (isPlain)
        return;
    writeEscaped(text, Where::text, isWhite(text), {});
    endTag(name);
}

void XMLSerializer::writeInside(const XMLDraft::Element& element) {
    _limits.enter({}, 0, 0);
    if (has(XMLPrettyPrint))
        _levels.push_back({false, false});
    writeElement(element, has(XMLPrettyPrint));
}

// Nodes are made only for the place of what cannot be written.
void writeDraft(const XMLDraft::Element& root, XMLOptions options, const XMLParseOptions& reading,
                TextBuffer& output) {
    try {
        XMLSerializer(output, options, XMLChecks::on, nullptr, &reading).write(root);
        return;
    } catch (const Exception&) {
        output.take();
    }
    XMLSerializer(output, options, XMLChecks::on, nullptr, &reading)
        .write(*XMLDraft::makeDocument(root));
}

void writeDraftInside(const XMLDraft::Element& element, XMLOptions options,
                      const XMLParseOptions& reading, TextBuffer& output) {
    try {
        XMLSerializer(output, options, XMLChecks::on, nullptr, &reading).writeInside(element);
    } catch (const Exception&) {
        TextBuffer unused;
        XMLSerializer(unused, options, XMLChecks::on, nullptr, &reading)
            .write(*XMLDraft::makeDocument(element));
        throw;
    }
}

} // namespace qx
