#pragma once

// A base for classes of a host's whose objects are to come through a document whole: it keeps
// unknown XML, knows the object that holds it, and is written as an item of a collection.
//
//     class Fruit : public QXMappedObject { public: std::string kind; };
//     qx::Class::define<Fruit, QXMappedObject>("Fruit").members<&Fruit::kind>();

#include <QXXMLMarshalling/QXUnknownXML.h>
#include <QXXMLMarshalling/model/WeakRef.h>

class QX_API QXMappedObject : public qx::Object {
public:
    ~QXMappedObject() override;

    QXUnknownXML unknownXML;

    // The object into which a reading put this one; null for a root, for what a plain struct holds,
    // and once that object is gone. Set before this one gets to its place.
    template <class T = qx::Object>
    qx::Ref<T> parent() const {
        return _parent.lock().template as<T>();
    }
    void setParent(qx::Object* parent);
    // Whether items of collections are left out when they are written.
    virtual bool isRemovable() const;

protected:
    const qx::Class& describedClass() const override;

private:
    qx::WeakRef<qx::Object> _parent;
};
