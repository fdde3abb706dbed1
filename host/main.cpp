// SPDX-License-Identifier: Apache-2.0
// vexactl: the command-line host.
#include <csignal>
#include <cstdio>
#include <exception>

#include "host/access/driver_trace.h"
#include "host/command_line.h"
#include "host/console/interrupt.h"

namespace {

int run(const vexa::host::Invocation& invocation) {
  using vexa::host::ExitCode;
  vexa::host::UniqueFd results = vexa::host::take_standard_output();
  if (!results.valid() || !vexa::host::Interrupt::install()) {
    std::perror("vexactl: cannot set up its descriptors");
    return static_cast<int>(ExitCode::kCannotWrite);
  }
  // A reader of our output that has gone is an error to report, not a reason to die.
  if (std::signal(SIGPIPE, SIG_IGN) == SIG_ERR) return static_cast<int>(ExitCode::kCannotWrite);
  vexa::host::Terminal terminal(std::move(results));
  return static_cast<int>(vexa::host::run_command_line(invocation, terminal));
}

}  // namespace

int main(int argc, char** argv, char** environment) {
  try {
    return run({argc, argv, environment});
  } catch (const std::exception& error) {
    std::fprintf(stderr, "vexactl: %s\n", error.what());
    return static_cast<int>(vexa::host::ExitCode::kUsage);
  }
}
