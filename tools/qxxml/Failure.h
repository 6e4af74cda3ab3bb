#pragma once

// Thrown by a command that cannot do its work: what stands behind "qxxml: error " on standard
// error.

#include <QXXMLMarshalling/model/Error.h>

#include <cstdint>
#include <exception>
#include <string>

namespace qxxml {

// A message of the tool's own, in the user's language: its texts stand among the library's.
std::string message(std::string_view englishText, const qx::Value& argument);

class Failure : public std::exception {
public:
    explicit Failure(std::string message) : _message(std::move(message)) {}
    // The error is one of that file, where it names no other.
    Failure(const qx::Ref<qx::Error>& error, const std::string& file);

    // "CODE: MESSAGE", for a parse error "CODE: FILE:LINE:COLUMN: MESSAGE", on one line.
    const char* what() const noexcept override { return _message.c_str(); }
    // Lines for the standard error: "qxxml: error " and the above, and then, as far as it is known,
    // the place, its text, the mapping's place and the suggestion; of each error that was
    // collected.
    enum class Form : std::uint8_t {
        text,
        coloured,
        oneLine, // "FILE:LINE:COLUMN: error CODE: MESSAGE" for editors
        json     // an object a line
    };
    std::string text(Form form) const;

private:
    std::string _message;
    qx::Ref<qx::Error> _error;
    std::string _file;
};

} // namespace qxxml
