// SPDX-License-Identifier: Apache-2.0
// The driver with its streaming members in reach, and a host that takes its frames.
#pragma once

#include <gtest/gtest.h>
#include <sys/ioctl.h>
#include <sys/socket.h>

#include <algorithm>
#include <chrono>
#include <ctime>
#include <memory>
#include <mutex>
#include <stdexcept>
#include <string>
#include <thread>
#include <vector>

#include "tests/support/test_driver.h"

namespace vexa_test {

class MediaDriver;

/// The drivers that a camera must not run ahead of. A camera sends by the clock, and a driver whose host is kept from
/// running drops frames: with this a test loses none, however slow the machine is for a moment. Any thread.
class KeptPace {
 public:
  /// Whether one of them has not taken what came.
  bool is_behind();

  void join(MediaDriver& driver) {
    const std::lock_guard<std::mutex> lock(mutex_);
    drivers_.push_back(&driver);
  }
  void leave(MediaDriver& driver) {
    const std::lock_guard<std::mutex> lock(mutex_);
    drivers_.erase(std::remove(drivers_.begin(), drivers_.end(), &driver), drivers_.end());
  }

 private:
  std::mutex mutex_;
  std::vector<MediaDriver*> drivers_;
};

class MediaDriver : public TestDriver {
 public:
  MediaDriver() = default;
  ~MediaDriver() override {
    for (const auto& pace : paces_) pace->leave(*this);
  }

  /// From here on the camera that asks `pace` waits for this driver's host.
  void keep_pace(const std::shared_ptr<KeptPace>& pace) {
    if (std::find(paces_.begin(), paces_.end(), pace) != paces_.end()) return;
    paces_.push_back(pace);
    pace->join(*this);
  }

  /// Whether frames wait for the host, or datagrams for the streaming thread. Any thread. Bytes of a connection do not
  /// count: they wait until what follows them comes, and are not lost.
  bool is_behind() {
    constexpr std::size_t kFewFrames = 3;
    {
      const vexa::Guard guard(m_FrameQueueLock);
      if (m_FrameQueue.size() >= kFewFrames) return true;
    }
    const vexa::Guard guard(m_VideoStateLock);
    int type = 0;
    socklen_t length = sizeof type;
    if (getsockopt(m_StreamSocket, SOL_SOCKET, SO_TYPE, &type, &length) != 0 || type != SOCK_DGRAM) return false;
    int unread = 0;
    return ioctl(m_StreamSocket, FIONREAD, &unread) == 0 && unread > 0;
  }

  /// Live video over RTP from the camera that `use` named.
  void use_live(const std::string& codec) {
    const vexa::Guard guard(m_ConnectionLock);
    m_ConnectionInfo.streamTransport = 1;
    m_CameraInfo.codecName = codec;
  }
  void use_live_h264() { use_live("H.264"); }

 private:
  std::vector<std::shared_ptr<KeptPace>> paces_;
};

inline bool KeptPace::is_behind() {
  const std::lock_guard<std::mutex> lock(mutex_);
  return std::any_of(drivers_.begin(), drivers_.end(), [](MediaDriver* driver) { return driver->is_behind(); });
}

/// A driver whose frames come from the test in place of a camera.
class FedDriver : public MediaDriver {
 public:
  FedDriver() {
    state().now = [] { return clock_now; };
    m_LastFrameTime = clock_now = 1000;
    use("127.0.0.1", 1, 5000);
  }

  /// A frame whose one byte is `mark`; its bytes are the caller's.
  static VideoFrameInfo made_frame(std::int32_t type, char mark = 'x') {
    VideoFrameInfo frame;
    frame.capacity = 8;
    frame.data = new unsigned char[frame.capacity]();
    frame.data[0] = static_cast<unsigned char>(mark);
    frame.length = 1;
    frame.frameType = type;
    return frame;
  }

  /// What the streaming thread does with a frame that it has read.
  void feed(ELibDReturnCode result = LIBD_OK, std::int32_t type = VIDEO_FRAME_JPEG, char mark = 'x') {
    VideoFrameInfo frame = made_frame(type, mark);
    ProcessCurrentFrameData(this, frame, wait_key, result);
    EXPECT_EQ(frame.data, nullptr) << "the frame is the queue's, or freed";
  }

  std::size_t waiting() {
    const vexa::Guard guard(m_FrameQueueLock);
    return m_FrameQueue.size();
  }

  ELibDReturnCode take() {
    SLibDVideoFrameInfo frame;
    return GetCurrentVideoFrame(frame);
  }

  static inline std::time_t clock_now = 1000;  ///< seconds, as these drivers see them
  bool wait_key = false;                       ///< whether the next frame must be a key frame
};

/// A frame as the host got it.
struct TakenFrame {
  std::string bytes;
  SLibDVideoFrameInfo info;
};

class FrameTaker : public CDataSink {
 public:
  void Write(const unsigned char* data, unsigned int length) override {
    bytes_.assign(reinterpret_cast<const char*>(data), length);
  }

  /// One poll; the frame when there is one.
  ELibDReturnCode take(CLibraryDevice& driver, TakenFrame& frame) {
    frame.info.sink = this;
    const ELibDReturnCode code = driver.GetCurrentVideoFrame(frame.info);
    if (code == LIBD_OK) frame.bytes = std::move(bytes_);
    return code;
  }

  /// Polls until `count` frames have come, or none has for `patience`.
  std::vector<TakenFrame> take_all(CLibraryDevice& driver, std::size_t count,
                                   std::chrono::milliseconds patience = std::chrono::seconds(10)) {
    std::vector<TakenFrame> frames;
    auto last = std::chrono::steady_clock::now();
    while (frames.size() < count && std::chrono::steady_clock::now() - last < patience) {
      TakenFrame frame;
      if (take(driver, frame) == LIBD_OK) {
        frames.push_back(std::move(frame));
        last = std::chrono::steady_clock::now();
      } else {
        std::this_thread::sleep_for(std::chrono::milliseconds(1));
      }
    }
    return frames;
  }

 private:
  std::string bytes_;
};

/// A host's sink that takes no frame.
class ThrowingSink : public CDataSink {
 public:
  void Write(const unsigned char*, unsigned int) override { throw std::runtime_error("disk full"); }
};

/// For H.264 and MPEG-4, of which 30 frames wait for the host.
#if defined(__SANITIZE_THREAD__) || defined(__SANITIZE_ADDRESS__)
constexpr double kPace = 1;
#else
constexpr double kPace = 4;
#endif

/// For JPEG, of which nine wait.
#if defined(__SANITIZE_THREAD__) || defined(__SANITIZE_ADDRESS__)
constexpr double kJpegPace = 1;
#else
constexpr double kJpegPace = 2;
#endif

}  // namespace vexa_test
