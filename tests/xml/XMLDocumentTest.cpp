#include <QXXMLMarshalling/xml/XMLDocument.h>

#include <gtest/gtest.h>
#include <sstream>

#include "support/TemporaryFolder.h"

namespace {

using qx::Ref;
using qx::XMLDocument;

TEST(XMLDocument, IsReadFromAFileByPathAndByURL) {
    const TemporaryFolder files;
    const std::string path = files.write("a b.xml", "<a>\n<b/></a>");
    const std::string URL = "file://" + files.root() + "/a%20b.xml";
    EXPECT_EQ(XMLDocument::initWithContentsOfFile(path)->XMLString(), "<a><b></b></a>");
    EXPECT_EQ(XMLDocument::initWithContentsOfURL(path)->XMLString(), "<a><b></b></a>");
    EXPECT_EQ(XMLDocument::initWithContentsOfURL(URL)->XMLString(), "<a><b></b></a>");
}

TEST(XMLDocument, WhatCannotBeReadIsAnError) {
    const TemporaryFolder files;
    const std::pair<std::string, int> cases[] = {
        {files.path("missing.xml"), 260}, {files.root(), 256}, {"http://localhost/a.xml", 256}};
    for (const auto& [URL, code] : cases) {
        Ref<qx::Error> error;
        EXPECT_FALSE(XMLDocument::initWithContentsOfURL(URL, {}, &error)) << URL;
        EXPECT_EQ(error->domain(), qx::Error::cocoaDomain) << URL;
        EXPECT_EQ(error->code(), code) << URL;
        EXPECT_FALSE(XMLDocument::initWithContentsOfURL(URL)) << URL;
    }
    EXPECT_FALSE(XMLDocument::initWithData("<a"));
}

TEST(XMLDocument, GoesThroughStreams) {
    std::stringstream stream("<?xml version=\"1.0\" encoding=\"ISO-8859-1\"?><a>\xE9</a>");
    const auto document = XMLDocument::initWithStream(stream);
    ASSERT_TRUE(document);
    EXPECT_EQ(document->version(), "1.0");
    EXPECT_EQ(document->characterEncoding(), "ISO-8859-1");
    EXPECT_TRUE(document->standalone().isNull());
    std::ostringstream output;
    EXPECT_TRUE(document->writeToStream(output));
    EXPECT_EQ(output.str(), stream.str());
    Ref<qx::Error> error;
    output.setstate(std::ios::badbit);
    EXPECT_FALSE(document->writeToStream(output, qx::XMLNoOptions, &error));
    EXPECT_EQ(error->code(), 512);
    stream.setstate(std::ios::badbit);
    EXPECT_FALSE(XMLDocument::initWithStream(stream, {}, &error));
    EXPECT_EQ(error->code(), 256);
}

TEST(XMLDocument, IsWrittenWhollyOrNotAtAll) {
    const TemporaryFolder files;
    const std::string path = files.write("a.xml", "<old/>");
    const auto document = XMLDocument::initWithData("<a><b/></a>");
    EXPECT_TRUE(document->writeToFile(path, qx::XMLCompactEmptyElements));
    EXPECT_EQ(files.read("a.xml"), "<a><b/></a>");
    Ref<qx::Error> error;
    EXPECT_FALSE(document->writeToFile(files.path("no/such/a.xml"), qx::XMLNoOptions, &error));
    EXPECT_EQ(error->domain(), qx::Error::cocoaDomain);
    document->rootElement()->setStringValue("\x01");
    EXPECT_ANY_THROW(document->writeToFile(path));
    EXPECT_ANY_THROW(XMLDocument::initWithRootElement(nullptr)->XMLData());
    EXPECT_EQ(files.read("a.xml"), "<a><b/></a>");
    EXPECT_EQ(files.list(""), "a.xml ");
}

} // namespace
