// libxml2's own tree of the orders, made and freed.

#include "Beside.h"

#include <libxml/parser.h>

namespace {

void libxml2Tree(benchmark::State& state) {
    const std::string& xml = bench::document(state.range(0));
    bench::besideUnit(state, xml, [&] {
        const xmlDocPtr tree = xmlReadMemory(xml.data(), static_cast<int>(xml.size()), nullptr,
                                             nullptr, XML_PARSE_NONET | XML_PARSE_HUGE);
        xmlFreeDoc(tree);
        return tree != nullptr;
    });
}

BENCHMARK(libxml2Tree)->Apply(bench::once);

} // namespace
