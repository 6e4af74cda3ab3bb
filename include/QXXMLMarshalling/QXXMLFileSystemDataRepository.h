#pragma once

// Documents and data as files. With the user's data directory AS (see docs/repositories.md), the
// process name Client and the version 2.1.57, a name is looked for in
//
//     AS/Client/2.1.57        the user's copies for this version
//     AS/Client               the user's copies for any version
//     the main bundle         what ships with the program
//     the framework bundle    what ships with this library
//
// and the first hit wins. The lists can be changed, by a creation hook for every repository made
// later. A name stays below its directory: one that is empty, absolute or leads out finds nothing,
// and fails when it is written (514, "The file name is invalid."), before anything is touched.

#include <QXXMLMarshalling/QXXMLDataRepository.h>
#include <QXXMLMarshalling/host/Bundle.h>
#include <QXXMLMarshalling/model/Array.h>

class QX_API QXXMLFileSystemDataRepository : public QXXMLPersistentRepository {
public:
    // The user default that names the bundle of the client application, whose version counts;
    // without it that of the main bundle does. Resources are looked for in `searchBundles`.
    static constexpr const char* clientBundleIdentifierKey = "CorvexClientBundleIdentifier";

    using CreateFunction = void (*)(QXXMLFileSystemDataRepository& repository);
    // Called with every repository made from now on, once its lists stand; null for none. It may be
    // called while the shared manager is made: asking for
    // QXXMLDataRepositoryManager::defaultManager then raises NSInternalInconsistencyException.
    static void setRepositoryCreateFunction(CreateFunction function) noexcept;

    // Raises NSInternalInconsistencyException "No application support directories found" where the
    // user has none: no XDG_DATA_HOME, no HOME and no account with a home. A subclass that can be
    // made without arguments is made with init<Subclass>().
    template <std::derived_from<QXXMLFileSystemDataRepository> T = QXXMLFileSystemDataRepository>
    static qx::Ref<T> init() {
        auto repository = qx::make<T>();
        initialize(*repository);
        return repository;
    }
    ~QXXMLFileSystemDataRepository() override;

    // Paths of directories (strings), in the order of the search; then bundles. Changing a list
    // while a look-up walks it raises NSGenericException. Null is an empty list.
    const qx::Ref<qx::Array>& searchPaths() const noexcept { return _searchPaths; }
    void setSearchPaths(const qx::Ref<qx::Array>& paths);
    const qx::Ref<qx::Array>& searchBundles() const noexcept { return _searchBundles; }
    void setSearchBundles(const qx::Ref<qx::Array>& bundles);

    // Sets both lists to what is drawn above.
    virtual void initializeSearchPaths();
    // Appends the versioned directory and the plain one below `directory`, which gets the process
    // name appended unless it ends with it already. A version that leads out of the plain one, as
    // ".." does, has no directory.
    virtual void addPathToSearchPaths(const qx::String& directory, const qx::String& processName);
    // The client application's bundle. An unknown identifier is warned about, and the main bundle
    // taken.
    virtual qx::Ref<qx::Bundle> applicationBundle();
    // CFBundleShortVersionString and CFBundleVersion of that bundle, cleaned and joined by a dot;
    // one alone where the other is empty. Cleaned are leading digits and dots, "(" becoming a dot:
    // "1.0(23)" is "1.0.23", "3.0b2" is "3.0", "v1.0" is empty. One that names no directory of its
    // own ("..") is passed over when reading, and 514 when a versioned file is written.
    virtual qx::String applicationVersion();

    // Whatever has the name counts as a hit; reading a directory, a pipe or a device is an error
    // (256), and so is reading more than 2 GB.
    qx::String pathForResourceNamed(const qx::String& name) override;
    virtual qx::String pathForResourceInBundlesNamed(const qx::String& name);

    bool containsDocument(const qx::String& name) override;
    bool containsData(const qx::String& name) override;
    // The size is that of the file, whether or not it can be parsed; 0 where there is none.
    qx::Ref<qx::XMLDocument> documentNamed(const qx::String& name, std::uint64_t* size = nullptr,
                                           qx::Ref<qx::Error>* error = nullptr) override;
    qx::Ref<qx::Data> dataForName(const qx::String& name,
                                  qx::Ref<qx::Error>* error = nullptr) override;

    // AS/Client; null where the user has no directory for data.
    virtual qx::String userOverrideArea();
    // Makes the directory with those above it. Null when it stands afterwards, else
    //   -2000  "Application support area is not a directory: %@"
    // or the file system's error.
    virtual qx::Ref<qx::Error> createUserOverrideArea(const qx::String& directory);
    // Writes into the directory, which is made first, in one step: the file is whole or not there.
    // One that is replaced leaves its permissions, group and access list to the new one; a symbolic
    // link of that name stays, and what it leads to is replaced.
    // The path written; null with an error, an older file then being untouched:
    //   514   "The file name is invalid."            see above
    //   512   "The file cannot be written: %@"       also for null data, for a null or empty
    //                                                directory, and where a pipe or a device has
    //                                                the name; the reason says why
    //   513, 640, 642                                no permission, disk full, disk read-only
    //   -2000 or what else createUserOverrideArea answers
    // For 514, null data, and names that are too long not even a directory is made.
    virtual qx::String writeFile(const qx::Ref<qx::Data>& data, const qx::String& directory,
                                 const qx::String& name, qx::Ref<qx::Error>* error = nullptr);

    // Pretty-printed, empty elements in their short form, into the plain area. The errors are those
    // of writeFile: 512 for a null document, too. One that no XML can say (a name, a text) is
    //   517  "The text cannot be written: %@"
    // and touches nothing.
    qx::String writeDocumentToUserOverrideArea(const qx::Ref<qx::XMLDocument>& document,
                                               const qx::String& name,
                                               qx::Ref<qx::Error>* error = nullptr) override;
    qx::String writeFileToUserOverrideArea(const qx::Ref<qx::Data>& data, const qx::String& name,
                                           qx::Ref<qx::Error>* error = nullptr) override;
    qx::String writeFileToVersionedUserOverrideArea(const qx::Ref<qx::Data>& data,
                                                    const qx::String& name,
                                                    qx::Ref<qx::Error>* error = nullptr) override;

    // Class name and address, then " searchPaths: …" when there are any.
    qx::String description() const override;

protected:
    // Not set up yet: that is done by init, when the virtual operations are the subclass's.
    QXXMLFileSystemDataRepository();
    friend qx::Ref<QXXMLFileSystemDataRepository> qx::make<QXXMLFileSystemDataRepository>();

private:
    static void initialize(QXXMLFileSystemDataRepository& repository);

    qx::Ref<qx::Array> _searchPaths;
    qx::Ref<qx::Array> _searchBundles;
};
