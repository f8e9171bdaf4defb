//===- Tag.cpp - Tags of kernel interfaces ---------------------------------===//
//
// network ip interface tag add|remove|get. Three tags belong to services that
// may run on a netstack of their own; add keeps such a tag and its netstack
// consistent, and remove leaves the interfaces of pre-defined netstacks alone.
//
//===----------------------------------------------------------------------===//
#include "ip.h"
#include "ip/InterfaceCommon.h"

#include "HostCtl/Host.h"
#include "HostCtl/Lib.h"
#include "HostCtl/Network/NetworkInfo.h"
#include "TvkCtl/Network/TvkNicImpl.h"

#include <algorithm>

namespace CorvexCli::NetworkNamespace {

using namespace Fabrik;
using HostCtl::Lib::HostCtlException;
using HostCtl::Network::TvkNicTagType;

namespace {

const std::string kInterfaceTag = "InterfaceTag";
const std::string kTags = "Tags";
const std::string kInterfaceName = "interface-name";
const std::string kTagName = "tagname";
const std::string kDefaultNetstack = "defaultTcpipStack";
const std::string kNoTvknic = "Unable to find tvknic with name ";
const std::string kErrorWas = ". Error was : ";

/// The state of a netstack instance created in the kernel.
constexpr uint32_t kEnabledState = 4660;

/// A service tag and the netstack of its service.
struct ServiceTag {
  TvkNicTagType tag;    ///< The tag.
  const char* netstack; ///< Its dedicated netstack key.
};

const ServiceTag kServiceTags[] = {
    {HostCtl::Network::TvkNicTagDriftway, "driftway"},
    {HostCtl::Network::TvkNicTagTwinRun, "twinRun"},
    {HostCtl::Network::TvkNicTagAmbrel, "AmbrelProvisioning"},
};

/// The netstack a tag belongs to: its service's, else the default one.
std::string NetstackOfTag(TvkNicTagType tag) {
  for (const ServiceTag& service : kServiceTags)
    if (service.tag == tag)
      return service.netstack;
  return kDefaultNetstack;
}

/// Whether \p tag may be set on an interface of \p netstack: an interface of a
/// service netstack takes only that service's tag.
bool TagFitsNetstack(TvkNicTagType tag, const std::string& netstack) {
  for (const ServiceTag& service : kServiceTags)
    if (netstack == service.netstack)
      return tag == service.tag;
  return true;
}

/// The supported tags, joined with ", ".
std::string SupportedTags() {
  std::string list;
  for (int type = 1; type <= 12; ++type) {
    const char* name = TvkCtl::Network::TvkNicTagIdToName(static_cast<TvkNicTagType>(type));
    if (!name)
      continue;
    if (!list.empty())
      list += ", ";
    list += name;
  }
  return list;
}

/// Translates the tag name; adds the two errors and returns TvkNicTagInvalid
/// for a name that is no tag.
TvkNicTagType TranslateTag(const std::string& name, CallSpec::Output& output) {
  TvkNicTagType tag = TvkCtl::Network::TvkNicTagNameToId(name);
  if (tag == HostCtl::Network::TvkNicTagInvalid) {
    output.AddErrorMessage("Invalid tag name " + name);
    output.AddErrorMessage("Supported tags are: " + SupportedTags());
  }
  return tag;
}

std::shared_ptr<CallSpec::InputSpec> TagChangeSpec(const char* interfaceDescription) {
  return MakeInputSpec(
      {{"interface-name", "i", CallSpec::String, true, interfaceDescription},
       {"tagname", "t", CallSpec::String, true, "Tag name to assign to the interface"}});
}

} // namespace

// --- network ip interface tag add ------------------------------------------------

CORVEX_DEFINE_NEW(IpInterfaceTagAdd)

IpInterfaceTagAdd::IpInterfaceTagAdd() {
  SetDescription("Adds a tag on a given Tarvik network interface. Supported tags are: " +
                 SupportedTags());
}

IpInterfaceTagAdd::~IpInterfaceTagAdd() = default;

std::shared_ptr<CallSpec::InputSpec> IpInterfaceTagAdd::GetInputSpecInternal() {
  return TagChangeSpec("The name of the Tarvik network interface on which tags should be set. "
                       "This name must be an interface listed in the interface list command.");
}

std::shared_ptr<CallSpec::OutputSpec> IpInterfaceTagAdd::GetOutputSpecInternal() {
  return BoolResultSpec();
}

void IpInterfaceTagAdd::ExecuteInternal(const std::shared_ptr<CallSpec::Input>& input,
                                        const std::shared_ptr<CallSpec::Output>& output) {
  const std::string& name = input->GetParameter(kInterfaceName);
  const std::string& tagName = input->GetParameter(kTagName);
  try {
    TvkNicTagType tag = TranslateTag(tagName, *output);
    if (tag == HostCtl::Network::TvkNicTagInvalid)
      return;
    std::string tagNetstack = NetstackOfTag(tag);
    TvkCtl::Network::TvKernelNicInfoImpl service;
    if (tagNetstack != kDefaultNetstack) {
      auto info = HostCtl::Network::NetworkFactory::GetNetworkInfo();
      if (info->GetNetstackInstanceState(tagNetstack) == kEnabledState) {
        std::vector<std::string> names;
        service.GetTvkernelNicNamesByInstanceKey(names, tagNetstack, 0);
        if (!names.empty()) {
          output->AddErrorMessage("Failed to add " + tagName +
                                  " tag when dedicated stack is instantiated");
          return;
        }
      }
    }
    auto nic = service.GetTvKernelNicByInterface(name, false, 0);
    if (!nic) {
      output->AddErrorMessage(kNoTvknic + name);
      return;
    }
    if (!TagFitsNetstack(tag, nic->GetNetstackInstanceName())) {
      output->AddErrorMessage("netstack mismatch for tag" + tagName);
      return;
    }
    nic->AddTag(tag, false);
    output->SetRootObject(MetaObj::MetaBool::New(true));
  } catch (const HostCtlException& e) {
    output->AddErrorMessage("Error setting tag " + tagName + " on interface " + name + kErrorWas +
                            e.what());
  }
}

// --- network ip interface tag remove ---------------------------------------------

CORVEX_DEFINE_NEW(IpInterfaceTagRemove)

IpInterfaceTagRemove::IpInterfaceTagRemove() {
  SetDescription("Removes a tag on a given Tarvik network interface.");
}

IpInterfaceTagRemove::~IpInterfaceTagRemove() = default;

std::shared_ptr<CallSpec::InputSpec> IpInterfaceTagRemove::GetInputSpecInternal() {
  return TagChangeSpec(
      "The name of the Tarvik network interface from which tags should be removed. This name "
      "must be an interface listed  in the interface list command.");
}

std::shared_ptr<CallSpec::OutputSpec> IpInterfaceTagRemove::GetOutputSpecInternal() {
  return BoolResultSpec();
}

void IpInterfaceTagRemove::ExecuteInternal(const std::shared_ptr<CallSpec::Input>& input,
                                           const std::shared_ptr<CallSpec::Output>& output) {
  const std::string& name = input->GetParameter(kInterfaceName);
  const std::string& tagName = input->GetParameter(kTagName);
  try {
    TvkNicTagType tag = TranslateTag(tagName, *output);
    if (tag == HostCtl::Network::TvkNicTagInvalid)
      return;
    TvkCtl::Network::TvKernelNicInfoImpl service;
    auto nic = service.GetTvKernelNicByInterface(name, false, 0);
    if (!nic) {
      output->AddErrorMessage(kNoTvknic + name);
      return;
    }
    auto host = HostCtl::HostFactory::GetHost();
    std::vector<std::string> predefined = host->GetNetworkInfo()->GetPredefinedNetstackInstances();
    if (std::find(predefined.begin(), predefined.end(), nic->GetNetstackInstanceName()) !=
        predefined.end()) {
      output->AddErrorMessage("Can not remove tag from pre-defined netstack.");
      return;
    }
    nic->RemoveTag(tag);
    output->SetRootObject(MetaObj::MetaBool::New(true));
  } catch (const HostCtlException& e) {
    output->AddErrorMessage("Error removing tag " + tagName + " from interface " + name +
                            kErrorWas + e.what());
  }
}

// --- network ip interface tag get ------------------------------------------------

CORVEX_DEFINE_NEW(IpInterfaceTagGet)

IpInterfaceTagGet::IpInterfaceTagGet() {
  SetDescription("Gets the tags set on the given Tarvik network interface.");
  SetDefaultOutputFormatter("simple");
  SetDefaultOutputParameter("fields:IntefaceTag", kTags);
  SetDefaultOutputParameter("header:" + kInterfaceTag, "<NONE>");
}

IpInterfaceTagGet::~IpInterfaceTagGet() = default;

std::shared_ptr<MetaObj::MetaStruct> IpInterfaceTagGet::GetOutputStructure() {
  auto structure = MetaObj::MetaStruct::New(kInterfaceTag);
  structure->SetField(kTags, MetaObj::MetaList::New(MetaObj::String));
  return structure;
}

std::shared_ptr<CallSpec::InputSpec> IpInterfaceTagGet::GetInputSpecInternal() {
  return MakeInputSpec({{"interface-name", "i", CallSpec::String, true,
                         "Name of tvknic whose tags are to be read"}});
}

std::shared_ptr<CallSpec::OutputSpec> IpInterfaceTagGet::GetOutputSpecInternal() {
  return ResultSpec(GetOutputStructure());
}

void IpInterfaceTagGet::ExecuteInternal(const std::shared_ptr<CallSpec::Input>& input,
                                        const std::shared_ptr<CallSpec::Output>& output) {
  const std::string& name = input->GetParameter(kInterfaceName);
  try {
    TvkCtl::Network::TvKernelNicInfoImpl service;
    std::unique_ptr<HostCtl::Network::TvkNic> found;
    for (auto& nic : service.GetTvKernelNics(0)) {
      if (nic && nic->GetInterfaceName() == name) {
        found = std::move(nic);
        break;
      }
    }
    if (!found) {
      output->AddErrorMessage("Unable to find an interface with name " + name);
      return;
    }
    std::vector<TvkNicTagType> tags;
    found->GetTags(tags);
    std::vector<std::string> names;
    for (TvkNicTagType tag : tags) {
      const char* tagName = TvkCtl::Network::TvkNicTagIdToName(tag);
      names.emplace_back(tagName ? tagName : "");
    }
    auto result = GetOutputStructure();
    result->SetField(kTags, names);
    output->SetRootObject(result);
  } catch (const HostCtlException& e) {
    output->AddErrorMessage("Error getting tags on interface " + name + kErrorWas + e.what());
  }
}

} // namespace CorvexCli::NetworkNamespace
