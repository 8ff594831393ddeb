// SPDX-License-Identifier: MIT
#include <gtest/gtest.h>
#include <orb/thread/critical_section.h>
#include <orb/thread/event.h>
#include <orb/thread/thread.h>
#include <pthread.h>

#include <chrono>
#include <thread>

namespace {

struct Worker {
  virtual void Run() {
    pthread_detach(pthread_self());  // Nobody else does.
    done.Set();
  }
  virtual ~Worker() = default;

  COrbEvent done;
};

void* Begin(void* worker) {
  static_cast<Worker*>(worker)->Run();
  return nullptr;
}

TEST(CriticalSection, IsFreeAfterAsManyLeavesAsEnters) {
  COrbCriticalSection lock;
  COrbEvent entered;
  lock.Enter();
  lock.Enter();
  std::thread other([&] {
    lock.Enter();
    entered.Set();
    lock.Leave();
  });
  lock.Leave();
  EXPECT_FALSE(entered.WaitTime(25));
  lock.Leave();
  EXPECT_EQ(entered.Wait(), 0);
  other.join();
}

TEST(BeginThread, RunsAFunctionOrTheFirstVirtualOne) {
  Worker worker;
  EXPECT_EQ(OrbBeginThread(Begin, &worker), 0);
  EXPECT_TRUE(worker.done.WaitTime(60'000));
  EXPECT_EQ(OrbBeginRunnableThread(&worker), 0);
  EXPECT_TRUE(worker.done.WaitTime(60'000));
}

TEST(Sleep, LastsAtLeastAsLongUntilTheProductWraps) {
  const auto begin = std::chrono::steady_clock::now();
  EXPECT_EQ(OrbSleep(20), 0);
  EXPECT_GE(std::chrono::steady_clock::now() - begin, std::chrono::milliseconds(20));
  EXPECT_EQ(OrbSleep(4'294'968), 0);  // 4,294,968,000 - 2^32 = 704 microseconds, not 71 minutes.
}

TEST(ProcessLock, IsNumber256AndKeepsOtherThreadsOut) {
  for (const int unknown : {0, 255, 257, -256}) {
    EXPECT_EQ(OrbMacEnterLock(unknown), 0x1103U) << unknown;
    EXPECT_EQ(OrbMacLeaveLock(unknown), 0x1103U) << unknown;
  }
  int sum = 0;
  const auto add = [&sum] {
    for (int i = 0; i < 10'000; ++i) {
      EXPECT_EQ(OrbMacEnterLock(256), 0U);
      ++sum;
      EXPECT_EQ(OrbMacLeaveLock(256), 0U);
    }
  };
  std::thread other(add);
  add();
  other.join();
  EXPECT_EQ(sum, 20'000);
}

}  // namespace
