#include <QXXMLMarshalling/model/Error.h>

#include <QXXMLMarshalling/model/Format.h>

#include "model/LibraryClass.h"
#include "model/Localizer.h"

namespace qx {

Error::Error(const ErrorText& text, std::vector<Value> arguments)
    : Error(cocoaDomain, text, text.code, std::move(arguments), 0, 0) {}

Error::Error(const ErrorText& text, std::vector<Value> arguments, String reason)
    : Error(text, std::move(arguments)) {
    _reason = std::move(reason);
}

Error::Error(const char* domain, const ErrorText& text, int code, std::vector<Value> arguments,
             std::size_t line, std::size_t column)
    : _domain(domain), _code(code), _text(&text), _arguments(std::move(arguments)), _line(line),
      _column(column) {}

Error::Error(const char* domain, int code, String message, String reason, std::size_t line,
             std::size_t column)
    : _domain(domain), _code(code), _message(std::move(message)), _reason(std::move(reason)),
      _line(line), _column(column) {}

Error::~Error() = default;

String Error::domain() const { return _domain; }

String Error::localizedDescription() const {
    return _text != nullptr ? qx::format(localizedText(_text->message), _arguments) : _message;
}

String Error::localizedFailureReason() const {
    return _text != nullptr && _reason.isNull() ? localizedText(_text->reason) : _reason;
}

String Error::description() const {
    return String::concat({_domain, " ", std::to_string(_code), ": ", localizedDescription(), " (",
                           localizedFailureReason(), ")"});
}

const Class& Error::describedClass() const { return libraryClass<Error>("qx::Error"); }

} // namespace qx
