// Writing objects to files, texts and streams.

#include <QXXMLMarshalling/QXXMLMarshaller.h>
#include <QXXMLMarshalling/base/Exception.h>

#include "files/AtomicWrite.h"
#include "files/Files.h"
#include "marshaller/DocumentParsing.h"
#include "marshaller/Marshalling.h"
#include "model/Errors.h"
#include "xml/XMLSerializer.h"

using qx::Error;
using qx::Ref;
using qx::String;

namespace {

// Calls use(text) with the document of the object, which is drafted and printed; what use()
// answers. The draft's names are the mapping's, which the marshalling holds: getters may let go of
// the marshaller. What no XML document can hold, or none that could be read again, raises while it
// is printed.
template <class Use>
auto withDocument(const QXXMLMarshaller& marshaller, const qx::Value& object, qx::XMLOptions layout,
                  Ref<Error>* error, Use use) -> decltype(use(std::declval<qx::TextBuffer&>())) {
    if (error != nullptr)
        error->reset();
    const qx::XMLParseOptions reading = qx::detail::parsingOf(marshaller);
    const qx::Value held = object; // whatever the getters do to the caller's
    qx::XMLDraft draft;
    qx::detail::Marshalling marshalling(marshaller, &draft);
    const auto root = marshalling.marshallObject(held, error);
    if (!root || (error != nullptr && *error))
        return {};
    try {
        qx::TextBuffer text;
        qx::writeDraft(*root.drafted, layout, reading, text);
        return use(text);
    } catch (const qx::Exception& exception) {
        return qx::fail(error, qx::errors::textCannotBeWritten, exception.reason());
    }
}

} // namespace

String QXXMLMarshaller::writeString(const qx::Value& object, Ref<Error>* error,
                                    qx::XMLOptions layout) {
    return withDocument(*this, object, layout, error,
                        [](qx::TextBuffer& text) { return text.take(); });
}

bool QXXMLMarshaller::writeFile(const qx::Value& object, const String& path, Ref<Error>* error,
                                qx::XMLOptions layout) {
    return withDocument(*this, object, layout, error, [&](const qx::TextBuffer& text) {
        return qx::writeFileAtomically(path, text.view(), error);
    });
}

bool QXXMLMarshaller::writeStream(const qx::Value& object, std::ostream& stream, Ref<Error>* error,
                                  qx::XMLOptions layout) {
    return withDocument(*this, object, layout, error, [&](const qx::TextBuffer& text) {
        return qx::writeToStream(stream, text.view(), error);
    });
}
