// A host that makes the library say things, and prints what was said and where. log-hooks.sh
// compiles it with the log functions that its flags name: WITH_DEBUG, WITH_WARNING, both or none.

#include <QXXMLMarshalling/QXXMLMarshalling.h>

#include <cstdio>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <iostream>

#include <unistd.h>

namespace {

class TakenOnce : public qx::Object {};
class TakenTwice : public qx::Object {};

std::string folder = "/tmp/qx-log-XXXXXX";
std::string told;

// What a host's function may ask the library while it logs: for a class whose name is told to be
// taken, and for the very files that are told to be broken.
[[maybe_unused]] bool asks() {
    return qx::Class::named("Taken") != nullptr &&
           !qx::UserDefaults::standardUserDefaults()->boolForKey("Loud") &&
           qx::Bundle::bundleWithPath(folder)->infoDictionary()->isEmpty();
}

// A class under a taken name; broken files; an attribute and an element that the mapping does not
// know; values of a record that are set, undone and redone.
void saySomething() {
    qx::Class::define<TakenOnce>("Taken");
    qx::Class::define<TakenTwice>("Taken");
    asks();
    const auto mapping = qx::XMLDocument::initWithData(
        R"(<mapping><class name="Order"><map-to xml="order"/></class></mapping>)");
    QXXMLMarshaller::initWithMappingXML(mapping.get())
        ->readString("<order number='1'><note>n</note></order>");

    const auto manager = qx::make<qx::UndoManager>();
    const auto record = qx::make<QXGenericRecord>();
    record->setValueForKey("untold", "title"); // without an undo manager
    record->setUndoManager(manager);
    record->setValueForKey("Emma", "title");
    record->setValueForKey("Emma", "title"); // no change
    record->setValueForKey(300, "pages");
    manager->undo();
    manager->redo();
}

} // namespace

// Hosts are built with hidden visibility: nothing is exported on purpose.
#ifdef WITH_DEBUG
void QXLogDebug(std::string_view format, std::span<const qx::Value> arguments) {
    told += "debug: " + qx::format(format, arguments).str() + "\n";
}
#endif
#ifdef WITH_WARNING
void QXLogWarning(std::string_view format, std::span<const qx::Value> arguments) {
    told += (asks() ? "warning: " : "deaf: ") + qx::format(format, arguments).str() + "\n";
}
#endif

int main() {
    if (::mkdtemp(folder.data()) == nullptr)
        return 1;
    ::setenv("XDG_CONFIG_HOME", folder.c_str(), 1);
    qx::ProcessInfo::setProcessName("Client");
    for (const char* name : {"/Client.plist", "/Info.plist"})
        std::ofstream(folder + name) << "<plist>";
    saySomething();
    std::filesystem::remove_all(folder);
    std::cout << told;
}
