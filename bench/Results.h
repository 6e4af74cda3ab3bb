#pragma once

// What the benchmarks of a run found, as a table and as a plot.

#include <benchmark/benchmark.h>

#include <map>
#include <string>

namespace bench {

class Results {
public:
    // Takes in a benchmark that ran without an error.
    void add(const benchmark::BenchmarkReporter::Run& run);

    // Prints the rows of which the run has figures, with what is aimed at.
    void printTable() const;

    // Draws time over size as SVG; false when the file cannot be written.
    bool plot(const std::string& path) const;

private:
    // 0 when the run did not have it. "read/60" is a benchmark's name without its settings.
    double counter(const std::string& name, const char* counter) const;
    double ratio(const std::string& name, const char* counter, const std::string& other) const;

    std::map<std::string, std::map<std::string, double>> _counters;
};

} // namespace bench
