#include "qxxml/Commands.h"
#include "qxxml/Failure.h"
#include "qxxml/Json.h"
#include "qxxml/Session.h"

#include <algorithm>

namespace qxxml {

namespace {

using Severity = QXXMLFinding::Severity;

// A fault quotes the element that it is about, however large that is.
std::string shortened(const std::string& text) {
    constexpr std::size_t longest = 240;
    if (text.size() <= longest)
        return text;
    std::size_t end = longest;
    while (end > 0 && (text[end] & 0xC0) == 0x80) // inside of a character
        --end;
    return text.substr(0, end) + "...";
}

std::string textOf(const QXXMLMappingPlace& place) {
    return place.documentName.str() + ":" + std::to_string(place.line) + ":" +
           std::to_string(place.column);
}

// FILE:LINE:COLUMN: SEVERITY: TEXT [CLASS.FIELD], and what belongs to it on lines of their own.
std::string textOf(const QXXMLFinding& finding) {
    std::string text = shortened(finding.description().str());
    if (!finding.className.isNull())
        text += " [" + finding.className.str() +
                (finding.fieldName.isNull() ? "" : "." + finding.fieldName.str()) + "]";
    if (!finding.suggestion.isNull())
        text += "\n    " + message("did you mean %@?", finding.suggestion);
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

std::string textOf(const std::vector<QXXMLFinding>& findings, const Options& options) {
    std::vector<QXXMLFinding> shown = findings;
    if (!options.notes)
        std::erase_if(shown, [](const auto& each) { return each.severity == Severity::note; });
    if (options.json) {
        auto list = nlohmann::ordered_json::array();
        for (const QXXMLFinding& finding : shown)
            list.push_back(jsonOf(finding));
        return qxxml::textOf(list) + "\n";
    }
    std::string text;
    for (const QXXMLFinding& finding : shown)
        text += textOf(finding);
    return text + summaryOf(findings);
}

} // namespace

std::string check(const Options& options, int& status) {
    const Session session(options);
    const auto mapping = session.resolveMapping({.collectsFaults = true});
    const auto findings = mapping->check();
    const bool isSound = count(findings, Severity::error) + count(findings, Severity::warning) == 0;
    status = isSound ? 0 : 1;
    return textOf(findings, options);
}

} // namespace qxxml
