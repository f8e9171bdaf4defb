//===- Attachment.cpp - Uplink attachments --------------------------------===//
//
// network nic attachment add, list and remove: a branch uplink attached to a
// trunk uplink under one VLAN ID.
//
//===----------------------------------------------------------------------===//
#include "nic.h"

#include "Fabrik/Call.h"
#include "Fabrik/MetaObj.h"
#include "HostCtl/Lib.h"
#include "HostCtl/Misc.h"
#include "HostCtl/Network/NetworkInfo.h"
#include "HostCtl/Network/Switching.h"
#include "TvkCtl/Network/NetworkInfoImpl.h"
#include "TvkCtl/Network/PnicImpl.h"
#include "common/FieldTable.h"
#include "common/ParameterTable.h"

#include <vector>

namespace CorvexCli::NetworkNamespace {

using namespace Fabrik;
using HostCtl::Lib::HostCtlException;
using HostCtl::Misc::StrCat;

namespace {

const std::string kTrunk = "trunk";
const std::string kBranch = "branch";
const std::string kVlanId = "vlan-id";

const std::string kAttachmentInfo = "AttachmentInfo";
const std::string kTrunkField = "Trunk";
const std::string kBranchField = "Branch";
const std::string kBranchMac = "Branch MAC";
const std::string kVlanIdField = "VLAN ID";

const ParameterDef kAddParameters[] = {
    {kTrunk, "t", CallSpec::String, true, "The name of the NIC to be configured as trunk uplink."},
    {kBranch, "b", CallSpec::String, true, "The name of the NIC to be attached as branch uplink."},
    // A branch takes a VLAN ID strictly between the bounds a port group admits.
    {kVlanId, "v", CallSpec::Integer, true,
     "The vlan ID for the branch uplink. Valid values: %ENUM%",
     ParameterCheck::Range(HostCtl::Network::PortGroup::MIN_VLAN_ID + 1,
                           HostCtl::Network::PortGroup::MAX_VLAN_ID - 1)},
};
const ParameterDef kListParameters[] = {
    {kTrunk, "t", CallSpec::String, false, "Show information only for the specified NIC."},
};
const ParameterDef kRemoveParameters[] = {
    {kTrunk, "t", CallSpec::String, true, "The name of the trunk uplink."},
    {kBranch, "b", CallSpec::String, true, "The name of the branch uplink."},
};
} // namespace

// network nic attachment add

CORVEX_DEFINE_MAKE_SHARED(NicAttachmentAdd)

NicAttachmentAdd::NicAttachmentAdd() {
  SetDescription("Attach one uplink as a branch to a trunk uplink with specified VLAN ID.");
}

NicAttachmentAdd::~NicAttachmentAdd() = default;

std::shared_ptr<CallSpec::InputSpec> NicAttachmentAdd::GetInputSpecInternal() {
  return MakeInputSpec(kAddParameters);
}

std::shared_ptr<CallSpec::OutputSpec> NicAttachmentAdd::GetOutputSpecInternal() {
  return BoolResultSpec();
}

void NicAttachmentAdd::ExecuteInternal(const std::shared_ptr<CallSpec::Input>& input,
                                       const std::shared_ptr<CallSpec::Output>& output) {
  const std::string& trunkName = input->GetParameter(kTrunk);
  const std::string& branchName = input->GetParameter(kBranch);
  try {
    long vlanId = input->GetParameterInt(kVlanId);
    if (trunkName == branchName) {
      output->AddErrorMessage("Trunk uplink and branch uplink need to be different.");
      return;
    }
    TvkCtl::Network::NetworkInfoImpl info;
    std::unique_ptr<HostCtl::Network::Pnic> trunk = info.GetPnicByName(trunkName);
    if (!trunk) {
      output->AddErrorMessage("Invalid trunk PNIC name " + trunkName);
      return;
    }
    if (!info.GetPnicByName(branchName)) {
      output->AddErrorMessage("Invalid branch PNIC name " + branchName);
      return;
    }
    trunk->AttachBranch(branchName, static_cast<uint16_t>(vlanId));
    output->SetRootObject(MetaObj::MetaBool::New(true));
  } catch (const HostCtlException& e) {
    output->AddErrorMessage(
        StrCat("Failed to attach uplink ", branchName, " to ", trunkName, ": ", e.what()));
  }
}

// network nic attachment list

CORVEX_DEFINE_MAKE_SHARED(NicAttachmentList)

NicAttachmentList::NicAttachmentList() {
  SetDescription("Show uplink attachment information.");
  SetDefaultOutputFormatter("table");
  SetDefaultOutputParameter("fields:" + kAttachmentInfo, kTrunkField + "," + kBranchField + "," +
                                                             kBranchMac + "," + kVlanIdField);
}

NicAttachmentList::~NicAttachmentList() = default;

std::shared_ptr<MetaObj::MetaStruct> NicAttachmentList::GetOutputStructure() {
  auto structure = MetaObj::MetaStruct::New(kAttachmentInfo);
  structure->SetField(kTrunkField, MetaObj::MetaString::New());
  structure->SetField(kBranchField, MetaObj::MetaString::New());
  structure->SetField(kBranchMac, MetaObj::MetaString::New());
  structure->SetField(kVlanIdField, MetaObj::MetaInt::New());
  return structure;
}

std::shared_ptr<CallSpec::InputSpec> NicAttachmentList::GetInputSpecInternal() {
  return MakeInputSpec(kListParameters);
}

std::shared_ptr<CallSpec::OutputSpec> NicAttachmentList::GetOutputSpecInternal() {
  return ListResultSpec(GetOutputStructure());
}

void NicAttachmentList::ExecuteInternal(const std::shared_ptr<CallSpec::Input>& input,
                                        const std::shared_ptr<CallSpec::Output>& output) {
  try {
    std::unique_ptr<HostCtl::Network::NetworkInfo> info =
        HostCtl::Network::NetworkFactory::GetNetworkInfo();
    std::vector<std::unique_ptr<HostCtl::Network::Pnic>> trunks;
    if (input->HasParameter(kTrunk)) {
      const std::string& name = input->GetParameter(kTrunk);
      std::unique_ptr<HostCtl::Network::Pnic> trunk = info->GetPnicByName(name);
      if (!trunk) {
        output->AddErrorMessage("Invalid PNIC name " + name);
        return;
      }
      trunks.push_back(std::move(trunk));
    } else {
      trunks = info->GetPnics(HostCtl::Network::PnicGetAll);
    }
    auto list = MetaObj::MetaList::New(MetaObj::Struct, GetOutputStructure());
    for (const auto& trunk : trunks) {
      if (!trunk)
        continue;
      std::vector<HostCtl::Network::PnicAttachment> attachments = trunk->GetAttachments();
      list->Reserve(list->GetCount() + attachments.size());
      for (const HostCtl::Network::PnicAttachment& attachment : attachments) {
        auto row = GetOutputStructure();
        row->SetField(kTrunkField, trunk->GetName());
        row->SetField(kBranchField, attachment.branch);
        TvkCtl::Network::PnicImpl branch(attachment.branch);
        row->SetField(kBranchMac, branch.GetMacAddress().GetStringAddress());
        row->SetField(kVlanIdField, static_cast<long>(attachment.vlanId));
        list->Add(row);
      }
    }
    output->SetRootObject(list);
  } catch (const HostCtlException& e) {
    output->AddErrorMessage(std::string("Unable to list uplink's attachment info: ") + e.what());
  }
}

// network nic attachment remove

CORVEX_DEFINE_MAKE_SHARED(NicAttachmentRemove)

NicAttachmentRemove::NicAttachmentRemove() {
  SetDescription("Detach a branch uplink from its trunk.");
}

NicAttachmentRemove::~NicAttachmentRemove() = default;

std::shared_ptr<CallSpec::InputSpec> NicAttachmentRemove::GetInputSpecInternal() {
  return MakeInputSpec(kRemoveParameters);
}

std::shared_ptr<CallSpec::OutputSpec> NicAttachmentRemove::GetOutputSpecInternal() {
  return BoolResultSpec();
}

void NicAttachmentRemove::ExecuteInternal(const std::shared_ptr<CallSpec::Input>& input,
                                          const std::shared_ptr<CallSpec::Output>& output) {
  const std::string& trunkName = input->GetParameter(kTrunk);
  const std::string& branchName = input->GetParameter(kBranch);
  try {
    TvkCtl::Network::NetworkInfoImpl info;
    std::unique_ptr<HostCtl::Network::Pnic> trunk = info.GetPnicByName(trunkName);
    if (!trunk) {
      output->AddErrorMessage("Invalid PNIC name " + trunkName);
      return;
    }
    trunk->DetachBranch(branchName);
    output->SetRootObject(MetaObj::MetaBool::New(true));
  } catch (const HostCtlException& e) {
    output->AddErrorMessage(
        StrCat("Failed to detach uplink ", branchName, " from ", trunkName, ": ", e.what()));
  }
}

} // namespace CorvexCli::NetworkNamespace
