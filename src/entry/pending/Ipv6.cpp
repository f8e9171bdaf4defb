//===- Ipv6.cpp - Interim IPv6 commands -----------------------------------===//
//
// Interim definitions of the commands of the Ipv6 family: IPv6 settings and
// addresses. Each command is a complete node of the tree, with its description,
// default output settings and result schema, but running it only reports that
// it is not available yet. src/ip/Ipv6.cpp replaces this file.
//
//===----------------------------------------------------------------------===//
#include "ip.h"

#include "entry/pending/Pending.h"

namespace CorvexCli::NetworkNamespace {

using Fabrik::CallSpec::OutputSpec;
using Fabrik::MetaObj::MetaBool;
using Fabrik::MetaObj::MetaInt;
using Fabrik::MetaObj::MetaList;
using Fabrik::MetaObj::MetaString;
using Fabrik::MetaObj::MetaStruct;

// network ip interface ipv6 get

CORVEX_DEFINE_NEW(IpInterfaceIpv6Get)

IpInterfaceIpv6Get::IpInterfaceIpv6Get() {
  SetDescription("Get IPv6 settings for Tarvik network interfaces. This does not include the IPv6 "
                 "addresses which can be found in the \"address list\" command.");
  SetDefaultOutputFormatter("table");
  SetDefaultOutputParameter("fields:IPv6Interface",
                            "Name,IPv6 Enabled,DHCPv6 Enabled,Router Adv Enabled,DHCP DNS,Gateway");
}

CORVEX_PENDING_OPERATIONS(IpInterfaceIpv6Get)

std::shared_ptr<MetaStruct> IpInterfaceIpv6Get::GetOutputStructure() {
  auto structure = MetaStruct::New("IPv6Interface");
  structure->SetField("Name", MetaString::New());
  structure->SetField("IPv6 Enabled", MetaBool::New());
  structure->SetField("DHCPv6 Enabled", MetaBool::New());
  structure->SetField("Router Adv Enabled", MetaBool::New());
  structure->SetField("DHCP DNS", MetaBool::New());
  structure->SetField("Gateway", MetaString::New());
  return structure;
}

std::shared_ptr<OutputSpec> IpInterfaceIpv6Get::GetOutputSpecInternal() {
  auto spec = OutputSpec::New();
  spec->SetRootObject(MetaList::New(Fabrik::MetaObj::Struct, GetOutputStructure()));
  return spec;
}

// network ip interface ipv6 set

CORVEX_DEFINE_NEW(IpInterfaceIpv6Set)

IpInterfaceIpv6Set::IpInterfaceIpv6Set() {
  SetDescription("Configure IPv6 settings for a given Tarvik network interface.");
}

CORVEX_PENDING_OPERATIONS(IpInterfaceIpv6Set)

std::shared_ptr<OutputSpec> IpInterfaceIpv6Set::GetOutputSpecInternal() {
  auto spec = OutputSpec::New();
  spec->SetRootObject(MetaBool::New());
  return spec;
}

// network ip interface ipv6 address list

CORVEX_DEFINE_NEW(IpInterfaceIpv6AddressList)

IpInterfaceIpv6AddressList::IpInterfaceIpv6AddressList() {
  SetDescription(
      "This command will list all of the IPv6 addresses currently assigned to the system");
  SetDefaultOutputFormatter("table");
  SetDefaultOutputParameter("fields:IPv6Interface", "Interface,Address,Netmask,Type,Status");
}

CORVEX_PENDING_OPERATIONS(IpInterfaceIpv6AddressList)

std::shared_ptr<MetaStruct> IpInterfaceIpv6AddressList::GetOutputStructure() {
  auto structure = MetaStruct::New("IPv6Interface");
  structure->SetField("Interface", MetaString::New());
  structure->SetField("Address", MetaString::New());
  structure->SetField("Netmask", MetaInt::New());
  structure->SetField("Type", MetaString::New());
  structure->SetField("Status", MetaString::New());
  return structure;
}

std::shared_ptr<OutputSpec> IpInterfaceIpv6AddressList::GetOutputSpecInternal() {
  auto spec = OutputSpec::New();
  spec->SetRootObject(MetaList::New(Fabrik::MetaObj::Struct, GetOutputStructure()));
  return spec;
}

// network ip interface ipv6 address add

CORVEX_DEFINE_NEW(IpInterfaceIpv6AddressAdd)

IpInterfaceIpv6AddressAdd::IpInterfaceIpv6AddressAdd() {
  SetDescription("Add a static IPv6 address to a given Tarvik network interface.");
}

CORVEX_PENDING_OPERATIONS(IpInterfaceIpv6AddressAdd)

std::shared_ptr<OutputSpec> IpInterfaceIpv6AddressAdd::GetOutputSpecInternal() {
  auto spec = OutputSpec::New();
  spec->SetRootObject(MetaBool::New());
  return spec;
}

// network ip interface ipv6 address remove

CORVEX_DEFINE_NEW(IpInterfaceIpv6AddressRemove)

IpInterfaceIpv6AddressRemove::IpInterfaceIpv6AddressRemove() {
  SetDescription("Remove an IPv6 address from a given Tarvik network interface.");
}

CORVEX_PENDING_OPERATIONS(IpInterfaceIpv6AddressRemove)

std::shared_ptr<OutputSpec> IpInterfaceIpv6AddressRemove::GetOutputSpecInternal() {
  auto spec = OutputSpec::New();
  spec->SetRootObject(MetaBool::New());
  return spec;
}

} // namespace CorvexCli::NetworkNamespace
