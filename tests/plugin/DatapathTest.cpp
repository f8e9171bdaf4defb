//===- DatapathTest.cpp - Conversions of the VM and port commands ---------===//
#include "datapath.h"

#include "HostCtl/Network/PortStats.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <cstdint>
#include <limits>

namespace {

using CorvexCli::NetworkNamespace::sortFilterStats;
using CorvexCli::NetworkNamespace::UnicastPackets;
using CorvexCli::NetworkNamespace::VmNameFromWorldName;
using HostCtl::Network::FilterStats;

FilterStats Filter(const std::string& name, bool direction, const std::string& key) {
  FilterStats filter;
  filter.name = name;
  filter.direction = direction;
  filter.sortKey = key;
  return filter;
}

std::vector<std::string> SortedNames(std::vector<FilterStats> filters) {
  std::sort(filters.begin(), filters.end(), sortFilterStats);
  std::vector<std::string> names;
  for (const FilterStats& f : filters)
    names.push_back(f.name);
  return names;
}

TEST(DatapathConversions, WorldNamesLoseTheirPrefix) {
  EXPECT_EQ(VmNameFromWorldName("ovm0:web-01"), "web-01");
  EXPECT_EQ(VmNameFromWorldName("abcdefghijkl"), "fghijkl");
  EXPECT_EQ(VmNameFromWorldName("ovm0:"), "");
  EXPECT_EQ(VmNameFromWorldName("vm1"), "");
  EXPECT_EQ(VmNameFromWorldName(""), "");
}

TEST(DatapathConversions, FiltersSortClearFirstAscendingThenSetDescending) {
  EXPECT_EQ(SortedNames({Filter("c", true, "c"), Filter("b", false, "b"), Filter("d", true, "d"),
                         Filter("a", false, "a")}),
            (std::vector<std::string>{"a", "b", "d", "c"}));
  // Keys compare as unsigned bytes: a key with a byte above 0x7f comes after
  // plain ASCII among clear ones, before it among set ones.
  EXPECT_EQ(SortedNames({Filter("high", false, "\xe9"), Filter("low", false, "z"),
                         Filter("setHigh", true, "\xe9"), Filter("setLow", true, "z")}),
            (std::vector<std::string>{"low", "high", "setHigh", "setLow"}));
  // The relation is a strict weak ordering: nothing is less than itself.
  FilterStats same = Filter("x", true, "k");
  EXPECT_FALSE(sortFilterStats(same, same));
  EXPECT_TRUE(sortFilterStats(Filter("p", false, "zz"), Filter("q", true, "a")));
  EXPECT_FALSE(sortFilterStats(Filter("q", true, "a"), Filter("p", false, "zz")));
}

TEST(DatapathConversions, UnicastIsTheRestInUnsigned64Bits) {
  EXPECT_EQ(UnicastPackets(10, 3, 2), 5u);
  EXPECT_EQ(UnicastPackets(0, 0, 0), 0u);
  constexpr uint64_t kMax = std::numeric_limits<uint64_t>::max();
  EXPECT_EQ(UnicastPackets(kMax, 1, 2), kMax - 3);
  EXPECT_EQ(UnicastPackets(uint64_t{1} << 40, uint64_t{1} << 39, uint64_t{1} << 38),
            uint64_t{1} << 38);
}

} // namespace
