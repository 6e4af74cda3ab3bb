// Reading and writing documents of nested orders.

#include "Beside.h"

#include <QXXMLMarshalling/QXXMLMarshaller.h>

#include <istream>

namespace {

using namespace bench;

qx::Ref<QXXMLMarshaller> marshaller() {
    const auto mapping = qx::XMLDocument::initWithData(orderMapping);
    return QXXMLMarshaller::initWithMappingXML(mapping.get());
}

// The nodes are made when one is asked for.
void index(benchmark::State& state) {
    const std::string& xml = document(state.range(0));
    besideUnit(state, xml, [&] { return qx::XMLDocument::initWithData(xml).get() != nullptr; });
}
void tree(benchmark::State& state) {
    const std::string& xml = document(state.range(0));
    besideUnit(state, xml, [&] {
        return qx::XMLDocument::initWithData(xml)->rootElement()->childCount() != 0;
    });
}

void read(benchmark::State& state) {
    const std::string& xml = document(state.range(0));
    const auto reader = marshaller();
    besideUnit(state, xml, [&] { return reader->readString(xml).get() != nullptr; });
}
void hostClasses(benchmark::State& state) {
    const std::string& xml = document(state.range(0));
    const DescribedHosts described;
    const auto reader = marshaller();
    besideUnit(state, xml, [&] {
        const auto orders = reader->readString<HostOrders>(xml);
        return orders && !(*orders)->orders.empty();
    });
}
void structs(benchmark::State& state) {
    const std::string& xml = document(state.range(0));
    const Described described;
    const auto reader = marshaller();
    besideUnit(state, xml, [&] {
        const auto orders = reader->readString<Orders>(xml);
        return orders && !orders->orders.empty();
    });
}

void write(benchmark::State& state) {
    const std::string& xml = document(state.range(0));
    const auto writer = marshaller();
    const auto object = writer->readString(xml);
    besideUnit(state, xml, [&] { return !writer->writeString(object).isNull(); });
}
void writeStructs(benchmark::State& state) {
    const std::string& xml = document(state.range(0));
    const Described described;
    const auto writer = marshaller();
    const auto orders = writer->readString<Orders>(xml);
    besideUnit(state, xml, [&] { return !writer->writeString(*orders).isNull(); });
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
template <class T>
void eachOf(benchmark::State& state) {
    const std::string& xml = document(state.range(0));
    const auto reader = marshaller();
    besideUnit(state, xml, [&] {
        Bytes bytes(xml);
        std::istream stream(&bytes);
        return reader->unmarshallEach<T>(stream, "order", [](const auto&) {});
    });
}
void eachRecord(benchmark::State& state) { eachOf<qx::Object>(state); }
void eachStruct(benchmark::State& state) {
    const Described described;
    eachOf<Order>(state);
}

// Documents of about 0.9 kB, in passes over all their bytes in one document.
void smallDocuments(benchmark::State& state) {
    const std::string& xml = document(state.range(0));
    std::vector<std::string> documents;
    for (std::size_t bytes = 0; bytes < xml.size(); bytes += documents.back().size())
        documents.push_back(oneOrder(documents.size()));
    const auto reader = marshaller();
    besideUnit(state, xml, [&] {
        bool isRead = true;
        for (const std::string& text : documents)
            isRead = reader->readString(text) && isRead;
        return isRead;
    });
    state.counters["documents"] = static_cast<double>(documents.size());
}

BENCHMARK(index)->Apply(once);
BENCHMARK(tree)->Apply(once);
BENCHMARK(read)->Apply(sizes);
BENCHMARK(smallDocuments)->Apply(once);
BENCHMARK(hostClasses)->Apply(once);
BENCHMARK(structs)->Apply(sizes);
BENCHMARK(write)->Apply(once);
BENCHMARK(writeStructs)->Apply(once);
BENCHMARK(eachRecord)->Apply(sizes);
BENCHMARK(eachStruct)->Apply(once);

} // namespace
