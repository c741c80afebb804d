// The processor record and the thread count.
#include <HB/hb.h>
#include <JRN/jrn.h>
#include <OPT/opt.h>

#include <algorithm>
#include <atomic>
#include <string>
#include <thread>

namespace {

enum Word { word_fpu, word_mmx, word_sse2, word_sse3, word_ssse3, word_threads, word_sse41, word_avx2, word_avx512 };

// Written by HB_PrepareCpuData, alone on the main thread; read by all.
constinit i32 cpu_words[HB_CPU_WordCount] = {};
// 0: not set.
constinit std::atomic<i32> thread_setting{0};

void read_processor(i32* words) {
  words[word_fpu] = 1;
#if defined(__x86_64__) || defined(__i386__)
  __builtin_cpu_init();
  words[word_mmx] = __builtin_cpu_supports("mmx") != 0;
  words[word_sse2] = __builtin_cpu_supports("sse2") != 0;
  words[word_sse3] = __builtin_cpu_supports("sse3") != 0;
  words[word_ssse3] = __builtin_cpu_supports("ssse3") != 0;
  // Each with what vector code of its width takes for granted.
  words[word_sse41] = __builtin_cpu_supports("sse4.1") != 0 && __builtin_cpu_supports("sse4.2") != 0;
  words[word_avx2] = __builtin_cpu_supports("avx2") != 0 && __builtin_cpu_supports("fma") != 0 &&
                     __builtin_cpu_supports("bmi") != 0 && __builtin_cpu_supports("bmi2") != 0;
  words[word_avx512] = __builtin_cpu_supports("avx512f") != 0 && __builtin_cpu_supports("avx512bw") != 0 &&
                       __builtin_cpu_supports("avx512dq") != 0 && __builtin_cpu_supports("avx512vl") != 0 &&
                       __builtin_cpu_supports("avx512cd") != 0;
#endif
  words[word_threads] = static_cast<i32>(std::min(std::thread::hardware_concurrency(), 65536u));
}

// The first word above the cap; words before it stay.
void cap(i32* words, const std::string& level) {
  Word first_above;
  if (level == "scalar")
    first_above = word_fpu;
  else if (level == "sse4")
    first_above = word_avx2;
  else if (level == "avx2")
    first_above = word_avx512;
  else {
    if (!level.empty() && level != "avx512")
      JRN_Log(30, "HB", "cpu", ("preference cpu: \"" + level + "\" is none of scalar, sse4, avx2, avx512").c_str());
    return;
  }
  std::fill(words + first_above, words + HB_CPU_WordCount, 0);
}

}  // namespace

extern "C" {
constinit const i32* HB_G_CPU_DataP = cpu_words;
}

void HB_PrepareCpuData() {
  i32 words[HB_CPU_WordCount] = {};
  read_processor(words);
  cap(words, OPT_GetString("cpu", ""));
  std::copy(std::begin(words), std::end(words), cpu_words);
  HB_G_CPU_DataP = cpu_words;
}

extern "C" void HB_SetNumThreads(i32 count) { thread_setting.store(std::max(count, 0), std::memory_order_relaxed); }

extern "C" i32 HB_GetNumThreads(i32* out, i32 default_count) {
  const i32 set = thread_setting.load(std::memory_order_relaxed);
  if (out != nullptr) *out = std::max(set > 0 ? set : default_count, 1);
  return ZR_Err_None;
}
