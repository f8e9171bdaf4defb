//===- LinuxNet/Links.h - Links: listing, changing, veth pairs, bridges ---===//
//
// A link is what `ip link` shows: a device of the namespace with its name,
// index, kind, state, addresses, counters and, for SR-IOV devices, its
// virtual functions. Lists come from one rtnetlink dump; changes are one
// request each.
//
//===----------------------------------------------------------------------===//
#pragma once

#include "LinuxNet/Ip.h"

#include <cstdint>
#include <optional>
#include <span>
#include <string>
#include <vector>

namespace LinuxNet {

class Namespace;

/// The 64-bit counters of a link (IFLA_STATS64), in the kernel's order.
struct LinkStats {
  uint64_t rxPackets = 0, txPackets = 0, rxBytes = 0, txBytes = 0;
  uint64_t rxErrors = 0, txErrors = 0, rxDropped = 0, txDropped = 0;
  uint64_t multicast = 0, collisions = 0;
  uint64_t rxLengthErrors = 0, rxOverErrors = 0, rxCrcErrors = 0, rxFrameErrors = 0;
  uint64_t rxFifoErrors = 0, rxMissedErrors = 0;
  uint64_t txAbortedErrors = 0, txCarrierErrors = 0, txFifoErrors = 0;
  uint64_t txHeartbeatErrors = 0, txWindowErrors = 0;
  uint64_t rxCompressed = 0, txCompressed = 0, rxNoHandler = 0;
};

/// One virtual function of an SR-IOV device (IFLA_VFINFO_LIST).
struct VfInfo {
  uint32_t index = 0;     ///< VF number, from 0.
  HwAddress mac;          ///< Its MAC address.
  uint32_t vlan = 0;      ///< Port VLAN; 0 for none.
  uint32_t qos = 0;       ///< 802.1p priority of the port VLAN.
  uint32_t minTxRate = 0; ///< Mbps; 0 for no limit.
  uint32_t maxTxRate = 0; ///< Mbps; 0 for no limit.
  int spoofCheck = -1;    ///< 1 on, 0 off, -1 not reported.
  int trust = -1;         ///< 1 on, 0 off, -1 not reported.
  uint32_t linkState = 0; ///< 0 auto, 1 enable, 2 disable (IFLA_VF_LINK_STATE_*).
  bool hasStats = false;  ///< The counters below were reported.
  uint64_t rxPackets = 0, txPackets = 0, rxBytes = 0, txBytes = 0;
  uint64_t broadcast = 0, multicast = 0, rxDropped = 0, txDropped = 0;
};

/// Operational states (RFC 2863, IF_OPER_*).
enum class OperState : uint8_t {
  Unknown = 0,
  NotPresent = 1,
  Down = 2,
  LowerLayerDown = 3,
  Testing = 4,
  Dormant = 5,
  Up = 6,
};

/// One link.
struct Link {
  int index = 0;         ///< Interface index.
  std::string name;      ///< Interface name.
  std::string kind;      ///< IFLA_INFO_KIND ("veth", "bridge"); empty for plain devices.
  std::string slaveKind; ///< IFLA_INFO_SLAVE_KIND ("bridge" for a bridge port).
  int master = 0;        ///< Index of the master (bridge); 0 for none.
  int link = 0;          ///< IFLA_LINK: the peer of a veth, the lower device of a macvlan.
  bool linkInOtherNamespace = false;        ///< `link` is an index of another namespace.
  uint32_t flags = 0;                       ///< IFF_* flags.
  bool adminUp = false;                     ///< IFF_UP.
  bool lowerUp = false;                     ///< IFF_LOWER_UP.
  bool carrier = false;                     ///< IFLA_CARRIER.
  OperState operState = OperState::Unknown; ///< IFLA_OPERSTATE.
  uint16_t type = 0;                        ///< ARPHRD_* (1 Ethernet, 772 loopback).
  uint32_t mtu = 0, minMtu = 0, maxMtu = 0; ///< MTU and its bounds.
  HwAddress address;                        ///< Hardware address.
  HwAddress broadcast;                      ///< Hardware broadcast address.
  HwAddress permAddress;      ///< Permanent address (IFLA_PERM_ADDRESS), if the device has one.
  std::string alias;          ///< IFLA_IFALIAS.
  std::string qdisc;          ///< Root queueing discipline.
  uint32_t txQueueLength = 0; ///< IFLA_TXQLEN.
  uint32_t numTxQueues = 0, numRxQueues = 0; ///< Queue counts.
  std::string parentDevice;          ///< IFLA_PARENT_DEV_NAME ("0000:3b:00.0"); empty without one.
  std::string parentBus;             ///< IFLA_PARENT_DEV_BUS_NAME ("pci", "usb", "virtio").
  std::vector<std::string> altNames; ///< Alternative names.
  bool hasStats = false;             ///< `stats` was reported.
  LinkStats stats;                   ///< Counters.
  uint32_t numVfs = 0;               ///< IFLA_NUM_VF.
  std::vector<VfInfo> vfs;           ///< Filled when asked for (ListLinks withVfs).
};

/// Every link of the namespace, by index. \p withVfs asks the kernel for
/// virtual-function information as well (larger replies on SR-IOV devices).
std::vector<Link> ListLinks(Namespace& ns, bool withVfs = false);
/// The link of that name, or nullopt.
std::optional<Link> GetLink(Namespace& ns, const std::string& name, bool withVfs = true);

/// What ChangeLink changes; unset members stay as they are.
struct LinkChange {
  std::optional<bool> up;            ///< Administrative state.
  std::optional<uint32_t> mtu;       ///< MTU.
  std::optional<HwAddress> address;  ///< Hardware address.
  std::optional<std::string> alias;  ///< Alias; "" removes it.
  std::optional<std::string> master; ///< Master link by name; "" detaches.
  std::optional<std::string> name;   ///< New name.
};
/// Applies \p change to link \p name in one request.
void ChangeLink(Namespace& ns, const std::string& name, const LinkChange& change);

/// Creates a veth pair \p name / \p peer (both in this namespace).
void CreateVeth(Namespace& ns, const std::string& name, const std::string& peer);
/// Creates a bridge; \p mtu 0 keeps the kernel's default.
void CreateBridge(Namespace& ns, const std::string& name, uint32_t mtu = 0);
/// Deletes a link (a veth takes its peer along).
void DeleteLink(Namespace& ns, const std::string& name);
/// Makes \p port a port of \p bridge.
void AddBridgePort(Namespace& ns, const std::string& bridge, const std::string& port);
/// Takes \p port out of its bridge; refused when it is in none.
void RemoveBridgePort(Namespace& ns, const std::string& port);
/// The names of the ports of \p bridge, by index.
std::vector<std::string> BridgePorts(Namespace& ns, const std::string& bridge);

/// Reads one RTM_NEWLINK message (netlink header, ifinfomsg, attributes) as
/// ListLinks does: for messages recorded from devices this host lacks.
Link ParseLinkMessage(std::span<const uint8_t> message);

/// Text of an operational state as `ip` prints it ("UP", "LOWERLAYERDOWN").
const char* OperStateName(OperState state);

} // namespace LinuxNet
