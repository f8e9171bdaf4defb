//===- HostCtl/Session.h - The host a process works on ---------------------===//
//
// For the command host: which host state the process works on, how long a
// change waits for another process, and the transactions that make a command
// or a batch all-or-nothing. The library reads no environment apart from
// DefaultHostPath; the command host reads it once and hands settings down.
//
// A run of the command host is one of:
//
//   BeginCommand(changes) ... host operations ... EndCommand(keep)
//   BeginBatch() { BeginCommand(changes) ... EndCommand(keep) }* EndBatch(commit)
//
// Each host operation inside keeps its own savepoint, so an operation the host
// refuses is undone alone while the steps before it stay.
//
//===----------------------------------------------------------------------===//
#pragma once

#include <string>

namespace HostCtl::Session {

/// How long a change waits for another process's lock when the command host
/// sets nothing: 10 seconds.
constexpr int kDefaultLockTimeoutMs = 10000;

/// ${XDG_STATE_HOME:-$HOME/.local/state}/ostracli/host.db, the host state when
/// the command host is given none; /tmp/ostracli/host.db without either
/// variable.
std::string DefaultHostPath();

/// Works on the host state at \p path from now on. With \p createDemo (the
/// default host), a missing file is created from the demo profile when it is
/// first used; any other path must exist.
void SetHostPath(const std::string& path, bool createDemo = false);

/// How long a command waits for another process that changes the host.
void SetLockTimeout(int milliseconds);

/// Starts a command. One that \p changes the host runs in a write
/// transaction: the lock is taken now, waiting up to the lock timeout.
/// Any other runs in one read transaction, a consistent view of the host.
/// Inside a batch the command is a savepoint of the batch's transaction.
/// Throws HostCtl::Lib::HostCtlException when the host state cannot be
/// opened or locked; nothing has changed then.
void BeginCommand(bool changes);

/// Ends the command: \p keep commits its changes durably (inside a batch:
/// keeps them in the batch), otherwise undoes all of them. Throws
/// HostCtlException when they cannot be committed; nothing is kept then.
void EndCommand(bool keep);

/// Starts a batch: one write transaction that holds the lock until EndBatch.
/// Throws HostCtlException when the host state cannot be used.
void BeginBatch();

/// Commits (or, with \p commit false, discards) the batch durably. Throws
/// HostCtlException when the commit fails; nothing of the batch is kept then.
void EndBatch(bool commit);

/// True when the batch's transaction has been lost (SQLite ended it after a
/// full disk or an I/O error): nothing of the batch is kept, and every later
/// command would fail. The batch must stop.
bool BatchLost();

} // namespace HostCtl::Session
