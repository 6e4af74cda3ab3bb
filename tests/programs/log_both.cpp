// A host with both log functions, built as hosts are: with hidden visibility and nothing exported
// on purpose. Nothing goes to standard error.

#include "LogRun.h"

namespace {

std::string debugged;
std::string warned;

} // namespace

void QXLogDebug(std::string_view format, std::span<const qx::Value> arguments) {
    debugged += qx::format(format, arguments).str() + "\n";
}

void QXLogWarning(std::string_view format, std::span<const qx::Value> arguments) {
    // A host's function may ask the library while it logs.
    warned += qx::format(format, arguments).str() + (qx::Class::named("Taken") ? "\n" : "?");
}

int main() {
    expectTimes(0, "\n", standardErrorOf(saySomething));
    expectTimes(1, "The class name Taken is taken", warned);
    expectTimes(1, "Unbound attributes: ", warned);
    expectTimes(2, "\n", warned);
    expectTimes(1, "*** Warning: Unbound fields: ", debugged);
    expectTimes(1, "\n", debugged);
}
