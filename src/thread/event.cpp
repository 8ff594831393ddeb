// SPDX-License-Identifier: MIT
#include <fcntl.h>
#include <orb/thread/event.h>
#include <sys/random.h>
#include <sys/stat.h>
#include <time.h>
#include <unistd.h>

#include <cerrno>
#include <cinttypes>
#include <cstdint>
#include <cstdio>

namespace {

constexpr mode_t kMode = 0664;
constexpr unsigned int kPollMilliseconds = 10;

/// Where the kernel gives no random number the clock will do: a name that is taken is tried again.
std::uint64_t RandomNumber() {
  std::uint64_t number = 0;
  if (getrandom(&number, sizeof number, 0) == sizeof number) return number;
  timespec now = {};
  clock_gettime(CLOCK_MONOTONIC, &now);
  return static_cast<std::uint64_t>(now.tv_sec) << 32 ^ static_cast<std::uint64_t>(now.tv_nsec);
}

int FailWithoutSemaphore() {
  errno = EINVAL;
  return -1;
}

}  // namespace

COrbEvent::COrbEvent() {
  do {
    std::snprintf(name, sizeof name, "/OrbRTL_%016" PRIx64, RandomNumber());
    semaphore = sem_open(name, O_CREAT | O_EXCL, kMode, 0U);
  } while (semaphore == SEM_FAILED && errno == EEXIST);
  if (semaphore == SEM_FAILED) semaphore = nullptr;
}

COrbEvent::~COrbEvent() {
  if (semaphore == nullptr) return;
  sem_close(semaphore);
  sem_unlink(name);
}

int COrbEvent::Set() { return semaphore == nullptr ? FailWithoutSemaphore() : sem_post(semaphore); }

int COrbEvent::Wait() {
  return semaphore == nullptr ? FailWithoutSemaphore() : sem_wait(semaphore);
}

bool COrbEvent::WaitTime(unsigned int milliseconds) {
  if (semaphore == nullptr) return false;
  if (sem_trywait(semaphore) == 0) return true;
  for (unsigned int left = milliseconds; left > kPollMilliseconds; left -= kPollMilliseconds) {
    usleep(kPollMilliseconds * 1000);
    if (sem_trywait(semaphore) == 0) return true;
  }
  return false;
}
