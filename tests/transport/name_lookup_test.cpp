// Host names while the system's resolver does not answer. It is replaced here by one that answers when a test says so.
#include "transport/name_lookup.h"

#include <arpa/inet.h>
#include <dlfcn.h>
#include <gtest/gtest.h>
#include <netdb.h>

#include <array>
#include <atomic>
#include <chrono>
#include <future>
#include <mutex>
#include <string>
#include <thread>
#include <vector>

namespace {

constexpr const char* kSlowName = "slow.invalid";
constexpr const char* kKnownName = "known.invalid";

std::mutex gate;  // held while the resolver does not answer
std::atomic<int> asked{0};

bool is(const char* name, const char* wanted) { return std::string(name) == wanted; }

}  // namespace

extern "C" int gethostbyname_r(const char* name, hostent* entry, char* room, std::size_t size, hostent** result,
                               int* error) {
  using Resolver = int (*)(const char*, hostent*, char*, std::size_t, hostent**, int*);
  static const auto system_resolver = reinterpret_cast<Resolver>(dlsym(RTLD_NEXT, "gethostbyname_r"));
  if (!is(name, kSlowName) && !is(name, kKnownName)) return system_resolver(name, entry, room, size, result, error);
  if (is(name, kSlowName)) {
    ++asked;
    const std::lock_guard<std::mutex> wait(gate);
  }
  return system_resolver("127.0.0.9", entry, room, size, result, error);
}

namespace vexa {
namespace {

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
  std::unique_lock<std::mutex> silence(gate);
  const int before = asked;
  auto lookup = std::async(std::launch::async, [&] { return resolve_host(kSlowName, 80, {&signal}); });
  while (asked == before) std::this_thread::yield();
  signal.raise();
  EXPECT_FALSE(lookup.get().address);
  silence.unlock();
  const CancelSignal never;
  EXPECT_TRUE(resolve_host(kSlowName, 80, {&never}).address);
}

TEST(NameLookup, RunsAtMostSoManyBesideTheirCallers) {
  std::unique_lock<std::mutex> silence(gate);
  const int before = asked;
  CancelSignal signal;
  std::vector<std::future<ResolvedHost>> lookups;
  for (int i = 0; i < kMostLookups + 4; ++i) {
    lookups.push_back(std::async(std::launch::async, [&] { return resolve_host(kSlowName, 80, {&signal}); }));
  }
  while (asked < before + kMostLookups) std::this_thread::yield();
  signal.raise();
  for (auto& lookup : lookups) EXPECT_FALSE(lookup.get().address);
  EXPECT_EQ(asked, before + kMostLookups);
  silence.unlock();
  const CancelSignal never;
  EXPECT_TRUE(resolve_host(kSlowName, 80, {&never}).address);
}

}  // namespace
}  // namespace vexa
