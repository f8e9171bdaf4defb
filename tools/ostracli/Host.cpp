//===- Host.cpp - The command host -----------------------------------------===//
//
// ostracli [GLOBAL OPTIONS] WORD... [COMMAND OPTIONS]
//
// The host resolves the words to a node of the command tree, checks the
// command options against the command's input specification (types,
// required parameters, enumerations, ranges, patterns) and only then runs the
// command. Anything the command lets escape is reported, never a crash.
//
//===----------------------------------------------------------------------===//
#include "Host.h"

#include "Fabrik/Format.h"
#include "FormatParams.h"
#include "Help.h"
#include "HostCtl/Lib.h"
#include "HostCtl/Session.h"
#include "Options.h"

#include <algorithm>
#include <cerrno>
#include <climits>
#include <csignal>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <dirent.h>
#include <dlfcn.h>
#include <ostream>
#include <sstream>
#include <stdexcept>
#include <streambuf>
#include <sys/stat.h>
#include <unistd.h>

#ifndef OSTRA_VERSION
#define OSTRA_VERSION "0.0.0"
#endif

extern "C" {
typedef void (*RegisterFn)(Fabrik::AutoCli::NamespaceNodePtr&);
typedef const char* (*VersionFn)();
}

namespace Ostra {

using namespace Fabrik;

namespace {

/// A stream buffer that appends to a string: formatters write the result
/// straight into the command's output text, without a buffer of their own and
/// a copy of it (a listing may be megabytes long).
class AppendBuffer final : public std::streambuf {
public:
  explicit AppendBuffer(std::string& text) : text_(text) {}

protected:
  int_type overflow(int_type c) override {
    if (!traits_type::eq_int_type(c, traits_type::eof()))
      text_ += traits_type::to_char_type(c);
    return traits_type::not_eof(c);
  }
  std::streamsize xsputn(const char* data, std::streamsize count) override {
    text_.append(data, static_cast<std::size_t>(count));
    return count;
  }

private:
  std::string& text_; ///< Destination.
};

/// A stream buffer that writes to a file in large pieces and remembers a
/// failed write (with its errno).
class FileBuffer final : public std::streambuf {
public:
  explicit FileBuffer(std::FILE* file) : file_(file) {}
  /// Writes what is buffered; false once a write failed.
  bool Flush() {
    if (!failed_ && !buffer_.empty() && file_ &&
        std::fwrite(buffer_.data(), 1, buffer_.size(), file_) != buffer_.size()) {
      failed_ = true;
      error_ = errno;
    }
    buffer_.clear();
    if (failed_)
      errno = error_;
    return !failed_;
  }

protected:
  int_type overflow(int_type c) override {
    if (!traits_type::eq_int_type(c, traits_type::eof())) {
      char byte = traits_type::to_char_type(c);
      xsputn(&byte, 1);
    }
    return traits_type::not_eof(c);
  }
  std::streamsize xsputn(const char* data, std::streamsize count) override {
    const auto size = static_cast<std::size_t>(count);
    if (buffer_.size() + size < kPiece) {
      buffer_.append(data, size);
      return count;
    }
    // A large piece goes to the file as it is, not through the buffer.
    if (Flush() && file_ && std::fwrite(data, 1, size, file_) != size) {
      failed_ = true;
      error_ = errno;
    }
    return count;
  }

private:
  static constexpr std::size_t kPiece = std::size_t{256} * 1024; ///< Bytes passed on at a time.
  std::FILE* file_;                                              ///< Destination.
  std::string buffer_;                                           ///< Bytes not yet written.
  bool failed_ = false;                                          ///< A write failed.
  int error_ = 0;                                                ///< errno of the failed write.
};

/// True for the result template of a command that changes the host: a
/// command whose result is a boolean is an action; every other command
/// reports what it reads. The walk of the whole tree in the registration
/// test keeps this true.
bool IsAction(const MetaObj::MetaObjectPtr& shape) {
  return shape && shape->GetType() == MetaObj::Boolean;
}

/// The element template of a result that is a list of structures: the rows
/// of such a result can stream. Null for any other result.
const MetaObj::MetaStruct* StreamedElement(const MetaObj::MetaObjectPtr& shape) {
  if (!shape || shape->GetType() != MetaObj::List)
    return nullptr;
  const auto& list = static_cast<const MetaObj::MetaList&>(*shape);
  const MetaObj::MetaObjectPtr& element = list.GetElementTemplate();
  if (list.GetElementType() != MetaObj::Struct || !element || element->GetType() != MetaObj::Struct)
    return nullptr;
  return static_cast<const MetaObj::MetaStruct*>(element.get());
}

std::string ExecutableDirectory() {
  char buffer[PATH_MAX];
  ssize_t length = ::readlink("/proc/self/exe", buffer, sizeof buffer - 1);
  if (length <= 0)
    return ".";
  buffer[length] = '\0';
  std::string path(buffer);
  std::size_t slash = path.find_last_of('/');
  return slash == std::string::npos ? "." : path.substr(0, slash);
}

/// The host state the run works on (SelectHost).
struct HostChoice {
  std::string path; ///< --host value (a database file, linux or netns:NAME); "" before SelectHost.
  bool isDefault = false; ///< The default host, created on first use.
  std::string problem;    ///< Why the host cannot be used (no backend serves it), or "".
};

HostChoice& Chosen() {
  static HostChoice choice;
  return choice;
}

/// Where the host state lives, for help texts.
std::string HostStateText() {
  const HostChoice& host = Chosen();
  if (host.path.empty())
    return HostCtl::Session::DefaultHostPath() + " (created from the demo profile on first use)";
  return host.path + (host.isDefault ? " (created from the demo profile on first use)" : "");
}

/// Reads a lock timeout in milliseconds; -1 when \p text is not one.
int ParseTimeout(const std::string& text) {
  if (text.empty() || text.size() > 7 || text.find_first_not_of("0123456789") != std::string::npos)
    return -1;
  return std::stoi(text);
}

/// Values echoed in messages are cut to this many characters.
constexpr std::size_t kEchoLimit = 64;

} // namespace

std::string HostProblem() {
  const HostChoice& host = Chosen();
  if (!host.problem.empty())
    return host.problem;
  if (host.path.empty() || host.isDefault || !HostCtl::Session::IsSimulatedHost(host.path))
    return "";
  struct stat st {};
  if (::stat(host.path.c_str(), &st) != 0 && errno == ENOENT)
    return "ostracli: no host state at " + host.path + " (create one with: ostrahost init " +
           host.path + ")\n";
  if (S_ISDIR(st.st_mode))
    return "ostracli: " + host.path + " is a directory, not a host state\n";
  if (::access(host.path.c_str(), R_OK) != 0)
    return "ostracli: cannot read the host state at " + host.path + ": " + std::strerror(errno) +
           "\n";
  return "";
}

void SelectHost(const std::string& path, bool isDefault) {
  Chosen() = {path, isDefault, ""};
  try {
    HostCtl::Session::SetHost(path, isDefault);
  } catch (const HostCtl::Lib::HostCtlException& e) {
    // Reported before anything runs (HostProblem); the session refuses every
    // operation on this host meanwhile.
    Chosen().problem = std::string("ostracli: ") + e.what() + "\n";
  }
}

bool ChangesHost(AutoCli::CommandSpec& command) {
  std::shared_ptr<CallSpec::OutputSpec> spec = command.GetOutputSpec();
  return IsAction(spec ? spec->GetRootObject() : nullptr);
}

std::string ShortenEchoes(std::string text, const std::vector<std::string>& words) {
  std::vector<const std::string*> longWords;
  for (const std::string& word : words)
    if (word.size() > kEchoLimit)
      longWords.push_back(&word);
  // The longest first, so that a word that holds another is shortened whole.
  std::sort(longWords.begin(), longWords.end(),
            [](const std::string* a, const std::string* b) { return a->size() > b->size(); });
  for (const std::string* word : longWords) {
    std::size_t cut = 0;
    for (std::size_t chars = 0; cut < word->size() && chars < kEchoLimit; ++chars) {
      ++cut;
      while (cut < word->size() && (static_cast<unsigned char>((*word)[cut]) & 0xC0) == 0x80)
        ++cut;
    }
    std::string shortened =
        word->substr(0, cut) + "\u2026 (" + std::to_string(word->size()) + " bytes)";
    for (std::size_t pos = text.find(*word); pos != std::string::npos;
         pos = text.find(*word, pos + shortened.size()))
      text.replace(pos, word->size(), shortened);
  }
  return text;
}

bool WriteAll(std::FILE* stream, const std::string& text) {
  errno = 0;
  if (!text.empty() && std::fwrite(text.data(), 1, text.size(), stream) != text.size())
    return false;
  if (std::fflush(stream) != 0 || std::ferror(stream))
    return false;
  return true;
}

std::string DefaultPluginDirectory() {
  if (const char* env = std::getenv("OSTRACLI_PLUGIN_DIR"); env && *env)
    return env;
  return ExecutableDirectory() + "/../lib/ostracli/plugins";
}

std::unique_ptr<CommandTree> CommandTree::Load(const std::string& directory) {
  auto tree = std::make_unique<CommandTree>(AutoCli::Namespace::New());
  DIR* dir = ::opendir(directory.c_str());
  if (!dir)
    throw std::runtime_error("cannot read the plug-in directory " + directory + ": " +
                             std::strerror(errno));
  std::vector<std::string> files;
  while (dirent* entry = ::readdir(dir)) {
    std::string name = entry->d_name;
    if (name.size() > 3 && name.compare(name.size() - 3, 3, ".so") == 0)
      files.push_back(directory + "/" + name);
  }
  ::closedir(dir);
  std::sort(files.begin(), files.end());
  for (const std::string& file : files) {
    void* handle = ::dlopen(file.c_str(), RTLD_LAZY | RTLD_LOCAL);
    if (!handle)
      throw std::runtime_error(std::string("cannot load the plug-in ") + ::dlerror());
    auto registerFn = reinterpret_cast<RegisterFn>(::dlsym(handle, "AutoCli_RegisterNamespaces"));
    if (!registerFn)
      throw std::runtime_error("the plug-in " + file +
                               " has no AutoCli_RegisterNamespaces entry point");
    Plugin plugin{file, ""};
    if (auto versionFn = reinterpret_cast<VersionFn>(::dlsym(handle, "AutoCli_PluginVersion")))
      plugin.version = versionFn();
    AutoCli::NamespaceNodePtr root = tree->root_;
    registerFn(root);
    tree->plugins_.push_back(std::move(plugin));
    // The plug-in stays loaded for the life of the process: its nodes live
    // in the tree.
  }
  return tree;
}

int ParseGlobalOptions(const std::vector<std::string>& args, GlobalOptions& options,
                       std::string& err) {
  std::size_t i = 0;
  auto value = [&](const std::string& name, std::string& into) -> bool {
    const std::string& arg = args[i];
    std::size_t eq = arg.find('=');
    if (eq != std::string::npos) {
      into = arg.substr(eq + 1);
      return true;
    }
    if (i + 1 >= args.size()) {
      err += "Error: option " + name + " requires a value\n";
      return false;
    }
    into = args[++i];
    return true;
  };
  for (; i < args.size(); ++i) {
    const std::string& arg = args[i];
    if (arg.empty() || arg[0] != '-')
      break;
    std::string name = arg.substr(0, arg.find('='));
    if (name == "--help" || name == "-h") {
      options.help = true;
    } else if (name == "--version") {
      options.version = true;
    } else if (name == "--keep-going") {
      options.keepGoing = true;
    } else if (name == "--atomic") {
      options.atomic = true;
    } else if (name == "--lock-timeout") {
      std::string text;
      if (!value(name, text))
        return -1;
      options.lockTimeoutMs = ParseTimeout(text);
      if (options.lockTimeoutMs < 0) {
        err += "Error: option --lock-timeout takes milliseconds from 0 to 9999999, got \"" + text +
               "\"\n";
        return -1;
      }
    } else if (name == "--reference") {
      options.reference = true;
    } else if (name == "--man") {
      options.reference = options.manual = true;
    } else if (name == "--complete") {
      options.complete = true;
      return static_cast<int>(i + 1);
    } else if (name == "--batch") {
      if (!value(name, options.batch))
        return -1;
      if (options.batch.empty()) {
        err += "Error: option --batch requires a file (- for standard input)\n";
        return -1;
      }
    } else if (name == "--formatter") {
      if (!value(name, options.formatter))
        return -1;
    } else if (name == "--host") {
      if (!value(name, options.hostPath))
        return -1;
      if (options.hostPath.empty()) {
        err += "Error: option --host requires a path\n";
        return -1;
      }
    } else if (name == "--format-param") {
      std::string pair;
      if (!value(name, pair))
        return -1;
      std::size_t eq = pair.find('=');
      if (eq == std::string::npos || eq == 0) {
        err += "Error: option --format-param expects KEY=VALUE, got \"" + pair + "\"\n";
        return -1;
      }
      options.params.emplace_back(pair.substr(0, eq), pair.substr(eq + 1));
    } else {
      err += "Error: unknown global option " + name +
             " (global options come before the command; see ostracli --help)\n";
      return -1;
    }
  }
  return static_cast<int>(i);
}

namespace {

int RunOne(const CommandTree& tree, const std::vector<std::string>& args, std::string& out,
           std::string& err, const RunMode& mode) {
  GlobalOptions global;
  int first = ParseGlobalOptions(args, global, err);
  if (first < 0)
    return ExitUsage;
  if (global.complete || global.reference || !global.batch.empty() || global.keepGoing ||
      (mode.inBatch && global.lockTimeoutMs >= 0)) {
    err += "Error: --batch, --keep-going, --lock-timeout, --complete and --reference are options "
           "of a whole ostracli run, not of one command\n";
    return ExitUsage;
  }
  if (mode.inBatch && !global.hostPath.empty()) {
    err += "Error: a line of a batch cannot name another host\n";
    return ExitUsage;
  }
  if (!global.formatter.empty() && !Format::MakeFormatter(global.formatter)) {
    std::string names;
    for (const std::string& name : Format::FormatterNames())
      names += (names.empty() ? "" : ", ") + name;
    err += "Error: unknown formatter \"" + global.formatter + "\" (one of: " + names + ")\n";
    return ExitUsage;
  }
  if (global.version) {
    out += "ostracli " OSTRA_VERSION "\n";
    for (const Plugin& plugin : tree.Plugins()) {
      std::string name = plugin.path.substr(plugin.path.find_last_of('/') + 1);
      out += (plugin.version.empty() ? name : plugin.version) + " (" + plugin.path + ")\n";
    }
    return ExitOk;
  }
  // Handed to the session each time (it keeps the host it serves already): a
  // process that runs several command lines may have reset it in between.
  if (!global.hostPath.empty())
    SelectHost(global.hostPath, false);

  // Resolve the command path: words up to the first option.
  std::vector<std::string> words;
  std::size_t i = static_cast<std::size_t>(first);
  for (; i < args.size() && !(args[i].size() > 1 && args[i][0] == '-'); ++i)
    words.push_back(args[i]);
  std::vector<std::string> rest(args.begin() + static_cast<long>(i), args.end());

  AutoCli::NamespaceNodePtr node = tree.Root();
  for (std::size_t w = 0; w < words.size(); ++w) {
    AutoCli::NamespaceNodePtr next =
        node->GetType() == AutoCli::NamespaceKind ? node->GetNamespaceNode(words[w]) : nullptr;
    if (!next) {
      err += UnknownWordMessage(*node, words[w]);
      return ExitUsage;
    }
    node = next;
  }

  // Help is text unless a formatter is asked for; then it is a typed value
  // that formatter prints.
  auto printHelp = [&](const MetaObj::MetaObjectPtr& help) {
    AppendBuffer buffer(out);
    std::ostream text(&buffer);
    Format::MakeFormatter(global.formatter)->Write(text, help, Format::Parameters());
  };
  const bool typedHelp = !global.formatter.empty();
  if (node->GetType() == AutoCli::NamespaceKind) {
    if (!rest.empty() && !global.help && !AsksForHelp(rest, nullptr)) {
      err += "Error: " + rest[0] + " is not a command; \"ostracli " + node->GetPathString(' ') +
             " --help\" lists the commands\n";
      return ExitUsage;
    }
    if (typedHelp)
      printHelp(NamespaceHelpValue(*node));
    else
      out += NamespaceHelpText(*node, HostStateText());
    return ExitOk;
  }

  auto command = std::dynamic_pointer_cast<AutoCli::Command>(node);
  if (!command) {
    err += "Error: " + node->GetPathString(' ') + " cannot be run\n";
    return ExitUsage;
  }
  // A command's options may come from the host (the congestion control
  // algorithms of a netstack): a host that cannot answer is one line, never
  // a crash of help or parsing.
  std::shared_ptr<CallSpec::InputSpec> inputSpec;
  try {
    inputSpec = command->GetInputSpec();
  } catch (const HostCtl::Lib::HostCtlException& e) {
    err += (mode.inBatch ? "" : "ostracli: ") + std::string(e.what()) + "\n";
    return ExitCommandError;
  }
  if (global.help || AsksForHelp(rest, inputSpec.get())) {
    if (typedHelp)
      printHelp(CommandHelpValue(*command, *inputSpec));
    else
      out += CommandHelpText(*command, *inputSpec);
    return ExitOk;
  }

  auto input = CallSpec::Input::New();
  std::string problem;
  if (!ParseCommandOptions(*inputSpec, rest, *input, problem) ||
      !(problem = CheckFormatParams(*command, tree.Root(), global.params)).empty()) {
    err += "Error: " + problem + "\n";
    return ExitUsage;
  }

  // The command runs in one transaction, taken before its first step: a
  // write one for a command that changes the host, so that it either waits
  // for the lock or changes nothing at all.
  if (!mode.inBatch) {
    if (std::string hostProblem = HostProblem(); !hostProblem.empty()) {
      err += hostProblem;
      return ExitCommandError;
    }
  }
  const std::shared_ptr<CallSpec::OutputSpec> outputSpec = command->GetOutputSpec();
  const MetaObj::MetaObjectPtr shape = outputSpec ? outputSpec->GetRootObject() : nullptr;
  try {
    HostCtl::Session::BeginCommand(IsAction(shape));
  } catch (const HostCtl::Lib::HostCtlException& e) {
    err += (mode.inBatch ? "" : "ostracli: ") + std::string(e.what()) + "\n";
    return ExitCommandError;
  }

  std::string formatterName = global.formatter;
  if (formatterName.empty())
    formatterName = command->GetDefaultOutputFormatter();
  std::unique_ptr<Format::Formatter> formatter = Format::MakeFormatter(formatterName);
  if (!formatter)
    formatter = Format::MakeFormatter("simple");
  Format::Parameters params;
  if (!formatter->IsMachineFormat())
    for (const auto& [key, value] : command->GetDefaultOutputParameters())
      params.Set(key, value);
  for (const auto& [key, value] : global.params)
    params.Set(key, value);
  // A listing is formatted row by row while it runs, and the rows are not
  // kept (MetaObj::StreamRows): its memory stays flat in the number of rows.
  std::unique_ptr<Format::ListWriter> stream;
  if (const MetaObj::MetaStruct* element = StreamedElement(shape)) {
    stream = formatter->StreamList(*element, params);
    MetaObj::StreamRows(element, stream.get());
  }

  auto output = CallSpec::Output::New();
  HostCtl::Session::ClearNotAvailable();
  try {
    command->Execute(input, output);
  } catch (const HostCtl::Lib::HostCtlException& e) {
    output->AddErrorMessage(e.what());
  } catch (const std::bad_alloc&) {
    output->AddErrorMessage("Not enough memory to run the command");
  } catch (const std::exception& e) {
    output->AddErrorMessage(std::string("Internal error: ") + e.what());
  } catch (...) {
    output->AddErrorMessage("Internal error: unknown exception");
  }
  MetaObj::StreamRows(nullptr, nullptr);
  // The rows of a streamed result are all formatted before the command's
  // transaction ends.
  const MetaObj::MetaObjectPtr& root = output->GetRootObject();
  auto* streamed = root && root->GetType() == MetaObj::List &&
                           static_cast<MetaObj::MetaList&>(*root).IsStreamed()
                       ? static_cast<MetaObj::MetaList*>(root.get())
                       : nullptr;
  if (streamed) {
    try {
      streamed->Flush();
    } catch (const std::exception& e) {
      output->AddErrorMessage(std::string("Internal error: ") + e.what());
      streamed = nullptr;
    }
  }
  // The steps a command completed before the host refused a later one stay,
  // as each command's documented order promises; --atomic and a batch line
  // keep nothing of a command that reported an error.
  const bool keep = !(output->HasError() && (mode.atomic || mode.inBatch));
  try {
    HostCtl::Session::EndCommand(keep);
  } catch (const HostCtl::Lib::HostCtlException& e) {
    for (const std::string& message : output->GetErrorMessages())
      err += message + "\n";
    err += std::string(e.what()) + "\n";
    return ExitCommandError;
  }

  int writeError = 0; // errno of a failed write of a streamed result.
  if (root && (streamed || !(root->GetType() == MetaObj::List &&
                             static_cast<MetaObj::MetaList&>(*root).IsStreamed()))) {
    // A long result goes straight to the output file where there is one,
    // after what the run wrote before it.
    const bool direct = mode.direct && streamed;
    FileBuffer file(mode.direct);
    AppendBuffer buffer(out);
    std::ostream text(direct ? static_cast<std::streambuf*>(&file) : &buffer);
    if (direct && !WriteAll(mode.direct, out)) {
      writeError = errno;
      out.clear();
      std::clearerr(mode.direct);
    } else {
      if (direct)
        out.clear();
      try {
        if (streamed)
          stream->Finish(text);
        else
          formatter->Write(text, root, params);
      } catch (const std::exception& e) {
        output->AddErrorMessage(std::string("Internal error: ") + e.what());
      }
      if (direct && (!file.Flush() || !WriteAll(mode.direct, ""))) {
        writeError = errno;
        // Reported here; the caller's last flush must not report it again.
        std::clearerr(mode.direct);
      }
    }
  }
  // A command that failed because the host lacks an operation it needs is
  // reported as one line naming the command, not as the operation's failure.
  std::string missing =
      output->HasError() ? HostCtl::Session::NotAvailableLine(command->GetPathString(' ')) : "";
  if (!missing.empty())
    err += missing + "\n";
  else
    for (const std::string& message : output->GetErrorMessages())
      err += message + "\n";
  if (writeError != 0) {
    // The command's changes, if any, are committed: only its report is lost.
    err =
        "ostracli: cannot write the output: " + std::string(std::strerror(writeError)) + "\n" + err;
    return ExitCommandError;
  }
  return output->HasError() ? ExitCommandError : ExitOk;
}

} // namespace

int RunCommandLine(const CommandTree& tree, const std::vector<std::string>& args, std::string& out,
                   std::string& err, const RunMode& mode) {
  std::string messages;
  int status = RunOne(tree, args, out, messages, mode);
  err += ShortenEchoes(std::move(messages), args);
  return status;
}

int RunHost(int argc, char** argv, std::unique_ptr<CommandTree>& tree) {
  std::vector<std::string> args(argv + 1, argv + argc);
  try {
    tree = CommandTree::Load(DefaultPluginDirectory());
  } catch (const std::exception& e) {
    std::fprintf(stderr, "Error: %s\n", e.what());
    return ExitCommandError;
  }
  // A first look at the global options finds the modes of the whole run;
  // RunCommandLine reads them again (and reports their errors) for a command.
  GlobalOptions global;
  std::string out, err, ignored;
  int first = ParseGlobalOptions(args, global, ignored);
  if (first >= 0 && global.complete) {
    out = Complete(*tree, std::vector<std::string>(args.begin() + first, args.end()));
    std::fwrite(out.data(), 1, out.size(), stdout);
    return ExitOk;
  }
  if (first >= 0 && (global.reference || global.manual)) {
    out = global.manual ? ManualPage(*tree) : Reference(*tree);
    std::fwrite(out.data(), 1, out.size(), stdout);
    return ExitOk;
  }
  // The environment is read here, once; the host library is handed the
  // settings.
  const char* hostEnv = std::getenv("OSTRACLI_HOST");
  if (first >= 0 && !global.hostPath.empty())
    SelectHost(global.hostPath, false);
  else if (hostEnv && *hostEnv)
    SelectHost(hostEnv, false);
  else
    SelectHost(HostCtl::Session::DefaultHostPath(), true);
  int timeout = global.lockTimeoutMs;
  for (const char* name : {"OSTRACLI_LOCK_TIMEOUT_MS", "OSTRACLI_BUSY_TIMEOUT_MS"}) {
    const char* env = std::getenv(name);
    if (timeout >= 0 || !env || !*env)
      continue;
    timeout = ParseTimeout(env);
    if (timeout < 0) {
      std::fprintf(stderr, "Error: %s takes milliseconds from 0 to 9999999, got \"%s\"\n", name,
                   env);
      return ExitUsage;
    }
  }
  if (timeout >= 0)
    HostCtl::Session::SetLockTimeout(timeout);

  // A host without transactions cannot undo a command: --atomic would
  // promise what it cannot keep.
  if (first >= 0 && global.atomic && HostProblem().empty()) {
    bool transactions = true;
    try {
      transactions = HostCtl::Session::HasTransactions();
    } catch (const HostCtl::Lib::HostCtlException&) {
    }
    if (!transactions) {
      std::fprintf(stderr,
                   "Error: --atomic needs a host with transactions; the host %s applies each "
                   "change as it is made\n",
                   Chosen().path.c_str());
      return ExitUsage;
    }
  }
  if (first >= 0 && !global.batch.empty()) {
    // The formatter options in front of --batch apply to every line.
    std::vector<std::string> defaults;
    if (!global.formatter.empty())
      defaults.insert(defaults.end(), {"--formatter", global.formatter});
    for (const auto& [key, value] : global.params)
      defaults.insert(defaults.end(), {"--format-param", key + "=" + value});
    if (static_cast<std::size_t>(first) < args.size()) {
      std::fprintf(stderr, "Error: --batch takes its commands from the file, not from the "
                           "command line\n");
      return ExitUsage;
    }
    return RunBatch(*tree, global.batch, defaults, global.keepGoing, global.atomic);
  }
  RunMode mode;
  mode.atomic = first >= 0 && global.atomic;
  mode.direct = stdout;
  int status = RunCommandLine(*tree, args, out, err, mode);
  if (!WriteAll(stdout, out)) {
    // The command's changes, if any, are committed: only its report is lost.
    std::fprintf(stderr, "ostracli: cannot write the output: %s\n", std::strerror(errno));
    WriteAll(stderr, err);
    return std::max(status, static_cast<int>(ExitCommandError));
  }
  WriteAll(stderr, err);
  return status;
}

} // namespace Ostra
