#pragma once

// How ValueTraits.h reads its scalars: false where the value is none of that kind, and the result
// is then left alone. No blanks are skipped but around a number.

#include <QXXMLMarshalling/model/Value.h>

#include <cstddef>
#include <vector>

namespace qx::detail {

QX_API bool readBoolean(const Value& value, bool& result);
QX_API bool readInteger(const Value& value, std::int64_t& result);
QX_API bool readUnsigned(const Value& value, std::uint64_t& result);
QX_API bool readReal(const Value& value, double& result);
QX_API bool readText(const Value& value, String& result);
// Base64 text as bytes, and back.
QX_API bool readBytes(const Value& value, std::vector<std::byte>& result);
QX_API String textOfBytes(const std::vector<std::byte>& bytes);

} // namespace qx::detail
