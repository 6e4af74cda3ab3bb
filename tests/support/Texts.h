#pragma once

// What tests compare, as one text.

#include <QXXMLMarshalling/base/Exception.h>
#include <QXXMLMarshalling/model/ValueTraits.h>
#include <QXXMLMarshalling/xml/XMLDocument.h>

#include "support/Patterns.h"

#include <gtest/gtest.h>

#include <string>

namespace support {

inline std::string repeated(std::string_view text, std::size_t times) {
    std::string all;
    while (times-- > 0)
        all += text;
    return all;
}

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
    return replaced(value.description().str(), "\\s+", " ");
}

// What a property of the type holds when it is set to the value; "refused" when it stays as it is.
template <class T>
std::string taken(const qx::Value& value) {
    T held{};
    const std::string before = oneLine(qx::ValueTraits<T>::toValue(held));
    const bool isTaken = qx::ValueTraits<T>::fromValue(value, held);
    const std::string after = oneLine(qx::ValueTraits<T>::toValue(held));
    return isTaken ? after : after == before ? "refused" : "refused, but changed to " + after;
}

} // namespace support
