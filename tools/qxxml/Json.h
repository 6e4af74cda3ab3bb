#pragma once

// Values and objects as JSON.
//
//     null, the null marker        null
//     booleans, numbers, strings   themselves
//     arrays                       arrays
//     dictionaries                 objects, keys in the order in which they were set
//     XML nodes                    strings of their XML text, an attribute as name="value"
//     data                         strings, their description
//     any other object             an object: "@class", its class name for marshalling; then the
//                                  properties described for its class, those of base classes first;
//                                  a record's keys in the order in which they were set
//
// A key that begins with "@" gets another "@" in front, so that "@class" is always the class. Where
// an object holds one that it stands in, {"@above": N} tells that it is the one N levels further
// up.

#include <QXXMLMarshalling/model/Value.h>

#include <nlohmann/json.hpp>

namespace qxxml {

// Nesting that goes further than this is refused: printing takes stack for each level.
inline constexpr std::size_t deepestJson = 1024;

// Throws Failure for what nests deeper, and lets qx::Exception pass, of a getter or of a node that
// is no XML.
nlohmann::ordered_json jsonOf(const qx::Value& value);
// One member or item a line, 4 blanks a level. Bytes that are no UTF-8 become U+FFFD.
std::string textOf(const nlohmann::ordered_json& json);
// All of it on one line.
std::string lineOf(const nlohmann::ordered_json& json);

} // namespace qxxml
