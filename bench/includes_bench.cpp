// Resolving a mapping document that includes many others of one class each: the time grows with
// their number and no faster.

#include <QXXMLMarshalling/QXXMLDataRepositoryManager.h>
#include <QXXMLMarshalling/QXXMLMarshallingMapping.h>
#include <QXXMLMarshalling/QXXMLVolatileDataRepository.h>

#include <benchmark/benchmark.h>

namespace {

qx::String nameOf(std::int64_t number) { return "included-" + std::to_string(number) + ".xml"; }

qx::Ref<qx::XMLDocument> includingMapping(std::int64_t count) {
    auto repository = QXXMLVolatileDataRepository::init();
    std::string includes;
    for (std::int64_t i = 0; i < count; ++i) {
        const std::string type = "Class" + std::to_string(i);
        const std::string mapping =
            "<mapping><class name=\"" + type + "\"><field name=\"name\"/></class></mapping>";
        repository->setDocument(qx::XMLDocument::initWithData(mapping), nameOf(i));
        includes += "<include href=\"" + nameOf(i).str() + "\"/>";
    }
    QXXMLDataRepositoryManager::defaultManager()->setVolatileRepository(repository);
    return qx::XMLDocument::initWithData("<mapping>" + includes + "</mapping>");
}

void include(benchmark::State& state) {
    const auto document = includingMapping(state.range(0));
    for (auto _ : state) {
        const auto mapping = QXXMLMarshallingMapping::initWithDocument(document.get());
        if (!mapping ||
            mapping->mapping()->classMappings().size() != static_cast<std::size_t>(state.range(0)))
            state.SkipWithError("not all documents were included");
    }
    QXXMLDataRepositoryManager::flushDefaultManager();
}

BENCHMARK(include)->Arg(100)->Arg(1000)->Unit(benchmark::kMillisecond);

} // namespace
