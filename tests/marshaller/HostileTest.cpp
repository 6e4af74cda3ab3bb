// Mappings and documents that multiply: a reading makes, keeps and goes over as much as its limits
// say, and ends in an error beyond, whatever made it.

#include "support/Scenario.h"

#include <QXXMLMarshalling/QXGenericRecord.h>

#include <ctime>

namespace {

using qx::Ref;

std::string field(std::string_view name, std::string_view attributes, std::string_view binding) {
    return "<field name='" + std::string(name) + "' " + std::string(attributes) + "><bind-xml " +
           std::string(binding) + "/></field>";
}

std::string nested(int depth, const std::string& innermost = "") {
    std::string xml;
    for (int i = 0; i < depth; ++i)
        xml += "<a>";
    xml += innermost;
    for (int i = 0; i < depth; ++i)
        xml += "</a>";
    return xml;
}

std::string repeated(std::string_view text, int times) {
    std::string all;
    for (int i = 0; i < times; ++i)
        all += text;
    return all;
}

// Each level of elements is read twice.
std::string twice(const std::string& fields = "") {
    return "<class name='A'>" + field("x", "", "name='a' node='element'") +
           field("y", "", "name='a' node='element'") + fields + "</class>";
}

std::string flattenedTwice() {
    std::string mapping;
    for (int i = 0; i < 30; ++i) {
        const std::string next = "type='C" + std::to_string(i + 1) + "' container='false'";
        mapping += "<class name='C" + std::to_string(i) + "'>" +
                   field("a", next, "node='element'") + field("b", next, "node='element'") +
                   "</class>";
    }
    return mapping + "<class name='C30'/>";
}

// Each ancestor makes a private copy of its own.
std::string flattenedByAncestors() {
    std::string mapping;
    for (int i = 0; i < 500; ++i)
        mapping += "<class name='C" + std::to_string(i) + "' extends='C" + std::to_string(i + 1) +
                   "'>" + field("x", "container='false'", "node='attribute'") + "</class>";
    return mapping + "<class name='C500'/>";
}

} // namespace

TEST(Hostile, ReadingsThatMultiplyEndInAnError) {
    const struct {
        const char* question;
        std::string mapping, document;
        unsigned options;
        const char* expected;
    } cases[] = {
        {"two fields of one child", twice(), nested(20), scenario::usual,
         "-224: Reading makes more objects than the limit of 10320: A (Invalid Mapping)"},
        {"two collections of all children",
         "<class name='A'>" + field("x", "collection='array'", "") +
             field("y", "collection='array'", "") + "</class>",
         nested(250), scenario::discard,
         "-224: Reading makes more objects than the limit of 14000: A (Invalid Mapping)"},
        {"classes flattened into one another", flattenedTwice(), "<c0/>", scenario::usual,
         "-224: Reading makes more objects than the limit of 10016: C29 (Invalid Mapping)"},
        {"many unknown children", twice(), nested(14, repeated("<b/>", 2000)), scenario::usual,
         "-224: Reading keeps more nodes than the limit of 138896: a (Invalid Mapping)"},
        {"copies of copies",
         "<class name='A'>" + field("x", "type='Flat' container='false'", "node='element'") +
             field("y", "", "name='a' node='element'") + "</class><class name='Flat'/>",
         nested(120, repeated("<b/>", 2000)), scenario::usual,
         "-224: Reading keeps more nodes than the limit of 145680: a (Invalid Mapping)"},
        {"many children that nobody wants", twice(), nested(20, repeated("<b/>", 2000)),
         scenario::discard,
         "-224: Reading goes over more nodes than the limit of 806400: a (Invalid Mapping)"},
        {"copies for every ancestor", flattenedByAncestors(),
         "<c0>" + repeated("<b/>", 2000) + "</c0>", scenario::discard,
         "-224: Reading goes over more nodes than the limit of 800320: c0 (Invalid Mapping)"},
        {"text that is put together", twice(field("t", "", "node='text'")),
         nested(20, repeated("<b><c/>some text</b>", 2000)), scenario::discard,
         "-224: Reading goes over more nodes than the limit of 1646400: a (Invalid Mapping)"},
    };
    for (const auto& [question, mapping, document, options, expected] : cases) {
        SCOPED_TRACE(question);
        const auto marshaller = scenario::marshaller(mapping, options);
        EXPECT_EQ(scenario::read(*marshaller, document), expected);
        EXPECT_FALSE(marshaller->readString(document)) << "half an object, without a slot";
    }
}

// Each field would refuse every child, again and again.
TEST(Hostile, ReadingsThatPassOverWhatIsRefusedEndSoon) {
    std::string fields;
    for (int i = 0; i < 1000; ++i)
        fields += field("x" + std::to_string(i), "collection='array'", "name='a'");
    const auto marshaller = scenario::marshaller("<class name='A'>" + fields + "</class>");
    marshaller->setMaximumDepth(1);
    const std::clock_t start = std::clock();
    EXPECT_FALSE(marshaller->readString(nested(1, repeated("<a/>", 100'000))));
    EXPECT_LT(std::clock() - start, 2 * CLOCKS_PER_SEC);
}

TEST(Hostile, SmallDocumentsPassHoweverTheyAreRead) {
    const std::string all = field("all", "collection='array'", "");
    const std::string flat = field("flat", "type='Flat' container='false'", "node='element'");
    const std::pair<std::string, int> cases[] = {
        {"<class name='A'>" + flat + all + "</class><class name='Flat'>" + all + "</class>", 10},
        {"<class name='A'>" + flat + all + "</class><class name='Flat'/>", 200},
        {"<class name='A'>" + all + flat + "</class><class name='Flat'/>", 200},
    };
    for (const auto& [mapping, depth] : cases) {
        const auto marshaller = scenario::marshaller(mapping);
        Ref<qx::Error> error;
        EXPECT_TRUE(marshaller->readString(nested(depth), &error)) << scenario::show(error);
    }
}

TEST(Hostile, AttributesThatManyObjectsKeepCountOnce) {
    std::string attributes;
    for (int i = 0; i < 20; ++i)
        attributes += " a" + std::to_string(i) + "=''";
    std::string fields;
    for (const char* name : {"u", "v", "w", "x", "y"})
        fields += field(name, "type='Flat' container='false'", "node='element'");
    const auto marshaller =
        scenario::marshaller("<class name='Flat'/><class name='A'>" + fields + "</class><class " +
                             "name='List'>" + field("all", "collection='array'", "") + "</class>");
    Ref<qx::Error> error;
    EXPECT_TRUE(marshaller->readString(
        "<list>" + repeated("<a" + attributes + "/>", 1000) + "</list>", &error))
        << scenario::show(error);
}

TEST(Hostile, LimitsAreTheHosts) {
    const auto marshaller = scenario::marshaller(twice());
    const std::string document = nested(4, "<b/>"); // 15 objects, 8 kept nodes, 5 elements
    const auto limit = [&](std::size_t base, std::size_t perElement, std::size_t kept) {
        marshaller->setMaximumObjects({.base = base, .perElement = perElement});
        marshaller->setMaximumKeptNodes({.base = 0, .perElement = kept});
        Ref<qx::Error> error;
        const auto object = marshaller->readString(document, &error);
        return object ? "read" : error->localizedDescription().str();
    };
    EXPECT_EQ(limit(15, 0, 2), "read");
    EXPECT_EQ(limit(14, 0, 2), "Reading makes more objects than the limit of 14: A");
    EXPECT_EQ(limit(0, 3, 2), "read");
    EXPECT_EQ(limit(4, 2, 2), "Reading makes more objects than the limit of 14: A");
    EXPECT_EQ(limit(15, 0, 1), "Reading keeps more nodes than the limit of 5: a");
    EXPECT_EQ(limit(SIZE_MAX, SIZE_MAX, SIZE_MAX), "read");
}
