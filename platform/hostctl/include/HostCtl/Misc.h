//===- HostCtl/Misc.h - Small text helpers ---------------------------------===//
#pragma once

#include <string>
#include <string_view>
#include <vector>

namespace HostCtl::Misc {

/// printf-style formatting into a string.
std::string StrPrintf(const char* format, ...) __attribute__((format(printf, 1, 2)));

/// Concatenates all arguments.
template <typename... Parts> std::string StrCat(const Parts&... parts) {
  std::string out;
  (out.append(std::string_view(parts)), ...);
  return out;
}

/// Splits \p text at any of the characters of \p delimiters; empty tokens are
/// dropped.
std::vector<std::string> StringTokenize(const std::string& text, const std::string& delimiters);

} // namespace HostCtl::Misc
