#include <QXXMLMarshalling/QXXMLMapping.h>

#include <QXXMLMarshalling/model/Array.h>

#include "mapping/MappingSource.h"
#include "mapping/MappingWords.h"
#include "model/Errors.h"
#include "model/LibraryClass.h"

#include <utility>

using qx::Error;
using qx::Key;
using qx::Ref;
using qx::String;
using qx::XMLElement;
using qx::detail::MappingSource;

QXXMLMapping::QXXMLMapping() = default;
QXXMLMapping::~QXXMLMapping() = default;

Ref<QXXMLMapping> QXXMLMapping::initWithXML(XMLElement* element, Ref<Error>* error) {
    return initialized<QXXMLMapping>(element, error);
}

namespace {

// Mapping nodes nest through the classes of bindings. A parsed document is limited already; one
// built by hand is not.
constexpr std::size_t deepestNode = 1'024;

// The nodes that are being read on this thread, one inside the other: all of one document.
thread_local std::size_t depth = 0;
thread_local MappingSource* sourceOfAll = nullptr;

struct Deeper {
    explicit Deeper(MappingSource& source) noexcept {
        if (depth++ == 0)
            sourceOfAll = &source;
    }
    ~Deeper() { --depth; }
    Deeper(const Deeper&) = delete;
    Deeper& operator=(const Deeper&) = delete;
};

} // namespace

bool QXXMLMapping::readElement(XMLElement* element, Ref<Error>* error) {
    return readElement(element, error,
                       depth != 0 ? Ref<MappingSource>(sourceOfAll) : MappingSource::of(element));
}

bool QXXMLMapping::readElement(XMLElement* element, Ref<Error>* error,
                               const Ref<MappingSource>& source) {
    const auto kept = element != nullptr ? Ref<XMLElement>(element) : XMLElement::initWithName("");
    if (depth == deepestNode)
        return qx::fail(error, qx::errors::nestedTooDeep, deepestNode, kept->name());
    _source = source;
    const Deeper deeper(*source);
    if (initXML(*kept, error))
        return true;
    if (error != nullptr)
        _source->locate(*error, *kept);
    return false;
}

bool QXXMLMapping::initXML(XMLElement& element, Ref<Error>* error) {
    const auto& words = qx::detail::mappingWords();
    _element = Ref<XMLElement>(&element);
    const auto descriptions = element.elementsForName(words.description);
    if (descriptions.size() > 1 &&
        !goesOn(qx::fail(error, qx::errors::tooManyDescriptions, &element), error))
        return false;
    if (!descriptions.empty())
        _mappingDescription = descriptions.front()->stringValue();
    return true;
}

bool QXXMLMapping::goesOn(bool succeeded, Ref<Error>* error) const {
    if (succeeded || error == nullptr || !*error || !_source->collectsFaults())
        return succeeded;
    _source->locate(*error, *_element);
    _source->addFault(std::exchange(*error, nullptr));
    return true;
}

Ref<QXXMLMapping> QXXMLMapping::copyWithZone() const {
    auto copy = newInstance();
    Ref<Error> ignored;
    return copy->readElement(_element.get(), &ignored, _source) ? copy : nullptr;
}

QXXMLMappingPlace QXXMLMapping::place() const {
    return {_source->name(), _element->line(), _element->column()};
}

std::vector<QXXMLMappingPlace> QXXMLMapping::includedFrom() const { return _source->chain(); }

Ref<QXXMLMapping> QXXMLMapping::newInstance() const { return qx::make<QXXMLMapping>(); }

String QXXMLMapping::description() const { return descriptionWithLocale(nullptr, 0); }

String QXXMLMapping::descriptionWithLocale(const qx::Object*, std::size_t) const {
    std::string text = Object::description().str();
    append(text, "description", _mappingDescription);
    return text;
}

void QXXMLMapping::append(std::string& text, std::string_view key, const String& value) {
    if (value.isEmpty())
        return;
    text += ' ';
    text += key;
    text += ": ";
    text += value.view();
}

void QXXMLMapping::append(std::string& text, std::string_view key, const qx::Object* locale,
                          std::size_t indent, std::vector<qx::Value> list) {
    if (list.empty())
        return;
    text += ' ';
    text += key;
    text += ":\n";
    text += qx::make<qx::Array>(std::move(list))->descriptionWithLocale(locale, indent).view();
}

// Values are interned: they are names for the most part, and documents are compared with them.
bool QXXMLMapping::extractStringAttribute(Key name, const XMLElement& element, bool required,
                                          String& result, Ref<Error>* error) {
    result = Key(element.attributeValue(name));
    return !result.isNull() || !required ||
           qx::fail(error, qx::errors::requiredAttributeNotFound, name.string(), &element);
}

bool QXXMLMapping::extractBooleanAttribute(Key name, const XMLElement& element, bool required,
                                           bool& result, Ref<Error>* error) {
    return extractBooleanAttribute(name, element, required, result, false, error);
}

bool QXXMLMapping::extractBooleanAttribute(Key name, const XMLElement& element, bool required,
                                           bool& result, bool defaultValue, Ref<Error>* error) {
    result = defaultValue;
    const String value = element.attributeValue(name);
    if (value.isNull())
        return !required ||
               qx::fail(error, qx::errors::requiredAttributeNotFound, name.string(), &element);
    if (value.equalsIgnoringCase("true"))
        result = true;
    else if (value.equalsIgnoringCase("false"))
        result = false;
    else
        return qx::fail(error, qx::errors::illegalBoolean, name.string(), value);
    return true;
}

const qx::Class& QXXMLMapping::describedClass() const {
    return qx::libraryClass<QXXMLMapping>("QXXMLMapping");
}
