//===- Netqueue.cpp - NetQueue counts, filter classes and load balancer ---===//
//
// network nic queue count get|set, network nic queue filterclass list and
// network nic queue loadbalancer list|set, plugin list|set, state list|set.
// All of them exchange one PnicNetqueueInfo record with the NIC. The eleven
// load-balancer settings and the six filter classes are tables; the sets
// send a zeroed record whose selection flags and mask name what changes.
//
//===----------------------------------------------------------------------===//
#include "nic.h"

#include "HostCtl/Lib.h"
#include "HostCtl/Network/PnicHwRecords.h"
#include "common/IntFit.h"
#include "nic/HwCommon.h"

#include <algorithm>
#include <functional>

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
using HostCtl::Network::kNetqueueFilterClassCount;
using HostCtl::Network::kNetqueueSettingCount;
using HostCtl::Network::NetworkInfo;
using HostCtl::Network::Pnic;
using HostCtl::Network::PnicNetqueueInfo;
using HostCtl::Network::PnicNetqueuePluginInfo;

namespace {

constexpr auto kString = Fabrik::CallSpec::String;
constexpr auto kInteger = Fabrik::CallSpec::Integer;
constexpr auto kBoolean = Fabrik::CallSpec::Boolean;

const std::string kVmnic = "vmnic";
const std::string kTx = "tx";
const std::string kRx = "rx";
const std::string kNum = "num";
const std::string kEnable = "enable";
const std::string kModule = "module";
const std::string kPlugin = "plugin";
const std::string kRxqpair = "rxqpair";
const std::string kRxqnofeat = "rxqnofeat";
const std::string kRxqpreempt = "rxqpreempt";
const std::string kRxqlatency = "rxqlatency";
const std::string kRxdynlb = "rxdynlb";
const std::string kDynpoollb = "dynpoollb";
const std::string kMaclearnlb = "maclearnlb";
const std::string kRsslb = "rsslb";
const std::string kLrolb = "lrolb";
const std::string kGeneveoamlb = "geneveoamlb";
const std::string kRsslrolb = "rsslrolb";

const std::string kNic = "NIC";
const std::string kCountStruct = "NetqueueCount";
const std::string kTxCount = "Tx netqueue count";
const std::string kRxCount = "Rx netqueue count";
const std::string kSettingsStruct = "Settings";
const std::string kMacOnly = "MacOnly";
const std::string kVlanOnly = "VlanOnly";
const std::string kVlanMac = "VlanMac";
const std::string kVxlan = "Vxlan";
const std::string kGeneve = "Geneve";
const std::string kGenericEncap = "GenericEncap";
const std::string kPluginStruct = "NetqBalPlugin";
const std::string kModuleName = "Module Name";
const std::string kPluginName = "Plugin Name";
const std::string kEnabled = "Enabled";
const std::string kDescription = "Description";
const std::string kStateStruct = "NetqBalState";
const std::string kRxQPair = "RxQPair";
const std::string kRxQNoFeature = "RxQNoFeature";
const std::string kPreEmptibleQ = "PreEmptibleQ";
const std::string kRxQLatency = "RxQLatency";
const std::string kRxDynamicLB = "RxDynamicLB";
const std::string kDynamicQPool = "DynamicQPool";
const std::string kMacLearnLB = "MacLearnLB";
const std::string kRSS = "RSS";
const std::string kLRO = "LRO";
const std::string kGeneveOAM = "GeneveOAM";
const std::string kRSSLRO = "RSSLRO";

/// One load-balancer setting, in record order (its index is its mask bit).
struct LbSetting {
  const std::string& column; ///< Column of the settings list.
  ParameterDef param;        ///< Parameter of the settings set.
  bool supportShown;         ///< The list shows S/U; otherwise N.
};

const LbSetting kLbSettings[kNetqueueSettingCount] = {
    {kRxQPair,
     {kRxqpair, "", kBoolean, false, "Configure Rx queue pair at netqueue load balancer."},
     true},
    {kRxQNoFeature,
     {kRxqnofeat, "", kBoolean, false, "Configure Rx queue no feature at netqueue load balancer."},
     false},
    {kPreEmptibleQ,
     {kRxqpreempt, "", kBoolean, false, "Configure pre-emptible queue at netqueue load balancer."},
     true},
    {kRxQLatency,
     {kRxqlatency, "", kBoolean, false, "Configure Rx queue latency at netqueue load balancer."},
     true},
    {kRxDynamicLB,
     {kRxdynlb, "", kBoolean, false,
      "Configure RX dynamic load balancing at netqueue load balancer."},
     false},
    {kDynamicQPool,
     {kDynpoollb, "", kBoolean, false, "Configure Dynamic queue pool at netqueue load balancer."},
     true},
    {kMacLearnLB,
     {kMaclearnlb, "", kBoolean, false,
      "Configure Mac learn load balancing at netqueue load balancer."},
     false},
    {kRSS,
     {kRsslb, "", kBoolean, false, "Configure Receive Side Scaling at netqueue load balancer."},
     true},
    {kLRO,
     {kLrolb, "", kBoolean, false, "Configure Large Receive Offload at netqueue load balancer."},
     true},
    {kGeneveOAM,
     {kGeneveoamlb, "", kBoolean, false, "Configure Geneve OAM at netqueue load balancer."},
     true},
    {kRSSLRO,
     {kRsslrolb, "", kBoolean, false,
      "Configure Receive Side Scaling with Large Receive Offload at netqueue load balancer."},
     true},
};

/// Columns of the filter-class list, in record order.
const std::string* const kFilterClassFields[kNetqueueFilterClassCount] = {
    &kMacOnly, &kVlanOnly, &kVlanMac, &kVxlan, &kGeneve, &kGenericEncap};

const ParameterDef kCountGetParams[] = {
    {kVmnic, "n", kString, false, "The name of pnic to get netqueue count"}};

const ParameterDef kCountSetParams[] = {
    {kVmnic, "n", kString, true, "Name of vmnic to set netqueue count."},
    {kTx, "t", kBoolean, false, "Tx netqueue to set count."},
    {kRx, "r", kBoolean, false, "Rx netqueue to set count."},
    {kNum, "q", kInteger, true, "Number of queues to set."},
};

const ParameterDef kLbSetVmnic = {kVmnic, "n", kString, true,
                                  "Name of vmnic to update netqueue load balancer setting."};

const ParameterDef kPluginListParams[] = {
    {kVmnic, "n", kString, false, "The name of pnic to get netqueue plugin details"}};

const ParameterDef kPluginSetParams[] = {
    {kVmnic, "n", kString, true, "Name of vmnic to change netqueue balancer plugin state"},
    {kEnable, "e", kBoolean, true, "Netqueue balancer plugin state"},
    {kModule, "m", kString, true, "Name of netqueue balancer module"},
    {kPlugin, "p", kString, true, "Name of netqueue balancer plugin"},
};

const ParameterDef kStateListParams[] = {
    {kVmnic, "n", kString, false, "The name of pnic to get netqueue balancer state"}};

const ParameterDef kStateSetParams[] = {
    {kVmnic, "n", kString, true, "Name of vmnic to change netqueue balancer state"},
    {kEnable, "e", kBoolean, true, "Netqueue balancer state"},
};

std::string InvalidPnic(const std::string& name) {
  return "Invalid PNIC name " + name;
}

std::unique_ptr<NetworkInfo> Root() {
  return HostCtl::Network::NetworkFactory::GetNetworkInfo();
}

/// The loop of the count, plugin and state lists: for each selected NIC a
/// zeroed record is filled and handed to \p addRows. A NIC whose record
/// cannot be read ends the command with its message when `vmnic` was given
/// and is left out otherwise. Gives false when the command has failed.
template <typename AddRows>
bool ForEachNetqueue(NetworkInfo& info, const Input& input, NicHw::NotFoundText notFound,
                     Output& output, AddRows addRows) {
  std::vector<std::unique_ptr<Pnic>> nics;
  if (!NicHw::SelectNics(info, input, kVmnic, notFound, output, nics))
    return false;
  bool named = input.HasParameter(kVmnic);
  for (const std::unique_ptr<Pnic>& nic : nics) {
    if (!nic)
      continue;
    PnicNetqueueInfo record{};
    try {
      nic->GetNetqueueInfo(record);
    } catch (const HostCtlException& e) {
      if (!named)
        continue;
      output.AddErrorMessage(e.what());
      return false;
    }
    addRows(*nic, record);
  }
  return true;
}

/// The list over every NIC that skips unreadable NICs silently, reusing one
/// record zeroed before the loop.
template <typename AddRow> void ForEachNetqueueQuietly(NetworkInfo& info, AddRow addRow) {
  std::vector<std::unique_ptr<Pnic>> nics = info.GetPnics(HostCtl::Network::PnicGetAll);
  PnicNetqueueInfo record{};
  for (const std::unique_ptr<Pnic>& nic : nics) {
    if (!nic)
      continue;
    try {
      nic->GetNetqueueInfo(record);
    } catch (const HostCtlException&) {
      continue;
    }
    addRow(*nic, record);
  }
}

/// Runs a list of the count, plugin or state kind: a list of \p rowShape
/// holding the rows \p addRows adds for each NIC that ForEachNetqueue visits,
/// or no result when that fails.
template <typename AddRows>
void ListNetqueues(const Input& input, Output& output, NicHw::NotFoundText notFound,
                   const std::shared_ptr<MetaStruct>& rowShape, AddRows addRows) {
  try {
    std::unique_ptr<NetworkInfo> info = Root();
    auto list = MetaList::New(Fabrik::MetaObj::Struct, rowShape);
    if (ForEachNetqueue(
            *info, input, notFound, output,
            [&](Pnic& nic, const PnicNetqueueInfo& record) { addRows(*list, nic, record); }))
      output.SetRootObject(list);
  } catch (const HostCtlException& e) {
    output.AddErrorMessage(e.what());
  }
}

/// Runs a list over every NIC that leaves unreadable NICs out: one row from
/// \p newRow per readable NIC, holding its name and the values \p fillRow sets.
template <typename FillRow>
void ListEveryNetqueue(Output& output, const std::function<std::shared_ptr<MetaStruct>()>& newRow,
                       FillRow fillRow) {
  try {
    std::unique_ptr<NetworkInfo> info = Root();
    auto list = MetaList::New(Fabrik::MetaObj::Struct, newRow());
    ForEachNetqueueQuietly(*info, [&](Pnic& nic, const PnicNetqueueInfo& record) {
      auto row = newRow();
      row->SetField(kNic, nic.GetName());
      fillRow(*row, record);
      list->Add(row);
    });
    output.SetRootObject(list);
  } catch (const HostCtlException& e) {
    output.AddErrorMessage(e.what());
  }
}

/// Queue counts are unsigned 32-bit numbers.
const IntFit kQueueFits[] = {{kNum, 0, kUint32Max}};

/// Runs a set: \p fill writes the selections into a zeroed record, which is
/// sent to the NIC `vmnic` names unless \p fill gives false (nothing
/// selected); the result is true either way.
template <typename Fill>
void SetNetqueue(const Input& input, Output& output, NicHw::NotFoundText notFound, Fill fill) {
  try {
    RequireFit(input, kQueueFits);
    std::unique_ptr<NetworkInfo> info = Root();
    std::unique_ptr<Pnic> nic = NicHw::FindNic(*info, input, kVmnic, notFound, output);
    if (!nic)
      return;
    PnicNetqueueInfo record{};
    if (fill(record))
      nic->SetNetqueueInfo(record);
    output.SetRootObject(MetaBool::New(true));
  } catch (const HostCtlException& e) {
    output.AddErrorMessage(e.what());
  }
}

} // namespace

/// The two-letter cell of load-balancer setting \p index.
std::string NetqueueLbSettingCell(std::size_t index, bool supported, bool allowed) {
  std::string cell = kLbSettings[index].supportShown ? (supported ? "S" : "U") : "N";
  return cell + (allowed ? "A" : "D");
}

// network nic queue count get

CORVEX_DEFINE_NEW(NicQueueCountGet)

NicQueueCountGet::NicQueueCountGet() {
  SetDescription("Get netqueue count on a nic");
  SetDefaultOutputFormatter("table");
  SetDefaultOutputParameter("fields:" + kCountStruct, kNic + "," + kTxCount + "," + kRxCount);
}

NicQueueCountGet::~NicQueueCountGet() = default;

std::shared_ptr<InputSpec> NicQueueCountGet::GetInputSpecInternal() {
  return MakeInputSpec(kCountGetParams);
}

std::shared_ptr<MetaStruct> NicQueueCountGet::GetOutputStructure() {
  auto structure = MetaStruct::New(kCountStruct);
  structure->SetField(kNic, MetaString::New());
  structure->SetField(kTxCount, MetaInt::New());
  structure->SetField(kRxCount, MetaInt::New());
  return structure;
}

std::shared_ptr<OutputSpec> NicQueueCountGet::GetOutputSpecInternal() {
  return ListResultSpec(GetOutputStructure());
}

void NicQueueCountGet::ExecuteInternal(const std::shared_ptr<Input>& input,
                                       const std::shared_ptr<Output>& output) {
  ListNetqueues(*input, *output, NicHw::PnicNotFound, GetOutputStructure(),
                [&](MetaList& list, Pnic& nic, const PnicNetqueueInfo& record) {
                  auto row = GetOutputStructure();
                  row->SetField(kNic, nic.GetName());
                  row->SetField(kTxCount, static_cast<long>(record.txQueueCount));
                  row->SetField(kRxCount, static_cast<long>(record.rxQueueCount));
                  list.Add(row);
                });
}

// network nic queue count set

CORVEX_DEFINE_NEW(NicQueueCountSet)

NicQueueCountSet::NicQueueCountSet() {
  SetDescription("Set number of netqueues on a nic");
}

NicQueueCountSet::~NicQueueCountSet() = default;

std::shared_ptr<InputSpec> NicQueueCountSet::GetInputSpecInternal() {
  return MakeInputSpec(kCountSetParams);
}

std::shared_ptr<OutputSpec> NicQueueCountSet::GetOutputSpecInternal() {
  return BoolResultSpec();
}

void NicQueueCountSet::ExecuteInternal(const std::shared_ptr<Input>& input,
                                       const std::shared_ptr<Output>& output) {
  SetNetqueue(*input, *output, NicHw::PnicNotFound, [&](PnicNetqueueInfo& record) {
    uint32_t count = static_cast<uint32_t>(input->GetParameterInt(kNum));
    if (input->HasParameter(kTx)) {
      record.txQueueCount = count;
      record.txCountSelected = true;
    }
    if (input->HasParameter(kRx)) {
      record.rxQueueCount = count;
      record.rxCountSelected = true;
    }
    return record.txCountSelected || record.rxCountSelected;
  });
}

// network nic queue filterclass list

CORVEX_DEFINE_NEW(NicQueueFilterClassList)

NicQueueFilterClassList::NicQueueFilterClassList() {
  SetDescription("List the netqueue supported filterclass of all physical NICs currently installed "
                 "and loaded on the system.");
  SetDefaultOutputFormatter("table");
  SetDefaultOutputParameter("fields:" + kSettingsStruct,
                            kNic + "," + NicHw::JoinFields(kFilterClassFields));
}

NicQueueFilterClassList::~NicQueueFilterClassList() = default;

std::shared_ptr<InputSpec> NicQueueFilterClassList::GetInputSpecInternal() {
  return InputSpec::New();
}

std::shared_ptr<MetaStruct> NicQueueFilterClassList::GetOutputStructure() {
  auto structure = MetaStruct::New(kSettingsStruct);
  structure->SetField(kNic, MetaString::New());
  for (const std::string* field : kFilterClassFields)
    structure->SetField(*field, MetaBool::New());
  return structure;
}

std::shared_ptr<OutputSpec> NicQueueFilterClassList::GetOutputSpecInternal() {
  return ListResultSpec(GetOutputStructure());
}

void NicQueueFilterClassList::ExecuteInternal(const std::shared_ptr<Input>& /*input*/,
                                              const std::shared_ptr<Output>& output) {
  ListEveryNetqueue(
      *output, [this] { return GetOutputStructure(); },
      [](MetaStruct& row, const PnicNetqueueInfo& record) {
        for (std::size_t i = 0; i < kNetqueueFilterClassCount; ++i)
          row.SetField(*kFilterClassFields[i], record.filterClasses[i]);
      });
}

// network nic queue loadbalancer list

CORVEX_DEFINE_NEW(NicQueueLbSettingList)

NicQueueLbSettingList::NicQueueLbSettingList() {
  SetDescription("List the load balancer settings of all the installed and loaded physical NICs. "
                 "(S:supported, U:unsupported, N:not-applicable, A:allowed, D:disallowed).");
  SetDefaultOutputFormatter("table");
  std::string fields = kNic;
  for (const LbSetting& setting : kLbSettings)
    fields += "," + setting.column;
  SetDefaultOutputParameter("fields:" + kSettingsStruct, fields);
}

NicQueueLbSettingList::~NicQueueLbSettingList() = default;

std::shared_ptr<InputSpec> NicQueueLbSettingList::GetInputSpecInternal() {
  return InputSpec::New();
}

std::shared_ptr<MetaStruct> NicQueueLbSettingList::GetOutputStructure() {
  auto structure = MetaStruct::New(kSettingsStruct);
  structure->SetField(kNic, MetaString::New());
  for (const LbSetting& setting : kLbSettings)
    structure->SetField(setting.column, MetaString::New());
  return structure;
}

std::shared_ptr<OutputSpec> NicQueueLbSettingList::GetOutputSpecInternal() {
  return ListResultSpec(GetOutputStructure());
}

void NicQueueLbSettingList::ExecuteInternal(const std::shared_ptr<Input>& /*input*/,
                                            const std::shared_ptr<Output>& output) {
  ListEveryNetqueue(
      *output, [this] { return GetOutputStructure(); },
      [](MetaStruct& row, const PnicNetqueueInfo& record) {
        for (std::size_t i = 0; i < kNetqueueSettingCount; ++i)
          row.SetField(kLbSettings[i].column, NetqueueLbSettingCell(i, record.settingSupported[i],
                                                                    record.settingAllowed[i]));
      });
}

// network nic queue loadbalancer set

CORVEX_DEFINE_NEW(NicQueueLbSettingSet)

NicQueueLbSettingSet::NicQueueLbSettingSet() {
  SetDescription("Enable/disable netqueue load balancer setting on a NIC.");
}

NicQueueLbSettingSet::~NicQueueLbSettingSet() = default;

std::shared_ptr<InputSpec> NicQueueLbSettingSet::GetInputSpecInternal() {
  auto spec = MakeInputSpec({&kLbSetVmnic, 1});
  for (const LbSetting& setting : kLbSettings)
    AddParameters(*spec, {&setting.param, 1});
  return spec;
}

std::shared_ptr<OutputSpec> NicQueueLbSettingSet::GetOutputSpecInternal() {
  return BoolResultSpec();
}

void NicQueueLbSettingSet::ExecuteInternal(const std::shared_ptr<Input>& input,
                                           const std::shared_ptr<Output>& output) {
  SetNetqueue(*input, *output, NicHw::PnicNotFound, [&](PnicNetqueueInfo& record) {
    for (std::size_t i = 0; i < kNetqueueSettingCount; ++i) {
      const std::string param(kLbSettings[i].param.name.View());
      if (!input->HasParameter(param))
        continue;
      record.settingAllowed[i] = input->GetParameterBool(param);
      record.settingMask |= 1u << i;
    }
    return record.settingMask != 0;
  });
}

// network nic queue loadbalancer state list

CORVEX_DEFINE_NEW(NicQueueLbStateList)

NicQueueLbStateList::NicQueueLbStateList() {
  SetDescription(
      "Netqueue balancer state of all physical NICs currently installed and loaded on the system");
  SetDefaultOutputFormatter("table");
  SetDefaultOutputParameter("fields:" + kStateStruct, kNic + "," + kEnabled);
}

NicQueueLbStateList::~NicQueueLbStateList() = default;

std::shared_ptr<InputSpec> NicQueueLbStateList::GetInputSpecInternal() {
  return MakeInputSpec(kStateListParams);
}

std::shared_ptr<MetaStruct> NicQueueLbStateList::GetOutputStructure() {
  auto structure = MetaStruct::New(kStateStruct);
  structure->SetField(kNic, MetaString::New());
  structure->SetField(kEnabled, MetaBool::New());
  return structure;
}

std::shared_ptr<OutputSpec> NicQueueLbStateList::GetOutputSpecInternal() {
  return ListResultSpec(GetOutputStructure());
}

void NicQueueLbStateList::ExecuteInternal(const std::shared_ptr<Input>& input,
                                          const std::shared_ptr<Output>& output) {
  ListNetqueues(*input, *output, InvalidPnic, GetOutputStructure(),
                [&](MetaList& list, Pnic& nic, const PnicNetqueueInfo& record) {
                  auto row = GetOutputStructure();
                  row->SetField(kNic, nic.GetName());
                  row->SetField(kEnabled, record.balancerEnabled);
                  list.Add(row);
                });
}

// network nic queue loadbalancer state set

CORVEX_DEFINE_NEW(NicQueueLbStateSet)

NicQueueLbStateSet::NicQueueLbStateSet() {
  SetDescription("Enable/disable netqueue balancer on a NIC");
}

NicQueueLbStateSet::~NicQueueLbStateSet() = default;

std::shared_ptr<InputSpec> NicQueueLbStateSet::GetInputSpecInternal() {
  return MakeInputSpec(kStateSetParams);
}

std::shared_ptr<OutputSpec> NicQueueLbStateSet::GetOutputSpecInternal() {
  return BoolResultSpec();
}

void NicQueueLbStateSet::ExecuteInternal(const std::shared_ptr<Input>& input,
                                         const std::shared_ptr<Output>& output) {
  SetNetqueue(*input, *output, InvalidPnic, [&](PnicNetqueueInfo& record) {
    record.balancerEnabled = input->GetParameterBool(kEnable);
    record.balancerStateSelected = true;
    return true;
  });
}

// network nic queue loadbalancer plugin list

CORVEX_DEFINE_NEW(NicQueueLbPluginList)

NicQueueLbPluginList::NicQueueLbPluginList() {
  SetDescription("Details of netqueue balancer plugins on all physical NICs currently installed "
                 "and loaded on the system");
  SetDefaultOutputFormatter("table");
  SetDefaultOutputParameter("fields:" + kPluginStruct, kNic + "," + kModuleName + "," +
                                                           kPluginName + "," + kEnabled + "," +
                                                           kDescription);
  SetDefaultOutputParameter("wrap-last", "true");
}

NicQueueLbPluginList::~NicQueueLbPluginList() = default;

std::shared_ptr<InputSpec> NicQueueLbPluginList::GetInputSpecInternal() {
  return MakeInputSpec(kPluginListParams);
}

std::shared_ptr<MetaStruct> NicQueueLbPluginList::GetOutputStructure() {
  auto structure = MetaStruct::New(kPluginStruct);
  structure->SetField(kNic, MetaString::New());
  structure->SetField(kModuleName, MetaString::New());
  structure->SetField(kPluginName, MetaString::New());
  structure->SetField(kEnabled, MetaBool::New());
  structure->SetField(kDescription, MetaString::New());
  return structure;
}

std::shared_ptr<OutputSpec> NicQueueLbPluginList::GetOutputSpecInternal() {
  return ListResultSpec(GetOutputStructure());
}

void NicQueueLbPluginList::ExecuteInternal(const std::shared_ptr<Input>& input,
                                           const std::shared_ptr<Output>& output) {
  ListNetqueues(*input, *output, InvalidPnic, GetOutputStructure(),
                [&](MetaList& list, Pnic& nic, const PnicNetqueueInfo& record) {
                  for (const PnicNetqueuePluginInfo& plugin : record.plugins) {
                    bool enabled =
                        std::any_of(record.changedPlugins.begin(), record.changedPlugins.end(),
                                    [&](const PnicNetqueuePluginInfo& on) {
                                      return on.moduleName == plugin.moduleName &&
                                             on.pluginName == plugin.pluginName;
                                    });
                    auto row = GetOutputStructure();
                    row->SetField(kNic, nic.GetName());
                    row->SetField(kModuleName, plugin.moduleName);
                    row->SetField(kPluginName, plugin.pluginName);
                    row->SetField(kEnabled, enabled);
                    row->SetField(kDescription, plugin.description);
                    list.Add(row);
                  }
                });
}

// network nic queue loadbalancer plugin set

CORVEX_DEFINE_NEW(NicQueueLbPluginSet)

NicQueueLbPluginSet::NicQueueLbPluginSet() {
  SetDescription("Enable/disable netqueue balancer plugin on a NIC");
}

NicQueueLbPluginSet::~NicQueueLbPluginSet() = default;

std::shared_ptr<InputSpec> NicQueueLbPluginSet::GetInputSpecInternal() {
  return MakeInputSpec(kPluginSetParams);
}

std::shared_ptr<OutputSpec> NicQueueLbPluginSet::GetOutputSpecInternal() {
  return BoolResultSpec();
}

void NicQueueLbPluginSet::ExecuteInternal(const std::shared_ptr<Input>& input,
                                          const std::shared_ptr<Output>& output) {
  SetNetqueue(*input, *output, InvalidPnic, [&](PnicNetqueueInfo& record) {
    record.changedPlugins.push_back(
        {input->GetParameter(kModule), input->GetParameter(kPlugin), std::string()});
    record.pluginStateSelected = true;
    record.pluginEnabled = input->GetParameterBool(kEnable);
    return true;
  });
}

} // namespace CorvexCli::NetworkNamespace
