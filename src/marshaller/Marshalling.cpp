#include "marshaller/Marshalling.h"

#include <QXXMLMarshalling/model/Array.h>
#include <QXXMLMarshalling/model/Class.h>
#include <QXXMLMarshalling/model/Dictionary.h>

#include "marshaller/MarshallerMemory.h"
#include "marshaller/NamespaceMatching.h"
#include "marshaller/WritingContext.h"
#include "model/Errors.h"

#include <algorithm>

namespace qx::detail {

Marshalling::Marshalling(const QXXMLMarshaller& marshaller, XMLDraft* draft)
    : _marshaller(&marshaller), _mapping(marshaller.mapping()),
      _plan(MappingPlan::of(_mapping.get())),
      // The plan of a single step, which writes nodes, may stand in no mapping, and is gone after
      // it.
      _classUses(draft != nullptr ? MarshallerMemory::of(marshaller).classUses(_mapping)
                                  : std::make_shared<ClassUses>(_mapping)),
      _output(draft), _keepsExactly(marshaller.keepsExactly()), _reports(marshaller) {
    if (auto table = NamespaceMatching::keptOf(marshaller);
        table != nullptr && marshaller.isUsingNamespaceURIs())
        _names = std::make_unique<OutputNames>(std::move(table));
}

Marshalling::Marshalling(const QXXMLMarshaller& marshaller, XMLDraft& draft, WritingTrace& trace)
    : Marshalling(marshaller, &draft) {
    _trace = &trace;
    _names.reset();
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
    const Opened opened(*this, declarationsOf(plan, *object.object()));
    auto element = newElement(name.isEmpty() ? plan.namelessName : name, plan.attributeCount);
    const QXXMLClassMapping& mapping = *plan.mapping;
    if (_marshaller->isUsingNamespaceURIs() && !mapping.nsURI().isEmpty())
        _output.addDeclaration(element, mapping.nsPrefix().isNull() ? noPrefix : mapping.nsPrefix(),
                               mapping.nsURI());
    if (!writeObject(plan, element, *object.object(), error))
        return {};
    return element;
}

// Its declarations and attributes go with it. What was declared for its attributes counts as
// declared outside: so it is.
WrittenElement Marshalling::shell(const ClassPlan& plan, const WrittenElement& target,
                                  const Value& object, ErrorSlot error) {
    if (!_names)
        return element(plan, plan.elementName, object, error);
    auto shell = _output.newElement(plan.namelessName, 0);
    if (!writeFields(plan, shell, *object.object(), error))
        return {};
    for (const auto& [prefix, URI] : _names->added())
        _output.addDeclaration(target, _names->lasting(prefix), URI);
    return shell;
}

void Marshalling::declare(const WrittenElement& element,
                          const OutputNames::Declaration& declaration) {
    _output.addDeclaration(element, _names->lasting(declaration.prefix), declaration.URI);
    _names->declare(declaration);
}

WrittenElement Marshalling::newElement(const String& name, std::size_t attributes) {
    if (!_names)
        return _output.newElement(name, attributes);
    const OutputNames::Name written = _names->elementName(name);
    auto element = _output.newElement(written.text, attributes);
    if (written.declaration)
        declare(element, *written.declaration);
    return element;
}

void Marshalling::addNamedTextElement(const WrittenElement& parent, const String& name,
                                      const FieldText& text) {
    if (_trace != nullptr)
        _trace->addText(text.view(), false);
    if (!_names)
        return _output.addChild(parent, name, text);
    const Opened opened(*this);
    const auto element = newElement(name, 0);
    _output.setText(element, text);
    _output.addChild(parent, element);
}

void Marshalling::addNamedAttribute(const WrittenElement& element, const String& name,
                                    const FieldText& text) {
    if (_trace != nullptr) {
        const XMLDraft::Node* const last = element.drafted->lastAttribute;
        _output.addAttribute(element, name, text);
        return _trace->addText(text.view(), element.drafted->lastAttribute == last);
    }
    if (!_names)
        return _output.addAttribute(element, name, text);
    const OutputNames::Name written = _names->attributeName(name);
    if (written.declaration)
        declare(element, *written.declaration);
    _output.addAttribute(element, written.text, text);
}

bool Marshalling::writeObjectExactly(const ClassPlan& plan, const WrittenElement& element,
                                     Object& object, ErrorSlot error) {
    std::unique_ptr<KeptPlacing> placing;
    if (_marshaller->saveUnknownXML() && _access.mayKeepXML(object))
        placing = std::make_unique<KeptPlacing>(_output, _access.getKept(object, KeptXML::children),
                                                _access.getKept(object, KeptXML::attributes));
    const bool isEmpty = !placing || placing->isEmpty();
    struct Scope {
        Marshalling& writing;
        KeptPlacing* placing;
        const Object* placed;
        ~Scope() {
            writing._placing = placing;
            writing._placed = placed;
        }
    } const scope{*this, _placing, _placed};
    _placing = isEmpty ? nullptr : placing.get();
    _placed = isEmpty ? nullptr : &object;
    if (_placing != nullptr)
        _placing->start(element);
    if (!writeFields(plan, element, object, error))
        return false;
    if (_placing != nullptr)
        _placing->finish(element);
    return true;
}

void Marshalling::placeKept(const FieldPlan& field, const WrittenElement& element) {
    if (_placing->needsWrapper())
        _placing->placeInside(wrapperOf(field, element));
    _placing->leaveField(element);
}

WrittenElement Marshalling::wrapperOf(const FieldPlan& field, const WrittenElement& element) {
    const String& name = !field.location().isEmpty() ? field.location() : field.bindTo();
    if (name.isEmpty())
        return element;
    if (auto wrapper = lastChildNamed(element, name))
        return wrapper;
    const Opened opened(*this);
    auto wrapper = newElement(name, 0);
    _output.addChild(element, wrapper);
    return wrapper;
}

bool Marshalling::writeFields(const ClassPlan& plan, const WrittenElement& element, Object& object,
                              ErrorSlot error) {
    if (_depth >= _marshaller->maximumDepth())
        return failTooDeep(plan, error);
    struct Deeper {
        std::size_t& depth;
        explicit Deeper(std::size_t& counted) : depth(counted) { ++depth; }
        ~Deeper() { --depth; }
    } const deeper(_depth);

    if (_trace != nullptr)
        _trace->enterObject(plan, element.drafted, object, _access);
    bool isWritten = false;
    if (!plan.mapping->extends().isEmpty()) {
        isWritten = writeWithAncestors(plan, element, object, error);
    } else if (writeOwnFields(plan, element, object, error)) {
        restoreXML(element, object);
        isWritten = true;
    }
    if (_trace != nullptr)
        _trace->leave();
    return isWritten;
}

// A class that is self-first writes its fields before its ancestors', any other after them. Kept
// XML is put back at every level, the farthest ancestor's first, so that it ends up behind all
// fields.
bool Marshalling::writeWithAncestors(const ClassPlan& plan, const WrittenElement& element,
                                     Object& object, ErrorSlot error) {
    std::vector<const ClassPlan*> levels;
    ExtendsWalk walk(plan);
    do {
        levels.push_back(&walk.current());
        if (walk.current().mapping->isSelfFirst() &&
            !writeOwnFields(walk.current(), element, object, error))
            return false;
    } while (walk.next());
    if (!walk.broken().isNull())
        return failed(plan, errors::noExtendsWhenMarshalling, walk.broken(), error);
    for (; !levels.empty(); levels.pop_back()) {
        const ClassPlan& level = *levels.back();
        if (!level.mapping->isSelfFirst() && !writeOwnFields(level, element, object, error))
            return false;
        restoreXML(element, object);
    }
    return true;
}

bool Marshalling::failTooDeep(const ClassPlan& plan, ErrorSlot error) const {
    return failed(plan, errors::nestedTooDeep, _marshaller->maximumDepth(), error);
}

bool Marshalling::failed(const ClassPlan& plan, const ErrorText& text, const Value& argument,
                         ErrorSlot error) const {
    if (error == nullptr)
        return false;
    if (&text == &errors::nestedTooDeep)
        fail(error, text, argument, plan.className.string());
    else
        fail(error, text, argument);
    WritingContext::tell(*error, _mapping.get(), nullptr, plan.mapping);
    return false;
}

bool Marshalling::failed(const FieldPlan& field, const ClassPlan& plan, Ref<Error>& problem,
                         ErrorSlot error) const {
    WritingContext::tell(problem, _mapping.get(), field.mapping, plan.mapping);
    WritingContext::tellKey(problem, field.key.view());
    *error = std::move(problem);
    return false;
}

bool Marshalling::failed(const FieldPlan& field, std::size_t item, Ref<Error>& problem,
                         ErrorSlot error) const {
    WritingContext::tell(problem, _mapping.get(), field.mapping,
                         field.mapping->classMapping().get());
    WritingContext::tellItem(problem, item);
    *error = std::move(problem);
    return false;
}

bool Marshalling::writeOwnFields(const ClassPlan& plan, const WrittenElement& element,
                                 Object& object, ErrorSlot error) {
    const auto& getters = _classUses->gettersOf(plan, object);
    ValuePlace place{ObjectAccess::plainRecord(object), nullptr};
    for (std::size_t i = 0; i < plan.fields.size(); ++i) {
        const FieldPlan& field = plan.fields[i];
        place.property = getters.properties[i];
        Ref<Error> problem;
        if (_trace != nullptr)
            _trace->enterField(field);
        if (_placing != nullptr)
            _placing->enterField(field.key);
        const bool isWritten = writeField(field, element, object, place, &problem);
        if (_placing != nullptr && isWritten)
            placeKept(field, element);
        if (_trace != nullptr)
            _trace->leave();
        if (isWritten)
            continue;
        return error != nullptr && failed(field, plan, problem, error);
    }
    return true;
}

WrittenElement Marshalling::lastChildNamed(const WrittenElement& element, const String& name) {
    return _output.lastChildNamed(element, _names ? _names->elementName(name).text : name);
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
    if (_trace != nullptr || !_access.mayKeepXML(object))
        return;
    if (_marshaller->saveUnknownXML() && &object != _placed)
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
    if (_names)
        for (const auto& [prefix, URI] : _names->added())
            copies.push_back(XMLNode::namespaceWithName(prefix, URI));
    _output.setDeclarations(element, copies);
}

} // namespace qx::detail
