//===- Dvs.cpp - Distributed switch list ----------------------------------===//
//
// network vswitch dvs corvex list: the distributed switches of the host with
// their distributed ports.
//
//===----------------------------------------------------------------------===//
#include "vswitch.h"

#include "HostCtl/Lib.h"
#include "HostCtl/Network/NetworkInfo.h"
#include "TvkCtl/Network/NetworkInfoImpl.h"
#include "TvkCtl/Network/Switching.h"
#include "common/PolicyParams.h"

#include <algorithm>

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

const std::string kParamKrxName = "krx-name";

const std::string kStructKrx = "KRX";
const std::string kStructDVPort = "DVPort";
const std::string kFieldName = "Name";
const std::string kFieldKrxId = "KRX ID";
const std::string kFieldClass = "Class";
const std::string kFieldNumPorts = "Num Ports";
const std::string kFieldUsedPorts = "Used Ports";
const std::string kFieldConfiguredPorts = "Configured Ports";
const std::string kFieldMtu = "MTU";
const std::string kFieldCdpStatus = "CDP Status";
const std::string kFieldBeaconTimeout = "Beacon Timeout";
const std::string kFieldUplinks = "Uplinks";
const std::string kFieldCorvexBranded = "Corvex Branded";
const std::string kFieldDVPort = "DVPort";
const std::string kFieldPortId = "Port ID";
const std::string kFieldInUse = "In Use";
const std::string kFieldDVPortgroupId = "DVPortgroup ID";
const std::string kFieldClient = "Client";

} // namespace

// network vswitch dvs corvex list

CORVEX_DEFINE_NEW(VirtualSwitchDVSCorvexList)

VirtualSwitchDVSCorvexList::VirtualSwitchDVSCorvexList() {
  SetDescription(
      "List the Corvex Ambrel Distributed Switch currently configured on the Ostra host.");
  SetDefaultOutputFormatter("simple");
  SetDefaultOutputParameter("header:" + kStructKrx, "%" + kFieldName + "%");
  std::string columns;
  for (const std::string* field :
       {&kFieldName, &kFieldKrxId, &kFieldClass, &kFieldNumPorts, &kFieldUsedPorts,
        &kFieldConfiguredPorts, &kFieldMtu, &kFieldCdpStatus, &kFieldBeaconTimeout, &kFieldUplinks,
        &kFieldCorvexBranded, &kFieldDVPort})
    columns += (columns.empty() ? "" : ",") + *field;
  SetDefaultOutputParameter("table-columns", columns);
}

VirtualSwitchDVSCorvexList::~VirtualSwitchDVSCorvexList() = default;

std::shared_ptr<InputSpec> VirtualSwitchDVSCorvexList::GetInputSpecInternal() {
  auto spec = InputSpec::New();
  AddParameters(*spec, {{kParamKrxName, "v", Fabrik::CallSpec::String, false,
                         "Limit the output of this command to only kRX with the given name."}});
  return spec;
}

std::shared_ptr<MetaStruct> VirtualSwitchDVSCorvexList::GetDVPortStructure() {
  auto structure = MetaStruct::New(kStructDVPort);
  structure->SetField(kFieldPortId, MetaString::New());
  structure->SetField(kFieldInUse, MetaBool::New());
  structure->SetField(kFieldDVPortgroupId, MetaString::New());
  structure->SetField(kFieldClient, MetaList::New(Fabrik::MetaObj::String));
  return structure;
}

std::shared_ptr<MetaStruct> VirtualSwitchDVSCorvexList::GetOutputStructure() {
  auto structure = MetaStruct::New(kStructKrx);
  structure->SetField(kFieldName, MetaString::New());
  structure->SetField(kFieldKrxId, MetaString::New());
  structure->SetField(kFieldClass, MetaString::New());
  structure->SetField(kFieldNumPorts, MetaInt::New());
  structure->SetField(kFieldUsedPorts, MetaInt::New());
  structure->SetField(kFieldConfiguredPorts, MetaInt::New());
  structure->SetField(kFieldMtu, MetaInt::New());
  structure->SetField(kFieldCdpStatus, MetaString::New());
  structure->SetField(kFieldBeaconTimeout, MetaInt::New());
  structure->SetField(kFieldUplinks, MetaList::New(Fabrik::MetaObj::String));
  structure->SetField(kFieldCorvexBranded, MetaBool::New());
  structure->SetField(kFieldDVPort, MetaList::New(Fabrik::MetaObj::Struct, GetDVPortStructure()));
  return structure;
}

std::shared_ptr<OutputSpec> VirtualSwitchDVSCorvexList::GetOutputSpecInternal() {
  return ListResultSpec(GetOutputStructure());
}

std::shared_ptr<MetaList>
VirtualSwitchDVSCorvexList::GetDVPortList(const std::vector<std::unique_ptr<DVPort>>& ports) {
  auto list = MetaList::New(Fabrik::MetaObj::Struct, GetDVPortStructure());
  for (const auto& port : ports) {
    auto* impl = dynamic_cast<TvkCtl::Network::DVPortImpl*>(port.get());
    if (!impl)
      continue;
    std::vector<std::string> clients;
    bool inUse = impl->IsInUse(clients);
    auto row = GetDVPortStructure();
    row->SetField(kFieldPortId, impl->GetPortId());
    row->SetField(kFieldInUse, inUse);
    row->SetField(kFieldDVPortgroupId, impl->GetDVPortgroupId());
    row->SetField(kFieldClient, clients);
    list->Add(row);
  }
  return list;
}

void VirtualSwitchDVSCorvexList::ExecuteInternal(const std::shared_ptr<Input>& input,
                                                 const std::shared_ptr<Output>& output) {
  try {
    std::string name;
    if (input->HasParameter(kParamKrxName))
      name = input->GetParameter(kParamKrxName);
    std::vector<std::unique_ptr<DVSwitch>> switches;
    if (name.empty()) {
      TvkCtl::Network::VirtualSwitchInfoImpl info;
      switches = info.GetDVSwitches();
    } else {
      switches.push_back(NetworkFactory::GetDVSwitchByName(name));
    }
    TvkCtl::Network::NetworkInfoImpl network;
    std::vector<std::string> nics;
    for (const auto& nic : network.GetPnics(PnicGetRegular))
      if (nic)
        nics.push_back(nic->GetName());
    auto list = MetaList::New(Fabrik::MetaObj::Struct, GetOutputStructure());
    for (const auto& entry : switches) {
      auto* dvs = dynamic_cast<TvkCtl::Network::DVSwitchImpl*>(entry.get());
      if (!dvs) {
        output->AddErrorMessage("Unable to access all kRX");
        break;
      }
      auto row = GetOutputStructure();
      row->SetField(kFieldName, dvs->GetDvsName());
      row->SetField(kFieldKrxId, dvs->GetDvsId());
      row->SetField(kFieldClass, dvs->GetClassName());
      row->SetField(kFieldNumPorts, static_cast<long>(dvs->GetNumPorts()));
      row->SetField(kFieldUsedPorts, static_cast<long>(dvs->GetUsedPorts()));
      row->SetField(kFieldConfiguredPorts, static_cast<long>(dvs->GetNumConfiguredPorts()));
      row->SetField(kFieldMtu, static_cast<long>(dvs->GetMTU()));
      row->SetField(kFieldCdpStatus, dvs->GetCdpStatusString());
      row->SetField(kFieldBeaconTimeout, static_cast<long>(dvs->GetBeaconTimeout()));
      row->SetField(kFieldCorvexBranded, dvs->IsCorvexBranded());
      row->SetField(kFieldDVPort, GetDVPortList(dvs->GetDVPorts()));
      std::vector<std::string> uplinks = dvs->GetUplinks();
      uplinks.erase(std::remove_if(uplinks.begin(), uplinks.end(),
                                   [&](const std::string& uplink) {
                                     return std::find(nics.begin(), nics.end(), uplink) ==
                                            nics.end();
                                   }),
                    uplinks.end());
      row->SetField(kFieldUplinks, uplinks);
      list->Add(row);
    }
    output->SetRootObject(list);
  } catch (const HostCtlException& e) {
    output->AddErrorMessage(e.what());
  }
}

} // namespace CorvexCli::NetworkNamespace
