#pragma once

// What the command line says, whichever command it is for.

#include <string>
#include <vector>

namespace qxxml {

struct Options {
    std::string mapping;  // path of the mapping document
    std::string document; // path of the document; "-" is standard input
    std::string name;     // what `where` looks for
    std::string each; // the name of the elements to read one by one; empty for the whole document
    std::vector<std::string> documents;   // what `infer` and `check` go by
    std::string object;                   // path of the JSON for `update`; "-" likewise
    std::vector<std::string> assignments; // KEYPATH=VALUE each, for `set`

    bool strict = false;
    bool discardUnknown = false;
    bool noNamespaceURIs = false;
    bool keepWhiteSpace = false;
    bool noDoctype = false;
    bool pretty = false;
    bool classes = false;
    bool svg = false;
    bool keepOrder = false;
    bool matchNamespaces = false;
    bool json = false;
    bool notes = false;
    bool oneLine = false;
    bool quiet = false;
    bool verbose = false;
    std::size_t errors = 1; // how many a reading collects
    std::string output;     // the file for the result; empty for standard output
    std::string why;        // the path of the node that `check` is asked about
    bool inPlace = false;
    bool diff = false;

    // PREFIX=URI each, an empty prefix for names without one.
    std::vector<std::string> prefixes;

    // Folders that are searched before the usual places, in this order.
    std::vector<std::string> searchPaths;
    // NAME or NAME/VERSION; empty for the tool itself.
    std::string application;
};

} // namespace qxxml
