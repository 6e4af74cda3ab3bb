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
    explicit TracedWriting(const QXXMLMarshaller& marshaller,
                           WritingTrace::Extent extent = WritingTrace::Extent::all)
        : _mapping(marshaller.mapping()),
          _trace(marshaller.saveUnknownXML(), marshaller.isUsingNamespaceURIs(), extent) {}
    TracedWriting(const TracedWriting&) = delete;
    TracedWriting& operator=(const TracedWriting&) = delete;

    // False with an error of marshalling. About so many entries and bytes of text are expected.
    // With values, what is shown may be printed.
    struct Size {
        std::size_t entries, texts;
    };
    bool write(const QXXMLMarshaller& marshaller, const Value& object, const Size& expected,
               XMLDraft::Values values, Ref<Error>* error);
    const WritingTrace& trace() const noexcept { return _trace; }
    std::optional<std::uint64_t> hash() { return _trace.hash(); }
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
    // Null with an error of reading or of writing. Where a hash of what is written is enough,
    // nothing else is traced.
    static std::unique_ptr<TracedReading>
    of(QXXMLMarshaller& marshaller, Ref<const Data> bytes, Ref<Error>* error,
       WritingTrace::Extent extent = WritingTrace::Extent::all);

    const XMLIndex& index() const noexcept { return _parsed->index(); }
    IndexedXML& document() noexcept { return *_document; }
    const ReadingTrace& read() const noexcept { return _read; }
    const WritingTrace& written() const noexcept { return _written->trace(); }
    std::optional<std::uint64_t> hash() { return _written->hash(); }
    // Calls take(plan, text) for each node that an object keeps although a field took it, or
    // something in it.
    template <class Take>
    void forEachDouble(Take take);

private:
    TracedReading() = default;

    std::vector<bool> takenEntries() const;

    XMLParser::Parsed _parsed;
    std::unique_ptr<IndexedXML> _document;
    ReadingTrace _read;
    std::unique_ptr<TracedWriting> _written;
};

template <class Take>
void TracedReading::forEachDouble(Take take) {
    using Form = ReadingTrace::Form;
    std::vector<bool> taken;
    for (const ReadingTrace::Use& use : _read.uses()) {
        if (use.form != Form::keptChild && use.form != Form::keptAttribute)
            continue;
        if (taken.empty())
            taken = takenEntries();
        if (!taken[use.entry])
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
