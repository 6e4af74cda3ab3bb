// Eight threads over one mapping, each reading documents that all of them read, and reading and
// writing some of its own, while others use what a program has one of: classes by name, user
// defaults, the shared repository manager, interned names, bundles and the log. Under the thread
// sanitizer (scripts/test-threads) a race ends it; everywhere else each result is compared.
//
// usage: threads [ROUNDS]

#include <QXXMLMarshalling/QXXMLMarshalling.h>

#include <array>
#include <atomic>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <iostream>
#include <latch>
#include <mutex>
#include <thread>
#include <utility>

namespace {

constexpr unsigned threadCount = 8;
std::string appFolder; // of a bundle, made before any thread runs

struct Line : qx::UndoableObject {
    qx::String text;
    int count = 0;
    qx::Value unboundChildren, unboundAttributes, namespaces;
    bool isRemovable() const { return false; }
};

// A class that comes and goes, as one of a plug-in does.
template <unsigned number>
struct Visitor : qx::Object {};

const char* const mappingText = R"(<mapping>
    <include href="common.xml"/>
    <class name="Order" extends="Common">
        <map-to xml="order" ns-uri="urn:order"/>
        <field name="title" required="true"><bind-xml name="title" node="element"/></field>
        <field name="lines" collection="array" type="Line"><bind-xml name="line" location="lines"/></field>
        <field name="any" collection="array"><bind-xml name="any"/></field>
        <field name="place" type="Place"><bind-xml name="place" node="element"/></field>
    </class>
    <class name="Place">
        <field name="address" type="Address" container="false"><bind-xml node="element"/></field>
    </class>
    <class name="Line">
        <map-to xml="line"/>
        <field name="count" type="int"><bind-xml name="count" node="attribute"/></field>
        <field name="text"><bind-xml node="text"/></field>
    </class>
    <class name="Note"><map-to xml="note"/><field name="text"><bind-xml node="text"/></field></class>
    <class name="Address"><field name="city"><bind-xml name="city" node="element"/></field></class>
</mapping>)";

const char* const includedText = R"(<mapping>
    <class name="Common"><field name="id"><bind-xml name="id" node="attribute"/></field></class>
</mapping>)";

// What a mapping includes is looked for through the shared manager, which one thread uses at a
// time.
qx::Ref<QXXMLMarshallingMapping> resolve() {
    static std::mutex mutex;
    const std::lock_guard lock(mutex);
    return QXXMLMarshallingMapping::initWithDocument(
        qx::XMLDocument::initWithData(mappingText).get());
}

std::string orderText(unsigned thread, unsigned round) {
    const std::string number = std::to_string(thread) + '-' + std::to_string(round);
    return "<!DOCTYPE order [<!ENTITY pen 'Pens " + number + "'>]><order id='" + number +
           "'><title>&pen;</title><lines><line count='" + std::to_string(round) +
           "'>a</line><line>b</line></lines><any><note>c</note></any><place><city>Galway</city></"
           "place>"
           "<unknown-" +
           number + "/></order>";
}

std::atomic<unsigned> failures = 0;

void check(bool condition, const char* expectation) {
    if (!condition && failures++ == 0)
        std::cerr << "not so: " << expectation << '\n';
}

void readAndWrite(QXXMLMarshaller& marshaller, unsigned thread, unsigned round) {
    const std::string number = std::to_string(thread) + '-' + std::to_string(round);
    qx::Ref<qx::Error> error;
    const auto order =
        marshaller.readString(orderText(thread, round), &error).as<QXGenericRecord>();
    check(order && !error, "the document is read");
    if (!order)
        return;
    order->setUndoManager(marshaller.undoManager());
    order->setValueForKey("changed " + number, "title");
    marshaller.undoManager()->undo();
    check(order->valueForKey("title").string().view() == "Pens " + number, "the change is undone");
    const std::string text = marshaller.writeString(order, &error).str();
    check(text.find(number) != std::string::npos, "the document is written");
    const auto again = marshaller.readString(text);
    check(again && again->valueForKey("id").string().view() == number, "what was written is read");

    check(!marshaller.readString("<order><line", &error) && error, "what is no XML is refused");
    marshaller.undoManager()->removeAllActions();
    error = nullptr;
    check(!marshaller.readString("<order><lines><line count='x'/></lines></order>", &error) &&
              error && !error->description().isEmpty(),
          "what is no number is refused");
}

template <unsigned number>
void comeAndGo() {
    const std::string name = "Visitor" + std::to_string(number);
    qx::Class::define<Visitor<number>>(name);
    const qx::Class* described = qx::Class::named(name);
    check(described != nullptr && described->create(), "a class is found under its name");
    check(qx::Class::named("Line") != nullptr, "other classes stay");
    qx::Class::forget(name);
}

void registerClasses(unsigned thread) {
    static constexpr auto steps = []<std::size_t... number>(std::index_sequence<number...>) {
        return std::array{&comeAndGo<number>...};
    }
    (std::make_index_sequence<threadCount>());
    steps[thread]();
}

void useDefaults(unsigned thread, unsigned round) {
    const auto defaults = qx::UserDefaults::standardUserDefaults();
    const qx::String key = "Key" + std::to_string(thread);
    defaults->setObject(std::to_string(round), key);
    check(defaults->integerForKey(key) == round, "a default that was set is read");
    defaults->registerDefault("registered", "Common");
    const char* const arguments[]{"-Argument", "value"};
    defaults->setArguments(arguments);
    if (round % 4 == 0)
        defaults->synchronize();
    check(defaults->stringForKey("Common") == "registered", "a registered default is read");
    defaults->removeObjectForKey(key);
    check(defaults->objectForKey(key).isNull(), "a default that was removed is gone");
    check(defaults->stringForKey("InFile") == "a text of the file", "the user's file is read");
}

// Folders of the user's that are the program's own: one default is there, no document, and a
// bundle.
void makeUserFolders(const std::filesystem::path& folder) {
    std::ofstream(folder / "threads.plist")
        << "<plist><dict><key>InFile</key><string>a text of the file</string></dict></plist>";
    appFolder = folder / "app";
    std::filesystem::create_directories(folder / "app/de.lproj");
    std::ofstream(folder / "app/Info.plist") << "<dict><key>CFBundleIdentifier</key>"
                                                "<string>org.example.Threads</string></dict>";
    std::ofstream(folder / "app/de.lproj/Localizable.strings") << "\"a\" = \"A\";\n\"b\";";
    // NOLINTBEGIN(concurrency-mt-unsafe): no other thread runs yet
    setenv("XDG_CONFIG_HOME", folder.c_str(), 1);
    setenv("XDG_DATA_HOME", folder.c_str(), 1);
    setenv("LC_ALL", "de_DE", 1);
    // NOLINTEND(concurrency-mt-unsafe)
    qx::ProcessInfo::setProcessName("threads");
}

void useBundles(unsigned thread, unsigned round) {
    const auto bundle = qx::Bundle::bundleWithPath(appFolder);
    check(bundle == qx::Bundle::bundleWithIdentifier("org.example.Threads"),
          "a bundle is opened once");
    check(bundle->localizedString("a").view() == "A", "a text is translated");
    if (round % 11 == 0)
        qx::Bundle::setMainBundle(thread % 2 != 0 ? bundle : nullptr);
    check(static_cast<bool>(qx::Bundle::mainBundle()), "there is a main bundle");
    const qx::Object& object = *bundle;
    check(static_cast<bool>(qx::Bundle::bundleForClass(typeid(object))), "a class has a bundle");
    qx::ProcessInfo::setProcessVersion("1", "2");
}

void useRepositories(unsigned thread, unsigned round) {
    const auto inMemory = QXXMLVolatileDataRepository::init();
    const qx::String name = "document" + std::to_string(thread) + ".xml";
    inMemory->setDocument(qx::XMLDocument::initWithData(mappingText), name);
    const auto own = QXXMLDataRepositoryManager::init();
    own->setRepository(inMemory, "own");
    check(static_cast<bool>(own->documentNamed(name)), "a document is found by name");
    const auto files = own->persistentRepository().as<QXXMLFileSystemDataRepository>();
    check(files && !files->containsDocument("no such document"), "what is not there is not found");
    check(static_cast<bool>(QXXMLDataRepositoryManager::defaultManager()), "there is a manager");
    if (round % 5 == 0)
        QXXMLDataRepositoryManager::flushDefaultManager();
    qx::Ref<qx::Error> error;
    const auto data = qx::make<qx::Data>(std::to_string(thread));
    check(!files->writeFileToUserOverrideArea(data, "shared.xml", &error).isNull() && !error,
          "a file that others write too is written");
    check(files->dataForName("shared.xml")->size() == 1, "and read as one of them wrote it");
    check(files->writeFileToUserOverrideArea(data, "../x", &error).isNull() &&
              !error->localizedDescription().isEmpty(),
          "a file outside is refused, in words");
    useBundles(thread, round);
    check(!qx::ProcessInfo::processName().isEmpty(), "the process has a name");
    if (round % 8 == 0)
        check(static_cast<bool>(resolve()), "a mapping resolves");
}

// All threads read the same documents, and make their nodes, whoever comes first.
using Documents = std::vector<qx::Ref<qx::XMLDocument>>;
const char* const sharedText =
    "<order xmlns:x='urn:x' id='1' x:a='2'><title>Pens</title><lines x:b='3'><line count='4' c='5'>"
    "a</line></lines><place d='6'><city>Galway</city><e f='7'>g</e></place><h i='8'>j</h></order>";

// All values in a tree, each node asked for.
std::string valuesIn(const qx::XMLNode& node) {
    std::string values = node.stringValue().str();
    if (const qx::XMLElement* const element = node.asElement())
        for (const qx::XMLNode& attribute : element->attributes())
            values += attribute.stringValue().view();
    for (const qx::XMLNode& child : node.children())
        values += valuesIn(child);
    return values;
}

void readShared(QXXMLMarshaller& marshaller, qx::XMLDocument& document, unsigned thread) {
    if (thread % 2 == 0)
        check(valuesIn(*document.rootElement()).starts_with("PensaGalwaygj12"), "nodes are there");
    const auto order = marshaller.unmarshall(&document);
    check(order && order->valueForKeyPath("place.address.city").string().view() == "Galway",
          "a document that others read is read");
    const auto kept = order->valueForKey("unboundAttributes").as<qx::Array>();
    check(kept && kept->at(0).as<qx::XMLNode>().get() ==
                      document.rootElement()->attributeForName("x:a"),
          "what is kept of it are its own nodes");
}

void run(const qx::Ref<QXXMLMarshallingMapping>& mapping, const Documents& documents,
         unsigned thread) {
    const auto marshaller = QXXMLMarshaller::initWithMapping(mapping);
    for (unsigned round = 0; round < documents.size(); ++round) {
        readShared(*marshaller, *documents[round], thread);
        readAndWrite(*marshaller, thread, round);
        registerClasses(thread);
        useDefaults(thread, round);
        useRepositories(thread, round);
    }
}

} // namespace

// The log is called on any thread.
void QXLogDebug(std::string_view format, std::span<const qx::Value> arguments) {
    qx::format(format, arguments);
}
void QXLogWarning(std::string_view format, std::span<const qx::Value> arguments) {
    qx::format(format, arguments);
}

int main(int argc, char** argv) {
    const unsigned rounds = argc > 1 ? static_cast<unsigned>(std::stoul(argv[1])) : 20;
    std::string folder = std::filesystem::temp_directory_path() / "threads-XXXXXX";
    if (mkdtemp(folder.data()) == nullptr)
        return 1;
    makeUserFolders(folder);
    qx::Class::define<Line, qx::UndoableObject>("Line")
        .property<&Line::text>("text")
        .property<&Line::count>("count")
        .property<&Line::unboundChildren>("unboundChildren")
        .property<&Line::unboundAttributes>("unboundAttributes")
        .property<&Line::namespaces>("__namespaces")
        .operation<&Line::isRemovable>("isRemovable");
    const auto included = QXXMLVolatileDataRepository::init();
    included->setDocument(qx::XMLDocument::initWithData(includedText), "common.xml");
    QXXMLDataRepositoryManager::defaultManager()->setVolatileRepository(included);

    const auto mapping = resolve();
    check(static_cast<bool>(mapping), "the mapping resolves");
    Documents documents;
    for (unsigned round = 0; round < rounds; ++round)
        documents.push_back(qx::XMLDocument::initWithData(sharedText));
    std::latch start(threadCount);
    std::vector<std::thread> threads;
    for (unsigned thread = 0; mapping && thread < threadCount; ++thread)
        threads.emplace_back([&, thread] {
            start.arrive_and_wait();
            run(mapping, documents, thread);
        });
    for (std::thread& thread : threads)
        thread.join();
    qx::Bundle::setMainBundle(nullptr);
    std::filesystem::remove_all(folder);
    return failures == 0 ? 0 : 1;
}
