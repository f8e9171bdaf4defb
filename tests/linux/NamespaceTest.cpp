//===- NamespaceTest.cpp - Opening, creating and leaving namespaces -------===//
#include "Lab.h"

#include "LinuxNet/Error.h"
#include "LinuxNet/Ethtool.h"
#include "LinuxNet/Links.h"

#include <cerrno>
#include <fcntl.h>
#include <sched.h>
#include <sys/wait.h>
#include <unistd.h>

using namespace LinuxNet;
using namespace LinuxNetTest;

namespace {

using NamespaceTest = LabTest;

TEST(NamespaceNames, MissingAndMalformedNamesAreRefusedWithOneLine) {
  try {
    Namespace::Open("no-such-lab-namespace");
    FAIL() << "opened a missing namespace";
  } catch (const Error& e) {
    EXPECT_EQ(e.Code(), ENOENT);
    EXPECT_STREQ(e.what(), "the network namespace no-such-lab-namespace does not exist");
  }
  for (const char* bad : {"..", "a/b", "."}) {
    try {
      Namespace::Open(bad);
      FAIL() << "opened " << bad;
    } catch (const Error& e) {
      EXPECT_EQ(e.Code(), EINVAL) << bad;
      EXPECT_EQ(std::string(e.what()),
                "'" + std::string(bad) + "' is not a valid network namespace name");
    }
  }
  const Namespace own = Namespace::Open("");
  EXPECT_TRUE(own.IsOwn());
  EXPECT_EQ(own.ResolvConfPath(), "/etc/resolv.conf");
  EXPECT_EQ(own.HostsPath(), "/etc/hosts");
}

TEST_F(NamespaceTest, FilesOfANamedNamespaceAreItsEtcNetnsFiles) {
  EXPECT_EQ(ns_->ResolvConfPath(), "/etc/netns/" + name_ + "/resolv.conf");
  EXPECT_EQ(ns_->HostsPath(), "/etc/netns/" + name_ + "/hosts");
}

TEST_F(NamespaceTest, CreateListDeleteAgreeWithIpNetns) {
  const std::string extra = name_ + "-x";
  CreateNamespace(extra);
  const Output listed = Shell("ip netns list");
  EXPECT_NE(listed.out.find(extra), std::string::npos) << listed.out;
  auto names = ListNamespaces();
  EXPECT_NE(std::find(names.begin(), names.end(), extra), names.end());
  EXPECT_NE(std::find(names.begin(), names.end(), name_), names.end());
  // The new namespace is empty but for its loopback device.
  EXPECT_EQ(IpJson("link show").size(), 6u);
  const Output links = Shell("ip -n " + extra + " -json link show");
  EXPECT_EQ(nlohmann::json::parse(links.out).size(), 1u);

  try {
    CreateNamespace(extra);
    ADD_FAILURE() << "created " << extra << " twice";
  } catch (const Error& e) {
    EXPECT_EQ(e.Code(), EEXIST);
    EXPECT_EQ(std::string(e.what()), "the network namespace " + extra + " already exists");
  }
  DeleteNamespace(extra);
  EXPECT_EQ(Shell("ip netns list").out.find(extra), std::string::npos);
  try {
    DeleteNamespace(extra);
    ADD_FAILURE() << "deleted " << extra << " twice";
  } catch (const Error& e) {
    EXPECT_EQ(e.Code(), ENOENT);
  }
}

TEST_F(NamespaceTest, TheCallingThreadNeverLeavesItsNamespace) {
  const unsigned long home = ThreadNamespace();
  // Reads, changes and refusals in the lab, each making its sockets there.
  EXPECT_FALSE(ListLinks(*ns_).empty());
  EXPECT_EQ(ThreadNamespace(), home);
  EXPECT_THROW(GetRings(*ns_, "vmnic0"), Error);
  EXPECT_EQ(ThreadNamespace(), home);
  LinkChange change;
  change.mtu = 1400;
  EXPECT_THROW(ChangeLink(*ns_, "no-such-link", change), Error);
  EXPECT_EQ(ThreadNamespace(), home);
  EXPECT_THROW(Namespace::Open(name_ + "-missing"), Error);
  CreateNamespace(name_ + "-y");
  DeleteNamespace(name_ + "-y");
  EXPECT_EQ(ThreadNamespace(), home);
  // The sockets are bound to the lab: its links are not this namespace's.
  const Namespace own = Namespace::Open("");
  EXPECT_FALSE(GetLink(*const_cast<Namespace*>(&own), "br0").has_value() &&
               GetLink(*const_cast<Namespace*>(&own), "peer1").has_value());
  EXPECT_TRUE(GetLink(*ns_, "peer1").has_value());
}

TEST_F(NamespaceTest, WithoutCapabilitiesReadsWorkAndChangesAreRefused) {
  // A child moves into the lab, drops root and works on its own namespace.
  int pipeFds[2];
  ASSERT_EQ(pipe(pipeFds), 0);
  const pid_t child = fork();
  ASSERT_GE(child, 0);
  if (child == 0) {
    close(pipeFds[0]);
    std::string report;
    const int fd = open(("/run/netns/" + name_).c_str(), O_RDONLY);
    if (fd < 0 || setns(fd, CLONE_NEWNET) != 0 || setresgid(65534, 65534, 65534) != 0 ||
        setresuid(65534, 65534, 65534) != 0) {
      report = "cannot enter the lab without root";
    } else {
      try {
        Namespace own = Namespace::Open("");
        report = std::to_string(ListLinks(own).size()) + " links; ";
        LinkChange change;
        change.up = true;
        ChangeLink(own, "vmnic1", change);
        report += "changed";
      } catch (const Error& e) {
        report += std::to_string(e.Code()) + " " + e.what();
      }
      try {
        Namespace lab = Namespace::Open(name_);
        ListLinks(lab);
        report += "; listed the lab";
      } catch (const Error& e) {
        report += "; " + std::string(e.what());
      }
    }
    (void)!write(pipeFds[1], report.data(), report.size());
    _exit(0);
  }
  close(pipeFds[1]);
  std::string report(1024, '\0');
  const ssize_t n = read(pipeFds[0], report.data(), report.size());
  report.resize(static_cast<std::size_t>(std::max<ssize_t>(0, n)));
  close(pipeFds[0]);
  waitpid(child, nullptr, 0);
  EXPECT_EQ(report, "6 links; " + std::to_string(EPERM) +
                        " permission denied: changing vmnic1 needs CAP_NET_ADMIN; "
                        "permission denied: entering the network namespace " +
                        name_ + " needs CAP_SYS_ADMIN");
  EXPECT_EQ(IpJson("link show vmnic1")[0]["operstate"], "DOWN");
}

} // namespace
