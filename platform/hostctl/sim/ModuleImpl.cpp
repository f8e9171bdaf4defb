//===- ModuleImpl.cpp - Kernel modules of the simulated host ---------------===//
#include "sim/ModuleImpl.h"

#include "HostCtl/Lib.h"
#include "HostCtl/System/SystemInfo.h"
#include "model/Store.h"

namespace Sim {

using HostCtl::Lib::HostCtlException;
using Model::Statement;
using Model::Store;

namespace {

/// The module's row: whether it is loaded; throws when the host has no such
/// module.
bool ReadLoaded(Store& store, const std::string& name) {
  Statement row = store.Prepare("SELECT loaded FROM kmodule WHERE name = ?");
  enum { kLoaded };
  row.Bind(1, name);
  if (!row.Step())
    throw HostCtlException("There is no kernel module named " + name);
  return row.Bool(kLoaded);
}

} // namespace

ModuleImpl::ModuleImpl(std::string name) : name_(std::move(name)) {}
ModuleImpl::~ModuleImpl() = default;

bool ModuleImpl::IsLoaded() {
  Store::Host().CheckFault("IsLoaded", name_);
  if (stale_) {
    Refresh();
    stale_ = false;
  }
  return loaded_;
}

void ModuleImpl::Refresh() {
  Store& store = Store::Host();
  loaded_ = store.Read([&] { return ReadLoaded(store, name_); });
}

void ModuleImpl::Load(const std::string& options, bool force) {
  Store& store = Store::Host();
  store.CheckFault("Load", name_);
  store.Write([&] {
    Statement row = store.Prepare("SELECT loaded, options FROM kmodule WHERE name = ?");
    enum { kLoaded, kOptions };
    row.Bind(1, name_);
    if (!row.Step())
      throw HostCtlException("There is no kernel module named " + name_);
    bool loaded = row.Bool(kLoaded);
    std::string current = row.Text(kOptions);
    if (loaded && current != options && !force)
      throw HostCtlException("Module " + name_ + " is loaded already with other options");
    store.Prepare("UPDATE kmodule SET loaded = 1, options = ? WHERE name = ?")
        .BindAll(options, name_)
        .Run();
  });
  stale_ = true;
}

void ModuleImpl::Unload() {
  Store& store = Store::Host();
  store.CheckFault("Unload", name_);
  store.Write([&] {
    if (!ReadLoaded(store, name_))
      throw HostCtlException("Module " + name_ + " is not loaded");
    store.Prepare("UPDATE kmodule SET loaded = 0, options = '' WHERE name = ?")
        .Bind(1, name_)
        .Run();
    // Unloading the firewall module takes its filters with it.
    if (name_ == HostCtl::System::FirewallModuleName)
      store.Prepare("UPDATE setting SET value = 0 WHERE key = 'firewall.filtersActive'").Run();
  });
  stale_ = true;
}

} // namespace Sim
