#pragma once

// Fills a format with values:
//   %@ %s       the next value's description; "(null)" for null
//   %1$@        the first value's description, likewise for other numbers
//   %d %lu %llx %08lx …   an integer, decimal or hexadecimal, with a width and leading zeros
//   %%          a percent sign
// A directive that it does not know, or that has no value, stays in the text as it is written, so
// a bad translation spoils a message but never the program.

#include <QXXMLMarshalling/model/Value.h>

#include <span>

namespace qx {

QX_API String format(std::string_view format, std::span<const Value> arguments);

} // namespace qx
