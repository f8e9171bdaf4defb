//===- SwitchPolicy.cpp - Failover, security and shaping of a switch ------===//
//
// network vswitch standard policy failover | security | shaping get | set.
//
//===----------------------------------------------------------------------===//
#include "vswitch.h"

#include "HostCtl/Lib.h"
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

const std::string kParamVswitchName = "vswitch-name";

const std::string kStructFailover = "VirtualSwitchFailoverPolicy";
const std::string kStructSecurity = "VirtualSwitchSecurityPolicy";
const std::string kStructShaping = "VirtualSwitchTrafficShapingPolicy";

const std::string kNoLegacySwitch = "Unable to find a legacy virtual switch with the name ";

std::shared_ptr<InputSpec> SwitchNameSpec(const char* description) {
  auto spec = InputSpec::New();
  AddParameters(*spec, {{kParamVswitchName, "v", Fabrik::CallSpec::String, true, description}});
  return spec;
}

/// The standard switch the command names, or null with the error added.
std::unique_ptr<VirtualSwitch> FindLegacySwitch(const std::shared_ptr<Input>& input,
                                                const std::shared_ptr<Output>& output) {
  const std::string& name = input->GetParameter(kParamVswitchName);
  TvkCtl::Network::VirtualSwitchInfoImpl info;
  std::unique_ptr<VirtualSwitch> vswitch;
  if (TvkCtl::Network::PortsetImpl::IsValidVirtualSwitch(name))
    vswitch = info.GetVirtualSwitchByName(name, PortsetGetRegular);
  if (!vswitch)
    output->AddErrorMessage(kNoLegacySwitch + name);
  return vswitch;
}

/// Runs \p body on the standard switch the command names (WithPolicyHolder).
template <typename Body>
void WithLegacySwitch(const std::shared_ptr<Input>& input, const std::shared_ptr<Output>& output,
                      Body body) {
  WithPolicyHolder(input, output, FindLegacySwitch, body);
}

} // namespace

// network vswitch standard policy shaping get

CORVEX_DEFINE_NEW(VirtualSwitchStandardPolicyShapingGet)

VirtualSwitchStandardPolicyShapingGet::VirtualSwitchStandardPolicyShapingGet() {
  SetDescription("Get the shaping policy settings for the given virtual switch");
  SetPolicyGetOutput(*this, kStructShaping, ShapingFieldNames(), true);
}

VirtualSwitchStandardPolicyShapingGet::~VirtualSwitchStandardPolicyShapingGet() = default;

std::shared_ptr<InputSpec> VirtualSwitchStandardPolicyShapingGet::GetInputSpecInternal() {
  return SwitchNameSpec(
      "The name of the virtual switch to use when fetching the switch shaping policy.");
}

std::shared_ptr<MetaStruct> VirtualSwitchStandardPolicyShapingGet::GetOutputStructure() {
  return NewShapingStructure(kStructShaping);
}

std::shared_ptr<OutputSpec> VirtualSwitchStandardPolicyShapingGet::GetOutputSpecInternal() {
  return ResultSpec(GetOutputStructure());
}

void VirtualSwitchStandardPolicyShapingGet::ExecuteInternal(const std::shared_ptr<Input>& input,
                                                            const std::shared_ptr<Output>& output) {
  WithLegacySwitch(input, output, [&](VirtualSwitch& vswitch) {
    auto result = GetOutputStructure();
    SetShapingFields(*result, DescribeShaping(vswitch.GetTrafficShapingPolicy()));
    output->SetRootObject(result);
  });
}

// network vswitch standard policy shaping set

CORVEX_DEFINE_NEW(VirtualSwitchStandardPolicyShapingSet)

VirtualSwitchStandardPolicyShapingSet::VirtualSwitchStandardPolicyShapingSet() {
  SetDescription("Set the shaping policy settings for the given virtual switch");
}

VirtualSwitchStandardPolicyShapingSet::~VirtualSwitchStandardPolicyShapingSet() = default;

std::shared_ptr<InputSpec> VirtualSwitchStandardPolicyShapingSet::GetInputSpecInternal() {
  auto spec = SwitchNameSpec(
      "The name of the virtual switch to use when setting the switch shaping policy.");
  AddShapingParameters(spec);
  return spec;
}

std::shared_ptr<OutputSpec> VirtualSwitchStandardPolicyShapingSet::GetOutputSpecInternal() {
  return BoolResultSpec();
}

void VirtualSwitchStandardPolicyShapingSet::ExecuteInternal(const std::shared_ptr<Input>& input,
                                                            const std::shared_ptr<Output>& output) {
  WithLegacySwitch(input, output, [&](VirtualSwitch& vswitch) {
    ShapingPolicy policy = vswitch.GetTrafficShapingPolicy();
    SetShapingPolicy(input, output, policy, false);
    if (!output->HasError())
      vswitch.SetTrafficShapingPolicy(policy);
    output->SetRootObject(MetaBool::New(true));
  });
}

// network vswitch standard policy security get

CORVEX_DEFINE_NEW(VirtualSwitchStandardPolicySecurityGet)

VirtualSwitchStandardPolicySecurityGet::VirtualSwitchStandardPolicySecurityGet() {
  SetDescription("Get the Security Policy governing the given virtual switch.");
  SetPolicyGetOutput(*this, kStructSecurity, SecurityFieldNames(), false);
}

VirtualSwitchStandardPolicySecurityGet::~VirtualSwitchStandardPolicySecurityGet() = default;

std::shared_ptr<InputSpec> VirtualSwitchStandardPolicySecurityGet::GetInputSpecInternal() {
  return SwitchNameSpec(
      "The name of the virtual switch to use when fetching the network security policy.");
}

std::shared_ptr<MetaStruct> VirtualSwitchStandardPolicySecurityGet::GetOutputStructure() {
  return NewSecurityStructure(kStructSecurity);
}

std::shared_ptr<OutputSpec> VirtualSwitchStandardPolicySecurityGet::GetOutputSpecInternal() {
  return ResultSpec(GetOutputStructure());
}

void VirtualSwitchStandardPolicySecurityGet::ExecuteInternal(
    const std::shared_ptr<Input>& input, const std::shared_ptr<Output>& output) {
  WithLegacySwitch(input, output, [&](VirtualSwitch& vswitch) {
    auto result = GetOutputStructure();
    SetSecurityFields(*result, vswitch.GetPortSecurityPolicy());
    output->SetRootObject(result);
  });
}

// network vswitch standard policy security set

CORVEX_DEFINE_NEW(VirtualSwitchStandardPolicySecuritySet)

VirtualSwitchStandardPolicySecuritySet::VirtualSwitchStandardPolicySecuritySet() {
  SetDescription("Set the security policy for a given virtual switch");
}

VirtualSwitchStandardPolicySecuritySet::~VirtualSwitchStandardPolicySecuritySet() = default;

std::shared_ptr<InputSpec> VirtualSwitchStandardPolicySecuritySet::GetInputSpecInternal() {
  auto spec = SwitchNameSpec(
      "The name of the virtual switch to use when setting the switch security policy.");
  AddParameters(
      *spec,
      {{kParamAllowPromiscuous, "p", Fabrik::CallSpec::Boolean, false,
        "Allow ports on the virtual switch to enter promiscuous mode."},
       {kParamAllowMacChange, "m", Fabrik::CallSpec::Boolean, false,
        "Allow ports on the virtual switch to change their MAC address."},
       {kParamAllowForgedTransmits, "f", Fabrik::CallSpec::Boolean, false,
        "Allow ports on the virtual switch to send packets with forged source information."}});
  return spec;
}

std::shared_ptr<OutputSpec> VirtualSwitchStandardPolicySecuritySet::GetOutputSpecInternal() {
  return BoolResultSpec();
}

void VirtualSwitchStandardPolicySecuritySet::ExecuteInternal(
    const std::shared_ptr<Input>& input, const std::shared_ptr<Output>& output) {
  WithLegacySwitch(input, output, [&](VirtualSwitch& vswitch) {
    PortSecurityPolicy policy = vswitch.GetPortSecurityPolicy();
    SetSecurityPolicy(input, output, policy);
    vswitch.SetPortSecurityPolicy(policy);
    output->SetRootObject(MetaBool::New(true));
  });
}

// network vswitch standard policy failover get

CORVEX_DEFINE_NEW(VirtualSwitchStandardPolicyFailoverGet)

VirtualSwitchStandardPolicyFailoverGet::VirtualSwitchStandardPolicyFailoverGet() {
  SetDescription("Get the failover policy settings governing the given virtual switch");
  SetPolicyGetOutput(*this, kStructFailover, FailoverFieldNames(), false);
}

VirtualSwitchStandardPolicyFailoverGet::~VirtualSwitchStandardPolicyFailoverGet() = default;

std::shared_ptr<InputSpec> VirtualSwitchStandardPolicyFailoverGet::GetInputSpecInternal() {
  return SwitchNameSpec(
      "The name of the virtual switch to use when fetching the switch failover policy.");
}

std::shared_ptr<MetaStruct> VirtualSwitchStandardPolicyFailoverGet::GetOutputStructure() {
  return NewFailoverStructure(kStructFailover);
}

std::shared_ptr<OutputSpec> VirtualSwitchStandardPolicyFailoverGet::GetOutputSpecInternal() {
  return ResultSpec(GetOutputStructure());
}

void VirtualSwitchStandardPolicyFailoverGet::ExecuteInternal(
    const std::shared_ptr<Input>& input, const std::shared_ptr<Output>& output) {
  WithLegacySwitch(input, output, [&](VirtualSwitch& vswitch) {
    auto result = GetOutputStructure();
    SetFailoverFields(*result,
                      DescribeFailover(vswitch.GetNicTeamingPolicy(), vswitch.GetUplinks()));
    output->SetRootObject(result);
  });
}

// network vswitch standard policy failover set

CORVEX_DEFINE_NEW(VirtualSwitchStandardPolicyFailoverSet)

VirtualSwitchStandardPolicyFailoverSet::VirtualSwitchStandardPolicyFailoverSet() {
  SetDescription("Configure the Failover policy for a virtual switch.");
}

VirtualSwitchStandardPolicyFailoverSet::~VirtualSwitchStandardPolicyFailoverSet() = default;

std::shared_ptr<InputSpec> VirtualSwitchStandardPolicyFailoverSet::GetInputSpecInternal() {
  auto spec = SwitchNameSpec(
      "The name of the virtual switch to use when configuring the switch failover policy.");
  AddFailoverParameters(spec);
  return spec;
}

std::shared_ptr<OutputSpec> VirtualSwitchStandardPolicyFailoverSet::GetOutputSpecInternal() {
  return BoolResultSpec();
}

void VirtualSwitchStandardPolicyFailoverSet::ExecuteInternal(
    const std::shared_ptr<Input>& input, const std::shared_ptr<Output>& output) {
  WithLegacySwitch(input, output, [&](VirtualSwitch& vswitch) {
    NicTeamingPolicy current = vswitch.GetNicTeamingPolicy();
    NicTeamingPolicy policy = vswitch.GetConfiguredNicTeamingPolicy();
    std::vector<std::string> uplinks = vswitch.GetUplinks();
    SetFailoverPolicy(input, output, policy, current, uplinks);
    if (!output->HasError())
      vswitch.SetNicTeamingPolicy(policy);
    output->SetRootObject(MetaBool::New(true));
  });
}

} // namespace CorvexCli::NetworkNamespace
