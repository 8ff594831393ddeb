// SPDX-License-Identifier: MIT
#include <orb/thread/critical_section.h>

COrbCriticalSection::~COrbCriticalSection() { pthread_mutex_destroy(&mutex_); }
