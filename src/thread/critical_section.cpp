// SPDX-License-Identifier: MIT
#include <orb/thread/critical_section.h>

namespace {

/// The attribute of every lock, made once: making one for each lock doubles the cost of a short
/// text.
const pthread_mutexattr_t* RecursiveAttribute() {
  static const pthread_mutexattr_t attribute = [] {
    pthread_mutexattr_t made;
    pthread_mutexattr_init(&made);
    pthread_mutexattr_settype(&made, PTHREAD_MUTEX_RECURSIVE);
    return made;
  }();
  return &attribute;
}

}  // namespace

COrbCriticalSection::COrbCriticalSection() { pthread_mutex_init(&mutex_, RecursiveAttribute()); }

COrbCriticalSection::~COrbCriticalSection() { pthread_mutex_destroy(&mutex_); }
