// Reading and writing documents of nested orders, beside a pass of the parser with empty callbacks
// over the same bytes: the unit in which the others are told, since it moves with the machine.

#include "Orders.h"
#include "Units.h"

#include <QXXMLMarshalling/QXXMLMarshaller.h>

#include <benchmark/benchmark.h>

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

void unit(benchmark::State& state) {
    const std::string& xml = document(state.range(0));
    for (auto _ : state)
        if (!bench::emptyPass(xml))
            state.SkipWithError("the parser failed");
}

void parse(benchmark::State& state) {
    const std::string& xml = document(state.range(0));
    for (auto _ : state)
        benchmark::DoNotOptimize(qx::XMLDocument::initWithData(xml));
}

void read(benchmark::State& state) {
    const std::string& xml = document(state.range(0));
    const auto reader = marshaller();
    for (auto _ : state)
        if (!reader->readString(xml))
            state.SkipWithError("nothing was read");
}

void write(benchmark::State& state) {
    const auto writer = marshaller();
    const auto object = writer->readString(document(state.range(0)));
    for (auto _ : state)
        if (writer->writeString(object).isNull())
            state.SkipWithError("nothing was written");
}

BENCHMARK(unit)->Arg(1)->Arg(10)->Arg(60)->Unit(benchmark::kMillisecond);
BENCHMARK(parse)->Arg(1)->Arg(10)->Arg(60)->Unit(benchmark::kMillisecond);
BENCHMARK(read)->Arg(1)->Arg(10)->Arg(60)->Unit(benchmark::kMillisecond);
BENCHMARK(write)->Arg(1)->Arg(10)->Arg(60)->Unit(benchmark::kMillisecond);

} // namespace
