// Saving where the file, the disk or the object does not let it: an error, and nothing is changed.

#include "support/Scenario.h"
#include "support/TemporaryFolder.h"

#include <QXXMLMarshalling/QXGenericRecord.h>
#include <QXXMLMarshalling/QXXMLDocumentFile.h>

#include <csignal>

#include <sys/resource.h>
#include <sys/stat.h>

namespace {

constexpr const char* mapping =
    "<Node xml='node'><name node='attribute'/><node type='Node' node='element'/></Node>";
constexpr const char* document = "<node name='a'><!-- kept --></node>\n";

// No file may become longer.
class FileLimit {
public:
    explicit FileLimit(::rlim_t size) : _handler(std::signal(SIGXFSZ, SIG_IGN)) {
        ::getrlimit(RLIMIT_FSIZE, &_was);
        const ::rlimit limit{size, _was.rlim_max};
        ::setrlimit(RLIMIT_FSIZE, &limit);
    }
    ~FileLimit() {
        ::setrlimit(RLIMIT_FSIZE, &_was);
        std::signal(SIGXFSZ, _handler);
    }
    FileLimit(const FileLimit&) = delete;
    FileLimit& operator=(const FileLimit&) = delete;

private:
    ::rlimit _was{};
    void (*const _handler)(int);
};

} // namespace

TEST(SavingLimits, WhatIsNoFileIsRefusedAndStays) {
    const TemporaryFolder folder;
    std::filesystem::create_directory(folder.path("directory"));
    ASSERT_EQ(::mkfifo(folder.path("pipe").c_str(), 0600), 0);
    std::filesystem::create_symlink("nothing", folder.path("dangling"));
    const auto marshaller = scenario::marshaller(mapping);
    const auto node = marshaller->readString(document);
    constexpr std::pair<const char*, std::ptrdiff_t> cases[] = {
        {"directory", 256}, {"pipe", 256}, {"dangling", 260}, {"missing", 260}, {"missing/a", 260}};
    for (const auto& [name, code] : cases) {
        SCOPED_TRACE(name);
        const std::string path = folder.path(name);
        const auto update = QXXMLUpdate::updateFile(*marshaller, node, path);
        ASSERT_FALSE(update);
        EXPECT_EQ(update.error()->code(), code) << support::told(update.error());
        qx::Ref<qx::Error> error;
        EXPECT_FALSE(QXXMLDocumentFile::open(path, marshaller, &error));
        EXPECT_EQ(error->code(), code);
        EXPECT_EQ(folder.list("."), "dangling directory pipe ");
    }
}

TEST(SavingLimits, AFullDiskLeavesTheFileAndTheEdits) {
    const TemporaryFolder folder;
    const std::string path = folder.write("a.xml", document);
    std::filesystem::permissions(path, std::filesystem::perms::owner_read);
    const auto marshaller = scenario::marshaller(mapping);
    const auto file = QXXMLDocumentFile::open(path, marshaller);
    ASSERT_TRUE(file);
    file->root()->setValueForKey("b", "name");
    qx::Ref<qx::Error> error;
    {
        const FileLimit limit(10);
        EXPECT_FALSE(file->save(&error));
        EXPECT_EQ(QXXMLUpdate::updateFile(*marshaller, file->root(), path).error()->code(),
                  error->code());
    }
    EXPECT_EQ(error->code(), 512) << support::told(error);
    EXPECT_EQ(folder.read("a.xml"), document);
    EXPECT_EQ(folder.list("."), "a.xml ");
    EXPECT_TRUE(file->isEdited());
    EXPECT_TRUE(file->save(&error)) << support::told(error);
    EXPECT_EQ(folder.read("a.xml"), "<node name='b'><!-- kept --></node>\n");
    EXPECT_EQ(std::filesystem::status(path).permissions(), std::filesystem::perms::owner_read);
}

TEST(SavingLimits, ObjectsNestAsDeepAsReadingGoesAndNeverInThemselves) {
    const auto marshaller = scenario::marshaller(mapping);
    marshaller->setMaximumDepth(QXXMLMarshaller::highestMaximumDepth);
    const std::size_t levels = marshaller->maximumDepth();
    std::string text, end;
    for (std::size_t i = 1; i < levels; ++i, end += "</node>")
        text += "<node>";
    const std::string deep = text + "<node name='a'/>" + end;
    const auto root = marshaller->readString(deep);
    ASSERT_TRUE(root);
    qx::Object* innermost = root.get();
    for (auto node = innermost->valueForKey("node"); node.isObject();
         node = innermost->valueForKey("node"))
        innermost = node.object();
    innermost->setValueForKey("b", "name");
    const auto update = QXXMLUpdate::updatedText(*marshaller, deep, root);
    ASSERT_TRUE(update) << support::told(update.error());
    EXPECT_TRUE(update->bytes()->view() == text + "<node name='b'/>" + end);
    // One level more, then without end.
    const auto self = qx::make<QXGenericRecord>();
    self->setClassNameForMarshalling("Node");
    innermost->setValueForKey(self, "node");
    EXPECT_FALSE(QXXMLUpdate::updatedText(*marshaller, deep, root));
    self->setValueForKey(self, "node");
    const auto cyclic = QXXMLUpdate::updatedText(*marshaller, document, self);
    self->setValueForKey(qx::Value(), "node");
    self->setChangeCache(nullptr); // which knows it from before
    ASSERT_FALSE(cyclic);
    EXPECT_EQ(support::told(cyclic.error()).substr(0, 44),
              "-223: Objects nest deeper than the limit of ");
}

// What is gone is gone through for what may have moved.
TEST(SavingLimits, ListsThatNestDeeplyGoAsAWhole) {
    const auto marshaller = scenario::marshaller(
        "<Node xml='node'><nodes type='Node' collection='array' name='node'/></Node>");
    marshaller->setMaximumDepth(QXXMLMarshaller::highestMaximumDepth / 2);
    std::string deep, end;
    for (std::size_t i = 1; i < marshaller->maximumDepth(); ++i, end += "</node>")
        deep += "<node>";
    const std::string text = "<node>" + deep + end + "<node/></node>";
    qx::Ref<qx::Error> error;
    const auto root = marshaller->readString(text, &error);
    ASSERT_TRUE(root) << support::told(error);
    const auto nodes = root->valueForKey("nodes").as<qx::Array>();
    const auto added = qx::make<qx::Array>();
    added->add(marshaller->readString("<node/>"));
    nodes->remove(0);
    nodes->at(0).object()->setValueForKey(added, "nodes");
    const auto update = QXXMLUpdate::updatedText(*marshaller, text, root);
    ASSERT_TRUE(update) << support::told(update.error());
    EXPECT_EQ(update->bytes()->view(), "<node><node><node></node></node></node>");
}
