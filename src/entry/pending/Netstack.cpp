//===- Netstack.cpp - Interim netstack commands ---------------------------===//
//
// Interim definitions of the commands of the Netstack family: Netstack
// instances and global IP settings. Each command is a complete node of the
// tree, with its description, default output settings and result schema, but
// running it only reports that it is not available yet. src/ip/Netstack.cpp
// replaces this file.
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

// network ip netstack list

CORVEX_DEFINE_NEW(IpNetstackInstanceList)

IpNetstackInstanceList::IpNetstackInstanceList() {
  SetDescription(
      "This command will list the Tarvik Netstack instances currently known to the system.");
  SetDefaultOutputFormatter("simple");
  SetDefaultOutputParameter("header:NetstackInstance", "%Key%");
  SetDefaultOutputParameter("fields:NetstackInstance", "Key,Name,State");
}

CORVEX_PENDING_OPERATIONS(IpNetstackInstanceList)

std::shared_ptr<MetaStruct> IpNetstackInstanceList::GetOutputStructure() {
  auto structure = MetaStruct::New("NetstackInstance");
  structure->SetField("Key", MetaString::New());
  structure->SetField("Name", MetaString::New());
  structure->SetField("State", MetaInt::New());
  return structure;
}

std::shared_ptr<OutputSpec> IpNetstackInstanceList::GetOutputSpecInternal() {
  auto spec = OutputSpec::New();
  spec->SetRootObject(MetaList::New(Fabrik::MetaObj::Struct, GetOutputStructure()));
  return spec;
}

// network ip netstack add

CORVEX_DEFINE_NEW(IpNetstackInstanceAdd)

IpNetstackInstanceAdd::IpNetstackInstanceAdd() {
  SetDescription("Add a new Netstack Instance.");
}

CORVEX_PENDING_OPERATIONS(IpNetstackInstanceAdd)

std::shared_ptr<OutputSpec> IpNetstackInstanceAdd::GetOutputSpecInternal() {
  auto spec = OutputSpec::New();
  spec->SetRootObject(MetaBool::New());
  return spec;
}

// network ip netstack remove

CORVEX_DEFINE_NEW(IpNetstackInstanceRemove)

IpNetstackInstanceRemove::IpNetstackInstanceRemove() {
  SetDescription("Remove a new Netstack Instance.");
}

CORVEX_PENDING_OPERATIONS(IpNetstackInstanceRemove)

std::shared_ptr<OutputSpec> IpNetstackInstanceRemove::GetOutputSpecInternal() {
  auto spec = OutputSpec::New();
  spec->SetRootObject(MetaBool::New());
  return spec;
}

// network ip netstack get

CORVEX_DEFINE_NEW(IpNetstackInstanceGet)

IpNetstackInstanceGet::IpNetstackInstanceGet() {
  SetDescription("Get runtime/configuration settings for a given Netstack Instance.");
  SetDefaultOutputFormatter("simple");
  SetDefaultOutputParameter("header:NetstackInstance", "%Key%");
  SetDefaultOutputParameter("fields:NetstackInstance",
                            "Key,Name,Enabled,Max Connections,Current Max Connections,Congestion "
                            "Control Algorithm,IPv6 Enabled,Current IPv6 Enabled,ECN Status,State");
}

CORVEX_PENDING_OPERATIONS(IpNetstackInstanceGet)

std::shared_ptr<MetaStruct> IpNetstackInstanceGet::GetOutputStructure() {
  auto structure = MetaStruct::New("NetstackInstance");
  structure->SetField("Key", MetaString::New());
  structure->SetField("Name", MetaString::New());
  structure->SetField("Enabled", MetaBool::New());
  structure->SetField("Max Connections", MetaInt::New());
  structure->SetField("Current Max Connections", MetaInt::New());
  structure->SetField("Congestion Control Algorithm", MetaString::New());
  structure->SetField("IPv6 Enabled", MetaBool::New());
  structure->SetField("Current IPv6 Enabled", MetaBool::New());
  structure->SetField("ECN Status", MetaString::New());
  structure->SetField("State", MetaInt::New());
  return structure;
}

std::shared_ptr<OutputSpec> IpNetstackInstanceGet::GetOutputSpecInternal() {
  auto spec = OutputSpec::New();
  spec->SetRootObject(MetaList::New(Fabrik::MetaObj::Struct, GetOutputStructure()));
  return spec;
}

// network ip netstack set

CORVEX_DEFINE_NEW(IpNetstackInstanceSet)

IpNetstackInstanceSet::IpNetstackInstanceSet() {
  SetDescription("Configure settings for a given Netstack Instance.");
}

CORVEX_PENDING_OPERATIONS(IpNetstackInstanceSet)

std::shared_ptr<OutputSpec> IpNetstackInstanceSet::GetOutputSpecInternal() {
  auto spec = OutputSpec::New();
  spec->SetRootObject(MetaBool::New());
  return spec;
}

// network ip get

CORVEX_DEFINE_NEW(IpGet)

IpGet::IpGet() {
  SetDescription("Get global IP settings");
  SetDefaultOutputFormatter("simple");
}

CORVEX_PENDING_OPERATIONS(IpGet)

std::shared_ptr<MetaStruct> IpGet::GetOutputStructure() {
  auto structure = MetaStruct::New("IPInfo");
  structure->SetField("IPv6 Enabled", MetaBool::New());
  return structure;
}

std::shared_ptr<OutputSpec> IpGet::GetOutputSpecInternal() {
  auto spec = OutputSpec::New();
  spec->SetRootObject(GetOutputStructure());
  return spec;
}

// network ip set

CORVEX_DEFINE_NEW(IpSet)

IpSet::IpSet() {
  SetDescription("Update global IP settings");
}

CORVEX_PENDING_OPERATIONS(IpSet)

std::shared_ptr<OutputSpec> IpSet::GetOutputSpecInternal() {
  auto spec = OutputSpec::New();
  spec->SetRootObject(MetaBool::New());
  return spec;
}

} // namespace CorvexCli::NetworkNamespace
