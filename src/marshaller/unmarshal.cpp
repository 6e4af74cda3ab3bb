#include "marshaller/Unmarshalling.h"

#include <QXXMLMarshalling/model/Array.h>

#include "host/Log.h"
#include "model/Errors.h"

using qx::Error;
using qx::Key;
using qx::Ref;
using qx::Value;

Unmarshalling::Unmarshalling(QXXMLMarshaller& marshaller, qx::XMLElement* root, Use use)
    : _marshaller(&marshaller), _root(root), _plan(marshaller.plan()), _use(use),
      _budget(marshaller, root), _classes(_plan.classCount() + 1),
      _classKnown(_plan.classCount() + 1),
      _hostActs(use == Use::steps || qx::hostHasLogDebug() || qx::hostHasLogWarning()) {}

// Lends counts for the time of one object's binding.
class Unmarshalling::SpareCounts {
public:
    explicit SpareCounts(Unmarshalling& unmarshalling) : _lent(unmarshalling._countsLent) {
        auto& all = unmarshalling._counts;
        if (_lent == all.size())
            all.push_back(std::make_unique<NameCounts>());
        _counts = all[_lent++].get();
    }
    ~SpareCounts() {
        _counts->clear();
        --_lent;
    }
    SpareCounts(const SpareCounts&) = delete;
    SpareCounts& operator=(const SpareCounts&) = delete;
    NameCounts& operator*() const noexcept { return *_counts; }

private:
    std::size_t& _lent;
    NameCounts* _counts;
};

Ref<qx::Object> Unmarshalling::unmarshallNode(qx::XMLNode* node, CopyScope* scope,
                                              ErrorSlot error) {
    qx::XMLElement* element = node != nullptr ? node->asElement() : nullptr;
    const ClassPlan* plan = element != nullptr ? _plan.classForElement(element->name()) : nullptr;
    if (plan != nullptr)
        return build(*plan, *element, scope, error);
    if (_marshaller->isLenient())
        return nullptr;
    return qx::fail(error, qx::errors::noDefinitionForElement, node);
}

Ref<qx::Object> Unmarshalling::build(const ClassPlan& plan, qx::XMLElement& element,
                                     CopyScope* scope, ErrorSlot error) {
    ElementSource source(element, scope, plan.bindingCount);
    return build(plan, source, false, error);
}

// A class that is flattened into itself, over whatever other classes, would never end.
bool Unmarshalling::isBeingBound(const ClassPlan& plan, const qx::XMLElement& element) const {
    for (const Frame* frame = _frame; frame != nullptr && frame->element == &element;
         frame = frame->parent)
        if (frame->plan->className == plan.className)
            return true;
    return false;
}

bool Unmarshalling::mayBuild(const ClassPlan& plan, const ElementSource& source, ErrorSlot error) {
    const qx::XMLElement& element = source.element();
    if (isBeingBound(plan, element))
        return qx::fail(error, qx::errors::noDefinitionForElement, &element);
    const std::size_t depth = _frame != nullptr ? _frame->depth : 0;
    const std::size_t deepest = _marshaller->maximumDepth();
    // What is refused counts too: without a slot the reading goes on.
    if (!_budget.takeObject(plan.className.string(), error))
        return false;
    if (depth < deepest)
        return _budget.takeVisits(element.childCount(), element, error);
    return qx::fail(error, qx::errors::nestedTooDeep, deepest, plan.className.string());
}

Ref<qx::Object> Unmarshalling::build(const ClassPlan& plan, ElementSource& source, bool isFlattened,
                                     ErrorSlot error) {
    if (!mayBuild(plan, source, error))
        return nullptr;
    Ref<qx::Object> object = allocate(plan);
    // Whoever set it: a caller's earlier error stops the binding, too.
    if (error != nullptr && *error)
        return nullptr;
    QXGenericRecord* const record = ObjectDoor::plainRecord(*object);
    const ObjectHooks* const hooks = record == nullptr ? &_door.hooksOf(*object) : nullptr;
    if (hooks != nullptr && hooks->rootObject != nullptr && hooks->setUndoManager != nullptr)
        ObjectDoor::send(*object, *hooks->setUndoManager, _marshaller->undoManager());

    const Frame frame{&plan, &source.element(), _frame, _frame != nullptr ? _frame->depth + 1 : 1};
    struct Restore {
        const Frame*& current;
        const Frame* outer;
        ~Restore() { current = outer; }
    } const restore{_frame, _frame};
    _frame = &frame;
    const SpareCounts fields(*this);
    const SpareCounts attributes(*this);
    if (!bindFields(plan, {*object, source, {*fields, *attributes}, isFlattened}, error))
        return nullptr;
    if (record != nullptr)
        record->setNotifyBindingsObservers(true);
    else if (hooks->setNotifyBindingsObservers != nullptr)
        ObjectDoor::send(*object, *hooks->setNotifyBindingsObservers, true);
    return object;
}

Ref<qx::Object> Unmarshalling::allocate(const ClassPlan& plan) {
    if (!_classKnown[plan.index]) {
        _classKnown[plan.index] = true;
        _classes[plan.index] = qx::Class::named(plan.classNameToInstantiate.view());
    }
    const qx::Class* type = _classes[plan.index];
    if (type != nullptr)
        hostActs();
    Ref<qx::Object> object = type != nullptr ? type->create() : nullptr;
    if (type != nullptr && !object) {
        qx::logWarningOrLine("Class %@ cannot be made without arguments, records stand in for it",
                             type->name());
        _classes[plan.index] = nullptr;
    }
    if (!object)
        object = QXGenericRecord::classObject().create();
    if (QXGenericRecord* record = ObjectDoor::plainRecord(*object)) {
        record->setClassNameForMarshalling(plan.className.string());
        record->setNotifyBindingsObservers(false);
        return object;
    }
    const ObjectHooks& hooks = _door.hooksOf(*object);
    if (hooks.setClassNameForMarshalling != nullptr)
        ObjectDoor::send(*object, *hooks.setClassNameForMarshalling, plan.className.string());
    if (hooks.setNotifyBindingsObservers != nullptr)
        ObjectDoor::send(*object, *hooks.setNotifyBindingsObservers, false);
    return object;
}

// From the first flattened field of a class on, that class and all its ancestors are bound from a
// private copy of what is left of the element; an ancestor with such a field makes one of its own.
bool Unmarshalling::bindFields(const ClassPlan& plan, const Target& target, ErrorSlot error) {
    std::unique_ptr<ElementSource> copy;
    ElementSource* source = &target.source;
    source->expectLookups(target.isFlattened ? plan.bindingCount : 0);
    ExtendsWalk walk(plan);
    while (true) {
        bool copied = false;
        for (const FieldPlan& field : walk.current().fields) {
            if (!field.isContainer && !copied) {
                if (!_budget.takeVisits(source->firstChildCount(), source->element(), error))
                    return false;
                copy = ElementSource::copyOf(*source);
                source = copy.get();
                copied = true;
            }
            if (!bindField(field, {target.object, *source, target.bound, target.isFlattened},
                           error))
                return false;
        }
        if (!walk.next())
            break;
        source->expectLookups(walk.current().bindingCount);
    }
    if (!walk.broken().isNull())
        return qx::fail(error, qx::errors::noExtends, walk.broken());
    const Target rest{target.object, *source, target.bound, target.isFlattened};
    return keepNamespaces(rest, error) && validate(&plan, rest, error);
}

bool Unmarshalling::keepNamespaces(const Target& target, ErrorSlot error) {
    static const Key key("__namespaces");
    const auto namespaces = target.source.element().namespaces();
    if (namespaces.empty())
        return true;
    auto kept = qx::make<qx::Array>();
    for (qx::XMLNode& declaration : namespaces) {
        auto node = target.source.keep(declaration, _budget, error);
        if (!node)
            return false;
        kept->add(std::move(node));
    }
    return ObjectDoor::set(target.object, key, kept, error);
}

// A step that found nothing and complains of nothing does not fail the object.
bool Unmarshalling::bindField(const FieldPlan& field, const Target& target, ErrorSlot error) {
    if (field.collection != CollectionKind::none)
        return bindCollection(field, target, error);
    Ref<Error> problem;
    bool bound = false;
    switch (field.nodeType) {
    case QXXMLNodeTypeAttribute:
        bound = bindAsAttribute(field, target, &problem);
        break;
    case QXXMLNodeTypeElement:
        bound = bindAsElement(field, target, &problem);
        break;
    case QXXMLNodeTypeText:
        bound = bindAsText(field, target, &problem);
        break;
    case QXXMLNodeTypeUnknown:
        bound = bindAsAttribute(field, target, &problem) || bindAsElement(field, target, &problem);
        break;
    default:
        return qx::fail(error, qx::errors::unknownFieldNodeType, field.mapping->node(),
                        field.mapping);
    }
    if (bound || !problem)
        return true;
    if (error != nullptr)
        *error = std::move(problem);
    return false;
}

// The item knows the object that holds it before it is set on it.
bool Unmarshalling::adopt(qx::Object& item, qx::Object& parent, ErrorSlot error) {
    if (ObjectDoor::plainRecord(item) != nullptr)
        return true;
    const qx::Operation* setParent = _door.hooksOf(item).setParent;
    if (setParent == nullptr)
        return true;
    const Value argument(&parent);
    if (!setParent->takes({&argument, 1}))
        return qx::fail(error, qx::errors::unableToSetValue, argument, "parent", item.isa().name());
    ObjectDoor::send(item, *setParent, argument);
    return true;
}
