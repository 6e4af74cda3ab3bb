#include <QXXMLMarshalling/detail/ValueReading.h>

#include "base/Base64.h"
#include "base/Unicode.h"
#include "base/WhiteSpace.h"

#include <charconv>
#include <cmath>
#include <limits>

namespace qx::detail {

namespace {

template <class T>
bool readWhole(std::string_view text, T& result) {
    text = trimmed(text);
    if (text.size() > 1 && text.front() == '+' && text[1] != '-')
        text.remove_prefix(1);
    const auto read = std::from_chars(text.data(), text.data() + text.size(), result);
    return read.ec == std::errc() && read.ptr == text.data() + text.size();
}

constexpr double twoTo63 = 9223372036854775808.0;
constexpr double twoTo64 = 18446744073709551616.0;

// Whether it is a number without a fraction in [from, to).
bool isWholeReal(const Value& value, double from, double to) {
    const double real = value.doubleValue();
    return std::trunc(real) == real && real >= from && real < to;
}

// XML Schema's words for what is no finite number; std::from_chars has others.
bool readNotFinite(std::string_view text, double& result) {
    const bool isNegative = text == "-INF";
    if (text == "NaN")
        result = std::numeric_limits<double>::quiet_NaN();
    else if (isNegative || text == "INF")
        result = isNegative ? -HUGE_VAL : HUGE_VAL;
    else
        return false;
    return true;
}

} // namespace

bool readBoolean(const Value& value, bool& result) {
    if (value.isNumber()) {
        result = value.boolValue();
        return true;
    }
    if (!value.isString())
        return false;
    const std::string_view text = value.view();
    for (const auto* yes : {"true", "yes", "1"})
        if (unicode::equalIgnoringCase(text, yes))
            return result = true;
    for (const auto* no : {"false", "no", "0"}) {
        if (unicode::equalIgnoringCase(text, no)) {
            result = false;
            return true;
        }
    }
    return false;
}

bool readInteger(const Value& value, std::int64_t& result) {
    if (value.isString())
        return readWhole(value.view(), result);
    if (value.kind() == Value::Kind::real ? !isWholeReal(value, -twoTo63, twoTo63)
                                          : !value.isNumber())
        return false;
    result = value.intValue();
    return true;
}

bool readUnsigned(const Value& value, std::uint64_t& result) {
    if (value.isString())
        return readWhole(value.view(), result);
    if (value.kind() == Value::Kind::real) {
        if (!isWholeReal(value, 0, twoTo64))
            return false;
        result = static_cast<std::uint64_t>(value.doubleValue());
        return true;
    }
    if (!value.isNumber() || value.intValue() < 0)
        return false;
    result = static_cast<std::uint64_t>(value.intValue());
    return true;
}

bool readReal(const Value& value, double& result) {
    if (value.isString()) {
        double read = 0;
        const bool isFinite = readWhole(value.view(), read) && std::isfinite(read);
        if (!isFinite && !readNotFinite(trimmed(value.view()), read))
            return false;
        result = read;
        return true;
    }
    if (!value.isNumber())
        return false;
    result = value.doubleValue();
    return true;
}

bool readText(const Value& value, String& result) {
    if (!value.isString() && !value.isNumber())
        return false;
    result = value.description();
    return true;
}

bool readBytes(const Value& value, std::vector<std::byte>& result) {
    if (!value.isString())
        return false;
    const auto bytes = decodeBase64(value.view());
    if (!bytes)
        return false;
    const auto* first = reinterpret_cast<const std::byte*>(bytes->data());
    result.assign(first, first + bytes->size());
    return true;
}

String textOfBytes(const std::vector<std::byte>& bytes) {
    return encodeBase64({reinterpret_cast<const char*>(bytes.data()), bytes.size()});
}

} // namespace qx::detail
