// SPDX-License-Identifier: Apache-2.0
// A virtual camera, and a host that keeps what a session calls it with.
#pragma once

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <chrono>
#include <condition_variable>
#include <cstdint>
#include <functional>
#include <memory>
#include <mutex>
#include <string>
#include <utility>
#include <vector>

#include "tests/support/own_address.h"
#include "vexa/session.h"
#include "virtual_camera/virtual_camera.h"

namespace vexa {

/// What a session has called its host with. Any thread.
class SessionHost {
 public:
  static constexpr std::chrono::seconds kLongest{30};  // a loaded machine is slow; a session that works is not

  SessionCallbacks callbacks() {
    SessionCallbacks host;
    host.state = [this](Session& session, const SessionStatus& status) {
      enter(session);
      keep([&] { states_.push_back(status); });
      if (on_state) on_state(session, status);
      leave();
    };
    host.frame = [this](Session& session, const SessionFrame& frame) {
      enter(session);
      keep([&] {
        frames_.push_back(frame);
        frames_.back().data = nullptr;
      });
      if (on_frame) on_frame(session, frame);
      leave();
    };
    host.alarms = [this](Session&, const std::vector<SLibDPinInfo>& pins) {
      keep([&] { pins_.insert(pins_.end(), pins.begin(), pins.end()); });
    };
    host.metadata = [this](Session&, const SLibDRawMDFrameInfo&) { keep([this] { ++side_.metadata; }); };
    host.audio = [this](Session&, const unsigned char*, std::size_t length, std::int32_t codec) {
      keep([&] {
        side_.sound_bytes += length;
        side_.sound_codec = codec;
      });
    };
    return host;
  }

  /// Waits until the condition holds for what has come; it is given this host's own lists.
  using Condition = std::function<bool(const std::vector<SessionStatus>&, const std::vector<SessionFrame>&)>;
  bool wait_for(const Condition& condition) {
    std::unique_lock<std::mutex> lock(mutex_);
    return news_.wait_for(lock, kLongest, [&] { return condition(states_, frames_); });
  }
  /// Waits for a state with this cause, from the event with the number after `later_than` on.
  bool wait_for_state(SessionState state, SessionCause cause, std::uint64_t later_than = 0) {
    return wait_for([&](const auto& states, const auto&) {
      for (const SessionStatus& status : states) {
        if (status.event > later_than && status.state == state && status.cause == cause) return true;
      }
      return false;
    });
  }
  bool wait_for_live(std::uint64_t later_than = 0) {
    return wait_for([&](const auto& states, const auto&) {
      return !states.empty() && states.back().event > later_than && states.back().state == SessionState::kLive;
    });
  }
  /// What has come of sound and metadata.
  struct Side {
    std::size_t sound_bytes = 0;
    std::int32_t sound_codec = -1;
    std::size_t metadata = 0;
  };
  bool wait_for_side(const std::function<bool(const Side&)>& condition) {
    return wait_for([&](const auto&, const auto&) { return condition(side_); });
  }
  Side side() {
    const std::lock_guard<std::mutex> lock(mutex_);
    return side_;
  }
  bool wait_for_frames(std::size_t count) {
    return wait_for([&](const auto&, const auto& frames) { return frames.size() >= count; });
  }

  std::vector<SessionStatus> states() {
    const std::lock_guard<std::mutex> lock(mutex_);
    return states_;
  }
  std::vector<SessionFrame> frames() {
    const std::lock_guard<std::mutex> lock(mutex_);
    return frames_;
  }
  std::vector<SLibDPinInfo> pins() {
    const std::lock_guard<std::mutex> lock(mutex_);
    return pins_;
  }
  std::uint64_t latest_event() {
    const std::lock_guard<std::mutex> lock(mutex_);
    return states_.empty() ? 0 : states_.back().event;
  }
  /// Whether two callbacks of the session ever ran at once.
  bool overlapped() {
    const std::lock_guard<std::mutex> lock(mutex_);
    return overlapped_;
  }

  // Of the test, set before the session is opened.
  std::function<void(Session&, const SessionStatus&)> on_state;
  std::function<void(Session&, const SessionFrame&)> on_frame;

 private:
  template <typename Change>
  void keep(const Change& change) {
    {
      const std::lock_guard<std::mutex> lock(mutex_);
      change();
    }
    news_.notify_all();
  }
  void enter(Session&) {
    const std::lock_guard<std::mutex> lock(mutex_);
    overlapped_ = overlapped_ || inside_ > 0;
    ++inside_;
  }
  void leave() {
    const std::lock_guard<std::mutex> lock(mutex_);
    --inside_;
  }

  std::mutex mutex_;
  std::condition_variable news_;
  std::vector<SessionStatus> states_;
  std::vector<SessionFrame> frames_;
  std::vector<SLibDPinInfo> pins_;
  Side side_;
  int inside_ = 0;
  bool overlapped_ = false;
};

/// A camera at an address of its own, with user name and password.
class SessionWithCamera : public testing::Test {
 protected:
  void start_camera(camera::CameraOptions options = {}) {
    options.address = vexa_test::own_loopback(1);
    options.user = "operator";
    options.password = "tr0ub4dor";
    // A camera of a model draws its pictures, in the codec that it is set to.
    if (options.profile_path.empty()) options.clip_path = VEXA_CLIPS "/small.h264";
    camera_ = std::make_unique<camera::VirtualCamera>(options);
    ASSERT_TRUE(camera_->start()) << camera_->error();
  }
  [[nodiscard]] camera::VirtualCamera& camera() { return *camera_; }

  /// For the camera, impatient.
  [[nodiscard]] SessionOptions options() const {
    SessionOptions options;
    options.connection.host = camera_->address();
    options.connection.port = camera_->http_port();
    options.connection.userName = "operator";
    options.connection.password = "tr0ub4dor";
    options.stallMilliseconds = 1000;
    options.giveUpMilliseconds = 2000;
    return options;
  }
  /// For tests that no stall may disturb on a loaded machine.
  [[nodiscard]] SessionOptions patient_options() const {
    SessionOptions patient = options();
    patient.stallMilliseconds = 30000;
    patient.giveUpMilliseconds = 60000;
    return patient;
  }

 private:
  std::unique_ptr<camera::VirtualCamera> camera_;
};

}  // namespace vexa
