#include <QXXMLMarshalling/xml/XMLNode.h>

#include <QXXMLMarshalling/model/Class.h>
#include <QXXMLMarshalling/xml/XMLDocument.h>

#include "base/MemoryBlocks.h"
#include "xml/KeptPlace.h"
#include "xml/XMLSerializer.h"

namespace qx {

namespace {

String present(const String& text) { return text.isNull() ? String("") : text; }

String written(const XMLNode& node, XMLOptions options, XMLChecks checks) {
    TextBuffer text;
    XMLSerializer(text, options, checks).write(node);
    return text.take();
}

} // namespace

XMLNode::~XMLNode() = default;

void* XMLNode::operator new(std::size_t size) { return MemoryBlocks::ofNodes().allocate(size); }

void XMLNode::operator delete(void* node) noexcept { MemoryBlocks::release(node); }

Ref<XMLNode> XMLNode::initTextWithStringValue(const String& text) {
    return Ref<XMLNode>::adopt(new XMLNode(XMLNodeKind::text, String(), present(text)));
}

Ref<XMLNode> XMLNode::initCommentWithStringValue(const String& text) {
    return Ref<XMLNode>::adopt(new XMLNode(XMLNodeKind::comment, String(), present(text)));
}

Ref<XMLNode> XMLNode::initProcessingInstructionWithName(const String& target, const String& data) {
    return Ref<XMLNode>::adopt(
        new XMLNode(XMLNodeKind::processingInstruction, present(target), present(data)));
}

Ref<XMLNode> XMLNode::attributeWithName(const String& name, const String& value) {
    return Ref<XMLNode>::adopt(new XMLNode(XMLNodeKind::attribute, present(name), present(value)));
}

Ref<XMLNode> XMLNode::namespaceWithName(const String& prefix, const String& URI) {
    return Ref<XMLNode>::adopt(
        new XMLNode(XMLNodeKind::namespaceDeclaration, present(prefix), present(URI)));
}

String XMLNode::stringValue() const { return _value; }

void XMLNode::setStringValue(const String& value) {
    _value = present(value);
    _isLayout = false;
}

XMLDocument* XMLNode::rootDocument() const noexcept {
    const XMLNode* top = this;
    while (top->_parent != nullptr)
        top = top->_parent;
    return top->_kind == XMLNodeKind::document
               ? static_cast<XMLDocument*>(const_cast<XMLNode*>(top))
               : nullptr;
}

void XMLNode::detach() {
    if (_parent == nullptr)
        return;
    if (_parent->_kind == XMLNodeKind::document)
        static_cast<XMLDocument*>(_parent)->unlink(*this);
    else
        static_cast<XMLElement*>(_parent)->unlink(*this);
    release();
}

Ref<XMLNode> XMLNode::copy() const {
    auto copied = Ref<XMLNode>::adopt(new XMLNode(_kind, _name, _value));
    copied->_isLayout = _isLayout;
    KeptPlace::copy(*this, *copied);
    return copied;
}

bool XMLNode::isSameXML(const XMLNode& other) const {
    return this == &other || (_kind == other._kind && description() == other.description().view());
}

String XMLNode::XMLString(XMLOptions options) const {
    return written(*this, options, XMLChecks::on);
}

String XMLNode::description() const { return written(*this, XMLNoOptions, XMLChecks::off); }

const Class& XMLNode::describedClass() const {
    static const Class* const described = &detail::publish(
        {.name = "qx::XMLNode", .type = &typeid(XMLNode), .superclass = &typeid(Object)}, false);
    return *described;
}

} // namespace qx
