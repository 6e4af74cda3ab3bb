#include "marshaller/Unmarshalling.h"

#include <QXXMLMarshalling/model/Array.h>

#include "host/Log.h"
#include "model/Errors.h"

namespace qx::detail {

Unmarshalling::Unmarshalling(QXXMLMarshaller& marshaller, XMLElement* root, Use use)
    : _marshaller(&marshaller), _root(root), _plan(MappingPlan::of(marshaller.mapping())),
      _use(use), _budget(marshaller, root), _classes(_plan.classCount() + 1),
      _classKnown(_plan.classCount() + 1),
      _collections(use == Use::steps || hostHasLogDebug() || hostHasLogWarning()) {}

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

Ref<Object> Unmarshalling::unmarshallNode(XMLNode* node, KeptCopies* copies, ErrorSlot error) {
    XMLElement* element = node != nullptr ? node->asElement() : nullptr;
    const ClassPlan* plan = element != nullptr ? _plan.classForElement(element->name()) : nullptr;
    if (plan != nullptr)
        return build(*plan, *element, copies, error);
    if (_marshaller->isLenient())
        return nullptr;
    return fail(error, errors::noDefinitionForElement, node);
}

Ref<Object> Unmarshalling::build(const ClassPlan& plan, XMLElement& element, KeptCopies* copies,
                                 ErrorSlot error) {
    ChildLookup source(element, copies, plan.bindingCount);
    return build(plan, source, false, error);
}

// A class that is flattened into itself, over whatever other classes, would never end.
bool Unmarshalling::isBeingBound(const ClassPlan& plan, const XMLElement& element) const {
    for (const Frame* frame = _frame; frame != nullptr && frame->element == &element;
         frame = frame->parent)
        if (frame->plan->className == plan.className)
            return true;
    return false;
}

bool Unmarshalling::mayBuild(const ClassPlan& plan, const ChildLookup& source, ErrorSlot error) {
    const XMLElement& element = source.element();
    if (isBeingBound(plan, element))
        return fail(error, errors::noDefinitionForElement, &element);
    const std::size_t depth = _frame != nullptr ? _frame->depth : 0;
    const std::size_t deepest = _marshaller->maximumDepth();
    // What is refused counts too: without a slot the reading goes on.
    if (!_budget.takeObject(plan.className.string(), error))
        return false;
    if (depth < deepest)
        return _budget.takeVisits(element.childCount(), element, error);
    return fail(error, errors::nestedTooDeep, deepest, plan.className.string());
}

Ref<Object> Unmarshalling::build(const ClassPlan& plan, ChildLookup& source, bool isFlattened,
                                 ErrorSlot error) {
    if (!mayBuild(plan, source, error))
        return nullptr;
    Ref<Object> object = allocate(plan);
    // Whoever set it: a caller's earlier error stops the binding, too.
    if (error != nullptr && *error)
        return nullptr;
    QXGenericRecord* const record = ObjectAccess::plainRecord(*object);
    // A struct is asked for nothing: it moves on once it is bound.
    const bool isAsked = record == nullptr && !object->isa().isStruct();
    const ObjectHooks* const hooks = isAsked ? &_access.hooksOf(*object) : nullptr;
    if (hooks != nullptr && hooks->rootObject != nullptr && hooks->setUndoManager != nullptr)
        ObjectAccess::send(*object, *hooks->setUndoManager, _marshaller->undoManager());

    const Frame frame{&plan, &source.element(), _frame, _frame != nullptr ? _frame->depth + 1 : 1};
    struct Restore {
        const Frame*& current;
        const Frame* outer;
        ~Restore() { current = outer; }
    } const restore{_frame, _frame};
    _frame = &frame;
    const LentNames fields(*this);
    const LentNames attributes(*this);
    if (!readFields(plan, {*object, source, {*fields, *attributes}, isFlattened}, error))
        return nullptr;
    if (record != nullptr)
        record->setNotifyBindingsObservers(true);
    else if (isAsked && hooks->setNotifyBindingsObservers != nullptr)
        ObjectAccess::send(*object, *hooks->setNotifyBindingsObservers, true);
    return object;
}

Ref<Object> Unmarshalling::allocate(const ClassPlan& plan) {
    if (!_classKnown[plan.index]) {
        _classKnown[plan.index] = true;
        _classes[plan.index] = Class::named(plan.classNameToInstantiate.view());
    }
    const Class* type = _classes[plan.index];
    if (type != nullptr && !type->isPassive())
        _collections.hostActs();
    Ref<Object> object = type != nullptr ? type->create() : nullptr;
    if (type != nullptr && !object) {
        logWarningOrLine("Class %@ cannot be made without arguments, records stand in for it",
                         type->name());
        _classes[plan.index] = nullptr;
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
                if (!_budget.takeVisits(source->firstChildCount(), source->element(), error))
                    return false;
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
    if (!walk.broken().isNull())
        return fail(error, errors::noExtends, walk.broken());
    const Target rest{target.object, *source, target.bound, target.isFlattened};
    return keepNamespaces(rest, error) && validate(&plan, rest, error);
}

bool Unmarshalling::keepNamespaces(const Target& target, ErrorSlot error) {
    const auto namespaces = target.source.element().namespaces();
    if (namespaces.empty())
        return true;
    auto kept = make<Array>();
    for (XMLNode& declaration : namespaces) {
        auto node = target.source.keep(declaration, _budget, error);
        if (!node)
            return false;
        kept->add(std::move(node));
    }
    return _access.setKept(target.object, KeptXML::namespaces, kept, error);
}

bool Unmarshalling::adopt(Object& item, Object& parent, ErrorSlot error) {
    // A struct moves to where it is held: there is no parent to tell it, and none that it could be.
    if (ObjectAccess::plainRecord(item) != nullptr || item.isa().isStruct() ||
        parent.isa().isStruct())
        return true;
    const Operation* setParent = _access.hooksOf(item).setParent;
    if (setParent == nullptr)
        return true;
    const Value argument(&parent);
    if (!setParent->takes({&argument, 1}))
        return fail(error, errors::unableToSetValue, argument, "parent", item.isa().name());
    ObjectAccess::send(item, *setParent, argument);
    return true;
}

} // namespace qx::detail
