//===- NetworkInfoImpl.cpp - Physical NICs of the network root ------------===//
#include "sim/NetworkInfoImpl.h"

#include "HostCtl/SmartNic.h"
#include "model/Store.h"
#include "sim/PnicImpl.h"

namespace Sim {

using Model::Statement;
using Model::Store;

NetworkInfoImpl::NetworkInfoImpl() = default;
NetworkInfoImpl::~NetworkInfoImpl() = default;

std::vector<std::unique_ptr<HostCtl::Network::Pnic>>
NetworkInfoImpl::GetPnics(HostCtl::Network::PnicGetType type) {
  Store& store = Store::Host();
  store.CheckFault("GetPnics", "*");
  std::vector<std::unique_ptr<HostCtl::Network::Pnic>> nics;
  store.Read([&] {
    for (PnicData& data : ListPnicData(store))
      nics.push_back(std::make_unique<PnicImpl>(std::move(data)));
  });
  return nics;
}

std::unique_ptr<HostCtl::Network::Pnic> NetworkInfoImpl::GetPnicByName(const std::string& name) {
  Store& store = Store::Host();
  store.CheckFault("GetPnicByName", name);
  PnicData data;
  bool found = store.Read([&] { return LoadPnicData(store, name, data); });
  if (!found)
    return nullptr;
  return std::make_unique<PnicImpl>(std::move(data));
}

} // namespace Sim

namespace Sim {

using HostCtl::SmartNic::SmartNic;

namespace {
class SmartNicImpl : public SmartNic {
public:
  explicit SmartNicImpl(std::string id) : id_(std::move(id)) {}
  std::string GetId() const override { return id_; }

private:
  std::string id_; ///< DPU identifier.
};
} // namespace

std::unique_ptr<SmartNic> GetSmartNicByPnic(const std::string& pnicName) {
  Model::Store& store = Model::Store::Host();
  store.CheckFault("GetSmartNicByPnic", pnicName);
  return store.Read([&]() -> std::unique_ptr<SmartNic> {
    Model::Statement row =
        store.Prepare("SELECT dpu_id FROM pnic WHERE name = ? AND dpu_id IS NOT NULL");
    enum { kDpuId };
    row.Bind(1, pnicName);
    if (!row.Step())
      return nullptr;
    return std::make_unique<SmartNicImpl>(row.Text(kDpuId));
  });
}

} // namespace Sim
