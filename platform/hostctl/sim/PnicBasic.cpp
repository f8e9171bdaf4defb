//===- PnicBasic.cpp - Information, link modes, pause, counters of a NIC ---===//
//
// The NIC information record (ports, link modes, PHY, transceiver, wake-on,
// message level), pause parameters, driver information, speed and duplex,
// negotiation restart, uplink attachments and packet counters of one
// physical NIC, over the side tables of model/NicPart.cpp.
//
//===----------------------------------------------------------------------===//
#include "sim/PnicImpl.h"

#include "HostCtl/Lib.h"
#include "model/NicModel.h"
#include "model/Store.h"

#include <algorithm>
#include <nlohmann/json.hpp>

namespace Sim {

using HostCtl::Lib::HostCtlException;
using Model::Statement;
using Model::Store;
using namespace HostCtl::Network;

namespace {

/// Port names for messages, by port code.
const char* const kPortNames[] = {"TP", "AUI", "BNC", "MII", "FIBRE", "DA", "BACKPLANE"};

std::string PortName(uint32_t code) {
  return code < std::size(kPortNames) ? kPortNames[code] : std::to_string(code);
}

std::string DuplexName(uint32_t code) {
  return code == 1 ? "full" : code == 2 ? "half" : "code " + std::to_string(code);
}

/// Whether \p mode offers \p speed at \p duplex (a mode of duplex 0 offers both).
bool Offers(const PnicLinkMode& mode, uint32_t speed, uint32_t duplex) {
  return mode.speed == speed && (mode.duplex == duplex || mode.duplex == 0);
}

} // namespace

void PnicImpl::GetPnicInfo(PnicInfo& info, int, int) const {
  Store& store = Store::Host();
  store.CheckFault("GetPnicInfo", data_.name);
  const PnicData& data = Data();
  Model::NicSettings settings =
      store.Read([&] { return Model::LoadNicSettings(store, data.name); });
  info = std::move(settings.info);
  info.linkStatus = data.adminUp && data.carrier ? "Up" : "Down";
}

void PnicImpl::GetPauseParams(PnicPauseParams& params) const {
  Store& store = Store::Host();
  store.CheckFault("GetPauseParams", data_.name);
  const PnicData& data = Data();
  Model::NicSettings settings =
      store.Read([&] { return Model::LoadNicSettings(store, data.name); });
  params = settings.pause;
  // Pause autonegotiation has a result only while the link is up.
  bool resolved = params.supported && params.autoNegotiation && data.adminUp && data.carrier;
  params.rxResolution = resolved ? (params.rx ? 1 : 2) : 0;
  params.txResolution = resolved ? (params.tx ? 1 : 2) : 0;
}

void PnicImpl::SetPauseParams(const PnicPauseParams& params) {
  Store& store = Store::Host();
  store.CheckFault("SetPauseParams", data_.name);
  store.Write([&] {
    if (!Model::PnicExists(store, data_.name))
      throw HostCtlException("There is no physical NIC named " + data_.name + " on this host");
    Model::NicSettings settings = Model::LoadNicSettings(store, data_.name);
    if (!settings.pause.supported)
      throw HostCtlException("NIC " + data_.name + " does not support pause parameters");
    settings.pause.autoNegotiation = params.autoNegotiation;
    settings.pause.rx = params.rx;
    settings.pause.tx = params.tx;
    Model::SaveNicSettings(store, data_.name, settings);
  });
}

void PnicImpl::GetDriverInfo(PnicDriverInfo& info) const {
  Store& store = Store::Host();
  store.CheckFault("GetDriverInfo", data_.name);
  const PnicData& data = Data();
  Model::NicSettings settings =
      store.Read([&] { return Model::LoadNicSettings(store, data.name); });
  info.driver = data.driver;
  info.version = settings.driverVersion;
  info.firmwareVersion = settings.firmwareVersion;
  info.busInfo = data.hasPci ? data.pciAddress : "N/A";
}

void PnicImpl::SetPnicInfo(const PnicInfo& info) {
  Store& store = Store::Host();
  store.CheckFault("SetPnicInfo", data_.name);
  const std::string& name = data_.name;
  store.Write([&] {
    if (!Model::PnicExists(store, name))
      throw HostCtlException("There is no physical NIC named " + name + " on this host");
    Model::NicSettings settings = Model::LoadNicSettings(store, name);
    PnicInfo& current = settings.info;
    if (info.portChanged) {
      if (info.port >= std::size(kPortNames))
        throw HostCtlException("Invalid port code " + std::to_string(info.port));
      if (std::find(current.supportedPorts.begin(), current.supportedPorts.end(), info.port) ==
          current.supportedPorts.end())
        throw HostCtlException("Port " + PortName(info.port) + " is not supported by NIC " + name);
      current.port = info.port;
    }
    if (info.phyAddressChanged) {
      if (info.phyAddress > 31)
        throw HostCtlException("Invalid PHY address " + std::to_string(info.phyAddress) +
                               " for NIC " + name + ": PHY addresses are 0 to 31");
      current.phyAddress = info.phyAddress;
    }
    if (info.virtualAddressChanged)
      current.virtualAddress = info.virtualAddress;
    if (info.transceiverChanged) {
      if (info.transceiver > 1)
        throw HostCtlException("Invalid transceiver code " + std::to_string(info.transceiver));
      current.transceiver = info.transceiver;
    }
    if (info.wakeOnChanged) {
      if (!current.supportsWakeOn)
        throw HostCtlException("NIC " + name + " does not support wake-on-LAN");
      for (uint32_t code : info.wakeOn)
        if (code > WakeOnSecureOn)
          throw HostCtlException("Invalid wake-on mode code " + std::to_string(code));
      current.wakeOn = info.wakeOn;
    }
    if (info.messageLevelChanged) {
      if (!current.messageLevelSupported)
        throw HostCtlException("The driver of NIC " + name + " has no message level");
      current.messageLevel = info.messageLevel;
    }
    Model::SaveNicSettings(store, name, settings);
  });
}

void PnicImpl::SetSpeedDuplex(uint32_t speed, uint32_t duplex) {
  Store& store = Store::Host();
  store.CheckFault("SetSpeedDuplex", data_.name);
  const std::string& name = data_.name;
  store.Write([&] {
    if (!Model::PnicExists(store, name))
      throw HostCtlException("There is no physical NIC named " + name + " on this host");
    Model::NicSettings settings = Model::LoadNicSettings(store, name);
    const std::vector<PnicLinkMode>& modes = settings.info.advertisedModes;
    uint32_t newSpeed = 0;
    uint32_t newDuplex = 0;
    if (speed == 0 && duplex == 0) {
      // Autonegotiation settles on the fastest advertised mode, full duplex
      // before half.
      settings.info.autoNegotiation = true;
      for (const PnicLinkMode& mode : modes) {
        uint32_t modeDuplex = mode.duplex == 0 ? 1 : mode.duplex;
        if (mode.speed > newSpeed || (mode.speed == newSpeed && modeDuplex == 1)) {
          newSpeed = mode.speed;
          newDuplex = modeDuplex;
        }
      }
    } else {
      if (speed == 0 || (duplex != 1 && duplex != 2))
        throw HostCtlException("Invalid speed " + std::to_string(speed) + " and duplex " +
                               DuplexName(duplex) + " for NIC " + name);
      if (std::none_of(modes.begin(), modes.end(),
                       [&](const PnicLinkMode& mode) { return Offers(mode, speed, duplex); }))
        throw HostCtlException("NIC " + name + " does not support " + std::to_string(speed) +
                               " Mbps at " + DuplexName(duplex) + " duplex");
      settings.info.autoNegotiation = false;
      newSpeed = speed;
      newDuplex = duplex;
    }
    Model::SaveNicSettings(store, name, settings);
    if (newSpeed != 0)
      store.Prepare("UPDATE pnic SET speed = ?, duplex = ? WHERE name = ?")
          .BindAll(newSpeed, newDuplex, name)
          .Run();
  });
  stale_ = true;
}

void PnicImpl::RestartNegotiation() {
  Store& store = Store::Host();
  store.CheckFault("RestartNegotiation", data_.name);
  Refresh();
  const PnicData& data = Data();
  Model::NicSettings settings =
      store.Read([&] { return Model::LoadNicSettings(store, data.name); });
  if (!data.adminUp)
    throw HostCtlException("Cannot restart negotiation on NIC " + data.name + ": the NIC is down");
  if (!settings.info.autoNegotiation)
    throw HostCtlException("Cannot restart negotiation on NIC " + data.name +
                           ": autonegotiation is off");
}

void PnicImpl::AttachBranch(const std::string& branch, uint16_t vlanId) {
  Store& store = Store::Host();
  store.CheckFault("AttachBranch", data_.name);
  store.Write([&] { Model::AddAttachment(store, data_.name, branch, vlanId); });
}

void PnicImpl::DetachBranch(const std::string& branch) {
  Store& store = Store::Host();
  store.CheckFault("DetachBranch", data_.name);
  store.Write([&] {
    if (!Model::PnicExists(store, data_.name))
      throw HostCtlException("There is no physical NIC named " + data_.name + " on this host");
    store.Prepare("DELETE FROM pnic_attachment WHERE branch = ? AND trunk = ?")
        .BindAll(branch, data_.name)
        .Run();
    if (store.Changes() == 0)
      throw HostCtlException("Uplink " + branch + " is not attached to " + data_.name);
  });
}

std::vector<PnicAttachment> PnicImpl::GetAttachments() const {
  Store& store = Store::Host();
  store.CheckFault("GetAttachments", data_.name);
  Data();
  return store.Read([&] {
    std::vector<PnicAttachment> attachments;
    Statement rows =
        store.Prepare("SELECT branch, vlan_id FROM pnic_attachment WHERE trunk = ? ORDER BY ord");
    enum { kBranch, kVlanId };
    rows.Bind(1, data_.name);
    while (rows.Step())
      attachments.push_back({rows.Text(kBranch), static_cast<uint16_t>(rows.Int(kVlanId))});
    return attachments;
  });
}

void PnicImpl::GetPnicStats(PnicStats& stats) const {
  Store& store = Store::Host();
  store.CheckFault("GetPnicStats", data_.name);
  Data();
  std::string text = store.Read([&] {
    Statement row = store.Prepare("SELECT value FROM pnic_record WHERE nic = ? AND kind = 'stats'");
    enum { kValue };
    row.Bind(1, data_.name);
    return row.Step() ? row.Text(kValue) : std::string("{}");
  });
  nlohmann::json counters = nlohmann::json::parse(text);
  for (const auto& key : Model::kPnicStatsKeys)
    stats.*key.member = counters.value(key.key, uint64_t{0});
}

} // namespace Sim
