//===- registration_bench.cpp - Cost of registering the command tree ------===//
//
// The command host registers the whole network tree on every invocation, so
// its cost is paid by every command.
//
//===----------------------------------------------------------------------===//
#include "entry/Register.h"

#include <benchmark/benchmark.h>

static void RegisterWholeTree(benchmark::State& state) {
  for (auto _ : state) {
    Fabrik::AutoCli::NamespaceNodePtr root = Fabrik::AutoCli::Namespace::New();
    AutoCli_RegisterNamespaces(root);
    benchmark::DoNotOptimize(root);
  }
}
BENCHMARK(RegisterWholeTree)->Unit(benchmark::kMicrosecond);

BENCHMARK_MAIN();
