//===- Sriov.cpp - SR-IOV NICs and virtual functions ----------------------===//
//
// network sriovnic list, sriovnic vf list and sriovnic vf stats: the NICs
// with SR-IOV enabled, their virtual functions and the counters of one
// virtual function.
//
//===----------------------------------------------------------------------===//
#include "common/FieldTable.h"
#include "nic.h"
#include "nic/NicText.h"

#include "Fabrik/Call.h"
#include "Fabrik/MetaObj.h"
#include "HostCtl/Lib.h"
#include "HostCtl/Network/Sriov.h"
#include "TvkCtl/Network/NetworkInfoImpl.h"
#include "common/IntFit.h"
#include "common/ParameterTable.h"

#include <cstdlib>

namespace CorvexCli::NetworkNamespace {

using namespace Fabrik;
using HostCtl::Lib::HostCtlException;
using HostCtl::Network::SriovNicVFStats;

namespace {

const std::string kNicName = "nic-name";
const std::string kVfId = "vf-id";

/// The VF id goes to the host as a signed 32-bit number; negative ones have
/// their own message.
const IntFit kStatsFits[] = {{kVfId, 0, kInt32Max}};
const std::string kNoSriovNic = "There is no SRIOV Nic with name ";

// network sriovnic list
const std::string kSriovNic = "SriovNic";
const std::string kName = "Name";
const std::string kPciDevice = "PCI Device";
const std::string kDriver = "Driver";
const std::string kLink = "Link";
const std::string kSpeed = "Speed";
const std::string kDuplex = "Duplex";
const std::string kMacAddress = "MAC Address";
const std::string kMtu = "MTU";
const std::string kDescription = "Description";

// network sriovnic vf list
const std::string kVfList = "VFList";
const std::string kVfIdField = "VF ID";
const std::string kActive = "Active";
const std::string kPciAddress = "PCI Address";
const std::string kOwnerWorldId = "Owner World ID";

// network sriovnic vf stats
const std::string kVfStats = "VfStats";
const std::string kNicNameField = "NIC Name";

/// The counters of "VfStats", in record order.
struct VfCounter {
  const char* field;                ///< Field name.
  uint64_t SriovNicVFStats::*value; ///< Counter of the record.
};
const VfCounter kVfCounters[] = {
    {"Rx Unicast Pkt", &SriovNicVFStats::rxUnicastPkts},
    {"Rx Unicast Bytes", &SriovNicVFStats::rxUnicastBytes},
    {"Rx Multicast Pkts", &SriovNicVFStats::rxMulticastPkts},
    {"Rx Multicast Bytes", &SriovNicVFStats::rxMulticastBytes},
    {"Rx Broadcast Pkts", &SriovNicVFStats::rxBroadcastPkts},
    {"Rx Broadcast Bytes", &SriovNicVFStats::rxBroadcastBytes},
    {"Rx Out of Buffer drops", &SriovNicVFStats::rxOutOfBufferDrops},
    {"Rx Error drops", &SriovNicVFStats::rxErrorDrops},
    {"Rx LRO Pkts", &SriovNicVFStats::rxLroPkts},
    {"Rx LRO Bytes", &SriovNicVFStats::rxLroBytes},
    {"Tx Unicast Pkt", &SriovNicVFStats::txUnicastPkts},
    {"Tx Unicast Bytes", &SriovNicVFStats::txUnicastBytes},
    {"Tx Multicast Pkts", &SriovNicVFStats::txMulticastPkts},
    {"Tx Multicast Bytes", &SriovNicVFStats::txMulticastBytes},
    {"Tx Broadcast Pkts", &SriovNicVFStats::txBroadcastPkts},
    {"Tx Broadcast Bytes", &SriovNicVFStats::txBroadcastBytes},
    {"Tx Errors", &SriovNicVFStats::txErrors},
    {"Tx Discards", &SriovNicVFStats::txDiscards},
    {"Tx TSO Pkts", &SriovNicVFStats::txTsoPkts},
    {"Tx TSO Bytes", &SriovNicVFStats::txTsoBytes},
};

/// The counter fields joined by ",".
std::string VfCounterFields() {
  std::string fields;
  for (const VfCounter& counter : kVfCounters)
    fields += (fields.empty() ? "" : ",") + std::string(counter.field);
  return fields;
}

} // namespace

long ParseVfId(const std::string& text) {
  return std::strtol(text.c_str(), nullptr, 10);
}

// network sriovnic list

CORVEX_DEFINE_NEW(SriovNicList)

SriovNicList::SriovNicList() {
  SetDescription("This command will list the SRIOV Enabled NICs (PFs) currently installed and "
                 "loaded on the system.");
  SetDefaultOutputFormatter("table");
  SetDefaultOutputParameter("fields:" + kSriovNic, kName + "," + kPciDevice + "," + kDriver + "," +
                                                       kLink + "," + kSpeed + "," + kDuplex + "," +
                                                       kMacAddress + "," + kMtu + "," +
                                                       kDescription);
}

SriovNicList::~SriovNicList() = default;

std::shared_ptr<MetaObj::MetaStruct> SriovNicList::GetOutputStructure() {
  auto structure = MetaObj::MetaStruct::New(kSriovNic);
  for (const std::string* field : {&kName, &kPciDevice, &kDriver, &kLink})
    structure->SetField(*field, MetaObj::MetaString::New());
  structure->SetField(kSpeed, MetaObj::MetaInt::New());
  structure->SetField(kDuplex, MetaObj::MetaString::New());
  structure->SetField(kMacAddress, MetaObj::MetaString::New());
  structure->SetField(kMtu, MetaObj::MetaInt::New());
  structure->SetField(kDescription, MetaObj::MetaString::New());
  return structure;
}

std::shared_ptr<CallSpec::InputSpec> SriovNicList::GetInputSpecInternal() {
  return CallSpec::InputSpec::New();
}

std::shared_ptr<CallSpec::OutputSpec> SriovNicList::GetOutputSpecInternal() {
  return ListResultSpec(GetOutputStructure());
}

void SriovNicList::ExecuteInternal(const std::shared_ptr<CallSpec::Input>& input,
                                   const std::shared_ptr<CallSpec::Output>& output) {
  try {
    TvkCtl::Network::NetworkInfoImpl info;
    auto list = MetaObj::MetaList::New(MetaObj::Struct, GetOutputStructure());
    for (const auto& nic : info.GetSriovNics()) {
      if (!nic)
        continue;
      auto row = GetOutputStructure();
      row->SetField(kName, nic->GetName());
      std::string pci = "Pseudo";
      std::string vendor = "Unknown";
      std::string device = "Unknown";
      if (auto pciDevice = nic->GetPciDevice()) {
        pci = pciDevice->GetAddress();
        vendor = pciDevice->GetVendorName();
        device = pciDevice->GetDeviceName();
      }
      row->SetField(kPciDevice, pci);
      row->SetField(kDriver, nic->GetDriverName());
      row->SetField(kLink, nic->IsLinkUp() ? "Up" : "Down");
      row->SetField(kSpeed, static_cast<long>(nic->GetSpeed()));
      row->SetField(kDuplex, nic->GetDuplex() == 1 ? "Full" : "Half");
      row->SetField(kMacAddress, nic->GetMacAddress().GetStringAddress());
      row->SetField(kMtu, static_cast<long>(nic->GetMtu()));
      row->SetField(kDescription, vendor + " " + device);
      list->Add(row);
    }
    output->SetRootObject(list);
  } catch (const HostCtlException& e) {
    output->AddErrorMessage(std::string("Unable to list NICs.  Error was ") + e.what());
  }
}

// network sriovnic vf list

CORVEX_DEFINE_NEW(VfList)

VfList::VfList() {
  SetDescription("Get the generic configuration of VFs for SRIOV NIC.");
  SetDefaultOutputFormatter("table");
  SetDefaultOutputParameter("fields:" + kVfList,
                            kVfIdField + "," + kActive + "," + kPciAddress + "," + kOwnerWorldId);
}

VfList::~VfList() = default;

std::shared_ptr<MetaObj::MetaStruct> VfList::GetOutputStructure() {
  auto structure = MetaObj::MetaStruct::New(kVfList);
  structure->SetField(kVfIdField, MetaObj::MetaInt::New());
  structure->SetField(kActive, MetaObj::MetaBool::New());
  structure->SetField(kPciAddress, MetaObj::MetaString::New());
  structure->SetField(kOwnerWorldId, MetaObj::MetaString::New());
  return structure;
}

std::shared_ptr<CallSpec::InputSpec> VfList::GetInputSpecInternal() {
  return MakeInputSpec({{kNicName, "n", CallSpec::String, true,
                         "The name of the SRIOV NIC to configured. This must be one of the cards "
                         "listed in the sriovNic list command."}});
}

std::shared_ptr<CallSpec::OutputSpec> VfList::GetOutputSpecInternal() {
  return ListResultSpec(GetOutputStructure());
}

void VfList::ExecuteInternal(const std::shared_ptr<CallSpec::Input>& input,
                             const std::shared_ptr<CallSpec::Output>& output) {
  try {
    auto list = MetaObj::MetaList::New(MetaObj::Struct, GetOutputStructure());
    const std::string& name = input->GetParameter(kNicName);
    TvkCtl::Network::NetworkInfoImpl info;
    if (!info.GetSriovNicByName(name)) {
      output->AddErrorMessage(kNoSriovNic + name);
      return;
    }
    for (const HostCtl::Network::SriovNicVFInfo& vf : info.GetSriovNicVFInfo(name)) {
      auto row = GetOutputStructure();
      row->SetField(kVfIdField, static_cast<long>(vf.vfId));
      row->SetField(kActive, vf.active);
      row->SetField(kPciAddress, vf.pciAddress);
      row->SetField(kOwnerWorldId, vf.ownerWorldId);
      list->Add(row);
    }
    output->SetRootObject(list);
  } catch (const HostCtlException& e) {
    output->AddErrorMessage(std::string("Unable to get VF Info. Error:") + e.what());
  }
}

// network sriovnic vf stats

CORVEX_DEFINE_NEW(VfStats)

VfStats::VfStats() {
  SetDescription("Get statistics for given VF of a SRIOV NIC.");
  SetDefaultOutputFormatter("simple");
  SetDefaultOutputParameter("header:VF", "Statistics for %vf% VF of %NIC Name%");
  SetDefaultOutputParameter("fields:VFStats", VfCounterFields());
}

VfStats::~VfStats() = default;

std::shared_ptr<MetaObj::MetaStruct> VfStats::GetOutputStructure() {
  auto structure = MetaObj::MetaStruct::New(kVfStats);
  structure->SetField(kNicNameField, MetaObj::MetaString::New());
  structure->SetField(kVfIdField, MetaObj::MetaInt::New());
  for (const VfCounter& counter : kVfCounters)
    structure->SetField(counter.field, MetaObj::MetaInt::New());
  return structure;
}

std::shared_ptr<CallSpec::InputSpec> VfStats::GetInputSpecInternal() {
  return MakeInputSpec({
      {kNicName, "n", CallSpec::String, true,
       "The name of the SRIOV NIC. This must be one of the cards listed in the sriovNic list "
       "command."},
      {kVfId, "v", CallSpec::Integer, true,
       "The VF ID of the virtual function whose stats are to be collected. This must be one of "
       "the VF IDs listed in the sriovnic vf list command."},
  });
}

std::shared_ptr<CallSpec::OutputSpec> VfStats::GetOutputSpecInternal() {
  return ListResultSpec(GetOutputStructure());
}

void VfStats::ExecuteInternal(const std::shared_ptr<CallSpec::Input>& input,
                              const std::shared_ptr<CallSpec::Output>& output) {
  try {
    TvkCtl::Network::NetworkInfoImpl info;
    auto list = MetaObj::MetaList::New(MetaObj::Struct, GetOutputStructure());
    const std::string& name = input->GetParameter(kNicName);
    const std::string& vfText = input->GetParameter(kVfId);
    // A number that does not fit in 32 bits is refused like a negative one,
    // rather than cut to its low bits and taken for another VF.
    long vfId = ParseVfId(vfText);
    if (vfId < 0) {
      output->AddErrorMessage("Invalid vf id:" + vfText + " provided. vf id starts from 0");
      return;
    }
    if (auto problem = OutOfRange(*input, kStatsFits[0])) {
      output->AddErrorMessage(*problem);
      return;
    }
    if (!info.GetSriovNicByName(name)) {
      output->AddErrorMessage(kNoSriovNic + name);
      return;
    }
    SriovNicVFStats stats{};
    info.GetSriovNicVFStats(stats, name, static_cast<int>(vfId));
    auto row = GetOutputStructure();
    row->SetField(kNicNameField, name);
    row->SetField(kVfIdField, static_cast<long>(vfId));
    for (const VfCounter& counter : kVfCounters)
      row->SetField(counter.field, static_cast<long>(stats.*counter.value));
    list->Add(row);
    output->SetRootObject(list);
  } catch (const HostCtlException& e) {
    output->AddErrorMessage(std::string("Unable to get VF Stats. Error:") + e.what());
  }
}

} // namespace CorvexCli::NetworkNamespace
