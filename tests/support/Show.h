#pragma once

// Values and objects as one line of text, for whole comparisons in tests:
//
//     Order{count: 3, lines: [Line{text: "a"}], unboundChildren: {note: [<note/>]}}
//
// Keys come sorted, so that records and host classes print alike; keys without a value do not come.

#include <QXXMLMarshalling/model/Value.h>

#include <string>

namespace support {

std::string show(const qx::Value& value);

} // namespace support
