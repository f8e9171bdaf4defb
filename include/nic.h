//===- nic.h - Physical NIC command classes -------------------------------===//
//
// The command classes of `network nic` and `network sriovnic`: one block per
// class, grouped by family in the order of the family source files of
// src/nic/. Each class is defined in its family file.
//
//===----------------------------------------------------------------------===//
#pragma once

#include "CommandBase.h"

namespace HostCtl::Network {
struct PnicInfo;
} // namespace HostCtl::Network

namespace CorvexCli::NetworkNamespace {

// NIC list (NicList.cpp).

/// network nic list
class NicList : public virtual Fabrik::AutoCli::Command {
  CORVEX_COMMAND(NicList)
  CORVEX_OUTPUT_STRUCTURE
};

// NIC information, link state and negotiation (NicInfo.cpp).

/// network nic get
class NicGet : public virtual Fabrik::AutoCli::Command {
  CORVEX_COMMAND(NicGet)
  CORVEX_OUTPUT_STRUCTURE
  /// The template of the "Driver Info" structure ("NICDriverInfo").
  std::shared_ptr<Fabrik::MetaObj::MetaStruct> GetDriverInfoStructure();
};

/// network nic set
class NicSet : public virtual Fabrik::AutoCli::Command {
  CORVEX_COMMAND(NicSet)
  /// Merges the optional parameters of \p input into \p info (read from the
  /// host), sets the changed flags, and tells whether anything is to be
  /// applied. A bad value throws HostCtl::Lib::HostCtlException.
  bool GetInfoFromParam(const std::shared_ptr<Fabrik::CallSpec::Input>& input,
                        HostCtl::Network::PnicInfo& info);
};

/// network nic up
class NicUp : public virtual Fabrik::AutoCli::Command {
  CORVEX_COMMAND(NicUp)
};

/// network nic down
class NicDown : public virtual Fabrik::AutoCli::Command {
  CORVEX_COMMAND(NicDown)
};

/// network nic negotiate restart
class NicNegotiationRestart : public virtual Fabrik::AutoCli::Command {
  CORVEX_COMMAND(NicNegotiationRestart)
};

// NIC and VLAN statistics (NicStats.cpp).

/// network nic stats get
class NicStatsGet : public virtual Fabrik::AutoCli::Command {
  CORVEX_COMMAND(NicStatsGet)
  CORVEX_OUTPUT_STRUCTURE
};

/// network nic vlan stats get
class NicVlanStatsGet : public virtual Fabrik::AutoCli::Command {
  CORVEX_COMMAND(NicVlanStatsGet)
  CORVEX_OUTPUT_STRUCTURE
};

/// network nic vlan stats set
class NicVlanStatsSet : public virtual Fabrik::AutoCli::Command {
  CORVEX_COMMAND(NicVlanStatsSet)
};

// SR-IOV NICs and virtual functions (Sriov.cpp).

/// network sriovnic list
class SriovNicList : public virtual Fabrik::AutoCli::Command {
  CORVEX_COMMAND(SriovNicList)
  CORVEX_OUTPUT_STRUCTURE
};

/// network sriovnic vf list
class VfList : public virtual Fabrik::AutoCli::Command {
  CORVEX_COMMAND(VfList)
  CORVEX_OUTPUT_STRUCTURE
};

/// network sriovnic vf stats
class VfStats : public virtual Fabrik::AutoCli::Command {
  CORVEX_COMMAND(VfStats)
  CORVEX_OUTPUT_STRUCTURE
};

// Uplink attachments (Attachment.cpp).

/// network nic attachment add
class NicAttachmentAdd : public Fabrik::AutoCli::Command {
  CORVEX_COMMAND(NicAttachmentAdd)
};

/// network nic attachment list
class NicAttachmentList : public Fabrik::AutoCli::Command {
  CORVEX_COMMAND(NicAttachmentList)
  CORVEX_OUTPUT_STRUCTURE
};

/// network nic attachment remove
class NicAttachmentRemove : public Fabrik::AutoCli::Command {
  CORVEX_COMMAND(NicAttachmentRemove)
};

// Checksum, segmentation and scatter-gather offloads (Offload.cpp).

/// network nic cso get
class NicCsoGet : public virtual Fabrik::AutoCli::Command {
  CORVEX_COMMAND(NicCsoGet)
  CORVEX_OUTPUT_STRUCTURE
};

/// network nic cso set
class NicCsoSet : public virtual Fabrik::AutoCli::Command {
  CORVEX_COMMAND(NicCsoSet)
};

/// network nic tso get
class NicTsoGet : public virtual Fabrik::AutoCli::Command {
  CORVEX_COMMAND(NicTsoGet)
  CORVEX_OUTPUT_STRUCTURE
};

/// network nic tso set
class NicTsoSet : public virtual Fabrik::AutoCli::Command {
  CORVEX_COMMAND(NicTsoSet)
};

/// network nic sg get
class NicSgGet : public virtual Fabrik::AutoCli::Command {
  CORVEX_COMMAND(NicSgGet)
  CORVEX_OUTPUT_STRUCTURE
};

/// network nic sg set
class NicSgSet : public virtual Fabrik::AutoCli::Command {
  CORVEX_COMMAND(NicSgSet)
};

// Interrupt coalescing (Coalesce.cpp).

/// network nic coalesce get
class NicCoalesceGet : public virtual Fabrik::AutoCli::Command {
  CORVEX_COMMAND(NicCoalesceGet)
  CORVEX_OUTPUT_STRUCTURE
};

/// network nic coalesce set
class NicCoalesceSet : public virtual Fabrik::AutoCli::Command {
  CORVEX_COMMAND(NicCoalesceSet)
};

/// network nic coalesce high get
class NicCoalesceHighGet : public virtual Fabrik::AutoCli::Command {
  CORVEX_COMMAND(NicCoalesceHighGet)
  CORVEX_OUTPUT_STRUCTURE
};

/// network nic coalesce high set
class NicCoalesceHighSet : public virtual Fabrik::AutoCli::Command {
  CORVEX_COMMAND(NicCoalesceHighSet)
};

/// network nic coalesce low get
class NicCoalesceLowGet : public virtual Fabrik::AutoCli::Command {
  CORVEX_COMMAND(NicCoalesceLowGet)
  CORVEX_OUTPUT_STRUCTURE
};

/// network nic coalesce low set
class NicCoalesceLowSet : public virtual Fabrik::AutoCli::Command {
  CORVEX_COMMAND(NicCoalesceLowSet)
};

// Rings and pause parameters (Ring.cpp).

/// network nic ring preset get
class NicRingPresetGet : public virtual Fabrik::AutoCli::Command {
  CORVEX_COMMAND(NicRingPresetGet)
  CORVEX_OUTPUT_STRUCTURE
};

/// network nic ring current get
class NicRingCurrentGet : public virtual Fabrik::AutoCli::Command {
  CORVEX_COMMAND(NicRingCurrentGet)
  CORVEX_OUTPUT_STRUCTURE
};

/// network nic ring current set
class NicRingCurrentSet : public virtual Fabrik::AutoCli::Command {
  CORVEX_COMMAND(NicRingCurrentSet)
};

/// network nic pauseParams list
class NicPauseParamsList : public virtual Fabrik::AutoCli::Command {
  CORVEX_COMMAND(NicPauseParamsList)
  CORVEX_OUTPUT_STRUCTURE
};

/// network nic pauseParams set
class NicPauseParamsSet : public virtual Fabrik::AutoCli::Command {
  CORVEX_COMMAND(NicPauseParamsSet)
};

// NetQueue count, filter classes and load balancer (Netqueue.cpp).

/// network nic queue count get
class NicQueueCountGet : public virtual Fabrik::AutoCli::Command {
  CORVEX_COMMAND(NicQueueCountGet)
  CORVEX_OUTPUT_STRUCTURE
};

/// network nic queue count set
class NicQueueCountSet : public virtual Fabrik::AutoCli::Command {
  CORVEX_COMMAND(NicQueueCountSet)
};

/// network nic queue filterclass list
class NicQueueFilterClassList : public virtual Fabrik::AutoCli::Command {
  CORVEX_COMMAND(NicQueueFilterClassList)
  CORVEX_OUTPUT_STRUCTURE
};

/// network nic queue loadbalancer list
class NicQueueLbSettingList : public virtual Fabrik::AutoCli::Command {
  CORVEX_COMMAND(NicQueueLbSettingList)
  CORVEX_OUTPUT_STRUCTURE
};

/// network nic queue loadbalancer set
class NicQueueLbSettingSet : public virtual Fabrik::AutoCli::Command {
  CORVEX_COMMAND(NicQueueLbSettingSet)
};

/// network nic queue loadbalancer state list
class NicQueueLbStateList : public virtual Fabrik::AutoCli::Command {
  CORVEX_COMMAND(NicQueueLbStateList)
  CORVEX_OUTPUT_STRUCTURE
};

/// network nic queue loadbalancer state set
class NicQueueLbStateSet : public virtual Fabrik::AutoCli::Command {
  CORVEX_COMMAND(NicQueueLbStateSet)
};

/// network nic queue loadbalancer plugin list
class NicQueueLbPluginList : public virtual Fabrik::AutoCli::Command {
  CORVEX_COMMAND(NicQueueLbPluginList)
  CORVEX_OUTPUT_STRUCTURE
};

/// network nic queue loadbalancer plugin set
class NicQueueLbPluginSet : public virtual Fabrik::AutoCli::Command {
  CORVEX_COMMAND(NicQueueLbPluginSet)
};

// Software simulation of offloads (Software.cpp).

/// network nic software list
class NicSoftwareList : public virtual Fabrik::AutoCli::Command {
  CORVEX_COMMAND(NicSoftwareList)
  CORVEX_OUTPUT_STRUCTURE
};

/// network nic software set
class NicSoftwareSet : public virtual Fabrik::AutoCli::Command {
  CORVEX_COMMAND(NicSoftwareSet)
};

// EEPROM, registers and self test (Diagnostics.cpp).

/// network nic eeprom dump
class NicEepromDump : public virtual Fabrik::AutoCli::Command {
  CORVEX_COMMAND(NicEepromDump)
  CORVEX_OUTPUT_STRUCTURE
};

/// network nic eeprom change
class NicEepromChange : public virtual Fabrik::AutoCli::Command {
  CORVEX_COMMAND(NicEepromChange)
};

/// network nic register dump
class NicRegisterDump : public virtual Fabrik::AutoCli::Command {
  CORVEX_COMMAND(NicRegisterDump)
  CORVEX_OUTPUT_STRUCTURE
};

/// network nic selftest run
class NicSelfTestRun : public virtual Fabrik::AutoCli::Command {
  CORVEX_COMMAND(NicSelfTestRun)
  CORVEX_OUTPUT_STRUCTURE
};

// DCB status (Dcb.cpp).

/// network nic dcb status get
class NicDcbStatusGet : public Fabrik::AutoCli::Command {
  CORVEX_COMMAND(NicDcbStatusGet)
  CORVEX_OUTPUT_STRUCTURE
};

// Hardware capabilities (HwCap.cpp).

/// network nic hwCap supported list
class NicHwCapSupportedList : public Fabrik::AutoCli::Command {
  CORVEX_COMMAND(NicHwCapSupportedList)
  CORVEX_OUTPUT_STRUCTURE
};

/// network nic hwCap activated list
class NicHwCapActivatedList : public Fabrik::AutoCli::Command {
  CORVEX_COMMAND(NicHwCapActivatedList)
  CORVEX_OUTPUT_STRUCTURE
};

} // namespace CorvexCli::NetworkNamespace
