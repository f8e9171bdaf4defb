//===- Dns.cpp - Interim DNS commands -------------------------------------===//
//
// Interim definitions of the commands of the Dns family: DNS servers and search
// domains. Each command is a complete node of the tree, with its description,
// default output settings and result schema, but running it only reports that
// it is not available yet. src/ip/Dns.cpp replaces this file.
//
//===----------------------------------------------------------------------===//
#include "ip.h"

#include "entry/pending/Pending.h"

namespace CorvexCli::NetworkNamespace {

using Fabrik::CallSpec::OutputSpec;
using Fabrik::MetaObj::MetaBool;
using Fabrik::MetaObj::MetaList;
using Fabrik::MetaObj::MetaStruct;

// network ip dns server list

CORVEX_DEFINE_NEW(IpDNSServerList)

IpDNSServerList::IpDNSServerList() {
  SetDescription("Print a list of the DNS server currently configured on the system in the order "
                 "in which they will be used.");
  SetDefaultOutputFormatter("simple");
}

CORVEX_PENDING_OPERATIONS(IpDNSServerList)

std::shared_ptr<MetaStruct> IpDNSServerList::GetOutputStructure() {
  auto structure = MetaStruct::New("NameServerList");
  structure->SetField("DNS Servers", MetaList::New(Fabrik::MetaObj::String));
  return structure;
}

std::shared_ptr<OutputSpec> IpDNSServerList::GetOutputSpecInternal() {
  auto spec = OutputSpec::New();
  spec->SetRootObject(GetOutputStructure());
  return spec;
}

// network ip dns server add

CORVEX_DEFINE_NEW(IpDNSServerAdd)

IpDNSServerAdd::IpDNSServerAdd() {
  SetDescription(
      "Add a new DNS server to the end of the list of DNS servers to use for this Ostra host.");
}

CORVEX_PENDING_OPERATIONS(IpDNSServerAdd)

std::shared_ptr<OutputSpec> IpDNSServerAdd::GetOutputSpecInternal() {
  auto spec = OutputSpec::New();
  spec->SetRootObject(MetaBool::New());
  return spec;
}

// network ip dns server remove

CORVEX_DEFINE_NEW(IpDNSServerRemove)

IpDNSServerRemove::IpDNSServerRemove() {
  SetDescription("Remove a DNS server from the list of DNS servers to use for this Ostra host.");
}

CORVEX_PENDING_OPERATIONS(IpDNSServerRemove)

std::shared_ptr<OutputSpec> IpDNSServerRemove::GetOutputSpecInternal() {
  auto spec = OutputSpec::New();
  spec->SetRootObject(MetaBool::New());
  return spec;
}

// network ip dns search add

CORVEX_DEFINE_NEW(IpDNSSearchAdd)

IpDNSSearchAdd::IpDNSSearchAdd() {
  SetDescription("Add a search domain to the list of domains to be searched when trying to resolve "
                 "an host name on the Ostra host.");
}

CORVEX_PENDING_OPERATIONS(IpDNSSearchAdd)

std::shared_ptr<OutputSpec> IpDNSSearchAdd::GetOutputSpecInternal() {
  auto spec = OutputSpec::New();
  spec->SetRootObject(MetaBool::New());
  return spec;
}

// network ip dns search remove

CORVEX_DEFINE_NEW(IpDNSSearchRemove)

IpDNSSearchRemove::IpDNSSearchRemove() {
  SetDescription("Remove a search domain from the list of domains to be searched when trying to "
                 "resolve an host name on the Ostra host.");
}

CORVEX_PENDING_OPERATIONS(IpDNSSearchRemove)

std::shared_ptr<OutputSpec> IpDNSSearchRemove::GetOutputSpecInternal() {
  auto spec = OutputSpec::New();
  spec->SetRootObject(MetaBool::New());
  return spec;
}

// network ip dns search list

CORVEX_DEFINE_NEW(IpDNSSearchList)

IpDNSSearchList::IpDNSSearchList() {
  SetDescription("List the search domains currently configured on the Ostra host in the order in "
                 "which they will be used when searching.");
  SetDefaultOutputFormatter("simple");
}

CORVEX_PENDING_OPERATIONS(IpDNSSearchList)

std::shared_ptr<MetaStruct> IpDNSSearchList::GetOutputStructure() {
  auto structure = MetaStruct::New("DNSSearchList");
  structure->SetField("DNS Search Domains", MetaList::New(Fabrik::MetaObj::String));
  return structure;
}

std::shared_ptr<OutputSpec> IpDNSSearchList::GetOutputSpecInternal() {
  auto spec = OutputSpec::New();
  spec->SetRootObject(GetOutputStructure());
  return spec;
}

} // namespace CorvexCli::NetworkNamespace
