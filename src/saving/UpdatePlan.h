#pragma once

// What is to be changed in a document's text, so that it says what an object says now.
//
// Two writings are laid side by side: of what was read from the text, and of the object. Both
// follow the same rules, so what differs is what was edited. The reading's trace tells which entry
// a value came from; there it is changed, in whatever form it stands. What has no entry yet gets a
// place among those of the fields around it.
//
//     UpdatePlan.cpp       objects and fields
//     UpdateLists.cpp      collections
//     UpdateMoves.cpp      items that go from one to another
//     UpdateTexts.cpp      texts and attributes that are there
//     UpdatePlaces.cpp     what is new: where, and how
//     UpdateKept.cpp       unknown XML
//
// What cannot be carried to the text is noted; the nearest object around that has an element may
// then be written anew.

#include "marshaller/ReadingTrace.h"
#include "saving/EditList.h"
#include "saving/ListMatching.h"
#include "saving/NewXML.h"

#include <memory>
#include <set>
#include <unordered_map>
#include <unordered_set>

namespace qx::detail {

// What a plan goes by: all of it outlives the plan.
struct UpdateSource {
    const XMLIndex& index;
    IndexedXML& document;
    const SourceMarkup& markup;
    const SourceLayout& layout;
    const ReadingTrace& read;
    const WritingTrace& before;
    const WritingTrace& after;
    NewXML& writer;
    std::shared_ptr<const NamespaceTable> names; // null where names are written as they are
};

class UpdatePlan {
public:
    using Shown = WritingTrace::Number;
    using Entry = XMLIndex::Number;
    static constexpr std::uint32_t none = UINT32_MAX;

    // An object that was saved before may keep what a field took once, and took no more when the
    // text was read: back in the text it would be taken again. So there may be a plan that adds no
    // unknown XML. And one that prints what has moved from one list to another.
    struct Ways {
        bool addKept = true;
        bool moveAcross = true;
    };
    // The objects of `anew`, numbers of the later writing, are written anew.
    UpdatePlan(const UpdateSource& source, const std::set<Shown>& anew, Ways ways);

    void run();
    EditList& edits() noexcept { return *_edits; }
    const EditList& edits() const noexcept { return *_edits; }
    // Once they are arranged.
    void joinRemovals();
    // Whether something has moved from one list to another.
    bool hasMovedAcross() const noexcept { return !_moves.empty(); }
    // The objects and fields whose change could not be carried.
    const std::vector<Shown>& failures() const noexcept { return _failures; }
    // The values whose element has lost what stood in it beside the text.
    const std::vector<Shown>& rewritten() const noexcept { return _rewritten; }
    // The unknown XML that objects keep and the text lacks, of new elements what a field might
    // take: the object, and the node's text.
    using NewKept = std::vector<std::pair<Shown, std::string>>;
    bool addsKept() const noexcept { return _ways.addKept; }
    const NewKept& newKept() const noexcept { return _newKept; }
    // The nearest object around, itself included, that has an element to be written anew, and is
    // not the root; none where there is none.
    Shown objectAround(Shown shown) const;

private:
    // An object in both writings, and what was read as it.
    struct Context {
        Shown before, after;
        std::uint32_t owner;
        const Context* parent;
        std::size_t ordinal; // among its fields, of the field that holds this one
        Entry entry;         // its element
    };
    // The direct children of an element that a field took: first and last.
    struct Range {
        Entry first = none, last = none;
    };
    struct Place {
        SourceMarkup::Offset at = 0;     // none where there is no place
        std::optional<std::string> line; // starts what is new there
        Entry opened = none;             // what is new is all that stands in this element
    };

    // Both lists of items; what each was read from, and the wrapper around them.
    struct List {
        std::vector<Shown> was, is;
        std::vector<std::uint32_t> uses; // of what was
        Entry wrapper = none;
        std::uint32_t binding = 0;
        const FieldPlan* plan = nullptr;
        Shown field = none; // in the later writing
    };

    // UpdatePlan.cpp
    // The uses of an owner, by field; of one of its fields; of null, of what was kept.
    std::span<const std::uint32_t> usesOf(std::uint32_t owner) const;
    std::span<const std::uint32_t> usesOf(std::uint32_t owner, const FieldPlan* field) const;
    void compareObject(Shown before, Shown after, std::uint32_t owner, const Context* parent,
                       std::size_t ordinal);
    void compareField(const Context& context, Shown before, Shown after, std::size_t ordinal);
    void compareInside(const Context& context, Shown before, Shown after, std::size_t ordinal);
    void compareSingle(const Context& context, Shown was, Shown is, Shown field,
                       std::size_t ordinal);
    void compareValue(const Context& context, std::uint32_t use, Shown was, Shown is,
                      std::size_t ordinal);
    void removeValue(std::uint32_t use, Shown field);
    void fail(Shown shown) { _failures.push_back(shown); }
    Entry parentOf(Entry entry) const { return _source.markup.parent(entry); }
    const ReadingTrace::Use& use(std::uint32_t number) const { return _source.read.uses()[number]; }
    bool areSame(Shown before, Shown after) const {
        return _source.before[before].hash == _source.after[after].hash;
    }
    bool isText(Shown after) const { return _source.after[after].kind == WritingTrace::Kind::text; }

    // UpdateLists.cpp
    void compareList(const Context& context, Shown before, Shown after, std::size_t ordinal);
    bool findEntries(const Context& context, List& list) const;
    bool findObjects(List& list) const;
    const Object* objectOf(std::uint32_t number) const;
    ListKeys keysOf(const List& list) const;
    std::size_t likeness(Shown was, Shown is) const;
    void arrangeList(const Context& context, const List& list, std::size_t ordinal);
    void fillList(const Context& context, const List& list, std::size_t ordinal);
    bool removeWrapper(const List& list);
    void removeItems(const List& list, const ListMatching& matching);
    std::string moved(const Context& context, const List& list, std::size_t was, Shown is,
                      std::size_t ordinal);
    std::string newItem(const List& list, Shown item, Entry inside,
                        const std::optional<std::string>& line, Entry beside = none);
    static const String* nameOfItems(const List& list);
    std::string printed(const List& list, Shown item, Entry inside,
                        const std::optional<std::string>& line, Entry beside);

    // UpdateMoves.cpp
    struct Gone {
        Shown was;
        std::uint32_t use;
    };
    struct Added {
        Shown is;
        Entry inside; // the element that it is added to
        String name;  // of its own
    };
    struct Indent {
        std::string_view old, now;
    };
    void noteGone(Shown was, std::uint32_t use);
    void noteGoneInside(Shown object, std::uint32_t owner);
    bool findMoves();
    bool mayMove(const Gone& gone, const Added& added) const;
    void startAgain();
    std::string movedFrom(std::uint32_t use, const std::optional<std::string>& line);
    void indentInside(Entry element, const Indent& indent, EditList& edits) const;
    void indentAnew(SourceMarkup::Offset place, const Indent& indent, EditList& edits) const;

    // UpdateTexts.cpp
    void setAttribute(Entry attribute, Shown value);
    SourceMarkup::Offset blanksBefore(SourceMarkup::Offset place) const;
    void removeAttribute(Entry attribute, Entry element, Shown field);
    void setText(Entry element, bool isOwn, std::string_view was, std::string_view now,
                 Shown value);
    struct Piece {
        Entry entry;
        std::string text;
    };
    std::vector<Piece> piecesOf(Entry element, std::string& all) const;
    bool setPieces(Entry element, std::string_view was, std::string_view now, Shown value);
    void setPiece(Entry piece, std::string_view was, std::string_view now, Shown value);

    // UpdatePlaces.cpp
    void insertValue(const Context& context, Shown value, Shown field, std::size_t ordinal);
    void insertAttribute(const Context& context, Entry element, Shown value, std::size_t ordinal);
    void insertChild(const std::string& printed, const Place& place, Shown shown);
    void openWithText(Entry element, const std::string& text, Shown shown);
    void replaceElement(Entry element, Shown object, const String* name);
    void removeElement(Entry element, Shown shown);
    // The part of the text that goes with an element, its comments too where they are to.
    std::pair<SourceMarkup::Offset, SourceMarkup::Offset> regionOf(Entry element,
                                                                   bool withComments) const;

    Place placeFor(const Context& context, std::size_t ordinal);
    Place placeInside(Entry element) const;
    Place placeBehind(Entry child) const;
    Place placeBefore(Entry child) const;
    Range rangeOf(const Context& context, Shown field) const;
    Range rangeOfOwner(std::uint32_t owner, Entry element) const;
    Entry attributeOf(const Context& context, Shown field) const;
    NewXML::Around around(Entry element, const std::optional<std::string>& line);
    bool isDeclared(Entry element, const String& prefix, std::string_view URI) const;
    Entry childNamed(Entry element, const String& name) const;
    void finishOpenings();

    // UpdateKept.cpp
    void compareKept(const Context& context);
    void countDoubles(const ClassPlan& plan, const std::vector<WritingTrace::Kept>& was,
                      const std::vector<WritingTrace::Kept>& is);
    void compareKeptChildren(const Context& context, const WritingTrace::KeptList& was,
                             const WritingTrace::KeptList& is);
    void compareDeclarations(const Context& context, const WritingTrace::KeptList& was,
                             const WritingTrace::KeptList& is);
    void compareKeptAttributes(const Context& context, const WritingTrace::KeptList& was,
                               const WritingTrace::KeptList& is);
    bool changeInTag(const Context& context, Entry entry, const WritingTrace::Kept* now);
    void addToTag(const Context& context, std::string_view name, const WritingTrace::Kept& kept);
    bool mayAddKept(Shown object, const std::string& text);
    static bool isNamedByField(const ClassPlan& plan, const WritingTrace::Kept& kept);
    std::vector<Entry> entriesOfKept(const Context& context,
                                     const std::vector<WritingTrace::Kept>& kept) const;

    void add(SourceMarkup::Offset begin, SourceMarkup::Offset end, std::string text, Shown shown) {
        _edits->add({begin, end, std::move(text), shown, _source.after.keyPath(shown)});
    }

    const UpdateSource& _source;
    const std::set<Shown>& _anew;
    const Ways _ways;
    // Whether objects have to be compared that show the same: they may declare something else.
    const bool _comparesAll;
    NewKept _newKept;
    EditList _all;
    EditList* _edits = &_all; // those of an item that moves are its own
    std::vector<Shown> _failures;
    std::vector<Shown> _rewritten;
    // By owner: of those that were asked for.
    mutable std::unordered_map<std::uint32_t, std::vector<std::uint32_t>> _uses;
    std::unordered_map<Shown, std::uint32_t> _owners; // of the objects that were compared
    // What is new in elements that hold nothing yet.
    struct Opening {
        std::string content;
        std::optional<std::string> line;
        Shown shown;
    };
    std::map<Entry, Opening> _openings;
    std::vector<Gone> _gone;
    std::vector<Added> _added;
    std::unordered_map<Shown, std::uint32_t> _moves; // items that are new, and what they were
    std::unordered_set<std::uint32_t> _movedFrom;
    std::unique_ptr<OutputNames> _names;
};

} // namespace qx::detail
