//===- main.cpp - ostrahost: create, import and export host states --------===//
//
//   ostrahost init PATH [--profile NAME]
//   ostrahost import FILE [--host PATH] [--max-size SIZE]
//                                            (FILE "-" reads standard input)
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
#include "HostCtl/Session.h"
#include "Usage.h"
#include "model/HostDescription.h"
#include "model/JsonRead.h"
#include "model/Store.h"

#include <cerrno>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <fcntl.h>
#include <memory>
#include <new>
#include <string>
#include <string_view>
#include <sys/stat.h>
#include <unistd.h>
#include <utility>
#include <vector>

namespace {

int Fail(const std::string& message) {
  std::fprintf(stderr, "ostrahost: %s\n", message.c_str());
  return 1;
}

/// Writes \p text to standard output; a failed write or flush is an error.
int Write(const std::string& text) {
  if (std::fwrite(text.data(), 1, text.size(), stdout) != text.size() || std::fflush(stdout) != 0)
    return Fail(std::string("cannot write the output: ") + std::strerror(errno));
  return 0;
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
  return HostCtl::Session::DefaultHostPath();
}

/// The largest host description import reads unless --max-size says
/// otherwise: far above the description of the largest generated host's
/// demo part, and small enough that parsing it fits in memory.
constexpr int64_t kDefaultMaxImport = int64_t{256} << 20;

/// Reads a size in bytes with an optional K, M or G suffix; -1 when \p text
/// is not one.
int64_t ParseSize(const std::string& text) {
  std::size_t digits = text.find_first_not_of("0123456789");
  if (digits == 0 || text.empty() || (digits != std::string::npos && digits + 1 != text.size()) ||
      text.size() > 12)
    return -1;
  int64_t value = std::stoll(text.substr(0, digits));
  if (digits == std::string::npos)
    return value;
  switch (text[digits]) {
  case 'K':
  case 'k':
    return value << 10;
  case 'M':
    return value << 20;
  case 'G':
    return value << 30;
  default:
    return -1;
  }
}

/// The refusal of input beyond the import limit.
std::string TooLarge(const std::string& file, int64_t limit) {
  return (file == "-" ? std::string("the standard input") : file) +
         " holds more than the import limit of " + std::to_string(limit) +
         " bytes (raise it with --max-size)";
}

/// Opens \p file ("-": standard input) for reading from its start as often as
/// needed, refusing more than \p limit bytes; "" on success, else the reason.
/// A regular file is read in place; anything else (a pipe, a device) is
/// copied to a temporary file first, at most \p limit bytes of it.
std::string OpenLimited(const std::string& file, int64_t limit, std::FILE*& out) {
  int fd = file == "-" ? 0 : ::open(file.c_str(), O_RDONLY | O_CLOEXEC);
  if (fd < 0)
    return "cannot read " + file + ": " + std::strerror(errno);
  struct stat st {};
  if (::fstat(fd, &st) == 0 && S_ISREG(st.st_mode) && fd != 0) {
    if (st.st_size > limit) {
      ::close(fd);
      return TooLarge(file, limit);
    }
    out = ::fdopen(fd, "r");
    return out ? "" : "cannot read " + file + ": " + std::strerror(errno);
  }
  std::FILE* copy = std::tmpfile();
  if (!copy) {
    if (fd != 0)
      ::close(fd);
    return std::string("cannot make a temporary file: ") + std::strerror(errno);
  }
  std::string problem;
  int64_t total = 0;
  char buffer[1 << 16];
  for (;;) {
    ssize_t got = ::read(fd, buffer, sizeof buffer);
    if (got < 0 && errno == EINTR)
      continue;
    if (got < 0) {
      problem = "cannot read " + file + ": " + std::strerror(errno);
      break;
    }
    if (got == 0)
      break;
    total += got;
    if (total > limit) {
      problem = TooLarge(file, limit);
      break;
    }
    if (std::fwrite(buffer, 1, static_cast<std::size_t>(got), copy) !=
        static_cast<std::size_t>(got)) {
      problem = std::string("cannot write a temporary file: ") + std::strerror(errno);
      break;
    }
  }
  if (fd != 0)
    ::close(fd);
  if (!problem.empty()) {
    std::fclose(copy);
    return problem;
  }
  std::rewind(copy);
  out = copy;
  return "";
}

/// Makes \p path's directory entry durable.
void SyncDirectory(const std::string& path) {
  std::size_t slash = path.find_last_of('/');
  std::string dir = slash == std::string::npos ? "." : slash == 0 ? "/" : path.substr(0, slash);
  int fd = ::open(dir.c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC);
  if (fd >= 0) {
    ::fsync(fd);
    ::close(fd);
  }
}

/// Creates \p path and fills it with \p fill. The host is built beside its
/// final name and linked into place whole, so that no process ever sees a
/// half-made host, whatever kills this one; of two processes that create
/// one path at once, exactly one succeeds and the other finds the host made.
template <typename Fill> void CreateHost(const std::string& path, Fill&& fill) {
  const std::string temp = path + ".new." + std::to_string(::getpid());
  auto discard = [&temp] {
    for (const char* suffix : {"", "-journal", "-wal", "-shm"})
      ::unlink((temp + suffix).c_str());
  };
  discard();
  try {
    std::unique_ptr<Model::Store> store = Model::Store::Create(temp);
    fill(*store);
  } catch (...) {
    discard();
    throw;
  }
  if (::link(temp.c_str(), path.c_str()) != 0) {
    int error = errno;
    discard();
    if (error == EEXIST)
      throw HostCtl::Lib::HostCtlException("the file " + path + " exists already");
    throw HostCtl::Lib::HostCtlException("cannot create " + path + ": " + std::strerror(error));
  }
  discard();
  SyncDirectory(path);
}

/// Creates \p path by \p import, or replaces the host it holds.
template <typename Import> void WriteHost(const std::string& path, Import&& import) {
  if (Exists(path)) {
    Model::Store store(path);
    import(store);
    return;
  }
  CreateHost(path, import);
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

/// The command line, parsed once for every command.
struct Options {
  std::vector<std::string> positional;   ///< Arguments that are no options.
  std::string host;                      ///< --host.
  std::string profile = "demo";          ///< --profile.
  Model::HostSizes sizes;                ///< generate's sizes.
  bool sized = false;                    ///< A size was given.
  int64_t maxImport = kDefaultMaxImport; ///< --max-size.
  bool limited = false;                  ///< --max-size was given.
};

int RunInit(const Options& options) {
  const std::string& path = options.positional[0];
  if (Exists(path))
    return Fail("the file " + path + " exists already");
  // Always a new file: another init may make the same path meanwhile,
  // and its host must not be replaced (WriteHost would import into it).
  nlohmann::ordered_json description = Model::Profile(options.profile);
  CreateHost(path, [&](Model::Store& store) { Model::ImportHost(store, description); });
  return 0;
}

int RunGenerate(const Options& options) {
  const std::string& path = options.positional[0];
  if (Exists(path))
    return Fail("the file " + path + " exists already");
  WriteGeneratedHost(path, options.sizes);
  return 0;
}

int RunImport(const Options& options) {
  std::FILE* file = nullptr;
  if (std::string problem = OpenLimited(options.positional[0], options.maxImport, file);
      !problem.empty())
    return Fail(problem);
  std::unique_ptr<std::FILE, int (*)(std::FILE*)> closer(file, std::fclose);
  // The description is checked whole before the host is touched, then read
  // again as it is imported: the large arrays are never in memory whole.
  nlohmann::ordered_json description = Model::ReadDescription(file);
  WriteHost(HostPath(options.host),
            [&](Model::Store& store) { Model::ImportHost(store, description, file); });
  return 0;
}

/// A write to standard output failed (errno tells why).
struct OutputFailed {};

int RunExport(const Options& options) {
  Model::Store store(HostPath(options.host));
  try {
    Model::WriteHostDescription(store, [](std::string_view text) {
      if (std::fwrite(text.data(), 1, text.size(), stdout) != text.size())
        throw OutputFailed{};
    });
    if (std::fflush(stdout) != 0)
      throw OutputFailed{};
  } catch (const OutputFailed&) {
    return Fail(std::string("cannot write the output: ") + std::strerror(errno));
  }
  return 0;
}

int RunProfile(const Options& options) {
  return Write(Model::Profile(options.positional[0]).dump(2) + "\n");
}

/// One command of ostrahost (Usage.cpp describes them to the user).
struct Subcommand {
  const char* name;       ///< First word of the command line.
  std::size_t positional; ///< Arguments it takes.
  const char* misuse;     ///< Its refusal of another number of arguments.
  int (*run)(const Options& options);
};

const Subcommand kSubcommands[] = {
    {"init", 1, "init takes one PATH", RunInit},
    {"generate", 1, "generate takes one PATH", RunGenerate},
    {"import", 1, "import takes one FILE", RunImport},
    {"export", 0, "export takes no arguments", RunExport},
    {"profile", 1, "profile takes one NAME", RunProfile},
};

/// Reads the options after the command word into \p options; "" on success,
/// else the refusal.
std::string ParseOptions(const std::vector<std::string>& args, Options& options) {
  Model::HostSizes& sizes = options.sizes;
  const std::pair<const char*, int64_t*> sizeOptions[] = {
      {"--routes", &sizes.routes},
      {"--portgroups", &sizes.portgroups},
      {"--vms", &sizes.vms},
      {"--ports-per-vm", &sizes.portsPerVm},
      {"--neighbours", &sizes.neighbours},
      {"--hosts-entries", &sizes.hostsEntries},
  };
  for (std::size_t i = 1; i < args.size(); ++i) {
    const std::string& arg = args[i];
    int64_t* size = nullptr;
    for (const auto& [name, target] : sizeOptions)
      if (arg == name)
        size = target;
    bool takesValue = size || arg == "--host" || arg == "--profile" || arg == "--max-size";
    if (takesValue && i + 1 >= args.size())
      return "option " + arg + " requires a value";
    if (size) {
      if (!ParseCount(args[++i], *size))
        return "option " + arg + " takes a count, not \"" + args[i] + "\"";
      options.sized = true;
    } else if (arg == "--host" || arg == "--profile") {
      (arg == "--host" ? options.host : options.profile) = args[++i];
    } else if (arg == "--max-size") {
      options.maxImport = ParseSize(args[++i]);
      if (options.maxImport < 0)
        return "option --max-size takes a size in bytes with an optional K, M or G, not \"" +
               args[i] + "\"";
      options.limited = true;
    } else if (arg.size() > 1 && arg[0] == '-' && arg != "-") {
      return "unknown option " + arg;
    } else {
      options.positional.push_back(arg);
    }
  }
  return "";
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
  const std::string& command = args[0];
  Options options;
  if (std::string refusal = ParseOptions(args, options); !refusal.empty())
    return Usage(refusal);
  if (options.sized && command != "generate")
    return Usage("only generate takes sizes");
  if (options.limited && command != "import")
    return Usage("only import takes --max-size");
  const Subcommand* subcommand = nullptr;
  for (const Subcommand& candidate : kSubcommands)
    if (command == candidate.name)
      subcommand = &candidate;
  if (!subcommand)
    return Usage("unknown command " + command);
  if (options.positional.size() != subcommand->positional)
    return Usage(subcommand->misuse);
  try {
    return subcommand->run(options);
  } catch (const Model::ImportError& e) {
    return Fail(std::string("invalid host description: ") + e.what());
  } catch (const HostCtl::Lib::HostCtlException& e) {
    return Fail(e.what());
  } catch (const std::bad_alloc&) {
    return Fail("not enough memory");
  } catch (const std::exception&) {
    // A library's own words would tell the user nothing.
    return Fail("internal error while running " + command);
  }
}
