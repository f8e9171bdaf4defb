//===- Route.cpp - Interim route commands ---------------------------------===//
//
// Interim definitions of the commands of the Route family: Routes. Each command
// is a complete node of the tree, with its description, default output settings
// and result schema, but running it only reports that it is not available yet.
// src/ip/Route.cpp replaces this file.
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

// network ip route ipv4 add

CORVEX_DEFINE_NEW(IpRouteIpv4Add)

IpRouteIpv4Add::IpRouteIpv4Add() {
  SetDescription("Add IPv4 route to the Tarvik.");
}

CORVEX_PENDING_OPERATIONS(IpRouteIpv4Add)

std::shared_ptr<OutputSpec> IpRouteIpv4Add::GetOutputSpecInternal() {
  auto spec = OutputSpec::New();
  spec->SetRootObject(MetaBool::New());
  return spec;
}

// network ip route ipv4 remove

CORVEX_DEFINE_NEW(IpRouteIpv4Remove)

IpRouteIpv4Remove::IpRouteIpv4Remove() {
  SetDescription("Remove IPv4 route");
}

CORVEX_PENDING_OPERATIONS(IpRouteIpv4Remove)

std::shared_ptr<OutputSpec> IpRouteIpv4Remove::GetOutputSpecInternal() {
  auto spec = OutputSpec::New();
  spec->SetRootObject(MetaBool::New());
  return spec;
}

// network ip route ipv4 list

CORVEX_DEFINE_NEW(IpRouteIpv4List)

IpRouteIpv4List::IpRouteIpv4List() {
  SetDescription("List configured IPv4 routes");
  SetDefaultOutputFormatter("table");
  SetDefaultOutputParameter("fields:Ipv4Route", "Network,Netmask,Gateway,Interface,Source");
}

CORVEX_PENDING_OPERATIONS(IpRouteIpv4List)

std::shared_ptr<MetaStruct> IpRouteIpv4List::GetOutputStructure() {
  auto structure = MetaStruct::New("Ipv4Route");
  structure->SetField("Network", MetaString::New());
  structure->SetField("Netmask", MetaString::New());
  structure->SetField("Gateway", MetaString::New());
  structure->SetField("Interface", MetaString::New());
  structure->SetField("Source", MetaString::New());
  return structure;
}

std::shared_ptr<OutputSpec> IpRouteIpv4List::GetOutputSpecInternal() {
  auto spec = OutputSpec::New();
  spec->SetRootObject(MetaList::New(Fabrik::MetaObj::Struct, GetOutputStructure()));
  return spec;
}

// network ip route ipv6 add

CORVEX_DEFINE_NEW(IpRouteIpv6Add)

IpRouteIpv6Add::IpRouteIpv6Add() {
  SetDescription("Add IPv6 route to the Tarvik.");
}

CORVEX_PENDING_OPERATIONS(IpRouteIpv6Add)

std::shared_ptr<OutputSpec> IpRouteIpv6Add::GetOutputSpecInternal() {
  auto spec = OutputSpec::New();
  spec->SetRootObject(MetaBool::New());
  return spec;
}

// network ip route ipv6 remove

CORVEX_DEFINE_NEW(IpRouteIpv6Remove)

IpRouteIpv6Remove::IpRouteIpv6Remove() {
  SetDescription("Remove IPv6 route from the Tarvik");
}

CORVEX_PENDING_OPERATIONS(IpRouteIpv6Remove)

std::shared_ptr<OutputSpec> IpRouteIpv6Remove::GetOutputSpecInternal() {
  auto spec = OutputSpec::New();
  spec->SetRootObject(MetaBool::New());
  return spec;
}

// network ip route ipv6 list

CORVEX_DEFINE_NEW(IpRouteIpv6List)

IpRouteIpv6List::IpRouteIpv6List() {
  SetDescription("List configured IPv6 routes");
  SetDefaultOutputFormatter("table");
  SetDefaultOutputParameter("fields:Ipv6Route", "Network,Netmask,Gateway,Interface");
}

CORVEX_PENDING_OPERATIONS(IpRouteIpv6List)

std::shared_ptr<MetaStruct> IpRouteIpv6List::GetOutputStructure() {
  auto structure = MetaStruct::New("Ipv6Route");
  structure->SetField("Network", MetaString::New());
  structure->SetField("Netmask", MetaString::New());
  structure->SetField("Gateway", MetaString::New());
  structure->SetField("Interface", MetaString::New());
  return structure;
}

std::shared_ptr<OutputSpec> IpRouteIpv6List::GetOutputSpecInternal() {
  auto spec = OutputSpec::New();
  spec->SetRootObject(MetaList::New(Fabrik::MetaObj::Struct, GetOutputStructure()));
  return spec;
}

} // namespace CorvexCli::NetworkNamespace
