//===- ScratchHost.h - A host imported into a temporary store -------------===//
//
// ScratchHost imports a host description into a temporary store file and
// makes it the host the library opens, for as long as the object lives; the
// host-library and the plug-in tests build their hosts with it.
//
//===----------------------------------------------------------------------===//
#pragma once

#include "model/HostDescription.h"
#include "model/Store.h"

#include <nlohmann/json.hpp>

#include <filesystem>
#include <string>
#include <unistd.h>

namespace TestSupport {

/// A host imported from a JSON description, current while the object lives.
class ScratchHost {
public:
  ScratchHost(const std::string& tag, const std::string& description) {
    path_ =
        std::filesystem::temp_directory_path() / (tag + "-" + std::to_string(::getpid()) + ".db");
    Remove();
    {
      auto store = Model::Store::Create(path_.string());
      Model::ImportHost(*store, nlohmann::ordered_json::parse(description));
    }
    Model::Store::CloseHost();
    Model::Store::SetPath(path_.string());
  }
  ~ScratchHost() {
    Model::Store::CloseHost();
    Remove();
  }
  ScratchHost(const ScratchHost&) = delete;
  ScratchHost& operator=(const ScratchHost&) = delete;

private:
  void Remove() {
    for (const char* suffix : {"", "-journal"})
      std::filesystem::remove(path_.string() + suffix);
  }

  std::filesystem::path path_; ///< Store file.
};

} // namespace TestSupport
