//===- Interface.cpp - Interim kernel interface commands ------------------===//
//
// Interim definitions of the commands of the Interface family: Kernel network
// interfaces. Each command is a complete node of the tree, with its
// description, default output settings and result schema, but running it only
// reports that it is not available yet. src/ip/Interface.cpp replaces this
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

// network ip interface add

CORVEX_DEFINE_NEW(IpInterfaceAdd)

IpInterfaceAdd::IpInterfaceAdd() {
  SetDescription("Add a new Tarvik network interface.");
}

CORVEX_PENDING_OPERATIONS(IpInterfaceAdd)

std::shared_ptr<OutputSpec> IpInterfaceAdd::GetOutputSpecInternal() {
  auto spec = OutputSpec::New();
  spec->SetRootObject(MetaBool::New());
  return spec;
}

// network ip interface remove

CORVEX_DEFINE_NEW(IpInterfaceRemove)

IpInterfaceRemove::IpInterfaceRemove() {
  SetDescription("Remove a Tarvik network interface from the Ostra host. A TarVik network "
                 "interface can be uniquely specified by --interface-name or --portgroup-name or "
                 "--dvs-name/--dvport-id. i.e. Providing its name or its connection point are two "
                 "ways to uniquely specify a TarVik network interface.");
}

CORVEX_PENDING_OPERATIONS(IpInterfaceRemove)

std::shared_ptr<OutputSpec> IpInterfaceRemove::GetOutputSpecInternal() {
  auto spec = OutputSpec::New();
  spec->SetRootObject(MetaBool::New());
  return spec;
}

// network ip interface list

CORVEX_DEFINE_NEW(IpInterfaceList)

IpInterfaceList::IpInterfaceList() {
  SetDescription(
      "This command will list the Tarvik network interfaces currently known to the system.");
  SetDefaultOutputFormatter("simple");
  SetDefaultOutputParameter("header:NetworkInterface", "%Name%");
  SetDefaultOutputParameter("fields:NetworkInterface",
                            "Name,MAC Address,Enabled,Portset,Portgroup,Netstack Instance,KRX "
                            "Name,KRX UUID,KRX Port,KRX Connection,Opaque Network ID,Opaque "
                            "Network Type,External ID,MTU,TSO MSS,RXDispQueue Size,Port ID");
}

CORVEX_PENDING_OPERATIONS(IpInterfaceList)

std::shared_ptr<MetaStruct> IpInterfaceList::GetOutputStructure() {
  auto structure = MetaStruct::New("NetworkInterface");
  structure->SetField("Name", MetaString::New());
  structure->SetField("MAC Address", MetaString::New());
  structure->SetField("Portset", MetaString::New());
  structure->SetField("Portgroup", MetaString::New());
  structure->SetField("Netstack Instance", MetaString::New());
  structure->SetField("KRX Name", MetaString::New());
  structure->SetField("KRX UUID", MetaString::New());
  structure->SetField("KRX Port", MetaString::New());
  structure->SetField("KRX Connection", MetaInt::New());
  structure->SetField("Opaque Network ID", MetaString::New());
  structure->SetField("Opaque Network Type", MetaString::New());
  structure->SetField("External ID", MetaString::New());
  structure->SetField("MTU", MetaInt::New());
  structure->SetField("TSO MSS", MetaInt::New());
  structure->SetField("RXDispQueue Size", MetaInt::New());
  structure->SetField("Enabled", MetaBool::New());
  structure->SetField("Port ID", MetaInt::New());
  return structure;
}

std::shared_ptr<OutputSpec> IpInterfaceList::GetOutputSpecInternal() {
  auto spec = OutputSpec::New();
  spec->SetRootObject(MetaList::New(Fabrik::MetaObj::Struct, GetOutputStructure()));
  return spec;
}

// network ip interface set

CORVEX_DEFINE_NEW(IpInterfaceSet)

IpInterfaceSet::IpInterfaceSet() {
  SetDescription("This command sets the enabled status and MTU size of a given IP interface ");
}

CORVEX_PENDING_OPERATIONS(IpInterfaceSet)

std::shared_ptr<OutputSpec> IpInterfaceSet::GetOutputSpecInternal() {
  auto spec = OutputSpec::New();
  spec->SetRootObject(MetaBool::New());
  return spec;
}

} // namespace CorvexCli::NetworkNamespace
