#pragma once

// The peak memory of work, measured in a process of its own.

#include <cstddef>
#include <string>
#include <vector>

namespace bench {

// Makes work a benchmark "peak-<name>/<megabytes>", whose counter "peakMB" is the peak of the
// process that ran it: this program, called with --peak. Work is given the size of its document in
// bytes and returns whether it did what it should. To be made before main.
class PeakWork {
public:
    using Function = bool (*)(std::size_t bytes);
    PeakWork(const std::string& name, Function work, const std::vector<int>& megabytes);
};

// What the program does when called with --peak NAME MEGABYTES; its exit status.
int runPeakWork(const std::string& name, std::size_t megabytes);

// A file of orders in the folder of temporary files, written in small pieces and removed at the
// end.
class OrdersFile {
public:
    explicit OrdersFile(std::size_t bytes);
    ~OrdersFile();
    OrdersFile(const OrdersFile&) = delete;
    OrdersFile& operator=(const OrdersFile&) = delete;
    const std::string& path() const { return _path; }

private:
    std::string _path;
};

} // namespace bench
