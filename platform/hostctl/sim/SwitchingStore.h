//===- SwitchingStore.h - Reading switching objects from the store --------===//
//
// Private helpers of the switching implementation: loading a switch's
// identity by name or id and making the object of its kind. They run inside
// a transaction of the caller.
//
//===----------------------------------------------------------------------===//
#pragma once

#include "model/Store.h"
#include "sim/Switching.h"

#include <memory>
#include <optional>
#include <string>

namespace Sim {

/// The switch of that name, of any kind.
std::optional<PortsetData> FindPortset(Model::Store& store, const std::string& name);
/// The switch of that id.
std::optional<PortsetData> FindPortsetById(Model::Store& store, int64_t id);
/// The switch a distributed switch UUID (or a standard switch name) names.
std::optional<PortsetData> FindPortsetByIdentifier(Model::Store& store, const std::string& id);
/// The object of the switch's kind.
std::unique_ptr<HostCtl::Network::Portset> MakePortset(PortsetData data);
/// Throws HostCtlException when the switch is gone.
void RequirePortset(Model::Store& store, const PortsetData& data);

/// The in-force teaming of standard switch \p portsetId: its configured
/// policy, whose uplink order follows the uplinks when it sets none.
HostCtl::Network::NicTeamingPolicy SwitchTeaming(Model::Store& store, int64_t portsetId);
/// The configured policies of standard switch \p portsetId.
HostCtl::Network::NicTeamingPolicy SwitchConfiguredTeaming(Model::Store& store, int64_t portsetId);
HostCtl::Network::PortSecurityPolicy SwitchSecurity(Model::Store& store, int64_t portsetId);
HostCtl::Network::ShapingPolicy SwitchShaping(Model::Store& store, int64_t portsetId);

} // namespace Sim
