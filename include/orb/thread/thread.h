// SPDX-License-Identifier: MIT
#pragma once

#include <orb/export.h>
#include <orb/result.h>

extern "C" {

/// Runs start(argument) on a thread of its own, which the library neither joins nor detaches and of
/// which it keeps no record. 0, or the error number of pthread_create (11: no more threads).
ORB_EXPORT int OrbBeginThread(void* (*start)(void*), void* argument);

/// Runs the first virtual function of `object` on a thread of its own. `object` must be of a
/// polymorphic class whose first virtual function takes no arguments, and must live until that has
/// returned; the library does not own it. 0, or the error number of pthread_create.
ORB_EXPORT int OrbBeginRunnableThread(void* object);

/// Sleeps. The microseconds are an unsigned 32-bit product: above 4,294,967 ms the time wraps.
/// 0, or -1 when a signal cut it short.
ORB_EXPORT int OrbSleep(unsigned int milliseconds);

/// Gives up the rest of the time slice. 0, or -1.
ORB_EXPORT int OrbSwitchThread();

}  // extern "C"

/// Takes the one process-wide lock, number 256 (0x100). It is not recursive. kOrbErrNotSupported
/// for any other number, and nothing is locked.
ORB_EXPORT OrbResult OrbMacEnterLock(int lockNumber);
/// Gives the process-wide lock back. kOrbErrNotSupported for any number but 256.
ORB_EXPORT OrbResult OrbMacLeaveLock(int lockNumber);
