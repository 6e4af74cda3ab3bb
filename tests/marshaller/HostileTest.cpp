// Mappings and documents that multiply: a reading makes, keeps and goes over as much as its limits
// say, and ends in an error beyond, whatever made it.

#include "support/Scenario.h"

#include <QXXMLMarshalling/QXGenericRecord.h>

#include <ctime>

namespace {

using qx::Ref;

using scenario::nested;
using scenario::repeated;

// Each level of elements is read twice.
std::string twice(const std::string& fields = "") {
    return "<A><x name='a' node='element'/><y name='a' node='element'/>" + fields + "</A>";
}

std::string flattenedTwice() {
    std::string mapping;
    for (int i = 0; i < 30; ++i) {
        const std::string name = "C" + std::to_string(i);
        const std::string next =
            " type='C" + std::to_string(i + 1) + "' container='false' node='element'/>";
        mapping += "<" + name + "><a" + next + "<b" + next + "</" + name + ">";
    }
    return mapping + "<C30/>";
}

// Each ancestor makes a private copy of its own.
std::string flattenedByAncestors() {
    std::string mapping;
    for (int i = 0; i < 500; ++i) {
        const std::string name = "C" + std::to_string(i);
        mapping += "<" + name + " extends='C" + std::to_string(i + 1) +
                   "'><x container='false' node='attribute'/></" + name + ">";
    }
    return mapping + "<C500/>";
}

} // namespace

TEST(Hostile, ReadingsThatMultiplyEndInAnError) {
    using scenario::discard, scenario::usual;
    const struct {
        const char* question;
        std::string mapping, document;
        unsigned options;
        const char* expected;
    } cases[] = {
        {"two fields of one child", twice(), nested("a", 20), usual,
         "makes more objects than the limit of 10320: A"},
        {"two collections of all children", "<A><x collection='array'/><y collection='array'/></A>",
         nested("a", 250), discard, "makes more objects than the limit of 14000: A"},
        {"classes flattened into one another", flattenedTwice(), "<c0/>", usual,
         "makes more objects than the limit of 10016: C29"},
        {"many unknown children", twice(), nested("a", 14, repeated("<b/>", 2000)), usual,
         "keeps more nodes than the limit of 138896: a"},
        {"many children that nobody wants", twice(), nested("a", 20, repeated("<b/>", 2000)),
         discard, "goes over more nodes than the limit of 806400: a"},
        {"copies for every ancestor", flattenedByAncestors(),
         nested("c0", 1, repeated("<b/>", 2000)), discard,
         "goes over more nodes than the limit of 800320: c0"},
        {"text that is put together", twice("<t node='text'/>"),
         nested("a", 20, repeated("<b><c/>some text</b>", 2000)), discard,
         "goes over more nodes than the limit of 1646400: a"},
    };
    for (const auto& [question, mapping, document, options, expected] : cases) {
        SCOPED_TRACE(question);
        const auto marshaller = scenario::marshaller(mapping, options);
        EXPECT_EQ(scenario::read(*marshaller, document),
                  "-224: Reading " + std::string(expected) + " (Invalid Mapping)");
        EXPECT_FALSE(marshaller->readString(document)) << "half an object, without a slot";
    }
}

// Each field would refuse every child, again and again.
TEST(Hostile, ReadingsThatPassOverWhatIsRefusedEndSoon) {
    std::string fields;
    for (int i = 0; i < 1000; ++i)
        fields += "<x" + std::to_string(i) + " collection='array' name='a'/>";
    const auto marshaller = scenario::marshaller("<A>" + fields + "</A>");
    marshaller->setMaximumDepth(1);
    const std::clock_t start = std::clock();
    EXPECT_FALSE(marshaller->readString(nested("a", 1, repeated("<a/>", 100'000))));
    EXPECT_LT(std::clock() - start, 2 * CLOCKS_PER_SEC);
}

TEST(Hostile, SmallDocumentsPassHoweverTheyAreRead) {
    const std::string all = "<all collection='array'/>";
    const std::string flat = "<flat type='Flat' container='false' node='element'/>";
    const std::pair<std::string, int> cases[] = {
        {"<A>" + flat + all + "</A><Flat>" + all + "</Flat>", 10},
        {"<A>" + flat + all + "</A><Flat/>", 200},
        {"<A>" + all + flat + "</A><Flat/>", 200},
    };
    for (const auto& [mapping, depth] : cases) {
        const auto marshaller = scenario::marshaller(mapping);
        Ref<qx::Error> error;
        EXPECT_TRUE(marshaller->readString(nested("a", depth), &error)) << scenario::told(error);
    }
}

// At each level twice as many objects have it.
TEST(Hostile, ALongTextStandsOnceHoweverManyObjectsReadIt) {
    const auto marshaller = scenario::marshaller(
        "<A xml='a'><x name='a' node='element'/><y name='a' node='element'/><t node='text'/>"
        "<v name='v' node='attribute'/></A>");
    const std::string text(1000, 't');
    const auto object = marshaller->readString("<a><a v='" + text + "'>" + text + "<b/></a></a>");
    ASSERT_TRUE(object);
    for (const char* key : {"t", "v"})
        EXPECT_TRUE(object->valueForKeyPath(std::string("x.") + key)
                        .string()
                        .isSameAs(object->valueForKeyPath(std::string("y.") + key).string()))
            << key;
}

TEST(Hostile, AttributesThatManyObjectsKeepCountOnce) {
    std::string attributes;
    for (int i = 0; i < 20; ++i)
        attributes += " a" + std::to_string(i) + "=''";
    std::string fields;
    for (const char* name : {"u", "v", "w", "x", "y"})
        fields += "<" + std::string(name) + " type='Flat' container='false' node='element'/>";
    const auto marshaller =
        scenario::marshaller("<Flat/><A>" + fields + "</A><List><all collection='array'/></List>");
    Ref<qx::Error> error;
    EXPECT_TRUE(
        marshaller->readString(nested("list", 1, repeated("<a" + attributes + "/>", 1000)), &error))
        << scenario::told(error);
}

TEST(Hostile, VeryManyDeclarationsAreKeptInLinearTime) {
    const auto element = qx::XMLElement::initWithName("a");
    for (int i = 0; i < 60'000; ++i)
        element->addNamespace(qx::XMLNode::namespaceWithName("p" + std::to_string(i), "u"));
    const auto marshaller = scenario::marshaller("<A/>");
    marshaller->setMaximumKeptNodes({.base = SIZE_MAX, .perElement = 0});
    const std::clock_t start = std::clock();
    EXPECT_TRUE(marshaller->unmarshallElement(element.get()));
    EXPECT_LT(std::clock() - start, 2 * CLOCKS_PER_SEC);
}

TEST(Hostile, LimitsAreTheHosts) {
    const auto marshaller = scenario::marshaller(twice());
    const std::string document = nested("a", 4, "<b/>"); // 15 objects, 8 kept nodes, 5 elements
    const auto limit = [&](std::size_t base, std::size_t perElement, std::size_t kept) {
        marshaller->setMaximumObjects({.base = base, .perElement = perElement});
        marshaller->setMaximumKeptNodes({.base = 0, .perElement = kept});
        Ref<qx::Error> error;
        const auto object = marshaller->readString(document, &error);
        return object ? "read" : error->localizedDescription().str();
    };
    const std::string tooManyObjects = "Reading makes more objects than the limit of 14: A";
    EXPECT_EQ(limit(15, 0, 2), "read");
    EXPECT_EQ(limit(14, 0, 2), tooManyObjects);
    EXPECT_EQ(limit(0, 3, 2), "read");
    EXPECT_EQ(limit(4, 2, 2), tooManyObjects);
    EXPECT_EQ(limit(15, 0, 1), "Reading keeps more nodes than the limit of 5: a");
    EXPECT_EQ(limit(SIZE_MAX, SIZE_MAX, SIZE_MAX), "read");

    const auto copying =
        scenario::marshaller("<A><u type='Flat' container='false' node='element'/></A><Flat/>");
    copying->setMaximumKeptNodes({.base = 2, .perElement = 0});
    EXPECT_EQ(scenario::read(*copying, "<a><b><c/></b></a>"),
              "-224: Reading keeps more nodes than the limit of 2: b (Invalid Mapping)");
}
