//===- Host.cpp - The command host -----------------------------------------===//
#include "Host.h"

namespace Ostra {

int RunHost(int argc, char** argv) { return 2; }

} // namespace Ostra
