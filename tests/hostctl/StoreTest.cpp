//===- StoreTest.cpp - The host store, descriptions and faults -------------===//
#include "model/Store.h"
#include "HostCtl/Lib.h"
#include "HostCtl/Network/NetworkInfo.h"
#include "HostCtl/Session.h"
#include "model/CoreModel.h"
#include "model/HostDescription.h"
#include "model/JsonRead.h"

#include <gtest/gtest.h>

#include <cstdlib>
#include <fstream>
#include <sys/stat.h>
#include <sys/wait.h>
#include <unistd.h>

namespace {

using HostCtl::Lib::HostCtlException;
using nlohmann::ordered_json;

class StoreTest : public ::testing::Test {
protected:
  void SetUp() override {
    char pattern[] = "/tmp/ostra-store-XXXXXX";
    dir_ = ::mkdtemp(pattern);
    path_ = dir_ + "/host.db";
  }
  void TearDown() override {
    Model::Store::CloseHost();
    std::system(("rm -rf " + dir_).c_str());
  }

  std::unique_ptr<Model::Store> Make(const ordered_json& host) {
    auto store = Model::Store::Create(path_);
    Model::ImportHost(*store, host);
    return store;
  }

  static ordered_json TwoNics() {
    return ordered_json::parse(R"({
      "nics": [
        {"name": "vmnic0", "pciAddress": "0000:01:00.0", "vendor": "V", "device": "D",
         "driver": "drv", "speed": 1000, "mac": "00:11:22:33:44:55"},
        {"name": "vmnic1", "pseudoDevice": "USB-NIC:A:B", "driver": "usb",
         "adminUp": false, "mac": "00:11:22:33:44:56", "dpuId": "dpu-1"}
      ],
      "faults": [{"operation": "GetPnicByName", "object": "vmnic1", "message": "broken"}]
    })");
  }

  std::string dir_;  ///< Scratch directory.
  std::string path_; ///< Store file inside it.
};

TEST_F(StoreTest, ExportThenImportGivesTheSameHost) {
  auto store = Make(TwoNics());
  ordered_json first = Model::ExportHost(*store);
  EXPECT_EQ(first["nics"].size(), 2u);
  EXPECT_EQ(first["nics"][1]["dpuId"], "dpu-1");
  Model::ImportHost(*store, first);
  EXPECT_EQ(Model::ExportHost(*store), first);
}

TEST_F(StoreTest, ImportRefusesBadFieldsAndKeepsTheOldHost) {
  auto store = Make(TwoNics());
  ordered_json before = Model::ExportHost(*store);
  struct Case {
    const char* json;
    const char* message;
  } cases[] = {
      {R"({"nics": [{"name": "x", "mac": "00:11:22:33:44:55", "speed": "fast"}]})",
       "nics[0].speed: expected an integer in [0 - 400000]"},
      {R"({"nics": [{"name": "x", "mac": "01:11:22:33:44:55"}]})",
       "nics[0].mac: expected a unicast MAC address such as 00:50:56:01:02:03"},
      {R"({"nics": [{"name": "x", "mac": "00:11:22:33:44:55", "colour": 1}]})",
       "nics[0].colour: unknown field"},
      {R"({"nicks": []})", "nicks: unknown field"},
      {R"({"nics": [{"mac": "00:11:22:33:44:55"}]})", "nics[0].name: missing"},
      {R"({"nics": [{"name": "a", "mac": "00:11:22:33:44:55"},
                    {"name": "a", "mac": "00:11:22:33:44:56"}]})",
       "nics[1].name: \"a\" is used by another NIC"},
  };
  for (const Case& c : cases) {
    try {
      Model::ImportHost(*store, ordered_json::parse(c.json));
      ADD_FAILURE() << "accepted " << c.json;
    } catch (const Model::ImportError& e) {
      EXPECT_EQ(std::string(e.what()), c.message);
    }
    EXPECT_EQ(Model::ExportHost(*store), before);
  }
}

TEST_F(StoreTest, DeclaredFaultsAreThrownByTheOperation) {
  Make(TwoNics());
  Model::Store::SetPath(path_);
  auto info = HostCtl::Network::NetworkFactory::GetNetworkInfo();
  EXPECT_NE(info->GetPnicByName("vmnic0"), nullptr);
  EXPECT_EQ(info->GetPnicByName("nope"), nullptr);
  try {
    info->GetPnicByName("vmnic1");
    ADD_FAILURE() << "no fault";
  } catch (const HostCtlException& e) {
    EXPECT_STREQ(e.what(), "broken");
  }
}

TEST_F(StoreTest, StoreFailuresAreClearErrors) {
  // A missing file.
  try {
    Model::Store store(dir_ + "/missing.db");
    ADD_FAILURE();
  } catch (const HostCtlException& e) {
    EXPECT_NE(std::string(e.what()).find("There is no host state at"), std::string::npos);
  }
  // A file that is not a database.
  std::ofstream(dir_ + "/text.db") << "just some text that is long enough to be read as a header";
  try {
    Model::Store store(dir_ + "/text.db");
    ADD_FAILURE();
  } catch (const HostCtlException& e) {
    EXPECT_EQ(std::string(e.what()), "The file " + dir_ + "/text.db is not a host state database");
  }
  // A SQLite database of something else.
  ::system(("sqlite3 " + dir_ + "/other.db 'CREATE TABLE t(x)' 2>/dev/null").c_str());
  struct stat st {};
  if (::stat((dir_ + "/other.db").c_str(), &st) == 0) {
    try {
      Model::Store store(dir_ + "/other.db");
      ADD_FAILURE();
    } catch (const HostCtlException& e) {
      EXPECT_EQ(std::string(e.what()),
                "The file " + dir_ + "/other.db is not a host state database");
    }
  }
}

TEST_F(StoreTest, ReadOnlyStoreRefusesChangesButReads) {
  if (::geteuid() == 0)
    GTEST_SKIP() << "root ignores file permissions";
  Make(TwoNics())->Exec("PRAGMA wal_checkpoint(TRUNCATE)");
  ::chmod(path_.c_str(), 0444);
  Model::Store store(path_);
  EXPECT_FALSE(store.Read([&] { return Model::GetSetting(store, "x").has_value(); }));
  try {
    store.Write([&] { Model::PutSetting(store, "x", "1"); });
    ADD_FAILURE();
  } catch (const HostCtlException& e) {
    EXPECT_NE(std::string(e.what()).find("read-only"), std::string::npos) << e.what();
  }
}

TEST_F(StoreTest, FailedWriteRollsBack) {
  auto store = Make(TwoNics());
  EXPECT_THROW(store->Write([&] {
    Model::PutSetting(*store, "k", "1");
    throw HostCtlException("refused");
  }),
               HostCtlException);
  EXPECT_FALSE(store->Read([&] { return Model::GetSetting(*store, "k").has_value(); }));
}

TEST_F(StoreTest, ConcurrentProcessesLoseNoUpdate) {
  Make(TwoNics());
  constexpr int kProcesses = 4;
  constexpr int kIncrements = 50;
  std::vector<pid_t> children;
  for (int p = 0; p < kProcesses; ++p) {
    pid_t pid = ::fork();
    if (pid == 0) {
      int status = 0;
      try {
        Model::Store store(path_);
        for (int i = 0; i < kIncrements; ++i) {
          store.Write([&] {
            long value = std::stol(Model::GetSetting(store, "counter").value_or("0"));
            Model::PutSetting(store, "counter", std::to_string(value + 1));
          });
        }
      } catch (...) {
        status = 1;
      }
      ::_exit(status);
    }
    children.push_back(pid);
  }
  for (pid_t pid : children) {
    int status = 0;
    ::waitpid(pid, &status, 0);
    EXPECT_TRUE(WIFEXITED(status) && WEXITSTATUS(status) == 0);
  }
  Model::Store store(path_);
  EXPECT_EQ(store.Read([&] { return Model::GetSetting(store, "counter"); }),
            std::to_string(kProcesses * kIncrements));
}

TEST_F(StoreTest, DemoProfileImports) {
  auto store = Make(Model::Profile("demo"));
  EXPECT_EQ(Model::ExportHost(*store)["nics"].size(), Model::Profile("demo")["nics"].size());
}

TEST(ProfileTest, FragmentsMergeByName) {
  ordered_json demo = Model::Profile("demo");
  ASSERT_TRUE(demo.contains("nics"));
  EXPECT_GE(demo["nics"].size(), 4u);
  EXPECT_THROW(Model::Profile("nope"), Model::ImportError);

  ordered_json into = ordered_json::parse(R"({"nics": [{"name": "a", "x": 1}], "k": 1})");
  Model::MergeDescription(
      into, ordered_json::parse(R"({"nics": [{"name": "a", "y": 2}, {"name": "b"}], "k": 2})"));
  EXPECT_EQ(into, ordered_json::parse(
                      R"({"nics": [{"name": "a", "x": 1, "y": 2}, {"name": "b"}], "k": 2})"));
}

} // namespace

namespace {

TEST_F(StoreTest, BatchKeepsGoodOperationsAndUndoesFailedOnes) {
  auto store = Make(TwoNics());
  store->BeginUnit(true);
  store->Write([&] { Model::PutSetting(*store, "a", "1"); });
  EXPECT_THROW(store->Write([&] {
    Model::PutSetting(*store, "b", "1");
    throw HostCtlException("refused");
  }),
               HostCtlException);
  store->Write([&] { Model::PutSetting(*store, "c", "1"); });
  store->EndUnit(true);
  Model::Store other(path_);
  EXPECT_TRUE(other.Read([&] { return Model::GetSetting(other, "a").has_value(); }));
  EXPECT_FALSE(other.Read([&] { return Model::GetSetting(other, "b").has_value(); }));
  EXPECT_TRUE(other.Read([&] { return Model::GetSetting(other, "c").has_value(); }));

  store->BeginUnit(true);
  store->Write([&] { Model::PutSetting(*store, "d", "1"); });
  store->EndUnit(false);
  EXPECT_FALSE(other.Read([&] { return Model::GetSetting(other, "d").has_value(); }));
}

} // namespace

namespace {

TEST_F(StoreTest, TruncatedStoreIsReportedNotReset) {
  Make(TwoNics());
  struct stat st {};
  ASSERT_EQ(::stat(path_.c_str(), &st), 0);
  ASSERT_EQ(::truncate(path_.c_str(), st.st_size / 2), 0);
  try {
    Model::Store store(path_);
    store.Read([&] { return Model::ExportHost(store); });
    ADD_FAILURE() << "a truncated store was read";
  } catch (const HostCtlException& e) {
    EXPECT_NE(std::string(e.what()).find("is corrupt"), std::string::npos) << e.what();
  }
  struct stat after {};
  ASSERT_EQ(::stat(path_.c_str(), &after), 0);
  EXPECT_EQ(after.st_size, st.st_size / 2);
}

TEST_F(StoreTest, WriterWaitsForALockThenGivesUpClearly) {
  Make(TwoNics());
  int ready[2], release[2];
  ASSERT_EQ(::pipe(ready), 0);
  ASSERT_EQ(::pipe(release), 0);
  pid_t pid = ::fork();
  if (pid == 0) {
    Model::Store holder(path_);
    holder.BeginUnit(true); // Holds the write lock.
    char c = 1;
    (void)!::write(ready[1], &c, 1);
    (void)!::read(release[0], &c, 1);
    holder.EndUnit(false);
    ::_exit(0);
  }
  char c;
  ASSERT_EQ(::read(ready[0], &c, 1), 1);
  Model::Store::SetLockTimeout(200);
  {
    Model::Store store(path_);
    try {
      store.Write([&] { Model::PutSetting(store, "x", "1"); });
      ADD_FAILURE() << "wrote through a held lock";
    } catch (const HostCtlException& e) {
      EXPECT_EQ(std::string(e.what()),
                "The host state at " + path_ + " is locked by another process; try again");
    }
    // Reads go on while the other process holds the write lock.
    EXPECT_FALSE(store.Read([&] { return Model::GetSetting(store, "x").has_value(); }));
  }
  Model::Store::SetLockTimeout(HostCtl::Session::kDefaultLockTimeoutMs);
  (void)!::write(release[1], &c, 1);
  int status = 0;
  ::waitpid(pid, &status, 0);
}

TEST_F(StoreTest, FullDiskChangesNothing) {
  auto store = Make(TwoNics());
  // Caps the file at its present size, as a full disk would.
  store->Exec("PRAGMA max_page_count = 1");
  try {
    store->Write([&] {
      for (int i = 0; i < 2000; ++i)
        Model::PutSetting(*store, "key" + std::to_string(i), std::string(200, 'x'));
    });
    ADD_FAILURE() << "the store grew past its cap";
  } catch (const HostCtlException& e) {
    EXPECT_EQ(std::string(e.what()),
              "The host state at " + path_ + " cannot be changed: the disk is full");
  }
  EXPECT_FALSE(store->Read([&] { return Model::GetSetting(*store, "key0").has_value(); }));
}

} // namespace

namespace {

/// The journal mode and synchronous level of the connection, read inside the
/// transaction that is about to commit.
std::pair<std::string, int64_t> Durability(Model::Store& store) {
  Model::Statement mode = store.Prepare("PRAGMA journal_mode");
  mode.Step();
  Model::Statement sync = store.Prepare("PRAGMA synchronous");
  sync.Step();
  return {mode.Text(0), sync.Int(0)};
}

TEST_F(StoreTest, EveryWritePathCommitsToTheFileWithFullSync) {
  // A rollback journal: a committed change is in the database file itself.
  const std::pair<std::string, int64_t> durable{"delete", 2};
  // A new store, and the import that fills it.
  auto created = Model::Store::Create(path_);
  EXPECT_EQ(created->Write([&] { return Durability(*created); }), durable) << "Create";
  Model::ImportHost(*created, TwoNics());
  created.reset();
  // An existing store opened by path (ostrahost, the tests).
  {
    Model::Store opened(path_);
    EXPECT_EQ(opened.Write([&] { return Durability(opened); }), durable) << "opened by path";
  }
  // The process's host store, one command at a time and as a batch.
  Model::Store::SetPath(path_);
  Model::Store& host = Model::Store::Host();
  HostCtl::Session::BeginCommand(true);
  EXPECT_EQ(host.Write([&] { return Durability(host); }), durable) << "command";
  HostCtl::Session::EndCommand(true);
  HostCtl::Session::BeginBatch();
  EXPECT_EQ(host.Write([&] { return Durability(host); }), durable) << "batch";
  HostCtl::Session::EndBatch(true);
  Model::Store::CloseHost();
  // The default host, created from the demo profile on first use.
  Model::Store::SetPath(dir_ + "/state/ostracli/host.db", /*createDemo=*/true);
  Model::Store& fresh = Model::Store::Host();
  EXPECT_EQ(fresh.Write([&] { return Durability(fresh); }), durable) << "default host";
  Model::Store::CloseHost();
}

} // namespace

namespace {

std::vector<std::string> Column(Model::Store& store, const char* sql) {
  std::vector<std::string> values;
  Model::Statement rows = store.Prepare(sql);
  while (rows.Step())
    values.push_back(rows.Text(0));
  return values;
}

// A host written by the first release (layout 1: a write-ahead log, resolver
// tables that SQLite 3.40's integrity check misreads) is brought up to date
// when it is first opened, and stays the same host.
TEST_F(StoreTest, UpgradesAFileOfTheLayoutBefore) {
  std::system(("cp " HOSTCTL_FIXTURES "/layout1.db " + path_).c_str());
  {
    Model::Store old(path_);
    EXPECT_EQ(Column(old, "PRAGMA user_version"), std::vector<std::string>{"3"});
    EXPECT_EQ(Column(old, "PRAGMA journal_mode"), std::vector<std::string>{"delete"});
    EXPECT_EQ(Column(old, "PRAGMA integrity_check"), std::vector<std::string>{"ok"});
    EXPECT_TRUE(Column(old, "PRAGMA foreign_key_check").empty());
    // The same host as a demo host made now, resolver order included.
    auto fresh = Model::Store::Create(dir_ + "/fresh.db");
    Model::ImportHost(*fresh, Model::Profile("demo"));
    // The demo of that release let vmnic0 use a load-balancer setting it did
    // not list as supported; today's demo lists it. Stored files are not
    // checked again, so the old file keeps its list.
    auto now = Model::ExportHost(*fresh);
    auto& supported = now["nics"][0]["netqueue"]["supportedSettings"];
    for (auto it = supported.begin(); it != supported.end();)
      it = *it == "MacLearnLB" ? supported.erase(it) : it + 1;
    EXPECT_EQ(Model::ExportHost(old), now);
  }
  // A second open finds nothing left to do.
  Model::Store again(path_);
  EXPECT_EQ(Column(again, "PRAGMA integrity_check"), std::vector<std::string>{"ok"});
}

} // namespace
