// SPDX-License-Identifier: MIT
#pragma once

namespace orbimport {

/// From now on the first Ctrl-C (or SIGTERM, SIGHUP) only asks for an end; the second one ends the
/// process. A closed output is an error of the write, no longer a signal.
void InstallSignalHandlers();

/// The signal that asked for an end, or 0.
int InterruptingSignal();

}  // namespace orbimport
