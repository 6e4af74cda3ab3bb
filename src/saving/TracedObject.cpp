#include "saving/TracedObject.h"

#include "marshaller/DocumentParsing.h"
#include "marshaller/Marshalling.h"
#include "marshaller/NoUndo.h"
#include "marshaller/Unmarshalling.h"
#include "model/Errors.h"

namespace qx::detail {

bool TracedWriting::write(const QXXMLMarshaller& marshaller, const Value& object,
                          std::size_t expectedEntries, Ref<Error>* error) {
    _object = object;
    _trace.reserve(expectedEntries);
    _draft = std::make_unique<XMLDraft>();
    if (!Marshalling(marshaller, *_draft, _trace).marshallObject(object, error))
        return false;
    _trace.hash();
    return true;
}

std::unique_ptr<TracedReading> TracedReading::of(QXXMLMarshaller& marshaller, Ref<const Data> bytes,
                                                 Ref<Error>* error) {
    std::unique_ptr<TracedReading> traced(new TracedReading(marshaller));
    traced->_parsed = XMLParser::parse(std::move(bytes), parsingOf(marshaller), error);
    if (!traced->_parsed)
        return nullptr;
    traced->_document = std::make_unique<IndexedXML>(*traced->_parsed);
    IndexedXML& document = *traced->_document;
    Ref<Error> problem;
    Ref<Object> object;
    {
        const NoUndo noUndo(marshaller.undoManager());
        object = readDocument(marshaller, document, &problem, &traced->_read);
    }
    if (!object && !problem)
        fail(&problem, errors::noDefinitionForElement,
             [&] { return document.quoted(document.root()); });
    // Mostly a field and a value for each use.
    const std::size_t entries = 2 * traced->_read.uses().size() + 1;
    if (!problem && traced->_written.write(marshaller, object, entries, &problem)) {
        traced->_written.keepTraceOnly();
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
