#include "model/Errors.h"

namespace qx {

void storeError(Ref<Error>& error, const ErrorText& text, std::vector<Value> arguments) {
    error = make<Error>(text, std::move(arguments));
}

} // namespace qx
