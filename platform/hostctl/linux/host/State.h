//===- linux/host/State.h - Names the kernel cannot hold -------------------===//
//
// Port groups and the names of IPsec SAs and SPs have no place in the
// kernel. They are kept in one small text file beside the namespace:
// /etc/netns/NAME/ostracli-state for netns:NAME (next to the resolv.conf and
// hosts that `ip netns exec` shows the namespace), /etc/ostracli/linux-state
// for the process's own namespace. One record a line, fields separated by
// tabs; lines starting with '#' are comments. The file is rewritten
// atomically under the directory's lock (LinuxNet::UpdateTextFile).
//
//===----------------------------------------------------------------------===//
#pragma once

#include <functional>
#include <string>
#include <vector>

namespace LinuxHost {

/// One record: its kind ("portgroup", "sa", "sp") and fields.
struct StateRecord {
  std::string kind;                ///< First field.
  std::vector<std::string> fields; ///< The others.
};

/// The state file of namespace \p netns ("" for the process's own).
std::string StatePath(const std::string& netns);
/// Every record of \p path; a missing file has none.
std::vector<StateRecord> ReadState(const std::string& path);
/// Reads the records, lets \p edit change them and writes them back
/// atomically when they changed. \p edit may throw to change nothing.
void UpdateState(const std::string& path,
                 const std::function<void(std::vector<StateRecord>&)>& edit);
/// Whether \p text can be a field (no tab, no line break, not empty).
bool IsStateField(const std::string& text);

} // namespace LinuxHost
