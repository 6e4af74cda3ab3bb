#pragma once

namespace qx {

// The one T of the process: made when it is first asked for, on whichever thread that is, and never
// destroyed. Code that runs while the program ends, and keys in static objects, may still use it.
template <class T>
T& immortal() {
    static T* const value = new T;
    return *value;
}

} // namespace qx
