#pragma once

// What one writing shows of each object: its fields in the order in which they are written, and
// their values as texts or objects. A writing that is given a trace tells it, writes the mapping's
// names as they are, and leaves kept XML where it is: the trace lists that apart.
//
//     object  Order                        next: behind everything inside
//       field   id       text "7"
//       field   lines    (a list)
//         object  Line
//           field   text   text "Pens"
//
// Every field of an object has an entry, also one without a value: two objects of a class have the
// same fields one beside the other. What is not seen in the XML is listed as hidden: an optional
// zero, what a text field wrote over, a second attribute of a name.
//
// The draft and the objects must outlive the trace; only one that ended well counts.

#include <QXXMLMarshalling/xml/XMLNode.h>

#include "base/BulkArray.h"
#include "marshaller/ObjectAccess.h"
#include "plan/ClassPlan.h"
#include "xml/XMLDraft.h"

#include <algorithm>
#include <optional>
#include <string>
#include <unordered_map>
#include <vector>

namespace qx::detail {

class WritingTrace {
public:
    using Number = std::uint32_t;
    static constexpr Number none = UINT32_MAX;

    enum class Kind : std::uint8_t { object, field, text };
    // Kept small: a writing shows as many as it goes over values.
    struct Shown {
        Kind kind;
        bool isList = false;     // of a field: it holds an array
        bool isHidden = false;   // of a value
        bool hasContent = false; // of an object: more than attributes stands in its element
        Number next;             // the entry after everything inside
        Number around = none;    // the entry that this one stands in
        // Of a value its number in the field; of a field, how many values it has.
        std::uint32_t count = 0;
        struct Span {
            std::uint32_t begin, size;
        };
        union {
            const FieldPlan* field; // of a field
            Span span;              // of a text
            std::uint32_t place;    // of an object: among all objects
        };
        std::uint64_t hash; // of all that is shown inside, kept XML included
    };
    static_assert(sizeof(Shown) == 32);
    // A node of the unknown XML of an object, and its text.
    struct Kept {
        Ref<XMLNode> node;
        std::string text;
    };
    struct KeptList {
        std::vector<Kept> children, attributes, declarations;
        std::uint64_t hash() const noexcept; // of children and attributes
    };

    // One that has nothing but a hash lists what is open, no more.
    enum class Extent : std::uint8_t { all, hash };
    WritingTrace(bool keepsUnknown, bool declares, Extent extent) noexcept
        : _keepsUnknown(keepsUnknown), _declares(declares), _extent(extent) {}
    // About how many entries there will be, with so many bytes of text.
    void reserve(std::size_t entries, std::size_t textSize) {
        _shown.reserve(entries);
        _texts.reserve(textSize);
    }
    std::size_t textSize() const noexcept { return _texts.size(); }
    // Whether there was no room for a text: all may have 4 GB, twice what a document may have.
    bool isTooLarge() const noexcept { return _isTooLarge; }

    const Shown& operator[](Number number) const noexcept { return _shown[number]; }
    Number size() const noexcept { return static_cast<Number>(_shown.size()); }
    std::string_view text(Number number) const noexcept {
        const Shown::Span span = _shown[number].span;
        return {_texts.data() + span.begin, span.size};
    }
    // Of an object. The element holds its fields; the object itself is null for a plain struct,
    // which may have moved on.
    const ClassPlan* plan(Number object) const noexcept { return placed(object).plan; }
    const XMLDraft::Element* element(Number object) const noexcept {
        return placed(object).element;
    }
    const Object* object(Number object) const noexcept { return placed(object).object; }
    // Null where the object keeps nothing.
    const KeptList* keptOf(Number object) const;
    // Calls visit(Number) for each object that keeps something, in their order.
    template <class Visit>
    void forEachKeeping(Visit visit) const {
        std::vector<Number> objects;
        for (const auto& entry : _kept)
            objects.push_back(entry.first);
        std::sort(objects.begin(), objects.end());
        for (const Number object : objects)
            visit(object);
    }
    // Of the hidden values and their fields, where the hash above is known without more work.
    std::uint64_t hiddenHash() const noexcept { return _hiddenHash; }
    // Whether objects may keep other declarations than there. They are in no hash above, and count
    // for nothing where none are kept: an object need not have any to say what is in its document.
    bool declaresOtherThan(const WritingTrace& other) const noexcept {
        return _declarationsHash != 0 && _declarationsHash != other._declarationsHash;
    }
    // Whether there is a hidden value.
    bool hidesSome() const noexcept { return _hidesSome; }
    // Calls visit(Number) for each entry directly inside.
    template <class Visit>
    void forEachInside(Number number, Visit visit) const {
        for (Number at = number + 1; at < _shown[number].next; at = _shown[at].next)
            visit(at);
    }
    // The values of a field that are to be seen.
    std::vector<Number> shownValues(Number field) const;
    // "lines[0].text" for a field or an object.
    String keyPath(Number number) const;
    // Of all that is shown; known once the writing has ended. None where what was shown did not
    // stay and there is nothing but a hash.
    std::optional<std::uint64_t> hash() {
        if (!_isHashed && _extent == Extent::all)
            hashAnew();
        return _isHashed ? std::optional(_hash) : std::nullopt;
    }

    // What the writing calls.
    void enterObject(const ClassPlan& plan, XMLDraft::Element* element, const Object& object,
                     ObjectAccess& access);
    void leave();
    void enterField(const FieldPlan& field);
    // The value of the field that is open, which was written: hidden, if nothing came of it.
    void hold(const Value& value);
    void markList() { _shown[_open.back()].isList = true; }
    void addText(std::string_view text, bool isHidden);
    // Takes the place of all children in the element.
    void replaceContent(const XMLDraft::Element* element);
    // What came since there were that many entries is not written.
    void forget(Number count);

private:
    struct Placed {
        const ClassPlan* plan;
        const XMLDraft::Element* element;
        const Object* object;
    };
    const Placed& placed(Number object) const noexcept { return _objects[_shown[object].place]; }
    Shown& add(Kind kind);
    // Marks that more than attributes stands in the element that is open.
    void noteContent();
    void noteContentAround();
    void mixInto(Number around, const Shown& shown);
    // With `hash` of what is inside.
    std::uint64_t hashOf(const Shown& shown) const noexcept;
    void hashAnew();

    const bool _keepsUnknown;
    const bool _declares; // what objects keep of namespaces
    const Extent _extent;
    std::uint64_t _hash = 0;
    std::uint64_t _hiddenHash = 0;
    std::uint64_t _declarationsHash = 0;
    bool _isHashed = true; // whether the hashes are right
    BulkArray<Shown> _shown;
    BulkArray<Placed> _objects;
    std::vector<Number> _open;
    BulkArray<char> _texts;
    bool _isTooLarge = false;
    bool _hidesSome = false;
    std::unordered_map<Number, KeptList> _kept;
};

} // namespace qx::detail
