#pragma once

// What the operating system refuses, as the errors that files/Files.h lists. Any thread may call.

#include "model/Errors.h"

namespace qx {

Failure failWithSystemError(Ref<Error>* error, const ErrorText& text, std::string_view path,
                            int errorNumber);
// 260, 257, 256, as the number says.
Failure failReading(Ref<Error>* error, const String& path, int errorNumber);
// 513, 640, 642, 512, as the number says.
Failure failWriting(Ref<Error>* error, const String& path, int errorNumber);

} // namespace qx
