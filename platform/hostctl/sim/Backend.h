//===- sim/Backend.h - The simulated host as a backend ---------------------===//
//
// The simulated host keeps a host in an SQLite store (model/); its objects
// implement the backend interfaces over it. These are its entry points that
// are no method of one of its objects.
//
//===----------------------------------------------------------------------===//
#pragma once

#include "backend/Backend.h"

#include <memory>
#include <string>

namespace Sim {

std::unique_ptr<HostCtl::Network::DVSwitch> GetDVSwitchByName(const std::string& name);
std::unique_ptr<HostCtl::Network::VirtualSwitch>
GetVirtualSwitchById(const std::string& name, HostCtl::Network::PortsetGetType type);
std::unique_ptr<HostCtl::Network::PortGroup> GetPortGroupByName(const std::string& name);
std::unique_ptr<HostCtl::Network::DVPort> GetDVPort(const HostCtl::Network::DVPortParam& param);
std::unique_ptr<HostCtl::SmartNic::SmartNic> GetSmartNicByPnic(const std::string& pnicName);
/// Runs a host command line on the model; see TvkCtl::Util::TvkCtl_Exec.
int Exec(const std::string& command, bool background, bool wait, bool captureOutput);

} // namespace Sim
