// What a check says of mappings, and of documents under them, on pages.

#include "Told.h"

#include "support/Cases.h"
#include "support/Page.h"
#include "support/Texts.h"

#include <QXXMLMarshalling/QXXMLDataRepositoryManager.h>
#include <QXXMLMarshalling/QXXMLDocumentCheck.h>

#include <gtest/gtest.h>

namespace {

using qx::Ref;

Ref<QXXMLMarshallingMapping> resolved(const std::string& content) {
    const auto document = support::parsed("<mapping>\n" + content + "</mapping>");
    document->setDocumentName("map.xml");
    auto mapping =
        QXXMLMarshallingMapping::initWithDocument(document.get(), {.collectsFaults = true});
    QXXMLDataRepositoryManager::flushDefaultManager();
    return mapping;
}

const bool mappings = support::addCases(
    "tests/check/findings.md", {"mapping"}, {"findings"}, [](const auto& expected) {
        const auto mapping = resolved(expected.given.at("mapping"));
        EXPECT_EQ(told(mapping->check(), expected.options.contains("notes")), expected.text);
    });

// The path of a node that is asked for stands behind "why".
const bool documents = support::addCases(
    "tests/check/documents.md", {"mapping", "document"}, {"findings", "why"},
    [](const auto& expected) {
        const auto marshaller =
            QXXMLMarshaller::initWithMapping(resolved(expected.given.at("mapping")));
        marshaller->setSaveUnknownXML(!expected.options.contains("discard"));
        QXXMLDocumentCheck check(marshaller);
        Ref<qx::Error> error;
        ASSERT_TRUE(check.addData(expected.given.at("document"), "doc.xml", &error))
            << support::told(error);
        if (expected.kind == "findings") {
            EXPECT_EQ(told(check.findings(), true), expected.text);
            return;
        }
        for (const std::string& path : expected.options) {
            if (path.starts_with('/'))
                EXPECT_EQ(check.why(path).str() + "\n", expected.text);
        }
    });

} // namespace

// Most sections show what goes wrong, then a mapping that does without.
TEST(RoundTripPage, WhatItWarnsOfIsFoundAndWhatItAdvisesIsNot) {
    std::map<std::string, std::vector<std::string>> sections;
    for (const auto& block : support::blocksOf(QX_SOURCE_DIR "/docs/round-trip.md"))
        if (block.heading == "xml mapping")
            sections[block.section].push_back(told(resolved(block.text)->check(), true));
    std::size_t pairs = 0;
    for (const auto& [section, findings] : sections) {
        if (findings.size() != 2)
            continue;
        ++pairs;
        EXPECT_TRUE(findings[0].find("written") != std::string::npos ||
                    findings[0].find("lost") != std::string::npos)
            << section << '\n'
            << findings[0];
        EXPECT_EQ(findings[1].find("warning"), std::string::npos) << section << '\n' << findings[1];
    }
    EXPECT_GE(pairs, 8U);
}
