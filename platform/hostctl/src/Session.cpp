//===- Session.cpp - The host a process works on ---------------------------===//
#include "HostCtl/Session.h"

#include "model/Store.h"

namespace HostCtl::Session {

std::string DefaultHostPath() {
  return Model::Store::DefaultPath();
}

void SetHostPath(const std::string& path) {
  Model::Store::SetPath(path);
}

void BeginBatch() {
  Model::Store::Host().BeginBatch();
}

void EndBatch(bool commit) {
  Model::Store::Host().EndBatch(commit);
}

} // namespace HostCtl::Session
