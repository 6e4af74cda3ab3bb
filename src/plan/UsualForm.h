#pragma once

// The usual form of a class's elements: what an element holds goes to one field each, which needs
// no rules to be found.
//
//     <order number="7">                     an attribute
//       <remark>Leave at the door</remark>   a child: a text, or an object
//       <line/> <line/>                      items, one behind the other
//       <lines> <line/> <line/> </lines>     items in a wrapper
//     </order>
//
// An element that has it can be bound in one pass over what it holds and one over the fields. A
// class has none where two fields could take the same, where a field may stand in several places,
// or has no element of its own.

#include "plan/FieldPlan.h"

#include <optional>

namespace qx::detail {

class UsualForm {
public:
    enum class Place : std::uint8_t {
        attribute,
        child,
        either, // an attribute or a child
        items,
        wrapped, // items in a wrapper
        text     // the element's own, where it holds nothing else
    };
    // What one field takes, in the order in which the fields are set.
    struct Slot {
        const FieldPlan* field;
        String name;           // of the attribute, the child or the wrapper; interned
        String itemName;       // of items; interned
        const ClassPlan* plan; // of the object or the items; null where these are texts
        Place place;

        bool mayBeAttribute() const noexcept {
            return place == Place::attribute || place == Place::either;
        }
        bool mayBeChild() const noexcept {
            return !(place == Place::attribute || place == Place::text);
        }
        bool isList() const noexcept { return place == Place::items || place == Place::wrapped; }
    };
    // So many that a set of them is one word.
    static constexpr std::size_t mostSlots = 32;

    // None where elements of the class have no usual form.
    static std::optional<UsualForm> of(const ClassPlan& plan);

    const std::vector<Slot>& slots() const noexcept { return _slots; }
    // Those without which the element is faulty, one bit each.
    std::uint32_t required() const noexcept { return _required; }
    // Whether items stand in the element itself.
    bool hasItems() const noexcept { return _hasItems; }
    // The slot of the element's own text; mostSlots where there is none.
    std::size_t textSlot() const noexcept { return _textSlot; }

private:
    // False where the form cannot have it.
    bool add(const FieldPlan& field);

    std::vector<Slot> _slots;
    std::uint32_t _required = 0;
    bool _hasItems = false;
    std::size_t _textSlot = mostSlots;
};

} // namespace qx::detail
