#pragma once

// What the commands that save an object into its document share.

#include "qxxml/Session.h"

namespace qxxml {

// Saves the object into the original's text. What is to be printed: the new text, the lines that
// change with --diff, nothing with --in-place. Values that no XML shows, and elements that were
// written anew, are told on the standard error.
std::string saved(const Session& session, QXXMLMarshaller& marshaller, const std::string& original,
                  const qx::Value& object);

} // namespace qxxml
