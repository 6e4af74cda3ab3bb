#include "xml/ParseFailure.h"

#include <QXXMLMarshalling/model/Format.h>

#include "host/Localization.h"

namespace qx {

ParseFailure::ParseFailure(const ErrorText& text, std::vector<Value> arguments, std::size_t at)
    : code(text.code), message(format(localizedText(text.message), arguments)),
      reason(localizedText(text.reason)), offset(at) {}

ParseFailure::ParseFailure(int parsersCode, std::string_view parsersMessage, std::size_t at)
    : code(parsersCode), message(parsersMessage), reason(localizedText(parseErrors::notWellFormed)),
      offset(at) {
    if (message.isEmpty())
        message = reason;
}

} // namespace qx
