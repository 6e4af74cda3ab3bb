#pragma once

// What the kinds of binding write into: an element of a tree of nodes, where somebody is to have
// the tree, or one of a draft that is only printed.

#include "marshaller/FieldValue.h"
#include "marshaller/LastChildByName.h"
#include "model/Errors.h"
#include "xml/XMLDraft.h"

#include <span>

namespace qx::detail {

// One of the two, or none. A draft's is lent by the draft.
struct WrittenElement {
    WrittenElement() noexcept = default;
    WrittenElement(Failure) noexcept {}
    explicit WrittenElement(Ref<XMLElement> element) noexcept : node(std::move(element)) {}
    explicit WrittenElement(XMLDraft::Element& element) noexcept : drafted(&element) {}
    explicit operator bool() const noexcept { return node || drafted != nullptr; }

    Ref<XMLElement> node;
    XMLDraft::Element* drafted = nullptr;
};

class ElementWriter {
public:
    // Writes into the draft, into nodes where there is none. Names that are passed stay where they
    // are as long as the draft is used.
    explicit ElementWriter(XMLDraft* draft) noexcept : _draft(draft) {}

    // With memory for so many attributes.
    WrittenElement newElement(const String& name, std::size_t attributes) {
        return _draft != nullptr ? WrittenElement(_draft->newElement(name))
                                 : WrittenElement(XMLElement::initForAttributes(name, attributes));
    }
    void addDeclaration(const WrittenElement& element, const String& prefix, const String& URI);
    // Adds nothing when an attribute of that name is there already. A kept element may be among
    // those of a draft: it is a node all the same.
    void addAttribute(const WrittenElement& element, const String& name, const FieldText& value) {
        if (!element.node)
            return _draft->addAttribute(*element.drafted, name, value.view());
        element.node->addAttribute(name, value.string());
    }
    void addChild(const WrittenElement& parent, const WrittenElement& child) {
        if (!parent.node)
            return XMLDraft::addChild(*parent.drafted, *child.drafted);
        parent.node->addChild(child.node);
    }
    void addChild(const WrittenElement& parent, const String& name, const FieldText& text) {
        if (!parent.node)
            return _draft->addLeaf(*parent.drafted, name, text.view());
        parent.node->addChild(XMLElement::initWithName(name, text.string()));
    }
    // Takes the place of all children.
    void setText(const WrittenElement& element, const FieldText& text);
    // Appends the children of the one to those of the other, and drops what is left of the one.
    void moveChildren(const WrittenElement& from, const WrittenElement& to);
    // None when no child has that name.
    WrittenElement lastChildNamed(const WrittenElement& element, const String& name);

    // Take the node from where it is, even where an attribute of its name is there already.
    void keepChild(const WrittenElement& element, const Ref<XMLNode>& child);
    void keepAttribute(const WrittenElement& element, const Ref<XMLNode>& attribute);
    // In place of all others.
    void setDeclarations(const WrittenElement& element, std::span<const Ref<XMLNode>> all);

private:
    XMLElement* lastChildNamed(const XMLElement& element, const String& name);

    XMLDraft* _draft;
    // Of the elements in which names were looked up among many children.
    std::unordered_map<const XMLElement*, LastChildByName> _lastChildren;
};

} // namespace qx::detail
