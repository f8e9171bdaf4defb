//===- SysctlTest.cpp - Network settings of the lab against sysctl --------===//
#include "Lab.h"

#include "LinuxNet/Error.h"
#include "LinuxNet/Sysctl.h"

#include <cerrno>

using namespace LinuxNet;
using namespace LinuxNetTest;

namespace {

using SysctlTest = LabTest;

TEST_F(SysctlTest, SettingsAreTheNamespacesOwnAndChangesStayInIt) {
  const std::string machine = Shell("sysctl -n net.ipv4.tcp_ecn").out;
  const std::string other = machine == "1\n" ? "0" : "1";
  EXPECT_EQ(ReadSysctl(*ns_, "net.ipv4.tcp_ecn") + "\n", Exec("sysctl -n net.ipv4.tcp_ecn").out);
  WriteSysctl(*ns_, "net.ipv4.tcp_ecn", other);
  EXPECT_EQ(Exec("sysctl -n net.ipv4.tcp_ecn").out, other + "\n");
  EXPECT_EQ(Shell("sysctl -n net.ipv4.tcp_ecn").out, machine);

  WriteSysctl(*ns_, "net/ipv6/conf/vmnic1/disable_ipv6", "1");
  EXPECT_EQ(Exec("sysctl -n net.ipv6.conf.vmnic1.disable_ipv6").out, "1\n");
  EXPECT_EQ(ReadSysctl(*ns_, "net.ipv6.conf.vmnic1.disable_ipv6"), "1");
  EXPECT_FALSE(ReadSysctl(*ns_, "net.ipv4.tcp_available_congestion_control").empty());
}

TEST_F(SysctlTest, MissingForeignAndBadValuesAreRefused) {
  try {
    ReadSysctl(*ns_, "net.ipv4.no_such_setting");
    ADD_FAILURE() << "read a missing setting";
  } catch (const Error& e) {
    EXPECT_EQ(e.Code(), ENOENT);
    EXPECT_STREQ(e.what(), "the setting net.ipv4.no_such_setting does not exist");
  }
  for (const char* foreign : {"kernel.hostname", "net/../kernel/hostname", "vm.swappiness"}) {
    try {
      WriteSysctl(*ns_, foreign, "x");
      ADD_FAILURE() << "wrote " << foreign;
    } catch (const Error& e) {
      EXPECT_EQ(e.Code(), EINVAL);
      EXPECT_EQ(std::string(e.what()),
                "'" + std::string(foreign) + "' is not a setting of a network namespace (net.*)");
    }
  }
  try {
    WriteSysctl(*ns_, "net.ipv4.tcp_congestion_control", "no-such-algorithm");
    ADD_FAILURE() << "an unknown algorithm was taken";
  } catch (const Error& e) {
    EXPECT_EQ(std::string(e.what()).rfind("the setting net.ipv4.tcp_congestion_control: ", 0), 0u)
        << e.what();
  }
}

} // namespace
