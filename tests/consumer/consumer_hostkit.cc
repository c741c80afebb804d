// A ready host against the installed package: rows on two threads.
#include <ZR/hostkit.h>

#include <atomic>

int main() {
  zr::HostkitOptions options;
  options.threads = 2;
  zr::Hostkit host(options);
  std::atomic<int> calls{0};
  const i32 result = ZR_IterateGeneric(100, &calls, [](void* counter, i32 thread, i32, i32) -> i32 {
    ++*static_cast<std::atomic<int>*>(counter);
    return thread < 0 || thread > 1;
  });
  if (result != 0 || calls != 100 || host.threads() != 2) return 1;
  return host.End();
}
