//===- model/Store.cpp - The SQLite store of the simulated host ------------===//
#include "model/Store.h"

#include "HostCtl/Lib.h"
#include "model/HostDescription.h"
#include "model/Part.h"

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

/// Identifies our files ("OSTR") and the layout of their tables.
constexpr int kApplicationId = 0x4f535452;
constexpr int kSchemaVersion = 1;

std::unique_ptr<Store>& HostSlot() {
  static std::unique_ptr<Store> store;
  return store;
}

std::string& PathSlot() {
  static std::string path;
  return path;
}

int BusyTimeoutMs() {
  if (const char* env = std::getenv("OSTRACLI_BUSY_TIMEOUT_MS")) {
    char* end = nullptr;
    long value = std::strtol(env, &end, 10);
    if (end != env && *end == '\0' && value >= 0 && value <= 600000)
      return static_cast<int>(value);
  }
  return 5000;
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

std::optional<std::string> Statement::OptText(int column) const {
  if (IsNull(column))
    return std::nullopt;
  return Text(column);
}

// --- Store ---------------------------------------------------------------

std::string Store::DefaultPath() {
  std::string base;
  if (const char* xdg = std::getenv("XDG_STATE_HOME"); xdg && *xdg)
    base = xdg;
  else if (const char* home = std::getenv("HOME"); home && *home)
    base = std::string(home) + "/.local/state";
  else
    base = "/tmp";
  return base + "/ostracli/host.db";
}

void Store::SetPath(const std::string& path) {
  PathSlot() = path;
  HostSlot().reset();
}

void Store::CloseHost() {
  HostSlot().reset();
}

Store& Store::Host() {
  std::unique_ptr<Store>& slot = HostSlot();
  if (slot)
    return *slot;
  std::string path = PathSlot();
  if (path.empty())
    if (const char* env = std::getenv("OSTRACLI_HOST"); env && *env)
      path = env;
  if (path.empty()) {
    path = DefaultPath();
    if (!FileExists(path))
      CreateDemoHost(path);
  }
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
  sqlite3_busy_timeout(db_, BusyTimeoutMs());
  // A one-shot process would otherwise checkpoint the whole log when it
  // closes; checkpoints happen automatically as the log grows.
  sqlite3_db_config(db_, SQLITE_DBCONFIG_NO_CKPT_ON_CLOSE, 1, nullptr);
  try {
    Exec("PRAGMA synchronous=FULL; PRAGMA foreign_keys=ON");
    Statement check = Prepare("PRAGMA application_id");
    check.Step();
    int64_t app = check.Int(0);
    Statement version = Prepare("PRAGMA user_version");
    version.Step();
    int64_t schema = version.Int(0);
    if (app != kApplicationId)
      throw HostCtlException("The file " + path + " is not a host state database");
    if (schema != kSchemaVersion)
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
  std::string sql =
      "PRAGMA journal_mode=WAL; PRAGMA application_id=" + std::to_string(kApplicationId) +
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
  switch (primary) {
  case SQLITE_BUSY:
  case SQLITE_LOCKED:
    throw HostCtlException(where + " is locked by another process; try again");
  case SQLITE_READONLY:
    throw HostCtlException(where + " cannot be changed: it is read-only");
  case SQLITE_FULL:
    throw HostCtlException(where + " cannot be changed: the disk is full");
  case SQLITE_NOTADB:
    throw HostCtlException("The file " + path_ + " is not a host state database");
  case SQLITE_CORRUPT:
    throw HostCtlException(where + " is corrupt");
  case SQLITE_IOERR:
  case SQLITE_CANTOPEN:
    throw HostCtlException(where + " cannot be read or written: " + sqlite3_errstr(rc));
  default:
    throw HostCtlException(where + ": error " + std::string(doing) + ": " +
                           (db_ ? sqlite3_errmsg(db_) : sqlite3_errstr(rc)));
  }
}

void Store::LoadFaults() {
  cache_->faults.clear();
  Statement stmt = Prepare("SELECT operation, object, message FROM fault");
  while (stmt.Step())
    cache_->faults.push_back({stmt.Text(0), stmt.Text(1), stmt.Text(2)});
  cache_->faultsLoaded = true;
}

void Store::CheckFault(std::string_view operation, std::string_view object) {
  if (!cache_->faultsLoaded)
    Read([this] { LoadFaults(); });
  for (const Cache::Fault& fault : cache_->faults)
    if (fault.operation == operation && (fault.object == object || fault.object == "*"))
      throw HostCtlException(fault.message);
}

// Transaction control goes through the statement cache: a batch opens and
// releases a savepoint per operation, and parsing those statements each time
// was a tenth of the cost of a batch of route additions.
Store::Scope::Scope(Store& store, bool write) : store_(store), outer_(store.depth_ == 0) {
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
  if (outer_)
    sqlite3_exec(store_.db_, "ROLLBACK", nullptr, nullptr, nullptr);
  else if (savepoint_)
    sqlite3_exec(store_.db_, "ROLLBACK TO operation; RELEASE operation", nullptr, nullptr, nullptr);
}

void Store::BeginBatch() {
  if (depth_ != 0)
    throw HostCtlException("Internal error: a batch was started inside a transaction");
  Exec("BEGIN IMMEDIATE");
  writing_ = true;
  depth_ = 1;
}

void Store::EndBatch(bool commit) {
  if (depth_ != 1)
    return;
  depth_ = 0;
  if (commit) {
    try {
      Exec("COMMIT");
    } catch (...) {
      sqlite3_exec(db_, "ROLLBACK", nullptr, nullptr, nullptr);
      throw;
    }
  } else {
    sqlite3_exec(db_, "ROLLBACK", nullptr, nullptr, nullptr);
  }
}

void CheckFault(std::string_view operation, std::string_view object) {
  Store::Host().CheckFault(operation, object);
}

} // namespace Model
