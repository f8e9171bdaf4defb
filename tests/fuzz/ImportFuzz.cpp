//===- ImportFuzz.cpp - Fuzzing the host-description importer -------------===//
//
// Any bytes: import must either refuse them with an ImportError (leaving the
// host as it was) or accept them, in which case export then import gives the
// same host.
//
//===----------------------------------------------------------------------===//
#include "HostCtl/Lib.h"
#include "model/HostDescription.h"
#include "model/JsonRead.h"
#include "model/Store.h"

#include <cstdint>
#include <cstdlib>
#include <string>
#include <unistd.h>

namespace {

Model::Store& Scratch() {
  static std::unique_ptr<Model::Store> store = [] {
    // On tmpfs the store's synchronous commits cost nothing, which makes the
    // fuzzer many times faster.
    const char* dir = ::access("/dev/shm", W_OK) == 0 ? "/dev/shm" : "/tmp";
    std::string path = std::string(dir) + "/ostra-import-fuzz-" + std::to_string(::getpid()) + ".db";
    for (const char* suffix : {"", "-wal", "-shm"})
      ::unlink((path + suffix).c_str());
    return Model::Store::Create(path);
  }();
  return *store;
}

} // namespace

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
  nlohmann::ordered_json host =
      nlohmann::ordered_json::parse(data, data + size, nullptr, /*allow_exceptions=*/false);
  if (host.is_discarded())
    return 0;
  Model::Store& store = Scratch();
  nlohmann::ordered_json before = Model::ExportHost(store);
  try {
    Model::ImportHost(store, host);
  } catch (const Model::ImportError&) {
    if (Model::ExportHost(store) != before)
      std::abort(); // A refused import changed the host.
    return 0;
  } catch (const HostCtl::Lib::HostCtlException&) {
    if (Model::ExportHost(store) != before)
      std::abort();
    return 0;
  }
  nlohmann::ordered_json exported = Model::ExportHost(store);
  Model::ImportHost(store, exported);
  if (Model::ExportHost(store) != exported)
    std::abort(); // Export then import changed the host.
  return 0;
}
