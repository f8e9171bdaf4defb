//===- Misc.cpp - Small text helpers ---------------------------------------===//
#include "HostCtl/Misc.h"

#include <cstdarg>
#include <cstdio>

namespace HostCtl::Misc {

std::string StrPrintf(const char* format, ...) {
  va_list args;
  va_start(args, format);
  va_list copy;
  va_copy(copy, args);
  int length = std::vsnprintf(nullptr, 0, format, copy);
  va_end(copy);
  std::string out;
  if (length > 0) {
    out.resize(static_cast<std::size_t>(length));
    std::vsnprintf(out.data(), out.size() + 1, format, args);
  }
  va_end(args);
  return out;
}

std::vector<std::string> StringTokenize(const std::string& text, const std::string& delimiters) {
  std::vector<std::string> tokens;
  std::size_t start = text.find_first_not_of(delimiters);
  while (start != std::string::npos) {
    std::size_t end = text.find_first_of(delimiters, start);
    tokens.push_back(text.substr(start, end - start));
    start = end == std::string::npos ? end : text.find_first_not_of(delimiters, end);
  }
  return tokens;
}

} // namespace HostCtl::Misc
