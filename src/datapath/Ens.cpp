//===- Ens.cpp - Fast-path logical core commands --------------------------===//
//
// network ens maxLcores get and set, and network ens lcore add, remove, list,
// switch get, add and remove, affinity get and set. Each command makes one
// call on the network information object; the host validates ids, switch
// names and NUMA nodes and answers false or throws (docs/ens.md).
//
//===----------------------------------------------------------------------===//
#include "datapath.h"

#include "HostCtl/Lib.h"
#include "HostCtl/Network/NetworkInfo.h"
#include "common/FieldTable.h"
#include "common/ParameterTable.h"

namespace CorvexCli::NetworkNamespace {

using Fabrik::CallSpec::Input;
using Fabrik::CallSpec::InputSpec;
using Fabrik::CallSpec::Output;
using Fabrik::CallSpec::OutputSpec;
using Fabrik::MetaObj::MetaBool;
using Fabrik::MetaObj::MetaInt;
using Fabrik::MetaObj::MetaList;
using Fabrik::MetaObj::MetaObjectPtr;
using Fabrik::MetaObj::MetaString;
using Fabrik::MetaObj::MetaStruct;
using HostCtl::Lib::HostCtlException;
using HostCtl::Network::NetworkFactory;
using HostCtl::Network::NetworkInfo;

namespace {

const std::string kLcoreIdParam = "lcore-id";
const std::string kAffinityParam = "affinity";
const std::string kSwitchParam = "switch";
const std::string kMaxLcoresParam = "maxlcores";

const std::string kEnsStruct = "Ens";
const std::string kLcoreIdField = "Lcore ID";
const std::string kSwitchField = "Switch";
const std::string kAffinityField = "Affinity";

/// The switch name that clears a context's association.
const std::string kNoSwitch = "null";

const ParameterDef kMaxLcoresSetParameters[] = {
    {kMaxLcoresParam, "n", Fabrik::CallSpec::Integer, true,
     "Number of maximum ENS contexts to be assigned."},
};
const ParameterDef kAddParameters[] = {
    {kLcoreIdParam, "l", Fabrik::CallSpec::Integer, true, "ENS context id to be created."},
};
const ParameterDef kRemoveParameters[] = {
    {kLcoreIdParam, "l", Fabrik::CallSpec::Integer, true, "ENS context id to be destroyed."},
};
const ParameterDef kLcoreParameters[] = {
    {kLcoreIdParam, "l", Fabrik::CallSpec::Integer, true, "ENS context id."},
};
const ParameterDef kSwitchAddParameters[] = {
    {kLcoreIdParam, "l", Fabrik::CallSpec::Integer, true, "ENS context id."},
    {kSwitchParam, "s", Fabrik::CallSpec::String, true, "Switch name."},
};
const ParameterDef kAffinitySetParameters[] = {
    {kLcoreIdParam, "l", Fabrik::CallSpec::Integer, true, "ENS context id."},
    {kAffinityParam, "a", Fabrik::CallSpec::Integer, true, "Numa node affinity."},
};
/// Runs \p call on the network information object and makes its value the
/// result; a host failure becomes the error.
template <typename Call> void RunEnsCall(Output& output, Call call) {
  try {
    std::unique_ptr<NetworkInfo> network = NetworkFactory::GetNetworkInfo();
    output.SetRootObject(call(*network));
  } catch (const HostCtlException& e) {
    output.AddErrorMessage(e.what());
  }
}

} // namespace

// network ens maxLcores get

CORVEX_DEFINE_MAKE_SHARED(EnsMaxlcoresGet)

EnsMaxlcoresGet::EnsMaxlcoresGet() {
  SetDescription("Get the maximum number of ENS contexts (lcores).");
  SetDefaultOutputFormatter("simple");
}

EnsMaxlcoresGet::~EnsMaxlcoresGet() = default;

std::shared_ptr<InputSpec> EnsMaxlcoresGet::GetInputSpecInternal() {
  return InputSpec::New();
}

std::shared_ptr<OutputSpec> EnsMaxlcoresGet::GetOutputSpecInternal() {
  return ResultSpec(MetaInt::New());
}

void EnsMaxlcoresGet::ExecuteInternal(const std::shared_ptr<Input>& /*input*/,
                                      const std::shared_ptr<Output>& output) {
  RunEnsCall(*output, [](NetworkInfo& network) { return MetaInt::New(network.GetEnsMaxLcores()); });
}

// network ens maxLcores set

CORVEX_DEFINE_MAKE_SHARED(EnsMaxlcoresSet)

EnsMaxlcoresSet::EnsMaxlcoresSet() {
  SetDescription("Set the maximum number of ENS contexts.");
}

EnsMaxlcoresSet::~EnsMaxlcoresSet() = default;

std::shared_ptr<InputSpec> EnsMaxlcoresSet::GetInputSpecInternal() {
  return MakeInputSpec(kMaxLcoresSetParameters);
}

std::shared_ptr<OutputSpec> EnsMaxlcoresSet::GetOutputSpecInternal() {
  return BoolResultSpec();
}

void EnsMaxlcoresSet::ExecuteInternal(const std::shared_ptr<Input>& input,
                                      const std::shared_ptr<Output>& output) {
  long count = input->GetParameterInt(kMaxLcoresParam);
  RunEnsCall(*output,
             [&](NetworkInfo& network) { return MetaBool::New(network.SetEnsMaxLcores(count)); });
}

// network ens lcore add

CORVEX_DEFINE_MAKE_SHARED(EnsLcoreAdd)

EnsLcoreAdd::EnsLcoreAdd() {
  SetDescription("Create ENS context.");
}

EnsLcoreAdd::~EnsLcoreAdd() = default;

std::shared_ptr<InputSpec> EnsLcoreAdd::GetInputSpecInternal() {
  return MakeInputSpec(kAddParameters);
}

std::shared_ptr<OutputSpec> EnsLcoreAdd::GetOutputSpecInternal() {
  return BoolResultSpec();
}

void EnsLcoreAdd::ExecuteInternal(const std::shared_ptr<Input>& input,
                                  const std::shared_ptr<Output>& output) {
  long id = input->GetParameterInt(kLcoreIdParam);
  RunEnsCall(*output, [&](NetworkInfo& network) { return MetaBool::New(network.AddEnsLcore(id)); });
}

// network ens lcore remove

CORVEX_DEFINE_MAKE_SHARED(EnsLcoreRemove)

EnsLcoreRemove::EnsLcoreRemove() {
  SetDescription("Destroy ENS context.");
}

EnsLcoreRemove::~EnsLcoreRemove() = default;

std::shared_ptr<InputSpec> EnsLcoreRemove::GetInputSpecInternal() {
  return MakeInputSpec(kRemoveParameters);
}

std::shared_ptr<OutputSpec> EnsLcoreRemove::GetOutputSpecInternal() {
  return BoolResultSpec();
}

void EnsLcoreRemove::ExecuteInternal(const std::shared_ptr<Input>& input,
                                     const std::shared_ptr<Output>& output) {
  long id = input->GetParameterInt(kLcoreIdParam);
  RunEnsCall(*output,
             [&](NetworkInfo& network) { return MetaBool::New(network.RemoveEnsLcore(id)); });
}

// network ens lcore list

CORVEX_DEFINE_MAKE_SHARED(EnsLcoreList)

EnsLcoreList::EnsLcoreList() {
  SetDescription("List ENS contexts.");
  SetDefaultOutputFormatter("table");
  SetDefaultOutputParameter("fields:" + kEnsStruct,
                            kLcoreIdField + "," + kSwitchField + "," + kAffinityField);
}

EnsLcoreList::~EnsLcoreList() = default;

std::shared_ptr<InputSpec> EnsLcoreList::GetInputSpecInternal() {
  return InputSpec::New();
}

std::shared_ptr<MetaStruct> EnsLcoreList::GetOutputStructure() {
  auto structure = MetaStruct::New(kEnsStruct);
  structure->SetField(kLcoreIdField, MetaInt::New());
  structure->SetField(kSwitchField, MetaString::New());
  structure->SetField(kAffinityField, MetaInt::New());
  return structure;
}

std::shared_ptr<OutputSpec> EnsLcoreList::GetOutputSpecInternal() {
  return ListResultSpec(GetOutputStructure());
}

void EnsLcoreList::ExecuteInternal(const std::shared_ptr<Input>& /*input*/,
                                   const std::shared_ptr<Output>& output) {
  RunEnsCall(*output, [&](NetworkInfo& network) {
    std::vector<int64_t> ids = network.GetEnsLcores();
    auto result = MetaList::New(Fabrik::MetaObj::Struct, GetOutputStructure());
    result->Reserve(ids.size());
    for (int64_t id : ids) {
      auto row = GetOutputStructure();
      row->SetField(kLcoreIdField, static_cast<long>(id));
      row->SetField(kSwitchField, network.GetEnsLcoreSwitch(id));
      row->SetField(kAffinityField, static_cast<long>(network.GetEnsLcoreAffinity(id)));
      result->Add(row);
    }
    return result;
  });
}

// network ens lcore switch get

CORVEX_DEFINE_MAKE_SHARED(EnsLcoreSwitchGet)

EnsLcoreSwitchGet::EnsLcoreSwitchGet() {
  SetDescription("Get the switch associated with given ENS context.");
  SetDefaultOutputFormatter("simple");
}

EnsLcoreSwitchGet::~EnsLcoreSwitchGet() = default;

std::shared_ptr<InputSpec> EnsLcoreSwitchGet::GetInputSpecInternal() {
  return MakeInputSpec(kLcoreParameters);
}

std::shared_ptr<OutputSpec> EnsLcoreSwitchGet::GetOutputSpecInternal() {
  return ResultSpec(MetaString::New());
}

void EnsLcoreSwitchGet::ExecuteInternal(const std::shared_ptr<Input>& input,
                                        const std::shared_ptr<Output>& output) {
  long id = input->GetParameterInt(kLcoreIdParam);
  RunEnsCall(*output,
             [&](NetworkInfo& network) { return MetaString::New(network.GetEnsLcoreSwitch(id)); });
}

// network ens lcore switch add

CORVEX_DEFINE_MAKE_SHARED(EnsLcoreSwitchAdd)

EnsLcoreSwitchAdd::EnsLcoreSwitchAdd() {
  SetDescription("Associate given ENS context with given switch.");
}

EnsLcoreSwitchAdd::~EnsLcoreSwitchAdd() = default;

std::shared_ptr<InputSpec> EnsLcoreSwitchAdd::GetInputSpecInternal() {
  return MakeInputSpec(kSwitchAddParameters);
}

std::shared_ptr<OutputSpec> EnsLcoreSwitchAdd::GetOutputSpecInternal() {
  return BoolResultSpec();
}

void EnsLcoreSwitchAdd::ExecuteInternal(const std::shared_ptr<Input>& input,
                                        const std::shared_ptr<Output>& output) {
  long id = input->GetParameterInt(kLcoreIdParam);
  const std::string& name = input->GetParameter(kSwitchParam);
  RunEnsCall(*output, [&](NetworkInfo& network) {
    return MetaBool::New(network.SetEnsLcoreSwitch(name, id));
  });
}

// network ens lcore switch remove

CORVEX_DEFINE_MAKE_SHARED(EnsLcoreSwitchRemove)

EnsLcoreSwitchRemove::EnsLcoreSwitchRemove() {
  SetDescription("Disassociate given ENS context from virtual switch.");
}

EnsLcoreSwitchRemove::~EnsLcoreSwitchRemove() = default;

std::shared_ptr<InputSpec> EnsLcoreSwitchRemove::GetInputSpecInternal() {
  return MakeInputSpec(kLcoreParameters);
}

std::shared_ptr<OutputSpec> EnsLcoreSwitchRemove::GetOutputSpecInternal() {
  return BoolResultSpec();
}

void EnsLcoreSwitchRemove::ExecuteInternal(const std::shared_ptr<Input>& input,
                                           const std::shared_ptr<Output>& output) {
  long id = input->GetParameterInt(kLcoreIdParam);
  RunEnsCall(*output, [&](NetworkInfo& network) {
    return MetaBool::New(network.SetEnsLcoreSwitch(kNoSwitch, id));
  });
}

// network ens lcore affinity get

CORVEX_DEFINE_MAKE_SHARED(EnsLcoreAffinityGet)

EnsLcoreAffinityGet::EnsLcoreAffinityGet() {
  SetDescription("Get the affinity for given ENS context.");
  SetDefaultOutputFormatter("simple");
}

EnsLcoreAffinityGet::~EnsLcoreAffinityGet() = default;

std::shared_ptr<InputSpec> EnsLcoreAffinityGet::GetInputSpecInternal() {
  return MakeInputSpec(kLcoreParameters);
}

std::shared_ptr<OutputSpec> EnsLcoreAffinityGet::GetOutputSpecInternal() {
  return ResultSpec(MetaInt::New());
}

void EnsLcoreAffinityGet::ExecuteInternal(const std::shared_ptr<Input>& input,
                                          const std::shared_ptr<Output>& output) {
  long id = input->GetParameterInt(kLcoreIdParam);
  RunEnsCall(*output, [&](NetworkInfo& network) {
    return MetaInt::New(static_cast<long>(network.GetEnsLcoreAffinity(id)));
  });
}

// network ens lcore affinity set

CORVEX_DEFINE_MAKE_SHARED(EnsLcoreAffinitySet)

EnsLcoreAffinitySet::EnsLcoreAffinitySet() {
  SetDescription("Set affinity for given ENS context.");
}

EnsLcoreAffinitySet::~EnsLcoreAffinitySet() = default;

std::shared_ptr<InputSpec> EnsLcoreAffinitySet::GetInputSpecInternal() {
  return MakeInputSpec(kAffinitySetParameters);
}

std::shared_ptr<OutputSpec> EnsLcoreAffinitySet::GetOutputSpecInternal() {
  return BoolResultSpec();
}

void EnsLcoreAffinitySet::ExecuteInternal(const std::shared_ptr<Input>& input,
                                          const std::shared_ptr<Output>& output) {
  long id = input->GetParameterInt(kLcoreIdParam);
  long affinity = input->GetParameterInt(kAffinityParam);
  RunEnsCall(*output, [&](NetworkInfo& network) {
    return MetaBool::New(network.SetEnsLcoreAffinity(affinity, id));
  });
}

} // namespace CorvexCli::NetworkNamespace
