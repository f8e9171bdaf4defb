//===- Lab.cpp - Building and removing the test namespace -----------------===//
#include "Lab.h"

#include <cstdio>
#include <sys/stat.h>
#include <sys/wait.h>
#include <unistd.h>

namespace LinuxNetTest {

Output Shell(const std::string& command, bool withErrors) {
  Output run;
  FILE* p = popen((command + (withErrors ? " 2>&1" : " 2>/dev/null")).c_str(), "r");
  if (!p) {
    run.status = -1;
    return run;
  }
  char buffer[4096];
  size_t n = 0;
  while ((n = fread(buffer, 1, sizeof buffer, p)) > 0)
    run.out.append(buffer, n);
  const int status = pclose(p);
  run.status = WIFEXITED(status) ? WEXITSTATUS(status) : -1;
  return run;
}

unsigned long ThreadNamespace() {
  struct stat st {};
  stat("/proc/thread-self/ns/net", &st);
  return st.st_ino;
}

void LabTest::SetUp() {
  if (geteuid() != 0)
    GTEST_SKIP() << "building a network namespace lab needs root (CAP_NET_ADMIN, CAP_SYS_ADMIN)";
  if (Shell("ip -V").status != 0)
    GTEST_SKIP() << "ip (iproute2) is not installed";
  const auto* info = ::testing::UnitTest::GetInstance()->current_test_info();
  name_ = "lnt" + std::to_string(getpid()) + "-" + info->name();
  if (name_.size() > 60)
    name_.resize(60);
  for (char& c : name_)
    if (!isalnum(static_cast<unsigned char>(c)) && c != '-')
      c = '-';
  Shell("ip netns del " + name_);
  ASSERT_EQ(Shell("ip netns add " + name_).status, 0) << "cannot create namespace " << name_;
  const std::string batch = "link set lo up\n"
                            "link add vmnic0 type veth peer name peer0\n"
                            "link add vmnic1 numtxqueues 4 numrxqueues 4 type veth peer name "
                            "peer1 numtxqueues 4 numrxqueues 4\n"
                            "link add br0 type bridge\n"
                            "link set vmnic0 master br0\n"
                            "link set vmnic0 up\n"
                            "link set peer0 up\n"
                            "link set br0 up\n"
                            "addr add 10.1.0.2/24 dev br0\n"
                            "addr add 2001:db8::2/64 dev br0 nodad\n"
                            "route add 198.51.100.0/24 via 10.1.0.1\n"
                            "route add 2001:db8:1::/64 via 2001:db8::1\n"
                            "neigh add 10.1.0.9 lladdr 02:00:00:00:00:09 dev br0\n"
                            "neigh add 2001:db8::9 lladdr 02:00:00:00:00:0a dev br0\n";
  const Output built = Shell("printf '" + batch + "' | ip -n " + name_ + " -batch -", true);
  ASSERT_EQ(built.status, 0) << built.out;
  // Carriers come up asynchronously: wait until the links that are up say
  // so, so that two readers never see the lab change under them.
  for (int wait = 0; wait < 100; ++wait) {
    int up = 0;
    for (const auto& link : IpJson("link show"))
      up += link["operstate"] == "UP";
    if (up == 3)
      break;
    usleep(20000);
  }
  const std::string etc = "/etc/netns/" + name_;
  ASSERT_EQ(Shell("mkdir -p " + etc + " && printf '# lab resolver\\nnameserver 192.0.2.53\\n' > " +
                  etc + "/resolv.conf && printf '127.0.0.1\\tlocalhost\\n' > " + etc + "/hosts")
                .status,
            0);
  ns_ = std::make_unique<LinuxNet::Namespace>(LinuxNet::Namespace::Open(name_));
}

void LabTest::TearDown() {
  ns_.reset();
  if (!name_.empty()) {
    Shell("ip netns del " + name_);
    Shell("rm -rf /etc/netns/" + name_);
  }
}

std::string LabTest::Ip(const std::string& args) {
  const Output run = Shell("ip -n " + name_ + " " + args, true);
  EXPECT_EQ(run.status, 0) << "ip " << args << ": " << run.out;
  return run.out;
}

nlohmann::json LabTest::IpJson(const std::string& args) {
  const Output run = Shell("ip -n " + name_ + " -json " + args);
  EXPECT_EQ(run.status, 0) << "ip -json " << args;
  if (run.out.find_first_not_of(" \n") == std::string::npos)
    return nlohmann::json::array();
  return nlohmann::json::parse(run.out);
}

Output LabTest::Exec(const std::string& command) {
  return Shell("ip netns exec " + name_ + " " + command);
}

} // namespace LinuxNetTest

// libnl-xfrm 3.7 does not release the selector addresses it builds while
// parsing a policy (xfrmnl_sp_parse); LeakSanitizer should report our leaks,
// not that one. libnl is built without frame pointers, so only the slow
// unwinder sees that the allocation comes from libnl-xfrm.
extern "C" __attribute__((visibility("default"), used)) const char* __lsan_default_suppressions() {
  return "leak:libnl-xfrm-3.so\n";
}
extern "C" __attribute__((visibility("default"), used)) const char* __asan_default_options() {
  return "fast_unwind_on_malloc=0";
}
