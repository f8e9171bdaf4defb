//===- LiveNames.h - Names of the host's objects, for completion -----------===//
#pragma once

#include <string>
#include <vector>

namespace Ostra {

/// The names of the host's objects that parameter \p parameter takes (NIC,
/// switch, port group, interface, netstack and ruleset names, VM world ids),
/// read through the host library from the host state at \p host (else
/// $OSTRACLI_HOST, else the default host); none for other parameters, or when
/// that host state does not exist or cannot be read.
std::vector<std::string> LiveNames(const std::string& parameter, const std::string& host);

} // namespace Ostra
