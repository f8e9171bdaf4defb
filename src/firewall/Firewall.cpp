//===- Firewall.cpp - Firewall state commands -----------------------------===//
//
// network firewall get, set, load, refresh and unload: the firewall's global
// enabled flag and default action, its kernel module and the loading of the
// ruleset configuration.
//
//===----------------------------------------------------------------------===//
#include "firewall.h"
#include "common/FieldTable.h"

#include "HostCtl/Lib.h"
#include "TvkCtl/System/ModuleImpl.h"
#include "TvkCtl/System/SystemInfoImpl.h"
#include "common/ParameterTable.h"

namespace CorvexCli::NetworkNamespace {

using Fabrik::CallSpec::Input;
using Fabrik::CallSpec::InputSpec;
using Fabrik::CallSpec::Output;
using Fabrik::CallSpec::OutputSpec;
using Fabrik::MetaObj::MetaBool;
using Fabrik::MetaObj::MetaString;
using Fabrik::MetaObj::MetaStruct;
using HostCtl::Lib::HostCtlException;
using HostCtl::System::FirewallModuleName;
using TvkCtl::System::ModuleImpl;
using TvkCtl::System::SystemInfoImpl;

namespace {

const std::string kFirewallStruct = "Firewall";
const std::string kLoadedField = "Loaded";
const std::string kEnabledField = "Enabled";
const std::string kDefaultActionField = "DefaultAction";
const std::string kEnabledParam = "enabled";
const std::string kDefaultActionParam = "default-action";

const ParameterDef kSetParameters[] = {
    {kEnabledParam, "e", Fabrik::CallSpec::Boolean, false,
     "Set to true to enable the firewall, set to false to disable the firewall."},
    {kDefaultActionParam, "d", Fabrik::CallSpec::Boolean, false,
     "Set to true to set defaultaction PASS, set to false to DROP."},
};

} // namespace

// network firewall get

CORVEX_DEFINE_NEW(FirewallGet)

FirewallGet::FirewallGet() {
  SetDescription("Get the firewall status.");
  SetDefaultOutputFormatter("simple");
}

FirewallGet::~FirewallGet() = default;

std::shared_ptr<InputSpec> FirewallGet::GetInputSpecInternal() {
  return InputSpec::New();
}

std::shared_ptr<MetaStruct> FirewallGet::GetOutputStructure() {
  auto structure = MetaStruct::New(kFirewallStruct);
  structure->SetField(kLoadedField, MetaBool::New());
  structure->SetField(kEnabledField, MetaBool::New());
  structure->SetField(kDefaultActionField, MetaString::New());
  return structure;
}

std::shared_ptr<OutputSpec> FirewallGet::GetOutputSpecInternal() {
  return ResultSpec(GetOutputStructure());
}

void FirewallGet::ExecuteInternal(const std::shared_ptr<Input>& /*input*/,
                                  const std::shared_ptr<Output>& output) {
  try {
    SystemInfoImpl system;
    ModuleImpl module(FirewallModuleName);
    auto result = GetOutputStructure();
    bool loaded = module.IsLoaded();
    bool enabled = false;
    bool pass = true;
    if (loaded) {
      enabled = system.IsFirewallEnabled();
      pass = system.GetFirewallDefaultAction();
    }
    result->SetField(kLoadedField, loaded);
    result->SetField(kEnabledField, enabled);
    result->SetField(kDefaultActionField, pass ? "PASS" : "DROP");
    output->SetRootObject(result);
  } catch (const HostCtlException& e) {
    output->AddErrorMessage(std::string("Unable to get firewall status.\n") + e.what());
  }
}

// network firewall set

CORVEX_DEFINE_NEW(FirewallSet)

FirewallSet::FirewallSet() {
  SetDescription("Set firewall enabled status and default action.");
}

FirewallSet::~FirewallSet() = default;

std::shared_ptr<InputSpec> FirewallSet::GetInputSpecInternal() {
  return MakeInputSpec(kSetParameters);
}

std::shared_ptr<OutputSpec> FirewallSet::GetOutputSpecInternal() {
  return BoolResultSpec();
}

void FirewallSet::ExecuteInternal(const std::shared_ptr<Input>& input,
                                  const std::shared_ptr<Output>& output) {
  SystemInfoImpl system;
  bool hasEnabled = input->HasParameter(kEnabledParam);
  bool hasAction = input->HasParameter(kDefaultActionParam);
  if (!hasEnabled && !hasAction) {
    output->AddErrorMessage("Need parameter --enabled or --default-action");
    return;
  }
  try {
    ModuleImpl module(FirewallModuleName);
    if (!module.IsLoaded()) {
      output->AddErrorMessage("Firewall module is not loaded");
      return;
    }
    bool enabled = system.IsFirewallEnabled();
    bool pass = system.GetFirewallDefaultAction();
    if (hasEnabled) {
      bool requested = input->GetParameterBool(kEnabledParam);
      if (requested != enabled)
        system.SetFirewallEnabled(requested);
    }
    if (hasAction) {
      bool requested = input->GetParameterBool(kDefaultActionParam);
      if (requested != pass)
        system.SetFirewallDefaultAction(requested);
    }
    output->SetRootObject(MetaBool::New(true));
  } catch (const HostCtlException& e) {
    output->AddErrorMessage(e.what());
  }
}

// network firewall load

CORVEX_DEFINE_NEW(FirewallLoad)

FirewallLoad::FirewallLoad() {
  SetDescription("Load firewall module and rulesets configuration.");
}

FirewallLoad::~FirewallLoad() = default;

std::shared_ptr<InputSpec> FirewallLoad::GetInputSpecInternal() {
  return InputSpec::New();
}

std::shared_ptr<OutputSpec> FirewallLoad::GetOutputSpecInternal() {
  return BoolResultSpec();
}

void FirewallLoad::ExecuteInternal(const std::shared_ptr<Input>& /*input*/,
                                   const std::shared_ptr<Output>& output) {
  try {
    SystemInfoImpl system;
    ModuleImpl module(FirewallModuleName);
    module.Load("", false);
    system.LoadFirewallRulesets();
    output->SetRootObject(MetaBool::New(true));
  } catch (const HostCtlException& e) {
    output->AddErrorMessage(e.what());
  }
}

// network firewall refresh

CORVEX_DEFINE_NEW(FirewallRefresh)

FirewallRefresh::FirewallRefresh() {
  SetDescription("Load ruleset configuration for firewall.");
}

FirewallRefresh::~FirewallRefresh() = default;

std::shared_ptr<InputSpec> FirewallRefresh::GetInputSpecInternal() {
  return InputSpec::New();
}

std::shared_ptr<OutputSpec> FirewallRefresh::GetOutputSpecInternal() {
  return BoolResultSpec();
}

void FirewallRefresh::ExecuteInternal(const std::shared_ptr<Input>& /*input*/,
                                      const std::shared_ptr<Output>& output) {
  try {
    SystemInfoImpl system;
    system.LoadFirewallRulesets();
    output->SetRootObject(MetaBool::New(true));
  } catch (const HostCtlException& e) {
    output->AddErrorMessage(e.what());
  }
}

// network firewall unload

CORVEX_DEFINE_NEW(FirewallUnload)

FirewallUnload::FirewallUnload() {
  SetDescription("Allow unload firewall module.");
}

FirewallUnload::~FirewallUnload() = default;

std::shared_ptr<InputSpec> FirewallUnload::GetInputSpecInternal() {
  return InputSpec::New();
}

std::shared_ptr<OutputSpec> FirewallUnload::GetOutputSpecInternal() {
  return BoolResultSpec();
}

void FirewallUnload::ExecuteInternal(const std::shared_ptr<Input>& /*input*/,
                                     const std::shared_ptr<Output>& output) {
  SystemInfoImpl system;
  try {
    ModuleImpl module(FirewallModuleName);
    if (module.IsLoaded()) {
      system.DestroyFirewallFilters();
      module.Unload();
    }
    output->SetRootObject(MetaBool::New(true));
  } catch (const HostCtlException& e) {
    output->AddErrorMessage(e.what());
  }
}

} // namespace CorvexCli::NetworkNamespace
