#pragma once

// What a check of a mapping found: something that its author may not have wanted, with the place
// and the reason. Findings are values of their own: they stay good when the mapping is gone.
//
//     for (const QXXMLFinding& finding : mapping->check())
//         std::cout << finding.description().view() << '\n';

#include <QXXMLMarshalling/QXXMLMapping.h>

struct QX_API QXXMLFinding {
    enum class Severity : std::uint8_t {
        note,    // has no effect, or one that is easily missed
        warning, // reads or writes other than it looks
        error    // fails, wherever it is used
    };

    Severity severity = Severity::warning;
    // What kind of finding it is, for programs: "unknown-attribute", for instance. docs/qxxml.md
    // lists them. Null in none.
    qx::String kind;
    // What is the matter and what comes of it, in the user's language.
    qx::String text;
    // What may have been meant, in a few words of English: did you mean "price"? Null where nothing
    // is near.
    qx::String suggestion;
    // The element of the mapping, or of a document; the includes that led there, the nearest first.
    QXXMLMappingPlace place;
    std::vector<QXXMLMappingPlace> includedFrom;
    // The class and the field that it is about, by their "name"; null where it is about none.
    qx::String className;
    qx::String fieldName;
    // The fault that made a mapping document unusable, as the error slot would have had it; null
    // for what is no fault.
    qx::Ref<qx::Error> fault;

    // "error", "warning" or "note".
    static const char* nameOf(Severity severity) noexcept;
    // "DOCUMENT:LINE:COLUMN: SEVERITY: TEXT", as editors read it; what is unknown of the place is
    // left out.
    qx::String description() const;
};
