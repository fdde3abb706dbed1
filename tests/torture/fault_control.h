// SPDX-License-Identifier: Apache-2.0
// What tests/torture's two halves share: the library that is loaded before all others and makes calls fail, and the
// program that decides which call.
#ifndef TESTS_TORTURE_FAULT_CONTROL_H_
#define TESTS_TORTURE_FAULT_CONTROL_H_

#include <cstdint>

namespace vexa::torture {

enum class Function : std::int32_t {
  kAllocate,
  kSocket,
  kConnect,
  kBind,
  kSetsockopt,
  kFcntl,
  kPoll,
  kSend,
  kReceive,
  kPipe,
  kEventfd,
  kThread,
  kOpen,
  kRead,
  kWrite,
  kRename,
  kSync,
  kResolve,
  kEpoll,
  kEpollAdd,
  kTimer,
  kSocketName,
  kSocketOption,
  kMutex
};

enum class Kind : std::int32_t { kError, kShort };

struct Fault {
  Function function;
  Kind kind;
  std::int32_t error;    ///< errno of a call that fails; h_errno for kResolve
  std::int32_t forever;  ///< 0: the one call, 1: it and all later ones
  std::uint64_t at;      ///< counted from 1
};

}  // namespace vexa::torture

extern "C" {
// Counts the calls of `fault.function` from now on and makes the one at `fault.at` fail; 0 makes none fail.
void vexa_torture_arm(const vexa::torture::Fault* fault);
// Ends it; the calls counted since.
std::uint64_t vexa_torture_disarm();
}

#endif  // TESTS_TORTURE_FAULT_CONTROL_H_
