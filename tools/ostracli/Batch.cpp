//===- Batch.cpp - Many commands in one run ---------------------------------===//
//
// ostracli [GLOBAL OPTIONS] --batch FILE [--keep-going]
//
// Runs one command line per line of FILE ("-": standard input) in one process
// on one host. Blank lines and lines starting with "#" are skipped. Each
// command prints what it would print alone. The batch stops at the first line
// that fails unless --keep-going is given; the exit status is the worst of the
// lines. Messages name their line ("ostracli: FILE:N: ..."), and a summary
// line counts the lines applied and failed. All changes of the batch are
// committed together, durably, when it ends: each line is a savepoint, so a
// failed line is undone whole while the others are kept (with --atomic,
// nothing is kept unless every line succeeded). A batch whose transaction is
// lost, or whose output cannot be written, stops at once and keeps nothing.
//
//===----------------------------------------------------------------------===//
#include "Host.h"

#include "HostCtl/Lib.h"
#include "HostCtl/Session.h"

#include <algorithm>
#include <cerrno>
#include <csignal>
#include <cstdio>
#include <cstring>
#include <string>
#include <sys/stat.h>

namespace Ostra {

bool SplitWords(const std::string& line, std::vector<std::string>& words) {
  // The strings of \p words are reused from line to line: a batch of
  // thousands of lines allocates for its words once.
  std::size_t count = 0;
  std::string* word = nullptr;
  auto startWord = [&]() {
    if (word)
      return;
    if (count == words.size())
      words.emplace_back();
    word = &words[count++];
    word->clear();
  };
  const std::size_t size = line.size();
  for (std::size_t i = 0; i < size; ++i) {
    const char c = line[i];
    if (c == ' ' || c == '\t' || c == '\r') {
      word = nullptr;
    } else if (c == '\'') {
      std::size_t end = line.find('\'', i + 1);
      if (end == std::string::npos)
        return false;
      startWord();
      word->append(line, i + 1, end - i - 1);
      i = end;
    } else if (c == '"') {
      startWord();
      for (++i;; ++i) {
        if (i >= size)
          return false;
        if (line[i] == '"')
          break;
        if (line[i] == '\\' && i + 1 < size &&
            (line[i + 1] == '"' || line[i + 1] == '\\' || line[i + 1] == '$' || line[i + 1] == '`'))
          ++i;
        *word += line[i];
      }
    } else if (c == '\\') {
      startWord();
      if (i + 1 < size)
        *word += line[++i];
    } else {
      // A run of plain characters at once.
      std::size_t end = i + 1;
      while (end < size && line[end] != ' ' && line[end] != '\t' && line[end] != '\r' &&
             line[end] != '\'' && line[end] != '"' && line[end] != '\\')
        ++end;
      startWord();
      word->append(line, i, end - i);
      i = end - 1;
    }
  }
  words.resize(count);
  return true;
}

namespace {

/// Reads the batch: a file, a FIFO or standard input, never a directory.
class BatchInput {
public:
  /// Opens \p file; "" on success, else the refusal.
  std::string Open(const std::string& file) {
    if (file == "-") {
      stream_ = stdin;
      return "";
    }
    stream_ = std::fopen(file.c_str(), "r");
    if (!stream_)
      return "Error: cannot read the batch file " + file + ": " + std::strerror(errno) + "\n";
    owned_ = true;
    struct stat st {};
    if (::fstat(::fileno(stream_), &st) == 0 && S_ISDIR(st.st_mode))
      return "Error: the batch file " + file + " is a directory\n";
    return "";
  }
  ~BatchInput() {
    if (owned_)
      std::fclose(stream_);
  }
  /// The next line without its line end; false at the end or on a read
  /// error (Failed() tells which).
  bool Next(std::string& line) {
    line.clear();
    int c;
    while ((c = std::getc(stream_)) != EOF) {
      if (c == '\n')
        return true;
      line += static_cast<char>(c);
    }
    return !line.empty() && !std::ferror(stream_);
  }
  bool Failed() const { return std::ferror(stream_) != 0; }

private:
  std::FILE* stream_ = nullptr; ///< The batch.
  bool owned_ = false;          ///< Opened here.
};

/// Bytes of results a batch gathers before it writes them.
constexpr std::size_t kOutputPiece = 64 * 1024;

/// "ostracli: FILE:N: " in front of every line of \p messages.
std::string NameLine(const std::string& messages, const std::string& where) {
  std::string named;
  for (std::size_t pos = 0; pos < messages.size();) {
    std::size_t end = messages.find('\n', pos);
    if (end == std::string::npos)
      end = messages.size();
    named += where + messages.substr(pos, end - pos) + "\n";
    pos = end + 1;
  }
  return named;
}

} // namespace

int RunBatch(const CommandTree& tree, const std::string& file,
             const std::vector<std::string>& defaults, bool keepGoing, bool atomic) {
  BatchInput input;
  if (std::string problem = input.Open(file); !problem.empty()) {
    std::fputs(problem.c_str(), stderr);
    return ExitUsage;
  }
  // A reader that goes away (a batch piped into head) must not end the
  // process halfway through: the failed write stops the batch instead, and
  // nothing of it is kept.
  std::signal(SIGPIPE, SIG_IGN);
  const std::string name = file == "-" ? "-" : file;
  if (std::string problem = HostProblem(); !problem.empty()) {
    std::fputs(problem.c_str(), stderr);
    return ExitCommandError;
  }
  try {
    HostCtl::Session::BeginBatch();
  } catch (const HostCtl::Lib::HostCtlException& e) {
    std::fprintf(stderr, "ostracli: %s\n", e.what());
    return ExitCommandError;
  }

  RunMode mode;
  mode.inBatch = true;
  int worst = ExitOk;
  long applied = 0, failed = 0, stoppedAt = 0;
  std::string fatal; // Why the batch cannot be kept, or "".
  std::string line;
  std::vector<std::string> words;
  std::string out, err;
  // The lines' results are passed on in large pieces, and before anything
  // goes to standard error, so that the two keep their order. A write that
  // fails stops the batch before it is kept.
  std::string pending;
  auto flush = [&]() {
    bool written = WriteAll(stdout, pending);
    pending.clear();
    return written;
  };
  for (long number = 1; input.Next(line); ++number) {
    std::size_t start = line.find_first_not_of(" \t\r");
    if (start == std::string::npos || line[start] == '#')
      continue;
    int status;
    out.clear();
    err.clear();
    if (line.find('\0') != std::string::npos) {
      err = "Error: the line holds a NUL byte\n";
      status = ExitUsage;
    } else if (!SplitWords(line, words)) {
      err = "Error: unterminated quote\n";
      status = ExitUsage;
    } else {
      if (!words.empty() && words[0] == "ostracli")
        words.erase(words.begin());
      words.insert(words.begin(), defaults.begin(), defaults.end());
      status = RunCommandLine(tree, words, out, err, mode);
    }
    pending += out;
    if ((pending.size() >= kOutputPiece || !err.empty()) && !flush()) {
      fatal = "cannot write the output: " + std::string(std::strerror(errno));
      stoppedAt = number;
      break;
    }
    if (!err.empty())
      WriteAll(stderr, NameLine(err, "ostracli: " + name + ":" + std::to_string(number) + ": "));
    worst = std::max(worst, status);
    (status == ExitOk ? applied : failed) += 1;
    if (HostCtl::Session::BatchLost()) {
      fatal = "the batch's transaction was lost";
      stoppedAt = number;
      break;
    }
    if (status != ExitOk && !keepGoing) {
      stoppedAt = number;
      break;
    }
  }
  if (fatal.empty() && !flush())
    fatal = "cannot write the output: " + std::string(std::strerror(errno));
  if (fatal.empty() && input.Failed()) {
    fatal = "cannot read the batch: " + std::string(std::strerror(errno));
    worst = std::max(worst, static_cast<int>(ExitUsage));
  }
  bool kept = fatal.empty() && !(atomic && failed > 0);
  try {
    HostCtl::Session::EndBatch(kept);
  } catch (const HostCtl::Lib::HostCtlException& e) {
    if (fatal.empty())
      fatal = e.what();
    kept = false;
  }
  std::string summary = "ostracli: " + name + ": " + std::to_string(applied) +
                        (applied == 1 ? " line" : " lines") + " applied, " +
                        std::to_string(failed) + " failed";
  if (stoppedAt > 0)
    summary += "; stopped at line " + std::to_string(stoppedAt);
  if (!fatal.empty())
    summary += "; " + fatal;
  if (!kept)
    summary += "; no change of the batch was kept";
  // A host without transactions (the Linux kernel) applies a batch line by
  // line; its summary always says so.
  bool lineByLine = false;
  try {
    lineByLine = !HostCtl::Session::HasTransactions();
  } catch (const HostCtl::Lib::HostCtlException&) {
  }
  if (lineByLine)
    summary += "; applied line by line: the host has no transactions";
  // A batch that applied every line is as quiet as each line was.
  if (failed > 0 || !kept || lineByLine)
    WriteAll(stderr, summary + "\n");
  if (!fatal.empty())
    worst = std::max(worst, static_cast<int>(ExitCommandError));
  return worst;
}

} // namespace Ostra
