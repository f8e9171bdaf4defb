//===- Offload.cpp - Checksum, segmentation and scatter-gather offloads ---===//
//
// network nic cso|tso|sg get|set. The three pairs differ only in the flags
// they touch and their wording, so each pair is one row of kOffloadKinds and
// the six commands share one get and one set routine.
//
//===----------------------------------------------------------------------===//
#include "nic.h"

#include "HostCtl/Lib.h"
#include "HostCtl/Network/PnicHwRecords.h"
#include "TvkCtl/Network/NetworkInfoImpl.h"
#include "nic/HwCommon.h"

namespace CorvexCli::NetworkNamespace {

using Fabrik::CallSpec::Input;
using Fabrik::CallSpec::InputSpec;
using Fabrik::CallSpec::Output;
using Fabrik::CallSpec::OutputSpec;
using Fabrik::MetaObj::MetaBool;
using Fabrik::MetaObj::MetaList;
using Fabrik::MetaObj::MetaStruct;
using HostCtl::Lib::HostCtlException;
using HostCtl::Network::Pnic;
using HostCtl::Network::PnicOffloadSettings;

namespace {

const std::string kVmnic = "vmnic";
const std::string kEnable = "enable";
const std::string kNic = "NIC";
const std::string kRxChecksum = "RX Checksum Offload";
const std::string kTxChecksum = "TX Checksum Offload";
const std::string kValue = "Value";
const std::string kCsoStruct = "CSOSettings";
const std::string kTsoStruct = "TSOSettings";
const std::string kSgStruct = "ScatterGatherSetting";
const std::string kOn = "on";
const std::string kOff = "off";
const std::string kNotAvailable = "N/A";

/// A flag shown by a get command.
struct OffloadColumn {
  const std::string& field;        ///< Result field.
  bool PnicOffloadSettings::*flag; ///< Record flag.
};

/// One pair of offload commands.
struct OffloadKind {
  const std::string& structName;                     ///< Result structure of the get.
  std::vector<OffloadColumn> columns;                ///< Value fields of the get, in order.
  std::vector<const std::string*> fields;            ///< All fields of the get, in order.
  ParameterDef getParams[1];                         ///< Parameters of the get.
  ParameterDef setParams[2];                         ///< Parameters of the set.
  uint8_t mask;                                      ///< Mask written by the set.
  std::vector<bool PnicOffloadSettings::*> setFlags; ///< Flags written by the set.
  bool zeroOnce; ///< The get zeroes its record once, before its loop.
};

const OffloadKind kCso = {
    kCsoStruct,
    {{kRxChecksum, &PnicOffloadSettings::rxChecksum},
     {kTxChecksum, &PnicOffloadSettings::txChecksum}},
    {&kNic, &kRxChecksum, &kTxChecksum},
    {{kVmnic, "n", Fabrik::CallSpec::String, false, "The name of pnic to get CSO settings"}},
    {{kVmnic, "n", Fabrik::CallSpec::String, true, "Name of vmnic to set offload settings."},
     {kEnable, "e", Fabrik::CallSpec::Integer, true, "RX/TX checksum offload",
      ParameterCheck::Range(0, 1)}},
    HostCtl::Network::OffloadRxChecksum | HostCtl::Network::OffloadTxChecksum,
    {&PnicOffloadSettings::rxChecksum, &PnicOffloadSettings::txChecksum},
    true,
};

const OffloadKind kTso = {
    kTsoStruct,
    {{kValue, &PnicOffloadSettings::tso}},
    {&kNic, &kValue},
    {{kVmnic, "n", Fabrik::CallSpec::String, false, "The name of pnic to get TSO settings"}},
    {{kVmnic, "n", Fabrik::CallSpec::String, true, "Name of vmnic to set TSO settings."},
     {kEnable, "e", Fabrik::CallSpec::Integer, true, "TCP segmentation offload",
      ParameterCheck::Range(0, 1)}},
    HostCtl::Network::OffloadTso,
    {&PnicOffloadSettings::tso},
    false,
};

const OffloadKind kSg = {
    kSgStruct,
    {{kValue, &PnicOffloadSettings::scatterGather}},
    {&kNic, &kValue},
    {{kVmnic, "n", Fabrik::CallSpec::String, false,
      "The name of pnic to get scatter-gather settings"}},
    {{kVmnic, "n", Fabrik::CallSpec::String, true,
      "Name of vmnic to configure scatter-gather settings."},
     {kEnable, "e", Fabrik::CallSpec::Integer, true, "Enable/disable sacatter-gather",
      ParameterCheck::Range(0, 1)}},
    HostCtl::Network::OffloadScatterGather,
    {&PnicOffloadSettings::scatterGather},
    false,
};

std::shared_ptr<MetaStruct> OffloadStructure(const OffloadKind& kind) {
  return NicHw::StringStructure(kind.structName, kind.fields);
}

void SetDefaults(Fabrik::AutoCli::CommandSpec& command, const OffloadKind& kind) {
  command.SetDefaultOutputFormatter("table");
  command.SetDefaultOutputParameter("fields:" + kind.structName, NicHw::JoinFields(kind.fields));
}

/// Lists the offload flags of \p kind for one NIC or all NICs.
void OffloadGet(const OffloadKind& kind, const Input& input, Output& output) {
  try {
    TvkCtl::Network::NetworkInfoImpl info;
    auto list = MetaList::New(Fabrik::MetaObj::Struct, OffloadStructure(kind));
    std::vector<std::unique_ptr<Pnic>> nics;
    if (!NicHw::SelectNics(info, input, kVmnic, NicHw::PnicNotFound, output, nics))
      return;
    PnicOffloadSettings settings{};
    for (const std::unique_ptr<Pnic>& nic : nics) {
      if (!nic)
        continue;
      auto row = OffloadStructure(kind);
      row->SetField(kNic, nic->GetName());
      try {
        if (!kind.zeroOnce)
          settings = PnicOffloadSettings{};
        nic->GetOffloadSettings(settings);
        for (const OffloadColumn& column : kind.columns)
          row->SetField(column.field, settings.*column.flag ? kOn : kOff);
      } catch (const HostCtlException&) {
        for (const OffloadColumn& column : kind.columns)
          row->SetField(column.field, kNotAvailable);
      }
      list->Add(row);
    }
    output.SetRootObject(list);
  } catch (const HostCtlException& e) {
    output.AddErrorMessage(e.what());
  }
}

/// Turns the flags of \p kind on or off on one NIC.
void OffloadSet(const OffloadKind& kind, const Input& input, Output& output) {
  try {
    TvkCtl::Network::NetworkInfoImpl info;
    std::unique_ptr<Pnic> nic = NicHw::FindNic(info, input, kVmnic, NicHw::PnicNotFound, output);
    if (!nic)
      return;
    PnicOffloadSettings settings{};
    nic->GetOffloadSettings(settings);
    bool value = input.GetParameterInt(kEnable) != 0;
    settings.mask = kind.mask;
    for (bool PnicOffloadSettings::*flag : kind.setFlags)
      settings.*flag = value;
    nic->SetOffloadSettings(settings);
    output.SetRootObject(MetaBool::New(true));
  } catch (const HostCtlException& e) {
    output.AddErrorMessage(e.what());
  }
}

} // namespace

// The six commands: each forwards to the routines above with its row.
#define CORVEX_OFFLOAD_GET(Class, Kind, Description)                                               \
  CORVEX_DEFINE_NEW(Class)                                                                         \
  Class::Class() {                                                                                 \
    SetDescription(Description);                                                                   \
    SetDefaults(*this, Kind);                                                                      \
  }                                                                                                \
  Class::~Class() = default;                                                                       \
  std::shared_ptr<InputSpec> Class::GetInputSpecInternal() {                                       \
    return MakeInputSpec(Kind.getParams);                                                          \
  }                                                                                                \
  std::shared_ptr<MetaStruct> Class::GetOutputStructure() {                                        \
    return OffloadStructure(Kind);                                                                 \
  }                                                                                                \
  std::shared_ptr<OutputSpec> Class::GetOutputSpecInternal() {                                     \
    return ListResultSpec(GetOutputStructure());                                                   \
  }                                                                                                \
  void Class::ExecuteInternal(const std::shared_ptr<Input>& input,                                 \
                              const std::shared_ptr<Output>& output) {                             \
    OffloadGet(Kind, *input, *output);                                                             \
  }

#define CORVEX_OFFLOAD_SET(Class, Kind, Description)                                               \
  CORVEX_DEFINE_NEW(Class)                                                                         \
  Class::Class() {                                                                                 \
    SetDescription(Description);                                                                   \
  }                                                                                                \
  Class::~Class() = default;                                                                       \
  std::shared_ptr<InputSpec> Class::GetInputSpecInternal() {                                       \
    return MakeInputSpec(Kind.setParams);                                                          \
  }                                                                                                \
  std::shared_ptr<OutputSpec> Class::GetOutputSpecInternal() {                                     \
    return BoolResultSpec();                                                                       \
  }                                                                                                \
  void Class::ExecuteInternal(const std::shared_ptr<Input>& input,                                 \
                              const std::shared_ptr<Output>& output) {                             \
    OffloadSet(Kind, *input, *output);                                                             \
  }

CORVEX_OFFLOAD_GET(NicCsoGet, kCso, "Get checksum offload settings")
CORVEX_OFFLOAD_SET(NicCsoSet, kCso,
                   "Set checksum offload settings on a nic, which is not persistent.")
CORVEX_OFFLOAD_GET(NicTsoGet, kTso, "Get TCP segmentation offload settings")
CORVEX_OFFLOAD_SET(NicTsoSet, kTso,
                   "Set TCP segmentation offload settings on a nic, which is not persistent.")
CORVEX_OFFLOAD_GET(NicSgGet, kSg, "Get scatter-gather settings")
CORVEX_OFFLOAD_SET(NicSgSet, kSg, "Set scatter-gatter settings on a nic, which is not persistent.")

} // namespace CorvexCli::NetworkNamespace
