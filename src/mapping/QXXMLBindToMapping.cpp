#include <QXXMLMarshalling/QXXMLBindToMapping.h>

#include <QXXMLMarshalling/QXXMLClassMapping.h>

#include "mapping/MappingWords.h"
#include "model/Errors.h"
#include "model/LibraryClass.h"
#include "model/Printing.h"

using qx::Error;
using qx::Ref;
using qx::String;
using qx::XMLElement;

QXXMLBindToMapping::QXXMLBindToMapping(bool minimal) noexcept : _minimal(minimal) {}

QXXMLBindToMapping::~QXXMLBindToMapping() = default;

Ref<QXXMLBindToMapping> QXXMLBindToMapping::initWithXML(XMLElement* element, Ref<Error>* error) {
    return initialized<QXXMLBindToMapping>(element, error);
}

Ref<QXXMLBindToMapping> QXXMLBindToMapping::initWithMinimalXML(XMLElement* element,
                                                               Ref<Error>* error) {
    return initialized<QXXMLBindToMapping>(element, error, true);
}

bool QXXMLBindToMapping::initXML(XMLElement& element, Ref<Error>* error) {
    const auto& words = qx::detail::mappingWords();
    if (!QXXMLMapping::initXML(element, error) ||
        !extractStringAttribute(words.name, element, false, _bindTo, error) ||
        !extractStringAttribute(words.location, element, false, _location, error))
        return false;
    if (_minimal)
        return true;
    if (!extractStringAttribute(words.type, element, false, _type, error) ||
        !extractStringAttribute(words.node, element, false, _node, error) ||
        !extractStringAttribute(words.references, element, false, _references, error) ||
        !extractStringAttribute(words.matches, element, false, _matches, error) ||
        !extractStringAttribute(words.qNamePrefix, element, false, _qNamePrefix, error) ||
        !extractStringAttribute(words.autoNaming, element, false, _autoNaming, error))
        return false;
    const auto classes = element.elementsForName(words.classes);
    if (classes.size() > 1)
        return goesOn(qx::fail(error, qx::errors::tooManyClassElements, &element), error);
    if (!classes.empty())
        _childClassMapping = QXXMLClassMapping::initWithXML(classes.front(), error);
    return goesOn(classes.empty() || _childClassMapping, error);
}

QXXMLNodeType QXXMLBindToMapping::nodeType() const {
    if (_node.equalsIgnoringCase("element"))
        return QXXMLNodeTypeElement;
    if (_node.equalsIgnoringCase("attribute"))
        return QXXMLNodeTypeAttribute;
    return _node.equalsIgnoringCase("text") ? QXXMLNodeTypeText : QXXMLNodeTypeUnknown;
}

Ref<QXXMLClassMapping> QXXMLBindToMapping::childClassMapping() const { return _childClassMapping; }

void QXXMLBindToMapping::setChildClassMapping(Ref<QXXMLClassMapping> mapping) {
    _childClassMapping = std::move(mapping);
}

String QXXMLBindToMapping::descriptionWithLocale(const qx::Object* locale,
                                                 std::size_t indent) const {
    // A host may set a class that holds this very binding.
    const qx::Printing printing(*this);
    if (!printing.mayDescend())
        return qx::Printing::cutShort;
    std::string text = QXXMLMapping::descriptionWithLocale(locale, indent).str();
    append(text, "bindTo", _bindTo);
    append(text, "type", _type);
    append(text, "node", _node);
    append(text, "location", _location);
    append(text, "references", _references);
    append(text, "matches", _matches);
    append(text, "QName-prefix", _qNamePrefix);
    if (_reference)
        append(text, "reference", "true");
    append(text, "auto-naming", _autoNaming);
    if (_childClassMapping) {
        text += " childClassMapping:\n";
        text += _childClassMapping->descriptionWithLocale(locale, indent).view();
    }
    return text;
}

Ref<QXXMLMapping> QXXMLBindToMapping::newInstance() const { return qx::make<QXXMLBindToMapping>(); }

const qx::Class& QXXMLBindToMapping::describedClass() const {
    return qx::libraryClass<QXXMLBindToMapping, QXXMLMapping>("QXXMLBindToMapping");
}
