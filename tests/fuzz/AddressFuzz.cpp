//===- AddressFuzz.cpp - Fuzzing the address and network parsers ----------===//
//
// Any text: the parsers must not crash, and what they accept must print back
// to a text that parses to the same value.
//
//===----------------------------------------------------------------------===//
#include "HostCtl/Lib.h"
#include "HostCtl/Network/Address.h"

#include <cstdint>
#include <cstdlib>
#include <string>

using namespace HostCtl::Network;

namespace {

void Check(bool condition) {
  if (!condition)
    std::abort();
}

} // namespace

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
  const std::string text(reinterpret_cast<const char*>(data), size);

  std::array<uint8_t, 6> mac{};
  if (MacAddress::Parse(text, mac)) {
    std::array<uint8_t, 6> again{};
    Check(MacAddress::Parse(MacAddress(mac).GetStringAddress(), again) && again == mac);
  }
  uint32_t v4 = 0;
  if (Ipv4Address::Parse(text, v4)) {
    uint32_t again = 0;
    Check(Ipv4Address::Parse(Ipv4Address(v4).GetStringAddress(), again) && again == v4);
  }
  std::array<uint8_t, 16> v6{};
  if (Ipv6Address::Parse(text, v6)) {
    std::array<uint8_t, 16> again{};
    std::string printed = Ipv6Address(v6).GetStringAddress();
    Check(Ipv6Address::Parse(printed, again) && again == v6);
  }
  try {
    Ipv4Network network(text);
    Check(Ipv4Network(network.GetStringAddress()) == network);
  } catch (const HostCtl::Lib::HostCtlException&) {
  }
  if (Ipv6Network::IsValidAddressAndNetmask(text)) {
    Ipv6Network network(text);
    Check(Ipv6Network(network.GetStringAddress()) == network);
  }
  return 0;
}
