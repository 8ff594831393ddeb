// SPDX-License-Identifier: MIT
#include <orb/thread/thread.h>
#include <pthread.h>
#include <unistd.h>

#include <cstdint>
#include <cstring>

#if defined(__clang__)
#define ORB_CALLS_BY_ADDRESS __attribute__((no_sanitize("function", "cfi-icall", "cfi-vcall")))
#else
#define ORB_CALLS_BY_ADDRESS
#endif

namespace {

constexpr int kProcessLock = 256;

constinit pthread_mutex_t processLock = PTHREAD_MUTEX_INITIALIZER;

/// The class of the object is not known here, so no cast can lead to its function. In the Itanium
/// C++ ABI an object begins with the address of its virtual table, whose first entry is its first
/// virtual function; that takes the object as its only argument, as a plain function would.
ORB_CALLS_BY_ADDRESS void* RunFirstVirtualFunction(void* object) {
  const void* table = nullptr;
  std::memcpy(&table, object, sizeof table);
  void (*function)(void*) = nullptr;
  std::memcpy(&function, table, sizeof function);
  function(object);
  return nullptr;
}

}  // namespace

int OrbBeginThread(void* (*start)(void*), void* argument) {
  pthread_t thread;
  return pthread_create(&thread, nullptr, start, argument);
}

int OrbBeginRunnableThread(void* object) { return OrbBeginThread(RunFirstVirtualFunction, object); }

int OrbSleep(unsigned int milliseconds) { return usleep(std::uint32_t{milliseconds} * 1000U); }

int OrbSwitchThread() { return usleep(0); }

OrbResult OrbMacEnterLock(int lockNumber) {
  if (lockNumber != kProcessLock) return kOrbErrNotSupported;
  pthread_mutex_lock(&processLock);
  return kOrbNoErr;
}

OrbResult OrbMacLeaveLock(int lockNumber) {
  if (lockNumber != kProcessLock) return kOrbErrNotSupported;
  pthread_mutex_unlock(&processLock);
  return kOrbNoErr;
}
