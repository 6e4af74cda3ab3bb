#include "tools/qxxml/Shell.h"

#include <cstdlib>

#include <sys/wait.h>

namespace {

void replaceAll(std::string& text, const std::string& what, const std::string& by) {
    for (std::size_t at = 0; (at = text.find(what, at)) != std::string::npos; at += by.size())
        text.replace(at, what.size(), by);
}

std::string realPath(const std::string& path) { return std::filesystem::canonical(path); }

} // namespace

Shell::Shell() {
    _home.setVariable("HOME", _home.root());
    _home.setVariable("XDG_DATA_HOME", std::nullopt);
    _home.setVariable("XDG_CONFIG_HOME", std::nullopt);
}

Outcome Shell::run(const std::string& command) const {
    const std::string output = _outside.path("output");
    const std::string errors = _outside.path("errors");
    const std::string line = "cd '" + _home.root() +
                             "' && PATH='" QX_BUILD_DIR "/bin':\"$PATH\" && { " + command +
                             "\n} </dev/null >'" + output + "' 2>'" + errors + "'";
    const int status = std::system(line.c_str());
    return {WIFEXITED(status) ? WEXITSTATUS(status) : -1, withoutPaths(_outside.read("output")),
            withoutPaths(_outside.read("errors"))};
}

std::string Shell::withoutPaths(std::string text) const {
    replaceAll(text, _home.root(), "/home/ada");
    replaceAll(text, realPath(QX_BUILD_DIR "/bin"), "/usr/bin");
    replaceAll(text, realPath(QX_SOURCE_DIR "/share"), "/usr/share/QXXMLMarshalling");
    return text;
}
