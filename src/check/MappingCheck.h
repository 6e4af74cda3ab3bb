#pragma once

// One check of a resolved mapping. Groups of rules (Rules.h) go over its documents, classes and
// fields and add what they find. The work grows with the mapping; names are suggested for the first
// few hundred findings only, since looking for one goes over all names that there are.

#include <QXXMLMarshalling/QXXMLMarshallingMapping.h>
#include <QXXMLMarshalling/model/Format.h>

#include "base/NearestName.h"
#include "check/FindingTexts.h"
#include "mapping/MappingSource.h"
#include "plan/IncludeLoader.h"
#include "plan/MappingPlan.h"

#include <array>

namespace qx::detail {

// What a finding is about: an element of a mapping document, and the class and field that it
// belongs to.
struct Subject {
    const MappingSource* source;
    std::size_t line;
    std::size_t column;
    String className = {};
    String fieldName = {};

    static Subject of(const QXXMLMapping& node, const MappingSource& source);
    static Subject of(const QXXMLClassMapping& type);
    static Subject of(const QXXMLFieldMapping& field);
    // A binding of the field.
    static Subject of(const QXXMLFieldMapping& field, const QXXMLBindToMapping& binding);
};

class MappingCheck {
public:
    // The mapping must outlive the check.
    explicit MappingCheck(const QXXMLMarshallingMapping& mapping);

    // All findings, in the order of the documents.
    std::vector<QXXMLFinding> run();

    // What the rules ask for.
    const MappingPlan& plan() const noexcept { return _plan; }
    const IncludeLoader& includes() const { return MappingPlan::includesOf(_mapping); }
    const std::vector<const QXXMLDocumentMapping*>& documents() const { return _documents; }
    const std::vector<const ClassPlan*>& classes() const noexcept { return _classes; }
    bool hasFaults() const noexcept { return !_mapping.faults().empty(); }

    // Adds a finding; its text is filled with the arguments.
    template <class... Arguments>
    void add(const FindingText& text, const Subject& subject, const Arguments&... arguments) {
        suggest(nullptr, text, subject, arguments...);
    }
    // The same with what was perhaps meant, a name or name="value", which may be null.
    template <class... Arguments>
    void suggest(const String& meant, const FindingText& text, const Subject& subject,
                 const Arguments&... arguments) {
        const std::array<Value, sizeof...(Arguments)> values{Value(arguments)...};
        store(meant, text, subject, values);
    }
    // The nearest of the names; null where none is near, or too many were looked for.
    template <class Names>
    String nearest(std::string_view wanted, const Names& names) {
        if (_suggestionsLeft == 0)
            return nullptr;
        --_suggestionsLeft;
        const std::string_view name = nearestName(wanted, names);
        return name.empty() ? String() : String(name);
    }
    // The same of the mapping's class names.
    String nearestClass(std::string_view wanted);

private:
    void store(const String& meant, const FindingText& text, const Subject& subject,
               std::span<const Value> arguments);

    const QXXMLMarshallingMapping& _mapping;
    const MappingPlan& _plan;
    std::vector<const QXXMLDocumentMapping*> _documents;
    std::vector<const ClassPlan*> _classes;
    std::vector<QXXMLFinding> _findings;
    std::size_t _suggestionsLeft = 200;
};

} // namespace qx::detail
