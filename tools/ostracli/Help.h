//===- Help.h - Help texts generated from the command tree -----------------===//
#pragma once

#include "Fabrik/AutoCli.h"

#include <string>

namespace Ostra {

/// "Error: ..." for a path word that names no child of \p node, with the
/// closest child names as suggestions.
std::string UnknownWordMessage(const Fabrik::AutoCli::NamespaceNode& node, const std::string& word);

/// The children of a namespace with their descriptions; the root's help also
/// explains the global options, exit statuses and where the host state lives.
std::string NamespaceHelpText(const Fabrik::AutoCli::NamespaceNode& node,
                              const std::string& hostState);
/// A command's description and options.
std::string CommandHelpText(const Fabrik::AutoCli::CommandSpec& command,
                            const Fabrik::CallSpec::InputSpec& spec);

/// Machine-readable help (--formatter json --help).
std::string NamespaceHelpJson(const Fabrik::AutoCli::NamespaceNode& node);
std::string CommandHelpJson(const Fabrik::AutoCli::CommandSpec& command,
                            const Fabrik::CallSpec::InputSpec& spec);

} // namespace Ostra
