//===- HostCtl/Session.h - The host a process works on ---------------------===//
//
// For the command host: which host state the process works on, and batches
// that apply many commands in one transaction.
//
//===----------------------------------------------------------------------===//
#pragma once

#include <string>

namespace HostCtl::Session {

/// The host state used when neither --host nor $OSTRACLI_HOST names one:
/// ${XDG_STATE_HOME:-$HOME/.local/state}/ostracli/host.db.
std::string DefaultHostPath();

/// Works on the host state at \p path (before the first host operation).
void SetHostPath(const std::string& path);

/// Starts a batch: every host operation until EndBatch runs inside one
/// transaction, each still undone alone when it fails. Throws
/// HostCtl::Lib::HostCtlException when the host state cannot be used.
void BeginBatch();

/// Commits (or, with \p commit false, discards) the batch durably. Throws
/// HostCtlException when the commit fails; nothing of the batch is kept then.
void EndBatch(bool commit);

} // namespace HostCtl::Session
