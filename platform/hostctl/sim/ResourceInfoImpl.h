//===- TvkCtl/Resource/ResourceInfoImpl.h - Worlds of the host ------------===//
#pragma once

#include <cstdint>
#include <map>
#include <string>

namespace TvkCtl::Resource {

class ResourceInfoImpl {
public:
  ResourceInfoImpl();
  ~ResourceInfoImpl();

  /// The name of world \p worldId (a VM or a service of the host), or the
  /// empty string when no world has that id.
  std::string GetWorldName(int64_t worldId);

private:
  bool loaded_ = false;                  ///< names_ has been read.
  std::map<int64_t, std::string> names_; ///< World names by id.
};

} // namespace TvkCtl::Resource
