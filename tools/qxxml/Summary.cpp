#include "qxxml/Summary.h"

#include "qxxml/Json.h"
#include "qxxml/Output.h"

namespace qxxml {

namespace {

using Kind = QXXMLReport::Kind;

constexpr std::size_t mostEntries = 500;

// 20,000
std::string withCommas(std::size_t number) {
    std::string text = std::to_string(number);
    for (std::size_t at = text.size(); at > 3; at -= 3)
        text.insert(at - 3, 1, ',');
    return text;
}

std::string whatOf(Kind kind, const std::string& name) {
    const std::string quoted = "`" + name + "`";
    switch (kind) {
    case Kind::unboundAttribute:
    case Kind::omittedValue:
        return "attribute " + quoted;
    case Kind::droppedText:
        return "text";
    default:
        return quoted;
    }
}

// What becomes of it.
const char* fateOf(Kind kind, bool isKept) {
    switch (kind) {
    case Kind::unboundChild:
    case Kind::unboundAttribute:
        return isKept ? "unknown, kept" : "unknown, lost";
    case Kind::droppedText:
        return "lost";
    case Kind::skippedItem:
        return "no item, lost";
    case Kind::omittedValue:
        return "not written, as it is zero, false or empty";
    }
    return "";
}

const char* nameOf(Kind kind) {
    switch (kind) {
    case Kind::unboundChild:
        return "unboundChild";
    case Kind::unboundAttribute:
        return "unboundAttribute";
    case Kind::droppedText:
        return "droppedText";
    case Kind::skippedItem:
        return "skippedItem";
    case Kind::omittedValue:
        return "omittedValue";
    }
    return "";
}

std::string textOf(const qx::DocumentPlace& place) {
    return std::to_string(place.line) + ":" + std::to_string(place.column);
}

} // namespace

void Summary::add(const QXXMLReport& report) {
    const Key key{report.kind, report.isKept, report.name.isNull() ? "" : report.name.str(),
                  report.elementName.str()};
    const auto known = _entries.find(key);
    if (known == _entries.end() && _entries.size() >= mostEntries) {
        ++_others;
        return;
    }
    Entry& entry = known != _entries.end() ? known->second : _entries[key];
    if (entry.elements++ == 0)
        entry.first = report.place();
    entry.count += report.count;
}

std::string Summary::lineOf(const Key& key, const Entry& entry) {
    const auto& [kind, isKept, name, element] = key;
    // Items are told one by one, whatever element they are in.
    const std::string number = entry.elements == 1 ? "" : withCommas(entry.elements) + " ";
    const bool isItem = kind == Kind::skippedItem;
    std::string line = (isItem ? number : "") + whatOf(kind, name) + " in " +
                       (isItem ? "" : number) + "`" + element + "`: " + fateOf(kind, isKept);
    if (entry.first.line != 0)
        line += (entry.elements == 1 ? ", at " : ", first at ") + textOf(entry.first);
    return "qxxml: warning: " + line + "\n";
}

std::string Summary::jsonLineOf(const Key& key, const Entry& entry) {
    const auto& [kind, isKept, name, element] = key;
    nlohmann::ordered_json json{
        {"severity", "warning"}, {"kind", nameOf(kind)},       {"name", name},
        {"element", element},    {"elements", entry.elements}, {"count", entry.count},
        {"isKept", isKept}};
    if (entry.first.line != 0)
        json["place"] = {
            {"document", entry.first.documentName.isNull() ? "" : entry.first.documentName.str()},
            {"line", entry.first.line},
            {"column", entry.first.column}};
    return qxxml::lineOf(json) + "\n";
}

std::string Summary::text(bool isJson) const {
    std::string text;
    for (const auto& [key, entry] : _entries)
        text += isJson ? jsonLineOf(key, entry) : lineOf(key, entry);
    if (_others != 0 && !isJson)
        text += "qxxml: warning: and " + withCommas(_others) + " others\n";
    return text;
}

std::string lineOf(const QXXMLReport& report) {
    const qx::DocumentPlace place = report.place();
    std::string line = "qxxml: warning: ";
    if (place.line != 0)
        line += (place.documentName.isNull() ? "" : harmless(place.documentName.str()) + ":") +
                textOf(place) + ": ";
    return line + whatOf(report.kind, report.name.isNull() ? "" : report.name.str()) + " in `" +
           report.elementName.str() + "`: " + fateOf(report.kind, report.isKept) + "\n";
}

} // namespace qxxml
