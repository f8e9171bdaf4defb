//===- TvkCtl/Resource/ResourceInfoImpl.h - Worlds of the host ------------===//
//
// A handle: the names are the session's host's.
//
//===----------------------------------------------------------------------===//
#pragma once

#include <cstdint>
#include <memory>
#include <string>

namespace HostCtl::Backend {
class Resource;
} // namespace HostCtl::Backend

namespace TvkCtl::Resource {

class ResourceInfoImpl {
public:
  ResourceInfoImpl();
  ~ResourceInfoImpl();

  /// The name of world \p worldId (a VM or a service of the host), or the
  /// empty string when no world has that id.
  std::string GetWorldName(int64_t worldId);

private:
  std::unique_ptr<HostCtl::Backend::Resource> ops_; ///< The host's operations.
};

} // namespace TvkCtl::Resource
