// Host objects that turn on the saving that reads them: whatever their getters and setters, or the
// handlers of the marshaller, do in the middle, no freed memory is used, and the file is a whole
// document that says what the object said at some time.

#include "support/Meddling.h"
#include "support/Scenario.h"
#include "support/TemporaryFolder.h"

#include <QXXMLMarshalling/QXMappedObject.h>
#include <QXXMLMarshalling/QXXMLDocumentFile.h>

#include <utility>

namespace {

using qx::Ref;
using Changed = QXXMLDocumentFile::Changed;
using support::Meddling;

class Note : public QXMappedObject {
public:
    qx::String text() const {
        Meddling::call();
        return _text;
    }
    void setText(const qx::String& text) {
        Meddling::call();
        _text = text;
    }
    std::vector<Ref<Note>> notes;

private:
    qx::String _text;
};

constexpr const char* mapping = "<Note xml='note'><text node='attribute'/>"
                                "<notes type='Note' collection='array' name='note'/></Note>";
constexpr const char* document = "<note text='a'><!-- c --><x/><note text='b'/>\n</note>\n";

class HostCode : public testing::Test {
protected:
    void SetUp() override {
        qx::Class::define<Note, QXMappedObject>("Note")
            .property<&Note::text, &Note::setText>("text")
            .members<&Note::notes>();
    }
    void TearDown() override {
        qx::Class::forget("Note");
        Meddling::act = nullptr;
    }
    void open() {
        path = folder.write("n.xml", document);
        marshaller = scenario::marshaller(mapping);
        file = QXXMLDocumentFile::open(path, marshaller);
        file->root<Note>()->notes[0]->setText("new");
    }
    // Whether the file is a document by which the tests may have come.
    bool isWhole() const {
        const auto root = scenario::marshaller(mapping)->readFile(path);
        const std::string text = folder.read("n.xml");
        return root && text.find("<!-- c --><x/>") != std::string::npos;
    }

    TemporaryFolder folder;
    std::string path;
    Ref<QXXMLMarshaller> marshaller;
    Ref<QXXMLDocumentFile> file;
};

} // namespace

TEST_F(HostCode, MayDoAnythingWithTheFileWhileItIsSaved) {
    const std::function<void()> acts[] = {
        [&] { file = nullptr; },
        [&] { marshaller = nullptr; },
        [&] { file->save(); },
        [&] { file->revert(); },
        [&] { file->isEdited(); },
        [&] { file->setUndoManager(qx::make<qx::UndoManager>()); },
        [&] { file->saveAs(path); },
        [&] { file->root<Note>()->notes.clear(); },
        [&] { file->root<Note>()->notes.push_back(qx::make<Note>()); },
        [&] { file->root<Note>()->setText("meddled"); },
        [&] { marshaller->setSaveUnknownXML(false); },
        [&] { marshaller->setKeepsExactly(true); },
        [&] { marshaller->setMaximumDepth(1); },
        [&] { folder.write("n.xml", "<note text='theirs'><!-- c --><x/></note>"); },
        [] { throw std::runtime_error("thrown"); },
    };
    const std::function<void(Ref<qx::Error>*)> operations[] = {
        [&](auto* error) { file->save(error); },
        [&](auto* error) { file->save(error, Changed::carryOver); },
        [&](auto* error) { file->revert(error); },
        [&](auto* error) {
            const auto update =
                QXXMLUpdate::updateFile(*Ref<QXXMLMarshaller>(marshaller), file->root(), path);
            *error = update.error();
        },
    };
    for (const auto& operation : operations)
        for (const auto& act : acts)
            for (int call = 0, isDone = 0; isDone == 0; call += 1 + call / 2) {
                open();
                Ref<qx::Error> error;
                const bool hasActed = Meddling::during(call, act, [&] {
                    try {
                        operation(&error);
                    } catch (const std::runtime_error&) {
                    }
                });
                isDone = hasActed ? 0 : 1;
                ASSERT_TRUE(isWhole())
                    << &operation - operations << " " << &act - acts << " " << call << "\n"
                    << folder.read("n.xml");
                ASSERT_LT(call, 100);
            }
}

// Of a large document: of a small one no progress is told.
TEST_F(HostCode, HandlersHearNoReportsAndMayCancel) {
    open();
    std::string large = "<note y='1'>";
    for (int i = 0; i < 40; ++i)
        large += "<note text='" + std::string(64 * 1024, 'x') + "'><z/></note>";
    large += "</note>";
    const auto root = marshaller->readString(large);
    root.as<Note>()->notes[0]->setText("new");
    int reports = 0;
    marshaller->setReportHandler([&](const QXXMLReport&) { ++reports; });
    const auto update = [&] { return QXXMLUpdate::updatedText(*marshaller, large, root); };
    int calls = 0;
    marshaller->setProgressHandler([&](const auto&) { return ++calls > 0; });
    EXPECT_TRUE(update());
    EXPECT_EQ(reports, 0);
    ASSERT_GE(calls, 2);
    for (const int last : {calls - 1, 0}) {
        calls = 0;
        marshaller->setProgressHandler([&, last](const auto&) { return calls++ < last; });
        EXPECT_EQ(update().error()->code(), -226);
    }
}

TEST_F(HostCode, AFileThatChangesWhileItIsUpdatedIsNotOverwritten) {
    open();
    const std::string theirs = "<note text='theirs'/>";
    Meddling::act = [&] { folder.write("n.xml", theirs); };
    Meddling::countdown = 5;
    EXPECT_EQ(QXXMLUpdate::updateFile(*marshaller, file->root(), path).error()->code(), -232);
    EXPECT_EQ(folder.read("n.xml"), theirs);
    EXPECT_EQ(QXXMLDocumentFile::open(path, nullptr), nullptr);
}

TEST_F(HostCode, EditsWhileASaveGoesOnAreNotSaved) {
    open();
    const auto undo = qx::make<qx::UndoManager>();
    file->setUndoManager(undo);
    const auto edit = [&] { undo->registerUndo(*file->root<Note>(), [](Note&) {}); };
    edit();
    EXPECT_TRUE(Meddling::during(0, edit, [&] { EXPECT_TRUE(file->save()); }));
    EXPECT_TRUE(file->isEdited());
    EXPECT_TRUE(file->save());
    EXPECT_FALSE(file->isEdited());
}
