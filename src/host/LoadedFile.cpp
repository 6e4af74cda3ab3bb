#include "host/LoadedFile.h"

#include "files/Files.h"

#include <algorithm>
#include <charconv>
#include <cstdlib>
#include <link.h>
#include <memory>

namespace qx {

namespace {

struct Search {
    std::uintptr_t address;
    bool isProgram = true; // which the loader names first
    const char* name = nullptr;
};

int lookInto(dl_phdr_info* object, std::size_t, void* data) {
    auto& search = *static_cast<Search*>(data);
    for (std::size_t i = 0; i < object->dlpi_phnum; ++i) {
        const auto& segment = object->dlpi_phdr[i];
        const std::uintptr_t start = object->dlpi_addr + segment.p_vaddr;
        if (segment.p_type == PT_LOAD && search.address - start < segment.p_memsz) {
            search.name = search.isProgram ? nullptr : object->dlpi_name;
            return 1;
        }
    }
    search.isProgram = false;
    return 0;
}

// The file that the kernel has mapped at the address; null for none. A line of its list:
//     7f0c2a400000-7f0c2a428000 r--p 00000000 08:01 1835 /usr/lib/libthing.so
String mappedFile(std::uintptr_t address) {
    const Ref<Data> list = readFile("/proc/self/maps");
    std::string_view rest = list ? list->view() : std::string_view();
    while (!rest.empty()) {
        const std::string_view line = rest.substr(0, rest.find('\n'));
        rest.remove_prefix(std::min(line.size() + 1, rest.size()));
        const char* const end = line.data() + line.size();
        std::uintptr_t from = 0;
        std::uintptr_t to = 0;
        const char* const dash = std::from_chars(line.data(), end, from, 16).ptr;
        if (dash == end || std::from_chars(dash + 1, end, to, 16).ec != std::errc())
            continue;
        const std::size_t path = line.find('/');
        if (address >= from && address < to)
            return path == std::string_view::npos ? String() : String(line.substr(path));
    }
    return nullptr;
}

} // namespace

String sharedObjectHolding(const void* address) {
    Search search{reinterpret_cast<std::uintptr_t>(address)};
    ::dl_iterate_phdr(&lookInto, &search);
    if (search.name == nullptr)
        return nullptr;
    // A relative name belongs to the directory that was the current one at that time.
    const String name = *search.name == '/' ? String(search.name) : mappedFile(search.address);
    const String real = realPath(name);
    return real.isNull() ? name : real;
}

String realPath(const String& path) {
    char* const resolved = ::realpath(path.c_str(), nullptr);
    if (resolved == nullptr)
        return nullptr;
    const std::unique_ptr<char, void (*)(void*)> owner(resolved, &std::free);
    return resolved;
}

} // namespace qx
