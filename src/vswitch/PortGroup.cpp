//===- PortGroup.cpp - Port groups of standard switches and their policies ===//
//
// network vswitch standard portgroup add | list | remove | set, and
// portgroup policy failover | security | shaping get | set. A port group's
// policy overrides its switch's field by field; the get commands show the
// values in force with one override flag per field.
//
//===----------------------------------------------------------------------===//
#include "vswitch.h"

#include "HostCtl/Lib.h"
#include "HostCtl/Network/NetworkInfo.h"
#include "TvkCtl/Network/NetworkInfoImpl.h"
#include "TvkCtl/Network/Switching.h"
#include "common/PolicyParams.h"

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

const std::string kParamPortgroupName = "portgroup-name";
const std::string kParamVswitchName = "vswitch-name";
const std::string kParamType = "type";
const std::string kParamVlanId = "vlan-id";
const std::string kParamUseVswitch = "use-vswitch";

const std::string kStructPortGroup = "PortGroup";
const std::string kStructFailover = "PortGroupFailoverPolicy";
const std::string kStructSecurity = "PortGroupSecurityPolicy";
const std::string kStructShaping = "PortGroupTrafficShapingPolicy";

const std::string kFieldName = "Name";
const std::string kFieldVirtualSwitch = "Virtual Switch";
const std::string kFieldActiveClients = "Active Clients";
const std::string kFieldVlanId = "VLAN ID";
const std::string kOverride = "Override Vswitch ";
const std::string kFieldOverrideUplinks = "Override Vswitch Uplinks";

const std::string kSystemType = "system";
const std::string kNoPortGroup = "Unable to find a port group with the name ";
const std::string kNoSwitchNamed = "Unable to find a virtual switch with name ";

const char* const kUseVswitchDescription =
    "Reset all values for this policy to use parent virtual switch's settings instead of "
    "overriding the settings for the port group. Using this in conjunction with other settings "
    "will first reset all of the fields to use the virtual switch setting and then apply the "
    "other options after the reset.";
const char* const kUseVswitchDescriptionSecurity =
    "Reset all values for this policy to use parent virtual switch's settings instead of "
    "overriding the settings for the port group.   Using this in conjunction with other "
    "settings will first reset all of the fields to use the virtual switch setting and then "
    "apply the other options after the reset.";

/// A value field of a policy result and the mask bit that says it is overridden.
struct OverrideField {
  const std::string& field; ///< Value field; its flag is "Override Vswitch " + field.
  uint32_t bit;             ///< Bit of the configured policy's set mask.
};

const OverrideField kFailoverOverrides[] = {
    {kFieldLoadBalancing, NicTeamingPolicy::MASK_LOAD_BALANCING},
    {kFieldFailureDetection, NicTeamingPolicy::MASK_FAILURE_DETECTION},
    {kFieldNotifySwitches, NicTeamingPolicy::MASK_NOTIFY_SWITCHES},
    {kFieldFailback, NicTeamingPolicy::MASK_FAILBACK},
};
const OverrideField kSecurityOverrides[] = {
    {kFieldAllowPromiscuous, PortSecurityPolicy::MASK_PROMISCUOUS},
    {kFieldAllowMacChange, PortSecurityPolicy::MASK_MAC_CHANGE},
    {kFieldAllowForgedTransmits, PortSecurityPolicy::MASK_FORGED_TRANSMITS},
};
const OverrideField kShapingOverrides[] = {
    {kFieldEnabled, ShapingPolicy::MASK_ENABLED},
    {kFieldAverageBandwidth, ShapingPolicy::MASK_AVERAGE},
    {kFieldPeakBandwidth, ShapingPolicy::MASK_PEAK},
    {kFieldBurstSize, ShapingPolicy::MASK_BURST},
};

/// The shaping rates a port group with shaping on must have from somewhere.
struct RequiredRate {
  ShapingPolicy::MaskBit bit; ///< The rate's mask bit.
  const char* message;        ///< Error when neither side sets it.
};
const RequiredRate kRequiredRates[] = {
    {ShapingPolicy::MASK_PEAK, "Unable to set shaping policy. A Peak BPS value must be set on "
                               "either this port group or on the parent virtual switch."},
    {ShapingPolicy::MASK_AVERAGE, "Unable to set shaping policy. An Average BPS value must be set "
                                  "on either this port group or on the parent virtual switch."},
    {ShapingPolicy::MASK_BURST, "Unable to set shaping policy. A Burst Size value must be set on "
                                "either this port group or on the parent virtual switch."},
};

std::shared_ptr<InputSpec> NameSpec(const char* description) {
  auto spec = InputSpec::New();
  AddParameters(*spec, {{kParamPortgroupName, "p", Fabrik::CallSpec::String, true, description}});
  return spec;
}

/// Declares portgroup-name and use-vswitch of a policy set command.
std::shared_ptr<InputSpec> PolicySetSpec(const char* nameDescription, const char* useDescription) {
  auto spec = NameSpec(nameDescription);
  AddParameters(*spec, {{kParamUseVswitch, "u", Fabrik::CallSpec::Flag, false, useDescription}});
  return spec;
}

/// The port group the command names, or null with the error added.
std::unique_ptr<PortGroup> FindPortGroup(const std::shared_ptr<Input>& input,
                                         const std::shared_ptr<Output>& output) {
  const std::string& name = input->GetParameter(kParamPortgroupName);
  std::unique_ptr<PortGroup> group = NetworkFactory::GetPortGroupByName(name);
  if (!group)
    output->AddErrorMessage(kNoPortGroup + name);
  return group;
}

/// Runs \p body on the port group the command names (WithPolicyHolder).
template <typename Body>
void WithPortGroup(const std::shared_ptr<Input>& input, const std::shared_ptr<Output>& output,
                   Body body) {
  WithPolicyHolder(input, output, FindPortGroup, body);
}

/// The value fields of a policy result followed by their override flags.
template <std::size_t N>
std::vector<std::string> WithOverrides(const std::vector<std::string>& values,
                                       const OverrideField (&overrides)[N]) {
  std::vector<std::string> fields = values;
  for (const OverrideField& entry : overrides)
    fields.push_back(kOverride + entry.field);
  return fields;
}

/// Declares one boolean override flag per entry of \p overrides.
template <std::size_t N>
void AddOverrideFields(MetaStruct& structure, const OverrideField (&overrides)[N]) {
  for (const OverrideField& entry : overrides)
    structure.SetField(kOverride + entry.field, MetaBool::New());
}

/// Sets each override flag from the configured policy's set mask.
template <std::size_t N>
void SetOverrides(MetaStruct& result, uint32_t mask, const OverrideField (&overrides)[N]) {
  for (const OverrideField& entry : overrides)
    result.SetField(kOverride + entry.field, (mask & entry.bit) != 0);
}

/// Runs portgroup add or remove on the named switch.
void ChangePortGroup(const std::shared_ptr<Input>& input, const std::shared_ptr<Output>& output,
                     bool add) {
  try {
    const std::string& group = input->GetParameter(kParamPortgroupName);
    const std::string& name = input->GetParameter(kParamVswitchName);
    std::unique_ptr<VirtualSwitch> vswitch =
        NetworkFactory::GetVirtualSwitchById(name, PortsetGetRegular);
    if (!vswitch) {
      output->AddErrorMessage(kNoSwitchNamed + name);
      return;
    }
    if (add)
      vswitch->AddPortGroup(group);
    else
      vswitch->RemovePortGroup(group);
    output->SetRootObject(MetaBool::New(true));
  } catch (const HostCtlException& e) {
    output->AddErrorMessage(e.what());
  }
}

} // namespace

// network vswitch standard portgroup list

CORVEX_DEFINE_NEW(VirtualSwitchPortGroupList)

VirtualSwitchPortGroupList::VirtualSwitchPortGroupList() {
  SetDescription("List all of the port groups currently on the system.");
  SetDefaultOutputFormatter("table");
  SetDefaultOutputParameter(
      "fields:" + kStructPortGroup,
      JoinFields({kFieldName, kFieldVirtualSwitch, kFieldActiveClients, kFieldVlanId}));
}

VirtualSwitchPortGroupList::~VirtualSwitchPortGroupList() = default;

std::shared_ptr<InputSpec> VirtualSwitchPortGroupList::GetInputSpecInternal() {
  auto spec = InputSpec::New();
  AddParameters(*spec, {{kParamType, "t", Fabrik::CallSpec::String, false,
                         "List port groups with given type(e.g. system)."}});
  return spec;
}

std::shared_ptr<MetaStruct> VirtualSwitchPortGroupList::GetOutputStructure() {
  auto structure = MetaStruct::New(kStructPortGroup);
  structure->SetField(kFieldName, MetaString::New());
  structure->SetField(kFieldVirtualSwitch, MetaString::New());
  structure->SetField(kFieldActiveClients, MetaInt::New());
  structure->SetField(kFieldVlanId, MetaInt::New());
  return structure;
}

std::shared_ptr<OutputSpec> VirtualSwitchPortGroupList::GetOutputSpecInternal() {
  return ListResultSpec(GetOutputStructure());
}

void VirtualSwitchPortGroupList::ExecuteInternal(const std::shared_ptr<Input>& input,
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
    TvkCtl::Network::NetworkInfoImpl info;
    auto list = MetaList::New(Fabrik::MetaObj::Struct, GetOutputStructure());
    for (const auto& group : info.GetAllPortGroups(selector)) {
      auto row = GetOutputStructure();
      row->SetField(kFieldName, group->GetName());
      row->SetField(kFieldVirtualSwitch, group->GetPortsetName());
      row->SetField(kFieldActiveClients, static_cast<long>(group->GetActiveClients()));
      row->SetField(kFieldVlanId, static_cast<long>(group->GetVlanId()));
      list->Add(row);
    }
    output->SetRootObject(list);
  } catch (const HostCtlException& e) {
    output->AddErrorMessage(e.what());
  }
}

// network vswitch standard portgroup add

CORVEX_DEFINE_NEW(VirtualSwitchPortGroupAdd)

VirtualSwitchPortGroupAdd::VirtualSwitchPortGroupAdd() {
  SetDescription("Allows the addition of a standard port group to a virtual switch.");
}

VirtualSwitchPortGroupAdd::~VirtualSwitchPortGroupAdd() = default;

std::shared_ptr<InputSpec> VirtualSwitchPortGroupAdd::GetInputSpecInternal() {
  auto spec = InputSpec::New();
  AddParameters(*spec, {{kParamPortgroupName, "p", Fabrik::CallSpec::String, true,
                         "The name of the port group to add"},
                        {kParamVswitchName, "v", Fabrik::CallSpec::String, true,
                         "The virtual switch to add the port group to."}});
  return spec;
}

std::shared_ptr<OutputSpec> VirtualSwitchPortGroupAdd::GetOutputSpecInternal() {
  return BoolResultSpec();
}

void VirtualSwitchPortGroupAdd::ExecuteInternal(const std::shared_ptr<Input>& input,
                                                const std::shared_ptr<Output>& output) {
  ChangePortGroup(input, output, true);
}

// network vswitch standard portgroup remove

CORVEX_DEFINE_NEW(VirtualSwitchPortGroupRemove)

VirtualSwitchPortGroupRemove::VirtualSwitchPortGroupRemove() {
  SetDescription("Remove a port group from the given virtual switch");
}

VirtualSwitchPortGroupRemove::~VirtualSwitchPortGroupRemove() = default;

std::shared_ptr<InputSpec> VirtualSwitchPortGroupRemove::GetInputSpecInternal() {
  auto spec = InputSpec::New();
  AddParameters(*spec, {{kParamPortgroupName, "p", Fabrik::CallSpec::String, true, " "},
                        {kParamVswitchName, "v", Fabrik::CallSpec::String, true, " "}});
  return spec;
}

std::shared_ptr<OutputSpec> VirtualSwitchPortGroupRemove::GetOutputSpecInternal() {
  return BoolResultSpec();
}

void VirtualSwitchPortGroupRemove::ExecuteInternal(const std::shared_ptr<Input>& input,
                                                   const std::shared_ptr<Output>& output) {
  ChangePortGroup(input, output, false);
}

// network vswitch standard portgroup set

CORVEX_DEFINE_NEW(VirtualSwitchPortGroupSet)

VirtualSwitchPortGroupSet::VirtualSwitchPortGroupSet() {
  SetDescription("Set the vlan id for the given port group");
}

VirtualSwitchPortGroupSet::~VirtualSwitchPortGroupSet() = default;

std::shared_ptr<InputSpec> VirtualSwitchPortGroupSet::GetInputSpecInternal() {
  auto spec = NameSpec("The name of the port group to set vlan id for.");
  const std::string vlanDescription =
      "The vlan id for this port group. This value is in the range (" +
      std::to_string(PortGroup::MIN_VLAN_ID) + " - " + std::to_string(PortGroup::MAX_VLAN_ID) + ")";
  AddParameters(*spec, {{kParamVlanId, "v", Fabrik::CallSpec::Integer, false, vlanDescription,
                         ParameterCheck::Range(PortGroup::MIN_VLAN_ID, PortGroup::MAX_VLAN_ID)}});
  return spec;
}

std::shared_ptr<OutputSpec> VirtualSwitchPortGroupSet::GetOutputSpecInternal() {
  return BoolResultSpec();
}

void VirtualSwitchPortGroupSet::ExecuteInternal(const std::shared_ptr<Input>& input,
                                                const std::shared_ptr<Output>& output) {
  try {
    if (!input->HasParameter(kParamVlanId)) {
      output->AddErrorMessage("The --vlan-id option is required");
      return;
    }
    long vlanId = input->GetParameterInt(kParamVlanId);
    auto group = FindPortGroup(input, output);
    if (!group)
      return;
    group->SetVlanId(static_cast<uint16_t>(vlanId));
    output->SetRootObject(MetaBool::New(true));
  } catch (const HostCtlException& e) {
    output->AddErrorMessage(e.what());
  }
}

// network vswitch standard portgroup policy shaping get

CORVEX_DEFINE_NEW(VirtualSwitchPortGroupPolicyShapingGet)

VirtualSwitchPortGroupPolicyShapingGet::VirtualSwitchPortGroupPolicyShapingGet() {
  SetDescription("Get the network shaping policy settings governing the given port group");
  SetPolicyGetOutput(*this, kStructShaping, WithOverrides(ShapingFieldNames(), kShapingOverrides),
                     true);
}

VirtualSwitchPortGroupPolicyShapingGet::~VirtualSwitchPortGroupPolicyShapingGet() = default;

std::shared_ptr<InputSpec> VirtualSwitchPortGroupPolicyShapingGet::GetInputSpecInternal() {
  return NameSpec("The name of the port group to use when fetching the port group shaping policy.");
}

std::shared_ptr<MetaStruct> VirtualSwitchPortGroupPolicyShapingGet::GetOutputStructure() {
  auto structure = NewShapingStructure(kStructShaping);
  AddOverrideFields(*structure, kShapingOverrides);
  return structure;
}

std::shared_ptr<OutputSpec> VirtualSwitchPortGroupPolicyShapingGet::GetOutputSpecInternal() {
  return ResultSpec(GetOutputStructure());
}

void VirtualSwitchPortGroupPolicyShapingGet::ExecuteInternal(
    const std::shared_ptr<Input>& input, const std::shared_ptr<Output>& output) {
  WithPortGroup(input, output, [&](PortGroup& group) {
    uint32_t mask = group.GetConfiguredTrafficShapingPolicy().GetSetMask();
    auto result = GetOutputStructure();
    SetShapingFields(*result, DescribeShaping(group.GetTrafficShapingPolicy()));
    SetOverrides(*result, mask, kShapingOverrides);
    output->SetRootObject(result);
  });
}

// network vswitch standard portgroup policy shaping set

CORVEX_DEFINE_NEW(VirtualSwitchPortGroupPolicyShapingSet)

VirtualSwitchPortGroupPolicyShapingSet::VirtualSwitchPortGroupPolicyShapingSet() {
  SetDescription("Set the shaping policy settings for the given port group");
}

VirtualSwitchPortGroupPolicyShapingSet::~VirtualSwitchPortGroupPolicyShapingSet() = default;

std::shared_ptr<InputSpec> VirtualSwitchPortGroupPolicyShapingSet::GetInputSpecInternal() {
  auto spec = PolicySetSpec("The name of the port group to set shaping policy for.",
                            kUseVswitchDescription);
  AddShapingParameters(spec);
  return spec;
}

std::shared_ptr<OutputSpec> VirtualSwitchPortGroupPolicyShapingSet::GetOutputSpecInternal() {
  return BoolResultSpec();
}

void VirtualSwitchPortGroupPolicyShapingSet::ExecuteInternal(
    const std::shared_ptr<Input>& input, const std::shared_ptr<Output>& output) {
  WithPortGroup(input, output, [&](PortGroup& group) {
    ShapingPolicy policy = group.GetConfiguredTrafficShapingPolicy();
    if (input->IsFlagSet(kParamUseVswitch))
      policy.UnsetAll();
    SetShapingPolicy(input, output, policy, false);
    if (policy.IsSet(ShapingPolicy::MASK_ENABLED) && policy.IsEnabled()) {
      ShapingPolicy inForce = group.GetTrafficShapingPolicy();
      for (const RequiredRate& rate : kRequiredRates)
        if (!policy.IsSet(rate.bit) && !inForce.IsSet(rate.bit))
          output->AddErrorMessage(rate.message);
    }
    if (!output->HasError())
      group.SetTrafficShapingPolicy(policy);
    output->SetRootObject(MetaBool::New(true));
  });
}

// network vswitch standard portgroup policy failover get

CORVEX_DEFINE_NEW(VirtualSwitchPortGroupPolicyFailoverGet)

VirtualSwitchPortGroupPolicyFailoverGet::VirtualSwitchPortGroupPolicyFailoverGet() {
  SetDescription("Get the network failover policy settings governing the given port group");
  std::vector<std::string> fields = WithOverrides(FailoverFieldNames(), kFailoverOverrides);
  fields.push_back(kFieldOverrideUplinks);
  SetPolicyGetOutput(*this, kStructFailover, fields, false);
}

VirtualSwitchPortGroupPolicyFailoverGet::~VirtualSwitchPortGroupPolicyFailoverGet() = default;

std::shared_ptr<InputSpec> VirtualSwitchPortGroupPolicyFailoverGet::GetInputSpecInternal() {
  return NameSpec(
      "The name of the port group to use when fetching the port group failover policy.");
}

std::shared_ptr<MetaStruct> VirtualSwitchPortGroupPolicyFailoverGet::GetOutputStructure() {
  auto structure = NewFailoverStructure(kStructFailover);
  AddOverrideFields(*structure, kFailoverOverrides);
  structure->SetField(kFieldOverrideUplinks, MetaBool::New());
  return structure;
}

std::shared_ptr<OutputSpec> VirtualSwitchPortGroupPolicyFailoverGet::GetOutputSpecInternal() {
  return ResultSpec(GetOutputStructure());
}

void VirtualSwitchPortGroupPolicyFailoverGet::ExecuteInternal(
    const std::shared_ptr<Input>& input, const std::shared_ptr<Output>& output) {
  WithPortGroup(input, output, [&](PortGroup& group) {
    NicTeamingPolicy inForce = group.GetNicTeamingPolicy();
    uint32_t mask = group.GetConfiguredNicTeamingPolicy().GetSetMask();
    std::vector<std::string> uplinks = group.GetVirtualSwitch()->GetUplinks();
    auto result = GetOutputStructure();
    SetFailoverFields(*result, DescribeFailover(inForce, uplinks));
    SetOverrides(*result, mask, kFailoverOverrides);
    result->SetField(kFieldOverrideUplinks, (mask & NicTeamingPolicy::MASK_UPLINK_ORDER) != 0);
    output->SetRootObject(result);
  });
}

// network vswitch standard portgroup policy failover set

CORVEX_DEFINE_NEW(VirtualSwitchPortGroupPolicyFailoverSet)

VirtualSwitchPortGroupPolicyFailoverSet::VirtualSwitchPortGroupPolicyFailoverSet() {
  SetDescription("Configure the Failover policy for a port group. These setting may potentially "
                 "override virtual switch settings.");
}

VirtualSwitchPortGroupPolicyFailoverSet::~VirtualSwitchPortGroupPolicyFailoverSet() = default;

std::shared_ptr<InputSpec> VirtualSwitchPortGroupPolicyFailoverSet::GetInputSpecInternal() {
  auto spec = PolicySetSpec("The name of the port group to set failover policy for.",
                            kUseVswitchDescription);
  AddFailoverParameters(spec);
  return spec;
}

std::shared_ptr<OutputSpec> VirtualSwitchPortGroupPolicyFailoverSet::GetOutputSpecInternal() {
  return BoolResultSpec();
}

void VirtualSwitchPortGroupPolicyFailoverSet::ExecuteInternal(
    const std::shared_ptr<Input>& input, const std::shared_ptr<Output>& output) {
  WithPortGroup(input, output, [&](PortGroup& group) {
    NicTeamingPolicy current = group.GetNicTeamingPolicy();
    NicTeamingPolicy policy = group.GetConfiguredNicTeamingPolicy();
    std::vector<std::string> uplinks = group.GetVirtualSwitch()->GetUplinks();
    if (input->IsFlagSet(kParamUseVswitch))
      policy.UnsetAll();
    SetFailoverPolicy(input, output, policy, current, uplinks);
    if (!output->HasError())
      group.SetNicTeamingPolicy(policy);
    output->SetRootObject(MetaBool::New(true));
  });
}

// network vswitch standard portgroup policy security get

CORVEX_DEFINE_NEW(VirtualSwitchPortGroupPolicySecurityGet)

VirtualSwitchPortGroupPolicySecurityGet::VirtualSwitchPortGroupPolicySecurityGet() {
  SetDescription("Get the Security Policy governing the given port group. ");
  SetPolicyGetOutput(*this, kStructSecurity,
                     WithOverrides(SecurityFieldNames(), kSecurityOverrides), false);
}

VirtualSwitchPortGroupPolicySecurityGet::~VirtualSwitchPortGroupPolicySecurityGet() = default;

std::shared_ptr<InputSpec> VirtualSwitchPortGroupPolicySecurityGet::GetInputSpecInternal() {
  return NameSpec("The name of the port group to use when fetching the network security policy.");
}

std::shared_ptr<MetaStruct> VirtualSwitchPortGroupPolicySecurityGet::GetOutputStructure() {
  auto structure = NewSecurityStructure(kStructSecurity);
  AddOverrideFields(*structure, kSecurityOverrides);
  return structure;
}

std::shared_ptr<OutputSpec> VirtualSwitchPortGroupPolicySecurityGet::GetOutputSpecInternal() {
  return ResultSpec(GetOutputStructure());
}

void VirtualSwitchPortGroupPolicySecurityGet::ExecuteInternal(
    const std::shared_ptr<Input>& input, const std::shared_ptr<Output>& output) {
  WithPortGroup(input, output, [&](PortGroup& group) {
    uint32_t mask = group.GetConfiguredPortSecurityPolicy().GetSetMask();
    auto result = GetOutputStructure();
    SetSecurityFields(*result, group.GetPortSecurityPolicy());
    SetOverrides(*result, mask, kSecurityOverrides);
    output->SetRootObject(result);
  });
}

// network vswitch standard portgroup policy security set

CORVEX_DEFINE_NEW(VirtualSwitchPortGroupPolicySecuritySet)

VirtualSwitchPortGroupPolicySecuritySet::VirtualSwitchPortGroupPolicySecuritySet() {
  SetDescription("Set the security policy for a given port group");
}

VirtualSwitchPortGroupPolicySecuritySet::~VirtualSwitchPortGroupPolicySecuritySet() = default;

std::shared_ptr<InputSpec> VirtualSwitchPortGroupPolicySecuritySet::GetInputSpecInternal() {
  auto spec = PolicySetSpec("The name of the port group to set security policy for.",
                            kUseVswitchDescriptionSecurity);
  AddSecurityParameters(spec);
  return spec;
}

std::shared_ptr<OutputSpec> VirtualSwitchPortGroupPolicySecuritySet::GetOutputSpecInternal() {
  return BoolResultSpec();
}

void VirtualSwitchPortGroupPolicySecuritySet::ExecuteInternal(
    const std::shared_ptr<Input>& input, const std::shared_ptr<Output>& output) {
  WithPortGroup(input, output, [&](PortGroup& group) {
    PortSecurityPolicy policy = group.GetConfiguredPortSecurityPolicy();
    if (input->IsFlagSet(kParamUseVswitch))
      policy.UnsetAll();
    SetSecurityPolicy(input, output, policy);
    if (!output->HasError())
      group.SetPortSecurityPolicy(policy);
    output->SetRootObject(MetaBool::New(true));
  });
}

} // namespace CorvexCli::NetworkNamespace
