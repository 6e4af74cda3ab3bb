#pragma once

// Saves an object into the document that it was read from, and changes nothing there but what was
// edited: comments, order, layout, quotes, references and all that the mapping does not know stay
// byte for byte.
//
//     auto update = QXXMLUpdate::updatedText(*marshaller, text, order);
//     if (!update) return report(*update.error());
//     for (const auto& edit : update->edits()) std::cout << edit.keyPath.view() << '\n';
//     send(update->bytes());
//
// The document is read once more and what was read is written; so is the object. Where the two
// differ the object was edited, and that is carried to the text. Objects of the mapping's classes
// are made for that, which register no undo; a progress handler hears of those readings, too. The
// result is read again before it is handed out: it says what the object says, or there is an error.
// Whatever the rules of reading and writing drop or put elsewhere touches nothing.
//
// One thread at a time, as for the marshaller. The object is read only.

#include <QXXMLMarshalling/QXXMLMarshaller.h>

#include <vector>

namespace qx::detail {
class DocumentUpdate;
}

class QX_API QXXMLUpdate {
public:
    // A place in the original that says something else now: its offset in bytes of the text as
    // UTF-8, without a byte-order mark, its line and column, both from 1; what stood there and what
    // stands there now. The key path begins at the root.
    struct Edit {
        std::size_t offset = 0;
        std::size_t line = 0;
        std::size_t column = 0;
        qx::String keyPath;
        qx::String oldText;
        qx::String newText;
    };
    struct Unshown {
        qx::String keyPath;
        qx::String value;
    };

    // The document with the object's changes, in its own encoding. The original has to be one that
    // the marshaller reads. Errors are those of reading it and of writing the object, and
    //   -211  "The root is of class: %@, not of class: %@"   (the document's, the object's)
    //   -230  "The document has no place of its own for the new value of: %@"   (the key path): an
    //         attribute's default or an entity brings the value in
    //   -230  "The document has one place for the new values of: %@ and: %@"   (key paths): two
    //         fields share an attribute, or text is taken as a whole
    //   -230  "The document cannot be changed to say the new value of: %@, which would be read
    //         as: %@"   (the key path, the text or "nothing"): the mapping writes the value where
    //         it does not read it
    //   -230  "The document could not be read with the new value of: %@: %@"   (the key path of the
    //         first edit, the error)
    //   -231  "The document cannot be changed in its encoding: %@"
    //   517   "The text cannot be written: %@"
    static qx::Result<QXXMLUpdate> updatedText(QXXMLMarshaller& marshaller, qx::XMLBytes original,
                                               const qx::Value& object);
    // The same, and the file gets the new bytes, in one step; untouched where there are no edits,
    // and on failure. Besides the errors above, those of reading and of writing files (256 for a
    // pipe or a device, too), and
    //   -232  "The file has changed since it was read: %@"
    static qx::Result<QXXMLUpdate> updateFile(QXXMLMarshaller& marshaller, const qx::Value& object,
                                              const qx::String& path);
    // The same for a plain struct, which is read where it is.
    template <qx::WritableStruct T>
    static qx::Result<QXXMLUpdate> updatedText(QXXMLMarshaller& marshaller, qx::XMLBytes original,
                                               const T& object) {
        return updatedText(marshaller, original, qx::detail::lend(object));
    }
    template <qx::WritableStruct T>
    static qx::Result<QXXMLUpdate> updateFile(QXXMLMarshaller& marshaller, const T& object,
                                              const qx::String& path) {
        return updateFile(marshaller, qx::detail::lend(object), path);
    }

    const qx::Ref<qx::Data>& bytes() const noexcept { return _bytes; }
    // In the order of the text; empty where the bytes are the original's.
    const std::vector<Edit>& edits() const noexcept { return _edits; }
    // The key paths of what was written anew with its element, because its change could be carried
    // in no other way: comments and unknown XML inside are gone with the old one, layout too.
    const std::vector<qx::String>& writtenAnew() const noexcept { return _writtenAnew; }
    // Values of the object that no XML shows, and that reading would not give: an optional zero
    // where the document has none, what a text field writes over. Also the text of unknown XML that
    // an object keeps, not exactly, from an earlier reading, and that a field would take.
    const std::vector<Unshown>& unshown() const noexcept { return _unshown; }

private:
    friend class qx::detail::DocumentUpdate;

    qx::Ref<qx::Data> _bytes;
    std::vector<Edit> _edits;
    std::vector<qx::String> _writtenAnew;
    std::vector<Unshown> _unshown;
};
