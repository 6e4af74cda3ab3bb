// The samples of docs/errors.md, between "// sample: NAME" and "// end of sample", for what no
// document brings about alone. The report of each error stands on the page below its sample, in a
// block headed "report NAME".

#include "support/Page.h"
#include "support/Scenario.h"
#include "support/TemporaryFolder.h"

#include <QXXMLMarshalling/QXGenericRecord.h>
#include <QXXMLMarshalling/QXXMLDataRepositoryManager.h>
#include <QXXMLMarshalling/QXXMLDocumentFile.h>
#include <QXXMLMarshalling/model/Class.h>

namespace {

// sample: refused
struct Item {
    double price = 0;
};

void describeItem() { qx::Class::define<Item>("Item").members<&Item::price>(); }
// end of sample

const bool isDescribed = (describeItem(), true); // for as long as the program runs

class ErrorsPage : public testing::Test {
protected:
    // The error is the page's, but for the folder.
    void expectReport(const char* name) {
        ASSERT_TRUE(error) << name;
        std::string report = error->report().str() + "\n";
        const std::string path = folder.path("");
        for (std::size_t at; (at = report.find(path)) != std::string::npos;)
            report.erase(at, path.size());
        for (const auto& block : support::blocksOf(QX_SOURCE_DIR "/docs/errors.md"))
            if (block.heading == std::string("report ") + name) {
                EXPECT_EQ(block.text, report);
                return error.reset();
            }
        ADD_FAILURE() << name << " is not reported on the page:\n" << report;
    }

    const TemporaryFolder folder;
    const qx::Ref<QXXMLMarshaller> marshaller =
        scenario::marshaller("<Order xml='order'><number node='attribute'/><code name='number' "
                             "node='attribute'/><title node='element'/><part type='Order' "
                             "node='element'/><parts type='Order' collection='array' "
                             "name='p'/></Order>");
    qx::Ref<qx::Error> error;
};

TEST_F(ErrorsPage, ShowsWhatMappingsCannotDo) {
    const std::string path = folder.write(
        "order.map.xml", "<mapping>\n    <include href=\"lines.map.xml\"/>\n</mapping>\n");
    folder.write("lines.map.xml", "<mapping>\n    <include href=\"order.map.xml\"/>\n</mapping>\n");
    // sample: circle
    QXXMLMarshaller::initWithMappingFile(path, &error); // order.map.xml
    // end of sample
    QXXMLDataRepositoryManager::flushDefaultManager();
    QXXMLDataRepositoryManager::defaultManager(); // as it was before
    expectReport("circle");
    // sample: prefixes
    marshaller->setNamespacePrefixes({{"urn:orders", "o:"}}, &error);
    // end of sample
    expectReport("prefixes");
}

TEST_F(ErrorsPage, ShowsWhatAProgramLimitsOrRefuses) {
    const auto items = scenario::marshaller("<Item xml='item'><price node='attribute'/></Item>");
    // sample: item
    items->readString("<item price=\"twelve\"/>", &error);
    // end of sample
    expectReport("item");
    // sample: depth
    marshaller->setMaximumDepth(2);
    marshaller->readString("<order><part><part/></part></order>", &error);
    // end of sample
    expectReport("depth");
    marshaller->setMaximumDepth(256);
    // sample: objects
    marshaller->setMaximumObjects({1, 0});
    marshaller->readString("<order><part/></order>", &error);
    // end of sample
    expectReport("objects");
    marshaller->setMaximumObjects({1'000, 16});
    const std::string large =
        "<order>" + support::repeated("\n<p/>" + std::string(1'000, ' '), 3'000) + "</order>";
    // sample: cancelled
    marshaller->setProgressHandler([](const QXXMLMarshaller::Progress&) { return false; });
    marshaller->readString(large, &error); // of some megabytes
    // end of sample
    expectReport("cancelled");
}

TEST_F(ErrorsPage, ShowsWhatCannotBeSaved) {
    const std::string text = "<order number=\"7\">\n<title>Pens</title>\n</order>\n";
    const std::string path = folder.write("order.xml", text);
    // sample: unsaved
    const char* xml = "<!DOCTYPE order [<!ATTLIST order number CDATA \"7\">]><order/>";
    const auto order = marshaller->readString(xml);
    order->setValueForKey(nullptr, "number"); // which would be 7 again
    const auto update = QXXMLUpdate::updatedText(*marshaller, xml, order);
    // end of sample
    error = update.error();
    expectReport("unsaved");
    const auto encoded = QXXMLUpdate::updatedText(
        *marshaller, "<?xml version='1.0' encoding='ISO-2022-JP'?><order>\33(B</order>", order);
    error = encoded.error();
    expectReport("encoding");
    const auto file = QXXMLDocumentFile::open(path, marshaller, &error);
    file->root()->setValueForKey("Ink", "title");
    folder.write("order.xml", "<order number=\"7\">\n<title>Paper</title>\n</order>\n");
    // sample: changed
    file->save(&error);
    // end of sample
    expectReport("changed");
    // sample: both
    file->save(&error, QXXMLDocumentFile::Changed::carryOver);
    // end of sample
    expectReport("both");
}

} // namespace
