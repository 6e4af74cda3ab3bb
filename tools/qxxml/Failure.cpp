#include "qxxml/Failure.h"

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

Failure::Failure(const qx::Ref<qx::Error>& error, const std::string& file)
    : _message(error ? messageOf(*error, file) : file + ": nothing was read") {}

} // namespace qxxml
