#include "xml/EntityTexts.h"

#include "xml/AttributeCounts.h"
#include "xml/CParserText.h"
#include "xml/ParseFailure.h"

#include <algorithm>
#include <bitset>
#include <charconv>
#include <libxml/entities.h>

namespace qx {

namespace {

// Less than any version of the C parser allows.
constexpr std::size_t maximumHeight = 32;

enum class Part { text, cdata, tag, other };

struct Markup {
    Part part;
    std::string_view start;
    std::string_view end;
};

// Where the markup that starts a text ends.
std::size_t endOf(const Markup& markup, std::string_view text) {
    if (markup.part != Part::tag) {
        const std::size_t end = text.find(markup.end, markup.start.size());
        return end != std::string_view::npos ? end + markup.end.size() : text.size();
    }
    char quote = '\0';
    for (std::size_t at = 0; at < text.size(); ++at) {
        const char c = text[at];
        if (quote != '\0')
            quote = c == quote ? '\0' : quote;
        else if (c == '"' || c == '\'')
            quote = c;
        else if (c == '>')
            return at + 1;
    }
    return text.size();
}

// Cuts the text of an entity into markup and what stands between.
template <class Use>
void forEachPart(std::string_view text, Use use) {
    static constexpr Markup markups[] = {{Part::cdata, "<![CDATA[", "]]>"},
                                         {Part::other, "<!--", "-->"},
                                         {Part::other, "<?", "?>"},
                                         {Part::tag, "<", ">"}};
    while (!text.empty()) {
        Part part = Part::text;
        std::size_t size = std::min(text.find('<'), text.size());
        if (size == 0) {
            const Markup& markup =
                *std::find_if(std::begin(markups), std::end(markups), [text](const Markup& known) {
                    return text.starts_with(known.start);
                });
            part = markup.part;
            size = endOf(markup, text);
        }
        use(part, text.substr(0, size));
        text.remove_prefix(size);
    }
}

// U+FDD0 to U+FDEF: no characters, and yet allowed in a document.
constexpr std::size_t markCount = 32;
constexpr std::size_t firstMark = 0xFDD0;
constexpr std::string_view markStart = "\xEF\xB7";
constexpr unsigned char firstMarkEnd = 0x90;

// The number of a character reference whose "&#" ends before the text; 0 for none.
std::size_t referredTo(std::string_view text) {
    const int base = text.starts_with('x') ? 16 : 10;
    const char* const start = text.data() + (base == 16 ? 1 : 0);
    std::size_t number = 0;
    std::from_chars(start, text.data() + text.size(), number, base);
    return number;
}

} // namespace

std::string EntityTexts::prepared(std::string_view text) {
    _heights.clear();
    if (findTagBeyond(text, maximumEntityAttributes) != std::string_view::npos)
        throw ParseFailure(parseErrors::tooManyAttributes, {maximumEntityAttributes});
    if (text.find('\r') == std::string_view::npos)
        return std::string(text);
    if (_mark == nullptr)
        _mark = freeMark();
    std::string result;
    forEachPart(text, [&](Part part, std::string_view piece) {
        for (const char c : piece)
            if (c == '\r' && _mark != nullptr && (part == Part::text || part == Part::cdata))
                result += _mark->data();
            else
                result += c;
    });
    return result;
}

std::string EntityTexts::unmarked(std::string_view piece, char replacement) const {
    const std::string_view mark(_mark->data());
    std::string result;
    for (std::size_t at = piece.find(mark); at != std::string_view::npos; at = piece.find(mark)) {
        result += piece.substr(0, at);
        result += replacement;
        piece.remove_prefix(at + mark.size());
    }
    return result += piece;
}

// Null for a document that holds all of them.
const EntityTexts::Mark* EntityTexts::freeMark() const noexcept {
    static constexpr auto marks = [] {
        std::array<Mark, markCount> all{};
        for (std::size_t i = 0; i < markCount; ++i)
            all[i] = {markStart[0], markStart[1], static_cast<char>(firstMarkEnd + i), '\0'};
        return all;
    }();
    std::bitset<markCount> used;
    for (std::size_t at = 0; (at = _document.find(markStart, at)) != std::string_view::npos;) {
        at += markStart.size();
        const std::size_t mark = at < _document.size()
                                     ? static_cast<unsigned char>(_document[at]) - firstMarkEnd
                                     : markCount;
        if (mark < markCount)
            used.set(mark);
    }
    // A "#" is enough: "&" may itself come from a reference.
    for (std::size_t at = 0; (at = _document.find('#', at)) != std::string_view::npos;) {
        const std::size_t mark = referredTo(_document.substr(++at)) - firstMark;
        if (mark < markCount)
            used.set(mark);
    }
    for (std::size_t i = 0; i < markCount; ++i)
        if (!used.test(i))
            return &marks[i];
    return nullptr;
}

std::size_t EntityTexts::heightOf(xmlDoc* document, const xmlEntity& entity, std::size_t depth) {
    if (depth > maximumHeight)
        throw ParseFailure(parseErrors::entitiesTooDeep, {maximumHeight});
    const auto known = _heights.find(&entity);
    if (known != _heights.end()) {
        if (depth + known->second > maximumHeight)
            throw ParseFailure(parseErrors::entitiesTooDeep, {maximumHeight});
        return known->second;
    }
    std::size_t height = 0;
    forEachPart(viewOf(entity.content), [&](Part part, std::string_view piece) {
        if (part != Part::text && part != Part::tag)
            return;
        for (std::size_t at = 0; (at = piece.find('&', at)) != std::string_view::npos;) {
            const std::size_t end = std::min(piece.find(';', at), piece.size());
            const std::string name(piece.substr(at + 1, end - at - 1));
            at = end;
            const xmlEntity* inner =
                xmlGetDocEntity(document, reinterpret_cast<const xmlChar*>(name.c_str()));
            if (inner != nullptr && inner->etype == XML_INTERNAL_GENERAL_ENTITY)
                height = std::max(height, heightOf(document, *inner, depth + 1) + 1);
        }
    });
    _heights.emplace(&entity, height);
    return height;
}

} // namespace qx
