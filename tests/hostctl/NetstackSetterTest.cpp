//===- NetstackSetterTest.cpp - What the netstack setters store and refuse -===//
//
// Every setter of a netstack instance that is on the host checks its declared
// fault, then changes one column in one transaction, refusing when the
// instance has gone meanwhile; with persist false it changes only the object.
// The host has a plain instance and one on which every setter has a fault.
//
//===----------------------------------------------------------------------===//
#include "../support/ScratchHost.h"
#include "HostCtl/Lib.h"
#include "TvkCtl/Network/NetstackInstanceImpl.h"
#include "TvkCtl/Network/NetworkInfoImpl.h"

#include <gtest/gtest.h>

#include <functional>
#include <string>

namespace {

using HostCtl::Lib::HostCtlException;
using HostCtl::Network::NetstackInstance;
using TvkCtl::Network::NetworkInfoImpl;

const char* const kHost = R"json({
  "netstacks": [{"key": "plain"}, {"key": "faulty"}],
  "faults": [
    {"operation": "SetInstanceName", "object": "faulty", "message": "name fault"},
    {"operation": "SetMaxConnections", "object": "faulty", "message": "connections fault"},
    {"operation": "SetCongestionControlAlgorithm", "object": "faulty", "message": "cc fault"},
    {"operation": "SetIpv6Enabled", "object": "faulty", "message": "ipv6 fault"},
    {"operation": "SetEcnStatus", "object": "faulty", "message": "ecn fault"}]
})json";

/// One setter: how to call it with a new value and how to read that value back.
struct Setter {
  const char* operation;                                    ///< Host operation name.
  std::function<void(NetstackInstance&, bool persist)> set; ///< Sets the new value.
  std::function<std::string(NetstackInstance&)> get;        ///< The value, as text.
  std::string before;                                       ///< Value on the host.
  std::string after;                                        ///< Value the setter gives.
  bool hasPersist;                                          ///< Takes a persist argument.
  std::string fault;                                        ///< Message of its fault.
};

const std::vector<Setter>& Setters() {
  static const std::vector<Setter> setters = {
      {"SetInstanceName", [](NetstackInstance& n, bool p) { n.SetInstanceName("renamed", p); },
       [](NetstackInstance& n) { return n.GetInstanceName(); }, "", "renamed", true, "name fault"},
      {"SetMaxConnections", [](NetstackInstance& n, bool p) { n.SetMaxConnections(22000, p); },
       [](NetstackInstance& n) { return std::to_string(n.GetMaxConnections()); }, "11000", "22000",
       true, "connections fault"},
      {"SetCongestionControlAlgorithm",
       [](NetstackInstance& n, bool p) { n.SetCongestionControlAlgorithm("cubic", p); },
       [](NetstackInstance& n) { return n.GetCongestionControlAlgorithm(); }, "newreno", "cubic",
       true, "cc fault"},
      {"SetIpv6Enabled", [](NetstackInstance& n, bool p) { n.SetIpv6Enabled(false, p); },
       [](NetstackInstance& n) { return std::string(n.GetIpv6Enabled() ? "on" : "off"); }, "on",
       "off", true, "ipv6 fault"},
      {"SetEcnStatus", [](NetstackInstance& n, bool) { n.SetEcnStatus("echo-only"); },
       [](NetstackInstance& n) { return n.GetEcnStatus(); }, "enabled", "echo-only", false,
       "ecn fault"},
  };
  return setters;
}

class NetstackSetterTest : public ::testing::Test {
protected:
  /// Instance \p key as the host has it now.
  std::unique_ptr<NetstackInstance> Lookup(const std::string& key) {
    auto instance = info_.LookupNetstackInstanceByKey(key);
    EXPECT_TRUE(instance) << key;
    return instance;
  }

  /// The value \p setter reads on instance \p key, or the name when it is
  /// the value the test host starts with (the name defaults to the key).
  std::string Stored(const Setter& setter, const std::string& key) {
    std::string value = setter.get(*Lookup(key));
    return value == key ? "" : value;
  }

  TestSupport::ScratchHost host_{"netstack-setter-test", kHost}; ///< The test host.
  NetworkInfoImpl info_;                                         ///< Netstack service.
};

TEST_F(NetstackSetterTest, PersistedValuesReachTheHostAndOthersOnlyTheObject) {
  for (const Setter& setter : Setters()) {
    SCOPED_TRACE(setter.operation);
    EXPECT_EQ(Stored(setter, "plain"), setter.before);
    if (setter.hasPersist) {
      auto transient = Lookup("plain");
      setter.set(*transient, false);
      EXPECT_EQ(setter.get(*transient), setter.after);
      EXPECT_EQ(Stored(setter, "plain"), setter.before);
    }
    auto persisted = Lookup("plain");
    setter.set(*persisted, true);
    EXPECT_EQ(setter.get(*persisted), setter.after);
    EXPECT_EQ(Stored(setter, "plain"), setter.after);
  }
}

TEST_F(NetstackSetterTest, FaultsAndVanishedInstancesChangeNothing) {
  for (const Setter& setter : Setters()) {
    SCOPED_TRACE(setter.operation);
    auto faulty = Lookup("faulty");
    try {
      setter.set(*faulty, true);
      ADD_FAILURE() << "the fault did not fire";
    } catch (const HostCtlException& e) {
      EXPECT_EQ(std::string(e.what()), setter.fault);
    }
    EXPECT_EQ(Stored(setter, "faulty"), setter.before);
  }

  // An object whose instance was removed after it was read is refused by
  // every setter that writes, and the instance does not come back.
  auto orphans = std::vector<std::unique_ptr<NetstackInstance>>();
  for (std::size_t i = 0; i < Setters().size(); ++i)
    orphans.push_back(Lookup("plain"));
  info_.RemoveNetstackInstance("plain", false);
  for (std::size_t i = 0; i < Setters().size(); ++i) {
    SCOPED_TRACE(Setters()[i].operation);
    try {
      Setters()[i].set(*orphans[i], true);
      ADD_FAILURE() << "a removed instance was changed";
    } catch (const HostCtlException& e) {
      EXPECT_EQ(std::string(e.what()), "Netstack instance plain does not exist");
    }
  }
  EXPECT_FALSE(info_.LookupNetstackInstanceByKey("plain"));
}

} // namespace
