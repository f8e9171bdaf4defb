//===- Ipv4.cpp - IPv4 settings of kernel interfaces ----------------------===//
//
// network ip interface ipv4 get (registered a second time as network ip
// interface ipv4 address list) and network ip interface ipv4 set, which
// switches an interface between a static address, DHCP and no address.
//
//===----------------------------------------------------------------------===//
#include "ip.h"
#include "ip/InterfaceCommon.h"

#include "HostCtl/Lib.h"
#include "HostCtl/Network/Address.h"
#include "TvkCtl/Network/RoutingInfoImpl.h"
#include "TvkCtl/Network/TvkNicImpl.h"

namespace CorvexCli::NetworkNamespace {

using namespace Fabrik;
using HostCtl::Lib::HostCtlException;
using HostCtl::Network::IpConfig;
using HostCtl::Network::Ipv4Address;
using HostCtl::Network::TvkNic;

namespace {

/// The values of --type of ipv4 set.
const EnumChoice kAddressTypeChoices[] = {
    {"static", "Set Static IPv4 information for this interface. Requires --ipv4 and --netmask "
               "options."},
    {"dhcp", "Use DHCP to aquire IPv4 setting for this interface."},
    {"none", "Remove IPv4 settings form this interface."},
};

const std::string kIpv4Interface = "IPv4Interface";
const std::string kName = "Name";
const std::string kIpv4Address = "IPv4 Address";
const std::string kIpv4Netmask = "IPv4 Netmask";
const std::string kIpv4Broadcast = "IPv4 Broadcast";
const std::string kAddressType = "Address Type";
const std::string kGateway = "Gateway";
const std::string kDhcpDns = "DHCP DNS";

const std::string kInterfaceName = "interface-name";
const std::string kDefaultNetstack = "defaultTcpipStack";
const std::string kAnyAddress = "0.0.0.0";
const std::string kNotValidIpv4 = " option provided. This address is not a valid IPv4 address";

} // namespace

// --- network ip interface ipv4 get -----------------------------------------------

CORVEX_DEFINE_NEW(IpInterfaceIpv4Get)

IpInterfaceIpv4Get::IpInterfaceIpv4Get() {
  SetDescription("List the IPv4 addresses assigned to Tarvik network interfaces.");
  SetDefaultOutputFormatter("table");
  SetDefaultOutputParameter("fields:" + kIpv4Interface,
                            kName + "," + kIpv4Address + "," + kIpv4Netmask + "," + kIpv4Broadcast +
                                "," + kAddressType + "," + kGateway + "," + kDhcpDns);
}

IpInterfaceIpv4Get::~IpInterfaceIpv4Get() = default;

std::shared_ptr<MetaObj::MetaStruct> IpInterfaceIpv4Get::GetOutputStructure() {
  return MakeStructure(kIpv4Interface, {{kName, FieldKind::String},
                                        {kIpv4Address, FieldKind::String},
                                        {kIpv4Netmask, FieldKind::String},
                                        {kIpv4Broadcast, FieldKind::String},
                                        {kAddressType, FieldKind::String},
                                        {kGateway, FieldKind::String},
                                        {kDhcpDns, FieldKind::Boolean}});
}

std::shared_ptr<CallSpec::InputSpec> IpInterfaceIpv4Get::GetInputSpecInternal() {
  return MakeInputSpec(
      {{"netstack", "N", CallSpec::String, false,
        "The network stack instance; if unspecified, consider all netstack instances"},
       {"interface-name", "i", CallSpec::String, false,
        "The name of the Tarvik network interface to limit the output of this command to."},
       {"type", "t", CallSpec::String, false,
        "List IPv4 information of Tarvik network interface with given type(e.g. system)."}});
}

std::shared_ptr<CallSpec::OutputSpec> IpInterfaceIpv4Get::GetOutputSpecInternal() {
  return ListResultSpec(GetOutputStructure());
}

void IpInterfaceIpv4Get::ExecuteInternal(const std::shared_ptr<CallSpec::Input>& input,
                                         const std::shared_ptr<CallSpec::Output>& output) {
  try {
    TvkCtl::Network::RoutingInfoImpl routing(kDefaultNetstack);
    TvkCtl::Network::TvKernelNicInfoImpl service;
    ListTvkNics(
        service, *input, *output, [this] { return GetOutputStructure(); },
        [&](MetaObj::MetaStruct& row, TvkNic& nic) {
          IpConfig config = nic.GetIpConfig();
          row.SetField(kIpv4Address, config.GetIpv4Address().GetStringAddress());
          row.SetField(kIpv4Netmask, config.GetIpv4Netmask().GetStringAddress());
          row.SetField(kIpv4Broadcast, config.GetIpv4Broadcast().GetStringAddress());
          Ipv4Address gateway = config.GetIpv4Gateway();
          bool dhcpDns = false;
          const char* type = "STATIC";
          if (config.GetUseDhcp()) {
            type = "DHCP";
            dhcpDns = nic.GetConfiguredIpConfig().GetDhcpDns();
          } else if (config.GetIpv4UseNone()) {
            type = "NONE";
          } else if (gateway == Ipv4Address(kAnyAddress)) {
            routing.SetNetstackInstanceKey(nic.GetNetstackInstanceName());
            routing.Refresh();
            gateway = routing.GetTvKernelDefaultGateway();
          }
          row.SetField(kAddressType, type);
          row.SetField(kGateway, gateway.GetStringAddress());
          row.SetField(kDhcpDns, dhcpDns);
        });
  } catch (const HostCtlException& e) {
    output->AddErrorMessage(std::string("Error getting IPv4 configuration. ") +
                            ". Error was : " + e.what());
  }
}

// --- network ip interface ipv4 set -----------------------------------------------

CORVEX_DEFINE_NEW(IpInterfaceIpv4Set)

IpInterfaceIpv4Set::IpInterfaceIpv4Set() {
  SetDescription("Configure IPv4 setting for a given Tarvik network interface.");
}

IpInterfaceIpv4Set::~IpInterfaceIpv4Set() = default;

std::shared_ptr<CallSpec::InputSpec> IpInterfaceIpv4Set::GetInputSpecInternal() {
  return MakeInputSpec(
      {{"interface-name", "i", CallSpec::String, true,
        "The name of the Tarvik network interface to set IPv4 settings for. This name must be an "
        "interface listed in the interface list command."},
       {"type", "t", CallSpec::String, false, "IPv4 Address type: %FULLENUM%",
        ParameterCheck::OneOf(kAddressTypeChoices)},
       {"ipv4", "I", CallSpec::String, false, "The static IPv4 address for this interface."},
       {"netmask", "N", CallSpec::String, false, "The static IPv4 netmask for this interface."},
       {"gateway", "g", CallSpec::String, false,
        "The default gateway for this interface. The value must be a valid IPv4 address. Gateway "
        "would be reset if not provided"},
       {"peer-dns", "P", CallSpec::Boolean, false,
        "A boolean value to indicate if the system should use the DNS settings published via "
        "DHCPv4 for this interface."}});
}

std::shared_ptr<CallSpec::OutputSpec> IpInterfaceIpv4Set::GetOutputSpecInternal() {
  return BoolResultSpec();
}

void IpInterfaceIpv4Set::ExecuteInternal(const std::shared_ptr<CallSpec::Input>& input,
                                         const std::shared_ptr<CallSpec::Output>& output) {
  const std::string& name = input->GetParameter(kInterfaceName);
  try {
    TvkCtl::Network::TvKernelNicInfoImpl service;
    auto nic = service.GetTvKernelNicByInterface(name, false, 0);
    if (!nic) {
      output->AddErrorMessage(kNoTarvikInterface + name);
      return;
    }
    IpConfig config = nic->GetIpConfig();
    config.SetIpv6DhcpDns(nic->GetConfiguredIpConfig().GetIpv6DhcpDns());
    bool hasIpv4 = input->HasParameter("ipv4");
    bool hasGateway = input->HasParameter("gateway");
    if (!input->HasParameter("type")) {
      if (hasIpv4 || hasGateway) {
        output->AddErrorMessage(
            "-I|--ipv4 or -g|--gateway can be specified only if type is specified");
        return;
      }
    } else {
      const std::string& type = input->GetParameter("type");
      if (type == "static") {
        std::string ipv4 = hasIpv4 ? input->GetParameter("ipv4") : "";
        std::string netmask = input->HasParameter("netmask") ? input->GetParameter("netmask") : "";
        std::string gateway = kAnyAddress;
        bool failed = false;
        if (ipv4.empty() || netmask.empty()) {
          output->AddErrorMessage("The --type=static requires the --ipv4 and --netmask options.");
          failed = true;
        }
        if (!Ipv4Address::IsValidAddress(ipv4)) {
          output->AddErrorMessage("Invalid --ipv4" + kNotValidIpv4);
          failed = true;
        }
        if (!Ipv4Address::IsValidAddress(netmask)) {
          output->AddErrorMessage("Invalid --netmask" + kNotValidIpv4);
          failed = true;
        }
        if (hasGateway) {
          gateway = input->GetParameter("gateway");
          if (!Ipv4Address::IsValidAddress(gateway)) {
            output->AddErrorMessage("Invalid --gateway" + kNotValidIpv4);
            return;
          }
        }
        if (failed)
          return;
        config.SetIpv4Address(Ipv4Address(ipv4));
        config.SetIpv4Netmask(Ipv4Address(netmask));
        config.SetIpv4Gateway(Ipv4Address(gateway));
      } else {
        if (hasIpv4 || hasGateway) {
          output->AddErrorMessage(
              "-I|--ipv4 or -g|--gateway can be specified only if type is static");
          return;
        }
        if (type == "dhcp")
          config.SetUseDhcp(true);
        else
          config.SetIpv4UseNone();
      }
    }
    if (input->HasParameter("peer-dns")) {
      bool peerDns = input->GetParameterBool("peer-dns");
      if (config.GetUseDhcp()) {
        config.SetDhcpDns(peerDns);
      } else if (peerDns) {
        output->AddErrorMessage("-P|--peer-dns can be specified only if DHCP is enabled");
        return;
      }
    }
    nic->SetIpConfig(config);
    output->SetRootObject(MetaObj::MetaBool::New(true));
  } catch (const HostCtlException& e) {
    output->AddErrorMessage("Error changing IPv4 configuration for the interface " + name +
                            ". Error was : " + e.what());
  }
}

} // namespace CorvexCli::NetworkNamespace
