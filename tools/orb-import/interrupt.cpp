// SPDX-License-Identifier: MIT
#include "interrupt.h"

#include <csignal>
#include <initializer_list>

namespace orbimport {
namespace {

volatile std::sig_atomic_t received = 0;

extern "C" void OnSignal(int number) { received = number; }

}  // namespace

void InstallSignalHandlers() {
  struct sigaction action = {};
  action.sa_handler = OnSignal;
  action.sa_flags = static_cast<int>(SA_RESTART | SA_RESETHAND);
  for (const int number : {SIGINT, SIGTERM, SIGHUP}) {
    struct sigaction before = {};
    sigaction(number, nullptr, &before);
    if (before.sa_handler != SIG_IGN) sigaction(number, &action, nullptr);  // Such as under nohup.
  }
  std::signal(SIGPIPE, SIG_IGN);
}

int InterruptingSignal() { return received; }

}  // namespace orbimport
