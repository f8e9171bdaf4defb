//===- Ipv4.cpp - Interim IPv4 settings commands --------------------------===//
//
// Interim definitions of the commands of the Ipv4 family: IPv4 settings. Each
// command is a complete node of the tree, with its description, default output
// settings and result schema, but running it only reports that it is not
// available yet. src/ip/Ipv4.cpp replaces this file.
//
//===----------------------------------------------------------------------===//
#include "ip.h"

#include "entry/pending/Pending.h"

namespace CorvexCli::NetworkNamespace {

using Fabrik::CallSpec::OutputSpec;
using Fabrik::MetaObj::MetaBool;
using Fabrik::MetaObj::MetaList;
using Fabrik::MetaObj::MetaString;
using Fabrik::MetaObj::MetaStruct;

// network ip interface ipv4 get and network ip interface ipv4 address list

CORVEX_DEFINE_NEW(IpInterfaceIpv4Get)

IpInterfaceIpv4Get::IpInterfaceIpv4Get() {
  SetDescription("List the IPv4 addresses assigned to Tarvik network interfaces.");
  SetDefaultOutputFormatter("table");
  SetDefaultOutputParameter(
      "fields:IPv4Interface",
      "Name,IPv4 Address,IPv4 Netmask,IPv4 Broadcast,Address Type,Gateway,DHCP DNS");
}

CORVEX_PENDING_OPERATIONS(IpInterfaceIpv4Get)

std::shared_ptr<MetaStruct> IpInterfaceIpv4Get::GetOutputStructure() {
  auto structure = MetaStruct::New("IPv4Interface");
  structure->SetField("Name", MetaString::New());
  structure->SetField("IPv4 Address", MetaString::New());
  structure->SetField("IPv4 Netmask", MetaString::New());
  structure->SetField("IPv4 Broadcast", MetaString::New());
  structure->SetField("Address Type", MetaString::New());
  structure->SetField("Gateway", MetaString::New());
  structure->SetField("DHCP DNS", MetaBool::New());
  return structure;
}

std::shared_ptr<OutputSpec> IpInterfaceIpv4Get::GetOutputSpecInternal() {
  auto spec = OutputSpec::New();
  spec->SetRootObject(MetaList::New(Fabrik::MetaObj::Struct, GetOutputStructure()));
  return spec;
}

// network ip interface ipv4 set

CORVEX_DEFINE_NEW(IpInterfaceIpv4Set)

IpInterfaceIpv4Set::IpInterfaceIpv4Set() {
  SetDescription("Configure IPv4 setting for a given Tarvik network interface.");
}

CORVEX_PENDING_OPERATIONS(IpInterfaceIpv4Set)

std::shared_ptr<OutputSpec> IpInterfaceIpv4Set::GetOutputSpecInternal() {
  auto spec = OutputSpec::New();
  spec->SetRootObject(MetaBool::New());
  return spec;
}

} // namespace CorvexCli::NetworkNamespace
