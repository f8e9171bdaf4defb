//===- TvkCtl/Util.h - Helpers for host programs ---------------------------===//
//
// The simulated host never starts a program on the machine it runs on:
// TvkCtl_Exec records the effect of the host programs it knows on the host
// model and refuses every other command line.
//
//===----------------------------------------------------------------------===//
#pragma once

#include <string>

namespace TvkCtl::Util {

/// The option that places a host program in child resource pool \p pool of
/// the kernel services' pool.
std::string MakeChildRpTvkOption(int pool);

/// Runs host command line \p command and returns its exit status (0 for
/// success). Only the service scripts of the host are known: starting one
/// records on the host that the service runs. A fault declared for operation
/// "TvkCtl_Exec" on the script's path makes it fail with status 1; an unknown
/// program gives 127.
int TvkCtl_Exec(const std::string& command, bool background, bool wait, bool captureOutput);

} // namespace TvkCtl::Util
