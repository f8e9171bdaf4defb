//===- EthtoolWire.h - Shared pieces of the ethtool parsers (internal) ----===//
#pragma once

#include "LinuxNet/Ethtool.h"

#include <netlink/attr.h>

#include <cstdint>
#include <span>
#include <string>
#include <utility>
#include <vector>

namespace LinuxNet::Detail {

/// A generic netlink reply copied to aligned storage, its attributes parsed.
class GenlReply {
public:
  /// Throws Error(EPROTO) when \p bytes is not a whole, well-formed message.
  GenlReply(std::span<const uint8_t> bytes, int max);
  std::vector<nlattr*> tb; ///< Top-level attributes by type.

private:
  std::vector<uint64_t> storage_; ///< The message, 8-byte aligned.
};

/// An ethtool bitset in either of its forms.
struct Bitset {
  uint32_t size = 0;                                   ///< Number of bits.
  bool noMask = false;                                 ///< A plain list (no mask).
  std::vector<uint32_t> value;                         ///< Bits set.
  std::vector<uint32_t> mask;                          ///< Bits present (verbose: listed).
  std::vector<std::pair<uint32_t, std::string>> names; ///< Verbose form: bit and name.
};
Bitset ParseBitset(const nlattr* a);
bool TestBit(const std::vector<uint32_t>& words, uint32_t bit);
std::vector<uint32_t> SetBits(const std::vector<uint32_t>& words);

/// A u32 member of Coalesce and its attribute.
struct CoalesceField {
  int attr;                                  ///< ETHTOOL_A_COALESCE_*.
  std::optional<uint32_t> Coalesce::*member; ///< The record's member.
};
/// Every u32 coalescing parameter (the two adaptive switches are u8).
std::span<const CoalesceField> CoalesceFields();

} // namespace LinuxNet::Detail
