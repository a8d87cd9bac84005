// Resolving a keyed string: the table's answer against building the text anew.
#include <benchmark/benchmark.h>

#include "framework/strings/CString.h"

namespace {

void BM_ResolveKeyed(benchmark::State& state) {
  for (auto _ : state) {
    Tarsa::CString s("$$$/Archway/Dialog/Title=Archway (^0 @ ^1%)");
    s.Resolve();
    benchmark::DoNotOptimize(s);
  }
}
BENCHMARK(BM_ResolveKeyed);

// Baseline: a plain copy of the same bytes.
void BM_CopyPlain(benchmark::State& state) {
  for (auto _ : state) {
    Tarsa::CString s(std::string("Archway (^0 @ ^1%)"));
    benchmark::DoNotOptimize(s);
  }
}
BENCHMARK(BM_CopyPlain);

}  // namespace
