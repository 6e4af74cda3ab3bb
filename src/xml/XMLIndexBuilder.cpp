#include "xml/XMLIndexBuilder.h"

#include "xml/ParseFailure.h"
#include "xml/XMLCharacters.h"
#include "xml/XMLLimits.h"

namespace qx {

void XMLIndexBuilder::setDeclaration(const String& version, const String& standalone) {
    _index._version = version;
    _index._standalone = standalone;
}

bool XMLIndexBuilder::isOwn(std::string_view piece) const noexcept {
    const auto addressOf = [](const void* place) {
        return reinterpret_cast<std::uintptr_t>(place);
    };
    return addressOf(piece.data()) - addressOf(_index._text.data()) < _index._text.size();
}

// What is no part of the document's text is copied.
void XMLIndexBuilder::add(XMLNodeKind kind, Number name, std::string_view value) {
    auto entry = XMLIndexEntry::of(kind, name, 0);
    const bool isAside = !isOwn(value);
    if (isAside && _index._aside.size() + value.size() > UINT32_MAX)
        throw ParseFailure(parseErrors::documentTooLarge);
    entry.setIf(isAside, XMLIndexEntry::isAside);
    entry.begin = static_cast<std::uint32_t>(
        isAside ? _index._aside.size()
                : static_cast<std::size_t>(value.data() - _index._text.data()));
    entry.end = entry.begin + static_cast<std::uint32_t>(value.size());
    entry.next = static_cast<Number>(_index._entries.size()) + 1;
    if (isAside)
        _index._aside += value;
    _index._entries.push_back(entry);
}

void XMLIndexBuilder::startElement(Number name, std::size_t offset) {
    finishText();
    if (_open.size() >= _options.maximumDepth)
        throw ParseFailure(parseErrors::tooDeep, {_options.maximumDepth});
    requireSize(_index._names[name].size(), parseErrors::nameTooLarge);
    const bool keeps = _options.keepWhiteSpace || (!_open.empty() && _open.back().preservesSpace);
    const std::size_t namespaces = _open.empty() ? 0 : _open.back().namespaces;
    _open.push_back({static_cast<Number>(_index._entries.size()), namespaces, keeps, keeps});
    _index._entries.push_back(
        XMLIndexEntry::of(XMLNodeKind::element, name, static_cast<std::uint32_t>(offset)));
    _hasRoot = true;
}

void XMLIndexBuilder::addNamespace(Number prefix, std::string_view URI) {
    constexpr std::size_t most = xmlLimits::namespaces;
    if (++_open.back().namespaces > most)
        throw ParseFailure(parseErrors::tooManyNamespaces, {most});
    requireSize(URI.size(), parseErrors::valueTooLarge);
    add(XMLNodeKind::namespaceDeclaration, prefix, URI);
}

void XMLIndexBuilder::addAttribute(Number name, std::string_view value) {
    requireSize(_index._names[name].size(), parseErrors::nameTooLarge);
    requireSize(value.size(), parseErrors::valueTooLarge);
    add(XMLNodeKind::attribute, name, value);
}

void XMLIndexBuilder::setPreservesSpace(bool preserves) {
    OpenElement& element = _open.back();
    element.preservesSpace = element.keepsLayout = preserves || _options.keepWhiteSpace;
}

void XMLIndexBuilder::endElement() {
    finishText();
    XMLIndexEntry& element = _index._entries[_open.back().number];
    element.next = static_cast<Number>(_index._entries.size());
    element.setIf(_open.back().keepsLayout, XMLIndexEntry::keepsLayout);
    _open.pop_back();
}

// The parser hands a text out in pieces; where one of the document's own is all, it stays there.
void XMLIndexBuilder::addText(std::string_view piece, bool mayBeLayout) {
    if (_open.empty())
        return;
    const bool isFirst = _piece.empty() && _joined.empty();
    requireSize(_piece.size() + _joined.size() + piece.size(), parseErrors::textTooLarge);
    _mayBeLayout = mayBeLayout && (isFirst || _mayBeLayout);
    if (isFirst && isOwn(piece)) {
        _piece = piece;
        return;
    }
    _joined += _piece;
    _joined += piece;
    _piece = {};
}

void XMLIndexBuilder::finishText() {
    const std::string_view text = _piece.empty() ? std::string_view(_joined) : _piece;
    if (text.empty())
        return;
    add(XMLNodeKind::text, 0, text);
    const bool isBlank = isLayout(text);
    _index._entries.back().setIf(isBlank, XMLIndexEntry::isBlank);
    _open.back().keepsLayout |= !isBlank;
    _piece = {};
    _joined.clear();
}

// White space of the document's own with a line break.
bool XMLIndexBuilder::isLayout(std::string_view text) const noexcept {
    return _mayBeLayout && isWhite(text) && text.find('\n') != std::string_view::npos;
}

void XMLIndexBuilder::addComment(std::string_view text) {
    finishText();
    requireSize(text.size(), parseErrors::commentTooLarge);
    add(XMLNodeKind::comment, 0, text);
}

void XMLIndexBuilder::addProcessingInstruction(Number target, std::string_view data) {
    finishText();
    requireSize(data.size(), parseErrors::instructionTooLarge);
    add(XMLNodeKind::processingInstruction, target, data);
}

void XMLIndexBuilder::refuseSize(const ErrorText& text) const {
    throw ParseFailure(text, {_options.maximumTextSize});
}

} // namespace qx
