//===- CommandLineTest.cpp - What the command host tells a user -----------===//
#include "../support/ScratchHost.h"
#include "Host.h"

#include "Fabrik/AutoCli.h"

#include <gtest/gtest.h>

namespace {

using namespace Fabrik;

/// A command that takes "-n NAME" and whose result is a boolean.
class Switcher : public Fabrik::AutoCli::Command {
protected:
  std::shared_ptr<CallSpec::InputSpec> GetInputSpecInternal() override {
    auto spec = CallSpec::InputSpec::New();
    auto name = CallSpec::ParameterSpec::New("nic-name", CallSpec::String);
    name->SetShortName("n");
    spec->AddParameter(name);
    return spec;
  }
  std::shared_ptr<CallSpec::OutputSpec> GetOutputSpecInternal() override {
    auto spec = CallSpec::OutputSpec::New();
    spec->SetRootObject(MetaObj::MetaBool::New());
    return spec;
  }
  void ExecuteInternal(const std::shared_ptr<CallSpec::Input>&,
                       const std::shared_ptr<CallSpec::Output>& output) override {
    output->SetRootObject(MetaObj::MetaBool::New(true));
  }
};

/// A command whose result is a list of "Nic" structures, each with a nested
/// "Driver" structure.
class Lister : public Fabrik::AutoCli::Command {
protected:
  std::shared_ptr<CallSpec::InputSpec> GetInputSpecInternal() override {
    return CallSpec::InputSpec::New();
  }
  std::shared_ptr<CallSpec::OutputSpec> GetOutputSpecInternal() override {
    auto driver = MetaObj::MetaStruct::New("Driver");
    driver->SetField("Version", MetaObj::MetaString::New());
    auto nic = MetaObj::MetaStruct::New("Nic");
    nic->SetField("Name", MetaObj::MetaString::New());
    nic->SetField("MTU", MetaObj::MetaInt::New());
    nic->SetField("Driver", driver);
    auto spec = CallSpec::OutputSpec::New();
    spec->SetRootObject(MetaObj::MetaList::New(MetaObj::Struct, nic));
    return spec;
  }
  void ExecuteInternal(const std::shared_ptr<CallSpec::Input>&,
                       const std::shared_ptr<CallSpec::Output>& output) override {
    auto row = MetaObj::MetaStruct::New("Nic");
    row->SetField("Name", "vmnic0");
    row->SetField("MTU", 1500L);
    auto list = MetaObj::MetaList::New(MetaObj::Struct);
    list->Add(row);
    output->SetRootObject(list);
  }
};

/// A command whose result is one "Switch" structure.
class Other : public Lister {
protected:
  std::shared_ptr<CallSpec::OutputSpec> GetOutputSpecInternal() override {
    auto vswitch = MetaObj::MetaStruct::New("Switch");
    vswitch->SetField("Name", MetaObj::MetaString::New());
    auto spec = CallSpec::OutputSpec::New();
    spec->SetRootObject(vswitch);
    return spec;
  }
};

TEST(HostTest, FormatterParametersMustNameWhatTheResultHolds) {
  TestSupport::ScratchHost host("command-line-test", "{}");
  auto root = AutoCli::Namespace::New();
  root->RegisterNamespaceNode(std::make_shared<Lister>(), "list");
  root->RegisterNamespaceNode(std::make_shared<Switcher>(), "probe");
  Ostra::CommandTree tree(root);
  auto run = [&](const std::string& param, std::string& err, const char* command = "list") {
    std::string out;
    err.clear();
    std::vector<std::string> args = {"--format-param", param, command};
    if (std::string(command) == "probe")
      args.insert(args.end(), {"-n", "x"});
    return Ostra::RunCommandLine(tree, args, out, err);
  };
  std::string err;
  for (const char* good : {"fields=Name, MTU", "fields:Driver=Version", "table-columns=MTU",
                           "header:Nic=%Name%", "units:Nic.MTU=bytes", "show-header=off"}) {
    EXPECT_EQ(run(good, err), 0) << good;
    EXPECT_EQ(err, "") << good;
  }
  const std::pair<const char*, const char*> bad[] = {
      {"fields=Name,Bogus",
       "--format-param fields=Name,Bogus: \"Bogus\" is not a field of Nic (its fields: Name, MTU, "
       "Driver)"},
      {"fields:Driver=Name",
       "--format-param fields:Driver=Name: \"Name\" is not a field of Driver (its fields: "
       "Version)"},
      {"header:Drivers=x", "--format-param header:Drivers=x: the result of this command has no "
                           "structure \"Drivers\" (its structures: Driver, Nic)"},
      {"units:Nic.Speed=Mbps", "--format-param units:Nic.Speed=Mbps: \"Speed\" is not a field of "
                               "Nic (its fields: Name, MTU, Driver)"},
      {"colour=red", "unknown formatter parameter \"colour\" (known: fields, fields:S, "
                     "table-columns, table-columns:S, header:S, units:S.F, show-header, "
                     "wrap-last)"},
      {"wrap-last=maybe",
       "--format-param wrap-last=maybe: \"maybe\" is not a boolean (true/false, yes/no, on/off, "
       "1/0)"},
  };
  for (const auto& [param, message] : bad) {
    EXPECT_EQ(run(param, err), 2) << param;
    EXPECT_EQ(err, "Error: " + std::string(message) + "\n");
  }
  // A boolean result has nothing to select, as in a batch whose global
  // options name the fields of its listings.
  EXPECT_EQ(run("fields=Name", err, "probe"), 0);
  EXPECT_EQ(run("units:Nic.MTU=bytes", err, "probe"), 0);
  // The structure of another command's result is for that command's lines.
  root->RegisterNamespaceNode(std::make_shared<Other>(), "other");
  EXPECT_EQ(run("fields:Nic=Name", err, "other"), 0);
  EXPECT_EQ(run("fields:Nic=Bogus", err), 2);
  EXPECT_EQ(run("colour=red", err, "probe"), 2);
}

TEST(HostTest, RootHelpListsEveryGlobalOption) {
  Ostra::CommandTree tree(AutoCli::Namespace::New());
  std::string out, err;
  ASSERT_EQ(Ostra::RunCommandLine(tree, {"--help"}, out, err), 0);
  for (const char* option :
       {"--formatter NAME", "--format-param KEY=VALUE", "--host PATH", "--batch FILE",
        "--keep-going", "--lock-timeout MS", "--atomic", "-h, --help", "--version", "--reference",
        "--man", "--complete WORD..."})
    EXPECT_NE(out.find("\n  " + std::string(option) + " "), std::string::npos) << option;
}

} // namespace
