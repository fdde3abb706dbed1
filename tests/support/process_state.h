// SPDX-License-Identifier: Apache-2.0
// The state of this process as the system reports it, and waiting for it to change.
#pragma once

#include <sys/syscall.h>
#include <unistd.h>

#include <chrono>
#include <cstddef>
#include <filesystem>
#include <fstream>
#include <iterator>
#include <string>
#include <thread>

namespace vexa_test {

inline std::size_t entries_in(const char* directory) {
  return static_cast<std::size_t>(
      std::distance(std::filesystem::directory_iterator(directory), std::filesystem::directory_iterator()));
}

/// Number of open descriptors, always including the one that does the counting.
inline std::size_t open_descriptors() { return entries_in("/proc/self/fd"); }

/// Number of threads the system still knows; one that was joined may be among them for a moment.
inline std::size_t running_threads() { return entries_in("/proc/self/task"); }

/// The calling thread, as is_running and is_sleeping want it.
inline long kernel_thread_id() { return syscall(SYS_gettid); }

/// True until the thread has ended.
inline bool is_running(long thread) { return access(("/proc/self/task/" + std::to_string(thread)).c_str(), F_OK) == 0; }

/// True when the thread waits in the system.
inline bool is_sleeping(long thread) {
  std::ifstream stat("/proc/self/task/" + std::to_string(thread) + "/stat");
  const std::string line((std::istreambuf_iterator<char>(stat)), std::istreambuf_iterator<char>());
  const std::size_t name_end = line.rfind(')');
  return name_end != std::string::npos && line.compare(name_end, 3, ") S") == 0;
}

/// Waits for a condition, at most half a minute. @return whether it came true.
template <typename Condition>
bool eventually(Condition condition) {
  const auto deadline = std::chrono::steady_clock::now() + std::chrono::seconds(30);
  while (!condition()) {
    if (std::chrono::steady_clock::now() > deadline) return false;
    std::this_thread::sleep_for(std::chrono::milliseconds(1));
  }
  return true;
}

}  // namespace vexa_test
