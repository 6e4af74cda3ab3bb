#pragma once

// Why a document cannot be read: thrown while it is prepared and parsed, caught before any frame of
// the C parser, and turned into the caller's error.

#include <cstddef>
#include <string>

namespace qx {

struct ParseFailure {
    // The offset of a failure that came about where the parser stands.
    static constexpr std::size_t here = static_cast<std::size_t>(-1);

    static constexpr const char* notWellFormed = "The document is not well-formed XML";
    static constexpr const char* beyondLimit = "The document exceeds a limit";
    static constexpr const char* notReadable = "The document's encoding cannot be read";

    int code; // of the parser's errors
    std::string message;
    const char* reason;
    // Into the document as UTF-8 text.
    std::size_t offset = here;
};

} // namespace qx
