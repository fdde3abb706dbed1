// SPDX-License-Identifier: Apache-2.0
// The camera's RTSP side. Sessions belong to the connection that set them up and end with it.
#ifndef VIRTUAL_CAMERA_SERVER_RTSP_CONNECTION_H_
#define VIRTUAL_CAMERA_SERVER_RTSP_CONNECTION_H_

#include <chrono>
#include <cstdint>
#include <functional>
#include <memory>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "virtual_camera/card/card.h"
#include "virtual_camera/rtp/interleaved_lane.h"
#include "virtual_camera/rtp/packet_port.h"
#include "virtual_camera/server/connection.h"
#include "virtual_camera/server/rtsp_session.h"
#include "virtual_camera/wire/message.h"
#include "virtual_camera/wire/rtsp_message.h"

namespace vexa::camera {

// Answers RTSP requests, and ends the sessions that it has set up when it ends. On the loop's thread.
class RtspConnection : public Connection {
 public:
  using Connection::Connection;

 private:
  RequestKind kind() const override { return RequestKind::kRtsp; }
  std::size_t request_size(std::string_view received) const override;
  Answer answer(const std::string& request) override;
  Answer refuse(const std::string& request, std::string_view status) const override;
  Next answered() override;
  bool may_idle() const override;
  void ended() override;
  std::size_t passed_over(std::string_view received) const override;
  void claim_socket(const std::function<void()>& ready) override;
  void release_socket() override;

  // Where a session's packets are to go, and how SETUP's answer states it; no port: it could not be opened.
  struct MediaTransport {
    std::unique_ptr<PacketPort> port;
    std::string transport;
    std::chrono::milliseconds pause{0};
  };
  MediaTransport open_udp(const AskedTransport& asked);
  MediaTransport open_interleaved(const AskedTransport& asked);

  Answer dispatch(const RequestHead& request, std::uint32_t sequence);
  std::optional<Recording> recording_at(std::string_view path, VideoUrl as);
  Answer describe_recording(const Recording& recording, std::uint32_t sequence);
  Answer describe(const RequestHead& request, std::uint32_t sequence);
  Answer setup(const RequestHead& request, std::uint32_t sequence);
  Answer play(const RequestHead& request, std::uint32_t sequence);
  Answer get_parameter(const RequestHead& request, std::uint32_t sequence);
  Answer teardown(const RequestHead& request, std::uint32_t sequence);
  std::shared_ptr<RtspSession> find_session(const RequestHead& request);

  std::vector<std::weak_ptr<RtspSession>> own_sessions_;
  std::shared_ptr<RtspSession> to_play_;   // starts when the answer to PLAY has left
  std::shared_ptr<InterleavedLane> lane_;  // from the first interleaved session on
  std::uint16_t next_channel_ = 0;         // no session has it, nor a later one
};

}  // namespace vexa::camera

#endif  // VIRTUAL_CAMERA_SERVER_RTSP_CONNECTION_H_
