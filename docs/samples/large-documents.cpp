// The samples of docs/large-documents.md, between "// sample: NAME" and "// end of sample", and
// what the page says of them. tests/docs/SamplesTest.cpp compares them with the page.

#include "support/Scenario.h"
#include "support/TemporaryFolder.h"

#include <QXXMLMarshalling/model/Class.h>

namespace {

struct Reading {
    std::string meter;
    int watts = 0;
};

struct Bar {
    std::uint64_t shown = 0;
    void show(std::uint64_t percent) { shown = percent; }
};

TEST(LargeDocumentsPage, EachReadingIsHandedOver) {
    qx::Class::define<Reading>("LargeDocuments.Reading")
        .members<&Reading::meter, &Reading::watts>();
    const TemporaryFolder folder;
    const qx::String path =
        folder.write("readings.xml",
                     "<house>" + scenario::repeated("<reading>7</reading>", 100'000) + "</house>");
    const auto marshaller = scenario::marshaller(
        "<LargeDocuments.Reading xml='reading'><watts node='text'/></LargeDocuments.Reading>");
    int total = 0;
    Bar bar;
    const bool isCancelled = false;
    // sample: progress
    marshaller->setProgressHandler([&](const QXXMLMarshaller::Progress& progress) {
        if (progress.size != 0)
            bar.show(progress.bytesRead * 100 / progress.size);
        return !isCancelled;
    });
    // end of sample
    // sample: each
    qx::Ref<qx::Error> error;
    marshaller->unmarshallEach<Reading>(
        path, "reading", [&](Reading reading) { total += reading.watts; }, &error);
    // end of sample
    EXPECT_FALSE(error);
    EXPECT_EQ(total, 700'000);
    int left = 3;
    const auto nextReading = [&] { return Reading{"m", left--}; };
    // sample: write
    marshaller->marshallEach(
        path, "readings",
        [&]() -> std::optional<Reading> {
            if (left == 0)
                return std::nullopt;
            return nextReading();
        },
        &error);
    // end of sample
    EXPECT_FALSE(error);
    EXPECT_EQ(folder.read("readings.xml"), "<?xml version=\"1.0\" encoding=\"UTF-8\"?>\n"
                                           "<readings>\n"
                                           "    <reading>3</reading>\n"
                                           "    <reading>2</reading>\n"
                                           "    <reading>1</reading>\n"
                                           "</readings>\n");
    EXPECT_GE(bar.shown, 50U);
}

} // namespace
