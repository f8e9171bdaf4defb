//===- PolicyParams.h - Teaming, security and shaping parameters ----------===//
//
// The policy "set" commands of standard switches and of port groups share one
// vocabulary of parameters and one way of applying them to a policy value.
// The Add*Parameters functions declare the parameters; the Set*Policy
// functions copy the given ones into a policy value, adding an error message
// to the output for every problem and never stopping early, so that the
// caller stores the policy only when the output holds no error. The get
// commands share the conversions of policies into result values.
//
//===----------------------------------------------------------------------===//
#pragma once

#include "Fabrik/AutoCli.h"
#include "Fabrik/Call.h"
#include "HostCtl/Lib.h"
#include "HostCtl/Network/Policy.h"
#include "common/FieldTable.h"
#include "common/ParameterTable.h"

#include <cstdint>
#include <memory>
#include <string>
#include <vector>

namespace CorvexCli::NetworkNamespace {

// --- Parameter names.
extern const std::string kParamLoadBalancing;
extern const std::string kParamFailureDetection;
extern const std::string kParamNotifySwitches;
extern const std::string kParamFailback;
extern const std::string kParamActiveUplinks;
extern const std::string kParamStandbyUplinks;
extern const std::string kParamAllowPromiscuous;
extern const std::string kParamAllowMacChange;
extern const std::string kParamAllowForgedTransmits;
extern const std::string kParamEnabled;
extern const std::string kParamAvgBandwidth;
extern const std::string kParamPeakBandwidth;
extern const std::string kParamBurstSize;

// --- Field names of the policy results.
extern const std::string kFieldLoadBalancing;
extern const std::string kFieldFailureDetection;
extern const std::string kFieldNotifySwitches;
extern const std::string kFieldFailback;
extern const std::string kFieldActiveAdapters;
extern const std::string kFieldStandbyAdapters;
extern const std::string kFieldUnusedAdapters;
extern const std::string kFieldAllowPromiscuous;
extern const std::string kFieldAllowMacChange;
extern const std::string kFieldAllowForgedTransmits;
extern const std::string kFieldEnabled;
extern const std::string kFieldAverageBandwidth;
extern const std::string kFieldPeakBandwidth;
extern const std::string kFieldBurstSize;

/// Appends load-balancing, failure-detection, notify-switches, failback,
/// active-uplinks and standby-uplinks.
void AddFailoverParameters(const std::shared_ptr<Fabrik::CallSpec::InputSpec>& spec);
/// Appends allow-promiscuous, allow-mac-change and allow-forged-transmits.
void AddSecurityParameters(const std::shared_ptr<Fabrik::CallSpec::InputSpec>& spec);
/// Appends enabled, avg-bandwidth, peak-bandwidth and burst-size.
void AddShapingParameters(const std::shared_ptr<Fabrik::CallSpec::InputSpec>& spec);

/// Edits \p policy from the failover parameters; \p current is the policy in
/// force (its uplink order and active count), \p connectedUplinks the uplinks
/// of the switch concerned.
void SetFailoverPolicy(const std::shared_ptr<Fabrik::CallSpec::Input>& input,
                       const std::shared_ptr<Fabrik::CallSpec::Output>& output,
                       HostCtl::Network::NicTeamingPolicy& policy,
                       const HostCtl::Network::NicTeamingPolicy& current,
                       const std::vector<std::string>& connectedUplinks);
/// Edits \p policy from the security parameters.
void SetSecurityPolicy(const std::shared_ptr<Fabrik::CallSpec::Input>& input,
                       const std::shared_ptr<Fabrik::CallSpec::Output>& output,
                       HostCtl::Network::PortSecurityPolicy& policy);
/// Edits \p policy from the shaping parameters; with \p requireAll every rate
/// must be given while the policy is enabled.
void SetShapingPolicy(const std::shared_ptr<Fabrik::CallSpec::Input>& input,
                      const std::shared_ptr<Fabrik::CallSpec::Output>& output,
                      HostCtl::Network::ShapingPolicy& policy, bool requireAll);

/// Splits a comma-separated uplink list; every field is kept as it stands,
/// except that nothing follows a final comma.
std::vector<std::string> SplitUplinks(const std::string& text);

/// The failover fields a get command shows.
struct FailoverValues {
  std::string loadBalancing;        ///< "iphash", "srcmac", "srcport", "explicit", "unknown".
  std::string failureDetection;     ///< "beacon" or "link".
  bool notifySwitches = false;      ///< Notify physical switches.
  bool failback = false;            ///< Not rolling restoration.
  std::vector<std::string> active;  ///< Active adapters.
  std::vector<std::string> standby; ///< Standby adapters.
  std::vector<std::string> unused;  ///< Uplinks outside the order.
};

/// The failover fields of \p policy on a switch with \p uplinks.
FailoverValues DescribeFailover(const HostCtl::Network::NicTeamingPolicy& policy,
                                const std::vector<std::string>& uplinks);

/// Shaping rates as shown: Kbps and Kib, or -1 each when shaping is off.
struct ShapingValues {
  bool enabled = false; ///< Shaping is on.
  long average = -1;    ///< Average bandwidth, Kbps.
  long peak = -1;       ///< Peak bandwidth, Kbps.
  long burst = -1;      ///< Burst size, Kib.
};
ShapingValues DescribeShaping(const HostCtl::Network::ShapingPolicy& policy);

// --- Results of the policy get commands. A switch and a port group show the
// same value fields under their own structure names; a port group adds one
// override flag per field after them.

/// The failover value fields, in the order shown.
const std::vector<std::string>& FailoverFieldNames();
/// The security value fields, in the order shown.
const std::vector<std::string>& SecurityFieldNames();
/// The shaping value fields, in the order shown.
const std::vector<std::string>& ShapingFieldNames();

/// A structure named \p name holding the failover value fields, unset.
std::shared_ptr<Fabrik::MetaObj::MetaStruct> NewFailoverStructure(const std::string& name);
/// A structure named \p name holding the security value fields, unset.
std::shared_ptr<Fabrik::MetaObj::MetaStruct> NewSecurityStructure(const std::string& name);
/// A structure named \p name holding the shaping value fields, unset.
std::shared_ptr<Fabrik::MetaObj::MetaStruct> NewShapingStructure(const std::string& name);

/// Sets the failover value fields of \p result.
void SetFailoverFields(Fabrik::MetaObj::MetaStruct& result, const FailoverValues& values);
/// Sets the security value fields of \p result from \p policy.
void SetSecurityFields(Fabrik::MetaObj::MetaStruct& result,
                       const HostCtl::Network::PortSecurityPolicy& policy);
/// Sets the shaping value fields of \p result.
void SetShapingFields(Fabrik::MetaObj::MetaStruct& result, const ShapingValues& values);

/// The default output of a policy get: the simple formatter, \p fields of
/// structure \p name, and no header; for a shaping structure (\p rateUnits)
/// also the units of its three rates.
void SetPolicyGetOutput(Fabrik::AutoCli::CommandSpec& command, const std::string& name,
                        const std::vector<std::string>& fields, bool rateUnits);

/// Runs \p body on the switch or port group \p find gives for the command,
/// which is null when \p find has added the error; a host failure adds its
/// message. The policy commands of switches and port groups run in it.
template <typename Find, typename Body>
void WithPolicyHolder(const std::shared_ptr<Fabrik::CallSpec::Input>& input,
                      const std::shared_ptr<Fabrik::CallSpec::Output>& output, Find find,
                      Body body) {
  try {
    if (auto holder = find(input, output))
      body(*holder);
  } catch (const HostCtl::Lib::HostCtlException& e) {
    output->AddErrorMessage(e.what());
  }
}

/// Joins field names with ",".
std::string JoinFields(const std::vector<std::string>& fields);

} // namespace CorvexCli::NetworkNamespace
