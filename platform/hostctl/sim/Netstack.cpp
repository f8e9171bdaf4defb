//===- Netstack.cpp - Netstack instances and the kernel IPv6 switch -------===//
//
// Netstack instances live in the netstack table. An instance created in the
// kernel has state 4660; its running maximum connection count and IPv6 switch
// are taken from the configured ones when it is created (added enabled, or
// enabled later). The kernel's IPv6 switch is kept as two settings: the
// running value and the value configured for the next boot.
//
//===----------------------------------------------------------------------===//
#include "sim/NetstackInstanceImpl.h"

#include "HostCtl/Lib.h"
#include "model/CoreModel.h"
#include "model/IpModel.h"
#include "model/Store.h"
#include "sim/NetworkInfoImpl.h"
#include "sim/TvkNicImpl.h"

#include <algorithm>

namespace Sim {

using HostCtl::Lib::HostCtlException;
using HostCtl::Network::NetstackInstance;
using Model::Statement;
using Model::Store;
namespace Ip = Model::Ip;

namespace {

bool Contains(const std::vector<std::string>& list, const std::string& value) {
  return std::find(list.begin(), list.end(), value) != list.end();
}

bool KernelIpv6Running(Store& store) {
  return Model::GetSetting(store, Ip::kIpv6RunningSetting).value_or("1") != "0";
}

#define NETSTACK_COLUMNS                                                                           \
  "key, name, state, max_conn, cur_max_conn, ccalgo, ipv6, cur_ipv6, ecn FROM netstack "
enum NetstackColumn {
  kNetstackKey,
  kNetstackName,
  kNetstackState,
  kNetstackMaxConn,
  kNetstackCurMaxConn,
  kNetstackCcalgo,
  kNetstackIpv6,
  kNetstackCurIpv6,
  kNetstackEcn
};

/// One row of NETSTACK_COLUMNS.
NetstackData ReadNetstack(const Statement& row, bool kernelIpv6) {
  NetstackData data;
  data.key = row.Text(kNetstackKey);
  data.name = row.Text(kNetstackName);
  data.state = static_cast<uint32_t>(row.Int(kNetstackState));
  data.maxConnections = static_cast<uint32_t>(row.Int(kNetstackMaxConn));
  data.curMaxConnections = static_cast<uint32_t>(row.Int(kNetstackCurMaxConn));
  data.ccAlgorithm = row.Text(kNetstackCcalgo);
  data.ipv6 = row.Bool(kNetstackIpv6);
  data.curIpv6 = row.Bool(kNetstackCurIpv6) && kernelIpv6;
  data.ecn = row.Text(kNetstackEcn);
  return data;
}

/// Reads instance \p key; false when there is none.
bool LoadNetstack(Store& store, const std::string& key, NetstackData& data) {
  Statement row = store.Prepare("SELECT " NETSTACK_COLUMNS "WHERE key = ?");
  row.Bind(1, key);
  if (!row.Step())
    return false;
  data = ReadNetstack(row, KernelIpv6Running(store));
  return true;
}

void RequireNetstack(Store& store, const std::string& key) {
  Statement row = store.Prepare("SELECT 1 FROM netstack WHERE key = ?");
  row.Bind(1, key);
  if (!row.Step())
    throw HostCtlException("Netstack instance " + key + " does not exist");
}

/// Throws when instance \p key still has interfaces; \p doing names the refused
/// action.
void RequireNoInterfaces(Store& store, const std::string& key, const std::string& doing) {
  Statement rows = store.Prepare("SELECT name FROM tvknic WHERE netstack = ? ORDER BY ord, name");
  enum { kName };
  rows.Bind(1, key);
  std::string names;
  while (rows.Step())
    names += (names.empty() ? "" : ", ") + rows.Text(kName);
  if (!names.empty())
    throw HostCtlException("Netstack instance " + key + " cannot be " + doing +
                           " while it has Tarvik network interfaces (" + names + ")");
}

void CheckMaxConnections(uint32_t value) {
  if (value < NetstackInstanceImpl::MIN_MAX_CONNECTIONS ||
      value > NetstackInstanceImpl::MAX_MAX_CONNECTIONS)
    throw HostCtlException("Maximum connections " + std::to_string(value) +
                           " is out of range; it must be " +
                           std::to_string(NetstackInstanceImpl::MIN_MAX_CONNECTIONS) + " to " +
                           std::to_string(NetstackInstanceImpl::MAX_MAX_CONNECTIONS));
}

void CheckCongestionControl(const std::string& name) {
  if (!Contains(Ip::CongestionControlAlgorithms(), name))
    throw HostCtlException("Unknown congestion control algorithm " + name);
}

void CheckEcn(const std::string& status) {
  if (!Contains(Ip::EcnModes(), status))
    throw HostCtlException("Unknown ECN status " + status +
                           "; it must be disabled, enabled or echo-only");
}

} // namespace

// --- NetstackInstanceImpl ----------------------------------------------------

NetstackInstanceImpl::NetstackInstanceImpl(std::string key, uint32_t maxConnections,
                                           std::string ccAlgorithm, bool ipv6Enabled,
                                           uint32_t /*layoutVersion*/, std::string ecn)
    : onHost_(false) {
  data_.key = std::move(key);
  data_.name = data_.key;
  data_.state = STATE_DISABLED;
  data_.maxConnections = maxConnections;
  data_.curMaxConnections = maxConnections;
  data_.ccAlgorithm = std::move(ccAlgorithm);
  data_.ipv6 = ipv6Enabled;
  data_.curIpv6 = ipv6Enabled;
  data_.ecn = std::move(ecn);
}

NetstackInstanceImpl::NetstackInstanceImpl(NetstackData data)
    : data_(std::move(data)), onHost_(true) {}

NetstackInstanceImpl::~NetstackInstanceImpl() = default;

std::vector<std::string> NetstackInstanceImpl::GetCongestionControlAlgorithmList() {
  return Ip::CongestionControlAlgorithms();
}

void NetstackInstanceImpl::Refresh() {
  stale_ = false;
  if (!onHost_)
    return;
  Store& store = Store::Host();
  store.CheckFault("Refresh", data_.key);
  NetstackData fresh;
  if (!store.Read([&] { return LoadNetstack(store, data_.key, fresh); }))
    throw HostCtlException("Netstack instance " + data_.key + " does not exist");
  data_ = std::move(fresh);
}

#define NETSTACK_GETTER(Type, Name, member)                                                        \
  Type NetstackInstanceImpl::Name() {                                                              \
    if (stale_)                                                                                    \
      Refresh();                                                                                   \
    return data_.member;                                                                           \
  }

NETSTACK_GETTER(std::string, GetKey, key)
NETSTACK_GETTER(std::string, GetInstanceName, name)
NETSTACK_GETTER(uint32_t, GetState, state)
NETSTACK_GETTER(uint32_t, GetMaxConnections, maxConnections)
NETSTACK_GETTER(uint32_t, GetCurrentMaxConnections, curMaxConnections)
NETSTACK_GETTER(std::string, GetCongestionControlAlgorithm, ccAlgorithm)
NETSTACK_GETTER(bool, GetIpv6Enabled, ipv6)
NETSTACK_GETTER(bool, GetCurrentIpv6Enabled, curIpv6)
NETSTACK_GETTER(std::string, GetEcnStatus, ecn)

#undef NETSTACK_GETTER

namespace {

/// Runs \p sql, an UPDATE of one column of netstack \p key whose parameters
/// are \p value and the key, as host operation \p operation: its declared
/// fault first, then one write transaction that requires the instance.
template <typename Value>
void UpdateNetstack(const char* operation, const std::string& key, const char* sql,
                    const Value& value) {
  Store& store = Store::Host();
  store.CheckFault(operation, key);
  store.Write([&] {
    RequireNetstack(store, key);
    store.Prepare(sql).BindAll(value, key).Run();
  });
}

} // namespace

void NetstackInstanceImpl::SetInstanceName(const std::string& name, bool persist) {
  if (name.empty() || name.size() > 64)
    throw HostCtlException("A netstack instance name must have 1 to 64 characters");
  if (persist && onHost_)
    UpdateNetstack("SetInstanceName", data_.key, "UPDATE netstack SET name = ? WHERE key = ?",
                   name);
  data_.name = name;
}

void NetstackInstanceImpl::Enable() {
  if (!onHost_) {
    data_.state = STATE_ENABLED;
    return;
  }
  Store& store = Store::Host();
  store.CheckFault("Enable", data_.key);
  store.Write([&] {
    RequireNetstack(store, data_.key);
    store
        .Prepare("UPDATE netstack SET state = ?, cur_max_conn = max_conn, cur_ipv6 = ipv6 "
                 "WHERE key = ? AND state <> ?")
        .BindAll(STATE_ENABLED, data_.key, STATE_ENABLED)
        .Run();
  });
  stale_ = true;
}

void NetstackInstanceImpl::Disable() {
  if (!onHost_) {
    data_.state = STATE_DISABLED;
    return;
  }
  Store& store = Store::Host();
  store.CheckFault("Disable", data_.key);
  if (data_.key == Ip::kDefaultNetstack)
    throw HostCtlException("The default netstack instance " + data_.key + " cannot be disabled");
  store.Write([&] {
    RequireNetstack(store, data_.key);
    RequireNoInterfaces(store, data_.key, "disabled");
    store.Prepare("UPDATE netstack SET state = ? WHERE key = ?")
        .BindAll(STATE_DISABLED, data_.key)
        .Run();
  });
  stale_ = true;
}

void NetstackInstanceImpl::SetMaxConnections(uint32_t value, bool persist) {
  CheckMaxConnections(value);
  if (persist && onHost_)
    UpdateNetstack("SetMaxConnections", data_.key, "UPDATE netstack SET max_conn = ? WHERE key = ?",
                   value);
  data_.maxConnections = value;
}

void NetstackInstanceImpl::SetCongestionControlAlgorithm(const std::string& name, bool persist) {
  CheckCongestionControl(name);
  if (persist && onHost_)
    UpdateNetstack("SetCongestionControlAlgorithm", data_.key,
                   "UPDATE netstack SET ccalgo = ? WHERE key = ?", name);
  data_.ccAlgorithm = name;
}

void NetstackInstanceImpl::SetIpv6Enabled(bool enabled, bool persist) {
  if (persist && onHost_)
    UpdateNetstack("SetIpv6Enabled", data_.key, "UPDATE netstack SET ipv6 = ? WHERE key = ?",
                   enabled);
  data_.ipv6 = enabled;
}

void NetstackInstanceImpl::SetEcnStatus(const std::string& status) {
  CheckEcn(status);
  if (onHost_)
    UpdateNetstack("SetEcnStatus", data_.key, "UPDATE netstack SET ecn = ? WHERE key = ?", status);
  data_.ecn = status;
}

// --- NetworkInfoImpl: netstacks and the kernel IPv6 switch --------------------

std::vector<std::unique_ptr<NetstackInstance>> NetworkInfoImpl::ListNetstackInstances() {
  Store& store = Store::Host();
  store.CheckFault("ListNetstackInstances", "*");
  return store.Read([&] {
    std::vector<std::unique_ptr<NetstackInstance>> stacks;
    bool kernelIpv6 = KernelIpv6Running(store);
    Statement rows = store.Prepare("SELECT " NETSTACK_COLUMNS "ORDER BY ord, key");
    while (rows.Step())
      stacks.push_back(std::make_unique<NetstackInstanceImpl>(ReadNetstack(rows, kernelIpv6)));
    return stacks;
  });
}

std::unique_ptr<NetstackInstance>
NetworkInfoImpl::LookupNetstackInstanceByKey(const std::string& key) {
  Store& store = Store::Host();
  store.CheckFault("LookupNetstackInstanceByKey", key);
  NetstackData data;
  if (!store.Read([&] { return LoadNetstack(store, key, data); }))
    return nullptr;
  return std::make_unique<NetstackInstanceImpl>(std::move(data));
}

void NetworkInfoImpl::AddNetstackInstance(NetstackInstance& instance, bool disabled) {
  Store& store = Store::Host();
  std::string key = instance.GetKey();
  store.CheckFault("AddNetstackInstance", key);
  if (!Ip::IsValidNetstackKey(key))
    throw HostCtlException("Invalid netstack instance key \"" + key +
                           "\": use 1 to 32 letters, digits, \"-\" or \"_\"");
  uint32_t maxConn = instance.GetMaxConnections();
  CheckMaxConnections(maxConn);
  std::string cc = instance.GetCongestionControlAlgorithm();
  CheckCongestionControl(cc);
  std::string ecn = instance.GetEcnStatus();
  CheckEcn(ecn);
  bool ipv6 = instance.GetIpv6Enabled();
  store.Write([&] {
    Statement exists = store.Prepare("SELECT 1 FROM netstack WHERE key = ?");
    exists.Bind(1, key);
    if (exists.Step())
      throw HostCtlException("Netstack instance " + key + " already exists");
    Statement count = store.Prepare(
        "SELECT count(*) AS instances, coalesce(max(ord), 0) + 1 AS next_ord FROM netstack");
    enum { kInstances, kNextOrd };
    count.Step();
    if (count.Int(kInstances) >= 32)
      throw HostCtlException("The host has the largest number of netstack instances (32)");
    store
        .Prepare("INSERT INTO netstack(key, ord, name, state, max_conn, cur_max_conn, ccalgo, "
                 "ipv6, cur_ipv6, ecn, predefined) VALUES(?,?,?,?,?,?,?,?,?,?,?)")
        .BindAll(key, count.Int(kNextOrd), instance.GetInstanceName(),
                 disabled ? NetstackInstance::STATE_DISABLED : NetstackInstance::STATE_ENABLED,
                 maxConn, maxConn, cc, ipv6, ipv6, ecn, Contains(Ip::PredefinedNetstacks(), key))
        .Run();
  });
}

void NetworkInfoImpl::RemoveNetstackInstance(const std::string& key, bool /*force*/) {
  Store& store = Store::Host();
  store.CheckFault("RemoveNetstackInstance", key);
  store.Write([&] {
    RequireNetstack(store, key);
    if (key == Ip::kDefaultNetstack)
      throw HostCtlException("The default netstack instance " + key + " cannot be removed");
    RequireNoInterfaces(store, key, "removed");
    store.Prepare("DELETE FROM netstack WHERE key = ?").Bind(1, key).Run();
  });
}

uint32_t NetworkInfoImpl::GetNetstackInstanceState(const std::string& key) {
  Store& store = Store::Host();
  store.CheckFault("GetNetstackInstanceState", key);
  return store.Read([&] {
    Statement row = store.Prepare("SELECT state FROM netstack WHERE key = ?");
    enum { kState };
    row.Bind(1, key);
    return row.Step() ? static_cast<uint32_t>(row.Int(kState)) : NetstackInstance::STATE_DISABLED;
  });
}

std::vector<std::string> NetworkInfoImpl::GetPredefinedNetstackInstances() {
  Store::Host().CheckFault("GetPredefinedNetstackInstances", "*");
  return Ip::PredefinedNetstacks();
}

bool NetworkInfoImpl::IsTvkIpv6Enabled() {
  Store& store = Store::Host();
  store.CheckFault("IsTvkIpv6Enabled", "*");
  return store.Read(
      [&] { return Model::GetSetting(store, Ip::kIpv6ConfiguredSetting).value_or("1") != "0"; });
}

void NetworkInfoImpl::SetTvkIpv6Enabled(bool enabled) {
  Store& store = Store::Host();
  store.CheckFault("SetTvkIpv6Enabled", "*");
  store.Write([&] { Model::PutSetting(store, Ip::kIpv6ConfiguredSetting, enabled ? "1" : "0"); });
}

std::unique_ptr<HostCtl::Network::TvKernelNicInfo> NetworkInfoImpl::GetTvKernelNicInfo() {
  return std::make_unique<TvKernelNicInfoImpl>();
}

} // namespace Sim
