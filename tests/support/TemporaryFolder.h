#pragma once

// A folder of its own for a test that reads or writes files, gone with the object.

#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <map>
#include <sstream>
#include <stdexcept>
#include <string>
#include <system_error>

#include <unistd.h>

class TemporaryFolder {
public:
    TemporaryFolder() {
        std::string pattern = std::filesystem::temp_directory_path() / "qx-test-XXXXXX";
        if (::mkdtemp(pattern.data()) == nullptr)
            throw std::runtime_error("no temporary folder");
        // Bundles tell their paths without symbolic links.
        _root = std::filesystem::canonical(pattern);
    }
    TemporaryFolder(const TemporaryFolder&) = delete;
    TemporaryFolder& operator=(const TemporaryFolder&) = delete;
    ~TemporaryFolder() {
        std::error_code ignored;
        std::filesystem::remove_all(_root, ignored);
    }

    std::string root() const { return _root; }
    std::string path(const std::string& relative) const { return _root + "/" + relative; }

    // Writes a file, with the folders above it; its path.
    std::string write(const std::string& relative, const std::string& text) const {
        const std::filesystem::path file = path(relative);
        std::filesystem::create_directories(file.parent_path());
        std::ofstream(file, std::ios::binary) << text;
        return file;
    }
    std::string read(const std::string& relative) const {
        std::ostringstream text;
        text << std::ifstream(path(relative), std::ios::binary).rdbuf();
        return text.str();
    }
    // The names in a folder, one blank behind each, in order.
    std::string list(const std::string& relative) const {
        std::map<std::string, int> names;
        for (const auto& entry : std::filesystem::directory_iterator(path(relative)))
            names[entry.path().filename()] = 0;
        std::string text;
        for (const auto& [name, ignored] : names)
            text += name + " ";
        return text;
    }

private:
    std::string _root;
};
