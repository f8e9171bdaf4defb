//===- Help.h - Help texts generated from the command tree -----------------===//
#pragma once

#include "Fabrik/AutoCli.h"
#include "Fabrik/MetaObj.h"

#include <string>
#include <vector>

namespace Ostra {

/// The names of \p names closest to \p word: a different case, or one or two
/// typing slips (one for words of up to four characters); none when nothing
/// is that close.
std::vector<std::string> ClosestNames(const std::string& word,
                                      const std::vector<std::string>& names);

/// "; did you mean "a", "b"?" for \p close, each name between \p before and
/// \p after; "" when \p close is empty.
std::string DidYouMean(const std::vector<std::string>& close, const char* before = "\"",
                       const char* after = "\"");

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

/// Help as a typed value, for --help with an explicit --formatter: a
/// namespace's path, kind, description and children (each with name, kind and
/// description).
Fabrik::MetaObj::MetaObjectPtr NamespaceHelpValue(const Fabrik::AutoCli::NamespaceNode& node);
/// A command's path, kind and description, its parameters (name, short name,
/// type and type code, required, expanded description, constraint) and its
/// default output formatter with its parameters as pairs of key and value.
Fabrik::MetaObj::MetaObjectPtr CommandHelpValue(const Fabrik::AutoCli::CommandSpec& command,
                                                const Fabrik::CallSpec::InputSpec& spec);

} // namespace Ostra
