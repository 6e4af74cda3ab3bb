// What a marshaller that keeps exactly leaves to objects: what no field took, with its place.

#include <QXXMLMarshalling/model/Array.h>
#include <QXXMLMarshalling/model/Dictionary.h>

#include "marshaller/Leftovers.h"
#include "marshaller/UnknownNames.h"
#include "marshaller/Unmarshalling.h"

namespace qx::detail {

// An object that stands in another's element leaves it all to that one.
bool Unmarshalling::validateExactly(const Target& target, ErrorSlot error) {
    const Number element = target.source.element();
    if (isInsideElement(element))
        return true;
    const Leftovers left(_document, *_trace);
    if (!_budget.takeVisits(left.visits(), element, error))
        return false;
    UnknownNames children, attributes;
    for (const Leftovers::Node& node : left.children())
        if (node.holder == element)
            children.add(_document, node.entry);
    for (const Leftovers::Node& node : left.attributes())
        if (node.holder == element)
            attributes.add(_document, node.entry);
    if (children.names())
        tellUnknown(Reporting::Kind::unboundChild, children, target);
    if (attributes.names())
        tellUnknown(Reporting::Kind::unboundAttribute, attributes, target);
    return keepChildren(target, left, error) && keepAttributes(target, left, error);
}

bool Unmarshalling::keepChildren(const Target& target, const Leftovers& left, ErrorSlot error) {
    Ref<Dictionary> kept;
    for (const Leftovers::Node& child : left.children()) {
        if (!_document.isElement(child.entry))
            continue;
        const auto node = target.source.keepElement(child.entry, _budget, error);
        if (!node)
            return false;
        KeptPlace::set(*node, child.place);
        if (!kept)
            kept = make<Dictionary>();
        const String& name = _document.writtenName(child.entry);
        if (kept->find(name) == nullptr)
            kept->set(name, make<Array>());
        static_cast<Array*>(kept->find(name)->object())->add(node);
        if (_isTraced)
            _trace->keep(ReadingTrace::Form::keptChild, child.entry);
    }
    return !kept || _access.setKept(target.object, KeptXML::children, kept, error);
}

bool Unmarshalling::keepAttributes(const Target& target, const Leftovers& left, ErrorSlot error) {
    Ref<Array> kept;
    for (const Leftovers::Node& attribute : left.attributes()) {
        const auto node =
            target.source.keepAttribute(attribute.entry, attribute.holder, _budget, error);
        if (!node)
            return false;
        KeptPlace::set(*node, attribute.place);
        if (!kept)
            kept = make<Array>();
        kept->add(node);
        if (_isTraced)
            _trace->keep(ReadingTrace::Form::keptAttribute, attribute.entry);
    }
    return !kept || _access.setKept(target.object, KeptXML::attributes, kept, error);
}

} // namespace qx::detail
