//===- FormatTestSupport.h - Sample results for the formatter tests ---------===//
#pragma once

#include "Fabrik/Format.h"

#include <gtest/gtest.h>

#include <initializer_list>
#include <sstream>
#include <string>
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
  auto policy = std::static_pointer_cast<MetaStruct>(*value->GetField("Policy"));
  policy->SetField("Enabled", true);
  policy->SetField("Peak", 100L);
  auto ports = std::static_pointer_cast<MetaList>(*value->GetField("Ports"));
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

} // namespace FormatTest
