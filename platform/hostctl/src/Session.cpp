//===- Session.cpp - The host a process works on ---------------------------===//
//
// The session owns the process's backend. It is made on first use from the
// host chosen with SetHost, else $OSTRACLI_HOST, else the default simulated
// host. "linux" and "netns:NAME" are served by a backend that a separately
// loaded module registers (so that libnl loads only when the Linux host is
// used); the module is looked for at $OSTRACLI_LINUX_MODULE, else at
// lib/ostracli/host-linux.so beside the executable's directory.
//
//===----------------------------------------------------------------------===//
#include "HostCtl/Session.h"

#include "HostCtl/Lib.h"
#include "backend/Backend.h"
#include "model/Store.h"

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
  void* handle = ::dlopen(LinuxModulePath().c_str(), RTLD_NOW | RTLD_LOCAL);
  if (!handle)
    return false;
  using RegisterFn = void (*)();
  auto registerFn = reinterpret_cast<RegisterFn>(::dlsym(handle, "OstraHost_Register"));
  if (!registerFn)
    return false;
  registerFn();
  return true; // The module stays loaded: the backend's code lives in it.
}

std::unique_ptr<Backend::Backend> MakeBackend(const std::string& spec, bool chosen) {
  std::string scheme = SchemeOf(spec);
  if (scheme.empty())
    return Backend::MakeSimulatedHost(chosen ? spec : std::string());
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
  if (!state.backend) {
    // Without SetHost the simulated host finds its own database as it
    // always has ($OSTRACLI_HOST, else the default made from the demo
    // profile); only a kernel host named by $OSTRACLI_HOST needs a factory.
    std::string spec;
    if (const char* env = std::getenv("OSTRACLI_HOST"); env && *env)
      spec = env;
    state.backend = MakeBackend(spec, !SchemeOf(spec).empty());
    state.spec = spec;
  }
  return *state.backend;
}

void ResetCurrent() {
  State& state = TheState();
  state.backend.reset();
  state.spec.clear();
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
  return Model::Store::DefaultPath();
}

void SetHost(const std::string& spec) {
  State& state = TheState();
  if (state.backend && state.spec == spec)
    return;
  std::unique_ptr<Backend::Backend> backend = MakeBackend(spec, true);
  state.backend = std::move(backend);
  state.spec = spec;
}

void SetHostPath(const std::string& path) {
  State& state = TheState();
  if (state.backend && state.spec == path)
    return;
  state.backend = Backend::MakeSimulatedHost(path);
  state.spec = path;
}

bool HasTransactions() {
  return Backend::Current().HasTransactions();
}

void BeginBatch() {
  Backend::Current().BeginBatch();
}

void EndBatch(bool commit) {
  Backend::Current().EndBatch(commit);
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
