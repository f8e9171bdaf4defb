//===- FilesTest.cpp - resolv.conf, hosts and their atomic rewrites -------===//
#include "Lab.h"

#include "LinuxNet/Error.h"
#include "LinuxNet/Files.h"

#include <cerrno>
#include <chrono>
#include <csignal>
#include <cstdlib>
#include <dirent.h>
#include <random>
#include <sys/stat.h>
#include <sys/wait.h>
#include <unistd.h>

using namespace LinuxNet;
using namespace LinuxNetTest;

namespace {

/// A directory of its own under /tmp, removed afterwards.
class FilesTest : public ::testing::Test {
protected:
  void SetUp() override {
    char dir[] = "/tmp/linuxnet-files-XXXXXX";
    ASSERT_NE(mkdtemp(dir), nullptr);
    dir_ = dir;
  }
  void TearDown() override { Shell("rm -rf " + dir_); }
  std::vector<std::string> Listing() const {
    std::vector<std::string> names;
    if (DIR* d = opendir(dir_.c_str())) {
      while (dirent* e = readdir(d))
        if (e->d_name[0] != '.' || (strcmp(e->d_name, ".") && strcmp(e->d_name, "..")))
          names.emplace_back(e->d_name);
      closedir(d);
    }
    std::sort(names.begin(), names.end());
    return names;
  }
  std::string dir_; ///< The test's directory.
};

TEST_F(FilesTest, ResolvConfEditsChangeOnlyTheLinesTheyManage) {
  ResolvConf conf = ResolvConf::Parse("# written by hand\n"
                                      "; an old comment\n"
                                      "options ndots:2 timeout:1\n"
                                      "nameserver 192.0.2.53\n"
                                      "nameserver 2001:DB8::53   # v6\n"
                                      "search old.example\n"
                                      "sortlist 10.0.0.0/255.0.0.0\n"
                                      "domain lab.example\n");
  EXPECT_EQ(conf.Nameservers(), (std::vector<std::string>{"192.0.2.53", "2001:DB8::53"}));
  EXPECT_EQ(conf.SearchDomains(), std::vector<std::string>{"lab.example"});
  conf.AddNameserver("198.51.100.53");
  ExpectError([&] { conf.AddNameserver("2001:db8::53"); }, EEXIST,
              "the DNS server 2001:db8::53 is already listed");
  ExpectError([&] { conf.AddNameserver("10.0.0"); }, EINVAL,
              "'10.0.0' is not an IPv4 or IPv6 address");
  conf.RemoveNameserver("192.0.2.53");
  ExpectError([&] { conf.RemoveNameserver("192.0.2.53"); }, ENOENT,
              "the DNS server 192.0.2.53 is not listed");
  conf.AddSearchDomain("corp.example");
  ExpectError([&] { conf.AddSearchDomain("Corp.Example"); }, EEXIST,
              "the search domain Corp.Example is already listed");
  ExpectError([&] { conf.AddSearchDomain("bad domain"); }, EINVAL,
              "'bad domain' is not a valid domain name");
  ExpectError([&] { conf.RemoveSearchDomain("nope.example"); }, ENOENT,
              "the search domain nope.example is not listed");
  EXPECT_EQ(conf.Text(), "# written by hand\n"
                         "; an old comment\n"
                         "options ndots:2 timeout:1\n"
                         "nameserver 2001:DB8::53   # v6\n"
                         "nameserver 198.51.100.53\n"
                         "sortlist 10.0.0.0/255.0.0.0\n"
                         "search lab.example corp.example\n");
  conf.RemoveSearchDomain("lab.example");
  conf.RemoveSearchDomain("corp.example");
  conf.RemoveAllNameservers();
  EXPECT_EQ(conf.Text(), "# written by hand\n"
                         "; an old comment\n"
                         "options ndots:2 timeout:1\n"
                         "sortlist 10.0.0.0/255.0.0.0\n");
  ResolvConf empty = ResolvConf::Parse("");
  empty.AddNameserver("fe80::1%eth0");
  empty.AddSearchDomain("lab.example");
  EXPECT_EQ(empty.Text(), "nameserver fe80::1%eth0\nsearch lab.example\n");
}

TEST_F(FilesTest, HostsEditsKeepEveryLineTheyDidNotWrite) {
  HostsFile hosts = HostsFile::Parse("127.0.0.1\tlocalhost\n"
                                     "::1\tlocalhost ip6-localhost ip6-loopback\n"
                                     "# lab hosts\n"
                                     "10.1.0.5   web web.lab   # the web server\n");
  const auto entries = hosts.Entries();
  ASSERT_EQ(entries.size(), 3u);
  EXPECT_EQ(entries[1].names,
            (std::vector<std::string>{"localhost", "ip6-localhost", "ip6-loopback"}));
  EXPECT_EQ(entries[2].address, "10.1.0.5");
  EXPECT_EQ(entries[2].comment, "the web server");
  hosts.Add("2001:db8::6", {"db", "db.lab"}, "database");
  ExpectError([&] { hosts.Add("10.1.0.5", {"web"}); }, EEXIST,
              "the hosts entry 10.1.0.5 web already exists");
  ExpectError([&] { hosts.Add("10.1.0.7", {"bad_name!"}); }, EINVAL,
              "'bad_name!' is not a valid host name");
  ExpectError([&] { hosts.Add("10.1.0.7", {"ok"}, "two\nlines"); }, EINVAL,
              "a hosts entry's comment must be one line");
  ExpectError([&] { hosts.Add("10.1.0.256", {"ok"}); }, EINVAL,
              "'10.1.0.256' is not an IPv4 or IPv6 address");
  hosts.Remove("10.1.0.5", "web");
  ExpectError([&] { hosts.Remove("10.1.0.5", "web"); }, ENOENT,
              "there is no hosts entry 10.1.0.5 web");
  // Addresses match in any spelling.
  hosts.Remove("2001:DB8:0::6", "db");
  EXPECT_EQ(hosts.Text(), "127.0.0.1\tlocalhost\n"
                          "::1\tlocalhost ip6-localhost ip6-loopback\n"
                          "# lab hosts\n");
  EXPECT_TRUE(IsValidHostName("a-b.example"));
  for (const std::string& bad :
       std::vector<std::string>{"", "-a", "a-", "a..b", "a b", std::string(64, 'x')})
    EXPECT_FALSE(IsValidHostName(bad)) << bad;
}

TEST_F(FilesTest, RewritesKeepModeAndSymlinkAndCreateDirectories) {
  const std::string real = dir_ + "/real.conf";
  WriteFileAtomically(real, "nameserver 192.0.2.1\n");
  ASSERT_EQ(chmod(real.c_str(), 0640), 0);
  ASSERT_EQ(symlink("real.conf", (dir_ + "/resolv.conf").c_str()), 0);
  UpdateResolvConf(dir_ + "/resolv.conf", [](ResolvConf& c) { c.AddNameserver("192.0.2.2"); });
  struct stat st {};
  ASSERT_EQ(lstat((dir_ + "/resolv.conf").c_str(), &st), 0);
  EXPECT_TRUE(S_ISLNK(st.st_mode));
  ASSERT_EQ(stat(real.c_str(), &st), 0);
  EXPECT_EQ(st.st_mode & 07777, 0640u);
  EXPECT_EQ(ReadTextFile(real), "nameserver 192.0.2.1\nnameserver 192.0.2.2\n");
  // An edit that changes nothing leaves the file alone, missing newline and all.
  WriteFileAtomically(real, "nameserver 192.0.2.1");
  ASSERT_EQ(stat(real.c_str(), &st), 0);
  const ino_t before = st.st_ino;
  UpdateResolvConf(real, [](ResolvConf&) {});
  ASSERT_EQ(stat(real.c_str(), &st), 0);
  EXPECT_EQ(st.st_ino, before);
  // A refused edit writes nothing.
  EXPECT_THROW(UpdateResolvConf(real, [](ResolvConf& c) { c.AddNameserver("192.0.2.1"); }), Error);
  EXPECT_EQ(ReadTextFile(real), "nameserver 192.0.2.1");
  UpdateHostsFile(dir_ + "/netns/lab/hosts", [](HostsFile& h) { h.Add("10.0.0.1", {"a"}); });
  EXPECT_EQ(ReadTextFile(dir_ + "/netns/lab/hosts"), "10.0.0.1\ta\n");
  EXPECT_EQ(Listing(), (std::vector<std::string>{"netns", "real.conf", "resolv.conf"}));
}

TEST_F(FilesTest, AProcessKilledMidRewriteLeavesTheOldOrTheNewFile) {
  const std::string path = dir_ + "/resolv.conf";
  std::string a, b;
  for (int i = 0; i < 6000; ++i) {
    a += "nameserver 192.0.2." + std::to_string(i % 250) + "  # old " + std::to_string(i) + "\n";
    b += "nameserver 198.51.100." + std::to_string(i % 250) + "  # new " + std::to_string(i) + "\n";
  }
  WriteFileAtomically(path, a);
  const unsigned seed = static_cast<unsigned>(
      std::chrono::steady_clock::now().time_since_epoch().count() & 0xffffffff);
  std::mt19937 random(seed);
  SCOPED_TRACE("seed " + std::to_string(seed));
  int killedMidWay = 0;
  for (int round = 0; round < 40; ++round) {
    const pid_t child = fork();
    ASSERT_GE(child, 0);
    if (child == 0) {
      for (;;)
        UpdateTextFile(path, [&](const std::string& old) { return old == a ? b : a; });
    }
    usleep(std::uniform_int_distribution<unsigned>(0, 4000)(random));
    kill(child, SIGKILL);
    int status = 0;
    waitpid(child, &status, 0);
    const std::string now = ReadTextFile(path);
    ASSERT_TRUE(now == a || now == b) << "round " << round << ": " << now.size() << " bytes";
    for (const std::string& name : Listing())
      killedMidWay += name != "resolv.conf";
  }
  // The next writer clears what killed ones left behind.
  UpdateTextFile(path, [&](const std::string&) { return a; });
  EXPECT_EQ(Listing(), std::vector<std::string>{"resolv.conf"});
  std::cout << "[          ] " << killedMidWay << " of 40 kills left a temporary file\n";
}

TEST_F(FilesTest, ConcurrentWritersLoseNoEdit) {
  const std::string path = dir_ + "/hosts";
  WriteFileAtomically(path, "127.0.0.1\tlocalhost\n");
  std::vector<pid_t> children;
  for (int w = 0; w < 4; ++w) {
    const pid_t child = fork();
    ASSERT_GE(child, 0);
    if (child == 0) {
      for (int i = 0; i < 25; ++i)
        UpdateHostsFile(path, [&](HostsFile& h) {
          h.Add("10.2." + std::to_string(w) + "." + std::to_string(i), {"h" + std::to_string(i)});
        });
      _exit(0);
    }
    children.push_back(child);
  }
  for (pid_t child : children) {
    int status = 0;
    waitpid(child, &status, 0);
    EXPECT_TRUE(WIFEXITED(status) && WEXITSTATUS(status) == 0);
  }
  EXPECT_EQ(HostsFile::Load(path).Entries().size(), 101u);
}

using NamespaceFilesTest = LabTest;

TEST_F(NamespaceFilesTest, ChangesAreWhatIpNetnsExecShowsTheNamespace) {
  UpdateResolvConf(ns_->ResolvConfPath(), [](ResolvConf& c) {
    c.AddNameserver("198.51.100.53");
    c.AddSearchDomain("lab.example");
  });
  UpdateHostsFile(ns_->HostsPath(), [](HostsFile& h) { h.Add("10.1.0.5", {"web.lab", "web"}); });
  EXPECT_EQ(
      Exec("cat /etc/resolv.conf").out,
      "# lab resolver\nnameserver 192.0.2.53\nnameserver 198.51.100.53\nsearch lab.example\n");
  EXPECT_EQ(Exec("cat /etc/hosts").out, "127.0.0.1\tlocalhost\n10.1.0.5\tweb.lab web\n");
  EXPECT_EQ(ResolvConf::Load(ns_->ResolvConfPath()).Nameservers(),
            (std::vector<std::string>{"192.0.2.53", "198.51.100.53"}));
}

} // namespace
