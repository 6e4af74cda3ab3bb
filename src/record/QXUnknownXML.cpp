#include <QXXMLMarshalling/QXUnknownXML.h>

#include <QXXMLMarshalling/xml/XMLNode.h>

using qx::Array;
using qx::Dictionary;
using qx::Ref;

namespace {

Ref<Array> copied(const Ref<Array>& nodes) {
    if (!nodes)
        return nullptr;
    auto copy = qx::make<Array>();
    copy->reserve(nodes->count());
    for (const qx::Value& value : *nodes) {
        const auto node = value.as<qx::XMLNode>();
        copy->add(node ? qx::Value(node->copy()) : value);
    }
    return copy;
}

Ref<Dictionary> copied(const Ref<Dictionary>& byName) {
    if (!byName)
        return nullptr;
    auto copy = qx::make<Dictionary>();
    for (const auto& entry : *byName)
        copy->set(entry.key, copied(entry.value.as<Array>()));
    return copy;
}

template <class Collection>
bool isEmptyOrNull(const Ref<Collection>& kept) noexcept {
    return !kept || kept->count() == 0;
}

} // namespace

QXUnknownXML::QXUnknownXML(const QXUnknownXML& other)
    : _children(copied(other._children)), _attributes(copied(other._attributes)),
      _namespaces(copied(other._namespaces)) {}

QXUnknownXML& QXUnknownXML::operator=(QXUnknownXML other) noexcept {
    std::swap(_children, other._children);
    std::swap(_attributes, other._attributes);
    std::swap(_namespaces, other._namespaces);
    return *this;
}

QXUnknownXML::~QXUnknownXML() = default;

bool QXUnknownXML::isEmpty() const noexcept {
    return isEmptyOrNull(_children) && isEmptyOrNull(_attributes) && isEmptyOrNull(_namespaces);
}
