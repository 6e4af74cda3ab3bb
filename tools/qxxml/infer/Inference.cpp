#include "qxxml/infer/Inference.h"

#include "qxxml/infer/Names.h"

#include <algorithm>

namespace qxxml {

namespace {

enum class Form { text, object, wrapper, unknown };

// What is known of an element name besides what was counted.
struct Shape {
    Form form = Form::object;
    bool isList = false;             // one untyped collection has all children
    std::string reason;              // why it is kept as unknown XML
    std::vector<std::size_t> order;  // of the children, by index
    std::vector<std::size_t> places; // of each child in that order
    std::size_t unknownChildren = 0; // and the place of the first of them
    std::size_t firstUnknown = static_cast<std::size_t>(-1);
    bool hasOrder = true;  // every element's children stand in it
    std::string className; // of those that become classes
};

class Inference {
public:
    Inference(const Statistics& statistics, bool keepsOrder)
        : _elements(statistics.elements()), _keepsOrder(keepsOrder), _shapes(_elements.size()) {}

    std::vector<InferredClass> classes();

private:
    void orderChildren();
    void findUnknown();
    std::string reasonAgainst(std::size_t parent, std::size_t child);
    bool isTextOnly(std::size_t index) const;
    bool isWrapper(std::size_t index) const;
    void findForms();
    void nameClasses();
    InferredClass classOf(std::size_t index) const;
    void addNamespace(const ElementStatistics& element, InferredClass& made) const;
    void addAttributes(const ElementStatistics& element, UniqueNames& keys,
                       InferredClass& made) const;
    void addChildren(std::size_t index, UniqueNames& keys, InferredClass& made) const;
    InferredField list(std::size_t index, UniqueNames& keys) const;
    InferredField field(const ElementStatistics& owner, const ChildStatistics& child,
                        UniqueNames& keys) const;
    void setItems(InferredField& field, std::size_t element) const;

    const std::deque<ElementStatistics>& _elements;
    bool _keepsOrder;
    std::vector<Shape> _shapes;
};

// An order in which each child stands before those that were seen next to it; of several the one
// that was seen first. Where they go round in circles, what was seen first goes on.
void orderOf(const ElementStatistics& element, Shape& shape) {
    std::vector<std::size_t> before(element.children.size());
    for (const ChildStatistics& child : element.children)
        for (const std::size_t follower : child.followers)
            ++before[follower];
    shape.places.resize(before.size());
    std::set<std::size_t> waiting;
    std::set<std::size_t> ready;
    for (std::size_t i = 0; i < before.size(); ++i)
        (before[i] == 0 ? ready : waiting).insert(i);
    while (!ready.empty() || !waiting.empty()) {
        std::set<std::size_t>& source = ready.empty() ? waiting : ready;
        shape.hasOrder = shape.hasOrder && &source == &ready;
        const std::size_t next = *source.begin();
        source.erase(source.begin());
        shape.places[next] = shape.order.size();
        shape.order.push_back(next);
        for (const std::size_t follower : element.children[next].followers)
            if (--before[follower] == 0 && waiting.erase(follower) != 0)
                ready.insert(follower);
    }
}

void Inference::orderChildren() {
    for (std::size_t i = 0; i < _elements.size(); ++i) {
        orderOf(_elements[i], _shapes[i]);
        _shapes[i].isList = _elements[i].isInterleaved || (_keepsOrder && !_shapes[i].hasOrder);
    }
}

// Empty where a class can have all content of those of the name.
std::string reasonAgainstContent(const ElementStatistics& element) {
    if (element.textAmongChildren > 0)
        return "text stands among its elements";
    if (element.withText > 0 && element.withChildren > 0)
        return "it holds now text, now elements";
    if (element.instructions > 0)
        return "processing instructions stand in it";
    return {};
}

// Unknown XML is written behind the fields. Empty where the parent's order does not suffer.
std::string Inference::reasonAgainst(std::size_t parent, std::size_t child) {
    const ElementStatistics& element = _elements[parent];
    Shape& shape = _shapes[parent];
    ++shape.unknownChildren;
    shape.firstUnknown = std::min(shape.firstUnknown, shape.places[element.childIndexes.at(child)]);
    const std::string name = "<" + _elements[child].name + ">";
    if (shape.isList)
        return "its children come in turns, and " + name + " is kept as unknown XML";
    const bool isLast = shape.firstUnknown + shape.unknownChildren == shape.order.size();
    return _keepsOrder && !isLast ? name + " is kept as unknown XML, and others stand behind it"
                                  : "";
}

// What is unknown may make its parents unknown: each pair of them is looked at once. A root is
// always a class.
void Inference::findUnknown() {
    std::vector<std::size_t> pending;
    const auto leave = [&](std::size_t index, const std::string& reason) {
        Shape& shape = _shapes[index];
        if (reason.empty() || !shape.reason.empty())
            return;
        shape.reason = reason;
        if (_elements[index].roots > 0)
            return;
        shape.form = Form::unknown;
        pending.push_back(index);
    };
    for (std::size_t i = 0; i < _elements.size(); ++i)
        leave(i, reasonAgainstContent(_elements[i]));
    while (!pending.empty()) {
        const std::size_t child = pending.back();
        pending.pop_back();
        for (const std::size_t parent : _elements[child].parents)
            leave(parent, reasonAgainst(parent, child));
    }
}

bool Inference::isTextOnly(std::size_t index) const {
    const ElementStatistics& element = _elements[index];
    return element.attributes.empty() && element.declarations.empty() &&
           element.withChildren == 0 && element.roots == 0 &&
           std::none_of(element.parents.begin(), element.parents.end(),
                        [&](std::size_t parent) { return _shapes[parent].isList; });
}

// The items stand in the wrapper's place: it may hold nothing else, be there once, and never empty.
bool Inference::isWrapper(std::size_t index) const {
    const ElementStatistics& element = _elements[index];
    if (!element.attributes.empty() || !element.declarations.empty() || element.roots > 0 ||
        element.children.size() != 1 || element.withChildren != element.count)
        return false;
    const ChildStatistics& items = element.children.front();
    if (!items.isRepeated || _shapes[items.element].form == Form::unknown)
        return false;
    return std::none_of(element.parents.begin(), element.parents.end(), [&](std::size_t parent) {
        const ElementStatistics& holder = _elements[parent];
        return _shapes[parent].isList || holder.children[holder.childIndexes.at(index)].isRepeated;
    });
}

void Inference::findForms() {
    for (std::size_t i = 0; i < _elements.size(); ++i)
        if (_shapes[i].form != Form::unknown)
            _shapes[i].form = isTextOnly(i)  ? Form::text
                              : isWrapper(i) ? Form::wrapper
                                             : Form::object;
}

// Of all that the roots hold, but for what stands only in unknown XML.
void Inference::nameClasses() {
    std::vector<bool> isReached(_elements.size());
    std::vector<std::size_t> pending;
    for (std::size_t i = 0; i < _elements.size(); ++i)
        if (_elements[i].roots > 0)
            pending.push_back(i);
    while (!pending.empty()) {
        const std::size_t index = pending.back();
        pending.pop_back();
        if (isReached[index] || _shapes[index].form == Form::unknown)
            continue;
        isReached[index] = true;
        for (const ChildStatistics& child : _elements[index].children)
            pending.push_back(child.element);
    }
    UniqueNames names;
    for (std::size_t i = 0; i < _elements.size(); ++i)
        if (isReached[i] && _shapes[i].form == Form::object)
            _shapes[i].className = names.add(classNameOf(_elements[i].name));
}

std::vector<InferredClass> Inference::classes() {
    orderChildren();
    findUnknown();
    findForms();
    nameClasses();
    std::vector<InferredClass> made;
    for (std::size_t i = 0; i < _elements.size(); ++i)
        if (!_shapes[i].className.empty())
            made.push_back(classOf(i));
    return made;
}

InferredType typeOf(const TextStatistics& texts, bool mayBeZero) {
    if (!mayBeZero && texts.zeros > 0)
        return InferredType::text;
    return texts.areIntegers()   ? InferredType::integer
           : texts.areBooleans() ? InferredType::boolean
                                 : InferredType::text;
}

void addText(const ElementStatistics& element, UniqueNames& keys, InferredClass& made) {
    const std::size_t withText = element.texts.count - element.texts.empty;
    if (element.withChildren > 0 || withText == 0)
        return;
    made.fields.push_back({.key = keys.add("text"),
                           .kind = InferredKind::text,
                           .type = typeOf(element.texts, true),
                           .isRequired = withText == element.count,
                           .isWholeNumber = element.texts.areIntegers(),
                           .count = withText,
                           .holders = withText});
}

InferredClass Inference::classOf(std::size_t index) const {
    const ElementStatistics& element = _elements[index];
    InferredClass made;
    made.name = _shapes[index].className;
    made.xmlName = element.name;
    made.count = element.count;
    made.keepsXML = !element.declarations.empty();
    // Keys under which objects keep what no field has.
    UniqueNames keys({"unboundChildren", "unboundAttributes"});
    addNamespace(element, made);
    addAttributes(element, keys, made);
    addText(element, keys, made);
    addChildren(index, keys, made);
    return made;
}

// A class declares one namespace on all its elements: one that all of them declared, that of their
// own name if it is among those.
void Inference::addNamespace(const ElementStatistics& element, InferredClass& made) const {
    const std::size_t colon = element.name.find(':');
    const std::string own = colon == std::string::npos ? "" : element.name.substr(0, colon);
    for (const auto& [declaration, count] : element.declarations) {
        const auto& [prefix, URI] = declaration;
        if (count != element.count || URI.empty() || (!made.nsURI.empty() && prefix != own))
            continue;
        made.nsPrefix = prefix;
        made.nsURI = URI;
    }
}

void Inference::addAttributes(const ElementStatistics& element, UniqueNames& keys,
                              InferredClass& made) const {
    for (const AttributeStatistics& attribute : element.attributes) {
        const TextStatistics& values = attribute.values;
        const bool isRequired = values.count == element.count;
        if (!isRequired && values.empty > 0) {
            made.remarks.push_back(
                "attribute " + attribute.name + ": " + std::to_string(values.count) +
                ", kept as unknown XML: it is optional, and empty " + std::to_string(values.empty) +
                " times, which no field writes again");
            made.keepsXML = true;
            continue;
        }
        made.fields.push_back({.key = keys.add(fieldNameOf(attribute.name)),
                               .xmlName = attribute.name,
                               .type = typeOf(values, isRequired),
                               .isRequired = isRequired,
                               .isWholeNumber = values.areIntegers(),
                               .count = values.count,
                               .holders = values.count});
    }
}

void Inference::addChildren(std::size_t index, UniqueNames& keys, InferredClass& made) const {
    const ElementStatistics& element = _elements[index];
    const Shape& shape = _shapes[index];
    if (!shape.reason.empty())
        made.remarks.push_back("lost or moved when it is written: " + shape.reason);
    if (!shape.hasOrder && !shape.isList)
        made.remarks.push_back("children stand in different orders; they are written in this one");
    if (shape.isList)
        made.fields.push_back(list(index, keys));
    for (const std::size_t number : shape.order) {
        const ChildStatistics& child = element.children[number];
        const Shape& inner = _shapes[child.element];
        if (inner.form == Form::unknown) {
            made.remarks.push_back("<" + _elements[child.element].name +
                                   ">: " + std::to_string(child.count) +
                                   ", kept as unknown XML: " + inner.reason);
            made.keepsXML = true;
        } else if (!shape.isList) {
            made.fields.push_back(field(element, child, keys));
        }
    }
}

InferredField Inference::list(std::size_t index, UniqueNames& keys) const {
    InferredField made{.key = keys.add("children", "List"),
                       .kind = InferredKind::mixedCollection,
                       .type = InferredType::object,
                       .holders = _elements[index].withChildren};
    for (const ChildStatistics& child : _elements[index].children) {
        made.count += child.count;
        if (!_shapes[child.element].className.empty())
            made.itemClasses.push_back(_shapes[child.element].className);
    }
    return made;
}

void Inference::setItems(InferredField& field, std::size_t element) const {
    const ElementStatistics& items = _elements[element];
    field.xmlName = items.name;
    field.isWholeNumber = items.texts.areIntegers();
    field.className = _shapes[element].className;
    field.type = field.className.empty() ? typeOf(items.texts, true) : InferredType::object;
}

InferredField Inference::field(const ElementStatistics& owner, const ChildStatistics& child,
                               UniqueNames& keys) const {
    const ElementStatistics& element = _elements[child.element];
    InferredField made{.key = keys.add(fieldNameOf(element.name), "Element"),
                       .kind = InferredKind::element,
                       .count = child.count,
                       .holders = child.parents};
    if (_shapes[child.element].form == Form::wrapper) {
        made.kind = InferredKind::collection;
        made.location = element.name;
        made.count = element.children.front().count;
        setItems(made, element.children.front().element);
        return made;
    }
    setItems(made, child.element);
    if (child.isRepeated)
        made.kind = InferredKind::collection;
    else
        made.isRequired = child.parents == owner.count;
    return made;
}

} // namespace

std::vector<InferredClass> infer(const Statistics& statistics, bool keepsOrder) {
    return Inference(statistics, keepsOrder).classes();
}

} // namespace qxxml
