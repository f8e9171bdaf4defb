//===- HostsFile.cpp - The host's name table ------------------------------===//
#include "sim/HostsFile.h"

#include "HostCtl/Lib.h"
#include "HostCtl/Misc.h"
#include "HostCtl/Network/Address.h"
#include "model/IpServicesModel.h"
#include "model/Store.h"

#include <cctype>

namespace Sim {

using HostCtl::Lib::HostCtlException;
using Model::Statement;
using Model::Store;

HostsFile::HostsFile() = default;
HostsFile::~HostsFile() = default;

void HostsFile::AddEntryFromUser(const std::string& ip, const std::string& hostname,
                                 const std::vector<std::string>& aliases,
                                 const std::string& comment) {
  Store& store = Store::Host();
  store.CheckFault("AddEntryFromUser", hostname);
  store.Write(
      [&] { Model::IpSvc::InsertHostsEntry(store, ip, hostname, aliases, comment, false); });
}

void HostsFile::RemoveEntryFromUser(const std::string& ip, const std::string& hostname) {
  Store& store = Store::Host();
  store.CheckFault("RemoveEntryFromUser", hostname);
  std::string address = ip;
  if (HostCtl::Network::Ipv4Address::IsValidAddress(ip))
    address = HostCtl::Network::Ipv4Address(ip).GetStringAddress();
  else if (HostCtl::Network::Ipv6Address::IsValidAddress(ip))
    address = HostCtl::Network::Ipv6Address(ip).GetStringAddress();
  else
    throw HostCtlException("Invalid IP address '" + ip + "'");
  store.Write([&] {
    Statement row = store.Prepare(
        "SELECT id, system FROM ipsvc_hosts WHERE address = ? AND hostname = ? COLLATE NOCASE");
    enum { kId, kSystem };
    Model::IpSvc::BindAddress(row, 1, address);
    row.Bind(2, hostname);
    if (!row.Step())
      throw HostCtlException("No entry for " + address + " " + hostname + " exists");
    if (row.Bool(kSystem))
      throw HostCtlException("The entry for " + address + " " + hostname +
                             " is a system entry and cannot be removed");
    int64_t id = row.Int(kId);
    store.Prepare("DELETE FROM ipsvc_hosts WHERE id = ?").Bind(1, id).Run();
  });
}

std::vector<std::shared_ptr<HostsFileEntry>> HostsFile::GetEntriesFromConfig() {
  Store& store = Store::Host();
  store.CheckFault("GetEntriesFromConfig", "*");
  std::vector<std::shared_ptr<HostsFileEntry>> entries;
  store.Read([&] {
    Statement rows = store.Prepare("SELECT address, hostname, aliases, comment FROM ipsvc_hosts "
                                   "WHERE system = 0 ORDER BY id");
    enum { kAddress, kHostname, kAliases, kComment };
    while (rows.Step())
      entries.push_back(std::make_shared<HostsFileEntry>(
          Model::IpSvc::AddressText(rows, kAddress), rows.Text(kHostname),
          HostCtl::Misc::StringTokenize(rows.Text(kAliases), " "), rows.Text(kComment)));
  });
  return entries;
}

} // namespace Sim
