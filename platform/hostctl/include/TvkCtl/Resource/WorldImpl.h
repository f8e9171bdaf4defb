//===- TvkCtl/Resource/WorldImpl.h - A world (process) of the host --------===//
#pragma once

#include <cstdint>
#include <string>

namespace TvkCtl::Resource {

/// A world of the session's host, by id; the VMs are worlds.
class WorldImpl {
public:
  explicit WorldImpl(int64_t worldId);
  ~WorldImpl() = default;

  int64_t GetWorldId() const { return worldId_; }
  /// The world's name as the host keeps it; throws HostCtlException when the
  /// host has no world of this id.
  std::string GetWorldName() const;

private:
  int64_t worldId_; ///< World id.
};

} // namespace TvkCtl::Resource
