//===- main.cpp - ostracli entry point -------------------------------------===//
#include "Host.h"

#include <cstdio>
#include <cstdlib>
#include <iostream>

int main(int argc, char** argv) {
  std::unique_ptr<Ostra::CommandTree> tree;
  int status = Ostra::RunHost(argc, argv, tree);
#ifndef OSTRA_SANITIZED
  // The run is over: its output only needs flushing, and every change it made
  // is already committed durably. Tearing down the command tree and closing
  // the host's store would cost a tenth of a short command's time for nothing,
  // so the process ends here. (Sanitized builds end normally, so that the leak
  // checker sees everything released.)
  std::cout.flush();
  std::cerr.flush();
  std::fflush(nullptr);
  std::_Exit(status);
#endif
  return status;
}
