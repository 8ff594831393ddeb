// SPDX-License-Identifier: MIT
#pragma once

/// Marks what the shared library exports. Everything without it stays inside (hidden visibility).
#define ORB_EXPORT __attribute__((visibility("default")))

/// Marks what an exported class keeps to itself.
#define ORB_LOCAL __attribute__((visibility("hidden")))
