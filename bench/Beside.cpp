#include "Beside.h"

#include <fstream>

namespace bench {

const std::string& document(std::int64_t megabytes) {
    static std::int64_t size = 0;
    static std::string xml;
    if (size != megabytes) {
        xml = std::string(); // not both at once
        xml = orders(static_cast<std::size_t>(megabytes) * megabyte);
        size = megabytes;
    }
    return xml;
}

namespace {

std::size_t availableMegabytes() {
    std::ifstream file("/proc/meminfo");
    for (std::string word; file >> word;)
        if (word == "MemAvailable:") {
            std::size_t kilobytes = 0;
            file >> kilobytes;
            return kilobytes / 1000;
        }
    return 0;
}

} // namespace

void sizes(benchmark::internal::Benchmark* benchmark) {
    benchmark->Arg(1)->Arg(10)->Arg(60);
    // The document, its copy, and what it is read into.
    if (availableMegabytes() > 600 * 12)
        benchmark->Arg(600);
    benchmark->Iterations(5)->Unit(benchmark::kMillisecond)->UseManualTime();
}

} // namespace bench
