//===- HostTest.cpp - Command-line parsing and the command host ------------===//
#include "Host.h"
#include "Options.h"

#include "../support/ScratchHost.h"
#include "Fabrik/AutoCli.h"
#include "HostCtl/Lib.h"
#include "HostCtl/Session.h"
#include "model/CoreModel.h"
#include "model/Store.h"

#include <gtest/gtest.h>

#include <stdexcept>

namespace {

using namespace Fabrik;
using CallSpec::Input;
using CallSpec::InputSpec;
using CallSpec::ParameterConstraint;
using CallSpec::ParameterSpec;

std::shared_ptr<InputSpec> SampleSpec() {
  auto spec = InputSpec::New();
  auto add = [&](const char* name, const char* shortName, CallSpec::ParameterType type,
                 bool required = false) {
    auto p = ParameterSpec::New(name, type);
    p->SetShortName(shortName);
    p->SetRequired(required);
    spec->AddParameter(p);
    return p;
  };
  add("nic-name", "n", CallSpec::String, true);
  auto speed = add("speed", "S", CallSpec::Integer);
  auto speeds = ParameterConstraint::New(CallSpec::IntEnum);
  speeds->AddIntEnum(100);
  speeds->AddIntEnum(1000);
  speed->SetConstraint(speeds);
  auto ports = add("ports", "P", CallSpec::Integer);
  auto range = ParameterConstraint::New(CallSpec::IntRange);
  range->SetIntRange(1, 4096);
  ports->SetConstraint(range);
  auto duplex = add("duplex", "D", CallSpec::String);
  auto words = ParameterConstraint::New(CallSpec::StringEnum);
  words->AddStringEnum("full");
  words->AddStringEnum("half");
  duplex->SetConstraint(words);
  auto name = add("interface-name", "i", CallSpec::String);
  auto pattern = ParameterConstraint::New(CallSpec::StringRegex);
  pattern->SetStringRegex("tvk([0-9]|[1-9][0-9])");
  name->SetConstraint(pattern);
  add("enabled", "e", CallSpec::Boolean);
  add("auto", "a", CallSpec::Flag);
  add("vmnic", "m", CallSpec::StringList);
  return spec;
}

std::string Parse(std::vector<std::string> args, Input& input) {
  std::string problem;
  return Ostra::ParseCommandOptions(*SampleSpec(), args, input, problem) ? "" : problem;
}

TEST(OptionsTest, AcceptsEveryFormAndType) {
  Input input;
  EXPECT_EQ(Parse({"-n", "vmnic0", "--speed=1000", "--ports", "-1"}, input),
            "option --ports: value -1 is out of range [1 - 4096]");
  Input ok;
  EXPECT_EQ(Parse({"--nic-name", "vmnic0", "-S", "100", "--duplex=half", "-i", "tvk12", "-e", "ON",
                   "-a", "-m", "a", "--vmnic", "b", "--ports", "+4096"},
                  ok),
            "");
  EXPECT_EQ(ok.GetParameter("nic-name"), "vmnic0");
  EXPECT_EQ(ok.GetParameterInt("speed"), 100);
  EXPECT_EQ(ok.GetParameterInt("ports"), 4096);
  EXPECT_EQ(ok.GetParameter("ports"), "+4096");
  EXPECT_TRUE(ok.GetParameterBool("enabled"));
  EXPECT_TRUE(ok.IsFlagSet("auto"));
  std::vector<std::string> list;
  ok.GetParameterList("vmnic", list);
  EXPECT_EQ(list, (std::vector<std::string>{"a", "b"}));
  EXPECT_FALSE(ok.HasParameter("duplex2"));
}

TEST(OptionsTest, RefusesBadCommandLinesNamingTheOption) {
  struct Case {
    std::vector<std::string> args;
    std::string problem;
  } cases[] = {
      {{}, "missing required option --nic-name (-n)"},
      {{"-n", "a", "--colour", "red"}, "unknown option --colour"},
      // A slip of one or two letters gets the closest option names.
      {{"--nic-nme", "a"}, "unknown option --nic-nme; did you mean --nic-name?"},
      {{"-n", "a", "--Duplex", "full"}, "unknown option --Duplex; did you mean --duplex?"},
      {{"-n", "a", "--vmnics", "b"}, "unknown option --vmnics; did you mean --vmnic?"},
      // An option of the whole run, written where the command's go.
      {{"-n", "a", "--formatter", "json"},
       "option --formatter is a global option; global options go before the command words"},
      {{"-n", "a", "--host=/tmp/h.db"},
       "option --host is a global option; global options go before the command words"},
      {{"-n", "a", "-x", "1"}, "unknown option -x"},
      {{"-n", "a", "-n", "b"}, "option --nic-name is given more than once"},
      {{"-n", "a", "--speed", "fast"}, "option --speed: \"fast\" is not an integer"},
      {{"-n", "a", "--speed", "99999999999999999999"},
       "option --speed: \"99999999999999999999\" is outside the 64-bit integer range"},
      {{"-n", "a", "--speed", "-9223372036854775809"},
       "option --speed: \"-9223372036854775809\" is outside the 64-bit integer range"},
      // Bytes that are not UTF-8 are shown escaped, so the message stays text.
      {{"-n", "a", "--speed", "1\xff\xfe"}, "option --speed: \"1\\xff\\xfe\" is not an integer"},
      {{"-n", "a", "-e", "caf\xc3\xa9"},
       "option --enabled: \"caf\xc3\xa9\" is not a boolean (true/false, yes/no, on/off, 1/0)"},
      // A long value is cut before a character that would not fit whole.
      {{"-n", "a", "--speed", std::string(63, '9') + "\xc3\xa9"},
       "option --speed: \"" + std::string(63, '9') + "...\" is not an integer"},
      {{"-n", "a", "--speed", "10"}, "option --speed: value 10 is not one of: 100, 1000"},
      {{"-n", "a", "--duplex", "Full"},
       "option --duplex: value \"Full\" is not one of: full, half"},
      {{"-n", "a", "-e", "maybe"},
       "option --enabled: \"maybe\" is not a boolean (true/false, yes/no, on/off, 1/0)"},
      {{"-n", "a", "--auto=yes"}, "option --auto takes no value"},
      {{"-n"}, "option --nic-name requires a value"},
      {{"-n", "a", "stray"}, "unexpected argument \"stray\" (options are written --name VALUE)"},
      {{"-n", "a", "-i", "tvk100"},
       "option --interface-name: value \"tvk100\" does not match the pattern "
       "tvk([0-9]|[1-9][0-9])"},
      {{"-n", std::string("a\x01") + "b"}, ""},
      {{"-n", std::string(4097, 'x')}, "option --nic-name: the value is longer than 4096 bytes"},
      {{"-n", std::string(4096, 'x')}, ""},
      {{"-n", "caf\xc3\xa9"}, ""},
      {{"-n", "caf\xe9"}, "option --nic-name: the value is not valid UTF-8 text"},
      {{"-n", "\xc0\xaf"}, "option --nic-name: the value is not valid UTF-8 text"},
      {{"-n", "\xed\xa0\x80"}, "option --nic-name: the value is not valid UTF-8 text"},
      {{"-n", "a", "-m", "\xff"}, "option --vmnic: the value is not valid UTF-8 text"},
  };
  for (const Case& c : cases) {
    Input input;
    std::string problem = Parse(c.args, input);
    EXPECT_EQ(problem, c.problem);
  }
}

TEST(OptionsTest, HelpAnywhereAfterTheWords) {
  auto spec = SampleSpec();
  EXPECT_TRUE(Ostra::AsksForHelp({"-n", "vmnic0", "--help"}, spec.get()));
  EXPECT_TRUE(Ostra::AsksForHelp({"--bogus", "-h"}, spec.get()));
  EXPECT_TRUE(Ostra::AsksForHelp({"--help"}, nullptr));
  EXPECT_FALSE(Ostra::AsksForHelp({"-n", "vmnic0"}, spec.get()));
  // A command with a -h of its own keeps it.
  auto own = ParameterSpec::New("hostname", CallSpec::String);
  own->SetShortName("h");
  spec->AddParameter(own);
  EXPECT_FALSE(Ostra::AsksForHelp({"-h", "web01"}, spec.get()));
  EXPECT_TRUE(Ostra::AsksForHelp({"-h", "web01", "--help"}, spec.get()));
}

TEST(OptionsTest, BooleanWordsAndIntegers) {
  bool value = false;
  for (const char* word : {"true", "TRUE", "1", "yes", "On"}) {
    EXPECT_TRUE(Ostra::ParseBoolWord(word, value));
    EXPECT_TRUE(value) << word;
  }
  for (const char* word : {"false", "0", "No", "OFF"}) {
    EXPECT_TRUE(Ostra::ParseBoolWord(word, value));
    EXPECT_FALSE(value) << word;
  }
  EXPECT_FALSE(Ostra::ParseBoolWord("", value));
  EXPECT_FALSE(Ostra::ParseBoolWord("y", value));
  long number = 0;
  EXPECT_TRUE(Ostra::ParseInteger("-9223372036854775808", number));
  EXPECT_EQ(number, LONG_MIN);
  EXPECT_FALSE(Ostra::ParseInteger("9223372036854775808", number));
  for (const char* bad : {"", "-", "1.0", "0x10", " 1", "1 ", "1e3"})
    EXPECT_FALSE(Ostra::ParseInteger(bad, number)) << bad;
}

/// A command that fails in the ways a command can.
class Probe : public Fabrik::AutoCli::Command {
public:
  explicit Probe(int mode) : mode_(mode) { SetDescription("Probe."); }

protected:
  std::shared_ptr<CallSpec::InputSpec> GetInputSpecInternal() override { return SampleSpec(); }
  std::shared_ptr<CallSpec::OutputSpec> GetOutputSpecInternal() override {
    auto spec = CallSpec::OutputSpec::New();
    spec->SetRootObject(MetaObj::MetaBool::New());
    return spec;
  }
  void ExecuteInternal(const std::shared_ptr<CallSpec::Input>& input,
                       const std::shared_ptr<CallSpec::Output>& output) override {
    switch (mode_) {
    case 0:
      output->SetRootObject(MetaObj::MetaBool::New(true));
      return;
    case 1:
      output->AddErrorMessage("first");
      output->AddErrorMessage("second");
      output->SetRootObject(MetaObj::MetaBool::New(true));
      return;
    case 2:
      throw std::runtime_error("boom");
    case 4: // A first step done; a later one refused unless the key says "ok".
      Put(input->GetParameter("nic-name"));
      if (input->GetParameter("nic-name") != "ok")
        output->AddErrorMessage("the second step was refused");
      output->SetRootObject(MetaObj::MetaBool::New(true));
      return;
    default:
      throw 42;
    }
  }

  /// One change of the host: a setting named \p key.
  static void Put(const std::string& key) {
    Model::Store& store = Model::Store::Host();
    store.Write([&] { Model::PutSetting(store, key, "1"); });
  }

private:
  int mode_; ///< Which behaviour to show.
};

/// A command whose result is no boolean, so it runs in a read transaction,
/// but that tries to change the host anyway.
class SneakyReader : public Probe {
public:
  SneakyReader() : Probe(0) {}

protected:
  std::shared_ptr<CallSpec::OutputSpec> GetOutputSpecInternal() override {
    auto spec = CallSpec::OutputSpec::New();
    spec->SetRootObject(MetaObj::MetaString::New());
    return spec;
  }
  void ExecuteInternal(const std::shared_ptr<CallSpec::Input>& input,
                       const std::shared_ptr<CallSpec::Output>& output) override {
    Put(input->GetParameter("nic-name"));
    output->SetRootObject(MetaObj::MetaString::New("changed"));
  }
};

bool HasSetting(const std::string& key) {
  Model::Store& store = Model::Store::Host();
  return store.Read([&] { return Model::GetSetting(store, key).has_value(); });
}

TEST(HostTest, ExitStatusesAndEscapingExceptions) {
  TestSupport::ScratchHost host("host-test", "{}");
  auto root = AutoCli::Namespace::New();
  auto probes = AutoCli::Namespace::New();
  for (int mode = 0; mode < 4; ++mode)
    probes->RegisterNamespaceNode(std::make_shared<Probe>(mode), "p" + std::to_string(mode));
  root->RegisterNamespaceNode(probes, "probe");
  Ostra::CommandTree tree(root);
  auto run = [&](std::vector<std::string> args, std::string& out, std::string& err) {
    out.clear();
    err.clear();
    return Ostra::RunCommandLine(tree, args, out, err);
  };
  std::string out, err;
  EXPECT_EQ(run({"probe", "p0", "-n", "x"}, out, err), 0);
  EXPECT_EQ(out, "true\n");
  EXPECT_EQ(run({"probe", "p1", "-n", "x"}, out, err), 1);
  EXPECT_EQ(out, "true\n");
  EXPECT_EQ(err, "first\nsecond\n");
  EXPECT_EQ(run({"probe", "p2", "-n", "x"}, out, err), 1);
  EXPECT_EQ(err, "Internal error: boom\n");
  EXPECT_EQ(run({"probe", "p3", "-n", "x"}, out, err), 1);
  EXPECT_EQ(err, "Internal error: unknown exception\n");
  EXPECT_EQ(run({"probe", "p0"}, out, err), 2);
  EXPECT_EQ(err, "Error: missing required option --nic-name (-n)\n");
  EXPECT_EQ(out, "");
  EXPECT_EQ(run({"probe"}, out, err), 0);
  EXPECT_NE(out.find("Available Commands:"), std::string::npos);
}

TEST(HostTest, ACommandIsOneTransaction) {
  TestSupport::ScratchHost host("host-transaction", "{}");
  auto root = AutoCli::Namespace::New();
  auto probes = AutoCli::Namespace::New();
  probes->RegisterNamespaceNode(std::make_shared<Probe>(4), "partly");
  probes->RegisterNamespaceNode(std::make_shared<SneakyReader>(), "sneaky");
  root->RegisterNamespaceNode(probes, "probe");
  Ostra::CommandTree tree(root);
  auto run = [&](const std::string& key, const Ostra::RunMode& mode) {
    std::string out, err;
    int status = Ostra::RunCommandLine(tree, {"probe", "partly", "-n", key}, out, err, mode);
    EXPECT_EQ(err, key == "ok" ? "" : "the second step was refused\n");
    return status;
  };

  // The steps before a refused one stay, as the command's order promises...
  EXPECT_EQ(run("plain", {}), 1);
  EXPECT_TRUE(HasSetting("plain"));
  // ...unless --atomic asks for all or nothing.
  Ostra::RunMode atomic;
  atomic.atomic = true;
  EXPECT_EQ(run("atomic", atomic), 1);
  EXPECT_FALSE(HasSetting("atomic"));

  // A failed batch line is undone whole; the lines around it stay.
  Ostra::RunMode line;
  line.inBatch = true;
  HostCtl::Session::BeginBatch();
  EXPECT_EQ(run("ok", line), 0);
  EXPECT_EQ(run("line", line), 1);
  HostCtl::Session::EndBatch(true);
  EXPECT_TRUE(HasSetting("ok"));
  EXPECT_FALSE(HasSetting("line"));

  // A command that only reads runs in a read transaction: a change is refused
  // and leaves nothing behind.
  std::string out, err;
  EXPECT_EQ(Ostra::RunCommandLine(tree, {"probe", "sneaky", "-n", "sneaky"}, out, err), 1);
  EXPECT_EQ(err, "Internal error: a change was attempted inside a read\n");
  EXPECT_FALSE(HasSetting("sneaky"));
}

/// A listing: rows of one kind, then an ending chosen by the mode.
class Lister : public Fabrik::AutoCli::Command {
public:
  explicit Lister(int mode) : mode_(mode) { SetDefaultOutputFormatter("table"); }

protected:
  std::shared_ptr<CallSpec::InputSpec> GetInputSpecInternal() override {
    return CallSpec::InputSpec::New();
  }
  static std::shared_ptr<MetaObj::MetaStruct> Row() {
    auto row = MetaObj::MetaStruct::New("Item");
    row->SetField("Name", MetaObj::MetaString::New());
    row->SetField("Size", MetaObj::MetaInt::New());
    return row;
  }
  std::shared_ptr<CallSpec::OutputSpec> GetOutputSpecInternal() override {
    auto spec = CallSpec::OutputSpec::New();
    spec->SetRootObject(MetaObj::MetaList::New(MetaObj::Struct, Row()));
    return spec;
  }
  void ExecuteInternal(const std::shared_ptr<CallSpec::Input>&,
                       const std::shared_ptr<CallSpec::Output>& output) override {
    auto list = MetaObj::MetaList::New(MetaObj::Struct, Row());
    for (long i = 0; i < 3; ++i) {
      auto row = Row();
      row->SetField("Name", "item" + std::to_string(i));
      list->Add(row);
      row->SetField("Size", i * 10);
    }
    switch (mode_) {
    case 0: // Every row listed.
      output->SetRootObject(list);
      return;
    case 1: // A failure after some rows: the error alone.
      output->AddErrorMessage("cannot read item3");
      return;
    case 2: // A failure reported with the rows so far.
      output->AddErrorMessage("cannot read item3");
      output->SetRootObject(list);
      return;
    case 3: { // The result is another list of the same kind.
      auto other = MetaObj::MetaList::New(MetaObj::Struct, Row());
      auto row = Row();
      row->SetField("Name", "other");
      other->Add(row);
      output->SetRootObject(other);
      return;
    }
    default:
      throw std::runtime_error("lost the host");
    }
  }

private:
  int mode_; ///< Which ending.
};

TEST(HostTest, ListingsStreamAndPrintNothingWhenTheyFail) {
  TestSupport::ScratchHost host("host-listing", "{}");
  auto root = AutoCli::Namespace::New();
  auto lists = AutoCli::Namespace::New();
  for (int mode = 0; mode < 5; ++mode)
    lists->RegisterNamespaceNode(std::make_shared<Lister>(mode), "l" + std::to_string(mode));
  root->RegisterNamespaceNode(lists, "list");
  Ostra::CommandTree tree(root);
  auto run = [&](const std::string& name, std::string& out, std::string& err,
                 const std::vector<std::string>& global = {}) {
    out.clear();
    err.clear();
    std::vector<std::string> args = global;
    args.insert(args.end(), {"list", name});
    return Ostra::RunCommandLine(tree, args, out, err);
  };
  const std::string table = "Name   Size\n"
                            "-----  ----\n"
                            "item0  0\n"
                            "item1  10\n"
                            "item2  20\n";
  std::string out, err;
  EXPECT_EQ(run("l0", out, err), 0);
  EXPECT_EQ(out, table);
  EXPECT_EQ(run("l0", out, err, {"--formatter", "csv"}), 0);
  EXPECT_EQ(out, "Name,Size\nitem0,0\nitem1,10\nitem2,20\n");
  EXPECT_EQ(run("l1", out, err), 1);
  EXPECT_EQ(out, "");
  EXPECT_EQ(err, "cannot read item3\n");
  EXPECT_EQ(run("l2", out, err), 1);
  EXPECT_EQ(out, table);
  EXPECT_EQ(err, "cannot read item3\n");
  EXPECT_EQ(run("l3", out, err, {"--formatter", "json"}), 0);
  EXPECT_EQ(out, "[\n  {\n    \"Name\": \"other\"\n  }\n]\n");
  EXPECT_EQ(run("l4", out, err), 1);
  EXPECT_EQ(out, "");
  EXPECT_EQ(err, "Internal error: lost the host\n");

  // The whole run writes a streamed result straight to its output file,
  // after anything already in the output text.
  std::FILE* file = std::tmpfile();
  ASSERT_NE(file, nullptr);
  Ostra::RunMode direct;
  direct.direct = file;
  out = "before\n";
  err.clear();
  EXPECT_EQ(Ostra::RunCommandLine(tree, {"list", "l0"}, out, err, direct), 0);
  EXPECT_EQ(out, "");
  std::rewind(file);
  std::string written(4096, '\0');
  written.resize(std::fread(written.data(), 1, written.size(), file));
  std::fclose(file);
  EXPECT_EQ(written, "before\n" + table);
}

TEST(HostTest, LongEchoedValuesAreShortened) {
  const std::string word(200, 'x');
  const std::string accented = std::string(70, 'a') + "\xc3\xa9";
  std::string shortened =
      Ostra::ShortenEchoes("Error: \"" + word + "\" and \"" + accented + "\" are refused; " + word,
                           {word, accented, "x"});
  const std::string cut = std::string(64, 'x') + "\xe2\x80\xa6 (200 bytes)";
  EXPECT_EQ(shortened, "Error: \"" + cut + "\" and \"" + std::string(64, 'a') +
                           "\xe2\x80\xa6 (72 bytes)\" are refused; " + cut);
  // A multi-byte character is never cut in two.
  const std::string wide = std::string(63, 'a') + "\xc3\xa9" + std::string(10, 'b');
  EXPECT_EQ(Ostra::ShortenEchoes(wide, {wide}),
            std::string(63, 'a') + "\xc3\xa9\xe2\x80\xa6 (75 bytes)");
  EXPECT_EQ(Ostra::ShortenEchoes("short", {"short"}), "short");
}

} // namespace

namespace {

TEST(BatchTest, SplitsLinesLikeAShell) {
  std::vector<std::string> words;
  ASSERT_TRUE(Ostra::SplitWords("  network ip hosts add -i 10.0.0.1 -n 'my host'  ", words));
  EXPECT_EQ(words, (std::vector<std::string>{"network", "ip", "hosts", "add", "-i", "10.0.0.1",
                                             "-n", "my host"}));
  ASSERT_TRUE(Ostra::SplitWords(R"(a "b \"c\" d" e\ f '' "")", words));
  EXPECT_EQ(words, (std::vector<std::string>{"a", "b \"c\" d", "e f", "", ""}));
  EXPECT_FALSE(Ostra::SplitWords("a 'b", words));
  EXPECT_FALSE(Ostra::SplitWords("a \"b", words));
}

} // namespace
