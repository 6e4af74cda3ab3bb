#pragma once

// What tests compare, as one text.

#include <QXXMLMarshalling/base/Exception.h>
#include <QXXMLMarshalling/model/Value.h>

#include <regex>
#include <string>

namespace support {

// What a call raises: "NSRangeException: the reason", or "nothing".
template <class F>
std::string raised(F call) {
    try {
        call();
    } catch (const qx::Exception& exception) {
        return exception.what();
    }
    return "nothing";
}

// The description of a value in one line.
inline std::string oneLine(const qx::Value& value) {
    static const std::regex layout("\\s+");
    return std::regex_replace(value.description().str(), layout, " ");
}

} // namespace support
