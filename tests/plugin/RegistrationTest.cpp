//===- RegistrationTest.cpp - The registered network command tree ---------===//
//
// Registers the plug-in on a fresh root and checks what the generated
// reference (docs/reference.md, compared by the reference-docs test) cannot
// show: how many namespaces, registrations and classes the tree has, that
// every command class declared in include/ is reachable, that no name is
// registered twice under one namespace, that each node knows its place, that
// the default output settings name structures and fields the result has, and
// that every command that changes the host, and only those, run in a write
// transaction. The texts themselves are the reference's to guard.
//
//===----------------------------------------------------------------------===//
#include "Host.h"
#include "entry/Register.h"

#include "ip.h"

#include <gtest/gtest.h>

#include <cxxabi.h>

#include <cstdlib>
#include <fstream>
#include <map>
#include <memory>
#include <regex>
#include <set>
#include <sstream>
#include <string>
#include <typeindex>
#include <typeinfo>
#include <vector>

namespace {

using namespace CorvexCli::NetworkNamespace;
using Fabrik::AutoCli::CommandSpec;
using Fabrik::AutoCli::NamespaceNodePtr;
using Fabrik::MetaObj::MetaList;
using Fabrik::MetaObj::MetaObjectPtr;
using Fabrik::MetaObj::MetaStruct;

/// Default output parameters that name a structure or field the result does not
/// have. They are the documented settings, kept as they stand.
const std::set<std::pair<std::string, std::string>> KnownUnmatchedParameters = {
    {"network ip interface tag get", "fields:IntefaceTag"},
    {"network multicast group list", "fields:Interface"},
    {"network sriovnic vf stats", "header:VF"},
    {"network sriovnic vf stats", "fields:VFStats"},
    {"network vswitch dvs corvex lacp stats get", "fields:LACP"},
    {"network vswitch dvs corvex lacp status get", "table-columns:LAG"},
};

/// Commands whose last word is no "get" or "list" although they only read:
/// they print what the NIC holds or reports.
const std::set<std::string> ReadingVerbExceptions = {
    "network nic eeprom dump",
    "network nic register dump",
    "network nic selftest run",
    "network sriovnic vf stats",
};

std::vector<std::string> Split(const std::string& text, char separator) {
  std::vector<std::string> parts;
  std::istringstream stream(text);
  for (std::string part; std::getline(stream, part, separator);)
    parts.push_back(part);
  return parts;
}

/// The class name of \p object without its namespaces.
std::string ClassName(const CommandSpec& object) {
  int status = 0;
  char* demangled = abi::__cxa_demangle(typeid(object).name(), nullptr, nullptr, &status);
  std::string name = status == 0 ? demangled : typeid(object).name();
  std::free(demangled);
  return name.substr(name.rfind(':') + 1);
}

/// The command classes declared in the plug-in's headers (CORVEX_COMMAND).
std::set<std::string> DeclaredClasses() {
  std::set<std::string> classes;
  const std::regex declaration(R"(^\s*CORVEX_COMMAND\((\w+)\))");
  for (const char* header : {"datapath.h", "firewall.h", "ip.h", "nic.h", "vswitch.h"}) {
    std::ifstream in(std::string(OSTRA_SOURCE_DIR "/include/") + header);
    EXPECT_TRUE(in.good()) << header;
    std::smatch match;
    for (std::string line; std::getline(in, line);)
      if (std::regex_search(line, match, declaration))
        classes.insert(match[1]);
  }
  return classes;
}

/// The field names of every structure in a result template, by structure name.
using StructureFields = std::map<std::string, std::set<std::string>>;

void CollectStructures(const MetaObjectPtr& value, StructureFields& out) {
  if (auto structure = std::dynamic_pointer_cast<MetaStruct>(value)) {
    auto& fields = out[structure->GetName()];
    for (std::size_t i = 0; i < structure->GetFieldCount(); ++i) {
      fields.insert(structure->GetFieldName(i));
      CollectStructures(structure->GetFieldValue(i).GetObject(), out);
    }
  } else if (auto list = std::dynamic_pointer_cast<MetaList>(value)) {
    if (list->GetElementTemplate())
      CollectStructures(list->GetElementTemplate(), out);
  }
}

/// The fields a default output parameter names, and the structure it names in
/// \p target (\p target holds the result's own structure when the key names
/// none). False for a key no formatter reads.
bool NamedFields(const std::string& key, const std::string& value, std::string& target,
                 std::vector<std::string>& fields) {
  std::size_t colon = key.find(':');
  std::string kind = key.substr(0, colon);
  if (colon != std::string::npos)
    target = key.substr(colon + 1);
  if (kind == "fields" || kind == "table-columns") {
    fields = Split(value, ',');
  } else if (kind == "header") {
    std::vector<std::string> pieces = Split(value, '%');
    for (std::size_t i = 1; i < pieces.size(); i += 2)
      fields.push_back(pieces[i]);
  } else if (kind == "units") {
    std::size_t dot = target.find('.');
    if (dot == std::string::npos)
      return false;
    fields.push_back(target.substr(dot + 1));
    target = target.substr(0, dot);
  } else {
    return false;
  }
  return true;
}

/// The tree that AutoCli_RegisterNamespaces builds on a fresh root, with every
/// node below it indexed by path and every command in the order walked.
class RegistrationTest : public ::testing::Test {
protected:
  void SetUp() override {
    root = Fabrik::AutoCli::Namespace::New();
    AutoCli_RegisterNamespaces(root);
    ASSERT_EQ(root->GetNamespaceNodeNames(), std::vector<std::string>{"network"});
    Walk(root->GetNamespaceNode("network"), "network");
  }

  void Walk(const NamespaceNodePtr& node, const std::string& path) {
    ASSERT_NE(node, nullptr) << path;
    ++registrations[path];
    nodes[path] = node;
    if (node->GetType() == Fabrik::AutoCli::NamespaceKind)
      ++namespaceCount;
    else if (auto command = std::dynamic_pointer_cast<CommandSpec>(node))
      commands.push_back({path, command});
    for (const std::string& name : node->GetNamespaceNodeNames())
      Walk(node->GetNamespaceNode(name), path + " " + name);
  }

  struct Registered {
    std::string path;                     ///< Words from "network".
    std::shared_ptr<CommandSpec> command; ///< The registered object.
  };

  NamespaceNodePtr root;                         ///< The host's root.
  std::map<std::string, NamespaceNodePtr> nodes; ///< Every node below it, by path.
  std::map<std::string, int> registrations;      ///< Times each path was reached.
  std::vector<Registered> commands;              ///< Every command node, in walk order.
  std::size_t namespaceCount = 0;                ///< Namespace nodes found.
};

TEST_F(RegistrationTest, TreeHasEveryNamespaceRegistrationAndClassOnce) {
  EXPECT_EQ(namespaceCount, 91u);
  EXPECT_EQ(commands.size(), 152u);
  for (const auto& [path, count] : registrations)
    EXPECT_EQ(count, 1) << path << " is registered more than once";

  // Each node sits where its path says, below the parent it names.
  for (const auto& [path, node] : nodes) {
    EXPECT_EQ(node->GetPathString(' '), path);
    const std::string parent = path.substr(0, path.rfind(' '));
    EXPECT_EQ(node->GetParent(), parent == path ? root : nodes.at(parent)) << path;
  }

  // Every class declared in include/ is registered, and nothing else is.
  std::set<std::string> registered;
  for (const Registered& entry : commands) {
    EXPECT_EQ(entry.command->GetType(), Fabrik::AutoCli::CommandKind) << entry.path;
    EXPECT_EQ(entry.command->GetThis(), entry.command) << entry.path << ": New() left no self";
    registered.insert(ClassName(*entry.command));
  }
  EXPECT_EQ(registered.size(), 151u);
  const std::set<std::string> declared = DeclaredClasses();
  EXPECT_EQ(declared.size(), 151u);
  for (const std::string& name : declared)
    EXPECT_EQ(registered.count(name), 1u) << name << " is declared but not registered";
  for (const std::string& name : registered)
    EXPECT_EQ(declared.count(name), 1u) << name << " is registered but not declared in include/";
}

// The one class registered twice is two objects, one per place in the tree.
TEST_F(RegistrationTest, Ipv4GetIsTwoObjectsOfOneClass) {
  NamespaceNodePtr get = nodes["network ip interface ipv4 get"];
  NamespaceNodePtr list = nodes["network ip interface ipv4 address list"];
  ASSERT_NE(get, nullptr);
  ASSERT_NE(list, nullptr);
  EXPECT_NE(get, list);
  EXPECT_TRUE(typeid(*get) == typeid(IpInterfaceIpv4Get));
  EXPECT_TRUE(typeid(*list) == typeid(IpInterfaceIpv4Get));
}

// The reference prints an empty default formatter as "simple"; a command that
// sets output parameters names its formatter itself.
TEST_F(RegistrationTest, OutputParametersComeWithTheirFormatter) {
  for (const Registered& entry : commands) {
    if (!entry.command->GetDefaultOutputParameters().empty()) {
      EXPECT_FALSE(entry.command->GetDefaultOutputFormatter().empty()) << entry.path;
    }
  }
}

// The default output parameters name structures and fields of the result by
// text; a misspelt name would silently show nothing.
TEST_F(RegistrationTest, OutputParametersNameStructuresAndFieldsOfTheResult) {
  for (const Registered& entry : commands) {
    SCOPED_TRACE(entry.path);
    const MetaObjectPtr result = entry.command->GetOutputSpec()->GetRootObject();
    ASSERT_NE(result, nullptr);
    StructureFields structures;
    CollectStructures(result, structures);
    // A key without a structure name is about the result's own structure.
    std::string own;
    if (auto list = std::dynamic_pointer_cast<MetaList>(result))
      if (auto element = std::dynamic_pointer_cast<MetaStruct>(list->GetElementTemplate()))
        own = element->GetName();
    if (auto structure = std::dynamic_pointer_cast<MetaStruct>(result))
      own = structure->GetName();
    for (const auto& [key, value] : entry.command->GetDefaultOutputParameters()) {
      if (KnownUnmatchedParameters.count({entry.path, key}) != 0)
        continue;
      if (key == "wrap-last") {
        EXPECT_EQ(value, "true");
        continue;
      }
      std::string target = own;
      std::vector<std::string> fields;
      if (!NamedFields(key, value, target, fields)) {
        ADD_FAILURE() << "unknown output parameter " << key;
        continue;
      }
      auto structure = structures.find(target);
      if (structure == structures.end()) {
        ADD_FAILURE() << key << " names no structure of the result";
        continue;
      }
      for (const std::string& field : fields)
        EXPECT_EQ(structure->second.count(field), 1u) << key << " names no field " << field;
    }
  }
}

// The command host runs a command whose result is a boolean in a write
// transaction and every other command in a read transaction, where a change
// is refused. Across the whole tree, that must agree with what each command
// is for: "get" and "list" commands read, every other command acts.
TEST_F(RegistrationTest, EveryActionAndOnlyActionsRunInAWriteTransaction) {
  std::size_t actions = 0;
  for (const Registered& entry : commands) {
    const std::string verb = entry.path.substr(entry.path.find_last_of(' ') + 1);
    const bool reads = verb == "get" || verb == "list";
    const bool changes = Ostra::ChangesHost(*entry.command);
    actions += changes ? 1 : 0;
    EXPECT_EQ(changes, !reads != (ReadingVerbExceptions.count(entry.path) > 0)) << entry.path;
  }
  EXPECT_GT(actions, 0u);
  EXPECT_LT(actions, commands.size());
}

} // namespace
