//===- Register.cpp - The network command tree -----------------------------===//
//
// AutoCli_RegisterNamespaces builds the `network` subtree from one table, Tree,
// that lists every namespace in the order in which it is created, each followed
// by the commands registered on it in their registration order. Building goes
// in two passes: the first creates each namespace with its description and
// registers its commands on it at once; the second attaches every namespace to
// its parent once it is complete, so that the tree is assembled bottom-up, and
// `network` is registered on the host's root last.
//
//===----------------------------------------------------------------------===//
#include "entry/Register.h"

#include "datapath.h"
#include "firewall.h"
#include "ip.h"
#include "nic.h"
#include "vswitch.h"

#include <algorithm>
#include <cstring>
#include <string_view>
#include <vector>

namespace CorvexCli::NetworkNamespace {
namespace {

using Fabrik::AutoCli::NamespaceNodePtr;

/// Creates one command object and hands it over as a node of the tree.
using CommandFactory = NamespaceNodePtr (*)();

template <class Class> NamespaceNodePtr MakeCommand() {
  return Class::New();
}

/// One row of the tree table: a namespace, or a command of the namespace of the
/// nearest namespace row above it.
struct TreeRow {
  const char* path;        ///< Namespace: its path from "network". Command: its name.
  const char* description; ///< Namespace description; null for a command.
  CommandFactory make;     ///< Command factory; null for a namespace.
  bool command;            ///< The row registers a command.
};

constexpr TreeRow Ns(const char* path, const char* description) {
  return {path, description, nullptr, false};
}

template <class Class> constexpr TreeRow Cmd(const char* name) {
  return {name, nullptr, &MakeCommand<Class>, true};
}

/// The whole tree. `network ip interface ipv4 get` and `network ip interface
/// ipv4 address list` are two objects of IpInterfaceIpv4Get. The LACP
/// namespaces come last, below `network vswitch dvs corvex`.
constexpr TreeRow Tree[] = {
    Ns("network",
       "Operations that pertain to the maintenance of networking on an OSTRA host. This includes a "
       "wide variety of commands to manipulate virtual networking components (vswitch, portgroup, "
       "etc) as well as local host IP, DNS and general host networking settings."),

    Ns("network ip", "Operations that can be performed on tvknics"),
    Cmd<IpGet>("get"),
    Cmd<IpSet>("set"),

    Ns("network ip neighbor", "Operations that can be performed on arp tables"),
    Cmd<IpNeighborList>("list"),
    Cmd<IpNeighborRemove>("remove"),

    Ns("network ip connection", "List active tcpip connections"),
    Cmd<IpConnectionList>("list"),

    Ns("network ip dns", "Operations pertaining to Domain Name Server configuration."),

    Ns("network ip dns server", "Operations pertaining to DNS server configuration."),
    Cmd<IpDNSServerList>("list"),
    Cmd<IpDNSServerAdd>("add"),
    Cmd<IpDNSServerRemove>("remove"),

    Ns("network ip dns search", "Operations pertaining to DNS search domain configuration."),
    Cmd<IpDNSSearchAdd>("add"),
    Cmd<IpDNSSearchRemove>("remove"),
    Cmd<IpDNSSearchList>("list"),

    Ns("network ip route", "Operations pertaining to route configuration"),

    Ns("network ip route ipv4", "IPv4 route operations"),
    Cmd<IpRouteIpv4Add>("add"),
    Cmd<IpRouteIpv4Remove>("remove"),
    Cmd<IpRouteIpv4List>("list"),

    Ns("network ip route ipv6", "IPv6 route operations"),
    Cmd<IpRouteIpv6Add>("add"),
    Cmd<IpRouteIpv6Remove>("remove"),
    Cmd<IpRouteIpv6List>("list"),

    Ns("network ip ipsec", "Operations on Internet Protocol Security"),

    Ns("network ip ipsec sa", "Operations pertaining to Security Association"),
    Cmd<IpIpsecSAAdd>("add"),
    Cmd<IpIpsecSARemove>("remove"),
    Cmd<IpIpsecSAList>("list"),

    Ns("network ip ipsec sp", "Operations pertaining to Security Policy"),
    Cmd<IpIpsecSPAdd>("add"),
    Cmd<IpIpsecSPRemove>("remove"),
    Cmd<IpIpsecSPList>("list"),

    Ns("network ip interface", "Operations having to do with the creation, management and deletion "
                               "of Tarvik network interfaces (tvknic)."),
    Cmd<IpInterfaceAdd>("add"),
    Cmd<IpInterfaceRemove>("remove"),
    Cmd<IpInterfaceList>("list"),
    Cmd<IpInterfaceSet>("set"),

    Ns("network ip interface ipv4", "Commands to get and set IPv4 settings for tvknic."),
    Cmd<IpInterfaceIpv4Get>("get"),
    Cmd<IpInterfaceIpv4Set>("set"),

    Ns("network ip interface ipv4 address",
       "Commands for managing IPv4 addresses assigned to Tarvik network interfaces."),
    Cmd<IpInterfaceIpv4Get>("list"),

    Ns("network ip interface ipv6", "Commands to get and set IPv6 settings for tvknic."),
    Cmd<IpInterfaceIpv6Set>("set"),
    Cmd<IpInterfaceIpv6Get>("get"),

    Ns("network ip interface ipv6 address",
       "Commands to list and update IPv6 addresses assigned to the system."),
    Cmd<IpInterfaceIpv6AddressList>("list"),
    Cmd<IpInterfaceIpv6AddressAdd>("add"),
    Cmd<IpInterfaceIpv6AddressRemove>("remove"),

    Ns("network ip interface tag", "Commands to add and remove tags on tvknics."),
    Cmd<IpInterfaceTagAdd>("add"),
    Cmd<IpInterfaceTagRemove>("remove"),
    Cmd<IpInterfaceTagGet>("get"),

    Ns("network ip netstack", "Operations having to do with the creation, management and deletion "
                              "of Tarvik Netstack Instances."),
    Cmd<IpNetstackInstanceList>("list"),
    Cmd<IpNetstackInstanceAdd>("add"),
    Cmd<IpNetstackInstanceRemove>("remove"),
    Cmd<IpNetstackInstanceGet>("get"),
    Cmd<IpNetstackInstanceSet>("set"),

    Ns("network ip hosts", "Operations pertaining to /etc/hosts"),
    Cmd<IpHostsList>("list"),
    Cmd<IpHostsAdd>("add"),
    Cmd<IpHostsRemove>("remove"),

    Ns("network multicast", "Operations having to do with multicast"),

    Ns("network multicast group", "Operations to list multicast groups"),
    Cmd<MulticastGroupList>("list"),

    Ns("network nic", "Operations having to do with the configuration of Network Interface Card "
                      "and getting and updating the NIC settings."),
    Cmd<NicList>("list"),
    Cmd<NicUp>("up"),
    Cmd<NicGet>("get"),
    Cmd<NicSet>("set"),
    Cmd<NicDown>("down"),

    Ns("network nic stats", "Get packet statistics for a NIC"),
    Cmd<NicStatsGet>("get"),

    Ns("network nic vlan", "Get VLAN information for a NIC"),

    Ns("network nic vlan stats", "Commands to access VLAN statistics for a NIC"),
    Cmd<NicVlanStatsGet>("get"),
    Cmd<NicVlanStatsSet>("set"),

    Ns("network nic coalesce", "Commands to access coalesce paramaters for a NIC"),
    Cmd<NicCoalesceGet>("get"),
    Cmd<NicCoalesceSet>("set"),

    Ns("network nic coalesce low",
       "Commands to access coalesce parameters for a NIC at low packet rate"),
    Cmd<NicCoalesceLowGet>("get"),
    Cmd<NicCoalesceLowSet>("set"),

    Ns("network nic coalesce high",
       "Commands to access coalesce parameters for a NIC at high packet rate"),
    Cmd<NicCoalesceHighGet>("get"),
    Cmd<NicCoalesceHighSet>("set"),

    Ns("network nic cso", "Commands to access checksum offload settings for a NIC"),
    Cmd<NicCsoGet>("get"),
    Cmd<NicCsoSet>("set"),

    Ns("network nic tso", "Commands to access TCP segmentation offload settings for a NIC"),
    Cmd<NicTsoGet>("get"),
    Cmd<NicTsoSet>("set"),

    Ns("network nic sg", "Commands to access scatter-gather settings for a NIC"),
    Cmd<NicSgGet>("get"),
    Cmd<NicSgSet>("set"),

    Ns("network nic pauseParams", "Commands to access pause parameters for a NIC"),
    Cmd<NicPauseParamsList>("list"),
    Cmd<NicPauseParamsSet>("set"),

    Ns("network nic register", "Commands to access registers for a NIC"),
    Cmd<NicRegisterDump>("dump"),

    Ns("network nic eeprom", "Commands to access EEPROM for a NIC"),
    Cmd<NicEepromDump>("dump"),
    Cmd<NicEepromChange>("change"),

    Ns("network nic negotiate", "Commands to access negotiation feature on a NIC"),
    Cmd<NicNegotiationRestart>("restart"),

    Ns("network nic selftest", "Commands to access self test feature on a NIC"),
    Cmd<NicSelfTestRun>("run"),

    Ns("network nic queue", "Commands to access RX/TX netqueue features on a NIC"),

    Ns("network nic queue loadbalancer", "Commands to access load balancer features of netqueue"),
    Cmd<NicQueueLbSettingList>("list"),
    Cmd<NicQueueLbSettingSet>("set"),

    Ns("network nic queue loadbalancer state", "Commands to access load balancer state on a NIC"),
    Cmd<NicQueueLbStateList>("list"),
    Cmd<NicQueueLbStateSet>("set"),

    Ns("network nic queue loadbalancer plugin",
       "Commands to access load balancer plugins on a NIC"),
    Cmd<NicQueueLbPluginList>("list"),
    Cmd<NicQueueLbPluginSet>("set"),

    Ns("network nic queue count", "Commands to access netqueue count on a NIC"),
    Cmd<NicQueueCountGet>("get"),
    Cmd<NicQueueCountSet>("set"),

    Ns("network nic queue filterclass", "Commands to access supported filter class"),
    Cmd<NicQueueFilterClassList>("list"),

    Ns("network nic software", "Commands to access NIC feature software simulation settings"),
    Cmd<NicSoftwareList>("list"),
    Cmd<NicSoftwareSet>("set"),

    Ns("network nic ring", "Commands to access NIC RX/TX ring buffer parameters"),

    Ns("network nic ring preset",
       "Commands to access preset maximums for NIC RX/TX ring buffer parameters."),
    Cmd<NicRingPresetGet>("get"),

    Ns("network nic ring current", "Commands to access current NIC RX/TX ring buffer parameters"),
    Cmd<NicRingCurrentGet>("get"),
    Cmd<NicRingCurrentSet>("set"),

    Ns("network nic hwCap", "Commands to access hardware capabilities on a NIC."),

    Ns("network nic hwCap supported",
       "Commands to access supported hardware capabilities of physical NICs."),
    Cmd<NicHwCapSupportedList>("list"),

    Ns("network nic hwCap activated",
       "Commands to access activated hardware capabilities of physical NICs."),
    Cmd<NicHwCapActivatedList>("list"),

    Ns("network nic dcb", "Commands regarding DCB (Data Center Bridging) protocol."),

    Ns("network nic dcb status", "Status information for DCB (Data Center Briding) protocol."),
    Cmd<NicDcbStatusGet>("get"),

    Ns("network nic attachment", "Commands to access attachment info for a NIC."),
    Cmd<NicAttachmentAdd>("add"),
    Cmd<NicAttachmentRemove>("remove"),
    Cmd<NicAttachmentList>("list"),

    Ns("network sriovnic", "Operations having to do with the configuration of SRIOV enabled "
                           "Network Interface Card and getting and updating the NIC settings."),
    Cmd<SriovNicList>("list"),

    Ns("network sriovnic vf", "Operations related to VFs of a SRIOV capable pNIC"),
    Cmd<VfList>("list"),
    Cmd<VfStats>("stats"),

    Ns("network vswitch", "Commands to list and manipulate Virtual Switches on an OSTRA host."),

    Ns("network vswitch standard",
       "Commands to list and manipulate Legacy Virtual Switches on an OSTRA host."),
    Cmd<VirtualSwitchStandardAdd>("add"),
    Cmd<VirtualSwitchStandardSet>("set"),
    Cmd<VirtualSwitchStandardList>("list"),
    Cmd<VirtualSwitchStandardRemove>("remove"),

    Ns("network vswitch standard uplink",
       "Commands to add and remove uplink on given virtual switch."),
    Cmd<VirtualSwitchStandardUplinkAdd>("add"),
    Cmd<VirtualSwitchStandardUplinkRemove>("remove"),

    Ns("network vswitch standard policy",
       "Commands to manipulate network policy settings governing the given virtual switch."),

    Ns("network vswitch standard policy shaping",
       "Commands to manipulate shaping policy setting for the given virtual switch."),
    Cmd<VirtualSwitchStandardPolicyShapingGet>("get"),
    Cmd<VirtualSwitchStandardPolicyShapingSet>("set"),

    Ns("network vswitch standard policy security",
       "Commands to manipulate security policy setting for the given virtual switch."),
    Cmd<VirtualSwitchStandardPolicySecurityGet>("get"),
    Cmd<VirtualSwitchStandardPolicySecuritySet>("set"),

    Ns("network vswitch standard policy failover",
       "Commands to manipulate failover policy setting for the given virtual switch."),
    Cmd<VirtualSwitchStandardPolicyFailoverGet>("get"),
    Cmd<VirtualSwitchStandardPolicyFailoverSet>("set"),

    Ns("network vswitch standard portgroup",
       "Commands to list and manipulate Port Groups on an OSTRA host."),
    Cmd<VirtualSwitchPortGroupList>("list"),
    Cmd<VirtualSwitchPortGroupAdd>("add"),
    Cmd<VirtualSwitchPortGroupRemove>("remove"),
    Cmd<VirtualSwitchPortGroupSet>("set"),

    Ns("network vswitch standard portgroup policy",
       "Commands to manipulate network policy settings governing the given portgroup."),

    Ns("network vswitch standard portgroup policy shaping",
       "Commands to manipulate shaping policy setting for the given portgroup."),
    Cmd<VirtualSwitchPortGroupPolicyShapingGet>("get"),
    Cmd<VirtualSwitchPortGroupPolicyShapingSet>("set"),

    Ns("network vswitch standard portgroup policy failover",
       "Commands to manipulate failover policy setting for the given portgroup."),
    Cmd<VirtualSwitchPortGroupPolicyFailoverGet>("get"),
    Cmd<VirtualSwitchPortGroupPolicyFailoverSet>("set"),

    Ns("network vswitch standard portgroup policy security",
       "Commands to manipulate security policy setting for the given portgroup."),
    Cmd<VirtualSwitchPortGroupPolicySecurityGet>("get"),
    Cmd<VirtualSwitchPortGroupPolicySecuritySet>("set"),

    Ns("network vswitch dvs", "Commands to retrieve Distributed Virtual Switch information"),

    Ns("network vswitch dvs corvex",
       "Commands to retrieve Corvex Ambrel Distributed Switch information"),
    Cmd<VirtualSwitchDVSCorvexList>("list"),

    Ns("network firewall", "A set of commands for firewall related operations"),
    Cmd<FirewallGet>("get"),
    Cmd<FirewallSet>("set"),
    Cmd<FirewallLoad>("load"),
    Cmd<FirewallRefresh>("refresh"),
    Cmd<FirewallUnload>("unload"),

    Ns("network firewall ruleset", "Commands to list and update firewall ruleset configuration"),
    Cmd<FirewallRulesetList>("list"),
    Cmd<FirewallRulesetSet>("set"),

    Ns("network firewall ruleset client", "Commands related to firewall ruleset clients"),
    Cmd<FirewallRulesetClientGet>("get"),
    Cmd<FirewallRulesetClientAdd>("add"),
    Cmd<FirewallRulesetClientRemove>("remove"),

    Ns("network firewall ruleset rule", "Commands to list rules in the ruleset"),
    Cmd<FirewallRulesetRuleList>("list"),

    Ns("network firewall ruleset allowedip",
       "Commands to list and add/remove allowedip on ruleset"),
    Cmd<FirewallRulesetAllowedipList>("list"),
    Cmd<FirewallRulesetAllowedipAdd>("add"),
    Cmd<FirewallRulesetAllowedipRemove>("remove"),

    Ns("network port", "Commands to get information about a port"),

    Ns("network port stats", "Commands to get port statistics"),
    Cmd<PortStatsGet>("get"),

    Ns("network port filter", "Commands to get port filter information"),

    Ns("network port filter stats", "Commands to get port filter statistics"),
    Cmd<PortFilterStatsGet>("get"),

    Ns("network vm", "A set of commands for VM related operations"),
    Cmd<VMList>("list"),

    Ns("network vm port", "Command to list ports of a given VM"),
    Cmd<VMPortList>("list"),

    Ns("network ens", "Commands to list and manipulate Enhanced Networking Stack (ENS) feature on "
                      "virtual switch."),

    Ns("network ens maxLcores", "Commands to access maximum number of ENS contexts."),
    Cmd<EnsMaxlcoresGet>("get"),
    Cmd<EnsMaxlcoresSet>("set"),

    Ns("network ens lcore", "Commands to list and manipulate ENS context parameters."),
    Cmd<EnsLcoreAdd>("add"),
    Cmd<EnsLcoreRemove>("remove"),
    Cmd<EnsLcoreList>("list"),

    Ns("network ens lcore switch", "Commands to access switch associated with given ENS context."),
    Cmd<EnsLcoreSwitchGet>("get"),
    Cmd<EnsLcoreSwitchAdd>("add"),
    Cmd<EnsLcoreSwitchRemove>("remove"),

    Ns("network ens lcore affinity", "Commands to access affinity for a given ENS context."),
    Cmd<EnsLcoreAffinityGet>("get"),
    Cmd<EnsLcoreAffinitySet>("set"),

    Ns("network vswitch dvs corvex lacp", "A set of commands for LACP related operations"),

    Ns("network vswitch dvs corvex lacp config", "Command to get LACP configuration"),
    Cmd<LacpGetConfig>("get"),

    Ns("network vswitch dvs corvex lacp status", "Command to get LACP port status"),
    Cmd<LacpGetStatus>("get"),

    Ns("network vswitch dvs corvex lacp stats", "Command to get LACP protocol statistics"),
    Cmd<LacpGetStats>("get"),

    Ns("network vswitch dvs corvex lacp timeout", "Command to set LACP LAG timeout"),
    Cmd<LacpSetTimeout>("set"),
};

/// The number of rows of Tree that are commands (\p commands true) or
/// namespaces.
constexpr std::size_t CountRows(bool commands) {
  std::size_t count = 0;
  for (const TreeRow& row : Tree)
    count += row.command == commands ? 1 : 0;
  return count;
}

static_assert(!Tree[0].command, "the table starts with the network namespace");
static_assert(CountRows(false) == 91, "the network subtree has 91 namespaces");
static_assert(CountRows(true) == 152, "the network subtree has 152 command registrations");

/// The name of a namespace under its parent: the last word of its path.
const char* LastWord(const char* path) {
  const char* blank = std::strrchr(path, ' ');
  return blank == nullptr ? path : blank + 1;
}

/// A namespace created by the first pass.
struct BuiltNamespace {
  std::string_view path; ///< Path from "network", words separated by blanks.
  std::size_t depth;     ///< Number of words below "network".
  NamespaceNodePtr node; ///< The namespace node.
};

} // namespace
} // namespace CorvexCli::NetworkNamespace

extern "C" __attribute__((visibility("default"))) void
AutoCli_RegisterNamespaces(std::shared_ptr<Fabrik::AutoCli::NamespaceNode>& root) {
  using namespace CorvexCli::NetworkNamespace;

  // First pass: create each namespace and set its description at once, then
  // register each of its commands on it, moving the new object in.
  std::vector<BuiltNamespace> namespaces;
  for (const TreeRow& row : Tree) {
    if (row.make != nullptr) {
      namespaces.back().node->RegisterNamespaceNode(row.make(), row.path);
      continue;
    }
    NamespaceNodePtr node = Fabrik::AutoCli::Namespace::New();
    node->SetDescription(row.description);
    std::string_view path = row.path;
    namespaces.push_back({path, static_cast<std::size_t>(std::count(path.begin(), path.end(), ' ')),
                          std::move(node)});
  }

  // Second pass: attach every namespace below `network` to its parent, the
  // deepest level first. A namespace is then complete when it is attached (its
  // commands and all its descendants are in place), and the sort being stable,
  // siblings are attached in the order in which they were created.
  std::vector<const BuiltNamespace*> attachOrder;
  for (const BuiltNamespace& entry : namespaces) {
    if (entry.depth > 0)
      attachOrder.push_back(&entry);
  }
  std::stable_sort(
      attachOrder.begin(), attachOrder.end(),
      [](const BuiltNamespace* a, const BuiltNamespace* b) { return a->depth > b->depth; });
  for (const BuiltNamespace* child : attachOrder) {
    std::string_view parentPath = child->path.substr(0, child->path.rfind(' '));
    auto parent =
        std::find_if(namespaces.begin(), namespaces.end(),
                     [&](const BuiltNamespace& entry) { return entry.path == parentPath; });
    parent->node->RegisterNamespaceNode(child->node, LastWord(child->path.data()));
  }

  // Last, attach the finished `network` node to the host's root. The
  // function's own references to the namespaces are released on return.
  root->RegisterNamespaceNode(namespaces.front().node, "network");
}
