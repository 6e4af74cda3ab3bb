// A mapping and, after the line "<?document?>", a document: what can be read under it can be
// written, what was written can be read, and undoing the reading leads there and back. The objects
// are records and, where the mapping has a class "Item", a host's.

#include "Support.h"

#include <QXXMLMarshalling/QXGenericRecord.h>
#include <QXXMLMarshalling/QXXMLMarshaller.h>
#include <QXXMLMarshalling/base/Exception.h>
#include <QXXMLMarshalling/model/Class.h>
#include <QXXMLMarshalling/undo/UndoableObject.h>

namespace {

// A property for each kind of conversion, and places for what is kept.
struct Item : qx::UndoableObject {
    qx::String name;
    int count = 0;
    double price = 0;
    bool isGift = false;
    qx::Ref<qx::Array> parts;
    qx::Ref<qx::Object> owner;
    qx::Value unboundChildren, unboundAttributes, namespaces;

    bool isRemovable() const { return false; }
    // Asked for by the marshaller before it gives its undo manager.
    qx::Ref<qx::Object> rootObject() { return qx::Ref<qx::Object>(this); }
};

void describeItem() {
    qx::Class::define<Item, qx::UndoableObject>("Item")
        .property<&Item::name>("name")
        .property<&Item::count>("count")
        .property<&Item::price>("price")
        .property<&Item::isGift>("gift")
        .property<&Item::parts>("parts")
        .property<&Item::owner>("owner")
        .property<&Item::unboundChildren>("unboundChildren")
        .property<&Item::unboundAttributes>("unboundAttributes")
        .property<&Item::namespaces>("__namespaces")
        .operation<&Item::isRemovable>("isRemovable")
        .operation<&Item::rootObject>("rootObject");
}

// The object as a document; empty with an error, and when the mapping names a key that a host's
// class does not have.
std::string written(QXXMLMarshaller& marshaller, const qx::Value& object) {
    qx::Ref<qx::Error> error;
    qx::String text;
    try {
        text = marshaller.writeString(object, &error);
    } catch (const qx::Exception& exception) {
        fuzz::require(exception.name() == std::string_view(qx::Exception::undefinedKey),
                      exception.what());
        return {};
    }
    if (!text.isNull()) {
        fuzz::require(!error, "what is written leaves no error");
        return text.str();
    }
    fuzz::requireError(error);
    return {};
}

qx::Ref<qx::Object> read(QXXMLMarshaller& marshaller, std::string_view document) {
    qx::Ref<qx::Error> error;
    auto object = marshaller.readString(document, &error);
    fuzz::require(marshaller.undoManager()->groupingLevel() == 0, "reading closes its group");
    if (error) {
        fuzz::require(!object, "an object comes without an error");
        fuzz::requireError(error);
    }
    if (object)
        fuzz::require(!object->description().isEmpty(), "an object can be printed");
    return object;
}

// Host objects are given the manager while they are read.
void undoAndRedo(qx::UndoManager& undo) {
    while (undo.canUndo())
        undo.undo();
    while (undo.canRedo())
        undo.redo();
}

// Removes all values in one step, and undoes it.
void clear(QXGenericRecord& record, const qx::Ref<qx::UndoManager>& undo) {
    record.setUndoManager(undo);
    {
        const qx::UndoGroup group(undo);
        for (const qx::String& key : record.keys())
            record.setValueForKey(nullptr, key);
    }
    undo->undo();
    record.setUndoManager(nullptr);
}

void tryOptions(const qx::Ref<QXXMLMarshallingMapping>& mapping, std::string_view document,
                bool lenient, bool keep) {
    const auto marshaller = QXXMLMarshaller::initWithMapping(mapping);
    marshaller->setLenient(lenient);
    marshaller->setSaveUnknownXML(keep);
    const auto object = read(*marshaller, document);
    if (!object)
        return;
    const std::string text = written(*marshaller, object);

    const auto undo = marshaller->undoManager();
    undoAndRedo(*undo);
    fuzz::require(written(*marshaller, object) == text, "undo and redo lead back");
    if (const auto record = object.as<QXGenericRecord>()) {
        clear(*record, undo);
        fuzz::require(written(*marshaller, object) == text, "what was removed is back");
    }
    undo->removeAllActions(); // which may keep what keeps the manager

    if (!text.empty()) {
        const auto parsed = qx::XMLDocument::initWithData(text);
        fuzz::require(static_cast<bool>(parsed), "what is written can be parsed");
        if (const auto again = read(*marshaller, text))
            written(*marshaller, again);
    }
}

} // namespace

extern "C" int LLVMFuzzerInitialize(int* argumentCount, char*** arguments);
extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size);

extern "C" int LLVMFuzzerInitialize(int*, char***) {
    fuzz::offerIncludes();
    describeItem();
    return 0;
}

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    constexpr std::string_view separator = "<?document?>";
    const std::string_view bytes(reinterpret_cast<const char*>(data), size);
    const std::size_t end = bytes.find(separator);
    if (end == std::string_view::npos)
        return 0;
    const auto mappingDocument = qx::XMLDocument::initWithData(bytes.substr(0, end));
    const auto mapping = QXXMLMarshallingMapping::initWithDocument(mappingDocument.get());
    if (!mappingDocument || !mapping)
        return 0;
    std::string_view document = bytes.substr(end + separator.size());
    document.remove_prefix(std::min(document.find_first_not_of(" \n"), document.size()));
    for (const bool lenient : {false, true})
        for (const bool keep : {false, true})
            tryOptions(mapping, document, lenient, keep);
    return 0;
}
