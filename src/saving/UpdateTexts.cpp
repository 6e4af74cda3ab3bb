// Texts and attributes that are there get another value, in the form in which they stand.

#include "saving/UpdatePlan.h"
#include "xml/XMLCharacters.h"

#include <algorithm>

namespace qx::detail {

namespace {

constexpr std::string_view cdataStart = "<![CDATA[";
constexpr std::string_view cdataEnd = "]]>";
constexpr std::string_view blanks = " \t\r\n";

// How much of two texts is the same at the start, up to whole characters.
std::size_t commonStart(std::string_view a, std::string_view b) {
    std::size_t same = 0;
    while (same < std::min(a.size(), b.size()) && a[same] == b[same])
        ++same;
    while (same > 0 && same < a.size() && (a[same] & 0xC0) == 0x80)
        --same;
    while (same > 0 && same < b.size() && (b[same] & 0xC0) == 0x80)
        --same;
    return same;
}

std::size_t commonEnd(std::string_view a, std::string_view b, std::size_t start) {
    const std::size_t most = std::min(a.size(), b.size()) - start;
    std::size_t same = 0;
    while (same < most && a[a.size() - same - 1] == b[b.size() - same - 1])
        ++same;
    while (same > 0 && (a[a.size() - same] & 0xC0) == 0x80)
        --same;
    return same;
}

// A number or a truth keeps the blanks around it.
std::string withBlanksOf(std::string_view raw, std::string_view was, std::string_view now) {
    const std::size_t begin = std::min(raw.find_first_not_of(blanks), raw.size());
    const std::size_t end = raw.find_last_not_of(blanks) + 1;
    const bool isPadded =
        begin != raw.size() && raw != was && raw.substr(begin, end - begin) == was;
    return isPadded
               ? std::string(raw.substr(0, begin)) + std::string(now) + std::string(raw.substr(end))
               : std::string(now);
}

} // namespace

void UpdatePlan::setAttribute(Entry attribute, Shown value) {
    const SourceMarkup::Spot& spot = _source.markup[attribute];
    if (!spot.isPlaced())
        return fail(value);
    const char quote = _source.markup.text()[spot.end - 1];
    add(spot.insideBegin, spot.insideEnd,
        _source.writer.attributeValue(_source.after.text(value), quote), value);
}

// With the blanks before it. A wrapper that held nothing else goes, too.
void UpdatePlan::removeAttribute(Entry attribute, Entry element, Shown field) {
    const SourceMarkup::Spot& spot = _source.markup[attribute];
    if (!spot.isPlaced())
        return fail(field);
    const bool isWrapper =
        !_source.after[field].field->bindings.empty() &&
        _source.document.name(element) == _source.after[field].field->location() &&
        !_source.after[field].field->location().isEmpty();
    bool isOnly = _source.index.firstChild(element) == element + 2;
    _source.document.forEachChild(element, [&](Entry) { isOnly = false; });
    if (isWrapper && isOnly)
        return removeElement(element, field);
    add(blanksBefore(spot.begin), spot.end, {}, field);
}

// Where the white space before a place begins.
SourceMarkup::Offset UpdatePlan::blanksBefore(SourceMarkup::Offset place) const {
    while (place > 0 && blanks.find(_source.markup.text()[place - 1]) != blanks.npos)
        --place;
    return place;
}

void UpdatePlan::setText(Entry element, bool isOwn, std::string_view was, std::string_view now,
                         Shown value) {
    const SourceMarkup::Spot& spot = _source.markup[element];
    if (!spot.isPlaced())
        return fail(value);
    const String raw = _source.document.text(element).string();
    const std::string wanted = withBlanksOf(raw.view(), was, now);
    if (raw.view() == wanted)
        return;
    if (setPieces(element, raw.view(), wanted, value))
        return;
    bool hasChild = false;
    _source.document.forEachChild(
        element, [&](Entry child) { hasChild = hasChild || _source.document.isElement(child); });
    if (hasChild && isOwn)
        return fail(value);
    _rewritten.push_back(value);
    add(spot.insideBegin, spot.insideEnd, _source.writer.text(wanted), value);
}

// The texts inside an element, as reading joins them.
std::vector<UpdatePlan::Piece> UpdatePlan::piecesOf(Entry element, std::string& all) const {
    std::vector<Piece> pieces;
    const XMLIndex& index = _source.index;
    std::string room;
    for (Entry at = element + 1; at < index.contentEnd(element); ++at) {
        const bool isText = index[at].nodeKind() == XMLNodeKind::text;
        if (!isText || XMLIndex::isLayout(index[at], index[parentOf(at)]))
            continue;
        pieces.push_back({at, std::string(index.value(index[at], room))});
        all += pieces.back().text;
    }
    return pieces;
}

// Where the text stands in one or more pieces, with comments and the like between them, only those
// that change are touched. False where a piece has no place of its own.
bool UpdatePlan::setPieces(Entry element, std::string_view was, std::string_view now, Shown value) {
    std::string all;
    const std::vector<Piece> pieces = piecesOf(element, all);
    if (all != was)
        return false;
    if (pieces.empty()) {
        const SourceMarkup::Spot& spot = _source.markup[element];
        if (!spot.isEmptyTag())
            add(spot.insideEnd, spot.insideEnd, _source.writer.text(now), value);
        else
            openWithText(element, _source.writer.text(now), value);
        return true;
    }
    const std::size_t start = commonStart(was, now);
    const std::size_t end = was.size() - commonEnd(was, now, start);
    const std::string_view middle = now.substr(start, now.size() - (was.size() - end) - start);
    std::size_t begin = 0;
    bool isPut = false;
    std::vector<std::pair<const Piece*, std::string>> changed;
    for (const Piece& piece : pieces) {
        const std::size_t pieceEnd = begin + piece.text.size();
        const bool takesMiddle = !isPut && (start < pieceEnd || &piece == &pieces.back());
        const std::size_t from = std::clamp(start, begin, pieceEnd) - begin;
        const std::size_t to = std::max(std::clamp(end, begin, pieceEnd) - begin, from);
        begin = pieceEnd;
        isPut = isPut || takesMiddle;
        std::string text = piece.text.substr(0, from) + std::string(takesMiddle ? middle : "") +
                           piece.text.substr(to);
        if (text == piece.text)
            continue;
        if (parentOf(piece.entry) != element || !_source.markup[piece.entry].isPlaced())
            return false;
        changed.emplace_back(&piece, std::move(text));
    }
    for (const auto& [piece, text] : changed)
        setPiece(piece->entry, piece->text, text, value);
    return true;
}

// A CDATA section stays one; elsewhere what is the same at both ends stays as it is written.
void UpdatePlan::setPiece(Entry piece, std::string_view was, std::string_view now, Shown value) {
    constexpr std::string_view special = "&;<>\r";
    const SourceMarkup::Spot& spot = _source.markup[piece];
    const std::string_view raw = _source.markup.raw(piece);
    const bool isCDATA = raw.starts_with(cdataStart) && raw.find(cdataEnd) == raw.size() - 3;
    if (isCDATA && !isWhite(now) && _source.writer.mayBeCDATA(now))
        return add(spot.begin + 9, spot.end - 3, _source.writer.lines(now), value);
    std::size_t start = 0, end = 0;
    if (!isCDATA && !isWhite(now)) {
        start = std::min(commonStart(raw, was), commonStart(was, now));
        start = std::min(raw.find_first_of(special), start);
        end = std::min(commonEnd(raw, was, start), commonEnd(was, now, start));
        const std::size_t last = raw.substr(raw.size() - end).find_last_of(special);
        end = last == raw.npos ? end : end - last - 1;
    }
    add(spot.begin + static_cast<SourceMarkup::Offset>(start),
        spot.end - static_cast<SourceMarkup::Offset>(end),
        _source.writer.text(now.substr(start, now.size() - end - start)), value);
}

} // namespace qx::detail
