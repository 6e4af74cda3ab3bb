#include "marshaller/ElementWriter.h"

namespace qx::detail {

void ElementWriter::addDeclaration(const WrittenElement& element, const String& prefix,
                                   const String& URI) {
    if (element.node)
        element.node->addNamespace(XMLNode::namespaceWithName(prefix, URI));
    else
        _draft->addDeclaration(*element.drafted, prefix, URI);
}

void ElementWriter::setText(const WrittenElement& element, const FieldText& text) {
    if (element.node)
        element.node->setStringValue(text.string());
    else
        _draft->setText(*element.drafted, text.view());
}

void ElementWriter::moveChildren(const WrittenElement& from, const WrittenElement& to) {
    if (!to.node)
        return XMLDraft::moveChildren(*from.drafted, *to.drafted);
    while (XMLNode* first = from.node->firstChild()) {
        Ref<XMLNode> node(first);
        node->detach();
        to.node->addChild(std::move(node));
    }
}

WrittenElement ElementWriter::lastChildNamed(const WrittenElement& element, const String& name) {
    if (element.node)
        return WrittenElement(Ref<XMLElement>(lastChildNamed(*element.node, name)));
    const XMLDraft::Found found =
        _draft->lastChildNamed(*element.drafted, name, [&](const XMLElement& holder) {
            return lastChildNamed(holder, name);
        });
    return found.element != nullptr ? WrittenElement(*found.element)
                                    : WrittenElement(Ref<XMLElement>(found.kept));
}

XMLElement* ElementWriter::lastChildNamed(const XMLElement& element, const String& name) {
    // Up to so many, looking through the children costs no more than an index of them.
    constexpr std::size_t mostScanned = 64;
    if (element.childCount() > mostScanned)
        return _lastChildren[&element].named(element, name);
    for (XMLNode* child = element.lastChild(); child != nullptr; child = child->previousSibling())
        if (child->isElement() && child->name() == name)
            return child->asElement();
    return nullptr;
}

// The index hears of what is added at once: the node that it has seen last may be taken next.
void ElementWriter::keepChild(const WrittenElement& element, const Ref<XMLNode>& child) {
    XMLElement& parent = element.node ? *element.node : _draft->holderOfChildren(*element.drafted);
    const auto known = _lastChildren.find(&parent);
    LastChildByName* const last = known != _lastChildren.end() ? &known->second : nullptr;
    if (last != nullptr)
        last->catchUp(parent);
    child->detach();
    parent.addChild(child);
    if (last != nullptr)
        last->see(*child);
}

void ElementWriter::keepAttribute(const WrittenElement& element, const Ref<XMLNode>& attribute) {
    attribute->detach();
    XMLElement* const target = element.node
                                   ? element.node.get()
                                   : _draft->holderOfAttribute(*element.drafted, attribute->name());
    if (target != nullptr)
        target->addAttribute(attribute);
}

void ElementWriter::setDeclarations(const WrittenElement& element,
                                    std::span<const Ref<XMLNode>> all) {
    XMLElement& target =
        element.node ? *element.node : _draft->holderOfDeclarations(*element.drafted);
    target.setNamespaces(all);
}

} // namespace qx::detail
