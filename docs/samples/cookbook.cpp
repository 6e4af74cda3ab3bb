// The samples of docs/cookbook.md, between "// sample: NAME" and "// end of sample", and what the
// page says of them. tests/docs/SamplesTest.cpp compares them with the page.

#include "support/Scenario.h"
#include "support/TemporaryFolder.h"

#include <QXXMLMarshalling/QXXMLMarshalling.h>

#include <algorithm>
#include <chrono>
#include <iostream>
#include <memory>
#include <numbers>

namespace {

// sample: trip
enum class Means { train, bicycle };

struct Stage {
    std::string from, to;
    Means means = Means::train;
    std::optional<double> climb; // metres, where they are known
};
struct Trip {
    std::string title;
    std::chrono::sys_days begins{};
    std::vector<Stage> stages;
    std::vector<std::string> tags;
    QXUnknownXML unknown;
};

void describeTrip() {
    qx::Class::define<Stage>("Stage")
        .members<&Stage::from, &Stage::to, &Stage::climb>()
        .member<&Stage::means>("by")
        .names({{Means::train, "train"}, {Means::bicycle, "bicycle"}});
    qx::Class::define<Trip>("Trip")
        .members<&Trip::title, &Trip::begins, &Trip::stages, &Trip::tags, &Trip::unknown>();
}
// end of sample

// sample: read
qx::Result<Trip> read(const std::string& path) {
    qx::Ref<qx::Error> error;
    const auto marshaller = QXXMLMarshaller::initWithMappingFile("trips.xml", &error);
    if (!marshaller)
        return error;
    return marshaller->readFile<Trip>(path);
}
// end of sample

// sample: change
bool addStage(QXXMLMarshaller& marshaller, const std::string& path) {
    auto trip = marshaller.readFile<Trip>(path);
    if (!trip) {
        std::cerr << trip.error()->localizedDescription().view() << '\n';
        return false;
    }
    trip->stages.push_back({.from = "Bath", .to = "Wells", .means = Means::bicycle, .climb = 0});
    return marshaller.writeFile(*trip, path);
}
// end of sample

// sample: unknown
bool hasPhoto(const Trip& trip) {
    const auto& children = trip.unknown.children();
    return children && children->get("photo") != nullptr;
}
// end of sample

// sample: shapes
struct Shape {
    virtual ~Shape() = default;
    virtual double area() const = 0;
};
struct Circle : Shape {
    double radius = 0;
    double area() const override { return std::numbers::pi * radius * radius; }
};
struct Square : Shape {
    double side = 0;
    double area() const override { return side * side; }
};
struct Drawing {
    std::vector<std::unique_ptr<Shape>> shapes;
};

void describeShapes() {
    qx::Class::define<Circle, Shape>("Circle").members<&Circle::radius>();
    qx::Class::define<Square, Shape>("Square").members<&Square::side>();
    qx::Class::define<Drawing>("Drawing").members<&Drawing::shapes>();
}
// end of sample

// sample: layout
qx::String compact(QXXMLMarshaller& marshaller, const Trip& trip) {
    return marshaller.writeString(trip, nullptr, qx::XMLCompactEmptyElements); // one line, <photo/>
}
// end of sample

// sample: objects
class Folder : public QXMappedObject {
public:
    std::string name;
    std::vector<qx::Ref<Folder>> folders;
    bool isOpen = false; // the program's own
};

void describeFolder() {
    qx::Class::define<Folder, QXMappedObject>("Folder").members<&Folder::name, &Folder::folders>();
}
// end of sample

// sample: reload
bool reload(QXXMLMarshaller& marshaller, const qx::Ref<Folder>& shown, const std::string& path) {
    qx::Ref<qx::Error> error;
    if (marshaller.readInto(shown, path, &error))
        return true;
    std::cerr << error->localizedDescription().view() << '\n';
    return false;
}
// end of sample

constexpr const char* mapping =
    "<Trip xml='trip'><title node='attribute'/><begins node='attribute'/>"
    "<tags type='string' collection='array' name='tag'/>"
    "<stages type='Stage' collection='array' name='stage'/></Trip>"
    "<Stage><from node='attribute'/><to node='attribute'/><by node='attribute'/>"
    "<climb node='attribute'/></Stage>"
    "<Folder xml='folder'><name node='attribute'/>"
    "<folders type='Folder' collection='array' name='folder'/></Folder>";

constexpr const char* document =
    R"(<trip title="Somerset" begins="2026-05-01" map="12"><tag>hills</tag><tag>rail</tag>)"
    R"(<stage from="London" to="Bath" by="train"></stage><photo></photo></trip>)";

class Cookbook : public testing::Test {
protected:
    Cookbook() : marshaller(scenario::marshaller(mapping)) {
        describeTrip();
        describeFolder();
    }
    void TearDown() override {
        for (const char* name : {"Trip", "Stage", "Folder"})
            qx::Class::forget(name);
    }
    const qx::Ref<QXXMLMarshaller> marshaller;
    const TemporaryFolder folder;
};

} // namespace

TEST_F(Cookbook, ReadsChangesAndWrites) {
    const std::string path = folder.write("trip.xml", document);
    EXPECT_FALSE(read(path)) << "there is no such mapping";
    EXPECT_TRUE(addStage(*marshaller, path));
    const auto trip = marshaller->readFile<Trip>(path);
    ASSERT_TRUE(trip);
    EXPECT_EQ(trip->tags, (std::vector<std::string>{"hills", "rail"}));
    EXPECT_EQ(trip->stages.at(1).climb, 0);
    EXPECT_TRUE(hasPhoto(*trip));
    EXPECT_FALSE(hasPhoto(Trip{}));
    EXPECT_EQ(marshaller->marshall(*trip)->rootElement()->XMLString(),
              R"(<trip title="Somerset" begins="2026-05-01" map="12"><tag>hills</tag>)"
              R"(<tag>rail</tag><stage from="London" to="Bath" by="train"></stage>)"
              R"(<stage from="Bath" to="Wells" by="bicycle" climb="0"></stage>)"
              R"(<photo></photo></trip>)");
}

TEST_F(Cookbook, RefusesWhatMembersDoNotTake) {
    const auto told = [&](const char* text) {
        return support::told(marshaller->readString<Trip>(text).error());
    };
    EXPECT_EQ(told("<trip><stage by='boat'/></trip>"),
              "-222: Unable to set value: boat for key: by in class: Stage (Invalid Value)");
    EXPECT_EQ(told("<trip begins='soon'/>"),
              "-222: Unable to set value: soon for key: begins in class: Trip (Invalid Value)");
    EXPECT_EQ(told("<folder/>"),
              "-211: The root is of class: Folder, not of class: Trip (Invalid Mapping)");
    EXPECT_EQ(told("<journey/>"),
              "-211: No definition to handle element: <journey></journey> (Invalid Mapping)");
}

TEST_F(Cookbook, HoldsShapesOfSeveralKinds) {
    describeShapes();
    const auto drawer = scenario::marshaller(
        "<Drawing xml='drawing'><shapes collection='array' name='shapes'/></Drawing>"
        "<Circle xml='circle'><radius node='attribute'/></Circle>"
        "<Square xml='square'><side node='attribute'/></Square>");
    const std::string text = "<drawing><shapes><square side=\"2\"></square><circle radius=\"1\">"
                             "</circle></shapes></drawing>";
    const auto drawing = drawer->readString<Drawing>(text);
    ASSERT_TRUE(drawing);
    EXPECT_EQ(drawing->shapes.at(0)->area(), 4);
    EXPECT_EQ(drawer->marshall(*drawing)->rootElement()->XMLString().str(), text);
    for (const char* name : {"Circle", "Square", "Drawing"})
        qx::Class::forget(name);
}

TEST_F(Cookbook, MatchesByNamespaceAndWritesOtherLayouts) {
    const auto trip = marshaller->readString<Trip>(document);
    EXPECT_NE(compact(*marshaller, *trip).view().find("map=\"12\"><tag>hills</tag>"),
              std::string_view::npos);
    EXPECT_NE(compact(*marshaller, *trip).view().find("<photo/></trip>"), std::string_view::npos);
    const auto reader = scenario::marshaller("<Feed xml='feed'><id node='element'/></Feed>");
    qx::Ref<qx::Error> error;
    // sample: prefixes
    reader->setNamespacePrefixes({{"http://www.w3.org/2005/Atom", ""}}, &error);
    // end of sample
    const qx::String text =
        "<a:feed xmlns:a=\"http://www.w3.org/2005/Atom\"><a:id>7</a:id></a:feed>";
    const auto feed = reader->readString(text);
    ASSERT_TRUE(feed);
    EXPECT_EQ(feed->valueForKey("id").string(), "7");
    EXPECT_EQ(reader->marshall(feed)->rootElement()->XMLString(), text);
}

TEST_F(Cookbook, ReadsIntoWhatIsThere) {
    const std::string path =
        folder.write("folders.xml", "<folder name='a'><folder name='b'/></folder>");
    const auto shown = marshaller->readFile<Folder>(path).value();
    const auto inner = shown->folders.at(0);
    inner->isOpen = true;
    std::string heard;
    const auto token = inner->observe(
        "name", [&](const qx::ValueChange& change) { heard += change.newValue.string().str(); });
    folder.write("folders.xml", "<folder><folder name='c'/><folder name='d'/></folder>");
    EXPECT_TRUE(reload(*marshaller, shown, path));
    EXPECT_EQ(shown->name, "");
    EXPECT_EQ(shown->folders.at(0), inner);
    EXPECT_TRUE(inner->isOpen);
    EXPECT_EQ(heard, "c");
    folder.write("folders.xml", "<folder name='e'");
    testing::internal::CaptureStderr();
    EXPECT_FALSE(reload(*marshaller, shown, path));
    EXPECT_NE(testing::internal::GetCapturedStderr(), "");
    EXPECT_EQ(shown->folders.size(), 2U);
}

TEST_F(Cookbook, ValuesAreUsedAsTheLanguageUsesThem) {
    qx::Class::forget("Trip");
    const auto trip = marshaller->readString(document).as<QXGenericRecord>();
    // sample: values
    auto title = trip["title"].get<std::string>();      // raises where it is no text
    auto length = trip["length"].tryGet<double>();      // none: no such key
    trip["title"] = "Somerset and Avon";                // observers hear of it
    auto tags = trip["tags"].get<qx::Ref<qx::Array>>(); // the list itself
    std::ranges::sort(*tags);
    for (const auto& [key, value] : *trip->contents())
        std::cout << key + ": " << value.description() << '\n';
    // end of sample
    EXPECT_EQ(title, "Somerset");
    EXPECT_EQ(length, std::nullopt);
    EXPECT_EQ(trip["title"].get<std::string>(), "Somerset and Avon");
    EXPECT_EQ(tags[0].get<std::string>(), "hills");
}

namespace {

// sample: plug-in
struct Photo {
    std::string file;
};

void usePhotos(QXXMLMarshaller& marshaller) {
    // In a plug-in this is a static object, and ends when the plug-in is unloaded.
    const qx::ClassRegistration photos =
        qx::Class::define<Photo>("Photo").members<&Photo::file>().registration();
    if (const auto photo = marshaller.readString<Photo>("<photo file='a.jpg'/>"))
        std::cout << photo->file << '\n';
}
// end of sample

} // namespace

TEST_F(Cookbook, ClassesMayComeAndGo) {
    const auto used = scenario::marshaller("<Photo xml='photo'><file node='attribute'/></Photo>");
    testing::internal::CaptureStdout();
    usePhotos(*used);
    EXPECT_EQ(testing::internal::GetCapturedStdout(), "a.jpg\n");
    EXPECT_TRUE(used->readString("<photo file='a.jpg'/>").as<QXGenericRecord>());
}
