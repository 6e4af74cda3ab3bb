// Writing objects to files, texts and streams.

#include <QXXMLMarshalling/QXXMLMarshaller.h>
#include <QXXMLMarshalling/base/Exception.h>

#include "base/BulkObjects.h"
#include "files/AtomicWrite.h"
#include "files/Files.h"
#include "marshaller/DocumentParsing.h"
#include "marshaller/Marshalling.h"
#include "model/Errors.h"
#include "xml/XMLCharacters.h"
#include "xml/XMLSerializer.h"

#include <utility>

using qx::Error;
using qx::Ref;
using qx::String;
using qx::detail::reset;

namespace {

// Drafts the object and has print(element, limits, size) print the draft of that size. Its names
// are the mapping's, which the marshalling holds: getters may let go of the marshaller. What no XML
// document can hold, or none that could be read again, raises while it is printed.
template <class Print>
bool printed(const QXXMLMarshaller& marshaller, const qx::Value& object, Ref<Error>* error,
             Print print) {
    const qx::XMLParseOptions reading = qx::detail::parsingOf(marshaller);
    const qx::Value held = object; // whatever the getters do to the caller's
    const qx::BulkObjects bulk;    // boxes of structs and lists of them come and go
    qx::XMLDraft draft;
    qx::detail::Marshalling marshalling(marshaller, &draft);
    const auto root = marshalling.marshallObject(held, error);
    if (!root || (error != nullptr && *error))
        return false;
    try {
        print(*root.drafted, reading, draft.size());
        return true;
    } catch (const qx::Exception& exception) {
        return qx::fail(error, qx::errors::textCannotBeWritten, exception.reason());
    }
}

// The text of the object's document; false with an error.
bool print(const QXXMLMarshaller& marshaller, const qx::Value& object, qx::XMLOptions layout,
           Ref<Error>* error, qx::TextBuffer& text) {
    reset(error);
    return printed(marshaller, object, error,
                   [&](const auto& root, const auto& reading, std::size_t size) {
                       // Mostly a document is somewhat smaller than its draft.
                       text.reserve(size);
                       qx::writeDraft(root, layout, reading, text);
                   });
}

// A document of the objects that next() answers, until that is null. The sink opens, takes bytes
// and is committed at the end.
template <class Sink>
bool writeSequence(QXXMLMarshaller& marshaller, Sink& sink, const String& rootName,
                   qx::detail::UniqueFunction<qx::Value()>& next, Ref<Error>* error,
                   qx::XMLOptions layout) {
    constexpr std::size_t blockSize = 64 * 1024;
    reset(error);
    const Ref<QXXMLMarshaller> held(&marshaller); // the producer may let go of it
    if (!qx::isXMLName(rootName))
        return qx::fail(error, qx::errors::textCannotBeWritten,
                        String::concat({rootName, " is no name of an element"}));
    if (!sink.open(error))
        return false;
    const std::string_view lineEnd = (layout & qx::XMLPrettyPrint) != 0 ? "\n" : "";
    const bool isCompact = (layout & qx::XMLCompactEmptyElements) != 0;
    bool isEmpty = true;
    qx::TextBuffer text;
    text += String::concat({"<?xml version=\"1.0\" encoding=\"UTF-8\"?>", lineEnd, "<", rootName})
                .view();
    for (qx::Value object = next(); !object.isNull(); object = next()) {
        if (std::exchange(isEmpty, false))
            text += '>';
        const bool isPrinted = printed(marshaller, object, error,
                                       [&](const auto& element, const auto& reading, std::size_t) {
                                           qx::writeDraftInside(element, layout, reading, text);
                                       });
        if (!isPrinted || (text.size() >= blockSize && !sink.write(text.take(), error)))
            return false;
    }
    if (isEmpty && isCompact)
        text += "/>";
    else
        text += String::concat({isEmpty ? ">" : lineEnd, "</", rootName, ">"}).view();
    text += lineEnd;
    return sink.write(text.view(), error) && sink.commit(error);
}

class StreamSink {
public:
    explicit StreamSink(std::ostream& stream) noexcept : _stream(stream) {}
    static bool open(Ref<Error>*) { return true; }
    bool write(std::string_view bytes, Ref<Error>* error) {
        return qx::writeToStream(_stream, bytes, error);
    }
    static bool commit(Ref<Error>*) { return true; }

private:
    std::ostream& _stream;
};

} // namespace

String QXXMLMarshaller::writeString(const qx::Value& object, Ref<Error>* error,
                                    qx::XMLOptions layout) {
    qx::TextBuffer text;
    return print(*this, object, layout, error, text) ? text.take() : String();
}

bool QXXMLMarshaller::writeFile(const qx::Value& object, const String& path, Ref<Error>* error,
                                qx::XMLOptions layout) {
    qx::TextBuffer text;
    return print(*this, object, layout, error, text) &&
           qx::writeFileAtomically(path, text.view(), error);
}

bool QXXMLMarshaller::writeStream(const qx::Value& object, std::ostream& stream, Ref<Error>* error,
                                  qx::XMLOptions layout) {
    qx::TextBuffer text;
    return print(*this, object, layout, error, text) &&
           qx::writeToStream(stream, text.view(), error);
}

bool QXXMLMarshaller::writeEach(const String& path, const String& rootName, Producer next,
                                Ref<Error>* error, qx::XMLOptions layout) {
    qx::AtomicFile file(path);
    return writeSequence(*this, file, rootName, next, error, layout);
}

bool QXXMLMarshaller::writeEach(std::ostream& stream, const String& rootName, Producer next,
                                Ref<Error>* error, qx::XMLOptions layout) {
    StreamSink sink(stream);
    return writeSequence(*this, sink, rootName, next, error, layout);
}
