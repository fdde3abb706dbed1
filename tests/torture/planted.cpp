// SPDX-License-Identifier: Apache-2.0
// Code that does not bear a failing call, each in a way of its own, and code that does: what the harness has to find
// and what it has to pass.
#include <fcntl.h>
#include <sys/eventfd.h>
#include <sys/socket.h>
#include <unistd.h>

#include <cstdlib>
#include <thread>
#include <vector>

#include "tests/torture/scenarios.h"

namespace vexa::torture {
namespace {

void clean(Run& run, CLibraryDevice&) {
  void* const block = std::malloc(100);
  const int fd = block == nullptr ? -1 : socket(AF_INET, SOCK_DGRAM | SOCK_CLOEXEC, 0);
  run.expect_true("clean", fd >= 0);
  if (fd >= 0) close(fd);
  std::free(block);
}

void leaks_memory(Run& run, CLibraryDevice&) {
  void* const first = std::malloc(100);
  void* const second = std::malloc(100);
  run.expect_true("leaks_memory", first != nullptr && second != nullptr);
  std::free(second);
  if (second != nullptr) std::free(first);
}

void leaks_descriptor(Run& run, CLibraryDevice&) {
  const int first = open("/dev/null", O_RDONLY | O_CLOEXEC);
  const int second = socket(AF_INET, SOCK_DGRAM | SOCK_CLOEXEC, 0);
  run.expect_true("leaks_descriptor", first >= 0 && second >= 0);
  if (second < 0) return;
  close(second);
  close(first);
}

void leaks_thread(Run& run, CLibraryDevice&) {
  const int event = eventfd(0, EFD_CLOEXEC);
  run.expect_true("leaks_thread", event >= 0);
  if (event < 0) std::thread([] { pause(); }).detach();
  if (event >= 0) close(event);
}

void unstated(Run& run, CLibraryDevice&) {
  const int fd = socket(AF_INET, SOCK_DGRAM | SOCK_CLOEXEC, 0);
  run.expect("unstated", fd >= 0 ? LIBD_OK : LIBD_INVALID_ARGUMENT);
  if (fd >= 0) close(fd);
}

void stays_broken(Run& run, CLibraryDevice&) {
  static bool broken = false;
  const int fd = socket(AF_INET, SOCK_DGRAM | SOCK_CLOEXEC, 0);
  broken = broken || fd < 0;
  run.expect_true("stays_broken", !broken);
  if (fd >= 0) close(fd);
}

void crashes(Run&, CLibraryDevice&) {
  const int fd = socket(AF_INET, SOCK_DGRAM | SOCK_CLOEXEC, 0);
  if (fd < 0) std::abort();
  close(fd);
}

void hangs(Run&, CLibraryDevice&) {
  const int fd = socket(AF_INET, SOCK_DGRAM | SOCK_CLOEXEC, 0);
  while (fd < 0) pause();
  close(fd);
}

}  // namespace

const std::vector<Scenario>& planted_scenarios() {
  static const std::vector<Scenario> scenarios = {
      {"clean", clean},
      {"leaks_memory", leaks_memory},
      {"leaks_descriptor", leaks_descriptor},
      {"crashes", crashes},
      {"leaks_thread", leaks_thread},
      {"stays_broken", stays_broken},
      {"unstated", unstated},
      {"hangs", hangs},
  };
  return scenarios;
}

}  // namespace vexa::torture
