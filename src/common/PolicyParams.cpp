//===- PolicyParams.cpp - Teaming, security and shaping parameters --------===//
#include "common/PolicyParams.h"

#include "TvkCtl/Network/PnicImpl.h"

#include "HostCtl/Lib.h"

#include <algorithm>
#include <dlfcn.h>
#include <limits>

namespace CorvexCli::NetworkNamespace {

using Fabrik::CallSpec::InputSpec;
using Fabrik::CallSpec::OutputSpec;
using Fabrik::MetaObj::MetaBool;
using Fabrik::MetaObj::MetaInt;
using Fabrik::MetaObj::MetaList;
using Fabrik::MetaObj::MetaString;
using Fabrik::MetaObj::MetaStruct;
using HostCtl::Network::LinkCriteriaSelectionPolicy;
using HostCtl::Network::NicTeamingPolicy;
using HostCtl::Network::PortSecurityPolicy;
using HostCtl::Network::ShapingPolicy;

const std::string kParamLoadBalancing = "load-balancing";
const std::string kParamFailureDetection = "failure-detection";
const std::string kParamNotifySwitches = "notify-switches";
const std::string kParamFailback = "failback";
const std::string kParamActiveUplinks = "active-uplinks";
const std::string kParamStandbyUplinks = "standby-uplinks";
const std::string kParamAllowPromiscuous = "allow-promiscuous";
const std::string kParamAllowMacChange = "allow-mac-change";
const std::string kParamAllowForgedTransmits = "allow-forged-transmits";
const std::string kParamEnabled = "enabled";
const std::string kParamAvgBandwidth = "avg-bandwidth";
const std::string kParamPeakBandwidth = "peak-bandwidth";
const std::string kParamBurstSize = "burst-size";

const std::string kFieldLoadBalancing = "Load Balancing";
const std::string kFieldFailureDetection = "Network Failure Detection";
const std::string kFieldNotifySwitches = "Notify Switches";
const std::string kFieldFailback = "Failback";
const std::string kFieldActiveAdapters = "Active Adapters";
const std::string kFieldStandbyAdapters = "Standby Adapters";
const std::string kFieldUnusedAdapters = "Unused Adapters";
const std::string kFieldAllowPromiscuous = "Allow Promiscuous";
const std::string kFieldAllowMacChange = "Allow MAC Address Change";
const std::string kFieldAllowForgedTransmits = "Allow Forged Transmits";
const std::string kFieldEnabled = "Enabled";
const std::string kFieldAverageBandwidth = "Average Bandwidth";
const std::string kFieldPeakBandwidth = "Peak Bandwidth";
const std::string kFieldBurstSize = "Burst Size";

namespace {

const EnumChoice kLoadBalancingChoices[] = {
    {"portid", "Route based on the originating virtual port ID."},
    {"iphash", "Route based on hashing the src and destination IP addresses"},
    {"mac", "Route based on the MAC address of the packet source."},
    {"explicit", "Always use the highest order uplink from the list of active adapters which "
                 "pass failover criteria."},
};

const EnumChoice kFailureDetectionChoices[] = {
    {"link", "Detect failures based on the NIC link state"},
    {"beacon", "Detect failures based on active beaconing to the vswitch"},
};

const ParameterDef kFailoverParams[] = {
    {kParamLoadBalancing, "l", Fabrik::CallSpec::String, false,
     "Set the load balancing policy for this policy. This can be one of the following options: "
     "%FULLENUM%",
     ParameterCheck::OneOf(kLoadBalancingChoices)},
    {kParamFailureDetection, "f", Fabrik::CallSpec::String, false,
     "Set the method of determining how a network outage is detected. %FULLENUM%",
     ParameterCheck::OneOf(kFailureDetectionChoices)},
    {kParamNotifySwitches, "n", Fabrik::CallSpec::Boolean, false,
     "Indicate whether to send a notification to physical switches on failover"},
    {kParamFailback, "b", Fabrik::CallSpec::Boolean, false,
     "Configure whether a NIC will be used immediately when it comes back in service after a "
     "failover"},
    {kParamActiveUplinks, "a", Fabrik::CallSpec::String, false,
     "Configure the list of active adapters and their failover order. This list must be a comma "
     "seperated list of values with the uplink name and no spaces. Example:  "
     "--active-uplinks=vmnic0,vmnic3,vmnic7,vmnic1"},
    {kParamStandbyUplinks, "s", Fabrik::CallSpec::String, false,
     "Configure the list of standby adapters and their failover order. This list must be a comma "
     "seperated list of values with the uplink name and no spaces. Example:  "
     "--standby-uplinks=vmnic2,vmnic4,vmnic8,vmnic6,vmnic11"},
};

const ParameterDef kSecurityParams[] = {
    {kParamAllowPromiscuous, "o", Fabrik::CallSpec::Boolean, false,
     "Allow ports on the virtual switch to enter promiscuous mode."},
    {kParamAllowMacChange, "m", Fabrik::CallSpec::Boolean, false,
     "Allow ports on the virtual switch to change their MAC address."},
    {kParamAllowForgedTransmits, "f", Fabrik::CallSpec::Boolean, false,
     "Allow ports on the virtual switch to send packets with forged source information."},
};

/// Each rate is at least 1; the upper bound is checked once scaled.
constexpr ParameterCheck kRateRange = ParameterCheck::Range(1, std::numeric_limits<long>::max());

const ParameterDef kShapingParams[] = {
    {kParamEnabled, "e", Fabrik::CallSpec::Boolean, false,
     "Indicate whether to enable traffic shaping on this policy. If this is true then the "
     "--avg-bandwidth, --peak-bandwidth and --burst-size options are required."},
    {kParamAvgBandwidth, "b", Fabrik::CallSpec::Integer, false,
     "The averge bandwidth allowed for this shaping policy. This value is in Kbps (1 Kbps = 1000 "
     "bits/s)",
     kRateRange},
    {kParamPeakBandwidth, "k", Fabrik::CallSpec::Integer, false,
     "The peak bandwidth allowed for this shaping policy. This value is in Kbps (1 Kbps = 1000 "
     "bits/s)",
     kRateRange},
    {kParamBurstSize, "t", Fabrik::CallSpec::Integer, false,
     "The largest burst size allowed for this shaping policy. This value is in Kib (1 Kib = 1024 "
     "bits)",
     kRateRange},
};

/// Load-balancing parameter values and the team policy type each selects.
struct TeamChoice {
  const char* value;                     ///< Parameter value.
  NicTeamingPolicy::TeamPolicyType type; ///< Type set.
};
const TeamChoice kTeamChoices[] = {
    {"portid", NicTeamingPolicy::TEAM_SRC_PORT},
    {"iphash", NicTeamingPolicy::TEAM_IP_HASH},
    {"mac", NicTeamingPolicy::TEAM_SRC_MAC},
    {"explicit", NicTeamingPolicy::TEAM_EXPLICIT},
};

/// Names shown by the get commands, by team policy type.
struct TeamShown {
  NicTeamingPolicy::TeamPolicyType type; ///< Type.
  const char* shown;                     ///< Shown name.
};
const TeamShown kTeamShown[] = {
    {NicTeamingPolicy::TEAM_IP_HASH, "iphash"},
    {NicTeamingPolicy::TEAM_SRC_MAC, "srcmac"},
    {NicTeamingPolicy::TEAM_SRC_PORT, "srcport"},
    {NicTeamingPolicy::TEAM_EXPLICIT, "explicit"},
};

bool Contains(const std::vector<std::string>& list, const std::string& name) {
  return std::find(list.begin(), list.end(), name) != list.end();
}

/// Checks each uplink name and appends the good ones to \p order.
void AppendUplinks(const std::string& text, const char* unknownMessage,
                   const std::vector<std::string>& connected, std::vector<std::string>& order,
                   const std::shared_ptr<Fabrik::CallSpec::Output>& output) {
  for (const std::string& name : SplitUplinks(text)) {
    if (!TvkCtl::Network::PnicImpl::IsValidPnic(name))
      output->AddErrorMessage(unknownMessage + name);
    else if (!Contains(connected, name))
      output->AddErrorMessage("NIC is not connected to the vswitch : " + name);
    else
      order.push_back(name);
  }
}

/// Reads rate \p name in Kbps (or Kib) and scales it to bps (or bytes); false
/// with an error added when the result would not fit the policy's 64 bits.
bool ScaledRate(const std::shared_ptr<Fabrik::CallSpec::Input>& input,
                const std::shared_ptr<Fabrik::CallSpec::Output>& output, const std::string& name,
                long factor, uint64_t& scaled) {
  long value = input->GetParameterInt(name);
  if (value < 1 || value > std::numeric_limits<int64_t>::max() / factor) {
    output->AddErrorMessage("The value of --" + name + " is out of range (1 - " +
                            std::to_string(std::numeric_limits<int64_t>::max() / factor) + ")");
    return false;
  }
  scaled = static_cast<uint64_t>(value) * static_cast<uint64_t>(factor);
  return true;
}

} // namespace

void AddFailoverParameters(const std::shared_ptr<InputSpec>& spec) {
  AddParameters(*spec, kFailoverParams);
}

void AddSecurityParameters(const std::shared_ptr<InputSpec>& spec) {
  AddParameters(*spec, kSecurityParams);
}

void AddShapingParameters(const std::shared_ptr<InputSpec>& spec) {
  AddParameters(*spec, kShapingParams);
}

namespace {

using SplitFunction = void (*)(const char*, std::size_t, void (*)(void*, const char*, std::size_t),
                               void*);

/// The splitter of the uplink module: already in the process (unit tests link
/// it in), else loaded from network-uplinks.so beside the plug-in directory.
SplitFunction Splitter() {
  static const SplitFunction function = []() -> SplitFunction {
    if (void* found = ::dlsym(RTLD_DEFAULT, "OstraSplitUplinks"))
      return reinterpret_cast<SplitFunction>(found);
    Dl_info info{};
    if (!::dladdr(reinterpret_cast<void*>(&Splitter), &info) || !info.dli_fname)
      return nullptr;
    std::string path = info.dli_fname;
    path = path.substr(0, path.find_last_of('/') + 1) + "../network-uplinks.so";
    void* module = ::dlopen(path.c_str(), RTLD_NOW | RTLD_LOCAL);
    return module ? reinterpret_cast<SplitFunction>(::dlsym(module, "OstraSplitUplinks")) : nullptr;
  }();
  return function;
}

} // namespace

std::vector<std::string> SplitUplinks(const std::string& text) {
  SplitFunction split = Splitter();
  if (!split)
    throw HostCtl::Lib::HostCtlException(
        "Uplink lists cannot be read: the module network-uplinks.so is not installed");
  std::vector<std::string> names;
  split(
      text.data(), text.size(),
      [](void* context, const char* token, std::size_t size) {
        static_cast<std::vector<std::string>*>(context)->emplace_back(token, size);
      },
      &names);
  return names;
}

void SetSecurityPolicy(const std::shared_ptr<Fabrik::CallSpec::Input>& input,
                       const std::shared_ptr<Fabrik::CallSpec::Output>& /*output*/,
                       PortSecurityPolicy& policy) {
  if (input->HasParameter(kParamAllowPromiscuous))
    policy.SetAllowPromiscuous(input->GetParameterBool(kParamAllowPromiscuous));
  if (input->HasParameter(kParamAllowMacChange))
    policy.SetAllowMacAddressChange(input->GetParameterBool(kParamAllowMacChange));
  if (input->HasParameter(kParamAllowForgedTransmits))
    policy.SetAllowForgedTransmits(input->GetParameterBool(kParamAllowForgedTransmits));
}

void SetShapingPolicy(const std::shared_ptr<Fabrik::CallSpec::Input>& input,
                      const std::shared_ptr<Fabrik::CallSpec::Output>& output,
                      ShapingPolicy& policy, bool requireAll) {
  bool enabledNow = false;
  if (input->HasParameter(kParamEnabled)) {
    enabledNow = input->GetParameterBool(kParamEnabled);
    policy.SetEnabled(enabledNow);
  }
  if (!policy.IsEnabled())
    return;
  bool required = enabledNow || requireAll;
  uint64_t value = 0;
  if (input->HasParameter(kParamAvgBandwidth)) {
    if (ScaledRate(input, output, kParamAvgBandwidth, 1000, value))
      policy.SetAverageBps(value);
  } else if (required) {
    output->AddErrorMessage("Missing required parameter --avg-bandwidth");
  }
  if (input->HasParameter(kParamPeakBandwidth)) {
    if (ScaledRate(input, output, kParamPeakBandwidth, 1000, value))
      policy.SetPeakBps(value);
  } else if (required) {
    output->AddErrorMessage("Missing required parameter --peak-bandwidth");
  }
  if (input->HasParameter(kParamBurstSize)) {
    if (ScaledRate(input, output, kParamBurstSize, 128, value))
      policy.SetBurstSize(value);
  } else if (required) {
    output->AddErrorMessage("Missing required parameter --burst-size");
  }
}

void SetFailoverPolicy(const std::shared_ptr<Fabrik::CallSpec::Input>& input,
                       const std::shared_ptr<Fabrik::CallSpec::Output>& output,
                       NicTeamingPolicy& policy, const NicTeamingPolicy& current,
                       const std::vector<std::string>& connectedUplinks) {
  if (input->HasParameter(kParamLoadBalancing)) {
    const std::string& value = input->GetParameter(kParamLoadBalancing);
    const TeamChoice* choice = nullptr;
    for (const TeamChoice& entry : kTeamChoices)
      if (value == entry.value)
        choice = &entry;
    if (choice)
      policy.SetTeamingPolicy(choice->type);
    else
      output->AddErrorMessage("Unknown Load Balancing policy: " + value);
  }
  if (input->HasParameter(kParamFailureDetection)) {
    const std::string& value = input->GetParameter(kParamFailureDetection);
    LinkCriteriaSelectionPolicy criteria;
    if (value == "link")
      criteria.SetBeacon(true);
    else if (value == "beacon")
      criteria.SetBeacon(false);
    else
      output->AddErrorMessage("Unknown failure detection type " + value);
    policy.SetLinkCriteria(criteria);
  }
  if (input->HasParameter(kParamNotifySwitches))
    policy.SetNotifySwitchOnFailure(input->GetParameterBool(kParamNotifySwitches));
  if (input->HasParameter(kParamFailback))
    policy.SetRollingRestoration(!input->GetParameterBool(kParamFailback));

  bool hasActive = input->HasParameter(kParamActiveUplinks);
  bool hasStandby = input->HasParameter(kParamStandbyUplinks);
  if (!hasActive && !hasStandby)
    return;

  std::vector<std::string> order;
  if (hasActive) {
    AppendUplinks(input->GetParameter(kParamActiveUplinks),
                  "Unknown NIC name in active uplinks : ", connectedUplinks, order, output);
    auto activeCount = static_cast<int32_t>(order.size());
    if (!hasStandby) {
      // The present standby uplinks stay standby.
      std::vector<std::string> previous = current.GetUplinkOrder();
      std::size_t m = static_cast<std::size_t>(std::max(0, current.GetMaxActiveUplinks()));
      if (m < previous.size()) {
        for (std::size_t i = m; i < previous.size();) {
          if (Contains(order, previous[i]))
            previous.erase(previous.begin() + static_cast<std::ptrdiff_t>(i));
          else
            ++i;
        }
        order.insert(order.end(), previous.begin() + static_cast<std::ptrdiff_t>(m),
                     previous.end());
      }
    }
    policy.SetMaxActiveUplinks(activeCount);
  }
  if (hasStandby) {
    AppendUplinks(input->GetParameter(kParamStandbyUplinks),
                  "Unknown NIC name in standby uplinks : ", connectedUplinks, order, output);
    if (!hasActive) {
      // The present active uplinks stay active.
      std::vector<std::string> previous = current.GetUplinkOrder();
      int32_t m = std::max(0, current.GetMaxActiveUplinks());
      for (std::size_t i = 0; static_cast<int32_t>(i) < m && i < previous.size();) {
        if (Contains(order, previous[i])) {
          previous.erase(previous.begin() + static_cast<std::ptrdiff_t>(i));
          --m;
        } else {
          ++i;
        }
      }
      policy.SetMaxActiveUplinks(m);
      std::size_t keep = std::min(static_cast<std::size_t>(m), previous.size());
      std::vector<std::string> merged(previous.begin(),
                                      previous.begin() + static_cast<std::ptrdiff_t>(keep));
      merged.insert(merged.end(), order.begin(), order.end());
      order = std::move(merged);
    }
  }
  std::vector<std::string> sorted = order;
  std::sort(sorted.begin(), sorted.end());
  if (std::adjacent_find(sorted.begin(), sorted.end()) != sorted.end()) {
    output->AddErrorMessage("some NICs appear in the input for more than once.");
    return;
  }
  policy.SetUplinkOrder(order);
}

FailoverValues DescribeFailover(const NicTeamingPolicy& policy,
                                const std::vector<std::string>& uplinks) {
  FailoverValues values;
  values.loadBalancing = "unknown";
  for (const TeamShown& entry : kTeamShown)
    if (policy.GetTeamingPolicy() == entry.type)
      values.loadBalancing = entry.shown;
  const LinkCriteriaSelectionPolicy& criteria = policy.GetLinkCriteria();
  bool beacon = (criteria.GetFlagWord(0) & LinkCriteriaSelectionPolicy::BEACON_BIT) != 0 &&
                (criteria.GetFlagWord(1) & LinkCriteriaSelectionPolicy::BEACON_BIT) == 0;
  values.failureDetection = beacon ? "beacon" : "link";
  values.notifySwitches = policy.GetNotifySwitchOnFailure();
  values.failback = !policy.GetRollingRestoration();
  const std::vector<std::string>& order = policy.GetUplinkOrder();
  std::size_t n =
      std::min(static_cast<std::size_t>(std::max(0, policy.GetMaxActiveUplinks())), order.size());
  values.active.assign(order.begin(), order.begin() + static_cast<std::ptrdiff_t>(n));
  values.standby.assign(order.begin() + static_cast<std::ptrdiff_t>(n), order.end());
  for (const std::string& uplink : uplinks)
    if (!Contains(order, uplink))
      values.unused.push_back(uplink);
  return values;
}

ShapingValues DescribeShaping(const ShapingPolicy& policy) {
  ShapingValues values;
  values.enabled = policy.IsEnabled();
  if (values.enabled) {
    values.average = static_cast<long>(policy.GetAverageBps() / 1000);
    values.peak = static_cast<long>(policy.GetPeakBps() / 1000);
    values.burst = static_cast<long>(policy.GetBurstSize() / 128);
  }
  return values;
}

const std::vector<std::string>& FailoverFieldNames() {
  static const std::vector<std::string> names = {
      kFieldLoadBalancing,  kFieldFailureDetection, kFieldNotifySwitches, kFieldFailback,
      kFieldActiveAdapters, kFieldStandbyAdapters,  kFieldUnusedAdapters};
  return names;
}

const std::vector<std::string>& SecurityFieldNames() {
  static const std::vector<std::string> names = {kFieldAllowPromiscuous, kFieldAllowMacChange,
                                                 kFieldAllowForgedTransmits};
  return names;
}

const std::vector<std::string>& ShapingFieldNames() {
  static const std::vector<std::string> names = {kFieldEnabled, kFieldAverageBandwidth,
                                                 kFieldPeakBandwidth, kFieldBurstSize};
  return names;
}

std::shared_ptr<MetaStruct> NewFailoverStructure(const std::string& name) {
  auto structure = MetaStruct::New(name);
  structure->SetField(kFieldLoadBalancing, MetaString::New());
  structure->SetField(kFieldFailureDetection, MetaString::New());
  structure->SetField(kFieldNotifySwitches, MetaBool::New());
  structure->SetField(kFieldFailback, MetaBool::New());
  structure->SetField(kFieldActiveAdapters, MetaList::New(Fabrik::MetaObj::String));
  structure->SetField(kFieldStandbyAdapters, MetaList::New(Fabrik::MetaObj::String));
  structure->SetField(kFieldUnusedAdapters, MetaList::New(Fabrik::MetaObj::String));
  return structure;
}

std::shared_ptr<MetaStruct> NewSecurityStructure(const std::string& name) {
  auto structure = MetaStruct::New(name);
  for (const std::string& field : SecurityFieldNames())
    structure->SetField(field, MetaBool::New());
  return structure;
}

std::shared_ptr<MetaStruct> NewShapingStructure(const std::string& name) {
  auto structure = MetaStruct::New(name);
  structure->SetField(kFieldEnabled, MetaBool::New());
  structure->SetField(kFieldAverageBandwidth, MetaInt::New());
  structure->SetField(kFieldPeakBandwidth, MetaInt::New());
  structure->SetField(kFieldBurstSize, MetaInt::New());
  return structure;
}

void SetFailoverFields(MetaStruct& result, const FailoverValues& values) {
  result.SetField(kFieldLoadBalancing, values.loadBalancing);
  result.SetField(kFieldFailureDetection, values.failureDetection);
  result.SetField(kFieldNotifySwitches, values.notifySwitches);
  result.SetField(kFieldFailback, values.failback);
  result.SetField(kFieldActiveAdapters, values.active);
  result.SetField(kFieldStandbyAdapters, values.standby);
  result.SetField(kFieldUnusedAdapters, values.unused);
}

void SetSecurityFields(MetaStruct& result, const PortSecurityPolicy& policy) {
  result.SetField(kFieldAllowPromiscuous, policy.GetAllowPromiscuous());
  result.SetField(kFieldAllowMacChange, policy.GetAllowMacAddressChange());
  result.SetField(kFieldAllowForgedTransmits, policy.GetAllowForgedTransmits());
}

void SetShapingFields(MetaStruct& result, const ShapingValues& values) {
  result.SetField(kFieldEnabled, values.enabled);
  result.SetField(kFieldAverageBandwidth, values.average);
  result.SetField(kFieldPeakBandwidth, values.peak);
  result.SetField(kFieldBurstSize, values.burst);
}

void SetPolicyGetOutput(Fabrik::AutoCli::CommandSpec& command, const std::string& name,
                        const std::vector<std::string>& fields, bool rateUnits) {
  command.SetDefaultOutputFormatter("simple");
  command.SetDefaultOutputParameter("fields:" + name, JoinFields(fields));
  command.SetDefaultOutputParameter("header:" + name, "<NONE>");
  if (!rateUnits)
    return;
  command.SetDefaultOutputParameter("units:" + name + "." + kFieldAverageBandwidth, "Kbps");
  command.SetDefaultOutputParameter("units:" + name + "." + kFieldPeakBandwidth, "Kbps");
  command.SetDefaultOutputParameter("units:" + name + "." + kFieldBurstSize, "Kib");
}

std::string JoinFields(const std::vector<std::string>& fields) {
  std::string joined;
  for (const std::string& field : fields)
    joined += (joined.empty() ? "" : ",") + field;
  return joined;
}
} // namespace CorvexCli::NetworkNamespace
