//===- TvKernelNicInfoImpl.cpp - Listing the kernel interfaces ------------===//
//
// The look-ups of the kernel interface service: all interfaces of one kind
// (ordinary or system), those of one netstack, one by name, those with a tag.
// Adding and removing interfaces is in TvkNicAttach.cpp.
//
//===----------------------------------------------------------------------===//
#include "sim/TvkNicImpl.h"

#include "HostCtl/Lib.h"
#include "model/Store.h"

namespace Sim {

using HostCtl::Network::TvkNic;
using HostCtl::Network::TvkNicTagType;
using Model::Statement;
using Model::Store;

namespace {

/// Columns read for each listed interface, in the order ReadRow expects.
#define TVKNIC_COLUMNS                                                                             \
  "t.name, t.netstack, t.mac, t.mtu, t.tso_mss, t.rx_queues, "                                     \
  "t.enabled, coalesce(t.port_id, 0) FROM tvknic t "
enum TvknicColumn {
  kNicName,
  kNicNetstack,
  kNicMac,
  kNicMtu,
  kNicTsoMss,
  kNicRxQueues,
  kNicEnabled,
  kNicPortId
};

std::unique_ptr<TvkNic> ReadRow(const Statement& row) {
  TvkNicData data;
  data.name = row.Text(kNicName);
  data.netstack = row.Text(kNicNetstack);
  data.mac = row.Text(kNicMac);
  data.mtu = static_cast<uint32_t>(row.Int(kNicMtu));
  data.tsoMss = static_cast<uint32_t>(row.Int(kNicTsoMss));
  data.rxQueues = static_cast<uint32_t>(row.Int(kNicRxQueues));
  data.enabled = row.Bool(kNicEnabled);
  data.portId = row.Int(kNicPortId);
  return std::make_unique<TvkNicImpl>(std::move(data));
}

std::vector<std::unique_ptr<TvkNic>> ReadAll(Statement& rows) {
  std::vector<std::unique_ptr<TvkNic>> nics;
  while (rows.Step())
    nics.push_back(ReadRow(rows));
  return nics;
}

} // namespace

TvKernelNicInfoImpl::TvKernelNicInfoImpl() = default;
TvKernelNicInfoImpl::~TvKernelNicInfoImpl() = default;

std::vector<std::unique_ptr<TvkNic>> TvKernelNicInfoImpl::GetTvKernelNics(int selector) {
  Store& store = Store::Host();
  store.CheckFault("GetTvKernelNics", "*");
  return store.Read([&] {
    Statement rows =
        store.Prepare("SELECT " TVKNIC_COLUMNS "WHERE t.system = ? ORDER BY t.ord, t.name");
    rows.Bind(1, selector == 1);
    return ReadAll(rows);
  });
}

std::vector<std::unique_ptr<TvkNic>>
TvKernelNicInfoImpl::GetTvKernelNicsByInstanceKey(const std::string& netstack, int selector) {
  Store& store = Store::Host();
  store.CheckFault("GetTvKernelNicsByInstanceKey", netstack);
  return store.Read([&] {
    Statement rows = store.Prepare("SELECT " TVKNIC_COLUMNS
                                   "WHERE t.netstack = ? AND t.system = ? ORDER BY t.ord, t.name");
    rows.BindAll(netstack, selector == 1);
    return ReadAll(rows);
  });
}

std::unique_ptr<TvkNic> TvKernelNicInfoImpl::GetTvKernelNicByInterface(const std::string& name,
                                                                       bool /*refresh*/,
                                                                       int selector) {
  Store& store = Store::Host();
  store.CheckFault("GetTvKernelNicByInterface", name);
  return store.Read([&]() -> std::unique_ptr<TvkNic> {
    Statement row = store.Prepare("SELECT " TVKNIC_COLUMNS "WHERE t.name = ? AND t.system = ?");
    row.BindAll(name, selector == 1);
    if (!row.Step())
      return nullptr;
    return ReadRow(row);
  });
}

std::vector<std::unique_ptr<TvkNic>> TvKernelNicInfoImpl::GetTvKernelNicsByTag(TvkNicTagType tag) {
  Store& store = Store::Host();
  const char* name = TvkNicTagIdToName(tag);
  store.CheckFault("GetTvKernelNicsByTag", name ? name : "*");
  return store.Read([&] {
    Statement rows = store.Prepare("SELECT " TVKNIC_COLUMNS
                                   "JOIN tvknic_tag g ON g.nic = t.name WHERE g.tag = ? "
                                   "ORDER BY t.ord, t.name");
    rows.Bind(1, static_cast<int>(tag));
    return ReadAll(rows);
  });
}

void TvKernelNicInfoImpl::GetTvkernelNicNamesByInstanceKey(std::vector<std::string>& names,
                                                           const std::string& netstack,
                                                           int selector) {
  Store& store = Store::Host();
  store.CheckFault("GetTvkernelNicNamesByInstanceKey", netstack);
  names.clear();
  store.Read([&] {
    Statement rows = store.Prepare(
        "SELECT name FROM tvknic WHERE netstack = ? AND system = ? ORDER BY ord, name");
    enum { kName };
    rows.BindAll(netstack, selector == 1);
    while (rows.Step())
      names.push_back(rows.Text(kName));
  });
}

} // namespace Sim
