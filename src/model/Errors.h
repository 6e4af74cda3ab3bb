#pragma once

// Every error text that the library reports by itself, and the one way to report it; what a parser
// says of a place in a document is in xml/ParseFailure.h. A text stands here once;
// share/<language>.lproj/Localizable.strings holds its translations, found by the English text.
// Operations hand the helper's answer straight on, whatever they return:
//
//     return fail(error, errors::classRedefined, className);       // false, a null Ref or String
//
// Arguments are only looked at when the caller passed a slot. One that costs something to work out
// is passed as a callable, which is then not called either.

#include <QXXMLMarshalling/model/Error.h>

#include <concepts>

namespace qx {

namespace errors {

inline constexpr const char* invalidXML = "Invalid XML";
inline constexpr const char* invalidValue = "Invalid Value";

// Mapping documents and data documents.
inline constexpr ErrorText tooManyDescriptions{-200, "Too many descriptions in element: %@",
                                               invalidXML};
inline constexpr ErrorText tooManyMapToElements{-201, "Too many map-to elements in element: %@",
                                                invalidXML};
inline constexpr ErrorText requiredAttributeNotFound{
    -202, "Required attribute: %@ not found in element: %@", invalidXML};
inline constexpr ErrorText requiredAttributeMissing{
    -202, "Required attribute missing for field: %@ in element: %@", invalidXML};
inline constexpr ErrorText requiredTextMissing{
    -202, "Required text missing for field: %@ in element: %@", invalidXML};
inline constexpr ErrorText requiredElementMissing{
    -202, "Missing required element named: %@ in element: %@", invalidXML};
inline constexpr ErrorText illegalBoolean{-203, "Boolean attribute: %@ has an illegal value: %@",
                                          invalidXML};
inline constexpr ErrorText tooManyBindXMLElements{-204, "Too many bind-xml elements in element: %@",
                                                  invalidXML};
inline constexpr ErrorText classRedefined{-205, "Class redefined: %@", invalidXML};
inline constexpr ErrorText elementRedefined{-205, "Element redefined: %@ class: %@", invalidXML};
inline constexpr ErrorText noMappingForClass{-207, "No mapping for class: %@", invalidXML};
inline constexpr ErrorText noMappingForDeclaredClass{-207, "No mapping for declared class: %@",
                                                     invalidXML};
inline constexpr ErrorText unknownCollectionClass{-208, "Unable to process collection class: %@",
                                                  invalidXML};
// Nothing causes it: a word that "node" does not know counts as none. Its code stays taken.
inline constexpr ErrorText unknownFieldNodeType{-209, "Unknown field node type: %@ - %@",
                                                invalidXML};
inline constexpr ErrorText tooManyChildren{-210, "Too many children with name: %@ in element: %@",
                                           invalidXML};
inline constexpr ErrorText tooManyChildElements{
    -210, "Too many child elements of name: %@ in element: %@", invalidXML};
inline constexpr ErrorText noClassName{-211, "No class name for marshalling defined: %@",
                                       invalidXML};
inline constexpr ErrorText noMappingDefinition{-211, "No mapping definition for class: %@",
                                               invalidXML};
inline constexpr ErrorText noExtendsWhenMarshalling{
    -211, "No extends definition for class during marshaling: %@", invalidXML};
inline constexpr ErrorText noExtends{-211, "No extends definition for class: %@", invalidXML};
inline constexpr ErrorText noDefinitionForElement{-211, "No definition to handle element: %@",
                                                  "Invalid Mapping"};
inline constexpr ErrorText rootOfOtherClass{-211, "The root is of class: %@, not of class: %@",
                                            "Invalid Mapping"};
inline constexpr ErrorText requiredValueMissing{
    -212, "Required value missing for field: %@ in object: %@", invalidValue};
inline constexpr ErrorText tooManyClassElements{-213, "Too many class elements in element: %@",
                                                invalidXML};
inline constexpr ErrorText unknownFields{
    -214, "Unknown fields found in XML document: %@ element: %@", invalidXML};
inline constexpr ErrorText unknownAttributes{
    -215, "Unknown attributes found in XML document: %@ element: %@", invalidXML};
inline constexpr ErrorText unableToLoadInclude{-218, "Unable to load included file: %@",
                                               "Unable to load included document"};
inline constexpr ErrorText alternativesWithoutBindXML{
    -219, "alt-xml defined with no bind-xml elements in element: %@", invalidXML};
inline constexpr ErrorText tooManyElementsForField{
    -220, "Too many elements defined for field: %@ in element: %@", invalidXML};
inline constexpr ErrorText notAnInteger{-221, "<%@>: Unable to convert value to integer: %@",
                                        invalidXML};
inline constexpr ErrorText unableToSetValue{
    -222, "Unable to set value: %@ for key: %@ in class: %@", invalidValue};
inline constexpr ErrorText objectOfWrongClass{
    -222, "Unable to set value: %@ for key: %@ in class: %@, which takes: %@", invalidValue};
inline constexpr ErrorText nestedTooDeep{-223, "Objects nest deeper than the limit of %@: %@",
                                         invalidValue};
inline constexpr ErrorText tooManyObjects{
    -224, "Reading makes more objects than the limit of %@: %@", "Invalid Mapping"};
inline constexpr ErrorText tooManyKeptNodes{
    -224, "Reading keeps more nodes than the limit of %@: %@", "Invalid Mapping"};
inline constexpr ErrorText tooManyVisits{
    -224, "Reading goes over more nodes than the limit of %@: %@", "Invalid Mapping"};
inline constexpr ErrorText noNamespacePrefix{-225, "%@ cannot be the prefix of the namespace: %@",
                                             "Invalid Mapping"};
inline constexpr ErrorText prefixOfTwoNamespaces{
    -225, "The prefix: %@ would stand for two namespaces: %@ and: %@", "Invalid Mapping"};
inline constexpr ErrorText namespaceOfTwoPrefixes{
    -225, "The namespace: %@ would have two prefixes: %@ and: %@", "Invalid Mapping"};
inline constexpr ErrorText readingCancelled{-226, "The reading was cancelled",
                                            "The program asked for it."};
inline constexpr ErrorText changeHasNoPlace{
    -230, "The document has no place of its own for the new value of: %@", invalidValue};
inline constexpr ErrorText changesMeet{
    -230, "The document has one place for the new values of: %@ and: %@", invalidValue};
inline constexpr ErrorText changeReadsOtherwise{
    -230, "The document cannot be changed to say the new value of: %@, which would be read as: %@",
    invalidValue};
inline constexpr ErrorText changeCannotBeRead{
    -230, "The document could not be read with the new value of: %@: %@", invalidValue};
inline constexpr ErrorText encodingCannotBeKept{
    -231, "The document cannot be changed in its encoding: %@", invalidXML};
inline constexpr ErrorText fileHasChanged{-232, "The file has changed since it was read: %@",
                                          "Another program has written it."};
inline constexpr ErrorText bothHaveChanged{-233, "The file and the object have both changed: %@",
                                           invalidValue};
inline constexpr ErrorText areaIsNoDirectory{
    -2000, "Application support area is not a directory: %@", "Unable to write XML to user area"};

// Files. Where the reason is empty, the operating system's own text is given.
inline constexpr ErrorText readFailed{256, "The file cannot be read: %@", ""};
inline constexpr ErrorText noLocalURL{256, "Cannot read %@", "No URL of a local file"};
inline constexpr ErrorText streamNotRead{256, "Cannot read the document from its stream",
                                         "The stream failed"};
inline constexpr ErrorText streamNotWritten{512, "Cannot write the document to its stream",
                                            "The stream failed"};
inline constexpr ErrorText noRegularFile{256, readFailed.message,
                                         "It is a pipe, a socket or a device."};
inline constexpr ErrorText fileTooLarge{256, readFailed.message,
                                        "It is larger than the limit for such files."};
inline constexpr ErrorText readNotPermitted{257, "Permission to read is missing: %@", ""};
inline constexpr ErrorText fileNotFound{260, "There is no such file: %@", ""};
inline constexpr ErrorText writeFailed{512, "The file cannot be written: %@", ""};
inline constexpr ErrorText noRegularTarget{512, writeFailed.message, noRegularFile.reason};
inline constexpr ErrorText writeNotPermitted{513, "Permission to write is missing: %@", ""};
inline constexpr ErrorText invalidFileName{
    514, "The file name is invalid.",
    "A name has to be a relative path that stays inside its directory."};
inline constexpr ErrorText diskFull{640, "The disk is too full to write: %@", ""};
inline constexpr ErrorText textCannotBeWritten{517, "The text cannot be written: %@", ""};
inline constexpr ErrorText readOnlyDisk{642, "The disk is read-only: %@", ""};

} // namespace errors

// What a failed operation returns: false, or null.
struct Failure {
    operator bool() const noexcept { return false; }
    template <class T>
    operator Ref<T>() const noexcept {
        return nullptr;
    }
    operator String() const noexcept { return nullptr; }
};

// Stores an error with that text and those arguments.
void storeError(Ref<Error>& error, const ErrorText& text, std::vector<Value> arguments);

namespace detail {
template <class Argument>
Value errorArgument(const Argument& argument) {
    if constexpr (std::invocable<const Argument&>)
        return Value(argument());
    else
        return Value(argument);
}
} // namespace detail

// Reports the failure to a caller who passed a slot. Arguments are whatever makes a Value, or
// callables that return such a thing.
template <class... Arguments>
Failure fail(Ref<Error>* error, const ErrorText& text, const Arguments&... arguments) {
    if (error != nullptr)
        storeError(*error, text, {detail::errorArgument(arguments)...});
    return {};
}

} // namespace qx
