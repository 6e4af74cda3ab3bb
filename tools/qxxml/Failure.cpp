#include "qxxml/Failure.h"

#include <QXXMLMarshalling/host/Bundle.h>
#include <QXXMLMarshalling/model/Format.h>

namespace qxxml {

namespace {

std::string messageOf(const qx::Error& error, const std::string& file) {
    std::string text = std::to_string(error.code()) + ": ";
    if (error.domain() == qx::Error::parserDomain)
        text +=
            file + ":" + std::to_string(error.line()) + ":" + std::to_string(error.column()) + ": ";
    return text + error.localizedDescription().str();
}

} // namespace

std::string message(std::string_view englishText, const qx::Value& argument) {
    const auto framework = qx::Bundle::frameworkBundle();
    const qx::String text =
        framework ? framework->localizedString(englishText) : qx::String(englishText);
    return qx::format(text, {&argument, 1}).str();
}

Failure::Failure(const qx::Ref<qx::Error>& error, const std::string& file)
    : _message(error ? messageOf(*error, file) : file + ": nothing was read") {}

} // namespace qxxml
