#include "marshaller/Marshalling.h"

#include <QXXMLMarshalling/model/Array.h>
#include <QXXMLMarshalling/model/Class.h>
#include <QXXMLMarshalling/model/Dictionary.h>

#include "model/Errors.h"

#include <algorithm>

using qx::Key;
using qx::Ref;
using qx::String;
using qx::Value;
using qx::XMLElement;
using qx::XMLNode;

Marshalling::Marshalling(QXXMLMarshaller& marshaller)
    : _marshaller(&marshaller), _plan(marshaller.plan()),
      _saveUnknownXML(marshaller._saveUnknownXML),
      _usingNamespaceURIs(marshaller._usingNamespaceURIs) {}

const ClassPlan* Marshalling::classOf(const Value& value) const {
    return value.isObject() ? _plan.classNamed(value.classNameForMarshalling()) : nullptr;
}

Ref<XMLElement> Marshalling::marshallObject(const Value& object, ErrorSlot error) {
    const String className = object.classNameForMarshalling();
    if (className.isNull())
        return qx::fail(error, qx::errors::noClassName,
                        object.isObject() ? object.object()->isa().name() : String());
    const ClassPlan* plan = classOf(object);
    if (plan == nullptr)
        return qx::fail(error, qx::errors::noMappingDefinition, className);
    return element(*plan, plan->elementName, object, error);
}

Ref<XMLElement> Marshalling::element(const ClassPlan& plan, const String& name, const Value& object,
                                     ErrorSlot error) {
    if (!object.isObject())
        return qx::fail(error, qx::errors::noMappingDefinition, object.classNameForMarshalling());
    auto element = XMLElement::initForAttributes(name.isEmpty() ? plan.className.string() : name,
                                                 plan.attributeCount);
    const QXXMLClassMapping& mapping = *plan.mapping;
    if (_usingNamespaceURIs && !mapping.nsURI().isEmpty()) {
        const String prefix = mapping.nsPrefix().isNull() ? String("") : mapping.nsPrefix();
        element->addNamespace(XMLNode::namespaceWithName(prefix, mapping.nsURI()));
    }
    return bindFields(plan, *element, *object.object(), error) ? element : nullptr;
}

// A class that is self-first writes its fields before its ancestors', any other after them. Kept
// XML is put back at every level, the farthest ancestor's first, so that it ends up behind all
// fields.
bool Marshalling::bindFields(const ClassPlan& plan, XMLElement& element, qx::Object& object,
                             ErrorSlot error) {
    const std::size_t deepest = _marshaller->_maximumDepth;
    if (_depth >= deepest)
        return qx::fail(error, qx::errors::nestedTooDeep, deepest, plan.className.string());
    struct Deeper {
        std::size_t& depth;
        explicit Deeper(std::size_t& counted) : depth(counted) { ++depth; }
        ~Deeper() { --depth; }
    } const deeper(_depth);

    std::vector<const ClassPlan*> levels;
    ExtendsWalk walk(plan);
    do {
        levels.push_back(&walk.current());
        if (walk.current().mapping->isSelfFirst() &&
            !bindOwnFields(walk.current(), element, object, error))
            return false;
    } while (walk.next());
    if (!walk.broken().isNull())
        return qx::fail(error, qx::errors::noExtendsWhenMarshalling, walk.broken());
    std::reverse(levels.begin(), levels.end());
    for (const ClassPlan* level : levels) {
        if (!level->mapping->isSelfFirst() && !bindOwnFields(*level, element, object, error))
            return false;
        if (_saveUnknownXML)
            restoreUnknownXML(element, object);
        restoreNamespaces(element, object);
    }
    return true;
}

bool Marshalling::bindOwnFields(const ClassPlan& plan, XMLElement& element, qx::Object& object,
                                ErrorSlot error) {
    for (const FieldPlan& field : plan.fields) {
        Ref<qx::Error> problem;
        if (mapField(field, element, object, &problem))
            continue;
        if (error != nullptr)
            *error = std::move(problem);
        return false;
    }
    return true;
}

namespace {

// Takes a kept node out of wherever it is; null for what is no such node.
Ref<XMLNode> moved(const Value& kept, qx::XMLNodeKind kind) {
    auto node = kept.as<XMLNode>();
    if (!node || node->kind() != kind)
        return nullptr;
    node->detach();
    return node;
}

} // namespace

void Marshalling::restoreUnknownXML(XMLElement& element, const qx::Object& object) {
    static const Key childrenKey("unboundChildren");
    static const Key attributesKey("unboundAttributes");
    if (const auto children = ObjectDoor::get(object, childrenKey).as<qx::Dictionary>()) {
        const auto known = _lastChildren.find(&element);
        LastChildren* const last = known != _lastChildren.end() ? &known->second : nullptr;
        if (last != nullptr)
            last->catchUp(element);
        for (const auto& entry : *children)
            if (const auto elements = entry.value.as<qx::Array>())
                for (const Value& kept : *elements)
                    if (const auto child = moved(kept, qx::XMLNodeKind::element)) {
                        element.addChild(child);
                        if (last != nullptr)
                            last->see(*child);
                    }
    }
    if (const auto attributes = ObjectDoor::get(object, attributesKey).as<qx::Array>())
        for (const Value& kept : *attributes)
            if (auto attribute = moved(kept, qx::XMLNodeKind::attribute))
                element.addAttribute(std::move(attribute));
}

// The declarations that were read take the place of the class mapping's own.
void Marshalling::restoreNamespaces(XMLElement& element, const qx::Object& object) const {
    static const Key key("__namespaces");
    const auto kept = ObjectDoor::get(object, key).as<qx::Array>();
    if (!kept || kept->isEmpty() || !_usingNamespaceURIs)
        return;
    std::vector<Ref<XMLNode>> copies;
    for (const Value& value : *kept) {
        const auto declaration = value.as<XMLNode>();
        if (declaration && declaration->kind() == qx::XMLNodeKind::namespaceDeclaration)
            copies.push_back(declaration->copy());
    }
    element.setNamespaces(copies);
}
