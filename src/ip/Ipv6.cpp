//===- Ipv6.cpp - IPv6 settings and addresses of kernel interfaces --------===//
//
// network ip interface ipv6 get|set and network ip interface ipv6 address
// list|add|remove. Each reads the interface's IP configuration, changes it
// and applies it as a whole. SelectTvkNics, the choice of interfaces shared
// with the IPv4 listing, is defined here too.
//
//===----------------------------------------------------------------------===//
#include "ip.h"
#include "ip/InterfaceCommon.h"

#include "HostCtl/Lib.h"
#include "HostCtl/Network/Address.h"

namespace CorvexCli::NetworkNamespace {

using namespace Fabrik;
using HostCtl::Lib::HostCtlException;
using HostCtl::Network::IpConfig;
using HostCtl::Network::Ipv6Address;
using HostCtl::Network::Ipv6Network;
using HostCtl::Network::TvkNic;

namespace {

const std::string kIpv6Interface = "IPv6Interface";
const std::string kName = "Name";
const std::string kIpv6Enabled = "IPv6 Enabled";
const std::string kDhcpv6Enabled = "DHCPv6 Enabled";
const std::string kRouterAdvEnabled = "Router Adv Enabled";
const std::string kDhcpDns = "DHCP DNS";
const std::string kGateway = "Gateway";
const std::string kInterface = "Interface";
const std::string kAddress = "Address";
const std::string kNetmask = "Netmask";
const std::string kType = "Type";
const std::string kStatus = "Status";

const std::string kInterfaceName = "interface-name";
const std::string kNetstackParam = "netstack";
const std::string kIpv6Param = "ipv6";

const std::string kErrorWas = ". Error was : ";
const std::string kBadIpv6Format = "Invalid format for IPv6 address. Address must be in the format "
                                   "<ipv6-address>/<prefix-length>   Example: 1:2:3:4::/64";

/// Names of the address types and statuses of the address listing.
const char* AddressTypeName(int type) {
  switch (type) {
  case 9:
    return "DHCP";
  case 7:
    return "AUTOCONF";
  default:
    return "STATIC";
  }
}

const char* AddressStatusName(int status) {
  switch (status) {
  case 5:
    return "DEPRECATED";
  case 3:
    return "DUPLICATED";
  case 2:
    return "TENTATIVE";
  default:
    return "PREFERRED";
  }
}

/// Whether DHCPv6 or router advertisement is on in \p config.
bool LearnsIpv6(const IpConfig& config) {
  return config.GetUseIpv6Dhcp() || config.GetUseIpv6RouterAdvertised();
}

/// The shared steps of address add and remove: validate the text, look the
/// interface up, change the address list and apply it.
void ChangeIpv6Address(const CallSpec::Input& input, CallSpec::Output& output, bool add) {
  const std::string& name = input.GetParameter(kInterfaceName);
  try {
    const std::string& text = input.GetParameter(kIpv6Param);
    if (!Ipv6Network::IsValidAddressAndNetmask(text)) {
      output.AddErrorMessage(kBadIpv6Format);
      return;
    }
    auto nic = KernelNicService()->GetTvKernelNicByInterface(name, false, 0);
    if (!nic) {
      output.AddErrorMessage(kNoTarvikInterface + name);
      return;
    }
    IpConfig config = nic->GetIpConfig();
    Ipv6Network network(text);
    if (add)
      config.AddIpv6Network(network);
    else
      config.RemoveIpv6Network(network);
    nic->SetIpConfig(config);
    output.SetRootObject(MetaObj::MetaBool::New(true));
  } catch (const HostCtlException& e) {
    output.AddErrorMessage((add ? "Error adding IPv6 address for the interface "
                                : "Error removing IPv6 address for the interface ") +
                           name + kErrorWas + e.what());
  }
}

std::shared_ptr<CallSpec::InputSpec> AddressChangeSpec(const char* interfaceDescription,
                                                       const char* addressDescription) {
  return MakeInputSpec({{"interface-name", "i", CallSpec::String, true, interfaceDescription},
                        {"ipv6", "I", CallSpec::String, true, addressDescription}});
}

} // namespace

bool SelectTvkNics(HostCtl::Network::TvKernelNicInfo& service, const CallSpec::Input& input,
                   CallSpec::Output& output, std::vector<std::unique_ptr<TvkNic>>& nics) {
  std::string name = input.HasParameter(kInterfaceName) ? input.GetParameter(kInterfaceName) : "";
  std::string netstack =
      input.HasParameter(kNetstackParam) ? input.GetParameter(kNetstackParam) : "";
  HostCtl::Network::PortsetGetType selector;
  if (!ReadListType(input, output, selector))
    return false;
  nics.clear();
  if (!name.empty()) {
    auto nic = service.GetTvKernelNicByInterface(name, false, selector);
    if (!nic) {
      output.AddErrorMessage(kNoTarvikInterface + name);
      return false;
    }
    nics.push_back(std::move(nic));
  } else if (netstack.empty()) {
    nics = service.GetTvKernelNics(selector);
  } else {
    nics = service.GetTvKernelNicsByInstanceKey(netstack, selector);
  }
  return true;
}

// --- network ip interface ipv6 get -----------------------------------------------

CORVEX_DEFINE_NEW(IpInterfaceIpv6Get)

IpInterfaceIpv6Get::IpInterfaceIpv6Get() {
  SetDescription("Get IPv6 settings for Tarvik network interfaces. This does not include the IPv6 "
                 "addresses which can be found in the \"address list\" command.");
  SetDefaultOutputFormatter("table");
  SetDefaultOutputParameter("fields:" + kIpv6Interface,
                            kName + "," + kIpv6Enabled + "," + kDhcpv6Enabled + "," +
                                kRouterAdvEnabled + "," + kDhcpDns + "," + kGateway);
}

IpInterfaceIpv6Get::~IpInterfaceIpv6Get() = default;

std::shared_ptr<MetaObj::MetaStruct> IpInterfaceIpv6Get::GetOutputStructure() {
  return MakeStructure(kIpv6Interface, {{kName, FieldKind::String},
                                        {kIpv6Enabled, FieldKind::Boolean},
                                        {kDhcpv6Enabled, FieldKind::Boolean},
                                        {kRouterAdvEnabled, FieldKind::Boolean},
                                        {kDhcpDns, FieldKind::Boolean},
                                        {kGateway, FieldKind::String}});
}

std::shared_ptr<CallSpec::InputSpec> IpInterfaceIpv6Get::GetInputSpecInternal() {
  return MakeInputSpec(
      {{"interface-name", "n", CallSpec::String, false,
        "The name of the Tarvik network interface to limit the output of this command to."},
       {"netstack", "N", CallSpec::String, false,
        "The network stack instance; if unspecified, consider all netstack instances"},
       {"type", "t", CallSpec::String, false,
        "List IPv6 information of Tarvik network interface with given type(e.g. system)."}});
}

std::shared_ptr<CallSpec::OutputSpec> IpInterfaceIpv6Get::GetOutputSpecInternal() {
  return ListResultSpec(GetOutputStructure());
}

void IpInterfaceIpv6Get::ExecuteInternal(const std::shared_ptr<CallSpec::Input>& input,
                                         const std::shared_ptr<CallSpec::Output>& output) {
  try {
    std::unique_ptr<HostCtl::Network::TvKernelNicInfo> service = KernelNicService();
    ListTvkNics(
        *service, *input, *output, [this] { return GetOutputStructure(); },
        [](MetaObj::MetaStruct& row, TvkNic& nic) {
          IpConfig config = nic.GetIpConfig();
          row.SetField(kIpv6Enabled, config.GetUseIpv6());
          row.SetField(kDhcpv6Enabled, config.GetUseIpv6Dhcp());
          row.SetField(kRouterAdvEnabled, config.GetUseIpv6RouterAdvertised());
          row.SetField(kGateway, config.GetIpv6Gateway().GetStringAddress());
          row.SetField(kDhcpDns,
                       LearnsIpv6(config) ? nic.GetConfiguredIpConfig().GetIpv6DhcpDns() : false);
        });
  } catch (const HostCtlException& e) {
    output->AddErrorMessage(std::string("Error getting IPv6 configuration. ") + kErrorWas +
                            e.what());
  }
}

// --- network ip interface ipv6 set -----------------------------------------------

CORVEX_DEFINE_NEW(IpInterfaceIpv6Set)

IpInterfaceIpv6Set::IpInterfaceIpv6Set() {
  SetDescription("Configure IPv6 settings for a given Tarvik network interface.");
}

IpInterfaceIpv6Set::~IpInterfaceIpv6Set() = default;

std::shared_ptr<CallSpec::InputSpec> IpInterfaceIpv6Set::GetInputSpecInternal() {
  return MakeInputSpec(
      {{"interface-name", "i", CallSpec::String, true,
        "The name of the Tarvik network interface to set IPv6 settings for. This name must be an "
        "interface listed in the interface list command."},
       {"enable-ipv6", "e", CallSpec::Boolean, false,
        "Setting this value to true enables IPv6 on thisinterface while setting it to false "
        "disables IPv6 on this interface."},
       {"enable-dhcpv6", "d", CallSpec::Boolean, false,
        "Setting this value to true will enable DHCPv6 on this interface and attempt to aquire an "
        "IPv6 address from the network "},
       {"enable-router-adv", "r", CallSpec::Boolean, false,
        "Setting this value to true will enable IPv6 Router Advertised IPv6 addresses to be added "
        "to this interface from any routers broadcasting on the local network."},
       {"peer-dns", "P", CallSpec::Boolean, false,
        "A boolean value to indicate if the system should use the DNS settings published via "
        "DHCPv6 for this interface."},
       {"gateway", "g", CallSpec::String, false,
        "A default gateway for this interface. The value must be a valid IPv6 address."}});
}

std::shared_ptr<CallSpec::OutputSpec> IpInterfaceIpv6Set::GetOutputSpecInternal() {
  return BoolResultSpec();
}

void IpInterfaceIpv6Set::ExecuteInternal(const std::shared_ptr<CallSpec::Input>& input,
                                         const std::shared_ptr<CallSpec::Output>& output) {
  const std::string& name = input->GetParameter(kInterfaceName);
  try {
    auto nic = KernelNicService()->GetTvKernelNicByInterface(name, false, 0);
    if (!nic) {
      output->AddErrorMessage(kNoTarvikInterface + name);
      return;
    }
    IpConfig config = nic->GetIpConfig();
    config.SetDhcpDns(nic->GetConfiguredIpConfig().GetDhcpDns());
    if (input->HasParameter("enable-dhcpv6"))
      config.SetUseIpv6Dhcp(input->GetParameterBool("enable-dhcpv6"));
    if (input->HasParameter("enable-router-adv"))
      config.SetUseIpv6RouterAdvertised(input->GetParameterBool("enable-router-adv"));
    if (input->HasParameter("peer-dns")) {
      bool peerDns = input->GetParameterBool("peer-dns");
      if (LearnsIpv6(config)) {
        config.SetIpv6DhcpDns(peerDns);
      } else if (peerDns) {
        output->AddErrorMessage("-P|--peer-dns can be specified only if DHCPv6 or RA is enabled");
        return;
      }
    }
    if (input->HasParameter("enable-ipv6"))
      config.SetUseIpv6(input->GetParameterBool("enable-ipv6"));
    if (!input->HasParameter("gateway")) {
      config.SetIpv6Gateway(Ipv6Address());
    } else {
      if (config.GetUseIpv6RouterAdvertised()) {
        output->AddErrorMessage(
            "Cannot set an interface gateway when Router Advertisement is enabled.");
        return;
      }
      const std::string& gateway = input->GetParameter("gateway");
      if (!Ipv6Address::IsValidAddress(gateway)) {
        output->AddErrorMessage(
            "Invalid --gateway option provided.This address is not a valid IPv6 address");
        return;
      }
      config.SetIpv6Gateway(Ipv6Address(gateway));
    }
    nic->SetIpConfig(config);
    output->SetRootObject(MetaObj::MetaBool::New(true));
  } catch (const HostCtlException& e) {
    output->AddErrorMessage("Error changing IPv6 configuration for the interface " + name +
                            kErrorWas + e.what());
  }
}

// --- network ip interface ipv6 address list --------------------------------------

CORVEX_DEFINE_NEW(IpInterfaceIpv6AddressList)

IpInterfaceIpv6AddressList::IpInterfaceIpv6AddressList() {
  SetDescription(
      "This command will list all of the IPv6 addresses currently assigned to the system");
  SetDefaultOutputFormatter("table");
  SetDefaultOutputParameter("fields:" + kIpv6Interface, kInterface + "," + kAddress + "," +
                                                            kNetmask + "," + kType + "," + kStatus);
}

IpInterfaceIpv6AddressList::~IpInterfaceIpv6AddressList() = default;

std::shared_ptr<MetaObj::MetaStruct> IpInterfaceIpv6AddressList::GetOutputStructure() {
  return MakeStructure(kIpv6Interface, {{kInterface, FieldKind::String},
                                        {kAddress, FieldKind::String},
                                        {kNetmask, FieldKind::Integer},
                                        {kType, FieldKind::String},
                                        {kStatus, FieldKind::String}});
}

std::shared_ptr<CallSpec::InputSpec> IpInterfaceIpv6AddressList::GetInputSpecInternal() {
  return MakeInputSpec(
      {{"interface-name", "i", CallSpec::String, false,
        "The name of the Tarvik network interface to limit the output of this command to."},
       {"type", "t", CallSpec::String, false,
        "List IPv6 addresses of Tarvik network interface with given type(e.g. system)."}});
}

std::shared_ptr<CallSpec::OutputSpec> IpInterfaceIpv6AddressList::GetOutputSpecInternal() {
  return ListResultSpec(GetOutputStructure());
}

void IpInterfaceIpv6AddressList::ExecuteInternal(const std::shared_ptr<CallSpec::Input>& input,
                                                 const std::shared_ptr<CallSpec::Output>& output) {
  try {
    // This listing has no netstack parameter.
    HostCtl::Network::PortsetGetType selector;
    if (!ReadListType(*input, *output, selector, false))
      return;
    std::unique_ptr<HostCtl::Network::TvKernelNicInfo> service = KernelNicService();
    std::vector<std::unique_ptr<TvkNic>> nics;
    if (input->HasParameter(kInterfaceName)) {
      const std::string& name = input->GetParameter(kInterfaceName);
      auto nic = service->GetTvKernelNicByInterface(name, false, selector);
      if (!nic) {
        output->AddErrorMessage(kNoTarvikInterface + name);
        return;
      }
      nics.push_back(std::move(nic));
    } else {
      nics = service->GetTvKernelNics(selector);
    }
    auto list = MetaObj::MetaList::New(MetaObj::Struct, GetOutputStructure());
    for (const auto& nic : nics) {
      if (!nic)
        continue;
      std::string name = nic->GetInterfaceName();
      const IpConfig config = nic->GetIpConfig();
      for (const Ipv6Network& network : config.GetIpv6Network()) {
        auto row = GetOutputStructure();
        row->SetField(kInterface, name);
        row->SetField(kAddress, network.GetAddress().GetStringAddress());
        row->SetField(kNetmask, static_cast<long>(network.GetNetmask()));
        row->SetField(kType, AddressTypeName(network.GetIpv6AddressType()));
        row->SetField(kStatus, AddressStatusName(network.GetIpv6AddressStatus()));
        list->Add(row);
      }
    }
    output->SetRootObject(list);
  } catch (const HostCtlException& e) {
    output->AddErrorMessage(std::string("Unable to list IPv6 Addresses. Error was: ") + e.what());
  }
}

// --- network ip interface ipv6 address add ---------------------------------------

CORVEX_DEFINE_NEW(IpInterfaceIpv6AddressAdd)

IpInterfaceIpv6AddressAdd::IpInterfaceIpv6AddressAdd() {
  SetDescription("Add a static IPv6 address to a given Tarvik network interface.");
}

IpInterfaceIpv6AddressAdd::~IpInterfaceIpv6AddressAdd() = default;

std::shared_ptr<CallSpec::InputSpec> IpInterfaceIpv6AddressAdd::GetInputSpecInternal() {
  return AddressChangeSpec(
      "The name of the Tarvik network interface to add a static IPv6 address to. This name must "
      "be an interface listed in the interface list command.",
      "The IPv6 address to add to the given Tarvik network interface. This must be in X:X:X::/X "
      "format");
}

std::shared_ptr<CallSpec::OutputSpec> IpInterfaceIpv6AddressAdd::GetOutputSpecInternal() {
  return BoolResultSpec();
}

void IpInterfaceIpv6AddressAdd::ExecuteInternal(const std::shared_ptr<CallSpec::Input>& input,
                                                const std::shared_ptr<CallSpec::Output>& output) {
  ChangeIpv6Address(*input, *output, true);
}

// --- network ip interface ipv6 address remove ------------------------------------

CORVEX_DEFINE_NEW(IpInterfaceIpv6AddressRemove)

IpInterfaceIpv6AddressRemove::IpInterfaceIpv6AddressRemove() {
  SetDescription("Remove an IPv6 address from a given Tarvik network interface.");
}

IpInterfaceIpv6AddressRemove::~IpInterfaceIpv6AddressRemove() = default;

std::shared_ptr<CallSpec::InputSpec> IpInterfaceIpv6AddressRemove::GetInputSpecInternal() {
  return AddressChangeSpec(
      "The name of the Tarvik network interface to remove an IPv6 address from. This name must "
      "be an interface listed in the interface list command.",
      "The IPv6 address to remove from the given Tarvik network interface. This must be in "
      "X:X:X::/X format");
}

std::shared_ptr<CallSpec::OutputSpec> IpInterfaceIpv6AddressRemove::GetOutputSpecInternal() {
  return BoolResultSpec();
}

void IpInterfaceIpv6AddressRemove::ExecuteInternal(
    const std::shared_ptr<CallSpec::Input>& input,
    const std::shared_ptr<CallSpec::Output>& output) {
  ChangeIpv6Address(*input, *output, false);
}

} // namespace CorvexCli::NetworkNamespace
