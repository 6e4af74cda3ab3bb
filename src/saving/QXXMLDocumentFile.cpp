#include <QXXMLMarshalling/QXXMLDocumentFile.h>

#include "files/AtomicWrite.h"
#include "files/Files.h"
#include "marshaller/DocumentParsing.h"
#include "model/Errors.h"
#include "model/LibraryClass.h"
#include "saving/SourceEncoding.h"
#include "saving/TextMerge.h"
#include "xml/XMLParser.h"

using qx::Data;
using qx::Error;
using qx::Ref;
using qx::String;

namespace {

// What a field took, too, would grow old in the object while its value is edited: the file's
// readings keep exactly.
class ExactKeeping {
public:
    explicit ExactKeeping(Ref<QXXMLMarshaller> marshaller)
        : _marshaller(std::move(marshaller)), _was(_marshaller->keepsExactly()) {
        _marshaller->setKeepsExactly(true);
    }
    ~ExactKeeping() { _marshaller->setKeepsExactly(_was); }
    ExactKeeping(const ExactKeeping&) = delete;
    ExactKeeping& operator=(const ExactKeeping&) = delete;

private:
    const Ref<QXXMLMarshaller> _marshaller;
    const bool _was;
};

} // namespace

QXXMLDocumentFile::~QXXMLDocumentFile() = default;

Ref<QXXMLDocumentFile> QXXMLDocumentFile::open(const String& path, Ref<QXXMLMarshaller> marshaller,
                                               Ref<Error>* error) {
    qx::detail::reset(error);
    if (!marshaller)
        marshaller = QXXMLMarshaller::initWithMapping(nullptr);
    auto text = qx::readFile(path, error, qx::ReadableFiles::regular);
    if (!text)
        return nullptr;
    Ref<Error> problem;
    const ExactKeeping exact(marshaller);
    auto root = marshaller->readString(*text, &problem);
    if (problem || !root) {
        if (error != nullptr)
            *error = std::move(problem);
        return nullptr;
    }
    auto file = qx::make<QXXMLDocumentFile>();
    file->_path = path;
    file->_marshaller = std::move(marshaller);
    file->_text = std::move(text);
    file->_root = std::move(root);
    return file;
}

void QXXMLDocumentFile::setUndoManager(Ref<qx::UndoManager> manager) {
    _undoManager = std::move(manager);
}

QXXMLDocumentFile::SavePoint::SavePoint(const QXXMLDocumentFile& file)
    : undoManager(file._undoManager), position(undoManager ? undoManager->position() : 0) {}

void QXXMLDocumentFile::setBase(Ref<Data> text, const SavePoint& point) {
    _text = std::move(text);
    if (point.undoManager)
        point.undoManager->setSavedMark(point.position);
}

// Code of the host's may let go of the file while the object is read, or save it.
qx::Result<QXXMLUpdate> QXXMLDocumentFile::update(const Ref<Data>& text) const {
    const Ref<const QXXMLDocumentFile> kept(this);
    const ExactKeeping exact(_marshaller);
    return QXXMLUpdate::updatedText(*_marshaller, *text, _root);
}

bool QXXMLDocumentFile::isEdited() const {
    if (_undoManager)
        return !_undoManager->isAtSavedMark();
    const Ref<Data> text = _text;
    const auto update = this->update(text);
    return !update || !update->edits().empty();
}

bool QXXMLDocumentFile::write(const String& path, const Ref<Data>& bytes, const SavePoint& point,
                              Ref<Error>* error) {
    if (!qx::writeFileAtomically(path, bytes->view(), error))
        return false;
    setBase(bytes, point);
    return true;
}

bool QXXMLDocumentFile::save(Ref<Error>* error, Changed changed) {
    qx::detail::reset(error);
    const Ref<QXXMLDocumentFile> kept(this);
    const SavePoint point(*this);
    const Ref<Data> text = _text;
    const auto update = this->update(text);
    if (!update) {
        if (error != nullptr)
            *error = update.error();
        return false;
    }
    const auto theirs = qx::readFile(_path, error, qx::ReadableFiles::regular);
    if (!theirs)
        return false;
    const bool isSame = theirs->view() == text->view();
    if (!isSame && changed == Changed::refuse)
        return qx::fail(error, qx::errors::fileHasChanged, _path);
    if (!isSame && changed == Changed::carryOver)
        return carryOver(text, *update, theirs, error);
    if (isSame && update->edits().empty()) {
        setBase(text, point);
        return true;
    }
    return write(_path, update->bytes(), point, error);
}

bool QXXMLDocumentFile::saveAs(const String& path, Ref<Error>* error) {
    qx::detail::reset(error);
    const Ref<QXXMLDocumentFile> kept(this);
    const SavePoint point(*this);
    const Ref<Data> text = _text;
    const String to = path; // which may be the file's own
    const auto update = this->update(text);
    if (!update && error != nullptr)
        *error = update.error();
    if (!update || !write(to, update->bytes(), point, error))
        return false;
    _path = to;
    return true;
}

bool QXXMLDocumentFile::revert(Ref<Error>* error) {
    qx::detail::reset(error);
    const Ref<QXXMLDocumentFile> kept(this);
    const ExactKeeping exact(_marshaller);
    auto text = qx::readFile(_path, error, qx::ReadableFiles::regular);
    if (!text || !_marshaller->readStringInto(_root, *text, error))
        return false;
    setBase(std::move(text), SavePoint(*this));
    return true;
}

// The merged text is read before anything is written: a text that was carried to a wrong place may
// be none.
bool QXXMLDocumentFile::carryOver(const Ref<Data>& text, const QXXMLUpdate& update,
                                  const Ref<Data>& theirs, Ref<Error>* error) {
    const ExactKeeping exact(_marshaller);
    const auto options = qx::detail::parsingOf(*_marshaller);
    const auto base = qx::XMLParser::parse(text, options, error);
    const auto now = base ? qx::XMLParser::parse(theirs, options, error) : nullptr;
    if (!now)
        return false;
    String conflict;
    const auto merged = qx::detail::carriedOver(base->index().text(), update.edits(),
                                                now->index().text(), conflict);
    if (!merged)
        return qx::fail(error, qx::errors::bothHaveChanged, conflict);
    const auto bytes =
        qx::detail::SourceEncoding(theirs->view()).encoded(*merged, now->index().text(), error);
    Ref<Error> problem;
    if (!bytes || !_marshaller->readString(*bytes, &problem) || problem) {
        if (problem && error != nullptr)
            *error = std::move(problem);
        return false;
    }
    if (!write(_path, bytes, SavePoint(*this), error) ||
        !_marshaller->readStringInto(_root, *bytes, error))
        return false;
    setBase(bytes, SavePoint(*this));
    return true;
}

const qx::Class& QXXMLDocumentFile::describedClass() const {
    return qx::libraryClass<QXXMLDocumentFile>("QXXMLDocumentFile");
}
