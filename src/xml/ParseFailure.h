#pragma once

// Why a document cannot be read: thrown while it is prepared and parsed, caught before any frame of
// the C parser, and turned into the caller's error.
//
// The library's own texts for that stand here once, with the codes that the C parser has for such
// faults; they are translated like those of model/Errors.h. What the C parser itself
// finds is told in its own words, in English.

#include <QXXMLMarshalling/model/Error.h>

namespace qx {

namespace parseErrors {

inline constexpr const char* notWellFormed = "The document is not well-formed XML";
inline constexpr const char* beyondLimit = "The document exceeds a limit";
inline constexpr const char* notAllowed = "The document is not accepted";
inline constexpr const char* notReadable = "The document's encoding cannot be read";

inline constexpr ErrorText empty{4, "The document is empty", notWellFormed};
inline constexpr ErrorText noStartTag{3, "Start tag expected, '<' not found", notWellFormed};
inline constexpr ErrorText zeroByte{9, "The document holds a zero byte", notWellFormed};
inline constexpr ErrorText unknownVersion{108, "The version %@ is no version of XML",
                                          notWellFormed};
inline constexpr ErrorText externalEntity{
    29, "The entity %@ stands outside of the document and is not read", notWellFormed};
inline constexpr ErrorText undeclaredEntity{26, "The entity %@ is not declared", notWellFormed};
inline constexpr ErrorText notationWithoutIdentifier{105, "The notation %@ has no identifier",
                                                     notWellFormed};
inline constexpr ErrorText doctypeRefused{
    1, "The document has a DOCTYPE, which is not allowed here", notAllowed};

inline constexpr ErrorText unknownEncoding{32, "The encoding %@ is not known", notReadable};
inline constexpr ErrorText otherEncoding{
    81, "The document is not in the encoding that it declares, %@", notReadable};
inline constexpr ErrorText malformedCharacter{81, "A character is not in the encoding %@",
                                              notReadable};

inline constexpr ErrorText documentTooLarge{1, "The document is larger than 2 GB", beyondLimit};
inline constexpr ErrorText tooDeep{1, "Elements nest deeper than the limit of %@", beyondLimit};
inline constexpr ErrorText nameTooLarge{1, "A name is larger than the limit of %@ bytes",
                                        beyondLimit};
inline constexpr ErrorText valueTooLarge{
    1, "An attribute's value is larger than the limit of %@ bytes", beyondLimit};
inline constexpr ErrorText textTooLarge{1, "A text is larger than the limit of %@ bytes",
                                        beyondLimit};
inline constexpr ErrorText commentTooLarge{1, "A comment is larger than the limit of %@ bytes",
                                           beyondLimit};
inline constexpr ErrorText instructionTooLarge{
    1, "A processing instruction is larger than the limit of %@ bytes", beyondLimit};
inline constexpr ErrorText tooManyNames{
    1, "The document has more different names than the limit of %@", beyondLimit};
inline constexpr ErrorText subsetTooLarge{1, "The DOCTYPE declares more than the limit of %@ bytes",
                                          beyondLimit};
inline constexpr ErrorText entitiesTooDeep{
    89, "Entities refer to themselves, or nest deeper than the limit of %@", beyondLimit};
inline constexpr ErrorText tooManyDefaults{1, "More attributes have defaults than the limit of %@",
                                           beyondLimit};
inline constexpr ErrorText tooManyAttributes{
    1, "An element has more attributes than the limit of %@", beyondLimit};
inline constexpr ErrorText tooManyNamespaces{
    1, "More namespace declarations are in force than the limit of %@", beyondLimit};
inline constexpr ErrorText expansionTooLarge{
    89, "Entities and attribute defaults bring in more than the limit of %@ bytes", beyondLimit};

} // namespace parseErrors

struct ParseFailure {
    bool isOfEncoding() const noexcept { return code == parseErrors::otherEncoding.code; }
    // What may help, in a few words of English; null where there is nothing to say.
    String suggestion() const;

    // The offset of a failure that came about where the parser stands.
    static constexpr std::size_t here = static_cast<std::size_t>(-1);

    // One of ours.
    explicit ParseFailure(const ErrorText& ours, std::vector<Value> filledIn = {},
                          std::size_t at = here);
    // What the C parser says of a document that is not well-formed.
    ParseFailure(int parsersCode, std::string_view parsersMessage, std::size_t at);

    int code;
    const ErrorText* text;
    std::vector<Value> arguments;
    // Into the document as UTF-8 text.
    std::size_t offset;
};

} // namespace qx
