//===- linux/host/State.cpp - Names the kernel cannot hold -----------------===//
#include "State.h"

#include "Host.h"
#include "LinuxNet/Files.h"

#include <sstream>

namespace LinuxHost {

namespace {

std::vector<StateRecord> Parse(const std::string& text) {
  std::vector<StateRecord> records;
  std::istringstream lines(text);
  for (std::string line; std::getline(lines, line);) {
    if (line.empty() || line[0] == '#')
      continue;
    StateRecord record;
    std::size_t start = 0;
    for (;;) {
      std::size_t tab = line.find('\t', start);
      std::string field = line.substr(start, tab == std::string::npos ? tab : tab - start);
      if (record.kind.empty())
        record.kind = field;
      else
        record.fields.push_back(field);
      if (tab == std::string::npos)
        break;
      start = tab + 1;
    }
    records.push_back(std::move(record));
  }
  return records;
}

std::string Format(const std::vector<StateRecord>& records) {
  std::string text = "# Kept by ostracli: names a Linux kernel cannot hold.\n";
  for (const StateRecord& record : records) {
    text += record.kind;
    for (const std::string& field : record.fields)
      text += "\t" + field;
    text += "\n";
  }
  return text;
}

} // namespace

std::string StatePath(const std::string& netns) {
  return netns.empty() ? "/etc/ostracli/linux-state" : "/etc/netns/" + netns + "/ostracli-state";
}

std::vector<StateRecord> ReadState(const std::string& path) {
  return Parse(Kernel([&] { return LinuxNet::ReadTextFile(path); }));
}

void UpdateState(const std::string& path,
                 const std::function<void(std::vector<StateRecord>&)>& edit) {
  Kernel([&] {
    LinuxNet::UpdateTextFile(path, [&](const std::string& text) {
      std::vector<StateRecord> records = Parse(text);
      edit(records);
      std::string result = Format(records);
      // An untouched file stays as it is (or missing).
      return Parse(text).size() == records.size() && Format(Parse(text)) == result ? text : result;
    });
  });
}

bool IsStateField(const std::string& text) {
  return !text.empty() && text.find_first_of("\t\r\n") == std::string::npos;
}

} // namespace LinuxHost
