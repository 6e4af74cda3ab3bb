#pragma once

// The unit of the benchmarks: what the XML parser alone takes.

#include <functional>
#include <string_view>
#include <vector>

namespace bench {

// Parses the bytes with callbacks that do nothing; false when they are no XML.
bool emptyPass(std::string_view xml);

// Measures work in passes of the parser that run just before and after it, in processor time, so
// that a change of the machine's speed meets both.
class Units {
public:
    // False when the parser fails or the work returns false.
    bool measure(std::string_view xml, const std::function<bool()>& work);
    double latestSeconds() const { return _latest; }
    // How many passes the work took; the middle one of all measures.
    double median() const;

private:
    double _latest = 0;
    std::vector<double> _units;
};

} // namespace bench
