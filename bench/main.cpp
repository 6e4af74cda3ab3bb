// Runs the benchmarks, then prints what they found as a table, in units of the parser's own pass.
// With --plot FILE it draws time over size, too.

#include "Peak.h"
#include "Results.h"

#include <cstdio>
#include <cstdlib>
#include <string_view>

namespace {

class Reporter : public benchmark::ConsoleReporter {
public:
    Reporter() : ConsoleReporter(OO_Tabular) {}

    void ReportRuns(const std::vector<Run>& runs) override {
        ConsoleReporter::ReportRuns(runs);
        for (const Run& run : runs)
            if (!run.error_occurred && run.run_type == Run::RT_Iteration)
                _results.add(run);
    }

    const bench::Results& results() const { return _results; }

private:
    bench::Results _results;
};

// Takes "--plot FILE" out of the arguments; null where it is not among them.
const char* takePlot(int& argc, char** argv) {
    for (int i = 1; i + 1 < argc; ++i)
        if (std::string_view(argv[i]) == "--plot") {
            const char* const path = argv[i + 1];
            for (int rest = i + 2; rest <= argc; ++rest)
                argv[rest - 2] = argv[rest];
            argc -= 2;
            return path;
        }
    return nullptr;
}

} // namespace

int main(int argc, char** argv) {
    if (argc == 4 && std::string_view(argv[1]) == "--peak")
        return bench::runPeakWork(argv[2], std::strtoul(argv[3], nullptr, 10));
    const char* const plot = takePlot(argc, argv);
    benchmark::Initialize(&argc, argv);
    if (benchmark::ReportUnrecognizedArguments(argc, argv))
        return 2;
    Reporter reporter;
    benchmark::RunSpecifiedBenchmarks(&reporter);
    reporter.results().printTable();
    benchmark::Shutdown();
    if (plot && !reporter.results().plot(plot)) {
        std::fprintf(stderr, "bench: %s cannot be written\n", plot);
        return 1;
    }
    return 0;
}
