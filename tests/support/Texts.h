#pragma once

// What tests compare, as one text.

#include <QXXMLMarshalling/base/Exception.h>
#include <QXXMLMarshalling/model/Value.h>
#include <QXXMLMarshalling/xml/XMLDocument.h>

#include <gtest/gtest.h>

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

// The document that a text holds; a failure of the test that asks when it holds none.
inline qx::Ref<qx::XMLDocument> parsed(std::string_view text,
                                       const qx::XMLParseOptions& options = {}) {
    qx::Ref<qx::Error> error;
    auto document = qx::XMLDocument::initWithData(text, options, &error);
    EXPECT_TRUE(document) << (error ? error->description().str() : "no error");
    return document;
}

// "-202: message (reason)", or "no error".
inline std::string told(const qx::Ref<qx::Error>& error) {
    if (!error)
        return "no error";
    return std::to_string(error->code()) + ": " + error->localizedDescription().str() + " (" +
           error->localizedFailureReason().str() + ")";
}

// The description of a value in one line.
inline std::string oneLine(const qx::Value& value) {
    static const std::regex layout("\\s+");
    return std::regex_replace(value.description().str(), layout, " ");
}

} // namespace support
