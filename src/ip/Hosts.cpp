//===- Hosts.cpp - network ip hosts add, remove, list ---------------------===//
//
// The user's entries of the host's name table. The host library checks the
// values; these commands pass them through and report its refusals.
//
//===----------------------------------------------------------------------===//
#include "ip.h"

#include "HostCtl/Lib.h"
#include "TvkCtl/Network/HostsFile.h"
#include "common/FieldTable.h"
#include "common/ParameterTable.h"
#include "ip/IpCommon.h"

namespace CorvexCli::NetworkNamespace {

using Fabrik::CallSpec::Input;
using Fabrik::CallSpec::InputSpec;
using Fabrik::CallSpec::Output;
using Fabrik::CallSpec::OutputSpec;
using Fabrik::MetaObj::MetaBool;
using Fabrik::MetaObj::MetaList;
using Fabrik::MetaObj::MetaStruct;
using HostCtl::Lib::HostCtlException;
using TvkCtl::Network::HostsFile;

namespace {

const std::string kIpAddress = "IP address";
const std::string kHostName = "HostName";
const std::string kAliases = "Aliases";
const std::string kComment = "Comment";

const ParameterDef kIpParam = {"ip", "I", Fabrik::CallSpec::String, true,
                               "The IP address (v4 or v6) of the host."};
const ParameterDef kHostnameParam = {"hostname", "H", Fabrik::CallSpec::String, true,
                                     "The name of the host."};

} // namespace

// network ip hosts list

CORVEX_DEFINE_MAKE_SHARED(IpHostsList)

IpHostsList::IpHostsList() {
  SetDescription("List the user specified associations of IP addresses with host names.");
  SetDefaultOutputFormatter("simple");
  SetDefaultOutputParameter("fields:IpHostList",
                            kIpAddress + "," + kHostName + "," + kAliases + "," + kComment);
}

IpHostsList::~IpHostsList() = default;

std::shared_ptr<InputSpec> IpHostsList::GetInputSpecInternal() {
  return InputSpec::New();
}

std::shared_ptr<MetaStruct> IpHostsList::GetOutputStructure() {
  return MakeStructure("IpHostList", {{kIpAddress, FieldKind::String},
                                      {kHostName, FieldKind::String},
                                      {kAliases, FieldKind::StringList},
                                      {kComment, FieldKind::String}});
}

std::shared_ptr<OutputSpec> IpHostsList::GetOutputSpecInternal() {
  return ListResultSpec(GetOutputStructure());
}

void IpHostsList::ExecuteInternal(const std::shared_ptr<Input>& /*input*/,
                                  const std::shared_ptr<Output>& output) {
  try {
    HostsFile hosts;
    auto entries = hosts.GetEntriesFromConfig();
    auto list = MetaList::New(Fabrik::MetaObj::Struct, GetOutputStructure());
    list->Reserve(entries.size());
    for (const auto& entry : entries) {
      auto row = GetOutputStructure();
      row->SetField(kIpAddress, entry->GetIpAddress());
      row->SetField(kHostName, entry->GetHostName());
      row->SetField(kAliases, entry->GetAliases());
      row->SetField(kComment, entry->GetComment());
      list->Add(row);
    }
    output->SetRootObject(list);
  } catch (const HostCtlException& e) {
    output->AddErrorMessage(e.what());
  }
}

// network ip hosts add

CORVEX_DEFINE_MAKE_SHARED(IpHostsAdd)

IpHostsAdd::IpHostsAdd() {
  SetDescription("Add association of IP addresses with host names.");
}

IpHostsAdd::~IpHostsAdd() = default;

std::shared_ptr<InputSpec> IpHostsAdd::GetInputSpecInternal() {
  return MakeInputSpec(
      {kIpParam,
       kHostnameParam,
       {"alias", "A", Fabrik::CallSpec::StringList, false, "The list of aliases of the host."},
       {"comment", "C", Fabrik::CallSpec::String, false, "Comment line of this item"}});
}

std::shared_ptr<OutputSpec> IpHostsAdd::GetOutputSpecInternal() {
  return BoolResultSpec();
}

void IpHostsAdd::ExecuteInternal(const std::shared_ptr<Input>& input,
                                 const std::shared_ptr<Output>& output) {
  try {
    std::vector<std::string> aliases;
    if (input->HasParameter("alias"))
      input->GetParameterList("alias", aliases);
    std::string comment = input->HasParameter("comment") ? input->GetParameter("comment") : "";
    HostsFile hosts;
    hosts.AddEntryFromUser(input->GetParameter("ip"), input->GetParameter("hostname"), aliases,
                           comment);
    output->SetRootObject(MetaBool::New(true));
  } catch (const HostCtlException& e) {
    output->AddErrorMessage(std::string("Error adding etc host item:") + e.what());
  }
}

// network ip hosts remove

CORVEX_DEFINE_MAKE_SHARED(IpHostsRemove)

IpHostsRemove::IpHostsRemove() {
  SetDescription("Remove association of IP addresses with host names.");
}

IpHostsRemove::~IpHostsRemove() = default;

std::shared_ptr<InputSpec> IpHostsRemove::GetInputSpecInternal() {
  return MakeInputSpec({kIpParam, kHostnameParam});
}

std::shared_ptr<OutputSpec> IpHostsRemove::GetOutputSpecInternal() {
  return BoolResultSpec();
}

void IpHostsRemove::ExecuteInternal(const std::shared_ptr<Input>& input,
                                    const std::shared_ptr<Output>& output) {
  try {
    HostsFile hosts;
    hosts.RemoveEntryFromUser(input->GetParameter("ip"), input->GetParameter("hostname"));
    output->SetRootObject(MetaBool::New(true));
  } catch (const HostCtlException& e) {
    output->AddErrorMessage(std::string("Error removing etc host item:") + e.what());
  }
}

} // namespace CorvexCli::NetworkNamespace
