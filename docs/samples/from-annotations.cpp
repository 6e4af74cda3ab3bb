// The sample of docs/from-annotations.md, and that it fits the mapping there.
// tests/docs/SamplesTest.cpp compares it with the page.

#include "support/Page.h"

#include <QXXMLMarshalling/QXXMLMarshaller.h>
#include <QXXMLMarshalling/model/Class.h>

#include <gtest/gtest.h>

namespace {

// sample: track
struct Point {
    double lat = 0, lon = 0;
};
struct Track {
    std::string id, title;
    std::vector<Point> points;
};

void describeTracks() {
    qx::Class::define<Point>("Point").members<&Point::lat, &Point::lon>();
    qx::Class::define<Track>("Track").members<&Track::id, &Track::title, &Track::points>();
}
// end of sample

} // namespace

TEST(FromAnnotationsPage, TheClassFitsTheMapping) {
    describeTracks();
    const auto blocks = support::blocksOf(QX_SOURCE_DIR "/docs/from-annotations.md");
    const auto mapping = qx::XMLDocument::initWithData(std::string_view(blocks.front().text));
    const auto marshaller = QXXMLMarshaller::initWithMappingXML(mapping.get());
    const std::string text =
        "<trk xmlns=\"urn:example:tracks\" id=\"7\"><name>Ridge</name><segment>"
        "<pt lat=\"47.5\" lon=\"11\"/></segment></trk>";
    const auto track = marshaller->readString<Track>(text);
    ASSERT_TRUE(track);
    EXPECT_EQ(track->title, "Ridge");
    EXPECT_EQ(track->points.at(0).lat, 47.5);
    EXPECT_NE(
        marshaller->writeString(*track, nullptr, qx::XMLCompactEmptyElements).view().find(text),
        std::string::npos);
}
