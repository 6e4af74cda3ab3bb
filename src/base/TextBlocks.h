#pragma once

// Memory for the many short texts that reading a document makes.

#include <QXXMLMarshalling/base/String.h>

namespace qx {

// The text in a block of memory that it shares with others made on this thread: one live text keeps
// its block. Long texts have memory of their own.
String textInBlock(std::string_view text);

} // namespace qx
