//===- Globals.h - The global options of ostracli, as users see them -------===//
//
// One table of the options that come before the command words: the root
// help, the manual page and shell completion show it, and the option parser
// of a command names it when such an option comes after the command words.
// (ParseGlobalOptions in Host.cpp reads them.)
//
//===----------------------------------------------------------------------===//
#pragma once

#include <span>
#include <string>

namespace Ostra {

/// One global option.
struct GlobalOption {
  const char* name;  ///< Long name with its dashes, such as "--formatter".
  const char* alias; ///< Short name ("-h"), or null.
  const char* value; ///< What its value is ("NAME"), or null for none.
  const char* text;  ///< What it does; line breaks fit the help's columns.
};

/// Every global option, in the order help shows them.
std::span<const GlobalOption> GlobalOptionTable();

/// The global option named \p name (long or short), or null.
const GlobalOption* FindGlobalOption(const std::string& name);

} // namespace Ostra
