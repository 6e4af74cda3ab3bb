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
    double median() const { return middle(_units); }
    // How long the work took, and how long a pass beside it.
    double medianSeconds() const { return middle(_seconds); }
    double medianPassSeconds() const { return middle(_passSeconds); }

private:
    static double middle(std::vector<double> measures);

    double _latest = 0;
    std::vector<double> _units;
    std::vector<double> _seconds;
    std::vector<double> _passSeconds;
};

} // namespace bench
