//===- FormatParams.h - The user's formatter parameters, checked -----------===//
#pragma once

#include "Fabrik/AutoCli.h"

#include <string>
#include <utility>
#include <vector>

namespace Ostra {

/// The problem with the --format-param pairs \p params for \p command's
/// result, or "" when there is none: a key no formatter reads, a field that
/// the structure it names does not have, a structure that no command of
/// \p tree has, or a switch that is not a boolean. The message names the
/// valid keys, structures or fields. Since the parameters in front of
/// --batch apply to every line, a structure of another command's result, and
/// any selection on a result without structures, are let through.
std::string CheckFormatParams(Fabrik::AutoCli::CommandSpec& command,
                              const Fabrik::AutoCli::NamespaceNodePtr& tree,
                              const std::vector<std::pair<std::string, std::string>>& params);

} // namespace Ostra
