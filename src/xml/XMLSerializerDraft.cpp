// Prints drafts, with the layout and the limits that nodes have.

#include <QXXMLMarshalling/base/Exception.h>

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
    writeElement(root);
    if (has(XMLPrettyPrint))
        _output += '\n';
    _limits.requireDocument(_output.size(), {});
}

XMLSerializer::DraftTag XMLSerializer::startTag(const XMLDraft::Element& element) {
    DraftTag tag{.preserves = enclosingLevel().preserves};
    _output += '<';
    writeName(*element.name, {});
    if (element.hasDeclarations)
        forEachDeclaration(element, [&](const String& prefix, const String& URI) {
            _output += ' ';
            writeNamespace(prefix, URI, {});
            ++tag.declarations;
        });
    tag.attributes = tag.declarations;
    const auto write = [&](const String& name, std::string_view value) {
        _output += ' ';
        writeAttribute(name, value, {},
                       [&](std::string_view prefix) { return declares(element, prefix); });
        ++tag.attributes;
        tag.declarations += isDeclaration(name) ? 1 : 0;
        if (name.view() == "xml:space")
            tag.preserves = value == "preserve";
    };
    XMLDraft::forEach(element.lastAttribute, [&](const XMLDraft::Node& node) {
        if (node.kind() == XMLDraft::Kind::attribute)
            write(*node.name, node.value());
        else if (node.kind() == XMLDraft::Kind::keptAttributes)
            node.holder().forEachAttribute(write);
    });
    _limits.enter({}, tag.attributes, tag.declarations);
    tag.hasChildren = anyChild(element, isThere);
    if (tag.hasChildren || !has(XMLCompactEmptyElements))
        _output += '>';
    return tag;
}

// Drafts are as deep as objects may nest.
void XMLSerializer::writeElement(const XMLDraft::Element& element) {
    const DraftTag tag = startTag(element);
    if (tag.hasChildren) {
        const bool isMixed =
            enclosingLevel().isMixed || element.hasText || !anyChild(element, [](const auto& node) {
                return node.kind() != XMLDraft::Kind::text && isThere(node);
            });
        const bool isLaidOut = has(XMLPrettyPrint) && !isMixed && !tag.preserves;
        if (has(XMLPrettyPrint))
            _levels.push_back({tag.preserves, isMixed});
        writeChildren(element);
        if (has(XMLPrettyPrint))
            _levels.pop_back();
        if (isLaidOut)
            breakLine(_levels.size());
    }
    _limits.leave();
    if (tag.hasChildren || !has(XMLCompactEmptyElements))
        endTag(*element.name);
    else
        _output += "/>";
}

void XMLSerializer::writeChildren(const XMLDraft::Element& element) {
    const bool isLaidOut = has(XMLPrettyPrint) && !_levels.back().isInline();
    XMLDraft::forEach(element.lastChild, [&](const XMLDraft::Node& node) {
        if (isLaidOut && node.name != nullptr)
            breakLine(_levels.size());
        switch (node.kind()) {
        case XMLDraft::Kind::leaf:
            writeLeaf(node);
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
            writeElement(node.element());
        }
    });
}

void XMLSerializer::writeLeaf(const XMLDraft::Node& leaf) {
    _output += '<';
    writeName(*leaf.name, {});
    _output += '>';
    _limits.enter({}, 0, 0);
    _limits.requireSize(leaf.value().size(), "a text is larger than", {});
    writeEscaped(leaf.value(), Where::text, isWhite(leaf.value()), {});
    _limits.leave();
    endTag(*leaf.name);
}

void XMLSerializer::writeInside(const XMLDraft::Element& element) {
    _limits.enter({}, 0, 0);
    if (has(XMLPrettyPrint)) {
        _levels.push_back({false, false});
        breakLine(_levels.size());
    }
    writeElement(element);
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
