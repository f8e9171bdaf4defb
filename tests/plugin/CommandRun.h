//===- CommandRun.h - Commands run in-process against a scratch host ------===//
//
// On a ScratchHost (support/ScratchHost.h), RunCommand executes a command
// object with the given parameters and gives back its errors and its result
// in the JSON form the json formatter prints, so that a test compares values
// and field order without reading the meta objects by hand.
//
//===----------------------------------------------------------------------===//
#pragma once

#include "Fabrik/AutoCli.h"
#include "Fabrik/Call.h"
#include "Fabrik/Format.h"

#include "../support/ScratchHost.h"

#include <nlohmann/json.hpp>

#include <sstream>
#include <string>
#include <variant>
#include <vector>

namespace PluginTest {

using TestSupport::ScratchHost;

/// One parameter of a run: a string, an integer, a boolean, or a flag.
struct Flag {};
using Value = std::variant<std::string, long, bool, Flag>;
using Params = std::vector<std::pair<std::string, Value>>;

/// What a command left in its output.
struct Result {
  std::vector<std::string> errors; ///< Error messages, in order.
  nlohmann::ordered_json root;     ///< The result as json prints it; null when none was set.
};

/// Runs \p command with \p params.
inline Result RunCommand(Fabrik::AutoCli::Command& command, const Params& params = {}) {
  auto input = Fabrik::CallSpec::Input::New();
  for (const auto& [name, value] : params) {
    if (const auto* text = std::get_if<std::string>(&value))
      input->SetString(name, *text);
    else if (const auto* number = std::get_if<long>(&value))
      input->SetInt(name, *number);
    else if (const auto* flag = std::get_if<bool>(&value))
      input->SetBool(name, *flag);
    else
      input->SetFlag(name);
  }
  auto output = Fabrik::CallSpec::Output::New();
  command.Execute(input, output);
  Result result;
  result.errors = output->GetErrorMessages();
  if (output->GetRootObject()) {
    std::ostringstream text;
    Fabrik::Format::MakeFormatter("json")->Write(text, output->GetRootObject(), {});
    result.root = nlohmann::ordered_json::parse(text.str());
  }
  return result;
}

/// The keys of \p object, in order.
inline std::vector<std::string> Keys(const nlohmann::ordered_json& object) {
  std::vector<std::string> keys;
  for (const auto& item : object.items())
    keys.push_back(item.key());
  return keys;
}

} // namespace PluginTest
