// The pages of cases in this folder, on every kind of object.

#include "Cases.h"

namespace {

using kinds::Kind;

const bool added = [] {
    cases::addPage("tests/marshaller/keeping.md", {Kind::record, Kind::host});
    for (const char* page :
         {"reading", "writing", "round-trips", "namespaces", "mistakes", "unwritable"})
        cases::addPage("tests/marshaller/" + std::string(page) + ".md",
                       {Kind::record, Kind::host, Kind::plain});
    return true;
}();

} // namespace
