//===- UplinkSplitter.cpp - Splitting uplink lists with Boost.Regex -------===//
//
// A module of its own, loaded by the network plug-in the first time a command
// splits an uplink list: Boost.Regex (with the ICU libraries it depends on) is
// then loaded only by the few commands that need it, not by every start of
// ostracli.
//
//===----------------------------------------------------------------------===//
#include <boost/regex.hpp>

#include <cstddef>
#include <string>

/// Splits \p text at every "," (Boost.Regex token iteration, sub-match -1)
/// and hands each token, unchanged and in order, to \p emit.
extern "C" __attribute__((visibility("default"))) void
OstraSplitUplinks(const char* text, std::size_t length,
                  void (*emit)(void* context, const char* token, std::size_t size), void* context) {
  static const boost::regex separator(",", boost::regex::perl);
  const std::string input(text, length);
  boost::sregex_token_iterator it(input.begin(), input.end(), separator, -1);
  for (boost::sregex_token_iterator end; it != end; ++it) {
    const std::string token = it->str();
    emit(context, token.data(), token.size());
  }
}
