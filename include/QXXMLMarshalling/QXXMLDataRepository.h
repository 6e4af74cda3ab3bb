#pragma once

// What finds documents and raw data by name: three abstract classes that a host may implement.
//
//     QXXMLDataRepository           reads by name
//     QXXMLMutableDataRepository    takes documents from the host
//     QXXMLPersistentRepository     knows files, and writes into the user's override area
//
// A class may be both of the latter. A name is a relative path such as "orders.xml" or
// "maps/orders.xml". Repositories are asked by one thread at a time.

#include <QXXMLMarshalling/model/Data.h>
#include <QXXMLMarshalling/xml/XMLDocument.h>

class QX_API QXXMLDataRepository : public qx::Object {
public:
    ~QXXMLDataRepository() override;

    // Whether a document, or raw data, of that name can be had here.
    virtual bool containsDocument(const qx::String& name) = 0;
    virtual bool containsData(const qx::String& name) = 0;
    // The document; null without an error when there is none of that name, null with one when it
    // cannot be read or parsed. `size`, where given, receives how many bytes it was read from; the
    // largest signed 64-bit value when none were read, because it is held parsed.
    virtual qx::Ref<qx::XMLDocument> documentNamed(const qx::String& name,
                                                   std::uint64_t* size = nullptr,
                                                   qx::Ref<qx::Error>* error = nullptr) = 0;
    // The bytes; null as above.
    virtual qx::Ref<qx::Data> dataForName(const qx::String& name,
                                          qx::Ref<qx::Error>* error = nullptr) = 0;
};

class QX_API QXXMLMutableDataRepository : public virtual QXXMLDataRepository {
public:
    ~QXXMLMutableDataRepository() override;

    // Stores the document under the name, in place of an earlier one. False when it was not taken.
    virtual bool setDocument(const qx::Ref<qx::XMLDocument>& document, const qx::String& name,
                             qx::Ref<qx::Error>* error = nullptr) = 0;
};

class QX_API QXXMLPersistentRepository : public virtual QXXMLDataRepository {
public:
    ~QXXMLPersistentRepository() override;

    // The path of the first file of that name; null when there is none.
    virtual qx::String pathForResourceNamed(const qx::String& name) = 0;
    // Each writes a file that shadows what ships under that name, and answers its path; null with
    // an error when it cannot be written. The versioned area is searched before the plain one.
    virtual qx::String writeDocumentToUserOverrideArea(const qx::Ref<qx::XMLDocument>& document,
                                                       const qx::String& name,
                                                       qx::Ref<qx::Error>* error = nullptr) = 0;
    virtual qx::String writeFileToUserOverrideArea(const qx::Ref<qx::Data>& data,
                                                   const qx::String& name,
                                                   qx::Ref<qx::Error>* error = nullptr) = 0;
    virtual qx::String
    writeFileToVersionedUserOverrideArea(const qx::Ref<qx::Data>& data, const qx::String& name,
                                         qx::Ref<qx::Error>* error = nullptr) = 0;
};
