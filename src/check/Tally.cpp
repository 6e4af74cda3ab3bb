#include "check/Tally.h"

#include <QXXMLMarshalling/model/Format.h>

#include "model/Localizer.h"

namespace qx::detail {

void Tally::add(const FindingText& text, std::vector<String> arguments, const Concerned& concerned,
                const std::function<QXXMLMappingPlace()>& place,
                const std::function<String()>& suggestion) {
    const auto [found, isNew] =
        _numbers.try_emplace(Key(&text, arguments, concerned), _entries.size());
    if (isNew)
        _entries.push_back({&text, std::move(arguments), concerned,
                            suggestion ? suggestion() : String(), place(), 0});
    ++_entries[found->second].count;
}

void Tally::add(const Tally& other) {
    for (const Entry& entry : other._entries) {
        const auto [found, isNew] = _numbers.try_emplace(
            Key(entry.text, entry.arguments, entry.concerned), _entries.size());
        if (isNew)
            _entries.push_back(entry);
        else
            _entries[found->second].count += entry.count;
    }
}

std::vector<QXXMLFinding> Tally::findings() const {
    std::vector<QXXMLFinding> all;
    for (const Entry& entry : _entries) {
        std::vector<Value> arguments(entry.arguments.begin(), entry.arguments.end());
        arguments.emplace_back(std::to_string(entry.count));
        QXXMLFinding finding;
        finding.severity = entry.text->severity;
        finding.kind = entry.text->kind;
        finding.text = qx::format(localizedText(entry.text->message), arguments);
        finding.suggestion = entry.suggestion;
        finding.place = entry.place;
        finding.className = entry.concerned.className;
        finding.fieldName = entry.concerned.fieldName;
        all.push_back(std::move(finding));
    }
    return all;
}

} // namespace qx::detail
