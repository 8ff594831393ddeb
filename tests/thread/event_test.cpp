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

using std::chrono::milliseconds;
using std::chrono::steady_clock;

/// The names of this library's semaphores that exist on the machine.
std::set<std::string> SemaphoreNames() {
  std::set<std::string> names;
  for (const auto& entry : std::filesystem::directory_iterator("/dev/shm")) {
    const std::string name = entry.path().filename();
    if (name.starts_with("sem.OrbRTL_")) names.insert(name);
  }
  return names;
}

TEST(Event, CountsItsSets) {
  COrbEvent event;
  const auto begin = steady_clock::now();
  EXPECT_FALSE(event.WaitTime(0));
  EXPECT_FALSE(event.WaitTime(100));  // Gives up after nine polls.
  EXPECT_GE(steady_clock::now() - begin, milliseconds(90));
  for (int i = 0; i < 3; ++i) EXPECT_EQ(event.Set(), 0);
  EXPECT_EQ(event.Wait(), 0);
  EXPECT_TRUE(event.WaitTime(0));
  EXPECT_TRUE(event.WaitTime(10));
  EXPECT_FALSE(event.WaitTime(10));
}

TEST(Event, WakesAWaiterOnAnotherThread) {
  COrbEvent event;
  COrbEvent done;
  std::thread waiter([&] {
    EXPECT_EQ(event.Wait(), 0);
    EXPECT_TRUE(event.WaitTime(60'000));
    done.Set();
  });
  EXPECT_FALSE(done.WaitTime(25));
  event.Set();
  EXPECT_FALSE(done.WaitTime(25));
  event.Set();
  EXPECT_EQ(done.Wait(), 0);
  waiter.join();
}

TEST(Event, HasANameOfItsOwnThatGoesWithIt) {
  auto first = std::make_unique<COrbEvent>();
  const std::set<std::string> one = SemaphoreNames();
  auto second = std::make_unique<COrbEvent>();
  std::set<std::string> added = SemaphoreNames();
  for (const std::string& name : one) added.erase(name);
  // Other programs' events come and go, so more may have been added than the second one's.
  ASSERT_FALSE(added.empty());
  for (const std::string& name : added) {
    EXPECT_EQ(name.size(), std::string("sem.OrbRTL_").size() + 16);
    EXPECT_EQ(name.find_first_not_of("0123456789abcdef", 11), std::string::npos) << name;
  }
  second->Set();
  EXPECT_FALSE(first->WaitTime(0));
  second.reset();
  if (added.size() == 1) {
    EXPECT_EQ(SemaphoreNames().count(*added.begin()), 0U);
  }
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
