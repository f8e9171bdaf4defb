//===- DcbFormat.cpp - Text forms of DCB codes, masks and arrays ----------===//
#include "common/DcbFormat.h"

#include "HostCtl/Misc.h"

#include <iterator>

namespace CorvexCli::NetworkNamespace {

namespace {

/// Mode names by mode number.
const char* const kDcbModeNames[] = {"Unknown", "CEN Mode", "CEE Mode", "IEEE Mode"};

} // namespace

std::string DcbModeToString(uint32_t mode) {
  const char* name = mode < std::size(kDcbModeNames) ? kDcbModeNames[mode] : kDcbModeNames[0];
  return HostCtl::Misc::StrPrintf("%u - %s", mode, name);
}

std::string DcbIntMaskToString(uint8_t mask) {
  return HostCtl::Misc::StrPrintf("%d %d %d %d %d %d %d %d", mask & 1, (mask >> 1) & 1,
                                  (mask >> 2) & 1, (mask >> 3) & 1, (mask >> 4) & 1,
                                  (mask >> 5) & 1, (mask >> 6) & 1, (mask >> 7) & 1);
}

std::string DcbArrayToString(const std::array<uint8_t, 8>& array) {
  return HostCtl::Misc::StrPrintf("%d %d %d %d %d %d %d %d", array[0], array[1], array[2], array[3],
                                  array[4], array[5], array[6], array[7]);
}

} // namespace CorvexCli::NetworkNamespace
