//===- NicStats.cpp - NIC and VLAN statistics -----------------------------===//
//
// network nic stats get, vlan stats get and vlan stats set: the packet
// counters of one physical NIC, and the per-VLAN counters of a NIC that is an
// uplink of a virtual switch.
//
//===----------------------------------------------------------------------===//
#include "common/FieldTable.h"
#include "nic.h"

#include "Fabrik/Call.h"
#include "Fabrik/MetaObj.h"
#include "HostCtl/Lib.h"
#include "HostCtl/Network/PnicRecords.h"
#include "HostCtl/Network/Switching.h"
#include "TvkCtl/Network/PnicImpl.h"
#include "TvkCtl/Network/Switching.h"
#include "common/ParameterTable.h"

#include <algorithm>

namespace CorvexCli::NetworkNamespace {

using namespace Fabrik;
using HostCtl::Lib::HostCtlException;
using HostCtl::Network::PnicStats;

namespace {

const std::string kNicName = "nic-name";
const std::string kEnabled = "enabled";
const std::string kNicNameDescription = "Name of the NIC to get statistics from.";

const std::string kNic = "Nic";
const std::string kNicNameField = "NIC Name";
const std::string kVlanNic = "NIC";
const std::string kVlanIdField = "VLAN ID";
const std::string kPacketsReceived = "Packets received";
const std::string kPacketsSent = "Packets sent";
const std::string kNotConnected = " is not a valid NIC connected to any virtual switch.";

/// The counters of "Nic", in field order.
struct NicCounter {
  const char* field;          ///< Field name.
  uint64_t PnicStats::*value; ///< Counter of the record.
};
const NicCounter kNicCounters[] = {
    {"Packets received", &PnicStats::rxPackets},
    {"Packets sent", &PnicStats::txPackets},
    {"Bytes received", &PnicStats::rxBytes},
    {"Bytes sent", &PnicStats::txBytes},
    {"Receive packets dropped", &PnicStats::rxDropped},
    {"Transmit packets dropped", &PnicStats::txDropped},
    {"Multicast packets received", &PnicStats::rxMulticast},
    {"Broadcast packets received", &PnicStats::rxBroadcast},
    {"Multicast packets sent", &PnicStats::txMulticast},
    {"Broadcast packets sent", &PnicStats::txBroadcast},
    {"Total receive errors", &PnicStats::rxErrors},
    {"Receive length errors", &PnicStats::rxLengthErrors},
    {"Receive over errors", &PnicStats::rxOverErrors},
    {"Receive CRC errors", &PnicStats::rxCrcErrors},
    {"Receive frame errors", &PnicStats::rxFrameErrors},
    {"Receive FIFO errors", &PnicStats::rxFifoErrors},
    {"Receive missed errors", &PnicStats::rxMissedErrors},
    {"Total transmit errors", &PnicStats::txErrors},
    {"Transmit aborted errors", &PnicStats::txAbortedErrors},
    {"Transmit carrier errors", &PnicStats::txCarrierErrors},
    {"Transmit FIFO errors", &PnicStats::txFifoErrors},
    {"Transmit heartbeat errors", &PnicStats::txHeartbeatErrors},
    {"Transmit window errors", &PnicStats::txWindowErrors},
};

/// The one parameter of the commands that read one NIC's counters.
const ParameterDef kNicNameParameters[] = {
    {kNicName, "n", CallSpec::String, true, kNicNameDescription},
};

/// The first switch, in the host's order, that has \p nic as an uplink.
std::unique_ptr<HostCtl::Network::Portset>
FindUplinkSwitch(TvkCtl::Network::VirtualSwitchInfoImpl& switches, const std::string& nic) {
  for (auto& portset : switches.GetAllSwitches()) {
    if (!portset)
      continue;
    std::vector<std::string> uplinks = portset->GetUplinks();
    if (std::find(uplinks.begin(), uplinks.end(), nic) != uplinks.end())
      return std::move(portset);
  }
  return nullptr;
}

} // namespace

// network nic stats get

CORVEX_DEFINE_NEW(NicStatsGet)

NicStatsGet::NicStatsGet() {
  SetDescription("Get NIC statistics for a given interface.");
  SetDefaultOutputFormatter("simple");
  SetDefaultOutputParameter("header:" + kNic, "NIC statistics for %" + kNicNameField + "%");
  std::string fields;
  for (const NicCounter& counter : kNicCounters)
    fields += (fields.empty() ? "" : ",") + std::string(counter.field);
  SetDefaultOutputParameter("fields:" + kNic, fields);
}

NicStatsGet::~NicStatsGet() = default;

std::shared_ptr<MetaObj::MetaStruct> NicStatsGet::GetOutputStructure() {
  auto structure = MetaObj::MetaStruct::New(kNic);
  structure->SetField(kNicNameField, MetaObj::MetaString::New());
  for (const NicCounter& counter : kNicCounters)
    structure->SetField(counter.field, MetaObj::MetaInt::New());
  return structure;
}

std::shared_ptr<CallSpec::InputSpec> NicStatsGet::GetInputSpecInternal() {
  return MakeInputSpec(kNicNameParameters);
}

std::shared_ptr<CallSpec::OutputSpec> NicStatsGet::GetOutputSpecInternal() {
  return ListResultSpec(GetOutputStructure());
}

void NicStatsGet::ExecuteInternal(const std::shared_ptr<CallSpec::Input>& input,
                                  const std::shared_ptr<CallSpec::Output>& output) {
  try {
    auto list = MetaObj::MetaList::New(MetaObj::Struct, GetOutputStructure());
    TvkCtl::Network::PnicImpl nic(input->GetParameter(kNicName));
    PnicStats stats{};
    nic.GetPnicStats(stats);
    auto row = GetOutputStructure();
    row->SetField(kNicNameField, nic.GetName());
    for (const NicCounter& counter : kNicCounters)
      row->SetField(counter.field, static_cast<long>(stats.*counter.value));
    list->Add(row);
    output->SetRootObject(list);
  } catch (const HostCtlException& e) {
    output->AddErrorMessage(std::string("Unable to get stats for NIC: ") + e.what());
  }
}

// network nic vlan stats get

CORVEX_DEFINE_NEW(NicVlanStatsGet)

NicVlanStatsGet::NicVlanStatsGet() {
  SetDescription("List VLAN statistics for active VLAN's on the NIC.");
  SetDefaultOutputFormatter("simple");
  SetDefaultOutputParameter("header:" + kVlanNic, "VLAN %" + kVlanIdField + "%");
  SetDefaultOutputParameter("fields:" + kVlanNic, kPacketsReceived + "," + kPacketsSent);
}

NicVlanStatsGet::~NicVlanStatsGet() = default;

std::shared_ptr<MetaObj::MetaStruct> NicVlanStatsGet::GetOutputStructure() {
  auto structure = MetaObj::MetaStruct::New(kVlanNic);
  structure->SetField(kVlanIdField, MetaObj::MetaInt::New());
  structure->SetField(kPacketsReceived, MetaObj::MetaInt::New());
  structure->SetField(kPacketsSent, MetaObj::MetaInt::New());
  return structure;
}

std::shared_ptr<CallSpec::InputSpec> NicVlanStatsGet::GetInputSpecInternal() {
  return MakeInputSpec(kNicNameParameters);
}

std::shared_ptr<CallSpec::OutputSpec> NicVlanStatsGet::GetOutputSpecInternal() {
  return ListResultSpec(GetOutputStructure());
}

void NicVlanStatsGet::ExecuteInternal(const std::shared_ptr<CallSpec::Input>& input,
                                      const std::shared_ptr<CallSpec::Output>& output) {
  try {
    auto list = MetaObj::MetaList::New(MetaObj::Struct, GetOutputStructure());
    const std::string& name = input->GetParameter(kNicName);
    TvkCtl::Network::VirtualSwitchInfoImpl switches;
    std::unique_ptr<HostCtl::Network::Portset> portset = FindUplinkSwitch(switches, name);
    if (!portset) {
      output->AddErrorMessage(name + kNotConnected);
      return;
    }
    for (const HostCtl::Network::VlanStats& entry : portset->GetVlanStats(name)) {
      auto row = GetOutputStructure();
      row->SetField(kVlanIdField, static_cast<long>(entry.vlanId));
      row->SetField(kPacketsReceived, static_cast<long>(entry.received));
      row->SetField(kPacketsSent, static_cast<long>(entry.sent));
      list->Add(row);
    }
    if (list->GetCount() == 0) {
      output->AddErrorMessage("VLAN stats are disabled for " + name + " please enable them first.");
      return;
    }
    output->SetRootObject(list);
  } catch (const HostCtlException& e) {
    output->AddErrorMessage(std::string("Unable to get VLAN stats: ") + e.what());
  }
}

// network nic vlan stats set

CORVEX_DEFINE_NEW(NicVlanStatsSet)

NicVlanStatsSet::NicVlanStatsSet() {
  SetDescription("Enable/disable VLAN statistics collection on the NIC.");
}

NicVlanStatsSet::~NicVlanStatsSet() = default;

std::shared_ptr<CallSpec::InputSpec> NicVlanStatsSet::GetInputSpecInternal() {
  return MakeInputSpec({
      {kNicName, "n", CallSpec::String, true, kNicNameDescription},
      {kEnabled, "e", CallSpec::Boolean, true, "Whether to enable or disable VLAN statistics"},
  });
}

std::shared_ptr<CallSpec::OutputSpec> NicVlanStatsSet::GetOutputSpecInternal() {
  return BoolResultSpec();
}

void NicVlanStatsSet::ExecuteInternal(const std::shared_ptr<CallSpec::Input>& input,
                                      const std::shared_ptr<CallSpec::Output>& output) {
  try {
    const std::string& name = input->GetParameter(kNicName);
    bool enabled = input->GetParameterBool(kEnabled);
    TvkCtl::Network::VirtualSwitchInfoImpl switches;
    std::unique_ptr<HostCtl::Network::Portset> portset = FindUplinkSwitch(switches, name);
    if (!portset) {
      output->AddErrorMessage(name + kNotConnected);
      return;
    }
    portset->SetVlanStatsEnabled(name, enabled);
    output->SetRootObject(MetaObj::MetaBool::New(true));
  } catch (const HostCtlException& e) {
    output->AddErrorMessage(std::string("Unable to set VLAN stats: ") + e.what());
  }
}

} // namespace CorvexCli::NetworkNamespace
