//===- Ipsec.cpp - Interim IPsec commands ---------------------------------===//
//
// Interim definitions of the commands of the Ipsec family: IPsec security
// associations and policies. Each command is a complete node of the tree, with
// its description, default output settings and result schema, but running it
// only reports that it is not available yet. src/ip/Ipsec.cpp replaces this
// file.
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

// network ip ipsec sa add

CORVEX_DEFINE_NEW(IpIpsecSAAdd)

IpIpsecSAAdd::IpIpsecSAAdd() {
  SetDescription("Add a Security Association.");
}

CORVEX_PENDING_OPERATIONS(IpIpsecSAAdd)

std::shared_ptr<OutputSpec> IpIpsecSAAdd::GetOutputSpecInternal() {
  auto spec = OutputSpec::New();
  spec->SetRootObject(MetaBool::New());
  return spec;
}

// network ip ipsec sa remove

CORVEX_DEFINE_NEW(IpIpsecSARemove)

IpIpsecSARemove::IpIpsecSARemove() {
  SetDescription("Operation to remove Security Association(s)");
}

CORVEX_PENDING_OPERATIONS(IpIpsecSARemove)

std::shared_ptr<OutputSpec> IpIpsecSARemove::GetOutputSpecInternal() {
  auto spec = OutputSpec::New();
  spec->SetRootObject(MetaBool::New());
  return spec;
}

// network ip ipsec sa list

CORVEX_DEFINE_NEW(IpIpsecSAList)

IpIpsecSAList::IpIpsecSAList() {
  SetDescription("List configured Security Associations");
  SetDefaultOutputFormatter("table");
  SetDefaultOutputParameter("fields:SecurityAssociation",
                            "Name,Source Address,Destination Address,State,SPI,Mode,Encryption "
                            "Algorithm,Integrity Algorithm,Lifetime");
}

CORVEX_PENDING_OPERATIONS(IpIpsecSAList)

std::shared_ptr<MetaStruct> IpIpsecSAList::GetOutputStructure() {
  auto structure = MetaStruct::New("SecurityAssociation");
  structure->SetField("Name", MetaString::New());
  structure->SetField("Source Address", MetaString::New());
  structure->SetField("Destination Address", MetaString::New());
  structure->SetField("State", MetaString::New());
  structure->SetField("SPI", MetaString::New());
  structure->SetField("Mode", MetaString::New());
  structure->SetField("Encryption Algorithm", MetaString::New());
  structure->SetField("Integrity Algorithm", MetaString::New());
  structure->SetField("Lifetime", MetaString::New());
  return structure;
}

std::shared_ptr<OutputSpec> IpIpsecSAList::GetOutputSpecInternal() {
  auto spec = OutputSpec::New();
  spec->SetRootObject(MetaList::New(Fabrik::MetaObj::Struct, GetOutputStructure()));
  return spec;
}

// network ip ipsec sp add

CORVEX_DEFINE_NEW(IpIpsecSPAdd)

IpIpsecSPAdd::IpIpsecSPAdd() {
  SetDescription("Add a Security Policy.");
}

CORVEX_PENDING_OPERATIONS(IpIpsecSPAdd)

std::shared_ptr<OutputSpec> IpIpsecSPAdd::GetOutputSpecInternal() {
  auto spec = OutputSpec::New();
  spec->SetRootObject(MetaBool::New());
  return spec;
}

// network ip ipsec sp remove

CORVEX_DEFINE_NEW(IpIpsecSPRemove)

IpIpsecSPRemove::IpIpsecSPRemove() {
  SetDescription("Operation to remove Security Policy");
}

CORVEX_PENDING_OPERATIONS(IpIpsecSPRemove)

std::shared_ptr<OutputSpec> IpIpsecSPRemove::GetOutputSpecInternal() {
  auto spec = OutputSpec::New();
  spec->SetRootObject(MetaBool::New());
  return spec;
}

// network ip ipsec sp list

CORVEX_DEFINE_NEW(IpIpsecSPList)

IpIpsecSPList::IpIpsecSPList() {
  SetDescription("List configured Security Policys");
  SetDefaultOutputFormatter("table");
  SetDefaultOutputParameter("fields:SecurityPolicy",
                            "Name,Source Address,Source Port,Destination Address,Destination "
                            "Port,Protocol,Flow,Action,Mode,SA Name");
}

CORVEX_PENDING_OPERATIONS(IpIpsecSPList)

std::shared_ptr<MetaStruct> IpIpsecSPList::GetOutputStructure() {
  auto structure = MetaStruct::New("SecurityPolicy");
  structure->SetField("Name", MetaString::New());
  structure->SetField("Source Address", MetaString::New());
  structure->SetField("Source Port", MetaInt::New());
  structure->SetField("Destination Address", MetaString::New());
  structure->SetField("Destination Port", MetaInt::New());
  structure->SetField("Protocol", MetaString::New());
  structure->SetField("Flow", MetaString::New());
  structure->SetField("Action", MetaString::New());
  structure->SetField("Mode", MetaString::New());
  structure->SetField("SA Name", MetaString::New());
  return structure;
}

std::shared_ptr<OutputSpec> IpIpsecSPList::GetOutputSpecInternal() {
  auto spec = OutputSpec::New();
  spec->SetRootObject(MetaList::New(Fabrik::MetaObj::Struct, GetOutputStructure()));
  return spec;
}

} // namespace CorvexCli::NetworkNamespace
