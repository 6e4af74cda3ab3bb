#pragma once

// Documents and raw data that the host holds in memory under names. A document and data may share a
// name. Register one with QXXMLDataRepositoryManager::setVolatileRepository to have it asked.

#include <QXXMLMarshalling/QXXMLDataRepository.h>
#include <QXXMLMarshalling/model/Dictionary.h>

class QX_API QXXMLVolatileDataRepository : public QXXMLMutableDataRepository {
public:
    // Empty.
    static qx::Ref<QXXMLVolatileDataRepository> init();
    QXXMLVolatileDataRepository();
    ~QXXMLVolatileDataRepository() override;

    bool containsDocument(const qx::String& name) override;
    bool containsData(const qx::String& name) override;
    // The very document that was set, or null; never an error. The size is always the largest
    // signed 64-bit value.
    qx::Ref<qx::XMLDocument> documentNamed(const qx::String& name, std::uint64_t* size = nullptr,
                                           qx::Ref<qx::Error>* error = nullptr) override;
    qx::Ref<qx::Data> dataForName(const qx::String& name,
                                  qx::Ref<qx::Error>* error = nullptr) override;

    // Always true, never an error; null for the document, the data or the name raises
    // NSInvalidArgumentException.
    bool setDocument(const qx::Ref<qx::XMLDocument>& document, const qx::String& name,
                     qx::Ref<qx::Error>* error = nullptr) override;
    bool setData(const qx::Ref<qx::Data>& data, const qx::String& name,
                 qx::Ref<qx::Error>* error = nullptr);

    // Class name and address, then " documents: …" when there are any.
    qx::String description() const override;

private:
    qx::Ref<qx::Dictionary> _documents;
    qx::Ref<qx::Dictionary> _datas;
};
