//===- GeneratedHostTest.cpp - Large hosts made by the generator -----------===//
//
// The generated host must be one that a host description could hold: its
// export imports again to the same host, its switches hold its ports, and the
// host operations list what was generated.
//
//===----------------------------------------------------------------------===//
#include "HostCtl/Lib.h"
#include "HostCtl/Network/Switching.h"
#include "TvkCtl/Network/RoutingInfoImpl.h"
#include "model/HostDescription.h"
#include "model/Store.h"

#include <gtest/gtest.h>

#include <cstdlib>
#include <string>
#include <sys/stat.h>

namespace {

using HostCtl::Lib::HostCtlException;
using nlohmann::ordered_json;

class GeneratedHostTest : public ::testing::Test {
protected:
  void SetUp() override {
    char pattern[] = "/tmp/ostra-generated-XXXXXX";
    dir_ = ::mkdtemp(pattern);
  }
  void TearDown() override {
    Model::Store::CloseHost();
    std::system(("rm -rf " + dir_).c_str());
  }

  std::unique_ptr<Model::Store> Generate(const std::string& name, const Model::HostSizes& sizes) {
    auto store = Model::Store::Create(dir_ + "/" + name);
    Model::GenerateHost(*store, sizes);
    return store;
  }

  static int64_t Count(Model::Store& store, const char* sql) {
    Model::Statement row = store.Prepare(sql);
    EXPECT_TRUE(row.Step()) << sql;
    return row.Int(0);
  }

  static Model::HostSizes Small() {
    Model::HostSizes sizes;
    sizes.routes = 300;
    sizes.portgroups = 25;
    sizes.vms = 7;
    sizes.portsPerVm = 3;
    sizes.neighbours = 11;
    sizes.hostsEntries = 13;
    return sizes;
  }

  std::string dir_; ///< Scratch directory.
};

TEST_F(GeneratedHostTest, AddsTheRequestedRowsToTheDemoHost) {
  auto demo = Model::Store::Create(dir_ + "/demo.db");
  Model::ImportHost(*demo, Model::Profile("demo"));
  auto store = Generate("big.db", Small());
  struct Table {
    const char* sql;
    int64_t added;
  } tables[] = {
      {"SELECT count(*) FROM ipsvc_route WHERE family = 4 AND netstack = 'defaultTcpipStack'", 300},
      {"SELECT count(*) FROM portgroup", 25},
      {"SELECT count(*) FROM world", 7},
      {"SELECT count(*) FROM port WHERE client_kind = 'vm'", 21},
      {"SELECT count(*) FROM vm_port_mac", 21},
      {"SELECT count(*) FROM ipsvc_neighbor", 11},
      {"SELECT count(*) FROM ipsvc_hosts", 13},
  };
  for (const Table& table : tables)
    EXPECT_EQ(Count(*store, table.sql) - Count(*demo, table.sql), table.added) << table.sql;
  // Port groups go round robin over both standard switches, VM ports only
  // onto port groups of their own switch.
  EXPECT_EQ(
      Count(*store, "SELECT count(DISTINCT portset_id) FROM portgroup WHERE name LIKE 'PG-%'"), 2);
  EXPECT_EQ(Count(*store, "SELECT count(*) FROM port p JOIN portgroup g ON g.id = p.portgroup_id "
                          "WHERE p.portset_id <> g.portset_id"),
            0);
  EXPECT_EQ(Count(*store, "SELECT count(*) FROM portgroup WHERE vlan_id NOT BETWEEN 0 AND 4095"),
            0);
}

TEST_F(GeneratedHostTest, ExportThenImportGivesTheSameHost) {
  auto store = Generate("big.db", Small());
  ordered_json first = Model::ExportHost(*store);
  EXPECT_EQ(first["routes"].size(), 300u + Model::Profile("demo")["routes"].size());
  auto copy = Model::Store::Create(dir_ + "/copy.db");
  Model::ImportHost(*copy, first);
  EXPECT_EQ(Model::ExportHost(*copy), first);
}

TEST_F(GeneratedHostTest, SwitchesGrowToHoldTheVmPortsWithinTheHostLimit) {
  Model::HostSizes sizes;
  sizes.routes = 0;
  sizes.portgroups = 10;
  sizes.vms = 1000;
  sizes.portsPerVm = 4;
  auto store = Generate("big.db", sizes);
  EXPECT_EQ(Count(*store, "SELECT count(*) FROM portset s WHERE kind = 'standard' AND "
                          "(SELECT count(*) FROM port WHERE portset_id = s.id) > num_ports"),
            0);
  EXPECT_LE(Count(*store, "SELECT sum(num_ports) FROM portset WHERE kind = 'standard'"),
            HostCtl::Network::VirtualSwitch::MAX_HOST_PORTS);
  // A host that holds this many ports still imports.
  auto copy = Model::Store::Create(dir_ + "/copy.db");
  EXPECT_NO_THROW(Model::ImportHost(*copy, Model::ExportHost(*store)));
}

TEST_F(GeneratedHostTest, SizesBeyondTheHostsLimitsAreRefusedAndWriteNothing) {
  Model::HostSizes tooManyPorts;
  tooManyPorts.vms = 2000;
  tooManyPorts.portsPerVm = 4;
  auto store = Model::Store::Create(dir_ + "/big.db");
  try {
    Model::GenerateHost(*store, tooManyPorts);
    ADD_FAILURE() << "8000 VM ports accepted";
  } catch (const HostCtlException& e) {
    EXPECT_NE(std::string(e.what()).find("8000 VM ports do not fit"), std::string::npos)
        << e.what();
  }
  EXPECT_EQ(Count(*store, "SELECT count(*) FROM netstack"), 0);
  EXPECT_EQ(Count(*store, "SELECT count(*) FROM ipsvc_route"), 0);

  Model::HostSizes negative;
  negative.routes = -1;
  EXPECT_THROW(Model::CheckHostSizes(negative), HostCtlException);
  Model::HostSizes huge;
  huge.neighbours = Model::HostSizes::kMaxNeighbours + 1;
  EXPECT_THROW(Model::CheckHostSizes(huge), HostCtlException);
}

TEST_F(GeneratedHostTest, RoutingListsEveryGeneratedRouteInOrder) {
  Model::HostSizes sizes;
  sizes.routes = 40000; // beyond 32768 the networks are /26
  sizes.portgroups = 0;
  sizes.vms = 0;
  Generate("big.db", sizes).reset();
  Model::Store::SetPath(dir_ + "/big.db");
  TvkCtl::Network::RoutingInfoImpl routing("defaultTcpipStack");
  auto routes = routing.GetCurrentTarvikRoutes(HostCtl::Network::PortsetGetRegular);
  ASSERT_GE(routes.size(), 40000u);
  const auto& last = routes.back();
  EXPECT_EQ(last.GetNetwork().GetStringAddress(), "10.167.15.192/26");
  EXPECT_EQ(last.GetInterfaceName(), "tvk0");
  EXPECT_EQ(routing.GetDefaultGatewaySource(last.GetNetwork()), "user");
}

} // namespace
