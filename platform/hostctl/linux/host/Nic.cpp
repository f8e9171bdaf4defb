//===- linux/host/Nic.cpp - Physical NICs: links and ethtool ---------------===//
//
// A NIC is a link that IsNic accepts. Its state comes from rtnetlink (one
// link message), its settings from ethtool. What a driver does not support is
// the driver's refusal ("vmnic3: the driver veth does not support ring
// parameters"); only the readings a NIC-wide listing needs from every NIC
// (pause, wake-on, message level) turn that refusal into "not supported".
//
//===----------------------------------------------------------------------===//
#include "Host.h"

#include "HostCtl/Network/PnicHwRecords.h"
#include "LinuxNet/Dcb.h"
#include "LinuxNet/Ethtool.h"
#include "LinuxNet/Files.h"

#include <algorithm>
#include <array>
#include <cerrno>
#include <cstring>
#include <fstream>

namespace LinuxHost {

using namespace HostCtl::Network;
namespace Ops = HostCtl::Backend;

namespace {

/// Whether \p e is a driver's "not supported" (as opposed to a failure).
bool Unsupported(const HostCtl::Lib::HostCtlException& e) {
  return e.GetCode() == EOPNOTSUPP || e.GetCode() == ENOTSUP;
}

/// Media names by code (PnicLinkMode::media).
constexpr std::array<const char*, 39> kMedia = {
    "None",    "Unknown", "BaseT",     "BaseX",    "BaseKX",     "BaseSX",         "BaseLX",
    "BaseKR",  "BaseLR",  "BaseSR",    "BaseER",   "BaseTwinax", "BaseTwinaxLong", "BaseLRM",
    "BaseCR1", "BaseKR2", "BaseMLD2",  "BaseKR4",  "BaseKX4",    "BaseCR4",        "BaseSR4",
    "BaseLR4", "BaseR4",  "BaseSGMII", "BaseSFI",  "XLPPI",      "BaseCX-SGMII",   "BaseDR4",
    "BaseFR4", "AUI-8",   "AUI-4",     "BaseSR16", "BaseFR8",    "BaseLR8",        "AUI-16",
    "BaseER4", "BaseER8", "BaseCX4",   "BaseCR2"};

/// The media code of an ethtool link mode name ("10000baseSR/Full" gives
/// BaseSR); 1 (unknown) for a medium the table lacks.
uint32_t MediaOf(const char* name) {
  const char* base = std::strstr(name, "base");
  if (!base)
    return 1;
  std::string medium = "Base" + std::string(base + 4, std::strcspn(base + 4, "/"));
  if (medium == "BaseCR")
    medium = "BaseCR1";
  for (std::size_t i = 0; i < kMedia.size(); ++i)
    if (medium == kMedia[i])
      return static_cast<uint32_t>(i);
  return 1;
}

/// Port codes by the names of ethtool's port bits.
uint32_t PortOfBit(const char* name, bool& found) {
  static const std::pair<const char*, uint32_t> ports[] = {
      {"TP", 0}, {"AUI", 1}, {"BNC", 2}, {"MII", 3}, {"FIBRE", 4}, {"Backplane", 6}};
  for (const auto& [text, code] : ports)
    if (std::strcmp(name, text) == 0) {
      found = true;
      return code;
    }
  found = false;
  return 0;
}

/// ethtool's port code (PORT_*) to ours; 7 (none) for the others.
uint32_t PortCode(uint8_t port) {
  return port <= LinuxNet::PortDa ? port : 7;
}
/// Ours to ethtool's; backplane has no PORT_ code of its own.
std::optional<uint8_t> EthtoolPort(uint32_t code) {
  if (code <= 5)
    return static_cast<uint8_t>(code);
  return std::nullopt;
}

/// Our coalescing parameters beside ethtool's.
using CoalesceField =
    std::pair<uint32_t PnicCoalesceParams::*, std::optional<uint32_t> LinuxNet::Coalesce::*>;
const CoalesceField kCoalesceFields[] = {
    {&PnicCoalesceParams::statsBlockUsecs, &LinuxNet::Coalesce::statsBlockUsecs},
    {&PnicCoalesceParams::sampleInterval, &LinuxNet::Coalesce::sampleInterval},
    {&PnicCoalesceParams::pktRateLow, &LinuxNet::Coalesce::pktRateLow},
    {&PnicCoalesceParams::pktRateHigh, &LinuxNet::Coalesce::pktRateHigh},
    {&PnicCoalesceParams::rxUsecs, &LinuxNet::Coalesce::rxUsecs},
    {&PnicCoalesceParams::rxMaxFrames, &LinuxNet::Coalesce::rxMaxFrames},
    {&PnicCoalesceParams::rxUsecsIrq, &LinuxNet::Coalesce::rxUsecsIrq},
    {&PnicCoalesceParams::rxMaxFramesIrq, &LinuxNet::Coalesce::rxMaxFramesIrq},
    {&PnicCoalesceParams::txUsecs, &LinuxNet::Coalesce::txUsecs},
    {&PnicCoalesceParams::txMaxFrames, &LinuxNet::Coalesce::txMaxFrames},
    {&PnicCoalesceParams::txUsecsIrq, &LinuxNet::Coalesce::txUsecsIrq},
    {&PnicCoalesceParams::txMaxFramesIrq, &LinuxNet::Coalesce::txMaxFramesIrq},
    {&PnicCoalesceParams::rxUsecsLow, &LinuxNet::Coalesce::rxUsecsLow},
    {&PnicCoalesceParams::rxMaxFramesLow, &LinuxNet::Coalesce::rxMaxFramesLow},
    {&PnicCoalesceParams::txUsecsLow, &LinuxNet::Coalesce::txUsecsLow},
    {&PnicCoalesceParams::txMaxFramesLow, &LinuxNet::Coalesce::txMaxFramesLow},
    {&PnicCoalesceParams::rxUsecsHigh, &LinuxNet::Coalesce::rxUsecsHigh},
    {&PnicCoalesceParams::rxMaxFramesHigh, &LinuxNet::Coalesce::rxMaxFramesHigh},
    {&PnicCoalesceParams::txUsecsHigh, &LinuxNet::Coalesce::txUsecsHigh},
    {&PnicCoalesceParams::txMaxFramesHigh, &LinuxNet::Coalesce::txMaxFramesHigh}};

/// A PCI function, named from the hwdata table when the machine has it.
class PciFunction final : public PciDevice {
public:
  explicit PciFunction(std::string address) : address_(std::move(address)) {
    std::string vendor = ReadId("vendor"), device = ReadId("device");
    vendorName_ = vendor.empty() ? "Unknown" : "0x" + vendor;
    deviceName_ = device.empty() ? "Unknown" : "0x" + device;
    if (!vendor.empty())
      LookUp(vendor, device);
  }
  std::string GetVendorName() const override { return vendorName_; }
  std::string GetDeviceName() const override { return deviceName_; }
  std::string GetAddress() const override { return address_; }

private:
  /// A 4-digit id from sysfs ("0x8086" gives "8086"), or "".
  std::string ReadId(const char* what) const {
    std::string text = LinuxNet::ReadTextFile("/sys/bus/pci/devices/" + address_ + "/" + what);
    if (text.size() < 6 || text.compare(0, 2, "0x") != 0)
      return "";
    return text.substr(2, 4);
  }
  void LookUp(const std::string& vendor, const std::string& device) {
    for (const char* path : {"/usr/share/misc/pci.ids", "/usr/share/hwdata/pci.ids"}) {
      std::ifstream in(path);
      if (!in)
        continue;
      bool inVendor = false;
      for (std::string line; std::getline(in, line);) {
        if (line.empty() || line[0] == '#')
          continue;
        if (line[0] != '\t') {
          if (inVendor)
            return;
          if (line.compare(0, 4, vendor) == 0 && line.size() > 6) {
            inVendor = true;
            vendorName_ = line.substr(6);
          }
        } else if (inVendor && line.size() > 7 && line[1] != '\t' &&
                   line.compare(1, 4, device) == 0) {
          deviceName_ = line.substr(7);
          return;
        }
      }
      return;
    }
  }
  std::string address_, vendorName_, deviceName_; ///< As shown.
};

class Nic final : public Ops::Pnic {
public:
  Nic(Context& ctx, std::string name, std::optional<LinuxNet::Link> link = std::nullopt,
      std::optional<LinuxNet::LinkModes> modes = std::nullopt)
      : ctx_(ctx), name_(std::move(name)), link_(std::move(link)), modes_(std::move(modes)) {}

  void Refresh() override {
    link_.reset();
    modes_.reset();
    driver_.reset();
  }
  std::string GetName() const override { return name_; }
  std::unique_ptr<PciDevice> GetPciDevice() const override {
    const LinuxNet::Link& link = Link();
    if (link.parentBus != "pci" || link.parentDevice.empty())
      return nullptr;
    return std::make_unique<PciFunction>(link.parentDevice);
  }
  uint32_t GetDuplex() const override {
    uint8_t duplex = Modes().duplex;
    return duplex == LinuxNet::DuplexFull ? 1 : duplex == LinuxNet::DuplexHalf ? 2 : 0;
  }
  bool IsLinkUp() const override { return Link().carrier; }
  bool IsLinkStatusUp() const override { return Link().operState == LinuxNet::OperState::Up; }
  bool IsAdminUp() const override { return Link().adminUp; }
  uint32_t GetSpeed() const override { return Modes().speed; }
  void SetSpeedDuplex(uint32_t speed, uint32_t duplex) override {
    LinuxNet::LinkSettingsChange change;
    if (speed == 0 && duplex == 0) {
      change.autoneg = true;
    } else {
      change.autoneg = false;
      change.speed = speed;
      change.duplex = duplex == 2 ? LinuxNet::DuplexHalf : LinuxNet::DuplexFull;
    }
    Kernel([&] { LinuxNet::SetLinkSettings(ctx_.ns, Name(), change); });
    Refresh();
  }
  std::string GetDriverName() const override { return Driver().driver; }
  MacAddress GetMacAddress() const override {
    const LinuxNet::HwAddress& bytes = Link().address;
    std::array<uint8_t, 6> mac{};
    if (bytes.size() == mac.size())
      std::copy(bytes.begin(), bytes.end(), mac.begin());
    return MacAddress(mac);
  }
  void SetAdminStatus(bool up) override {
    LinuxNet::LinkChange change;
    change.up = up;
    Kernel([&] { LinuxNet::ChangeLink(ctx_.ns, Name(), change); });
    Refresh();
  }
  uint32_t GetMtu() const override { return Link().mtu; }
  /// A NIC on another bus: "PhyDev:BUS:DRIVER", so that its description is
  /// its bus and driver; a lab NIC has no device to describe.
  std::string GetPseudoDeviceDescription() const override {
    const LinuxNet::Link& link = Link();
    if (link.parentBus.empty())
      return "";
    return "PhyDev:" + link.parentBus + ":" + Driver().driver;
  }

  void GetPnicInfo(PnicInfo& info, int, int) const override {
    LinuxNet::LinkSettings settings =
        Kernel([&] { return LinuxNet::GetLinkSettings(ctx_.ns, Name()); });
    info.supportedPorts.clear();
    info.advertisedModes.clear();
    for (uint32_t bit : settings.modes.supported) {
      const LinuxNet::LinkModeInfo* mode = LinuxNet::FindLinkMode(bit);
      if (!mode)
        continue;
      bool isPort = false;
      uint32_t port = PortOfBit(mode->name, isPort);
      if (isPort)
        info.supportedPorts.push_back(port);
      if (std::strcmp(mode->name, "Autoneg") == 0)
        info.supportsAutoNegotiation = true;
    }
    for (uint32_t bit : settings.modes.advertised) {
      const LinuxNet::LinkModeInfo* mode = LinuxNet::FindLinkMode(bit);
      if (!mode)
        continue;
      if (std::strcmp(mode->name, "Autoneg") == 0)
        info.advertisedAutoNegotiation = true;
      if (mode->speed == 0)
        continue;
      uint32_t duplex = mode->duplex == LinuxNet::DuplexFull   ? 1
                        : mode->duplex == LinuxNet::DuplexHalf ? 2
                                                               : 0;
      info.advertisedModes.push_back({mode->speed, duplex, MediaOf(mode->name)});
    }
    info.autoNegotiation = settings.modes.autoneg;
    if (settings.info) {
      info.port = PortCode(settings.info->port);
      info.phyAddress = settings.info->phyAddress;
      info.transceiver = settings.info->transceiver;
    } else {
      info.port = 7;
    }
    info.wakeOn.clear();
    try {
      LinuxNet::WakeOnLan wol = Kernel([&] { return LinuxNet::GetWakeOnLan(ctx_.ns, Name()); });
      info.supportsWakeOn = wol.supported != 0;
      for (uint32_t bit = 0; bit <= WakeOnSecureOn; ++bit)
        if (wol.enabled & (1u << bit))
          info.wakeOn.push_back(bit);
      if (info.supportsWakeOn && wol.enabled == 0)
        info.wakeOn.push_back(WakeOnDisabled);
    } catch (const HostCtl::Lib::HostCtlException& e) {
      if (!Unsupported(e))
        throw;
      info.supportsWakeOn = false;
    }
    try {
      info.messageLevel = Kernel([&] { return LinuxNet::GetMessageLevel(ctx_.ns, Name()); });
      info.messageLevelSupported = true;
    } catch (const HostCtl::Lib::HostCtlException& e) {
      if (!Unsupported(e))
        throw;
      info.messageLevelSupported = false;
    }
    info.linkStatus = IsLinkStatusUp() ? "Up" : "Down";
  }
  void GetPauseParams(PnicPauseParams& params) const override {
    try {
      LinuxNet::Pause pause = Kernel([&] { return LinuxNet::GetPause(ctx_.ns, Name()); });
      params.supported = true;
      params.autoNegotiation = pause.autoneg.value_or(false);
      params.rx = pause.rx.value_or(false);
      params.tx = pause.tx.value_or(false);
    } catch (const HostCtl::Lib::HostCtlException& e) {
      if (!Unsupported(e))
        throw;
      params = PnicPauseParams{};
    }
  }
  void GetDriverInfo(PnicDriverInfo& info) const override {
    const LinuxNet::DriverInfo& driver = Driver();
    info.driver = driver.driver;
    info.version = driver.version;
    info.firmwareVersion = driver.firmwareVersion;
    info.busInfo = driver.busInfo;
  }
  void GetHwCapabilities(PnicHwCapabilities& caps) const override;
  void SetPnicInfo(const PnicInfo& info) override {
    if (info.phyAddressChanged || info.transceiverChanged)
      Refuse(Name() + ": the kernel sets the PHY address and transceiver of a NIC itself");
    if (info.virtualAddressChanged)
      Ops::Unavailable("SetPnicInfo (virtual address)");
    if (info.portChanged) {
      LinuxNet::LinkSettingsChange change;
      change.port = EthtoolPort(info.port);
      if (!change.port)
        Refuse(Name() + ": the kernel has no port code for the backplane port");
      Kernel([&] { LinuxNet::SetLinkSettings(ctx_.ns, Name(), change); });
    }
    if (info.wakeOnChanged) {
      uint32_t bits = 0;
      for (uint32_t code : info.wakeOn)
        if (code <= WakeOnSecureOn)
          bits |= 1u << code;
      Kernel([&] { LinuxNet::SetWakeOnLan(ctx_.ns, Name(), bits); });
    }
    if (info.messageLevelChanged)
      Kernel([&] { LinuxNet::SetMessageLevel(ctx_.ns, Name(), info.messageLevel); });
    Refresh();
  }
  void RestartNegotiation() override {
    Kernel([&] { LinuxNet::RestartNegotiation(ctx_.ns, Name()); });
  }
  /// Nothing attaches one NIC to another on Linux (a VLAN device would, where
  /// the kernel has them): a NIC has no attachments.
  std::vector<PnicAttachment> GetAttachments() const override {
    Name();
    return {};
  }

  void GetOffloadSettings(PnicOffloadSettings& settings) const override {
    std::vector<LinuxNet::Feature> features =
        Kernel([&] { return LinuxNet::GetFeatures(ctx_.ns, Name()); });
    LinuxNet::Offloads offloads = LinuxNet::SummarizeOffloads(features);
    settings.rxChecksum = offloads.rxChecksum;
    settings.txChecksum = offloads.txChecksum;
    settings.scatterGather = offloads.scatterGather;
    settings.tso = offloads.tso;
    settings.tso6 = offloads.tso6;
    settings.encapOffload = false;
    settings.text.clear();
    for (const LinuxNet::Feature& feature : features) {
      if (feature.name == "tx-udp_tnl-segmentation" && feature.active)
        settings.encapOffload = true;
      if (feature.active)
        settings.text += (settings.text.empty() ? "" : " ") + feature.name;
    }
  }
  void SetOffloadSettings(const PnicOffloadSettings& settings) override {
    using LinuxNet::OffloadGroup;
    const std::pair<uint8_t, std::pair<OffloadGroup, bool>> groups[] = {
        {OffloadRxChecksum, {OffloadGroup::RxChecksum, settings.rxChecksum}},
        {OffloadTxChecksum, {OffloadGroup::TxChecksum, settings.txChecksum}},
        {OffloadScatterGather, {OffloadGroup::ScatterGather, settings.scatterGather}},
        {OffloadTso, {OffloadGroup::Tso, settings.tso}}};
    for (const auto& group : groups) {
      const std::pair<OffloadGroup, bool>& change = group.second;
      if (settings.mask & group.first)
        Kernel([&] { LinuxNet::SetOffload(ctx_.ns, Name(), change.first, change.second); });
    }
  }
  void GetCoalesceParams(PnicCoalesceParams& p) const override {
    LinuxNet::Coalesce c = Kernel([&] { return LinuxNet::GetCoalesce(ctx_.ns, Name()); });
    p.adaptiveRx = c.adaptiveRx.value_or(false);
    p.adaptiveTx = c.adaptiveTx.value_or(false);
    for (const auto& [ours, theirs] : kCoalesceFields)
      p.*ours = (c.*theirs).value_or(0);
  }
  void SetCoalesceParams(const PnicCoalesceParams& p) override {
    LinuxNet::Coalesce current = Kernel([&] { return LinuxNet::GetCoalesce(ctx_.ns, Name()); });
    LinuxNet::Coalesce change;
    // Only what the driver has and what differs is sent: a driver refuses
    // parameters it lacks even when they are left as they are.
    for (const auto& [ours, theirs] : kCoalesceFields)
      if ((current.*theirs).has_value() && *(current.*theirs) != p.*ours)
        change.*theirs = p.*ours;
    if (current.adaptiveRx && *current.adaptiveRx != p.adaptiveRx)
      change.adaptiveRx = p.adaptiveRx;
    if (current.adaptiveTx && *current.adaptiveTx != p.adaptiveTx)
      change.adaptiveTx = p.adaptiveTx;
    Kernel([&] { LinuxNet::SetCoalesce(ctx_.ns, Name(), change); });
  }
  void GetRingParams(PnicRingParams& maximums, PnicRingParams& current) const override {
    LinuxNet::Rings rings = Kernel([&] { return LinuxNet::GetRings(ctx_.ns, Name()); });
    maximums = {0, rings.rxMax, rings.rxMiniMax, rings.rxJumboMax, rings.txMax};
    current = {0, rings.rx.value_or(0), rings.rxMini.value_or(0), rings.rxJumbo.value_or(0),
               rings.tx.value_or(0)};
  }
  void SetRingParams(const PnicRingParams& params) override {
    LinuxNet::Rings change;
    if (params.rx)
      change.rx = params.rx;
    if (params.rxMini)
      change.rxMini = params.rxMini;
    if (params.rxJumbo)
      change.rxJumbo = params.rxJumbo;
    if (params.tx)
      change.tx = params.tx;
    Kernel([&] { LinuxNet::SetRings(ctx_.ns, Name(), change); });
  }
  void SetPauseParams(const PnicPauseParams& params) override {
    LinuxNet::Pause change;
    change.autoneg = params.autoNegotiation;
    change.rx = params.rx;
    change.tx = params.tx;
    Kernel([&] { LinuxNet::SetPause(ctx_.ns, Name(), change); });
  }
  /// Queue counts are the driver's channels: combined channels count as both
  /// receive and transmit queues.
  void GetNetqueueInfo(PnicNetqueueInfo& info) const override {
    LinuxNet::Channels channels = Kernel([&] { return LinuxNet::GetChannels(ctx_.ns, Name()); });
    uint32_t combined = channels.combined.value_or(0);
    info.rxQueueCount = channels.rx.value_or(0) + combined;
    info.txQueueCount = channels.tx.value_or(0) + combined;
  }
  void SetNetqueueInfo(const PnicNetqueueInfo& info) override {
    if (info.balancerStateSelected || info.pluginStateSelected || info.settingMask)
      Ops::Unavailable("SetNetqueueInfo (load balancer)");
    LinuxNet::Channels current = Kernel([&] { return LinuxNet::GetChannels(ctx_.ns, Name()); });
    LinuxNet::Channels change;
    if (current.combined && !current.rx && !current.tx) {
      // Combined channels carry both directions: both counts must agree.
      uint32_t rx = info.rxCountSelected ? info.rxQueueCount : *current.combined;
      uint32_t tx = info.txCountSelected ? info.txQueueCount : *current.combined;
      if (rx != tx)
        Refuse(Name() + ": the driver " + Driver().driver +
               " has combined queues only, so the receive and transmit counts are the same");
      change.combined = rx;
    } else {
      if (info.rxCountSelected)
        change.rx = info.rxQueueCount;
      if (info.txCountSelected)
        change.tx = info.txQueueCount;
    }
    Kernel([&] { LinuxNet::SetChannels(ctx_.ns, Name(), change); });
  }
  void GetEepromDump(std::vector<uint8_t>& data, uint32_t length, uint32_t offset) const override {
    data = Kernel([&] { return LinuxNet::ReadEeprom(ctx_.ns, Name(), offset, length); });
  }
  void SetEepromValue(uint32_t magic, uint32_t offset, uint32_t value) override {
    if (value > 0xff)
      Refuse(Name() + ": an EEPROM value is one byte, 0 to 255");
    Kernel([&] {
      LinuxNet::WriteEeprom(ctx_.ns, Name(), magic, offset, {static_cast<uint8_t>(value)});
    });
  }
  void SetEepromFromFile(uint32_t magic, const std::string& file) override {
    std::ifstream in(file, std::ios::binary);
    if (!in)
      Refuse("Cannot read " + file + ": " + std::strerror(errno));
    std::vector<uint8_t> data((std::istreambuf_iterator<char>(in)),
                              std::istreambuf_iterator<char>());
    Kernel([&] { LinuxNet::WriteEeprom(ctx_.ns, Name(), magic, 0, data); });
  }
  void GetRegisterDump(std::vector<uint32_t>& words) const override {
    LinuxNet::RegisterDump dump = Kernel([&] { return LinuxNet::DumpRegisters(ctx_.ns, Name()); });
    words.assign((dump.data.size() + 3) / 4, 0);
    std::memcpy(words.data(), dump.data.data(), dump.data.size());
  }
  void RunSelfTest(PnicSelfTestResult& result, bool online) override {
    LinuxNet::SelfTestResult run =
        Kernel([&] { return LinuxNet::RunSelfTest(ctx_.ns, Name(), !online); });
    result.failed = run.failed;
    result.info.clear();
    for (const auto& [test, value] : run.results)
      result.info.push_back(test + ": " + std::to_string(value));
  }
  void GetPnicStats(PnicStats& s) const override;

  /// The link; throws when \p name_ is no NIC of the host.
  const LinuxNet::Link& Link() const {
    if (!link_) {
      std::optional<LinuxNet::Link> link = FindLink(ctx_, name_);
      if (!link || !IsNic(*link))
        Refuse("There is no physical NIC named " + name_ + " on " + ctx_.spec);
      link_ = std::move(link);
    }
    return *link_;
  }

private:
  const std::string& Name() const { return Link().name; }
  const LinuxNet::LinkModes& Modes() const {
    if (!modes_)
      modes_ = Kernel([&] { return LinuxNet::GetLinkSettings(ctx_.ns, Name()); }).modes;
    return *modes_;
  }
  const LinuxNet::DriverInfo& Driver() const {
    if (!driver_)
      driver_ = Kernel([&] { return LinuxNet::GetDriverInfo(ctx_.ns, Name()); });
    return *driver_;
  }
  Context& ctx_;                                       ///< The host.
  std::string name_;                                   ///< As asked for.
  mutable std::optional<LinuxNet::Link> link_;         ///< Read on first use.
  mutable std::optional<LinuxNet::LinkModes> modes_;   ///< Speed and duplex.
  mutable std::optional<LinuxNet::DriverInfo> driver_; ///< Driver information.
};

void Nic::GetPnicStats(PnicStats& s) const {
  const LinuxNet::LinkStats& k = Link().stats;
  s.txPackets = k.txPackets;
  s.rxPackets = k.rxPackets;
  s.txBytes = k.txBytes;
  s.rxBytes = k.rxBytes;
  s.txErrors = k.txErrors;
  s.rxErrors = k.rxErrors;
  s.txDropped = k.txDropped;
  s.rxDropped = k.rxDropped;
  s.rxMulticast = k.multicast;
  s.rxLengthErrors = k.rxLengthErrors;
  s.rxOverErrors = k.rxOverErrors;
  s.rxCrcErrors = k.rxCrcErrors;
  s.rxFrameErrors = k.rxFrameErrors;
  s.rxFifoErrors = k.rxFifoErrors;
  s.rxMissedErrors = k.rxMissedErrors;
  s.txAbortedErrors = k.txAbortedErrors;
  s.txFifoErrors = k.txFifoErrors;
  s.txCarrierErrors = k.txCarrierErrors;
  s.txHeartbeatErrors = k.txHeartbeatErrors;
  s.txWindowErrors = k.txWindowErrors;
  s.collisions = k.collisions;
  // The kernel counts neither broadcasts nor sent multicasts; a driver may
  // (ethtool -S). Without a driver counter the value is all ones, which the
  // listing shows as -1: "not counted", never a made-up 0.
  s.rxBroadcast = s.txBroadcast = s.txMulticast = UINT64_MAX;
  std::vector<std::pair<std::string, uint64_t>> driver;
  try {
    driver = Kernel([&] { return LinuxNet::GetDriverStats(ctx_.ns, Name()); });
  } catch (const HostCtl::Lib::HostCtlException& e) {
    if (!Unsupported(e))
      throw;
  }
  for (const auto& [name, value] : driver) {
    if (name == "rx_broadcast" || name == "rx_bcast_packets" || name == "rx_broadcast_packets")
      s.rxBroadcast = value;
    else if (name == "tx_broadcast" || name == "tx_bcast_packets" || name == "tx_broadcast_packets")
      s.txBroadcast = value;
    else if (name == "tx_multicast" || name == "tx_mcast_packets" || name == "tx_multicast_packets")
      s.txMulticast = value;
  }
}

void Nic::GetHwCapabilities(PnicHwCapabilities& caps) const {
  std::vector<LinuxNet::Feature> features =
      Kernel([&] { return LinuxNet::GetFeatures(ctx_.ns, Name()); });
  caps = {};
  auto mark = [&](int bit, bool supported, bool active) {
    if (supported)
      caps.supported |= uint64_t{1} << bit;
    if (active)
      caps.activated |= uint64_t{1} << bit;
  };
  // Bits as GetHwCapName names them (Host.cpp); a feature that is fixed off
  // is one the device does not have.
  static const std::pair<int, std::vector<const char*>> byFeature[] = {
      {0, {"rx-checksum"}},
      {1, {"tx-checksum-ipv4", "tx-checksum-ip-generic"}},
      {2, {"rx-checksum"}},
      {3, {"tx-checksum-ipv6", "tx-checksum-ip-generic"}},
      {4, {"tx-tcp-segmentation"}},
      {5, {"tx-tcp6-segmentation"}},
      {6, {"tx-scatter-gather"}},
      {7, {"tx-scatter-gather-fraglist"}},
      {8, {"tx-vlan-hw-insert"}},
      {9, {"rx-vlan-hw-parse"}},
      {10, {"rx-lro"}},
      {11, {"rx-hashing"}},
      {12, {"tx-udp_tnl-segmentation"}},
      {13, {"tx-udp_tnl-csum-segmentation"}},
      {15, {"highdma"}},
      {18, {"rx-ntuple-filter"}}};
  for (const auto& [bit, names] : byFeature)
    for (const LinuxNet::Feature& feature : features)
      if (std::find_if(names.begin(), names.end(),
                       [&](const char* n) { return feature.name == n; }) != names.end())
        mark(bit, feature.changeable || feature.active, feature.active);
  try {
    LinuxNet::WakeOnLan wol = Kernel([&] { return LinuxNet::GetWakeOnLan(ctx_.ns, Name()); });
    mark(17, wol.supported != 0, wol.enabled != 0);
  } catch (const HostCtl::Lib::HostCtlException& e) {
    if (!Unsupported(e))
      throw;
  }
  PnicPauseParams pause;
  GetPauseParams(pause);
  mark(19, pause.supported, pause.rx || pause.tx);
  mark(23, Link().numVfs > 0, Link().numVfs > 0);
  mark(25, Link().maxMtu > 1500, Link().mtu > 1500);
}

/// DCB of one NIC, read through dcbnl.
class Dcb final : public Ops::Dcb {
public:
  Dcb(Context& ctx, std::string name) : ctx_(ctx), name_(std::move(name)) {}
  uint32_t GetMode() const override {
    const LinuxNet::DcbInfo& info = Info();
    if (!info.dcbx)
      return DcbModeUnknown;
    if (*info.dcbx & LinuxNet::DcbxIeee)
      return DcbModeIeee;
    if (*info.dcbx & LinuxNet::DcbxCee)
      return DcbModeCee;
    return DcbModeUnknown;
  }
  bool IsEnabled() const override { return Info().enabled; }
  DcbCapabilities GetCapabilities() const override {
    DcbCapabilities caps;
    if (const auto& c = Info().capabilities) {
      caps.priorityGroup = c->priorityGroups;
      caps.priorityFlowControl = c->priorityFlowControl;
      caps.upToTcMap = c->upToTc;
      caps.pgTrafficClasses = c->pgTrafficClasses;
      caps.pfcTrafficClasses = c->pfcTrafficClasses;
    }
    return caps;
  }
  bool IsPfcEnabled() const override {
    const auto& ieee = Info().ieee;
    return ieee && ieee->pfc && ieee->pfc->enabled != 0;
  }
  uint8_t GetPfcConfig() const override {
    const auto& ieee = Info().ieee;
    return ieee && ieee->pfc ? ieee->pfc->enabled : 0;
  }
  DcbIeeeEtsConfig GetIeeeEtsConfig() const override {
    DcbIeeeEtsConfig config;
    const auto& ieee = Info().ieee;
    if (!ieee || !ieee->ets)
      Refuse(name_ + ": the driver reports no IEEE ETS configuration");
    const LinuxNet::DcbEts& ets = *ieee->ets;
    config.willing = ets.willing;
    config.supportedCapacity = ets.etsCapability;
    config.creditBasedShaper = ets.creditBasedShaper ? "Supported" : "Not Supported";
    config.txBandwidth = ets.txBandwidth;
    config.rxBandwidth = ets.rxBandwidth;
    config.tsaTable = ets.tsa;
    config.priorityAssignment = ets.priorityTc;
    config.recommendedBandwidth = ets.recommendedBandwidth;
    config.recommendedTsa = ets.recommendedTsa;
    config.recommendedPriority = ets.recommendedPriorityTc;
    return config;
  }
  DcbIeeePfcConfig GetIeeePfcConfig() const override {
    DcbIeeePfcConfig config;
    const auto& ieee = Info().ieee;
    if (!ieee || !ieee->pfc)
      Refuse(name_ + ": the driver reports no IEEE PFC configuration");
    const LinuxNet::DcbPfc& pfc = *ieee->pfc;
    config.trafficClasses = pfc.capability;
    config.mask = pfc.enabled;
    config.macsecBypass = pfc.macsecBypass;
    config.delay = static_cast<uint8_t>(std::min<uint16_t>(pfc.delay, 255));
    for (std::size_t i = 0; i < 8; ++i) {
      config.sentFrames[i] = static_cast<uint8_t>(std::min<uint64_t>(pfc.requests[i], 255));
      config.receivedFrames[i] = static_cast<uint8_t>(std::min<uint64_t>(pfc.indications[i], 255));
    }
    return config;
  }
  std::vector<DcbAppInfo> GetAppInfo() const override {
    static const char* const selectors[] = {
        "Reserved", "Ethertype", "TCP/SCTP Port", "UDP/DCCP Port", "TCP/SCTP/UDP/DCCP Port",
        "DSCP"};
    std::vector<DcbAppInfo> apps;
    if (const auto& ieee = Info().ieee)
      for (const LinuxNet::DcbApp& app : ieee->apps)
        apps.push_back({app.selector < 6 ? selectors[app.selector] : "Unknown",
                        std::to_string(app.protocol), std::to_string(app.priority)});
    return apps;
  }

private:
  const LinuxNet::DcbInfo& Info() const {
    if (!info_) {
      Nic nic(ctx_, name_);
      nic.Link();
      info_ = Kernel([&] { return LinuxNet::GetDcb(ctx_.ns, name_); });
    }
    return *info_;
  }
  Context& ctx_;                                  ///< The host.
  std::string name_;                              ///< The NIC.
  mutable std::optional<LinuxNet::DcbInfo> info_; ///< Read on first use.
};

} // namespace

std::unique_ptr<Ops::Pnic> MakePnic(Context& ctx, const std::string& name) {
  return std::make_unique<Nic>(ctx, name);
}

std::unique_ptr<Ops::Pnic> MakeListedPnic(Context& ctx, const LinuxNet::Link& link,
                                          const LinuxNet::LinkModes* modes) {
  return std::make_unique<Nic>(ctx, link.name, link,
                               modes ? std::optional<LinuxNet::LinkModes>(*modes) : std::nullopt);
}

std::unique_ptr<Ops::Dcb> MakeDcb(Context& ctx, const std::string& name) {
  return std::make_unique<Dcb>(ctx, name);
}

} // namespace LinuxHost
