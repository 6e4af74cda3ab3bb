#pragma once

// Which items of a list before are which items of the list now: equal ones first, then those of one
// key, then by place. In time near linear, whatever the lists hold:
//
// 1. Equal ends.
// 2. Between them items that are alone of their kind in both lists, as many as keep their order.
// 3. Between those, again equal ends, then equal items one after another.
// 4. What is left, anywhere, if it is equal: it has moved. Then by key.
// 5. Of what then is left between two that have kept their place, those that are alike, in their
//    order; where that is much, by place alone.
// 6. Of those that are not in order any more the small ones have moved.

#include <cstdint>
#include <functional>
#include <string_view>
#include <vector>

namespace qx::detail {

struct ListItem {
    std::uint64_t hash; // equal ones are equal
    std::uint64_t kind; // items of two kinds never are one item
};

// Of each item a key that no other of its list has; both empty where there is none.
struct ListKeys {
    std::vector<std::string_view> before, now;
};

struct ListMatching {
    static constexpr std::size_t none = SIZE_MAX;
    // For each item now, which one it was; none for a new one.
    std::vector<std::size_t> was;
    // Whether it has kept its place among those that have.
    std::vector<bool> stays;
};

// How much an item before has in common with one now, both by their number.
using Likeness = std::function<std::size_t(std::size_t before, std::size_t now)>;

// How large an item before is, by its number; more than 0.
using ItemSize = std::function<std::size_t(std::size_t before)>;

// findKeys() is asked for keys where equality leaves items over. Without sizes as few items as may
// be have moved.
ListMatching match(const std::vector<ListItem>& before, const std::vector<ListItem>& now,
                   const Likeness& likeness = nullptr,
                   const std::function<ListKeys()>& findKeys = nullptr,
                   const ItemSize& sizeOf = nullptr);

} // namespace qx::detail
