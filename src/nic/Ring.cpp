//===- Ring.cpp - Ring sizes and pause parameters of a physical NIC -------===//
//
// network nic ring current get|set, network nic ring preset get and
// network nic pauseParams list|set. Rings and pause flags are declared in
// tables: each ring is one row (field, maximum field, parameter, record
// member), each pause flag one row.
//
//===----------------------------------------------------------------------===//
#include "nic.h"

#include "HostCtl/Lib.h"
#include "HostCtl/Network/PnicHwRecords.h"
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
using HostCtl::Network::PnicPauseParams;
using HostCtl::Network::PnicRingParams;

namespace {

constexpr auto kString = Fabrik::CallSpec::String;
constexpr auto kInteger = Fabrik::CallSpec::Integer;
constexpr auto kBoolean = Fabrik::CallSpec::Boolean;

const std::string kNicName = "nic-name";
const std::string kRx = "rx";
const std::string kRxMini = "rx-mini";
const std::string kRxJumbo = "rx-jumbo";
const std::string kTx = "tx";
const std::string kAuto = "auto";

const std::string kRingStruct = "RingInfo";
const std::string kRxField = "RX";
const std::string kRxMiniField = "RX Mini";
const std::string kRxJumboField = "RX Jumbo";
const std::string kTxField = "TX";
const std::string kMaxRxField = "Max RX";
const std::string kMaxRxMiniField = "Max RX Mini";
const std::string kMaxRxJumboField = "Max RX Jumbo";
const std::string kMaxTxField = "Max TX";

const std::string kPauseStruct = "PauseParamsSettings";
const std::string kNic = "NIC";
const std::string kSupported = "Pause Params Supported";
const std::string kAutoNegotiation = "Auto Negotiation";
const std::string kPauseRx = "Pause RX";
const std::string kPauseTx = "Pause TX";
const std::string kResolutionAvail = "Auto Negotiation Resolution Avail";
const std::string kRxResolution = "RX Auto Negotiation Resolution";
const std::string kTxResolution = "TX Auto Negotiation Resolution";

/// One ring: its result fields, set parameter and record member.
struct Ring {
  const std::string& field;         ///< Field of the current size.
  const std::string& maxField;      ///< Field of the preset maximum.
  uint32_t PnicRingParams::*member; ///< Record field.
};

const Ring kRings[] = {
    {kRxField, kMaxRxField, &PnicRingParams::rx},
    {kRxMiniField, kMaxRxMiniField, &PnicRingParams::rxMini},
    {kRxJumboField, kMaxRxJumboField, &PnicRingParams::rxJumbo},
    {kTxField, kMaxTxField, &PnicRingParams::tx},
};

const std::string* const kCurrentFields[] = {&kRxField, &kRxMiniField, &kRxJumboField, &kTxField};
const std::string* const kMaxFields[] = {&kMaxRxField, &kMaxRxMiniField, &kMaxRxJumboField,
                                         &kMaxTxField};

const ParameterDef kCurrentGetParams[] = {
    {kNicName, "n", kString, true,
     "The name of the NIC whose current RX/TX ring buffer parameters should be retrieved."}};

const ParameterDef kPresetGetParams[] = {
    {kNicName, "n", kString, true,
     "The name of the NIC whose preset maximums for RX/TX ring buffer parameters should be "
     "retrieved."}};

/// The set parameters; the four sizes are in kRings order.
const ParameterDef kCurrentSetParams[] = {
    {kNicName, "n", kString, true,
     "The name of the NIC whose current RX/TX ring buffer parameters should be set."},
    {kRx, "r", kInteger, false, "Number of ring entries for the RX ring."},
    {kRxMini, "m", kInteger, false, "Number of ring entries for the RX mini ring."},
    {kRxJumbo, "j", kInteger, false, "Number of ring entries for the RX jumbo ring."},
    {kTx, "t", kInteger, false, "Number of ring entries for the TX ring."},
};

/// Ring sizes are unsigned 32-bit counts.
const IntFit kRingFits[] = {
    {kRx, 0, kUint32Max},
    {kRxMini, 0, kUint32Max},
    {kRxJumbo, 0, kUint32Max},
    {kTx, 0, kUint32Max},
};

/// Fields of "PauseParamsSettings" after "NIC", in structure order.
const std::string* const kPauseFields[] = {&kSupported,   &kAutoNegotiation, &kPauseRx,
                                           &kPauseTx,     &kResolutionAvail, &kRxResolution,
                                           &kTxResolution};

/// Display order of the pause list.
const std::string* const kPauseDisplay[] = {&kNic,          &kSupported,       &kPauseRx,
                                            &kPauseTx,      &kAutoNegotiation, &kResolutionAvail,
                                            &kRxResolution, &kTxResolution};

const ParameterDef kPauseListParams[] = {{kNicName, "n", kString, false,
                                          "The name of the NIC whose pause parameters should be "
                                          "retrieved."}};

/// The set parameters; the three flags are in kPauseSetFlags order.
const ParameterDef kPauseSetParams[] = {
    {kNicName, "n", kString, true, "Name of NIC whose pause parameters should be set."},
    {kAuto, "a", kBoolean, false, "Enable/disable auto negotiation."},
    {kRx, "r", kBoolean, false, "Enable/disable pause RX flow control."},
    {kTx, "t", kBoolean, false, "Enable/disable pause TX flow control."},
};

bool PnicPauseParams::*const kPauseSetFlags[] = {&PnicPauseParams::autoNegotiation,
                                                 &PnicPauseParams::rx, &PnicPauseParams::tx};

std::string NicNotFound(const std::string& name) {
  return "NIC with name " + name + " not found";
}

/// The NIC named by `nic-name`, or null after adding the error.
std::unique_ptr<Pnic> FindNic(HostCtl::Network::NetworkInfo& info, const Input& input,
                              Output& output) {
  return NicHw::FindNic(info, input, kNicName, NicNotFound, output);
}

std::shared_ptr<MetaStruct> RingStructure(bool withMaximums) {
  auto structure = MetaStruct::New(kRingStruct);
  for (const Ring& ring : kRings)
    structure->SetField(ring.field, MetaInt::New());
  if (withMaximums)
    for (const Ring& ring : kRings)
      structure->SetField(ring.maxField, MetaInt::New());
  return structure;
}

/// Reads the ring sizes of the NIC named by `nic-name` and fills a RingInfo
/// structure: the current sizes, or the preset maximums (twice) when
/// \p preset.
void RingGet(bool preset, const Input& input, Output& output) {
  try {
    std::unique_ptr<HostCtl::Network::NetworkInfo> info =
        HostCtl::Network::NetworkFactory::GetNetworkInfo();
    std::unique_ptr<Pnic> nic = FindNic(*info, input, output);
    if (!nic)
      return;
    PnicRingParams maximums{};
    PnicRingParams current{};
    nic->GetRingParams(maximums, current);
    auto result = RingStructure(preset);
    const PnicRingParams& shown = preset ? maximums : current;
    for (const Ring& ring : kRings)
      result->SetField(ring.field, static_cast<long>(shown.*ring.member));
    if (preset)
      for (const Ring& ring : kRings)
        result->SetField(ring.maxField, static_cast<long>(maximums.*ring.member));
    output.SetRootObject(result);
  } catch (const HostCtlException& e) {
    output.AddErrorMessage(e.what());
  }
}

} // namespace

// network nic ring preset get

CORVEX_DEFINE_NEW(NicRingPresetGet)

NicRingPresetGet::NicRingPresetGet() {
  SetDescription("Get preset maximums for RX/TX ring buffer parameters of a NIC.");
  SetDefaultOutputFormatter("simple");
  SetDefaultOutputParameter("fields:" + kRingStruct, NicHw::JoinFields(kMaxFields));
}

NicRingPresetGet::~NicRingPresetGet() = default;

std::shared_ptr<InputSpec> NicRingPresetGet::GetInputSpecInternal() {
  return MakeInputSpec(kPresetGetParams);
}

std::shared_ptr<MetaStruct> NicRingPresetGet::GetOutputStructure() {
  return RingStructure(true);
}

std::shared_ptr<OutputSpec> NicRingPresetGet::GetOutputSpecInternal() {
  return ResultSpec(GetOutputStructure());
}

void NicRingPresetGet::ExecuteInternal(const std::shared_ptr<Input>& input,
                                       const std::shared_ptr<Output>& output) {
  RingGet(true, *input, *output);
}

// network nic ring current get

CORVEX_DEFINE_NEW(NicRingCurrentGet)

NicRingCurrentGet::NicRingCurrentGet() {
  SetDescription("Get current RX/TX ring buffer parameters of a NIC");
  SetDefaultOutputFormatter("simple");
  SetDefaultOutputParameter("fields:" + kRingStruct, NicHw::JoinFields(kCurrentFields));
}

NicRingCurrentGet::~NicRingCurrentGet() = default;

std::shared_ptr<InputSpec> NicRingCurrentGet::GetInputSpecInternal() {
  return MakeInputSpec(kCurrentGetParams);
}

std::shared_ptr<MetaStruct> NicRingCurrentGet::GetOutputStructure() {
  return RingStructure(false);
}

std::shared_ptr<OutputSpec> NicRingCurrentGet::GetOutputSpecInternal() {
  return ResultSpec(GetOutputStructure());
}

void NicRingCurrentGet::ExecuteInternal(const std::shared_ptr<Input>& input,
                                        const std::shared_ptr<Output>& output) {
  RingGet(false, *input, *output);
}

// network nic ring current set

CORVEX_DEFINE_NEW(NicRingCurrentSet)

NicRingCurrentSet::NicRingCurrentSet() {
  SetDescription("Set current RX/TX ring buffer parameters of a NIC");
}

NicRingCurrentSet::~NicRingCurrentSet() = default;

std::shared_ptr<InputSpec> NicRingCurrentSet::GetInputSpecInternal() {
  return MakeInputSpec(kCurrentSetParams);
}

std::shared_ptr<OutputSpec> NicRingCurrentSet::GetOutputSpecInternal() {
  return BoolResultSpec();
}

void NicRingCurrentSet::ExecuteInternal(const std::shared_ptr<Input>& input,
                                        const std::shared_ptr<Output>& output) {
  try {
    RequireFit(*input, kRingFits);
    std::unique_ptr<HostCtl::Network::NetworkInfo> info =
        HostCtl::Network::NetworkFactory::GetNetworkInfo();
    std::unique_ptr<Pnic> nic = FindNic(*info, *input, *output);
    if (!nic)
      return;
    PnicRingParams sizes{};
    for (std::size_t i = 0; i < std::size(kRings); ++i) {
      const std::string param(kCurrentSetParams[i + 1].name.View());
      if (input->HasParameter(param))
        sizes.*kRings[i].member = static_cast<uint32_t>(input->GetParameterInt(param));
    }
    nic->SetRingParams(sizes);
    output->SetRootObject(MetaBool::New(true));
  } catch (const HostCtlException& e) {
    output->AddErrorMessage(e.what());
  }
}

// network nic pauseParams list

CORVEX_DEFINE_NEW(NicPauseParamsList)

NicPauseParamsList::NicPauseParamsList() {
  SetDescription("List pause parameters of all NICs");
  SetDefaultOutputFormatter("table");
  SetDefaultOutputParameter("fields:" + kPauseStruct, NicHw::JoinFields(kPauseDisplay));
}

NicPauseParamsList::~NicPauseParamsList() = default;

std::shared_ptr<InputSpec> NicPauseParamsList::GetInputSpecInternal() {
  return MakeInputSpec(kPauseListParams);
}

std::shared_ptr<MetaStruct> NicPauseParamsList::GetOutputStructure() {
  auto structure = MetaStruct::New(kPauseStruct);
  structure->SetField(kNic, MetaString::New());
  for (const std::string* field : kPauseFields)
    structure->SetField(*field, MetaBool::New());
  return structure;
}

std::shared_ptr<OutputSpec> NicPauseParamsList::GetOutputSpecInternal() {
  return ListResultSpec(GetOutputStructure());
}

void NicPauseParamsList::ExecuteInternal(const std::shared_ptr<Input>& input,
                                         const std::shared_ptr<Output>& output) {
  try {
    std::unique_ptr<HostCtl::Network::NetworkInfo> info =
        HostCtl::Network::NetworkFactory::GetNetworkInfo();
    auto list = MetaList::New(Fabrik::MetaObj::Struct, GetOutputStructure());
    std::vector<std::unique_ptr<Pnic>> nics;
    if (!NicHw::SelectNics(*info, *input, kNicName, NicNotFound, *output, nics))
      return;
    PnicPauseParams params{};
    for (const std::unique_ptr<Pnic>& nic : nics) {
      if (!nic)
        continue;
      // Structure order: supported, auto-negotiation, RX, TX, resolution
      // available, RX resolution, TX resolution.
      bool values[std::size(kPauseFields)] = {};
      try {
        nic->GetPauseParams(params);
        if (params.supported) {
          bool resolved = params.rxResolution != 0 && params.txResolution != 0;
          values[0] = true;
          values[1] = params.autoNegotiation;
          values[2] = params.rx;
          values[3] = params.tx;
          values[4] = resolved;
          values[5] = resolved && params.rxResolution == 1;
          values[6] = resolved && params.txResolution == 1;
        }
      } catch (const HostCtlException&) {
        std::fill(std::begin(values), std::end(values), false);
      }
      auto row = GetOutputStructure();
      row->SetField(kNic, nic->GetName());
      for (std::size_t i = 0; i < std::size(kPauseFields); ++i)
        row->SetField(*kPauseFields[i], values[i]);
      list->Add(row);
    }
    output->SetRootObject(list);
  } catch (const HostCtlException& e) {
    output->AddErrorMessage(e.what());
  }
}

// network nic pauseParams set

CORVEX_DEFINE_NEW(NicPauseParamsSet)

NicPauseParamsSet::NicPauseParamsSet() {
  SetDescription("Set pause parameters for a NIC");
}

NicPauseParamsSet::~NicPauseParamsSet() = default;

std::shared_ptr<InputSpec> NicPauseParamsSet::GetInputSpecInternal() {
  return MakeInputSpec(kPauseSetParams);
}

std::shared_ptr<OutputSpec> NicPauseParamsSet::GetOutputSpecInternal() {
  return BoolResultSpec();
}

void NicPauseParamsSet::ExecuteInternal(const std::shared_ptr<Input>& input,
                                        const std::shared_ptr<Output>& output) {
  try {
    std::unique_ptr<HostCtl::Network::NetworkInfo> info =
        HostCtl::Network::NetworkFactory::GetNetworkInfo();
    std::unique_ptr<Pnic> nic = FindNic(*info, *input, *output);
    if (!nic)
      return;
    PnicPauseParams params{};
    nic->GetPauseParams(params);
    for (std::size_t i = 0; i < std::size(kPauseSetFlags); ++i) {
      const std::string param(kPauseSetParams[i + 1].name.View());
      if (input->HasParameter(param))
        params.*kPauseSetFlags[i] = input->GetParameterBool(param);
    }
    nic->SetPauseParams(params);
    output->SetRootObject(MetaBool::New(true));
  } catch (const HostCtlException& e) {
    output->AddErrorMessage(e.what());
  }
}

} // namespace CorvexCli::NetworkNamespace
