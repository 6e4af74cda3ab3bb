#include <QXXMLMarshalling/QXMappedObject.h>

namespace {

// Known to the library and not to mappings, which cannot name it.
const qx::Class& describe() {
    using namespace qx::detail;
    ClassDraft draft;
    draft.name = "QXMappedObject";
    draft.type = &typeid(QXMappedObject);
    draft.superclass = &typeid(qx::Object);
    addParts<QXMappedObject, &QXMappedObject::unknownXML>(draft.properties);
    draft.operations = {
        instanceOperation<QXMappedObject, &QXMappedObject::setParent>("setParent:"),
        instanceOperation<QXMappedObject, &QXMappedObject::isRemovable>("isRemovable")};
    return publish(std::move(draft), false);
}

const qx::Class& classObject() {
    static const qx::Class* const described = &describe();
    return *described;
}

// Before classes that derive from it are looked at.
[[maybe_unused]] const qx::Class& described = classObject();

} // namespace

QXMappedObject::~QXMappedObject() = default;

void QXMappedObject::setParent(qx::Object* parent) { _parent = parent; }

bool QXMappedObject::isRemovable() const { return false; }

const qx::Class& QXMappedObject::describedClass() const { return classObject(); }
