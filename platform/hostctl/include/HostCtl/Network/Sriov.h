//===- HostCtl/Network/Sriov.h - Records of SR-IOV virtual functions ------===//
//
// The records NetworkInfo hands out for the virtual functions (VFs) of an
// SR-IOV enabled physical NIC: one information entry per VF and the packet
// counters of one VF. Callers zero-fill (value-initialise) them before a Get.
//
//===----------------------------------------------------------------------===//
#pragma once

#include <cstdint>
#include <string>

namespace HostCtl::Network {

/// One virtual function of an SR-IOV NIC.
struct SriovNicVFInfo {
  uint8_t vfId = 0;         ///< VF ID, from 0.
  bool active = false;      ///< The VF is in use by a world.
  std::string pciAddress;   ///< PCI address of the VF.
  std::string ownerWorldId; ///< World that owns the VF (empty when none).
};

/// Packet counters of one virtual function, in record order.
struct SriovNicVFStats {
  uint64_t rxUnicastPkts = 0;      ///< Unicast packets received.
  uint64_t rxUnicastBytes = 0;     ///< Unicast bytes received.
  uint64_t rxMulticastPkts = 0;    ///< Multicast packets received.
  uint64_t rxMulticastBytes = 0;   ///< Multicast bytes received.
  uint64_t rxBroadcastPkts = 0;    ///< Broadcast packets received.
  uint64_t rxBroadcastBytes = 0;   ///< Broadcast bytes received.
  uint64_t rxOutOfBufferDrops = 0; ///< Received packets dropped for want of buffers.
  uint64_t rxErrorDrops = 0;       ///< Received packets dropped for errors.
  uint64_t rxLroPkts = 0;          ///< Packets made by large receive offload.
  uint64_t rxLroBytes = 0;         ///< Bytes of those packets.
  uint64_t txUnicastPkts = 0;      ///< Unicast packets sent.
  uint64_t txUnicastBytes = 0;     ///< Unicast bytes sent.
  uint64_t txMulticastPkts = 0;    ///< Multicast packets sent.
  uint64_t txMulticastBytes = 0;   ///< Multicast bytes sent.
  uint64_t txBroadcastPkts = 0;    ///< Broadcast packets sent.
  uint64_t txBroadcastBytes = 0;   ///< Broadcast bytes sent.
  uint64_t txErrors = 0;           ///< Transmit errors.
  uint64_t txDiscards = 0;         ///< Packets discarded on transmit.
  uint64_t txTsoPkts = 0;          ///< Packets sent with segmentation offload.
  uint64_t txTsoBytes = 0;         ///< Bytes of those packets.
};

} // namespace HostCtl::Network
