#pragma once

// The commands. Each gives the text for standard output, which is printed only once it is whole,
// and throws Failure, or lets qx::Exception pass, when it cannot. What comes one by one (readEach)
// is printed as it comes.

#include "qxxml/Options.h"

namespace qxxml {

// The resolved mapping's description, without the addresses of objects: the same on every run.
std::string describe(const Options& options);
// The document's object as JSON, see Json.h.
std::string read(const Options& options);
// An object a line as JSON, of each of the document's elements of one name.
std::string readEach(const Options& options);
// A mapping that fits the documents, or structs that fit this mapping.
std::string infer(const Options& options);
// The document, read into an object and written from it.
std::string roundtrip(const Options& options);
// The mapping as a graph for Graphviz; with --svg it has dot print the picture, and gives nothing.
std::string graph(const Options& options);
// The document with the values of some key paths set, and nothing else changed (Saving.h).
std::string set(const Options& options);
// The document with what an object says as JSON, likewise.
std::string update(const Options& options);
// The path that a name resolves to, and the places that were looked at up to there.
std::string where(const Options& options);

// What is wrong with the mapping; sets the exit status to 1 where that is more than notes.
std::string check(const Options& options, int& status);

} // namespace qxxml
