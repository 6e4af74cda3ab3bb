#include "marshaller/Unmarshalling.h"

#include <QXXMLMarshalling/model/Array.h>
#include <QXXMLMarshalling/model/Dictionary.h>

#include "host/Log.h"
#include "marshaller/UnknownNames.h"
#include "model/Errors.h"

#include <algorithm>

namespace qx::detail {

namespace {

// Whether some field takes the text of the class's own element.
bool takesText(const ClassPlan& plan) {
    ExtendsWalk walk(plan);
    do {
        const auto takes = [](const FieldPlan& field) {
            return !field.isCollection() && (field.kind == BindingKind::text ||
                                             (!field.isContainer && field.typeClass == nullptr));
        };
        if (std::ranges::any_of(walk.current().fields, takes))
            return true;
    } while (walk.next());
    return false;
}

} // namespace

bool Unmarshalling::validate(const ClassPlan* plan, const Target& target, ErrorSlot error) {
    if (_marshaller->isLenient() && !_marshaller->saveUnknownXML())
        return true;
    if (reports().isOn() && plan != nullptr && !takesText(*plan))
        _reports.tellTexts(_document, target.source.element(), &target.object);
    if (isExact(plan))
        return validateExactly(target, error);
    if (_use == Use::document)
        return validateChildren(target, error) && validateAttributes(target, error);
    ConsumedNames fields = target.bound.fields;
    ConsumedNames attributes = target.bound.attributes;
    const Target copied{target.object, target.source, {fields, attributes}, target.isFlattened};
    return validateChildren(copied, error) && validateAttributes(copied, error);
}

bool Unmarshalling::mayEnd(const ClassPlan& plan, Number element, std::size_t attributes,
                           ErrorSlot error) {
    if ((_marshaller->isLenient() && !_marshaller->saveUnknownXML()) ||
        _budget.takeVisits(attributes, element, error))
        return true;
    locate(error, element, nullptr, &plan);
    return passOver(error);
}

bool Unmarshalling::mayEndExactly(const ClassPlan& plan, const Target& target, ErrorSlot error) {
    if (validate(&plan, target, error))
        return true;
    locate(error, target.source.element(), nullptr, &plan);
    return passOver(error);
}

// What no field consumed is an error, there.
bool Unmarshalling::refuse(Number unknown, ErrorSlot error) {
    locate(error, unknown, nullptr, _frame != nullptr ? _frame->plan : nullptr);
    return passOver(error);
}

// Although it is worded as a warning, what is said of children goes to the host's debug log;
// whether there is a host's log at all is asked of the warnings. Who has a reading traced hears of
// it there.
void Unmarshalling::tellUnknown(Reporting::Kind kind, const UnknownNames& unknown,
                                const Target& target) {
    if (_isQuiet)
        return;
    const bool isChild = kind == Reporting::Kind::unboundChild;
    if (_reports.isOn())
        for (const Number node : unknown.firsts())
            _reports.tell(kind, _document, target.source.element(), node, &target.object,
                          isChild ? unknown.countOf(_document, node) : 1,
                          _marshaller->saveUnknownXML());
    else if (!isChild)
        logWarningOrLine("Unbound attributes: %@", unknown.written());
    else if (hostHasLogWarning())
        logDebug("*** Warning: Unbound fields: %@", unknown.written());
    else
        log("Unbound fields: %@", unknown.written());
}

bool Unmarshalling::validateChildren(const Target& target, ErrorSlot error) {
    UnknownNames unknown;
    target.source.forEachChild(
        [&](Number child) { unknown.see(_document, child, target.bound.fields); });
    if (!unknown.names())
        return true;
    if (!_marshaller->saveUnknownXML() && !_marshaller->isLenient()) {
        fail(error, errors::unknownFields, unknown.written(), target.source.elementName());
        return refuse(unknown.firsts().front(), error);
    }
    tellUnknown(Reporting::Kind::unboundChild, unknown, target);
    return !_marshaller->saveUnknownXML() ||
           keepChildren(target, *unknown.names(), *unknown.written(), error);
}

// A name that is left is kept with all its elements, those that were consumed included; under the
// name as it is written.
bool Unmarshalling::keepChildren(const Target& target, const CountedSet& names,
                                 const CountedSet& written, ErrorSlot error) {
    auto kept = make<Dictionary>();
    for (const String& name : written.names())
        kept->set(name, make<Array>());
    bool fits = true;
    const auto listFor = [&](Number child) -> Array* {
        const String& name = _document.writtenName(child);
        if (_document.isMatched() && !names.contains(_document.name(child)))
            return nullptr;
        if (_document.isMatched() && kept->find(name) == nullptr)
            kept->set(name, make<Array>());
        const Value* const elements = kept->find(name);
        return elements != nullptr ? static_cast<Array*>(elements->object()) : nullptr;
    };
    target.source.forEachChild([&](Number child) {
        Array* const elements = fits && _document.isElement(child) ? listFor(child) : nullptr;
        if (elements == nullptr)
            return;
        const auto node = target.source.keepElement(child, _budget, error);
        fits = node.get() != nullptr;
        if (fits)
            elements->add(node);
        if (_trace != nullptr)
            _trace->keep(ReadingTrace::Form::keptChild, child);
    });
    // A processing instruction leaves a name alone.
    std::size_t lone = 0;
    for (const auto& entry : *kept)
        lone += static_cast<const Array*>(entry.value.object())->isEmpty() ? 1 : 0;
    return fits && _budget.takeKept(lone, target.source.element(), error) &&
           _access.setKept(target.object, KeptXML::children, kept, error);
}

bool Unmarshalling::validateAttributes(const Target& target, ErrorSlot error) {
    const Number element = target.source.element();
    UnknownNames unknown;
    std::size_t seen = 0;
    target.source.forEachAttribute([&](Number attribute) {
        unknown.see(_document, attribute, target.bound.attributes);
        ++seen;
    });
    if (!_budget.takeVisits(seen, element, error))
        return false;
    if (!unknown.names())
        return true;
    if (!_marshaller->saveUnknownXML() && !_marshaller->isLenient()) {
        fail(error, errors::unknownAttributes, unknown.written(), target.source.elementName());
        return refuse(unknown.firsts().front(), error);
    }
    tellUnknown(Reporting::Kind::unboundAttribute, unknown, target);
    return !_marshaller->saveUnknownXML() || keepAttributes(target, *unknown.names(), error);
}

bool Unmarshalling::keepAttributes(const Target& target, const CountedSet& names, ErrorSlot error) {
    auto kept = make<Array>();
    bool fits = true;
    const auto keep = [&](Number attribute) {
        if (!fits || !names.contains(_document.name(attribute)))
            return;
        auto node = target.source.keepAttribute(attribute, target.source.element(), _budget, error);
        fits = node.get() != nullptr;
        if (fits)
            kept->add(std::move(node));
        if (_trace != nullptr)
            _trace->keep(ReadingTrace::Form::keptAttribute, attribute);
    };
    target.source.forEachAttribute(keep);
    return fits && _access.setKept(target.object, KeptXML::attributes, kept, error);
}

} // namespace qx::detail
