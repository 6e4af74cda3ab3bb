// Reading objects from files, texts and streams, and writing them.

#include <QXXMLMarshalling/QXXMLMarshaller.h>
#include <QXXMLMarshalling/base/Exception.h>
#include <QXXMLMarshalling/model/Class.h>

#include "files/AtomicWrite.h"
#include "files/Files.h"
#include "marshaller/Marshalling.h"
#include "marshaller/Unmarshalling.h"
#include "model/Errors.h"
#include "model/TypeNames.h"
#include "xml/XMLParser.h"
#include "xml/XMLSerializer.h"

#include <algorithm>

using qx::Error;
using qx::Ref;
using qx::String;
using qx::XMLDocument;
using qx::detail::ClassPlan;
using qx::detail::MappingPlan;

namespace {

void reset(Ref<Error>* error) {
    if (error != nullptr)
        error->reset();
}

// What is written is meant to be read by such a marshaller, too.
qx::XMLParseOptions parseOptions(const QXXMLMarshaller& marshaller) {
    qx::XMLParseOptions options;
    // An object may stand in a wrapper, and hold a last element with text.
    options.maximumDepth = std::max(options.maximumDepth, 2 * marshaller.maximumDepth() + 1);
    return options;
}

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

// A lenient marshaller gives no object for a root that no class maps to, and no error either:
// whoever reads in one step is told. So is who asks for a class, before anything is read.
Ref<qx::Object> objectOf(QXXMLMarshaller& marshaller, qx::IndexedXML& document,
                         const std::type_info& type, Ref<Error>* error) {
    const auto root = document.root();
    const auto noDefinition = [&] {
        return qx::fail(error, qx::errors::noDefinitionForElement,
                        [&] { return document.quoted(root); });
    };
    const ClassPlan* const plan =
        root != qx::IndexedXML::none
            ? MappingPlan::of(marshaller.mapping()).classForElement(document.name(root))
            : nullptr;
    if (plan == nullptr)
        return noDefinition();
    if (!mayBe(*plan, type))
        return qx::fail(error, qx::errors::rootOfOtherClass, plan->className.string(),
                        nameOf(type));
    auto object = qx::detail::readDocument(marshaller, document, error);
    if (!object && error != nullptr && !*error)
        return noDefinition();
    return object;
}

Ref<qx::Object> objectOf(QXXMLMarshaller& marshaller, const qx::XMLParser::Parsed& parsed,
                         const std::type_info& type, Ref<Error>* error) {
    if (!parsed)
        return nullptr;
    qx::IndexedXML document(*parsed);
    return objectOf(marshaller, document, type, error);
}

// Calls use(text) with the document of the object, which is drafted and printed; what use()
// answers. The draft's names are the mapping's, which the marshalling holds: getters may let go of
// the marshaller. What no XML document can hold, or none that could be read again, raises while it
// is printed.
template <class Use>
auto withDocument(const QXXMLMarshaller& marshaller, const qx::Value& object, qx::XMLOptions layout,
                  Ref<Error>* error, Use use) -> decltype(use(std::declval<qx::TextBuffer&>())) {
    reset(error);
    const qx::XMLParseOptions reading = parseOptions(marshaller);
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

Ref<qx::Object> QXXMLMarshaller::unmarshall(XMLDocument* document, const std::type_info& type,
                                            Ref<Error>* error) {
    if (document == nullptr)
        return qx::fail(error, qx::errors::noDefinitionForElement, document);
    qx::IndexedXML read(*document);
    return objectOf(*this, read, type, error);
}

Ref<Error> QXXMLMarshaller::wrongClass(const qx::Object& object, const std::type_info& type) {
    Ref<Error> error;
    qx::fail(&error, qx::errors::rootOfOtherClass, object.classNameForMarshalling(), nameOf(type));
    return error;
}

Ref<qx::Object> QXXMLMarshaller::readString(qx::XMLBytes xml, const std::type_info& type,
                                            Ref<Error>* error) {
    reset(error);
    return objectOf(*this, qx::XMLParser::parseLent(xml, parseOptions(*this), error), type, error);
}

Ref<qx::Object> QXXMLMarshaller::readFile(const String& path, const std::type_info& type,
                                          Ref<Error>* error) {
    reset(error);
    auto data = qx::readFile(path, error);
    if (!data)
        return nullptr;
    return objectOf(*this, qx::XMLParser::parse(std::move(data), parseOptions(*this), error), type,
                    error);
}

Ref<qx::Object> QXXMLMarshaller::readStream(std::istream& stream, const std::type_info& type,
                                            Ref<Error>* error) {
    reset(error);
    auto data = qx::readStream(stream, error);
    if (!data)
        return nullptr;
    return objectOf(*this, qx::XMLParser::parse(std::move(data), parseOptions(*this), error), type,
                    error);
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
