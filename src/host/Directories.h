#pragma once

// The user's directories.

#include <QXXMLMarshalling/base/String.h>

#include <vector>

namespace qx {

// Where programs keep the user's documents: $XDG_DATA_HOME, else .local/share in $HOME, else in the
// home directory of the user's account. Empty only where there is none of the three. Variables that
// hold no absolute path count as unset.
std::vector<String> searchPathForApplicationSupport();

// Where programs keep the user's settings: $XDG_CONFIG_HOME, else .config, likewise. Null without.
String configurationDirectory();

} // namespace qx
