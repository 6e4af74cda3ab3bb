#include "qxxml/Failure.h"

#include <QXXMLMarshalling/host/Bundle.h>
#include <QXXMLMarshalling/model/Format.h>

#include "qxxml/Json.h"
#include "qxxml/Output.h"

namespace qxxml {

namespace {

using Json = nlohmann::ordered_json;

std::string fileOf(const qx::Error& error, const std::string& file) {
    const qx::String name = error.documentName();
    return name.isNull() || name == "/dev/stdin" ? file : name.str();
}

std::string placeOf(const qx::Error& error, const std::string& file) {
    return harmless(fileOf(error, file)) + ":" + std::to_string(error.line()) + ":" +
           std::to_string(error.column());
}

bool isOfParser(const qx::Error& error) { return error.domain() == qx::Error::parserDomain; }

std::string messageOf(const qx::Error& error, const std::string& file) {
    return std::to_string(error.code()) + ": " +
           (isOfParser(error) ? placeOf(error, file) + ": " : "") + error.shortDescription().str();
}

// What the report says behind its first line; of a parser's error without the place, which stands
// in that.
std::string detailsOf(const qx::Error& error, qx::Error::Style style) {
    std::string text = error.report(style).str();
    std::size_t end = text.find('\n');
    if (isOfParser(error) && end != std::string::npos && text.compare(end, 6, "\n  at ") == 0)
        end = text.find('\n', end + 1);
    return end != std::string::npos ? text.substr(end) : "";
}

std::string oneLineOf(const qx::Error& error, const std::string& file) {
    const std::string message =
        "error " + std::to_string(error.code()) + ": " + error.shortDescription().str();
    const qx::String suggestion = error.suggestion();
    return (error.line() != 0 ? placeOf(error, file) : harmless(fileOf(error, file))) + ": " +
           message + (suggestion.isNull() ? "" : harmless(" (" + suggestion.str() + ")")) + "\n";
}

Json jsonOf(const qx::DocumentPlace& place) {
    return {{"document", place.documentName.isNull() ? "" : place.documentName.str()},
            {"line", place.line},
            {"column", place.column}};
}

Json jsonOf(const qx::Error& error, const std::string& file) {
    Json json{
        {"severity", "error"}, {"code", error.code()}, {"text", error.shortDescription().str()}};
    const auto addUnlessNull = [&](const char* key, const qx::String& value) {
        if (!value.isNull())
            json[key] = value.str();
    };
    qx::DocumentPlace place = error.place();
    place.documentName = fileOf(error, file);
    json["place"] = jsonOf(place);
    addUnlessNull("path", error.path());
    addUnlessNull("class", error.mappingClass());
    addUnlessNull("field", error.mappingField());
    if (error.mappingPlace().line != 0)
        json["mapping"] = jsonOf(error.mappingPlace());
    for (const qx::DocumentPlace& include : error.mappingIncludes())
        json["includedFrom"].push_back(jsonOf(include));
    addUnlessNull("suggestion", error.suggestion());
    return json;
}

} // namespace

std::string message(std::string_view englishText, const qx::Value& argument) {
    const auto framework = qx::Bundle::frameworkBundle();
    const qx::String text =
        framework ? framework->localizedString(englishText) : qx::String(englishText);
    return qx::format(text, {&argument, 1}).str();
}

Failure::Failure(const qx::Ref<qx::Error>& error, const std::string& file)
    : _message(error ? messageOf(*error, file) : file + ": nothing was read"), _error(error),
      _file(file) {}

std::string Failure::text(Form form) const {
    if (!_error)
        return form == Form::json ? lineOf(Json{{"severity", "error"}, {"text", _message}}) + "\n"
                                  : "qxxml: error " + _message + "\n";
    std::string text;
    for (const auto& error : _error->all()) {
        if (form == Form::json) {
            text += lineOf(jsonOf(*error, _file)) + "\n";
        } else if (form == Form::oneLine) {
            text += oneLineOf(*error, _file);
        } else {
            const auto style =
                form == Form::coloured ? qx::Error::Style::coloured : qx::Error::Style::plain;
            text += "qxxml: error " + messageOf(*error, _file) + detailsOf(*error, style) + "\n";
        }
    }
    return text;
}

} // namespace qxxml
