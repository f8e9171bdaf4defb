//===- model/HostDescription.h - The JSON form of a whole host -------------===//
//
// A host description is one JSON document holding everything the simulated
// host knows, faults included (docs/host-state.md). Import replaces the whole
// host in one transaction, after validating every field; export writes it
// back so that export then import gives the same host.
//
//===----------------------------------------------------------------------===//
#pragma once

#include <nlohmann/json.hpp>

#include <string>
#include <string_view>
#include <vector>

namespace Model {

class Store;

/// Replaces the host in \p store by \p host. Throws ImportError naming the bad
/// field (nothing is changed then).
void ImportHost(Store& store, const nlohmann::ordered_json& host);

/// The whole host as a description.
nlohmann::ordered_json ExportHost(Store& store);

/// Merges \p fragment into \p into: objects key by key, arrays of objects that
/// carry "name" (or "key") element by element on that value, other values
/// replaced.
void MergeDescription(nlohmann::ordered_json& into, const nlohmann::ordered_json& fragment);

/// A built-in profile: "demo" or "empty". Throws ImportError for other names.
nlohmann::ordered_json Profile(const std::string& name);
std::vector<std::string> ProfileNames();

/// Creates the store file at \p path from the demo profile, making the
/// directories it needs; safe when several processes do it at once.
void CreateDemoHost(const std::string& path);

/// The demo profile's fragments, embedded at build time.
std::vector<std::string_view> DemoProfileFragments();

} // namespace Model
