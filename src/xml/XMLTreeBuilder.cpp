#include "xml/XMLTreeBuilder.h"

#include "base/TextBlocks.h"
#include "xml/ParseFailure.h"
#include "xml/XMLCharacters.h"
#include "xml/XMLLimits.h"
#include "xml/XMLSiblings.h"

#include <algorithm>
#include <libxml/xmlerror.h>

namespace qx {

namespace {

constexpr std::size_t maximumNamespaces = xmlLimits::namespaces;

std::uint32_t saturated(std::size_t number) {
    return static_cast<std::uint32_t>(std::min<std::size_t>(number, UINT32_MAX));
}

} // namespace

inline XMLNode* XMLTreeBuilder::newNode(XMLNodeKind kind, String name, String value) {
    return ::new (_blocks.allocate(sizeof(XMLNode)))
        XMLNode(kind, std::move(name), std::move(value));
}

void XMLTreeBuilder::startElement(const String& name, std::size_t attributes, std::size_t line,
                                  std::size_t column) {
    finishText();
    if (_open.size() >= _options.maximumDepth)
        throw ParseFailure(parseErrors::tooDeep, {_options.maximumDepth});
    requireSize(name.size(), parseErrors::nameTooLarge);
    const bool preserves = !_open.empty() && _open.back().preservesSpace;
    const std::size_t namespaces = _open.empty() ? 0 : _open.back().namespaces;
    const std::size_t room = XMLElement::roomFor(attributes);
    auto* element = ::new (_blocks.allocate(XMLElement::sizeWith(room))) XMLElement(name, room);
    element->_line = saturated(line);
    element->_column = saturated(column);
    if (_open.empty())
        XMLSiblings::append(_document, _document._firstChild, element);
    else
        appendChild(*_open.back().element, element);
    element->expectAttributes(attributes);
    _open.push_back({element, _layouts.size(), namespaces, false, preserves});
}

void XMLTreeBuilder::addNamespace(const String& prefix, const String& URI) {
    if (++_open.back().namespaces > maximumNamespaces)
        throw ParseFailure(parseErrors::tooManyNamespaces, {maximumNamespaces});
    requireSize(URI.size(), parseErrors::valueTooLarge);
    XMLElement& element = *_open.back().element;
    element.appendUnlessThere(
        element._firstNamespace,
        Ref<XMLNode>::adopt(newNode(XMLNodeKind::namespaceDeclaration, prefix, URI)));
}

void XMLTreeBuilder::addAttribute(const String& name, std::string_view value) {
    requireSize(name.size(), parseErrors::nameTooLarge);
    requireSize(value.size(), parseErrors::valueTooLarge);
    XMLElement& element = *_open.back().element;
    if (element.canHoldAttribute())
        element.holdAttribute(name, textInBlock(value));
    else
        element.appendAttribute(
            Ref<XMLNode>::adopt(newNode(XMLNodeKind::attribute, name, textInBlock(value))));
}

void XMLTreeBuilder::endElement() {
    if (hasPendingText())
        placeText(true);
    if (_layouts.size() != _open.back().firstLayout)
        dropLayout(_open.back());
    _open.pop_back();
}

void XMLTreeBuilder::joinText(std::string_view piece, bool mayBeLayout) {
    if (_open.empty())
        return;
    requireSize(_lasting.size() + _joined.size() + piece.size(), parseErrors::textTooLarge);
    _mayBeLayout = mayBeLayout && (!hasPendingText() || _mayBeLayout);
    _joined += _lasting;
    _joined += piece;
    _lasting = {};
}

void XMLTreeBuilder::addComment(std::string_view text) {
    finishText();
    requireSize(text.size(), parseErrors::commentTooLarge);
    appendToCurrent(XMLNode::initCommentWithStringValue(text));
}

void XMLTreeBuilder::addProcessingInstruction(const String& target, std::string_view data) {
    finishText();
    requireSize(data.size(), parseErrors::instructionTooLarge);
    appendToCurrent(XMLNode::initProcessingInstructionWithName(target, data));
}

// White space of the document's own with a line break.
inline bool XMLTreeBuilder::isLayout(std::string_view text) const noexcept {
    return _mayBeLayout && isWhite(text.front()) && isWhite(text) &&
           (text.front() == '\n' || text.find('\n') != std::string_view::npos);
}

void XMLTreeBuilder::placeText(bool endsElement) {
    OpenElement& open = _open.back();
    const std::string_view text = _lasting.empty() ? std::string_view(_joined) : _lasting;
    const bool isLayout = this->isLayout(text);
    if (isLayout && !open.hasText && !open.preservesSpace && !_options.keepWhiteSpace) {
        // No text follows that would have it kept once the element ends.
        if (!endsElement)
            _layouts.push_back(
                {XMLNode::lastOf(open.element->_firstChild),
                 _lasting.empty() ? _joinedLayouts.emplace_back(_joined) : _lasting});
    } else if (endsElement && !isLayout && open.element->_childCount == 0 &&
               _layouts.size() == open.firstLayout) {
        open.element->holdText(textInBlock(text));
    } else {
        if (!isLayout && !open.hasText)
            restoreLayout(open);
        appendText(text, isLayout, nullptr);
    }
    _lasting = {};
    _joined.clear();
}

// Other text has come: what was put aside before it stands beside text.
void XMLTreeBuilder::restoreLayout(OpenElement& open) {
    open.hasText = true;
    for (std::size_t i = open.firstLayout; i < _layouts.size(); ++i) {
        const Layout& layout = _layouts[i];
        appendText(layout.text, true,
                   layout.after != nullptr ? layout.after->_next : open.element->_firstChild);
    }
    dropLayout(open);
}

void XMLTreeBuilder::appendText(std::string_view text, bool isLayout, XMLNode* before) {
    auto* node = newNode(XMLNodeKind::text, String(), textInBlock(text));
    node->_isLayout = isLayout;
    appendChild(*_open.back().element, node, before);
}

void XMLTreeBuilder::dropLayout(const OpenElement& open) noexcept {
    _layouts.erase(_layouts.begin() + static_cast<std::ptrdiff_t>(open.firstLayout),
                   _layouts.end());
}

void XMLTreeBuilder::appendChild(XMLElement& parent, XMLNode* child, XMLNode* before) noexcept {
    XMLSiblings::insert(parent, parent._firstChild, child, before);
    ++parent._childCount;
}

void XMLTreeBuilder::appendToCurrent(Ref<XMLNode> node) {
    if (_open.empty())
        XMLSiblings::append(_document, _document._firstChild, node.detach());
    else
        appendChild(*_open.back().element, node.detach());
}

void XMLTreeBuilder::refuseSize(const ErrorText& text) const {
    throw ParseFailure(text, {_options.maximumTextSize});
}

} // namespace qx
