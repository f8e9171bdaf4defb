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

#include <cstdint>
#include <cstdio>
#include <functional>
#include <string>
#include <string_view>
#include <vector>

namespace Model {

class Store;

/// Replaces the host in \p store by \p host. Throws ImportError naming the bad
/// field (nothing is changed then).
void ImportHost(Store& store, const nlohmann::ordered_json& host);

/// Reads the host description in \p file and checks it whole (JSON, repeated
/// and unknown keys), holding in memory all but the elements of the arrays
/// that parts import one at a time (routes, hosts entries, neighbours): those
/// are checked and dropped. Throws ImportError naming the bad field.
nlohmann::ordered_json ReadDescription(std::FILE* file);

/// Replaces the host in \p store by the description that ReadDescription
/// read from \p file as \p host, reading the dropped arrays again from the
/// start of \p file as they are imported. Throws ImportError naming the bad
/// field (nothing is changed then).
void ImportHost(Store& store, const nlohmann::ordered_json& host, std::FILE* file);

/// The whole host as a description.
nlohmann::ordered_json ExportHost(Store& store);

/// Writes the whole host as a description, as ExportHost(store).dump(2)
/// followed by a newline would, in pieces of about 64 KiB handed to \p write.
/// The large collections (routes, hosts entries, neighbours) are read and
/// written element by element, so memory stays small whatever the host's
/// size. Stops at the first exception \p write throws.
void WriteHostDescription(Store& store, const std::function<void(std::string_view)>& write);

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

/// Sizes of a generated host (ostrahost generate).
struct HostSizes {
  int64_t routes = 10000;    ///< IPv4 routes on the default netstack.
  int64_t portgroups = 4000; ///< Port groups, spread over the standard switches.
  int64_t vms = 1000;        ///< VMs, spread over the standard switches.
  int64_t portsPerVm = 4;    ///< Ports of each VM.
  int64_t neighbours = 0;    ///< IPv4 neighbours of tvk0.
  int64_t hostsEntries = 0;  ///< Hosts entries.

  static constexpr int64_t kMaxRoutes = 2000000;
  static constexpr int64_t kMaxPortGroups = 100000;
  static constexpr int64_t kMaxVms = 4608;
  static constexpr int64_t kMaxPortsPerVm = 64;
  static constexpr int64_t kMaxNeighbours = 1000000;
  static constexpr int64_t kMaxHostsEntries = 1000000;
};

/// Throws HostCtl::Lib::HostCtlException naming the first size out of range.
void CheckHostSizes(const HostSizes& sizes);

/// Fills \p store, a new empty store, with the demo host grown to \p sizes,
/// in one transaction (docs/host-state.md, "Generated hosts"). Throws
/// HostCtl::Lib::HostCtlException when the sizes do not fit the host's limits
/// (the VM ports must fit on the standard switches); nothing is written then.
void GenerateHost(Store& store, const HostSizes& sizes);

/// The demo profile's fragments, embedded at build time.
std::vector<std::string_view> DemoProfileFragments();

} // namespace Model
