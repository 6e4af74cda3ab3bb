#pragma once

// Objects out of JSON as Json.h has it: records, their arrays and dictionaries, and the unknown XML
// that they keep as nodes.

#include <QXXMLMarshalling/model/Value.h>

#include <string>

namespace qxxml {

// Throws Failure for what is no such JSON, or nests deeper than Json.h allows.
qx::Value objectOf(const std::string& json);

} // namespace qxxml
