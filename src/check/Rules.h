#pragma once

// The groups of rules, a file each. They know the mapping language, and how the marshaller reads
// and writes what it says.

#include "check/MappingCheck.h"

namespace qx::detail {

// grammar.cpp: elements and attributes that the language does not have, or not there.
void checkGrammar(MappingCheck& check);
// references.cpp: includes, types, classes that are extended or flattened.
void checkReferences(MappingCheck& check);
// bindings.cpp: the bindings of one field by itself.
void checkBindings(MappingCheck& check);
// conflicts.cpp: fields of one class that are in each other's way.
void checkConflicts(MappingCheck& check);
// roundTrip.cpp: what is written other than it was read.
void checkRoundTrip(MappingCheck& check);
// hostClasses.cpp: classes of the program that do not have what the mapping says.
void checkHostClasses(MappingCheck& check);

} // namespace qx::detail
