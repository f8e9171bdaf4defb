//===- model/NicHwPart.cpp - Hardware settings of the physical NICs -------===//
//
// The NIC hardware part keeps, per physical NIC, one JSON record of each
// hardware kind in the side table pnic_record (see NicHwModel.h). It imports the
// keys of the same names inside each object of "nics" and exports them back.
//
//===----------------------------------------------------------------------===//
#include "model/NicHwModel.h"

#include "model/JsonRead.h"
#include "model/Part.h"

#include <algorithm>
#include <cstdio>
#include <initializer_list>
#include <limits>
#include <set>

namespace Model {

using nlohmann::ordered_json;
using namespace HostCtl::Network;

const std::array<const char*, kNetqueueSettingCount> kNetqueueSettingNames = {
    "RxQPair",    "RxQNoFeature", "PreEmptibleQ", "RxQLatency", "RxDynamicLB", "DynamicQPool",
    "MacLearnLB", "RSS",          "LRO",          "GeneveOAM",  "RSSLRO"};

const std::array<const char*, kNetqueueFilterClassCount> kNetqueueFilterClassNames = {
    "macOnly", "vlanOnly", "vlanMac", "vxlan", "geneve", "genericEncap"};

const std::array<const char*, kSoftwareFeatureCount> kSoftwareFeatureNames = {
    "ipv4cso", "ipv4tso",    "sg",      "obo",  "vxlanencap", "ipv6tso",   "ipv6tsoext",
    "ipv6cso", "ipv6csoext", "highdma", "sgsp", "tagging",    "untagging", "geneveoffload"};

const std::vector<std::string>& HwCapNames() {
  // Names of our own; bits without an entry have no name.
  static const std::vector<std::string> names = {
      "RxChecksumV4",    "TxChecksumV4",   "RxChecksumV6",    "TxChecksumV6",     "SegmentationV4",
      "SegmentationV6",  "ScatterGather",  "MultiPageGather", "VlanInsert",       "VlanStrip",
      "LargeReceive",    "ReceiveScaling", "TunnelVxlan",     "TunnelGeneve",     "EncapOffset",
      "HighDmaAddress",  "PreciseClock",   "WakeOnLan",       "FlowSteering",     "PauseFrames",
      "EnergySaving",    "QueuePairs",     "DcbPriority",     "VirtualFunctions", "PacketPacing",
      "JumboFrames",     "LinkCrypto",     "RemoteMemory",    "TimeSlicedQueues", "InlineFiltering",
      "TelemetryStream", "ReservedPath",   "ExtendedStats",   "PortMirroring"};
  return names;
}

namespace {

constexpr int64_t kU32Max = std::numeric_limits<uint32_t>::max();
constexpr int64_t kU8Max = std::numeric_limits<uint8_t>::max();

/// Refuses keys of \p object that are not in \p keys.
void CheckKnown(const JsonObject& object, std::initializer_list<const char*> keys) {
  for (const auto& item : object.Json().items()) {
    const std::string& key = item.key();
    bool known = std::any_of(keys.begin(), keys.end(), [&](const char* k) { return key == k; });
    if (!known)
      object.Fail(key.c_str(), "unknown field");
  }
}

/// Reads an array of names from \p table into \p flags; unknown or repeated
/// names are refused.
template <std::size_t N>
void NamesToFlags(const JsonObject& object, const char* key,
                  const std::array<const char*, N>& table, std::array<bool, N>& flags) {
  for (const std::string& name : object.Strings(key)) {
    auto it = std::find_if(table.begin(), table.end(), [&](const char* n) { return name == n; });
    if (it == table.end())
      object.Fail(key, "unknown name \"" + name + "\"");
    bool& flag = flags[static_cast<std::size_t>(it - table.begin())];
    if (flag)
      object.Fail(key, "\"" + name + "\" is named twice");
    flag = true;
  }
}

template <std::size_t N>
ordered_json FlagsToNames(const std::array<const char*, N>& table,
                          const std::array<bool, N>& flags) {
  ordered_json names = ordered_json::array();
  for (std::size_t i = 0; i < N; ++i)
    if (flags[i])
      names.push_back(table[i]);
  return names;
}

uint32_t U32(const JsonObject& object, const char* key) {
  return static_cast<uint32_t>(object.Int(key, 0, kU32Max, 0));
}

uint8_t U8(const JsonObject& object, const char* key) {
  return static_cast<uint8_t>(object.Int(key, 0, kU8Max, 0));
}

DcbClassArray ClassArray(const JsonObject& object, const char* key) {
  DcbClassArray out{};
  if (!object.Has(key))
    return out;
  std::vector<int64_t> values = object.Ints(key, 0, kU8Max);
  if (values.size() != out.size())
    object.Fail(key, "expected 8 integers");
  std::copy(values.begin(), values.end(), out.begin());
  return out;
}

ordered_json ClassArrayJson(const DcbClassArray& values) {
  ordered_json out = ordered_json::array();
  for (uint8_t v : values)
    out.push_back(v);
  return out;
}

/// One 32-bit field of the coalescing record.
struct CoalesceField {
  const char* key;                      ///< JSON key.
  uint32_t PnicCoalesceParams::*member; ///< Record field.
};

constexpr CoalesceField kCoalesceFields[] = {
    {"statsBlockUsecs", &PnicCoalesceParams::statsBlockUsecs},
    {"sampleInterval", &PnicCoalesceParams::sampleInterval},
    {"pktRateLow", &PnicCoalesceParams::pktRateLow},
    {"pktRateHigh", &PnicCoalesceParams::pktRateHigh},
    {"rxUsecs", &PnicCoalesceParams::rxUsecs},
    {"rxMaxFrames", &PnicCoalesceParams::rxMaxFrames},
    {"rxUsecsIrq", &PnicCoalesceParams::rxUsecsIrq},
    {"rxMaxFramesIrq", &PnicCoalesceParams::rxMaxFramesIrq},
    {"txUsecs", &PnicCoalesceParams::txUsecs},
    {"txMaxFrames", &PnicCoalesceParams::txMaxFrames},
    {"txUsecsIrq", &PnicCoalesceParams::txUsecsIrq},
    {"txMaxFramesIrq", &PnicCoalesceParams::txMaxFramesIrq},
    {"rxUsecsLow", &PnicCoalesceParams::rxUsecsLow},
    {"rxMaxFramesLow", &PnicCoalesceParams::rxMaxFramesLow},
    {"txUsecsLow", &PnicCoalesceParams::txUsecsLow},
    {"txMaxFramesLow", &PnicCoalesceParams::txMaxFramesLow},
    {"rxUsecsHigh", &PnicCoalesceParams::rxUsecsHigh},
    {"rxMaxFramesHigh", &PnicCoalesceParams::rxMaxFramesHigh},
    {"txUsecsHigh", &PnicCoalesceParams::txUsecsHigh},
    {"txMaxFramesHigh", &PnicCoalesceParams::txMaxFramesHigh},
};

/// One ring of the ring record.
struct RingField {
  const char* key;                  ///< JSON key.
  uint32_t PnicRingParams::*member; ///< Record field.
};

constexpr RingField kRingFields[] = {{"rx", &PnicRingParams::rx},
                                     {"rxMini", &PnicRingParams::rxMini},
                                     {"rxJumbo", &PnicRingParams::rxJumbo},
                                     {"tx", &PnicRingParams::tx}};

PnicRingParams DecodeRing(const JsonObject& object) {
  CheckKnown(object, {"rx", "rxMini", "rxJumbo", "tx"});
  PnicRingParams ring;
  for (const RingField& field : kRingFields)
    ring.*field.member = U32(object, field.key);
  return ring;
}

ordered_json EncodeRing(const PnicRingParams& ring) {
  ordered_json out = ordered_json::object();
  for (const RingField& field : kRingFields)
    out[field.key] = ring.*field.member;
  return out;
}

} // namespace

// --- Codecs.

void Decode(const ordered_json& json, const std::string& path, PnicOffloadSettings& out) {
  JsonObject o(json, path);
  CheckKnown(o,
             {"rxChecksum", "txChecksum", "scatterGather", "tso", "tso6", "encapOffload", "text"});
  out.rxChecksum = o.Bool("rxChecksum", false);
  out.txChecksum = o.Bool("txChecksum", false);
  out.scatterGather = o.Bool("scatterGather", false);
  out.tso = o.Bool("tso", false);
  out.tso6 = o.Bool("tso6", false);
  out.encapOffload = o.Bool("encapOffload", false);
  out.text = o.String("text", "");
}

ordered_json Encode(const PnicOffloadSettings& in) {
  return {{"rxChecksum", in.rxChecksum},
          {"txChecksum", in.txChecksum},
          {"scatterGather", in.scatterGather},
          {"tso", in.tso},
          {"tso6", in.tso6},
          {"encapOffload", in.encapOffload},
          {"text", in.text}};
}

void Decode(const ordered_json& json, const std::string& path, PnicCoalesceParams& out) {
  JsonObject o(json, path);
  for (const auto& item : json.items()) {
    const std::string& key = item.key();
    bool known = key == "adaptiveRx" || key == "adaptiveTx" ||
                 std::any_of(std::begin(kCoalesceFields), std::end(kCoalesceFields),
                             [&](const CoalesceField& f) { return key == f.key; });
    if (!known)
      o.Fail(key.c_str(), "unknown field");
  }
  out.adaptiveRx = o.Bool("adaptiveRx", false);
  out.adaptiveTx = o.Bool("adaptiveTx", false);
  for (const CoalesceField& field : kCoalesceFields)
    out.*field.member = U32(o, field.key);
}

ordered_json Encode(const PnicCoalesceParams& in) {
  ordered_json out = {{"adaptiveRx", in.adaptiveRx}, {"adaptiveTx", in.adaptiveTx}};
  for (const CoalesceField& field : kCoalesceFields)
    out[field.key] = in.*field.member;
  return out;
}

void Decode(const ordered_json& json, const std::string& path, RingState& out) {
  JsonObject o(json, path);
  CheckKnown(o, {"maximums", "current"});
  std::optional<JsonObject> max = o.Object("maximums");
  std::optional<JsonObject> cur = o.Object("current");
  if (max)
    out.maximums = DecodeRing(*max);
  if (cur)
    out.current = DecodeRing(*cur);
  for (const RingField& field : kRingFields)
    if (out.current.*field.member > out.maximums.*field.member)
      cur->Fail(field.key, "exceeds the preset maximum");
}

ordered_json Encode(const RingState& in) {
  return {{"maximums", EncodeRing(in.maximums)}, {"current", EncodeRing(in.current)}};
}

void Decode(const ordered_json& json, const std::string& path, NetqueueState& out) {
  JsonObject o(json, path);
  CheckKnown(o, {"txQueues", "rxQueues", "maxTxQueues", "maxRxQueues", "balancerEnabled",
                 "supportedSettings", "allowedSettings", "filterClasses", "plugins"});
  PnicNetqueueInfo& info = out.info;
  out.maxTxQueues = U32(o, "maxTxQueues");
  out.maxRxQueues = U32(o, "maxRxQueues");
  info.txQueueCount = static_cast<uint32_t>(o.Int("txQueues", 0, out.maxTxQueues, 0));
  info.rxQueueCount = static_cast<uint32_t>(o.Int("rxQueues", 0, out.maxRxQueues, 0));
  info.balancerEnabled = o.Bool("balancerEnabled", false);
  NamesToFlags(o, "supportedSettings", kNetqueueSettingNames, info.settingSupported);
  NamesToFlags(o, "allowedSettings", kNetqueueSettingNames, info.settingAllowed);
  NamesToFlags(o, "filterClasses", kNetqueueFilterClassNames, info.filterClasses);
  std::set<std::pair<std::string, std::string>> seen;
  for (const JsonObject& p : o.Objects("plugins")) {
    CheckKnown(p, {"module", "plugin", "description", "enabled"});
    PnicNetqueuePluginInfo plugin{p.String("module"), p.String("plugin"),
                                  p.String("description", "")};
    if (plugin.moduleName.empty() || plugin.pluginName.empty())
      p.Fail(plugin.moduleName.empty() ? "module" : "plugin", "must not be empty");
    if (!seen.insert({plugin.moduleName, plugin.pluginName}).second)
      p.Fail("plugin", "\"" + plugin.pluginName + "\" of module \"" + plugin.moduleName +
                           "\" is named twice");
    if (p.Bool("enabled", false))
      info.changedPlugins.push_back(plugin);
    info.plugins.push_back(std::move(plugin));
  }
}

ordered_json Encode(const NetqueueState& in) {
  const PnicNetqueueInfo& info = in.info;
  ordered_json plugins = ordered_json::array();
  for (const PnicNetqueuePluginInfo& p : info.plugins) {
    bool enabled =
        std::any_of(info.changedPlugins.begin(), info.changedPlugins.end(),
                    [&](const PnicNetqueuePluginInfo& e) {
                      return e.moduleName == p.moduleName && e.pluginName == p.pluginName;
                    });
    plugins.push_back({{"module", p.moduleName},
                       {"plugin", p.pluginName},
                       {"description", p.description},
                       {"enabled", enabled}});
  }
  return {{"txQueues", info.txQueueCount},
          {"rxQueues", info.rxQueueCount},
          {"maxTxQueues", in.maxTxQueues},
          {"maxRxQueues", in.maxRxQueues},
          {"balancerEnabled", info.balancerEnabled},
          {"supportedSettings", FlagsToNames(kNetqueueSettingNames, info.settingSupported)},
          {"allowedSettings", FlagsToNames(kNetqueueSettingNames, info.settingAllowed)},
          {"filterClasses", FlagsToNames(kNetqueueFilterClassNames, info.filterClasses)},
          {"plugins", std::move(plugins)}};
}

void Decode(const ordered_json& json, const std::string& path, PnicSoftwareSimulation& out) {
  JsonObject o(json, path);
  CheckKnown(o, {"simulated"});
  NamesToFlags(o, "simulated", kSoftwareFeatureNames, out.features);
}

ordered_json Encode(const PnicSoftwareSimulation& in) {
  return {{"simulated", FlagsToNames(kSoftwareFeatureNames, in.features)}};
}

void Decode(const ordered_json& json, const std::string& path, EepromState& out) {
  JsonObject o(json, path);
  CheckKnown(o, {"magic", "data"});
  out.magic = static_cast<uint32_t>(o.Int("magic", 0, kU32Max));
  std::string hex;
  for (char c : o.String("data"))
    if (c != ' ' && c != '\n')
      hex.push_back(c);
  if (hex.size() % 2 != 0 || hex.find_first_not_of("0123456789abcdefABCDEF") != std::string::npos)
    o.Fail("data", "expected pairs of hexadecimal digits");
  out.data.clear();
  for (std::size_t i = 0; i < hex.size(); i += 2)
    out.data.push_back(static_cast<uint8_t>(std::stoul(hex.substr(i, 2), nullptr, 16)));
}

ordered_json Encode(const EepromState& in) {
  std::string hex;
  hex.reserve(in.data.size() * 2);
  char digits[3];
  for (uint8_t byte : in.data) {
    std::snprintf(digits, sizeof digits, "%02x", byte);
    hex.append(digits);
  }
  return {{"magic", in.magic}, {"data", hex}};
}

void Decode(const ordered_json& json, const std::string& path, RegisterState& out) {
  if (!json.is_array())
    throw ImportError(path + ": expected an array of integers");
  out.words.clear();
  for (std::size_t i = 0; i < json.size(); ++i) {
    const ordered_json& v = json[i];
    if (!v.is_number_unsigned() && !(v.is_number_integer() && v.get<int64_t>() >= 0))
      throw ImportError(path + "[" + std::to_string(i) + "]: expected an integer in [0 - " +
                        std::to_string(kU32Max) + "]");
    uint64_t word = v.get<uint64_t>();
    if (word > static_cast<uint64_t>(kU32Max))
      throw ImportError(path + "[" + std::to_string(i) + "]: expected an integer in [0 - " +
                        std::to_string(kU32Max) + "]");
    out.words.push_back(static_cast<uint32_t>(word));
  }
}

ordered_json Encode(const RegisterState& in) {
  ordered_json out = ordered_json::array();
  for (uint32_t word : in.words)
    out.push_back(word);
  return out;
}

void Decode(const ordered_json& json, const std::string& path, SelfTestState& out) {
  JsonObject o(json, path);
  CheckKnown(o, {"tests"});
  out.tests.clear();
  for (const JsonObject& t : o.Objects("tests")) {
    CheckKnown(t, {"name", "passed", "online"});
    out.tests.push_back({t.String("name"), t.Bool("passed", true), t.Bool("online", true)});
  }
}

ordered_json Encode(const SelfTestState& in) {
  ordered_json tests = ordered_json::array();
  for (const SelfTestState::Test& t : in.tests)
    tests.push_back({{"name", t.name}, {"passed", t.passed}, {"online", t.online}});
  return {{"tests", std::move(tests)}};
}

void Decode(const ordered_json& json, const std::string& path, DcbState& out) {
  JsonObject o(json, path);
  CheckKnown(o, {"mode", "enabled", "capabilities", "pfcEnabled", "pfcConfig", "ieeeEts", "ieeePfc",
                 "apps"});
  out.mode = static_cast<uint32_t>(o.Int("mode", 0, 3, 0));
  out.enabled = o.Bool("enabled", false);
  out.pfcEnabled = o.Bool("pfcEnabled", false);
  out.pfcConfig = U8(o, "pfcConfig");
  if (std::optional<JsonObject> c = o.Object("capabilities")) {
    CheckKnown(*c, {"priorityGroup", "priorityFlowControl", "upToTcMap", "pgTrafficClasses",
                    "pfcTrafficClasses"});
    out.caps.priorityGroup = c->Bool("priorityGroup", false);
    out.caps.priorityFlowControl = c->Bool("priorityFlowControl", false);
    out.caps.upToTcMap = c->Bool("upToTcMap", false);
    out.caps.pgTrafficClasses = U8(*c, "pgTrafficClasses");
    out.caps.pfcTrafficClasses = U8(*c, "pfcTrafficClasses");
  }
  if (std::optional<JsonObject> e = o.Object("ieeeEts")) {
    CheckKnown(*e, {"willing", "supportedCapacity", "creditBasedShaper", "txBandwidth",
                    "rxBandwidth", "tsaTable", "priorityAssignment", "recommendedBandwidth",
                    "recommendedTsa", "recommendedPriority"});
    out.ets.willing = U8(*e, "willing");
    out.ets.supportedCapacity = U8(*e, "supportedCapacity");
    out.ets.creditBasedShaper = e->String("creditBasedShaper", "");
    out.ets.txBandwidth = ClassArray(*e, "txBandwidth");
    out.ets.rxBandwidth = ClassArray(*e, "rxBandwidth");
    out.ets.tsaTable = ClassArray(*e, "tsaTable");
    out.ets.priorityAssignment = ClassArray(*e, "priorityAssignment");
    out.ets.recommendedBandwidth = ClassArray(*e, "recommendedBandwidth");
    out.ets.recommendedTsa = ClassArray(*e, "recommendedTsa");
    out.ets.recommendedPriority = ClassArray(*e, "recommendedPriority");
  }
  if (std::optional<JsonObject> p = o.Object("ieeePfc")) {
    CheckKnown(*p,
               {"trafficClasses", "mask", "macsecBypass", "delay", "sentFrames", "receivedFrames"});
    out.pfc.trafficClasses = U8(*p, "trafficClasses");
    out.pfc.mask = U8(*p, "mask");
    out.pfc.macsecBypass = U8(*p, "macsecBypass");
    out.pfc.delay = U8(*p, "delay");
    out.pfc.sentFrames = ClassArray(*p, "sentFrames");
    out.pfc.receivedFrames = ClassArray(*p, "receivedFrames");
  }
  out.apps.clear();
  for (const JsonObject& a : o.Objects("apps")) {
    CheckKnown(a, {"appType", "protocolId", "userPriority"});
    out.apps.push_back({a.String("appType"), a.String("protocolId"), a.String("userPriority")});
  }
}

ordered_json Encode(const DcbState& in) {
  ordered_json apps = ordered_json::array();
  for (const DcbAppInfo& a : in.apps)
    apps.push_back(
        {{"appType", a.appType}, {"protocolId", a.protocolId}, {"userPriority", a.userPriority}});
  return {{"mode", in.mode},
          {"enabled", in.enabled},
          {"capabilities",
           {{"priorityGroup", in.caps.priorityGroup},
            {"priorityFlowControl", in.caps.priorityFlowControl},
            {"upToTcMap", in.caps.upToTcMap},
            {"pgTrafficClasses", in.caps.pgTrafficClasses},
            {"pfcTrafficClasses", in.caps.pfcTrafficClasses}}},
          {"pfcEnabled", in.pfcEnabled},
          {"pfcConfig", in.pfcConfig},
          {"ieeeEts",
           {{"willing", in.ets.willing},
            {"supportedCapacity", in.ets.supportedCapacity},
            {"creditBasedShaper", in.ets.creditBasedShaper},
            {"txBandwidth", ClassArrayJson(in.ets.txBandwidth)},
            {"rxBandwidth", ClassArrayJson(in.ets.rxBandwidth)},
            {"tsaTable", ClassArrayJson(in.ets.tsaTable)},
            {"priorityAssignment", ClassArrayJson(in.ets.priorityAssignment)},
            {"recommendedBandwidth", ClassArrayJson(in.ets.recommendedBandwidth)},
            {"recommendedTsa", ClassArrayJson(in.ets.recommendedTsa)},
            {"recommendedPriority", ClassArrayJson(in.ets.recommendedPriority)}}},
          {"ieeePfc",
           {{"trafficClasses", in.pfc.trafficClasses},
            {"mask", in.pfc.mask},
            {"macsecBypass", in.pfc.macsecBypass},
            {"delay", in.pfc.delay},
            {"sentFrames", ClassArrayJson(in.pfc.sentFrames)},
            {"receivedFrames", ClassArrayJson(in.pfc.receivedFrames)}}},
          {"apps", std::move(apps)}};
}

namespace {

uint64_t CapMask(const JsonObject& o, const char* key) {
  const std::vector<std::string>& names = HwCapNames();
  uint64_t mask = 0;
  for (const std::string& name : o.Strings(key)) {
    auto it = std::find(names.begin(), names.end(), name);
    if (it == names.end())
      o.Fail(key, "unknown capability \"" + name + "\"");
    mask |= uint64_t{1} << (it - names.begin());
  }
  return mask;
}

ordered_json CapNames(uint64_t mask) {
  const std::vector<std::string>& names = HwCapNames();
  ordered_json out = ordered_json::array();
  for (std::size_t bit = 0; bit < names.size(); ++bit)
    if (mask & (uint64_t{1} << bit))
      out.push_back(names[bit]);
  return out;
}

} // namespace

void Decode(const ordered_json& json, const std::string& path, PnicHwCapabilities& out) {
  JsonObject o(json, path);
  CheckKnown(o, {"supported", "activated"});
  out.supported = CapMask(o, "supported");
  out.activated = CapMask(o, "activated");
  if (out.activated & ~out.supported)
    o.Fail("activated", "names a capability that is not supported");
}

ordered_json Encode(const PnicHwCapabilities& in) {
  return {{"supported", CapNames(in.supported)}, {"activated", CapNames(in.activated)}};
}

// --- The host's rules.

const std::array<RingSlot, 4> kRingSlots = {{
    {"RX", &PnicRingParams::rx, true},
    {"RX mini", &PnicRingParams::rxMini, false},
    {"RX jumbo", &PnicRingParams::rxJumbo, false},
    {"TX", &PnicRingParams::tx, true},
}};

namespace {

/// A count or delay of the coalescing record and its name in messages.
struct CoalesceSlot {
  const char* name;                     ///< Name in messages.
  uint32_t PnicCoalesceParams::*member; ///< Field.
};

constexpr CoalesceSlot kCoalesceSlots[] = {
    {"statistics interval", &PnicCoalesceParams::statsBlockUsecs},
    {"sample interval", &PnicCoalesceParams::sampleInterval},
    {"low packet rate", &PnicCoalesceParams::pktRateLow},
    {"high packet rate", &PnicCoalesceParams::pktRateHigh},
    {"RX microseconds", &PnicCoalesceParams::rxUsecs},
    {"RX maximum frames", &PnicCoalesceParams::rxMaxFrames},
    {"RX microseconds during an interrupt", &PnicCoalesceParams::rxUsecsIrq},
    {"RX maximum frames during an interrupt", &PnicCoalesceParams::rxMaxFramesIrq},
    {"TX microseconds", &PnicCoalesceParams::txUsecs},
    {"TX maximum frames", &PnicCoalesceParams::txMaxFrames},
    {"TX microseconds during an interrupt", &PnicCoalesceParams::txUsecsIrq},
    {"TX maximum frames during an interrupt", &PnicCoalesceParams::txMaxFramesIrq},
    {"low-rate RX delay time", &PnicCoalesceParams::rxUsecsLow},
    {"low-rate RX delay packets", &PnicCoalesceParams::rxMaxFramesLow},
    {"low-rate TX delay time", &PnicCoalesceParams::txUsecsLow},
    {"low-rate TX delay packets", &PnicCoalesceParams::txMaxFramesLow},
    {"high-rate RX delay time", &PnicCoalesceParams::rxUsecsHigh},
    {"high-rate RX delay packets", &PnicCoalesceParams::rxMaxFramesHigh},
    {"high-rate TX delay time", &PnicCoalesceParams::txUsecsHigh},
    {"high-rate TX delay packets", &PnicCoalesceParams::txMaxFramesHigh},
};

/// The largest coalescing count or delay a driver takes. Larger values are
/// what a negative number becomes in the record's 32 bits, and no hardware
/// delays an interrupt for weeks.
constexpr uint32_t kMaxCoalesceValue = 0x7fffffff;

std::string QueueCountProblem(const std::string& nic, const char* direction, uint32_t count,
                              uint32_t max) {
  if (max != 0 && (count < 1 || count > max))
    return "The " + std::string(direction) + " netqueue count of " + nic +
           " must be between 1 and " + std::to_string(max) + ", not " + std::to_string(count);
  return "";
}

} // namespace

std::string CoalesceProblem(const std::string& nic, const PnicCoalesceParams& p) {
  for (const CoalesceSlot& slot : kCoalesceSlots)
    if (p.*slot.member > kMaxCoalesceValue)
      return "The coalescing " + std::string(slot.name) + " of " + nic + " must be at most " +
             std::to_string(kMaxCoalesceValue) + ", not " + std::to_string(p.*slot.member);
  if ((p.adaptiveRx || p.adaptiveTx) && (p.sampleInterval < 1 || p.sampleInterval > 3600))
    return "Adaptive coalescing on " + nic + " needs a sample interval of 1 to 3600 seconds, not " +
           std::to_string(p.sampleInterval);
  if (p.pktRateLow != 0 && p.pktRateHigh != 0 && p.pktRateLow >= p.pktRateHigh)
    return "The low packet rate of " + nic + " (" + std::to_string(p.pktRateLow) +
           " pps) must be below its high packet rate (" + std::to_string(p.pktRateHigh) + " pps)";
  return "";
}

std::string RingProblem(const std::string& nic, const RingState& state) {
  for (const RingSlot& slot : kRingSlots) {
    uint32_t size = state.current.*slot.member;
    uint32_t max = state.maximums.*slot.member;
    if (max == 0 && size != 0)
      return nic + " has no " + slot.name + " ring; its size must be 0, not " +
             std::to_string(size);
    if (size > max)
      return "The " + std::string(slot.name) + " ring of " + nic + " takes at most " +
             std::to_string(max) + " entries, not " + std::to_string(size);
    if (slot.required && max != 0 && size == 0)
      return "The " + std::string(slot.name) + " ring of " + nic + " needs at least one entry";
  }
  return "";
}

std::string NetqueueProblem(const std::string& nic, const NetqueueState& state) {
  const PnicNetqueueInfo& info = state.info;
  std::string problem = QueueCountProblem(nic, "TX", info.txQueueCount, state.maxTxQueues);
  if (problem.empty())
    problem = QueueCountProblem(nic, "RX", info.rxQueueCount, state.maxRxQueues);
  for (std::size_t i = 0; problem.empty() && i < kNetqueueSettingCount; ++i)
    if (info.settingAllowed[i] && !info.settingSupported[i])
      problem = nic + " does not support the NetQueue load balancer setting " +
                kNetqueueSettingNames[i] + ", so it cannot be allowed";
  return problem;
}

// --- Store access.

bool NicHwPnicExists(Store& store, const std::string& nic) {
  Statement row = store.Prepare("SELECT 1 FROM pnic WHERE name = ?");
  row.Bind(1, nic);
  return row.Step();
}

bool LoadNicHwRecord(Store& store, const std::string& nic, const char* kind, std::string& text) {
  Statement row = store.Prepare("SELECT value FROM pnic_record WHERE nic = ? AND kind = ?");
  enum { kValue };
  row.BindAll(nic, kind);
  if (!row.Step())
    return false;
  text = row.Text(kValue);
  return true;
}

void SaveNicHwRecord(Store& store, const std::string& nic, const char* kind,
                     const ordered_json& record) {
  store
      .Prepare("INSERT INTO pnic_record(nic, kind, value) VALUES(?, ?, ?) "
               "ON CONFLICT(nic, kind) DO UPDATE SET value = excluded.value")
      .BindAll(nic, kind, record.dump())
      .Run();
}

// --- The part.

namespace {

const char* const kNicHwSchema = R"sql(
-- Records of physical NICs, one JSON document per NIC and kind: the generic
-- information ("info") and counters ("stats") of the NIC part, and the
-- hardware kinds (offload, coalesce, ring, netqueue, softwareSimulation,
-- eeprom, registers, selfTest, dcb, hwCap). A NIC without a hardware record
-- of a kind lacks the feature.
CREATE TABLE pnic_record(
  nic TEXT NOT NULL REFERENCES pnic(name) ON DELETE CASCADE,
  kind TEXT NOT NULL,
  value TEXT NOT NULL,
  PRIMARY KEY(nic, kind)
) WITHOUT ROWID;
)sql";

/// The host's rules for a record of a kind that has some (see NicHwModel.h).
template <typename Record> std::string StateProblem(const std::string&, const Record&) {
  return "";
}
template <> std::string StateProblem(const std::string& nic, const PnicCoalesceParams& record) {
  return CoalesceProblem(nic, record);
}
template <> std::string StateProblem(const std::string& nic, const RingState& record) {
  return RingProblem(nic, record);
}
template <> std::string StateProblem(const std::string& nic, const NetqueueState& record) {
  return NetqueueProblem(nic, record);
}

/// Checks a record of one kind of NIC \p nic, as stored and against the
/// host's rules, and gives its canonical JSON.
template <typename Record>
ordered_json Normalise(const ordered_json& json, const std::string& path, const std::string& nic) {
  Record record{};
  Decode(json, path, record);
  if (std::string problem = StateProblem(nic, record); !problem.empty())
    throw ImportError(path + ": " + problem);
  return Encode(record);
}

/// One kind of hardware record: its host-description key and its codec.
struct RecordKind {
  const char* key; ///< Key inside a NIC.
  ordered_json (*normalise)(const ordered_json&, const std::string&,
                            const std::string&); ///< Check and canonicalise.
};

constexpr RecordKind kRecordKinds[] = {
    {"offload", Normalise<PnicOffloadSettings>},
    {"coalesce", Normalise<PnicCoalesceParams>},
    {"ring", Normalise<RingState>},
    {"netqueue", Normalise<NetqueueState>},
    {"softwareSimulation", Normalise<PnicSoftwareSimulation>},
    {"eeprom", Normalise<EepromState>},
    {"registers", Normalise<RegisterState>},
    {"selfTest", Normalise<SelfTestState>},
    {"dcb", Normalise<DcbState>},
    {"hwCap", Normalise<PnicHwCapabilities>},
};

void ImportNicHw(const ordered_json& host, Store& store) {
  JsonObject root(host, "");
  for (const JsonObject& nic : root.Objects("nics")) {
    std::string name = nic.String("name");
    for (const RecordKind& kind : kRecordKinds) {
      auto it = nic.Json().find(kind.key);
      if (it == nic.Json().end())
        continue;
      SaveNicHwRecord(store, name, kind.key,
                      kind.normalise(*it, nic.Path() + "." + kind.key, name));
    }
  }
}

void ExportNicHw(ordered_json& host, Store& store, ExportStreams& /*streams*/) {
  if (!host.contains("nics"))
    return;
  for (ordered_json& nic : host["nics"]) {
    std::string name = nic.value("name", "");
    for (const RecordKind& kind : kRecordKinds) {
      std::string text;
      if (LoadNicHwRecord(store, name, kind.key, text))
        nic[kind.key] = ordered_json::parse(text);
    }
  }
}

} // namespace

extern const Part kNicHwPart;
const Part kNicHwPart = {
    "nichw",
    kNicHwSchema,
    {{"nics",
      {"offload", "coalesce", "ring", "netqueue", "softwareSimulation", "eeprom", "registers",
       "selfTest", "dcb", "hwCap"}}},
    ImportNicHw,
    ExportNicHw,
};

} // namespace Model
