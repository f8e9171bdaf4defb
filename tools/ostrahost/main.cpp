//===- main.cpp - ostrahost: create, import and export host states --------===//
//
//   ostrahost init PATH [--profile NAME]
//   ostrahost import FILE [--host PATH]      (FILE "-" reads standard input)
//   ostrahost export [--host PATH]
//   ostrahost profile NAME
//   ostrahost generate PATH [--routes N] [--portgroups N] [--vms N]
//                           [--ports-per-vm N] [--neighbours N] [--hosts-entries N]
//   ostrahost --help | --version | --man
//
// The host defaults to $OSTRACLI_HOST, else the default host of ostracli.
//
//===----------------------------------------------------------------------===//
#include "HostCtl/Lib.h"
#include "Usage.h"
#include "model/HostDescription.h"
#include "model/JsonRead.h"
#include "model/Store.h"

#include <cstdio>
#include <cstdlib>
#include <fstream>
#include <iostream>
#include <iterator>
#include <sstream>
#include <string>
#include <sys/stat.h>
#include <utility>
#include <vector>

namespace {

int Fail(const std::string& message) {
  std::fprintf(stderr, "ostrahost: %s\n", message.c_str());
  return 1;
}

int Usage(const std::string& message) {
  std::fprintf(stderr, "ostrahost: %s\nsee ostrahost --help\n", message.c_str());
  return 2;
}

bool Exists(const std::string& path) {
  struct stat st {};
  return ::stat(path.c_str(), &st) == 0;
}

std::string HostPath(const std::string& given) {
  if (!given.empty())
    return given;
  if (const char* env = std::getenv("OSTRACLI_HOST"); env && *env)
    return env;
  return Model::Store::DefaultPath();
}

/// Creates \p path and fills it with \p fill; a failure leaves no file
/// behind. The host ends up in the database file itself, not only in its
/// write-ahead log, so that copying the file alone copies the host.
template <typename Fill> void CreateHost(const std::string& path, Fill&& fill) {
  std::unique_ptr<Model::Store> store = Model::Store::Create(path);
  try {
    fill(*store);
    store->Exec("PRAGMA wal_checkpoint(TRUNCATE)");
  } catch (...) {
    store.reset();
    for (const char* suffix : {"", "-wal", "-shm"})
      std::remove((path + suffix).c_str());
    throw;
  }
}

/// Creates \p path from \p host, or replaces the host it holds.
void WriteHost(const std::string& path, const nlohmann::ordered_json& host) {
  if (Exists(path)) {
    Model::Store store(path);
    Model::ImportHost(store, host);
    store.Exec("PRAGMA wal_checkpoint(TRUNCATE)");
    return;
  }
  CreateHost(path, [&](Model::Store& store) { Model::ImportHost(store, host); });
}

/// Reads a non-negative count; false when \p text is not one.
bool ParseCount(const std::string& text, int64_t& value) {
  if (text.empty() || text.size() > 9 || text.find_first_not_of("0123456789") != std::string::npos)
    return false;
  value = std::stoll(text);
  return true;
}

/// Creates \p path as a generated host; a failure leaves no file behind.
void WriteGeneratedHost(const std::string& path, const Model::HostSizes& sizes) {
  Model::CheckHostSizes(sizes);
  CreateHost(path, [&](Model::Store& store) { Model::GenerateHost(store, sizes); });
}

} // namespace

int main(int argc, char** argv) {
  std::vector<std::string> args(argv + 1, argv + argc);
  if (args.empty())
    return Usage("no command given");
  if (args[0] == "--help" || args[0] == "-h" || args[0] == "--version" || args[0] == "--man") {
    std::string text = OstraHost::UsageText();
    if (args[0] == "--version")
      text = std::string("ostrahost ") + OstraHost::Version() + "\n";
    else if (args[0] == "--man")
      text = OstraHost::ManualPage();
    std::fwrite(text.data(), 1, text.size(), stdout);
    return 0;
  }
  std::string command = args[0];
  std::vector<std::string> positional;
  std::string host, profile = "demo";
  Model::HostSizes sizes;
  const std::pair<const char*, int64_t*> sizeOptions[] = {
      {"--routes", &sizes.routes},
      {"--portgroups", &sizes.portgroups},
      {"--vms", &sizes.vms},
      {"--ports-per-vm", &sizes.portsPerVm},
      {"--neighbours", &sizes.neighbours},
      {"--hosts-entries", &sizes.hostsEntries},
  };
  bool sized = false;
  for (std::size_t i = 1; i < args.size(); ++i) {
    const std::string& arg = args[i];
    int64_t* size = nullptr;
    for (const auto& [name, target] : sizeOptions)
      if (arg == name)
        size = target;
    if (size) {
      if (i + 1 >= args.size())
        return Usage("option " + arg + " requires a value");
      if (!ParseCount(args[++i], *size))
        return Usage("option " + arg + " takes a count, not \"" + args[i] + "\"");
      sized = true;
    } else if (arg == "--host" || arg == "--profile") {
      if (i + 1 >= args.size())
        return Usage("option " + arg + " requires a value");
      (arg == "--host" ? host : profile) = args[++i];
    } else if (arg.size() > 1 && arg[0] == '-' && arg != "-") {
      return Usage("unknown option " + arg);
    } else {
      positional.push_back(arg);
    }
  }
  if (sized && command != "generate")
    return Usage("only generate takes sizes");
  try {
    if (command == "init") {
      if (positional.size() != 1)
        return Usage("init takes one PATH");
      if (Exists(positional[0]))
        return Fail("the file " + positional[0] + " exists already");
      WriteHost(positional[0], Model::Profile(profile));
      return 0;
    }
    if (command == "generate") {
      if (positional.size() != 1)
        return Usage("generate takes one PATH");
      if (Exists(positional[0]))
        return Fail("the file " + positional[0] + " exists already");
      WriteGeneratedHost(positional[0], sizes);
      return 0;
    }
    if (command == "import") {
      if (positional.size() != 1)
        return Usage("import takes one FILE");
      std::string text;
      if (positional[0] == "-") {
        text.assign(std::istreambuf_iterator<char>(std::cin), std::istreambuf_iterator<char>());
      } else {
        std::ifstream file(positional[0], std::ios::binary);
        if (!file)
          return Fail("cannot read " + positional[0]);
        text.assign(std::istreambuf_iterator<char>(file), std::istreambuf_iterator<char>());
      }
      nlohmann::ordered_json doc;
      try {
        doc = nlohmann::ordered_json::parse(text);
      } catch (const nlohmann::json::exception& e) {
        return Fail("invalid host description: not JSON (" + std::string(e.what()) + ")");
      }
      WriteHost(HostPath(host), doc);
      return 0;
    }
    if (command == "export") {
      if (!positional.empty())
        return Usage("export takes no arguments");
      Model::Store store(HostPath(host));
      std::string text = Model::ExportHost(store).dump(2) + "\n";
      std::fwrite(text.data(), 1, text.size(), stdout);
      return 0;
    }
    if (command == "profile") {
      if (positional.size() != 1)
        return Usage("profile takes one NAME");
      std::string text = Model::Profile(positional[0]).dump(2) + "\n";
      std::fwrite(text.data(), 1, text.size(), stdout);
      return 0;
    }
    return Usage("unknown command " + command);
  } catch (const Model::ImportError& e) {
    return Fail(std::string("invalid host description: ") + e.what());
  } catch (const HostCtl::Lib::HostCtlException& e) {
    return Fail(e.what());
  } catch (const std::exception& e) {
    return Fail(e.what());
  }
}
