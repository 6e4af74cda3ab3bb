#include <QXXMLMarshalling/QXXMLDocumentCheck.h>

#include "check/DocumentRules.h"
#include "files/Files.h"
#include "marshaller/DocumentParsing.h"
#include "marshaller/TakenNames.h"
#include "marshaller/Unmarshalling.h"
#include "xml/XMLDocumentContent.h"
#include "xml/XMLParser.h"

using qx::DocumentPlaces;
using qx::Error;
using qx::Ref;
using qx::String;
using qx::XMLDocument;
using qx::detail::MappingPlan;
using qx::detail::ReadingTrace;
using qx::detail::TakenEntries;
using qx::detail::Tally;

namespace findings = qx::detail::findings;

namespace {

// Reads without keeping or refusing what is unknown, whatever the host has set.
class PassingOver {
public:
    explicit PassingOver(QXXMLMarshaller& marshaller, bool keepsUnknown)
        : _marshaller(marshaller), _isLenient(marshaller.isLenient()),
          _saves(marshaller.saveUnknownXML()) {
        marshaller.setLenient(true);
        marshaller.setSaveUnknownXML(keepsUnknown);
    }
    ~PassingOver() {
        _marshaller.setLenient(_isLenient);
        _marshaller.setSaveUnknownXML(_saves);
    }
    PassingOver(const PassingOver&) = delete;
    PassingOver& operator=(const PassingOver&) = delete;

private:
    QXXMLMarshaller& _marshaller;
    const bool _isLenient;
    const bool _saves;
};

using Parsed = std::shared_ptr<const qx::ParsedDocument>;

// A document that was read, with what its trace tells.
struct ReadDocument {
    Parsed parsed;
    qx::XMLIndex::Number root = qx::IndexedXML::none;
    ReadingTrace trace;
    std::unique_ptr<DocumentPlaces> places;
};

bool isRead(QXXMLMarshaller& marshaller, ReadDocument& document, bool& hasObject,
            Ref<Error>* error) {
    const PassingOver options(marshaller, false);
    qx::IndexedXML indexed(*document.parsed, document.places->documentName());
    document.root = indexed.root();
    Ref<Error> problem;
    const auto object = readDocument(marshaller, indexed, &problem, &document.trace);
    hasObject = object.get() != nullptr;
    if (problem && error != nullptr)
        *error = problem;
    return !problem;
}

void tellUnknownRoot(const QXXMLMarshaller& marshaller, const ReadDocument& document,
                     Tally& tally) {
    const String name = document.parsed->index().name(document.parsed->index()[document.root]);
    const QXXMLMarshallingMapping* const mapping = marshaller.mapping();
    tally.add(
        findings::unknownRoot, {name}, {},
        [&] { return document.places->placeOf(document.root).place; },
        [&] {
            return mapping != nullptr ? qx::detail::suggestedElement(*mapping, name) : String();
        });
}

// Nodes that are kept are moved when they are written: what is compared has nodes of its own.
void compareWritten(QXXMLMarshaller& marshaller, const ReadDocument& document,
                    const TakenEntries& taken, Tally& tally) {
    using qx::XMLDocumentContent;
    const PassingOver options(marshaller, marshaller.saveUnknownXML());
    const auto place = [&] { return document.places->placeOf(document.root).place; };
    Ref<Error> error;
    const auto object =
        marshaller.unmarshall(XMLDocumentContent::document(document.parsed), &error);
    const String written =
        object ? marshaller.writeString(object, &error, qx::XMLNoOptions) : String();
    const auto again =
        error || written.isNull()
            ? nullptr
            : XMLDocument::initWithData(written, qx::detail::parsingOf(marshaller), &error);
    if (!again)
        return tally.add(findings::notWritten, {error ? error->shortDescription() : String()}, {},
                         place);
    const auto original = XMLDocumentContent::document(document.parsed);
    qx::detail::compareTrees(taken, *document.places, document.root, *original->rootElement(),
                             *again->rootElement(), tally);
}

} // namespace

struct QXXMLDocumentCheck::State {
    Ref<QXXMLMarshaller> marshaller;
    Tally tally;
    qx::detail::FoundFields fields;
    std::unique_ptr<ReadDocument> last;

    bool add(Parsed parsed, const String& name, Ref<Error>* error);
};

QXXMLDocumentCheck::QXXMLDocumentCheck(Ref<QXXMLMarshaller> marshaller)
    : _state(std::make_unique<State>()) {
    _state->marshaller = std::move(marshaller);
    _state->marshaller->setReportHandler([](const QXXMLReport&) {});
}

QXXMLDocumentCheck::~QXXMLDocumentCheck() { _state->marshaller->setReportHandler(nullptr); }

bool QXXMLDocumentCheck::addFile(const String& path, Ref<Error>* error) {
    auto data = qx::readFile(path, error);
    auto parsed = data ? qx::XMLParser::parse(std::move(data),
                                              qx::detail::parsingOf(*_state->marshaller), error)
                       : nullptr;
    qx::detail::ErrorDetails::nameDocument(error, path);
    return parsed && _state->add(std::move(parsed), path, error);
}

bool QXXMLDocumentCheck::addData(qx::XMLBytes bytes, const String& name, Ref<Error>* error) {
    auto parsed =
        qx::XMLParser::parseCopy(bytes, qx::detail::parsingOf(*_state->marshaller), error);
    qx::detail::ErrorDetails::nameDocument(error, name);
    return parsed && _state->add(std::move(parsed), name, error);
}

bool QXXMLDocumentCheck::State::add(Parsed parsed, const String& name, Ref<Error>* error) {
    auto document = std::make_unique<ReadDocument>();
    document->parsed = parsed;
    document->places = std::make_unique<DocumentPlaces>(std::move(parsed), name);
    bool hasObject = false;
    if (!isRead(*marshaller, *document, hasObject, error))
        return false;
    if (!hasObject) {
        tellUnknownRoot(*marshaller, *document, tally);
    } else {
        const TakenEntries taken(document->parsed->index(), document->trace);
        checkUntaken(taken, *document->places, document->root, tally);
        fields.add(document->trace);
        compareWritten(*marshaller, *document, taken, tally);
    }
    last = std::move(document);
    return true;
}

std::vector<QXXMLFinding> QXXMLDocumentCheck::findings() const {
    auto all = _state->tally.findings();
    if (const QXXMLMarshallingMapping* const mapping = _state->marshaller->mapping())
        _state->fields.addFindings(MappingPlan::of(mapping), *mapping->mapping(), all);
    return all;
}

String QXXMLDocumentCheck::why(const String& path) const {
    if (!_state->last)
        return nullptr;
    const ReadDocument& document = *_state->last;
    const TakenEntries taken(document.parsed->index(), document.trace);
    return qx::detail::reasonFor(path, taken, *document.places, document.root,
                                 _state->marshaller->saveUnknownXML());
}
