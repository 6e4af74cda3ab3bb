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

#include "marshaller/ObjectAccess.h"
#include "plan/ClassPlan.h"
#include "xml/XMLDraft.h"

#include <string>
#include <unordered_map>
#include <vector>

namespace qx::detail {

class WritingTrace {
public:
    using Number = std::uint32_t;
    static constexpr Number none = UINT32_MAX;

    enum class Kind : std::uint8_t { object, field, text };
    struct Shown {
        Kind kind;
        bool isList = false;                  // of a field: it holds an array
        bool isHidden = false;                // of a value
        Number next = 0;                      // the entry after everything inside
        Number around = none;                 // the entry that this one stands in
        const ClassPlan* plan = nullptr;      // of an object
        const FieldPlan* field = nullptr;     // of a field
        XMLDraft::Element* element = nullptr; // that holds an object's fields
        const Object* object = nullptr;       // null of a plain struct, which may have moved on
        std::size_t begin = 0, size = 0;      // of a text
        std::size_t item = 0;                 // of a value: its number in the field
        std::size_t items = 0;                // of a field: how many values it has
        std::uint64_t hash = 0;               // of all that is shown inside, kept XML included
    };
    // A node of the unknown XML of an object, and its text.
    struct Kept {
        Ref<XMLNode> node;
        std::string text;
    };
    struct KeptList {
        std::vector<Kept> children, attributes, declarations;
        std::uint64_t hash() const noexcept; // of children and attributes
    };

    explicit WritingTrace(bool keepsUnknown) noexcept : _keepsUnknown(keepsUnknown) {}

    const Shown& operator[](Number number) const noexcept { return _shown[number]; }
    Number size() const noexcept { return static_cast<Number>(_shown.size()); }
    std::string_view text(Number number) const noexcept {
        return std::string_view(_texts).substr(_shown[number].begin, _shown[number].size);
    }
    // Null where the object keeps nothing.
    const KeptList* keptOf(Number object) const;
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
    // To be called once all is there.
    void hash();

    // What the writing calls.
    void enterObject(const ClassPlan& plan, XMLDraft::Element* element, const Object& object,
                     ObjectAccess& access);
    void leave();
    void enterField(const FieldPlan& field);
    // The value of the field that is open: hidden, if nothing else comes of it.
    void hold(const Value& value);
    void leaveField();
    void markList() { _shown[_open.back()].isList = true; }
    void addText(std::string_view text, bool isHidden);
    // Takes the place of all children in the element.
    void replaceContent(const XMLDraft::Element* element);
    // What came since there were that many entries is not written.
    void forget(Number count);

private:
    Number add(Shown shown);
    std::uint64_t hashOf(Number number) const;

    const bool _keepsUnknown;
    std::vector<Shown> _shown;
    std::vector<Number> _open;
    std::string _texts;
    std::unordered_map<Number, KeptList> _kept;
};

} // namespace qx::detail
