// SPDX-License-Identifier: Apache-2.0
// Cameras in a process of their own, so that their work is not counted.
#pragma once

#include <sys/wait.h>
#include <unistd.h>

#include <csignal>
#include <cstdio>
#include <cstdlib>
#include <functional>

namespace vexa_bench {

class CameraProcess {
 public:
  /// `serve` runs in the new process: it reports that the cameras are ready by writing one byte to the descriptor, and
  /// does not return. Ends the program when no byte comes.
  explicit CameraProcess(const std::function<void(int)>& serve) {
    int ready[2];
    if (pipe(ready) != 0) std::exit(1);
    child_ = fork();
    if (child_ == 0) {
      serve(ready[1]);
      _exit(1);
    }
    close(ready[1]);
    char byte = 0;
    const bool started = read(ready[0], &byte, 1) == 1;
    close(ready[0]);
    if (started) return;
    std::fprintf(stderr, "the cameras did not start: is port 554 free, and are you root?\n");
    std::exit(1);
  }
  ~CameraProcess() {
    kill(child_, SIGKILL);
    waitpid(child_, nullptr, 0);
  }
  CameraProcess(const CameraProcess&) = delete;
  CameraProcess& operator=(const CameraProcess&) = delete;

 private:
  pid_t child_ = -1;
};

/// Reports "ready" from the new process.
inline void report_ready(int ready) {
  if (write(ready, "r", 1) != 1) _exit(1);
}

}  // namespace vexa_bench
