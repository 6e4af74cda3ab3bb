#pragma once

// A world of its own for a test that looks at the user's files: a temporary folder that holds the
// home, data and configuration directories, another process name, and no locale. All of it is taken
// back at the end.

#include <QXXMLMarshalling/host/Bundle.h>
#include <QXXMLMarshalling/host/ProcessInfo.h>
#include <QXXMLMarshalling/host/UserDefaults.h>
#include <QXXMLMarshalling/model/Null.h>

#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <map>
#include <optional>
#include <sstream>
#include <stdexcept>
#include <string>
#include <vector>

#include <unistd.h>

class FileSandbox {
public:
    FileSandbox() {
        std::string pattern = std::filesystem::temp_directory_path() / "qx-test-XXXXXX";
        if (::mkdtemp(pattern.data()) == nullptr)
            throw std::runtime_error("no temporary folder");
        // Bundles tell their paths without symbolic links.
        _root = std::filesystem::canonical(pattern);
        setVariable("HOME", path("home"));
        setVariable("XDG_DATA_HOME", path("data"));
        setVariable("XDG_CONFIG_HOME", path("config"));
        for (const char* name : {"LC_ALL", "LC_MESSAGES", "LANG"})
            setVariable(name, std::nullopt);
        qx::ProcessInfo::setProcessName("Client");
    }
    FileSandbox(const FileSandbox&) = delete;
    FileSandbox& operator=(const FileSandbox&) = delete;
    ~FileSandbox() {
        qx::ProcessInfo::setProcessName(nullptr);
        qx::ProcessInfo::setProcessVersion(nullptr);
        qx::Bundle::setMainBundle(nullptr);
        for (const auto& bundle : _bundles)
            qx::Bundle::forget(bundle);
        qx::UserDefaults::standardUserDefaults()->synchronize();
        for (const auto& [name, value] : _former)
            assign(name, value);
        std::error_code ignored;
        std::filesystem::remove_all(_root, ignored);
    }

    std::string root() const { return _root; }
    std::string path(const std::string& relative) const { return _root + "/" + relative; }

    void setVariable(const std::string& name, const std::optional<std::string>& value) {
        const char* former = std::getenv(name.c_str());
        _former.try_emplace(name, former ? std::optional<std::string>(former) : std::nullopt);
        assign(name, value);
    }

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

    // Makes a bundle with those entries in its Info.plist.
    qx::Ref<qx::Bundle> bundle(const std::string& relative,
                               const std::map<std::string, std::string>& info = {}) {
        std::string list = "<plist version=\"1.0\"><dict>";
        for (const auto& [key, value] : info)
            list += "<key>" + key + "</key><string>" + value + "</string>";
        write(relative + "/Info.plist", list + "</dict></plist>");
        return _bundles.emplace_back(qx::Bundle::bundleWithPath(path(relative)));
    }

    // What the library keeps for ever is no leak of the first test that needs it.
    static void makeLastingObjects() {
        qx::Bundle::mainBundle();
        qx::Bundle::frameworkBundle();
        qx::UserDefaults::standardUserDefaults()->boolForKey("");
        qx::Null::marker();
    }

private:
    static void assign(const std::string& name, const std::optional<std::string>& value) {
        if (value)
            ::setenv(name.c_str(), value->c_str(), 1);
        else
            ::unsetenv(name.c_str());
    }

    std::string _root;
    std::vector<qx::Ref<qx::Bundle>> _bundles;
    std::map<std::string, std::optional<std::string>> _former;
};
