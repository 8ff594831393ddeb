// SPDX-License-Identifier: MIT
#include <dirent.h>
#include <gtest/gtest.h>
#include <orb/thread/event.h>
#include <sys/resource.h>

#include <chrono>
#include <memory>
#include <set>
#include <string>
#include <thread>

namespace {

using std::chrono::milliseconds;
using std::chrono::steady_clock;

/// The names of this library's semaphores that exist on the machine.
std::set<std::string> SemaphoreNames() {
  std::set<std::string> names;
  DIR* folder = opendir("/dev/shm");
  if (folder == nullptr) return names;
  while (const dirent* entry = readdir(folder)) {
    const std::string name = entry->d_name;
    if (name.rfind("sem.OrbRTL_", 0) == 0) names.insert(name);
  }
  closedir(folder);
  return names;
}

/// While it lives, this process can open nothing more.
class NoMoreFiles {
 public:
  NoMoreFiles() {
    getrlimit(RLIMIT_NOFILE, &before_);
    const rlimit none = {0, before_.rlim_max};
    setrlimit(RLIMIT_NOFILE, &none);
  }
  ~NoMoreFiles() { setrlimit(RLIMIT_NOFILE, &before_); }
  NoMoreFiles(const NoMoreFiles&) = delete;
  NoMoreFiles& operator=(const NoMoreFiles&) = delete;

 private:
  rlimit before_ = {};
};

TEST(Event, CountsItsSets) {
  COrbEvent event;
  EXPECT_FALSE(event.WaitTime(0));
  for (int i = 0; i < 3; ++i) EXPECT_EQ(event.Set(), 0);
  EXPECT_EQ(event.Wait(), 0);
  EXPECT_TRUE(event.WaitTime(0));
  EXPECT_TRUE(event.WaitTime(10));
  EXPECT_FALSE(event.WaitTime(10));
}

TEST(Event, WaitTimeGivesUpAfterNinePolls) {
  COrbEvent event;
  const auto begin = steady_clock::now();
  EXPECT_FALSE(event.WaitTime(100));
  EXPECT_GE(steady_clock::now() - begin, milliseconds(90));
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
    const NoMoreFiles limit;
    event = std::make_unique<COrbEvent>();
  }
  EXPECT_EQ(event->Set(), -1);
  EXPECT_EQ(event->Wait(), -1);
  EXPECT_FALSE(event->WaitTime(100));
}

}  // namespace
