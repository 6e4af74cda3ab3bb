#pragma once

// The error record that failing operations leave in their caller's error slot: a domain, a negative
// code, a message and a reason. Texts are put together when they are asked for, so an error that
// nobody reads costs no copy of an element's XML; an error keeps the nodes that its message quotes.
//
//     qx::Ref<qx::Error> error;                      // a slot must hold null when passed in
//     if (!marshaller->unmarshall(document, &error) && error)
//         std::cerr << error->localizedDescription().view() << '\n';
//
// An error that a slot holds already counts as one of the operation that looks at the slot: it
// stays there and the result is null, although nothing was wrong. So a slot is used for one
// operation, or set to null before the next; what reads or writes in one step (readFile and the
// like) sets it to null itself. Without a slot a failing operation answers the same,
// but for the steps of reading that say otherwise (QXXMLMarshaller.h): a collection leaves out the
// items that fail.

#include <QXXMLMarshalling/model/Object.h>

#include <vector>

namespace qx {

// One row of an error table: the texts are keys for localisation, in English.
struct ErrorText {
    int code;
    const char* message;
    const char* reason;
};

class QX_API Error final : public Object {
public:
    static constexpr const char* cocoaDomain = "NSCocoaErrorDomain";
    static constexpr const char* parserDomain = "NSXMLParserErrorDomain";

    // `text` must live for ever (a constant); it is put into the user's language and filled with
    // `arguments` when asked for.
    Error(const ErrorText& text, std::vector<Value> arguments);
    // The same with a reason of its own.
    Error(const ErrorText& text, std::vector<Value> arguments, String reason);
    // The same in another domain, with a place in a document.
    Error(const char* domain, const ErrorText& text, int code, std::vector<Value> arguments,
          std::size_t line, std::size_t column);
    // An error whose texts are final, with the place in a document where it came about (0: none).
    Error(const char* domain, int code, String message, String reason, std::size_t line = 0,
          std::size_t column = 0);
    ~Error() override;

    String domain() const;
    int code() const noexcept { return _code; }
    // NSLocalizedDescriptionKey: the message in the user's language.
    String localizedDescription() const;
    // NSLocalizedFailureReasonErrorKey.
    String localizedFailureReason() const;
    // 1-based place in the document, for parse errors; 0 where the error has none.
    std::size_t line() const noexcept { return _line; }
    std::size_t column() const noexcept { return _column; }

    // "domain code: message (reason)".
    String description() const override;

protected:
    const Class& describedClass() const override;

private:
    const char* _domain;
    int _code;
    const ErrorText* _text = nullptr;
    std::vector<Value> _arguments;
    String _message;
    String _reason;
    std::size_t _line = 0;
    std::size_t _column = 0;
};

} // namespace qx
