// SPDX-License-Identifier: Apache-2.0
// Work done in a process of its own, where limits, users and working folders may be changed.
#pragma once

#include <grp.h>
#include <gtest/gtest.h>
#include <sys/wait.h>
#include <unistd.h>

#include <string>

namespace vexa_test {

/// Runs `work` in a child process, and returns the text that it returns; "ended by signal N" or "ended with code N"
/// when it did not come that far. Call it while no other thread runs.
template <typename Work>
std::string in_child(Work work) {
  int ends[2] = {-1, -1};
  if (pipe(ends) != 0) return "no pipe";
  const pid_t child = fork();
  if (child == 0) {
    close(ends[0]);
    const std::string report = work();
    const bool told = write(ends[1], report.data(), report.size()) == static_cast<ssize_t>(report.size());
    _exit(told ? 0 : 1);
  }
  close(ends[1]);
  std::string report;
  char piece[512];
  for (ssize_t got = 0; (got = read(ends[0], piece, sizeof piece)) > 0;) {
    report.append(piece, static_cast<std::size_t>(got));
  }
  close(ends[0]);
  int status = 0;
  if (child < 0 || waitpid(child, &status, 0) != child) return "no child";
  if (WIFSIGNALED(status)) return "ended by signal " + std::to_string(WTERMSIG(status));
  if (WEXITSTATUS(status) != 0) return "ended with code " + std::to_string(WEXITSTATUS(status));
  return report;
}

/// Gives up the superuser's rights for the rest of a child's life. An ordinary user stays what it is.
inline bool become_unprivileged() {
  constexpr uid_t kNobody = 65534;
  if (geteuid() != 0) return true;
  return setgroups(0, nullptr) == 0 && setresgid(kNobody, kNobody, kNobody) == 0 &&
         setresuid(kNobody, kNobody, kNobody) == 0;
}

/// What `work` writes to standard error.
template <typename Work>
std::string stderr_of(Work work) {
  testing::internal::CaptureStderr();
  work();
  return testing::internal::GetCapturedStderr();
}

}  // namespace vexa_test
