#pragma once

// The error record that failing operations leave in their caller's error slot: a domain, a negative
// code, a message and a reason. Texts are put together when they are asked for, so an error that
// nobody reads costs no copy of an element's XML; an error keeps the nodes that its message quotes.
// So are the places that it knows: lines and columns are counted, paths found when asked for, and
// an error of reading keeps the document's text for that.
//
//     qx::Ref<qx::Error> error;                      // a slot must hold null when passed in
//     if (!marshaller->unmarshall(document, &error) && error)
//         std::cerr << error->report().view() << '\n';
//
// An error that a slot holds already counts as one of the operation that looks at the slot: it
// stays there and the result is null, although nothing was wrong. So a slot is used for one
// operation, or set to null before the next; what reads or writes in one step (readFile and the
// like) sets it to null itself. Without a slot a failing operation answers the same,
// but for the steps of reading that say otherwise (QXXMLMarshaller.h): a collection leaves out the
// items that fail.

#include <QXXMLMarshalling/model/Object.h>

#include <memory>
#include <vector>

namespace qx {

namespace detail {
class ErrorDetails;
} // namespace detail

// Where something stands in a document. What is not known is null or 0.
struct DocumentPlace {
    String documentName; // the path of a file, or what XMLDocument::documentName() says
    std::size_t line = 0;
    std::size_t column = 0; // both 1-based, a column being one character (code point)
};

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
    // The same with a code and a domain of its own.
    Error(const ErrorText& text, std::vector<Value> arguments, int code, const char* domain);
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

    // The message on one line, with what it quotes cut to some 120 characters.
    String shortDescription() const;

    // What stands beside the texts, as far as it is known. Any thread may ask, also when the
    // document and the marshaller are gone.
    //
    // Where the document has what is wrong: the fault of a parser, the element or attribute that a
    // reading stopped at. Of trees the elements know their places, attributes have those of theirs.
    DocumentPlace place() const;
    String documentName() const { return place().documentName; }
    std::size_t line() const { return place().line; }
    std::size_t column() const { return place().column; }
    // Such as /orders/order[3]/lines/line[2]/@quantity: a number where several siblings have the
    // name. Of what was to be written the keys that lead to the value from the object, with the
    // positions of items from 0: lines[1].quantity. Deep ones begin with "...".
    String path() const;
    // What of the mapping it was read or written by: the names of the field and of the class, where
    // that field, or else the class, stands in its mapping document, and the includes that led to
    // that document, the nearest first.
    String mappingField() const;
    String mappingClass() const;
    DocumentPlace mappingPlace() const;
    std::vector<DocumentPlace> mappingIncludes() const;
    // What may have been meant, in a few words of English: did you mean "price"?
    String suggestion() const;
    // This error, and those that were collected behind it, in the order of the document; see
    // QXXMLMarshaller::setMaximumErrors().
    std::vector<Ref<const Error>> all() const;

    // The error for people: the short description, then, as far as they are known, a line each for
    // the place, the text there with a mark below it, the place in the mapping, and the suggestion.
    // No line break ends it. Those that were collected have reports of their own, see all().
    //
    //     Unable to set value: twelve for key: price in class: Item
    //       at order.xml:12:11 /order/items/item[2]/@price
    //         <item price="twelve"/>
    //               ^
    //       by order.map.xml:8:13, field "price" of class "Item"
    //       it takes a number
    //
    // Long lines are cut around the mark. Colours are those of terminals.
    enum class Style : std::uint8_t { plain, coloured };
    String report(Style style = Style::plain) const;

    // "domain code: message (reason)".
    String description() const override;

protected:
    const Class& describedClass() const override;

private:
    friend class detail::ErrorDetails;

    const char* _domain;
    int _code;
    const ErrorText* _text = nullptr;
    std::vector<Value> _arguments;
    String _message;
    String _reason;
    std::unique_ptr<detail::ErrorDetails> _details; // null: nothing stands beside the texts
};

} // namespace qx
