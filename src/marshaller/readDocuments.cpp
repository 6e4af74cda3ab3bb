// Reading objects from files, texts, streams and documents: new ones, one after another, or into
// those that are there.

#include <QXXMLMarshalling/QXXMLMarshaller.h>
#include <QXXMLMarshalling/base/Exception.h>
#include <QXXMLMarshalling/model/Class.h>

#include "files/Files.h"
#include "marshaller/DocumentParsing.h"
#include "marshaller/MarshallerMemory.h"
#include "marshaller/NoUndo.h"
#include "marshaller/Reloading.h"
#include "marshaller/Unmarshalling.h"
#include "model/Errors.h"
#include "model/TypeNames.h"
#include "xml/XMLPieces.h"

using qx::Error;
using qx::Ref;
using qx::String;
using qx::XMLDocument;
using qx::detail::ClassPlan;
using qx::detail::ErrorDetails;
using qx::detail::MappingPlan;
using qx::detail::MarshallerMemory;
using qx::detail::ReadingContext;
using qx::detail::reset;

namespace {

// Whether objects of the class may be of the C++ type, as far as that is known beforehand: a type
// that nobody described may be a base of theirs.
bool mayBe(const ClassPlan& plan, const std::type_info& type) {
    const qx::Class* const wanted = qx::Class::described(type);
    const qx::Class* const made = qx::Class::named(plan.classNameToInstantiate.view());
    if (wanted == nullptr || made == nullptr)
        return true;
    return wanted->isStruct() ? made == wanted : made->isSubclassOf(*wanted);
}

String nameOf(const std::type_info& type) {
    const qx::Class* const described = qx::Class::described(type);
    return described != nullptr ? described->name() : String(qx::readableName(type));
}

// Whether an element of that name may become such an object, as far as that shows before it is
// read.
template <class Quoted>
bool mayRead(const QXXMLMarshaller& marshaller, const String& elementName,
             const std::type_info& type, Ref<Error>* error, Quoted quoted) {
    const ClassPlan* const plan =
        MappingPlan::of(marshaller.mapping()).classForElement(elementName);
    if (plan == nullptr)
        return qx::fail(error, qx::errors::noDefinitionForElement, quoted);
    if (!mayBe(*plan, type))
        return qx::fail(error, qx::errors::rootOfOtherClass, plan->className.string(),
                        nameOf(type));
    return true;
}

// A lenient marshaller gives no object for a root that no class maps to, and no error either:
// whoever reads in one step is told. So is who asks for a class, before anything is read.
Ref<qx::Object> objectOf(QXXMLMarshaller& marshaller, qx::IndexedXML& document,
                         const std::type_info& type, Ref<Error>* error) {
    if (const qx::NamespaceTable* const table = qx::detail::NamespaceMatching::of(marshaller))
        document.matchBy(*table);
    const auto root = document.root();
    const auto quoted = [&] { return document.quoted(root); };
    const String name = root != qx::IndexedXML::none ? document.name(root) : String();
    Ref<qx::Object> object;
    if (mayRead(marshaller, name, type, error, quoted)) {
        object = qx::detail::readDocument(marshaller, document, error);
        if (!object && error != nullptr && !*error)
            qx::fail(error, qx::errors::noDefinitionForElement, quoted);
    }
    if (!object && error != nullptr)
        ReadingContext::tell(*error, document, marshaller.mapping(), {.number = root});
    return object;
}

// What was parsed, of the file of that name if it has one; null where that failed.
struct Source {
    qx::XMLParser::Parsed parsed;
    String name;
};

Ref<qx::Object> objectOf(QXXMLMarshaller& marshaller, const Source& source,
                         const std::type_info& type, Ref<Error>* error) {
    if (!source.parsed)
        return nullptr;
    qx::IndexedXML document(*source.parsed, source.name);
    return objectOf(marshaller, document, type, error);
}

Source sourceOf(QXXMLMarshaller& marshaller, Ref<qx::Data> data, Ref<Error>* error) {
    if (!data)
        return {};
    return {qx::XMLParser::parse(std::move(data), qx::detail::parsingOf(marshaller), error,
                                 &MarshallerMemory::of(marshaller).parsing),
            {}};
}

Source sourceOf(QXXMLMarshaller& marshaller, qx::XMLBytes bytes, Ref<Error>* error) {
    return {qx::XMLParser::parseCopy(bytes, qx::detail::parsingOf(marshaller), error,
                                     &MarshallerMemory::of(marshaller).parsing),
            {}};
}

Source sourceOfFile(QXXMLMarshaller& marshaller, const String& path, Ref<Error>* error) {
    Source source = sourceOf(marshaller, qx::readFile(path, error), error);
    source.name = path;
    if (!source.parsed)
        ErrorDetails::nameDocument(error, path);
    return source;
}

qx::Object& present(qx::Object* object) {
    if (object == nullptr)
        throw qx::Exception(qx::Exception::invalidArgument, "there is no object to read into");
    return *object;
}

// The C++ type that the root has to be of, as far as that is asked before it is read.
const std::type_info& typeOf(qx::Object& object) {
    if (!object.isa().isStruct())
        return typeid(qx::Object);
    const auto& held = static_cast<qx::detail::StructObject&>(object);
    if (held.as(held.type()) == nullptr)
        throw qx::Exception(qx::Exception::invalidArgument,
                            "the struct that is to be read into was moved away");
    return held.type();
}

bool fill(QXXMLMarshaller& marshaller, qx::Object& object, qx::IndexedXML& document,
          Ref<Error>* error) {
    // The object's own code may let go of any of them.
    const Ref<QXXMLMarshaller> kept(&marshaller);
    const Ref<const QXXMLMarshallingMapping> mapping(marshaller.mapping());
    const Ref<qx::Object> held(&object);
    // Without a slot a reading leaves out what fails.
    Ref<Error> problem;
    Ref<qx::Object> fresh;
    {
        const qx::detail::NoUndo noUndo(marshaller.undoManager());
        fresh = objectOf(marshaller, document, typeOf(object), &problem);
    }
    bool isRead = fresh && !problem; // part of a document is none to reload
    if (isRead && !qx::detail::Reloading::isOfSameClass(object, *fresh))
        isRead = qx::fail(&problem, qx::errors::rootOfOtherClass, fresh->classNameForMarshalling(),
                          object.classNameForMarshalling());
    if (isRead) {
        const MappingPlan& plan = MappingPlan::of(mapping.get());
        const ClassPlan* root = plan.classForElement(document.name(document.root()));
        isRead = qx::detail::Reloading(plan).run(*root, object, *fresh, &problem);
    }
    if (error != nullptr)
        *error = std::move(problem);
    return isRead;
}

bool fill(QXXMLMarshaller& marshaller, qx::Object& object, const Source& source,
          Ref<Error>* error) {
    if (!source.parsed)
        return false;
    qx::IndexedXML document(*source.parsed, source.name);
    return fill(marshaller, object, document, error);
}

} // namespace

Ref<qx::Object> QXXMLMarshaller::unmarshall(XMLDocument* document, const std::type_info& type,
                                            Ref<Error>* error) {
    if (document == nullptr)
        return qx::fail(error, qx::errors::noDefinitionForElement, document);
    qx::IndexedXML read(*document);
    return objectOf(*this, read, type, error);
}

Ref<Error> qx::detail::wrongClass(const qx::Object& object, const std::type_info& type) {
    Ref<Error> error;
    qx::fail(&error, qx::errors::rootOfOtherClass, object.classNameForMarshalling(),
             ::nameOf(type));
    return error;
}

Ref<qx::Object> QXXMLMarshaller::readString(qx::XMLBytes xml, const std::type_info& type,
                                            Ref<Error>* error) {
    reset(error);
    return objectOf(*this, sourceOf(*this, xml, error), type, error);
}

Ref<qx::Object> QXXMLMarshaller::readFile(const String& path, const std::type_info& type,
                                          Ref<Error>* error) {
    reset(error);
    return objectOf(*this, sourceOfFile(*this, path, error), type, error);
}

Ref<qx::Object> QXXMLMarshaller::readStream(std::istream& stream, const std::type_info& type,
                                            Ref<Error>* error) {
    reset(error);
    return objectOf(*this, sourceOf(*this, qx::readStream(stream, error), error), type, error);
}

Ref<qx::Object> QXXMLMarshaller::readString(qx::XMLBytes xml, Ref<Error>* error) {
    return readString(xml, typeid(qx::Object), error);
}

Ref<qx::Object> QXXMLMarshaller::readFile(const String& path, Ref<Error>* error) {
    return readFile(path, typeid(qx::Object), error);
}

Ref<qx::Object> QXXMLMarshaller::readStream(std::istream& stream, Ref<Error>* error) {
    return readStream(stream, typeid(qx::Object), error);
}

bool QXXMLMarshaller::readEach(const String& path, const String& elementName,
                               const std::type_info& type, Visitor visitor, Ref<Error>* error) {
    qx::FileSource source(path);
    return readEach(source, elementName, type, std::move(visitor), error);
}

bool QXXMLMarshaller::readEach(std::istream& stream, const String& elementName,
                               const std::type_info& type, Visitor visitor, Ref<Error>* error) {
    qx::StreamSource source(stream);
    return readEach(source, elementName, type, std::move(visitor), error);
}

bool QXXMLMarshaller::readEach(qx::ByteSource& source, const String& elementName,
                               const std::type_info& type, Visitor visitor, Ref<Error>* error) {
    reset(error);
    const Ref<QXXMLMarshaller> held(this); // the visitor may let go of it
    if (!mayRead(*this, elementName, type, error, [&] { return elementName; }))
        return false;
    Ref<Error> failure;
    bool goesOn = true;
    // The visitor may change it: what is an item stays.
    const auto table = qx::detail::NamespaceMatching::keptOf(*this);
    const auto match = table ? qx::XMLSplitter::Match::localNames : qx::XMLSplitter::Match::names;
    qx::XMLPieces pieces(source, elementName, match, qx::detail::parsingOf(*this));
    qx::detail::ReadingProgress progress(*this, source.size());
    qx::detail::ErrorCollector collector(*this, error);
    const String name = source.name();
    while (const auto piece = goesOn ? pieces.next(&failure) : nullptr) {
        if (!progress.startPiece(pieces.bytesRead(), &failure))
            break;
        qx::IndexedXML document(*piece, name);
        if (table)
            document.matchBy(*table);
        else
            document.matchAsWritten();
        qx::detail::Unmarshalling reading(*this, document);
        document.forEachOutermost(elementName, [&](qx::IndexedXML::Number item) {
            const std::size_t before = collector.count();
            auto object = reading.read(item, &failure, progress, collector);
            if (!object && !failure && collector.count() == before)
                qx::fail(&failure, qx::errors::noDefinitionForElement,
                         [&] { return document.quoted(item); });
            const bool isWhole = object && collector.count() == before;
            if (isWhole || (object && collector.keepsPartial())) {
                auto visited = visitor(object);
                failure = std::move(visited.error);
                goesOn = visited.goesOn;
            }
            reading.locate(&failure, item);
            goesOn = goesOn && (!failure || reading.passOver(&failure));
            collector.settle(before);
            return goesOn;
        });
    }
    if (failure && failure->documentName().isNull())
        ErrorDetails::nameDocument(&failure, name);
    if (!collector.giveTo(&failure))
        return true;
    if (error != nullptr)
        *error = failure;
    return false;
}

bool QXXMLMarshaller::readBytesInto(qx::Object* object, qx::XMLBytes xml, Ref<Error>* error) {
    reset(error);
    return fill(*this, present(object), sourceOf(*this, xml, error), error);
}

bool QXXMLMarshaller::readFileInto(qx::Object* object, const String& path, Ref<Error>* error) {
    reset(error);
    return fill(*this, present(object), sourceOfFile(*this, path, error), error);
}

bool QXXMLMarshaller::readInputInto(qx::Object* object, std::istream& stream, Ref<Error>* error) {
    reset(error);
    return fill(*this, present(object), sourceOf(*this, qx::readStream(stream, error), error),
                error);
}

bool QXXMLMarshaller::readTreeInto(qx::Object* object, XMLDocument* document, Ref<Error>* error) {
    reset(error);
    if (document == nullptr)
        return qx::fail(error, qx::errors::noDefinitionForElement, document);
    qx::IndexedXML read(*document);
    return fill(*this, present(object), read, error);
}
