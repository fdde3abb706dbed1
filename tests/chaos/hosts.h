// SPDX-License-Identifier: Apache-2.0
// Hosts that do to drivers and sessions whatever a host may do, in an order drawn by a seed, and look whether what they
// get is right.
#pragma once

#include <atomic>
#include <chrono>
#include <cstdint>
#include <functional>
#include <memory>
#include <random>
#include <string>
#include <vector>

#include "tests/chaos/cameras.h"
#include "vexa/cancel.h"
#include "vexa/session.h"
#include "vexa/vexa_common.h"

namespace vexa_test {

/// The first thing that went wrong, and which operation of whom runs since when.
class Findings {
 public:
  /// Says what is wrong, and ends the process: what comes after it is not to be trusted.
  [[noreturn]] static void stop_at(const std::string& wrong);
};

/// Ends the process when an operation does not return within its bound.
class OperationClock {
 public:
  void begin(const char* operation) {
    since_ = std::chrono::steady_clock::now().time_since_epoch().count();
    operation_ = operation;
  }
  void end() { operation_ = nullptr; }
  /// Any thread.
  void look() const;

 private:
  std::atomic<const char*> operation_{nullptr};
  std::atomic<std::int64_t> since_{0};  // as the steady clock counts: an atomic duration takes a lock on 32 bits
};

/// A driver of one of the cameras. Operations but for the destruction may come from any thread.
class ChaosDriver {
 public:
  ChaosDriver(ChaosCameras& cameras, std::size_t camera, bool rtp);
  ~ChaosDriver();

  /// The name of the operation that number `chosen` stands for.
  static const char* name_of(std::size_t chosen);
  void operate(std::size_t chosen);
  static std::size_t operations();
  /// Whether its counts balance.
  void check_counts();

 private:
  void take_frames();

  ChaosCameras& cameras_;
  const bool rtp_;
  CVexaCommon driver_;
};

/// One thread's work: drivers of its own, one that all share, and sessions.
class ChaosHost {
 public:
  ChaosHost(ChaosCameras& cameras, ChaosDriver& shared, std::uint32_t seed);

  void step();
  /// Stops everything.
  void finish();
  [[nodiscard]] const OperationClock& clock() const { return clock_; }
  [[nodiscard]] std::uint64_t steps() const { return steps_; }

 private:
  void drive();
  void use_session();
  void open_session();

  ChaosCameras& cameras_;
  ChaosDriver& shared_;
  std::mt19937 random_;
  OperationClock clock_;
  std::unique_ptr<ChaosDriver> own_;
  std::unique_ptr<vexa::SessionGroup> group_;
  std::vector<std::shared_ptr<vexa::Session>> sessions_;
  std::atomic<std::uint64_t> steps_{0};
};

}  // namespace vexa_test
