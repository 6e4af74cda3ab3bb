#pragma once

// What one reading made of each entry of an index: which field of which object took it, and in what
// form. A reading that is given a trace tells it; any other pays one test for each object and
// field.
//
//     <order id="7"><lines><line>Pens</line></lines><note/></order>
//
//     owner 0   the order                  uses   attribute  id           "id"
//     owner 1   the line, item 0 of it            wrapper    <lines>      "lines"
//                                                 item 0     <line>       "lines"
//                                                 text       <line>       of owner 1: "text"
//                                                 keptChild  <note>
//
// An entry without a use was dropped. One entry may have several: of two fields, of an object and
// those that are flattened into it, or of a field and as kept XML too.

#include "base/BulkArray.h"
#include "plan/ClassPlan.h"
#include "xml/IndexedXML.h"

#include <vector>

namespace qx::detail {

class ReadingTrace {
public:
    using Number = IndexedXML::Number; // of an entry
    static constexpr std::uint32_t none = UINT32_MAX;

    enum class Form : std::uint8_t {
        attribute, // of the owner's element, or of a wrapper in it
        child,     // an element: an object of its own, or the text in it
        text,      // all text of the owner's element
        flattened, // an object in the owner's element
        item,      // of a collection
        wrapper,   // the element around an attribute or around items
        keptChild, // as unknown XML
        keptAttribute,
        declaration, // of a namespace, kept
    };
    struct Use {
        Number entry;
        Form form;
        std::uint32_t binding; // of the field's names, which it went by: 0 for the first
        std::uint32_t item;    // its number among the items
        std::uint32_t owner;
        std::uint32_t made;     // the owner that was made of it, none of a text
        const FieldPlan* field; // null of what is kept
    };
    // An object that was made.
    struct Owner {
        Number element;
        const ClassPlan* plan;
        const Object* object; // which may have moved on, where it is a struct
        std::uint32_t use;    // what it was made of; none for the root
        // Its uses, with those of the objects inside; known once it is left.
        std::uint32_t firstUse = 0, usesEnd = 0;
    };

    // In the order in which they came about. The mapping must outlive them.
    const BulkArray<Use>& uses() const noexcept { return _uses; }
    const BulkArray<Owner>& owners() const noexcept { return _owners; }
    // "lines[0].text" for a field of an owner; empty for the root without a field.
    String keyPath(std::uint32_t owner, const FieldPlan* field) const;

    // About how many uses there will be.
    void reserve(std::size_t uses) { _uses.reserve(uses); }
    // What the reading calls. The object that is entered was made of the use that came last.
    void enter(const ClassPlan& plan, Number element, const Object& object);
    void leave();
    // Leaves the object, and keeps nothing of it but the use that it was made of.
    void leaveAndForget();
    // The owner that is being read; none where single steps are.
    std::uint32_t current() const noexcept { return _open.empty() ? none : _open.back(); }
    void take(Form form, const FieldPlan& field, Number entry, std::size_t binding = 0,
              std::size_t item = 0);
    void keep(Form form, Number entry);
    // Nothing came of what was taken since there were that many uses.
    void forget(std::size_t uses);

private:
    BulkArray<Use> _uses;
    BulkArray<Owner> _owners;
    std::vector<std::uint32_t> _open; // the owners whose reading goes on
};

} // namespace qx::detail
