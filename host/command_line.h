// SPDX-License-Identifier: Apache-2.0
// The command line of vexactl as a whole.
#ifndef HOST_COMMAND_LINE_H_
#define HOST_COMMAND_LINE_H_

#include "host/base/problem.h"
#include "host/console/terminal.h"

namespace vexa::host {

struct Invocation {
  int argc;
  const char* const* argv;
  const char* const* environment;
};

[[nodiscard]] ExitCode run_command_line(const Invocation& invocation, Terminal& terminal);

}  // namespace vexa::host

#endif  // HOST_COMMAND_LINE_H_
