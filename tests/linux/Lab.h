//===- Lab.h - A throwaway network namespace for one test -----------------===//
//
// LabTest builds, for each test, a namespace named after the process and the
// test, with two veth pairs (vmnic0/peer0 in a bridge br0, vmnic1/peer1
// free), IPv4 and IPv6 addresses, routes, neighbours and /etc/netns files,
// and deletes it afterwards whatever happened. Its oracle runs ip, bridge,
// ethtool and ss in that namespace.
//
//===----------------------------------------------------------------------===//
#pragma once

#include "LinuxNet/Error.h"
#include "LinuxNet/Namespace.h"

#include <gtest/gtest.h>
#include <nlohmann/json.hpp>

#include <string>
#include <unistd.h>

namespace LinuxNetTest {

/// Output and exit status of a shell command.
struct Output {
  std::string out;
  int status = 0;
};
/// Runs \p command with /bin/sh; standard error goes to the output too when
/// \p withErrors.
Output Shell(const std::string& command, bool withErrors = false);

/// A test that needs root and its own namespace.
class LabTest : public ::testing::Test {
protected:
  void SetUp() override;
  void TearDown() override;

  /// Runs "ip -n NS ARGS" and fails the test when it fails.
  std::string Ip(const std::string& args);
  /// Runs "ip -n NS -json ARGS" and parses its output.
  nlohmann::json IpJson(const std::string& args);
  /// Runs COMMAND inside the namespace (ip netns exec).
  Output Exec(const std::string& command);

  std::string name_;                        ///< The namespace's name.
  std::unique_ptr<LinuxNet::Namespace> ns_; ///< The library's handle to it.
};

/// Expects \p body to throw LinuxNet::Error with \p code and \p message.
template <typename F> void ExpectError(F&& body, int code, const std::string& message) {
  try {
    body();
    ADD_FAILURE() << "no error; expected: " << message;
  } catch (const LinuxNet::Error& e) {
    EXPECT_EQ(e.Code(), code) << e.what();
    EXPECT_EQ(std::string(e.what()), message);
  }
}

/// Expects two readers of the same kernel state to agree. The lab keeps
/// moving for a moment after it is built (IPv6 link-local addresses and
/// their routes appear when carriers come up), so a difference is read
/// again for up to a second before it counts.
template <typename A, typename B> void ExpectAgree(A ours, B oracle) {
  for (int attempt = 0;; ++attempt) {
    const auto a = ours();
    const auto b = oracle();
    if (a == b || attempt == 10) {
      EXPECT_EQ(a, b);
      return;
    }
    usleep(100000);
  }
}

/// The inode of the calling thread's network namespace.
unsigned long ThreadNamespace();

} // namespace LinuxNetTest
