//===- Sriov.cpp - SR-IOV NICs and their virtual functions ----------------===//
//
// The SR-IOV operations of the network root: the NICs with SR-IOV enabled,
// their virtual functions and the counters of one virtual function, over the
// sriov column of pnic and the sriov_vf table of model/NicPart.cpp.
//
//===----------------------------------------------------------------------===//
#include "sim/NetworkInfoImpl.h"

#include "HostCtl/Lib.h"
#include "model/NicModel.h"
#include "model/Store.h"
#include "sim/PnicImpl.h"

#include <nlohmann/json.hpp>

namespace Sim {

using HostCtl::Lib::HostCtlException;
using Model::Statement;
using Model::Store;
using namespace HostCtl::Network;

namespace {

bool IsSriovNic(Store& store, const std::string& name) {
  Statement row = store.Prepare("SELECT 1 FROM pnic WHERE name = ? AND sriov = 1");
  row.Bind(1, name);
  return row.Step();
}

/// Refuses a name that is no SR-IOV NIC of the host.
void RequireSriovNic(Store& store, const std::string& name) {
  if (!IsSriovNic(store, name)) {
    if (Model::PnicExists(store, name))
      throw HostCtlException("NIC " + name + " does not have SR-IOV enabled");
    throw HostCtlException("There is no physical NIC named " + name + " on this host");
  }
}

} // namespace

std::vector<std::unique_ptr<Pnic>> NetworkInfoImpl::GetSriovNics() {
  Store& store = Store::Host();
  store.CheckFault("GetSriovNics", "*");
  return store.Read([&] {
    std::vector<std::string> names;
    Statement rows = store.Prepare("SELECT name FROM pnic WHERE sriov = 1 ORDER BY ord");
    enum { kName };
    while (rows.Step())
      names.push_back(rows.Text(kName));
    std::vector<std::unique_ptr<Pnic>> nics;
    for (const std::string& name : names) {
      PnicData data;
      if (LoadPnicData(store, name, data))
        nics.push_back(std::make_unique<PnicImpl>(std::move(data)));
    }
    return nics;
  });
}

std::unique_ptr<Pnic> NetworkInfoImpl::GetSriovNicByName(const std::string& name) {
  Store& store = Store::Host();
  store.CheckFault("GetSriovNicByName", name);
  return store.Read([&]() -> std::unique_ptr<Pnic> {
    PnicData data;
    if (!IsSriovNic(store, name) || !LoadPnicData(store, name, data))
      return nullptr;
    return std::make_unique<PnicImpl>(std::move(data));
  });
}

std::vector<SriovNicVFInfo> NetworkInfoImpl::GetSriovNicVFInfo(const std::string& name) {
  Store& store = Store::Host();
  store.CheckFault("GetSriovNicVFInfo", name);
  return store.Read([&] {
    RequireSriovNic(store, name);
    std::vector<SriovNicVFInfo> vfs;
    Statement rows = store.Prepare("SELECT vf_id, active, pci_address, owner_world FROM sriov_vf "
                                   "WHERE nic = ? ORDER BY vf_id");
    enum { kVfId, kActive, kPciAddress, kOwnerWorld };
    rows.Bind(1, name);
    while (rows.Step())
      vfs.push_back({static_cast<uint8_t>(rows.Int(kVfId)), rows.Bool(kActive),
                     rows.Text(kPciAddress), rows.Text(kOwnerWorld)});
    return vfs;
  });
}

void NetworkInfoImpl::GetSriovNicVFStats(SriovNicVFStats& stats, const std::string& name,
                                         int vfId) {
  Store& store = Store::Host();
  store.CheckFault("GetSriovNicVFStats", name);
  std::string text = store.Read([&] {
    RequireSriovNic(store, name);
    Statement row = store.Prepare("SELECT counters FROM sriov_vf WHERE nic = ? AND vf_id = ?");
    enum { kCounters };
    row.BindAll(name, vfId);
    if (!row.Step())
      throw HostCtlException("NIC " + name + " has no VF with ID " + std::to_string(vfId));
    return row.Text(kCounters);
  });
  nlohmann::json counters = nlohmann::json::parse(text);
  for (const auto& key : Model::kVfStatsKeys)
    stats.*key.member = counters.value(key.key, uint64_t{0});
}

} // namespace Sim
