//===- Host.h - The command host ---------------------------------------------===//
//
// Loads the plug-ins, builds the command tree, parses and validates a command
// line, runs the command and formats its result.
//
//===----------------------------------------------------------------------===//
#pragma once

namespace Ostra {

/// Runs one command line; returns the process exit status (0, 1 or 2).
int RunHost(int argc, char** argv);

} // namespace Ostra
