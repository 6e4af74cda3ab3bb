#pragma once

// Thrown by a command that cannot do its work: what stands behind "qxxml: error " on standard
// error.

#include <QXXMLMarshalling/model/Error.h>

#include <exception>
#include <string>

namespace qxxml {

// A message of the tool's own, in the user's language: its texts stand among the library's.
std::string message(std::string_view englishText, const qx::Value& argument);

class Failure : public std::exception {
public:
    explicit Failure(std::string message) : _message(std::move(message)) {}
    // "CODE: MESSAGE", for a parse error "CODE: FILE:LINE:COLUMN: MESSAGE".
    Failure(const qx::Ref<qx::Error>& error, const std::string& file);

    const char* what() const noexcept override { return _message.c_str(); }

private:
    std::string _message;
};

} // namespace qxxml
