#include "xml/AttributeCounts.h"

#include <algorithm>

namespace qx {

namespace {

// No attribute takes less.
constexpr std::size_t shortestAttribute = 4;

// Text has no quotes to heed.
std::size_t countAttributes(std::string_view tag) {
    if (tag.starts_with("<!") || tag.starts_with("<?") || tag.starts_with("</"))
        return 0;
    std::size_t count = 0;
    char quote = '\0';
    for (const char c : tag) {
        if (c == '=' && quote == '\0')
            ++count;
        else if (quote != '\0')
            quote = c == quote ? '\0' : quote;
        else if (c == '"' || c == '\'')
            quote = c;
        else if (c == '>')
            break;
    }
    return count;
}

} // namespace

// Only tags can have no "<" inside for long and matter here; so it is enough to look for the last
// "<" of each stretch of text, and to walk through stretches that have none.
std::size_t findTagBeyond(std::string_view text, std::size_t maximum) {
    const std::size_t longTag = maximum * shortestAttribute;
    std::size_t tag = 0;   // the last "<" found
    std::size_t known = 1; // there is none between it and here
    while (text.size() - tag >= longTag) {
        const std::size_t last = text.substr(known, tag + longTag - known).rfind('<');
        if (last != std::string_view::npos) {
            const std::size_t found = known + last;
            known = tag + longTag;
            tag = found;
            continue;
        }
        const std::size_t next = std::min(text.find('<', tag + longTag), text.size());
        if (countAttributes(text.substr(tag, next - tag)) > maximum)
            return tag;
        tag = next;
        known = next + 1;
    }
    return std::string_view::npos;
}

} // namespace qx
