#include "Peak.h"

#include "Beside.h"

#include <cstdio>
#include <filesystem>
#include <fstream>
#include <map>
#include <unistd.h>

namespace bench {

namespace {

std::map<std::string, PeakWork::Function>& works() {
    static std::map<std::string, PeakWork::Function> all;
    return all;
}

// Of this process up to now, in bytes.
double peak() {
    std::ifstream file("/proc/self/status");
    for (std::string word; file >> word;)
        if (word == "VmHWM:") {
            double kibibytes = 0;
            file >> kibibytes;
            return kibibytes * 1024;
        }
    return 0;
}

// Runs the work in a process of its own and returns its peak; 0 when that failed.
double peakOf(const std::string& name, std::int64_t megabytes) {
    const std::string program = std::filesystem::read_symlink("/proc/self/exe");
    const std::string command =
        "'" + program + "' --peak " + name + " " + std::to_string(megabytes);
    std::FILE* const child = popen(command.c_str(), "r");
    if (!child)
        return 0;
    double bytes = 0;
    const bool isRead = std::fscanf(child, "%lf", &bytes) == 1;
    return pclose(child) == 0 && isRead ? bytes : 0;
}

} // namespace

PeakWork::PeakWork(const std::string& name, Function work, const std::vector<int>& megabytes) {
    works()[name] = work;
    auto* const registered =
        benchmark::RegisterBenchmark(("peak-" + name).c_str(), [name](benchmark::State& state) {
            for (auto _ : state) {
                const double bytes = peakOf(name, state.range(0));
                if (bytes == 0)
                    state.SkipWithError("the process that was measured failed");
                state.counters["peakMB"] = bytes / 1e6;
            }
        });
    for (const int size : megabytes)
        registered->Arg(size);
    registered->Iterations(1)->Unit(benchmark::kMillisecond);
}

int runPeakWork(const std::string& name, std::size_t megabytes) {
    const auto found = works().find(name);
    if (found == works().end() || !found->second(megabytes * megabyte))
        return 1;
    std::printf("%.0f\n", peak());
    return 0;
}

OrdersFile::OrdersFile(std::size_t bytes)
    : _path(std::filesystem::temp_directory_path() /
            ("orders-" + std::to_string(getpid()) + ".xml")) {
    GeneratedOrders orders(bytes);
    std::ofstream(_path, std::ios::binary) << &orders;
}

OrdersFile::~OrdersFile() {
    std::error_code ignored;
    std::filesystem::remove(_path, ignored);
}

} // namespace bench
