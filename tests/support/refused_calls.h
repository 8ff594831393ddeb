// SPDX-License-Identifier: MIT
#pragma once

#include <linux/filter.h>
#include <linux/seccomp.h>
#include <sys/prctl.h>

#include <cstddef>
#include <vector>

namespace orb::test {

/// A system call that fails, as it does on a lesser file system or an older kernel.
struct RefusedCall {
  long number;
  int error;
  /// Only where the third argument has one of these bits; 0 for always.
  unsigned flags = 0;
};

/// Refuses the calls to this process for the rest of its life. For the body of RunInChild().
inline bool RefuseCalls(const std::vector<RefusedCall>& calls) {
  std::vector<sock_filter> program;
  for (const RefusedCall& call : calls) {
    const auto number = static_cast<unsigned>(call.number);
    const auto answer = SECCOMP_RET_ERRNO | static_cast<unsigned>(call.error);
    const unsigned char skip = call.flags != 0 ? 3 : 1;
    program.push_back(BPF_STMT(BPF_LD | BPF_W | BPF_ABS, offsetof(seccomp_data, nr)));
    program.push_back(BPF_JUMP(BPF_JMP | BPF_JEQ | BPF_K, number, 0, skip));
    if (call.flags != 0) {
      program.push_back(BPF_STMT(BPF_LD | BPF_W | BPF_ABS, offsetof(seccomp_data, args[2])));
      program.push_back(BPF_JUMP(BPF_JMP | BPF_JSET | BPF_K, call.flags, 0, 1));
    }
    program.push_back(BPF_STMT(BPF_RET | BPF_K, answer));
  }
  program.push_back(BPF_STMT(BPF_RET | BPF_K, SECCOMP_RET_ALLOW));
  sock_fprog filter{static_cast<unsigned short>(program.size()), program.data()};
  return ::prctl(PR_SET_NO_NEW_PRIVS, 1, 0, 0, 0) == 0 &&
         ::prctl(PR_SET_SECCOMP, SECCOMP_MODE_FILTER, &filter) == 0;
}

}  // namespace orb::test
