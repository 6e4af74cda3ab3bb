#pragma once

// Steps with the repositories of a client named "Client" (support/FileSteps.h for those with
// files):
//
//     version SHORT BUILD            of the client's bundle, ~/app, and a new repository of files
//     data-home PATH                 where the user's files are, and a new repository of files
//     paths, find NAME               where the repository of files looks, and what it finds
//     document NAME, data NAME       say what the manager gives
//     write, write-versioned NAME TEXT, write-document NAME TEXT
//     hold REPOSITORY NAME TEXT      a document in memory
//     order REPOSITORY…, names       the order in which the manager asks

#include "support/FileSandbox.h"
#include "support/FileSteps.h"
#include "support/Texts.h"

#include <QXXMLMarshalling/QXXMLDataRepositoryManager.h>
#include <QXXMLMarshalling/QXXMLFileSystemDataRepository.h>
#include <QXXMLMarshalling/QXXMLVolatileDataRepository.h>

class RepositorySteps : public support::FileSteps<FileSandbox> {
public:
    RepositorySteps() {
        main = folder.bundle("app", {});
        qx::Bundle::setMainBundle(main);
        makeFiles();
        know("version", [this](auto& words) {
            main->infoDictionary()->set("CFBundleShortVersionString", words.at(0));
            main->infoDictionary()->set("CFBundleVersion", words.at(1));
            makeFiles();
        });
        know("data-home", [this](auto& words) {
            folder.setVariable("XDG_DATA_HOME", path(words));
            makeFiles();
        });
        know("paths", [this](auto&) {
            for (const qx::Value& path : *files->searchPaths())
                sayPath(path.string().str());
        });
        know("find", [this](auto& words) {
            sayPath(qx::Value(files->pathForResourceNamed(words.at(0))).description().str());
        });
        know("document", [this](auto& words) {
            std::uint64_t size = 0;
            sayOutcome([&](auto* error) {
                const auto document = manager->documentNamed(words.at(0), &size, error);
                return document ? document->XMLString() : "nothing";
            });
            say(std::to_string(size) + " bytes");
        });
        know("data", [this](auto& words) {
            sayOutcome([&](auto* error) {
                const auto data = manager->dataForName(words.at(0), error);
                return data ? qx::String(data->view()) : "nothing";
            });
        });
        const auto data = [](const std::string& text) { return qx::make<qx::Data>(text); };
        using Files = QXXMLFileSystemDataRepository;
        knowWriting("write", &Files::writeFileToUserOverrideArea, data);
        knowWriting("write-versioned", &Files::writeFileToVersionedUserOverrideArea, data);
        knowWriting("write-document", &Files::writeDocumentToUserOverrideArea,
                    [](auto& text) { return support::parsed(text); });
        know("hold", [this](auto& words) {
            const auto memory = QXXMLVolatileDataRepository::init();
            memory->setDocument(support::parsed(words.at(2)), words[1]);
            manager->setRepository(memory, words[0]);
        });
        know("order", [this](auto& words) {
            const auto names = qx::make<qx::Array>();
            for (const std::string& name : words)
                names->add(name);
            manager->setRepositoryNames(names);
        });
        know("names", [this](auto&) {
            for (const qx::Value& name : *manager->repositoryNames())
                say(name.string().str());
        });
    }

private:
    void makeFiles() {
        files = QXXMLFileSystemDataRepository::init();
        manager->setPersistentRepository(files);
    }
    template <class Call>
    void sayOutcome(Call call) {
        qx::Ref<qx::Error> error;
        const qx::String text = call(&error);
        sayPath(error ? support::told(error) : text.str());
    }
    template <class Write, class Make>
    void knowWriting(const char* command, Write write, Make make) {
        know(command, [=, this](auto& words) {
            sayOutcome(
                [&](auto* error) { return ((*files).*write)(make(words.at(1)), words[0], error); });
        });
    }

    qx::Ref<qx::Bundle> main;
    qx::Ref<QXXMLFileSystemDataRepository> files;
    qx::Ref<QXXMLDataRepositoryManager> manager = QXXMLDataRepositoryManager::init();
};
