// Births the library once around all benchmarks, with as many threads as ZR_BENCH_THREADS says (1 without).
#include <benchmark/benchmark.h>

#include "divided.h"

int main(int argc, char** argv) {
  benchmark::Initialize(&argc, argv);
  if (benchmark::ReportUnrecognizedArguments(argc, argv)) return 1;
  zr::HostkitOptions options;
  options.threads = bench::threads_wanted();
  zr::Hostkit host(options);
  benchmark::AddCustomContext("library threads", std::to_string(host.threads()));
  benchmark::RunSpecifiedBenchmarks();
  benchmark::Shutdown();
  return host.End();
}
