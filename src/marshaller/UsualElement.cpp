#include "marshaller/UsualElement.h"

namespace qx::detail {

namespace {

using Place = UsualForm::Place;
using Slot = UsualForm::Slot;

// The slot of that name. Most documents have everything in the order of the fields: then it is the
// next one, or soon behind.
template <class Fits>
std::size_t slotFrom(std::size_t next, std::span<const Slot> slots, const String& name,
                     Fits fits) noexcept {
    for (std::size_t i = next; i < slots.size(); ++i)
        if (slots[i].name.isSameAs(name) && fits(slots[i]))
            return i;
    for (std::size_t i = 0; i < next; ++i)
        if (slots[i].name.isSameAs(name) && fits(slots[i]))
            return i;
    return UsualForm::mostSlots;
}

} // namespace

inline bool UsualElement::take(std::size_t slot, Number number) noexcept {
    if (slot == none || has(slot))
        return false;
    _slots |= 1U << slot;
    ++_slotCount;
    _first[slot] = number;
    return true;
}

bool UsualElement::find(IndexedXML& document, const UsualForm& form, Number element) {
    document.expand(element);
    const XMLIndex& index = document.index();
    const String* const names = document.names();
    const std::span<const Slot> slots = form.slots();
    const XMLIndexEntry& entry = index[element];
    const Number end = index.contentEnd(element);
    Number at = index.content(element);
    std::size_t slot = 0;
    for (; at < end && index[at].nodeKind() == XMLNodeKind::attribute; ++at, ++slot) {
        slot = slotFrom(slot, slots, names[index[at].name()],
                        [](const Slot& known) { return known.mayBeAttribute(); });
        if (!take(slot, at))
            return false;
        ++_attributeCount;
    }
    std::size_t latest = none; // of the element before
    for (; at < end; at = index.siblingOf(at), ++_childCount) {
        const XMLNodeKind kind = index[at].nodeKind();
        if (kind == XMLNodeKind::element) {
            slot = slotFrom(slot, slots, names[index[at].name()],
                            [](const Slot& known) { return known.mayBeChild(); });
            // Of the items of a list one stands behind the other.
            const bool isNextItem =
                slot == latest && slot != none && slots[slot].place == Place::items;
            if (!isNextItem && !take(slot, at))
                return false;
            latest = slot;
        } else if (kind == XMLNodeKind::text) {
            if (XMLIndex::isLayout(index[at], entry))
                --_childCount; // it is none
            else if (form.textSlot() != none && !take(form.textSlot(), at))
                return false;
        } else if (kind != XMLNodeKind::comment) {
            return false;
        }
    }
    // Beside other children the text would be put together.
    const bool isTextAlone =
        form.textSlot() == none || _childCount == 0 || (_childCount == 1 && has(form.textSlot()));
    return isTextAlone && (form.required() & ~_slots) == 0;
}

bool UsualElement::isAllItems(IndexedXML& document, const UsualForm& form) const {
    const XMLIndex& index = document.index();
    const auto isItem = [&](const Slot& slot, Number child) {
        const XMLNodeKind kind = index[child].nodeKind();
        return kind == XMLNodeKind::element
                   ? document.names()[index[child].name()].isSameAs(slot.itemName)
                   : kind == XMLNodeKind::text || kind == XMLNodeKind::comment;
    };
    for (std::size_t i = 0; i < form.slots().size(); ++i) {
        const Slot& slot = form.slots()[i];
        if (slot.place != Place::wrapped || !has(i))
            continue;
        document.expand(_first[i]);
        if (index.firstChild(_first[i]) != index.content(_first[i]))
            return false; // it has attributes
        const Number end = index.contentEnd(_first[i]);
        for (Number at = index.firstChild(_first[i]); at < end; at = index.siblingOf(at))
            if (!isItem(slot, at))
                return false;
    }
    return true;
}

} // namespace qx::detail
