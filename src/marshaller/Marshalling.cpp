#include "marshaller/Marshalling.h"

#include <QXXMLMarshalling/model/Array.h>
#include <QXXMLMarshalling/model/Class.h>
#include <QXXMLMarshalling/model/Dictionary.h>

#include "model/Errors.h"

#include <algorithm>

namespace qx::detail {

Marshalling::Marshalling(const QXXMLMarshaller& marshaller, XMLDraft* draft)
    : _marshaller(&marshaller), _mapping(marshaller.mapping()),
      _plan(MappingPlan::of(_mapping.get())), _output(draft) {}

const ClassPlan* Marshalling::classOf(const Value& value) const {
    return value.isObject() ? _plan.classNamed(value.classNameForMarshalling()) : nullptr;
}

WrittenElement Marshalling::marshallObject(const Value& object, ErrorSlot error) {
    const String className = object.classNameForMarshalling();
    if (className.isNull())
        return fail(error, errors::noClassName,
                    object.isObject() ? object.object()->isa().name() : String());
    const ClassPlan* plan = classOf(object);
    if (plan == nullptr)
        return fail(error, errors::noMappingDefinition, className);
    return element(*plan, plan->elementName, object, error);
}

WrittenElement Marshalling::element(const ClassPlan& plan, const String& name, const Value& object,
                                    ErrorSlot error) {
    if (!object.isObject())
        return fail(error, errors::noMappingDefinition, object.classNameForMarshalling());
    static const String noPrefix("");
    auto element =
        _output.newElement(name.isEmpty() ? plan.namelessName : name, plan.attributeCount);
    const QXXMLClassMapping& mapping = *plan.mapping;
    if (_marshaller->isUsingNamespaceURIs() && !mapping.nsURI().isEmpty())
        _output.addDeclaration(element, mapping.nsPrefix().isNull() ? noPrefix : mapping.nsPrefix(),
                               mapping.nsURI());
    if (!writeFields(plan, element, *object.object(), error))
        return {};
    return element;
}

// A class that is self-first writes its fields before its ancestors', any other after them. Kept
// XML is put back at every level, the farthest ancestor's first, so that it ends up behind all
// fields.
bool Marshalling::writeFields(const ClassPlan& plan, const WrittenElement& element, Object& object,
                              ErrorSlot error) {
    const std::size_t deepest = _marshaller->maximumDepth();
    if (_depth >= deepest)
        return fail(error, errors::nestedTooDeep, deepest, plan.className.string());
    struct Deeper {
        std::size_t& depth;
        explicit Deeper(std::size_t& counted) : depth(counted) { ++depth; }
        ~Deeper() { --depth; }
    } const deeper(_depth);

    std::vector<const ClassPlan*> ancestors;
    ExtendsWalk walk(plan);
    do {
        if (&walk.current() != &plan)
            ancestors.push_back(&walk.current());
        if (walk.current().mapping->isSelfFirst() &&
            !writeOwnFields(walk.current(), element, object, error))
            return false;
    } while (walk.next());
    if (!walk.broken().isNull())
        return fail(error, errors::noExtendsWhenMarshalling, walk.broken());
    const auto finish = [&](const ClassPlan& level) {
        if (!level.mapping->isSelfFirst() && !writeOwnFields(level, element, object, error))
            return false;
        restoreXML(element, object);
        return true;
    };
    return std::all_of(ancestors.rbegin(), ancestors.rend(),
                       [&](const ClassPlan* ancestor) { return finish(*ancestor); }) &&
           finish(plan);
}

bool Marshalling::writeOwnFields(const ClassPlan& plan, const WrittenElement& element,
                                 Object& object, ErrorSlot error) {
    for (const FieldPlan& field : plan.fields) {
        Ref<Error> problem;
        if (writeField(field, element, object, &problem))
            continue;
        if (error != nullptr)
            *error = std::move(problem);
        return false;
    }
    return true;
}

bool Marshalling::isToBeWritten(const Value& item) { return _access.isToBeWritten(*item.object()); }

namespace {

// Null for what is no such node.
Ref<XMLNode> keptNode(const Value& kept, XMLNodeKind kind) {
    auto node = kept.as<XMLNode>();
    return node && node->kind() == kind ? node : nullptr;
}

} // namespace

void Marshalling::restoreXML(const WrittenElement& element, const Object& object) {
    if (!_access.mayKeepXML(object))
        return;
    if (_marshaller->saveUnknownXML())
        restoreUnknownXML(element, object);
    restoreNamespaces(element, object);
}

void Marshalling::restoreUnknownXML(const WrittenElement& element, const Object& object) {
    if (const auto children = _access.getKept(object, KeptXML::children).as<Dictionary>())
        for (const auto& entry : *children)
            if (const auto elements = entry.value.as<Array>())
                for (const Value& kept : *elements)
                    if (const auto child = keptNode(kept, XMLNodeKind::element))
                        _output.keepChild(element, child);
    if (const auto attributes = _access.getKept(object, KeptXML::attributes).as<Array>())
        for (const Value& kept : *attributes)
            if (const auto attribute = keptNode(kept, XMLNodeKind::attribute))
                _output.keepAttribute(element, attribute);
}

// The declarations that were read take the place of the class mapping's own.
void Marshalling::restoreNamespaces(const WrittenElement& element, const Object& object) {
    const auto kept = _access.getKept(object, KeptXML::namespaces).as<Array>();
    if (!kept || kept->isEmpty() || !_marshaller->isUsingNamespaceURIs())
        return;
    std::vector<Ref<XMLNode>> copies;
    for (const Value& value : *kept) {
        const auto declaration = value.as<XMLNode>();
        if (declaration && declaration->kind() == XMLNodeKind::namespaceDeclaration)
            copies.push_back(declaration->copy());
    }
    _output.setDeclarations(element, copies);
}

} // namespace qx::detail
