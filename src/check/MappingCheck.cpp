#include "check/MappingCheck.h"

#include "check/Rules.h"
#include "model/Localizer.h"

#include <algorithm>
#include <tuple>
#include <unordered_map>

using qx::detail::MappingCheck;

std::vector<QXXMLFinding> QXXMLMarshallingMapping::check() const {
    return MappingCheck(*this).run();
}

namespace qx::detail {

Subject Subject::of(const QXXMLMapping& node, const MappingSource& source) {
    const XMLElement& element = MappingSource::elementOf(node);
    return {&source, element.line(), element.column()};
}

Subject Subject::of(const QXXMLClassMapping& type) {
    Subject subject = of(type, MappingSource::of(type));
    subject.className = type.className();
    return subject;
}

Subject Subject::of(const QXXMLFieldMapping& field) {
    Subject subject = of(field, MappingSource::of(field));
    if (const auto type = field.classMapping())
        subject.className = type->className();
    subject.fieldName = field.name();
    return subject;
}

Subject Subject::of(const QXXMLFieldMapping& field, const QXXMLBindToMapping& binding) {
    Subject subject = of(field);
    const XMLElement& element = MappingSource::elementOf(binding);
    subject.line = element.line();
    subject.column = element.column();
    return subject;
}

MappingCheck::MappingCheck(const QXXMLMarshallingMapping& mapping)
    : _mapping(mapping), _plan(MappingPlan::of(&mapping)), _findings(mapping.faults()) {
    _documents.push_back(mapping.mapping());
    for (const auto& included : includes().included())
        _documents.push_back(included.get());
    // A class whose name is taken has no plan.
    for (const auto& type : mapping.mapping()->classMappings())
        if (const ClassPlan* const plan = _plan.planOf(*type))
            _classes.push_back(plan);
}

String MappingCheck::nearestClass(std::string_view wanted) {
    std::vector<std::string_view> names;
    for (const ClassPlan* type : _classes)
        names.push_back(type->mapping->className());
    return nearest(wanted, names);
}

String suggestionOf(const String& meant) {
    if (meant.isNull())
        return nullptr;
    const bool isQuoted = meant.view().find('"') != std::string_view::npos;
    const std::string_view quote = isQuoted ? "" : "\"";
    return String::concat({"did you mean ", quote, meant.view(), quote, "?"});
}

void MappingCheck::store(const String& meant, const FindingText& text, const Subject& subject,
                         std::span<const Value> arguments) {
    QXXMLFinding finding;
    finding.severity = text.severity;
    finding.kind = text.kind;
    finding.text = qx::format(localizedText(text.message), arguments);
    finding.suggestion = suggestionOf(meant);
    finding.place = {subject.source->name(), subject.line, subject.column};
    finding.includedFrom = subject.source->chain();
    finding.className = subject.className;
    finding.fieldName = subject.fieldName;
    _findings.push_back(std::move(finding));
}

std::vector<QXXMLFinding> MappingCheck::run() {
    for (const auto rules : {&checkGrammar, &checkReferences, &checkBindings, &checkConflicts,
                             &checkRoundTrip, &checkHostClasses})
        rules(*this);
    std::unordered_map<String, std::size_t> order;
    for (const QXXMLDocumentMapping* document : _documents)
        order.emplace(MappingSource::of(*document).name(), order.size());
    const auto keyOf = [&](const QXXMLFinding& finding) {
        const auto document = order.find(finding.place.documentName);
        return std::tuple(document != order.end() ? document->second : order.size(),
                          finding.place.line, finding.place.column);
    };
    std::stable_sort(
        _findings.begin(), _findings.end(),
        [&](const QXXMLFinding& a, const QXXMLFinding& b) { return keyOf(a) < keyOf(b); });
    return std::move(_findings);
}

} // namespace qx::detail
