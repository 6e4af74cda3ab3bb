#pragma once

// One call of the unmarshaller: elements become objects, driven by the mapping's plan. How a field
// is read is told by its kind of binding (FieldBinding.h); what no field consumed is looked at in
// validate.cpp.
//
// Error slots are handed along as they come: a step reports only to a caller who passed one, and
// collections behave differently without.
//
// Between any two steps stands the code of host classes, which may change the document and the
// marshaller, or let go of them. So the call holds the marshaller, reads an index, which shows the
// document as it stood at the start, and reads the options where they count.

#include <QXXMLMarshalling/QXXMLMarshaller.h>

#include "marshaller/ChildLookup.h"
#include "marshaller/ClassUses.h"
#include "marshaller/ConsumedNames.h"
#include "marshaller/ErrorCollector.h"
#include "marshaller/NamespaceMatching.h"
#include "marshaller/ObjectAccess.h"
#include "marshaller/ReadingContext.h"
#include "marshaller/ReadingProgress.h"
#include "marshaller/ReadingTrace.h"
#include "marshaller/Reporting.h"
#include "marshaller/UsualReading.h"
#include "plan/MappingPlan.h"

namespace qx::detail {

class Leftovers;
class UnknownNames;

class Unmarshalling {
public:
    using ErrorSlot = Ref<Error>*;
    using Number = IndexedXML::Number;
    static constexpr Number none = IndexedXML::none;

    // What the fields of one element consumed.
    struct Bound {
        ConsumedNames& fields;
        ConsumedNames& attributes;
    };
    // The object that is being bound, and where from.
    struct Target {
        Object& object;
        ChildLookup& source;
        Bound bound;
        bool isFlattened;
    };

    // Of a whole document's unmarshalling the counts of consumed names are its own affair; in
    // single steps they are the caller's, and left as they are by the validation.
    enum class Use : std::uint8_t { document, steps };
    // The document must outlive the call.
    Unmarshalling(QXXMLMarshaller& marshaller, IndexedXML& document, Use use = Use::document);

    // From here on it is told what becomes of each entry; it outlives the call. The report handler
    // and the log hear nothing then.
    void setTrace(ReadingTrace* trace) noexcept {
        _isTraced = _isQuiet = trace != nullptr;
        _trace = _isTraced ? trace : _ownTrace.get();
    }
    void setQuiet() noexcept { _isQuiet = true; }
    // In an undo group of its own. Errors that the collector takes leave out what failed.
    Ref<Object> read(Number element, ErrorSlot error, ReadingProgress& progress,
                     ErrorCollector& collector);
    // `nodes` are those that are kept of the element.
    Ref<Object> unmarshallNode(Number node, IndexedXML::Nodes nodes, ErrorSlot error);
    // `source` may be shared with the object that this one is flattened into.
    Ref<Object> build(const ClassPlan& plan, ChildLookup& source, bool isFlattened, ErrorSlot error,
                      StructObject* given = nullptr);
    // A new object, or the struct that is given.
    Ref<Object> build(const ClassPlan& plan, Number element, IndexedXML::Nodes nodes,
                      ErrorSlot error, StructObject* given = nullptr);
    Ref<Object> allocate(const ClassPlan& plan);
    // The fields of the class and its ancestors, and what no field consumed.
    bool readFields(const ClassPlan& plan, const Target& target, ErrorSlot error);
    // True unless it failed: also when there was nothing to bind.
    bool readField(const FieldPlan& field, const Target& target, ErrorSlot error);
    // What is to be done where a field has failed: whether the reading goes on. It stands apart,
    // so that a level of nested objects takes less of the stack.
    [[gnu::noinline]] bool passOverField(const FieldPlan& field, const Target& target,
                                         ErrorSlot error);
    // What is left to do for an element all of which was bound.
    bool mayEnd(const ClassPlan& plan, Number element, std::size_t attributes, ErrorSlot error);
    // Whether what is left is told from the trace, not from names: of objects that this call makes.
    bool isExact(const ClassPlan* plan) const noexcept {
        return _keepsExactly && plan != nullptr && _frame != nullptr &&
               _marshaller->saveUnknownXML();
    }
    // As mayEnd() where the trace shows that something is left to be kept exactly.
    bool mayEndExactly(const ClassPlan& plan, const Target& target, ErrorSlot error);
    // `plan` is the class whose fields were bound, null where they were bound one by one.
    bool validate(const ClassPlan* plan, const Target& target, ErrorSlot error);

    // An error that the slot holds from before stays as it is.
    void startWith(ErrorSlot error) noexcept {
        _earlier = error != nullptr ? error->get() : nullptr;
    }
    // Tells the error that a step has left in the slot where it came about, unless it knows.
    void locate(ErrorSlot error, Number number, const FieldPlan* field = nullptr,
                const ClassPlan* plan = nullptr);

    // Whether the reading goes on without what has failed: the error in the slot is collected.
    bool passOver(ErrorSlot error) {
        return _collector != nullptr && error != nullptr && *error && mayPassOver() &&
               _collector->take(*error);
    }
    // Errors are told all at the end, and need no line of the log each.
    bool isCollecting() const noexcept {
        return _collector != nullptr && _collector->isCollecting();
    }

    // What the kinds of binding ask for.
    const MappingPlan& plan() const noexcept { return _plan; }
    ReadingBudget& budget() noexcept { return _budget; }
    // Of the classes as they are now: a host may describe and forget some at any time. What was
    // handed out before stays.
    ClassUses& classUses() {
        if (!_classUses->areCurrent()) [[unlikely]]
            renewClassUses();
        return *_classUses;
    }
    // The text inside an element, put together; null with -224 where that is too much.
    Value textOf(Number element, ErrorSlot error);
    IndexedXML& document() noexcept { return _document; }
    // Null where nobody wants one.
    ReadingTrace* trace() const noexcept { return _trace; }
    // Whether only what no field took is kept.
    bool keepsExactly() const noexcept { return _keepsExactly; }
    // The class that maps to an element of that name; null where none does.
    const ClassPlan* classForElement(Number element) const {
        return _plan.classForElement(_document.name(element));
    }
    // The class whose fields are being read; null in single steps.
    const ClassPlan* currentClass() const noexcept {
        return _frame != nullptr ? _frame->plan : nullptr;
    }
    const Reporting& reports() const noexcept { return _isQuiet ? _silent : _reports; }
    // An argument of an error: the node as it is quoted.
    auto quoted(Number node) {
        return [this, node] { return _document.quoted(node); };
    }
    // The next object that is built stands in this element, which is none of an object: where names
    // are matched by namespace, it keeps the declarations of that, too.
    void setWrapper(Number wrapper) noexcept { _wrapper = _document.isMatched() ? wrapper : none; }
    // Tells the item of the object that is to hold it, which comes before that one gets it. False
    // when the item does not take such a parent.
    bool adopt(Object& item, Object& parent, ErrorSlot error) {
        return _access.adopt(item, parent, error);
    }

private:
    // An object that is being bound, and those whose binding led to it.
    struct Frame {
        const ClassPlan* plan;
        Number element;
        const Frame* parent;
        std::size_t depth;
        Number wrapper;
    };
    class LentNames;
    [[gnu::noinline]] void renewClassUses();
    class Traced;

    bool isBeingBound(const ClassPlan& plan, Number element) const;
    // Whether the object that is being bound stands in that of another, which the element is of.
    bool isInsideElement(Number element) const noexcept {
        return _frame->parent != nullptr && _frame->parent->element == element;
    }
    Number placeOf(const FieldPlan& field, const Target& target, int code) const;
    // What ends a reading as a whole goes on failing.
    bool mayPassOver() const noexcept { return !_budget.isSpent() && !_progress->isCancelled(); }
    // An element, and how many children it has.
    struct Counted {
        Number element;
        std::size_t children;
    };
    bool mayBuild(const ClassPlan& plan, const Counted& source, ErrorSlot error);
    // The object, whose fields read(Object&) sets.
    template <class Read>
    Ref<Object> buildWith(const ClassPlan& plan, const Counted& source, StructObject* given,
                          ErrorSlot error, Read read);
    // As build(): none where the element has not the usual form of the class. The two stand apart,
    // so that a level of nested objects takes the stack of one of them.
    [[gnu::noinline]] std::optional<Ref<Object>> buildUsual(const ClassPlan& plan, Number element,
                                                            IndexedXML::Nodes nodes,
                                                            ErrorSlot error, StructObject* given);
    [[gnu::noinline]] Ref<Object> buildAny(const ClassPlan& plan, Number element,
                                           IndexedXML::Nodes nodes, ErrorSlot error,
                                           StructObject* given);
    // Whether nobody wants more of an element than its fields.
    bool isPlain() const noexcept {
        return _use == Use::document && !reports().isOn() && !_document.isMatched();
    }
    bool keepNamespaces(const Target& target, ErrorSlot error);
    std::vector<Number> declarationsAround(Number element);
    bool validateExactly(const Target& target, ErrorSlot error);
    bool keepChildren(const Target& target, const Leftovers& left, ErrorSlot error);
    bool keepAttributes(const Target& target, const Leftovers& left, ErrorSlot error);
    void tellUnknown(Reporting::Kind kind, const UnknownNames& unknown, const Target& target);
    bool refuse(Number unknown, ErrorSlot error);
    bool validateChildren(const Target& target, ErrorSlot error);
    bool keepChildren(const Target& target, const CountedSet& names, const CountedSet& written,
                      ErrorSlot error);
    bool validateAttributes(const Target& target, ErrorSlot error);
    bool keepAttributes(const Target& target, const CountedSet& names, ErrorSlot error);

    const Ref<QXXMLMarshaller> _marshaller;
    const Ref<const QXXMLMarshallingMapping> _mapping; // of the plan
    IndexedXML& _document;
    const MappingPlan& _plan;
    const Use _use;
    ReadingBudget _budget;
    ObjectAccess _access;
    ReadingProgress* _progress = nullptr;
    ErrorCollector* _collector = nullptr;
    const Reporting _reports;
    const Reporting _silent;
    const bool _keepsExactly;
    bool _isQuiet = false;
    bool _isTraced = false;
    const std::unique_ptr<ReadingTrace> _ownTrace; // of what is kept exactly
    ReadingTrace* _trace = nullptr;
    std::shared_ptr<ClassUses> _classUses;
    std::vector<std::shared_ptr<ClassUses>> _earlierClassUses;
    const Frame* _frame = nullptr;
    const Error* _earlier = nullptr;
    Number _wrapper = none; // see setWrapper
    // A pool of consumed names; the first few are lent to the objects that are being bound.
    std::vector<std::unique_ptr<ConsumedNames>> _names;
    std::size_t _namesLent = 0;
};

// A whole document, in one undo group.
Ref<Object> readDocument(QXXMLMarshaller& marshaller, IndexedXML& document, Ref<Error>* error,
                         ReadingTrace* trace = nullptr);
// The same; the report handler and the log hear nothing.
Ref<Object> readQuietly(QXXMLMarshaller& marshaller, IndexedXML& document, Ref<Error>* error);

} // namespace qx::detail
