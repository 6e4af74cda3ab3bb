#include <QXXMLMarshalling/QXXMLUpdate.h>

#include "files/AtomicWrite.h"
#include "files/Files.h"
#include "saving/DocumentUpdate.h"

using qx::Error;
using qx::Ref;
using qx::Result;

Result<QXXMLUpdate> QXXMLUpdate::updatedText(QXXMLMarshaller& marshaller, qx::XMLBytes original,
                                             const qx::Value& object) {
    // A copy: getters may change what the caller holds.
    auto bytes = qx::make<qx::Data>(original.view());
    return qx::detail::DocumentUpdate(marshaller, std::move(bytes), object).run();
}

Result<QXXMLUpdate> QXXMLUpdate::updateFile(QXXMLMarshaller& marshaller, const qx::Value& object,
                                            const qx::String& path) {
    Ref<Error> error;
    const auto original = qx::readFile(path, &error);
    if (!original)
        return error;
    auto update = qx::detail::DocumentUpdate(marshaller, original, object).run();
    const bool isToBeWritten = update && !update->edits().empty();
    if (isToBeWritten && !qx::writeFileAtomically(path, update->bytes()->view(), &error))
        return error;
    return update;
}
