// The samples of docs/saving.md, between "// sample: NAME" and "// end of sample", and what the
// page says of them. tests/docs/SamplesTest.cpp compares them with the page.

#include "support/Page.h"
#include "support/Scenario.h"
#include "support/TemporaryFolder.h"

#include <QXXMLMarshalling/QXGenericRecord.h>
#include <QXXMLMarshalling/QXXMLDocumentFile.h>

namespace {

// The file on the page.
std::string fileOnPage() {
    for (const auto& block : support::blocksOf(QX_SOURCE_DIR "/docs/saving.md"))
        if (block.heading == "xml")
            return block.text;
    return {};
}

qx::String update(QXXMLMarshaller* marshaller, const std::string& path, std::ostream& log) {
    qx::Ref<qx::Error> error;
    // sample: update
    qx::Ref<qx::Object> order = marshaller->readFile(path, &error);
    order->setValueForKey("Ink", "title");
    auto update = QXXMLUpdate::updateFile(*marshaller, order, path);
    if (!update)
        return update.error()->localizedDescription();
    for (const QXXMLUpdate::Edit& edit : update->edits())
        log << edit.keyPath.view() << " in line " << edit.line << '\n';
    // end of sample
    return {};
}

TEST(SavingPage, OneLineIsAnother) {
    const TemporaryFolder folder;
    std::string text = fileOnPage();
    const std::string path = folder.write("order.xml", text);
    const auto marshaller = scenario::marshaller("<Order xml='order'><number node='attribute'/>"
                                                 "<title node='element'/></Order>");
    std::ostringstream log;
    EXPECT_EQ(update(marshaller.get(), path, log), qx::String());
    EXPECT_EQ(log.str(), "title in line 3\n");
    text.replace(text.find("Pens"), 4, "Ink");
    EXPECT_EQ(folder.read("order.xml"), text);
    qx::Ref<qx::Error> error;
    // sample: editor
    const auto file = QXXMLDocumentFile::open(path, marshaller, &error);
    const auto undo = qx::make<qx::UndoManager>();
    file->root<QXGenericRecord>()->setUndoManager(undo);
    file->setUndoManager(undo);
    file->root()->setValueForKey("Paper", "title");
    if (file->isEdited())
        file->save(&error);
    // end of sample
    EXPECT_FALSE(error || file->isEdited());
    text.replace(text.find("Ink"), 3, "Paper");
    EXPECT_EQ(folder.read("order.xml"), text);
}

} // namespace
