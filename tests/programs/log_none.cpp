// A host without log functions: everything goes to standard error, one line each.

#include "LogRun.h"

int main() {
    if (&QXLogDebug != nullptr || &QXLogWarning != nullptr)
        return 1;
    const std::string lines = standardErrorOf(saySomething);
    expectTimes(1, "The class name Taken is taken", lines);
    expectTimes(1, "] Unbound attributes: ", lines);
    expectTimes(1, "] Unbound fields: ", lines);
    expectTimes(3, "\n", lines);
}
