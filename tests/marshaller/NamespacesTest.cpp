// Names that are matched by namespace: the options, and what is done step by step. What comes of
// documents stands in namespaces.md.

#include "support/Scenario.h"

#include <QXXMLMarshalling/QXXMLMarshalling.h>

namespace {

qx::Ref<QXXMLMarshaller> makeMarshaller() {
    const auto made = scenario::marshaller(
        "<Feed xml='feed' ns-uri='urn:a'><title node='element'/>"
        "<id node='attribute' name='x:id'/><entries type='Entry' collection='array' name='x:e'/>"
        "</Feed><Entry><name node='text'/></Entry>");
    EXPECT_TRUE(made->setNamespacePrefixes({{"urn:a", ""}, {"urn:x", "x"}}));
    return made;
}

const std::string document =
    R"(<all xmlns:p="urn:a" xmlns:q="urn:x"><p:feed q:id="1">)"
    R"(<p:title>t</p:title><q:e>n</q:e><q:other></q:other></p:feed></all>)";

} // namespace

TEST(NamespacesTest, OptionsAreRefusedWhole) {
    const auto marshaller = makeMarshaller();
    qx::Ref<qx::Error> error;
    EXPECT_FALSE(marshaller->setNamespacePrefixes({{"urn:b", "b"}, {"urn:c", "b"}}, &error));
    EXPECT_EQ(support::told(error),
              "-225: The prefix: b would stand for two namespaces: urn:b and: "
              "urn:c (Invalid Mapping)");
    EXPECT_EQ(marshaller->namespacePrefixes().size(), 2U);
    for (const auto& [URI, prefix] : {std::pair("", "a"), {"urn:a", "a:b"}, {"urn:a", "xml"}})
        EXPECT_FALSE(marshaller->setNamespacePrefixes({{URI, prefix}})) << prefix;
    EXPECT_TRUE(marshaller->setNamespacePrefixes({}));
    EXPECT_FALSE(marshaller->matchesNamespaces());
    EXPECT_FALSE(marshaller->readString("<p:feed xmlns:p='urn:a'/>")) << "off again";
    EXPECT_TRUE(marshaller->setMatchesNamespaces(true));
    EXPECT_TRUE(marshaller->readString("<p:feed xmlns:p='urn:a'/>"));
}

// A step finds what is declared around the element that it is given.
TEST(NamespacesTest, AreMatchedByTheSingleSteps) {
    const auto marshaller = makeMarshaller();
    const auto tree = support::parsed(document);
    qx::XMLElement& element = *tree->rootElement()->firstChild()->asElement();
    const auto read = marshaller->unmarshallElement(&element);
    ASSERT_TRUE(read);
    EXPECT_EQ(read->valueForKey("title"), "t");
    const QXXMLClassMapping& mapping = *marshaller->mapping()->mappingForClassName("Feed");
    EXPECT_TRUE(marshaller->buildClassWithMapping(mapping, &element, false));
    const auto object = marshaller->allocateClassWithMapping(mapping);
    qx::CountedSet fields, attributes;
    for (const auto& field : mapping.fields())
        EXPECT_TRUE(marshaller->bindField(*field, *object, 0, element, fields, attributes, false));
    EXPECT_EQ(object->valueForKey("id"), "1");
    EXPECT_EQ(fields.description(), "(title [1], x:e [1])");
    marshaller->setLenient(false);
    marshaller->setSaveUnknownXML(false);
    qx::Ref<qx::Error> error;
    EXPECT_FALSE(marshaller->validateBoundFields(fields, attributes, element, *object, &error));
    EXPECT_EQ(support::told(error), "-214: Unknown fields found in XML document: (q:other [1]) "
                                    "element: p:feed (Invalid XML)");

    const auto target = qx::XMLElement::initWithName("p:feed");
    tree->rootElement()->addChild(target);
    EXPECT_TRUE(marshaller->bindFieldMappings(mapping, *target, *object));
    EXPECT_EQ(target->XMLString(), R"(<p:feed q:id="1"><p:title>t</p:title><q:e>n</q:e></p:feed>)");
}

namespace {

// Undoes, while it is read, all that its reading goes by.
struct Meddler : QXMappedObject {
    static inline QXXMLMarshaller* marshaller = nullptr;
    static inline qx::XMLDocument* tree = nullptr;
    qx::String title;
    void setTitle(const qx::String& text) {
        title = text;
        marshaller->setNamespacePrefixes({{"urn:b", ""}});
        tree->rootElement()->setNamespaces({});
    }
    const qx::String& getTitle() const { return title; }
    qx::String id;
};

} // namespace

TEST(NamespacesTest, StayAsTheyStoodWhenAReadingBegan) {
    qx::Class::define<Meddler, QXMappedObject>("Feed")
        .property<&Meddler::getTitle, &Meddler::setTitle>("title")
        .property<&Meddler::id>("id");
    const auto marshaller =
        scenario::marshaller("<Feed xml='feed'><title node='element'/><id node='element'/></Feed>");
    for (const bool isTree : {false, true}) {
        marshaller->setNamespacePrefixes({{"urn:a", ""}});
        const auto tree =
            support::parsed("<p:feed xmlns:p='urn:a'><p:title>t</p:title><p:id>1</p:id></p:feed>");
        if (isTree)
            tree->rootElement();
        Meddler::marshaller = marshaller.get();
        Meddler::tree = tree.get();
        const auto read = marshaller->unmarshall<Meddler>(tree.get());
        EXPECT_EQ(read.value()->id, "1");
        EXPECT_FALSE(marshaller->readString("<p:feed xmlns:p='urn:a'/>"));
    }
    qx::Class::forget("Feed");
}
