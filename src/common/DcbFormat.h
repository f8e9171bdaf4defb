//===- DcbFormat.h - Text forms of DCB codes, masks and arrays ------------===//
//
// Formatting functions shared by the DCB commands: a mode code as its
// number and name, a per-priority bit mask and a per-class byte array as
// eight blank-separated numbers.
//
//===----------------------------------------------------------------------===//
#pragma once

#include <array>
#include <cstdint>
#include <string>

namespace CorvexCli::NetworkNamespace {

/// "%d - %s": the mode number and its name ("Unknown", "CEN Mode",
/// "CEE Mode", "IEEE Mode"); a number above 3 is named "Unknown".
std::string DcbModeToString(uint32_t mode);

/// The bits 0 to 7 of \p mask, in that order, each 0 or 1, separated by
/// single blanks.
std::string DcbIntMaskToString(uint8_t mask);

/// The eight values of \p array in decimal, separated by single blanks.
std::string DcbArrayToString(const std::array<uint8_t, 8>& array);

} // namespace CorvexCli::NetworkNamespace
