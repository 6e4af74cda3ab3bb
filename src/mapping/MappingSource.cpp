#include "mapping/MappingSource.h"

#include <QXXMLMarshalling/xml/XMLDocument.h>

#include "base/NearestName.h"
#include "model/ErrorDetails.h"
#include "model/Errors.h"
#include "model/LibraryClass.h"
#include "xml/XMLPlace.h"

namespace qx::detail {

Ref<MappingSource> MappingSource::of(const XMLElement* element) {
    auto source = make<MappingSource>();
    const XMLDocument* const document = element != nullptr ? element->rootDocument() : nullptr;
    if (document != nullptr)
        source->_name = document->documentName();
    return source;
}

Ref<MappingSource> MappingSource::included(const QXXMLDocumentMapping& includer, std::size_t number,
                                           const XMLDocument* document) {
    auto source = make<MappingSource>();
    if (document != nullptr)
        source->_name = document->documentName();
    if (source->_name.isNull())
        source->_name = includer.includes()[number];
    source->_includer = Ref(&of(includer));
    source->_place = includer.includePlace(number);
    source->_faults = source->_includer->_faults;
    return source;
}

Ref<QXXMLDocumentMapping> MappingSource::read(XMLElement* root, Ref<Error>* error) {
    auto mapping = make<QXXMLDocumentMapping>();
    QXXMLMapping& node = *mapping;
    return node.readElement(root, error, Ref(this)) ? mapping : nullptr;
}

namespace {

const XMLNode& topOf(const XMLNode& node) {
    const XMLNode* top = &node;
    while (top->parent() != nullptr)
        top = top->parent();
    return *top;
}

} // namespace

// What is wrong in a mapping document, worked out when somebody asks.
class MappingSource::FaultContext final : public ErrorContext {
public:
    FaultContext(const Error& error, const MappingSource& source, const XMLElement& element)
        : _code(error.code()), _source(&source), _element(&element), _top(&topOf(element)) {}

    SourcePlace source() const override {
        SourcePlace place;
        place.place = {_source->_name, _element->line(), _element->column()};
        place.path = pathOf(*_element);
        return place;
    }
    // The place once more where includes led to it.
    MappingNote mapping() const override {
        MappingNote note;
        if (_source->_includer) {
            note.place = source().place;
            note.includes = _source->chain();
        }
        return note;
    }
    String suggestion() const override {
        if (_code == errors::illegalBoolean.code)
            return "did you mean \"true\" or \"false\"?";
        if (_code != errors::requiredAttributeNotFound.code)
            return nullptr;
        NearestName nearest("name");
        _element->forEachAttribute(
            [&](const String& attribute, const String&) { nearest.consider(attribute); });
        return nearest.name().empty()
                   ? String()
                   : String::concat({"did you mean \"name\" by \"", nearest.name(), "\"?"});
    }

private:
    const int _code;
    const Ref<const MappingSource> _source;
    const Ref<const XMLElement> _element;
    const Ref<const XMLNode> _top; // keeps what the path leads through
};

void MappingSource::locate(const Ref<Error>& error, const XMLElement& element) const {
    if (error && !ErrorDetails::hasContext(*error))
        ErrorDetails::setContext(*error, std::make_unique<FaultContext>(*error, *this, element));
}

// An error that knows a place of the mapping comes from further in. One that knows a place in a
// document alone is of the parser.
void MappingSource::locate(const Ref<Error>& error, const QXXMLDocumentMapping& includer,
                           std::size_t number) {
    const MappingSource& source = of(includer);
    if (!error)
        return;
    if (!ErrorDetails::hasContext(*error))
        return source.locate(error, *includer._includeElements[number]);
    const ErrorContext& before = ErrorDetails::contextOf(*error);
    if (before.mapping().place.line != 0)
        return;
    SourcePlace place = before.source();
    if (place.place.documentName.isNull())
        place.place.documentName = includer.includes()[number];
    MappingNote note;
    note.place = includer.includePlace(number);
    note.includes = source.chain();
    ErrorDetails::setContext(*error, std::make_unique<KnownContext>(
                                         std::move(place), std::move(note), before.suggestion()));
}

// Includes that led to a fault are told by its error, the nearest one as the place in the mapping.
void MappingSource::addFault(Ref<Error> fault) const {
    QXXMLFinding finding;
    finding.severity = QXXMLFinding::Severity::error;
    finding.kind = "fault";
    finding.text = fault->shortDescription();
    finding.suggestion = fault->suggestion();
    finding.place = fault->place();
    finding.includedFrom = fault->mappingIncludes();
    if (const QXXMLMappingPlace include = fault->mappingPlace();
        include.line != 0 && include.documentName != finding.place.documentName)
        finding.includedFrom.insert(finding.includedFrom.begin(), include);
    finding.fault = std::move(fault);
    _faults->push_back(std::move(finding));
}

MappingNote MappingSource::noteOf(const QXXMLFieldMapping* field, const QXXMLClassMapping* type) {
    MappingNote note;
    if (field != nullptr)
        note.field = field->name();
    if (type != nullptr)
        note.className = type->className();
    const QXXMLMapping* const node =
        field != nullptr ? static_cast<const QXXMLMapping*>(field) : type;
    if (node == nullptr)
        return note;
    note.place = node->place();
    note.includes = node->includedFrom();
    return note;
}

std::vector<QXXMLMappingPlace> MappingSource::chain() const {
    std::vector<QXXMLMappingPlace> places;
    for (const MappingSource* at = this; at->_includer; at = at->_includer.get())
        places.push_back(at->_place);
    return places;
}

const Class& MappingSource::describedClass() const {
    return libraryClass<MappingSource>("qx::MappingSource");
}

} // namespace qx::detail
