#pragma once

// A world of its own for a test that looks at the user's files: a temporary folder that holds the
// home, data and configuration directories, another process name, and no locale. All of it is taken
// back at the end.

#include <QXXMLMarshalling/host/Bundle.h>
#include <QXXMLMarshalling/host/ProcessInfo.h>
#include <QXXMLMarshalling/host/UserDefaults.h>
#include <QXXMLMarshalling/model/Null.h>

#include "support/TemporaryFolder.h"

#include <cstdlib>
#include <map>
#include <optional>
#include <string>
#include <vector>

class FileSandbox : public TemporaryFolder {
public:
    FileSandbox() {
        setVariable("HOME", path("home"));
        setVariable("XDG_DATA_HOME", path("data"));
        setVariable("XDG_CONFIG_HOME", path("config"));
        for (const char* name : {"LC_ALL", "LC_MESSAGES", "LANG"})
            setVariable(name, std::nullopt);
        qx::ProcessInfo::setProcessName("Client");
    }
    ~FileSandbox() {
        qx::ProcessInfo::setProcessName(nullptr);
        qx::ProcessInfo::setProcessVersion(nullptr);
        qx::Bundle::setMainBundle(nullptr);
        for (const auto& bundle : _bundles)
            qx::Bundle::forget(bundle);
        qx::UserDefaults::standardUserDefaults()->synchronize();
        for (const auto& [name, value] : _former)
            assign(name, value);
    }

    void setVariable(const std::string& name, const std::optional<std::string>& value) {
        const char* former = std::getenv(name.c_str());
        _former.try_emplace(name, former ? std::optional<std::string>(former) : std::nullopt);
        assign(name, value);
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

private:
    static void assign(const std::string& name, const std::optional<std::string>& value) {
        if (value)
            ::setenv(name.c_str(), value->c_str(), 1);
        else
            ::unsetenv(name.c_str());
    }

    std::vector<qx::Ref<qx::Bundle>> _bundles;
    std::map<std::string, std::optional<std::string>> _former;
};
