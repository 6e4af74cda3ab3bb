#pragma once

// A document that a program edits: a file, and the object that was read from it. Saving changes in
// the file what was edited in the object, and nothing else (QXXMLUpdate.h).
//
//     auto file = QXXMLDocumentFile::open("order.xml", marshaller, &error);
//     file->root()->setValueForKey("shipped", "state");
//     if (file->isEdited() && !file->save(&error)) report(*error);
//
// It holds the text as it was read or saved last: edits are what the object differs in from that.
// Its readings keep unknown XML exactly (QXXMLMarshaller::setKeepsExactly), whatever the marshaller
// does otherwise.
// The object is the program's to change; one thread uses both, as with the marshaller.

#include <QXXMLMarshalling/QXXMLUpdate.h>
#include <QXXMLMarshalling/model/Boxed.h>

class QX_API QXXMLDocumentFile final : public qx::Object {
public:
    // Null with the errors of QXXMLMarshaller::readFile(), and 256 for a pipe or a device.
    static qx::Ref<QXXMLDocumentFile> open(const qx::String& path,
                                           qx::Ref<QXXMLMarshaller> marshaller,
                                           qx::Ref<qx::Error>* error = nullptr);
    ~QXXMLDocumentFile() override;

    const qx::String& path() const noexcept { return _path; }
    // What was read; the same object for good.
    const qx::Ref<qx::Object>& root() const noexcept { return _root; }
    // The root as a T, a plain struct or a class that derives from qx::Object; null where it is
    // none.
    template <class T>
    T* root() const {
        if constexpr (std::derived_from<T, qx::Object>) {
            return _root.template as<T>().get();
        } else {
            const auto box = _root.template as<qx::Boxed<T>>();
            return box ? &**box : nullptr;
        }
    }
    // The text that edits are measured from.
    const qx::Ref<qx::Data>& text() const noexcept { return _text; }

    // The manager with which the objects register their changes; null at first. With one, its saved
    // mark tells whether there are edits; saving and reverting set it.
    void setUndoManager(qx::Ref<qx::UndoManager> manager);
    const qx::Ref<qx::UndoManager>& undoManager() const noexcept { return _undoManager; }
    // Whether saving would change something. Without an undo manager the object is compared with
    // the text, which takes as long as saving does; what cannot be compared counts as edited.
    bool isEdited() const;

    // What becomes of a file that another program has written since it was read or saved here:
    enum class Changed {
        refuse,    // an error, and nothing is written
        overwrite, // it is lost
        carryOver, // edits go into the file as it is now, by their place; the object gets what the
                   // other program has changed
    };
    // Writes the edits into the file, which is replaced in one step; untouched where there are
    // none, and on failure. False with an error of reading or writing files, of
    // QXXMLUpdate::updatedText(), or with
    //   -232  "The file has changed since it was read: %@"
    //   -233  "The file and the object have both changed: %@"   (the key path of an edit whose
    //         lines are others now)
    bool save(qx::Ref<qx::Error>* error = nullptr, Changed changed = Changed::refuse);
    // The same into another file, whatever stands there; the document is that file from then on.
    bool saveAs(const qx::String& path, qx::Ref<qx::Error>* error = nullptr);
    // Reads the file into the object again, as QXXMLMarshaller::readInto() does.
    bool revert(qx::Ref<qx::Error>* error = nullptr);

protected:
    const qx::Class& describedClass() const override;

private:
    QXXMLDocumentFile() = default;
    friend qx::Ref<QXXMLDocumentFile> qx::make<QXXMLDocumentFile>();

    qx::Result<QXXMLUpdate> update(const qx::Ref<qx::Data>& text) const;
    // Where the undo manager stood when a save began: code of the host's may edit the object while
    // that goes on.
    struct SavePoint {
        explicit SavePoint(const QXXMLDocumentFile& file);
        const qx::Ref<qx::UndoManager> undoManager;
        const std::uint64_t position;
    };
    bool write(const qx::String& path, const qx::Ref<qx::Data>& bytes, const SavePoint& point,
               qx::Ref<qx::Error>* error);
    bool carryOver(const qx::Ref<qx::Data>& text, const QXXMLUpdate& update,
                   const qx::Ref<qx::Data>& theirs, qx::Ref<qx::Error>* error);
    void setBase(qx::Ref<qx::Data> text, const SavePoint& point);

    qx::String _path;
    qx::Ref<QXXMLMarshaller> _marshaller;
    qx::Ref<qx::Data> _text;
    qx::Ref<qx::Object> _root;
    qx::Ref<qx::UndoManager> _undoManager;
};
