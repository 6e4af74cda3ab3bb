#include "saving/TracedObject.h"

#include "marshaller/DocumentParsing.h"
#include "marshaller/Marshalling.h"
#include "marshaller/NoUndo.h"
#include "marshaller/Unmarshalling.h"
#include "model/Errors.h"

namespace qx::detail {

bool TracedWriting::write(const QXXMLMarshaller& marshaller, const Value& object,
                          const Size& expected, XMLDraft::Values values, Ref<Error>* error) {
    _object = object;
    _trace.reserve(expected.entries, expected.texts);
    _draft = std::make_unique<XMLDraft>(values);
    if (!Marshalling(marshaller, *_draft, _trace).marshallObject(object, error))
        return false;
    _trace.hash();
    return true;
}

std::unique_ptr<TracedReading> TracedReading::of(QXXMLMarshaller& marshaller, Ref<const Data> bytes,
                                                 Ref<Error>* error, WritingTrace::Extent extent) {
    std::unique_ptr<TracedReading> traced(new TracedReading);
    traced->_parsed = XMLParser::parse(std::move(bytes), parsingOf(marshaller), error);
    if (!traced->_parsed)
        return nullptr;
    traced->_document = std::make_unique<IndexedXML>(*traced->_parsed);
    IndexedXML& document = *traced->_document;
    traced->_read.reserve(traced->index().entries().size());
    Ref<Error> problem;
    {
        const NoUndo noUndo(marshaller.undoManager());
        traced->_object = readDocument(marshaller, document, &problem, &traced->_read);
    }
    if (!traced->_object && !problem)
        fail(&problem, errors::noDefinitionForElement,
             [&] { return document.quoted(document.root()); });
    if (!problem && traced->write(marshaller, extent, &problem))
        return traced;
    *error = std::move(problem);
    return nullptr;
}

bool TracedReading::write(const QXXMLMarshaller& marshaller, WritingTrace::Extent extent,
                          Ref<Error>* error) {
    const bool isAll = extent == WritingTrace::Extent::all;
    // Mostly a field and a value for each use.
    const TracedWriting::Size size{isAll ? 2 * _read.uses().size() + 1 : 0,
                                   isAll ? index().text().size() / 2 : 0};
    _written = std::make_unique<TracedWriting>(marshaller, extent);
    if (!_written->write(marshaller, _object, size, XMLDraft::Values::dropped, error))
        return false;
    _written->keepTraceOnly();
    if (isAll)
        _object.reset();
    return true;
}

// The elements that stand around what was taken, too.
std::vector<bool> TracedReading::takenEntries() const {
    using Form = ReadingTrace::Form;
    const auto entries = index().entries();
    std::vector<bool> taken(entries.size());
    for (const ReadingTrace::Use& use : _read.uses())
        if (use.field != nullptr && use.form != Form::text && use.form != Form::flattened)
            taken[use.entry] = true;
    std::vector<XMLIndex::Number> open;
    for (XMLIndex::Number at = 0; at < entries.size(); ++at) {
        while (!open.empty() && entries[open.back()].next <= at)
            open.pop_back();
        for (auto around = open.rbegin(); taken[at] && around != open.rend() && !taken[*around];
             ++around)
            taken[*around] = true;
        if (entries[at].nodeKind() == XMLNodeKind::element)
            open.push_back(at);
    }
    return taken;
}

} // namespace qx::detail
