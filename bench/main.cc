// Births the library once around all benchmarks, with as many threads as ZR_BENCH_THREADS says (1 without).
#include <ZR/hostkit.h>
#include <ZR/zr.h>
#include <benchmark/benchmark.h>

#include <cstdlib>

int main(int argc, char** argv) {
  benchmark::Initialize(&argc, argv);
  if (benchmark::ReportUnrecognizedArguments(argc, argv)) return 1;
  const char* const threads = std::getenv("ZR_BENCH_THREADS");
  zr::HostkitOptions options;
  options.threads = threads != nullptr ? std::atoi(threads) : 1;
  zr::Hostkit host(options);
  benchmark::AddCustomContext("library threads", std::to_string(host.threads()));
  benchmark::RunSpecifiedBenchmarks();
  benchmark::Shutdown();
  return host.End();
}
