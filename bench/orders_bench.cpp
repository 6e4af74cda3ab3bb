// Reading and writing documents of nested orders. Beside each pass runs one of the parser with
// empty callbacks over the same bytes: the unit in which the others are told, since it moves with
// the machine.

#include "Orders.h"
#include "Units.h"

#include <QXXMLMarshalling/QXXMLMarshaller.h>

#include <benchmark/benchmark.h>

#include <istream>
#include <map>

namespace {

constexpr std::size_t megabyte = 1000 * 1000;

const std::string& document(std::int64_t megabytes) {
    static std::map<std::int64_t, std::string> made;
    std::string& xml = made[megabytes];
    if (xml.empty())
        xml = bench::orders(static_cast<std::size_t>(megabytes) * megabyte);
    return xml;
}

qx::Ref<QXXMLMarshaller> marshaller() {
    const auto mapping = qx::XMLDocument::initWithData(bench::orderMapping);
    return QXXMLMarshaller::initWithMappingXML(mapping.get());
}

// Runs work() beside the unit; it returns whether it did what it should.
template <class Work>
void besideUnit(benchmark::State& state, const std::string& xml, Work work) {
    bench::Units units;
    for (auto _ : state) {
        if (!units.measure(xml, work))
            state.SkipWithError("nothing was parsed, read or written");
        state.SetIterationTime(units.latestSeconds());
    }
    state.counters["units"] = units.median();
}

void parse(benchmark::State& state) {
    const std::string& xml = document(state.range(0));
    besideUnit(state, xml, [&] { return qx::XMLDocument::initWithData(xml).get() != nullptr; });
}

void read(benchmark::State& state) {
    const std::string& xml = document(state.range(0));
    const auto reader = marshaller();
    besideUnit(state, xml, [&] { return reader->readString(xml).get() != nullptr; });
}

// The bytes as a stream, without a copy of them.
class Bytes final : public std::streambuf {
public:
    explicit Bytes(const std::string& bytes) {
        char* const begin = const_cast<char*>(bytes.data());
        setg(begin, begin, begin + bytes.size());
    }
};

// One order after another, each forgotten before the next.
template <class Order>
void readEachOf(benchmark::State& state) {
    const std::string& xml = document(state.range(0));
    const auto reader = marshaller();
    besideUnit(state, xml, [&] {
        Bytes bytes(xml);
        std::istream stream(&bytes);
        return reader->unmarshallEach<Order>(stream, "order", [](const auto&) {});
    });
}
void readEach(benchmark::State& state) { readEachOf<qx::Object>(state); }
void readEachStruct(benchmark::State& state) {
    const bench::Described described;
    readEachOf<bench::Order>(state);
}

void write(benchmark::State& state) {
    const std::string& xml = document(state.range(0));
    const auto writer = marshaller();
    const auto object = writer->readString(xml);
    besideUnit(state, xml, [&] { return !writer->writeString(object).isNull(); });
}

void readStructs(benchmark::State& state) {
    const std::string& xml = document(state.range(0));
    const bench::Described described;
    const auto reader = marshaller();
    besideUnit(state, xml, [&] { return reader->readString<bench::Orders>(xml).hasValue(); });
}

void writeStructs(benchmark::State& state) {
    const std::string& xml = document(state.range(0));
    const bench::Described described;
    const auto writer = marshaller();
    const auto orders = writer->readString<bench::Orders>(xml);
    besideUnit(state, xml, [&] { return !writer->writeString(*orders).isNull(); });
}

void sizes(benchmark::internal::Benchmark* benchmark) {
    benchmark->Arg(1)
        ->Arg(10)
        ->Arg(60)
        ->Unit(benchmark::kMillisecond)
        ->UseManualTime()
        ->MinTime(2.0);
}

BENCHMARK(parse)->Apply(sizes);
BENCHMARK(read)->Apply(sizes);
BENCHMARK(readEach)->Apply(sizes);
BENCHMARK(write)->Apply(sizes);
BENCHMARK(readStructs)->Apply(sizes);
BENCHMARK(readEachStruct)->Apply(sizes);
BENCHMARK(writeStructs)->Apply(sizes);

} // namespace
