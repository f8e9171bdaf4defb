//===- EthtoolWire.cpp - Reading the kernel's ethtool replies -------------===//
//
// Each parser takes the bytes of one reply, so that recorded replies of
// drivers this machine does not have can be read in tests as the kernel's.
//
//===----------------------------------------------------------------------===//
#include "LinuxNet/Error.h"
#include "LinuxNet/Ethtool.h"

#include "Attr.h"
#include "EthtoolWire.h"

#include <linux/ethtool.h>
#include <linux/ethtool_netlink.h>
#include <netlink/genl/genl.h>

#include <cerrno>
#include <map>

namespace LinuxNet {

using namespace Detail;

namespace Detail {

GenlReply::GenlReply(std::span<const uint8_t> bytes, int max)
    : tb(static_cast<std::size_t>(max) + 1) {
  if (bytes.size() < NLMSG_HDRLEN + GENL_HDRLEN)
    throw Error(EPROTO,
                "an ethtool reply of " + std::to_string(bytes.size()) + " bytes is too short");
  storage_.resize((bytes.size() + 7) / 8);
  memcpy(storage_.data(), bytes.data(), bytes.size());
  auto* h = reinterpret_cast<nlmsghdr*>(storage_.data());
  if (h->nlmsg_len < NLMSG_HDRLEN + GENL_HDRLEN || h->nlmsg_len > bytes.size() ||
      genlmsg_parse(h, 0, tb.data(), max, nullptr) < 0)
    throw Error(EPROTO, "an ethtool reply is malformed");
}

Bitset ParseBitset(const nlattr* a) {
  Bitset b;
  nlattr* tb[ETHTOOL_A_BITSET_MAX + 1];
  if (!ParseNested(tb, ETHTOOL_A_BITSET_MAX, a))
    return b;
  b.noMask = tb[ETHTOOL_A_BITSET_NOMASK] != nullptr;
  b.size = Value<uint32_t>(tb[ETHTOOL_A_BITSET_SIZE]);
  auto words = [](const nlattr* w) {
    std::vector<uint32_t> v;
    if (w) {
      v.resize(static_cast<std::size_t>(nla_len(w)) / 4);
      memcpy(v.data(), nla_data(w), v.size() * 4);
    }
    return v;
  };
  if (tb[ETHTOOL_A_BITSET_VALUE]) {
    b.value = words(tb[ETHTOOL_A_BITSET_VALUE]);
    b.mask = words(tb[ETHTOOL_A_BITSET_MASK]);
    return b;
  }
  auto set = [](std::vector<uint32_t>& v, uint32_t bit) {
    if (v.size() <= bit / 32)
      v.resize(bit / 32 + 1);
    v[bit / 32] |= 1u << (bit % 32);
  };
  int remaining = 0;
  const nlattr* bit = nullptr;
  if (tb[ETHTOOL_A_BITSET_BITS]) {
    nla_for_each_nested(bit, tb[ETHTOOL_A_BITSET_BITS], remaining) {
      nlattr* bt[ETHTOOL_A_BITSET_BIT_MAX + 1];
      if (nla_type(bit) != ETHTOOL_A_BITSET_BITS_BIT ||
          !ParseNested(bt, ETHTOOL_A_BITSET_BIT_MAX, bit) || !bt[ETHTOOL_A_BITSET_BIT_INDEX])
        continue;
      const uint32_t index = Value<uint32_t>(bt[ETHTOOL_A_BITSET_BIT_INDEX]);
      b.names.emplace_back(index, String(bt[ETHTOOL_A_BITSET_BIT_NAME]));
      set(b.mask, index);
      if (b.noMask || bt[ETHTOOL_A_BITSET_BIT_VALUE])
        set(b.value, index);
    }
  }
  return b;
}

bool TestBit(const std::vector<uint32_t>& words, uint32_t bit) {
  return bit / 32 < words.size() && (words[bit / 32] >> (bit % 32)) & 1;
}

std::vector<uint32_t> SetBits(const std::vector<uint32_t>& words) {
  std::vector<uint32_t> bits;
  for (uint32_t i = 0; i < words.size() * 32; ++i)
    if (TestBit(words, i))
      bits.push_back(i);
  return bits;
}

constexpr CoalesceField kCoalesceFields[] = {
    {ETHTOOL_A_COALESCE_RX_USECS, &Coalesce::rxUsecs},
    {ETHTOOL_A_COALESCE_RX_MAX_FRAMES, &Coalesce::rxMaxFrames},
    {ETHTOOL_A_COALESCE_RX_USECS_IRQ, &Coalesce::rxUsecsIrq},
    {ETHTOOL_A_COALESCE_RX_MAX_FRAMES_IRQ, &Coalesce::rxMaxFramesIrq},
    {ETHTOOL_A_COALESCE_TX_USECS, &Coalesce::txUsecs},
    {ETHTOOL_A_COALESCE_TX_MAX_FRAMES, &Coalesce::txMaxFrames},
    {ETHTOOL_A_COALESCE_TX_USECS_IRQ, &Coalesce::txUsecsIrq},
    {ETHTOOL_A_COALESCE_TX_MAX_FRAMES_IRQ, &Coalesce::txMaxFramesIrq},
    {ETHTOOL_A_COALESCE_STATS_BLOCK_USECS, &Coalesce::statsBlockUsecs},
    {ETHTOOL_A_COALESCE_PKT_RATE_LOW, &Coalesce::pktRateLow},
    {ETHTOOL_A_COALESCE_RX_USECS_LOW, &Coalesce::rxUsecsLow},
    {ETHTOOL_A_COALESCE_RX_MAX_FRAMES_LOW, &Coalesce::rxMaxFramesLow},
    {ETHTOOL_A_COALESCE_TX_USECS_LOW, &Coalesce::txUsecsLow},
    {ETHTOOL_A_COALESCE_TX_MAX_FRAMES_LOW, &Coalesce::txMaxFramesLow},
    {ETHTOOL_A_COALESCE_PKT_RATE_HIGH, &Coalesce::pktRateHigh},
    {ETHTOOL_A_COALESCE_RX_USECS_HIGH, &Coalesce::rxUsecsHigh},
    {ETHTOOL_A_COALESCE_RX_MAX_FRAMES_HIGH, &Coalesce::rxMaxFramesHigh},
    {ETHTOOL_A_COALESCE_TX_USECS_HIGH, &Coalesce::txUsecsHigh},
    {ETHTOOL_A_COALESCE_TX_MAX_FRAMES_HIGH, &Coalesce::txMaxFramesHigh},
    {ETHTOOL_A_COALESCE_RATE_SAMPLE_INTERVAL, &Coalesce::sampleInterval},
};

std::span<const CoalesceField> CoalesceFields() {
  return kCoalesceFields;
}

} // namespace Detail

namespace {

std::optional<uint32_t> U32(const nlattr* a) {
  uint32_t v = 0;
  return Get(a, v) ? std::optional<uint32_t>(v) : std::nullopt;
}

std::optional<bool> Flag(const nlattr* a) {
  uint8_t v = 0;
  return Get(a, v) ? std::optional<bool>(v != 0) : std::nullopt;
}

/// A fixed-size ioctl structure at the start of \p bytes.
template <typename T> T Head(std::span<const uint8_t> bytes, const char* what) {
  if (bytes.size() < sizeof(T))
    throw Error(EPROTO, std::string("a short ") + what + " reply");
  T t{};
  memcpy(&t, bytes.data(), sizeof(T));
  return t;
}

std::string Text(const char* p, std::size_t n) {
  return std::string(p, strnlen(p, n));
}

/// The names of a string set reply (struct ethtool_gstrings and its data).
std::vector<std::string> Names(std::span<const uint8_t> bytes) {
  const auto head = Head<ethtool_gstrings>(bytes, "string set");
  std::vector<std::string> names;
  const std::size_t available = (bytes.size() - sizeof(ethtool_gstrings)) / ETH_GSTRING_LEN;
  const std::size_t count = std::min<std::size_t>(head.len, available);
  const auto* p = reinterpret_cast<const char*>(bytes.data() + sizeof(ethtool_gstrings));
  for (std::size_t i = 0; i < count; ++i)
    names.push_back(Text(p + i * ETH_GSTRING_LEN, ETH_GSTRING_LEN));
  return names;
}

/// \p count 64-bit values from \p data (fewer when it is short), each with
/// its label, or \p fallback and its position.
std::vector<std::pair<std::string, uint64_t>> Counters(std::span<const uint8_t> data,
                                                       uint32_t count,
                                                       const std::vector<std::string>& labels,
                                                       const char* fallback) {
  std::vector<std::pair<std::string, uint64_t>> values;
  const std::size_t n = std::min<std::size_t>(count, data.size() / 8);
  for (std::size_t i = 0; i < n; ++i) {
    uint64_t value = 0;
    memcpy(&value, data.data() + i * 8, 8);
    values.emplace_back(i < labels.size() ? labels[i] : fallback + std::to_string(i), value);
  }
  return values;
}

} // namespace

namespace EthtoolWire {

LinkModes ParseLinkModes(std::span<const uint8_t> message) {
  GenlReply r(message, ETHTOOL_A_LINKMODES_MAX);
  LinkModes m;
  nlattr* header[ETHTOOL_A_HEADER_MAX + 1];
  if (ParseNested(header, ETHTOOL_A_HEADER_MAX, r.tb[ETHTOOL_A_LINKMODES_HEADER])) {
    m.ifindex = static_cast<int>(Value<uint32_t>(header[ETHTOOL_A_HEADER_DEV_INDEX]));
    m.device = String(header[ETHTOOL_A_HEADER_DEV_NAME]);
  }
  m.autoneg = Value<uint8_t>(r.tb[ETHTOOL_A_LINKMODES_AUTONEG]) == AUTONEG_ENABLE;
  const uint32_t speed = Value<uint32_t>(r.tb[ETHTOOL_A_LINKMODES_SPEED], SPEED_UNKNOWN);
  m.speed = speed == static_cast<uint32_t>(SPEED_UNKNOWN) ? 0 : speed;
  m.duplex = Value<uint8_t>(r.tb[ETHTOOL_A_LINKMODES_DUPLEX], DUPLEX_UNKNOWN);
  if (m.duplex != DuplexHalf && m.duplex != DuplexFull)
    m.duplex = DuplexUnknown;
  m.lanes = Value<uint32_t>(r.tb[ETHTOOL_A_LINKMODES_LANES]);
  const Bitset ours = ParseBitset(r.tb[ETHTOOL_A_LINKMODES_OURS]);
  m.advertised = SetBits(ours.value);
  m.supported = SetBits(ours.noMask ? ours.value : ours.mask);
  m.peerAdvertised = SetBits(ParseBitset(r.tb[ETHTOOL_A_LINKMODES_PEER]).value);
  return m;
}

LinkInfo ParseLinkInfo(std::span<const uint8_t> message) {
  GenlReply r(message, ETHTOOL_A_LINKINFO_MAX);
  LinkInfo info;
  info.port = Value<uint8_t>(r.tb[ETHTOOL_A_LINKINFO_PORT], PortOther);
  info.phyAddress = Value<uint8_t>(r.tb[ETHTOOL_A_LINKINFO_PHYADDR]);
  info.transceiver = Value<uint8_t>(r.tb[ETHTOOL_A_LINKINFO_TRANSCEIVER]);
  info.mdix = Value<uint8_t>(r.tb[ETHTOOL_A_LINKINFO_TP_MDIX]);
  return info;
}

std::vector<Feature> ParseFeatures(std::span<const uint8_t> message,
                                   const std::vector<std::string>& names) {
  GenlReply r(message, ETHTOOL_A_FEATURES_MAX);
  const Bitset hw = ParseBitset(r.tb[ETHTOOL_A_FEATURES_HW]);
  const Bitset wanted = ParseBitset(r.tb[ETHTOOL_A_FEATURES_WANTED]);
  const Bitset active = ParseBitset(r.tb[ETHTOOL_A_FEATURES_ACTIVE]);
  const Bitset nochange = ParseBitset(r.tb[ETHTOOL_A_FEATURES_NOCHANGE]);
  // Every feature of the string set, or else every one a set names, by bit.
  std::map<uint32_t, std::string> byBit;
  for (std::size_t bit = 0; bit < names.size(); ++bit)
    byBit.emplace(static_cast<uint32_t>(bit), names[bit]);
  for (const Bitset* b : {&hw, &wanted, &active, &nochange})
    for (const auto& [bit, name] : b->names)
      byBit.emplace(bit, name);
  for (const Bitset* b : {&hw, &wanted, &active})
    for (uint32_t bit : SetBits(b->value))
      byBit.emplace(bit, "bit " + std::to_string(bit));
  std::vector<Feature> features;
  for (const auto& [bit, name] : byBit) {
    Feature f;
    f.name = name;
    f.active = TestBit(active.value, bit);
    f.wanted = TestBit(wanted.value, bit);
    f.changeable = TestBit(hw.value, bit) && !TestBit(nochange.value, bit);
    features.push_back(std::move(f));
  }
  return features;
}

Channels ParseChannels(std::span<const uint8_t> message) {
  GenlReply r(message, ETHTOOL_A_CHANNELS_MAX);
  Channels c;
  c.rxMax = Value<uint32_t>(r.tb[ETHTOOL_A_CHANNELS_RX_MAX]);
  c.txMax = Value<uint32_t>(r.tb[ETHTOOL_A_CHANNELS_TX_MAX]);
  c.otherMax = Value<uint32_t>(r.tb[ETHTOOL_A_CHANNELS_OTHER_MAX]);
  c.combinedMax = Value<uint32_t>(r.tb[ETHTOOL_A_CHANNELS_COMBINED_MAX]);
  c.rx = U32(r.tb[ETHTOOL_A_CHANNELS_RX_COUNT]);
  c.tx = U32(r.tb[ETHTOOL_A_CHANNELS_TX_COUNT]);
  c.other = U32(r.tb[ETHTOOL_A_CHANNELS_OTHER_COUNT]);
  c.combined = U32(r.tb[ETHTOOL_A_CHANNELS_COMBINED_COUNT]);
  return c;
}

Rings ParseRings(std::span<const uint8_t> message) {
  GenlReply r(message, ETHTOOL_A_RINGS_MAX);
  Rings g;
  g.rxMax = Value<uint32_t>(r.tb[ETHTOOL_A_RINGS_RX_MAX]);
  g.rxMiniMax = Value<uint32_t>(r.tb[ETHTOOL_A_RINGS_RX_MINI_MAX]);
  g.rxJumboMax = Value<uint32_t>(r.tb[ETHTOOL_A_RINGS_RX_JUMBO_MAX]);
  g.txMax = Value<uint32_t>(r.tb[ETHTOOL_A_RINGS_TX_MAX]);
  g.rx = U32(r.tb[ETHTOOL_A_RINGS_RX]);
  g.rxMini = U32(r.tb[ETHTOOL_A_RINGS_RX_MINI]);
  g.rxJumbo = U32(r.tb[ETHTOOL_A_RINGS_RX_JUMBO]);
  g.tx = U32(r.tb[ETHTOOL_A_RINGS_TX]);
  return g;
}

Coalesce ParseCoalesce(std::span<const uint8_t> message) {
  GenlReply r(message, ETHTOOL_A_COALESCE_MAX);
  Coalesce c;
  for (const auto& field : CoalesceFields())
    c.*field.member = U32(r.tb[field.attr]);
  c.adaptiveRx = Flag(r.tb[ETHTOOL_A_COALESCE_USE_ADAPTIVE_RX]);
  c.adaptiveTx = Flag(r.tb[ETHTOOL_A_COALESCE_USE_ADAPTIVE_TX]);
  return c;
}

Pause ParsePause(std::span<const uint8_t> message) {
  GenlReply r(message, ETHTOOL_A_PAUSE_MAX);
  return {Flag(r.tb[ETHTOOL_A_PAUSE_AUTONEG]), Flag(r.tb[ETHTOOL_A_PAUSE_RX]),
          Flag(r.tb[ETHTOOL_A_PAUSE_TX])};
}

WakeOnLan ParseWakeOnLan(std::span<const uint8_t> message) {
  GenlReply r(message, ETHTOOL_A_WOL_MAX);
  const Bitset modes = ParseBitset(r.tb[ETHTOOL_A_WOL_MODES]);
  WakeOnLan w;
  w.enabled = modes.value.empty() ? 0 : modes.value[0];
  w.supported = modes.noMask ? w.enabled : (modes.mask.empty() ? 0 : modes.mask[0]);
  return w;
}

uint32_t ParseMessageLevel(std::span<const uint8_t> message) {
  GenlReply r(message, ETHTOOL_A_DEBUG_MAX);
  const Bitset mask = ParseBitset(r.tb[ETHTOOL_A_DEBUG_MSGMASK]);
  return mask.value.empty() ? 0 : mask.value[0];
}

DriverInfo ParseDriverInfo(std::span<const uint8_t> bytes) {
  const auto d = Head<ethtool_drvinfo>(bytes, "driver information");
  DriverInfo info;
  info.driver = Text(d.driver, sizeof d.driver);
  info.version = Text(d.version, sizeof d.version);
  info.firmwareVersion = Text(d.fw_version, sizeof d.fw_version);
  info.busInfo = Text(d.bus_info, sizeof d.bus_info);
  info.expansionRomVersion = Text(d.erom_version, sizeof d.erom_version);
  info.statsCount = d.n_stats;
  info.testCount = d.testinfo_len;
  info.eepromLength = d.eedump_len;
  info.registerLength = d.regdump_len;
  return info;
}

std::vector<uint8_t> ParseEeprom(std::span<const uint8_t> bytes) {
  const auto e = Head<ethtool_eeprom>(bytes, "EEPROM");
  const std::size_t n = std::min<std::size_t>(e.len, bytes.size() - sizeof(ethtool_eeprom));
  const auto* p = bytes.data() + sizeof(ethtool_eeprom);
  return std::vector<uint8_t>(p, p + n);
}

RegisterDump ParseRegisters(std::span<const uint8_t> bytes) {
  const auto regs = Head<ethtool_regs>(bytes, "register dump");
  const std::size_t n = std::min<std::size_t>(regs.len, bytes.size() - sizeof(ethtool_regs));
  const auto* p = bytes.data() + sizeof(ethtool_regs);
  return {regs.version, std::vector<uint8_t>(p, p + n)};
}

SelfTestResult ParseSelfTest(std::span<const uint8_t> test, std::span<const uint8_t> names) {
  const auto t = Head<ethtool_test>(test, "self test");
  const std::vector<std::string> labels = names.empty() ? std::vector<std::string>{} : Names(names);
  SelfTestResult result;
  result.failed = t.flags & ETH_TEST_FL_FAILED;
  result.results = Counters(test.subspan(sizeof(ethtool_test)), t.len, labels, "test ");
  return result;
}

std::vector<std::pair<std::string, uint64_t>> ParseStats(std::span<const uint8_t> stats,
                                                         std::span<const uint8_t> names) {
  const auto s = Head<ethtool_stats>(stats, "statistics");
  const std::vector<std::string> labels = Names(names);
  return Counters(stats.subspan(sizeof(ethtool_stats)), s.n_stats, labels, "stat ");
}

} // namespace EthtoolWire

const LinkModeInfo* FindLinkMode(uint32_t bit) {
  static const LinkModeInfo modes[] = {
#define LINK_MODE(bit, name, speed, duplex) {bit, name, speed, duplex},
#include "LinkModes.def"
#undef LINK_MODE
  };
  for (const auto& m : modes)
    if (m.bit == bit)
      return &m;
  return nullptr;
}

} // namespace LinuxNet
