// What a check says of mappings, on pages.

#include "support/Cases.h"
#include "support/Texts.h"

#include <QXXMLMarshalling/QXXMLDataRepositoryManager.h>
#include <QXXMLMarshalling/QXXMLMarshallingMapping.h>

#include <gtest/gtest.h>

namespace {

// A line for each finding, as "LINE:COLUMN severity kind: text [Class.field] -> suggestion".
std::string told(const std::vector<QXXMLFinding>& findings, bool withNotes) {
    std::string lines;
    for (const QXXMLFinding& finding : findings) {
        if (finding.severity == QXXMLFinding::Severity::note && !withNotes)
            continue;
        lines += std::to_string(finding.place.line) + ':' + std::to_string(finding.place.column) +
                 ' ' + QXXMLFinding::nameOf(finding.severity) + ' ' + finding.kind.str() + ": " +
                 finding.text.str();
        if (!finding.className.isNull())
            lines += " [" + finding.className.str() +
                     (finding.fieldName.isNull() ? "" : "." + finding.fieldName.str()) + "]";
        if (!finding.suggestion.isNull())
            lines += " -> " + finding.suggestion.str();
        lines += '\n';
    }
    return lines.empty() ? "nothing\n" : lines;
}

const bool added = support::addCases(
    "tests/check/findings.md", {"mapping"}, {"findings"}, [](const auto& expected) {
        const auto document =
            support::parsed("<mapping>\n" + expected.given.at("mapping") + "</mapping>");
        const auto mapping =
            QXXMLMarshallingMapping::initWithDocument(document.get(), {.collectsFaults = true});
        QXXMLDataRepositoryManager::flushDefaultManager();
        EXPECT_EQ(told(mapping->check(), expected.options.contains("notes")), expected.text);
    });

} // namespace
