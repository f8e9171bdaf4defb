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

/// An operation that the host in use does not have (the Linux host has no
/// distributed switches, for one). Making one notes it in the session, so the
/// command host can report the whole command as not available on this host
/// (HostCtl::Session::NotAvailableLine) rather than as a failure.
class NotAvailableException : public HostCtlException {
public:
  /// "<operation> is not available on <host>", such as "GetDVSwitches is not
  /// available on a Linux host".
  NotAvailableException(const std::string& operation, const std::string& host);
  const std::string& GetOperation() const { return operation_; }
  const std::string& GetHost() const { return host_; }

private:
  std::string operation_; ///< The host library operation.
  std::string host_;      ///< The host as a message names it ("a Linux host").
};

} // namespace HostCtl::Lib
