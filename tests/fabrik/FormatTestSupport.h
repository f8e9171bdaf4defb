//===- FormatTestSupport.h - Sample results for the formatter tests ---------===//
#pragma once

#include "Fabrik/Format.h"

#include <gtest/gtest.h>
#include <nlohmann/json.hpp>

#include <cstdio>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <initializer_list>
#include <optional>
#include <sstream>
#include <string>
#include <sys/wait.h>
#include <unistd.h>
#include <utility>
#include <vector>

namespace FormatTest {

using namespace Fabrik::MetaObj;
using Fabrik::Format::Parameters;

/// The text \p formatter writes for \p root with \p params.
inline std::string Render(const std::string& formatter, const MetaObjectPtr& root,
                          std::initializer_list<std::pair<std::string, std::string>> params = {}) {
  Parameters parameters;
  for (const auto& [key, value] : params)
    parameters.Set(key, value);
  auto writer = Fabrik::Format::MakeFormatter(formatter);
  EXPECT_NE(writer, nullptr) << formatter;
  if (!writer)
    return "";
  std::ostringstream out;
  writer->Write(out, root, parameters);
  return out.str();
}

/// The template of a switch: every field unset.
inline std::shared_ptr<MetaStruct> SwitchTemplate() {
  auto policy = MetaStruct::New("Policy");
  policy->SetField("Enabled", MetaBool::New());
  policy->SetField("Peak", MetaInt::New());
  auto ports = MetaList::New(Struct, MetaStruct::New("Port"));
  auto value = MetaStruct::New("VirtualSwitch");
  value->SetField("Name", MetaString::New());
  value->SetField("MTU", MetaInt::New());
  value->SetField("Uplinks", MetaList::New(String));
  value->SetField("Policy", policy);
  value->SetField("Ports", ports);
  value->SetField("Notes", MetaString::New());
  return value;
}

/// A filled switch with \p portIds ports; "Notes" stays unset.
inline std::shared_ptr<MetaStruct> Switch(const std::string& name, long mtu,
                                          const std::vector<std::string>& uplinks,
                                          const std::vector<long>& portIds) {
  auto value = std::static_pointer_cast<MetaStruct>(SwitchTemplate()->Clone());
  value->SetField("Name", name);
  value->SetField("MTU", mtu);
  value->SetField("Uplinks", uplinks);
  auto policy = std::static_pointer_cast<MetaStruct>(value->GetField("Policy")->GetObject());
  policy->SetField("Enabled", true);
  policy->SetField("Peak", 100L);
  auto ports = std::static_pointer_cast<MetaList>(value->GetField("Ports")->GetObject());
  for (long id : portIds) {
    auto port = MetaStruct::New("Port");
    port->SetField("Port ID", id);
    port->SetField("In Use", id % 2 == 1);
    ports->Add(port);
  }
  return value;
}

/// A list of the two sample switches.
inline std::shared_ptr<MetaList> TwoSwitches() {
  auto list = MetaList::New(Struct, SwitchTemplate());
  list->Add(Switch("vSwitch0", 1500, {"vmnic0", "vmnic1"}, {1, 2}));
  list->Add(Switch("vSwitch1", 9000, {}, {}));
  return list;
}

/// NICs nested several levels deep: a driver structure holding a firmware
/// structure with a list of strings, and a list of queues whose filters hold
/// lists of strings. The second NIC has empty lists and unset fields.
inline std::shared_ptr<MetaList> Nics() {
  auto firmware = MetaStruct::New("Firmware");
  firmware->SetField("Version", MetaString::New());
  firmware->SetField("Features", MetaList::New(String));
  auto driver = MetaStruct::New("Driver");
  driver->SetField("Name", MetaString::New());
  driver->SetField("Firmware", firmware);
  auto filter = MetaStruct::New("Filter");
  filter->SetField("Class", MetaString::New());
  filter->SetField("MACs", MetaList::New(String));
  auto queue = MetaStruct::New("Queue");
  queue->SetField("Queue ID", MetaInt::New());
  queue->SetField("Filters", MetaList::New(Struct, filter));
  auto nic = MetaStruct::New("Nic");
  nic->SetField("Name", MetaString::New());
  nic->SetField("Speed", MetaInt::New());
  nic->SetField("Link Up", MetaBool::New());
  nic->SetField("Uplinks", MetaList::New(String));
  nic->SetField("Driver", driver);
  nic->SetField("Queues", MetaList::New(Struct, queue));
  nic->SetField("Description", MetaString::New());

  auto list = MetaList::New(Struct, nic);
  auto first = std::static_pointer_cast<MetaStruct>(nic->Clone());
  first->SetField("Name", "vmnic0");
  first->SetField("Speed", 25000L);
  first->SetField("Link Up", true);
  first->SetField("Uplinks", std::vector<std::string>{"vmnic0", "vmnic1"});
  auto firstDriver = std::static_pointer_cast<MetaStruct>(first->GetField("Driver")->GetObject());
  firstDriver->SetField("Name", "nfx");
  auto firstFirmware =
      std::static_pointer_cast<MetaStruct>(firstDriver->GetField("Firmware")->GetObject());
  firstFirmware->SetField("Version", "2.1");
  firstFirmware->SetField("Features", std::vector<std::string>{"tso", "rss"});
  auto firstQueue = std::static_pointer_cast<MetaStruct>(queue->Clone());
  firstQueue->SetField("Queue ID", 0L);
  auto firstFilter = std::static_pointer_cast<MetaStruct>(filter->Clone());
  firstFilter->SetField("Class", "mac");
  firstFilter->SetField("MACs", std::vector<std::string>{"00:50:56:00:00:01"});
  std::static_pointer_cast<MetaList>(firstQueue->GetField("Filters")->GetObject())
      ->Add(firstFilter);
  std::static_pointer_cast<MetaList>(first->GetField("Queues")->GetObject())->Add(firstQueue);
  first->SetField("Description", "Dual port, \"25G\"");
  list->Add(first);

  auto second = std::static_pointer_cast<MetaStruct>(nic->Clone());
  second->SetField("Name", "vmnic1");
  second->SetField("Speed", -1L);
  second->SetField("Link Up", false);
  list->Add(second);
  return list;
}

/// Strings that every format must carry unchanged: its own delimiters, line
/// breaks, blanks at both ends, markup and non-ASCII text.
inline std::shared_ptr<MetaStruct> AwkwardText() {
  auto value = MetaStruct::New("Text");
  value->SetField("Comma, \"Quote\"", "a,b \"c\" d");
  value->SetField("Lines", "one\r\ntwo\nthree\rfour");
  value->SetField("Return", "a\rb");
  value->SetField("Blanks", "  padded\t ");
  value->SetField("Markup", "<a href=\"x\">&amp;</a> ]]>");
  value->SetField("Key=Value", "x=y.z[0]\\n\\");
  value->SetField("Empty", "");
  value->SetField("Unicode", "Z\xC3\xBCrich \xE2\x82\xAC \xF0\x9F\x98\x80");
  value->SetField("List", std::vector<std::string>{"", "a,b", "c\nd"});
  return value;
}

/// One result of every shape the commands produce, by name: scalars, lists of
/// strings (empty too), a structure, lists of structures nested several
/// levels, and awkward strings.
inline std::vector<std::pair<std::string, MetaObjectPtr>> Samples() {
  auto strings = MetaList::New(String);
  strings->AddAll(std::vector<std::string>{"vmnic0", "", "a,b"});
  return {
      {"boolean", MetaBool::New(false)},
      {"integer", MetaInt::New(-9000)},
      {"string", MetaString::New("a \"b\"\nc")},
      {"string list", strings},
      {"empty string list", MetaList::New(String)},
      {"structure", Switch("vSwitch0", 1500, {"vmnic0"}, {1})},
      {"structure list", TwoSwitches()},
      {"empty structure list", MetaList::New(Struct, SwitchTemplate())},
      {"nested structures", Nics()},
      {"awkward strings", AwkwardText()},
  };
}

/// The values \p value holds as JSON, in field order: unset fields are left
/// out, an unset item of a list is null. Independent of the formatters.
inline nlohmann::ordered_json Expected(const Fabrik::MetaObj::MetaValue& value) {
  if (!value.IsShown())
    return nullptr;
  switch (value.GetType()) {
  case Boolean:
    return value.GetBool();
  case Integer:
    return value.GetInt();
  case String:
    return value.GetString();
  case List: {
    auto array = nlohmann::ordered_json::array();
    for (const Fabrik::MetaObj::MetaValue& item : value.AsList().GetItems())
      array.push_back(Expected(item));
    return array;
  }
  case Struct: {
    auto object = nlohmann::ordered_json::object();
    const MetaStruct& structure = value.AsStruct();
    for (std::size_t i = 0; i < structure.GetFieldCount(); ++i) {
      if (structure.GetFieldValue(i).IsShown())
        object[structure.GetFieldName(i)] = Expected(structure.GetFieldValue(i));
    }
    return object;
  }
  }
  return nullptr;
}

inline nlohmann::ordered_json Expected(const MetaObjectPtr& value) {
  return Expected(Fabrik::MetaObj::MetaValue(value));
}

/// What a helper program printed and how it ended.
struct ToolResult {
  int status = -1;    ///< Exit status; -1 when it did not exit normally.
  std::string output; ///< Its standard output.
};

/// Runs \p command through the shell with \p input on its standard input.
inline ToolResult RunTool(const std::string& command, const std::string& input) {
  std::string path = (std::filesystem::temp_directory_path() / "fabrik-format-XXXXXX").string();
  const int fd = mkstemp(path.data());
  EXPECT_GE(fd, 0);
  if (fd < 0)
    return {};
  close(fd);
  std::ofstream(path, std::ios::binary) << input;
  ToolResult result;
  if (FILE* pipe = popen((command + " < '" + path + "'").c_str(), "r")) {
    char buffer[4096];
    std::size_t count = 0;
    while ((count = std::fread(buffer, 1, sizeof buffer, pipe)) > 0)
      result.output.append(buffer, count);
    const int status = pclose(pipe);
    if (status != -1 && WIFEXITED(status))
      result.status = WEXITSTATUS(status);
  }
  std::filesystem::remove(path);
  return result;
}

/// True when \p program is an executable file.
inline bool HaveProgram(const char* program) {
  return access(program, X_OK) == 0;
}

/// True when python3 can be run.
inline bool HavePython() {
  return RunTool("command -v python3 >/dev/null", "").status == 0;
}

/// What the Python reader of machine formats (read_machine_format.py) reads
/// from each of \p documents in \p format, or null when it fails; \p message
/// then holds its complaint. The caller skips its test when HavePython() is
/// false.
inline std::optional<nlohmann::ordered_json>
ReadWithPython(const std::string& format, const std::vector<std::string>& documents,
               std::string& message) {
  ToolResult result = RunTool(std::string("python3 '") + FABRIK_TEST_SOURCE_DIR +
                                  "/read_machine_format.py' " + format + " 2>&1",
                              nlohmann::ordered_json(documents).dump());
  if (result.status != 0) {
    message = result.output;
    return std::nullopt;
  }
  return nlohmann::ordered_json::parse(result.output);
}

} // namespace FormatTest
