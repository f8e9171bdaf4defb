//===- RegistrationTest.cpp - The registered network command tree ---------===//
//
// Registers the plug-in on a fresh root and compares the whole tree with the
// tables below: every namespace with its description, every command with its
// class, description, default output settings and result kind, the order of
// the children, and the names that the default output settings refer to.
//
//===----------------------------------------------------------------------===//
#include "Host.h"
#include "entry/Register.h"

#include "datapath.h"
#include "firewall.h"
#include "ip.h"
#include "nic.h"
#include "vswitch.h"

#include <gtest/gtest.h>

#include <map>
#include <memory>
#include <set>
#include <sstream>
#include <string>
#include <typeinfo>
#include <utility>
#include <vector>

namespace {

using namespace CorvexCli::NetworkNamespace;
using Fabrik::AutoCli::CommandSpec;
using Fabrik::AutoCli::NamespaceNodePtr;
using Fabrik::MetaObj::MetaList;
using Fabrik::MetaObj::MetaObjectPtr;
using Fabrik::MetaObj::MetaStruct;
using Parameters = std::vector<std::pair<std::string, std::string>>;

struct ExpectedNamespace {
  const char* path;        ///< Words from "network", separated by blanks.
  const char* description; ///< Exact description.
};

/// Every namespace of the subtree, in the order of creation.
const ExpectedNamespace ExpectedNamespaces[] = {
    {"network",
     "Operations that pertain to the maintenance of networking on an OSTRA host. This includes a "
     "wide variety of commands to manipulate virtual networking components (vswitch, portgroup, "
     "etc) as well as local host IP, DNS and general host networking settings."},
    {"network ip", "Operations that can be performed on tvknics"},
    {"network ip neighbor", "Operations that can be performed on arp tables"},
    {"network ip connection", "List active tcpip connections"},
    {"network ip dns", "Operations pertaining to Domain Name Server configuration."},
    {"network ip dns server", "Operations pertaining to DNS server configuration."},
    {"network ip dns search", "Operations pertaining to DNS search domain configuration."},
    {"network ip route", "Operations pertaining to route configuration"},
    {"network ip route ipv4", "IPv4 route operations"},
    {"network ip route ipv6", "IPv6 route operations"},
    {"network ip ipsec", "Operations on Internet Protocol Security"},
    {"network ip ipsec sa", "Operations pertaining to Security Association"},
    {"network ip ipsec sp", "Operations pertaining to Security Policy"},
    {"network ip interface", "Operations having to do with the creation, management and deletion "
                             "of Tarvik network interfaces (tvknic)."},
    {"network ip interface ipv4", "Commands to get and set IPv4 settings for tvknic."},
    {"network ip interface ipv4 address",
     "Commands for managing IPv4 addresses assigned to Tarvik network interfaces."},
    {"network ip interface ipv6", "Commands to get and set IPv6 settings for tvknic."},
    {"network ip interface ipv6 address",
     "Commands to list and update IPv6 addresses assigned to the system."},
    {"network ip interface tag", "Commands to add and remove tags on tvknics."},
    {"network ip netstack", "Operations having to do with the creation, management and deletion of "
                            "Tarvik Netstack Instances."},
    {"network ip hosts", "Operations pertaining to /etc/hosts"},
    {"network multicast", "Operations having to do with multicast"},
    {"network multicast group", "Operations to list multicast groups"},
    {"network nic", "Operations having to do with the configuration of Network Interface Card and "
                    "getting and updating the NIC settings."},
    {"network nic stats", "Get packet statistics for a NIC"},
    {"network nic vlan", "Get VLAN information for a NIC"},
    {"network nic vlan stats", "Commands to access VLAN statistics for a NIC"},
    {"network nic coalesce", "Commands to access coalesce paramaters for a NIC"},
    {"network nic coalesce low",
     "Commands to access coalesce parameters for a NIC at low packet rate"},
    {"network nic coalesce high",
     "Commands to access coalesce parameters for a NIC at high packet rate"},
    {"network nic cso", "Commands to access checksum offload settings for a NIC"},
    {"network nic tso", "Commands to access TCP segmentation offload settings for a NIC"},
    {"network nic sg", "Commands to access scatter-gather settings for a NIC"},
    {"network nic pauseParams", "Commands to access pause parameters for a NIC"},
    {"network nic register", "Commands to access registers for a NIC"},
    {"network nic eeprom", "Commands to access EEPROM for a NIC"},
    {"network nic negotiate", "Commands to access negotiation feature on a NIC"},
    {"network nic selftest", "Commands to access self test feature on a NIC"},
    {"network nic queue", "Commands to access RX/TX netqueue features on a NIC"},
    {"network nic queue loadbalancer", "Commands to access load balancer features of netqueue"},
    {"network nic queue loadbalancer state", "Commands to access load balancer state on a NIC"},
    {"network nic queue loadbalancer plugin", "Commands to access load balancer plugins on a NIC"},
    {"network nic queue count", "Commands to access netqueue count on a NIC"},
    {"network nic queue filterclass", "Commands to access supported filter class"},
    {"network nic software", "Commands to access NIC feature software simulation settings"},
    {"network nic ring", "Commands to access NIC RX/TX ring buffer parameters"},
    {"network nic ring preset",
     "Commands to access preset maximums for NIC RX/TX ring buffer parameters."},
    {"network nic ring current", "Commands to access current NIC RX/TX ring buffer parameters"},
    {"network nic hwCap", "Commands to access hardware capabilities on a NIC."},
    {"network nic hwCap supported",
     "Commands to access supported hardware capabilities of physical NICs."},
    {"network nic hwCap activated",
     "Commands to access activated hardware capabilities of physical NICs."},
    {"network nic dcb", "Commands regarding DCB (Data Center Bridging) protocol."},
    {"network nic dcb status", "Status information for DCB (Data Center Briding) protocol."},
    {"network nic attachment", "Commands to access attachment info for a NIC."},
    {"network sriovnic", "Operations having to do with the configuration of SRIOV enabled Network "
                         "Interface Card and getting and updating the NIC settings."},
    {"network sriovnic vf", "Operations related to VFs of a SRIOV capable pNIC"},
    {"network vswitch", "Commands to list and manipulate Virtual Switches on an OSTRA host."},
    {"network vswitch standard",
     "Commands to list and manipulate Legacy Virtual Switches on an OSTRA host."},
    {"network vswitch standard uplink",
     "Commands to add and remove uplink on given virtual switch."},
    {"network vswitch standard policy",
     "Commands to manipulate network policy settings governing the given virtual switch."},
    {"network vswitch standard policy shaping",
     "Commands to manipulate shaping policy setting for the given virtual switch."},
    {"network vswitch standard policy security",
     "Commands to manipulate security policy setting for the given virtual switch."},
    {"network vswitch standard policy failover",
     "Commands to manipulate failover policy setting for the given virtual switch."},
    {"network vswitch standard portgroup",
     "Commands to list and manipulate Port Groups on an OSTRA host."},
    {"network vswitch standard portgroup policy",
     "Commands to manipulate network policy settings governing the given portgroup."},
    {"network vswitch standard portgroup policy shaping",
     "Commands to manipulate shaping policy setting for the given portgroup."},
    {"network vswitch standard portgroup policy failover",
     "Commands to manipulate failover policy setting for the given portgroup."},
    {"network vswitch standard portgroup policy security",
     "Commands to manipulate security policy setting for the given portgroup."},
    {"network vswitch dvs", "Commands to retrieve Distributed Virtual Switch information"},
    {"network vswitch dvs corvex",
     "Commands to retrieve Corvex Ambrel Distributed Switch information"},
    {"network firewall", "A set of commands for firewall related operations"},
    {"network firewall ruleset", "Commands to list and update firewall ruleset configuration"},
    {"network firewall ruleset client", "Commands related to firewall ruleset clients"},
    {"network firewall ruleset rule", "Commands to list rules in the ruleset"},
    {"network firewall ruleset allowedip", "Commands to list and add/remove allowedip on ruleset"},
    {"network port", "Commands to get information about a port"},
    {"network port stats", "Commands to get port statistics"},
    {"network port filter", "Commands to get port filter information"},
    {"network port filter stats", "Commands to get port filter statistics"},
    {"network vm", "A set of commands for VM related operations"},
    {"network vm port", "Command to list ports of a given VM"},
    {"network ens",
     "Commands to list and manipulate Enhanced Networking Stack (ENS) feature on virtual switch."},
    {"network ens maxLcores", "Commands to access maximum number of ENS contexts."},
    {"network ens lcore", "Commands to list and manipulate ENS context parameters."},
    {"network ens lcore switch", "Commands to access switch associated with given ENS context."},
    {"network ens lcore affinity", "Commands to access affinity for a given ENS context."},
    {"network vswitch dvs corvex lacp", "A set of commands for LACP related operations"},
    {"network vswitch dvs corvex lacp config", "Command to get LACP configuration"},
    {"network vswitch dvs corvex lacp status", "Command to get LACP port status"},
    {"network vswitch dvs corvex lacp stats", "Command to get LACP protocol statistics"},
    {"network vswitch dvs corvex lacp timeout", "Command to set LACP LAG timeout"},
};

/// What a command's output specification has at its root.
enum class Result { Boolean, Integer, String, Structure, StructureList };

struct ExpectedCommand {
  const char* path;           ///< Words from "network", separated by blanks.
  const std::type_info* type; ///< Class of the registered object.
  Result result;              ///< Kind of the result template.
  const char* structure;      ///< Name of the result structure; "" for scalars.
  const char* description;    ///< Exact description (a prefix for tag add).
  const char* formatter;      ///< Default output formatter; "" for none.
  Parameters parameters;      ///< Default output parameters, in order.
};

/// Every command registration, in the order of registration: path, class,
/// result, description, then the default output formatter and parameters.
// clang-format off
const ExpectedCommand ExpectedCommands[] = {
    {"network ip get", &typeid(IpGet), Result::Structure, "IPInfo",
     "Get global IP settings",
     "simple", {}},
    {"network ip set", &typeid(IpSet), Result::Boolean, "",
     "Update global IP settings",
     "", {}},
    {"network ip neighbor list", &typeid(IpNeighborList), Result::StructureList, "NetworkNeighbor",
     "List ARP table entries",
     "table",
     {{"fields:NetworkNeighbor", "Neighbor,Mac Address,Tvknic,Expiry,State,Type"},
      {"units:NetworkNeighbor.Expiry", "sec"}}},
    {"network ip neighbor remove", &typeid(IpNeighborRemove), Result::Boolean, "",
     "Remove ARP table entries",
     "", {}},
    {"network ip connection list", &typeid(IpConnectionList), Result::StructureList, "IpConnection",
     "List active TCP/IP connections",
     "table",
     {{"fields:IpConnection",
        "Proto,Recv Q,Send Q,Local Address,Foreign Address,State,World ID,CC Algo,World Name"}}},
    {"network ip dns server list", &typeid(IpDNSServerList), Result::Structure, "NameServerList",
     "Print a list of the DNS server currently configured on the system in the order in which they "
     "will be used.",
     "simple", {}},
    {"network ip dns server add", &typeid(IpDNSServerAdd), Result::Boolean, "",
     "Add a new DNS server to the end of the list of DNS servers to use for this Ostra host.",
     "", {}},
    {"network ip dns server remove", &typeid(IpDNSServerRemove), Result::Boolean, "",
     "Remove a DNS server from the list of DNS servers to use for this Ostra host.",
     "", {}},
    {"network ip dns search add", &typeid(IpDNSSearchAdd), Result::Boolean, "",
     "Add a search domain to the list of domains to be searched when trying to resolve an host "
     "name on the Ostra host.",
     "", {}},
    {"network ip dns search remove", &typeid(IpDNSSearchRemove), Result::Boolean, "",
     "Remove a search domain from the list of domains to be searched when trying to resolve an "
     "host name on the Ostra host.",
     "", {}},
    {"network ip dns search list", &typeid(IpDNSSearchList), Result::Structure, "DNSSearchList",
     "List the search domains currently configured on the Ostra host in the order in which they "
     "will be used when searching.",
     "simple", {}},
    {"network ip route ipv4 add", &typeid(IpRouteIpv4Add), Result::Boolean, "",
     "Add IPv4 route to the Tarvik.",
     "", {}},
    {"network ip route ipv4 remove", &typeid(IpRouteIpv4Remove), Result::Boolean, "",
     "Remove IPv4 route",
     "", {}},
    {"network ip route ipv4 list", &typeid(IpRouteIpv4List), Result::StructureList, "Ipv4Route",
     "List configured IPv4 routes",
     "table",
     {{"fields:Ipv4Route", "Network,Netmask,Gateway,Interface,Source"}}},
    {"network ip route ipv6 add", &typeid(IpRouteIpv6Add), Result::Boolean, "",
     "Add IPv6 route to the Tarvik.",
     "", {}},
    {"network ip route ipv6 remove", &typeid(IpRouteIpv6Remove), Result::Boolean, "",
     "Remove IPv6 route from the Tarvik",
     "", {}},
    {"network ip route ipv6 list", &typeid(IpRouteIpv6List), Result::StructureList, "Ipv6Route",
     "List configured IPv6 routes",
     "table",
     {{"fields:Ipv6Route", "Network,Netmask,Gateway,Interface"}}},
    {"network ip ipsec sa add", &typeid(IpIpsecSAAdd), Result::Boolean, "",
     "Add a Security Association.",
     "", {}},
    {"network ip ipsec sa remove", &typeid(IpIpsecSARemove), Result::Boolean, "",
     "Operation to remove Security Association(s)",
     "", {}},
    {"network ip ipsec sa list", &typeid(IpIpsecSAList),
     Result::StructureList, "SecurityAssociation",
     "List configured Security Associations",
     "table",
     {{"fields:SecurityAssociation",
        "Name,Source Address,Destination Address,State,SPI,Mode,Encryption Algorithm,Integrity "
        "Algorithm,Lifetime"}}},
    {"network ip ipsec sp add", &typeid(IpIpsecSPAdd), Result::Boolean, "",
     "Add a Security Policy.",
     "", {}},
    {"network ip ipsec sp remove", &typeid(IpIpsecSPRemove), Result::Boolean, "",
     "Operation to remove Security Policy",
     "", {}},
    {"network ip ipsec sp list", &typeid(IpIpsecSPList), Result::StructureList, "SecurityPolicy",
     "List configured Security Policys",
     "table",
     {{"fields:SecurityPolicy",
        "Name,Source Address,Source Port,Destination Address,Destination Port,Protocol,Flow,Action,"
        "Mode,SA Name"}}},
    {"network ip interface add", &typeid(IpInterfaceAdd), Result::Boolean, "",
     "Add a new Tarvik network interface.",
     "", {}},
    {"network ip interface remove", &typeid(IpInterfaceRemove), Result::Boolean, "",
     "Remove a Tarvik network interface from the Ostra host. A TarVik network interface can be "
     "uniquely specified by --interface-name or --portgroup-name or --dvs-name/--dvport-id. i.e. "
     "Providing its name or its connection point are two ways to uniquely specify a TarVik network "
     "interface.",
     "", {}},
    {"network ip interface list", &typeid(IpInterfaceList),
     Result::StructureList, "NetworkInterface",
     "This command will list the Tarvik network interfaces currently known to the system.",
     "simple",
     {{"header:NetworkInterface", "%Name%"},
      {"fields:NetworkInterface",
        "Name,MAC Address,Enabled,Portset,Portgroup,Netstack Instance,KRX Name,KRX UUID,KRX Port,"
        "KRX Connection,Opaque Network ID,Opaque Network Type,External ID,MTU,TSO MSS,RXDispQueue "
        "Size,Port ID"}}},
    {"network ip interface set", &typeid(IpInterfaceSet), Result::Boolean, "",
     "This command sets the enabled status and MTU size of a given IP interface ",
     "", {}},
    {"network ip interface ipv4 get", &typeid(IpInterfaceIpv4Get),
     Result::StructureList, "IPv4Interface",
     "List the IPv4 addresses assigned to Tarvik network interfaces.",
     "table",
     {{"fields:IPv4Interface",
        "Name,IPv4 Address,IPv4 Netmask,IPv4 Broadcast,Address Type,Gateway,DHCP DNS"}}},
    {"network ip interface ipv4 set", &typeid(IpInterfaceIpv4Set), Result::Boolean, "",
     "Configure IPv4 setting for a given Tarvik network interface.",
     "", {}},
    {"network ip interface ipv4 address list", &typeid(IpInterfaceIpv4Get),
     Result::StructureList, "IPv4Interface",
     "List the IPv4 addresses assigned to Tarvik network interfaces.",
     "table",
     {{"fields:IPv4Interface",
        "Name,IPv4 Address,IPv4 Netmask,IPv4 Broadcast,Address Type,Gateway,DHCP DNS"}}},
    {"network ip interface ipv6 set", &typeid(IpInterfaceIpv6Set), Result::Boolean, "",
     "Configure IPv6 settings for a given Tarvik network interface.",
     "", {}},
    {"network ip interface ipv6 get", &typeid(IpInterfaceIpv6Get),
     Result::StructureList, "IPv6Interface",
     "Get IPv6 settings for Tarvik network interfaces. This does not include the IPv6 addresses "
     "which can be found in the \"address list\" command.",
     "table",
     {{"fields:IPv6Interface",
        "Name,IPv6 Enabled,DHCPv6 Enabled,Router Adv Enabled,DHCP DNS,Gateway"}}},
    {"network ip interface ipv6 address list", &typeid(IpInterfaceIpv6AddressList),
     Result::StructureList, "IPv6Interface",
     "This command will list all of the IPv6 addresses currently assigned to the system",
     "table",
     {{"fields:IPv6Interface", "Interface,Address,Netmask,Type,Status"}}},
    {"network ip interface ipv6 address add", &typeid(IpInterfaceIpv6AddressAdd),
     Result::Boolean, "",
     "Add a static IPv6 address to a given Tarvik network interface.",
     "", {}},
    {"network ip interface ipv6 address remove", &typeid(IpInterfaceIpv6AddressRemove),
     Result::Boolean, "",
     "Remove an IPv6 address from a given Tarvik network interface.",
     "", {}},
    {"network ip interface tag add", &typeid(IpInterfaceTagAdd), Result::Boolean, "",
     "Adds a tag on a given Tarvik network interface. Supported tags are: ",
     "", {}},
    {"network ip interface tag remove", &typeid(IpInterfaceTagRemove), Result::Boolean, "",
     "Removes a tag on a given Tarvik network interface.",
     "", {}},
    {"network ip interface tag get", &typeid(IpInterfaceTagGet), Result::Structure, "InterfaceTag",
     "Gets the tags set on the given Tarvik network interface.",
     "simple",
     {{"fields:IntefaceTag", "Tags"},
      {"header:InterfaceTag", "<NONE>"}}},
    {"network ip netstack list", &typeid(IpNetstackInstanceList),
     Result::StructureList, "NetstackInstance",
     "This command will list the Tarvik Netstack instances currently known to the system.",
     "simple",
     {{"header:NetstackInstance", "%Key%"},
      {"fields:NetstackInstance", "Key,Name,State"}}},
    {"network ip netstack add", &typeid(IpNetstackInstanceAdd), Result::Boolean, "",
     "Add a new Netstack Instance.",
     "", {}},
    {"network ip netstack remove", &typeid(IpNetstackInstanceRemove), Result::Boolean, "",
     "Remove a new Netstack Instance.",
     "", {}},
    {"network ip netstack get", &typeid(IpNetstackInstanceGet),
     Result::StructureList, "NetstackInstance",
     "Get runtime/configuration settings for a given Netstack Instance.",
     "simple",
     {{"header:NetstackInstance", "%Key%"},
      {"fields:NetstackInstance",
        "Key,Name,Enabled,Max Connections,Current Max Connections,Congestion Control Algorithm,"
        "IPv6 Enabled,Current IPv6 Enabled,ECN Status,State"}}},
    {"network ip netstack set", &typeid(IpNetstackInstanceSet), Result::Boolean, "",
     "Configure settings for a given Netstack Instance.",
     "", {}},
    {"network ip hosts list", &typeid(IpHostsList), Result::StructureList, "IpHostList",
     "List the user specified associations of IP addresses with host names.",
     "simple",
     {{"fields:IpHostList", "IP address,HostName,Aliases,Comment"}}},
    {"network ip hosts add", &typeid(IpHostsAdd), Result::Boolean, "",
     "Add association of IP addresses with host names.",
     "", {}},
    {"network ip hosts remove", &typeid(IpHostsRemove), Result::Boolean, "",
     "Remove association of IP addresses with host names.",
     "", {}},
    {"network multicast group list", &typeid(MulticastGroupList), Result::StructureList, "Nic",
     "List all the multicast group members.",
     "table",
     {{"fields:Interface", "Interface,Refcount,Group,Link Layer"}}},
    {"network nic list", &typeid(NicList), Result::StructureList, "Nic",
     "This command will list the Physical NICs currently installed and loaded on the system.",
     "table",
     {{"fields:Nic",
        "Name,PCI Device,Driver,Admin Status,Link Status,Speed,Duplex,MAC Address,MTU,"
        "Description"}}},
    {"network nic up", &typeid(NicUp), Result::Boolean, "",
     "Bring up the specified network device.",
     "", {}},
    {"network nic get", &typeid(NicGet), Result::Structure, "NICInfo",
     "Get the generic configuration of a network device",
     "simple", {}},
    {"network nic set", &typeid(NicSet), Result::Boolean, "",
     "Set the general options for the specified ethernet device.",
     "", {}},
    {"network nic down", &typeid(NicDown), Result::Boolean, "",
     "Bring down the specified network device.",
     "", {}},
    {"network nic stats get", &typeid(NicStatsGet), Result::StructureList, "Nic",
     "Get NIC statistics for a given interface.",
     "simple",
     {{"header:Nic", "NIC statistics for %NIC Name%"},
      {"fields:Nic",
        "Packets received,Packets sent,Bytes received,Bytes sent,Receive packets dropped,Transmit "
        "packets dropped,Multicast packets received,Broadcast packets received,Multicast packets "
        "sent,Broadcast packets sent,Total receive errors,Receive length errors,Receive over "
        "errors,Receive CRC errors,Receive frame errors,Receive FIFO errors,Receive missed errors,"
        "Total transmit errors,Transmit aborted errors,Transmit carrier errors,Transmit FIFO "
        "errors,Transmit heartbeat errors,Transmit window errors"}}},
    {"network nic vlan stats get", &typeid(NicVlanStatsGet), Result::StructureList, "NIC",
     "List VLAN statistics for active VLAN's on the NIC.",
     "simple",
     {{"header:NIC", "VLAN %VLAN ID%"},
      {"fields:NIC", "Packets received,Packets sent"}}},
    {"network nic vlan stats set", &typeid(NicVlanStatsSet), Result::Boolean, "",
     "Enable/disable VLAN statistics collection on the NIC.",
     "", {}},
    {"network nic coalesce get", &typeid(NicCoalesceGet), Result::StructureList, "CoalesceParams",
     "Get coalesce parameters",
     "table",
     {{"fields:CoalesceParams",
        "NIC,RX microseconds,RX maximum frames,TX microseconds,TX Maximum frames,Adaptive RX,"
        "Adaptive TX,Sample interval seconds"}}},
    {"network nic coalesce set", &typeid(NicCoalesceSet), Result::Boolean, "",
     "Set coalesce parameters on a nic",
     "", {}},
    {"network nic coalesce low get", &typeid(NicCoalesceLowGet),
     Result::Structure, "CoalesceParamsAtLowPacketRate",
     "Get information about the behavior of a NIC when it sends or receives packets at low packet "
     "rate.",
     "simple",
     {{"fields:CoalesceParamsAtLowPacketRate",
        "NIC,Packet rate,RX delay time,RX delay packets,TX delay time,TX delay packets"},
      {"units:CoalesceParamsAtLowPacketRate.Packet rate", "pps"},
      {"units:CoalesceParamsAtLowPacketRate.RX delay time", "microsecond"},
      {"units:CoalesceParamsAtLowPacketRate.TX delay time", "microsecond"}}},
    {"network nic coalesce low set", &typeid(NicCoalesceLowSet), Result::Boolean, "",
     "Set parameters to control the behavior of a NIC when it sends or receives packets at low "
     "packet rate.",
     "", {}},
    {"network nic coalesce high get", &typeid(NicCoalesceHighGet),
     Result::Structure, "CoalesceParamsAtHighPacketRate",
     "Get information about the behavior of a NIC when it sends or receives packets at high packet "
     "rate.",
     "simple",
     {{"fields:CoalesceParamsAtHighPacketRate",
        "NIC,Packet rate,RX delay time,RX delay packets,TX delay time,TX delay packets"},
      {"units:CoalesceParamsAtHighPacketRate.Packet rate", "pps"},
      {"units:CoalesceParamsAtHighPacketRate.RX delay time", "microsecond"},
      {"units:CoalesceParamsAtHighPacketRate.TX delay time", "microsecond"}}},
    {"network nic coalesce high set", &typeid(NicCoalesceHighSet), Result::Boolean, "",
     "Set parameters to control the behavior of a NIC when it sends or receives packets at high "
     "packet rate.",
     "", {}},
    {"network nic cso get", &typeid(NicCsoGet), Result::StructureList, "CSOSettings",
     "Get checksum offload settings",
     "table",
     {{"fields:CSOSettings", "NIC,RX Checksum Offload,TX Checksum Offload"}}},
    {"network nic cso set", &typeid(NicCsoSet), Result::Boolean, "",
     "Set checksum offload settings on a nic, which is not persistent.",
     "", {}},
    {"network nic tso get", &typeid(NicTsoGet), Result::StructureList, "TSOSettings",
     "Get TCP segmentation offload settings",
     "table",
     {{"fields:TSOSettings", "NIC,Value"}}},
    {"network nic tso set", &typeid(NicTsoSet), Result::Boolean, "",
     "Set TCP segmentation offload settings on a nic, which is not persistent.",
     "", {}},
    {"network nic sg get", &typeid(NicSgGet), Result::StructureList, "ScatterGatherSetting",
     "Get scatter-gather settings",
     "table",
     {{"fields:ScatterGatherSetting", "NIC,Value"}}},
    {"network nic sg set", &typeid(NicSgSet), Result::Boolean, "",
     "Set scatter-gatter settings on a nic, which is not persistent.",
     "", {}},
    {"network nic pauseParams list", &typeid(NicPauseParamsList),
     Result::StructureList, "PauseParamsSettings",
     "List pause parameters of all NICs",
     "table",
     {{"fields:PauseParamsSettings",
        "NIC,Pause Params Supported,Pause RX,Pause TX,Auto Negotiation,Auto Negotiation Resolution "
        "Avail,RX Auto Negotiation Resolution,TX Auto Negotiation Resolution"}}},
    {"network nic pauseParams set", &typeid(NicPauseParamsSet), Result::Boolean, "",
     "Set pause parameters for a NIC",
     "", {}},
    {"network nic register dump", &typeid(NicRegisterDump), Result::StructureList, "RegisterDump",
     "Dump device registers",
     "table",
     {{"fields:RegisterDump", "Offset,Value"}}},
    {"network nic eeprom dump", &typeid(NicEepromDump), Result::StructureList, "EepromDump",
     "Dump device EEPROM",
     "table",
     {{"fields:EepromDump", "Offset,Value"}}},
    {"network nic eeprom change", &typeid(NicEepromChange), Result::Boolean, "",
     "Change EEPROM on a nic",
     "", {}},
    {"network nic negotiate restart", &typeid(NicNegotiationRestart), Result::Boolean, "",
     "Restart N-Way negotiation on a nic",
     "", {}},
    {"network nic selftest run", &typeid(NicSelfTestRun), Result::StructureList, "EepromDump",
     "Run self test",
     "table",
     {{"fields:EepromDump", "Item,Value"}}},
    {"network nic queue loadbalancer list", &typeid(NicQueueLbSettingList),
     Result::StructureList, "Settings",
     "List the load balancer settings of all the installed and loaded physical NICs. (S:supported, "
     "U:unsupported, N:not-applicable, A:allowed, D:disallowed).",
     "table",
     {{"fields:Settings",
        "NIC,RxQPair,RxQNoFeature,PreEmptibleQ,RxQLatency,RxDynamicLB,DynamicQPool,MacLearnLB,RSS,"
        "LRO,GeneveOAM,RSSLRO"}}},
    {"network nic queue loadbalancer set", &typeid(NicQueueLbSettingSet), Result::Boolean, "",
     "Enable/disable netqueue load balancer setting on a NIC.",
     "", {}},
    {"network nic queue loadbalancer state list", &typeid(NicQueueLbStateList),
     Result::StructureList, "NetqBalState",
     "Netqueue balancer state of all physical NICs currently installed and loaded on the system",
     "table",
     {{"fields:NetqBalState", "NIC,Enabled"}}},
    {"network nic queue loadbalancer state set", &typeid(NicQueueLbStateSet), Result::Boolean, "",
     "Enable/disable netqueue balancer on a NIC",
     "", {}},
    {"network nic queue loadbalancer plugin list", &typeid(NicQueueLbPluginList),
     Result::StructureList, "NetqBalPlugin",
     "Details of netqueue balancer plugins on all physical NICs currently installed and loaded on "
     "the system",
     "table",
     {{"fields:NetqBalPlugin", "NIC,Module Name,Plugin Name,Enabled,Description"},
      {"wrap-last", "true"}}},
    {"network nic queue loadbalancer plugin set", &typeid(NicQueueLbPluginSet), Result::Boolean, "",
     "Enable/disable netqueue balancer plugin on a NIC",
     "", {}},
    {"network nic queue count get", &typeid(NicQueueCountGet),
     Result::StructureList, "NetqueueCount",
     "Get netqueue count on a nic",
     "table",
     {{"fields:NetqueueCount", "NIC,Tx netqueue count,Rx netqueue count"}}},
    {"network nic queue count set", &typeid(NicQueueCountSet), Result::Boolean, "",
     "Set number of netqueues on a nic",
     "", {}},
    {"network nic queue filterclass list", &typeid(NicQueueFilterClassList),
     Result::StructureList, "Settings",
     "List the netqueue supported filterclass of all physical NICs currently installed and loaded "
     "on the system.",
     "table",
     {{"fields:Settings", "NIC,MacOnly,VlanOnly,VlanMac,Vxlan,Geneve,GenericEncap"}}},
    {"network nic software list", &typeid(NicSoftwareList), Result::StructureList, "Settings",
     "List software simulation settings of physical NICs currently installed and loaded on the "
     "system.",
     "table",
     {{"fields:Settings",
        "NIC,IPv4 CSO,IPv4 TSO,Scatter Gather,Offset Based Offload,VXLAN Encap,Geneve Offload,IPv6 "
        "TSO,IPv6 TSO Ext,IPv6 CSO,IPv6 CSO Ext,High DMA,Scatter Gather MP,VLAN Tagging,VLAN "
        "Untagging"}}},
    {"network nic software set", &typeid(NicSoftwareSet), Result::Boolean, "",
     "Enable and disable software simulation settings on a NIC.",
     "", {}},
    {"network nic ring preset get", &typeid(NicRingPresetGet), Result::Structure, "RingInfo",
     "Get preset maximums for RX/TX ring buffer parameters of a NIC.",
     "simple",
     {{"fields:RingInfo", "Max RX,Max RX Mini,Max RX Jumbo,Max TX"}}},
    {"network nic ring current get", &typeid(NicRingCurrentGet), Result::Structure, "RingInfo",
     "Get current RX/TX ring buffer parameters of a NIC",
     "simple",
     {{"fields:RingInfo", "RX,RX Mini,RX Jumbo,TX"}}},
    {"network nic ring current set", &typeid(NicRingCurrentSet), Result::Boolean, "",
     "Set current RX/TX ring buffer parameters of a NIC",
     "", {}},
    {"network nic hwCap supported list", &typeid(NicHwCapSupportedList),
     Result::StructureList, "Settings",
     "List supported hardware capabilities of physical NICs.",
     "table",
     {{"fields:Settings", "NIC,Device Hardware Cap Supported"}}},
    {"network nic hwCap activated list", &typeid(NicHwCapActivatedList),
     Result::StructureList, "Settings",
     "List activated hardware capabilities of physical NICs.",
     "table",
     {{"fields:Settings", "NIC,Device Hardware Cap Activated"}}},
    {"network nic dcb status get", &typeid(NicDcbStatusGet), Result::Structure, "DCBStatus",
     "Get the DCB information for a NIC.",
     "simple",
     {{"fields:DCBStatus",
        "Nic Name,Mode,Enabled,Capabilities,PFC Enabled,PFC Configuration,IEEE ETS Configuration,"
        "IEEE PFC Configuration,DCB Apps"},
      {"fields:DcbIeeeEtsConfig",
        "Willing Bit In ETS Config TLV,Supported Capacity,Credit Based Shaper ETS Algorithm "
        "Supported,TX Bandwidth Per TC,RX Bandwidth Per TC,TSA Assignment Table Per TC,Priority "
        "Assignment Per TC,Recommended TC Bandwidth Per TC,Recommended TSA Assignment Per TC,"
        "Recommended Priority Assignment Per TC"},
      {"fields:DcbIeeePfcConfig",
        "Number Of Traffic Classes,PFC Configuration,Macsec Bypass Capability Is Enabled,Round "
        "Trip Propagation Delay Of Link,Sent PFC Frames,Received PFC Frames"},
      {"fields:DcbApps", "App Type,Protocol ID,User Priority"},
      {"fields:DcbCapabilities",
        "Priority Group,Priority Flow Control,PG Traffic Classes,PFC Traffic Classes"}}},
    {"network nic attachment add", &typeid(NicAttachmentAdd), Result::Boolean, "",
     "Attach one uplink as a branch to a trunk uplink with specified VLAN ID.",
     "", {}},
    {"network nic attachment remove", &typeid(NicAttachmentRemove), Result::Boolean, "",
     "Detach a branch uplink from its trunk.",
     "", {}},
    {"network nic attachment list", &typeid(NicAttachmentList),
     Result::StructureList, "AttachmentInfo",
     "Show uplink attachment information.",
     "table",
     {{"fields:AttachmentInfo", "Trunk,Branch,Branch MAC,VLAN ID"}}},
    {"network sriovnic list", &typeid(SriovNicList), Result::StructureList, "SriovNic",
     "This command will list the SRIOV Enabled NICs (PFs) currently installed and loaded on the "
     "system.",
     "table",
     {{"fields:SriovNic", "Name,PCI Device,Driver,Link,Speed,Duplex,MAC Address,MTU,Description"}}},
    {"network sriovnic vf list", &typeid(VfList), Result::StructureList, "VFList",
     "Get the generic configuration of VFs for SRIOV NIC.",
     "table",
     {{"fields:VFList", "VF ID,Active,PCI Address,Owner World ID"}}},
    {"network sriovnic vf stats", &typeid(VfStats), Result::StructureList, "VfStats",
     "Get statistics for given VF of a SRIOV NIC.",
     "simple",
     {{"header:VF", "Statistics for %vf% VF of %NIC Name%"},
      {"fields:VFStats",
        "Rx Unicast Pkt,Rx Unicast Bytes,Rx Multicast Pkts,Rx Multicast Bytes,Rx Broadcast Pkts,Rx "
        "Broadcast Bytes,Rx Out of Buffer drops,Rx Error drops,Rx LRO Pkts,Rx LRO Bytes,Tx Unicast "
        "Pkt,Tx Unicast Bytes,Tx Multicast Pkts,Tx Multicast Bytes,Tx Broadcast Pkts,Tx Broadcast "
        "Bytes,Tx Errors,Tx Discards,Tx TSO Pkts,Tx TSO Bytes"}}},
    {"network vswitch standard add", &typeid(VirtualSwitchStandardAdd), Result::Boolean, "",
     "Add a new virtual switch to the Ostra networking system.",
     "", {}},
    {"network vswitch standard set", &typeid(VirtualSwitchStandardSet), Result::Boolean, "",
     "This command sets the MTU size and CDP status of a given virtual switch.",
     "", {}},
    {"network vswitch standard list", &typeid(VirtualSwitchStandardList),
     Result::StructureList, "VirtualSwitch",
     "List the virtual switches current on the Ostra host.",
     "simple",
     {{"header:VirtualSwitch", "%Name%"},
      {"fields:VirtualSwitch",
        "Name,Class,Num Ports,Used Ports,Configured Ports,MTU,CDP Status,Beacon Enabled,Beacon "
        "Interval,Beacon Threshold,Beacon Required By,Uplinks,Portgroups"}}},
    {"network vswitch standard remove", &typeid(VirtualSwitchStandardRemove), Result::Boolean, "",
     "Remove a virtual switch from the Ostra networking system.",
     "", {}},
    {"network vswitch standard uplink add", &typeid(VirtualSwitchStandardUplinkAdd),
     Result::Boolean, "",
     "Add an uplink to the given virtual switch. Note if this virtual switch has a NIC teaming "
     "policy assigned to it then the policy must also be modified to enable use of this uplink on "
     "this virtual switch",
     "", {}},
    {"network vswitch standard uplink remove", &typeid(VirtualSwitchStandardUplinkRemove),
     Result::Boolean, "",
     "Remove an uplink from the given virtual switch. Note if this virtual switch has a NIC "
     "teaming policy assigned to it then the policy must also be modified to disable use of this "
     "uplink on this virtual switch",
     "", {}},
    {"network vswitch standard policy shaping get", &typeid(VirtualSwitchStandardPolicyShapingGet),
     Result::Structure, "VirtualSwitchTrafficShapingPolicy",
     "Get the shaping policy settings for the given virtual switch",
     "simple",
     {{"fields:VirtualSwitchTrafficShapingPolicy",
        "Enabled,Average Bandwidth,Peak Bandwidth,Burst Size"},
      {"header:VirtualSwitchTrafficShapingPolicy", "<NONE>"},
      {"units:VirtualSwitchTrafficShapingPolicy.Average Bandwidth", "Kbps"},
      {"units:VirtualSwitchTrafficShapingPolicy.Peak Bandwidth", "Kbps"},
      {"units:VirtualSwitchTrafficShapingPolicy.Burst Size", "Kib"}}},
    {"network vswitch standard policy shaping set", &typeid(VirtualSwitchStandardPolicyShapingSet),
     Result::Boolean, "",
     "Set the shaping policy settings for the given virtual switch",
     "", {}},
    {"network vswitch standard policy security get",
     &typeid(VirtualSwitchStandardPolicySecurityGet),
     Result::Structure, "VirtualSwitchSecurityPolicy",
     "Get the Security Policy governing the given virtual switch.",
     "simple",
     {{"fields:VirtualSwitchSecurityPolicy",
        "Allow Promiscuous,Allow MAC Address Change,Allow Forged Transmits"},
      {"header:VirtualSwitchSecurityPolicy", "<NONE>"}}},
    {"network vswitch standard policy security set",
     &typeid(VirtualSwitchStandardPolicySecuritySet),
     Result::Boolean, "",
     "Set the security policy for a given virtual switch",
     "", {}},
    {"network vswitch standard policy failover get",
     &typeid(VirtualSwitchStandardPolicyFailoverGet),
     Result::Structure, "VirtualSwitchFailoverPolicy",
     "Get the failover policy settings governing the given virtual switch",
     "simple",
     {{"fields:VirtualSwitchFailoverPolicy",
        "Load Balancing,Network Failure Detection,Notify Switches,Failback,Active Adapters,Standby "
        "Adapters,Unused Adapters"},
      {"header:VirtualSwitchFailoverPolicy", "<NONE>"}}},
    {"network vswitch standard policy failover set",
     &typeid(VirtualSwitchStandardPolicyFailoverSet),
     Result::Boolean, "",
     "Configure the Failover policy for a virtual switch.",
     "", {}},
    {"network vswitch standard portgroup list", &typeid(VirtualSwitchPortGroupList),
     Result::StructureList, "PortGroup",
     "List all of the port groups currently on the system.",
     "table",
     {{"fields:PortGroup", "Name,Virtual Switch,Active Clients,VLAN ID"}}},
    {"network vswitch standard portgroup add", &typeid(VirtualSwitchPortGroupAdd),
     Result::Boolean, "",
     "Allows the addition of a standard port group to a virtual switch.",
     "", {}},
    {"network vswitch standard portgroup remove", &typeid(VirtualSwitchPortGroupRemove),
     Result::Boolean, "",
     "Remove a port group from the given virtual switch",
     "", {}},
    {"network vswitch standard portgroup set", &typeid(VirtualSwitchPortGroupSet),
     Result::Boolean, "",
     "Set the vlan id for the given port group",
     "", {}},
    {"network vswitch standard portgroup policy shaping get",
     &typeid(VirtualSwitchPortGroupPolicyShapingGet),
     Result::Structure, "PortGroupTrafficShapingPolicy",
     "Get the network shaping policy settings governing the given port group",
     "simple",
     {{"fields:PortGroupTrafficShapingPolicy",
        "Enabled,Average Bandwidth,Peak Bandwidth,Burst Size,Override Vswitch Enabled,Override "
        "Vswitch Average Bandwidth,Override Vswitch Peak Bandwidth,Override Vswitch Burst Size"},
      {"header:PortGroupTrafficShapingPolicy", "<NONE>"},
      {"units:PortGroupTrafficShapingPolicy.Average Bandwidth", "Kbps"},
      {"units:PortGroupTrafficShapingPolicy.Peak Bandwidth", "Kbps"},
      {"units:PortGroupTrafficShapingPolicy.Burst Size", "Kib"}}},
    {"network vswitch standard portgroup policy shaping set",
     &typeid(VirtualSwitchPortGroupPolicyShapingSet),
     Result::Boolean, "",
     "Set the shaping policy settings for the given port group",
     "", {}},
    {"network vswitch standard portgroup policy failover get",
     &typeid(VirtualSwitchPortGroupPolicyFailoverGet),
     Result::Structure, "PortGroupFailoverPolicy",
     "Get the network failover policy settings governing the given port group",
     "simple",
     {{"fields:PortGroupFailoverPolicy",
        "Load Balancing,Network Failure Detection,Notify Switches,Failback,Active Adapters,Standby "
        "Adapters,Unused Adapters,Override Vswitch Load Balancing,Override Vswitch Network Failure "
        "Detection,Override Vswitch Notify Switches,Override Vswitch Failback,Override Vswitch "
        "Uplinks"},
      {"header:PortGroupFailoverPolicy", "<NONE>"}}},
    {"network vswitch standard portgroup policy failover set",
     &typeid(VirtualSwitchPortGroupPolicyFailoverSet),
     Result::Boolean, "",
     "Configure the Failover policy for a port group. These setting may potentially override "
     "virtual switch settings.",
     "", {}},
    {"network vswitch standard portgroup policy security get",
     &typeid(VirtualSwitchPortGroupPolicySecurityGet),
     Result::Structure, "PortGroupSecurityPolicy",
     "Get the Security Policy governing the given port group. ",
     "simple",
     {{"fields:PortGroupSecurityPolicy",
        "Allow Promiscuous,Allow MAC Address Change,Allow Forged Transmits,Override Vswitch Allow "
        "Promiscuous,Override Vswitch Allow MAC Address Change,Override Vswitch Allow Forged "
        "Transmits"},
      {"header:PortGroupSecurityPolicy", "<NONE>"}}},
    {"network vswitch standard portgroup policy security set",
     &typeid(VirtualSwitchPortGroupPolicySecuritySet),
     Result::Boolean, "",
     "Set the security policy for a given port group",
     "", {}},
    {"network vswitch dvs corvex list", &typeid(VirtualSwitchDVSCorvexList),
     Result::StructureList, "KRX",
     "List the Corvex Ambrel Distributed Switch currently configured on the Ostra host.",
     "simple",
     {{"header:KRX", "%Name%"},
      {"table-columns",
        "Name,KRX ID,Class,Num Ports,Used Ports,Configured Ports,MTU,CDP Status,Beacon Timeout,"
        "Uplinks,Corvex Branded,DVPort"}}},
    {"network firewall get", &typeid(FirewallGet), Result::Structure, "Firewall",
     "Get the firewall status.",
     "simple", {}},
    {"network firewall set", &typeid(FirewallSet), Result::Boolean, "",
     "Set firewall enabled status and default action.",
     "", {}},
    {"network firewall load", &typeid(FirewallLoad), Result::Boolean, "",
     "Load firewall module and rulesets configuration.",
     "", {}},
    {"network firewall refresh", &typeid(FirewallRefresh), Result::Boolean, "",
     "Load ruleset configuration for firewall.",
     "", {}},
    {"network firewall unload", &typeid(FirewallUnload), Result::Boolean, "",
     "Allow unload firewall module.",
     "", {}},
    {"network firewall ruleset list", &typeid(FirewallRulesetList),
     Result::StructureList, "Ruleset",
     "List the rulesets in firewall.",
     "table",
     {{"fields:Ruleset", "Name,Enabled,Enable/Disable configurable,Allowed IP configurable"}}},
    {"network firewall ruleset set", &typeid(FirewallRulesetSet), Result::Boolean, "",
     "Set firewall ruleset status (allowedAll flag and enabled status).",
     "", {}},
    {"network firewall ruleset client get", &typeid(FirewallRulesetClientGet),
     Result::Structure, "FirewallRulesetClientGet",
     "Show the number of clients using a firewall ruleset.",
     "simple",
     {{"fields:FirewallRulesetClientGet", "Ruleset Client Count"}}},
    {"network firewall ruleset client add", &typeid(FirewallRulesetClientAdd), Result::Boolean, "",
     "Add a new client to a firewall ruleset. This enables the firewall ruleset and increments the "
     "number of clients using the ruleset.",
     "", {}},
    {"network firewall ruleset client remove", &typeid(FirewallRulesetClientRemove),
     Result::Boolean, "",
     "Remove a client from a firewall ruleset. This decrements the number of clients using the "
     "ruleset and if the number reaches zero the ruleset is disabled.",
     "", {}},
    {"network firewall ruleset rule list", &typeid(FirewallRulesetRuleList),
     Result::StructureList, "FirewallPortRule",
     "List the rules of each ruleset in firewall.",
     "table",
     {{"fields:FirewallPortRule", "Ruleset,Direction,Protocol,Port Type,Port Begin,Port End"}}},
    {"network firewall ruleset allowedip list", &typeid(FirewallRulesetAllowedipList),
     Result::StructureList, "FirewallRulesetAllowedip",
     "List allowed IP addresses for rulesets.",
     "table",
     {{"fields:FirewallRulesetAllowedip", "Ruleset,Allowed IP Addresses"}}},
    {"network firewall ruleset allowedip add", &typeid(FirewallRulesetAllowedipAdd),
     Result::Boolean, "",
     "Add allowed IP address/range to the ruleset.",
     "", {}},
    {"network firewall ruleset allowedip remove", &typeid(FirewallRulesetAllowedipRemove),
     Result::Boolean, "",
     "Remove allowed IP address/range from the ruleset.",
     "", {}},
    {"network port stats get", &typeid(PortStatsGet), Result::StructureList, "Port",
     "Packet statistics for a given port.",
     "simple",
     {{"header:Port", "Packet statistics for port %Port ID%"},
      {"fields:Port",
        "Packets received,Packets sent,Bytes received,Bytes sent,Broadcast packets received,"
        "Broadcast packets sent,Multicast packets received,Multicast packets sent,Unicast packets "
        "received,Unicast packets sent,Receive packets dropped,Transmit packets dropped"}}},
    {"network port filter stats get", &typeid(PortFilterStatsGet), Result::StructureList, "Filter",
     "Filter statistics for a given port.",
     "simple",
     {{"header:Filter", "Filter statistics for %Filter name%"},
      {"fields:Filter",
        "Filter direction,Packets in,Packets out,Packets dropped,Packets filtered,Packets faulted,"
        "Packets queued,Packets injected,Packet errors"}}},
    {"network vm list", &typeid(VMList), Result::StructureList, "VM",
     "List networking information for the VM's that have active ports.",
     "table",
     {{"fields:VM", "World ID,Name,Num Ports,Networks"}}},
    {"network vm port list", &typeid(VMPortList), Result::StructureList, "Port",
     "List of active ports for a given VM.",
     "simple",
     {{"fields:Port",
        "Port ID,vSwitch,Portgroup,DVPort ID,MAC Address,IP Address,Team Uplink,Uplink Port ID,"
        "Active Filters"}}},
    {"network ens maxLcores get", &typeid(EnsMaxlcoresGet), Result::Integer, "",
     "Get the maximum number of ENS contexts (lcores).",
     "simple", {}},
    {"network ens maxLcores set", &typeid(EnsMaxlcoresSet), Result::Boolean, "",
     "Set the maximum number of ENS contexts.",
     "", {}},
    {"network ens lcore add", &typeid(EnsLcoreAdd), Result::Boolean, "",
     "Create ENS context.",
     "", {}},
    {"network ens lcore remove", &typeid(EnsLcoreRemove), Result::Boolean, "",
     "Destroy ENS context.",
     "", {}},
    {"network ens lcore list", &typeid(EnsLcoreList), Result::StructureList, "Ens",
     "List ENS contexts.",
     "table",
     {{"fields:Ens", "Lcore ID,Switch,Affinity"}}},
    {"network ens lcore switch get", &typeid(EnsLcoreSwitchGet), Result::String, "",
     "Get the switch associated with given ENS context.",
     "simple", {}},
    {"network ens lcore switch add", &typeid(EnsLcoreSwitchAdd), Result::Boolean, "",
     "Associate given ENS context with given switch.",
     "", {}},
    {"network ens lcore switch remove", &typeid(EnsLcoreSwitchRemove), Result::Boolean, "",
     "Disassociate given ENS context from virtual switch.",
     "", {}},
    {"network ens lcore affinity get", &typeid(EnsLcoreAffinityGet), Result::Integer, "",
     "Get the affinity for given ENS context.",
     "simple", {}},
    {"network ens lcore affinity set", &typeid(EnsLcoreAffinitySet), Result::Boolean, "",
     "Set affinity for given ENS context.",
     "", {}},
    {"network vswitch dvs corvex lacp config get", &typeid(LacpGetConfig),
     Result::StructureList, "LACP",
     "Get LACP configuration on DVS",
     "table",
     {{"fields:LACP", "DVS Name,LAG Name,LAG ID,NICs,Enabled,Mode,Load balance"}}},
    {"network vswitch dvs corvex lacp status get", &typeid(LacpGetStatus),
     Result::StructureList, "LAG",
     "Get LACP status on DVS",
     "simple",
     {{"header:LAG", "%DVSwitch%"},
      {"header:NicStatus", "<NONE>"},
      {"header:LocalInfo", "<NONE>"},
      {"header:PartnerInfo", "<NONE>"},
      {"table-columns:LAG", "DVSwitch,LAG ID,Mode,Age,Flags,Nic List"},
      {"table-columns:NicStatus", "Nic,State,Local Information,Partner Information"},
      {"table-columns:LocalInfo", "Flags,Admin Key,Oper Key,Port Priority,Port Number,Port State"},
      {"table-columns:PartnerInfo",
        "Device ID,Age,Flags,Oper Key,Port Priority,Port Number,Port State"}}},
    {"network vswitch dvs corvex lacp stats get", &typeid(LacpGetStats),
     Result::StructureList, "LACPStats",
     "Get LACP stats on DVS uplinks",
     "table",
     {{"fields:LACP", "Uplink, Tx LACPDUs, Tx Errors, Rx LACPDUs, Rx Errors"}}},
    {"network vswitch dvs corvex lacp timeout set", &typeid(LacpSetTimeout), Result::Boolean, "",
     "Set long/short timeout for vmnics in one LACP LAG",
     "", {}},
};
// clang-format on

/// The command whose description ends with the host library's tag names; only
/// its fixed beginning is known here.
const std::string TagAddPath = "network ip interface tag add";

/// Default output parameters that name a structure or field the result does not
/// have. They are the documented settings, kept as they stand.
const std::set<std::pair<std::string, std::string>> KnownUnmatchedParameters = {
    {"network ip interface tag get", "fields:IntefaceTag"},
    {"network multicast group list", "fields:Interface"},
    {"network sriovnic vf stats", "header:VF"},
    {"network sriovnic vf stats", "fields:VFStats"},
    {"network vswitch dvs corvex lacp stats get", "fields:LACP"},
    {"network vswitch dvs corvex lacp status get", "table-columns:LAG"},
};

std::string ParentPath(const std::string& path) {
  return path.substr(0, path.rfind(' '));
}

std::vector<std::string> Split(const std::string& text, char separator) {
  std::vector<std::string> parts;
  std::istringstream stream(text);
  for (std::string part; std::getline(stream, part, separator);)
    parts.push_back(part);
  return parts;
}

/// The field names of every structure in a result template, by structure name.
using StructureFields = std::map<std::string, std::set<std::string>>;

void CollectStructures(const MetaObjectPtr& value, StructureFields& out) {
  if (auto structure = std::dynamic_pointer_cast<MetaStruct>(value)) {
    auto& fields = out[structure->GetName()];
    for (std::size_t i = 0; i < structure->GetFieldCount(); ++i) {
      fields.insert(structure->GetFieldName(i));
      CollectStructures(structure->GetFieldValue(i).GetObject(), out);
    }
  } else if (auto list = std::dynamic_pointer_cast<MetaList>(value)) {
    if (list->GetElementTemplate())
      CollectStructures(list->GetElementTemplate(), out);
  }
}

/// The tree that AutoCli_RegisterNamespaces builds on a fresh root, with every
/// node below it indexed by path.
class RegistrationTest : public ::testing::Test {
protected:
  void SetUp() override {
    root = Fabrik::AutoCli::Namespace::New();
    AutoCli_RegisterNamespaces(root);
    ASSERT_TRUE(root->HasNamespaceNode("network"));
    Walk(root->GetNamespaceNode("network"), "network");
  }

  void Walk(const NamespaceNodePtr& node, const std::string& path) {
    ASSERT_NE(node, nullptr) << path;
    nodes[path] = node;
    if (node->GetType() == Fabrik::AutoCli::NamespaceKind)
      ++namespaceCount;
    else
      ++commandCount;
    for (const std::string& name : node->GetNamespaceNodeNames())
      Walk(node->GetNamespaceNode(name), path + " " + name);
  }

  NamespaceNodePtr Node(const std::string& path) const {
    auto found = nodes.find(path);
    return found == nodes.end() ? nullptr : found->second;
  }

  std::shared_ptr<CommandSpec> Command(const std::string& path) const {
    return std::dynamic_pointer_cast<CommandSpec>(Node(path));
  }

  NamespaceNodePtr root;                         ///< The host's root.
  std::map<std::string, NamespaceNodePtr> nodes; ///< Every node below it, by path.
  std::size_t namespaceCount = 0;                ///< Namespace nodes found.
  std::size_t commandCount = 0;                  ///< Command nodes found.
};

TEST_F(RegistrationTest, AttachesOnlyNetworkToTheRoot) {
  EXPECT_EQ(root->GetNamespaceNodeNames(), std::vector<std::string>{"network"});
  NamespaceNodePtr network = Node("network");
  EXPECT_EQ(network->GetName(), "network");
  EXPECT_EQ(network->GetParent(), root);
}

TEST_F(RegistrationTest, CreatesEveryNamespaceWithItsDescription) {
  EXPECT_EQ(namespaceCount, std::size(ExpectedNamespaces));
  for (const ExpectedNamespace& expected : ExpectedNamespaces) {
    SCOPED_TRACE(expected.path);
    NamespaceNodePtr node = Node(expected.path);
    ASSERT_NE(node, nullptr);
    EXPECT_EQ(node->GetType(), Fabrik::AutoCli::NamespaceKind);
    EXPECT_EQ(node->GetDescription(), expected.description);
  }
}

TEST_F(RegistrationTest, RegistersEveryCommandWithItsClassAndDefaultOutput) {
  EXPECT_EQ(commandCount, std::size(ExpectedCommands));
  for (const ExpectedCommand& expected : ExpectedCommands) {
    SCOPED_TRACE(expected.path);
    std::shared_ptr<CommandSpec> command = Command(expected.path);
    ASSERT_NE(command, nullptr);
    EXPECT_EQ(command->GetType(), Fabrik::AutoCli::CommandKind);
    EXPECT_TRUE(typeid(*command) == *expected.type) << typeid(*command).name();
    EXPECT_EQ(command->GetThis(), command) << "New() left the node without its own pointer";
    if (expected.path == TagAddPath)
      EXPECT_EQ(command->GetDescription().rfind(expected.description, 0), 0u);
    else
      EXPECT_EQ(command->GetDescription(), expected.description);
    EXPECT_EQ(command->GetDefaultOutputFormatter(), expected.formatter);
    EXPECT_EQ(command->GetDefaultOutputParameters(), expected.parameters);
  }
}

TEST_F(RegistrationTest, KeepsTheRegistrationOrderOfChildren) {
  EXPECT_EQ(Node("network")->GetNamespaceNodeNames(),
            (std::vector<std::string>{"ip", "multicast", "nic", "sriovnic", "vswitch", "firewall",
                                      "port", "vm", "ens"}));
  EXPECT_EQ(Node("network nic")->GetNamespaceNodeNames(),
            (std::vector<std::string>{"list",     "up",          "get",      "set",    "down",
                                      "stats",    "vlan",        "coalesce", "cso",    "tso",
                                      "sg",       "pauseParams", "register", "eeprom", "negotiate",
                                      "selftest", "queue",       "software", "ring",   "hwCap",
                                      "dcb",      "attachment"}));
  EXPECT_EQ(Node("network ip")->GetNamespaceNodeNames(),
            (std::vector<std::string>{"get", "set", "neighbor", "connection", "dns", "route",
                                      "ipsec", "interface", "netstack", "hosts"}));
  EXPECT_EQ(Node("network firewall")->GetNamespaceNodeNames(),
            (std::vector<std::string>{"get", "set", "load", "refresh", "unload", "ruleset"}));

  // Within every namespace, the commands come in the order of the table.
  std::map<std::string, std::vector<std::string>> expectedCommands;
  for (const ExpectedCommand& expected : ExpectedCommands) {
    std::string path = expected.path;
    expectedCommands[ParentPath(path)].push_back(path.substr(path.rfind(' ') + 1));
  }
  for (const auto& [parent, expected] : expectedCommands) {
    std::vector<std::string> registered;
    for (const NamespaceNodePtr& child : Node(parent)->GetNamespaceNodes()) {
      if (child->GetType() == Fabrik::AutoCli::CommandKind)
        registered.push_back(child->GetName());
    }
    EXPECT_EQ(registered, expected) << parent;
  }
}

TEST_F(RegistrationTest, RegistersIpv4GetTwiceAsDistinctObjects) {
  std::shared_ptr<CommandSpec> get = Command("network ip interface ipv4 get");
  std::shared_ptr<CommandSpec> list = Command("network ip interface ipv4 address list");
  ASSERT_NE(get, nullptr);
  ASSERT_NE(list, nullptr);
  EXPECT_NE(get, list);
  EXPECT_TRUE(typeid(*get) == typeid(IpInterfaceIpv4Get));
  EXPECT_TRUE(typeid(*list) == typeid(IpInterfaceIpv4Get));
  EXPECT_EQ(get->GetParent(), Node("network ip interface ipv4"));
  EXPECT_EQ(list->GetParent(), Node("network ip interface ipv4 address"));
  EXPECT_EQ(get->GetDescription(), list->GetDescription());
  EXPECT_EQ(get->GetDefaultOutputParameters(), list->GetDefaultOutputParameters());
}

TEST_F(RegistrationTest, NamesAreCaseSensitive) {
  NamespaceNodePtr nic = Node("network nic");
  EXPECT_TRUE(nic->HasNamespaceNode("hwCap"));
  EXPECT_FALSE(nic->HasNamespaceNode("hwcap"));
  EXPECT_FALSE(nic->HasNamespaceNode("HwCap"));
  EXPECT_TRUE(nic->HasNamespaceNode("pauseParams"));
  EXPECT_FALSE(nic->HasNamespaceNode("pauseparams"));
  EXPECT_TRUE(Node("network ens")->HasNamespaceNode("maxLcores"));
  EXPECT_FALSE(Node("network ens")->HasNamespaceNode("maxlcores"));
  EXPECT_FALSE(root->HasNamespaceNode("Network"));
}

TEST_F(RegistrationTest, OutputSpecificationsHaveTheResultKind) {
  for (const ExpectedCommand& expected : ExpectedCommands) {
    SCOPED_TRACE(expected.path);
    std::shared_ptr<CommandSpec> command = Command(expected.path);
    ASSERT_NE(command, nullptr);
    auto spec = command->GetOutputSpec();
    ASSERT_NE(spec, nullptr);
    const MetaObjectPtr& result = spec->GetRootObject();
    ASSERT_NE(result, nullptr);
    switch (expected.result) {
    case Result::Boolean:
      EXPECT_EQ(result->GetType(), Fabrik::MetaObj::Boolean);
      break;
    case Result::Integer:
      EXPECT_EQ(result->GetType(), Fabrik::MetaObj::Integer);
      break;
    case Result::String:
      EXPECT_EQ(result->GetType(), Fabrik::MetaObj::String);
      break;
    case Result::Structure: {
      auto structure = std::dynamic_pointer_cast<MetaStruct>(result);
      ASSERT_NE(structure, nullptr);
      EXPECT_EQ(structure->GetName(), expected.structure);
      EXPECT_NE(structure->GetFieldCount(), 0u);
      break;
    }
    case Result::StructureList: {
      auto list = std::dynamic_pointer_cast<MetaList>(result);
      ASSERT_NE(list, nullptr);
      EXPECT_EQ(list->GetElementType(), Fabrik::MetaObj::Struct);
      EXPECT_EQ(list->GetCount(), 0u);
      auto element = std::dynamic_pointer_cast<MetaStruct>(list->GetElementTemplate());
      ASSERT_NE(element, nullptr);
      EXPECT_EQ(element->GetName(), expected.structure);
      EXPECT_NE(element->GetFieldCount(), 0u);
      break;
    }
    }
  }
}

// The default output parameters name structures and fields of the result by
// text; a misspelt name would silently show nothing.
TEST_F(RegistrationTest, OutputParametersNameStructuresAndFieldsOfTheResult) {
  for (const ExpectedCommand& expected : ExpectedCommands) {
    SCOPED_TRACE(expected.path);
    std::shared_ptr<CommandSpec> command = Command(expected.path);
    ASSERT_NE(command, nullptr);
    StructureFields structures;
    CollectStructures(command->GetOutputSpec()->GetRootObject(), structures);

    for (const auto& [key, value] : command->GetDefaultOutputParameters()) {
      if (KnownUnmatchedParameters.count({expected.path, key}) != 0)
        continue;
      if (key == "wrap-last") {
        EXPECT_EQ(value, "true");
        continue;
      }
      std::size_t colon = key.find(':');
      std::string kind = key.substr(0, colon);
      std::string target = colon == std::string::npos ? expected.structure : key.substr(colon + 1);
      std::vector<std::string> fields;
      if (kind == "fields" || kind == "table-columns") {
        fields = Split(value, ',');
      } else if (kind == "header") {
        std::vector<std::string> pieces = Split(value, '%');
        for (std::size_t i = 1; i < pieces.size(); i += 2)
          fields.push_back(pieces[i]);
      } else if (kind == "units") {
        std::size_t dot = target.find('.');
        ASSERT_NE(dot, std::string::npos) << key;
        fields.push_back(target.substr(dot + 1));
        target = target.substr(0, dot);
      } else {
        ADD_FAILURE() << "unknown output parameter " << key;
        continue;
      }
      auto structure = structures.find(target);
      if (structure == structures.end()) {
        ADD_FAILURE() << key << " names no structure of the result";
        continue;
      }
      for (const std::string& field : fields)
        EXPECT_EQ(structure->second.count(field), 1u) << key << " names no field " << field;
    }
  }
}

} // namespace

namespace {

/// Commands whose last word is no "get" or "list" although they only read:
/// they print what the NIC holds or reports.
const std::set<std::string> kVerbExceptions = {
    "network nic eeprom dump",
    "network nic register dump",
    "network nic selftest run",
    "network sriovnic vf stats",
};

// The command host runs a command whose result is a boolean in a write
// transaction and every other command in a read transaction, where a change
// is refused. Across the whole tree, that must agree with what each command
// is for: "get" and "list" commands read, every other command acts.
TEST_F(RegistrationTest, EveryActionAndOnlyActionsRunInAWriteTransaction) {
  std::size_t actions = 0;
  for (const auto& [path, node] : nodes) {
    auto command = std::dynamic_pointer_cast<CommandSpec>(node);
    if (!command)
      continue;
    const std::string verb = path.substr(path.find_last_of(' ') + 1);
    const bool reads = verb == "get" || verb == "list";
    const bool changes = Ostra::ChangesHost(*command);
    actions += changes ? 1 : 0;
    EXPECT_EQ(changes, !reads != (kVerbExceptions.count(path) > 0)) << path;
  }
  EXPECT_GT(actions, 0u);
  EXPECT_LT(actions, commandCount);
}

} // namespace
