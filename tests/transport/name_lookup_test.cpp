// SPDX-License-Identifier: Apache-2.0
// Host names while the system's resolver does not answer. It is replaced here by one that answers when a test says so.
#include "transport/name_lookup.h"

#include <arpa/inet.h>
#include <dlfcn.h>
#include <gtest/gtest.h>
#include <netdb.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <atomic>
#include <cerrno>
#include <condition_variable>
#include <future>
#include <mutex>
#include <string>
#include <vector>

#include "tests/support/process_state.h"

namespace {

using vexa_test::eventually;
using vexa_test::is_sleeping;
using vexa_test::kernel_thread_id;

constexpr const char* kSlowName = "slow.invalid";
constexpr const char* kKnownName = "known.invalid";
constexpr const char* kMuteName = "mute.invalid";  // the thread that looks it up can write no more

std::mutex gate;
std::condition_variable answers;
bool silent = false;  // under the gate
std::atomic<int> asked{0};
std::atomic<int> waiting{0};

/// While it lasts, the resolver does not answer. Its end waits until every question has been answered.
class Silence {
 public:
  Silence() { set(true); }
  ~Silence() {
    set(false);
    EXPECT_TRUE(eventually([] { return waiting == 0; }));
  }
  Silence(const Silence&) = delete;
  Silence& operator=(const Silence&) = delete;

 private:
  static void set(bool value) {
    const std::lock_guard<std::mutex> lock(gate);
    silent = value;
    answers.notify_all();
  }
};

void wait_for_the_resolver() {
  ++asked;
  ++waiting;
  std::unique_lock<std::mutex> lock(gate);
  answers.wait(lock, [] { return !silent; });
  --waiting;
}

thread_local bool is_mute = false;

// A sanitizer's, where there is one; found before the tests, as signal handlers of theirs write.
const auto system_write = reinterpret_cast<decltype(&write)>(dlsym(RTLD_NEXT, "write"));

bool is(const char* name, const char* wanted) { return std::string(name) == wanted; }

}  // namespace

extern "C" int gethostbyname_r(const char* name, hostent* entry, char* room, std::size_t size, hostent** result,
                               int* error) {
  using Resolver = int (*)(const char*, hostent*, char*, std::size_t, hostent**, int*);
  static const auto system_resolver = reinterpret_cast<Resolver>(dlsym(RTLD_NEXT, "gethostbyname_r"));
  is_mute = is(name, kMuteName);
  if (!is(name, kSlowName) && !is(name, kKnownName) && !is_mute)
    return system_resolver(name, entry, room, size, result, error);
  if (is(name, kSlowName)) wait_for_the_resolver();
  return system_resolver("127.0.0.9", entry, room, size, result, error);
}

extern "C" ssize_t write(int descriptor, const void* data, std::size_t length) {
  if (!is_mute) return system_write(descriptor, data, length);
  errno = ENOSPC;
  return -1;
}

namespace vexa {
namespace {

TEST(NameLookup, EndsAlsoWhenItsEndCannotBeSignalled) {
  const CancelSignal never;
  EXPECT_TRUE(resolve_host(kMuteName, 80, {&never}).address);
}

TEST(NameLookup, FindsANameBesideTheCaller) {
  const CancelSignal never;
  const ResolvedHost found = resolve_host(kKnownName, 80, {&never});
  ASSERT_TRUE(found.address);
  EXPECT_EQ(found.address->sin_addr.s_addr, inet_addr("127.0.0.9"));
  EXPECT_EQ(found.address->sin_port, htons(80));
}

TEST(NameLookup, OfANameThatDoesNotExistGivesTheResolversNumber) {
  const CancelSignal never;
  const ResolvedHost alone = resolve_host("", 80);
  const ResolvedHost beside = resolve_host("", 80, {&never});
  EXPECT_FALSE(beside.address);
  EXPECT_NE(beside.error, 0);
  EXPECT_EQ(beside.error, alone.error);
}

TEST(NameLookup, OfANumberAsksNobody) {
  CancelSignal cancelled;
  cancelled.raise();
  EXPECT_TRUE(resolve_host("127.0.0.1", 80, {&cancelled}).address);
}

TEST(NameLookup, EndsWhenItIsCancelledAndThrowsAwayWhatIsFoundLater) {
  CancelSignal signal;
  const int before = asked;
  {
    const Silence silence;
    auto lookup = std::async(std::launch::async, [&] { return resolve_host(kSlowName, 80, {&signal}); });
    EXPECT_TRUE(eventually([before] { return asked > before; }));
    signal.raise();
    EXPECT_FALSE(lookup.get().address);
  }
  const CancelSignal never;
  EXPECT_TRUE(resolve_host(kSlowName, 80, {&never}).address);
}

TEST(NameLookup, RunsAtMostSoManyBesideTheirCallers) {
  const int before = asked;
  CancelSignal signal;
  {
    const Silence silence;
    std::array<std::atomic<long>, kMostLookups + 4> callers{};
    std::vector<std::future<ResolvedHost>> lookups;
    for (std::atomic<long>& caller : callers) {
      lookups.push_back(std::async(std::launch::async, [&] {
        caller = kernel_thread_id();
        return resolve_host(kSlowName, 80, {&signal});
      }));
    }
    EXPECT_TRUE(eventually([&] {
      return asked >= before + kMostLookups && std::all_of(callers.begin(), callers.end(), [](const auto& caller) {
               return caller != 0 && is_sleeping(caller);
             });
    }));
    EXPECT_EQ(asked, before + kMostLookups);
    signal.raise();
    for (auto& lookup : lookups) EXPECT_FALSE(lookup.get().address);
    EXPECT_EQ(asked, before + kMostLookups);
  }
  const CancelSignal never;
  EXPECT_TRUE(resolve_host(kSlowName, 80, {&never}).address);
}

}  // namespace
}  // namespace vexa
