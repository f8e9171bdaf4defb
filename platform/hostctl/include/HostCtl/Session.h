//===- HostCtl/Session.h - The host a process works on ---------------------===//
//
// For the command host: which host the process works on (a simulated host's
// database, or the Linux kernel through a backend module), how long a change
// waits for another process, the transactions that make a command or a batch
// all-or-nothing where the host has transactions, and the note that a command
// used an operation this host does not have. The library reads no
// environment apart from DefaultHostPath; the command host reads it once and
// hands settings down.
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

/// Works on host \p spec from now on: "linux" (this machine's kernel, in the
/// network namespace the process runs in), "netns:NAME" (the kernel inside
/// network namespace NAME) or else the path of a simulated host's database.
/// With \p createDemo (the default host), a missing database is created from
/// the demo profile when it is first used; any other path must exist.
/// Choosing the host in use again changes nothing (a batch in progress goes
/// on), and choosing a refused host again refuses it again. Throws HostCtl::Lib::HostCtlException,
/// with one line for the user, when no backend serves \p spec (the Linux host's module is not
/// installed).
void SetHost(const std::string& spec, bool createDemo = false);

/// Whether \p spec names a simulated host's database (not the kernel).
bool IsSimulatedHost(const std::string& spec);

/// How long a command waits for another process that changes the host.
void SetLockTimeout(int milliseconds);

/// Whether the host has transactions. A host without them keeps every change
/// as it is made: a batch applies line by line, and neither a failed batch
/// line nor a failed command can be undone.
bool HasTransactions();

/// Starts a command. One that \p changes the host runs in a write
/// transaction: the lock is taken now, waiting up to the lock timeout.
/// Any other runs in one read transaction, a consistent view of the host.
/// Inside a batch the command is a savepoint of the batch's transaction.
/// Throws HostCtl::Lib::HostCtlException when the host cannot be opened or
/// locked; nothing has changed then.
void BeginCommand(bool changes);

/// Ends the command: \p keep commits its changes durably (inside a batch:
/// keeps them in the batch), otherwise undoes all of them. Throws
/// HostCtlException when they cannot be committed; nothing is kept then.
void EndCommand(bool keep);

/// Starts a batch: one write transaction that holds the lock until EndBatch.
/// Throws HostCtlException when the host cannot be used.
void BeginBatch();

/// Commits (or, with \p commit false, discards) the batch durably. Throws
/// HostCtlException when the commit fails; nothing of the batch is kept then.
/// A host without transactions has kept every change already and refuses to
/// discard them.
void EndBatch(bool commit);

/// True when the batch's transaction has been lost (SQLite ended it after a
/// full disk or an I/O error): nothing of the batch is kept, and every later
/// command would fail. The batch must stop.
bool BatchLost();

/// Forgets that an operation was not available (before each command).
void ClearNotAvailable();

/// After a command that failed: "<command> is not available on <host>" (for
/// \p command "network vswitch dvs corvex list" on the Linux host: "network
/// vswitch dvs corvex list is not available on a Linux host") when an
/// operation it used since ClearNotAvailable was not available on this host;
/// "" otherwise.
std::string NotAvailableLine(const std::string& command);

} // namespace HostCtl::Session
