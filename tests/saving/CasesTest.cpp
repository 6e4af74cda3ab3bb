// The page of cases in this folder, and every document of the marshaller's pages: one that was not
// edited does not change.
//
//     xml mapping, text prefixes, xml document     as for the marshaller
//     text edits                                   what is done to what was read (Edits.h)
//     text diff                                    the lines that change
//     text saved                                   the whole text
//     text notes                                   what was written anew, what no XML shows
//     text error                                   instead
//
// On records and on host classes.

#include "Edits.h"

#include <QXXMLMarshalling/QXXMLUpdate.h>

namespace {

using support::Expectation;

struct Setup {
    qx::Ref<qx::XMLDocument> mapping;
    kinds::Defined classes;
    qx::Ref<QXXMLMarshaller> marshaller;

    Setup(const Expectation& expectation, kinds::Kind kind)
        : mapping(mappingOf(expectation.given.at("mapping"))),
          classes(kind, *mapping->rootElement()),
          marshaller(QXXMLMarshaller::initWithMappingXML(mapping.get())) {
        const Expectation& e = expectation;
        if (!marshaller)
            return;
        marshaller->setNamespacePrefixes(cases::prefixesOf(e.given));
        marshaller->setMatchesNamespaces(e.options.contains("by-namespace"));
        marshaller->setLenient(!e.options.contains("strict"));
        marshaller->setSaveUnknownXML(!e.options.contains("discard"));
        marshaller->setKeepsExactly(e.options.contains("exactly"));
        marshaller->setUsingNamespaceURIs(!e.options.contains("no-namespaces"));
    }
    static qx::Ref<qx::XMLDocument> mappingOf(const std::string& text) {
        return support::parsed(text.starts_with("<mapping") ? text
                                                            : "<mapping>" + text + "</mapping>");
    }
};

void checkUpdate(const Expectation& expectation) {
    const std::string& document = expectation.given.at("document");
    for (const kinds::Kind kind : {kinds::Kind::record, kinds::Kind::host}) {
        SCOPED_TRACE(kinds::names[kind]);
        const Setup setup(expectation, kind);
        qx::Ref<qx::Error> error;
        const auto object = setup.marshaller->readString(document, &error);
        ASSERT_TRUE(object) << support::told(error);
        edits::apply(object, expectation.given.at("edits"));
        const auto update = QXXMLUpdate::updatedText(*setup.marshaller, document, object);
        std::string told = "no error\n";
        if (!update)
            told = support::told(update.error()) + "\n";
        const std::string saved = update ? std::string(update->bytes()->view()) : "";
        std::string notes;
        for (std::size_t i = 0; update && i < update->writtenAnew().size(); ++i)
            notes += "anew: " + update->writtenAnew()[i].str() + "\n";
        for (std::size_t i = 0; update && i < update->unshown().size(); ++i)
            notes += "unshown: " + update->unshown()[i].keyPath.str() + " " +
                     update->unshown()[i].value.str() + "\n";
        const std::string& is = expectation.kind == "error"   ? told
                                : expectation.kind == "notes" ? notes
                                : expectation.kind == "saved" ? saved
                                                              : edits::difference(document, saved);
        EXPECT_EQ(is, expectation.text) << told;
    }
}

// Whatever becomes of it when it is written.
void checkUnedited(const Expectation& expectation) {
    const auto document = expectation.given.find("document");
    if (document == expectation.given.end())
        return;
    for (const kinds::Kind kind : {kinds::Kind::record, kinds::Kind::host, kinds::Kind::plain}) {
        const auto isFor = [&](const char* name) { return expectation.options.contains(name); };
        if (std::ranges::any_of(kinds::names, isFor) && !isFor(kinds::names[kind]))
            continue;
        SCOPED_TRACE(kinds::names[kind]);
        const Setup setup(expectation, kind);
        qx::Ref<qx::Error> error;
        const auto object =
            setup.marshaller ? setup.marshaller->readString(document->second, &error) : nullptr;
        if (!object || error || setup.marshaller->writeString(object).isNull())
            continue;
        const auto again = setup.marshaller->readString(document->second);
        const auto update = QXXMLUpdate::updatedText(*setup.marshaller, document->second, again);
        ASSERT_TRUE(update) << support::told(update.error()) << document->second;
        EXPECT_EQ(update->bytes()->view(), document->second);
        EXPECT_TRUE(update->edits().empty() && update->unshown().empty());
    }
}

const bool added = [] {
    support::addCases("tests/saving/saving.md", {"mapping", "prefixes", "document", "edits"},
                      {"diff", "saved", "notes", "error"}, checkUpdate);
    for (const char* page : {"keeping", "reading", "writing", "round-trips", "namespaces"})
        support::addCases("tests/marshaller/" + std::string(page) + ".md",
                          {"mapping", "prefixes", "document", "given"},
                          {"object", "written", "error"}, checkUnedited);
    for (const char* page : {"mapping-format", "round-trip"})
        support::addCases("docs/" + std::string(page) + ".md",
                          {"mapping", "prefixes", "document", "given"},
                          {"object", "written", "error"}, checkUnedited);
    return true;
}();

} // namespace
