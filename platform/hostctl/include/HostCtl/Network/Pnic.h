//===- HostCtl/Network/Pnic.h - A physical NIC -----------------------------===//
//
// The interface of one physical NIC as the host library hands it out. Every
// operation reads the current state of the host or changes it at once; a
// refusal throws HostCtl::Lib::HostCtlException.
//
//===----------------------------------------------------------------------===//
#pragma once

#include "HostCtl/Network/Address.h"
#include "HostCtl/Network/PnicRecords.h"

#include <cstdint>
#include <memory>
#include <string>
#include <vector>

namespace HostCtl::Network {

struct PnicOffloadSettings;
struct PnicCoalesceParams;
struct PnicRingParams;
struct PnicNetqueueInfo;
struct PnicSoftwareSimulation;
struct PnicSelfTestResult;

/// Selection code of NetworkInfo::GetPnics; both select every physical NIC.
enum PnicGetType : int {
  PnicGetRegular = 0,
  PnicGetAll = 1,
};

/// The PCI function of a NIC.
class PciDevice {
public:
  virtual ~PciDevice() = default;
  virtual std::string GetVendorName() const = 0;
  virtual std::string GetDeviceName() const = 0;
  /// "dddd:bb:ss.f".
  virtual std::string GetAddress() const = 0;
};

class Pnic {
public:
  virtual ~Pnic() = default;

  // --- Identity, link and administrative state.
  /// Drops cached state, so that the next getter reads the host again.
  virtual void Refresh() = 0;
  virtual std::string GetName() const = 0;
  /// The PCI function, or null for a NIC without one.
  virtual std::unique_ptr<PciDevice> GetPciDevice() const = 0;
  /// 1 full, 2 half, 0 unknown.
  virtual uint32_t GetDuplex() const = 0;
  virtual bool IsLinkUp() const = 0;
  virtual bool IsLinkStatusUp() const = 0;
  virtual bool IsAdminUp() const = 0;
  /// Mbps.
  virtual uint32_t GetSpeed() const = 0;
  /// Speed in Mbps and duplex code (1 full, 2 half); (0, 0) autonegotiates.
  virtual void SetSpeedDuplex(uint32_t speed, uint32_t duplex) = 0;
  virtual std::string GetDriverName() const = 0;
  virtual MacAddress GetMacAddress() const = 0;
  virtual void SetAdminStatus(bool up) = 0;
  virtual uint32_t GetMtu() const = 0;
  /// ":"-separated description of a NIC without PCI function.
  virtual std::string GetPseudoDeviceDescription() const = 0;

  // --- Generic information, pause, driver, capabilities, attachments.
  virtual void GetPnicInfo(PnicInfo& info, int flags, int reserved) const = 0;
  virtual void GetPauseParams(PnicPauseParams& params) const = 0;
  virtual void GetDriverInfo(PnicDriverInfo& info) const = 0;
  virtual void GetHwCapabilities(PnicHwCapabilities& caps) const = 0;
  virtual void SetPnicInfo(const PnicInfo& info) = 0;
  virtual void RestartNegotiation() = 0;
  virtual void AttachBranch(const std::string& branch, uint16_t vlanId) = 0;
  virtual void DetachBranch(const std::string& branch) = 0;
  virtual std::vector<PnicAttachment> GetAttachments() const = 0;

  // --- Hardware settings: offloads, coalescing, rings, pause, NetQueue,
  // software simulation, diagnostics.
  virtual void GetOffloadSettings(PnicOffloadSettings& settings) const = 0;
  virtual void SetOffloadSettings(const PnicOffloadSettings& settings) = 0;
  virtual void GetCoalesceParams(PnicCoalesceParams& params) const = 0;
  virtual void SetCoalesceParams(const PnicCoalesceParams& params) = 0;
  virtual void GetRingParams(PnicRingParams& maximums, PnicRingParams& current) const = 0;
  virtual void SetRingParams(const PnicRingParams& params) = 0;
  virtual void SetPauseParams(const PnicPauseParams& params) = 0;
  virtual void GetNetqueueInfo(PnicNetqueueInfo& info) const = 0;
  virtual void SetNetqueueInfo(const PnicNetqueueInfo& info) = 0;
  virtual void GetSoftwareSimulation(PnicSoftwareSimulation& settings) const = 0;
  virtual void SetSoftwareSimulation(const PnicSoftwareSimulation& settings) = 0;
  virtual void GetEepromDump(std::vector<uint8_t>& data, uint32_t length,
                             uint32_t offset) const = 0;
  virtual void SetEepromValue(uint32_t magic, uint32_t offset, uint32_t value) = 0;
  virtual void SetEepromFromFile(uint32_t magic, const std::string& file) = 0;
  virtual void GetRegisterDump(std::vector<uint32_t>& words) const = 0;
  virtual void RunSelfTest(PnicSelfTestResult& result, bool online) = 0;
};

} // namespace HostCtl::Network
