//===- TvkCtl/System/ModuleImpl.h - A kernel module of the host -----------===//
//
// A handle on a kernel module of the session's host. Load and Unload change
// the host at once.
//
//===----------------------------------------------------------------------===//
#pragma once

#include <memory>
#include <string>

namespace HostCtl::Backend {
class Module;
} // namespace HostCtl::Backend

namespace TvkCtl::System {

class ModuleImpl {
public:
  /// The module named \p name; operations on a name that is no module of the
  /// host throw HostCtlException.
  explicit ModuleImpl(std::string name);
  ~ModuleImpl();

  const std::string& GetName() const { return name_; }
  /// Whether the module is loaded.
  bool IsLoaded();
  /// Re-reads the module's state.
  void Refresh();
  /// Loads the module with the option string \p options; loading a loaded
  /// module keeps it loaded. \p force loads it even when its options differ
  /// from those it was loaded with (the options are then replaced).
  void Load(const std::string& options, bool force);
  /// Unloads the module; refused when it is not loaded.
  void Unload();

private:
  std::string name_;                              ///< Module name.
  std::unique_ptr<HostCtl::Backend::Module> ops_; ///< The host's module.
};

} // namespace TvkCtl::System
