//===- Lacp.cpp - LACP on distributed switches ----------------------------===//
//
// network vswitch dvs corvex lacp config get | stats get | status get |
// timeout set: the link aggregation groups of the host's distributed
// switches, their LACPDU counters, the negotiated LACP state of each NIC,
// and the short or long LACP timeout.
//
//===----------------------------------------------------------------------===//
#include "vswitch.h"

#include "HostCtl/Lib.h"
#include "HostCtl/Misc.h"
#include "HostCtl/Network/NetworkInfo.h"
#include "TvkCtl/Network/Switching.h"
#include "common/IntFit.h"
#include "common/PolicyParams.h"

#include <cstring>
#include <map>

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
using namespace HostCtl::Network;

namespace {

const std::string kParamDvs = "dvs";
const std::string kParamTimeout = "timeout";
const std::string kParamNicName = "nic-name";
const std::string kParamLagId = "lag-id";
const std::string kParamKrx = "krx";

/// The LAG id goes to the switch as an unsigned 32-bit number.
const IntFit kTimeoutFits[] = {{kParamLagId, 0, kUint32Max}};

const std::string kStructLacp = "LACP";
const std::string kStructLacpStats = "LACPStats";
const std::string kStructLag = "LAG";
const std::string kStructNicStatus = "NicStatus";
const std::string kStructLocalInfo = "LocalInfo";
const std::string kStructPartnerInfo = "PartnerInfo";

const std::string kFieldDvsName = "DVS Name";
const std::string kFieldLagName = "LAG Name";
const std::string kFieldLagId = "LAG ID";
const std::string kFieldNics = "NICs";
const std::string kFieldMode = "Mode";
const std::string kFieldLoadBalance = "Load balance";
const std::string kFieldDVSwitch = "DVSwitch";
const std::string kFieldNic = "NIC";
const std::string kFieldTxLacpdus = "Tx LACPDUs";
const std::string kFieldTxErrors = "Tx Errors";
const std::string kFieldRxLacpdus = "Rx LACPDUs";
const std::string kFieldRxErrors = "Rx Errors";
const std::string kFieldFlags = "Flags";
const std::string kFieldNicList = "Nic List";
const std::string kFieldNicName = "Nic";
const std::string kFieldState = "State";
const std::string kFieldLocalInformation = "Local Information";
const std::string kFieldPartnerInformation = "Partner Information";
const std::string kFieldPortState = "Port State";
const std::string kFieldAdminKey = "Admin Key";
const std::string kFieldOperKey = "Oper Key";
const std::string kFieldPortPriority = "Port Priority";
const std::string kFieldPortNumber = "Port Number";
const std::string kFieldDeviceId = "Device ID";
const std::string kFieldAge = "Age";

const std::string kDefaultLagName = "default_uplink_pg_lag";
const std::string kNoDvs =
    "LACP is supported on Corvex DVSwitch only, and there is no DVSwitch configured on host.";
const std::string kNoRunningLag = "No running LACP group on the host.";
const std::string kNoSuchDvs = "Unable to find DVSwitch ";

/// Names of the bits of an LACP port state, bit 0 first.
const char* const kPortStateBits[] = {"ACT", "FTO", "AGG", "SYN", "COL", "DIST", "DEF", "EXP"};

/// Names of the load-balancing indexes of a LAG.
const char* const kLoadBalanceNames[] = {"None",
                                         "Dst mac",
                                         "Src mac",
                                         "Src and dst mac",
                                         "Dst ip",
                                         "Src ip",
                                         "Src and dst ip",
                                         "Vlan",
                                         "Dst ip and vlan",
                                         "Src ip and vlan",
                                         "Src and dst ip, vlan",
                                         "Dst port",
                                         "Src port",
                                         "Src and dst port",
                                         "Dst ip and dst port",
                                         "Src ip and src port",
                                         "Src and dst ip, port",
                                         "Dst ip and dst port, vlan",
                                         "Src ip and src port, vlan",
                                         "Src and dst ip, port, vlan",
                                         "Src portID"};

/// Legend of the flag letters shown with every LAG.
const std::vector<std::string> kFlagLegend = {
    "S - Device is sending Slow LACPDUs", "F - Device is sending fast LACPDUs",
    "A - Device is in active mode", "P - Device is in passive mode"};

std::string ModeName(uint32_t mode) {
  if (mode == 1)
    return "Active";
  if (mode == 2)
    return "Passive";
  return "None";
}

/// A text field of a runtime record, read up to its NUL or its end.
template <std::size_t N> std::string FieldText(const char (&field)[N]) {
  return std::string(field, strnlen(field, N));
}

std::shared_ptr<InputSpec> DvsSpec() {
  auto spec = InputSpec::New();
  AddParameters(*spec, {{kParamDvs, "s", Fabrik::CallSpec::String, false,
                         "The name of DVS to get configuration on"}});
  return spec;
}

/// The switches a get command works on; false (with an error added) when
/// there are none or the named one does not exist.
bool SelectSwitches(const std::shared_ptr<Input>& input, const std::shared_ptr<Output>& output,
                    std::vector<std::unique_ptr<DVSwitch>>& switches) {
  if (input->HasParameter(kParamDvs)) {
    const std::string& name = input->GetParameter(kParamDvs);
    std::unique_ptr<DVSwitch> dvs = NetworkFactory::GetDVSwitchByName(name);
    if (!dvs) {
      output->AddErrorMessage(kNoSuchDvs + name);
      return false;
    }
    switches.push_back(std::move(dvs));
  } else {
    TvkCtl::Network::VirtualSwitchInfoImpl info;
    switches = info.GetDVSwitches();
    for (auto& opaque : info.GetOpaqueDVSwitches())
      switches.push_back(std::move(opaque));
  }
  if (switches.empty()) {
    output->AddErrorMessage(kNoDvs);
    return false;
  }
  return true;
}

/// Runs a LACP list over the switches SelectSwitches picks: \p addRows(list,
/// dvs) adds the rows of each switch, then \p refusal(list) gives the error
/// that stands instead of the result, or "" for none.
template <typename AddRows, typename Refusal>
void ListLacp(const std::shared_ptr<Input>& input, const std::shared_ptr<Output>& output,
              const std::shared_ptr<MetaStruct>& rowShape, AddRows addRows, Refusal refusal) {
  try {
    std::vector<std::unique_ptr<DVSwitch>> switches;
    if (!SelectSwitches(input, output, switches))
      return;
    auto list = MetaList::New(Fabrik::MetaObj::Struct, rowShape);
    for (const auto& dvs : switches)
      addRows(*list, *dvs);
    std::string message = refusal(*list);
    if (!message.empty()) {
      output->AddErrorMessage(message);
      return;
    }
    output->SetRootObject(list);
  } catch (const HostCtlException& e) {
    output->AddErrorMessage(e.what());
  }
}

std::shared_ptr<MetaStruct> LocalInfoStructure() {
  auto structure = MetaStruct::New(kStructLocalInfo);
  structure->SetField(kFieldPortState, MetaString::New());
  structure->SetField(kFieldFlags, MetaString::New());
  structure->SetField(kFieldAdminKey, MetaInt::New());
  structure->SetField(kFieldOperKey, MetaInt::New());
  structure->SetField(kFieldPortPriority, MetaInt::New());
  structure->SetField(kFieldPortNumber, MetaInt::New());
  return structure;
}

std::shared_ptr<MetaStruct> PartnerInfoStructure() {
  auto structure = MetaStruct::New(kStructPartnerInfo);
  structure->SetField(kFieldDeviceId, MetaString::New());
  structure->SetField(kFieldPortState, MetaString::New());
  structure->SetField(kFieldFlags, MetaString::New());
  structure->SetField(kFieldAge, MetaString::New());
  structure->SetField(kFieldOperKey, MetaInt::New());
  structure->SetField(kFieldPortPriority, MetaInt::New());
  structure->SetField(kFieldPortNumber, MetaInt::New());
  return structure;
}

std::shared_ptr<MetaStruct> NicStatusStructure() {
  auto structure = MetaStruct::New(kStructNicStatus);
  structure->SetField(kFieldNicName, MetaString::New());
  structure->SetField(kFieldState, MetaString::New());
  structure->SetField(kFieldLocalInformation, LocalInfoStructure());
  structure->SetField(kFieldPartnerInformation, PartnerInfoStructure());
  return structure;
}

std::shared_ptr<MetaStruct> NicStatusOf(const LacpNicInfo& nic, bool onDpu) {
  auto status = NicStatusStructure();
  status->SetField(kFieldNicName, FieldText(nic.nicName));
  std::string state = FieldText(nic.state);
  if (onDpu)
    state += " (running state is on dpu)";
  status->SetField(kFieldState, state);
  auto local = LocalInfoStructure();
  local->SetField(kFieldPortState, LacpPortStateToString(nic.actorState));
  local->SetField(kFieldFlags, FieldText(nic.actorFlags));
  local->SetField(kFieldAdminKey, static_cast<long>(nic.actorAdminKey));
  local->SetField(kFieldOperKey, static_cast<long>(nic.actorOperKey));
  local->SetField(kFieldPortPriority, static_cast<long>(nic.actorPortPriority));
  local->SetField(kFieldPortNumber, static_cast<long>(nic.actorPortNumber));
  status->SetField(kFieldLocalInformation, local);
  auto partner = PartnerInfoStructure();
  partner->SetField(kFieldDeviceId, FieldText(nic.partnerDeviceId));
  partner->SetField(kFieldPortState, LacpPortStateToString(nic.partnerState));
  partner->SetField(kFieldFlags, FieldText(nic.partnerFlags));
  partner->SetField(kFieldAge, LacpAgeToString(nic.partnerAge));
  partner->SetField(kFieldOperKey, static_cast<long>(nic.partnerOperKey));
  partner->SetField(kFieldPortPriority, static_cast<long>(nic.partnerPortPriority));
  partner->SetField(kFieldPortNumber, static_cast<long>(nic.partnerPortNumber));
  status->SetField(kFieldPartnerInformation, partner);
  return status;
}

} // namespace

std::string LacpPortStateToString(uint8_t state) {
  std::string text;
  for (int bit = 0; bit < 8; ++bit)
    if (state & (1u << bit))
      text += std::string(kPortStateBits[bit]) + ",";
  return text;
}

std::string LacpAgeToString(uint32_t seconds) {
  return HostCtl::Misc::StrPrintf("%02u:%02u:%02u", seconds / 3600, (seconds % 3600) / 60,
                                  seconds % 60);
}

std::string LacpLoadBalanceToString(uint32_t index) {
  if (index >= std::size(kLoadBalanceNames))
    return "Unknown";
  return kLoadBalanceNames[index];
}

// network vswitch dvs corvex lacp config get

CORVEX_DEFINE_NEW(LacpGetConfig)

LacpGetConfig::LacpGetConfig() {
  SetDescription("Get LACP configuration on DVS");
  SetDefaultOutputFormatter("table");
  SetDefaultOutputParameter("fields:" + kStructLacp,
                            JoinFields({kFieldDvsName, kFieldLagName, kFieldLagId, kFieldNics,
                                        kFieldEnabled, kFieldMode, kFieldLoadBalance}));
}

LacpGetConfig::~LacpGetConfig() = default;

std::shared_ptr<InputSpec> LacpGetConfig::GetInputSpecInternal() {
  return DvsSpec();
}

std::shared_ptr<MetaStruct> LacpGetConfig::GetOutputStructure() {
  auto structure = MetaStruct::New(kStructLacp);
  structure->SetField(kFieldDvsName, MetaString::New());
  structure->SetField(kFieldLagName, MetaString::New());
  structure->SetField(kFieldLagId, MetaString::New());
  structure->SetField(kFieldNics, MetaString::New());
  structure->SetField(kFieldEnabled, MetaBool::New());
  structure->SetField(kFieldMode, MetaString::New());
  structure->SetField(kFieldLoadBalance, MetaString::New());
  return structure;
}

std::shared_ptr<OutputSpec> LacpGetConfig::GetOutputSpecInternal() {
  return ListResultSpec(GetOutputStructure());
}

void LacpGetConfig::ExecuteInternal(const std::shared_ptr<Input>& input,
                                    const std::shared_ptr<Output>& output) {
  ListLacp(
      input, output, GetOutputStructure(),
      [&](MetaList& list, DVSwitch& dvs) {
        std::string displayName = dvs.GetDisplayName();
        std::map<std::string, DVPortParam> uplinkMap = dvs.GetUplinkPortMap();
        if (uplinkMap.empty()) {
          // LACP may be set on the uplink port group: one row per group key.
          std::map<std::string, DVUplinkPortLacp> byGroup;
          for (const DVUplinkPortLacp& port : dvs.GetUplinkPortLacp())
            if (port.lacpEnabled)
              byGroup.emplace(port.uplinkPortgroupKey, port);
          for (const auto& [key, port] : byGroup) {
            auto row = GetOutputStructure();
            row->SetField(kFieldDvsName, displayName);
            row->SetField(kFieldLagName, kDefaultLagName);
            row->SetField(kFieldLagId, "0");
            row->SetField(kFieldEnabled, port.lacpEnabled);
            row->SetField(kFieldMode, port.lacpEnabled ? ModeName(port.mode) : std::string());
            row->SetField(kFieldLoadBalance, "---");
            list.Add(row);
          }
          return;
        }
        // The name of each uplink's port, in NIC-name order.
        std::vector<std::pair<std::string, std::string>> portNames;
        for (const auto& [nic, param] : uplinkMap) {
          std::unique_ptr<DVPort> port = NetworkFactory::GetDVPort(param);
          portNames.emplace_back(nic, port ? port->GetName() : std::string());
        }
        for (const LagConfig& lag : dvs.GetLagConfigs()) {
          std::string lagName = FieldText(lag.lagName);
          std::string nics;
          for (uint32_t i = 0; i < lag.uplinkCount; ++i) {
            std::string portName = lagName + "-" + std::to_string(i);
            for (const auto& [nic, name] : portNames)
              if (name == portName) {
                nics += (nics.empty() ? "" : ",") + nic;
                break;
              }
          }
          auto row = GetOutputStructure();
          row->SetField(kFieldDvsName, displayName);
          row->SetField(kFieldLagName, lagName);
          row->SetField(kFieldLagId, FieldText(lag.lagId));
          row->SetField(kFieldNics, nics);
          row->SetField(kFieldEnabled, true);
          row->SetField(kFieldMode, ModeName(lag.mode));
          row->SetField(kFieldLoadBalance, LacpLoadBalanceToString(lag.loadBalancing));
          list.Add(row);
        }
      },
      [](const MetaList& list) {
        return list.GetCount() == 0 ? std::string("LACP is disabled on DVSwitch.") : std::string();
      });
}

// network vswitch dvs corvex lacp status get

CORVEX_DEFINE_NEW(LacpGetStatus)

LacpGetStatus::LacpGetStatus() {
  SetDescription("Get LACP status on DVS");
  SetDefaultOutputFormatter("simple");
  SetDefaultOutputParameter("header:" + kStructLag, "%" + kFieldDVSwitch + "%");
  SetDefaultOutputParameter("header:" + kStructNicStatus, "<NONE>");
  SetDefaultOutputParameter("header:" + kStructLocalInfo, "<NONE>");
  SetDefaultOutputParameter("header:" + kStructPartnerInfo, "<NONE>");
  SetDefaultOutputParameter(
      "table-columns:" + kStructLag,
      JoinFields({kFieldDVSwitch, kFieldLagId, kFieldMode, kFieldAge, kFieldFlags, kFieldNicList}));
  SetDefaultOutputParameter(
      "table-columns:" + kStructNicStatus,
      JoinFields({kFieldNicName, kFieldState, kFieldLocalInformation, kFieldPartnerInformation}));
  SetDefaultOutputParameter("table-columns:" + kStructLocalInfo,
                            JoinFields({kFieldFlags, kFieldAdminKey, kFieldOperKey,
                                        kFieldPortPriority, kFieldPortNumber, kFieldPortState}));
  SetDefaultOutputParameter("table-columns:" + kStructPartnerInfo,
                            JoinFields({kFieldDeviceId, kFieldAge, kFieldFlags, kFieldOperKey,
                                        kFieldPortPriority, kFieldPortNumber, kFieldPortState}));
}

LacpGetStatus::~LacpGetStatus() = default;

std::shared_ptr<InputSpec> LacpGetStatus::GetInputSpecInternal() {
  return DvsSpec();
}

std::shared_ptr<MetaStruct> LacpGetStatus::GetOutputStructure() {
  auto structure = MetaStruct::New(kStructLag);
  structure->SetField(kFieldDVSwitch, MetaString::New());
  structure->SetField(kFieldLagId, MetaInt::New());
  structure->SetField(kFieldMode, MetaString::New());
  structure->SetField(kFieldFlags, MetaList::New(Fabrik::MetaObj::String));
  structure->SetField(kFieldNicList, MetaList::New(Fabrik::MetaObj::Struct, NicStatusStructure()));
  return structure;
}

std::shared_ptr<OutputSpec> LacpGetStatus::GetOutputSpecInternal() {
  return ListResultSpec(GetOutputStructure());
}

void LacpGetStatus::ExecuteInternal(const std::shared_ptr<Input>& input,
                                    const std::shared_ptr<Output>& output) {
  ListLacp(
      input, output, GetOutputStructure(),
      [&](MetaList& list, DVSwitch& dvs) {
        std::vector<LacpLagInfo> lags;
        dvs.GetLacpInfo(lags);
        if (lags.empty())
          return;
        std::string displayName = dvs.GetDisplayName();
        bool onDpu = dvs.IsLacpOnDpu();
        for (const LacpLagInfo& lag : lags) {
          auto row = GetOutputStructure();
          row->SetField(kFieldDVSwitch, displayName);
          row->SetField(kFieldLagId, static_cast<long>(lag.lagId));
          row->SetField(kFieldMode, lag.mode == 2 ? "Passive" : "Active");
          row->SetField(kFieldFlags, kFlagLegend);
          auto nics = MetaList::New(Fabrik::MetaObj::Struct, NicStatusStructure());
          for (const auto& nic : lag.nics)
            if (nic)
              nics->Add(NicStatusOf(*nic, onDpu));
          row->SetField(kFieldNicList, nics);
          list.Add(row);
        }
      },
      [](const MetaList& list) { return list.GetCount() == 0 ? kNoRunningLag : std::string(); });
}

// network vswitch dvs corvex lacp stats get

CORVEX_DEFINE_NEW(LacpGetStats)

LacpGetStats::LacpGetStats() {
  SetDescription("Get LACP stats on DVS uplinks");
  SetDefaultOutputFormatter("table");
  SetDefaultOutputParameter("fields:" + kStructLacp,
                            "Uplink, Tx LACPDUs, Tx Errors, Rx LACPDUs, Rx Errors");
}

LacpGetStats::~LacpGetStats() = default;

std::shared_ptr<InputSpec> LacpGetStats::GetInputSpecInternal() {
  return DvsSpec();
}

std::shared_ptr<MetaStruct> LacpGetStats::GetOutputStructure() {
  auto structure = MetaStruct::New(kStructLacpStats);
  structure->SetField(kFieldDVSwitch, MetaString::New());
  structure->SetField(kFieldNic, MetaString::New());
  structure->SetField(kFieldLagId, MetaInt::New());
  structure->SetField(kFieldTxLacpdus, MetaInt::New());
  structure->SetField(kFieldTxErrors, MetaInt::New());
  structure->SetField(kFieldRxLacpdus, MetaInt::New());
  structure->SetField(kFieldRxErrors, MetaInt::New());
  return structure;
}

std::shared_ptr<OutputSpec> LacpGetStats::GetOutputSpecInternal() {
  return ListResultSpec(GetOutputStructure());
}

void LacpGetStats::ExecuteInternal(const std::shared_ptr<Input>& input,
                                   const std::shared_ptr<Output>& output) {
  std::size_t lagCount = 0;
  ListLacp(
      input, output, GetOutputStructure(),
      [&](MetaList& list, DVSwitch& dvs) {
        std::vector<LacpLagInfo> lags;
        dvs.GetLacpInfo(lags);
        lagCount += lags.size();
        std::string displayName = lags.empty() ? std::string() : dvs.GetDisplayName();
        for (const LacpLagInfo& lag : lags)
          for (const auto& nic : lag.nics) {
            if (!nic)
              continue;
            auto row = GetOutputStructure();
            row->SetField(kFieldDVSwitch, displayName);
            row->SetField(kFieldNic, FieldText(nic->nicName));
            row->SetField(kFieldLagId, static_cast<long>(lag.lagId));
            row->SetField(kFieldTxLacpdus, static_cast<long>(nic->txLacpdus));
            row->SetField(kFieldTxErrors, static_cast<long>(nic->txErrors));
            row->SetField(kFieldRxLacpdus, static_cast<long>(nic->rxLacpdus));
            row->SetField(kFieldRxErrors, static_cast<long>(nic->rxErrors));
            list.Add(row);
          }
      },
      [&](const MetaList& list) {
        if (lagCount == 0)
          return kNoRunningLag;
        return list.GetCount() == 0 ? std::string("No pnic is connected to DVSwitch.")
                                    : std::string();
      });
}

// network vswitch dvs corvex lacp timeout set

CORVEX_DEFINE_NEW(LacpSetTimeout)

LacpSetTimeout::LacpSetTimeout() {
  SetDescription("Set long/short timeout for vmnics in one LACP LAG");
}

LacpSetTimeout::~LacpSetTimeout() = default;

std::shared_ptr<InputSpec> LacpSetTimeout::GetInputSpecInternal() {
  auto spec = InputSpec::New();
  AddParameters(
      *spec,
      {{kParamTimeout, "t", Fabrik::CallSpec::Boolean, true,
        "Set long or short timeout: 1 for short timeout and 0 for long timeout."},
       {kParamNicName, "n", Fabrik::CallSpec::String, false,
        "The nic name. If it is set, then only this vmnic in the lag will be configured."},
       {kParamLagId, "l", Fabrik::CallSpec::Integer, true, "The ID of LAG to be configured."},
       {kParamKrx, "s", Fabrik::CallSpec::String, true, "The name of KRX."}});
  return spec;
}

std::shared_ptr<OutputSpec> LacpSetTimeout::GetOutputSpecInternal() {
  return BoolResultSpec();
}

void LacpSetTimeout::ExecuteInternal(const std::shared_ptr<Input>& input,
                                     const std::shared_ptr<Output>& output) {
  try {
    if (!input->HasParameter(kParamTimeout)) {
      output->AddErrorMessage("Timeout is empty");
      return;
    }
    if (!input->HasParameter(kParamKrx)) {
      output->AddErrorMessage("KRX name is empty");
      return;
    }
    const std::string& name = input->GetParameter(kParamKrx);
    std::unique_ptr<DVSwitch> dvs = NetworkFactory::GetDVSwitchByName(name);
    if (!dvs) {
      output->AddErrorMessage(kNoSuchDvs + name);
      return;
    }
    if (!input->HasParameter(kParamLagId)) {
      output->AddErrorMessage("LAG ID is empty");
      return;
    }
    if (auto problem = OutOfRange(*input, kTimeoutFits[0])) {
      output->AddErrorMessage(*problem);
      return;
    }
    long lagId = input->GetParameterInt(kParamLagId);
    std::string nicName;
    if (input->HasParameter(kParamNicName))
      nicName = input->GetParameter(kParamNicName);
    dvs->SetLacpTimeout(static_cast<uint32_t>(lagId), input->GetParameterBool(kParamTimeout),
                        nicName);
    output->SetRootObject(MetaBool::New(true));
  } catch (const HostCtlException& e) {
    output->AddErrorMessage(e.what());
  }
}

} // namespace CorvexCli::NetworkNamespace
