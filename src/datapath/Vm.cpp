//===- Vm.cpp - VM and VM port list commands ------------------------------===//
//
// network vm list and network vm port list: the VMs (worlds) that have ports
// on the host's switches, and the ports of one VM.
//
//===----------------------------------------------------------------------===//
#include "common/FieldTable.h"
#include "datapath.h"

#include "HostCtl/Lib.h"
#include "TvkCtl/Network/PnicImpl.h"
#include "TvkCtl/Network/Switching.h"
#include "TvkCtl/Resource/WorldImpl.h"
#include "common/ParameterTable.h"

#include <algorithm>
#include <cstdlib>
#include <map>

namespace CorvexCli::NetworkNamespace {

using Fabrik::CallSpec::Input;
using Fabrik::CallSpec::InputSpec;
using Fabrik::CallSpec::Output;
using Fabrik::CallSpec::OutputSpec;
using Fabrik::MetaObj::MetaInt;
using Fabrik::MetaObj::MetaList;
using Fabrik::MetaObj::MetaString;
using Fabrik::MetaObj::MetaStruct;
using HostCtl::Lib::HostCtlException;
using HostCtl::Network::Port;
using HostCtl::Network::Portset;
using TvkCtl::Network::DVPortImpl;
using TvkCtl::Network::PortsetImpl;
using TvkCtl::Network::VirtualSwitchInfoImpl;

namespace {

const std::string kWorldIdParam = "world-id";

const std::string kVmStruct = "VM";
const std::string kWorldIdField = "World ID";
const std::string kNameField = "Name";
const std::string kNumPortsField = "Num Ports";
const std::string kNetworksField = "Networks";

const std::string kPortStruct = "Port";
const std::string kPortIdField = "Port ID";
const std::string kVSwitchField = "vSwitch";
const std::string kPortgroupField = "Portgroup";
const std::string kDVPortIdField = "DVPort ID";
const std::string kMacAddressField = "MAC Address";
const std::string kIpAddressField = "IP Address";
const std::string kTeamUplinkField = "Team Uplink";
const std::string kUplinkPortIdField = "Uplink Port ID";
const std::string kActiveFiltersField = "Active Filters";

/// Length of the host's prefix of VM world names.
constexpr std::size_t kWorldNamePrefix = 5;

const ParameterDef kPortListParameters[] = {
    {kWorldIdParam, "w", Fabrik::CallSpec::Integer, true, "World ID of the VM for listing ports."},
};

/// How the VM commands treat a switch.
enum class SwitchKind { Legacy, Distributed, Other };

SwitchKind Classify(VirtualSwitchInfoImpl& switches, const std::string& name) {
  if (switches.IsLegacySwitch(name) || switches.IsOpaqueSwitch(name))
    return SwitchKind::Legacy;
  if (switches.IsDVSwitch(name))
    return SwitchKind::Distributed;
  return SwitchKind::Other;
}

/// The port group id of the distributed port \p port uses on \p portset.
std::string DVPortgroupOf(const Portset& portset, const Port& port) {
  const auto& impl = dynamic_cast<const PortsetImpl&>(portset);
  return DVPortImpl(impl.GetIdentifier(), port.GetDVPortID()).GetDVPortgroupId();
}

} // namespace

std::string VmNameFromWorldName(const std::string& worldName) {
  return worldName.size() < kWorldNamePrefix ? std::string() : worldName.substr(kWorldNamePrefix);
}

// network vm list

CORVEX_DEFINE_NEW(VMList)

VMList::VMList() {
  SetDescription("List networking information for the VM's that have active ports.");
  SetDefaultOutputFormatter("table");
  SetDefaultOutputParameter("fields:" + kVmStruct, kWorldIdField + "," + kNameField + "," +
                                                       kNumPortsField + "," + kNetworksField);
}

VMList::~VMList() = default;

std::shared_ptr<InputSpec> VMList::GetInputSpecInternal() {
  return InputSpec::New();
}

std::shared_ptr<MetaStruct> VMList::GetOutputStructure() {
  auto structure = MetaStruct::New(kVmStruct);
  structure->SetField(kWorldIdField, MetaInt::New());
  structure->SetField(kNameField, MetaString::New());
  structure->SetField(kNumPortsField, MetaInt::New());
  structure->SetField(kNetworksField, MetaList::New(Fabrik::MetaObj::String));
  return structure;
}

std::shared_ptr<OutputSpec> VMList::GetOutputSpecInternal() {
  return ListResultSpec(GetOutputStructure());
}

void VMList::ExecuteInternal(const std::shared_ptr<Input>& /*input*/,
                             const std::shared_ptr<Output>& output) {
  try {
    VirtualSwitchInfoImpl switches;
    // Worlds in ascending id order, each with its ports' networks in the
    // order the ports were found.
    std::map<int64_t, std::vector<std::string>> networks;
    for (const auto& portset : switches.GetAllSwitches()) {
      if (!portset)
        continue;
      SwitchKind kind = Classify(switches, portset->GetName());
      if (kind == SwitchKind::Other)
        continue;
      for (const auto& port : portset->GetPorts()) {
        int64_t world = port->GetWorldLeader();
        if (world == 0)
          continue;
        networks[world].push_back(kind == SwitchKind::Legacy ? port->GetPortGroupName()
                                                             : DVPortgroupOf(*portset, *port));
      }
    }
    auto result = MetaList::New(Fabrik::MetaObj::Struct, GetOutputStructure());
    for (const auto& [world, names] : networks) {
      auto row = GetOutputStructure();
      row->SetField(kWorldIdField, static_cast<long>(world));
      row->SetField(kNameField,
                    VmNameFromWorldName(TvkCtl::Resource::WorldImpl(world).GetWorldName()));
      row->SetField(kNumPortsField, static_cast<long>(names.size()));
      row->SetField(kNetworksField, names);
      result->Add(row);
    }
    output->SetRootObject(result);
  } catch (const HostCtlException& e) {
    output->AddErrorMessage(e.what());
  }
}

// network vm port list

CORVEX_DEFINE_NEW(VMPortList)

VMPortList::VMPortList() {
  SetDescription("List of active ports for a given VM.");
  SetDefaultOutputFormatter("simple");
  SetDefaultOutputParameter("fields:" + kPortStruct,
                            kPortIdField + "," + kVSwitchField + "," + kPortgroupField + "," +
                                kDVPortIdField + "," + kMacAddressField + "," + kIpAddressField +
                                "," + kTeamUplinkField + "," + kUplinkPortIdField + "," +
                                kActiveFiltersField);
}

VMPortList::~VMPortList() = default;

std::shared_ptr<InputSpec> VMPortList::GetInputSpecInternal() {
  return MakeInputSpec(kPortListParameters);
}

std::shared_ptr<MetaStruct> VMPortList::GetOutputStructure() {
  auto structure = MetaStruct::New(kPortStruct);
  structure->SetField(kPortIdField, MetaInt::New());
  structure->SetField(kVSwitchField, MetaString::New());
  structure->SetField(kPortgroupField, MetaString::New());
  structure->SetField(kDVPortIdField, MetaString::New());
  structure->SetField(kMacAddressField, MetaString::New());
  structure->SetField(kIpAddressField, MetaString::New());
  structure->SetField(kTeamUplinkField, MetaString::New());
  structure->SetField(kUplinkPortIdField, MetaInt::New());
  structure->SetField(kActiveFiltersField, MetaList::New(Fabrik::MetaObj::String));
  return structure;
}

std::shared_ptr<OutputSpec> VMPortList::GetOutputSpecInternal() {
  return ListResultSpec(GetOutputStructure());
}

void VMPortList::ExecuteInternal(const std::shared_ptr<Input>& input,
                                 const std::shared_ptr<Output>& output) {
  try {
    long world = std::strtol(input->GetParameter(kWorldIdParam).c_str(), nullptr, 10);
    VirtualSwitchInfoImpl switches;
    auto result = MetaList::New(Fabrik::MetaObj::Struct, GetOutputStructure());
    for (const auto& portset : switches.GetAllSwitches()) {
      if (!portset)
        continue;
      SwitchKind kind = Classify(switches, portset->GetName());
      for (const auto& port : portset->GetPorts()) {
        // World 0 stands for "no world": uplink and kernel ports are no VM's.
        if (world == 0 || port->GetWorldLeader() != world)
          continue;
        auto row = GetOutputStructure();
        row->SetField(kPortIdField, static_cast<long>(port->GetId()));
        if (kind == SwitchKind::Legacy) {
          row->SetField(kVSwitchField, portset->GetName());
          row->SetField(kPortgroupField, port->GetPortGroupName());
          row->SetField(kDVPortIdField, "");
        } else {
          const auto* dvs = dynamic_cast<const HostCtl::Network::DVSwitch*>(portset.get());
          row->SetField(kVSwitchField, dvs ? dvs->GetDisplayName() : portset->GetName());
          row->SetField(kPortgroupField, DVPortgroupOf(*portset, *port));
          row->SetField(kDVPortIdField, port->GetDVPortID());
        }
        std::vector<HostCtl::Network::MacAddress> macs = port->GetMacAddresses();
        row->SetField(kMacAddressField,
                      macs.empty() ? std::string() : macs.front().GetStringAddress());
        row->SetField(kIpAddressField, port->GetPortClientIpv4Address().GetStringAddress());
        // A port without team uplink, an uplink that is no NIC of the host
        // and a NIC without port show what the host has: nothing.
        std::string uplink = port->GetSchedTeamUplink();
        long uplinkPort = 0;
        if (!uplink.empty() && TvkCtl::Network::PnicImpl::IsValidPnic(uplink)) {
          TvkCtl::Network::PnicImpl nic(uplink);
          uplink = nic.GetName();
          if (std::unique_ptr<Port> nicPort = nic.GetPort())
            uplinkPort = static_cast<long>(nicPort->GetId());
        }
        row->SetField(kTeamUplinkField, uplink);
        row->SetField(kUplinkPortIdField, uplinkPort);
        std::vector<std::string> active;
        for (const auto& filter : port->GetFilterStats())
          if (filter->active &&
              std::find(active.begin(), active.end(), filter->name) == active.end())
            active.push_back(filter->name);
        row->SetField(kActiveFiltersField, active);
        result->Add(row);
      }
    }
    if (result->GetCount() == 0) {
      output->AddErrorMessage("Couldn't find VM with given world ID");
      return;
    }
    output->SetRootObject(result);
  } catch (const HostCtlException& e) {
    output->AddErrorMessage(e.what());
  }
}

} // namespace CorvexCli::NetworkNamespace
