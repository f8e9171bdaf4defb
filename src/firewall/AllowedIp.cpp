//===- AllowedIp.cpp - Ruleset allowed-IP and client commands -------------===//
//
// network firewall ruleset allowedip list, add and remove, and network
// firewall ruleset client get, add and remove.
//
//===----------------------------------------------------------------------===//
#include "firewall.h"

#include "HostCtl/Lib.h"
#include "HostCtl/System/Host.h"
#include "TvkCtl/System/SystemInfoImpl.h"
#include "common/ParameterTable.h"
#include "firewall/FirewallCommon.h"

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
using HostCtl::System::FirewallRuleset;
using TvkCtl::System::SystemInfoImpl;

namespace {

const std::string kRulesetIdParam = "ruleset-id";
const std::string kIpAddressParam = "ip-address";

const std::string kAllowedIpStruct = "FirewallRulesetAllowedip";
const std::string kRulesetField = "Ruleset";
const std::string kAllowedIpsField = "Allowed IP Addresses";

const std::string kClientStruct = "FirewallRulesetClientGet";
const std::string kClientCountField = "Ruleset Client Count";

const std::string kInvalidRuleset = "Invalid Ruleset Id.";

const ParameterDef kListParameters[] = {
    {kRulesetIdParam, "r", Fabrik::CallSpec::String, false, "The label of the ruleset."},
};

const ParameterDef kChangeParameters[] = {
    {kRulesetIdParam, "r", Fabrik::CallSpec::String, true, "The label of the ruleset."},
    {kIpAddressParam, "i", Fabrik::CallSpec::String, true,
     "Allowed ip address/range for the ruleset."},
};

const ParameterDef kClientParameters[] = {
    {kRulesetIdParam, "r", Fabrik::CallSpec::String, true, "The label of the ruleset."},
};
/// Adds an entry to, or removes one from, the allowed-IP list of the ruleset
/// named by the command's parameters.
void ChangeAllowedIp(const Input& input, Output& output,
                     void (FirewallRuleset::*change)(const std::string&)) {
  try {
    SystemInfoImpl system;
    const std::string& id = input.GetParameter(kRulesetIdParam);
    const std::string& address = input.GetParameter(kIpAddressParam);
    std::unique_ptr<FirewallRuleset> ruleset = system.GetFirewallRulesetById(id);
    if (!ruleset->IsValid()) {
      output.AddErrorMessage(kInvalidRuleset);
      return;
    }
    if (ruleset->IsAllowedAll()) {
      output.AddErrorMessage("Couldn't update allowed ip list when allowed-all flag is true.");
      return;
    }
    // An empty address is refused without a result: the command changed
    // nothing and must not answer true.
    if (address.empty()) {
      output.AddErrorMessage("Invalid allowedip parameter.");
      return;
    }
    ((*ruleset).*change)(address);
    output.SetRootObject(MetaBool::New(true));
  } catch (const HostCtlException& e) {
    output.AddErrorMessage(e.what());
  }
}

/// Looks up the client commands' ruleset through the host object; adds
/// "Invalid Ruleset Id." and answers null when there is none.
std::unique_ptr<FirewallRuleset> FindClientRuleset(const Input& input, Output& output) {
  const std::string& id = input.GetParameter(kRulesetIdParam);
  std::unique_ptr<HostCtl::Host> host = HostCtl::HostFactory::GetHost();
  std::unique_ptr<HostCtl::System::SystemInfo> system = host->GetSystemInfo();
  std::unique_ptr<FirewallRuleset> ruleset = system->GetFirewallRulesetById(id);
  if (!ruleset->IsValid()) {
    output.AddErrorMessage(kInvalidRuleset);
    return nullptr;
  }
  return ruleset;
}

} // namespace

// network firewall ruleset allowedip list

CORVEX_DEFINE_NEW(FirewallRulesetAllowedipList)

FirewallRulesetAllowedipList::FirewallRulesetAllowedipList() {
  SetDescription("List allowed IP addresses for rulesets.");
  SetDefaultOutputFormatter("table");
  SetDefaultOutputParameter("fields:" + kAllowedIpStruct, kRulesetField + "," + kAllowedIpsField);
}

FirewallRulesetAllowedipList::~FirewallRulesetAllowedipList() = default;

std::shared_ptr<InputSpec> FirewallRulesetAllowedipList::GetInputSpecInternal() {
  return MakeInputSpec(kListParameters);
}

std::shared_ptr<MetaStruct> FirewallRulesetAllowedipList::GetOutputStructure() {
  auto structure = MetaStruct::New(kAllowedIpStruct);
  structure->SetField(kRulesetField, MetaString::New());
  structure->SetField(kAllowedIpsField, MetaList::New(Fabrik::MetaObj::String));
  return structure;
}

std::shared_ptr<OutputSpec> FirewallRulesetAllowedipList::GetOutputSpecInternal() {
  return ListResultSpec(GetOutputStructure());
}

void FirewallRulesetAllowedipList::ExecuteInternal(const std::shared_ptr<Input>& input,
                                                   const std::shared_ptr<Output>& output) {
  ListRulesets(
      *input, *output, GetOutputStructure(), [&](MetaList& list, FirewallRuleset& ruleset) {
        auto row = GetOutputStructure();
        row->SetField(kRulesetField, ruleset.GetRulesetId());
        auto addresses = MetaList::New(Fabrik::MetaObj::String);
        if (ruleset.IsAllowedAll()) {
          addresses->Add(std::string("All"));
        } else {
          std::unique_ptr<HostCtl::System::FirewallAllowedIps> ips = ruleset.GetAllowedIps();
          for (const auto& address : ips->ipv4Addresses)
            addresses->Add(address.GetStringAddress());
          for (const auto& address : ips->ipv6Addresses)
            addresses->Add(address.GetStringAddress());
          for (const auto& network : ips->ipv4Networks)
            addresses->Add(network.GetStringAddress());
          for (const auto& network : ips->ipv6Networks)
            addresses->Add(network.GetStringAddress());
        }
        row->SetField(kAllowedIpsField, addresses);
        list.Add(row);
      });
}

// network firewall ruleset allowedip add

CORVEX_DEFINE_NEW(FirewallRulesetAllowedipAdd)

FirewallRulesetAllowedipAdd::FirewallRulesetAllowedipAdd() {
  SetDescription("Add allowed IP address/range to the ruleset.");
}

FirewallRulesetAllowedipAdd::~FirewallRulesetAllowedipAdd() = default;

std::shared_ptr<InputSpec> FirewallRulesetAllowedipAdd::GetInputSpecInternal() {
  return MakeInputSpec(kChangeParameters);
}

std::shared_ptr<OutputSpec> FirewallRulesetAllowedipAdd::GetOutputSpecInternal() {
  return BoolResultSpec();
}

void FirewallRulesetAllowedipAdd::ExecuteInternal(const std::shared_ptr<Input>& input,
                                                  const std::shared_ptr<Output>& output) {
  ChangeAllowedIp(*input, *output, &FirewallRuleset::AddAllowedIp);
}

// network firewall ruleset allowedip remove

CORVEX_DEFINE_NEW(FirewallRulesetAllowedipRemove)

FirewallRulesetAllowedipRemove::FirewallRulesetAllowedipRemove() {
  SetDescription("Remove allowed IP address/range from the ruleset.");
}

FirewallRulesetAllowedipRemove::~FirewallRulesetAllowedipRemove() = default;

std::shared_ptr<InputSpec> FirewallRulesetAllowedipRemove::GetInputSpecInternal() {
  return MakeInputSpec(kChangeParameters);
}

std::shared_ptr<OutputSpec> FirewallRulesetAllowedipRemove::GetOutputSpecInternal() {
  return BoolResultSpec();
}

void FirewallRulesetAllowedipRemove::ExecuteInternal(const std::shared_ptr<Input>& input,
                                                     const std::shared_ptr<Output>& output) {
  ChangeAllowedIp(*input, *output, &FirewallRuleset::RemoveAllowedIp);
}

// network firewall ruleset client get

CORVEX_DEFINE_MAKE_SHARED(FirewallRulesetClientGet)

FirewallRulesetClientGet::FirewallRulesetClientGet() {
  SetDescription("Show the number of clients using a firewall ruleset.");
  SetDefaultOutputFormatter("simple");
  SetDefaultOutputParameter("fields:" + kClientStruct, kClientCountField);
}

FirewallRulesetClientGet::~FirewallRulesetClientGet() = default;

std::shared_ptr<InputSpec> FirewallRulesetClientGet::GetInputSpecInternal() {
  return MakeInputSpec(kClientParameters);
}

std::shared_ptr<MetaStruct> FirewallRulesetClientGet::GetOutputStructure() {
  auto structure = MetaStruct::New(kClientStruct);
  structure->SetField(kClientCountField, MetaInt::New());
  return structure;
}

std::shared_ptr<OutputSpec> FirewallRulesetClientGet::GetOutputSpecInternal() {
  return ResultSpec(GetOutputStructure());
}

void FirewallRulesetClientGet::ExecuteInternal(const std::shared_ptr<Input>& input,
                                               const std::shared_ptr<Output>& output) {
  try {
    std::unique_ptr<FirewallRuleset> ruleset = FindClientRuleset(*input, *output);
    if (!ruleset)
      return;
    auto result = GetOutputStructure();
    result->SetField(kClientCountField, static_cast<long>(ruleset->GetClientCount()));
    output->SetRootObject(result);
  } catch (const HostCtlException& e) {
    output->AddErrorMessage(e.what());
  }
}

// network firewall ruleset client add

CORVEX_DEFINE_MAKE_SHARED(FirewallRulesetClientAdd)

FirewallRulesetClientAdd::FirewallRulesetClientAdd() {
  SetDescription("Add a new client to a firewall ruleset. This enables the firewall ruleset and "
                 "increments the number of clients using the ruleset.");
}

FirewallRulesetClientAdd::~FirewallRulesetClientAdd() = default;

std::shared_ptr<InputSpec> FirewallRulesetClientAdd::GetInputSpecInternal() {
  return MakeInputSpec(kClientParameters);
}

std::shared_ptr<OutputSpec> FirewallRulesetClientAdd::GetOutputSpecInternal() {
  return BoolResultSpec();
}

void FirewallRulesetClientAdd::ExecuteInternal(const std::shared_ptr<Input>& input,
                                               const std::shared_ptr<Output>& output) {
  try {
    std::unique_ptr<FirewallRuleset> ruleset = FindClientRuleset(*input, *output);
    if (!ruleset)
      return;
    ruleset->AddClient();
    output->SetRootObject(MetaBool::New(true));
  } catch (const HostCtlException& e) {
    output->AddErrorMessage(e.what());
  }
}

// network firewall ruleset client remove

CORVEX_DEFINE_MAKE_SHARED(FirewallRulesetClientRemove)

FirewallRulesetClientRemove::FirewallRulesetClientRemove() {
  SetDescription("Remove a client from a firewall ruleset. This decrements the number of clients "
                 "using the ruleset and if the number reaches zero the ruleset is disabled.");
}

FirewallRulesetClientRemove::~FirewallRulesetClientRemove() = default;

std::shared_ptr<InputSpec> FirewallRulesetClientRemove::GetInputSpecInternal() {
  return MakeInputSpec(kClientParameters);
}

std::shared_ptr<OutputSpec> FirewallRulesetClientRemove::GetOutputSpecInternal() {
  return BoolResultSpec();
}

void FirewallRulesetClientRemove::ExecuteInternal(const std::shared_ptr<Input>& input,
                                                  const std::shared_ptr<Output>& output) {
  try {
    std::unique_ptr<FirewallRuleset> ruleset = FindClientRuleset(*input, *output);
    if (!ruleset)
      return;
    ruleset->RemoveClient();
    output->SetRootObject(MetaBool::New(true));
  } catch (const HostCtlException& e) {
    output->AddErrorMessage(e.what());
  }
}

} // namespace CorvexCli::NetworkNamespace
