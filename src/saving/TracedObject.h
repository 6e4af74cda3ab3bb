#pragma once

// An object with all that its writing shows, and, where it was read from a text, with all that its
// reading took.

#include "marshaller/ReadingTrace.h"
#include "marshaller/WritingTrace.h"
#include "xml/XMLParser.h"

#include <QXXMLMarshalling/QXXMLMarshaller.h>

#include <memory>
#include <unordered_set>

namespace qx::detail {

class TracedWriting {
public:
    explicit TracedWriting(const QXXMLMarshaller& marshaller)
        : _mapping(marshaller.mapping()), _trace(marshaller.saveUnknownXML()) {}
    TracedWriting(const TracedWriting&) = delete;
    TracedWriting& operator=(const TracedWriting&) = delete;

    // False with an error of marshalling.
    bool write(const QXXMLMarshaller& marshaller, const Value& object, std::size_t expectedEntries,
               Ref<Error>* error);
    const WritingTrace& trace() const noexcept { return _trace; }
    // Lets go of all but what the trace itself says: nothing is printed from the draft.
    void keepTraceOnly() {
        _draft.reset();
        _object = {};
    }

private:
    const Ref<const QXXMLMarshallingMapping> _mapping; // has the names in the draft
    Value _object;
    std::unique_ptr<XMLDraft> _draft;
    WritingTrace _trace;
};

// A text, what was read from it, and what writing makes of that.
class TracedReading {
public:
    // Null with an error of reading or of writing.
    static std::unique_ptr<TracedReading> of(QXXMLMarshaller& marshaller, Ref<const Data> bytes,
                                             Ref<Error>* error);

    const XMLIndex& index() const noexcept { return _parsed->index(); }
    IndexedXML& document() noexcept { return *_document; }
    const ReadingTrace& read() const noexcept { return _read; }
    const WritingTrace& written() const noexcept { return _written.trace(); }
    // Calls take(plan, text) for each node that an object keeps although a field took it, or
    // something in it.
    template <class Take>
    void forEachDouble(Take take);

private:
    explicit TracedReading(const QXXMLMarshaller& marshaller) : _written(marshaller) {}

    std::vector<bool> takenEntries() const;

    XMLParser::Parsed _parsed;
    std::unique_ptr<IndexedXML> _document;
    ReadingTrace _read;
    TracedWriting _written;
};

template <class Take>
void TracedReading::forEachDouble(Take take) {
    using Form = ReadingTrace::Form;
    const std::vector<bool> taken = takenEntries();
    for (const ReadingTrace::Use& use : _read.uses()) {
        const bool isKept = use.form == Form::keptChild || use.form == Form::keptAttribute;
        if (!isKept || !taken[use.entry])
            continue;
        const ClassPlan* const plan = _read.owners()[use.owner].plan;
        if (use.form == Form::keptChild)
            take(plan, _document->element(IndexedXML::Nodes::own, use.entry)
                           ->XMLString(XMLCompactEmptyElements)
                           .str());
        else
            take(plan,
                 (_document->writtenName(use.entry) + "=" + _document->value(use.entry).view())
                     .str());
    }
}

} // namespace qx::detail
