// Lists the entries of an Atom feed. With an id and a title more, gives that entry, or the feed,
// the title, and leaves the rest of the file as it is.
//
//     example_atom FEED [ID TITLE]

#include "Feed.h"

#include <QXXMLMarshalling/QXXMLUpdate.h>

#include <iostream>

namespace {

std::string textOf(const std::optional<atom::Text>& title) {
    return title ? title->text : "without a title";
}

void tell(const atom::Feed& feed) {
    std::cout << textOf(feed.title) << '\n';
    for (const atom::Entry& entry : feed.entries) {
        std::cout << "    " << textOf(entry.title) << '\n';
        for (const atom::Link& link : entry.links)
            if (link.rel.value_or("alternate") == "alternate")
                std::cout << "        " << link.href << '\n';
    }
}

int fail(std::string_view reason) {
    std::cerr << "atom: " << reason << '\n';
    return 1;
}

} // namespace

int main(int count, char** arguments) {
    if (count != 2 && count != 4) {
        std::cerr << "usage: example_atom FEED [ID TITLE]\n";
        return 2;
    }
    atom::describeClasses();
    qx::Ref<qx::Error> error;
    const auto marshaller =
        QXXMLMarshaller::initWithMappingFile(QX_EXAMPLE_DIR "/mapping.xml", &error);
    if (!marshaller || !marshaller->setMatchesNamespaces(true, &error))
        return fail(error->report());
    // What has no field is kept: nobody needs to hear of it.
    marshaller->setReportHandler([](const QXXMLReport&) {});
    auto feed = marshaller->readFile<atom::Feed>(arguments[1]);
    if (!feed)
        return fail(feed.error()->report());
    if (count == 2)
        return tell(*feed), 0;

    atom::Text* title = atom::titleOf(*feed, arguments[2]);
    if (title == nullptr)
        return fail("no entry has the id " + std::string(arguments[2]));
    if (title->type == "xhtml")
        return fail("the title has markup");
    title->text = arguments[3];
    const auto update = QXXMLUpdate::updateFile(*marshaller, *feed, arguments[1]);
    if (!update)
        return fail(update.error()->report());
    for (const auto& edit : update->edits())
        std::cout << "line " << edit.line << ": " << edit.keyPath.view() << '\n';
    return 0;
}
