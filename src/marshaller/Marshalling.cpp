#include "marshaller/Marshalling.h"

#include <QXXMLMarshalling/model/Array.h>
#include <QXXMLMarshalling/model/Class.h>
#include <QXXMLMarshalling/model/Dictionary.h>

#include "marshaller/NamespaceMatching.h"
#include "model/Errors.h"

#include <algorithm>

namespace qx::detail {

Marshalling::Marshalling(const QXXMLMarshaller& marshaller)
    : _marshaller(&marshaller), _plan(MappingPlan::of(marshaller.mapping())) {
    if (auto table = NamespaceMatching::keptOf(marshaller);
        table != nullptr && marshaller.isUsingNamespaceURIs())
        _names = std::make_unique<OutputNames>(std::move(table));
}

Marshalling::Marshalling(const QXXMLMarshaller& marshaller, const XMLElement& inside)
    : Marshalling(marshaller) {
    if (!_names)
        return;
    std::vector<const XMLElement*> around;
    const XMLNode* node = &inside;
    for (; node != nullptr && node->isElement(); node = node->parent())
        around.push_back(node->asElement());
    std::vector<OutputNames::Declaration> declarations;
    for (const XMLElement* element : around)
        for (const XMLNode& declaration : element->namespaces())
            declarations.push_back({declaration.name(), declaration.stringValue()});
    _names->enter(declarations);
}

const ClassPlan* Marshalling::classOf(const Value& value) const {
    return value.isObject() ? _plan.classNamed(value.classNameForMarshalling()) : nullptr;
}

Ref<XMLElement> Marshalling::marshallObject(const Value& object, ErrorSlot error) {
    const String className = object.classNameForMarshalling();
    if (className.isNull())
        return fail(error, errors::noClassName,
                    object.isObject() ? object.object()->isa().name() : String());
    const ClassPlan* plan = classOf(object);
    if (plan == nullptr)
        return fail(error, errors::noMappingDefinition, className);
    return element(*plan, plan->elementName, object, error);
}

Ref<XMLElement> Marshalling::element(const ClassPlan& plan, const String& name, const Value& object,
                                     ErrorSlot error) {
    if (!object.isObject())
        return fail(error, errors::noMappingDefinition, object.classNameForMarshalling());
    const Opened opened(*this, declarationsOf(plan, *object.object()));
    auto element = newElement(name.isEmpty() ? plan.className.string() : name, plan.attributeCount);
    const QXXMLClassMapping& mapping = *plan.mapping;
    if (_marshaller->isUsingNamespaceURIs() && !mapping.nsURI().isEmpty()) {
        const String prefix = mapping.nsPrefix().isNull() ? String("") : mapping.nsPrefix();
        element->addNamespace(XMLNode::namespaceWithName(prefix, mapping.nsURI()));
    }
    return writeFields(plan, *element, *object.object(), error) ? element : nullptr;
}

// Its declarations and attributes go with it. What was declared for its attributes counts as
// declared outside: so it is.
Ref<XMLElement> Marshalling::shell(const ClassPlan& plan, XMLElement& target, const Value& object,
                                   ErrorSlot error) {
    if (!_names)
        return element(plan, plan.elementName, object, error);
    auto shell = XMLElement::initWithName(plan.className.string());
    if (!writeFields(plan, *shell, *object.object(), error))
        return nullptr;
    for (const auto& [prefix, URI] : _names->added())
        target.addNamespace(XMLNode::namespaceWithName(prefix, URI));
    return shell;
}

Ref<XMLElement> Marshalling::newElement(const String& name, std::size_t attributes) {
    if (!_names)
        return XMLElement::initForAttributes(name, attributes);
    const OutputNames::Name written = _names->elementName(name);
    auto element = XMLElement::initForAttributes(written.text, attributes);
    if (written.declaration) {
        const auto& [prefix, URI] = *written.declaration;
        element->addNamespace(XMLNode::namespaceWithName(prefix, URI));
        _names->declare(*written.declaration);
    }
    return element;
}

Ref<XMLElement> Marshalling::textElement(const String& name, const String& text) {
    if (!_names)
        return XMLElement::initWithName(name, text);
    const Opened opened(*this);
    auto element = newElement(name, 0);
    element->setStringValue(text);
    return element;
}

void Marshalling::addAttribute(XMLElement& element, const String& name, const String& text) {
    if (!_names)
        return element.addAttribute(name, text);
    const OutputNames::Name written = _names->attributeName(name);
    if (written.declaration) {
        const auto& [prefix, URI] = *written.declaration;
        element.addNamespace(XMLNode::namespaceWithName(prefix, URI));
        _names->declare(*written.declaration);
    }
    element.addAttribute(written.text, text);
}

// A class that is self-first writes its fields before its ancestors', any other after them. Kept
// XML is put back at every level, the farthest ancestor's first, so that it ends up behind all
// fields.
bool Marshalling::writeFields(const ClassPlan& plan, XMLElement& element, Object& object,
                              ErrorSlot error) {
    const std::size_t deepest = _marshaller->maximumDepth();
    if (_depth >= deepest)
        return fail(error, errors::nestedTooDeep, deepest, plan.className.string());
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
            !writeOwnFields(walk.current(), element, object, error))
            return false;
    } while (walk.next());
    if (!walk.broken().isNull())
        return fail(error, errors::noExtendsWhenMarshalling, walk.broken());
    std::reverse(levels.begin(), levels.end());
    for (const ClassPlan* level : levels) {
        if (!level->mapping->isSelfFirst() && !writeOwnFields(*level, element, object, error))
            return false;
        if (_marshaller->saveUnknownXML())
            restoreUnknownXML(element, object);
        restoreNamespaces(element, object);
    }
    return true;
}

bool Marshalling::writeOwnFields(const ClassPlan& plan, XMLElement& element, Object& object,
                                 ErrorSlot error) {
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

XMLElement* Marshalling::lastChildNamed(const XMLElement& element, const String& mapped) {
    const String& name = _names ? _names->elementName(mapped).text : mapped;
    // Up to so many, looking through the children costs no more than an index of them.
    constexpr std::size_t mostScanned = 64;
    if (element.childCount() > mostScanned)
        return _lastChildren[&element].named(element, name);
    for (XMLNode* child = element.lastChild(); child != nullptr; child = child->previousSibling())
        if (child->isElement() && child->name() == name)
            return child->asElement();
    return nullptr;
}

bool Marshalling::isToBeWritten(const Value& item) { return _access.isToBeWritten(*item.object()); }

namespace {

// Takes a kept node out of wherever it is; null for what is no such node.
Ref<XMLNode> moved(const Value& kept, XMLNodeKind kind) {
    auto node = kept.as<XMLNode>();
    if (!node || node->kind() != kind)
        return nullptr;
    node->detach();
    return node;
}

} // namespace

void Marshalling::restoreUnknownXML(XMLElement& element, const Object& object) {
    if (const auto children = _access.getKept(object, KeptXML::children).as<Dictionary>()) {
        const auto known = _lastChildren.find(&element);
        LastChildByName* const last = known != _lastChildren.end() ? &known->second : nullptr;
        if (last != nullptr)
            last->catchUp(element);
        for (const auto& entry : *children)
            if (const auto elements = entry.value.as<Array>())
                for (const Value& kept : *elements)
                    if (const auto child = moved(kept, XMLNodeKind::element)) {
                        element.addChild(child);
                        if (last != nullptr)
                            last->see(*child);
                    }
    }
    if (const auto attributes = _access.getKept(object, KeptXML::attributes).as<Array>())
        for (const Value& kept : *attributes)
            if (auto attribute = moved(kept, XMLNodeKind::attribute))
                element.addAttribute(std::move(attribute));
}

std::vector<OutputNames::Declaration> Marshalling::keptDeclarations(const Object& object) {
    std::vector<OutputNames::Declaration> declarations;
    if (!_names)
        return declarations;
    if (const auto kept = _access.getKept(object, KeptXML::namespaces).as<Array>())
        for (const Value& value : *kept)
            if (const auto declaration = value.as<XMLNode>();
                declaration && declaration->kind() == XMLNodeKind::namespaceDeclaration)
                declarations.push_back({declaration->name(), declaration->stringValue()});
    return declarations;
}

std::vector<OutputNames::Declaration> Marshalling::declarationsOf(const ClassPlan& plan,
                                                                  const Object& object) {
    auto declarations = keptDeclarations(object);
    const QXXMLClassMapping& mapping = *plan.mapping;
    if (_names && declarations.empty() && !mapping.nsURI().isEmpty())
        declarations.push_back(
            {mapping.nsPrefix().isNull() ? String("") : mapping.nsPrefix(), mapping.nsURI()});
    return declarations;
}

// The declarations that were read take the place of the class mapping's own; those that names need
// beside them stay.
void Marshalling::restoreNamespaces(XMLElement& element, const Object& object) {
    const auto kept = _access.getKept(object, KeptXML::namespaces).as<Array>();
    if (!kept || kept->isEmpty() || !_marshaller->isUsingNamespaceURIs())
        return;
    std::vector<Ref<XMLNode>> copies;
    for (const Value& value : *kept) {
        const auto declaration = value.as<XMLNode>();
        if (declaration && declaration->kind() == XMLNodeKind::namespaceDeclaration)
            copies.push_back(declaration->copy());
    }
    if (_names)
        for (const auto& [prefix, URI] : _names->added())
            copies.push_back(XMLNode::namespaceWithName(prefix, URI));
    element.setNamespaces(copies);
}

} // namespace qx::detail
