#include "saving/TracedObject.h"

#include "base/BulkObjects.h"
#include "marshaller/DocumentParsing.h"
#include "marshaller/Marshalling.h"
#include "marshaller/NoUndo.h"
#include "marshaller/Unmarshalling.h"
#include "model/Errors.h"

namespace qx::detail {

bool TracedWriting::write(const QXXMLMarshaller& marshaller, const Value& object,
                          const Size& expected, XMLDraft::Values values, Ref<Error>* error) {
    const BulkObjects bulk; // as in any writing
    _object = object;
    _trace.reserve(expected.entries, expected.texts);
    _draft = std::make_unique<XMLDraft>(values);
    if (!Marshalling(marshaller, *_draft, _trace).marshallObject(object, error))
        return false;
    if (_trace.isTooLarge())
        return fail(error, errors::textCannotBeWritten, "all values take more than 4 GB");
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
    const bool isAll = extent == WritingTrace::Extent::all;
    ReadingTrace& trace = traced->_read;
    if (isAll)
        trace.reserve(traced->index().entries().size());
    Ref<Error> problem;
    Ref<Object> object;
    {
        const NoUndo noUndo(marshaller.undoManager());
        object = isAll ? readDocument(marshaller, document, &problem, &trace)
                       : readQuietly(marshaller, document, &problem);
    }
    if (!object && !problem)
        fail(&problem, errors::noDefinitionForElement,
             [&] { return document.quoted(document.root()); });
    // Mostly a field and a value for each use.
    TracedWriting::Size size{};
    if (isAll)
        size = {2 * trace.uses().size() + 1, traced->index().text().size() / 2};
    traced->_written = std::make_unique<TracedWriting>(marshaller, extent);
    if (!problem &&
        traced->_written->write(marshaller, object, size, XMLDraft::Values::dropped, &problem)) {
        traced->_written->keepTraceOnly();
        return traced;
    }
    *error = std::move(problem);
    return nullptr;
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
