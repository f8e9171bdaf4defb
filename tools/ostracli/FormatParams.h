//===- FormatParams.h - The user's formatter parameters, checked -----------===//
#pragma once

#include "Fabrik/AutoCli.h"

#include <string>
#include <utility>
#include <vector>

namespace Ostra {

/// The problem with the --format-param pairs \p params for \p command's
/// result, or "" when there is none: a key no formatter reads, a structure
/// the result does not hold, a field that structure does not have, or a
/// switch that is not a boolean. The message names the valid keys,
/// structures or fields.
std::string CheckFormatParams(Fabrik::AutoCli::CommandSpec& command,
                              const std::vector<std::pair<std::string, std::string>>& params);

} // namespace Ostra
