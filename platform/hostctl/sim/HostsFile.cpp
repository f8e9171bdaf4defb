//===- HostsFile.cpp - The host's name table ------------------------------===//
#include "TvkCtl/Network/HostsFile.h"

#include "HostCtl/Lib.h"
#include "HostCtl/Misc.h"
#include "HostCtl/Network/Address.h"
#include "model/IpServicesModel.h"
#include "model/Store.h"

#include <cctype>

namespace TvkCtl::Network {

using HostCtl::Lib::HostCtlException;
using Model::Statement;
using Model::Store;

HostsFile::HostsFile() = default;
HostsFile::~HostsFile() = default;

bool HostsFile::IsValidHostName(const std::string& name) {
  if (name.empty() || name.size() > 253)
    return false;
  std::size_t start = 0;
  while (true) {
    std::size_t dot = name.find('.', start);
    std::size_t end = dot == std::string::npos ? name.size() : dot;
    std::size_t length = end - start;
    if (length == 0 || length > 63 || name[start] == '-' || name[end - 1] == '-')
      return false;
    for (std::size_t i = start; i < end; ++i) {
      unsigned char c = static_cast<unsigned char>(name[i]);
      if (!std::isalnum(c) && c != '-')
        return false;
    }
    if (dot == std::string::npos)
      return true;
    start = dot + 1;
  }
}

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
    row.BindAll(address, hostname);
    if (!row.Step())
      throw HostCtlException("No entry for " + address + " " + hostname + " exists");
    if (row.Bool(1))
      throw HostCtlException("The entry for " + address + " " + hostname +
                             " is a system entry and cannot be removed");
    int64_t id = row.Int(0);
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
    while (rows.Step())
      entries.push_back(std::make_shared<HostsFileEntry>(
          rows.Text(0), rows.Text(1), HostCtl::Misc::StringTokenize(rows.Text(2), " "),
          rows.Text(3)));
  });
  return entries;
}

} // namespace TvkCtl::Network
