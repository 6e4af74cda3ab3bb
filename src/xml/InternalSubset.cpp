#include "xml/InternalSubset.h"

#include "xml/ParseFailure.h"

#include <algorithm>

namespace qx {

namespace {

// What a quote, a comment or an instruction ends with, when one starts here; none otherwise.
std::string_view endOfQuoted(std::string_view text) {
    if (text.starts_with('"') || text.starts_with('\''))
        return text.substr(0, 1);
    if (text.starts_with("<!--"))
        return "-->";
    return text.starts_with("<?") ? "?>" : "";
}

} // namespace

// Goes through what is well-formed up to the bracket that closes the subset. At anything else the
// parser stops, so it does not matter how far this goes.
void InternalSubset::read(std::string_view text) {
    if (!text.starts_with('['))
        return;
    text = text.substr(1, std::min(_limit, text.size()) + 1);
    std::size_t at = 0;
    while (at < text.size() && text[at] != ']') {
        const std::string_view rest = text.substr(at);
        const std::string_view end = endOfQuoted(rest);
        const std::size_t found = end.empty() ? 0 : rest.find(end, end == "-->" ? 4 : 1);
        at = found == std::string_view::npos ? text.size()
                                             : at + found + std::max<std::size_t>(end.size(), 1);
    }
    expand(at);
}

void InternalSubset::expand(std::size_t bytes) {
    _size += bytes;
    if (_size > _limit)
        throw ParseFailure(parseErrors::subsetTooLarge, {_limit});
}

} // namespace qx
