// Documents in other people's hands, edited under the mappings of the examples: nothing but the
// edit changes, and what is read again is what was saved.

#include <QXXMLMarshalling/QXXMLDocumentFile.h>

#include "../examples/atom/Feed.h"
#include "../examples/gpx/Gpx.h"
#include "../examples/maven/Project.h"
#include "../examples/settings/Settings.h"
#include "support/TemporaryFolder.h"
#include "support/Texts.h"

namespace {

std::string inUTF16(std::string_view text) {
    std::string bytes = "\xFF\xFE";
    for (const char c : text)
        bytes.append({c, '\0'});
    return bytes;
}

// The text with other characters for one of its own, wherever that stands.
std::string with(std::string_view text, char placeholder, std::string_view instead) {
    std::string filled;
    for (const char c : text)
        filled += c == placeholder ? instead : std::string_view(&c, 1);
    return filled;
}

std::string withCRLF(std::string_view text) { return with(text, '\n', "\r\n"); }

struct Formats : testing::Test {
    void TearDown() override {
        for (const char* name :
             {"Circle",   "Dependency", "Entry",      "Feed",    "Gpx",        "Gradient",
              "Group",    "Link",       "Management", "Model",   "Parent",     "Path",
              "Plain",    "Point",      "Profile",    "Project", "Properties", "Shape",
              "Settings", "Rectangle",  "Text",       "Track"})
            qx::Class::forget(name);
    }
    void use(const std::string& example, void (*describeClasses)()) {
        describeClasses();
        marshaller = QXXMLMarshaller::initWithMappingFile(QX_SOURCE_DIR "/examples/" + example +
                                                          "/mapping.xml");
        marshaller->setReportHandler([](const QXXMLReport&) {});
    }
    qx::Ref<QXXMLDocumentFile> open() {
        qx::Ref<qx::Error> error;
        auto file = QXXMLDocumentFile::open(folder.path("document"), marshaller, &error);
        EXPECT_TRUE(file) << error->description().view();
        return file;
    }
    // The edit makes the text "to" of "from", which the document holds once.
    template <class T>
    void expectEdit(const std::string& document, const std::function<void(T&)>& edit,
                    const std::string& from, const std::string& to) {
        folder.write("document", document);
        const auto file = open();
        edit(*file->template root<T>());
        expectSaved(*file, document, from, to);
        const auto again = open();
        EXPECT_EQ(marshaller->writeString(again->root()), marshaller->writeString(file->root()));
    }
    void expectSaved(QXXMLDocumentFile& file, std::string document, const std::string& from,
                     const std::string& to) {
        const std::size_t place = document.find(from);
        ASSERT_TRUE(place != std::string::npos && document.find(from, place + 1) == document.npos)
            << from;
        qx::Ref<qx::Error> error;
        EXPECT_TRUE(file.save(&error)) << error->description().view();
        EXPECT_EQ(folder.read("document"), document.replace(place, from.size(), to));
        EXPECT_FALSE(file.isEdited());
    }

    TemporaryFolder folder;
    qx::Ref<QXXMLMarshaller> marshaller;
};

TEST_F(Formats, TracksOfOtherDevicesKeepTheirExtensions) {
    using namespace gpx;
    use("gpx", describeClasses);
    const std::string track =
        "<?xml version='1.0' standalone='no'?>\n"
        "<gpx version='1.1' creator='a watch' xmlns='http://www.topografix.com/GPX/1/1'\n"
        "\txmlns:heart='urn:example:heart'><!-- raw -->\n"
        "\t<metadata><time>2026-01-01T00:00:00Z</time></metadata>\n"
        "\t<wpt lat='+51.50' lon='-0.10'><name><![CDATA[A & B]]></name><sym>Flag</sym></wpt>\n"
        "\t<trk><name>Out</name><type>run</type>\n"
        "\t\t<trkseg><trkpt lat='51.5' lon='-0.1'/>\n"
        "\t\t\t<trkpt lon='-0.2' lat='51.500'><ele>7.0</ele><fix>2d</fix>\n"
        "\t\t\t\t<extensions><heart:rate unit='bpm'>141</heart:rate></extensions></trkpt>\n"
        "\t\t</trkseg>\n"
        "\t\t<trkseg/>\n"
        "\t\t<trkseg><trkpt lat='51.6' lon='-0.3'><ele>12.50</ele></trkpt></trkseg>\n"
        "\t</trk>\n"
        "</gpx>\n";
    const auto& expectTrack = [&](auto edit, const char* from, const char* to) {
        expectEdit<Gpx>(track, edit, from, to);
        expectEdit<Gpx>("\xEF\xBB\xBF" + withCRLF(track), edit, withCRLF(from), withCRLF(to));
        expectEdit<Gpx>(inUTF16(track), edit, inUTF16(from).substr(2), inUTF16(to).substr(2));
    };
    expectTrack([](Gpx& gpx) { EXPECT_TRUE(rename(gpx, "A & B", "A < B")); }, "A & B", "A < B");
    expectTrack([](Gpx& gpx) { EXPECT_TRUE(rename(gpx, "Out", "Back & out")); }, ">Out<",
                ">Back &amp; out<");
    expectTrack([](Gpx& gpx) { gpx.tracks[0].segments[2].points[0].elevation = 13; }, "12.50",
                "13");
    expectTrack([](Gpx& gpx) { gpx.tracks[0].segments[0].points[1].fix = Fix::full; }, "2d", "3d");
    expectTrack(
        [](Gpx& gpx) {
            gpx.tracks[0].segments[0].points.erase(gpx.tracks[0].segments[0].points.begin());
        },
        "<trkpt lat='51.5' lon='-0.1'/>", "");
    expectTrack([](Gpx& gpx) { gpx.waypoints.emplace_back().lon = 2; }, "</wpt>\n",
                "</wpt>\n\t<wpt lat='0' lon='2'/>\n");
}

TEST_F(Formats, AWalkIsWrittenAnewAsItWas) {
    use("gpx", gpx::describeClasses);
    const std::string path = QX_SOURCE_DIR "/examples/gpx/walk.gpx";
    std::ostringstream text;
    text << std::ifstream(path).rdbuf();
    EXPECT_EQ(marshaller->writeString(*marshaller->readFile<gpx::Gpx>(path)).str(), text.str());
}

TEST_F(Formats, FeedsAreKnownByNamespaceAndKeepTheirMarkup) {
    using namespace atom;
    use("atom", describeClasses);
    ASSERT_TRUE(marshaller->setMatchesNamespaces(true));
    const std::string document =
        "<@feed xmlns%=\"http://www.w3.org/2005/Atom\" xmlns:m=\"urn:example:media\">\n"
        "  <@title>All</@title><@id>f</@id>\n"
        "  <m:title>Not this one</m:title>\n"
        "  <@entry xml:base='/e'>\n"
        "    <@title type='html'><![CDATA[Tea <i>& toast]]></@title><@id>e1</@id>\n"
        "    <@link href='/1'/>\n"
        "    <@content type='xhtml'><div xmlns='http://www.w3.org/1999/xhtml'>One <b>two</b>\n"
        "three<title>Four</title></div></@content>\n"
        "  </@entry>\n"
        "  <x:entry xmlns:x='urn:example:other'><x:id>e1</x:id></x:entry>\n"
        "  <@entry><@id>e2</@id><@updated>2026-05-02T18:30:00.50+01:00</@updated>\n"
        "    <@title type='xhtml'>\n"
        "      <div xmlns='http://www.w3.org/1999/xhtml'>A <em>b</em> c</div></@title></@entry>\n"
        "</@feed>";
    for (const std::string prefix : {"", "a:"}) {
        const std::string feed = with(with(document, '@', prefix), '%', prefix.empty() ? "" : ":a");
        const std::string link = "<" + prefix + "link href='/";
        expectEdit<Feed>(
            feed, [](Feed& edited) { titleOf(edited, "e1")->text = "Tea & <b>cake"; }, "<i>& toast",
            "& <b>cake");
        expectEdit<Feed>(
            feed, [](Feed& edited) { titleOf(edited, "f")->text = "Some"; }, "All", "Some");
        expectEdit<Feed>(
            feed, [](Feed& edited) { edited.entries[0].links.emplace_back().href = "/2"; },
            link + "1'/>\n", link + "1'/>\n    " + link + "2'/>\n");
        expectEdit<Feed>(
            feed, [](Feed& edited) { edited.entries[1].updated = qx::DateTime(); },
            "2026-05-02T18:30:00.50+01:00", "1970-01-01T00:00:00");
    }
}

TEST_F(Formats, ProjectsKeepTheirComments) {
    using namespace maven;
    use("maven", describeClasses);
    const std::string old =
        "<project>\n"
        "  <artifactId>mill</artifactId>   <!-- since 2004 -->\n"
        "  <modules><!-- in order -->\n"
        "    <module>wheel</module>\n"
        "    <module>stone</module> <!-- last -->\n"
        "  </modules>\n"
        "  <properties><grain>1.1</grain><odd.name>x</odd.name></properties>\n"
        "  <dependencyManagement><dependencies>\n"
        "    <dependency><artifactId>oats</artifactId><version>${grain}</version></dependency>\n"
        "    <dependency><artifactId>rye</artifactId><version>\n"
        "      0.3 </version><optional/></dependency>\n"
        "  </dependencies></dependencyManagement>\n"
        "  <profiles><profile><id>wind</id><activation><jdk>17</jdk></activation>\n"
        "    <properties><sail>4</sail></properties>\n"
        "    <dependencies><dependency><artifactId>cloth</artifactId><version>${sail}</version>\n"
        "      </dependency></dependencies></profile></profiles>\n"
        "</project>\n";
    const auto& set = [](const char* artifact) {
        return [artifact](Project& project) { EXPECT_TRUE(setVersion(project, artifact, "9")); };
    };
    for (const std::string end : {"\n", "\r\n"}) {
        const std::string pom = end == "\n" ? old : withCRLF(old);
        expectEdit<Project>(pom, set("mill"), "since 2004 -->" + end,
                            "since 2004 -->" + end + "  <version>9</version>" + end);
        expectEdit<Project>(pom, set("oats"), "1.1", "9");
        expectEdit<Project>(pom, set("rye"), end + "      0.3 ", "9");
        expectEdit<Project>(pom, set("cloth"), ">4<", ">9<");
        expectEdit<Project>(
            pom,
            [](Project& project) { project.modules.insert(project.modules.begin() + 1, "axle"); },
            "wheel</module>", "wheel</module>" + end + "    <module>axle</module>");
        expectEdit<Project>(
            pom, [](Project& project) { project.modules.erase(project.modules.begin()); },
            "    <module>wheel</module>" + end, "");
    }
}

TEST_F(Formats, ShapesOfSeveralClassesShareAPalette) {
    using namespace settings;
    use("settings", describeClasses);
    const std::string star = "\t\t<star name=\"none\" rays=\"5\"/>\n";
    const std::string door =
        "\t\t<rectangle width=\"2\" height=\"3\" name=\"door\" corner=\"0\"/>\n";
    const std::string group =
        "\t\t<group name=\"g\"><shapes><circle name=\"in\" r=\"4\"/></shapes></group>\n";
    const std::string document =
        "<?xml version='1.0' encoding='ISO-8859-1'?>\n"
        "<settings grid=\"1e1\">\n"
        "\t<palette>\n"
        "\t\t<circle r=\"1.50\" name=\"caf\xE9\"><plain>red</plain></circle> <!-- as on page 1 "
        "-->\n" +
        star + door + group +
        "\t\t<path name=\"p\"><to x=\"0\" y=\"0\"/><to x=\"0\" y=\"-1\"/></path>\n"
        "\t</palette>\n"
        "</settings>\n";
    const auto& scale = [](const char* name) {
        return [name](Settings& settings) { shapeNamed(settings.palette, name)->scale(3); };
    };
    expectEdit<Settings>(document, scale("caf\xC3\xA9"), "1.50", "4.5");
    expectEdit<Settings>(document, scale("in"), "\"4\"", "\"12\"");
    expectEdit<Settings>(document, scale("door"), "width=\"2\" height=\"3\"",
                         "width=\"6\" height=\"9\"");
    expectEdit<Settings>(document, scale("p"), "\"-1\"", "\"-3\"");
    expectEdit<Settings>(
        document,
        [](Settings& settings) {
            settings.palette[0]->fill = Gradient{"a", "b", {}};
        },
        "<plain>red</plain>", "<gradient from=\"a\" to=\"b\"/>");
    expectEdit<Settings>(
        document,
        [](Settings& settings) {
            auto gate = std::make_unique<Rectangle>();
            gate->name = "gate \xE2\x82\xAC";
            gate->width = 1;
            settings.palette.insert(settings.palette.begin() + 2, std::move(gate));
        },
        "corner=\"0\"/>\n",
        "corner=\"0\"/>\n\t\t<rectangle name=\"gate &#8364;\" width=\"1\" height=\"0\"/>\n");
    expectEdit<Settings>(
        document, [](Settings& settings) { std::swap(settings.palette[1], settings.palette[2]); },
        star + door + group, star + group + door);
    ;
}

} // namespace
