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

void DnsConfigImpl::EnsureLoaded() {
  if (!loaded_)
    Refresh();
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

void DnsConfigImpl::AddUserNameServer(const HostCtl::Network::IpAddress& address) {
  Store::Host().CheckFault("AddUserNameServer", netstack_);
  EnsureLoaded();
  Change change{Change::AddServer, address.GetStringAddress()};
  Apply(change, servers_, domains_);
  changes_.push_back(std::move(change));
}

void DnsConfigImpl::RemoveNameServer(const HostCtl::Network::IpAddress& address) {
  Store::Host().CheckFault("RemoveNameServer", netstack_);
  EnsureLoaded();
  Change change{Change::RemoveServer, address.GetStringAddress()};
  Apply(change, servers_, domains_);
  changes_.push_back(std::move(change));
}

void DnsConfigImpl::RemoveNameServers() {
  Store::Host().CheckFault("RemoveNameServers", netstack_);
  EnsureLoaded();
  Change change{Change::RemoveAllServers, ""};
  Apply(change, servers_, domains_);
  changes_.push_back(std::move(change));
}

std::vector<std::string> DnsConfigImpl::GetNameServers() {
  Store::Host().CheckFault("GetNameServers", netstack_);
  if (changes_.empty() || !loaded_)
    Refresh();
  return servers_;
}

void DnsConfigImpl::AddUserSearchDomain(const std::string& domain) {
  Store::Host().CheckFault("AddUserSearchDomain", netstack_);
  EnsureLoaded();
  Model::IpSvc::CheckSearchDomain(domain);
  Change change{Change::AddDomain, domain};
  Apply(change, servers_, domains_);
  changes_.push_back(std::move(change));
}

void DnsConfigImpl::RemoveSearchDomain(const std::string& domain) {
  Store::Host().CheckFault("RemoveSearchDomain", netstack_);
  EnsureLoaded();
  Change change{Change::RemoveDomain, domain};
  Apply(change, servers_, domains_);
  changes_.push_back(std::move(change));
}

std::string DnsConfigImpl::GetSearchDomainsString() {
  Store::Host().CheckFault("GetSearchDomainsString", netstack_);
  if (changes_.empty() || !loaded_)
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
  store.Write([&] {
    std::vector<std::string> servers;
    std::vector<std::string> domains;
    Model::IpSvc::LoadDns(store, netstack_, servers, domains);
    for (const Change& change : changes_)
      Apply(change, servers, domains);
    Model::IpSvc::SaveDns(store, netstack_, servers, domains);
    servers_ = std::move(servers);
    domains_ = std::move(domains);
  });
  changes_.clear();
  loaded_ = true;
}

} // namespace Sim
