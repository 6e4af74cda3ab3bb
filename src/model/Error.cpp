#include <QXXMLMarshalling/model/Error.h>

#include <QXXMLMarshalling/model/Format.h>

#include "model/ErrorDetails.h"
#include "model/LibraryClass.h"
#include "model/Localizer.h"

namespace qx {

using detail::ErrorDetails;

Error::Error(const ErrorText& text, std::vector<Value> arguments)
    : Error(text, std::move(arguments), text.code, cocoaDomain) {}

Error::Error(const ErrorText& text, std::vector<Value> arguments, String reason)
    : Error(text, std::move(arguments)) {
    _reason = std::move(reason);
}

Error::Error(const ErrorText& text, std::vector<Value> arguments, int code, const char* domain)
    : _domain(domain), _code(code), _text(&text), _arguments(std::move(arguments)) {}

Error::Error(const char* domain, int code, String message, String reason, std::size_t line,
             std::size_t column)
    : _domain(domain), _code(code), _message(std::move(message)), _reason(std::move(reason)) {
    if (line == 0)
        return;
    detail::SourcePlace source;
    source.place.line = line;
    source.place.column = column;
    ErrorDetails::setContext(*this, std::make_unique<detail::KnownContext>(std::move(source)));
}

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

DocumentPlace Error::place() const { return ErrorDetails::contextOf(*this).source().place; }

String Error::path() const { return ErrorDetails::contextOf(*this).source().path; }

String Error::mappingField() const { return ErrorDetails::contextOf(*this).mapping().field; }

String Error::mappingClass() const { return ErrorDetails::contextOf(*this).mapping().className; }

DocumentPlace Error::mappingPlace() const { return ErrorDetails::contextOf(*this).mapping().place; }

std::vector<DocumentPlace> Error::mappingIncludes() const {
    return ErrorDetails::contextOf(*this).mapping().includes;
}

String Error::suggestion() const { return ErrorDetails::contextOf(*this).suggestion(); }

std::vector<Ref<const Error>> Error::all() const {
    const auto& others = ErrorDetails::othersOf(*this);
    std::vector<Ref<const Error>> errors{Ref<const Error>(this)};
    errors.insert(errors.end(), others.begin(), others.end());
    return errors;
}

const Class& Error::describedClass() const { return libraryClass<Error>("qx::Error"); }

} // namespace qx
