// The contract of the threaded iterate body, with one thread, with two, and with more than there are processors.
#include <ZR/hostkit.h>
#include <ZR/platform.h>
#include <gtest/gtest.h>

#include <atomic>
#include <chrono>
#include <memory>
#include <mutex>
#include <new>
#include <stdexcept>
#include <thread>

namespace {

using Work = std::function<i32(i32 thread_index, i32 i, i32 iterations)>;

i32 call_work(void* refcon, i32 thread_index, i32 i, i32 iterations) {
  return (*static_cast<const Work*>(refcon))(thread_index, i, iterations);
}
i32 iterate(i32 iterations, const Work& work) {
  return ZR_IterateGeneric(iterations, const_cast<Work*>(&work), call_work);
}

class ThreadedIterate : public testing::TestWithParam<int> {
 protected:
  void SetUp() override {
    zr::HostkitOptions options;
    options.threads = GetParam();
    options.message_sink = [this](u32, i32, const std::string& text) {
      const std::lock_guard hold(lock);
      message = text;
    };
    host = std::make_unique<zr::Hostkit>(std::move(options));
  }
  i32 threads() const { return GetParam(); }
  std::unique_ptr<zr::Hostkit> host;
  std::mutex lock;
  std::string message;
};
INSTANTIATE_TEST_SUITE_P(Threads, ThreadedIterate, testing::Values(1, 2, 5));

// Counts what runs, and sees two callbacks at work under one index.
class Ledger {
 public:
  Ledger(i32 iterations, i32 threads) : ran_(static_cast<size_t>(iterations)), busy_(static_cast<size_t>(threads)) {}
  void enter(i32 thread_index, i32 i) {
    const bool known = thread_index >= 0 && thread_index < static_cast<i32>(busy_.size());
    if (!known || busy_[static_cast<size_t>(thread_index)].exchange(true)) clashes++;
    ran_[static_cast<size_t>(i)]++;
  }
  void leave(i32 thread_index) { busy_[static_cast<size_t>(thread_index)] = false; }
  i32 ran(i32 i) const { return ran_[static_cast<size_t>(i)]; }
  std::atomic<i32> clashes = 0;

 private:
  std::vector<std::atomic<i32>> ran_;
  std::vector<std::atomic<bool>> busy_;
};

TEST_P(ThreadedIterate, RunsEveryIterationOnceUnderAnIndexOfItsOwn) {
  for (const i32 iterations : {1, 2, 3, 4, 5, 6, 7, 64, 79, 80, 81, 1000, 100003}) {
    Ledger ledger(iterations, threads());
    EXPECT_EQ(iterate(iterations,
                      [&](i32 thread_index, i32 i, i32 n) {
                        ledger.enter(thread_index, i);
                        ledger.leave(thread_index);
                        return n == iterations ? 0 : 99;
                      }),
              0);
    for (i32 i = 0; i < iterations; ++i) ASSERT_EQ(ledger.ran(i), 1) << "iteration " << i << " of " << iterations;
    EXPECT_EQ(ledger.clashes, 0) << iterations;
  }
}

TEST_P(ThreadedIterate, MinusOneCallsOncePerThread) {
  Ledger ledger(threads(), threads());
  EXPECT_EQ(iterate(-1,
                    [&](i32 thread_index, i32 i, i32 n) {
                      ledger.enter(thread_index, i);
                      const bool right = thread_index == i && n == threads();
                      ledger.leave(thread_index);
                      return right ? 0 : 99;
                    }),
            0);
  for (i32 i = 0; i < threads(); ++i) EXPECT_EQ(ledger.ran(i), 1) << i;
  EXPECT_EQ(ledger.clashes, 0);
}

TEST_P(ThreadedIterate, DoesNothingForNoIterationsAndRefusesNoFunction) {
  for (const i32 iterations : {0, -2, -100, INT32_MIN})
    EXPECT_EQ(iterate(iterations, [](i32, i32, i32) { return 99; }), 0);
  for (const i32 iterations : {-1, 0, 8}) {
    EXPECT_EQ(ZR_IterateGeneric(iterations, nullptr, nullptr), 3);
    EXPECT_EQ(message, "bad parameter passed to effect callback");
    message.clear();
  }
}

// Waits until `condition` holds, not for ever.
template <class Condition>
bool wait_until(Condition&& condition) {
  const auto give_up = std::chrono::steady_clock::now() + std::chrono::seconds(20);
  while (!condition() && std::chrono::steady_clock::now() < give_up) std::this_thread::yield();
  return condition();
}

TEST_P(ThreadedIterate, WorksAtTheSameTimeWithMoreThanOneThread) {
  if (threads() == 1) return;  // nobody to wait for
  for (const i32 iterations : {-1, 400}) {
    std::atomic<i32> entered = 0;
    EXPECT_EQ(iterate(iterations,
                      [&](i32, i32, i32) {
                        ++entered;
                        return wait_until([&] { return entered >= 2; }) ? 0 : 99;
                      }),
              0)
        << iterations;
  }
}

TEST_P(ThreadedIterate, ReturnsTheFailureOfTheSmallestIteration) {
  for (int round = 0; round < 10; ++round) {
    Ledger ledger(1000, threads());
    std::atomic<bool> later_one_failed = threads() == 1;
    EXPECT_EQ(iterate(1000,
                      [&](i32 thread_index, i32 i, i32) {
                        ledger.enter(thread_index, i);
                        if (i == 317) wait_until([&] { return later_one_failed.load(); });
                        ledger.leave(thread_index);
                        if (i < 317 || i % 3 != 2) return 0;
                        if (i > 317) later_one_failed = true;
                        return -i;
                      }),
              -317);
    EXPECT_TRUE(later_one_failed);
    for (i32 i = 0; i <= 317; ++i) ASSERT_EQ(ledger.ran(i), 1) << i;
  }
  EXPECT_EQ(iterate(-1, [&](i32, i32 i, i32 n) { return i >= n - 2 ? 500 + i : 0; }), 500 + std::max(threads() - 2, 0));
}

TEST_P(ThreadedIterate, StartsNoMoreThanOneIterationPerThreadOnceAllFail) {
  std::atomic<i32> calls = 0;
  EXPECT_EQ(iterate(1'000'000,
                    [&](i32, i32, i32) {
                      ++calls;
                      return 517;
                    }),
            517);
  EXPECT_LE(calls, threads());
}

TEST_P(ThreadedIterate, TurnsWhatACallbackThrowsIntoTheResult) {
  for (const i32 iterations : {-1, 1, 100}) {
    EXPECT_EQ(iterate(iterations, [](i32, i32, i32) -> i32 { throw i32{517}; }), 517);
    EXPECT_EQ(message, "") << "a code was reported where it was thrown";
    EXPECT_EQ(iterate(iterations, [](i32, i32, i32) -> i32 { throw std::bad_alloc(); }), 4);
    EXPECT_EQ(iterate(iterations,
                      [](i32, i32 i, i32) -> i32 {
                        if (i == 0) throw std::runtime_error("out of paint");
                        return 0;
                      }),
              3);
    EXPECT_EQ(message, "out of paint");
    message.clear();
  }
  EXPECT_EQ(iterate(100, [](i32, i32, i32) { return 0; }), 0) << "and goes on working";
}

TEST_P(ThreadedIterate, CallsFromInsideACallbackAreDoneThereUnderTheSameIndex) {
  const i32 outer = 40, inner = 25;
  std::atomic<i32> done = 0, wrong = 0, entered = 0;
  EXPECT_EQ(iterate(outer,
                    [&](i32 outer_index, i32, i32) {
                      ++entered;
                      if (threads() > 1) wait_until([&] { return entered >= 2; });  // on two indices at least
                      const auto self = std::this_thread::get_id();
                      i32 next = 0;
                      return iterate(inner, [&](i32 index, i32 i, i32 n) {
                        const bool right = i == next++ && n == inner && std::this_thread::get_id() == self &&
                                           index == (threads() > 1 ? outer_index : 0);
                        wrong += !right;
                        ++done;
                        return 0;
                      });
                    }),
            0);
  EXPECT_EQ(done, outer * inner);
  EXPECT_EQ(wrong, 0);
}

TEST_P(ThreadedIterate, MinusOneFromInsideACallbackTakesAllIndicesInOrder) {
  std::atomic<i32> wrong = 0;
  EXPECT_EQ(iterate(30,
                    [&](i32, i32, i32) {
                      i32 next = 0;
                      const i32 result = iterate(-1, [&](i32 index, i32 i, i32 n) {
                        wrong += !(index == next && i == next && n == threads());
                        ++next;
                        return 0;
                      });
                      wrong += next != threads();
                      return result;
                    }),
            0);
  EXPECT_EQ(wrong, 0);
}

TEST_P(ThreadedIterate, ANestedFailureIsTheResultOfBoth) {
  EXPECT_EQ(iterate(20, [](i32, i32 i,
                           i32) { return iterate(20, [i](i32, i32 j, i32) { return i == 3 && j == 4 ? 88 : 0; }); }),
            88);
}

TEST_P(ThreadedIterate, CallsFromSeveralThreadsAreIndependent) {
  std::vector<std::thread> callers;
  std::atomic<i32> wrong = 0;
  for (int caller = 0; caller < 4; ++caller)
    callers.emplace_back([&, caller] {
      for (int round = 0; round < 100; ++round) {
        Ledger ledger(200, threads());
        const i32 fails_at = round % 2 == 0 ? 150 + caller : 1000;
        const i32 result = iterate(200, [&](i32 thread_index, i32 i, i32) {
          ledger.enter(thread_index, i);
          ledger.leave(thread_index);
          return i == fails_at ? i : 0;
        });
        wrong += result != (fails_at < 200 ? fails_at : 0);
        wrong += ledger.clashes;
        for (i32 i = 0; i < std::min(fails_at, 200); ++i) wrong += ledger.ran(i) != 1;
      }
    });
  for (std::thread& caller : callers) caller.join();
  EXPECT_EQ(wrong, 0);
}

}  // namespace
