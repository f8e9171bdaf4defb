//===- HostCtl/Session.h - The host a process works on ---------------------===//
//
// For the command host: which host the process works on (a simulated host's
// database, or the Linux kernel through a backend module), batches that
// apply many commands in one transaction where the host has transactions,
// and the note that a command used an operation this host does not have.
//
//===----------------------------------------------------------------------===//
#pragma once

#include <string>

namespace HostCtl::Session {

/// The host state used when neither --host nor $OSTRACLI_HOST names one:
/// ${XDG_STATE_HOME:-$HOME/.local/state}/ostracli/host.db.
std::string DefaultHostPath();

/// Works on host \p spec from now on: "linux" (this machine's kernel),
/// "netns:NAME" (the kernel inside network namespace NAME) or else the path
/// of a simulated host's database. Choosing the host in use again changes
/// nothing (a batch in progress goes on). Throws
/// HostCtl::Lib::HostCtlException, with one line for the user, when no
/// backend serves \p spec (the Linux host's module is not installed).
void SetHost(const std::string& spec);

/// Works on the simulated host whose database is at \p path.
void SetHostPath(const std::string& path);

/// Whether the host applies a batch in one transaction. A host without
/// transactions applies a batch line by line and refuses EndBatch(false).
bool HasTransactions();

/// Starts a batch: on a host with transactions every host operation until
/// EndBatch runs inside one transaction, each still undone alone when it
/// fails. Throws HostCtl::Lib::HostCtlException when the host cannot be used.
void BeginBatch();

/// Commits (or, with \p commit false, discards) the batch durably. Throws
/// HostCtlException when the commit fails; nothing of the batch is kept then.
/// A host without transactions has kept every change already and refuses to
/// discard them.
void EndBatch(bool commit);

/// Forgets that an operation was not available (before each command).
void ClearNotAvailable();

/// After a command that failed: "<command> is not available on <host>" (for
/// \p command "network vswitch dvs corvex list" on the Linux host: "network
/// vswitch dvs corvex list is not available on a Linux host") when an
/// operation it used since ClearNotAvailable was not available on this host;
/// "" otherwise.
std::string NotAvailableLine(const std::string& command);

} // namespace HostCtl::Session
