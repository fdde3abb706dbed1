// SPDX-License-Identifier: Apache-2.0
// The transports of a picture to a host: datagrams, the RTSP connection, an HTTP stream.
#pragma once

#include <gtest/gtest.h>
#include <sys/socket.h>
#include <unistd.h>

#include <string>
#include <vector>

#include "tests/media/live_camera.h"
#include "tests/media/rtp_feed.h"
#include "virtual_camera/codec/image_clip.h"

namespace vexa_test {

enum class VideoTransport { kUdp, kInterleaved, kHttp };

/// A camera that plays `clip` over each transport.
inline vexa::camera::CameraOptions options_for_all_transports(const std::string& clip) {
  auto options = camera_options();
  options.clip_path = options.image_path = std::string(VEXA_CLIPS) + "/" + clip;
  if (clip.ends_with(".mjpeg")) options.speed = kJpegPace;
  options.range_clock = "20240131T235959.250Z";  // without one the driver opens no session of interleaved packets
  return options;
}

/// The driver's part of interleaved packets, which no live start of its own uses: it opens the session and reads packet
/// by packet. What it reads goes to the media socket of its assembly, as datagrams.
class InterleavedReader {
 public:
  explicit InterleavedReader(MediaDriver& driver) : driver_(driver), packet_(65535), picture_(1200000) {}
  ~InterleavedReader() {
    driver_.rtp_over_tcp_close(connection_);
    driver_.ReleaseRtpPacketsPtr();
    if (assembly_ != -1) close(assembly_);
    const vexa::Guard guard(driver_.m_VideoStateLock);
    if (driver_.m_StreamSocket != -1) close(driver_.m_StreamSocket);
    driver_.m_StreamSocket = -1;
  }
  InterleavedReader(const InterleavedReader&) = delete;
  InterleavedReader& operator=(const InterleavedReader&) = delete;

  [[nodiscard]] bool open(LiveCamera& camera) {
    driver_.m_CameraInfo.rtspPort = camera->rtsp_port();
    connection_ =
        driver_.rtp_over_tcp_open("rtsp://%s:%d/media/video%d", camera->address().c_str(), camera->rtsp_port(), 1);
    int ends[2];
    if (connection_ == -1 || socketpair(AF_UNIX, SOCK_DGRAM | SOCK_CLOEXEC, 0, ends) != 0) return false;
    {
      const vexa::Guard guard(driver_.m_VideoStateLock);
      driver_.m_StreamSocket = ends[0];
    }
    assembly_ = ends[1];
    return driver_.state().allocate_packets();
  }

  /// The next picture; empty when none came.
  std::string next(const std::string& codec) {
    RtpFields fields;
    while (!fields.marker) {
      const int length =
          driver_.rtp_over_tcp_payload_recv(connection_, packet_.data(), static_cast<int>(packet_.size()),
                                            &fields.marker, &fields.type, 5000, &fields.timestamp);
      if (length <= 0) return {};
      fields.sequence = sequence_++;
      const Payload datagram = rtp_datagram(fields, {packet_.begin(), packet_.begin() + length});
      if (send(assembly_, datagram.data(), datagram.size(), 0) != static_cast<ssize_t>(datagram.size())) return {};
    }
    CVexaCommon::VideoFrameInfo frame;
    frame.data = picture_.data();
    frame.capacity = static_cast<unsigned int>(picture_.size());
    if (driver_.GetRtpCurrentVideoFrame(codec, frame) != LIBD_OK) return {};
    return {picture_.begin(), picture_.begin() + frame.length};
  }

 private:
  MediaDriver& driver_;
  int connection_ = -1;
  int assembly_ = -1;
  unsigned sequence_ = 1;
  std::vector<char> packet_;
  Payload picture_;
};

/// The first frames of the camera's video as the driver hands them out; fewer when no more came.
inline std::vector<std::string> frames_by(VideoTransport transport, LiveCamera& camera, std::size_t count) {
  MediaDriver driver;
  camera.introduce(driver);
  std::vector<std::string> frames;
  if (transport == VideoTransport::kInterleaved) {
    InterleavedReader reader(driver);
    EXPECT_TRUE(reader.open(camera)) << driver.latest_error();
    while (frames.size() < count) {
      frames.push_back(reader.next(driver.state().stream_codec()));
      if (frames.back().empty()) break;
    }
    return frames;
  }
  if (transport == VideoTransport::kHttp) driver.m_ConnectionInfo.streamTransport = 0;
  EXPECT_EQ(driver.StartVideoStreaming(), LIBD_OK) << driver.latest_error();
  for (TakenFrame& frame : FrameTaker().take_all(driver, count)) frames.push_back(std::move(frame.bytes));
  return frames;
}

/// A picture without its user-data units, which the readers of HTTP streams take out.
inline std::string without_user_data(vexa::camera::Codec kind, const std::string& picture) {
  if (kind == vexa::camera::Codec::kJpeg) return picture;
  const bool h264 = kind == vexa::camera::Codec::kH264;
  const std::string code = h264 ? std::string("\0\0\0\1", 4) : std::string("\0\0\1", 3);
  std::string kept;
  for (std::size_t unit = picture.find(code); unit != std::string::npos;) {
    const std::size_t next = picture.find(code, unit + code.size());
    const int type = static_cast<unsigned char>(picture[unit + code.size()]);
    const bool user_data = h264 ? (type & 0x1f) == 6 : type == 0xb2;
    if (!user_data) kept += picture.substr(unit, next - unit);
    unit = next;
  }
  return kept;
}

}  // namespace vexa_test
