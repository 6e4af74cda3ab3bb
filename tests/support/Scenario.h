#pragma once

// What the tables of scenarios run through: a marshaller from mapping text, and an object or an
// error as one text.

#include <QXXMLMarshalling/QXXMLMarshaller.h>

#include "support/Show.h"

#include <gtest/gtest.h>

namespace scenario {

// How a marshaller is set up: as it is made, or with some options off.
enum Options : unsigned { usual = 0, strict = 1, discard = 2, noNamespaces = 4 };

inline qx::Ref<QXXMLMarshaller> marshaller(std::string_view mapping, unsigned options = usual) {
    qx::Ref<qx::Error> error;
    const auto document = qx::XMLDocument::initWithData(
        "<mapping>" + std::string(mapping) + "</mapping>", {}, &error);
    EXPECT_TRUE(document) << error->description().view();
    auto made = QXXMLMarshaller::initWithMappingXML(document.get(), &error);
    EXPECT_TRUE(made) << (error ? error->description().view() : "no error");
    made->setLenient((options & strict) == 0);
    made->setSaveUnknownXML((options & discard) == 0);
    made->setUsingNamespaceURIs((options & noNamespaces) == 0);
    return made;
}

// "-202: message (reason)".
inline std::string show(const qx::Ref<qx::Error>& error) {
    return std::to_string(error->code()) + ": " + error->localizedDescription().str() + " (" +
           error->localizedFailureReason().str() + ")";
}

// The object that the document gives, or the error.
inline std::string read(QXXMLMarshaller& marshaller, std::string_view document) {
    qx::Ref<qx::Error> error;
    const auto object = marshaller.readString(document, &error);
    EXPECT_FALSE(object && error) << "both an object and an error";
    return error ? show(error) : support::show(object);
}

// The object's root element, or the error.
inline std::string write(QXXMLMarshaller& marshaller, const qx::Value& object) {
    qx::Ref<qx::Error> error;
    const auto element = marshaller.marshallObject(object, &error);
    EXPECT_FALSE(element && error) << "both an element and an error";
    return error ? show(error) : element ? element->XMLString().str() : "null";
}

} // namespace scenario
