// A host with a function for debugging messages: a record tells it of each change that it registers
// and of each value that undoing and redoing set.

#include <QXXMLMarshalling/QXGenericRecord.h>
#include <QXXMLMarshalling/host/Log.h>
#include <QXXMLMarshalling/model/Format.h>

#include <cstdio>

namespace {

std::string logged;

} // namespace

void QXLogDebug(std::string_view format, std::span<const qx::Value> arguments) {
    logged += qx::format(format, arguments).str() + "\n";
}

int main() {
    const auto manager = qx::make<qx::UndoManager>();
    const auto record = qx::make<QXGenericRecord>();
    record->setValueForKey("untold", "title"); // without an undo manager
    record->setUndoManager(manager);
    record->setValueForKey("Emma", "title");
    record->setValueForKey("Emma", "title"); // no change
    record->setValueForKey(300, "pages");
    manager->undo();
    manager->redo();

    char address[32];
    std::snprintf(address, sizeof address, "0x%08lx",
                  reinterpret_cast<unsigned long>(record.get()));
    const std::string set = std::string("<QXGenericRecord:") + address + ": _setValue:forKey: ";
    const std::string expected = "Set for key: title existing: untold value: Emma\n"
                                 "Set for key: pages existing: (null) value: 300\n" +
                                 set +
                                 "pages, (null)\n"
                                 "Undo for key: pages existing: 300 value: (null)\n" +
                                 set +
                                 "title, untold\n"
                                 "Undo for key: title existing: Emma value: untold\n" +
                                 set +
                                 "title, Emma\n"
                                 "Redo for key: title existing: untold value: Emma\n" +
                                 set +
                                 "pages, 300\n"
                                 "Redo for key: pages existing: (null) value: 300\n";
    if (logged == expected)
        return 0;
    std::printf("logged:\n%s\nexpected:\n%s\n", logged.c_str(), expected.c_str());
    return 1;
}
