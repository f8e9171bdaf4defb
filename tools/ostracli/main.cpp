//===- main.cpp - ostracli entry point -------------------------------------===//
#include "Host.h"

int main(int argc, char** argv) {
  return Ostra::RunHost(argc, argv);
}
