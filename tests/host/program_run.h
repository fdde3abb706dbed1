// SPDX-License-Identifier: Apache-2.0
// Runs a program of the build as a user would, in a folder of its own.
#pragma once

#include <fcntl.h>
#include <poll.h>
#include <pty.h>
#include <spawn.h>
#include <sys/wait.h>
#include <termios.h>
#include <unistd.h>

#include <chrono>
#include <csignal>
#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <functional>
#include <memory>
#include <string>
#include <string_view>
#include <thread>
#include <utility>
#include <vector>

#include "tests/support/process_state.h"
#include "tests/support/temporary_folder.h"

namespace vexa_test {

struct ProgramResult {
  int exit_code = -1;  // 128 + N when signal N ended it
  std::string out;
  std::string err;
};

class ProgramRun {
 public:
  enum class StandardError { kFile, kTerminal };

  // The program's folder is `folder`, and its environment just `environment`. Its standard output is `standard_output`
  // where that is a descriptor, which stays the caller's; else a file. Its standard input likewise; else empty.
  ProgramRun(const TemporaryFolder& folder, std::vector<std::string> arguments,
             std::vector<std::string> environment = {}, StandardError standard_error = StandardError::kFile,
             int standard_output = -1, int standard_input = -1)
      : out_(folder / ".out"), err_(folder / ".err") {
    posix_spawn_file_actions_t actions;
    posix_spawn_file_actions_init(&actions);
    const int create = O_WRONLY | O_CREAT | O_TRUNC;
    posix_spawn_file_actions_addopen(&actions, STDIN_FILENO, "/dev/null", O_RDONLY, 0);
    if (standard_input >= 0) posix_spawn_file_actions_adddup2(&actions, standard_input, STDIN_FILENO);
    posix_spawn_file_actions_addopen(&actions, STDOUT_FILENO, out_.c_str(), create, 0600);
    if (standard_output >= 0) posix_spawn_file_actions_adddup2(&actions, standard_output, STDOUT_FILENO);
    if (standard_error == StandardError::kFile) {
      posix_spawn_file_actions_addopen(&actions, STDERR_FILENO, err_.c_str(), create, 0600);
    } else {
      posix_spawn_file_actions_adddup2(&actions, open_terminal(), STDERR_FILENO);
    }
    posix_spawn_file_actions_addchdir_np(&actions, folder.path().c_str());
    // A camera of this process that is pulled out must not live on in the program's copies of its sockets.
    posix_spawn_file_actions_addclosefrom_np(&actions, STDERR_FILENO + 1);
    // Where a build that counts what runs writes its counts; by itself it would choose the program's folder.
    if (const char* const counts = std::getenv("LLVM_PROFILE_FILE"); counts != nullptr) {
      environment.push_back(std::string("LLVM_PROFILE_FILE=") + counts);
    }
    spawn(actions, pointers_to(arguments), pointers_to(environment));
    posix_spawn_file_actions_destroy(&actions);
  }

  ~ProgramRun() {
    if (pid_ > 0) {
      kill(pid_, SIGKILL);
      wait();
    }
  }
  ProgramRun(const ProgramRun&) = delete;
  ProgramRun& operator=(const ProgramRun&) = delete;

  void signal(int number) const { kill(pid_, number); }

  ProgramResult wait() {
    ProgramResult result;
    int status = 0;
    if (pid_ > 0 && waitpid(std::exchange(pid_, -1), &status, 0) > 0) {
      result.exit_code = WIFSIGNALED(status) ? 128 + WTERMSIG(status) : WEXITSTATUS(status);
    }
    result.out = contents_of(out_);
    if (reader_.joinable()) reader_.join();
    result.err = terminal_text_.empty() ? contents_of(err_) : terminal_text_;
    return result;
  }

 private:
  static std::vector<char*> pointers_to(std::vector<std::string>& texts) {
    std::vector<char*> pointers;
    for (std::string& text : texts) pointers.push_back(text.data());
    pointers.push_back(nullptr);
    return pointers;
  }

  void spawn(const posix_spawn_file_actions_t& actions, std::vector<char*> arguments, std::vector<char*> environment) {
    // Signals as a terminal gives them, whatever a test run in the background has inherited.
    sigset_t all;
    sigset_t none;
    sigfillset(&all);
    sigemptyset(&none);
    posix_spawnattr_t attributes;
    posix_spawnattr_init(&attributes);
    posix_spawnattr_setsigdefault(&attributes, &all);
    posix_spawnattr_setsigmask(&attributes, &none);
    posix_spawnattr_setflags(&attributes, POSIX_SPAWN_SETSIGDEF | POSIX_SPAWN_SETSIGMASK);
    if (posix_spawn(&pid_, arguments[0], &actions, &attributes, arguments.data(), environment.data()) != 0) pid_ = -1;
    posix_spawnattr_destroy(&attributes);
    if (slave_ >= 0) close(slave_);
  }

  // Reads on until the program, the last to hold the terminal's other end, has gone.
  int open_terminal() {
    int master = -1;
    if (openpty(&master, &slave_, nullptr, nullptr, nullptr) != 0) return STDERR_FILENO;
    fcntl(master, F_SETFD, FD_CLOEXEC);
    fcntl(slave_, F_SETFD, FD_CLOEXEC);
    reader_ = std::thread([this, master] {
      char piece[512];
      for (ssize_t got = 0; (got = read(master, piece, sizeof piece)) > 0;) {
        terminal_text_.append(piece, static_cast<std::size_t>(got));
      }
      close(master);
    });
    return slave_;
  }

  const std::string out_;
  const std::string err_;
  pid_t pid_ = -1;
  int slave_ = -1;
  std::thread reader_;
  std::string terminal_text_;
};

// What ffprobe reports about a file, line by line, without warnings.
inline std::vector<std::string> probed(const std::string& entries, const std::string& path) {
  std::vector<std::string> lines;
  const std::string command = "ffprobe -v warning -show_entries " + entries + " -of csv=p=0 '" + path + "' 2>&1";
  std::FILE* output = popen((command + " </dev/null").c_str(), "r");
  char line[128];
  while (output != nullptr && std::fgets(line, sizeof line, output) != nullptr) {
    lines.emplace_back(line, std::string_view(line).find('\n'));
  }
  if (output != nullptr) pclose(output);
  return lines;
}

// A program whose standard output is read by `reader` as it comes.
class ReadRun {
 public:
  enum class Reader { kPipe, kTerminal };

  ReadRun(const TemporaryFolder& folder, std::vector<std::string> arguments, std::vector<std::string> environment,
          Reader reader) {
    int ends[2] = {-1, -1};
    if (reader == Reader::kTerminal) {
      if (openpty(&ends[0], &ends[1], nullptr, nullptr, nullptr) != 0) return;
      termios settings{};
      tcgetattr(ends[1], &settings);
      cfmakeraw(&settings);
      tcsetattr(ends[1], TCSANOW, &settings);
      for (const int end : ends) fcntl(end, F_SETFD, FD_CLOEXEC);
    } else if (pipe2(ends, O_CLOEXEC) != 0) {
      return;
    }
    read_end_ = ends[0];
    program_ = std::make_unique<ProgramRun>(folder, std::move(arguments), std::move(environment),
                                            ProgramRun::StandardError::kFile, ends[1]);
    close(ends[1]);
  }
  ~ReadRun() { stop_reading(); }
  ReadRun(const ReadRun&) = delete;
  ReadRun& operator=(const ReadRun&) = delete;

  // What comes until the end, or until as many lines are there.
  std::string read_lines(std::size_t count = SIZE_MAX) const {
    std::string text;
    for (char letter = 0; count > 0 && read(read_end_, &letter, 1) == 1;) {
      text += letter;
      if (letter == '\n') --count;
    }
    return text;
  }
  void stop_reading() {
    if (read_end_ >= 0) close(std::exchange(read_end_, -1));
  }
  [[nodiscard]] ProgramRun& program() const { return *program_; }

 private:
  int read_end_ = -1;
  std::unique_ptr<ProgramRun> program_;
};

}  // namespace vexa_test
