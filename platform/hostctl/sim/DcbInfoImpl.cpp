//===- DcbInfoImpl.cpp - DCB state of a physical NIC ----------------------===//
//
// Every operation checks for a declared fault named after it, then reads the
// NIC's DCB record in a read transaction.
//
//===----------------------------------------------------------------------===//
#include "sim/DcbInfoImpl.h"

#include "HostCtl/Lib.h"
#include "model/NicHwModel.h"

namespace Sim {

using HostCtl::Lib::HostCtlException;
using Model::Store;
using namespace HostCtl::Network;

namespace {

/// The DCB state of \p nic after the fault check of \p operation.
Model::DcbState ReadDcb(const char* operation, const std::string& nic) {
  Store& store = Store::Host();
  store.CheckFault(operation, nic);
  return store.Read([&] {
    if (!Model::NicHwPnicExists(store, nic))
      throw HostCtlException("There is no physical NIC named " + nic + " on this host");
    std::string text;
    if (!Model::LoadNicHwRecord(store, nic, "dcb", text))
      throw HostCtlException(nic + " does not support DCB");
    Model::DcbState state;
    try {
      Model::Decode(nlohmann::ordered_json::parse(text), nic + ".dcb", state);
    } catch (const std::exception& e) {
      throw HostCtlException("The stored DCB record of " + nic + " is damaged: " + e.what());
    }
    return state;
  });
}

} // namespace

DcbInfoImpl::DcbInfoImpl(std::string nic) : nic_(std::move(nic)) {}
DcbInfoImpl::~DcbInfoImpl() = default;

uint32_t DcbInfoImpl::GetMode() const {
  return ReadDcb("GetMode", nic_).mode;
}

bool DcbInfoImpl::IsEnabled() const {
  return ReadDcb("IsEnabled", nic_).enabled;
}

DcbCapabilities DcbInfoImpl::GetCapabilities() const {
  return ReadDcb("GetCapabilities", nic_).caps;
}

bool DcbInfoImpl::IsPfcEnabled() const {
  return ReadDcb("IsPfcEnabled", nic_).pfcEnabled;
}

uint8_t DcbInfoImpl::GetPfcConfig() const {
  return ReadDcb("GetPfcConfig", nic_).pfcConfig;
}

DcbIeeeEtsConfig DcbInfoImpl::GetIeeeEtsConfig() const {
  return ReadDcb("GetIeeeEtsConfig", nic_).ets;
}

DcbIeeePfcConfig DcbInfoImpl::GetIeeePfcConfig() const {
  return ReadDcb("GetIeeePfcConfig", nic_).pfc;
}

std::vector<DcbAppInfo> DcbInfoImpl::GetAppInfo() const {
  return ReadDcb("GetAppInfo", nic_).apps;
}

} // namespace Sim
