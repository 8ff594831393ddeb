// SPDX-License-Identifier: MIT
#include <gtest/gtest.h>
#include <orb/thread/event.h>

#include <chrono>
#include <filesystem>
#include <memory>
#include <set>
#include <string>
#include <thread>

#include "support/resource_limit.h"

namespace {

/// The semaphores that exist on the machine.
std::set<std::string> Semaphores() {
  std::set<std::string> names;
  for (const auto& entry : std::filesystem::directory_iterator("/dev/shm"))
    names.insert(entry.path().filename());
  return names;
}

TEST(Event, CountsItsSets) {
  using std::chrono::steady_clock;
  COrbEvent event;
  const auto begin = steady_clock::now();
  EXPECT_FALSE(event.WaitTime(0));
  EXPECT_FALSE(event.WaitTime(100));  // Gives up after nine polls.
  EXPECT_GE(steady_clock::now() - begin, std::chrono::milliseconds(90));
  for (int i = 0; i < 3; ++i) EXPECT_EQ(event.Set(), 0);
  EXPECT_EQ(event.Wait(), 0);
  EXPECT_TRUE(event.WaitTime(0) && event.WaitTime(10));
  EXPECT_FALSE(event.WaitTime(10));
}

TEST(Event, WakesAWaiterOnAnotherThread) {
  COrbEvent event, done;
  std::thread waiter([&] {
    EXPECT_EQ(event.Wait(), 0);
    EXPECT_TRUE(event.WaitTime(60'000));
    done.Set();
  });
  for (int i = 0; i < 2; ++i) {
    EXPECT_FALSE(done.WaitTime(25));
    event.Set();
  }
  EXPECT_EQ(done.Wait(), 0);
  waiter.join();
}

TEST(Event, HasANameOfItsOwnThatGoesWithIt) {
  COrbEvent first;
  const std::set<std::string> before = Semaphores();
  auto second = std::make_unique<COrbEvent>();
  // Other programs' events come and go, so more may have been added than the second one's.
  std::set<std::string> added;
  for (const std::string& name : Semaphores()) {
    const bool isOurs = name.starts_with("sem.OrbRTL_") && name.size() == 11 + 16 &&
                        name.find_first_not_of("0123456789abcdef", 11) == std::string::npos;
    if (isOurs && !before.contains(name)) added.insert(name);
  }
  ASSERT_FALSE(added.empty());
  second->Set();
  EXPECT_FALSE(first.WaitTime(0));
  second.reset();
  EXPECT_TRUE(added.size() > 1 || !Semaphores().contains(*added.begin()));
}

TEST(Event, WithoutSemaphoreFailsInEveryCall) {
  std::unique_ptr<COrbEvent> event;
  {
    const orb::test::ResourceLimit none(RLIMIT_NOFILE, 0);
    event = std::make_unique<COrbEvent>();
  }
  EXPECT_EQ(event->Set(), -1);
  EXPECT_EQ(event->Wait(), -1);
  EXPECT_FALSE(event->WaitTime(100));
}

}  // namespace
