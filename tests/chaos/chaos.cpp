// SPDX-License-Identifier: Apache-2.0
// Several threads do whatever hosts may do, to drivers and sessions of cameras whose faults change all the time. After
// each operation: it has returned, frames are whole pictures, the counts balance. At the end no thread and no
// descriptor is left. The seed decides what each thread does in which order.
//   chaos [--seed N] [--operations N | --seconds N]      40 operations of each thread by default
#include <chrono>
#include <cstdio>
#include <deque>
#include <random>
#include <string>
#include <thread>

#include "tests/chaos/hosts.h"
#include "tests/support/number_options.h"
#include "tests/support/process_state.h"

namespace {

using vexa_test::ChaosCameras;
using vexa_test::ChaosDriver;
using vexa_test::ChaosHost;
using vexa_test::Findings;

constexpr std::size_t kThreads = 3;

struct Arguments {
  long seed = 1;
  long operations = 40;
  long seconds = 0;  // 0: as many operations as there are
};

/// All of a run's hosts, each in a thread of its own, and the cameras' changes in this one.
std::uint64_t run(const Arguments& arguments, ChaosCameras& cameras) {
  const auto end = std::chrono::steady_clock::now() + std::chrono::seconds(arguments.seconds);
  const auto goes_on = [&](const ChaosHost& host) {
    return arguments.seconds > 0 ? std::chrono::steady_clock::now() < end
                                 : host.steps() < static_cast<std::uint64_t>(arguments.operations);
  };
  std::mt19937 random(static_cast<std::uint32_t>(arguments.seed));
  ChaosDriver shared(cameras, 0, true);
  std::deque<ChaosHost> hosts;
  std::deque<std::thread> threads;
  std::atomic<std::size_t> working{kThreads};
  for (std::size_t i = 0; i < kThreads; ++i) hosts.emplace_back(cameras, shared, static_cast<std::uint32_t>(random()));
  for (ChaosHost& host : hosts) {
    threads.emplace_back([&] {
      while (goes_on(host)) host.step();
      host.finish();
      --working;
    });
  }
  while (working > 0) {
    cameras.change(random);
    for (const ChaosHost& host : hosts) host.clock().look();
    std::this_thread::sleep_for(std::chrono::milliseconds(20));
  }
  for (std::thread& thread : threads) thread.join();
  std::uint64_t steps = 0;
  for (const ChaosHost& host : hosts) steps += host.steps();
  return steps;
}

}  // namespace

int main(int count, char** texts) {
  Arguments arguments;
  if (!vexa_test::read_numbers(
          count, texts,
          {{"--seed", &arguments.seed}, {"--operations", &arguments.operations}, {"--seconds", &arguments.seconds}})) {
    std::fprintf(stderr, "usage: %s [--seed N] [--operations N | --seconds N]\n", texts[0]);
    return 2;
  }
  std::uint64_t steps = 0;
  {
    ChaosCameras cameras;
    if (!cameras.start()) Findings::stop_at("a camera does not start: " + cameras.at(0).error());
    const std::size_t descriptors = vexa_test::open_descriptors();
    const std::size_t threads = vexa_test::running_threads();
    steps = run(arguments, cameras);
    cameras.heal();
    // The cameras' own connections end when they learn that their hosts have gone.
    if (!vexa_test::eventually([&] { return vexa_test::running_threads() <= threads; })) {
      Findings::stop_at("threads are left");
    }
    if (!vexa_test::eventually([&] { return vexa_test::open_descriptors() <= descriptors; })) {
      Findings::stop_at("descriptors are left: " + std::to_string(vexa_test::open_descriptors()) + " for " +
                        std::to_string(descriptors));
    }
  }
  std::printf("seed %ld: %llu operations\n", arguments.seed, static_cast<unsigned long long>(steps));
  return 0;
}
