// SPDX-License-Identifier: MIT
#pragma once

/// The progress and cancel callback of the long operations. It is called at the points that each
/// operation names, with the pointer it was given, on the caller's thread and without any lock
/// held; it may call the library again. True goes on, false cancels. A null function means no
/// reports and no cancel.
using OrbProgressProc = bool (*)(void*);
