//===- Host.h - The command host -------------------------------------------===//
//
// Loads the plug-ins, builds the command tree, parses and validates a command
// line, runs the command and formats its result. Exit status: 0 success, 1 the
// command reported an error, 2 the command line was refused before anything
// ran.
//
//===----------------------------------------------------------------------===//
#pragma once

#include "Fabrik/AutoCli.h"

#include <cstdio>
#include <iosfwd>
#include <memory>
#include <string>
#include <vector>

namespace Ostra {

/// Exit statuses.
enum ExitStatus : int {
  ExitOk = 0,
  ExitCommandError = 1,
  ExitUsage = 2,
};

/// A loaded plug-in.
struct Plugin {
  std::string path;    ///< File it was loaded from.
  std::string version; ///< Version it reports, or "".
};

/// The command tree with its plug-ins.
class CommandTree {
public:
  /// Loads every plug-in of \p directory and registers it on a new root.
  /// Throws std::runtime_error when a plug-in cannot be loaded.
  static std::unique_ptr<CommandTree> Load(const std::string& directory);
  /// A tree over an already registered root (tests).
  explicit CommandTree(Fabrik::AutoCli::NamespaceNodePtr root) : root_(std::move(root)) {}
  const Fabrik::AutoCli::NamespaceNodePtr& Root() const { return root_; }
  const std::vector<Plugin>& Plugins() const { return plugins_; }

private:
  Fabrik::AutoCli::NamespaceNodePtr root_; ///< Root node; children are the plug-ins' trees.
  std::vector<Plugin> plugins_;            ///< Loaded plug-ins, in load order.
};

/// Options of the whole run that come before the command path.
struct GlobalOptions {
  std::string formatter;                                   ///< --formatter, or "".
  std::vector<std::pair<std::string, std::string>> params; ///< --format-param, in order.
  std::string hostPath;                                    ///< --host, or "".
  std::string batch;                                       ///< --batch FILE, or "".
  bool keepGoing = false;                                  ///< --keep-going.
  bool atomic = false;                                     ///< --atomic.
  int lockTimeoutMs = -1;                                  ///< --lock-timeout MS, or -1.
  bool help = false;                                       ///< --help or -h.
  bool version = false;                                    ///< --version.
  bool complete = false;                                   ///< --complete WORD...
  bool reference = false;                                  ///< --reference.
  bool manual = false; ///< --man: the reference as a manual page (reference is set too).
};

/// Reads the global options in front of the command path; returns the index
/// of the first path word (after --complete: of the first word to complete),
/// or -1 after reporting a refusal in \p err.
int ParseGlobalOptions(const std::vector<std::string>& args, GlobalOptions& options,
                       std::string& err);

/// How a command line runs.
struct RunMode {
  bool inBatch = false; ///< A line of a batch: a savepoint of the batch's transaction.
  bool atomic = false;  ///< --atomic: a command that reports an error changes nothing.
  /// Where a streamed listing is written as it is finished, instead of into
  /// the output text; null for the text.
  std::FILE* direct = nullptr;
};

/// Runs one command per line of \p file ("-" for standard input) with the
/// global options \p defaults in front of each; see docs/cli.md. With
/// \p atomic the batch keeps its changes only when every line succeeds.
int RunBatch(const CommandTree& tree, const std::string& file,
             const std::vector<std::string>& defaults, bool keepGoing, bool atomic);

/// The host state the run works on: \p path, created from the demo profile
/// on first use when \p isDefault. Commands check that it exists before they
/// run.
void SelectHost(const std::string& path, bool isDefault);

/// The one-line refusal ("ostracli: ...\n") of the selected host when it is
/// missing, unreadable or served by no backend; "" when commands may run.
std::string HostProblem();

/// Whether \p command changes the host, and so runs in a write transaction
/// (every other command runs in one read transaction).
bool ChangesHost(Fabrik::AutoCli::CommandSpec& command);

/// \p text with every word of \p words longer than 64 bytes shortened, where
/// it is echoed, to its first 64 characters, "…" and its length.
std::string ShortenEchoes(std::string text, const std::vector<std::string>& words);

/// Splits a command line into words as a POSIX shell would for plain words,
/// single and double quotes and backslashes; false for an unterminated quote.
bool SplitWords(const std::string& line, std::vector<std::string>& words);

/// Completion candidates, one per line, for the words typed so far (the last
/// one being the word under the cursor).
std::string Complete(const CommandTree& tree, const std::vector<std::string>& words);

/// The command reference in Markdown, generated from the tree.
std::string Reference(const CommandTree& tree);

/// The name of a parameter type in the reference and the manual page.
const char* ReferenceTypeName(Fabrik::CallSpec::ParameterType type);

/// The manual page ostracli(1) in roff, generated from the tree and the
/// global options.
std::string ManualPage(const CommandTree& tree);

/// Where ostracli looks for plug-ins: $OSTRACLI_PLUGIN_DIR, else
/// <directory of the executable>/../lib/ostracli/plugins.
std::string DefaultPluginDirectory();

/// Runs one command line (without the program name) on \p tree; writes the
/// result to \p out and messages to \p err; returns the exit status.
int RunCommandLine(const CommandTree& tree, const std::vector<std::string>& args, std::string& out,
                   std::string& err, const RunMode& mode = {});

/// Writes \p text to \p stream and flushes it; false, with errno set, when
/// the output could not be written.
bool WriteAll(std::FILE* stream, const std::string& text);

/// The whole program: loads the tree into \p tree, runs argv, prints, returns
/// the status. The caller owns the tree, so it decides whether tearing it down
/// at the end of the process is worth the time.
int RunHost(int argc, char** argv, std::unique_ptr<CommandTree>& tree);

} // namespace Ostra
