//===- model/Store.h - The SQLite store of the simulated host --------------===//
//
// One SQLite database file holds one host. Every host operation runs in one
// transaction: Read() for operations that only look, Write() for operations
// that change the host (committed durably before Write returns). Statements
// are prepared once per connection and reused.
//
// Failures of the store itself (missing, corrupt, read-only, full, locked for
// longer than the busy timeout) surface as HostCtl::Lib::HostCtlException
// with a clear message, like any refusal of the host.
//
//===----------------------------------------------------------------------===//
#pragma once

#include <cstddef>
#include <cstdint>
#include <functional>
#include <memory>
#include <optional>
#include <string>
#include <string_view>
#include <type_traits>
#include <vector>

struct sqlite3;
struct sqlite3_stmt;

namespace Model {

class Store;

/// A prepared statement in use; it is reset and its bindings cleared when the
/// object goes away, so the cached statement can be used again.
class Statement {
public:
  Statement(Store& store, sqlite3_stmt* stmt) : store_(&store), stmt_(stmt) {}
  Statement(Statement&& other) noexcept;
  Statement(const Statement&) = delete;
  Statement& operator=(const Statement&) = delete;
  ~Statement();

  /// Binds parameter \p index (1-based).
  Statement& Bind(int index, int64_t value);
  Statement& Bind(int index, int value) { return Bind(index, static_cast<int64_t>(value)); }
  Statement& Bind(int index, uint32_t value) { return Bind(index, static_cast<int64_t>(value)); }
  Statement& Bind(int index, bool value) { return Bind(index, static_cast<int64_t>(value)); }
  Statement& Bind(int index, std::string_view value);
  Statement& Bind(int index, const std::string& value) {
    return Bind(index, std::string_view(value));
  }
  Statement& Bind(int index, const char* value) { return Bind(index, std::string_view(value)); }
  Statement& BindNull(int index);
  /// Binds \p size bytes at \p data as a blob (copied).
  Statement& BindBlob(int index, const void* data, std::size_t size);
  /// Binds all arguments to parameters 1, 2, ...
  template <typename... Args> Statement& BindAll(const Args&... args) {
    int index = 0;
    (Bind(++index, args), ...);
    return *this;
  }

  /// Steps once; true when a row is available.
  bool Step();
  /// Steps to completion (statements that return no rows).
  void Run();
  /// Makes the statement ready to run again; bind every parameter anew
  /// before the next Step or Run (bulk inserts reuse one statement so).
  void Reset();

  int64_t Int(int column) const;
  std::string Text(int column) const;
  bool Bool(int column) const { return Int(column) != 0; }
  bool IsNull(int column) const;
  /// The column as text, or nothing for NULL.
  std::optional<std::string> OptText(int column) const;
  /// Copies the column's bytes to \p out when it is a blob of exactly
  /// \p size bytes; false (and \p out untouched) otherwise.
  bool Blob(int column, void* out, std::size_t size) const;

private:
  Store* store_;       ///< Owner of the connection, for error texts.
  sqlite3_stmt* stmt_; ///< Cached statement; null after a move.
};

/// The open store of the host this process works on.
class Store {
public:
  /// The host store of this process, opened on first use at SetPath's path.
  /// The store reads no environment: the command host chooses the path.
  static Store& Host();
  /// Chooses the host database before first use (closing the one open). With
  /// \p createDemo, a missing file is created from the demo profile first.
  static void SetPath(const std::string& path, bool createDemo = false);
  /// How long statements wait for another connection's lock.
  static void SetLockTimeout(int milliseconds);
  /// Closes the process's host store (the next Host() opens it again).
  static void CloseHost();

  /// Opens an existing store; throws HostCtlException when it cannot.
  explicit Store(const std::string& path);
  ~Store();
  Store(const Store&) = delete;
  Store& operator=(const Store&) = delete;

  /// Creates a new, empty store file with every part's schema; fails when the
  /// file exists.
  static std::unique_ptr<Store> Create(const std::string& path);

  /// Runs \p fn in a read transaction.
  template <typename Fn> auto Read(Fn&& fn) -> decltype(fn()) {
    Scope scope(*this, false);
    if constexpr (std::is_void_v<decltype(fn())>) {
      fn();
      scope.Commit();
    } else {
      auto result = fn();
      scope.Commit();
      return result;
    }
  }
  /// Runs \p fn in a write transaction, committed durably when \p fn returns
  /// and rolled back when it throws.
  template <typename Fn> auto Write(Fn&& fn) -> decltype(fn()) {
    Scope scope(*this, true);
    if constexpr (std::is_void_v<decltype(fn())>) {
      fn();
      scope.Commit();
    } else {
      auto result = fn();
      scope.Commit();
      return result;
    }
  }

  /// Starts a unit of work that host operations join until EndUnit: outside
  /// any transaction a transaction (a write one, taking the lock now and
  /// waiting for it up to the lock timeout, when \p write; otherwise one
  /// consistent read), inside one a savepoint. Operations inside keep their
  /// own savepoints, so a refused operation is still undone alone.
  void BeginUnit(bool write);
  /// Ends the innermost unit: \p keep commits it (or releases its savepoint),
  /// otherwise rolls it back. Throws HostCtlException when the commit fails or
  /// the transaction was lost; nothing of the unit is kept then.
  void EndUnit(bool keep);
  /// True when SQLite rolled back the open transaction on its own (a full
  /// disk, an I/O error): nothing of it is kept, and every host operation
  /// fails until the outermost unit ends.
  bool Lost() const { return lost_; }

  /// A statement from the cache (prepared on first use).
  Statement Prepare(const char* sql);
  /// Runs SQL text that returns no rows (schema, pragmas).
  void Exec(const char* sql);
  int64_t LastInsertId() const;
  int Changes() const;

  /// Throws the fault the host description declares for \p operation on
  /// \p object (or on "*"), if any.
  void CheckFault(std::string_view operation, std::string_view object);

  const std::string& GetPath() const { return path_; }
  sqlite3* Handle() const { return db_; }
  /// Throws HostCtlException describing SQLite result code \p rc.
  [[noreturn]] void Fail(int rc, std::string_view doing) const;

private:
  /// One transaction. A scope inside a write transaction is a savepoint, so
  /// that a failed inner operation is undone alone; a read inside any
  /// transaction joins it.
  class Scope {
  public:
    Scope(Store& store, bool write);
    ~Scope();
    void Commit();

  private:
    Store& store_;
    bool outer_;             ///< Began the transaction.
    bool savepoint_ = false; ///< Opened a savepoint.
    bool done_ = false;      ///< Committed.
  };

  void LoadFaults();
  /// Brings a file of an older layout to the current one, in one transaction.
  void Upgrade(int64_t from);
  /// Throws when the open transaction has gone away underneath us.
  void CheckTransaction();
  std::string LostMessage() const;

  struct Cache;
  std::string path_;                ///< Database file.
  sqlite3* db_ = nullptr;           ///< Connection.
  std::unique_ptr<Cache> cache_;    ///< Prepared statements and faults.
  int depth_ = 0;                   ///< Nesting of transaction scopes.
  bool writing_ = false;            ///< The open transaction is a write.
  bool lost_ = false;               ///< SQLite rolled back the open transaction.
  mutable std::string lastFailure_; ///< Text of the last failure, for a lost transaction.
  std::vector<bool> units_;         ///< Open units, innermost last; true: began the transaction.
};

/// Shorthand for Store::Host().CheckFault(...).
void CheckFault(std::string_view operation, std::string_view object);

} // namespace Model
