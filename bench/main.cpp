// Runs the benchmarks, then tells reading and writing in units of the parser's own pass and how the
// time for a megabyte changes with the size.

#include <benchmark/benchmark.h>

#include <cstdio>
#include <map>
#include <string>

namespace {

class Reporter : public benchmark::ConsoleReporter {
public:
    Reporter() : ConsoleReporter(OO_None) {}

    void ReportRuns(const std::vector<Run>& runs) override {
        ConsoleReporter::ReportRuns(runs);
        for (const Run& run : runs)
            if (!run.error_occurred && run.run_type == Run::RT_Iteration)
                _milliseconds[run.benchmark_name()] = run.GetAdjustedCPUTime();
    }

    void tellRatios() const {
        for (const char* work : {"parse", "read", "write"}) {
            for (const char* size : {"1", "10", "60"})
                tell(work, size, std::string("unit/") + size, "units");
            tellGrowth(work);
        }
    }

private:
    double time(const std::string& name) const {
        const auto found = _milliseconds.find(name);
        return found != _milliseconds.end() ? found->second : 0;
    }
    void tell(const std::string& work, const std::string& size, const std::string& unit,
              const char* what) const {
        const double taken = time(work + "/" + size);
        if (taken > 0 && time(unit) > 0)
            std::printf("%-6s %3s MB: %.2f %s\n", work.c_str(), size.c_str(), taken / time(unit),
                        what);
    }
    void tellGrowth(const std::string& work) const {
        const double small = time(work + "/1");
        if (small > 0)
            std::printf("%-6s a megabyte at 60 MB takes %.2f times one at 1 MB\n", work.c_str(),
                        time(work + "/60") / 60 / small);
    }

    std::map<std::string, double> _milliseconds;
};

} // namespace

int main(int argc, char** argv) {
    benchmark::Initialize(&argc, argv);
    Reporter reporter;
    benchmark::RunSpecifiedBenchmarks(&reporter);
    reporter.tellRatios();
    benchmark::Shutdown();
    return 0;
}
