//===- LinuxNet/Xfrm.h - IPsec states and policies of the kernel ----------===//
//
// What `ip xfrm state` and `ip xfrm policy` show and change. Reading them
// needs CAP_NET_ADMIN: the kernel keeps keys in them.
//
//===----------------------------------------------------------------------===//
#pragma once

#include "LinuxNet/Ip.h"

#include <cstdint>
#include <string>
#include <vector>

namespace LinuxNet {

class Namespace;

/// IPsec protocols.
enum : uint8_t { XfrmEsp = 50, XfrmAh = 51 };
/// Modes (XFRM_MODE_*).
enum : uint8_t { XfrmTransport = 0, XfrmTunnel = 1 };
/// Policy directions (XFRM_POLICY_*).
enum : uint8_t { XfrmIn = 0, XfrmOut = 1, XfrmFwd = 2 };
/// Policy actions.
enum : uint8_t { XfrmAllow = 0, XfrmBlock = 1 };

/// Traffic a state or policy applies to.
struct XfrmSelector {
  IpPrefix source;              ///< Source network.
  IpPrefix destination;         ///< Destination network.
  uint16_t sourcePort = 0;      ///< 0: any.
  uint16_t destinationPort = 0; ///< 0: any.
  uint8_t protocol = 0;         ///< Upper-layer protocol; 0: any.
  int ifindex = 0;              ///< Interface; 0: any.
};

/// A cipher or integrity algorithm with its key.
struct XfrmAlgorithm {
  std::string name;            ///< Kernel name ("cbc(aes)", "hmac(sha256)"); empty for none.
  std::vector<uint8_t> key;    ///< Key bytes.
  uint32_t truncationBits = 0; ///< Integrity: truncated ICV length; 0 for the default.
};

/// One security association.
struct XfrmState {
  IpAddress source;             ///< Outer source.
  IpAddress destination;        ///< Outer destination.
  uint32_t spi = 0;             ///< Security parameter index (host order).
  uint8_t protocol = XfrmEsp;   ///< XfrmEsp or XfrmAh.
  uint8_t mode = XfrmTransport; ///< XfrmTransport or XfrmTunnel.
  uint32_t reqid = 0;           ///< Request id tying it to policies.
  XfrmAlgorithm encryption;     ///< Cipher.
  XfrmAlgorithm integrity;      ///< Integrity algorithm.
  uint64_t softLifetime = 0;    ///< Seconds after adding until renegotiation; 0 for none.
  uint64_t hardLifetime = 0;    ///< Seconds after adding until removal; 0 for none.
  XfrmSelector selector;        ///< Traffic; empty for any.
};

/// One template of a policy: the state traffic must pass.
struct XfrmTemplate {
  IpAddress source, destination; ///< Tunnel end points (tunnel mode).
  uint8_t protocol = XfrmEsp;    ///< XfrmEsp or XfrmAh.
  uint8_t mode = XfrmTransport;  ///< Mode.
  uint32_t spi = 0;              ///< 0: any.
  uint32_t reqid = 0;            ///< 0: any.
  bool optional = false;         ///< "level use" rather than "level required".
};

/// One security policy.
struct XfrmPolicy {
  XfrmSelector selector;               ///< Traffic.
  uint8_t direction = XfrmOut;         ///< XfrmIn, XfrmOut or XfrmFwd.
  uint8_t action = XfrmAllow;          ///< XfrmAllow or XfrmBlock.
  uint32_t priority = 0;               ///< Lower wins.
  uint32_t index = 0;                  ///< The kernel's id (read only; set when listed).
  std::vector<XfrmTemplate> templates; ///< States the traffic needs.
};

std::vector<XfrmState> ListXfrmStates(Namespace& ns);
/// Adds a state; refuses an existing one (same destination, SPI, protocol).
void AddXfrmState(Namespace& ns, const XfrmState& state);
void DeleteXfrmState(Namespace& ns, const IpAddress& destination, uint32_t spi, uint8_t protocol);

std::vector<XfrmPolicy> ListXfrmPolicies(Namespace& ns);
/// Adds a policy; refuses one with the same selector and direction.
void AddXfrmPolicy(Namespace& ns, const XfrmPolicy& policy);
/// Deletes the policy of that selector and direction.
void DeleteXfrmPolicy(Namespace& ns, const XfrmSelector& selector, uint8_t direction);

} // namespace LinuxNet
