// SPDX-License-Identifier: MIT
#pragma once

#include <orb/export.h>
#include <pthread.h>
#include <sys/single_threaded.h>

/// A recursive lock. The thread that holds it may enter again and must leave as often as it
/// entered. Unlocked when made; must be unlocked when destroyed.
class ORB_EXPORT COrbCriticalSection {
 public:
  COrbCriticalSection() = default;
  COrbCriticalSection(const COrbCriticalSection&) = delete;
  COrbCriticalSection& operator=(const COrbCriticalSection&) = delete;
  virtual ~COrbCriticalSection();

  /// Both are const so that const operations of an owner can lock.
  void Enter() const { pthread_mutex_lock(&mutex_); }
  void Leave() const { pthread_mutex_unlock(&mutex_); }

 private:
  // Texts make many: a constant saves making an attribute and calling pthread_mutex_init.
  mutable pthread_mutex_t mutex_ = PTHREAD_RECURSIVE_MUTEX_INITIALIZER_NP;
};

namespace orb {

/// Whether the process has no thread but this one. It stays so until this thread starts another, so
/// what is done before that needs no lock.
inline bool IsOnlyThread() { return __libc_single_threaded != 0; }

}  // namespace orb
