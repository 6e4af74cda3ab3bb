#include "base/NearestName.h"

#include "base/Unicode.h"

#include <algorithm>
#include <array>

namespace qx {

namespace {

// Longer names are compared by case and prefix only.
constexpr std::size_t longestEdited = 64;
// In cells of the table of edits, some thousands of usual names; a candidate that is not compared
// by edits costs one.
constexpr std::uint32_t mostWork = 1U << 20;
// Still longer ones are not looked at.
constexpr std::size_t longestFolded = 1'024;

// Ranks, and the number of edits between the second and the last.
constexpr std::uint32_t sameButCase = 0;
constexpr std::uint32_t sameButPrefix = 1;
constexpr std::uint32_t firstEdit = 2;
constexpr std::uint32_t half = 10;
constexpr std::uint32_t notNear = 20;

// So many edits leave a name of that length recognisable.
std::uint32_t mostEdits(std::size_t length) {
    return length < 3 ? 0 : length < 6 ? 1 : length < 9 ? 2 : 3;
}

bool isHalf(std::u32string_view part, std::u32string_view whole) {
    return part.size() >= 3 && part.size() * 2 >= whole.size() &&
           (whole.starts_with(part) || whole.ends_with(part));
}

std::string_view bounded(std::string_view name) { return name.substr(0, longestFolded); }

} // namespace

NearestName::Folded::Folded(std::string_view name) {
    for (const char byte : unicode::lowercased(bounded(name))) {
        const auto unit = static_cast<unsigned char>(byte);
        // The bytes of a character further up count as one.
        if ((unit & 0xC0U) == 0x80U && !whole.empty())
            whole.back() = whole.back() << 6U | (unit & 0x3FU);
        else
            whole += unit;
    }
}

std::u32string_view NearestName::Folded::local() const noexcept {
    return std::u32string_view(whole).substr(whole.find(U':') + 1);
}

NearestName::NearestName(std::string_view wanted)
    : _wanted(wanted), _folded(wanted), _distance(notNear), _workLeft(mostWork) {}

void NearestName::consider(std::string_view candidate) {
    if (candidate.empty() || candidate.size() > longestFolded || candidate == _wanted ||
        _wanted.empty() || _wanted.size() > longestFolded || _workLeft == 0)
        return;
    const std::uint32_t distance = distanceTo(Folded(candidate));
    if (distance >= _distance)
        return;
    _distance = distance;
    _best = candidate;
}

std::uint32_t NearestName::distanceTo(const Folded& candidate) {
    --_workLeft;
    if (candidate.whole == _folded.whole)
        return sameButCase;
    const bool hasPrefixes = candidate.local().size() != candidate.whole.size() ||
                             _folded.local().size() != _folded.whole.size();
    if (hasPrefixes && !candidate.local().empty() && candidate.local() == _folded.local())
        return sameButPrefix;
    const std::size_t length = std::min(candidate.whole.size(), _folded.whole.size());
    const std::uint32_t most = mostEdits(length);
    const std::uint32_t edits = editsBetween(candidate.whole, _folded.whole, most);
    if (edits <= most)
        return firstEdit + edits;
    const bool isPart =
        isHalf(candidate.whole, _folded.whole) || isHalf(_folded.whole, candidate.whole);
    return isPart ? half : notNear;
}

// The table of edits between all beginnings of the two, a row at a time; of two earlier rows the
// swapped neighbours need one. More than `most` where the names are further apart, however far.
std::uint32_t NearestName::editsBetween(std::u32string_view a, std::u32string_view b,
                                        std::uint32_t most) {
    const std::size_t longer = std::max(a.size(), b.size());
    if (most == 0 || longer > longestEdited || longer - std::min(a.size(), b.size()) > most)
        return most + 1;
    const auto work = static_cast<std::uint32_t>(a.size() * b.size());
    _workLeft -= std::min(_workLeft, work);
    std::array<std::array<std::uint8_t, longestEdited + 1>, 3> rows;
    for (std::size_t column = 0; column <= b.size(); ++column)
        rows[0][column] = static_cast<std::uint8_t>(column);
    for (std::size_t row = 1; row <= a.size(); ++row) {
        const auto& above = rows[(row - 1) % 3];
        const auto& twoAbove = rows[(row + 1) % 3];
        auto& cells = rows[row % 3];
        cells[0] = static_cast<std::uint8_t>(row);
        for (std::size_t column = 1; column <= b.size(); ++column) {
            const bool isSame = a[row - 1] == b[column - 1];
            std::uint32_t edits = above[column - 1] + (isSame ? 0U : 1U);
            edits = std::min<std::uint32_t>({edits, above[column] + 1U, cells[column - 1] + 1U});
            if (row > 1 && column > 1 && a[row - 1] == b[column - 2] && a[row - 2] == b[column - 1])
                edits = std::min<std::uint32_t>(edits, twoAbove[column - 2] + 1U);
            cells[column] = static_cast<std::uint8_t>(edits);
        }
    }
    return rows[a.size() % 3][b.size()];
}

} // namespace qx
