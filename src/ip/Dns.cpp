//===- Dns.cpp - network ip dns server|search add, remove, list -----------===//
//
// The resolver commands of one netstack: ordered DNS servers and search
// domains. Every change is saved with DnsConfigImpl::SaveConfig.
//
//===----------------------------------------------------------------------===//
#include "ip.h"

#include "HostCtl/Lib.h"
#include "HostCtl/Misc.h"
#include "TvkCtl/Network/DnsConfigImpl.h"
#include "common/FieldTable.h"
#include "common/ParameterTable.h"
#include "ip/IpCommon.h"

#include <optional>

namespace CorvexCli::NetworkNamespace {

using Fabrik::CallSpec::Input;
using Fabrik::CallSpec::InputSpec;
using Fabrik::CallSpec::Output;
using Fabrik::CallSpec::OutputSpec;
using Fabrik::MetaObj::MetaBool;
using Fabrik::MetaObj::MetaList;
using Fabrik::MetaObj::MetaStruct;
using HostCtl::Lib::HostCtlException;
using HostCtl::Network::IpAddress;
using HostCtl::Network::Ipv4Address;
using HostCtl::Network::Ipv6Address;
using TvkCtl::Network::DnsConfigImpl;

namespace {

const std::string kDnsServers = "DNS Servers";
const std::string kDnsSearchDomains = "DNS Search Domains";

const ParameterDef kNetstackParam = {"netstack", "N", Fabrik::CallSpec::String, false,
                                     kNetstackDescription};

/// The server address the user typed, IPv4 tried first; nothing (with the
/// error added) when neither family accepts it.
std::optional<IpAddress> ServerAddress(const std::string& text, Output& output) {
  if (Ipv4Address::IsValidAddress(text))
    return IpAddress(Ipv4Address(text));
  if (Ipv6Address::IsValidAddress(text))
    return IpAddress(Ipv6Address(text));
  output.AddErrorMessage("The specified address '" + text +
                         "' is not recognised as a valid IP address");
  return std::nullopt;
}

/// Runs \p change on the netstack's configuration, saves it and sets true.
template <typename Change> void ChangeDns(const Input& input, Output& output, Change&& change) {
  try {
    DnsConfigImpl dns(NetstackParameter(input));
    if (!change(dns))
      return;
    dns.SaveConfig();
    output.SetRootObject(MetaBool::New(true));
  } catch (const HostCtlException& e) {
    output.AddErrorMessage(e.what());
  }
}

} // namespace

// network ip dns server list

CORVEX_DEFINE_NEW(IpDNSServerList)

IpDNSServerList::IpDNSServerList() {
  SetDescription("Print a list of the DNS server currently configured on the system in the order "
                 "in which they will be used.");
  SetDefaultOutputFormatter("simple");
}

IpDNSServerList::~IpDNSServerList() = default;

std::shared_ptr<InputSpec> IpDNSServerList::GetInputSpecInternal() {
  return MakeInputSpec({kNetstackParam});
}

std::shared_ptr<MetaStruct> IpDNSServerList::GetOutputStructure() {
  return MakeStructure("NameServerList", {{kDnsServers, FieldKind::StringList}});
}

std::shared_ptr<OutputSpec> IpDNSServerList::GetOutputSpecInternal() {
  return ResultSpec(GetOutputStructure());
}

void IpDNSServerList::ExecuteInternal(const std::shared_ptr<Input>& input,
                                      const std::shared_ptr<Output>& output) {
  try {
    DnsConfigImpl dns(NetstackParameter(*input));
    auto servers = MetaList::New(Fabrik::MetaObj::String);
    for (const std::string& server : dns.GetNameServers())
      servers->Add(server);
    auto result = GetOutputStructure();
    result->SetField(kDnsServers, servers);
    output->SetRootObject(result);
  } catch (const HostCtlException& e) {
    output->AddErrorMessage(e.what());
  }
}

// network ip dns server add

CORVEX_DEFINE_NEW(IpDNSServerAdd)

IpDNSServerAdd::IpDNSServerAdd() {
  SetDescription(
      "Add a new DNS server to the end of the list of DNS servers to use for this Ostra host.");
}

IpDNSServerAdd::~IpDNSServerAdd() = default;

std::shared_ptr<InputSpec> IpDNSServerAdd::GetInputSpecInternal() {
  return MakeInputSpec(
      {{"server", "s", Fabrik::CallSpec::String, true,
        "The IP address (v4 or v6) of the DNS server to add to the DNS server list."},
       kNetstackParam});
}

std::shared_ptr<OutputSpec> IpDNSServerAdd::GetOutputSpecInternal() {
  return BoolResultSpec();
}

void IpDNSServerAdd::ExecuteInternal(const std::shared_ptr<Input>& input,
                                     const std::shared_ptr<Output>& output) {
  ChangeDns(*input, *output, [&](DnsConfigImpl& dns) {
    std::optional<IpAddress> address = ServerAddress(input->GetParameter("server"), *output);
    if (!address)
      return false;
    dns.AddUserNameServer(*address);
    return true;
  });
}

// network ip dns server remove

CORVEX_DEFINE_NEW(IpDNSServerRemove)

IpDNSServerRemove::IpDNSServerRemove() {
  SetDescription("Remove a DNS server from the list of DNS servers to use for this Ostra host.");
}

IpDNSServerRemove::~IpDNSServerRemove() = default;

std::shared_ptr<InputSpec> IpDNSServerRemove::GetInputSpecInternal() {
  return MakeInputSpec({{"all", "a", Fabrik::CallSpec::Flag, false, " "},
                        {"server", "s", Fabrik::CallSpec::String, false, " "},
                        kNetstackParam});
}

std::shared_ptr<OutputSpec> IpDNSServerRemove::GetOutputSpecInternal() {
  return BoolResultSpec();
}

void IpDNSServerRemove::ExecuteInternal(const std::shared_ptr<Input>& input,
                                        const std::shared_ptr<Output>& output) {
  bool all = input->IsFlagSet("all");
  if (!all && !input->HasParameter("server")) {
    output->AddErrorMessage("You must specify exactly one of: --all, --server");
    return;
  }
  ChangeDns(*input, *output, [&](DnsConfigImpl& dns) {
    if (all) {
      dns.RemoveNameServers();
      return true;
    }
    std::optional<IpAddress> address = ServerAddress(input->GetParameter("server"), *output);
    if (!address)
      return false;
    dns.RemoveNameServer(*address);
    return true;
  });
}

// network ip dns search add

CORVEX_DEFINE_NEW(IpDNSSearchAdd)

IpDNSSearchAdd::IpDNSSearchAdd() {
  SetDescription("Add a search domain to the list of domains to be searched when trying to resolve "
                 "an host name on the Ostra host.");
}

IpDNSSearchAdd::~IpDNSSearchAdd() = default;

std::shared_ptr<InputSpec> IpDNSSearchAdd::GetInputSpecInternal() {
  return MakeInputSpec({{"domain", "d", Fabrik::CallSpec::String, true,
                         "The string name of a domain to add to the list of search domains."},
                        kNetstackParam});
}

std::shared_ptr<OutputSpec> IpDNSSearchAdd::GetOutputSpecInternal() {
  return BoolResultSpec();
}

void IpDNSSearchAdd::ExecuteInternal(const std::shared_ptr<Input>& input,
                                     const std::shared_ptr<Output>& output) {
  ChangeDns(*input, *output, [&](DnsConfigImpl& dns) {
    dns.AddUserSearchDomain(input->GetParameter("domain"));
    return true;
  });
}

// network ip dns search remove

CORVEX_DEFINE_NEW(IpDNSSearchRemove)

IpDNSSearchRemove::IpDNSSearchRemove() {
  SetDescription("Remove a search domain from the list of domains to be searched when trying to "
                 "resolve an host name on the Ostra host.");
}

IpDNSSearchRemove::~IpDNSSearchRemove() = default;

std::shared_ptr<InputSpec> IpDNSSearchRemove::GetInputSpecInternal() {
  return MakeInputSpec({{"domain", "d", Fabrik::CallSpec::String, true,
                         "The string name of a domain to remove from the list of search domains."},
                        kNetstackParam});
}

std::shared_ptr<OutputSpec> IpDNSSearchRemove::GetOutputSpecInternal() {
  return BoolResultSpec();
}

void IpDNSSearchRemove::ExecuteInternal(const std::shared_ptr<Input>& input,
                                        const std::shared_ptr<Output>& output) {
  ChangeDns(*input, *output, [&](DnsConfigImpl& dns) {
    dns.RemoveSearchDomain(input->GetParameter("domain"));
    return true;
  });
}

// network ip dns search list

CORVEX_DEFINE_NEW(IpDNSSearchList)

IpDNSSearchList::IpDNSSearchList() {
  SetDescription("List the search domains currently configured on the Ostra host in the order in "
                 "which they will be used when searching.");
  SetDefaultOutputFormatter("simple");
}

IpDNSSearchList::~IpDNSSearchList() = default;

std::shared_ptr<InputSpec> IpDNSSearchList::GetInputSpecInternal() {
  return MakeInputSpec({kNetstackParam});
}

std::shared_ptr<MetaStruct> IpDNSSearchList::GetOutputStructure() {
  return MakeStructure("DNSSearchList", {{kDnsSearchDomains, FieldKind::StringList}});
}

std::shared_ptr<OutputSpec> IpDNSSearchList::GetOutputSpecInternal() {
  return ResultSpec(GetOutputStructure());
}

void IpDNSSearchList::ExecuteInternal(const std::shared_ptr<Input>& input,
                                      const std::shared_ptr<Output>& output) {
  try {
    DnsConfigImpl dns(NetstackParameter(*input));
    auto domains = MetaList::New(Fabrik::MetaObj::String);
    domains->AddAll(HostCtl::Misc::StringTokenize(dns.GetSearchDomainsString(), " "));
    auto result = GetOutputStructure();
    result->SetField(kDnsSearchDomains, domains);
    output->SetRootObject(result);
  } catch (const HostCtlException& e) {
    output->AddErrorMessage(e.what());
  }
}

} // namespace CorvexCli::NetworkNamespace
