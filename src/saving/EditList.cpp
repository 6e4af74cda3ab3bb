#include "saving/EditList.h"

#include <algorithm>
#include <utility>

namespace qx::detail {

const SourceEdit* EditList::arrange() {
    const auto stands = [](const SourceEdit& a, const SourceEdit& b) {
        return std::pair(a.begin, a.begin != a.end) < std::pair(b.begin, b.begin != b.end);
    };
    if (!std::is_sorted(_edits.begin(), _edits.end(), stands))
        std::stable_sort(_edits.begin(), _edits.end(), stands);
    const auto same = [](const SourceEdit& a, const SourceEdit& b) {
        return a.begin == b.begin && a.end == b.end && a.begin != a.end && a.text == b.text;
    };
    _edits.erase(std::unique(_edits.begin(), _edits.end(), same), _edits.end());
    const auto meets = [](const SourceEdit& a, const SourceEdit& b) { return b.begin < a.end; };
    const auto found = std::adjacent_find(_edits.begin(), _edits.end(), meets);
    return found != _edits.end() ? &*found : nullptr;
}

std::string EditList::applied(std::string_view text, Offset begin, Offset end) const {
    std::size_t size = end - begin;
    for (const SourceEdit& edit : _edits)
        size += edit.text.size();
    std::string result;
    result.reserve(size);
    for (const SourceEdit& edit : _edits) {
        result += text.substr(begin, edit.begin - begin);
        result += edit.text;
        begin = edit.end;
    }
    result += text.substr(begin, end - begin);
    return result;
}

} // namespace qx::detail
