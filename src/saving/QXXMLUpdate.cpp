#include <QXXMLMarshalling/QXXMLUpdate.h>

#include "files/AtomicWrite.h"
#include "files/Files.h"
#include "model/Errors.h"
#include "saving/DocumentUpdate.h"

using qx::Error;
using qx::Ref;
using qx::Result;

Result<QXXMLUpdate> QXXMLUpdate::updatedText(QXXMLMarshaller& marshaller, qx::XMLBytes original,
                                             const qx::Value& object) {
    return qx::detail::DocumentUpdate(marshaller, original, object).run();
}

Result<QXXMLUpdate> QXXMLUpdate::updateFile(QXXMLMarshaller& marshaller, const qx::Value& object,
                                            const qx::String& path) {
    Ref<Error> error;
    const auto original = qx::readFile(path, &error, qx::ReadableFiles::regular);
    if (!original)
        return error;
    auto update = updatedText(marshaller, *original, object);
    if (!update || update->edits().empty())
        return update;
    const auto now = qx::readFile(path, &error, qx::ReadableFiles::regular);
    const bool isSame = now && now->view() == original->view();
    if (now && !isSame)
        qx::fail(&error, qx::errors::fileHasChanged, path);
    if (!isSame || !qx::writeFileAtomically(path, update->bytes()->view(), &error))
        return error;
    return update;
}
