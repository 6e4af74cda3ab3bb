#include "saving/TextMerge.h"

#include "saving/EditList.h"
#include "saving/ListMatching.h"

#include <algorithm>
#include <functional>

namespace qx::detail {

namespace {

struct Lines {
    std::vector<std::size_t> starts;
    std::vector<ListItem> items;

    explicit Lines(std::string_view text) {
        for (std::size_t at = 0; at < text.size();) {
            const std::size_t end = std::min(text.find('\n', at), text.size() - 1) + 1;
            starts.push_back(at);
            items.push_back({std::hash<std::string_view>()(text.substr(at, end - at)), 0});
            at = end;
        }
    }
    std::size_t lineOf(std::size_t offset) const {
        return static_cast<std::size_t>(std::upper_bound(starts.begin(), starts.end(), offset) -
                                        starts.begin()) -
               1;
    }
};

} // namespace

std::optional<std::string> carriedOver(std::string_view base,
                                       const std::vector<QXXMLUpdate::Edit>& edits,
                                       std::string_view theirs, String& conflict) {
    const Lines before(base), now(theirs);
    const ListMatching matching = match(before.items, now.items);
    std::vector<std::size_t> place(before.starts.size(), ListMatching::none);
    for (std::size_t i = 0; i < matching.was.size(); ++i)
        if (matching.stays[i])
            place[matching.was[i]] = i;
    EditList carried;
    for (const QXXMLUpdate::Edit& edit : edits) {
        const std::size_t end = edit.offset + edit.oldText.size();
        const std::size_t first = before.lineOf(edit.offset);
        const std::size_t last = before.lineOf(end != edit.offset ? end - 1 : end);
        bool isThere = true;
        for (std::size_t line = first; line <= last && isThere; ++line)
            isThere =
                place[line] != ListMatching::none && place[line] - place[first] == line - first;
        const std::size_t at =
            isThere ? now.starts[place[first]] + edit.offset - before.starts[first] : 0;
        if (!isThere || theirs.substr(at, edit.oldText.size()) != edit.oldText.view()) {
            conflict = edit.keyPath;
            return std::nullopt;
        }
        carried.add({static_cast<EditList::Offset>(at),
                     static_cast<EditList::Offset>(at + edit.oldText.size()), edit.newText.str(), 0,
                     edit.keyPath});
    }
    if (const SourceEdit* const clash = carried.arrange()) {
        conflict = clash->keyPath;
        return std::nullopt;
    }
    return carried.applied(theirs, 0, static_cast<EditList::Offset>(theirs.size()));
}

} // namespace qx::detail
