//===- Pending.h - Support for the interim command definitions -----------===//
//
// Until a command family has its implementation in src/<subsystem>/, its
// commands are defined in src/entry/pending/<Family>.cpp. An interim command is
// a complete node of the tree (description, default output settings, result
// schema) whose execution reports that the command is not available in this
// build and sets no result. The family file is deleted when the family's real
// implementation lands.
//
//===----------------------------------------------------------------------===//
#pragma once

#include "Fabrik/Call.h"

#include <memory>

namespace CorvexCli::NetworkNamespace::Pending {

/// The one error an interim command reports when it is run.
inline constexpr const char* UnavailableMessage =
    "This command is not available in this build yet.";

/// Reports that the command is not available: adds UnavailableMessage to
/// \p output and leaves its root object unset.
inline void ReportUnavailable(const std::shared_ptr<Fabrik::CallSpec::Output>& output) {
  output->AddErrorMessage(UnavailableMessage);
}

} // namespace CorvexCli::NetworkNamespace::Pending

/// Defines the members that are the same in every interim command: the
/// destructor, an empty input specification and an ExecuteInternal that only
/// reports the command as unavailable.
#define CORVEX_PENDING_OPERATIONS(Class)                                                           \
  Class::~Class() = default;                                                                       \
                                                                                                   \
  std::shared_ptr<Fabrik::CallSpec::InputSpec> Class::GetInputSpecInternal() {                     \
    return Fabrik::CallSpec::InputSpec::New();                                                     \
  }                                                                                                \
                                                                                                   \
  void Class::ExecuteInternal(const std::shared_ptr<Fabrik::CallSpec::Input>& /*input*/,           \
                              const std::shared_ptr<Fabrik::CallSpec::Output>& output) {           \
    Pending::ReportUnavailable(output);                                                            \
  }
