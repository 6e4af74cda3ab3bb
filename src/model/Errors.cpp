#include "model/Errors.h"

#include "host/Localization.h"

#include <QXXMLMarshalling/model/Format.h>

#include <cstring>

namespace qx {

void storeError(Ref<Error>& error, const ErrorText& text, std::vector<Value> arguments) {
    error = make<Error>(text, std::move(arguments), &localizedText);
}

Failure failWithSystemError(Ref<Error>* error, const ErrorText& text, std::string_view path,
                            int errorNumber) {
    if (error == nullptr)
        return {};
    char buffer[256];
    const String reason = strerror_r(errorNumber, buffer, sizeof buffer);
    const Value arguments[]{path};
    *error = make<Error>(Error::cocoaDomain, text.code,
                         format(localizedText(text.message), arguments), reason);
    return {};
}

} // namespace qx
