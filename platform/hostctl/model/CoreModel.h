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

/// A host-wide setting, or nothing when it was never set.
std::optional<std::string> GetSetting(Store& store, std::string_view key);
void PutSetting(Store& store, std::string_view key, std::string_view value);

} // namespace Model
