//===- ip/InterfaceCommon.h - Tables shared by the kernel interface families ===//
//
// The kernel interface, IPv4 and IPv6 commands share the choice of the
// interfaces a listing shows and the loop that lists them; their parameter
// and field tables are those of common/ParameterTable.h and FieldTable.h.
//
//===----------------------------------------------------------------------===//
#pragma once

#include "Fabrik/Call.h"
#include "Fabrik/MetaObj.h"
#include "HostCtl/Network/TvkNic.h"
#include "common/FieldTable.h"
#include "common/ParameterTable.h"
#include "ip/IpCommon.h"

#include <memory>
#include <string>
#include <vector>

namespace CorvexCli::NetworkNamespace {

/// The interfaces an IPv4 or IPv6 listing shows, chosen by its parameters
/// "interface-name", "netstack" and "type": one named interface, or all
/// interfaces of one or every netstack, ordinary or (type "system") system
/// ones. Adds the error message and returns false when the parameters are
/// refused or the named interface does not exist.
bool SelectTvkNics(HostCtl::Network::TvKernelNicInfo& service, const Fabrik::CallSpec::Input& input,
                   Fabrik::CallSpec::Output& output,
                   std::vector<std::unique_ptr<HostCtl::Network::TvkNic>>& nics);

/// The listing of the interfaces SelectTvkNics chooses: one row from
/// \p newRow per interface, its "Name" field holding the interface name and
/// its other fields set by \p fill(row, nic). Failures of the host reach the
/// caller.
template <typename NewRow, typename Fill>
void ListTvkNics(HostCtl::Network::TvKernelNicInfo& service, const Fabrik::CallSpec::Input& input,
                 Fabrik::CallSpec::Output& output, NewRow newRow, Fill fill) {
  std::vector<std::unique_ptr<HostCtl::Network::TvkNic>> nics;
  if (!SelectTvkNics(service, input, output, nics))
    return;
  auto list = Fabrik::MetaObj::MetaList::New(Fabrik::MetaObj::Struct, newRow());
  for (const auto& nic : nics) {
    if (!nic)
      continue;
    auto row = newRow();
    row->SetField("Name", nic->GetInterfaceName());
    fill(*row, *nic);
    list->Add(row);
  }
  output.SetRootObject(list);
}

/// Message of a look-up by interface name that found nothing.
inline const std::string kNoTarvikInterface = "Unable to find a Tarvik interface with the name ";

} // namespace CorvexCli::NetworkNamespace
