#include "marshaller/Leftovers.h"

namespace qx::detail {

using Form = ReadingTrace::Form;

Leftovers::Leftovers(IndexedXML& document, const ReadingTrace& trace) : _document(document) {
    collect(trace, trace.current(), 0);
    const Number element = trace.owners()[trace.current()].element;
    listAttributes(element, nullptr);
    list(element, nullptr);
}

// What objects with elements of their own took is theirs.
void Leftovers::collect(const ReadingTrace& trace, std::uint32_t owner, std::uint32_t around) {
    const auto& uses = trace.uses();
    const std::size_t end = owner == trace.current() ? uses.size() : trace.owners()[owner].usesEnd;
    for (std::size_t at = trace.owners()[owner].firstUse; at < end;) {
        const ReadingTrace::Use& use = uses[at++];
        if (use.field == nullptr)
            continue;
        if (use.made == ReadingTrace::none || use.form != Form::flattened)
            note(use, around);
        if (use.made == ReadingTrace::none)
            continue;
        if (use.form == Form::flattened) {
            Keys keys = _around[around];
            keys.push_back(use.field->key);
            _around.push_back(std::move(keys));
            collect(trace, use.made, static_cast<std::uint32_t>(_around.size() - 1));
        }
        at = trace.owners()[use.made].usesEnd;
    }
}

void Leftovers::note(const ReadingTrace::Use& use, std::uint32_t around) {
    if (use.form == Form::text || use.form == Form::flattened) {
        _isTextTaken = true;
        return;
    }
    const bool isWrapper = use.form == Form::wrapper;
    const Taker taker{use.field, around, use.form == Form::item ? use.item + 1 : KeptPlace::all,
                      isWrapper};
    const auto [known, isNew] = _taken.try_emplace(use.entry, taker);
    // Whoever takes it as a whole takes what is in it.
    if (!isNew && known->second.isWrapper && !isWrapper)
        known->second = taker;
}

KeptPlace Leftovers::placeBehind(const Taker* last, const Taker* wrapper) {
    KeptPlace place;
    place.order = _count++;
    place.isInside = wrapper != nullptr;
    const Taker* const taker = wrapper != nullptr ? wrapper : last;
    if (taker == nullptr)
        return place;
    place.field = _around[taker->around];
    place.field.push_back(taker->field->key);
    const bool isItem = last != nullptr && last->field == taker->field;
    place.items = isItem ? last->items : wrapper != nullptr ? 0 : KeptPlace::all;
    return place;
}

// An item of the wrapper around it counts there; behind one of another field's stands what stands
// behind the item before that.
void Leftovers::list(Number element, const Taker* wrapper) {
    const Taker* last = nullptr;
    _document.forEachChild(element, [&](Number child) {
        ++_visits;
        const bool isElement = _document.isElement(child);
        if (!isElement && (wrapper != nullptr || _document.name(child).isNull()))
            return;
        const auto taken = isElement ? _taken.find(child) : _taken.end();
        if (taken == _taken.end()) {
            const bool isText = isElement && _isTextTaken && wrapper == nullptr &&
                                !_document.text(child).view().empty();
            if (!isText)
                _children.push_back({child, element, placeBehind(last, wrapper)});
            return;
        }
        if (wrapper == nullptr || taken->second.field == wrapper->field)
            last = &taken->second;
        if (wrapper == nullptr && taken->second.isWrapper) {
            listAttributes(child, last);
            list(child, last);
        }
    });
}

void Leftovers::listAttributes(Number element, const Taker* wrapper) {
    _document.forEachOfKind(XMLNodeKind::attribute, element, [&](Number attribute) {
        ++_visits;
        if (!_taken.contains(attribute))
            _attributes.push_back({attribute, element, placeBehind(nullptr, wrapper)});
    });
}

} // namespace qx::detail
