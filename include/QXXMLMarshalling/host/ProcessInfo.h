#pragma once

// What the running program is called. The name stands in the path of the user's documents and
// defaults and in log lines; a host whose executable has another name sets it before it asks for
// repositories or defaults. Any thread may ask.

#include <QXXMLMarshalling/base/String.h>

namespace qx {

class QX_API ProcessInfo {
public:
    // What was set, else the file name by which the program was called.
    static String processName();
    // Null goes back to the program's own name. A name that is no file name ("", "a/b", "..")
    // raises NSInvalidArgumentException.
    static void setProcessName(const String& name);

    // The host's version, as CFBundleShortVersionString and CFBundleVersion of the main bundle;
    // they take the place of those in its Info.plist. Null leaves the property list's.
    static void setProcessVersion(const String& version, const String& build = nullptr);
    static String processVersion();
    static String processBuild();

    static int processIdentifier();
    // The absolute path of the program's file; null where it cannot be told.
    static String executablePath();
};

} // namespace qx
