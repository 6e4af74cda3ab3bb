#include "Units.h"

#include <algorithm>
#include <ctime>
#include <libxml/parser.h>

namespace bench {

bool emptyPass(std::string_view xml) {
    xmlSAXHandler handler{};
    handler.initialized = XML_SAX2_MAGIC;
    handler.startElementNs = [](void*, const xmlChar*, const xmlChar*, const xmlChar*, int,
                                const xmlChar**, int, int, const xmlChar**) {};
    handler.endElementNs = [](void*, const xmlChar*, const xmlChar*, const xmlChar*) {};
    handler.characters = [](void*, const xmlChar*, int) {};
    int user = 0;
    return xmlSAXUserParseMemory(&handler, &user, xml.data(), static_cast<int>(xml.size())) == 0;
}

namespace {

double processorSeconds() {
    timespec now{};
    clock_gettime(CLOCK_PROCESS_CPUTIME_ID, &now);
    return static_cast<double>(now.tv_sec) + static_cast<double>(now.tv_nsec) * 1e-9;
}

} // namespace

bool Units::measure(std::string_view xml, const std::function<bool()>& work) {
    // The first pass after other work also pays for what that left: the second one counts.
    const auto pass = [&] {
        if (!emptyPass(xml))
            return 0.0;
        const double start = processorSeconds();
        emptyPass(xml);
        return processorSeconds() - start;
    };
    const double before = pass();
    const double start = processorSeconds();
    const bool done = work();
    _latest = processorSeconds() - start;
    const double unit = (before + pass()) / 2;
    if (before > 0) {
        _units.push_back(_latest / unit);
        _seconds.push_back(_latest);
        _passSeconds.push_back(unit);
    }
    return done && before > 0;
}

double Units::middle(std::vector<double> measures) {
    if (measures.empty())
        return 0;
    const auto middle = measures.begin() + static_cast<std::ptrdiff_t>(measures.size() / 2);
    std::nth_element(measures.begin(), middle, measures.end());
    return *middle;
}

} // namespace bench
