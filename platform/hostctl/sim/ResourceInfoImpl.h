//===- TvkCtl/Resource/ResourceInfoImpl.h - Worlds of the host ------------===//
#pragma once

#include "backend/Backend.h"

#include <cstdint>
#include <map>
#include <string>

namespace Sim {

class ResourceInfoImpl : public HostCtl::Backend::Resource {
public:
  ResourceInfoImpl();
  ~ResourceInfoImpl();

  /// The name of world \p worldId (a VM or a service of the host), or the
  /// empty string when no world has that id.
  std::string GetWorldName(int64_t worldId) override;

private:
  bool loaded_ = false;                  ///< names_ has been read.
  std::map<int64_t, std::string> names_; ///< World names by id.
};

} // namespace Sim
