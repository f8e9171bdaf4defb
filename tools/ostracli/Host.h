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
  std::vector<Plugin> plugins_;           ///< Loaded plug-ins, in load order.
};

/// Where ostracli looks for plug-ins: $OSTRACLI_PLUGIN_DIR, else
/// <directory of the executable>/../lib/ostracli/plugins.
std::string DefaultPluginDirectory();

/// Runs one command line (without the program name) on \p tree; writes the
/// result to \p out and messages to \p err; returns the exit status.
int RunCommandLine(const CommandTree& tree, const std::vector<std::string>& args,
                   std::string& out, std::string& err);

/// The whole program: loads the tree, runs argv, prints, returns the status.
int RunHost(int argc, char** argv);

} // namespace Ostra
