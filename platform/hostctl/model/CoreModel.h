//===- model/CoreModel.h - Helpers over the shared tables ------------------===//
#pragma once

#include "model/Store.h"

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>

namespace Model {

/// The next free virtual port id (ids start at 33554432).
int64_t AllocatePortId(Store& store);

/// The setting that holds the declared faults: a JSON array of objects with
/// "operation", "object" and "message", as the host description has them.
inline constexpr std::string_view kFaultsSetting = "faults";

/// A host-wide setting, or nothing when it was never set.
std::optional<std::string> GetSetting(Store& store, std::string_view key);
void PutSetting(Store& store, std::string_view key, std::string_view value);

} // namespace Model
