//===- HostCtl/Lib.h - The host library's exception -----------------------===//
//
// Every host operation reports a refusal or a failure by throwing
// HostCtlException with a message meant for the user.
//
//===----------------------------------------------------------------------===//
#pragma once

#include <exception>
#include <string>

namespace HostCtl::Lib {

/// A refusal or failure of a host operation; what() is a message for the user.
class HostCtlException : public std::exception {
public:
  explicit HostCtlException(std::string message) : message_(std::move(message)) {}
  HostCtlException(std::string message, int code, int detail)
      : message_(std::move(message)), code_(code), detail_(detail) {}
  const char* what() const noexcept override { return message_.c_str(); }
  int GetCode() const { return code_; }
  int GetDetail() const { return detail_; }

private:
  std::string message_; ///< The user-facing message.
  int code_ = 0;        ///< Further word; 0 when made from a text alone.
  int detail_ = 0;      ///< Further word; 0 when made from a text alone.
};

} // namespace HostCtl::Lib
