//===- SwitchingTest.cpp - Switches, port groups and policies of the host --===//
#include "TvkCtl/Network/Switching.h"
#include "HostCtl/Lib.h"
#include "HostCtl/Network/NetworkInfo.h"
#include "TvkCtl/Network/NetworkInfoImpl.h"
#include "model/HostDescription.h"
#include "model/Store.h"

#include <gtest/gtest.h>

#include <filesystem>
#include <unistd.h>

namespace {

using namespace HostCtl::Network;
using namespace TvkCtl::Network;
using HostCtl::Lib::HostCtlException;

/// A fresh host store in a temporary file, made the process's host.
class SwitchingTest : public ::testing::Test {
protected:
  void Load(const nlohmann::ordered_json& host) {
    path_ = std::filesystem::temp_directory_path() / ("switching-test-" + std::to_string(getpid()) +
                                                      "-" + std::to_string(counter_++) + ".db");
    std::filesystem::remove(path_);
    {
      auto store = Model::Store::Create(path_.string());
      Model::ImportHost(*store, host);
    }
    Model::Store::CloseHost();
    Model::Store::SetPath(path_.string());
  }
  void SetUp() override { Load(Model::Profile("demo")); }
  void TearDown() override {
    Model::Store::CloseHost();
    std::filesystem::remove(path_);
    std::filesystem::remove(path_.string() + "-wal");
    std::filesystem::remove(path_.string() + "-shm");
  }

  std::filesystem::path path_;
  static inline int counter_ = 0;
};

TEST_F(SwitchingTest, ListsEverySwitchKind) {
  VirtualSwitchInfoImpl info;
  auto all = info.GetAllSwitches();
  EXPECT_GE(all.size(), 0u);
}

} // namespace
