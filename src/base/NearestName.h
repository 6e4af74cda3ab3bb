#pragma once

// The known name that somebody who wrote another one most likely meant, for the suggestion beside
// an error. What counts as near, the nearest first:
//
//     1  the same but for upper and lower case           Price      price
//     2  the same behind another prefix, or none          atom:feed  feed
//     3  few edits away: a character more, less or        pirce      price
//        another, or two neighbours swapped
//     4  one is the beginning or the end of the other,    bool       boolean
//        and no less than half of it
//
//     NearestName nearest("pirce");
//     for (const auto& field : fields)
//         nearest.consider(field.name);
//     if (!nearest.name().empty()) …
//
// Of names equally near the first wins. The work is bounded, whatever the names are: long ones are
// not compared by edits, and after some thousands of comparisons by edits the rest is passed over.

#include <cstdint>
#include <string>
#include <string_view>

namespace qx {

class NearestName {
public:
    explicit NearestName(std::string_view wanted);

    // The candidate must outlive this. One that is the wanted name itself, or empty, is passed
    // over.
    void consider(std::string_view candidate);
    // Empty where nothing is near.
    std::string_view name() const noexcept { return _best; }

private:
    // A name in lower case, one unit for each code point.
    struct Folded {
        explicit Folded(std::string_view name);
        std::u32string whole;
        std::u32string_view local() const noexcept; // behind the prefix
    };

    std::uint32_t distanceTo(const Folded& candidate);
    std::uint32_t editsBetween(std::u32string_view a, std::u32string_view b, std::uint32_t most);

    const std::string_view _wanted;
    const Folded _folded;
    std::string_view _best;
    std::uint32_t _distance; // of the best one; smaller is nearer
    std::uint32_t _workLeft;
};

// The nearest of a range of texts; empty where none is near.
template <class Names>
std::string_view nearestName(std::string_view wanted, const Names& known) {
    NearestName nearest(wanted);
    for (const auto& name : known)
        nearest.consider(name);
    return nearest.name();
}

} // namespace qx
