//===- LinuxNet/Error.h - The one exception of the kernel library ---------===//
//
// Every refusal of the kernel, and every bad value handed to the library, is
// thrown as LinuxNet::Error: a message for the user that names the object and
// the reason, and the errno that caused it.
//
//===----------------------------------------------------------------------===//
#pragma once

#include <stdexcept>
#include <string>

namespace LinuxNet {

/// A refusal or failure; what() names the object and the reason.
class Error : public std::runtime_error {
public:
  Error(int code, const std::string& message) : std::runtime_error(message), code_(code) {}
  /// The errno behind the failure (EINVAL for a bad value given by the caller).
  int Code() const noexcept { return code_; }

private:
  int code_; ///< errno value.
};

} // namespace LinuxNet
