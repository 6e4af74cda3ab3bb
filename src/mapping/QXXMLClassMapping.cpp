#include <QXXMLMarshalling/QXXMLClassMapping.h>

#include "mapping/MappingWords.h"
#include "model/Errors.h"
#include "model/LibraryClass.h"

using qx::Error;
using qx::Key;
using qx::Ref;
using qx::String;
using qx::XMLElement;

QXXMLClassMapping::~QXXMLClassMapping() = default;

Ref<QXXMLClassMapping> QXXMLClassMapping::initWithXML(XMLElement* element, Ref<Error>* error) {
    return initialized<QXXMLClassMapping>(element, error);
}

bool QXXMLClassMapping::initXML(XMLElement& element, Ref<Error>* error) {
    const auto& words = qx::detail::mappingWords();
    return QXXMLMapping::initXML(element, error) &&
           goesOn(extractStringAttribute(words.name, element, true, _className, error), error) &&
           extractStringAttribute(words.extends, element, false, _extends, error) &&
           readFlag(words.autoComplete, _autocomplete, error) &&
           readFlag(words.selfFirst, _selfFirst, error) &&
           extractStringAttribute(words.type, element, false, _type, error) && readMapTo(error) &&
           processFields(element.elementsForName(words.field), error);
}

bool QXXMLClassMapping::readFlag(Key name, bool& flag, Ref<Error>* error) {
    return goesOn(extractBooleanAttribute(name, element(), false, flag, error), error);
}

bool QXXMLClassMapping::readMapTo(Ref<Error>* error) {
    const auto& words = qx::detail::mappingWords();
    const auto mapTos = element().elementsForName(words.mapTo);
    if (mapTos.size() > 1 &&
        !goesOn(qx::fail(error, qx::errors::tooManyMapToElements, &element()), error))
        return false;
    if (mapTos.empty())
        return true;
    return extractStringAttribute(words.xml, *mapTos.front(), false, _mapTo, error) &&
           extractStringAttribute(words.nsURI, *mapTos.front(), false, _nsURI, error) &&
           extractStringAttribute(words.nsPrefix, *mapTos.front(), false, _nsPrefix, error);
}

bool QXXMLClassMapping::processFields(const std::vector<XMLElement*>& elements, Ref<Error>* error) {
    for (XMLElement* element : elements) {
        auto field = QXXMLFieldMapping::initWithXML(element, error);
        if (!goesOn(field != nullptr, error))
            return false;
        if (!field || field->name().isNull())
            continue;
        field->setClassMapping(this);
        _fields.push_back(std::move(field));
    }
    return true;
}

Ref<QXXMLMapping> QXXMLClassMapping::copyWithZone() const {
    auto copy = QXXMLMapping::copyWithZone();
    if (!copy)
        return nullptr;
    auto& mapping = static_cast<QXXMLClassMapping&>(*copy);
    mapping._className = _className;
    mapping._extends = _extends;
    mapping._mapTo = _mapTo;
    mapping._nsURI = _nsURI;
    mapping._nsPrefix = _nsPrefix;
    mapping._type = _type;
    mapping._fields = _fields;
    return copy;
}

String QXXMLClassMapping::descriptionWithLocale(const qx::Object* locale,
                                                std::size_t indent) const {
    std::string text = QXXMLMapping::descriptionWithLocale(locale, indent).str();
    append(text, "class", _className);
    append(text, "map-to", _mapTo);
    append(text, "ns-prefix", _nsPrefix);
    append(text, "ns-uri", _nsURI);
    append(text, "extends", _extends);
    append(text, "type", _type);
    append(text, "fields", locale, indent, {_fields.begin(), _fields.end()});
    return text;
}

Ref<QXXMLMapping> QXXMLClassMapping::newInstance() const { return qx::make<QXXMLClassMapping>(); }

const qx::Class& QXXMLClassMapping::describedClass() const {
    using qx::detail::accessorProperty;
    return qx::libraryClass<QXXMLClassMapping, QXXMLMapping>(
        "QXXMLClassMapping", {accessorProperty<QXXMLClassMapping, &QXXMLClassMapping::mapTo,
                                               &QXXMLClassMapping::setMapTo>("mapTo")});
}
