#include "saving/SourceLayout.h"

#include "xml/XMLCharacters.h"

namespace qx::detail {

namespace {

constexpr std::size_t npos = std::string_view::npos;

bool isBlank(char c) { return c == ' ' || c == '\t'; }
bool isBreak(char c) { return c == '\n' || c == '\r'; }

} // namespace

SourceLayout::SourceLayout(const XMLIndex& index, const SourceMarkup& markup)
    : _index(index), _markup(markup) {
    const std::string_view text = markup.text();
    if (const std::size_t end = text.find_first_of("\r\n"); end != npos)
        _newline = text.substr(end, text.substr(end).starts_with("\r\n") ? 2 : 1);
}

SourceLayout::Habits SourceLayout::findHabits() const {
    Habits found;
    const std::string_view text = _markup.text();
    bool hasQuote = false, hasEmpty = false;
    Number root = UINT32_MAX;
    for (Number at = 0; at < _index.entries().size() && !(hasQuote && hasEmpty); ++at) {
        const XMLNodeKind kind = _index[at].nodeKind();
        const bool isElement = kind == XMLNodeKind::element;
        if (isElement && root == UINT32_MAX)
            root = at;
        const bool mayShow = isElement ? !hasEmpty && _index.firstChild(at) == _index.contentEnd(at)
                                       : !hasQuote && kind == XMLNodeKind::attribute;
        const SourceMarkup::Spot spot = mayShow ? _markup[at] : SourceMarkup::Spot();
        if (!spot.isPlaced())
            continue;
        if (isElement && spot.insideBegin == spot.insideEnd) {
            hasEmpty = true;
            if (!spot.isEmptyTag())
                found.emptyTag = {};
            else if (isBlank(text[spot.end - 3]))
                found.emptyTag = " />";
        } else if (!isElement) {
            hasQuote = true;
            found.quote = text[spot.end - 1];
        }
    }
    if (const auto unit = findUnit(root))
        found.unit = *unit;
    return found;
}

// Of the first element that begins a line inside another that does.
std::optional<std::string_view> SourceLayout::findUnit(Number root) const {
    const auto outer = root != UINT32_MAX ? lineStart(_markup[root].begin) : std::nullopt;
    if (!outer)
        return std::nullopt;
    const std::size_t outside =
        outer->size() - std::min(outer->find_first_of(" \t"), outer->size());
    for (Number at = _index.firstChild(root); at < _index.contentEnd(root);
         at = _index.siblingOf(at)) {
        if (_index[at].nodeKind() != XMLNodeKind::element || !_markup[at].isPlaced())
            continue;
        const auto inner = lineStart(_markup[at].begin);
        const std::size_t blanks = inner ? std::min(inner->find_first_of(" \t"), inner->size()) : 0;
        if (!inner || inner->size() - blanks < outside)
            continue;
        return inner->substr(blanks + outside);
    }
    return std::nullopt;
}

std::optional<std::string_view> SourceLayout::lineStart(Offset place) const {
    const std::string_view text = _markup.text();
    std::size_t begin = place;
    while (begin > 0 && isBlank(text[begin - 1]))
        --begin;
    if (begin == 0)
        return text.substr(0, place);
    if (!isBreak(text[begin - 1]))
        return std::nullopt;
    --begin;
    if (begin > 0 && text[begin] == '\n' && text[begin - 1] == '\r')
        --begin;
    return text.substr(begin, place - begin);
}

bool SourceLayout::isInline(Number element) const {
    if (!_index[element].has(XMLIndexEntry::keepsLayout))
        return false;
    const auto [known, isNew] = _inline.try_emplace(element);
    if (isNew)
        known->second = hasInlineText(element);
    return known->second;
}

bool SourceLayout::isOnOneLine(Number element) const {
    const auto [known, isNew] = _onOneLine.try_emplace(element);
    if (!isNew)
        return known->second;
    const auto& spot = _markup[element];
    const bool hasBreak =
        _markup.text().substr(spot.begin, spot.end - spot.begin).find_first_of("\r\n") != npos;
    for (Number at = _index.firstChild(element); at < _index.contentEnd(element) && !hasBreak;
         at = _index.siblingOf(at))
        known->second |= _index[at].nodeKind() == XMLNodeKind::element;
    return known->second;
}

// White space without a line break counts as content when a document is read, but comments stand
// behind such, too. Where there is only layout, xml:space has it kept.
bool SourceLayout::hasInlineText(Number element) const {
    bool isKept = true;
    for (Number at = _index.firstChild(element); at < _index.contentEnd(element);
         at = _index.siblingOf(at)) {
        if (_index[at].nodeKind() != XMLNodeKind::text)
            continue;
        std::string room;
        if (!isWhite(_index.value(_index[at], room)))
            return true;
        isKept = isKept && _index[at].has(XMLIndexEntry::isBlank);
    }
    return isKept;
}

std::optional<std::string> SourceLayout::lineStartInside(Number element) const {
    const auto outer = lineStart(_markup[element].begin);
    if (!outer || isInline(element))
        return std::nullopt;
    // A root at the start of the text stands on a line, but does not show that there are others.
    if (_markup.text().find_first_of("\r\n") == npos)
        return std::nullopt;
    const bool hasBreak = !outer->empty() && isBreak(outer->front());
    return std::string(hasBreak ? "" : _newline) + std::string(*outer) + unit();
}

SourceLayout::Offset SourceLayout::withComments(Offset begin) const {
    const std::string_view text = _markup.text();
    while (const auto line = lineStart(begin)) {
        const std::string_view before = text.substr(0, begin - line->size());
        if (line->empty() || !before.ends_with("-->"))
            break;
        const std::size_t comment = before.rfind("<!--");
        if (comment == npos || !lineStart(static_cast<Offset>(comment)))
            break;
        begin = static_cast<Offset>(comment);
    }
    return begin;
}

SourceLayout::Offset SourceLayout::behind(Number entry) const {
    const std::string_view text = _markup.text();
    std::size_t end = _markup[entry].end;
    while (true) {
        const std::size_t next = text.find_first_not_of(" \t", end);
        if (next == npos || !text.substr(next).starts_with("<!--"))
            break;
        const std::size_t close = text.find("-->", next + 4) + 3;
        if (text.substr(next, close - next).find_first_of("\r\n") != npos)
            break;
        end = close;
    }
    return endsLine(static_cast<Offset>(end)) ? static_cast<Offset>(end) : _markup[entry].end;
}

bool SourceLayout::endsLine(Offset place) const {
    const std::string_view text = _markup.text();
    const std::size_t rest = text.find_first_not_of(" \t", place);
    return rest == npos || isBreak(text[rest]) || text.substr(rest).starts_with("</");
}

std::pair<SourceLayout::Offset, SourceLayout::Offset> SourceLayout::region(Number entry,
                                                                           Offset begin) const {
    const Offset end = _markup[entry].end;
    const auto line = lineStart(begin);
    if (!line || line->empty() || !endsLine(end))
        return {begin, end};
    return {begin - static_cast<Offset>(line->size()), end};
}

} // namespace qx::detail
