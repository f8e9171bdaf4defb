//===- model/Store.cpp - The SQLite store of the simulated host ------------===//
#include "model/Store.h"

#include "HostCtl/Lib.h"
#include "HostCtl/Session.h"
#include "model/CoreModel.h"
#include "model/HostDescription.h"
#include "model/Migration.h"
#include "model/Part.h"

#include <nlohmann/json.hpp>
#include <sqlite3.h>

#include <cerrno>
#include <cstdlib>
#include <cstring>
#include <string>
#include <sys/stat.h>
#include <unistd.h>
#include <unordered_map>
#include <vector>

namespace Model {

using HostCtl::Lib::HostCtlException;

namespace {

/// Identifies our files ("OSTR"); model/Migration.h has the layout version.
constexpr int kApplicationId = 0x4f535452;
constexpr int64_t kSchemaVersion = kLayoutVersion;

std::unique_ptr<Store>& HostSlot() {
  static std::unique_ptr<Store> store;
  return store;
}

std::string& PathSlot() {
  static std::string path;
  return path;
}

/// Whether Host() creates a missing file from the demo profile.
bool& CreateDemoSlot() {
  static bool create = false;
  return create;
}

/// How long a statement waits for another connection's lock, in milliseconds.
int& LockTimeoutSlot() {
  static int timeout = HostCtl::Session::kDefaultLockTimeoutMs;
  return timeout;
}

bool FileExists(const std::string& path) {
  struct stat st {};
  return ::stat(path.c_str(), &st) == 0;
}

} // namespace

struct Store::Cache {
  std::unordered_map<std::string_view, sqlite3_stmt*> statements; ///< Keyed by SQL text.
  bool faultsLoaded = false;                                      ///< faults is current.
  struct Fault {
    std::string operation, object, message;
  };
  std::vector<Fault> faults; ///< Declared faults of the host.
};

// --- Statement -----------------------------------------------------------

Statement::Statement(Statement&& other) noexcept : store_(other.store_), stmt_(other.stmt_) {
  other.stmt_ = nullptr;
}

Statement::~Statement() {
  if (stmt_) {
    sqlite3_reset(stmt_);
    sqlite3_clear_bindings(stmt_);
  }
}

Statement& Statement::Bind(int index, int64_t value) {
  int rc = sqlite3_bind_int64(stmt_, index, value);
  if (rc != SQLITE_OK)
    store_->Fail(rc, "binding a value");
  return *this;
}

Statement& Statement::Bind(int index, std::string_view value) {
  int rc = sqlite3_bind_text(stmt_, index, value.data(), static_cast<int>(value.size()),
                             SQLITE_TRANSIENT);
  if (rc != SQLITE_OK)
    store_->Fail(rc, "binding a value");
  return *this;
}

Statement& Statement::BindNull(int index) {
  int rc = sqlite3_bind_null(stmt_, index);
  if (rc != SQLITE_OK)
    store_->Fail(rc, "binding a value");
  return *this;
}

Statement& Statement::BindBlob(int index, const void* data, std::size_t size) {
  int rc = sqlite3_bind_blob(stmt_, index, data, static_cast<int>(size), SQLITE_TRANSIENT);
  if (rc != SQLITE_OK)
    store_->Fail(rc, "binding a value");
  return *this;
}

bool Statement::Step() {
  int rc = sqlite3_step(stmt_);
  if (rc == SQLITE_ROW)
    return true;
  if (rc == SQLITE_DONE)
    return false;
  store_->Fail(rc, "running a statement");
}

void Statement::Run() {
  while (Step()) {
  }
}

void Statement::Reset() {
  sqlite3_reset(stmt_);
}

int64_t Statement::Int(int column) const {
  return sqlite3_column_int64(stmt_, column);
}

std::string Statement::Text(int column) const {
  const unsigned char* text = sqlite3_column_text(stmt_, column);
  if (!text)
    return std::string();
  return std::string(reinterpret_cast<const char*>(text),
                     static_cast<std::size_t>(sqlite3_column_bytes(stmt_, column)));
}

bool Statement::IsNull(int column) const {
  return sqlite3_column_type(stmt_, column) == SQLITE_NULL;
}

bool Statement::Blob(int column, void* out, std::size_t size) const {
  if (sqlite3_column_type(stmt_, column) != SQLITE_BLOB)
    return false;
  const void* bytes = sqlite3_column_blob(stmt_, column);
  if (static_cast<std::size_t>(sqlite3_column_bytes(stmt_, column)) != size)
    return false;
  std::memcpy(out, bytes, size);
  return true;
}

std::optional<std::string> Statement::OptText(int column) const {
  if (IsNull(column))
    return std::nullopt;
  return Text(column);
}

// --- Store ---------------------------------------------------------------

void Store::SetPath(const std::string& path, bool createDemo) {
  PathSlot() = path;
  CreateDemoSlot() = createDemo;
  HostSlot().reset();
}

void Store::SetLockTimeout(int milliseconds) {
  LockTimeoutSlot() = milliseconds;
  if (HostSlot())
    sqlite3_busy_timeout(HostSlot()->db_, milliseconds);
}

void Store::CloseHost() {
  HostSlot().reset();
}

Store& Store::Host() {
  std::unique_ptr<Store>& slot = HostSlot();
  if (slot)
    return *slot;
  const std::string& path = PathSlot();
  if (path.empty())
    throw HostCtlException("Internal error: no host state was chosen");
  if (CreateDemoSlot() && !FileExists(path))
    CreateDemoHost(path);
  slot = std::make_unique<Store>(path);
  return *slot;
}

Store::Store(const std::string& path) : path_(path), cache_(std::make_unique<Cache>()) {
  if (!FileExists(path))
    throw HostCtlException("There is no host state at " + path +
                           " (create one with \"ostrahost init " + path + "\")");
  int rc =
      sqlite3_open_v2(path.c_str(), &db_, SQLITE_OPEN_READWRITE | SQLITE_OPEN_NOMUTEX, nullptr);
  if (rc != SQLITE_OK) {
    std::string message = db_ ? sqlite3_errmsg(db_) : sqlite3_errstr(rc);
    sqlite3_close(db_);
    db_ = nullptr;
    throw HostCtlException("Cannot open the host state at " + path + ": " + message);
  }
  sqlite3_extended_result_codes(db_, 1);
  sqlite3_busy_timeout(db_, LockTimeoutSlot());
  try {
    Exec("PRAGMA synchronous=FULL; PRAGMA foreign_keys=ON");
    // Each pragma below returns one row of one column.
    enum { kValue };
    Statement check = Prepare("PRAGMA application_id");
    check.Step();
    int64_t app = check.Int(kValue);
    check.Reset();
    Statement version = Prepare("PRAGMA user_version");
    version.Step();
    int64_t schema = version.Int(kValue);
    version.Reset();
    if (app != kApplicationId)
      throw HostCtlException("The file " + path + " is not a host state database");
    if (schema >= 1 && schema < kSchemaVersion)
      Upgrade(schema);
    else if (schema != kSchemaVersion)
      throw HostCtlException("The host state at " + path + " has layout version " +
                             std::to_string(schema) + "; this tool reads version " +
                             std::to_string(kSchemaVersion));
  } catch (...) {
    for (auto& [sql, stmt] : cache_->statements)
      sqlite3_finalize(stmt);
    cache_->statements.clear();
    sqlite3_close(db_);
    db_ = nullptr;
    throw;
  }
}

void Store::Upgrade(int64_t from) {
  // Layout 1 kept changes in a write-ahead log beside the file; the rollback
  // journal keeps every committed change in the file itself. Leaving the log
  // needs the file to ourselves, which may take a moment.
  // Each pragma below returns one row of one column.
  enum { kValue };
  Statement mode = Prepare("PRAGMA journal_mode");
  std::string journal = mode.Step() ? mode.Text(kValue) : std::string();
  mode.Reset();
  if (journal == "wal") {
    Statement change = Prepare("PRAGMA journal_mode=DELETE");
    journal = change.Step() ? change.Text(kValue) : std::string();
    change.Reset();
    if (journal == "wal")
      throw HostCtlException("The host state at " + path_ +
                             " is locked by another process; try again");
  }
  // The migration renames and drops tables that others refer to: foreign
  // keys are checked once at its end instead, and renaming a table leaves
  // the references to it alone (the old tables all go).
  Exec("PRAGMA foreign_keys=OFF; PRAGMA legacy_alter_table=ON");
  try {
    Exec("BEGIN IMMEDIATE");
    Statement version = Prepare("PRAGMA user_version");
    version.Step();
    int64_t current = version.Int(kValue);
    version.Reset();
    // Another process may have migrated the file while this one waited.
    if (current == from) {
      MigrateLayout(*this, from);
      Exec(("PRAGMA user_version=" + std::to_string(kSchemaVersion)).c_str());
    }
    Exec("COMMIT");
  } catch (...) {
    if (!sqlite3_get_autocommit(db_))
      sqlite3_exec(db_, "ROLLBACK", nullptr, nullptr, nullptr);
    sqlite3_exec(db_, "PRAGMA foreign_keys=ON; PRAGMA legacy_alter_table=OFF", nullptr, nullptr,
                 nullptr);
    throw;
  }
  Exec("PRAGMA foreign_keys=ON; PRAGMA legacy_alter_table=OFF");
}

Store::~Store() {
  if (!db_)
    return;
  for (auto& [sql, stmt] : cache_->statements)
    sqlite3_finalize(stmt);
  sqlite3_close(db_);
}

std::unique_ptr<Store> Store::Create(const std::string& path) {
  if (FileExists(path))
    throw HostCtlException("The file " + path + " exists already");
  sqlite3* db = nullptr;
  int rc = sqlite3_open_v2(
      path.c_str(), &db, SQLITE_OPEN_READWRITE | SQLITE_OPEN_CREATE | SQLITE_OPEN_NOMUTEX, nullptr);
  if (rc != SQLITE_OK) {
    std::string message = db ? sqlite3_errmsg(db) : sqlite3_errstr(rc);
    sqlite3_close(db);
    throw HostCtlException("Cannot create the host state at " + path + ": " + message);
  }
  std::string sql = "PRAGMA application_id=" + std::to_string(kApplicationId) +
                    "; PRAGMA user_version=" + std::to_string(kSchemaVersion) + "; BEGIN;";
  for (const Part* part : AllParts())
    sql += part->schema;
  sql += "COMMIT;";
  char* error = nullptr;
  rc = sqlite3_exec(db, sql.c_str(), nullptr, nullptr, &error);
  if (rc != SQLITE_OK) {
    std::string message = error ? error : sqlite3_errstr(rc);
    sqlite3_free(error);
    sqlite3_close(db);
    ::unlink(path.c_str());
    throw HostCtlException("Cannot create the host state at " + path + ": " + message);
  }
  sqlite3_close(db);
  return std::make_unique<Store>(path);
}

Statement Store::Prepare(const char* sql) {
  auto it = cache_->statements.find(std::string_view(sql));
  if (it != cache_->statements.end())
    return Statement(*this, it->second);
  sqlite3_stmt* stmt = nullptr;
  int rc = sqlite3_prepare_v3(db_, sql, -1, SQLITE_PREPARE_PERSISTENT, &stmt, nullptr);
  if (rc != SQLITE_OK)
    Fail(rc, "preparing a statement");
  cache_->statements.emplace(std::string_view(sqlite3_sql(stmt)), stmt);
  return Statement(*this, stmt);
}

void Store::Exec(const char* sql) {
  char* error = nullptr;
  int rc = sqlite3_exec(db_, sql, nullptr, nullptr, &error);
  sqlite3_free(error);
  if (rc != SQLITE_OK)
    Fail(rc, "running a statement");
}

int64_t Store::LastInsertId() const {
  return sqlite3_last_insert_rowid(db_);
}

int Store::Changes() const {
  return sqlite3_changes(db_);
}

void Store::Fail(int rc, std::string_view doing) const {
  int primary = rc & 0xff;
  std::string where = "The host state at " + path_;
  std::string message;
  switch (primary) {
  case SQLITE_BUSY:
  case SQLITE_LOCKED:
    message = where + " is locked by another process; try again";
    break;
  case SQLITE_READONLY:
    message = where + " cannot be changed: it is read-only";
    lastFailure_ = "it is read-only";
    break;
  case SQLITE_FULL:
    message = where + " cannot be changed: the disk is full";
    lastFailure_ = "the disk is full";
    break;
  case SQLITE_NOTADB:
    message = "The file " + path_ + " is not a host state database";
    break;
  case SQLITE_CORRUPT:
    message = where + " is corrupt";
    lastFailure_ = "it is corrupt";
    break;
  case SQLITE_IOERR:
  case SQLITE_CANTOPEN:
    message = where + " cannot be read or written: " + sqlite3_errstr(rc);
    lastFailure_ = sqlite3_errstr(rc);
    break;
  default:
    message = where + ": error " + std::string(doing) + ": " +
              (db_ ? sqlite3_errmsg(db_) : sqlite3_errstr(rc));
    break;
  }
  throw HostCtlException(message);
}

void Store::LoadFaults() {
  cache_->faults.clear();
  if (std::optional<std::string> text = GetSetting(*this, kFaultsSetting))
    for (const nlohmann::json& fault : nlohmann::json::parse(*text))
      cache_->faults.push_back({fault.at("operation").get<std::string>(),
                                fault.at("object").get<std::string>(),
                                fault.at("message").get<std::string>()});
  cache_->faultsLoaded = true;
}

void Store::CheckFault(std::string_view operation, std::string_view object) {
  if (!cache_->faultsLoaded)
    Read([this] { LoadFaults(); });
  for (const Cache::Fault& fault : cache_->faults)
    if (fault.operation == operation && (fault.object == object || fault.object == "*"))
      throw HostCtlException(fault.message);
}

void Store::CheckTransaction() {
  if (!lost_ && (depth_ == 0 || !sqlite3_get_autocommit(db_)))
    return;
  // SQLite ends a transaction by itself after some failures (a full disk, an
  // I/O error). What follows would then run outside it, each statement
  // committing on its own: refuse everything until the outermost unit ends.
  lost_ = true;
  throw HostCtlException(LostMessage());
}

std::string Store::LostMessage() const {
  return "The host state at " + path_ + " lost its open transaction" +
         (lastFailure_.empty() ? std::string() : " (" + lastFailure_ + ")") +
         "; none of its changes were kept";
}

// Transaction control goes through the statement cache: a batch opens and
// releases a savepoint per operation, and parsing those statements each time
// was a tenth of the cost of a batch of route additions.
Store::Scope::Scope(Store& store, bool write) : store_(store), outer_(store.depth_ == 0) {
  store_.CheckTransaction();
  if (outer_) {
    store_.Prepare(write ? "BEGIN IMMEDIATE" : "BEGIN").Run();
    store_.writing_ = write;
  } else if (write && !store_.writing_) {
    throw HostCtlException("Internal error: a change was attempted inside a read");
  } else if (write) {
    store_.Prepare("SAVEPOINT operation").Run();
    savepoint_ = true;
  }
  ++store_.depth_;
}

void Store::Scope::Commit() {
  store_.CheckTransaction();
  if (outer_)
    store_.Prepare("COMMIT").Run();
  else if (savepoint_)
    store_.Prepare("RELEASE operation").Run();
  done_ = true;
  --store_.depth_;
}

Store::Scope::~Scope() {
  if (done_)
    return;
  --store_.depth_;
  if (store_.lost_ || sqlite3_get_autocommit(store_.db_))
    return;
  if (outer_)
    sqlite3_exec(store_.db_, "ROLLBACK", nullptr, nullptr, nullptr);
  else if (savepoint_)
    sqlite3_exec(store_.db_, "ROLLBACK TO operation; RELEASE operation", nullptr, nullptr, nullptr);
}

void Store::BeginUnit(bool write) {
  CheckTransaction();
  const bool outer = depth_ == 0;
  if (outer) {
    lastFailure_.clear();
    Prepare(write ? "BEGIN IMMEDIATE" : "BEGIN").Run();
    writing_ = write;
  } else if (write && !writing_) {
    throw HostCtlException("Internal error: a change was attempted inside a read");
  } else {
    Prepare("SAVEPOINT unit").Run();
  }
  units_.push_back(outer);
  ++depth_;
}

void Store::EndUnit(bool keep) {
  if (units_.empty())
    throw HostCtlException("Internal error: no unit of work is open");
  const bool outer = units_.back();
  units_.pop_back();
  --depth_;
  if (lost_ || sqlite3_get_autocommit(db_)) {
    // An inner unit leaves the loss in place for the units around it; the
    // outermost one reports it last and starts afresh.
    lost_ = !outer;
    throw HostCtlException(LostMessage());
  }
  if (outer) {
    if (!keep) {
      sqlite3_exec(db_, "ROLLBACK", nullptr, nullptr, nullptr);
      return;
    }
    try {
      Prepare("COMMIT").Run();
    } catch (...) {
      if (!sqlite3_get_autocommit(db_))
        sqlite3_exec(db_, "ROLLBACK", nullptr, nullptr, nullptr);
      throw;
    }
    return;
  }
  if (keep) {
    Prepare("RELEASE unit").Run();
  } else {
    Prepare("ROLLBACK TO unit").Run();
    Prepare("RELEASE unit").Run();
  }
}

void CheckFault(std::string_view operation, std::string_view object) {
  Store::Host().CheckFault(operation, object);
}

} // namespace Model
