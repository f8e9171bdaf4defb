//===- Software.cpp - Software simulation of NIC offloads -----------------===//
//
// network nic software list|set. The fourteen features are one table in the
// order of the result structure and of the set parameters; each row names
// the feature's flag index (its mask bit) in the host record.
//
//===----------------------------------------------------------------------===//
#include "nic.h"

#include "HostCtl/Lib.h"
#include "HostCtl/Network/PnicHwRecords.h"
#include "nic/HwCommon.h"

namespace CorvexCli::NetworkNamespace {

using Fabrik::CallSpec::Input;
using Fabrik::CallSpec::InputSpec;
using Fabrik::CallSpec::Output;
using Fabrik::CallSpec::OutputSpec;
using Fabrik::MetaObj::MetaBool;
using Fabrik::MetaObj::MetaList;
using Fabrik::MetaObj::MetaString;
using Fabrik::MetaObj::MetaStruct;
using HostCtl::Lib::HostCtlException;
using HostCtl::Network::kSoftwareFeatureCount;
using HostCtl::Network::Pnic;
using HostCtl::Network::PnicSoftwareSimulation;

namespace {

constexpr auto kString = Fabrik::CallSpec::String;
constexpr auto kStringList = Fabrik::CallSpec::StringList;
constexpr auto kBoolean = Fabrik::CallSpec::Boolean;

const std::string kVmnic = "vmnic";
const std::string kIpv4cso = "ipv4cso";
const std::string kIpv4tso = "ipv4tso";
const std::string kSg = "sg";
const std::string kObo = "obo";
const std::string kVxlanencap = "vxlanencap";
const std::string kGeneveoffload = "geneveoffload";
const std::string kIpv6tso = "ipv6tso";
const std::string kIpv6tsoext = "ipv6tsoext";
const std::string kIpv6cso = "ipv6cso";
const std::string kIpv6csoext = "ipv6csoext";
const std::string kHighdma = "highdma";
const std::string kSgsp = "sgsp";
const std::string kTagging = "tagging";
const std::string kUntagging = "untagging";

const std::string kSettingsStruct = "Settings";
const std::string kNic = "NIC";
const std::string kIpv4CsoField = "IPv4 CSO";
const std::string kIpv4TsoField = "IPv4 TSO";
const std::string kSgField = "Scatter Gather";
const std::string kOboField = "Offset Based Offload";
const std::string kVxlanField = "VXLAN Encap";
const std::string kGeneveField = "Geneve Offload";
const std::string kIpv6TsoField = "IPv6 TSO";
const std::string kIpv6TsoExtField = "IPv6 TSO Ext";
const std::string kIpv6CsoField = "IPv6 CSO";
const std::string kIpv6CsoExtField = "IPv6 CSO Ext";
const std::string kHighDmaField = "High DMA";
const std::string kSgMpField = "Scatter Gather MP";
const std::string kTaggingField = "VLAN Tagging";
const std::string kUntaggingField = "VLAN Untagging";
const std::string kOn = "on";
const std::string kOff = "off";
const std::string kNotAvailable = "N/A";

/// One simulated feature, in the order of the result and the parameters.
struct Feature {
  const std::string& column; ///< Result field.
  ParameterDef param;        ///< Set parameter.
  std::size_t index;         ///< Flag index and mask bit in the record.
};

const Feature kFeatures[kSoftwareFeatureCount] = {
    {kIpv4CsoField,
     {kIpv4cso, "", kBoolean, false, "Configure IPv4 checksum offload software simulation."},
     0},
    {kIpv4TsoField,
     {kIpv4tso, "", kBoolean, false,
      "Configure IPv4 TCP segmentation offload software simulation."},
     1},
    {kSgField, {kSg, "", kBoolean, false, "Configure scatter gather software simulation."}, 2},
    {kOboField,
     {kObo, "", kBoolean, false,
      "Configure offset based encapsulation offload software simulation."},
     3},
    {kVxlanField,
     {kVxlanencap, "", kBoolean, false,
      "Configure VXLAN encapsulation offload software simulation."},
     4},
    {kGeneveField,
     {kGeneveoffload, "", kBoolean, false,
      "Configure Geneve encapsulation offload software simulation."},
     13},
    {kIpv6TsoField,
     {kIpv6tso, "", kBoolean, false,
      "Configure IPv6 TCP segmentation offload software simulation."},
     5},
    {kIpv6TsoExtField,
     {kIpv6tsoext, "", kBoolean, false,
      "Configure IPv6 extend header TCP segmentation offload software simulation."},
     6},
    {kIpv6CsoField,
     {kIpv6cso, "", kBoolean, false, "Configure IPv6 checksum offload software simulation."},
     7},
    {kIpv6CsoExtField,
     {kIpv6csoext, "", kBoolean, false,
      "Configure IPv6 extend header checksum offload software simulation."},
     8},
    {kHighDmaField, {kHighdma, "", kBoolean, false, "Configure high DMA software simulation."}, 9},
    {kSgMpField,
     {kSgsp, "", kBoolean, false,
      "Configure scatter gather span multiple pages software simulation."},
     10},
    {kTaggingField,
     {kTagging, "", kBoolean, false, "Configure TX VLAN tagging software simulation."},
     11},
    {kUntaggingField,
     {kUntagging, "", kBoolean, false, "Configure RX VLAN untagging software simulation."},
     12},
};

const ParameterDef kListParams[] = {
    {kVmnic, "n", kStringList, false,
     "Limit the output to only the physical NICS with the specified names."}};

const ParameterDef kSetVmnic = {
    kVmnic, "n", kString, true,
    "Name of the vmnic whose software similation settings should be updated."};

std::string CantFindPnic(const std::string& name) {
  return "Can't find PNIC with name " + name;
}

} // namespace

// network nic software list

CORVEX_DEFINE_NEW(NicSoftwareList)

NicSoftwareList::NicSoftwareList() {
  SetDescription("List software simulation settings of physical NICs currently installed and "
                 "loaded on the system.");
  SetDefaultOutputFormatter("table");
  std::string fields = kNic;
  for (const Feature& feature : kFeatures)
    fields += "," + feature.column;
  SetDefaultOutputParameter("fields:" + kSettingsStruct, fields);
}

NicSoftwareList::~NicSoftwareList() = default;

std::shared_ptr<InputSpec> NicSoftwareList::GetInputSpecInternal() {
  return MakeInputSpec(kListParams);
}

std::shared_ptr<MetaStruct> NicSoftwareList::GetOutputStructure() {
  auto structure = MetaStruct::New(kSettingsStruct);
  structure->SetField(kNic, MetaString::New());
  for (const Feature& feature : kFeatures)
    structure->SetField(feature.column, MetaString::New());
  return structure;
}

std::shared_ptr<OutputSpec> NicSoftwareList::GetOutputSpecInternal() {
  return ListResultSpec(GetOutputStructure());
}

void NicSoftwareList::ExecuteInternal(const std::shared_ptr<Input>& input,
                                      const std::shared_ptr<Output>& output) {
  try {
    std::unique_ptr<HostCtl::Network::NetworkInfo> info =
        HostCtl::Network::NetworkFactory::GetNetworkInfo();
    auto list = MetaList::New(Fabrik::MetaObj::Struct, GetOutputStructure());
    std::vector<std::unique_ptr<Pnic>> nics;
    if (!NicHw::SelectNicList(*info, *input, kVmnic, CantFindPnic, *output, nics))
      return;
    PnicSoftwareSimulation record{};
    for (const std::unique_ptr<Pnic>& nic : nics) {
      if (!nic)
        continue;
      auto row = GetOutputStructure();
      row->SetField(kNic, nic->GetName());
      try {
        nic->GetSoftwareSimulation(record);
        for (const Feature& feature : kFeatures)
          row->SetField(feature.column, record.features[feature.index] ? kOn : kOff);
      } catch (const HostCtlException&) {
        for (const Feature& feature : kFeatures)
          row->SetField(feature.column, kNotAvailable);
      }
      list->Add(row);
    }
    output->SetRootObject(list);
  } catch (const HostCtlException& e) {
    output->AddErrorMessage(e.what());
  }
}

// network nic software set

CORVEX_DEFINE_NEW(NicSoftwareSet)

NicSoftwareSet::NicSoftwareSet() {
  SetDescription("Enable and disable software simulation settings on a NIC.");
}

NicSoftwareSet::~NicSoftwareSet() = default;

std::shared_ptr<InputSpec> NicSoftwareSet::GetInputSpecInternal() {
  auto spec = MakeInputSpec({&kSetVmnic, 1});
  for (const Feature& feature : kFeatures)
    AddParameters(*spec, {&feature.param, 1});
  return spec;
}

std::shared_ptr<OutputSpec> NicSoftwareSet::GetOutputSpecInternal() {
  return BoolResultSpec();
}

void NicSoftwareSet::ExecuteInternal(const std::shared_ptr<Input>& input,
                                     const std::shared_ptr<Output>& output) {
  try {
    std::unique_ptr<HostCtl::Network::NetworkInfo> info =
        HostCtl::Network::NetworkFactory::GetNetworkInfo();
    std::unique_ptr<Pnic> nic = NicHw::FindNic(*info, *input, kVmnic, NicHw::PnicNotFound, *output);
    if (!nic)
      return;
    PnicSoftwareSimulation record{};
    for (const Feature& feature : kFeatures) {
      const std::string param(feature.param.name.View());
      if (!input->HasParameter(param))
        continue;
      record.features[feature.index] = input->GetParameterBool(param);
      record.mask |= 1u << feature.index;
    }
    if (record.mask != 0)
      nic->SetSoftwareSimulation(record);
    output->SetRootObject(MetaBool::New(true));
  } catch (const HostCtlException& e) {
    output->AddErrorMessage(e.what());
  }
}

} // namespace CorvexCli::NetworkNamespace
