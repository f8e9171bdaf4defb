//===- Session.cpp - The host a process works on ---------------------------===//
#include "HostCtl/Session.h"

#include "model/Store.h"

#include <cstdlib>

namespace HostCtl::Session {

std::string DefaultHostPath() {
  std::string base;
  if (const char* xdg = std::getenv("XDG_STATE_HOME"); xdg && *xdg)
    base = xdg;
  else if (const char* home = std::getenv("HOME"); home && *home)
    base = std::string(home) + "/.local/state";
  else
    base = "/tmp";
  return base + "/ostracli/host.db";
}

void SetHostPath(const std::string& path, bool createDemo) {
  Model::Store::SetPath(path, createDemo);
}

void SetLockTimeout(int milliseconds) {
  Model::Store::SetLockTimeout(milliseconds);
}

void BeginCommand(bool changes) {
  Model::Store::Host().BeginUnit(changes);
}

void EndCommand(bool keep) {
  Model::Store::Host().EndUnit(keep);
}

void BeginBatch() {
  Model::Store::Host().BeginUnit(true);
}

void EndBatch(bool commit) {
  Model::Store::Host().EndUnit(commit);
}

bool BatchLost() {
  return Model::Store::Host().Lost();
}

} // namespace HostCtl::Session
