// Loading and resolving a mapping of a thousand classes, each of which refers to the next ones.

#include "Beside.h"

#include <QXXMLMarshalling/QXXMLMarshallingMapping.h>

namespace {

std::string mappingOf(std::size_t classes) {
    std::string xml = "<mapping>\n";
    for (std::size_t i = 0; i < classes; ++i) {
        const std::string number = std::to_string(i);
        const std::string next = std::to_string((i + 1) % classes);
        xml += "  <class name=\"Class" + number + "\">\n    <map-to xml=\"class" + number +
               "\"/>\n    <field name=\"number\" required=\"true\">"
               "<bind-xml name=\"number\" node=\"attribute\"/></field>\n"
               "    <field name=\"count\" type=\"int\">"
               "<bind-xml name=\"count\" node=\"attribute\"/></field>\n"
               "    <field name=\"remark\"><bind-xml name=\"remark\" node=\"element\"/></field>\n"
               "    <field name=\"next\" type=\"Class" +
               next +
               "\"><bind-xml name=\"next\" node=\"element\"/></field>\n"
               "    <field name=\"parts\" type=\"Class" +
               next +
               "\" collection=\"array\"><bind-xml name=\"part\" location=\"parts\"/></field>\n"
               "  </class>\n";
    }
    return xml + "</mapping>\n";
}

void mapping(benchmark::State& state) {
    const auto classes = static_cast<std::size_t>(state.range(0));
    const std::string xml = mappingOf(classes);
    bench::besideUnit(state, xml, [&] {
        const auto document = qx::XMLDocument::initWithData(xml);
        const auto resolved = QXXMLMarshallingMapping::initWithDocument(document.get());
        return resolved && resolved->mapping()->classMappings().size() == classes;
    });
}

BENCHMARK(mapping)->Arg(1000)->Iterations(31)->Unit(benchmark::kMillisecond)->UseManualTime();

} // namespace
