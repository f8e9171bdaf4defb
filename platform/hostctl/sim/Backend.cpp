//===- Backend.cpp - The simulated host as a backend -----------------------===//
//
// Every root of the simulated host is one of its objects; a batch is one
// store transaction.
//
//===----------------------------------------------------------------------===//
#include "sim/Backend.h"

#include "TvkCtl/Network/Switching.h"
#include "model/Store.h"
#include "sim/DcbInfoImpl.h"
#include "sim/DnsConfigImpl.h"
#include "sim/HostsFile.h"
#include "sim/IpSecConfigImpl.h"
#include "sim/ModuleImpl.h"
#include "sim/NetstackInstanceImpl.h"
#include "sim/NetworkInfoImpl.h"
#include "sim/PnicImpl.h"
#include "sim/ResourceInfoImpl.h"
#include "sim/RoutingInfoImpl.h"
#include "sim/Switching.h"
#include "sim/SystemInfoImpl.h"
#include "sim/TvkNicImpl.h"
#include "sim/WorldImpl.h"

namespace Sim {

namespace {

using namespace HostCtl;
namespace Ops = HostCtl::Backend;

class SimulatedHost final : public Ops::Backend {
public:
  std::string Describe() const override { return "the simulated host"; }

  std::unique_ptr<Ops::Network> MakeNetwork() override {
    return std::make_unique<NetworkInfoImpl>();
  }
  std::unique_ptr<Network::TvKernelNicInfo> MakeKernelNics() override {
    return std::make_unique<TvKernelNicInfoImpl>();
  }
  std::unique_ptr<Network::NetstackInstance>
  MakeNewNetstackInstance(const std::string& key, uint32_t maxConnections,
                          const std::string& ccAlgorithm, bool ipv6Enabled, uint32_t layoutVersion,
                          const std::string& ecn) override {
    return std::make_unique<NetstackInstanceImpl>(key, maxConnections, ccAlgorithm, ipv6Enabled,
                                                  layoutVersion, ecn);
  }
  std::unique_ptr<Ops::Routing> MakeRouting(const std::string& netstack) override {
    return std::make_unique<RoutingInfoImpl>(netstack);
  }
  std::unique_ptr<Ops::Switches> MakeSwitches() override {
    return std::make_unique<VirtualSwitchInfoImpl>();
  }
  std::unique_ptr<Ops::PortGroup> MakePortGroup(const std::string& name) override {
    return std::make_unique<PortGroupImpl>(name);
  }
  std::unique_ptr<Ops::DVPort> MakeDVPort(const Network::DVPortParam& param) override {
    return std::make_unique<DVPortImpl>(param);
  }
  std::unique_ptr<Ops::DVPort> MakeDVPort(const std::string& switchId,
                                          const std::string& dvPortId) override {
    return std::make_unique<DVPortImpl>(switchId, dvPortId);
  }
  std::unique_ptr<Ops::Pnic> MakePnic(const std::string& name) override {
    return std::make_unique<PnicImpl>(name);
  }
  std::unique_ptr<Ops::Dcb> MakeDcb(const std::string& nic) override {
    return std::make_unique<DcbInfoImpl>(nic);
  }
  std::unique_ptr<Ops::Dns> MakeDns(const std::string& netstack) override {
    return std::make_unique<DnsConfigImpl>(netstack);
  }
  std::unique_ptr<Ops::HostsTable> MakeHostsTable() override {
    return std::make_unique<HostsFile>();
  }
  std::unique_ptr<Ops::IpSec> MakeIpSec() override { return std::make_unique<IpSecConfigImpl>(); }
  std::unique_ptr<Ops::System> MakeSystem() override { return std::make_unique<SystemInfoImpl>(); }
  std::unique_ptr<Ops::Module> MakeModule(const std::string& name) override {
    return std::make_unique<ModuleImpl>(name);
  }
  std::unique_ptr<Ops::Resource> MakeResource() override {
    return std::make_unique<ResourceInfoImpl>();
  }

  std::unique_ptr<Network::DVSwitch> GetDVSwitchByName(const std::string& name) override {
    return Sim::GetDVSwitchByName(name);
  }
  std::unique_ptr<Network::VirtualSwitch>
  GetVirtualSwitchById(const std::string& name, Network::PortsetGetType type) override {
    return Sim::GetVirtualSwitchById(name, type);
  }
  std::unique_ptr<Network::PortGroup> GetPortGroupByName(const std::string& name) override {
    return Sim::GetPortGroupByName(name);
  }
  std::unique_ptr<Network::DVPort> GetDVPort(const Network::DVPortParam& param) override {
    return Sim::GetDVPort(param);
  }
  std::unique_ptr<SmartNic::SmartNic> GetSmartNicByPnic(const std::string& pnic) override {
    return Sim::GetSmartNicByPnic(pnic);
  }
  bool IsValidPnic(const std::string& name) override { return PnicImpl::IsValidPnic(name); }
  bool IsValidVirtualSwitch(const std::string& name) override {
    return PortsetImpl::IsValidVirtualSwitch(name);
  }
  std::string GetHwCapName(int bit) override { return PnicImpl::GetHwCapName(bit); }
  std::vector<std::string> GetCongestionControlAlgorithmList() override {
    return NetstackInstanceImpl::GetCongestionControlAlgorithmList();
  }
  std::string GetWorldName(int64_t worldId) override { return WorldImpl(worldId).GetWorldName(); }
  int Exec(const std::string& command, bool background, bool wait, bool captureOutput) override {
    return Sim::Exec(command, background, wait, captureOutput);
  }

  bool HasTransactions() const override { return true; }
  void SetLockTimeout(int milliseconds) override { Model::Store::SetLockTimeout(milliseconds); }
  void BeginCommand(bool changes) override { Model::Store::Host().BeginUnit(changes); }
  void EndCommand(bool keep) override { Model::Store::Host().EndUnit(keep); }
  void BeginBatch() override { Model::Store::Host().BeginUnit(true); }
  void EndBatch(bool commit) override { Model::Store::Host().EndUnit(commit); }
  bool BatchLost() const override { return Model::Store::Host().Lost(); }
};

} // namespace

} // namespace Sim

namespace HostCtl::Backend {

std::unique_ptr<Backend> MakeSimulatedHost(const std::string& path, bool createDemo) {
  if (!path.empty())
    Model::Store::SetPath(path, createDemo);
  return std::make_unique<Sim::SimulatedHost>();
}

} // namespace HostCtl::Backend
