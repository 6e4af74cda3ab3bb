// A host with the warning function alone: messages for debugging go nowhere.

#include "LogRun.h"

namespace {

std::string warned;

} // namespace

void QXLogWarning(std::string_view format, std::span<const qx::Value> arguments) {
    warned += qx::format(format, arguments).str() + "\n";
}

int main() {
    if (&QXLogDebug != nullptr)
        return 1;
    expectTimes(0, "\n", standardErrorOf(saySomething));
    expectTimes(1, "The class name Taken is taken", warned);
    expectTimes(1, "Unbound attributes: ", warned);
    expectTimes(2, "\n", warned);
}
