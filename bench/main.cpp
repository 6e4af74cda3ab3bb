// Runs the benchmarks, then tells parsing, reading and writing in units of the parser's own pass
// and how the time for a megabyte, or an included document, changes with their number.

#include <benchmark/benchmark.h>

#include <cstdio>
#include <map>
#include <string>

namespace {

class Reporter : public benchmark::ConsoleReporter {
public:
    Reporter() : ConsoleReporter(OO_Tabular) {}

    void ReportRuns(const std::vector<Run>& runs) override {
        ConsoleReporter::ReportRuns(runs);
        for (const Run& run : runs) {
            if (run.error_occurred || run.run_type != Run::RT_Iteration)
                continue;
            // "read/60/manual_time" is kept as "read/60".
            const std::string name = run.benchmark_name();
            const std::string shortName = name.substr(0, name.find('/', name.find('/') + 1));
            _times[shortName] = run.GetAdjustedRealTime();
            const auto units = run.counters.find("units");
            if (units != run.counters.end())
                _units[shortName] = units->second;
        }
    }

    void tellRatios() const {
        for (const auto& [name, units] : _units)
            std::printf("%-9s %5.2f units\n", name.c_str(), units);
        for (const char* work : {"parse", "read", "write"})
            tellGrowth(work, "megabyte", 1, 60);
        tellGrowth("include", "document", 100, 1000);
    }

private:
    double time(const std::string& name) const {
        const auto found = _times.find(name);
        return found != _times.end() ? found->second : 0;
    }
    void tellGrowth(const std::string& work, const char* what, int few, int many) const {
        const double small = time(work + "/" + std::to_string(few)) / few;
        const double large = time(work + "/" + std::to_string(many)) / many;
        if (small > 0 && large > 0)
            std::printf("%s: a %s among %d takes %.2f times one among %d\n", work.c_str(), what,
                        many, large / small, few);
    }

    std::map<std::string, double> _times;
    std::map<std::string, double> _units;
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
