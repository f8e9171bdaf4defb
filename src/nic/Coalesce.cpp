//===- Coalesce.cpp - Interrupt coalescing of a physical NIC --------------===//
//
// network nic coalesce get|set and network nic coalesce high|low get|set.
// Every command reads the NIC's whole coalescing record; the sets change the
// fields their parameters name and write the record back whole. The high
// and low pairs are one table row each.
//
//===----------------------------------------------------------------------===//
#include "nic.h"

#include "HostCtl/Lib.h"
#include "HostCtl/Network/PnicHwRecords.h"
#include "TvkCtl/Network/NetworkInfoImpl.h"
#include "common/IntFit.h"
#include "nic/HwCommon.h"

namespace CorvexCli::NetworkNamespace {

using Fabrik::CallSpec::Input;
using Fabrik::CallSpec::InputSpec;
using Fabrik::CallSpec::Output;
using Fabrik::CallSpec::OutputSpec;
using Fabrik::MetaObj::MetaBool;
using Fabrik::MetaObj::MetaInt;
using Fabrik::MetaObj::MetaList;
using Fabrik::MetaObj::MetaString;
using Fabrik::MetaObj::MetaStruct;
using HostCtl::Lib::HostCtlException;
using HostCtl::Network::Pnic;
using HostCtl::Network::PnicCoalesceParams;

namespace {

constexpr auto kString = Fabrik::CallSpec::String;
constexpr auto kInteger = Fabrik::CallSpec::Integer;
constexpr auto kBoolean = Fabrik::CallSpec::Boolean;

const std::string kVmnic = "vmnic";
const std::string kRxUsecs = "rx-usecs";
const std::string kRxMaxFrames = "rx-max-frames";
const std::string kTxUsecs = "tx-usecs";
const std::string kTxMaxFrames = "tx-max-frames";
const std::string kAdaptiveRx = "adaptive-rx";
const std::string kAdaptiveTx = "adaptive-tx";
const std::string kSampleInterval = "sample-interval";
const std::string kPktRate = "pkt-rate";

const std::string kCoalesceStruct = "CoalesceParams";
const std::string kNic = "NIC";
const std::string kRxMicroseconds = "RX microseconds";
const std::string kRxMaximumFrames = "RX maximum frames";
const std::string kTxMicroseconds = "TX microseconds";
const std::string kTxMaximumFrames = "TX Maximum frames";
const std::string kAdaptiveRxField = "Adaptive RX";
const std::string kAdaptiveTxField = "Adaptive TX";
const std::string kSampleIntervalField = "Sample interval seconds";
const std::string kPacketRate = "Packet rate";
const std::string kRxDelayTime = "RX delay time";
const std::string kRxDelayPackets = "RX delay packets";
const std::string kTxDelayTime = "TX delay time";
const std::string kTxDelayPackets = "TX delay packets";
const std::string kHighStruct = "CoalesceParamsAtHighPacketRate";
const std::string kLowStruct = "CoalesceParamsAtLowPacketRate";
const std::string kNotAvailable = "N/A";

/// A record field: a count or, when count is null, an on/off flag.
struct CoalesceTarget {
  uint32_t PnicCoalesceParams::*count; ///< Count field, or null.
  bool PnicCoalesceParams::*flag;      ///< Flag field, when count is null.
};

/// A value column of `network nic coalesce get`.
struct CoalesceColumn {
  const std::string& field; ///< Result field.
  CoalesceTarget target;    ///< What it shows.
};

const CoalesceColumn kCoalesceColumns[] = {
    {kRxMicroseconds, {&PnicCoalesceParams::rxUsecs, nullptr}},
    {kRxMaximumFrames, {&PnicCoalesceParams::rxMaxFrames, nullptr}},
    {kTxMicroseconds, {&PnicCoalesceParams::txUsecs, nullptr}},
    {kTxMaximumFrames, {&PnicCoalesceParams::txMaxFrames, nullptr}},
    {kAdaptiveRxField, {nullptr, &PnicCoalesceParams::adaptiveRx}},
    {kAdaptiveTxField, {nullptr, &PnicCoalesceParams::adaptiveTx}},
    {kSampleIntervalField, {&PnicCoalesceParams::sampleInterval, nullptr}},
};

const std::string* const kCoalesceFields[] = {&kNic,
                                              &kRxMicroseconds,
                                              &kRxMaximumFrames,
                                              &kTxMicroseconds,
                                              &kTxMaximumFrames,
                                              &kAdaptiveRxField,
                                              &kAdaptiveTxField,
                                              &kSampleIntervalField};

const ParameterDef kGetParams[] = {
    {kVmnic, "n", kString, false, "The name of pnic to get coalesce parameters"}};

const ParameterDef kSetParams[] = {
    {kVmnic, "n", kString, true, "Name of vmnic to set coalesce parameters."},
    {kRxUsecs, "r", kInteger, false,
     "Number of microseconds driver to wait for RX before interrupting."},
    {kRxMaxFrames, "R", kInteger, false,
     "Maximum number of RX frames driver to process before interrupting."},
    {kTxUsecs, "t", kInteger, false,
     "Number of microseconds driver to wait for completed TX before interrupting."},
    {kTxMaxFrames, "T", kInteger, false,
     "Maximum number of completed TX frames driver to process before interrupting."},
    {kAdaptiveRx, "a", kBoolean, false, "enable or disable adaptive RX algorithm in driver."},
    {kAdaptiveTx, "A", kBoolean, false, "enable or disable adaptive TX algorithm in driver."},
    {kSampleInterval, "i", kInteger, false,
     "Packet rate sampling internal in seconds for the adaptive coalescing algorithm in driver.",
     ParameterCheck::Range(1, 3600)},
};

/// Record fields of the optional set parameters, in the order of kSetParams
/// after `vmnic`.
const CoalesceTarget kSetTargets[] = {
    {&PnicCoalesceParams::rxUsecs, nullptr},        {&PnicCoalesceParams::rxMaxFrames, nullptr},
    {&PnicCoalesceParams::txUsecs, nullptr},        {&PnicCoalesceParams::txMaxFrames, nullptr},
    {nullptr, &PnicCoalesceParams::adaptiveRx},     {nullptr, &PnicCoalesceParams::adaptiveTx},
    {&PnicCoalesceParams::sampleInterval, nullptr},
};

/// The integer set parameters of every coalescing set go into the record's
/// unsigned 32-bit counts (the sample interval has its own narrower range).
const IntFit kCountFits[] = {
    {kPktRate, 0, kUint32Max}, {kRxUsecs, 0, kUint32Max},     {kRxMaxFrames, 0, kUint32Max},
    {kTxUsecs, 0, kUint32Max}, {kTxMaxFrames, 0, kUint32Max},
};

/// Result fields of the high and low gets after "NIC", all integers.
const std::string* const kRegimeFields[] = {&kPacketRate, &kRxDelayTime, &kRxDelayPackets,
                                            &kTxDelayTime, &kTxDelayPackets};

/// One packet-rate regime: the high or the low pair.
struct Regime {
  const std::string& structName; ///< Result structure of the get.
  uint32_t PnicCoalesceParams::*
      members[5];            ///< Packet rate, RX time and packets, TX time and packets.
  ParameterDef setParams[6]; ///< Parameters of the set.
};

const ParameterDef kRegimeGetParams[] = {
    {kVmnic, "n", kString, true,
     "The name of the pnic for which information should be retrieved."}};

const Regime kHigh = {
    kHighStruct,
    {&PnicCoalesceParams::pktRateHigh, &PnicCoalesceParams::rxUsecsHigh,
     &PnicCoalesceParams::rxMaxFramesHigh, &PnicCoalesceParams::txUsecsHigh,
     &PnicCoalesceParams::txMaxFramesHigh},
    {{kVmnic, "n", kString, true, "Name of the vmnic for which parameters should be set."},
     {kPktRate, "p", kInteger, false,
      "The high packet rate measured in number of packets per second. When packet rate is above "
      "this parameter, the RX/TX coalescing parameters configured by this command are used."},
     {kRxUsecs, "r", kInteger, false,
      "The number of microseconds to delay an RX interrupt after a packet arrives under high "
      "packet rate conditions."},
     {kRxMaxFrames, "R", kInteger, false,
      "The maximum number of RX packets to delay an RX interrupt after they arrive under high "
      "packet rate conditions."},
     {kTxUsecs, "t", kInteger, false,
      "The number of microseconds to delay a TX interrupt after a packet is sent under high "
      "packet rate conditions."},
     {kTxMaxFrames, "T", kInteger, false,
      "The maximum number of TX packets to delay an TX interrupt after they are sent under high "
      "packet rate conditions."}},
};

const Regime kLow = {
    kLowStruct,
    {&PnicCoalesceParams::pktRateLow, &PnicCoalesceParams::rxUsecsLow,
     &PnicCoalesceParams::rxMaxFramesLow, &PnicCoalesceParams::txUsecsLow,
     &PnicCoalesceParams::txMaxFramesLow},
    {{kVmnic, "n", kString, true, "Name of the vmnic for which parameters should be set."},
     {kPktRate, "p", kInteger, false,
      "The low packet rate measured in number of packets per second. When packet rate is below "
      "this parameter, the RX/TX coalescing parameters configured by this command are used."},
     {kRxUsecs, "r", kInteger, false,
      "The number of microseconds to delay an RX interrupt after a packet arrives under low "
      "packet rate conditions."},
     {kRxMaxFrames, "R", kInteger, false,
      "The maximum number of RX packets to delay an RX interrupt after they arrive under low "
      "packet rate conditions."},
     {kTxUsecs, "t", kInteger, false,
      "The number of microseconds to delay a TX interrupt after a packet is sent under low "
      "packet rate conditions."},
     {kTxMaxFrames, "T", kInteger, false,
      "The maximum number of TX packets to delay an TX interrupt after they are sent under low "
      "packet rate conditions."}},
};

std::shared_ptr<MetaStruct> RegimeStructure(const Regime& regime) {
  auto structure = MetaStruct::New(regime.structName);
  structure->SetField(kNic, MetaString::New());
  for (const std::string* field : kRegimeFields)
    structure->SetField(*field, MetaInt::New());
  return structure;
}

void SetRegimeDefaults(Fabrik::AutoCli::CommandSpec& command, const Regime& regime) {
  command.SetDefaultOutputFormatter("simple");
  command.SetDefaultOutputParameter("fields:" + regime.structName,
                                    kNic + "," + NicHw::JoinFields(kRegimeFields));
  command.SetDefaultOutputParameter("units:" + regime.structName + "." + kPacketRate, "pps");
  command.SetDefaultOutputParameter("units:" + regime.structName + "." + kRxDelayTime,
                                    "microsecond");
  command.SetDefaultOutputParameter("units:" + regime.structName + "." + kTxDelayTime,
                                    "microsecond");
}

/// The NIC named by `vmnic`, through the factory's network root.
std::unique_ptr<Pnic> RegimeNic(const Input& input, Output& output) {
  std::unique_ptr<HostCtl::Network::NetworkInfo> info =
      HostCtl::Network::NetworkFactory::GetNetworkInfo();
  return NicHw::FindNic(*info, input, kVmnic, NicHw::PnicNotFound, output);
}

void RegimeGet(const Regime& regime, const Input& input, Output& output) {
  try {
    const std::string& name = input.GetParameter(kVmnic);
    std::unique_ptr<HostCtl::Network::NetworkInfo> info =
        HostCtl::Network::NetworkFactory::GetNetworkInfo();
    std::unique_ptr<Pnic> nic = info->GetPnicByName(name);
    if (!nic)
      throw HostCtlException(NicHw::PnicNotFound(name));
    auto result = RegimeStructure(regime);
    result->SetField(kNic, name);
    PnicCoalesceParams params{};
    nic->GetCoalesceParams(params);
    for (std::size_t i = 0; i < std::size(kRegimeFields); ++i)
      result->SetField(*kRegimeFields[i], static_cast<long>(params.*regime.members[i]));
    output.SetRootObject(result);
  } catch (const HostCtlException& e) {
    output.AddErrorMessage(e.what());
  }
}

void RegimeSet(const Regime& regime, const Input& input, Output& output) {
  try {
    RequireFit(input, kCountFits);
    std::unique_ptr<Pnic> nic = RegimeNic(input, output);
    if (!nic)
      return;
    PnicCoalesceParams params{};
    nic->GetCoalesceParams(params);
    for (std::size_t i = 0; i < std::size(regime.members); ++i) {
      const std::string param(regime.setParams[i + 1].name.View());
      if (input.HasParameter(param))
        params.*regime.members[i] = static_cast<uint32_t>(input.GetParameterInt(param));
    }
    nic->SetCoalesceParams(params);
    output.SetRootObject(MetaBool::New(true));
  } catch (const HostCtlException& e) {
    output.AddErrorMessage(e.what());
  }
}

} // namespace

// network nic coalesce get

CORVEX_DEFINE_NEW(NicCoalesceGet)

NicCoalesceGet::NicCoalesceGet() {
  SetDescription("Get coalesce parameters");
  SetDefaultOutputFormatter("table");
  SetDefaultOutputParameter("fields:" + kCoalesceStruct, NicHw::JoinFields(kCoalesceFields));
}

NicCoalesceGet::~NicCoalesceGet() = default;

std::shared_ptr<InputSpec> NicCoalesceGet::GetInputSpecInternal() {
  return MakeInputSpec(kGetParams);
}

std::shared_ptr<MetaStruct> NicCoalesceGet::GetOutputStructure() {
  return NicHw::StringStructure(kCoalesceStruct, kCoalesceFields);
}

std::shared_ptr<OutputSpec> NicCoalesceGet::GetOutputSpecInternal() {
  return ListResultSpec(GetOutputStructure());
}

void NicCoalesceGet::ExecuteInternal(const std::shared_ptr<Input>& input,
                                     const std::shared_ptr<Output>& output) {
  try {
    TvkCtl::Network::NetworkInfoImpl info;
    auto list = MetaList::New(Fabrik::MetaObj::Struct, GetOutputStructure());
    std::vector<std::unique_ptr<Pnic>> nics;
    if (!NicHw::SelectNics(info, *input, kVmnic, NicHw::PnicNotFound, *output, nics))
      return;
    PnicCoalesceParams params{};
    for (const std::unique_ptr<Pnic>& nic : nics) {
      if (!nic)
        continue;
      auto row = GetOutputStructure();
      row->SetField(kNic, nic->GetName());
      try {
        nic->GetCoalesceParams(params);
        for (const CoalesceColumn& column : kCoalesceColumns) {
          if (column.target.count)
            row->SetField(column.field, std::to_string(params.*column.target.count));
          else
            row->SetField(column.field, params.*column.target.flag ? "On" : "Off");
        }
      } catch (const HostCtlException&) {
        for (const CoalesceColumn& column : kCoalesceColumns)
          row->SetField(column.field, kNotAvailable);
      }
      list->Add(row);
    }
    output->SetRootObject(list);
  } catch (const HostCtlException& e) {
    output->AddErrorMessage(e.what());
  }
}

// network nic coalesce set

CORVEX_DEFINE_NEW(NicCoalesceSet)

NicCoalesceSet::NicCoalesceSet() {
  SetDescription("Set coalesce parameters on a nic");
}

NicCoalesceSet::~NicCoalesceSet() = default;

std::shared_ptr<InputSpec> NicCoalesceSet::GetInputSpecInternal() {
  return MakeInputSpec(kSetParams);
}

std::shared_ptr<OutputSpec> NicCoalesceSet::GetOutputSpecInternal() {
  return BoolResultSpec();
}

void NicCoalesceSet::ExecuteInternal(const std::shared_ptr<Input>& input,
                                     const std::shared_ptr<Output>& output) {
  try {
    RequireFit(*input, kCountFits);
    TvkCtl::Network::NetworkInfoImpl info;
    std::unique_ptr<Pnic> nic = NicHw::FindNic(info, *input, kVmnic, NicHw::PnicNotFound, *output);
    if (!nic)
      return;
    PnicCoalesceParams params{};
    nic->GetCoalesceParams(params);
    for (std::size_t i = 0; i < std::size(kSetTargets); ++i) {
      const std::string param(kSetParams[i + 1].name.View());
      if (!input->HasParameter(param))
        continue;
      const CoalesceTarget& target = kSetTargets[i];
      if (target.count)
        params.*target.count = static_cast<uint32_t>(input->GetParameterInt(param));
      else
        params.*target.flag = input->GetParameterBool(param);
    }
    nic->SetCoalesceParams(params);
    output->SetRootObject(MetaBool::New(true));
  } catch (const HostCtlException& e) {
    output->AddErrorMessage(e.what());
  }
}

// The high and low pairs: each forwards to the routines above with its row.
#define CORVEX_REGIME_GET(Class, Kind, Description)                                                \
  CORVEX_DEFINE_NEW(Class)                                                                         \
  Class::Class() {                                                                                 \
    SetDescription(Description);                                                                   \
    SetRegimeDefaults(*this, Kind);                                                                \
  }                                                                                                \
  Class::~Class() = default;                                                                       \
  std::shared_ptr<InputSpec> Class::GetInputSpecInternal() {                                       \
    return MakeInputSpec(kRegimeGetParams);                                                        \
  }                                                                                                \
  std::shared_ptr<MetaStruct> Class::GetOutputStructure() {                                        \
    return RegimeStructure(Kind);                                                                  \
  }                                                                                                \
  std::shared_ptr<OutputSpec> Class::GetOutputSpecInternal() {                                     \
    return ResultSpec(GetOutputStructure());                                                       \
  }                                                                                                \
  void Class::ExecuteInternal(const std::shared_ptr<Input>& input,                                 \
                              const std::shared_ptr<Output>& output) {                             \
    RegimeGet(Kind, *input, *output);                                                              \
  }

#define CORVEX_REGIME_SET(Class, Kind, Description)                                                \
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
    RegimeSet(Kind, *input, *output);                                                              \
  }

CORVEX_REGIME_GET(NicCoalesceHighGet, kHigh,
                  "Get information about the behavior of a NIC when it sends or receives packets "
                  "at high packet rate.")
CORVEX_REGIME_SET(NicCoalesceHighSet, kHigh,
                  "Set parameters to control the behavior of a NIC when it sends or receives "
                  "packets at high packet rate.")
CORVEX_REGIME_GET(NicCoalesceLowGet, kLow,
                  "Get information about the behavior of a NIC when it sends or receives packets "
                  "at low packet rate.")
CORVEX_REGIME_SET(NicCoalesceLowSet, kLow,
                  "Set parameters to control the behavior of a NIC when it sends or receives "
                  "packets at low packet rate.")

} // namespace CorvexCli::NetworkNamespace
