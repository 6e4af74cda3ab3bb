#include "files/Paths.h"

#include <algorithm>

namespace qx {

bool holdsZeroByte(std::string_view path) { return path.find('\0') != std::string_view::npos; }

std::string directoryOf(std::string_view path) {
    const std::size_t slash = path.rfind('/');
    if (slash == std::string_view::npos)
        return ".";
    return std::string(path.substr(0, slash == 0 ? 1 : slash));
}

String appendingPathComponent(std::string_view directory, std::string_view component) {
    if (directory.empty())
        return component;
    while (directory.size() > 1 && directory.back() == '/')
        directory.remove_suffix(1);
    if (component.empty())
        return directory;
    return String::concat({directory, directory == "/" ? "" : "/", component});
}

String relativePath(std::string_view name) {
    if (name.starts_with('/') || holdsZeroByte(name))
        return nullptr;
    std::string path;
    while (!name.empty()) {
        const std::size_t slash = std::min(name.find('/'), name.size());
        const std::string_view component = name.substr(0, slash);
        name.remove_prefix(std::min(slash + 1, name.size()));
        if (component.empty() || component == ".")
            continue;
        if (component != "..") {
            if (!path.empty())
                path += '/';
            path += component;
            continue;
        }
        if (path.empty())
            return nullptr;
        const std::size_t parent = path.rfind('/');
        path.resize(parent == std::string::npos ? 0 : parent);
    }
    return path.empty() ? String() : String(path);
}

String pathOfURL(const String& URL) {
    constexpr std::string_view scheme = "file:";
    std::string_view rest = URL;
    if (!rest.starts_with(scheme))
        return rest.find("://") == std::string_view::npos ? URL : String();
    rest.remove_prefix(scheme.size());
    if (rest.starts_with("//")) {
        rest.remove_prefix(2);
        if (rest.starts_with("localhost/"))
            rest.remove_prefix(std::string_view("localhost").size());
        if (!rest.starts_with('/'))
            return nullptr;
    }
    const auto digit = [](char c) {
        if (c >= '0' && c <= '9')
            return c - '0';
        const char lower = static_cast<char>(c | 0x20);
        return lower >= 'a' && lower <= 'f' ? lower - 'a' + 10 : -1;
    };
    std::string path;
    for (std::size_t i = 0; i < rest.size(); ++i) {
        if (rest[i] == '%' && i + 2 < rest.size() && digit(rest[i + 1]) >= 0 &&
            digit(rest[i + 2]) >= 0) {
            path += static_cast<char>(digit(rest[i + 1]) * 16 + digit(rest[i + 2]));
            i += 2;
        } else {
            path += rest[i];
        }
    }
    return path;
}

} // namespace qx
