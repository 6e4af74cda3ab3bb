// The bindings of one field by itself: words that are none, names and locations that nothing uses.

#include "base/WhiteSpace.h"
#include "check/Rules.h"
#include "xml/XMLCharacters.h"

#include <set>

namespace qx::detail {

namespace {

constexpr std::string_view nodes[] = {"attribute", "element", "text"};
constexpr std::string_view collections[] = {"array", "vector", "collection", "set"};

// Words of other languages, and what stands for them here.
constexpr std::pair<std::string_view, std::string_view> foreignNodes[] = {
    {"attr", "attribute"}, {"@", "attribute"},     {"child", "element"}, {"tag", "element"},
    {"elem", "element"},   {"content", "text"},    {"value", "text"},    {"cdata", "text"},
    {"body", "text"},      {"characters", "text"}, {"#text", "text"},    {"text()", "text"},
};

// One field, whose findings are added to the check.
class BindingCheck {
public:
    BindingCheck(MappingCheck& check, const ClassPlan& type, const FieldPlan& field)
        : _check(check), _type(type), _field(field), _bindings(field.mapping->bindToMappings()) {}

    void run() {
        checkWords();
        checkThatItIsRead();
        checkNames();
        checkAlternatives();
        checkLocations();
        const bool isObject = _field.kind == BindingKind::element ||
                              _field.kind == BindingKind::flattened ||
                              _field.kind == BindingKind::automatic;
        if (!_field.isContainer && (!isObject || _field.isCollection()))
            _check.add(findings::containerOfNoObject, ofField());
    }

private:
    String suggestedCollection(const String& word);
    String suggestedNode(const String& word);
    void checkWords();
    void checkThatItIsRead();
    void checkNames();
    static String trimmedName(std::string_view text);
    String suggestedName(std::string_view name) const;
    void checkAlternatives();
    void checkLocations();

    Subject ofField() const { return Subject::of(*_field.mapping); }
    Subject ofBinding(std::size_t number) const {
        return Subject::of(*_field.mapping, *_bindings[number]);
    }

    MappingCheck& _check;
    const ClassPlan& _type;
    const FieldPlan& _field;
    const std::vector<Ref<QXXMLBindToMapping>>& _bindings;
};

// All kinds of collection make an array.
String BindingCheck::suggestedCollection(const String& word) {
    const String near = _check.nearest(word, collections);
    return near.isNull() ? String(collections[0]) : near;
}

String BindingCheck::suggestedNode(const String& word) {
    const String lower = word.lowercased();
    for (const auto& [foreign, ours] : foreignNodes)
        if (lower == foreign)
            return ours;
    return _check.nearest(word, nodes);
}

void BindingCheck::checkWords() {
    if (_field.collection == CollectionKind::unknown)
        _check.suggest(suggestedCollection(_field.mapping->collection()),
                       findings::unknownCollection, ofField(), _field.mapping->collection(),
                       _type.mapping->className());
    if (_field.isCollection() && !_bindings.empty()) {
        const auto node = _field.mapping->nodeType();
        if (node == QXXMLNodeTypeAttribute || node == QXXMLNodeTypeText)
            _check.add(findings::nodeOfCollection, ofBinding(0), _bindings.front()->node());
    }
    if (_bindings.empty() || _field.isCollection() || _field.kind != BindingKind::automatic)
        return;
    const String& node = _bindings.front()->node();
    if (!node.isEmpty())
        return _check.suggest(suggestedNode(node), findings::unknownNode, ofBinding(0), node);
    const ClassPlan* const type = _field.typeClass;
    if (type == nullptr)
        return _check.add(findings::nodeLeftOpen, ofBinding(0));
    // An object is written under its class's name, and read from the field's.
    const String written = type->elementName.isEmpty() ? type->namelessName : type->elementName;
    if (_field.isContainer && written != _field.xmlName())
        _check.suggest("node=\"element\"", findings::writtenAsClass, ofBinding(0), written);
}

void BindingCheck::checkThatItIsRead() {
    const bool isCollection = _field.isCollection();
    if (_bindings.empty() && (!isCollection || _field.hasType()))
        return _field.isRequired && !isCollection
                   ? _check.add(findings::requiredWithoutBinding, ofField(),
                                _type.mapping->className())
                   : _check.add(findings::fieldWithoutBinding, ofField());
    if (!isCollection || _field.typeClass == nullptr)
        return;
    bool isNamed = false;
    for (const BindingPlan& binding : _field.bindings)
        isNamed = isNamed || !binding.bindTo.isEmpty();
    if (!isNamed)
        _check.add(findings::itemsWithoutName, ofBinding(0), _field.typeClass->className.string());
}

void BindingCheck::checkNames() {
    for (std::size_t i = 0; i < _bindings.size(); ++i) {
        const String& name = _bindings[i]->bindTo();
        const String& location = _bindings[i]->location();
        if (!name.isEmpty() && !isXMLName(name))
            _check.suggest(suggestedName(name), findings::noXMLName, ofBinding(i), name);
        if (!location.isEmpty() && !isXMLName(location))
            _check.suggest(trimmedName(location), findings::noXMLName, ofBinding(i), location);
    }
}

String BindingCheck::trimmedName(std::string_view text) {
    const std::string_view name = trimmed(text);
    return isXMLName(name) ? String(name) : String();
}

// Names are no paths, nor do they say what kind of node they are of.
String BindingCheck::suggestedName(std::string_view name) const {
    const std::string_view plain = trimmed(name);
    if (plain.starts_with('@') && isXMLName(plain.substr(1)))
        return "name=\"" + std::string(plain.substr(1)) + "\" node=\"attribute\"";
    const std::size_t slash = plain.find('/');
    const bool looksInside =
        _field.isCollection() ? _field.hasType() : _field.kind == BindingKind::attribute;
    if (slash != std::string_view::npos && looksInside && isXMLName(plain.substr(0, slash)) &&
        isXMLName(plain.substr(slash + 1)))
        return "location=\"" + std::string(plain.substr(0, slash)) + "\" name=\"" +
               std::string(plain.substr(slash + 1)) + "\"";
    return trimmedName(name);
}

void BindingCheck::checkAlternatives() {
    const bool skipsNameless =
        _field.isCollection() ? !_field.hasSimpleType() : _field.kind == BindingKind::text;
    const bool isFlattened = _field.kind == BindingKind::flattened && !_field.isCollection();
    // Fields of these kinds look at the location, too.
    const bool usesLocation = _field.isCollection() ? _field.hasType()
                                                    : _field.kind == BindingKind::attribute ||
                                                          _field.kind == BindingKind::automatic;
    std::set<std::pair<std::string_view, std::string_view>> tried;
    for (std::size_t i = 0; i < _field.bindings.size(); ++i) {
        const BindingPlan& binding = _field.bindings[i];
        const std::string_view location = usesLocation ? binding.location.view() : "";
        const bool isSkipped = skipsNameless && binding.bindTo.isEmpty();
        const bool isNew = isSkipped || tried.emplace(binding.name.view(), location).second;
        if (i == 0)
            continue;
        if (isFlattened)
            _check.add(findings::alternativeOfFlattened, ofBinding(i));
        else if (isSkipped)
            _check.add(findings::alternativeWithoutName, ofBinding(i));
        else if (!isNew)
            _check.add(findings::nameTriedBefore, ofBinding(i));
    }
}

void BindingCheck::checkLocations() {
    for (std::size_t i = 0; i < _field.bindings.size(); ++i) {
        const String& location = _field.bindings[i].location;
        if (location.isEmpty())
            continue;
        if (_field.isCollection()) {
            if (!_field.hasType() && i == 0)
                _check.add(findings::locationOnlyWritten, ofBinding(i), location);
            else if (!_field.hasType())
                _check.add(findings::locationNotUsed, ofBinding(i), location);
        } else if (_field.kind == BindingKind::automatic) {
            _check.add(findings::locationOnlyRead, ofBinding(i), location);
        } else if (_field.kind != BindingKind::attribute) {
            _check.add(findings::locationNotUsed, ofBinding(i), location);
        }
    }
}

} // namespace

void checkBindings(MappingCheck& check) {
    for (const ClassPlan* type : check.classes()) {
        const String& element = type->mapping->mapTo();
        if (!element.isEmpty() && !isXMLName(element))
            check.add(findings::noXMLName, Subject::of(*type->mapping), element);
        for (const FieldPlan& field : type->fields)
            BindingCheck(check, *type, field).run();
    }
}

} // namespace qx::detail
