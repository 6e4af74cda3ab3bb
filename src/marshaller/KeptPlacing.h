#pragma once

// Puts the unknown XML that an object keeps back where it stood, while its fields are written:
// an element behind what the field writes that took the one before it, whatever that is now. What
// stood in a wrapper comes back into it. Attributes of the object's element have no place.

#include "marshaller/ElementWriter.h"
#include "xml/KeptPlace.h"

#include <map>

namespace qx::detail {

class KeptPlacing {
public:
    // What the object keeps: elements by name, in arrays, and an array of attributes.
    KeptPlacing(ElementWriter& output, const Value& children, const Value& attributes);
    bool isEmpty() const noexcept { return _elements.empty() && _attributes.empty(); }

    // What the writing of the object's fields calls, with the element that it writes into.
    void start(const WrittenElement& element) { place(element, {}, false, KeptPlace::all); }
    [[gnu::noinline]] void enterField(Key key) { _field.push_back(key); }
    // Whether something stood in the wrapper of the field that is open; then where that is.
    bool needsWrapper() const;
    void placeInside(const WrittenElement& wrapper);
    void leaveField(const WrittenElement& element);
    // That many items of the field that is open are there.
    void itemsAre(std::size_t count, const WrittenElement& around, bool isWrapper) {
        place(around, _field, isWrapper, static_cast<std::uint32_t>(count));
    }
    // The element has lost its children.
    void replaced(const WrittenElement& element);
    void finish(const WrittenElement& element);

private:
    using Field = std::vector<const void*>; // the identities of its keys
    struct Spot {
        Field field;
        bool isBehind; // the field, not inside its wrapper
        std::uint32_t items;
        auto operator<=>(const Spot&) const = default;
    };
    static Field identities(const std::vector<Key>& field);
    // Those with at most so many items before them.
    void place(const WrittenElement& element, const std::vector<Key>& field, bool isInside,
               std::uint32_t items);

    ElementWriter& _output;
    std::vector<Key> _field; // that is being written, behind those of the objects around it
    // What has not come back yet.
    std::map<Spot, std::vector<Ref<XMLNode>>> _elements;
    std::map<Field, std::vector<Ref<XMLNode>>> _attributes; // by wrapper
    std::vector<Ref<XMLNode>> _placed;
};

} // namespace qx::detail
