#include "qxxml/Commands.h"
#include "qxxml/Failure.h"
#include "qxxml/Json.h"
#include "qxxml/Output.h"
#include "qxxml/Session.h"

#include <QXXMLMarshalling/QXXMLDocumentCheck.h>

#include <algorithm>
#include <iostream>
#include <iterator>

namespace qxxml {

namespace {

using Severity = QXXMLFinding::Severity;

std::string textOf(const QXXMLMappingPlace& place) {
    return place.documentName.str() + ":" + std::to_string(place.line) + ":" +
           std::to_string(place.column);
}

// FILE:LINE:COLUMN: SEVERITY: TEXT [CLASS.FIELD], and what belongs to it on lines of their own.
std::string textOf(const QXXMLFinding& finding) {
    std::string text = finding.description().str();
    if (!finding.className.isNull())
        text += harmless(" [" + finding.className.str() +
                         (finding.fieldName.isNull() ? "" : "." + finding.fieldName.str()) + "]");
    if (!finding.suggestion.isNull())
        text += "\n    " + harmless(finding.suggestion.str());
    for (const QXXMLMappingPlace& include : finding.includedFrom)
        text += "\n    " + message("included from %@", textOf(include));
    return text + "\n";
}

nlohmann::ordered_json jsonOf(const QXXMLMappingPlace& place) {
    return {{"document", place.documentName.str()}, {"line", place.line}, {"column", place.column}};
}

nlohmann::ordered_json jsonOf(const QXXMLFinding& finding) {
    nlohmann::ordered_json json{{"severity", QXXMLFinding::nameOf(finding.severity)},
                                {"kind", finding.kind.str()},
                                {"text", finding.text.str()},
                                {"place", jsonOf(finding.place)}};
    const auto addUnlessNull = [&](const char* key, const qx::String& value) {
        if (!value.isNull())
            json[key] = value.str();
    };
    addUnlessNull("class", finding.className);
    addUnlessNull("field", finding.fieldName);
    addUnlessNull("suggestion", finding.suggestion);
    for (const QXXMLMappingPlace& include : finding.includedFrom)
        json["includedFrom"].push_back(jsonOf(include));
    if (finding.fault)
        json["code"] = finding.fault->code();
    return json;
}

std::size_t count(const std::vector<QXXMLFinding>& findings, Severity severity) {
    return static_cast<std::size_t>(
        std::count_if(findings.begin(), findings.end(), [severity](const QXXMLFinding& finding) {
            return finding.severity == severity;
        }));
}

std::string summaryOf(const std::vector<QXXMLFinding>& findings) {
    std::string text;
    for (const auto severity : {Severity::error, Severity::warning, Severity::note})
        text += (text.empty() ? "" : ", ") + std::to_string(count(findings, severity)) + " " +
                QXXMLFinding::nameOf(severity) + (count(findings, severity) == 1 ? "" : "s");
    return text + "\n";
}

std::string textOf(const std::vector<QXXMLFinding>& shown, const std::string& summary) {
    std::string text;
    for (const QXXMLFinding& finding : shown)
        text += textOf(finding);
    return text + summary;
}

std::string jsonTextOf(const std::vector<QXXMLFinding>& shown) {
    auto list = nlohmann::ordered_json::array();
    for (const QXXMLFinding& finding : shown)
        list.push_back(jsonOf(finding));
    return qxxml::textOf(list) + "\n";
}

// A document that cannot be read is a finding like others.
QXXMLFinding findingOf(const qx::Ref<qx::Error>& error, const std::string& document) {
    QXXMLFinding finding;
    finding.severity = Severity::error;
    finding.kind = "fault";
    finding.fault = error;
    finding.place.documentName = document;
    if (!error)
        return finding;
    finding.text = error->shortDescription();
    finding.suggestion = error->suggestion();
    finding.place = error->place();
    finding.className = error->mappingClass();
    finding.fieldName = error->mappingField();
    if (finding.place.documentName.isNull())
        finding.place.documentName = document;
    return finding;
}

// Reads the documents; what cannot be read is added to the findings.
void addDocuments(QXXMLDocumentCheck& check, const std::vector<std::string>& documents,
                  std::vector<QXXMLFinding>& findings) {
    for (const std::string& document : documents) {
        qx::Ref<qx::Error> error;
        const bool isRead =
            document == "-"
                ? check.addData(std::string(std::istreambuf_iterator<char>(std::cin), {}),
                                "<stdin>", &error)
                : check.addFile(document, &error);
        if (!isRead)
            findings.push_back(findingOf(error, document));
    }
}

} // namespace

// A mapping with faults reads nothing.
std::string check(const Options& options, int& status) {
    const Session session(options);
    const auto mapping = session.resolveMapping({.collectsFaults = true});
    std::vector<QXXMLFinding> findings = mapping->check();
    std::vector<QXXMLFinding> ofDocuments;
    if (mapping->faults().empty()) {
        QXXMLDocumentCheck documents(session.makeMarshaller(mapping));
        addDocuments(documents, options.documents, ofDocuments);
        if (!options.why.empty()) {
            const qx::String reason = documents.why(options.why);
            if (reason.isNull())
                throw Failure("260: " + message("There is no node of the path: %@", options.why));
            return reason.str() + "\n";
        }
        const auto found = documents.findings();
        ofDocuments.insert(ofDocuments.end(), found.begin(), found.end());
    }
    const auto isNote = [](const auto& finding) { return finding.severity == Severity::note; };
    auto shown = findings;
    if (!options.notes)
        std::erase_if(shown, isNote);
    shown.insert(shown.end(), ofDocuments.begin(), ofDocuments.end());
    findings.insert(findings.end(), ofDocuments.begin(), ofDocuments.end());
    status = std::all_of(findings.begin(), findings.end(), isNote) ? 0 : 1;
    return options.json ? jsonTextOf(shown) : textOf(shown, summaryOf(findings));
}

} // namespace qxxml
