#pragma once

// Repositories by name, and the order in which they are asked. The documents that a mapping
// includes are looked for through the shared manager:
//
//     auto volatiles = QXXMLVolatileDataRepository::init();
//     volatiles->setDocument(document, "common.xml");
//     QXXMLDataRepositoryManager::defaultManager()->setVolatileRepository(volatiles);
//
// A fresh manager holds one repository, the file-system one, as the persistent repository. The
// first repository that claims a name serves it; when its reading fails, no other is asked. A
// manager is used by one thread at a time; the shared one may be asked for from any.

#include <QXXMLMarshalling/QXXMLDataRepository.h>
#include <QXXMLMarshalling/platform/Array.h>
#include <QXXMLMarshalling/platform/Dictionary.h>

// Names of the two repositories that have accessors of their own; each is its own text.
extern "C" {
extern QX_API const char* const QXXMLDataRepositoryVolatileName;
extern QX_API const char* const QXXMLDataRepositoryPersistentName;
}

class QX_API QXXMLDataRepositoryManager : public qx::Object {
public:
    // The shared manager, made when it is first asked for; raises what init raises.
    static qx::Ref<QXXMLDataRepositoryManager> defaultManager();
    // Drops it: the next call of defaultManager makes a fresh one.
    static void flushDefaultManager();

    // Raises what QXXMLFileSystemDataRepository::init raises: NSInternalInconsistencyException for
    // a user without any home.
    static qx::Ref<QXXMLDataRepositoryManager> init();
    QXXMLDataRepositoryManager();
    ~QXXMLDataRepositoryManager() override;

    // Null when there is none of that name.
    qx::Ref<QXXMLDataRepository> repositoryForName(const qx::String& name) const;
    // Stores the repository under the name. One that had the name is replaced and keeps its place
    // in the order; a new name comes last, unless the order has it already. Null raises
    // NSInvalidArgumentException.
    void setRepository(const qx::Ref<QXXMLDataRepository>& repository, const qx::String& name);
    void addRepository(const qx::Ref<QXXMLDataRepository>& repository, const qx::String& name);

    qx::Ref<QXXMLDataRepository> volatileRepository() const;
    void setVolatileRepository(const qx::Ref<QXXMLDataRepository>& repository);
    qx::Ref<QXXMLDataRepository> persistentRepository() const;
    void setPersistentRepository(const qx::Ref<QXXMLDataRepository>& repository);

    // The order in which repositories are asked; a name without a repository claims nothing.
    // Changing or replacing the list while a look-up walks it raises NSGenericException. Null is an
    // empty list.
    virtual qx::Ref<qx::Array> repositoryNames() const;
    void setRepositoryNames(const qx::Ref<qx::Array>& names);

    // The first repository that claims the name; null when none does.
    qx::Ref<QXXMLDataRepository> repositoryForDocumentNamed(const qx::String& name) const;
    qx::Ref<QXXMLDataRepository> repositoryForDataNamed(const qx::String& name) const;
    // What that repository answers, its errors unchanged; null, with nothing set, when none claims
    // the name.
    qx::Ref<qx::XMLDocument> documentNamed(const qx::String& name, std::uint64_t* size = nullptr,
                                           qx::Ref<qx::Error>* error = nullptr) const;
    qx::Ref<qx::Data> dataForName(const qx::String& name,
                                  qx::Ref<qx::Error>* error = nullptr) const;

    // Class name and address, then " repositories: …" when there are any.
    qx::String description() const override;

private:
    qx::Ref<QXXMLDataRepository>
    firstClaiming(const qx::String& name,
                  bool (QXXMLDataRepository::*claims)(const qx::String&)) const;

    qx::Ref<qx::Dictionary> _repositories;
    qx::Ref<qx::Array> _repositoryNames;
    std::size_t _orderings = 0; // how often the list was replaced
};
