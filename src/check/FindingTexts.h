#pragma once

// Every kind of finding: its name, how grave it is, and what it says. The texts are keys for
// localisation, in English; share/<language>.lproj/Localizable.strings holds their translations.

#include <QXXMLMarshalling/QXXMLFinding.h>

namespace qx::detail {

struct FindingText {
    using Severity = QXXMLFinding::Severity;

    constexpr FindingText(const char* itsKind, Severity itsSeverity, const char* itsMessage)
        : kind(itsKind), severity(itsSeverity), message(itsMessage) {}

    const char* kind;
    Severity severity;
    const char* message;
};

namespace findings {

inline constexpr auto note = FindingText::Severity::note;
inline constexpr auto warning = FindingText::Severity::warning;
inline constexpr auto error = FindingText::Severity::error;

// The words of the mapping language.
inline constexpr FindingText
    unknownElement("unknown-element", warning,
                   "The element %@ has no meaning in %@ and is passed over");
inline constexpr FindingText
    misplacedElement("misplaced-element", warning,
                     "The element %@ has no meaning in %@, only in %@, and is passed over");
inline constexpr FindingText
    unknownAttribute("unknown-attribute", warning,
                     "The attribute %@ has no meaning on %@ and is passed over");
inline constexpr FindingText
    misplacedAttribute("misplaced-attribute", warning,
                       "The attribute %@ has no meaning on %@, only on %@, and is passed over");
inline constexpr FindingText attributeWithoutEffect("no-effect", note,
                                                    "The attribute %@ of %@ has no effect");
inline constexpr FindingText classWithoutEffect("no-effect", note,
                                                "A class inside of bind-xml has no effect");
inline constexpr FindingText prefixWithoutEffect("no-effect", warning,
                                                 "An ns-prefix without an ns-uri has no effect");
inline constexpr FindingText strayText("stray-text", note, "Text in %@ has no meaning: %@");
inline constexpr FindingText strayContent("stray-text", warning, "Text in %@ has no meaning: %@");
inline constexpr FindingText emptyName("no-xml-name", warning, "The name of the %@ is empty");
inline constexpr FindingText
    nodeOfCollection("no-effect", warning,
                     "A collection takes child elements: the node %@ is passed over");
inline constexpr FindingText otherRoot("other-root", note,
                                       "The root element is %@: it is read as a mapping");
inline constexpr FindingText
    wordAsRoot("other-root", warning,
               "The root element is %@: it stands for the mapping, and has no meaning itself");
inline constexpr FindingText unknownNode(
    "unknown-node", warning,
    "%@ is no node: an attribute or a child is read, and a text is written as an attribute");
inline constexpr FindingText
    unknownCollection("unknown-collection", error,
                      "%@ is no kind of collection: reading the class %@ fails");
inline constexpr FindingText noXMLName("no-xml-name", error,
                                       "%@ is no XML name: no document can have it");

// What names something else.
inline constexpr FindingText includeWithoutName("include-without-href", warning,
                                                "The include has no href and adds nothing");
inline constexpr FindingText includeNotFound("include-not-found", warning,
                                             "No document is called %@: the include adds nothing");
inline constexpr FindingText noClasses("no-classes", warning, "The mapping holds no class");
inline constexpr FindingText
    unknownExtends("unknown-extends", error,
                   "No class is called %@: reading and writing the class %@ fails");
inline constexpr FindingText
    extendsItself("extends-itself", error,
                  "The class %@ extends itself: reading and writing it fails");
inline constexpr FindingText
    flattenedIntoItself("flattened-itself", error,
                        "The class %@ is flattened into itself: reading it fails");
inline constexpr FindingText
    unknownItemType("unknown-type", error,
                    "The type %@ names no class: reading and writing the collection fails");
inline constexpr FindingText
    unknownElementType("unknown-type", error,
                       "The type %@ names no class: writing the field fails");
inline constexpr FindingText unknownType("unknown-type", warning,
                                         "The type %@ names no class: values are as without it");

// Where a field is looked for.
inline constexpr FindingText fieldWithoutBinding("never-read", warning,
                                                 "Without a bind-xml the field is never read");
inline constexpr FindingText requiredWithoutBinding(
    "never-read", error,
    "Without a bind-xml the required field is never found: reading the class %@ fails");
inline constexpr FindingText
    itemsWithoutName("never-read", warning,
                     "Without a name in the bind-xml no item of the class %@ is found");
inline constexpr FindingText
    nameTriedBefore("unreachable-alternative", warning,
                    "The field has this name already: it is never tried again");
inline constexpr FindingText
    alternativeWithoutName("unreachable-alternative", warning,
                           "An alternative without a name is never tried here");
inline constexpr FindingText alternativeOfFlattened(
    "unreachable-alternative", warning,
    "A flattened object has no name in the document: the alternative is never tried");
inline constexpr FindingText locationNotUsed(
    "unused-location", warning,
    "A location counts for attributes and typed collections only: %@ is passed over");
inline constexpr FindingText
    locationOnlyRead("unused-location", warning,
                     "The attribute is read from %@, but written without it");
inline constexpr FindingText containerOfNoObject(
    "container", warning,
    "A container of false is for objects: writing fails where the field has no value");
inline constexpr FindingText fieldTwice(
    "duplicate-field", warning,
    "The class %@ has a field of this name, too: one of two values is lost, or both are written");
inline constexpr FindingText
    sameAttribute("same-place", warning, "The field %@ has the same attribute: it is written once");
inline constexpr FindingText
    sameElement("same-place", warning,
                "The field %@ has the same element: both are written, and cannot be read back");
inline constexpr FindingText
    sameItems("same-place", warning,
              "The field %@ takes the same elements: they are written twice");

// What does not come back as it was.
inline constexpr FindingText classNotReadBack(
    "not-read-back", warning,
    "Without a map-to the class is written as %@ by itself, and read from %@ only");
inline constexpr FindingText flattenedKeeps(
    "written-twice", warning,
    "The flattened object keeps children that other fields take: they are written twice");
inline constexpr FindingText locationKept(
    "written-twice", warning,
    "The element %@ counts as unknown although its attribute is read: it is written twice");
inline constexpr FindingText itemsKept(
    "written-twice", warning,
    "Two or more items of a collection without a type count as unknown: they are written twice");
inline constexpr FindingText
    textOfChild("written-elsewhere", warning,
                "The text is read from the child %@, and written as that of the element itself");
inline constexpr FindingText nodeLeftOpen(
    "written-elsewhere", note,
    "Without a node an attribute or a child is read, and a text is written as an attribute");
inline constexpr FindingText writtenAsClass(
    "written-elsewhere", warning,
    "Without a node an object is written as %@, the name of its class, and not read back");
inline constexpr FindingText wrapperMayLack(
    "written-elsewhere", note,
    "Where a document has no %@, the collection takes all children that a class maps to");
inline constexpr FindingText wrapperMayLackOthers(
    "written-elsewhere", warning,
    "Where a document has no %@, the collection takes the children of the field %@, too");
inline constexpr FindingText
    takesChildrenOf("written-twice", warning,
                    "The collection takes the children of the field %@, too");
inline constexpr FindingText
    locationOnlyWritten("written-elsewhere", warning,
                        "Without a type the location %@ is written around the items, but not read");
inline constexpr FindingText
    textReplaces("lost", warning,
                 "Written, the text replaces the children that the field %@ has written");
inline constexpr FindingText
    textHoldsChildren("lost", warning,
                      "Read, the text holds that of the children of the field %@, too");
inline constexpr FindingText
    onlyText("lost", note, "Of an element %@ the text is kept, but not attributes and children");
inline constexpr FindingText
    onlyItems("lost", note,
              "Of an element %@ the items are kept, but not attributes and other children");
inline constexpr FindingText
    zeroLeftOut("lost", note,
                "Where the attribute says %@ it is not written, unless it is required");

// The classes of the program.
inline constexpr FindingText
    noSuchProperty("missing-property", error,
                   "The class %@ of the program has no property %@: reading it fails");
inline constexpr FindingText perhapsNoProperty(
    "missing-property", warning,
    "The class %@ of the program has no property %@: reading it fails, unless it takes any key");
inline constexpr FindingText
    notSettable("missing-property", error,
                "The property %@ of the class %@ of the program cannot be set");
inline constexpr FindingText objectNotTaken(
    "wrong-property", error,
    "The property %@ of the class %@ of the program takes no object of the class %@, but of: %@");
inline constexpr FindingText valueNotTaken(
    "wrong-property", error,
    "The property %@ of the class %@ of the program does not take the field's values");
inline constexpr FindingText valueWithoutName(
    "unnamed-value", warning,
    "The property %@ of the class %@ of the program begins as %@, which has no name to be read by");

// What documents have, and what writing them again gives. A count comes last.
inline constexpr FindingText unboundElement("unbound", warning,
                                            "No field took the element %@ in %@, %@ in all");
inline constexpr FindingText unboundAttribute("unbound", warning,
                                              "No field took the attribute %@ of %@, %@ in all");
inline constexpr FindingText
    elementInWrapper("dropped", warning,
                     "The element %@ in the wrapper %@ is no item and is dropped, %@ in all");
inline constexpr FindingText
    attributeOfWrapper("dropped", warning,
                       "The attribute %@ of the wrapper %@ is dropped, %@ in all");
inline constexpr FindingText
    elementInText("dropped", warning, "Of the element %@ in %@ only the text is kept, %@ in all");
inline constexpr FindingText attributeOfText(
    "dropped", warning,
    "The attribute %@ of %@, of which only the text is taken, is dropped, %@ in all");
inline constexpr FindingText unboundText("dropped", warning, "Text in %@ is dropped, %@ in all");
inline constexpr FindingText unknownRoot("unknown-root", error,
                                         "No class maps to the root element %@, %@ in all");
inline constexpr FindingText fieldNeverFound("never-found", note,
                                             "The field was found in none of %@ objects");
inline constexpr FindingText notWritten("not-written", error,
                                        "What was read cannot be written: %@ (%@ in all)");
inline constexpr FindingText lostInWriting("round-trip", warning,
                                           "Written again, %@ is lost, %@ in all");
inline constexpr FindingText changedInWriting("round-trip", warning,
                                              "Written again, %@ has another text, %@ in all");
inline constexpr FindingText addedInWriting("round-trip", warning,
                                            "Written again, there is one more %@, %@ in all");
inline constexpr FindingText
    movedInWriting("round-trip", note,
                   "Written again, %@ stands elsewhere among its siblings, %@ in all");
inline constexpr FindingText remarksLost("round-trip", note,
                                         "Written again, %@ is lost, %@ in all");

// Why a node is bound or not.
inline constexpr FindingText becameObject("why", note, "it became an object of the class %@ (%@)");
inline constexpr FindingText takenByField("why", note,
                                          "the field %@ of the class %@ (%@) took it: %@");
inline constexpr FindingText
    takenAsItem("why", note, "the field %@ of the class %@ (%@) took it as an item: %@");
inline constexpr FindingText takenAsWrapper("why", note,
                                            "the field %@ of the class %@ (%@) looked into it: %@");
inline constexpr FindingText
    takenAsFlattened("why", note, "the field %@ of the class %@ (%@) is flattened into it: %@");
inline constexpr FindingText takenAsText("why", note,
                                         "the field %@ of the class %@ (%@) took its text: %@");
inline constexpr FindingText noFieldForElement("why", note,
                                               "no field of the class %@ takes an element %@");
inline constexpr FindingText noFieldForAttribute("why", note,
                                                 "no field of the class %@ takes an attribute %@");
inline constexpr FindingText
    nameTakenElsewhere("why", note, "a field of the class %@ has the name %@, but took another");
inline constexpr FindingText keptAsUnknown("why", note, "it is kept as unknown XML");
inline constexpr FindingText dropped("why", note, "it is dropped");
inline constexpr FindingText
    onlyTextTaken("why", note, "of the element %@ around it only the text is taken, by %@");
inline constexpr FindingText
    onlyItemsTaken("why", note, "of the element %@ around it only the items are taken, by %@");
inline constexpr FindingText insideOfUntaken("why", note, "it stands in %@, and of that:");
inline constexpr FindingText noClassForRoot("why", note, "no class maps to the root element %@");

} // namespace findings

// The suggestion of a name, or of an attribute with its value; null for null.
String suggestionOf(const String& meant);

} // namespace qx::detail
