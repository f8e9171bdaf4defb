//===- Ruleset.cpp - Firewall ruleset and rule commands -------------------===//
//
// network firewall ruleset list and set, network firewall ruleset rule list,
// and the ruleset selection that the list commands of the firewall share.
//
//===----------------------------------------------------------------------===//
#include "firewall.h"

#include "HostCtl/Lib.h"
#include "HostCtl/Misc.h"
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
const std::string kAllowedAllParam = "allowed-all";
const std::string kEnabledParam = "enabled";

const std::string kRulesetStruct = "Ruleset";
const std::string kNameField = "Name";
const std::string kEnabledField = "Enabled";
const std::string kEnableConfigurableField = "Enable/Disable configurable";
const std::string kAllowedIpConfigurableField = "Allowed IP configurable";

const std::string kRuleStruct = "FirewallPortRule";
const std::string kRuleRulesetField = "Ruleset";
const std::string kPortTypeField = "Port Type";
const std::string kPortBeginField = "Port Begin";
const std::string kPortEndField = "Port End";
const std::string kDirectionField = "Direction";
const std::string kProtocolField = "Protocol";

const ParameterDef kListParameters[] = {
    {kRulesetIdParam, "r", Fabrik::CallSpec::String, false,
     "List configuration for specfic ruleset"},
};

const ParameterDef kRuleListParameters[] = {
    {kRulesetIdParam, "r", Fabrik::CallSpec::String, false, "List rules for specfic ruleset"},
};

const ParameterDef kSetParameters[] = {
    {kRulesetIdParam, "r", Fabrik::CallSpec::String, true, "The label of the ruleset."},
    {kAllowedAllParam, "a", Fabrik::CallSpec::Boolean, false,
     "Set to true to allowed all ip, set to false to use allowed ip list."},
    {kEnabledParam, "e", Fabrik::CallSpec::Boolean, false,
     "Set to true to enable ruleset, set to false to disable it."},
};

} // namespace

bool SelectFirewallRulesets(HostCtl::System::SystemInfo& system, const Input& input, Output& output,
                            std::vector<std::unique_ptr<FirewallRuleset>>& selection) {
  if (!input.HasParameter(kRulesetIdParam)) {
    selection = system.GetFirewallRulesets();
    return true;
  }
  const std::string& id = input.GetParameter(kRulesetIdParam);
  try {
    std::unique_ptr<FirewallRuleset> ruleset = system.GetFirewallRulesetById(id);
    if (!ruleset->IsValid()) {
      output.AddErrorMessage("Ruleset Not Found: " + id);
      return false;
    }
    selection.push_back(std::move(ruleset));
  } catch (const HostCtlException&) {
    output.AddErrorMessage("Failed to check loaded status: " + id);
    return false;
  }
  return true;
}

// network firewall ruleset list

CORVEX_DEFINE_NEW(FirewallRulesetList)

FirewallRulesetList::FirewallRulesetList() {
  SetDescription("List the rulesets in firewall.");
  SetDefaultOutputFormatter("table");
  SetDefaultOutputParameter("fields:" + kRulesetStruct,
                            HostCtl::Misc::StrPrintf("%s,%s,%s,%s", kNameField.c_str(),
                                                     kEnabledField.c_str(),
                                                     kEnableConfigurableField.c_str(),
                                                     kAllowedIpConfigurableField.c_str()));
}

FirewallRulesetList::~FirewallRulesetList() = default;

std::shared_ptr<InputSpec> FirewallRulesetList::GetInputSpecInternal() {
  return MakeInputSpec(kListParameters);
}

std::shared_ptr<MetaStruct> FirewallRulesetList::GetOutputStructure() {
  auto structure = MetaStruct::New(kRulesetStruct);
  structure->SetField(kNameField, MetaString::New());
  structure->SetField(kEnabledField, MetaBool::New());
  structure->SetField(kEnableConfigurableField, MetaBool::New());
  structure->SetField(kAllowedIpConfigurableField, MetaBool::New());
  return structure;
}

std::shared_ptr<OutputSpec> FirewallRulesetList::GetOutputSpecInternal() {
  return ListResultSpec(GetOutputStructure());
}

void FirewallRulesetList::ExecuteInternal(const std::shared_ptr<Input>& input,
                                          const std::shared_ptr<Output>& output) {
  ListRulesets(*input, *output, GetOutputStructure(),
               [&](MetaList& list, FirewallRuleset& ruleset) {
                 auto row = GetOutputStructure();
                 row->SetField(kNameField, ruleset.GetRulesetId());
                 row->SetField(kEnabledField, ruleset.IsEnabled());
                 row->SetField(kEnableConfigurableField, !ruleset.IsEnableDisableFixed());
                 row->SetField(kAllowedIpConfigurableField, !ruleset.IsAllowedIpFixed());
                 list.Add(row);
               });
}

// network firewall ruleset set

CORVEX_DEFINE_NEW(FirewallRulesetSet)

FirewallRulesetSet::FirewallRulesetSet() {
  SetDescription("Set firewall ruleset status (allowedAll flag and enabled status).");
}

FirewallRulesetSet::~FirewallRulesetSet() = default;

std::shared_ptr<InputSpec> FirewallRulesetSet::GetInputSpecInternal() {
  return MakeInputSpec(kSetParameters);
}

std::shared_ptr<OutputSpec> FirewallRulesetSet::GetOutputSpecInternal() {
  return BoolResultSpec();
}

void FirewallRulesetSet::ExecuteInternal(const std::shared_ptr<Input>& input,
                                         const std::shared_ptr<Output>& output) {
  try {
    SystemInfoImpl system;
    const std::string& id = input->GetParameter(kRulesetIdParam);
    bool hasEnabled = input->HasParameter(kEnabledParam);
    bool hasAllowedAll = input->HasParameter(kAllowedAllParam);
    if (!hasEnabled && !hasAllowedAll) {
      output->AddErrorMessage("Need parameter --enabled or --allowed-all");
      return;
    }
    std::unique_ptr<FirewallRuleset> ruleset = system.GetFirewallRulesetById(id);
    if (!ruleset->IsValid()) {
      output->AddErrorMessage("Invalid Ruleset Id.");
      return;
    }
    bool enabled = ruleset->IsEnabled();
    bool allowedAll = ruleset->IsAllowedAll();
    if (hasAllowedAll) {
      ruleset->CheckConfigurable(HostCtl::System::FirewallAllowedIpMode, false);
      bool requested = input->GetParameterBool(kAllowedAllParam);
      if (requested == allowedAll) {
        output->AddErrorMessage(allowedAll ? "Already allowed all ip"
                                           : "Already use allowed ip list");
        return;
      }
      ruleset->SetAllowedAll(requested);
    }
    if (hasEnabled) {
      ruleset->CheckConfigurable(HostCtl::System::FirewallEnabledState, false);
      bool requested = input->GetParameterBool(kEnabledParam);
      if (requested != enabled) {
        if (enabled)
          ruleset->Disable();
        else
          ruleset->Enable();
      }
    }
    output->SetRootObject(MetaBool::New(true));
  } catch (const HostCtlException& e) {
    output->AddErrorMessage(e.what());
  }
}

// network firewall ruleset rule list

CORVEX_DEFINE_NEW(FirewallRulesetRuleList)

FirewallRulesetRuleList::FirewallRulesetRuleList() {
  SetDescription("List the rules of each ruleset in firewall.");
  SetDefaultOutputFormatter("simple");
  SetDefaultOutputFormatter("table");
  SetDefaultOutputParameter("fields:" + kRuleStruct,
                            "Ruleset,Direction,Protocol,Port Type,Port Begin,Port End");
}

FirewallRulesetRuleList::~FirewallRulesetRuleList() = default;

std::shared_ptr<InputSpec> FirewallRulesetRuleList::GetInputSpecInternal() {
  return MakeInputSpec(kRuleListParameters);
}

std::shared_ptr<MetaStruct> FirewallRulesetRuleList::GetOutputStructure() {
  auto structure = MetaStruct::New(kRuleStruct);
  structure->SetField(kRuleRulesetField, MetaString::New());
  structure->SetField(kPortTypeField, MetaString::New());
  structure->SetField(kPortBeginField, MetaInt::New());
  structure->SetField(kPortEndField, MetaInt::New());
  structure->SetField(kDirectionField, MetaString::New());
  structure->SetField(kProtocolField, MetaString::New());
  return structure;
}

std::shared_ptr<OutputSpec> FirewallRulesetRuleList::GetOutputSpecInternal() {
  return ListResultSpec(GetOutputStructure());
}

void FirewallRulesetRuleList::ExecuteInternal(const std::shared_ptr<Input>& input,
                                              const std::shared_ptr<Output>& output) {
  ListRulesets(*input, *output, GetOutputStructure(),
               [&](MetaList& list, FirewallRuleset& ruleset) {
                 std::string id = ruleset.GetRulesetId();
                 for (const auto& rule : ruleset.GetRules()) {
                   auto row = GetOutputStructure();
                   row->SetField(kRuleRulesetField, id);
                   row->SetField(kPortTypeField, rule->portType == 1 ? "Dst" : "Src");
                   row->SetField(kPortBeginField, static_cast<long>(rule->portBegin));
                   row->SetField(kPortEndField, static_cast<long>(rule->portEnd));
                   row->SetField(kDirectionField, rule->direction == 0 ? "Inbound" : "Outbound");
                   row->SetField(kProtocolField, rule->protocol == 0 ? "TCP" : "UDP");
                   list.Add(row);
                 }
               });
}

} // namespace CorvexCli::NetworkNamespace
