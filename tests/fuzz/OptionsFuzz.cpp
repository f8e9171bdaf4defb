//===- OptionsFuzz.cpp - Fuzzing the command-line parser and validator ----===//
//
// Any words (NUL-separated): path resolution and option parsing against the
// real command tree must not crash, and an accepted command line must hold
// only values that pass the command's constraints.
//
//===----------------------------------------------------------------------===//
#include "Host.h"
#include "Options.h"
#include "entry/Register.h"

#include <cstdint>
#include <string>
#include <vector>

namespace {

const Fabrik::AutoCli::NamespaceNodePtr& Tree() {
  static Fabrik::AutoCli::NamespaceNodePtr root = [] {
    Fabrik::AutoCli::NamespaceNodePtr node = Fabrik::AutoCli::Namespace::New();
    AutoCli_RegisterNamespaces(node);
    return node;
  }();
  return root;
}

} // namespace

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
  std::vector<std::string> words;
  std::string word;
  for (size_t i = 0; i < size; ++i) {
    if (data[i] == 0) {
      words.push_back(word);
      word.clear();
    } else {
      word += static_cast<char>(data[i]);
    }
  }
  words.push_back(word);

  Ostra::GlobalOptions global;
  std::string err;
  int first = Ostra::ParseGlobalOptions(words, global, err);
  if (first < 0)
    return 0;
  Fabrik::AutoCli::NamespaceNodePtr node = Tree();
  size_t i = static_cast<size_t>(first);
  for (; i < words.size() && node->GetType() == Fabrik::AutoCli::NamespaceKind; ++i) {
    Fabrik::AutoCli::NamespaceNodePtr next = node->GetNamespaceNode(words[i]);
    if (!next)
      return 0;
    node = next;
  }
  auto command = std::dynamic_pointer_cast<Fabrik::AutoCli::CommandSpec>(node);
  if (!command)
    return 0;
  Fabrik::CallSpec::Input input;
  std::string problem;
  std::vector<std::string> rest(words.begin() + static_cast<long>(i), words.end());
  Ostra::ParseCommandOptions(*command->GetInputSpec(), rest, input, problem);
  return 0;
}
