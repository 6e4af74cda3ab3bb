#pragma once

// An element that has the usual form of its class (plan/UsualForm.h): what each field takes of it.

#include "plan/UsualForm.h"
#include "xml/IndexedXML.h"

#include <array>

namespace qx::detail {

class UsualElement {
public:
    using Number = IndexedXML::Number;

    // Looks the element through; false where it has not the form.
    bool find(IndexedXML& document, const UsualForm& form, Number element);

    // Whether its wrappers hold items, and nothing else.
    bool isAllItems(IndexedXML& document, const UsualForm& form) const;

    // The slots that have something, one bit each.
    std::uint32_t slots() const noexcept { return _slots; }
    bool has(std::size_t slot) const noexcept { return (_slots >> slot & 1U) != 0; }
    std::size_t slotCount() const noexcept { return _slotCount; }
    // The attribute, child, wrapper or text of such a slot, or its first item.
    Number operator[](std::size_t slot) const noexcept { return _first[slot]; }
    std::size_t attributeCount() const noexcept { return _attributeCount; }
    std::size_t childCount() const noexcept { return _childCount; }

private:
    static constexpr std::size_t none = UsualForm::mostSlots;

    bool take(std::size_t slot, Number number) noexcept;

    std::uint32_t _slots = 0;
    std::uint32_t _slotCount = 0;
    std::uint32_t _attributeCount = 0;
    std::uint32_t _childCount = 0;
    std::array<Number, UsualForm::mostSlots> _first;
};

} // namespace qx::detail
