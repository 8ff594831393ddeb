// SPDX-License-Identifier: MIT
#pragma once

/// Marks what the shared library exports. Everything without it stays inside (hidden visibility).
#define ORB_EXPORT __attribute__((visibility("default")))
