//===- Standard.cpp - Standard virtual switches and their uplinks ---------===//
//
// network vswitch standard add | list | remove | set, and uplink add | remove.
//
//===----------------------------------------------------------------------===//
#include "vswitch.h"

#include "HostCtl/Lib.h"
#include "HostCtl/Network/NetworkInfo.h"
#include "TvkCtl/Network/NetworkInfoImpl.h"
#include "TvkCtl/Network/Switching.h"
#include "common/IntFit.h"
#include "common/PolicyParams.h"

#include <algorithm>
#include <cstdint>

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

const std::string kParamVswitchName = "vswitch-name";
const std::string kParamPorts = "ports";
const std::string kParamType = "type";
const std::string kParamMtu = "mtu";
const std::string kParamCdpStatus = "cdp-status";
const std::string kParamUplinkName = "uplink-name";

const std::string kStructVirtualSwitch = "VirtualSwitch";
const std::string kFieldName = "Name";
const std::string kFieldClass = "Class";
const std::string kFieldNumPorts = "Num Ports";
const std::string kFieldUsedPorts = "Used Ports";
const std::string kFieldConfiguredPorts = "Configured Ports";
const std::string kFieldMtu = "MTU";
const std::string kFieldCdpStatus = "CDP Status";
const std::string kFieldBeaconEnabled = "Beacon Enabled";
const std::string kFieldBeaconInterval = "Beacon Interval";
const std::string kFieldBeaconThreshold = "Beacon Threshold";
const std::string kFieldBeaconRequiredBy = "Beacon Required By";
const std::string kFieldUplinks = "Uplinks";
const std::string kFieldPortgroups = "Portgroups";

const std::string kSystemType = "system";

/// The MTU is taken as a signed 32-bit number; negative ones have their own
/// message.
const IntFit kSetFits[] = {{kParamMtu, 0, kInt32Max}};

/// CDP status names, by index.
const std::string kCdpStatus[] = {"down", "listen", "advertise", "both"};
/// The values of --cdp-status.
const EnumChoice kCdpChoices[] = {
    {kCdpStatus[0], "CDP status is 'down'"},
    {kCdpStatus[1], "CDP status is 'listen'"},
    {kCdpStatus[2], "CDP status is 'advertise'"},
    {kCdpStatus[3], "CDP status is 'both'"},
};

const std::string kNoSwitchNamed = "Unable to find a virtual switch with name ";

/// Names of the host's physical NICs, in order.
std::vector<std::string> PhysicalNicNames() {
  TvkCtl::Network::NetworkInfoImpl info;
  std::vector<std::string> names;
  for (const auto& nic : info.GetPnics(PnicGetRegular))
    if (nic)
      names.push_back(nic->GetName());
  return names;
}

/// \p uplinks without the names that are not physical NICs, order kept.
std::vector<std::string> PhysicalOnly(std::vector<std::string> uplinks,
                                      const std::vector<std::string>& nics) {
  uplinks.erase(std::remove_if(uplinks.begin(), uplinks.end(),
                               [&](const std::string& name) {
                                 return std::find(nics.begin(), nics.end(), name) == nics.end();
                               }),
                uplinks.end());
  return uplinks;
}

/// Runs uplink add or remove: the switch must exist.
void ChangeUplink(const std::shared_ptr<Input>& input, const std::shared_ptr<Output>& output,
                  bool add) {
  try {
    const std::string& name = input->GetParameter(kParamVswitchName);
    const std::string& uplink = input->GetParameter(kParamUplinkName);
    std::unique_ptr<VirtualSwitch> vswitch =
        NetworkFactory::GetVirtualSwitchById(name, PortsetGetRegular);
    if (!vswitch) {
      output->AddErrorMessage(kNoSwitchNamed + name);
      return;
    }
    if (add)
      vswitch->AddUplink(uplink, true);
    else
      vswitch->RemoveUplink(uplink, false);
    output->SetRootObject(MetaBool::New(true));
  } catch (const HostCtlException& e) {
    output->AddErrorMessage(e.what());
  }
}

} // namespace

// network vswitch standard add

CORVEX_DEFINE_NEW(VirtualSwitchStandardAdd)

VirtualSwitchStandardAdd::VirtualSwitchStandardAdd() {
  SetDescription("Add a new virtual switch to the Ostra networking system.");
}

VirtualSwitchStandardAdd::~VirtualSwitchStandardAdd() = default;

std::shared_ptr<InputSpec> VirtualSwitchStandardAdd::GetInputSpecInternal() {
  return MakeInputSpec({
      {kParamVswitchName, "v", Fabrik::CallSpec::String, true,
       "The name of the virtual switch to create."},
      {kParamPorts, "P", Fabrik::CallSpec::Integer, false,
       "The number of ports to give this newly created virtual switch. Maximum ports per virtual "
       "switch is 4096. If no value is given the default value(128) is used. The number of ports "
       "is limited by the number of already allocated ports on the host. The system wide port "
       "count cannot be greater than 4608.",
       ParameterCheck::Range(1, 4096)},
  });
}

std::shared_ptr<OutputSpec> VirtualSwitchStandardAdd::GetOutputSpecInternal() {
  return BoolResultSpec();
}

void VirtualSwitchStandardAdd::ExecuteInternal(const std::shared_ptr<Input>& input,
                                               const std::shared_ptr<Output>& output) {
  try {
    const std::string& name = input->GetParameter(kParamVswitchName);
    if (name.size() > 127) {
      output->AddErrorMessage("The virtual switch name exceeds the maximum allowed length. ");
      return;
    }
    uint32_t ports = Portset::DEF_NUM_PORTS;
    if (input->HasParameter(kParamPorts))
      ports = static_cast<uint32_t>(input->GetParameterInt(kParamPorts));
    TvkCtl::Network::VirtualSwitchInfoImpl info;
    NicCapabilities capabilities = NicCapabilities::GetDefaultPolicy();
    ShapingPolicy shaping = ShapingPolicy::GetDefaultPolicy();
    PortSecurityPolicy security = PortSecurityPolicy::GetDefaultPolicy();
    NicTeamingPolicy teaming = NicTeamingPolicy::GetDefaultPolicy();
    info.AddVirtualSwitchWithPolicy(teaming, security, shaping, capabilities, name, ports);
    output->SetRootObject(MetaBool::New(true));
  } catch (const HostCtlException& e) {
    output->AddErrorMessage(e.what());
  }
}

// network vswitch standard set

CORVEX_DEFINE_NEW(VirtualSwitchStandardSet)

VirtualSwitchStandardSet::VirtualSwitchStandardSet() {
  SetDescription("This command sets the MTU size and CDP status of a given virtual switch.");
}

VirtualSwitchStandardSet::~VirtualSwitchStandardSet() = default;

std::shared_ptr<InputSpec> VirtualSwitchStandardSet::GetInputSpecInternal() {
  return MakeInputSpec({
      {kParamVswitchName, "v", Fabrik::CallSpec::String, true,
       "The name of virtual switch to apply the configurations."},
      {kParamMtu, "m", Fabrik::CallSpec::Integer, false,
       "The MTU size of the given virtual switch. "},
      {kParamCdpStatus, "c", Fabrik::CallSpec::String, false,
       "The CDP status of the given virtual switch. It can be 'down', 'listen', 'advertise' or "
       "'both'",
       ParameterCheck::OneOf(kCdpChoices)},
  });
}

std::shared_ptr<OutputSpec> VirtualSwitchStandardSet::GetOutputSpecInternal() {
  return BoolResultSpec();
}

void VirtualSwitchStandardSet::ExecuteInternal(const std::shared_ptr<Input>& input,
                                               const std::shared_ptr<Output>& output) {
  try {
    const std::string& name = input->GetParameter(kParamVswitchName);
    if (!TvkCtl::Network::PortsetImpl::IsValidVirtualSwitch(name)) {
      output->AddErrorMessage(name + " is not a valid name for a virtual switch");
      return;
    }
    TvkCtl::Network::VirtualSwitchInfoImpl info;
    std::unique_ptr<VirtualSwitch> vswitch = info.GetVirtualSwitchByName(name, PortsetGetRegular);
    if (!vswitch) {
      output->AddErrorMessage(kNoSwitchNamed + name);
      return;
    }
    if (input->HasParameter(kParamMtu)) {
      long mtu = input->GetParameterInt(kParamMtu);
      if (mtu < 0) {
        output->AddErrorMessage("MTU size should be a positive value");
        return;
      }
      if (auto problem = OutOfRange(*input, kSetFits[0])) {
        output->AddErrorMessage(*problem);
        return;
      }
      vswitch->SetMtu(static_cast<uint32_t>(mtu));
    }
    if (input->HasParameter(kParamCdpStatus)) {
      const std::string& status = input->GetParameter(kParamCdpStatus);
      auto it = std::find(std::begin(kCdpStatus), std::end(kCdpStatus), status);
      vswitch->SetCdpStatus(static_cast<uint32_t>(it - std::begin(kCdpStatus)));
    }
    output->SetRootObject(MetaBool::New(true));
  } catch (const HostCtlException& e) {
    output->AddErrorMessage(e.what());
  }
}

// network vswitch standard list

CORVEX_DEFINE_NEW(VirtualSwitchStandardList)

VirtualSwitchStandardList::VirtualSwitchStandardList() {
  SetDescription("List the virtual switches current on the Ostra host.");
  SetDefaultOutputFormatter("simple");
  SetDefaultOutputParameter("header:" + kStructVirtualSwitch, "%" + kFieldName + "%");
  std::string fields;
  for (const std::string* field :
       {&kFieldName, &kFieldClass, &kFieldNumPorts, &kFieldUsedPorts, &kFieldConfiguredPorts,
        &kFieldMtu, &kFieldCdpStatus, &kFieldBeaconEnabled, &kFieldBeaconInterval,
        &kFieldBeaconThreshold, &kFieldBeaconRequiredBy, &kFieldUplinks, &kFieldPortgroups})
    fields += (fields.empty() ? "" : ",") + *field;
  SetDefaultOutputParameter("fields:" + kStructVirtualSwitch, fields);
}

VirtualSwitchStandardList::~VirtualSwitchStandardList() = default;

std::shared_ptr<InputSpec> VirtualSwitchStandardList::GetInputSpecInternal() {
  auto spec = InputSpec::New();
  AddParameters(*spec,
                {{kParamVswitchName, "v", Fabrik::CallSpec::String, false,
                  "Limit the output of this command to only virtual switches with the given name."},
                 {kParamType, "t", Fabrik::CallSpec::String, false,
                  "List virtual switches with given type(e.g. system)."}});
  return spec;
}

std::shared_ptr<MetaStruct> VirtualSwitchStandardList::GetOutputStructure() {
  auto structure = MetaStruct::New(kStructVirtualSwitch);
  structure->SetField(kFieldName, MetaString::New());
  structure->SetField(kFieldClass, MetaString::New());
  structure->SetField(kFieldNumPorts, MetaInt::New());
  structure->SetField(kFieldUsedPorts, MetaInt::New());
  structure->SetField(kFieldConfiguredPorts, MetaInt::New());
  structure->SetField(kFieldMtu, MetaInt::New());
  structure->SetField(kFieldCdpStatus, MetaString::New());
  structure->SetField(kFieldBeaconEnabled, MetaBool::New());
  structure->SetField(kFieldBeaconInterval, MetaInt::New());
  structure->SetField(kFieldBeaconThreshold, MetaInt::New());
  structure->SetField(kFieldBeaconRequiredBy, MetaList::New(Fabrik::MetaObj::String));
  structure->SetField(kFieldUplinks, MetaList::New(Fabrik::MetaObj::String));
  structure->SetField(kFieldPortgroups, MetaList::New(Fabrik::MetaObj::String));
  return structure;
}

std::shared_ptr<OutputSpec> VirtualSwitchStandardList::GetOutputSpecInternal() {
  return ListResultSpec(GetOutputStructure());
}

void VirtualSwitchStandardList::ExecuteInternal(const std::shared_ptr<Input>& input,
                                                const std::shared_ptr<Output>& output) {
  try {
    PortsetGetType selector = PortsetGetRegular;
    if (input->HasParameter(kParamType)) {
      if (input->GetParameter(kParamType) != kSystemType) {
        output->AddErrorMessage("Invalid type value, should be 'system'.");
        return;
      }
      selector = PortsetGetSystem;
    }
    TvkCtl::Network::VirtualSwitchInfoImpl info;
    std::vector<std::unique_ptr<VirtualSwitch>> switches;
    if (input->HasParameter(kParamVswitchName))
      switches.push_back(
          info.GetVirtualSwitchByName(input->GetParameter(kParamVswitchName), selector));
    else
      switches = info.GetVirtualSwitches(selector);
    std::vector<std::string> nics = PhysicalNicNames();
    auto list = MetaList::New(Fabrik::MetaObj::Struct, GetOutputStructure());
    for (const auto& vswitch : switches) {
      if (!vswitch) {
        output->AddErrorMessage("Unable to access null portset.");
        continue;
      }
      auto row = GetOutputStructure();
      row->SetField(kFieldName, vswitch->GetName());
      row->SetField(kFieldClass, vswitch->GetClassName());
      row->SetField(kFieldNumPorts, static_cast<long>(vswitch->GetNumPorts()));
      row->SetField(kFieldUsedPorts, static_cast<long>(vswitch->GetUsedPorts()));
      row->SetField(kFieldConfiguredPorts, static_cast<long>(vswitch->GetConfiguredPorts()));
      row->SetField(kFieldMtu, static_cast<long>(vswitch->GetMtu()));
      uint32_t cdp = vswitch->GetCdpStatus();
      row->SetField(kFieldCdpStatus, cdp < 4 ? kCdpStatus[cdp] : std::string());
      row->SetField(kFieldBeaconEnabled, vswitch->IsBeaconEnabled());
      row->SetField(kFieldBeaconInterval, static_cast<long>(vswitch->GetBeaconInterval()));
      row->SetField(kFieldBeaconThreshold, static_cast<long>(vswitch->GetBeaconThreshold()));
      row->SetField(kFieldBeaconRequiredBy, vswitch->GetBeaconRequiredBy());
      row->SetField(kFieldUplinks, PhysicalOnly(vswitch->GetUplinks(), nics));
      std::vector<std::string> groups;
      for (const auto& group : vswitch->GetPortGroups())
        groups.push_back(group->GetName());
      row->SetField(kFieldPortgroups, groups);
      list->Add(row);
    }
    output->SetRootObject(list);
  } catch (const HostCtlException& e) {
    output->AddErrorMessage(e.what());
  }
}

// network vswitch standard remove

CORVEX_DEFINE_NEW(VirtualSwitchStandardRemove)

VirtualSwitchStandardRemove::VirtualSwitchStandardRemove() {
  SetDescription("Remove a virtual switch from the Ostra networking system.");
}

VirtualSwitchStandardRemove::~VirtualSwitchStandardRemove() = default;

std::shared_ptr<InputSpec> VirtualSwitchStandardRemove::GetInputSpecInternal() {
  auto spec = InputSpec::New();
  AddParameters(*spec, {{kParamVswitchName, "v", Fabrik::CallSpec::String, true,
                         "The name of the virtual switch to remove."}});
  return spec;
}

std::shared_ptr<OutputSpec> VirtualSwitchStandardRemove::GetOutputSpecInternal() {
  return BoolResultSpec();
}

void VirtualSwitchStandardRemove::ExecuteInternal(const std::shared_ptr<Input>& input,
                                                  const std::shared_ptr<Output>& output) {
  try {
    const std::string& name = input->GetParameter(kParamVswitchName);
    if (!TvkCtl::Network::PortsetImpl::IsValidVirtualSwitch(name)) {
      output->AddErrorMessage("Unable to find virtual switch with the name " + name);
      return;
    }
    TvkCtl::Network::VirtualSwitchInfoImpl info;
    info.RemoveVirtualSwitch(name);
    output->SetRootObject(MetaBool::New(true));
  } catch (const HostCtlException& e) {
    output->AddErrorMessage(e.what());
  }
}

// network vswitch standard uplink add

CORVEX_DEFINE_NEW(VirtualSwitchStandardUplinkAdd)

VirtualSwitchStandardUplinkAdd::VirtualSwitchStandardUplinkAdd() {
  SetDescription("Add an uplink to the given virtual switch. Note if this virtual switch has a NIC "
                 "teaming policy assigned to it then the policy must also be modified to enable "
                 "use of this uplink on this virtual switch");
}

VirtualSwitchStandardUplinkAdd::~VirtualSwitchStandardUplinkAdd() = default;

std::shared_ptr<InputSpec> VirtualSwitchStandardUplinkAdd::GetInputSpecInternal() {
  auto spec = InputSpec::New();
  AddParameters(*spec, {{kParamVswitchName, "v", Fabrik::CallSpec::String, true,
                         "The name of the virtual switch to add an uplink to."},
                        {kParamUplinkName, "u", Fabrik::CallSpec::String, true,
                         "The name of the uplink to add to the virtual switch."}});
  return spec;
}

std::shared_ptr<OutputSpec> VirtualSwitchStandardUplinkAdd::GetOutputSpecInternal() {
  return BoolResultSpec();
}

void VirtualSwitchStandardUplinkAdd::ExecuteInternal(const std::shared_ptr<Input>& input,
                                                     const std::shared_ptr<Output>& output) {
  ChangeUplink(input, output, true);
}

// network vswitch standard uplink remove

CORVEX_DEFINE_NEW(VirtualSwitchStandardUplinkRemove)

VirtualSwitchStandardUplinkRemove::VirtualSwitchStandardUplinkRemove() {
  SetDescription("Remove an uplink from the given virtual switch. Note if this virtual switch has "
                 "a NIC teaming policy assigned to it then the policy must also be modified to "
                 "disable use of this uplink on this virtual switch");
}

VirtualSwitchStandardUplinkRemove::~VirtualSwitchStandardUplinkRemove() = default;

std::shared_ptr<InputSpec> VirtualSwitchStandardUplinkRemove::GetInputSpecInternal() {
  auto spec = InputSpec::New();
  AddParameters(*spec, {{kParamVswitchName, "v", Fabrik::CallSpec::String, true,
                         "The name of the virtual switch to remove an uplink from."},
                        {kParamUplinkName, "u", Fabrik::CallSpec::String, true,
                         "The name of the uplink to remove from the virtual switch."}});
  return spec;
}

std::shared_ptr<OutputSpec> VirtualSwitchStandardUplinkRemove::GetOutputSpecInternal() {
  return BoolResultSpec();
}

void VirtualSwitchStandardUplinkRemove::ExecuteInternal(const std::shared_ptr<Input>& input,
                                                        const std::shared_ptr<Output>& output) {
  ChangeUplink(input, output, false);
}

} // namespace CorvexCli::NetworkNamespace
