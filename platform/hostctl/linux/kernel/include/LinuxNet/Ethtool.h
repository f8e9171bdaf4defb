//===- LinuxNet/Ethtool.h - Driver and hardware settings of a link --------===//
//
// What `ethtool` reads and changes: driver information, link settings,
// offload features, channels, rings, interrupt coalescing, pause, wake-on-LAN,
// message level, EEPROM, register dump, self test and driver statistics.
// Settings go through the kernel's ethtool netlink family; the operations it
// lacks (driver information, EEPROM, registers, self test, statistics,
// restarting negotiation) go through the SIOCETHTOOL ioctl. A driver that
// lacks an operation is refused as "DEV: the driver DRIVER does not support
// WHAT".
//
// The parsers of the kernel's replies are public (EthtoolWire), so that a
// reply can be read from recorded bytes as well as from the kernel.
//
//===----------------------------------------------------------------------===//
#pragma once

#include <cstdint>
#include <optional>
#include <span>
#include <string>
#include <utility>
#include <vector>

namespace LinuxNet {

class Namespace;

/// Driver information (ETHTOOL_GDRVINFO).
struct DriverInfo {
  std::string driver;              ///< Driver name ("veth", "ixgbe").
  std::string version;             ///< Driver version.
  std::string firmwareVersion;     ///< Firmware version; empty when none.
  std::string busInfo;             ///< Bus address ("0000:3b:00.0"); empty when none.
  std::string expansionRomVersion; ///< Expansion ROM version.
  uint32_t statsCount = 0;         ///< Number of driver statistics.
  uint32_t testCount = 0;          ///< Number of self-test results.
  uint32_t eepromLength = 0;       ///< EEPROM size in bytes; 0 when none.
  uint32_t registerLength = 0;     ///< Register dump size in bytes; 0 when none.
};
DriverInfo GetDriverInfo(Namespace& ns, const std::string& dev);

/// Duplex codes.
enum : uint8_t { DuplexHalf = 0, DuplexFull = 1, DuplexUnknown = 0xff };
/// Port codes (PORT_*).
enum : uint8_t {
  PortTp = 0,
  PortAui = 1,
  PortBnc = 2,
  PortMii = 3,
  PortFibre = 4,
  PortDa = 5,
  PortNone = 0xef,
  PortOther = 0xff
};

/// Speed, duplex and negotiation (ETHTOOL_MSG_LINKMODES_GET).
struct LinkModes {
  int ifindex = 0;                      ///< The link (filled by dumps).
  std::string device;                   ///< Its name (filled by dumps).
  bool autoneg = false;                 ///< Autonegotiation is on.
  uint32_t speed = 0;                   ///< Mbps; 0 when unknown (no link).
  uint8_t duplex = DuplexUnknown;       ///< DuplexHalf, DuplexFull or DuplexUnknown.
  uint32_t lanes = 0;                   ///< Lanes; 0 when not reported.
  std::vector<uint32_t> supported;      ///< Link mode bits the device supports.
  std::vector<uint32_t> advertised;     ///< Link mode bits it advertises.
  std::vector<uint32_t> peerAdvertised; ///< Bits the link partner advertises.
};
/// Port and transceiver (ETHTOOL_MSG_LINKINFO_GET).
struct LinkInfo {
  uint8_t port = PortOther; ///< Port code.
  uint8_t phyAddress = 0;   ///< PHY address.
  uint8_t transceiver = 0;  ///< 0 internal, 1 external.
  uint8_t mdix = 0;         ///< ETH_TP_MDI_* state.
};
/// Both, and the link state.
struct LinkSettings {
  LinkModes modes;              ///< Speed, duplex, negotiation.
  std::optional<LinkInfo> info; ///< Port; unset when the driver does not report it.
  std::optional<bool> link;     ///< Link detected; unset when unknown.
};
LinkSettings GetLinkSettings(Namespace& ns, const std::string& dev);
/// The link modes of every link that has them, in one dump.
std::vector<LinkModes> DumpLinkModes(Namespace& ns);

/// What SetLinkSettings changes.
struct LinkSettingsChange {
  std::optional<bool> autoneg;                     ///< Autonegotiation on or off.
  std::optional<uint32_t> speed;                   ///< Mbps (with autoneg off).
  std::optional<uint8_t> duplex;                   ///< DuplexHalf or DuplexFull.
  std::optional<std::vector<uint32_t>> advertised; ///< Link mode bits to advertise.
  std::optional<uint8_t> port;                     ///< Port code.
};
void SetLinkSettings(Namespace& ns, const std::string& dev, const LinkSettingsChange& change);
/// Restarts autonegotiation (ETHTOOL_NWAY_RST).
void RestartNegotiation(Namespace& ns, const std::string& dev);

/// One link mode bit.
struct LinkModeInfo {
  uint32_t bit;     ///< Bit number.
  const char* name; ///< "1000baseT/Full", or the name of a non-speed bit ("Autoneg").
  uint32_t speed;   ///< Mbps; 0 for a non-speed bit.
  uint8_t duplex;   ///< DuplexHalf, DuplexFull, or DuplexUnknown for a non-speed bit.
};
/// The description of \p bit, or null for a bit this library does not know.
const LinkModeInfo* FindLinkMode(uint32_t bit);

/// One offload feature (ETHTOOL_MSG_FEATURES_GET).
struct Feature {
  std::string name;        ///< Kernel name ("tx-tcp-segmentation").
  bool active = false;     ///< In effect.
  bool wanted = false;     ///< Asked for.
  bool changeable = false; ///< Can be changed (not fixed).
};
std::vector<Feature> GetFeatures(Namespace& ns, const std::string& dev);
/// Turns features on or off by name; refuses an unknown or fixed feature and
/// a change the driver did not make.
void SetFeatures(Namespace& ns, const std::string& dev,
                 const std::vector<std::pair<std::string, bool>>& changes);

/// The four offload groups of `ethtool -K` (rx, tx, sg, tso).
enum class OffloadGroup { RxChecksum, TxChecksum, ScatterGather, Tso };
/// Group states as `ethtool -k` shows them: on when a feature of the group is.
struct Offloads {
  bool rxChecksum = false, txChecksum = false, scatterGather = false, tso = false;
  bool tso6 = false; ///< tx-tcp6-segmentation.
};
Offloads SummarizeOffloads(const std::vector<Feature>& features);
/// Turns every changeable feature of \p group on or off.
void SetOffload(Namespace& ns, const std::string& dev, OffloadGroup group, bool on);

/// Channel (queue) counts; unset counts are the ones the driver lacks.
struct Channels {
  uint32_t rxMax = 0, txMax = 0, otherMax = 0, combinedMax = 0; ///< Maximums.
  std::optional<uint32_t> rx, tx, other, combined; ///< Current counts; in a set, the changes.
};
Channels GetChannels(Namespace& ns, const std::string& dev);
void SetChannels(Namespace& ns, const std::string& dev, const Channels& change);

/// Ring sizes in descriptors.
struct Rings {
  uint32_t rxMax = 0, rxMiniMax = 0, rxJumboMax = 0, txMax = 0; ///< Maximums.
  std::optional<uint32_t> rx, rxMini, rxJumbo, tx; ///< Current sizes; in a set, the changes.
};
Rings GetRings(Namespace& ns, const std::string& dev);
void SetRings(Namespace& ns, const std::string& dev, const Rings& change);

/// Interrupt coalescing; unset members are those the driver does not
/// support (in a get) or does not change (in a set).
struct Coalesce {
  std::optional<uint32_t> rxUsecs, rxMaxFrames, rxUsecsIrq, rxMaxFramesIrq;
  std::optional<uint32_t> txUsecs, txMaxFrames, txUsecsIrq, txMaxFramesIrq;
  std::optional<uint32_t> statsBlockUsecs;
  std::optional<bool> adaptiveRx, adaptiveTx;
  std::optional<uint32_t> pktRateLow, rxUsecsLow, rxMaxFramesLow, txUsecsLow, txMaxFramesLow;
  std::optional<uint32_t> pktRateHigh, rxUsecsHigh, rxMaxFramesHigh, txUsecsHigh, txMaxFramesHigh;
  std::optional<uint32_t> sampleInterval;
};
Coalesce GetCoalesce(Namespace& ns, const std::string& dev);
void SetCoalesce(Namespace& ns, const std::string& dev, const Coalesce& change);

/// Pause (flow control); in a set, unset members stay.
struct Pause {
  std::optional<bool> autoneg, rx, tx;
};
Pause GetPause(Namespace& ns, const std::string& dev);
void SetPause(Namespace& ns, const std::string& dev, const Pause& change);

/// Wake-on-LAN bits (WAKE_*): 1 PHY, 2 unicast, 4 multicast, 8 broadcast,
/// 16 ARP, 32 magic, 64 SecureOn magic, 128 filter.
struct WakeOnLan {
  uint32_t supported = 0; ///< Modes the device has.
  uint32_t enabled = 0;   ///< Modes in use.
};
WakeOnLan GetWakeOnLan(Namespace& ns, const std::string& dev);
void SetWakeOnLan(Namespace& ns, const std::string& dev, uint32_t modes);

/// Driver message level (NETIF_MSG_* bits).
uint32_t GetMessageLevel(Namespace& ns, const std::string& dev);
void SetMessageLevel(Namespace& ns, const std::string& dev, uint32_t level);

/// \p length bytes of the EEPROM from \p offset (0 length: all of it).
std::vector<uint8_t> ReadEeprom(Namespace& ns, const std::string& dev, uint32_t offset,
                                uint32_t length);
/// Writes \p data at \p offset; \p magic is the device's key.
void WriteEeprom(Namespace& ns, const std::string& dev, uint32_t magic, uint32_t offset,
                 const std::vector<uint8_t>& data);

/// A register dump: layout version and raw bytes, in the driver's format.
struct RegisterDump {
  uint32_t version = 0;
  std::vector<uint8_t> data;
};
RegisterDump DumpRegisters(Namespace& ns, const std::string& dev);

/// A self-test run.
struct SelfTestResult {
  bool failed = false;                                   ///< The driver reported a failure.
  std::vector<std::pair<std::string, uint64_t>> results; ///< Test name and result (0 passed).
};
/// Runs the self test; \p offline also runs the tests that interrupt traffic.
SelfTestResult RunSelfTest(Namespace& ns, const std::string& dev, bool offline);

/// Driver statistics (`ethtool -S`): name and value, in the driver's order.
std::vector<std::pair<std::string, uint64_t>> GetDriverStats(Namespace& ns, const std::string& dev);

/// Parsers of the kernel's replies. Netlink replies are whole messages
/// (netlink header, generic netlink header, attributes); ioctl replies are
/// the structures the ioctl filled, followed by their data.
namespace EthtoolWire {
LinkModes ParseLinkModes(std::span<const uint8_t> message);
LinkInfo ParseLinkInfo(std::span<const uint8_t> message);
/// \p names are the kernel's feature names by bit (its "features" string
/// set); without them only the features a verbose reply names are listed.
std::vector<Feature> ParseFeatures(std::span<const uint8_t> message,
                                   const std::vector<std::string>& names = {});
Channels ParseChannels(std::span<const uint8_t> message);
Rings ParseRings(std::span<const uint8_t> message);
Coalesce ParseCoalesce(std::span<const uint8_t> message);
Pause ParsePause(std::span<const uint8_t> message);
WakeOnLan ParseWakeOnLan(std::span<const uint8_t> message);
uint32_t ParseMessageLevel(std::span<const uint8_t> message);
/// struct ethtool_drvinfo.
DriverInfo ParseDriverInfo(std::span<const uint8_t> drvinfo);
/// struct ethtool_eeprom followed by its data.
std::vector<uint8_t> ParseEeprom(std::span<const uint8_t> eeprom);
/// struct ethtool_regs followed by its data.
RegisterDump ParseRegisters(std::span<const uint8_t> regs);
/// struct ethtool_test followed by its results, and the test names
/// (struct ethtool_gstrings followed by 32-byte names).
SelfTestResult ParseSelfTest(std::span<const uint8_t> test, std::span<const uint8_t> names);
/// struct ethtool_stats with its values, and the names as above.
std::vector<std::pair<std::string, uint64_t>> ParseStats(std::span<const uint8_t> stats,
                                                         std::span<const uint8_t> names);
} // namespace EthtoolWire

} // namespace LinuxNet
