#include "marshaller/Reporting.h"

#include "base/WhiteSpace.h"
#include "marshaller/ReadingContext.h"

#include <algorithm>
#include <unordered_map>

namespace qx::detail {

void Reporting::tell(Kind kind, IndexedXML& document, Number element, Number node, Object* object,
                     std::size_t count, bool isKept) const {
    const ReadingContext context(0, document, nullptr, {.number = node});
    QXXMLReport report;
    report.kind = kind;
    if (kind != Kind::droppedText)
        report.name = document.writtenName(node);
    report.elementName = document.writtenName(element);
    report.count = count;
    report.isKept = isKept;
    report.object = object;
    report.context = &context;
    (*_handler)(report);
}

void Reporting::tellInside(IndexedXML& document, Number element, Object* object) const {
    document.forEachOfKind(XMLNodeKind::attribute, element, [&](Number attribute) {
        tell(Kind::unboundAttribute, document, element, attribute, object);
    });
    struct Alike {
        Number first;
        std::size_t count;
    };
    std::vector<Alike> children;
    std::unordered_map<String, std::size_t> numbers;
    document.forEachChild(element, [&](Number child) {
        if (!document.isElement(child))
            return;
        const auto [known, isNew] = numbers.try_emplace(document.name(child), children.size());
        if (isNew)
            children.push_back({child, 0});
        ++children[known->second].count;
    });
    for (const Alike& alike : children)
        tell(Kind::unboundChild, document, element, alike.first, object, alike.count);
}

void Reporting::tellTexts(IndexedXML& document, Number element, Object* object) const {
    document.forEachChild(element, [&](Number child) {
        if (document.kind(child) == XMLNodeKind::text && !isWhite(document.value(child).view()))
            tell(Kind::droppedText, document, element, child, object);
    });
}

namespace {

// Calls visit(field, binding) for what the class and its ancestors bind inside of that wrapper.
template <class Visit>
void forEachInside(const String& wrapper, const ClassPlan& plan, Visit visit) {
    ExtendsWalk walk(plan);
    do {
        for (const FieldPlan& field : walk.current().fields)
            for (const BindingPlan& binding : field.bindings)
                if (binding.location == wrapper)
                    visit(field, binding);
    } while (walk.next());
}

// The names that fields of the class, or of an ancestor, take inside that wrapper: of attributes or
// of child elements.
std::vector<String> namesInside(const String& wrapper, const ClassPlan& plan, bool areAttributes) {
    std::vector<String> names;
    forEachInside(wrapper, plan, [&](const FieldPlan& field, const BindingPlan& binding) {
        if (field.isCollection() != areAttributes)
            names.push_back(binding.name);
    });
    return names;
}

bool contains(const std::vector<String>& names, const String& name) {
    return std::ranges::find(names, name) != names.end();
}

} // namespace

void Reporting::tellWrapper(IndexedXML& document, Number wrapper, const ClassPlan& plan,
                            const FieldPlan& field, Object* object) const {
    const String& name = document.name(wrapper);
    const FieldPlan* first = nullptr;
    forEachInside(name, plan, [&](const FieldPlan& one, const BindingPlan&) {
        if (first == nullptr && one.isCollection())
            first = &one;
    });
    if (first != nullptr && first != &field)
        return;
    const auto attributes = namesInside(name, plan, true);
    document.forEachOfKind(XMLNodeKind::attribute, wrapper, [&](Number attribute) {
        if (!contains(attributes, document.name(attribute)))
            tell(Kind::unboundAttribute, document, wrapper, attribute, object);
    });
    const auto children = namesInside(name, plan, false);
    document.forEachChild(wrapper, [&](Number child) {
        if (!children.empty() && document.isElement(child) &&
            !contains(children, document.name(child)))
            tell(Kind::skippedItem, document, wrapper, child, object);
    });
    tellTexts(document, wrapper, object);
}

void Reporting::tellOmitted(const FieldPlan& field) const {
    QXXMLReport report;
    report.kind = Kind::omittedValue;
    report.name = field.xmlName();
    if (const auto holder = field.mapping->classMapping())
        report.elementName = MappingPlan::elementNameOf(*holder);
    (*_handler)(report);
}

} // namespace qx::detail
