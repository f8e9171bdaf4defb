//===- TvkCtl/System/ModuleImpl.h - A kernel module of the host -----------===//
//
// ModuleImpl caches the module's state together with a stale mark; accessors
// refresh the cache first when the mark is set. Load and Unload change the
// host at once and mark the cache stale.
//
//===----------------------------------------------------------------------===//
#pragma once

#include "backend/Backend.h"

#include <string>

namespace Sim {

class ModuleImpl : public HostCtl::Backend::Module {
public:
  /// The module named \p name; operations on a name that is no module of the
  /// host throw HostCtlException.
  explicit ModuleImpl(std::string name);
  ~ModuleImpl();

  const std::string& GetName() const { return name_; }
  /// Whether the module is loaded.
  bool IsLoaded() override;
  /// Re-reads the module's state.
  void Refresh() override;
  /// Loads the module with the option string \p options; loading a loaded
  /// module keeps it loaded. \p force loads it even when its options differ
  /// from those it was loaded with (the options are then replaced).
  void Load(const std::string& options, bool force) override;
  /// Unloads the module; refused when it is not loaded.
  void Unload() override;

private:
  std::string name_;    ///< Module name.
  bool loaded_ = false; ///< Cached state.
  bool stale_ = true;   ///< loaded_ must be read again.
};

} // namespace Sim
