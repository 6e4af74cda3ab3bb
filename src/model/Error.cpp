#include <QXXMLMarshalling/model/Error.h>

#include <QXXMLMarshalling/model/Format.h>

#include "model/LibraryClass.h"

namespace qx {

Error::Error(const ErrorText& text, std::vector<Value> arguments, Localizer localizer)
    : _domain(cocoaDomain), _code(text.code), _text(&text), _localizer(localizer),
      _arguments(std::move(arguments)) {}

Error::Error(const char* domain, int code, String message, String reason, std::size_t line,
             std::size_t column)
    : _domain(domain), _code(code), _message(std::move(message)), _reason(std::move(reason)),
      _line(line), _column(column) {}

Error::~Error() = default;

String Error::domain() const { return _domain; }

String Error::localizedDescription() const {
    if (_text == nullptr)
        return _message;
    return format(_localizer != nullptr ? _localizer(_text->message) : String(_text->message),
                  _arguments);
}

String Error::localizedFailureReason() const {
    if (_text == nullptr)
        return _reason;
    return _localizer != nullptr ? _localizer(_text->reason) : String(_text->reason);
}

String Error::description() const {
    return String::concat({_domain, " ", std::to_string(_code), ": ", localizedDescription(), " (",
                           localizedFailureReason(), ")"});
}

const Class& Error::describedClass() const { return libraryClass<Error>("qx::Error"); }

} // namespace qx
