// SPDX-License-Identifier: MIT
#pragma once

#include <orb/export.h>
#include <semaphore.h>

/// A counting event on a named POSIX semaphore: each Set() lets one wait pass, so several calls of
/// Set() before a wait add up. Any thread may set and wait. The name is "/OrbRTL_" and 16 random
/// hexadecimal digits, unique among processes, and goes with the event.
///
/// An event whose semaphore could not be made (no shared memory left) fails in every call: Set()
/// and Wait() give -1, WaitTime() false.
class ORB_EXPORT COrbEvent {
 public:
  /// Count 0.
  COrbEvent();
  COrbEvent(const COrbEvent&) = delete;
  COrbEvent& operator=(const COrbEvent&) = delete;
  virtual ~COrbEvent();

  /// Adds one to the count and wakes one waiter. 0, or -1.
  int Set();
  /// Blocks until the count is above 0 and takes one. 0, or -1.
  int Wait();
  /// True when a count was taken in time. Polls every 10 ms, so it may give up that much early: 100
  /// waits about 90 ms, and up to 10 tries once without waiting.
  bool WaitTime(unsigned int milliseconds);

 private:
  sem_t* semaphore;
  char name[32];
};
