//===- Version.cpp - The plug-in's version -----------------------------------===//
#ifndef OSTRA_VERSION
#define OSTRA_VERSION "0.0.0"
#endif

/// The version of the network plug-in, shown by "ostracli --version".
extern "C" __attribute__((visibility("default"))) const char* AutoCli_PluginVersion() {
  return "network " OSTRA_VERSION;
}
