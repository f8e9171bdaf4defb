//===- IpCommon.h - What every IP service family reads the same way -------===//
//
// The netstack a command works on and the "type" selector of the listings,
// shared by every IP family.
//
//===----------------------------------------------------------------------===//
#pragma once

#include "Fabrik/Call.h"
#include "HostCtl/Network/NetworkInfo.h"
#include "HostCtl/Network/PortsetGetType.h"

#include <memory>
#include <string>

namespace CorvexCli::NetworkNamespace {

/// The description of the "netstack" parameter.
inline const char* const kNetstackDescription =
    "The network stack instance; if unspecified, use the default netstack instance";

/// The netstack a command works on: the "netstack" parameter when it is given
/// and not empty, else the default instance.
inline std::string NetstackParameter(const Fabrik::CallSpec::Input& input) {
  if (input.HasParameter("netstack") && !input.GetParameter("netstack").empty())
    return input.GetParameter("netstack");
  return "defaultTcpipStack";
}

/// Reads the "type" parameter of a listing into \p selector: regular objects
/// when it is absent, system objects when it is "system". Gives false, with
/// the error added, for any other type, and, when \p netstackMatters, for
/// system objects asked of a netstack other than the default one.
inline bool ReadListType(const Fabrik::CallSpec::Input& input, Fabrik::CallSpec::Output& output,
                         HostCtl::Network::PortsetGetType& selector, bool netstackMatters = true) {
  selector = HostCtl::Network::PortsetGetRegular;
  if (!input.HasParameter("type"))
    return true;
  if (input.GetParameter("type") != "system") {
    output.AddErrorMessage("Invalid type value, should be 'system'.");
    return false;
  }
  if (netstackMatters && NetstackParameter(input) != "defaultTcpipStack") {
    output.AddErrorMessage("Invalid netstack value, should be 'defaultTcpipStack'.");
    return false;
  }
  selector = HostCtl::Network::PortsetGetSystem;
  return true;
}

/// The kernel-interface service of the session's host, made by the factory so
/// that the command works on whichever host backend the session chose.
inline std::unique_ptr<HostCtl::Network::TvKernelNicInfo> KernelNicService() {
  return HostCtl::Network::NetworkFactory::GetNetworkInfo()->GetTvKernelNicInfo();
}

} // namespace CorvexCli::NetworkNamespace
