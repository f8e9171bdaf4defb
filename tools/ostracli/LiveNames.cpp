//===- LiveNames.cpp - Names of the host's objects, for completion ---------===//
//
// Completion of a value such as "network nic get -n <TAB>" offers the names
// the host has. They are read as the commands read them, through the host
// library's interfaces; a host state that does not exist is not created
// (completion changes nothing), and one that cannot be read offers nothing.
//
//===----------------------------------------------------------------------===//
#include "LiveNames.h"

#include "HostCtl/Network/NetworkInfo.h"
#include "HostCtl/Network/Pnic.h"
#include "HostCtl/Session.h"
#include "HostCtl/System/FirewallRuleset.h"
#include "TvkCtl/Network/NetworkInfoImpl.h"
#include "TvkCtl/Network/Switching.h"
#include "TvkCtl/Network/TvkNicImpl.h"
#include "TvkCtl/System/SystemInfoImpl.h"

#include <cstdlib>
#include <set>
#include <sys/stat.h>

namespace Ostra {

namespace {

/// The kinds of object whose names completion offers.
enum class Kind {
  Nic,
  StandardSwitch,
  DistributedSwitch,
  AnySwitch,
  PortGroup,
  Interface,
  Netstack,
  Ruleset,
  World
};

/// Which parameters name which kind of object.
struct NamedBy {
  const char* parameter; ///< Long name of the parameter.
  Kind kind;             ///< What its value names.
};

const NamedBy kNamedBy[] = {
    {"vmnic", Kind::Nic},
    {"nic-name", Kind::Nic},
    {"trunk", Kind::Nic},
    {"branch", Kind::Nic},
    {"uplink-name", Kind::Nic},
    {"active-uplinks", Kind::Nic},
    {"standby-uplinks", Kind::Nic},
    {"vswitch-name", Kind::StandardSwitch},
    {"dvs", Kind::DistributedSwitch},
    {"dvs-name", Kind::DistributedSwitch},
    {"krx", Kind::DistributedSwitch},
    {"krx-name", Kind::DistributedSwitch},
    {"switch", Kind::AnySwitch},
    {"portgroup-name", Kind::PortGroup},
    {"interface-name", Kind::Interface},
    {"netstack", Kind::Netstack},
    {"ruleset-id", Kind::Ruleset},
    {"world-id", Kind::World},
};

template <typename Objects, typename NameOf>
void AddAll(std::vector<std::string>& names, const Objects& objects, NameOf nameOf) {
  for (const auto& object : objects)
    if (object)
      names.push_back(nameOf(*object));
}

std::vector<std::string> Read(Kind kind) {
  using namespace TvkCtl::Network;
  std::vector<std::string> names;
  switch (kind) {
  case Kind::Nic:
    AddAll(names, NetworkInfoImpl().GetPnics(HostCtl::Network::PnicGetAll),
           [](const auto& nic) { return nic.GetName(); });
    break;
  case Kind::StandardSwitch:
    AddAll(names, VirtualSwitchInfoImpl().GetVirtualSwitches(HostCtl::Network::PortsetGetRegular),
           [](const auto& vswitch) { return vswitch.GetName(); });
    break;
  case Kind::DistributedSwitch:
    AddAll(names, VirtualSwitchInfoImpl().GetDVSwitches(),
           [](const auto& dvs) { return dvs.GetName(); });
    break;
  case Kind::AnySwitch:
    AddAll(names, VirtualSwitchInfoImpl().GetAllSwitches(),
           [](const auto& portset) { return portset.GetName(); });
    break;
  case Kind::PortGroup:
    AddAll(names, NetworkInfoImpl().GetAllPortGroups(HostCtl::Network::PortsetGetRegular),
           [](const auto& group) { return group.GetName(); });
    break;
  case Kind::Interface:
    AddAll(names, TvKernelNicInfoImpl().GetTvKernelNics(0),
           [](auto& nic) { return nic.GetInterfaceName(); });
    break;
  case Kind::Netstack:
    AddAll(names, NetworkInfoImpl().ListNetstackInstances(),
           [](auto& instance) { return instance.GetKey(); });
    break;
  case Kind::Ruleset:
    AddAll(names, TvkCtl::System::SystemInfoImpl().GetFirewallRulesets(),
           [](const auto& ruleset) { return ruleset.GetRulesetId(); });
    break;
  case Kind::World: {
    // The worlds that own ports: those are the VMs the datapath commands know.
    std::set<int64_t> worlds;
    for (const auto& portset : VirtualSwitchInfoImpl().GetAllSwitches())
      for (const auto& port : portset->GetPorts())
        if (port->GetWorldLeader() != 0)
          worlds.insert(port->GetWorldLeader());
    for (int64_t world : worlds)
      names.push_back(std::to_string(world));
    break;
  }
  }
  return names;
}

} // namespace

std::vector<std::string> LiveNames(const std::string& parameter, const std::string& host) {
  const NamedBy* named = nullptr;
  for (const NamedBy& row : kNamedBy)
    if (parameter == row.parameter)
      named = &row;
  if (!named)
    return {};
  std::string path = host;
  if (path.empty())
    if (const char* env = std::getenv("OSTRACLI_HOST"); env && *env)
      path = env;
  if (path.empty())
    path = HostCtl::Session::DefaultHostPath();
  // Completion never creates a host: a simulated host's file must exist.
  struct stat info {};
  if (HostCtl::Session::IsSimulatedHost(path) &&
      (::stat(path.c_str(), &info) != 0 || !S_ISREG(info.st_mode)))
    return {};
  try {
    HostCtl::Session::SetHost(path);
    return Read(named->kind);
  } catch (...) {
    // A host state that cannot be read offers nothing; the command itself
    // will say why when it runs.
    return {};
  }
}

} // namespace Ostra
