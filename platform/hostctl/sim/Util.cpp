//===- Util.cpp - Host programs, acting on the host model only ------------===//
#include "sim/Backend.h"

#include "HostCtl/Lib.h"
#include "model/CoreModel.h"
#include "model/IpModel.h"
#include "model/Store.h"

namespace Sim {

namespace {

/// Service scripts the simulated host knows, with the setting that records
/// that the service runs.
struct KnownService {
  const char* script;  ///< Path of the script.
  const char* setting; ///< Setting holding the options it runs with.
};

const KnownService kServices[] = {
    {"/etc/init.d/quilld", Model::Ip::kQuilldSetting},
};

} // namespace

int Exec(const std::string& command, bool /*background*/, bool /*wait*/, bool /*captureOutput*/) {
  std::size_t space = command.find(' ');
  std::string program = command.substr(0, space);
  std::string options = space == std::string::npos ? "" : command.substr(space + 1);
  for (const KnownService& service : kServices) {
    if (program != service.script)
      continue;
    Model::Store& store = Model::Store::Host();
    try {
      store.CheckFault("TvkCtl_Exec", program);
    } catch (const HostCtl::Lib::HostCtlException&) {
      return 1;
    }
    store.Write([&] { Model::PutSetting(store, service.setting, options); });
    return 0;
  }
  return 127;
}

} // namespace Sim
