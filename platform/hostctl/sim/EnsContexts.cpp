//===- EnsContexts.cpp - ENS contexts of the network root -----------------===//
//
// The rules (docs/ens.md): ids lie in [0, limit - 1], where the limit is the
// number of logical cores the host can dedicate to the fast path; the maximum
// lies in [0, limit]; a context's switch is a switch of the host and its
// affinity a NUMA node of the host. An argument that breaks these rules, or
// names a context that does not exist, throws HostCtlException; a valid
// request that the current state declines answers false: creating a context
// that exists or one beyond the maximum, lowering the maximum below the
// number of contexts, destroying a context still associated with a switch.
//
//===----------------------------------------------------------------------===//
#include "sim/NetworkInfoImpl.h"

#include "HostCtl/Lib.h"
#include "model/CoreModel.h"
#include "model/DatapathModel.h"

namespace Sim {

using HostCtl::Lib::HostCtlException;
using Model::Statement;
using Model::Store;

namespace {

/// The switch name that clears a context's association.
const char* const kNoSwitch = "null";

int64_t IntSetting(Store& store, const char* key, int64_t fallback) {
  std::optional<std::string> value = Model::GetSetting(store, key);
  return value ? std::stoll(*value) : fallback;
}

/// Refuses an id outside the host's range.
void CheckId(Store& store, int64_t id) {
  int64_t limit = IntSetting(store, Model::kEnsLcoreLimitKey, Model::kEnsDefaultLcoreLimit);
  if (id < 0 || id >= limit)
    throw HostCtlException("ENS context id " + std::to_string(id) + " is out of range [0 - " +
                           std::to_string(limit - 1) + "]");
}

/// Whether context \p id exists.
bool Exists(Store& store, int64_t id) {
  Statement row = store.Prepare("SELECT 1 FROM ens_lcore WHERE id = ?");
  row.Bind(1, id);
  return row.Step();
}

/// Refuses an id that names no context.
void RequireContext(Store& store, int64_t id) {
  CheckId(store, id);
  if (!Exists(store, id))
    throw HostCtlException("There is no ENS context with id " + std::to_string(id));
}

int64_t CountContexts(Store& store) {
  Statement count = store.Prepare("SELECT count(*) FROM ens_lcore");
  enum { kCount };
  count.Step();
  return count.Int(kCount);
}

std::string Object(int64_t id) {
  return std::to_string(id);
}

} // namespace

int64_t NetworkInfoImpl::GetEnsMaxLcores() {
  Store& store = Store::Host();
  store.CheckFault("GetEnsMaxLcores", "*");
  return store.Read(
      [&] { return IntSetting(store, Model::kEnsMaxLcoresKey, Model::kEnsDefaultMaxLcores); });
}

bool NetworkInfoImpl::SetEnsMaxLcores(int64_t count) {
  Store& store = Store::Host();
  store.CheckFault("SetEnsMaxLcores", "*");
  return store.Write([&] {
    int64_t limit = IntSetting(store, Model::kEnsLcoreLimitKey, Model::kEnsDefaultLcoreLimit);
    if (count < 0 || count > limit)
      throw HostCtlException("The maximum number of ENS contexts " + std::to_string(count) +
                             " is out of range [0 - " + std::to_string(limit) + "]");
    if (count < CountContexts(store))
      return false;
    Model::PutSetting(store, Model::kEnsMaxLcoresKey, std::to_string(count));
    return true;
  });
}

std::vector<int64_t> NetworkInfoImpl::GetEnsLcores() {
  Store& store = Store::Host();
  store.CheckFault("GetEnsLcores", "*");
  return store.Read([&] {
    std::vector<int64_t> ids;
    Statement rows = store.Prepare("SELECT id FROM ens_lcore ORDER BY id");
    enum { kId };
    while (rows.Step())
      ids.push_back(rows.Int(kId));
    return ids;
  });
}

bool NetworkInfoImpl::AddEnsLcore(int64_t id) {
  Store& store = Store::Host();
  store.CheckFault("AddEnsLcore", Object(id));
  return store.Write([&] {
    CheckId(store, id);
    int64_t max = IntSetting(store, Model::kEnsMaxLcoresKey, Model::kEnsDefaultMaxLcores);
    if (Exists(store, id) || CountContexts(store) >= max)
      return false;
    store.Prepare("INSERT INTO ens_lcore(id) VALUES(?)").Bind(1, id).Run();
    return true;
  });
}

bool NetworkInfoImpl::RemoveEnsLcore(int64_t id) {
  Store& store = Store::Host();
  store.CheckFault("RemoveEnsLcore", Object(id));
  return store.Write([&] {
    RequireContext(store, id);
    store.Prepare("DELETE FROM ens_lcore WHERE id = ? AND portset_id IS NULL").Bind(1, id).Run();
    return store.Changes() > 0;
  });
}

std::string NetworkInfoImpl::GetEnsLcoreSwitch(int64_t id) {
  Store& store = Store::Host();
  store.CheckFault("GetEnsLcoreSwitch", Object(id));
  return store.Read([&] {
    RequireContext(store, id);
    Statement row = store.Prepare(
        "SELECT p.name FROM ens_lcore l JOIN portset p ON p.id = l.portset_id WHERE l.id = ?");
    enum { kName };
    row.Bind(1, id);
    return row.Step() ? row.Text(kName) : std::string();
  });
}

int32_t NetworkInfoImpl::GetEnsLcoreAffinity(int64_t id) {
  Store& store = Store::Host();
  store.CheckFault("GetEnsLcoreAffinity", Object(id));
  return store.Read([&] {
    RequireContext(store, id);
    Statement row = store.Prepare("SELECT affinity FROM ens_lcore WHERE id = ?");
    enum { kAffinity };
    row.Bind(1, id);
    row.Step();
    return static_cast<int32_t>(row.Int(kAffinity));
  });
}

bool NetworkInfoImpl::SetEnsLcoreSwitch(const std::string& name, int64_t id) {
  Store& store = Store::Host();
  store.CheckFault("SetEnsLcoreSwitch", Object(id));
  return store.Write([&] {
    RequireContext(store, id);
    if (name == kNoSwitch) {
      store.Prepare("UPDATE ens_lcore SET portset_id = NULL WHERE id = ?").Bind(1, id).Run();
      return true;
    }
    Statement portset = store.Prepare("SELECT id FROM portset WHERE name = ?");
    enum { kId };
    portset.Bind(1, name);
    if (!portset.Step())
      throw HostCtlException("There is no virtual switch named " + name);
    int64_t portsetId = portset.Int(kId);
    store.Prepare("UPDATE ens_lcore SET portset_id = ? WHERE id = ?").BindAll(portsetId, id).Run();
    return true;
  });
}

bool NetworkInfoImpl::SetEnsLcoreAffinity(int64_t affinity, int64_t id) {
  Store& store = Store::Host();
  store.CheckFault("SetEnsLcoreAffinity", Object(id));
  return store.Write([&] {
    RequireContext(store, id);
    int64_t nodes = IntSetting(store, Model::kEnsNumaNodesKey, Model::kEnsDefaultNumaNodes);
    if (affinity < 0 || affinity >= nodes)
      throw HostCtlException("The host has no NUMA node " + std::to_string(affinity) +
                             " (nodes 0 - " + std::to_string(nodes - 1) + ")");
    store.Prepare("UPDATE ens_lcore SET affinity = ? WHERE id = ?").BindAll(affinity, id).Run();
    return true;
  });
}

} // namespace Sim
