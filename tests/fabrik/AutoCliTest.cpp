//===- AutoCliTest.cpp - Command tree, commands and typed values ------------===//
#include "Fabrik/AutoCli.h"

#include <gtest/gtest.h>

#include <stdexcept>

using namespace Fabrik;
using AutoCli::Namespace;
using AutoCli::NamespaceNodePtr;

namespace {

/// A command that records its runs and can be told to throw.
class EchoCommand : public virtual AutoCli::Command {
public:
  int runs = 0;         ///< ExecuteInternal calls so far.
  bool fail = false;    ///< Throw from ExecuteInternal.
  int specRequests = 0; ///< GetInputSpecInternal/GetOutputSpecInternal calls.

protected:
  std::shared_ptr<CallSpec::InputSpec> GetInputSpecInternal() override {
    ++specRequests;
    auto spec = CallSpec::InputSpec::New();
    spec->AddParameter(CallSpec::ParameterSpec::New("text", CallSpec::String));
    return spec;
  }
  std::shared_ptr<CallSpec::OutputSpec> GetOutputSpecInternal() override {
    ++specRequests;
    auto spec = CallSpec::OutputSpec::New();
    spec->SetRootObject(MetaObj::MetaString::New());
    return spec;
  }
  void ExecuteInternal(const std::shared_ptr<CallSpec::Input>& input,
                       const std::shared_ptr<CallSpec::Output>& output) override {
    ++runs;
    if (fail)
      throw std::runtime_error("boom");
    output->SetRootObject(MetaObj::MetaString::New(input->GetParameter("text")));
  }
};

/// root -> network -> nic -> {list, get}, network -> ip.
struct Tree {
  NamespaceNodePtr root = Namespace::New();
  NamespaceNodePtr network = Namespace::New();
  NamespaceNodePtr nic = Namespace::New();
  NamespaceNodePtr ip = Namespace::New();
  std::shared_ptr<EchoCommand> list{new EchoCommand()};
  std::shared_ptr<EchoCommand> get{new EchoCommand()};

  Tree() {
    nic->RegisterNamespaceNode(list, "list");
    nic->RegisterNamespaceNode(get, "get");
    network->RegisterNamespaceNode(nic, "nic");
    network->RegisterNamespaceNode(ip, std::string("ip"));
    root->RegisterNamespaceNode(network, "network");
  }
};

} // namespace

TEST(NamespaceNodeTest, RegistrationKeepsOrderAndLinksParent) {
  Tree tree;
  EXPECT_EQ(tree.network->GetNamespaceNodeNames(), (std::vector<std::string>{"nic", "ip"}));
  EXPECT_EQ(tree.network->GetNamespaceNodes(), (std::vector<NamespaceNodePtr>{tree.nic, tree.ip}));
  EXPECT_EQ(tree.get->GetParent(), tree.nic);
  EXPECT_EQ(tree.get->GetName(), "get");
  EXPECT_EQ(tree.get->GetThis(), tree.get);
  EXPECT_EQ(tree.get->GetPath(), (std::vector<std::string>{"network", "nic", "get"}));
  EXPECT_EQ(tree.get->GetPathString(' '), "network nic get");
  EXPECT_TRUE(tree.root->GetPath().empty());
  EXPECT_EQ(tree.nic->GetType(), AutoCli::NamespaceKind);
  EXPECT_EQ(tree.get->GetType(), AutoCli::CommandKind);
  EXPECT_EQ(tree.nic->GetDispatcher(), nullptr);
  EXPECT_EQ(tree.get->GetDispatcher(), tree.get);
}

TEST(NamespaceNodeTest, RegisteringANameAgainReplacesInPlace) {
  Tree tree;
  std::shared_ptr<EchoCommand> replacement{new EchoCommand()};
  tree.nic->RegisterNamespaceNode(replacement, "list");
  EXPECT_EQ(tree.nic->GetNamespaceNodeNames(), (std::vector<std::string>{"list", "get"}));
  EXPECT_EQ(tree.nic->GetNamespaceNode("list"), replacement);
  EXPECT_EQ(tree.list->GetParent(), nullptr);
  EXPECT_EQ(replacement->GetPathString('/'), "network/nic/list");
}

TEST(NamespaceNodeTest, RefusesCyclesAndEmptyRegistrations) {
  Tree tree;
  EXPECT_THROW(tree.nic->RegisterNamespaceNode(tree.network, "loop"), std::invalid_argument);
  EXPECT_THROW(tree.nic->RegisterNamespaceNode(tree.nic, "self"), std::invalid_argument);
  EXPECT_THROW(tree.nic->RegisterNamespaceNode(nullptr, "none"), std::invalid_argument);
  EXPECT_THROW(tree.nic->RegisterNamespaceNode(Namespace::New(), ""), std::invalid_argument);
  EXPECT_EQ(tree.nic->GetNamespaceNodeNames(), (std::vector<std::string>{"list", "get"}));
}

TEST(NamespaceNodeTest, ResolvesAsFarAsWordsMatch) {
  Tree tree;
  std::size_t consumed = 99;
  EXPECT_EQ(tree.root->ResolveNode({"network", "nic", "get", "extra"}, consumed), tree.get);
  EXPECT_EQ(consumed, 3u);
  EXPECT_EQ(tree.root->ResolveNode({"network", "Nic", "get"}, consumed), tree.network);
  EXPECT_EQ(consumed, 1u);
  EXPECT_EQ(tree.root->ResolveNode({}, consumed), tree.root);
  EXPECT_EQ(consumed, 0u);
}

TEST(NamespaceNodeTest, SubNamespaceCreatesOnceAndRefusesCommands) {
  Tree tree;
  NamespaceNodePtr vswitch = tree.network->SubNamespace("vswitch");
  EXPECT_EQ(tree.network->SubNamespace("vswitch"), vswitch);
  EXPECT_EQ(vswitch->GetPathString(' '), "network vswitch");
  EXPECT_THROW(tree.nic->SubNamespace("get"), std::invalid_argument);
}

TEST(CommandTest, DefaultOutputParameterReplacesInPlace) {
  EchoCommand command;
  command.SetDefaultOutputFormatter("simple");
  command.SetDefaultOutputFormatter("table");
  command.SetDefaultOutputParameter("header:Nic", "%Name%");
  command.SetDefaultOutputParameter("fields:Nic", "Name");
  command.SetDefaultOutputParameter("header:Nic", "<NONE>");
  EXPECT_EQ(command.GetDefaultOutputFormatter(), "table");
  using Pairs = std::vector<std::pair<std::string, std::string>>;
  EXPECT_EQ(command.GetDefaultOutputParameters(),
            (Pairs{{"header:Nic", "<NONE>"}, {"fields:Nic", "Name"}}));
}

TEST(CommandTest, SpecsAndExecutionReachTheCommand) {
  Tree tree;
  EXPECT_EQ(tree.get->GetInputSpec()->GetParameters().at(0)->GetName(), "text");
  EXPECT_EQ(tree.get->GetOutputSpec()->GetRootObject()->GetType(), MetaObj::String);
  EXPECT_EQ(tree.get->specRequests, 2);

  auto input = CallSpec::Input::New();
  input->SetString("text", "hello");
  auto output = CallSpec::Output::New();
  tree.get->Execute(input, output);
  ASSERT_NE(output->GetRootObject(), nullptr);
  EXPECT_EQ(static_cast<MetaObj::MetaString&>(*output->GetRootObject()).GetValue(), "hello");

  tree.get->fail = true;
  EXPECT_THROW(tree.get->Execute(input, CallSpec::Output::New()), std::runtime_error);
  EXPECT_EQ(tree.get->runs, 2);
}

TEST(MetaObjTest, SetFieldReplacesInPlaceAndCloneIsDeep) {
  auto nic = MetaObj::MetaStruct::New("Nic");
  nic->SetField("Name", MetaObj::MetaString::New());
  nic->SetField("MTU", MetaObj::MetaInt::New());
  nic->SetField("Name", "vmnic0");
  nic->SetField("Uplinks", std::vector<std::string>{"a"});
  ASSERT_EQ(nic->GetFieldCount(), 3u);
  EXPECT_EQ(nic->GetFieldName(0), "Name");
  EXPECT_TRUE(nic->GetFieldValue(0).IsShown());
  EXPECT_FALSE(nic->GetField("MTU")->IsShown());
  EXPECT_EQ(nic->GetField("Missing"), nullptr);

  auto copy = std::static_pointer_cast<MetaObj::MetaStruct>(nic->Clone());
  copy->SetField("Name", "vmnic1");
  std::static_pointer_cast<MetaObj::MetaList>(copy->GetField("Uplinks")->GetObject())->Add("b");
  EXPECT_EQ(nic->GetField("Name")->GetString(), "vmnic0");
  EXPECT_EQ(nic->GetField("Uplinks")->AsList().GetCount(), 1u);
}
