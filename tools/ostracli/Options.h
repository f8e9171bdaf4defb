//===- Options.h - Command options against an input specification --------===//
#pragma once

#include "Fabrik/Call.h"

#include <string>
#include <vector>

namespace Ostra {

/// Parses \p args (the words after the command path) into \p input: long
/// options "--name VALUE" and "--name=VALUE", short options "-s VALUE"; flags
/// take no value; a string list repeats its option. Checks types, required
/// parameters and constraints. On a refusal returns false with a message
/// naming the option in \p problem.
bool ParseCommandOptions(const Fabrik::CallSpec::InputSpec& spec,
                         const std::vector<std::string>& args, Fabrik::CallSpec::Input& input,
                         std::string& problem);

/// Whether \p args (the words after the command path) ask for help: "--help"
/// anywhere, or "-h" unless \p spec (null for a namespace) has a short option
/// "h" of its own.
bool AsksForHelp(const std::vector<std::string>& args, const Fabrik::CallSpec::InputSpec* spec);

/// Boolean words: true/false, 1/0, yes/no, on/off, in any case.
bool ParseBoolWord(const std::string& text, bool& value);

/// A decimal 64-bit integer with an optional sign and nothing else.
bool ParseInteger(const std::string& text, long& value);

} // namespace Ostra
