#include "marshaller/Unmarshalling.h"

#include <QXXMLMarshalling/model/Array.h>

#include "base/BulkObjects.h"
#include "host/Log.h"
#include "marshaller/MarshallerMemory.h"
#include "model/Errors.h"

#include <algorithm>
#include <unordered_set>
#include <utility>

namespace qx::detail {

Unmarshalling::Unmarshalling(QXXMLMarshaller& marshaller, IndexedXML& document, Use use)
    : _marshaller(&marshaller), _mapping(marshaller.mapping()), _document(document),
      _plan(MappingPlan::of(_mapping.get())), _use(use), _budget(marshaller, document),
      _reports(marshaller), _keepsExactly(marshaller.keepsExactly()),
      _ownTrace(_keepsExactly ? std::make_unique<ReadingTrace>() : nullptr),
      _trace(_ownTrace.get()) {
    renewClassUses();
    if (const NamespaceTable* const table = NamespaceMatching::of(marshaller))
        document.matchBy(*table);
}

// The plan of a single step may stand in no mapping, and is gone after it.
void Unmarshalling::renewClassUses() {
    if (_frame == nullptr) // nobody goes by them
        _earlierClassUses.clear();
    else
        _earlierClassUses.push_back(_classUses);
    _classUses = _use == Use::document ? MarshallerMemory::of(*_marshaller).classUses(_mapping)
                                       : std::make_shared<ClassUses>(_mapping);
}

// Lends consumed names for the time of one object's binding.
class Unmarshalling::LentNames {
public:
    explicit LentNames(Unmarshalling& unmarshalling) : _lent(unmarshalling._namesLent) {
        auto& all = unmarshalling._names;
        if (_lent == all.size())
            all.push_back(std::make_unique<ConsumedNames>());
        _names = all[_lent++].get();
    }
    ~LentNames() {
        _names->clear();
        --_lent;
    }
    LentNames(const LentNames&) = delete;
    LentNames& operator=(const LentNames&) = delete;
    ConsumedNames& operator*() const noexcept { return *_names; }

private:
    std::size_t& _lent;
    ConsumedNames* _names;
};

// The trace knows the object while it is bound. Of its own trace a call needs no more than the
// uses of the objects that are open.
class Unmarshalling::Traced {
public:
    Traced(Unmarshalling& reading, const ClassPlan& plan, Number element, const Object& object)
        : _trace(reading._trace),
          _isLasting(reading._isTraced || reading.isInsideElement(element)) {
        if (_trace != nullptr)
            _trace->enter(plan, element, object);
    }
    ~Traced() {
        if (_trace != nullptr && _isLasting)
            _trace->leave();
        else if (_trace != nullptr)
            _trace->leaveAndForget();
    }
    Traced(const Traced&) = delete;
    Traced& operator=(const Traced&) = delete;

private:
    ReadingTrace* const _trace;
    const bool _isLasting;
};

void Unmarshalling::locate(ErrorSlot error, Number number, const FieldPlan* field,
                           const ClassPlan* plan) {
    if (error != nullptr && *error && error->get() != _earlier)
        ReadingContext::tell(*error, _document, _mapping.get(), {number, field, plan});
}

Ref<Object> Unmarshalling::unmarshallNode(Number node, IndexedXML::Nodes nodes, ErrorSlot error) {
    const bool isElement = node != none && _document.isElement(node);
    const ClassPlan* plan = isElement ? classForElement(node) : nullptr;
    if (plan != nullptr)
        return build(*plan, node, nodes, error);
    if (_marshaller->isLenient())
        return nullptr;
    return fail(error, errors::noDefinitionForElement, quoted(node));
}

template <class Read>
Ref<Object> Unmarshalling::buildWith(const ClassPlan& plan, const Counted& source,
                                     StructObject* given, ErrorSlot error, Read read) {
    const Number wrapper = std::exchange(_wrapper, none);
    if (!mayBuild(plan, source, error)) {
        locate(error, source.element, nullptr, &plan);
        return nullptr;
    }
    Ref<Object> object = given != nullptr ? Ref<Object>(given) : allocate(plan);
    // Whoever set it: a caller's earlier error stops the binding, too.
    if (error != nullptr && *error)
        return nullptr;
    QXGenericRecord* const record = ObjectAccess::plainRecord(*object);
    // A struct is asked for nothing: it moves on once it is bound.
    const bool isAsked = record == nullptr && !object->isa().isStruct();
    const ObjectHooks* const hooks = isAsked ? &_access.hooksOf(*object) : nullptr;
    if (hooks != nullptr && hooks->rootObject != nullptr && hooks->setUndoManager != nullptr)
        ObjectAccess::send(*object, *hooks->setUndoManager, _marshaller->undoManager());

    const Frame frame{&plan, source.element, _frame, _frame != nullptr ? _frame->depth + 1 : 1,
                      wrapper};
    struct Restore {
        const Frame*& current;
        const Frame* outer;
        ~Restore() { current = outer; }
    } const restore{_frame, _frame};
    _frame = &frame;
    const Traced traced(*this, plan, source.element, *object);
    if (!read(*object))
        return nullptr;
    if (record != nullptr)
        record->setNotifyBindingsObservers(true);
    else if (isAsked && hooks->setNotifyBindingsObservers != nullptr)
        ObjectAccess::send(*object, *hooks->setNotifyBindingsObservers, true);
    return object;
}

// Each way in a function of its own: a level of nested objects takes the stack of one.
Ref<Object> Unmarshalling::build(const ClassPlan& plan, Number element, IndexedXML::Nodes nodes,
                                 ErrorSlot error, StructObject* given) {
    // Without a slot for errors items may be left out, which are unknown XML then.
    const bool mayBeUsual =
        plan.usualForm && isPlain() && (error != nullptr || !plan.usualForm->hasItems());
    auto object = mayBeUsual ? buildUsual(plan, element, nodes, error, given) : std::nullopt;
    return object ? std::move(*object) : buildAny(plan, element, nodes, error, given);
}

std::optional<Ref<Object>> Unmarshalling::buildUsual(const ClassPlan& plan, Number element,
                                                     IndexedXML::Nodes nodes, ErrorSlot error,
                                                     StructObject* given) {
    UsualElement usual;
    if (!usual.find(_document, *plan.usualForm, element))
        return std::nullopt;
    return buildWith(plan, {element, usual.childCount()}, given, error, [&](Object& object) {
        const UsualReading::Source source{plan, usual, element, nodes};
        return _trace == nullptr ? UsualReading::readFields(*this, source, object, error)
                                 : UsualReading::readFieldsTraced(*this, source, object, error);
    });
}

Ref<Object> Unmarshalling::buildAny(const ClassPlan& plan, Number element, IndexedXML::Nodes nodes,
                                    ErrorSlot error, StructObject* given) {
    ChildLookup source(_document, element, nodes, plan.bindingCount);
    return build(plan, source, false, error, given);
}

Ref<Object> Unmarshalling::build(const ClassPlan& plan, ChildLookup& source, bool isFlattened,
                                 ErrorSlot error, StructObject* given) {
    const Counted counted{source.element(), source.childCount()};
    return buildWith(plan, counted, given, error, [&](Object& object) {
        const LentNames fields(*this);
        const LentNames attributes(*this);
        return readFields(plan, {object, source, {*fields, *attributes}, isFlattened}, error);
    });
}

// A class that is flattened into itself, over whatever other classes, would never end.
bool Unmarshalling::isBeingBound(const ClassPlan& plan, Number element) const {
    for (const Frame* frame = _frame; frame != nullptr && frame->element == element;
         frame = frame->parent)
        if (frame->plan->className == plan.className)
            return true;
    return false;
}

bool Unmarshalling::mayBuild(const ClassPlan& plan, const Counted& source, ErrorSlot error) {
    const Number element = source.element;
    if (_progress != nullptr && !_progress->mayPass(_document.placeOf(element), error))
        return false;
    if (isBeingBound(plan, element))
        return fail(error, errors::noDefinitionForElement, quoted(element));
    const std::size_t depth = _frame != nullptr ? _frame->depth : 0;
    const std::size_t deepest = _marshaller->maximumDepth();
    // What is refused counts too: without a slot the reading goes on.
    if (!_budget.takeObject(plan.className.string(), error))
        return false;
    if (depth < deepest)
        return _budget.takeVisits(source.children, element, error);
    return fail(error, errors::nestedTooDeep, deepest, plan.className.string());
}

Ref<Object> Unmarshalling::allocate(const ClassPlan& plan) {
    const Class* const type = classUses().classOf(plan);
    Ref<Object> object = type != nullptr ? type->create() : nullptr;
    if (type != nullptr && !object) {
        logWarningOrLine("Class %@ cannot be made without arguments, records stand in for it",
                         type->name());
        _classUses->setUnmakeable(plan);
    }
    if (!object)
        object = QXGenericRecord::classObject().create();
    if (QXGenericRecord* record = ObjectAccess::plainRecord(*object)) {
        record->setClassNameForMarshalling(plan.className.string());
        record->setNotifyBindingsObservers(false);
        return object;
    }
    if (object->isa().isStruct())
        return object;
    const ObjectHooks& hooks = _access.hooksOf(*object);
    if (hooks.setClassNameForMarshalling != nullptr)
        ObjectAccess::send(*object, *hooks.setClassNameForMarshalling, plan.className.string());
    if (hooks.setNotifyBindingsObservers != nullptr)
        ObjectAccess::send(*object, *hooks.setNotifyBindingsObservers, false);
    return object;
}

// From the first flattened field of a class on, that class and all its ancestors are bound from a
// private copy of what is left of the element; an ancestor with such a field makes one of its own.
bool Unmarshalling::readFields(const ClassPlan& plan, const Target& target, ErrorSlot error) {
    std::unique_ptr<ChildLookup> copy;
    ChildLookup* source = &target.source;
    source->expectLookups(target.isFlattened ? plan.bindingCount : 0);
    ExtendsWalk walk(plan);
    while (true) {
        bool copied = false;
        for (const FieldPlan& field : walk.current().fields) {
            if (!field.isContainer && !copied) {
                if (!_budget.takeVisits(source->childCount(), source->element(), error)) {
                    locate(error, source->element(), &field, &plan);
                    return false;
                }
                copy = ChildLookup::copyOf(*source);
                source = copy.get();
                copied = true;
            }
            if (!readField(field, {target.object, *source, target.bound, target.isFlattened},
                           error))
                return false;
        }
        if (!walk.next())
            break;
        source->expectLookups(walk.current().bindingCount);
    }
    const Target rest{target.object, *source, target.bound, target.isFlattened};
    const bool isWhole = walk.broken().isNull()
                             ? keepNamespaces(rest, error) && validate(&plan, rest, error)
                             : fail(error, errors::noExtends, walk.broken());
    if (isWhole)
        return true;
    locate(error, source->element(), nullptr, &plan);
    return passOver(error);
}

Value Unmarshalling::textOf(Number element, ErrorSlot error) {
    const Number only = _document.onlyText(element);
    if (only != none)
        return _document.value(only);
    return _budget.takeText(element, error) ? _document.text(element) : Value();
}

bool Unmarshalling::keepNamespaces(const Target& target, ErrorSlot error) {
    const Number element = target.source.element();
    const bool hasWrapper =
        _frame != nullptr && _frame->wrapper != none && _frame->element == element;
    if (!target.source.hasDeclarations() && !hasWrapper)
        return true;
    Ref<Array> kept;
    bool fits = true;
    const auto keep = [&](Number declaration, Number holder) {
        auto node =
            fits ? target.source.keepAttribute(declaration, holder, _budget, error) : nullptr;
        fits = node.get() != nullptr;
        if (!kept)
            kept = make<Array>();
        if (fits)
            kept->add(std::move(node));
        if (_trace != nullptr)
            _trace->keep(ReadingTrace::Form::declaration, declaration);
    };
    _document.forEachOfKind(XMLNodeKind::namespaceDeclaration, element,
                            [&](Number declaration) { keep(declaration, element); });
    if (hasWrapper)
        for (const Number declaration : declarationsAround(element))
            keep(declaration, _frame->wrapper);
    if (!kept || !fits)
        return fits;
    return _access.setKept(target.object, KeptXML::namespaces, kept, error);
}

// Those of the wrapper that the element has none of its own for.
std::vector<Unmarshalling::Number> Unmarshalling::declarationsAround(Number element) {
    std::vector<Number> declarations;
    std::unordered_set<std::string_view> own;
    constexpr auto kind = XMLNodeKind::namespaceDeclaration;
    _document.forEachOfKind(kind, element, [&](Number declaration) {
        own.insert(_document.writtenName(declaration).view());
    });
    _document.forEachOfKind(kind, _frame->wrapper, [&](Number declaration) {
        if (!own.contains(_document.writtenName(declaration).view()))
            declarations.push_back(declaration);
    });
    return declarations;
}

namespace {

// One group for what a reading registers. It closes however the reading ends, with the groups that
// a host left open inside it. The group of the event around the reading stays as it is.
class ReadingGroup {
public:
    explicit ReadingGroup(Ref<UndoManager> manager)
        : _manager(std::move(manager)), _level(_manager->groupingLevel()) {
        _manager->beginUndoGrouping();
    }
    ~ReadingGroup() {
        while (_manager->groupingLevel() > _level)
            _manager->endUndoGrouping();
    }
    ReadingGroup(const ReadingGroup&) = delete;
    ReadingGroup& operator=(const ReadingGroup&) = delete;

private:
    const Ref<UndoManager> _manager;
    const std::size_t _level;
};

} // namespace

Ref<Object> Unmarshalling::read(Number element, ErrorSlot error, ReadingProgress& progress,
                                ErrorCollector& collector) {
    _progress = &progress;
    _collector = &collector;
    const ReadingGroup group(_marshaller->undoManager());
    const BulkObjects bulk;
    startWith(error);
    auto object = unmarshallNode(element, IndexedXML::Nodes::own, error);
    if (!object)
        locate(error, element);
    return object;
}

namespace {

Ref<Object> readAll(QXXMLMarshaller& marshaller, IndexedXML& document, Unmarshalling& reading,
                    Ref<Error>* error) {
    ReadingProgress progress(marshaller, document.size());
    ErrorCollector collector(marshaller, error);
    auto object = reading.read(document.root(), error, progress, collector);
    if (collector.count() != 0) {
        collector.giveTo(error);
        if (!collector.keepsPartial())
            return nullptr;
    }
    // Without a slot a collection leaves out what fails.
    return progress.isCancelled() ? nullptr : object;
}

} // namespace

Ref<Object> readDocument(QXXMLMarshaller& marshaller, IndexedXML& document, Ref<Error>* error,
                         ReadingTrace* trace) {
    Unmarshalling reading(marshaller, document);
    reading.setTrace(trace);
    return readAll(marshaller, document, reading, error);
}

Ref<Object> readQuietly(QXXMLMarshaller& marshaller, IndexedXML& document, Ref<Error>* error) {
    Unmarshalling reading(marshaller, document);
    reading.setQuiet();
    return readAll(marshaller, document, reading, error);
}

} // namespace qx::detail
