//===- LinuxNet/Sysctl.h - Network settings of a namespace ----------------===//
//
// The kernel's net.* settings (/proc/sys/net) belong to a network namespace:
// the congestion control algorithm, ECN, IPv6 switches per interface, router
// advertisements. They are opened inside the namespace and read or written
// from outside it. Settings outside net.* belong to the whole machine and are
// refused.
//
//===----------------------------------------------------------------------===//
#pragma once

#include <string>

namespace LinuxNet {

class Namespace;

/// The value of \p key ("net.ipv4.tcp_ecn" or "net/ipv4/tcp_ecn"), without
/// its trailing newline.
std::string ReadSysctl(Namespace& ns, const std::string& key);
/// Sets \p key to \p value.
void WriteSysctl(Namespace& ns, const std::string& key, const std::string& value);

} // namespace LinuxNet
