#pragma once

// Findings as the pages of this folder have them.

#include <QXXMLMarshalling/QXXMLFinding.h>

#include <string>
#include <vector>

// A line for each, as "LINE:COLUMN severity kind: text [Class.field] -> suggestion".
inline std::string told(const std::vector<QXXMLFinding>& findings, bool withNotes) {
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
