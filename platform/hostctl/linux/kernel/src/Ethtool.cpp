//===- Ethtool.cpp - Ethtool requests over generic netlink and ioctl ------===//
#include "LinuxNet/Ethtool.h"
#include "LinuxNet/Namespace.h"

#include "Attr.h"
#include "EthtoolWire.h"
#include "Netlink.h"

#include <linux/ethtool.h>
#include <linux/ethtool_netlink.h>
#include <linux/sockios.h>
#include <net/if.h>
#include <netlink/genl/genl.h>
#include <sys/ioctl.h>

#include <cerrno>
#include <fnmatch.h>
#include <map>

namespace LinuxNet {

using namespace Detail;

namespace {

/// Every ETHTOOL_A_*_HEADER attribute has this type.
constexpr int kHeaderAttr = 1;

void Put(int rc) {
  if (rc < 0)
    throw Error(ENOMEM, "out of memory building an ethtool request");
}

std::span<const uint8_t> Bytes(const nlmsghdr* h) {
  return {reinterpret_cast<const uint8_t*>(h), h->nlmsg_len};
}

/// A request of \p cmd for \p dev (all devices when empty).
MsgPtr Request(Namespace& ns, uint8_t cmd, const std::string& dev, uint32_t flags) {
  const int family = ns.Internals().EthtoolFamily();
  MsgPtr msg(nlmsg_alloc());
  if (!msg ||
      !genlmsg_put(msg.get(), NL_AUTO_PORT, NL_AUTO_SEQ, family, 0, 0, cmd, ETHTOOL_GENL_VERSION))
    throw Error(ENOMEM, "out of memory building an ethtool request");
  nlattr* header = nla_nest_start(msg.get(), kHeaderAttr);
  if (!header)
    Put(-1);
  if (!dev.empty())
    Put(nla_put_string(msg.get(), ETHTOOL_A_HEADER_DEV_NAME, dev.c_str()));
  if (flags)
    Put(nla_put_u32(msg.get(), ETHTOOL_A_HEADER_FLAGS, flags));
  nla_nest_end(msg.get(), header);
  return msg;
}

/// Runs \p body; a refusal for want of driver support names the driver, and
/// a missing device reads as such.
template <typename F>
auto Guarded(Namespace& ns, const std::string& dev, const char* feature, bool change, F&& body) {
  Subject subject{dev, change, feature};
  try {
    return body(subject);
  } catch (const Error& e) {
    RethrowForLink(ns, dev, subject, e);
  }
}

/// Sends a get request and parses its one reply with \p parse.
template <typename Parse>
auto Query(Namespace& ns, const std::string& dev, uint8_t cmd, uint32_t flags, const char* feature,
           Parse parse) {
  return Guarded(ns, dev, feature, false, [&](const Subject& subject) {
    MsgPtr msg = Request(ns, cmd, dev, flags);
    decltype(parse(std::span<const uint8_t>{})) result{};
    ns.Internals().Genl().Request(msg.get(), subject,
                                  [&](nlmsghdr* h) { result = parse(Bytes(h)); });
    return result;
  });
}

/// Sends a set request built by \p fill.
template <typename Fill>
void Set(Namespace& ns, const std::string& dev, uint8_t cmd, const char* feature, Fill fill) {
  Guarded(ns, dev, feature, true, [&](const Subject& subject) {
    MsgPtr msg = Request(ns, cmd, dev, 0);
    fill(msg.get());
    ns.Internals().Genl().Request(msg.get(), subject);
    return 0;
  });
}

void PutU32(nl_msg* msg, int attr, const std::optional<uint32_t>& v) {
  if (v)
    Put(nla_put_u32(msg, attr, *v));
}

void PutU8(nl_msg* msg, int attr, const std::optional<bool>& v) {
  if (v)
    Put(nla_put_u8(msg, attr, *v ? 1 : 0));
}

/// A compact bitset attribute of \p size bits holding \p value, replacing
/// the whole set.
void PutBitset(nl_msg* msg, int attr, uint32_t size, const std::vector<uint32_t>& value) {
  nlattr* nest = nla_nest_start(msg, attr);
  if (!nest)
    Put(-1);
  std::vector<uint32_t> words((size + 31) / 32);
  for (std::size_t i = 0; i < words.size() && i < value.size(); ++i)
    words[i] = value[i];
  Put(nla_put_flag(msg, ETHTOOL_A_BITSET_NOMASK));
  Put(nla_put_u32(msg, ETHTOOL_A_BITSET_SIZE, size));
  Put(nla_put(msg, ETHTOOL_A_BITSET_VALUE, static_cast<int>(words.size() * 4), words.data()));
  nla_nest_end(msg, nest);
}

/// SIOCETHTOOL on \p dev with \p data.
void Ioctl(Namespace& ns, const std::string& dev, void* data, const Subject& subject) {
  if (dev.empty() || dev.size() >= IFNAMSIZ)
    throw Error(ENODEV, "the link " + dev + " does not exist");
  ifreq request{};
  memcpy(request.ifr_name, dev.data(), dev.size());
  request.ifr_data = static_cast<char*>(data);
  if (ioctl(ns.Internals().Ioctl(), SIOCETHTOOL, &request) != 0)
    Fail(errno, subject);
}

/// A buffer for an ioctl structure \p T followed by \p extra bytes.
template <typename T> std::vector<uint64_t> IoctlBuffer(uint32_t cmd, std::size_t extra) {
  std::vector<uint64_t> buffer((sizeof(T) + extra + 7) / 8);
  T head{};
  head.cmd = cmd;
  memcpy(buffer.data(), &head, sizeof head);
  return buffer;
}

std::span<const uint8_t> AsBytes(const std::vector<uint64_t>& buffer) {
  return {reinterpret_cast<const uint8_t*>(buffer.data()), buffer.size() * 8};
}

DriverInfo ReadDriverInfo(Namespace& ns, const std::string& dev, const Subject& subject) {
  ethtool_drvinfo info{};
  info.cmd = ETHTOOL_GDRVINFO;
  Ioctl(ns, dev, &info, subject);
  return EthtoolWire::ParseDriverInfo({reinterpret_cast<const uint8_t*>(&info), sizeof info});
}

/// The names of string set \p set, \p count of them.
std::vector<uint64_t> ReadStrings(Namespace& ns, const std::string& dev, uint32_t set,
                                  uint32_t count, const Subject& subject) {
  auto buffer = IoctlBuffer<ethtool_gstrings>(ETHTOOL_GSTRINGS,
                                              static_cast<std::size_t>(count) * ETH_GSTRING_LEN);
  auto* head = reinterpret_cast<ethtool_gstrings*>(buffer.data());
  head->string_set = set;
  head->len = count;
  Ioctl(ns, dev, buffer.data(), subject);
  return buffer;
}

/// Feature name patterns of the `ethtool -K` groups.
const char* GroupPattern(OffloadGroup group) {
  switch (group) {
  case OffloadGroup::RxChecksum:
    return "rx-checksum";
  case OffloadGroup::TxChecksum:
    return "tx-checksum-*";
  case OffloadGroup::ScatterGather:
    return "tx-scatter-gather*";
  case OffloadGroup::Tso:
    return "tx-tcp*-segmentation";
  }
  return "";
}

const char* GroupName(OffloadGroup group) {
  switch (group) {
  case OffloadGroup::RxChecksum:
    return "rx-checksumming";
  case OffloadGroup::TxChecksum:
    return "tx-checksumming";
  case OffloadGroup::ScatterGather:
    return "scatter-gather";
  case OffloadGroup::Tso:
    return "tcp-segmentation-offload";
  }
  return "";
}

bool Matches(const char* pattern, const std::string& name) {
  return fnmatch(pattern, name.c_str(), 0) == 0;
}

} // namespace

DriverInfo GetDriverInfo(Namespace& ns, const std::string& dev) {
  return Guarded(ns, dev, "driver information", false,
                 [&](const Subject& s) { return ReadDriverInfo(ns, dev, s); });
}

LinkSettings GetLinkSettings(Namespace& ns, const std::string& dev) {
  LinkSettings settings;
  settings.modes = Query(ns, dev, ETHTOOL_MSG_LINKMODES_GET, ETHTOOL_FLAG_COMPACT_BITSETS,
                         "link settings", EthtoolWire::ParseLinkModes);
  try {
    settings.info =
        Query(ns, dev, ETHTOOL_MSG_LINKINFO_GET, 0, "link information", EthtoolWire::ParseLinkInfo);
  } catch (const Error& e) {
    if (e.Code() != EOPNOTSUPP)
      throw;
  }
  try {
    settings.link = Query(
        ns, dev, ETHTOOL_MSG_LINKSTATE_GET, 0, "link state", [](std::span<const uint8_t> bytes) {
          GenlReply r(bytes, ETHTOOL_A_LINKSTATE_MAX);
          uint8_t link = 0;
          return r.tb[ETHTOOL_A_LINKSTATE_LINK] && Detail::Get(r.tb[ETHTOOL_A_LINKSTATE_LINK], link)
                     ? std::optional<bool>(link != 0)
                     : std::optional<bool>();
        });
  } catch (const Error& e) {
    if (e.Code() != EOPNOTSUPP)
      throw;
  }
  return settings;
}

std::vector<LinkModes> DumpLinkModes(Namespace& ns) {
  std::vector<LinkModes> all;
  MsgPtr msg = Request(ns, ETHTOOL_MSG_LINKMODES_GET, "", ETHTOOL_FLAG_COMPACT_BITSETS);
  ns.Internals().Genl().Dump(msg.get(), {"the link settings", false}, [&](nlmsghdr* h) {
    all.push_back(EthtoolWire::ParseLinkModes(Bytes(h)));
  });
  return all;
}

void SetLinkSettings(Namespace& ns, const std::string& dev, const LinkSettingsChange& change) {
  if (change.autoneg || change.speed || change.duplex || change.advertised)
    Set(ns, dev, ETHTOOL_MSG_LINKMODES_SET, "changing link settings", [&](nl_msg* msg) {
      if (change.autoneg)
        Put(nla_put_u8(msg, ETHTOOL_A_LINKMODES_AUTONEG,
                       *change.autoneg ? AUTONEG_ENABLE : AUTONEG_DISABLE));
      PutU32(msg, ETHTOOL_A_LINKMODES_SPEED, change.speed);
      if (change.duplex)
        Put(nla_put_u8(msg, ETHTOOL_A_LINKMODES_DUPLEX, *change.duplex));
      if (change.advertised) {
        std::vector<uint32_t> words(__ETHTOOL_LINK_MODE_MASK_NBITS / 32 + 1);
        for (uint32_t bit : *change.advertised)
          if (bit / 32 < words.size())
            words[bit / 32] |= 1u << (bit % 32);
        PutBitset(msg, ETHTOOL_A_LINKMODES_OURS, __ETHTOOL_LINK_MODE_MASK_NBITS, words);
      }
    });
  if (change.port)
    Set(ns, dev, ETHTOOL_MSG_LINKINFO_SET, "changing the port",
        [&](nl_msg* msg) { Put(nla_put_u8(msg, ETHTOOL_A_LINKINFO_PORT, *change.port)); });
}

void RestartNegotiation(Namespace& ns, const std::string& dev) {
  Guarded(ns, dev, "restarting autonegotiation", true, [&](const Subject& s) {
    ethtool_value value{};
    value.cmd = ETHTOOL_NWAY_RST;
    Ioctl(ns, dev, &value, s);
    return 0;
  });
}

std::vector<Feature> GetFeatures(Namespace& ns, const std::string& dev) {
  return Guarded(ns, dev, "offload features", false, [&](const Subject& s) {
    // The names of every feature the kernel knows, so that fixed features
    // that are off are listed too.
    auto info = IoctlBuffer<ethtool_sset_info>(ETHTOOL_GSSET_INFO, sizeof(uint32_t));
    reinterpret_cast<ethtool_sset_info*>(info.data())->sset_mask = 1ULL << ETH_SS_FEATURES;
    Ioctl(ns, dev, info.data(), s);
    uint32_t count = 0;
    memcpy(&count, reinterpret_cast<const uint8_t*>(info.data()) + sizeof(ethtool_sset_info),
           sizeof count);
    const auto strings = ReadStrings(ns, dev, ETH_SS_FEATURES, count, s);
    std::vector<std::string> names;
    const auto* p = reinterpret_cast<const char*>(strings.data()) + sizeof(ethtool_gstrings);
    for (std::size_t i = 0; i < count; ++i) {
      const char* name = p + i * std::size_t{ETH_GSTRING_LEN};
      names.emplace_back(name, strnlen(name, ETH_GSTRING_LEN));
    }
    MsgPtr msg = Request(ns, ETHTOOL_MSG_FEATURES_GET, dev, ETHTOOL_FLAG_COMPACT_BITSETS);
    std::vector<Feature> features;
    ns.Internals().Genl().Request(
        msg.get(), s, [&](nlmsghdr* h) { features = EthtoolWire::ParseFeatures(Bytes(h), names); });
    return features;
  });
}

void SetFeatures(Namespace& ns, const std::string& dev,
                 const std::vector<std::pair<std::string, bool>>& changes) {
  if (changes.empty())
    return;
  std::map<std::string, Feature> current;
  for (Feature& f : GetFeatures(ns, dev))
    current.emplace(f.name, f);
  std::string driver;
  for (const auto& [name, on] : changes) {
    auto it = current.find(name);
    if (it == current.end())
      throw Error(EINVAL, dev + ": there is no offload feature " + name);
    if (!it->second.changeable && it->second.active != on) {
      if (driver.empty())
        driver = DriverName(ns, dev);
      throw Error(EOPNOTSUPP, dev + ": the driver " + (driver.empty() ? "" : driver + " ") +
                                  "cannot turn " + name + (on ? " on" : " off"));
    }
  }
  Set(ns, dev, ETHTOOL_MSG_FEATURES_SET, "changing offload features", [&](nl_msg* msg) {
    nlattr* wanted = nla_nest_start(msg, ETHTOOL_A_FEATURES_WANTED);
    nlattr* bits = wanted ? nla_nest_start(msg, ETHTOOL_A_BITSET_BITS) : nullptr;
    if (!bits)
      Put(-1);
    for (const auto& [name, on] : changes) {
      nlattr* bit = nla_nest_start(msg, ETHTOOL_A_BITSET_BITS_BIT);
      if (!bit)
        Put(-1);
      Put(nla_put_string(msg, ETHTOOL_A_BITSET_BIT_NAME, name.c_str()));
      if (on)
        Put(nla_put_flag(msg, ETHTOOL_A_BITSET_BIT_VALUE));
      nla_nest_end(msg, bit);
    }
    nla_nest_end(msg, bits);
    nla_nest_end(msg, wanted);
  });
  // A driver may take a request and still leave a feature as it was (one
  // feature can depend on another): that is a refusal, not a success.
  for (const Feature& f : GetFeatures(ns, dev))
    for (const auto& [name, on] : changes)
      if (f.name == name && f.active != on)
        throw Error(EOPNOTSUPP, dev + ": the driver left " + name + (on ? " off" : " on"));
}

Offloads SummarizeOffloads(const std::vector<Feature>& features) {
  Offloads o;
  for (const Feature& f : features) {
    if (!f.active)
      continue;
    o.rxChecksum |= Matches(GroupPattern(OffloadGroup::RxChecksum), f.name);
    o.txChecksum |= Matches(GroupPattern(OffloadGroup::TxChecksum), f.name);
    o.scatterGather |= Matches(GroupPattern(OffloadGroup::ScatterGather), f.name);
    o.tso |= Matches(GroupPattern(OffloadGroup::Tso), f.name);
    o.tso6 |= f.name == "tx-tcp6-segmentation";
  }
  return o;
}

void SetOffload(Namespace& ns, const std::string& dev, OffloadGroup group, bool on) {
  std::vector<std::pair<std::string, bool>> changes;
  bool any = false;
  for (const Feature& f : GetFeatures(ns, dev)) {
    if (!Matches(GroupPattern(group), f.name))
      continue;
    any = any || f.changeable || f.active == on;
    if (f.changeable && f.active != on)
      changes.emplace_back(f.name, on);
  }
  if (!any) {
    const std::string driver = DriverName(ns, dev);
    throw Error(EOPNOTSUPP, dev + ": the driver " + (driver.empty() ? "" : driver + " ") +
                                "cannot turn " + GroupName(group) + (on ? " on" : " off"));
  }
  SetFeatures(ns, dev, changes);
}

Channels GetChannels(Namespace& ns, const std::string& dev) {
  return Query(ns, dev, ETHTOOL_MSG_CHANNELS_GET, 0, "channels", EthtoolWire::ParseChannels);
}

void SetChannels(Namespace& ns, const std::string& dev, const Channels& change) {
  Set(ns, dev, ETHTOOL_MSG_CHANNELS_SET, "changing channels", [&](nl_msg* msg) {
    PutU32(msg, ETHTOOL_A_CHANNELS_RX_COUNT, change.rx);
    PutU32(msg, ETHTOOL_A_CHANNELS_TX_COUNT, change.tx);
    PutU32(msg, ETHTOOL_A_CHANNELS_OTHER_COUNT, change.other);
    PutU32(msg, ETHTOOL_A_CHANNELS_COMBINED_COUNT, change.combined);
  });
}

Rings GetRings(Namespace& ns, const std::string& dev) {
  return Query(ns, dev, ETHTOOL_MSG_RINGS_GET, 0, "ring parameters", EthtoolWire::ParseRings);
}

void SetRings(Namespace& ns, const std::string& dev, const Rings& change) {
  Set(ns, dev, ETHTOOL_MSG_RINGS_SET, "ring parameters", [&](nl_msg* msg) {
    PutU32(msg, ETHTOOL_A_RINGS_RX, change.rx);
    PutU32(msg, ETHTOOL_A_RINGS_RX_MINI, change.rxMini);
    PutU32(msg, ETHTOOL_A_RINGS_RX_JUMBO, change.rxJumbo);
    PutU32(msg, ETHTOOL_A_RINGS_TX, change.tx);
  });
}

Coalesce GetCoalesce(Namespace& ns, const std::string& dev) {
  return Query(ns, dev, ETHTOOL_MSG_COALESCE_GET, 0, "interrupt coalescing",
               EthtoolWire::ParseCoalesce);
}

void SetCoalesce(Namespace& ns, const std::string& dev, const Coalesce& change) {
  Set(ns, dev, ETHTOOL_MSG_COALESCE_SET, "interrupt coalescing", [&](nl_msg* msg) {
    for (const CoalesceField& field : CoalesceFields())
      PutU32(msg, field.attr, change.*field.member);
    PutU8(msg, ETHTOOL_A_COALESCE_USE_ADAPTIVE_RX, change.adaptiveRx);
    PutU8(msg, ETHTOOL_A_COALESCE_USE_ADAPTIVE_TX, change.adaptiveTx);
  });
}

Pause GetPause(Namespace& ns, const std::string& dev) {
  return Query(ns, dev, ETHTOOL_MSG_PAUSE_GET, 0, "pause parameters", EthtoolWire::ParsePause);
}

void SetPause(Namespace& ns, const std::string& dev, const Pause& change) {
  Set(ns, dev, ETHTOOL_MSG_PAUSE_SET, "pause parameters", [&](nl_msg* msg) {
    PutU8(msg, ETHTOOL_A_PAUSE_AUTONEG, change.autoneg);
    PutU8(msg, ETHTOOL_A_PAUSE_RX, change.rx);
    PutU8(msg, ETHTOOL_A_PAUSE_TX, change.tx);
  });
}

WakeOnLan GetWakeOnLan(Namespace& ns, const std::string& dev) {
  return Query(ns, dev, ETHTOOL_MSG_WOL_GET, ETHTOOL_FLAG_COMPACT_BITSETS, "wake-on-LAN",
               EthtoolWire::ParseWakeOnLan);
}

void SetWakeOnLan(Namespace& ns, const std::string& dev, uint32_t modes) {
  Set(ns, dev, ETHTOOL_MSG_WOL_SET, "wake-on-LAN",
      [&](nl_msg* msg) { PutBitset(msg, ETHTOOL_A_WOL_MODES, WOL_MODE_COUNT, {modes}); });
}

uint32_t GetMessageLevel(Namespace& ns, const std::string& dev) {
  return Query(ns, dev, ETHTOOL_MSG_DEBUG_GET, ETHTOOL_FLAG_COMPACT_BITSETS, "message levels",
               EthtoolWire::ParseMessageLevel);
}

void SetMessageLevel(Namespace& ns, const std::string& dev, uint32_t level) {
  Set(ns, dev, ETHTOOL_MSG_DEBUG_SET, "message levels",
      [&](nl_msg* msg) { PutBitset(msg, ETHTOOL_A_DEBUG_MSGMASK, 32, {level}); });
}

std::vector<uint8_t> ReadEeprom(Namespace& ns, const std::string& dev, uint32_t offset,
                                uint32_t length) {
  return Guarded(ns, dev, "EEPROM access", false, [&](const Subject& s) {
    const DriverInfo info = ReadDriverInfo(ns, dev, s);
    if (info.eepromLength) {
      if (!length)
        length = info.eepromLength - std::min(offset, info.eepromLength);
      if (offset > info.eepromLength || length > info.eepromLength - offset)
        throw Error(EINVAL, dev + ": the EEPROM has " + std::to_string(info.eepromLength) +
                                " bytes; " + std::to_string(length) + " from offset " +
                                std::to_string(offset) + " do not fit");
    }
    auto buffer = IoctlBuffer<ethtool_eeprom>(ETHTOOL_GEEPROM, length);
    auto* head = reinterpret_cast<ethtool_eeprom*>(buffer.data());
    head->offset = offset;
    head->len = length;
    Ioctl(ns, dev, buffer.data(), s);
    return EthtoolWire::ParseEeprom(AsBytes(buffer));
  });
}

void WriteEeprom(Namespace& ns, const std::string& dev, uint32_t magic, uint32_t offset,
                 const std::vector<uint8_t>& data) {
  Guarded(ns, dev, "EEPROM access", true, [&](const Subject& s) {
    auto buffer = IoctlBuffer<ethtool_eeprom>(ETHTOOL_SEEPROM, data.size());
    auto* head = reinterpret_cast<ethtool_eeprom*>(buffer.data());
    head->magic = magic;
    head->offset = offset;
    head->len = static_cast<uint32_t>(data.size());
    memcpy(reinterpret_cast<uint8_t*>(buffer.data()) + sizeof(ethtool_eeprom), data.data(),
           data.size());
    Ioctl(ns, dev, buffer.data(), s);
    return 0;
  });
}

RegisterDump DumpRegisters(Namespace& ns, const std::string& dev) {
  return Guarded(ns, dev, "register dumps", false, [&](const Subject& s) {
    const DriverInfo info = ReadDriverInfo(ns, dev, s);
    auto buffer = IoctlBuffer<ethtool_regs>(ETHTOOL_GREGS, info.registerLength);
    reinterpret_cast<ethtool_regs*>(buffer.data())->len = info.registerLength;
    Ioctl(ns, dev, buffer.data(), s);
    return EthtoolWire::ParseRegisters(AsBytes(buffer));
  });
}

SelfTestResult RunSelfTest(Namespace& ns, const std::string& dev, bool offline) {
  return Guarded(ns, dev, "self tests", true, [&](const Subject& s) {
    const DriverInfo info = ReadDriverInfo(ns, dev, s);
    auto test = IoctlBuffer<ethtool_test>(ETHTOOL_TEST, std::size_t{info.testCount} * 8);
    auto* head = reinterpret_cast<ethtool_test*>(test.data());
    head->flags = offline ? ETH_TEST_FL_OFFLINE : 0;
    head->len = info.testCount;
    Ioctl(ns, dev, test.data(), s);
    const auto names = ReadStrings(ns, dev, ETH_SS_TEST, info.testCount, s);
    return EthtoolWire::ParseSelfTest(AsBytes(test), AsBytes(names));
  });
}

std::vector<std::pair<std::string, uint64_t>> GetDriverStats(Namespace& ns,
                                                             const std::string& dev) {
  return Guarded(ns, dev, "driver statistics", false, [&](const Subject& s) {
    const DriverInfo info = ReadDriverInfo(ns, dev, s);
    const auto names = ReadStrings(ns, dev, ETH_SS_STATS, info.statsCount, s);
    auto stats = IoctlBuffer<ethtool_stats>(ETHTOOL_GSTATS, std::size_t{info.statsCount} * 8);
    reinterpret_cast<ethtool_stats*>(stats.data())->n_stats = info.statsCount;
    Ioctl(ns, dev, stats.data(), s);
    return EthtoolWire::ParseStats(AsBytes(stats), AsBytes(names));
  });
}

} // namespace LinuxNet
