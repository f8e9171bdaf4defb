//===- model/Parts.cpp - The list of model parts ---------------------------===//
//
// Parts import in this order, so a part may refer to rows of the parts listed
// before it (kernel interfaces refer to port groups, VMs to switches, ...).
//
//===----------------------------------------------------------------------===//
#include "model/Part.h"

namespace Model {

extern const Part kCorePart;

// Physical NICs: information, counters, SR-IOV, attachments.
extern const Part kNicPart;

// NIC hardware settings.
extern const Part kNicHwPart;

// Switching: standard and distributed switches, port groups, policies, LACP.
extern const Part kSwitchingPart;

// IP: netstacks, kernel interfaces, addresses, tags, multicast.
extern const Part kIpPart;

// IP services: routes, DNS, hosts, neighbours, connections, IPsec.
extern const Part kIpServicesPart;

// Datapath: VMs and their ports, port statistics, ENS.
extern const Part kDatapathPart;

// Firewall.
extern const Part kFirewallPart;

const std::vector<const Part*>& AllParts() {
  static const std::vector<const Part*> parts = {
      &kCorePart,

      // Physical NICs.
      &kNicPart,

      // NIC hardware settings.
      &kNicHwPart,

      // Switching.
      &kSwitchingPart,

      // IP.
      &kIpPart,

      // IP services.
      &kIpServicesPart,

      // Datapath.
      &kDatapathPart,

      // Firewall.
      &kFirewallPart,

  };
  return parts;
}

} // namespace Model
