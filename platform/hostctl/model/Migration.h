//===- model/Migration.h - Bringing older host files to the current layout -===//
//
// A host file records its layout version (PRAGMA user_version). Layout 1 was
// written by the first release (a write-ahead log beside the file), layout 2
// by the release that made the host one file; layout 3 is the current one.
// Store opens a file of an older layout and calls MigrateLayout inside one
// write transaction, so that the file holds either the old layout or the new
// one, whatever ends the process (docs/host-state.md).
//
//===----------------------------------------------------------------------===//
#pragma once

#include "model/Store.h"

#include <cstdint>

namespace Model {

/// The layout that Store::Create writes and Store reads.
inline constexpr int64_t kLayoutVersion = 3;

/// Rewrites the tables of a file of layout \p from (1 or 2) in the current
/// layout, every row kept. Runs inside the caller's write transaction with
/// foreign key enforcement off; throws HostCtlException (and the caller rolls
/// back) when the result would break a foreign key.
void MigrateLayout(Store& store, int64_t from);

} // namespace Model
