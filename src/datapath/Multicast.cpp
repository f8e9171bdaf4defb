//===- Multicast.cpp - Multicast group memberships ------------------------===//
//
// network multicast group list: one row per multicast group membership of the
// host's (ordinary) kernel interfaces.
//
//===----------------------------------------------------------------------===//
#include "common/FieldTable.h"
#include "datapath.h"

#include "Fabrik/Call.h"
#include "Fabrik/MetaObj.h"
#include "HostCtl/Host.h"
#include "HostCtl/Lib.h"
#include "HostCtl/Network/NetworkInfo.h"

namespace CorvexCli::NetworkNamespace {

using namespace Fabrik;

namespace {

const std::string kNic = "Nic";
const std::string kInterface = "Interface";
const std::string kRefcount = "Refcount";
const std::string kGroup = "Group";
const std::string kLinkLayer = "Link Layer";

} // namespace

CORVEX_DEFINE_NEW(MulticastGroupList)

MulticastGroupList::MulticastGroupList() {
  SetDescription("List all the multicast group members.");
  SetDefaultOutputFormatter("table");
  SetDefaultOutputParameter("fields:" + kInterface,
                            kInterface + "," + kRefcount + "," + kGroup + "," + kLinkLayer);
}

MulticastGroupList::~MulticastGroupList() = default;

std::shared_ptr<MetaObj::MetaStruct> MulticastGroupList::GetOutputStructure() {
  auto structure = MetaObj::MetaStruct::New(kNic);
  structure->SetField(kInterface, MetaObj::MetaString::New());
  structure->SetField(kRefcount, MetaObj::MetaInt::New());
  structure->SetField(kGroup, MetaObj::MetaString::New());
  structure->SetField(kLinkLayer, MetaObj::MetaString::New());
  return structure;
}

std::shared_ptr<CallSpec::InputSpec> MulticastGroupList::GetInputSpecInternal() {
  return CallSpec::InputSpec::New();
}

std::shared_ptr<CallSpec::OutputSpec> MulticastGroupList::GetOutputSpecInternal() {
  return ListResultSpec(GetOutputStructure());
}

void MulticastGroupList::ExecuteInternal(const std::shared_ptr<CallSpec::Input>& /*input*/,
                                         const std::shared_ptr<CallSpec::Output>& output) {
  try {
    auto host = HostCtl::HostFactory::GetHost();
    std::unique_ptr<HostCtl::Network::TvKernelNicInfo> service;
    {
      auto info = host->GetNetworkInfo();
      service = info->GetTvKernelNicInfo();
    }
    auto list = MetaObj::MetaList::New(MetaObj::Struct, GetOutputStructure());
    for (const auto& nic : service->GetTvKernelNics(0)) {
      if (!nic)
        continue;
      for (const HostCtl::Network::MulticastGroup& group : nic->GetMulticastGroups()) {
        auto row = GetOutputStructure();
        row->SetField(kInterface, group.interfaceName);
        row->SetField(kRefcount, static_cast<long>(group.refCount));
        row->SetField(kGroup, group.groupAddress);
        row->SetField(kLinkLayer, group.linkLayer);
        list->Add(row);
      }
    }
    output->SetRootObject(list);
  } catch (const HostCtl::Lib::HostCtlException& e) {
    output->AddErrorMessage(e.what());
  }
}

} // namespace CorvexCli::NetworkNamespace
