//===- main.cpp - ostrahost: create, import and export host states --------===//
//
//   ostrahost init PATH [--profile NAME]
//   ostrahost import FILE [--host PATH]      (FILE "-" reads standard input)
//   ostrahost export [--host PATH]
//   ostrahost profile NAME
//
// The host defaults to $OSTRACLI_HOST, else the default host of ostracli.
//
//===----------------------------------------------------------------------===//
#include "HostCtl/Lib.h"
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
#include <vector>

namespace {

const char* const kUsage =
    "Usage:\n"
    "  ostrahost init PATH [--profile demo|empty]   create a host state file\n"
    "  ostrahost import FILE [--host PATH]          replace a host by a JSON host description\n"
    "                                               (FILE - reads standard input; PATH is\n"
    "                                               created when it does not exist)\n"
    "  ostrahost export [--host PATH]               print the host as a JSON host description\n"
    "  ostrahost profile NAME                       print a built-in profile (demo, empty)\n"
    "\n"
    "The host is --host, else $OSTRACLI_HOST, else the default host of ostracli.\n";

int Fail(const std::string& message) {
  std::fprintf(stderr, "ostrahost: %s\n", message.c_str());
  return 1;
}

int Usage(const std::string& message) {
  std::fprintf(stderr, "ostrahost: %s\n%s", message.c_str(), kUsage);
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

/// Creates \p path from \p host, or replaces the host it holds.
void WriteHost(const std::string& path, const nlohmann::ordered_json& host) {
  if (Exists(path)) {
    Model::Store store(path);
    Model::ImportHost(store, host);
    return;
  }
  std::unique_ptr<Model::Store> store = Model::Store::Create(path);
  try {
    Model::ImportHost(*store, host);
  } catch (...) {
    store.reset();
    for (const char* suffix : {"", "-wal", "-shm"})
      std::remove((path + suffix).c_str());
    throw;
  }
}

} // namespace

int main(int argc, char** argv) {
  std::vector<std::string> args(argv + 1, argv + argc);
  if (args.empty() || args[0] == "--help" || args[0] == "-h") {
    std::fputs(kUsage, args.empty() ? stderr : stdout);
    return args.empty() ? 2 : 0;
  }
  std::string command = args[0];
  std::vector<std::string> positional;
  std::string host, profile = "demo";
  for (std::size_t i = 1; i < args.size(); ++i) {
    const std::string& arg = args[i];
    if (arg == "--host" || arg == "--profile") {
      if (i + 1 >= args.size())
        return Usage("option " + arg + " requires a value");
      (arg == "--host" ? host : profile) = args[++i];
    } else if (arg.size() > 1 && arg[0] == '-' && arg != "-") {
      return Usage("unknown option " + arg);
    } else {
      positional.push_back(arg);
    }
  }
  try {
    if (command == "init") {
      if (positional.size() != 1)
        return Usage("init takes one PATH");
      if (Exists(positional[0]))
        return Fail("the file " + positional[0] + " exists already");
      WriteHost(positional[0], Model::Profile(profile));
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
