#include "model/Printing.h"

#include <algorithm>
#include <vector>

namespace qx {

namespace {

thread_local std::vector<const Object*> beingPrinted;

} // namespace

Printing::Printing(const Object& object)
    : _entered(beingPrinted.size() < deepest &&
               std::find(beingPrinted.begin(), beingPrinted.end(), &object) == beingPrinted.end()) {
    if (_entered)
        beingPrinted.push_back(&object);
}

Printing::~Printing() {
    if (!_entered)
        return;
    beingPrinted.pop_back();
    if (beingPrinted.empty())
        std::vector<const Object*>().swap(beingPrinted);
}

} // namespace qx
