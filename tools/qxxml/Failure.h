#pragma once

// Thrown by a command that cannot do its work: what stands behind "qxxml: error " on standard
// error.

#include <QXXMLMarshalling/platform/Error.h>

#include <exception>
#include <string>

namespace qxxml {

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
