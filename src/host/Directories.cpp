#include "host/Directories.h"

#include "files/Paths.h"

#include <cerrno>
#include <cstdlib>
#include <pwd.h>
#include <unistd.h>

namespace qx {

namespace {

String absolutePathFrom(const char* variable) {
    // The host's own affair: nothing here changes the environment.
    const char* const value = std::getenv(variable); // NOLINT(concurrency-mt-unsafe)
    return value != nullptr && *value == '/' ? String(value) : String();
}

String accountHome() {
    std::vector<char> buffer(1024);
    passwd account{};
    passwd* found = nullptr;
    int status = 0;
    while ((status = ::getpwuid_r(::getuid(), &account, buffer.data(), buffer.size(), &found)) ==
           ERANGE)
        buffer.resize(buffer.size() * 2);
    const bool usable =
        status == 0 && found != nullptr && found->pw_dir != nullptr && *found->pw_dir == '/';
    return usable ? String(found->pw_dir) : String();
}

String userDirectory(const char* variable, std::string_view belowHome) {
    String directory = absolutePathFrom(variable);
    if (!directory.isNull())
        return directory;
    String home = absolutePathFrom("HOME");
    if (home.isNull())
        home = accountHome();
    return home.isNull() ? String() : appendingPathComponent(home, belowHome);
}

} // namespace

std::vector<String> searchPathForApplicationSupport() {
    const String directory = userDirectory("XDG_DATA_HOME", ".local/share");
    if (directory.isNull())
        return {};
    return {directory};
}

String configurationDirectory() { return userDirectory("XDG_CONFIG_HOME", ".config"); }

} // namespace qx
