#pragma once

// Turns objects into XML and XML into objects under one mapping.
//
//     qx::Ref<qx::Error> error;
//     auto marshaller = QXXMLMarshaller::initWithMappingFile("orders-mapping.xml", &error);
//     auto order = marshaller ? marshaller->readFile("order.xml", &error) : nullptr;
//     if (order) {
//         order->setValueForKey("shipped", "state");
//         marshaller->writeFile(order, "order.xml", &error);
//     }
//     if (error) std::cerr << error->localizedDescription().view();
//
// Where a class is described in C++ (Class.h), a call may ask for it and answers a qx::Result:
//
//     auto order = marshaller->readFile<Order>("order.xml");
//     if (!order) return report(*order.error());
//
// An error slot must hold null when it is passed in; a failure fills it only when it was passed.
// One thread uses a marshaller at a time; marshallers may share a resolved mapping. What C++
// setters of host classes throw passes through. They may use the marshaller, the document and its
// nodes. Whether fields that follow find what they changed in the document is not said; a list
// that is being filled stays as it was found. Getters may let go of what is being written.

#include <QXXMLMarshalling/QXXMLFieldValues.h>
#include <QXXMLMarshalling/QXXMLMarshallingMapping.h>
#include <QXXMLMarshalling/QXXMLReport.h>
#include <QXXMLMarshalling/detail/TypedObject.h>
#include <QXXMLMarshalling/model/Array.h>
#include <QXXMLMarshalling/model/CountedSet.h>
#include <QXXMLMarshalling/model/Result.h>
#include <QXXMLMarshalling/model/ValueTraits.h>
#include <QXXMLMarshalling/undo/UndoManager.h>

#include <concepts>
#include <iosfwd>
#include <map>
#include <memory>
#include <typeinfo>

namespace qx {
class ByteSource;
class NamespaceTable;
namespace detail {
class NamespaceMatching;
class MarshallerMemory;
class ReadingProgress;
class Reporting;
} // namespace detail
} // namespace qx

class QX_API QXXMLMarshaller : public qx::Object {
public:
    // Never fails; a null mapping holds no class.
    static qx::Ref<QXXMLMarshaller> initWithMapping(qx::Ref<QXXMLMarshallingMapping> mapping,
                                                    qx::Ref<qx::Error>* error = nullptr);
    // Null with the error of QXXMLMarshallingMapping::initWithDocument, which raises where the user
    // has no home at all, whether or not the mapping includes others.
    static qx::Ref<QXXMLMarshaller> initWithMappingXML(qx::XMLDocument* document,
                                                       qx::Ref<qx::Error>* error = nullptr);
    // Null with the error of reading the document (XMLDocument.h), or as above. Documents that it
    // includes are looked for in the repositories, then beside the file.
    static qx::Ref<QXXMLMarshaller> initWithMappingURL(const qx::String& URL,
                                                       qx::Ref<qx::Error>* error = nullptr);
    static qx::Ref<QXXMLMarshaller> initWithMappingFile(const qx::String& path,
                                                        qx::Ref<qx::Error>* error = nullptr);
    ~QXXMLMarshaller() override;

    // Null when made with a null mapping.
    QXXMLMarshallingMapping* mapping() const noexcept { return _mapping.get(); }
    // Groups what one unmarshall() registers, in a group of its own or as part of the one that is
    // open; made on the first call, then always the same.
    const qx::Ref<qx::UndoManager>& undoManager();

    // Options, true at first unless it says otherwise; each operation reads them when it runs.
    //
    // Lenient: unmarshalling passes over XML that the mapping does not describe.
    bool isLenient() const noexcept { return _lenient; }
    void setLenient(bool lenient) noexcept { _lenient = lenient; }
    // Unmarshalling keeps on its object what no field consumed, under the keys "unboundChildren"
    // and "unboundAttributes"; marshalling writes it back. A class of a host's without these keys
    // (QXUnknownXML.h brings them) keeps nothing of it, and the log says so, once for each class.
    bool saveUnknownXML() const noexcept { return _saveUnknownXML; }
    void setSaveUnknownXML(bool save) noexcept { _saveUnknownXML = save; }
    // Of unknown XML only what no field took is kept, also what stands in wrappers; the object that
    // the element is of keeps it, not one flattened into it. It is written where it stood: behind
    // what the field writes that took the element before it, or behind as many of its items; at the
    // start, if none was taken. A field with the element's text takes child elements with text, the
    // others come behind it. Nodes know their places: one thread at a time reads a tree. Single
    // steps that bind fields keep by name. False at first.
    bool keepsExactly() const noexcept { return _keepsExactly; }
    void setKeepsExactly(bool exactly) noexcept { _keepsExactly = exactly; }
    // Marshalling declares the namespaces of class mappings, and those that were read, which an
    // object keeps under the key "__namespaces".
    bool isUsingNamespaceURIs() const noexcept { return _usingNamespaceURIs; }
    void setUsingNamespaceURIs(bool use) noexcept { _usingNamespaceURIs = use; }
    // Marshalling leaves out attributes that are not required and zero, false or empty; numbers are
    // cut to integers first. Members of plain structs and std::optionals with a value are written.
    bool omitsZeroAttributes() const noexcept { return _omitsZeroAttributes; }
    void setOmitsZeroAttributes(bool omit) noexcept { _omitsZeroAttributes = omit; }
    // Names in documents are matched as they are written, prefix included. With a table from the
    // URIs of namespaces to prefixes they are matched by namespace instead: an element or attribute
    // in a namespace of the table has, for the mapping, the prefix that stands there, whatever the
    // document has for it; an empty one for names without. What is in another namespace, or in
    // none, does not match by a prefix of the table. Nothing is renamed in the document, in what is
    // kept of it, or in messages. What is written has the prefixes of the namespaces there, and
    // declarations that are missing. Empty at first. False, and all is left as it was, with
    //   -225  "%@ cannot be the prefix of the namespace: %@"
    //   -225  "The prefix: %@ would stand for two namespaces: %@ and: %@"
    // Without a slot an error is logged.
    using NamespacePrefixes = std::map<qx::String, qx::String>;
    const NamespacePrefixes& namespacePrefixes() const noexcept { return _namespacePrefixes; }
    bool setNamespacePrefixes(NamespacePrefixes prefixes, qx::Ref<qx::Error>* error = nullptr);
    // Whether the table also has what the class mappings say by "ns-uri" and "ns-prefix", but for
    // namespaces that were given a prefix above. False at first. Answers as above, or with
    //   -225  "The namespace: %@ would have two prefixes: %@ and: %@"
    bool matchesNamespaces() const noexcept { return _matchesNamespaces; }
    bool setMatchesNamespaces(bool matches, qx::Ref<qx::Error>* error = nullptr);
    // How deep objects may nest, in both directions; 256 at first, 2,048 at most (more counts so).
    // A level takes about a kilobyte of the thread's stack. Deeper objects end in
    //   -223  "Objects nest deeper than the limit of %@: %@"   (the limit, the class)
    std::size_t maximumDepth() const noexcept { return _maximumDepth; }
    void setMaximumDepth(std::size_t depth) noexcept {
        _maximumDepth = depth < highestMaximumDepth ? depth : highestMaximumDepth;
    }
    static constexpr std::size_t highestMaximumDepth = 2'048;
    // How much one reading may make, so that no mapping makes much of a small document: `base`, and
    // `perElement` more for each element of what is read. Beyond a limit a reading ends in
    //   -224  "Reading makes more objects than the limit of %@: %@"   (the limit, the class)
    //   -224  "Reading keeps more nodes than the limit of %@: %@"     (the limit, the element)
    //   -224  "Reading goes over more nodes than the limit of %@: %@"   (likewise)
    struct Limit {
        std::size_t base;
        std::size_t perElement;
    };
    // Objects; 10,000 and 16 at first. To make them it goes over at most 16 times as many nodes,
    // and 64 times as many as there are.
    Limit maximumObjects() const noexcept { return _maximumObjects; }
    void setMaximumObjects(Limit limit) noexcept { _maximumObjects = limit; }
    // The unknown XML that objects keep, and the nodes that are copied for that; 10,000 and 64.
    Limit maximumKeptNodes() const noexcept { return _maximumKeptNodes; }
    void setMaximumKeptNodes(Limit limit) noexcept { _maximumKeptNodes = limit; }

    // How readFile(), readString(), readStream() and unmarshallEach() parse. A document may nest at
    // least as deep as its objects may, whatever the options say.
    const qx::XMLParseOptions& parseOptions() const noexcept { return _parseOptions; }
    void setParseOptions(const qx::XMLParseOptions& options) { _parseOptions = options; }
    // Called about once a megabyte, between two objects, while a text, a file or a stream is read;
    // `size` is 0 where it is not known. An answer of false ends the reading in
    //   -226  "The reading was cancelled"
    // It may use the marshaller as setters may, and replace the handler. Null for none.
    struct Progress {
        std::uint64_t bytesRead;
        std::uint64_t size;
    };
    using ProgressHandler = qx::detail::UniqueFunction<bool(const Progress&)>;
    void setProgressHandler(ProgressHandler handler);

    // What reading and writing pass over, unbound XML above all, is told to the handler, if any,
    // and not logged. It may do what the one above may; the next call tells one that it sets.
    void setReportHandler(QXXMLReport::Handler handler);
    // How many errors a reading with a slot collects before it ends, 1 at first; single steps end
    // at the first. Fields and items that fail are left out, and not logged; the answer is null all
    // the same, the error is the first in the document, and all() lists them. -224 and -226 end it
    // at once. Who keeps the partial object gets that, too, but for Results and reloads.
    std::size_t maximumErrors() const noexcept { return _maximumErrors; }
    void setMaximumErrors(std::size_t count) noexcept { _maximumErrors = count; }
    bool keepsPartial() const noexcept { return _keepsPartial; }
    void setKeepsPartial(bool keeps) noexcept { _keepsPartial = keeps; }

    // A new document, version "1.0" and encoding "UTF-8", whose root represents the object; null
    // with one of the errors of marshallObject and of the fields. Kept unknown XML is moved, not
    // copied, into the document: out of an earlier one if the object was marshalled before.
    qx::Ref<qx::XMLDocument> marshall(const qx::Value& object, qx::Ref<qx::Error>* error = nullptr);
    // The object built from the document's root element; null on failure, and without an error when
    // a lenient marshaller finds no class for the root element. See unmarshallElement.
    qx::Ref<qx::Object> unmarshall(qx::XMLDocument* document, qx::Ref<qx::Error>* error = nullptr);
    template <std::derived_from<qx::XMLDocument> D>
    qx::Ref<qx::Object> unmarshall(const qx::Ref<D>& document,
                                   qx::Ref<qx::Error>* error = nullptr) {
        return unmarshall(document.get(), error);
    }

    // Parse and unmarshall in one step: the object, or null with an error. The slot is set to null
    // first, so that one serves many calls. Besides the errors of unmarshall() and of the parser,
    // whether the marshaller is lenient or not:
    //   -211  "No definition to handle element: %@"   (the root)
    qx::Ref<qx::Object> readString(qx::XMLBytes xml, qx::Ref<qx::Error>* error = nullptr);
    qx::Ref<qx::Object> readFile(const qx::String& path, qx::Ref<qx::Error>* error = nullptr);
    qx::Ref<qx::Object> readStream(std::istream& stream, qx::Ref<qx::Error>* error = nullptr);

    // The same for a document whose root is a T: a plain struct that was described gives a
    // qx::Result<T>, a class that derives from qx::Object a qx::Result<qx::Ref<T>>. Besides the
    // errors above:
    //   -211  "The root is of class: %@, not of class: %@"   (the root's, the T's)
    template <class T>
    [[nodiscard]] qx::ResultOf<T> readString(qx::XMLBytes xml) {
        return qx::detail::typedResult<T>(
            [&](auto* error) { return readString(xml, typeid(T), error); });
    }
    template <class T>
    [[nodiscard]] qx::ResultOf<T> readFile(const qx::String& path) {
        return qx::detail::typedResult<T>(
            [&](auto* error) { return readFile(path, typeid(T), error); });
    }
    template <class T>
    [[nodiscard]] qx::ResultOf<T> readStream(std::istream& stream) {
        return qx::detail::typedResult<T>(
            [&](auto* error) { return readStream(stream, typeid(T), error); });
    }
    template <class T>
    [[nodiscard]] qx::ResultOf<T> unmarshall(qx::XMLDocument* document) {
        return qx::detail::typedResult<T>(
            [&](auto* error) { return unmarshall(document, typeid(T), error); });
    }
    template <class T, std::derived_from<qx::XMLDocument> D>
    [[nodiscard]] qx::ResultOf<T> unmarshall(const qx::Ref<D>& document) {
        return unmarshall<T>(document.get());
    }

    // Reads a document that need not fit into memory: calls visit(object) with the object of each
    // outermost element of that name, at whatever depth, when it has been read, and forgets it.
    // What stands around these elements is parsed and passed over. `source` is the path of a file,
    // or a std::istream, which is read in blocks. `visit` may answer false to stop. True when it
    // was called for all of them, or has stopped; the errors are those of readFile(), also where a
    // class is asked for. Objects before a fault have been handed over when the call answers false.
    //
    //     marshaller->unmarshallEach("orders.xml", "order", [](qx::Ref<qx::Object> order) { … });
    //     marshaller->unmarshallEach<Order>(stream, "order", [](Order order) { … }, &error);
    //
    // Each object has an undo group of its own. The limits count anew in each piece that is read,
    // of some 256 KB and whole elements. The document may be of any size, one element of that name
    // (where names are matched by namespace, of that local name) of 2 GB.
    template <class T = qx::Object, class Source, class Visit>
    bool unmarshallEach(Source&& source, const qx::String& elementName, Visit visit,
                        qx::Ref<qx::Error>* error = nullptr) {
        const auto visitor = [&visit](const qx::Ref<qx::Object>& object) {
            return qx::detail::visited<T>(visit, object);
        };
        return readEach(source, elementName, typeid(T), visitor, error);
    }

    // Read into an object that is there, so that it equals what the operations above would make of
    // the document: a reload. It is a plain struct that was described, an object, or a Ref to one.
    // True when it was done; the slot is set to null first.
    // - What the mapping has a field for is set, to what a new object has where the document does
    //   not say; what it has none for stays. Unknown XML that was kept gives way to the document's.
    // - Objects that it holds, and structs behind pointers, stay and are read into where the
    //   document has one of the same class in that place; items of collections go by their place.
    //   Structs in objects that have an undo manager are replaced. While setters are called inside
    //   a list, a pointer or an optional of a struct, that member is empty; what they put there
    //   goes.
    // - Observers hear of the keys whose values differ, and of those that hold structs. An object
    //   with an undo manager has one group, for the objects that it holds, too.
    //
    // The document is read into a new object first, which registers no undo: whatever fails there
    // leaves yours as it was, with the errors above or with
    //   -211  "The root is of class: %@, not of class: %@"   (the root's, the object's)
    // Only what the object itself refuses of values that a new one took (-222), or what its setters
    // and observers throw, ends it halfway; undoing the group takes back what was done. A null Ref
    // and a box whose struct was moved away raise NSInvalidArgumentException.
    template <qx::Reloadable T>
    bool readInto(T&& object, const qx::String& path, qx::Ref<qx::Error>* error = nullptr) {
        return qx::detail::withObject(
            object, [&](qx::Object* held) { return readFileInto(held, path, error); });
    }
    template <qx::Reloadable T>
    bool readStringInto(T&& object, qx::XMLBytes xml, qx::Ref<qx::Error>* error = nullptr) {
        return qx::detail::withObject(
            object, [&](qx::Object* held) { return readBytesInto(held, xml, error); });
    }
    template <qx::Reloadable T>
    bool readStreamInto(T&& object, std::istream& stream, qx::Ref<qx::Error>* error = nullptr) {
        return qx::detail::withObject(
            object, [&](qx::Object* held) { return readInputInto(held, stream, error); });
    }
    template <qx::Reloadable T>
    bool unmarshallInto(T&& object, qx::XMLDocument* document,
                        qx::Ref<qx::Error>* error = nullptr) {
        return qx::detail::withObject(
            object, [&](qx::Object* held) { return readTreeInto(held, document, error); });
    }
    template <qx::Reloadable T, std::derived_from<qx::XMLDocument> D>
    bool unmarshallInto(T&& object, const qx::Ref<D>& document,
                        qx::Ref<qx::Error>* error = nullptr) {
        return unmarshallInto(object, document.get(), error);
    }

    // Marshall and serialise in one step, one element a line unless the layout says otherwise
    // (XMLNode.h); no tree of nodes is made. The slot is set to null first. The string is null on
    // failure; a file is replaced atomically, and untouched on failure. Kept unknown XML is taken
    // out of where it was, as by marshall(). Besides the errors of marshall() and of writing:
    //   517  "The text cannot be written: %@"   (a character or a name that XML has no place for,
    //         or what this marshaller could not read again: see the limits in XMLDocument.h)
    qx::String writeString(const qx::Value& object, qx::Ref<qx::Error>* error = nullptr,
                           qx::XMLOptions layout = qx::XMLPrettyPrint);
    bool writeFile(const qx::Value& object, const qx::String& path,
                   qx::Ref<qx::Error>* error = nullptr, qx::XMLOptions layout = qx::XMLPrettyPrint);
    bool writeStream(const qx::Value& object, std::ostream& stream,
                     qx::Ref<qx::Error>* error = nullptr,
                     qx::XMLOptions layout = qx::XMLPrettyPrint);

    // The same for a plain struct, or what owns one (std::unique_ptr, std::variant and the like).
    // It is read where it is and not copied: nothing may change it meanwhile.
    template <qx::WritableStruct T>
    qx::Ref<qx::XMLDocument> marshall(const T& object, qx::Ref<qx::Error>* error = nullptr) {
        return marshall(qx::detail::lend(object), error);
    }
    template <qx::WritableStruct T>
    qx::String writeString(const T& object, qx::Ref<qx::Error>* error = nullptr,
                           qx::XMLOptions layout = qx::XMLPrettyPrint) {
        return writeString(qx::detail::lend(object), error, layout);
    }
    template <qx::WritableStruct T>
    bool writeFile(const T& object, const qx::String& path, qx::Ref<qx::Error>* error = nullptr,
                   qx::XMLOptions layout = qx::XMLPrettyPrint) {
        return writeFile(qx::detail::lend(object), path, error, layout);
    }
    template <qx::WritableStruct T>
    bool writeStream(const T& object, std::ostream& stream, qx::Ref<qx::Error>* error = nullptr,
                     qx::XMLOptions layout = qx::XMLPrettyPrint) {
        return writeStream(qx::detail::lend(object), stream, error, layout);
    }

    // Writes a document that need not fit into memory: a root element of that name with the objects
    // that produce() answers, one after another, until that is null or empty: a qx::Value, a
    // qx::Ref, or a std::optional of a struct. `sink` is the path of a file, which is replaced
    // atomically at the end, or a std::ostream, which gets some of it where a later object fails.
    // The errors are those of writeFile(), 517 for what is no name of a root. unmarshallEach()
    // reads such documents.
    //
    //     marshaller->marshallEach("orders.xml", "orders", [&]() -> std::optional<Order> { … });
    template <class Sink, class Produce>
    bool marshallEach(Sink&& sink, const qx::String& rootName, Produce produce,
                      qx::Ref<qx::Error>* error = nullptr,
                      qx::XMLOptions layout = qx::XMLPrettyPrint) {
        using Produced = decltype(produce());
        std::optional<Produced> latest; // lent while it is written
        const auto next = [&]() -> qx::Value {
            latest.emplace(produce());
            if constexpr (std::convertible_to<Produced, qx::Value>)
                return *latest;
            else
                return qx::detail::lend(*latest);
        };
        return writeEach(sink, rootName, next, error, layout);
    }

    // The steps of marshalling, for hosts that build trees of their own.
    //
    // A new element for the object. Null with
    //   -211  "No class name for marshalling defined: %@"   (the object's class)
    //   -211  "No mapping definition for class: %@"
    qx::Ref<qx::XMLElement> marshallObject(const qx::Value& object,
                                           qx::Ref<qx::Error>* error = nullptr);
    qx::Ref<qx::XMLElement> elementWithMapping(const QXXMLClassMapping& mapping, qx::Object& object,
                                               qx::Ref<qx::Error>* error = nullptr);
    // Writes the fields of the class and of its ancestors, kept unknown XML and namespaces. False
    // with an error of the fields, or
    //   -211  "No extends definition for class during marshaling: %@"
    bool bindFieldMappings(const QXXMLClassMapping& mapping, qx::XMLElement& element,
                           qx::Object& object, qx::Ref<qx::Error>* error = nullptr);
    //   -207  "No mapping for class: %@"
    //   -211  "No class name for marshalling defined: %@"   (the class of `object`)
    //   -212  "Required value missing for field: %@ in object: %@"
    bool mapField(const QXXMLFieldMapping& field, qx::XMLElement& element, qx::Object& object,
                  qx::Ref<qx::Error>* error = nullptr);
    //   -207  "No mapping for declared class: %@"
    bool mapArray(const qx::Array& array, qx::XMLElement& element, const QXXMLFieldMapping& field,
                  qx::Ref<qx::Error>* error = nullptr);

    // The steps of unmarshalling. Each goes over the element's children anew, so that binding field
    // by field costs more than binding them all. One that is told that the object is flattened
    // takes the children that it binds out of the element.
    //
    // The object for the node's element name. Null where no class maps to it, if not lenient with
    //   -211  "No definition to handle element: %@"
    qx::Ref<qx::Object> unmarshallElement(qx::XMLNode* element,
                                          qx::Ref<qx::Error>* error = nullptr);
    // The object of that class. Null for a null element, and when the slot holds an error already.
    qx::Ref<qx::Object> buildClassWithMapping(const QXXMLClassMapping& mapping,
                                              qx::XMLElement* element, bool isFlattened,
                                              qx::Ref<qx::Error>* error = nullptr);
    // A new, empty object: of the host's class of that name, else a QXGenericRecord. Never null.
    qx::Ref<qx::Object> allocateClassWithMapping(const QXXMLClassMapping& mapping,
                                                 qx::Ref<qx::Error>* error = nullptr);
    // Bind the fields of the class and of its ancestors, and validate. `boundFields` and
    // `boundAttributes` count, whatever the options, the names of children and attributes that
    // fields consumed.
    //   -211  "No extends definition for class: %@"
    bool bindFieldsWithMapping(const QXXMLClassMapping& mapping, qx::Object& object,
                               qx::XMLElement& element, bool isFlattened,
                               qx::Ref<qx::Error>* error = nullptr);
    bool bindFieldsWithMapping(const QXXMLClassMapping& mapping, qx::Object& object,
                               qx::XMLElement& element, qx::CountedSet& boundFields,
                               qx::CountedSet& boundAttributes, bool isFlattened,
                               qx::Ref<qx::Error>* error = nullptr);
    // True unless it failed: also when there was nothing to bind.
    bool bindField(const QXXMLFieldMapping& field, qx::Object& object, std::size_t index,
                   qx::XMLElement& element, qx::CountedSet& boundFields,
                   qx::CountedSet& boundAttributes, bool isFlattened,
                   qx::Ref<qx::Error>* error = nullptr);
    // The steps of bindField, by the kind of field. Those for attributes and texts answer true when
    // a value was set; false without an error when there was nothing to bind.
    //   -202  "Required attribute missing for field: %@ in element: %@"
    //   -220  "Too many elements defined for field: %@ in element: %@"
    bool bindFieldAsAttribute(const QXXMLFieldMapping& field, qx::Object& object, std::size_t index,
                              qx::XMLElement& element, qx::CountedSet& boundFields,
                              qx::CountedSet& boundAttributes, qx::Ref<qx::Error>* error = nullptr);
    //   -202  "Required text missing for field: %@ in element: %@"
    //   -210  "Too many children with name: %@ in element: %@"
    bool bindFieldAsText(const QXXMLFieldMapping& field, qx::Object& object, std::size_t index,
                         qx::XMLElement& element, qx::CountedSet& boundFields,
                         qx::CountedSet& boundAttributes, qx::Ref<qx::Error>* error = nullptr);
    // True unless it failed: also when there was nothing to bind. Without a slot no failure inside
    // the child is one, and nothing is set.
    //   -202  "Missing required element named: %@ in element: %@"
    //   -210  "Too many child elements of name: %@ in element: %@"
    bool bindFieldAsElement(const QXXMLFieldMapping& field, qx::Object& object, std::size_t index,
                            qx::XMLElement& element, qx::CountedSet& boundFields,
                            qx::CountedSet& boundAttributes, bool isFlattened,
                            qx::Ref<qx::Error>* error = nullptr);
    // True unless they failed: also when there were no items, and the key was left alone. An item
    // that fails fails the collection when there is a slot; without one it is left out, and the
    // array holds the others.
    //   -208  "Unable to process collection class: %@"
    bool bindCollectionField(const QXXMLFieldMapping& field, qx::Object& object,
                             qx::XMLElement& element, qx::CountedSet& boundFields,
                             qx::CountedSet& boundAttributes, qx::Ref<qx::Error>* error = nullptr);
    //   -207  "No mapping for class: %@"
    bool bindArrayFieldByType(const QXXMLFieldMapping& field, qx::Object& object,
                              qx::XMLElement& element, qx::CountedSet& boundFields,
                              qx::CountedSet& boundAttributes, qx::Ref<qx::Error>* error = nullptr);
    // Compares what the element holds with what was consumed; keeps or refuses the rest. Unknown
    // children are child elements and processing instructions, which count under their targets; of
    // the latter nothing but an empty array under the target is kept. False with
    //   -214  "Unknown fields found in XML document: %@ element: %@"
    //   -215  "Unknown attributes found in XML document: %@ element: %@"
    bool validateBoundFields(const qx::CountedSet& boundFields,
                             const qx::CountedSet& boundAttributes, qx::XMLElement& element,
                             qx::Object& object, qx::Ref<qx::Error>* error = nullptr);

protected:
    QXXMLMarshaller() = default;
    friend qx::Ref<QXXMLMarshaller> qx::make<QXXMLMarshaller>();

    // Keeps the mapping; never fails. A subclass calls it first.
    virtual bool init(qx::Ref<QXXMLMarshallingMapping> mapping, qx::Ref<qx::Error>* error);
    const qx::Class& describedClass() const override;

private:
    friend class qx::detail::NamespaceMatching;
    friend class qx::detail::MarshallerMemory;
    friend class qx::detail::ReadingProgress;
    friend class qx::detail::Reporting;

    using Slot = qx::Ref<qx::Error>*;
    bool matchNamespaces(NamespacePrefixes prefixes, bool matches, Slot error);
    // The object of a document whose root is to be of that C++ type.
    qx::Ref<qx::Object> readString(qx::XMLBytes xml, const std::type_info& type, Slot error);
    qx::Ref<qx::Object> readFile(const qx::String& path, const std::type_info& type, Slot error);
    qx::Ref<qx::Object> readStream(std::istream& stream, const std::type_info& type, Slot error);
    qx::Ref<qx::Object> unmarshall(qx::XMLDocument* xml, const std::type_info& type, Slot error);
    using Visitor = qx::detail::UniqueFunction<qx::detail::Visited(const qx::Ref<qx::Object>&)>;
    bool readEach(const qx::String& path, const qx::String& elementName, const std::type_info& type,
                  Visitor visitor, Slot error);
    bool readEach(std::istream& stream, const qx::String& elementName, const std::type_info& type,
                  Visitor visitor, Slot error);
    bool readEach(qx::ByteSource& source, const qx::String& elementName, const std::type_info& type,
                  Visitor visitor, Slot error);
    bool readFileInto(qx::Object* object, const qx::String& path, Slot error);
    bool readBytesInto(qx::Object* object, qx::XMLBytes xml, Slot error);
    bool readInputInto(qx::Object* object, std::istream& stream, Slot error);
    bool readTreeInto(qx::Object* object, qx::XMLDocument* document, Slot error);
    using Producer = qx::detail::UniqueFunction<qx::Value()>;
    bool writeEach(const qx::String& path, const qx::String& rootName, Producer next, Slot error,
                   qx::XMLOptions layout);
    bool writeEach(std::ostream& stream, const qx::String& rootName, Producer next, Slot error,
                   qx::XMLOptions layout);

    qx::Ref<QXXMLMarshallingMapping> _mapping;
    bool _saveUnknownXML = true;
    bool _keepsExactly = false;
    bool _lenient = true;
    bool _usingNamespaceURIs = true;
    bool _omitsZeroAttributes = true;
    qx::Ref<qx::UndoManager> _undoManager;
    std::size_t _maximumDepth = 256;
    Limit _maximumObjects{10'000, 16};
    Limit _maximumKeptNodes{10'000, 64};
    qx::XMLParseOptions _parseOptions;
    std::shared_ptr<ProgressHandler> _progressHandler;
    std::shared_ptr<QXXMLReport::Handler> _reportHandler;
    std::size_t _maximumErrors = 1;
    bool _keepsPartial = false;
    bool _matchesNamespaces = false;
    NamespacePrefixes _namespacePrefixes;
    std::shared_ptr<const qx::NamespaceTable> _namespaces; // null: names are matched as written
    mutable std::shared_ptr<qx::detail::MarshallerMemory> _memory; // null before the first call
};
