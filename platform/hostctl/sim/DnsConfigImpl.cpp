//===- DnsConfigImpl.cpp - Resolver configuration of one netstack ---------===//
#include "sim/DnsConfigImpl.h"

#include "HostCtl/Lib.h"
#include "model/IpServicesModel.h"
#include "model/Store.h"

#include <algorithm>
#include <cctype>

namespace Sim {

using HostCtl::Lib::HostCtlException;
using Model::Store;

namespace {

bool SameDomain(const std::string& a, const std::string& b) {
  return a.size() == b.size() && std::equal(a.begin(), a.end(), b.begin(), [](char x, char y) {
           return std::tolower(static_cast<unsigned char>(x)) ==
                  std::tolower(static_cast<unsigned char>(y));
         });
}

} // namespace

DnsConfigImpl::DnsConfigImpl(std::string netstackKey) : netstack_(std::move(netstackKey)) {}

void DnsConfigImpl::Refresh() {
  Store& store = Store::Host();
  store.CheckFault("DnsConfigRefresh", netstack_);
  std::vector<std::string> servers;
  std::vector<std::string> domains;
  store.Read([&] { Model::IpSvc::LoadDns(store, netstack_, servers, domains); });
  for (const Change& change : changes_)
    Apply(change, servers, domains);
  servers_ = std::move(servers);
  domains_ = std::move(domains);
  loaded_ = true;
}

void DnsConfigImpl::Apply(const Change& change, std::vector<std::string>& servers,
                          std::vector<std::string>& domains) const {
  switch (change.kind) {
  case Change::AddServer:
    if (std::find(servers.begin(), servers.end(), change.value) != servers.end())
      throw HostCtlException("The DNS server " + change.value +
                             " is already configured for netstack " + netstack_);
    servers.push_back(change.value);
    break;
  case Change::RemoveServer: {
    auto it = std::find(servers.begin(), servers.end(), change.value);
    if (it == servers.end())
      throw HostCtlException("The DNS server " + change.value + " is not configured for netstack " +
                             netstack_);
    servers.erase(it);
    break;
  }
  case Change::RemoveAllServers:
    servers.clear();
    break;
  case Change::AddDomain:
    if (std::any_of(domains.begin(), domains.end(),
                    [&](const std::string& d) { return SameDomain(d, change.value); }))
      throw HostCtlException("The search domain " + change.value +
                             " is already configured for netstack " + netstack_);
    domains.push_back(change.value);
    break;
  case Change::RemoveDomain: {
    auto it = std::find_if(domains.begin(), domains.end(),
                           [&](const std::string& d) { return SameDomain(d, change.value); });
    if (it == domains.end())
      throw HostCtlException("The search domain " + change.value +
                             " is not configured for netstack " + netstack_);
    domains.erase(it);
    break;
  }
  }
}

bool DnsConfigImpl::Has(bool domain, const std::string& value) {
  // The latest change not yet saved that concerns the value decides; else the
  // store, by index, so that adding to a long list costs no more than to a
  // short one.
  for (auto it = changes_.rbegin(); it != changes_.rend(); ++it) {
    switch (it->kind) {
    case Change::AddServer:
    case Change::RemoveServer:
      if (!domain && it->value == value)
        return it->kind == Change::AddServer;
      break;
    case Change::RemoveAllServers:
      if (!domain)
        return false;
      break;
    case Change::AddDomain:
    case Change::RemoveDomain:
      if (domain && SameDomain(it->value, value))
        return it->kind == Change::AddDomain;
      break;
    }
  }
  Store& store = Store::Host();
  return store.Read([&] { return Model::IpSvc::HasDnsEntry(store, netstack_, domain, value); });
}

void DnsConfigImpl::Record(Change change) {
  bool domain = change.kind == Change::AddDomain || change.kind == Change::RemoveDomain;
  if (change.kind == Change::RemoveAllServers) {
    Has(false, ""); // Refuses a missing netstack.
  } else if (bool present = Has(domain, change.value);
             change.kind == Change::AddServer || change.kind == Change::AddDomain) {
    if (present)
      throw HostCtlException(std::string(domain ? "The search domain " : "The DNS server ") +
                             change.value + " is already configured for netstack " + netstack_);
  } else if (!present) {
    throw HostCtlException(std::string(domain ? "The search domain " : "The DNS server ") +
                           change.value + " is not configured for netstack " + netstack_);
  }
  changes_.push_back(std::move(change));
  loaded_ = false;
}

void DnsConfigImpl::AddUserNameServer(const HostCtl::Network::IpAddress& address) {
  Store::Host().CheckFault("AddUserNameServer", netstack_);
  Record({Change::AddServer, address.GetStringAddress()});
}

void DnsConfigImpl::RemoveNameServer(const HostCtl::Network::IpAddress& address) {
  Store::Host().CheckFault("RemoveNameServer", netstack_);
  Record({Change::RemoveServer, address.GetStringAddress()});
}

void DnsConfigImpl::RemoveNameServers() {
  Store::Host().CheckFault("RemoveNameServers", netstack_);
  Record({Change::RemoveAllServers, ""});
}

std::vector<std::string> DnsConfigImpl::GetNameServers() {
  Store::Host().CheckFault("GetNameServers", netstack_);
  if (!loaded_)
    Refresh();
  return servers_;
}

void DnsConfigImpl::AddUserSearchDomain(const std::string& domain) {
  Store::Host().CheckFault("AddUserSearchDomain", netstack_);
  Model::IpSvc::CheckSearchDomain(domain);
  Record({Change::AddDomain, domain});
}

void DnsConfigImpl::RemoveSearchDomain(const std::string& domain) {
  Store::Host().CheckFault("RemoveSearchDomain", netstack_);
  Record({Change::RemoveDomain, domain});
}

std::string DnsConfigImpl::GetSearchDomainsString() {
  Store::Host().CheckFault("GetSearchDomainsString", netstack_);
  if (!loaded_)
    Refresh();
  std::string text;
  for (const std::string& domain : domains_)
    text += (text.empty() ? "" : " ") + domain;
  return text;
}

void DnsConfigImpl::SaveConfig() {
  Store& store = Store::Host();
  store.CheckFault("SaveConfig", netstack_);
  if (changes_.empty())
    return;
  // Each change is checked again against the stored configuration and
  // applied as one row operation.
  store.Write([&] {
    namespace IpSvc = Model::IpSvc;
    for (const Change& change : changes_) {
      const bool domain = change.kind == Change::AddDomain || change.kind == Change::RemoveDomain;
      if (change.kind == Change::RemoveAllServers) {
        IpSvc::ClearDnsServers(store, netstack_);
        continue;
      }
      const bool present = IpSvc::HasDnsEntry(store, netstack_, domain, change.value);
      const bool add = change.kind == Change::AddServer || change.kind == Change::AddDomain;
      const char* what = domain ? "The search domain " : "The DNS server ";
      if (add && present)
        throw HostCtlException(what + change.value + " is already configured for netstack " +
                               netstack_);
      if (!add && !present)
        throw HostCtlException(what + change.value + " is not configured for netstack " +
                               netstack_);
      if (add)
        IpSvc::AppendDnsEntry(store, netstack_, domain, change.value);
      else
        IpSvc::RemoveDnsEntry(store, netstack_, domain, change.value);
    }
  });
  changes_.clear();
  loaded_ = false;
}

} // namespace Sim
