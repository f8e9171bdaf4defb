//===- IntFit.h - Integer parameters a command stores in fewer bits -------===//
//
// The command host passes every integer as 64 bits. Where a command hands a
// value on in a narrower type, the value must fit that type: one that does
// not is refused with the range, never cut to its low bits and reported as
// success. Each command family keeps its ranges in one table of IntFit rows
// next to the command that narrows.
//
//===----------------------------------------------------------------------===//
#pragma once

#include "Fabrik/Call.h"

#include <cstdint>
#include <optional>
#include <span>
#include <string>

namespace CorvexCli::NetworkNamespace {

/// The values an integer parameter can take through a narrower type.
struct IntFit {
  const std::string& name; ///< Long name of the parameter (a file-level constant).
  long min;                ///< Smallest value passed on.
  long max;                ///< Largest value passed on.
};

/// Bounds of the types commands narrow to.
constexpr long kUint32Max = UINT32_MAX;
constexpr long kInt32Max = INT32_MAX;

/// "option --NAME: value V is out of range [MIN - MAX]" when the parameter
/// of \p fit is given with a value outside its range; nothing otherwise.
std::optional<std::string> OutOfRange(const Fabrik::CallSpec::Input& input, const IntFit& fit);

/// Throws HostCtl::Lib::HostCtlException with the problem of the first
/// parameter of \p fits that is given outside its range.
void RequireFit(const Fabrik::CallSpec::Input& input, std::span<const IntFit> fits);

} // namespace CorvexCli::NetworkNamespace
