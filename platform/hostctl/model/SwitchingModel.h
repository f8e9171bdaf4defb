//===- model/SwitchingModel.h - Helpers of the switching part -------------===//
//
// Policies are kept as small JSON documents, in the same form as in the host
// description: a field is present exactly when the policy sets it. These
// helpers convert between that form and the policy value types, for the
// importer, the exporter and the switching objects.
//
//===----------------------------------------------------------------------===//
#pragma once

#include "HostCtl/Network/Policy.h"
#include "model/JsonRead.h"

#include <string>

namespace Model {

/// Load-balancing names of the description, by TeamPolicyType.
const char* TeamTypeName(HostCtl::Network::NicTeamingPolicy::TeamPolicyType type);

nlohmann::ordered_json TeamingToJson(const HostCtl::Network::NicTeamingPolicy& policy);
nlohmann::ordered_json SecurityToJson(const HostCtl::Network::PortSecurityPolicy& policy);
nlohmann::ordered_json ShapingToJson(const HostCtl::Network::ShapingPolicy& policy);

/// Reads a policy; only the fields present are set. Throws ImportError.
HostCtl::Network::NicTeamingPolicy TeamingFromJson(const JsonObject& object);
HostCtl::Network::PortSecurityPolicy SecurityFromJson(const JsonObject& object);
HostCtl::Network::ShapingPolicy ShapingFromJson(const JsonObject& object);

/// The same, from the text stored in the store.
HostCtl::Network::NicTeamingPolicy ParseTeaming(const std::string& text);
HostCtl::Network::PortSecurityPolicy ParseSecurity(const std::string& text);
HostCtl::Network::ShapingPolicy ParseShaping(const std::string& text);

nlohmann::ordered_json CapabilitiesToJson(const HostCtl::Network::NicCapabilities& caps);
HostCtl::Network::NicCapabilities CapabilitiesFromJson(const JsonObject& object);

} // namespace Model
