#include "xml/XMLPieces.h"

#include "xml/XMLLimits.h"

#include <algorithm>

namespace qx {

namespace {

constexpr std::size_t usualSize = 256 * 1024;
// What is repeated before each piece is at most this part of it.
constexpr std::size_t shareOfOpening = 4;

} // namespace

XMLParser::Parsed XMLPieces::next(Ref<Error>* error) {
    if (_hasEnded)
        return nullptr;
    const XMLSplitter before = _splitter;
    const Found found = findCut();
    _hasEnded = found != Found::cut;
    if (found == Found::nothing) {
        if (error != nullptr)
            *error = _failure;
        return nullptr;
    }
    if (_hasEnded && !_undecoded && text().empty() && _splitter.hasRootEnded())
        return nullptr;
    try {
        return parse(before, found);
    } catch (const ParseFailure& failure) {
        _hasEnded = true;
        if (error != nullptr)
            *error = XMLParser::errorOf(failure, std::string(_opening).append(text()), _origin);
        return nullptr;
    }
}

XMLPieces::Found XMLPieces::findCut() {
    const std::size_t enough = std::max(usualSize, shareOfOpening * _opening.size());
    while (true) {
        _splitter.goOver(text(), enough);
        if (_splitter.cut() >= enough || isWorthACut())
            return Found::cut;
        if (_splitter.isFaulty() || isBeyondLimit() || _source.isAtEnd() || _undecoded)
            return Found::end;
        if (!_failure)
            readMore();
        if (_failure)
            return _splitter.itemCount() != 0 ? Found::cut : Found::nothing;
    }
}

// Items are handed out before a wait, unless too much has to be repeated for them.
bool XMLPieces::isWorthACut() const {
    return _splitter.itemCount() != 0 && _source.isWaiting() &&
           _splitter.cut() * shareOfOpening >= _opening.size();
}

// Of a whole document, or of what no document has so much of in one: texts and the DOCTYPE have
// limits, whose characters may be references, and a tag a number of attributes.
bool XMLPieces::isBeyondLimit() const noexcept {
    constexpr std::size_t bytesOfCharacter = 16;
    constexpr std::size_t largestTag = 64 * 1024 * 1024;
    const std::size_t unfinished = text().size() - _splitter.position();
    return text().size() > xmlLimits::documentSize ||
           (unfinished > largestTag &&
            unfinished / bytesOfCharacter >
                std::max(_options.maximumTextSize, _options.maximumSubsetSize));
}

void XMLPieces::readMore() {
    _text.erase(0, _start);
    _start = 0;
    try {
        _source.read(_text, &_failure);
    } catch (const ParseFailure& failure) {
        _undecoded = failure;
    }
}

// Up to the cut, or to the end of the text. Where it has a fault, the items before that come first.
XMLParser::Parsed XMLPieces::parse(const XMLSplitter& before, Found found) {
    try {
        if (found == Found::cut)
            return parseUpToCut();
        if (_undecoded) {
            ParseFailure failure = *_undecoded;
            failure.offset = _opening.size() + failure.offset - _start;
            throw failure;
        }
        auto parsed =
            XMLParser::parsePiece(std::string(_opening).append(text()), _origin, _options, &_kept);
        if (_splitter.isFaulty() || isBeyondLimit())
            throw ParseFailure(parseErrors::textTooLarge, {_options.maximumTextSize},
                               _opening.size() + _splitter.position());
        return parsed;
    } catch (const ParseFailure& failure) {
        const std::size_t fault = failure.offset - std::min(failure.offset, _opening.size());
        if (!cutBefore(fault, before))
            throw;
        const std::size_t cut = _splitter.cut();
        _hasEnded = false;
        try {
            return parseUpToCut();
        } catch (const ParseFailure&) {
            // It lies in the last item: at its end a tag inside that was not closed has shown.
            if (!cutBefore(cut - 1, before))
                throw failure;
            return parseUpToCut();
        }
    }
}

// False where no item ends before that place.
bool XMLPieces::cutBefore(std::size_t place, const XMLSplitter& before) {
    _splitter = before;
    _splitter.goOver(text().substr(0, place), std::string_view::npos);
    return _splitter.itemCount() != 0;
}

XMLParser::Parsed XMLPieces::parseUpToCut() {
    const std::size_t cut = _splitter.cut();
    const std::string closing = _splitter.closing();
    std::string piece;
    piece.reserve(_opening.size() + cut + closing.size());
    piece.append(_opening).append(text().substr(0, cut)).append(closing);
    auto parsed = XMLParser::parsePiece(std::move(piece), _origin, _options, &_kept);
    removeUpToCut();
    return parsed;
}

void XMLPieces::removeUpToCut() {
    const std::size_t cut = _splitter.cut();
    TextOrigin begin;
    begin.line = _origin.line;
    begin.column = _origin.column;
    TextPosition place(text().substr(0, cut), begin);
    std::vector<std::size_t> lines(_splitter.openCount());
    std::vector<std::size_t> items(lines.size());
    for (std::size_t i = 0; i < lines.size(); ++i) {
        items[i] = _splitter.itemsInOpen(i);
        const std::size_t tag = _splitter.placeOfOpen(i);
        if (tag == XMLSplitter::none) {
            lines[i] = _origin.tagLines[i];
            continue;
        }
        place.moveTo(tag);
        lines[i] = place.line();
    }
    place.moveTo(cut);
    _start += cut;
    _splitter.removeUpToCut();
    _opening = _splitter.opening();
    _origin = {_opening.size(),  _splitter.prologueSize(),          place.line(),    place.column(),
               std::move(lines), std::string(_splitter.itemName()), std::move(items)};
}

} // namespace qx
