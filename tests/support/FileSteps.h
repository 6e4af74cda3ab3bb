#pragma once

// Steps among the files of a folder of their own, in what they say "~" (support/Steps.h):
//
//     file PATH TEXT, folder PATH, pipe PATH, link PATH TARGET, mode PATH OCTAL, remove PATH
//     list PATH, read PATH            say the names in a folder, the bytes of a file

#include "support/Steps.h"
#include "support/TemporaryFolder.h"

#include <sys/stat.h>

namespace support {

template <class Folder = TemporaryFolder>
class FileSteps : public Steps {
public:
    FileSteps() {
        know("file", [this](auto& words) { folder.write(words.at(0), words.at(1)); });
        know("folder", [this](auto& words) { std::filesystem::create_directories(path(words)); });
        know("pipe", [this](auto& words) { ::mkfifo(path(words).c_str(), 0600); });
        know("link",
             [this](auto& words) { std::filesystem::create_symlink(words.at(1), path(words)); });
        know("mode", [this](auto& words) {
            ::chmod(path(words).c_str(), static_cast<mode_t>(std::stoul(words.at(1), nullptr, 8)));
        });
        know("remove", [this](auto& words) { std::filesystem::remove_all(path(words)); });
        know("list", [this](auto& words) {
            const std::string names = folder.list(words.at(0));
            say(names.substr(0, names.find_last_not_of(' ') + 1));
        });
        know("read", [this](auto& words) { say(folder.read(words.at(0))); });
    }

protected:
    // The path that the first word names: below the folder, or "/" and on.
    std::string path(const Arguments& words) const {
        return words.at(0).starts_with('/') ? words[0] : folder.path(words[0]);
    }
    void sayPath(std::string text) {
        for (std::size_t at; (at = text.find(folder.root())) != std::string::npos;)
            text.replace(at, folder.root().size(), "~");
        say(text);
    }

    Folder folder;
};

} // namespace support
