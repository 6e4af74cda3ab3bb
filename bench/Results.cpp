#include "Results.h"

#include <cstdio>

namespace bench {

namespace {

struct Row {
    const char* work;
    const char* name;
    double goal; // 0: none
};

const Row unitRows[] = {
    {"index of a document", "index/60", 0.4},
    {"bytes to the node tree", "tree/60", 0},
    {"bytes to records, freed", "read/60", 1.2},
    {"bytes to host classes, freed", "hostClasses/60", 1.2},
    {"bytes to plain structs, freed", "structs/60", 1.1},
    {"records to bytes", "write/60", 1.3},
    {"structs to bytes", "writeStructs/60", 1.3},
    {"unmarshallEach, records dropped", "eachRecord/60", 1.0},
    {"unmarshallEach, structs dropped", "eachStruct/60", 1.0},
    {"60 MB in documents of 0.9 kB to records", "smallDocuments/60", 0},
    {"mapping of 1,000 classes, resolved", "mapping/1000", 3},
    {"pugixml: bytes to its tree", "pugixmlTree/60", 0},
    {"pugixml by hand: bytes to structs", "pugixmlStructs/60", 0},
    {"pugixml by hand: structs to bytes", "pugixmlWrite/60", 0},
    {"libxml2: bytes to its tree", "libxml2Tree/60", 0},
    {"cereal XML: bytes to structs", "cerealRead", 0},
    {"cereal XML: structs to bytes", "cerealWrite", 0},
    {"Boost.Serialization XML: bytes to structs", "boostRead", 0},
    {"Boost.Serialization XML: structs to bytes", "boostWrite", 0},
};

const Row peakRows[] = {
    {"peak with records of 60 MB, for each byte", "peak-records/60", 5},
    {"peak with structs of 60 MB, for each byte", "peak-structs/60", 0},
    {"the same by hand over pugixml", "peak-pugixmlStructs/60", 0},
};

const Row constantRows[] = {
    {"peak of unmarshallEach, records of 60 MB", "peak-eachRecord/60", 0},
    {"peak of unmarshallEach, records of 600 MB", "peak-eachRecord/600", 0},
    {"peak of unmarshallEach, structs of 60 MB", "peak-eachStruct/60", 0},
    {"peak of unmarshallEach, structs of 600 MB", "peak-eachStruct/600", 0},
};

void print(const char* work, double value, double goal, const char* unit) {
    if (value == 0)
        return;
    std::printf("| %-50s | %8.2f %-5s | ", work, value, unit);
    if (goal != 0)
        std::printf("%4.1f |\n", goal);
    else
        std::printf("     |\n");
}

} // namespace

void Results::add(const benchmark::BenchmarkReporter::Run& run) {
    // "read/60/iterations:5/manual_time" is kept as "read/60".
    const std::string name = run.benchmark_name();
    auto end = name.find('/');
    if (end != std::string::npos && name.compare(end, 12, "/iterations:") != 0)
        end = name.find('/', end + 1);
    auto& counters = _counters[name.substr(0, end)];
    counters["realTime"] = run.GetAdjustedRealTime();
    for (const auto& [counter, value] : run.counters)
        counters[counter] = value;
}

double Results::counter(const std::string& name, const char* counter) const {
    const auto run = _counters.find(name);
    if (run == _counters.end())
        return 0;
    const auto found = run->second.find(counter);
    return found != run->second.end() ? found->second : 0;
}

double Results::ratio(const std::string& name, const char* of, const std::string& other) const {
    const double below = counter(other, of);
    return below > 0 ? counter(name, of) / below : 0;
}

void Results::printTable() const {
    std::printf("\n| %-50s | %14s | %4s |\n|%s|%s|%s|\n", "work (units: empty passes of libxml2)",
                "measured", "goal", std::string(52, '-').c_str(), std::string(16, '-').c_str(),
                std::string(6, '-').c_str());
    for (const Row& row : unitRows)
        print(row.work, counter(row.name, "units"), row.goal, "units");
    print("documents of 0.9 kB beside one of all their bytes",
          ratio("smallDocuments/60", "units", "read/60"), 1.3, "times");
    print("a megabyte of 600 beside one alone, to records", ratio("read/600", "ms", "read/1") / 600,
          1.2, "times");
    print("an included mapping of 1,000 beside one of 100",
          ratio("include/1000", "realTime", "include/100") / 10, 0, "times");
    for (const Row& row : peakRows)
        print(row.work, counter(row.name, "peakMB") / 60, row.goal, "bytes");
    for (const Row& row : constantRows)
        print(row.work, counter(row.name, "peakMB"), row.goal, "MB");
}

} // namespace bench
