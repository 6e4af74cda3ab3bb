#pragma once

// Edits of a text carried over to another that came from it: each goes where the lines stand that
// it touches, if they are the same there.

#include <QXXMLMarshalling/QXXMLUpdate.h>

#include <optional>
#include <string>

namespace qx::detail {

// Null where lines of an edit are gone or others; its key path is given then.
std::optional<std::string> carriedOver(std::string_view base,
                                       const std::vector<QXXMLUpdate::Edit>& edits,
                                       std::string_view theirs, String& conflict);

} // namespace qx::detail
