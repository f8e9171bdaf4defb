//===- Session.cpp - The host a process works on ---------------------------===//
//
// The session owns the process's backend. It is made on first use from the
// host chosen with SetHost (else the simulated host's store decides, as in
// unit tests). "linux" and "netns:NAME" are served by a backend that a separately
// loaded module registers (so that libnl loads only when the Linux host is
// used); the module is looked for at $OSTRACLI_LINUX_MODULE, else at
// lib/ostracli/host-linux.so beside the executable's directory.
//
//===----------------------------------------------------------------------===//
#include "HostCtl/Session.h"

#include "HostCtl/Lib.h"
#include "backend/Backend.h"

#include <climits>
#include <cstdlib>
#include <dlfcn.h>
#include <map>
#include <unistd.h>

namespace HostCtl {

namespace {

/// What the session keeps.
struct State {
  std::unique_ptr<Backend::Backend> backend;         ///< In use, once made.
  std::string spec;                                  ///< --host value it serves.
  std::map<std::string, Backend::Factory> factories; ///< By scheme.
  std::string missingOperation;                      ///< Last operation not available, or "".
  std::string missingHost;                           ///< The host that lacked it.
  int lockTimeoutMs = -1;                            ///< SetLockTimeout's, or -1.
  std::string failure; ///< Why the host chosen last cannot be used, or "".
};

State& TheState() {
  static State state;
  return state;
}

/// The scheme of \p spec that a factory may claim: "linux" for "linux",
/// "netns" for "netns:NAME"; "" for a simulated host's path.
std::string SchemeOf(const std::string& spec) {
  if (spec == "linux")
    return spec;
  if (spec.rfind("netns:", 0) == 0)
    return "netns";
  return "";
}

std::string LinuxModulePath() {
  if (const char* env = std::getenv("OSTRACLI_LINUX_MODULE"); env && *env)
    return env;
  char buffer[PATH_MAX];
  ssize_t length = ::readlink("/proc/self/exe", buffer, sizeof buffer - 1);
  if (length <= 0)
    return "host-linux.so";
  std::string exe(buffer, static_cast<std::size_t>(length));
  return exe.substr(0, exe.find_last_of('/')) + "/../lib/ostracli/host-linux.so";
}

/// Loads the Linux host's module, which registers its factories; false when
/// it is not there.
bool LoadLinuxModule() {
  void* handle = ::dlopen(LinuxModulePath().c_str(), RTLD_LAZY | RTLD_LOCAL);
  if (!handle)
    return false;
  using RegisterFn = void (*)();
  auto registerFn = reinterpret_cast<RegisterFn>(::dlsym(handle, "OstraHost_Register"));
  if (!registerFn)
    return false;
  registerFn();
  return true; // The module stays loaded: the backend's code lives in it.
}

std::unique_ptr<Backend::Backend> MakeBackend(const std::string& spec, bool createDemo) {
  std::string scheme = SchemeOf(spec);
  if (scheme.empty())
    return Backend::MakeSimulatedHost(spec, createDemo);
  State& state = TheState();
  auto found = state.factories.find(scheme);
  if (found == state.factories.end() && LoadLinuxModule())
    found = state.factories.find(scheme);
  if (found == state.factories.end())
    throw Lib::HostCtlException("The host " + spec +
                                " needs the Linux host module (host-linux.so), which this "
                                "ostracli does not have");
  return found->second(spec);
}

} // namespace

namespace Backend {

void RegisterFactory(const std::string& scheme, Factory factory) {
  if (factory)
    TheState().factories[scheme] = factory;
  else
    TheState().factories.erase(scheme);
}

Backend& Current() {
  State& state = TheState();
  // A host that was chosen but cannot be used stays refused: no command may
  // fall back to another host.
  if (!state.failure.empty())
    throw Lib::HostCtlException(state.failure);
  if (!state.backend) {
    // Without SetHost (unit tests) the simulated host uses the database its
    // store was pointed at.
    state.backend = MakeSimulatedHost(std::string(), false);
    state.spec.clear();
    if (state.lockTimeoutMs >= 0)
      state.backend->SetLockTimeout(state.lockTimeoutMs);
  }
  return *state.backend;
}

void ResetCurrent() {
  State& state = TheState();
  state.backend.reset();
  state.spec.clear();
  state.failure.clear();
}

[[noreturn]] void Unavailable(const char* operation) {
  throw Lib::NotAvailableException(operation, Current().Describe());
}

} // namespace Backend

namespace Lib {

NotAvailableException::NotAvailableException(const std::string& operation, const std::string& host)
    : HostCtlException(operation + " is not available on " + host), operation_(operation),
      host_(host) {
  State& state = TheState();
  state.missingOperation = operation;
  state.missingHost = host;
}

} // namespace Lib

namespace Session {

std::string DefaultHostPath() {
  std::string base;
  if (const char* xdg = std::getenv("XDG_STATE_HOME"); xdg && *xdg)
    base = xdg;
  else if (const char* home = std::getenv("HOME"); home && *home)
    base = std::string(home) + "/.local/state";
  else
    base = "/tmp";
  return base + "/ostracli/host.db";
}

bool IsSimulatedHost(const std::string& spec) {
  return SchemeOf(spec).empty();
}

void SetHost(const std::string& spec, bool createDemo) {
  State& state = TheState();
  if (state.spec == spec) {
    // The host in use stays as it is (a batch in progress goes on); one that
    // was refused is refused again, with the same line.
    if (!state.failure.empty())
      throw Lib::HostCtlException(state.failure);
    if (state.backend)
      return;
  }
  state.backend.reset();
  state.spec = spec;
  std::unique_ptr<Backend::Backend> backend;
  try {
    backend = MakeBackend(spec, createDemo);
  } catch (const Lib::HostCtlException& e) {
    state.failure = e.what();
    throw;
  }
  state.failure.clear();
  if (state.lockTimeoutMs >= 0)
    backend->SetLockTimeout(state.lockTimeoutMs);
  state.backend = std::move(backend);
}

void SetLockTimeout(int milliseconds) {
  State& state = TheState();
  state.lockTimeoutMs = milliseconds;
  if (state.backend)
    state.backend->SetLockTimeout(milliseconds);
}

bool HasTransactions() {
  return Backend::Current().HasTransactions();
}

void BeginCommand(bool changes) {
  Backend::Current().BeginCommand(changes);
}

void EndCommand(bool keep) {
  Backend::Current().EndCommand(keep);
}

void BeginBatch() {
  Backend::Current().BeginBatch();
}

void EndBatch(bool commit) {
  Backend::Current().EndBatch(commit);
}

bool BatchLost() {
  return Backend::Current().BatchLost();
}

void ClearNotAvailable() {
  TheState().missingOperation.clear();
}

std::string NotAvailableLine(const std::string& command) {
  const State& state = TheState();
  if (state.missingOperation.empty())
    return "";
  return command + " is not available on " + state.missingHost;
}

} // namespace Session

} // namespace HostCtl
