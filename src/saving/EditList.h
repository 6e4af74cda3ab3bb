#pragma once

// Changes to a text, gathered in any order and carried out at once.

#include <QXXMLMarshalling/base/String.h>

#include <cstdint>
#include <optional>
#include <string>
#include <vector>

namespace qx::detail {

struct SourceEdit {
    std::uint32_t begin, end; // what it takes the place of
    std::string text;
    std::uint32_t shown; // what it says: an entry of the later writing
    String keyPath;
};

class EditList {
public:
    using Offset = std::uint32_t;

    // Of several at one place the first stands first, before what takes the place of something.
    void add(SourceEdit edit) { _edits.push_back(std::move(edit)); }
    bool isEmpty() const noexcept { return _edits.empty(); }
    const std::vector<SourceEdit>& edits() const noexcept { return _edits; }
    std::vector<SourceEdit>& edits() noexcept { return _edits; }
    // Brings them into the order of the text. One that meets the next, where they are not the
    // same; null where all can be carried out.
    const SourceEdit* arrange();
    // That part of the text with the edits, which are arranged.
    std::string applied(std::string_view text, Offset begin, Offset end) const;

private:
    std::vector<SourceEdit> _edits;
};

} // namespace qx::detail
