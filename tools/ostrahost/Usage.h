//===- Usage.h - What ostrahost tells its users ----------------------------===//
//
// One table of ostrahost's commands and options gives both its --help text
// and its manual page, ostrahost(1).
//
//===----------------------------------------------------------------------===//
#pragma once

#include <string>

namespace OstraHost {

/// The version ostrahost reports.
const char* Version();

/// The text of ostrahost --help.
std::string UsageText();

/// The manual page ostrahost(1) in roff (ostrahost --man).
std::string ManualPage();

} // namespace OstraHost
