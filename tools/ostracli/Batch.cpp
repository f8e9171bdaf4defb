//===- Batch.cpp - Many commands in one run ---------------------------------===//
//
// ostracli [GLOBAL OPTIONS] --batch FILE [--keep-going]
//
// Runs one command line per line of FILE ("-": standard input) in one process
// on one host. Blank lines and lines starting with "#" are skipped. Each
// command prints what it would print alone. The batch stops at the first line
// that fails unless --keep-going is given; the exit status is the worst of the
// lines. All changes of the batch are committed together, durably, when it
// ends: a failed line's own changes are undone, the others' are kept.
//
//===----------------------------------------------------------------------===//
#include "Host.h"

#include "HostCtl/Lib.h"
#include "HostCtl/Session.h"

#include <cstdio>
#include <cstdlib>
#include <fstream>
#include <iostream>
#include <string>

namespace Ostra {

bool SplitWords(const std::string& line, std::vector<std::string>& words) {
  words.clear();
  std::string word;
  bool inWord = false;
  for (std::size_t i = 0; i < line.size(); ++i) {
    char c = line[i];
    if (c == ' ' || c == '\t' || c == '\r') {
      if (inWord)
        words.push_back(word);
      word.clear();
      inWord = false;
    } else if (c == '\'') {
      std::size_t end = line.find('\'', i + 1);
      if (end == std::string::npos)
        return false;
      word += line.substr(i + 1, end - i - 1);
      inWord = true;
      i = end;
    } else if (c == '"') {
      inWord = true;
      for (++i;; ++i) {
        if (i >= line.size())
          return false;
        if (line[i] == '"')
          break;
        if (line[i] == '\\' && i + 1 < line.size() &&
            (line[i + 1] == '"' || line[i + 1] == '\\' || line[i + 1] == '$' || line[i + 1] == '`'))
          ++i;
        word += line[i];
      }
    } else if (c == '\\') {
      if (i + 1 < line.size())
        word += line[++i];
      inWord = true;
    } else {
      word += c;
      inWord = true;
    }
  }
  if (inWord)
    words.push_back(word);
  return true;
}

int RunBatch(const CommandTree& tree, const std::string& file,
             const std::vector<std::string>& defaults, bool keepGoing) {
  std::ifstream stream;
  std::istream* in = &std::cin;
  if (file != "-") {
    stream.open(file);
    if (!stream) {
      std::fprintf(stderr, "Error: cannot read the batch file %s\n", file.c_str());
      return ExitUsage;
    }
    in = &stream;
  }
  // The host is the one named in front of --batch (or the default); a line
  // cannot switch hosts.
  GlobalOptions global;
  std::string err;
  ParseGlobalOptions(defaults, global, err);
  if (!global.hostPath.empty()) {
    ::setenv("OSTRACLI_HOST", global.hostPath.c_str(), 1);
  }
  try {
    if (!global.hostPath.empty())
      HostCtl::Session::SetHost(global.hostPath);
    HostCtl::Session::BeginBatch();
  } catch (const HostCtl::Lib::HostCtlException& e) {
    std::fprintf(stderr, "%s\n", e.what());
    return ExitCommandError;
  }

  int worst = ExitOk;
  std::string line;
  for (long number = 1; std::getline(*in, line); ++number) {
    std::size_t start = line.find_first_not_of(" \t\r");
    if (start == std::string::npos || line[start] == '#')
      continue;
    std::vector<std::string> words;
    int status;
    std::string out;
    err.clear();
    if (!SplitWords(line, words)) {
      err = "Error: unterminated quote\n";
      status = ExitUsage;
    } else {
      if (!words.empty() && words[0] == "ostracli")
        words.erase(words.begin());
      bool switchesHost = false;
      for (const std::string& word : words) {
        if (word.empty() || word[0] != '-')
          break;
        switchesHost |= word == "--host" || word.rfind("--host=", 0) == 0;
      }
      if (switchesHost) {
        err = "Error: a line of a batch cannot name another host\n";
        status = ExitUsage;
      } else {
        words.insert(words.begin(), defaults.begin(), defaults.end());
        status = RunCommandLine(tree, words, out, err);
      }
    }
    std::fwrite(out.data(), 1, out.size(), stdout);
    std::fflush(stdout);
    std::fwrite(err.data(), 1, err.size(), stderr);
    worst = std::max(worst, status);
    if (status != ExitOk && !keepGoing) {
      std::fprintf(stderr, "Batch stopped at line %ld (exit status %d)\n", number, status);
      break;
    }
  }
  try {
    HostCtl::Session::EndBatch(true);
  } catch (const HostCtl::Lib::HostCtlException& e) {
    std::fprintf(stderr, "%s\nNo change of the batch was kept.\n", e.what());
    return ExitCommandError;
  }
  return worst;
}

} // namespace Ostra
