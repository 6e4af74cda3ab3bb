#pragma once

// The command line of the tool, and how every run of it ends.

namespace qxxml {

// Runs the command that the arguments ask for. The exit status: 0 when it has done its work and its
// output is written, 1 when it failed, with "qxxml: error …" on standard error, 2 for wrong usage.
int runCommandLine(int argc, const char* const* argv);

} // namespace qxxml
