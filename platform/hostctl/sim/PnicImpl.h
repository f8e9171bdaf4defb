//===- TvkCtl/Network/PnicImpl.h - A physical NIC of the simulated host ---===//
//
// PnicImpl reads the NIC's basic state once and keeps it until Refresh() or a
// change through this object; every other record is read from the host when
// asked. Each area implements its operations in its own source file.
//
//===----------------------------------------------------------------------===//
#pragma once

#include "HostCtl/Network/Pnic.h"
#include "HostCtl/Network/Switching.h"
#include "backend/Backend.h"

#include <cstdint>
#include <memory>
#include <string>
#include <vector>

namespace Model {
class Store;
} // namespace Model

namespace Sim {

/// The basic state of a physical NIC.
struct PnicData {
  std::string name;         ///< NIC name, such as vmnic0.
  bool hasPci = false;      ///< The NIC has a PCI function.
  std::string pciAddress;   ///< PCI address, when hasPci.
  std::string vendor;       ///< PCI vendor name.
  std::string device;       ///< PCI device name.
  std::string pseudoDevice; ///< Description of a NIC without PCI function.
  std::string driver;       ///< Driver name.
  bool adminUp = false;     ///< Administratively up.
  bool carrier = false;     ///< The PHY has carrier.
  uint32_t speed = 0;       ///< Mbps.
  uint32_t duplex = 0;      ///< 1 full, 2 half.
  std::string mac;          ///< MAC address text.
  uint32_t mtu = 0;         ///< MTU.
};

/// Reads the basic state of NIC \p name into \p data; false when the host has
/// no such NIC (inside a transaction).
bool LoadPnicData(Model::Store& store, const std::string& name, PnicData& data);
/// The basic state of every NIC of the host, in the host's order (inside a
/// transaction).
std::vector<PnicData> ListPnicData(Model::Store& store);

class PnicImpl : public HostCtl::Backend::Pnic {
public:
  /// A NIC looked up by name; operations on a name that is no NIC of the host
  /// throw HostCtlException.
  explicit PnicImpl(std::string name);
  explicit PnicImpl(PnicData data);
  ~PnicImpl() override;

  /// Whether the host has a physical NIC of that name.
  static bool IsValidPnic(const std::string& name);
  /// The name of hardware capability bit \p bit ("" for a bit with no name).
  static std::string GetHwCapName(int bit);

  // --- Identity, link and administrative state.
  void Refresh() override;
  std::string GetName() const override;
  std::unique_ptr<HostCtl::Network::PciDevice> GetPciDevice() const override;
  uint32_t GetDuplex() const override;
  bool IsLinkUp() const override;
  bool IsLinkStatusUp() const override;
  bool IsAdminUp() const override;
  uint32_t GetSpeed() const override;
  void SetSpeedDuplex(uint32_t speed, uint32_t duplex) override;
  std::string GetDriverName() const override;
  HostCtl::Network::MacAddress GetMacAddress() const override;
  void SetAdminStatus(bool up) override;
  uint32_t GetMtu() const override;
  std::string GetPseudoDeviceDescription() const override;

  // --- Generic information, pause, driver, capabilities, attachments.
  void GetPnicInfo(HostCtl::Network::PnicInfo& info, int flags, int reserved) const override;
  void GetPauseParams(HostCtl::Network::PnicPauseParams& params) const override;
  void GetDriverInfo(HostCtl::Network::PnicDriverInfo& info) const override;
  void GetHwCapabilities(HostCtl::Network::PnicHwCapabilities& caps) const override;
  void SetPnicInfo(const HostCtl::Network::PnicInfo& info) override;
  void RestartNegotiation() override;
  void AttachBranch(const std::string& branch, uint16_t vlanId) override;
  void DetachBranch(const std::string& branch) override;
  std::vector<HostCtl::Network::PnicAttachment> GetAttachments() const override;
  /// Packet counters.
  void GetPnicStats(HostCtl::Network::PnicStats& stats) const override;

  // --- Hardware settings.
  void GetOffloadSettings(HostCtl::Network::PnicOffloadSettings& settings) const override;
  void SetOffloadSettings(const HostCtl::Network::PnicOffloadSettings& settings) override;
  void GetCoalesceParams(HostCtl::Network::PnicCoalesceParams& params) const override;
  void SetCoalesceParams(const HostCtl::Network::PnicCoalesceParams& params) override;
  void GetRingParams(HostCtl::Network::PnicRingParams& maximums,
                     HostCtl::Network::PnicRingParams& current) const override;
  void SetRingParams(const HostCtl::Network::PnicRingParams& params) override;
  void SetPauseParams(const HostCtl::Network::PnicPauseParams& params) override;
  void GetNetqueueInfo(HostCtl::Network::PnicNetqueueInfo& info) const override;
  void SetNetqueueInfo(const HostCtl::Network::PnicNetqueueInfo& info) override;
  void GetSoftwareSimulation(HostCtl::Network::PnicSoftwareSimulation& settings) const override;
  void SetSoftwareSimulation(const HostCtl::Network::PnicSoftwareSimulation& settings) override;
  void GetEepromDump(std::vector<uint8_t>& data, uint32_t length, uint32_t offset) const override;
  void SetEepromValue(uint32_t magic, uint32_t offset, uint32_t value) override;
  void SetEepromFromFile(uint32_t magic, const std::string& file) override;
  void GetRegisterDump(std::vector<uint32_t>& words) const override;
  void RunSelfTest(HostCtl::Network::PnicSelfTestResult& result, bool online) override;

  // --- Datapath.
  /// The NIC's uplink port, or null when the NIC is no uplink of a switch.
  std::unique_ptr<HostCtl::Network::Port> GetPort() const override;

protected:
  /// The basic state, read from the host when stale; throws HostCtlException
  /// when the host has no NIC of this name.
  const PnicData& Data() const;

private:
  mutable PnicData data_; ///< Cached basic state.
  mutable bool stale_;    ///< data_ must be read again.
};

} // namespace Sim
