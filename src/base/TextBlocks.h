#pragma once

// Memory for the many short texts that reading a document makes: strings cut from the text blocks
// of the thread (MemoryBlocks.h).
//
//     in a block   | owner | count | hash | isInBlock 1, size | bytes ... | 0 |
//     alone                | count | hash | isInBlock 0, size | bytes ... | 0 |
//
// 1. The last count, on whatever thread, ends a string: isInBlock says whether its memory goes
//    back to its block or to the C library.
// 2. One live text keeps its block allocated, about a kilobyte.
// 3. A string in a block is never resized in place.
// 4. Texts beyond 256 bytes stand alone: they would leave much of a block unused.

#include <QXXMLMarshalling/base/String.h>

namespace qx {

// The text in a block, or alone where it is too long for one.
String textInBlock(std::string_view text);

} // namespace qx
