#include <QXXMLMarshalling/QXXMLDataRepositoryManager.h>

#include <QXXMLMarshalling/QXXMLFileSystemDataRepository.h>
#include <QXXMLMarshalling/QXXMLVolatileDataRepository.h>
#include <QXXMLMarshalling/base/Exception.h>

#include "base/Immortal.h"
#include "repository/NameLookUp.h"

#include <mutex>
#include <utility>

using qx::Array;
using qx::Data;
using qx::Dictionary;
using qx::Error;
using qx::Exception;
using qx::Ref;
using qx::String;
using qx::Value;
using qx::XMLDocument;
using qx::detail::NameLookUp;

const char* const QXXMLDataRepositoryVolatileName = "QXXMLDataRepositoryVolatileName";
const char* const QXXMLDataRepositoryPersistentName = "QXXMLDataRepositoryPersistentName";

namespace {

struct SharedManager {
    std::mutex mutex;
    Ref<QXXMLDataRepositoryManager> manager;
};

// Marks, per thread, that the shared manager is being made: a creation hook that asks for it would
// otherwise make one without end.
class Making {
public:
    Making() {
        if (_active)
            throw Exception(Exception::internalInconsistency,
                            "The shared repository manager was asked for while it is made");
        _active = true;
    }
    Making(const Making&) = delete;
    Making& operator=(const Making&) = delete;
    ~Making() { _active = false; }

private:
    static thread_local bool _active;
};
thread_local bool Making::_active = false;

} // namespace

Ref<QXXMLDataRepositoryManager> QXXMLDataRepositoryManager::defaultManager() {
    auto& shared = qx::immortal<SharedManager>();
    {
        const std::lock_guard lock(shared.mutex);
        if (shared.manager)
            return shared.manager;
    }
    const Making making;
    auto made = init();
    const std::lock_guard lock(shared.mutex);
    if (!shared.manager)
        shared.manager = std::move(made);
    return shared.manager;
}

void QXXMLDataRepositoryManager::flushDefaultManager() {
    auto& shared = qx::immortal<SharedManager>();
    Ref<QXXMLDataRepositoryManager> dropped; // ends after the lock is gone
    const std::lock_guard lock(shared.mutex);
    dropped = std::exchange(shared.manager, nullptr);
}

Ref<QXXMLDataRepositoryManager> QXXMLDataRepositoryManager::init() {
    return qx::make<QXXMLDataRepositoryManager>();
}

// Both are registered under one name on purpose: the file system takes the place of the repository
// in memory, which a host registers itself where it wants one.
QXXMLDataRepositoryManager::QXXMLDataRepositoryManager()
    : _repositories(qx::make<Dictionary>()), _repositoryNames(qx::make<Array>()) {
    addRepository(QXXMLVolatileDataRepository::init(), QXXMLDataRepositoryPersistentName);
    addRepository(QXXMLFileSystemDataRepository::init(), QXXMLDataRepositoryPersistentName);
}

QXXMLDataRepositoryManager::~QXXMLDataRepositoryManager() = default;

Ref<QXXMLDataRepository> QXXMLDataRepositoryManager::repositoryForName(const String& name) const {
    return _repositories->get(name).as<QXXMLDataRepository>();
}

void QXXMLDataRepositoryManager::setRepository(const Ref<QXXMLDataRepository>& repository,
                                               const String& name) {
    // The host may have placed the name before its repository.
    const bool isNew = !_repositories->contains(name) && !_repositoryNames->contains(name);
    _repositories->set(name, repository);
    if (isNew)
        _repositoryNames->add(name);
}

void QXXMLDataRepositoryManager::addRepository(const Ref<QXXMLDataRepository>& repository,
                                               const String& name) {
    setRepository(repository, name);
}

Ref<QXXMLDataRepository> QXXMLDataRepositoryManager::volatileRepository() const {
    return repositoryForName(QXXMLDataRepositoryVolatileName);
}

void QXXMLDataRepositoryManager::setVolatileRepository(const Ref<QXXMLDataRepository>& repository) {
    setRepository(repository, QXXMLDataRepositoryVolatileName);
}

Ref<QXXMLDataRepository> QXXMLDataRepositoryManager::persistentRepository() const {
    return repositoryForName(QXXMLDataRepositoryPersistentName);
}

void QXXMLDataRepositoryManager::setPersistentRepository(
    const Ref<QXXMLDataRepository>& repository) {
    setRepository(repository, QXXMLDataRepositoryPersistentName);
}

Ref<Array> QXXMLDataRepositoryManager::repositoryNames() const { return _repositoryNames; }

void QXXMLDataRepositoryManager::setRepositoryNames(const Ref<Array>& names) {
    _repositoryNames = names ? names : qx::make<Array>();
    ++_orderings;
}

Ref<QXXMLDataRepository> QXXMLDataRepositoryManager::firstClaiming(
    const String& name, bool (QXXMLDataRepository::*claims)(const String&)) const {
    const Ref<Array> names = repositoryNames();
    if (!names)
        return nullptr;
    const std::size_t orderings = _orderings;
    for (const Value& repositoryName : *names) {
        auto repository = repositoryForName(repositoryName.string());
        if (repository && (*repository.*claims)(name))
            return repository;
        if (orderings != _orderings)
            throw Exception(Exception::generic,
                            "the list of repositories was replaced while it was walked");
    }
    return nullptr;
}

Ref<QXXMLDataRepository>
QXXMLDataRepositoryManager::repositoryForDocumentNamed(const String& name) const {
    return firstClaiming(name, &QXXMLDataRepository::containsDocument);
}

Ref<QXXMLDataRepository>
QXXMLDataRepositoryManager::repositoryForDataNamed(const String& name) const {
    return firstClaiming(name, &QXXMLDataRepository::containsData);
}

Ref<XMLDocument> QXXMLDataRepositoryManager::documentNamed(const String& name, std::uint64_t* size,
                                                           Ref<Error>* error) const {
    const NameLookUp lookUp;
    const auto repository = repositoryForDocumentNamed(name);
    return repository ? repository->documentNamed(name, size, error) : nullptr;
}

Ref<Data> QXXMLDataRepositoryManager::dataForName(const String& name, Ref<Error>* error) const {
    const NameLookUp lookUp;
    const auto repository = repositoryForDataNamed(name);
    return repository ? repository->dataForName(name, error) : nullptr;
}

String QXXMLDataRepositoryManager::description() const {
    if (_repositories->isEmpty())
        return Object::description();
    return String::concat({Object::description(), " repositories: ", _repositories->description()});
}
