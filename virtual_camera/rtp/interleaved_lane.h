// RTP packets between the answers on an RTSP connection, each after "$", its channel and its length (RFC 2326, 10.12).
#ifndef VIRTUAL_CAMERA_RTP_INTERLEAVED_LANE_H_
#define VIRTUAL_CAMERA_RTP_INTERLEAVED_LANE_H_

#include <asio/ip/tcp.hpp>
#include <asio/steady_timer.hpp>
#include <chrono>
#include <cstddef>
#include <cstdint>
#include <functional>
#include <memory>
#include <optional>
#include <span>
#include <string>
#include <vector>

#include "virtual_camera/rtp/packet_port.h"

namespace vexa::camera {

// What the sessions of one connection send on it. Held by the connection and its ports; on the loop's thread. Answers
// and packets take turns, and neither is ever cut by the other.
class InterleavedLane : public std::enable_shared_from_this<InterleavedLane> {
 public:
  // `socket` is the owner's. `reset` ends the owner's connection where writing fails, or the peer reads no byte for
  // `patience`; it is called only while the owner lives.
  InterleavedLane(std::weak_ptr<void> owner, std::function<void()> reset, asio::ip::tcp::socket& socket,
                  std::chrono::milliseconds patience);

  // Puts a packet after those that wait; false when there is no room for it.
  [[nodiscard]] bool offer(std::uint8_t channel, const Outgoing& packet);
  // Sends the packets that wait, once no other write is in progress.
  void flush();
  // Calls `ready` as soon as no packet is being written; none leaves from then on until release().
  void claim(std::function<void()> ready);
  void release();
  void close();

 private:
  void write_rest();
  void written();
  void watch();

  const std::weak_ptr<void> owner_;
  const std::function<void()> reset_;  // called only while the owner lives
  asio::ip::tcp::socket& socket_;      // touched only while the owner lives
  const std::chrono::milliseconds patience_;
  asio::steady_timer stalled_;
  std::string waiting_;
  std::string leaving_;
  std::size_t left_ = 0;  // bytes of `leaving_` that have left
  std::function<void()> ready_;
  bool writing_ = false;
  bool claimed_ = false;
  bool closed_ = false;
};

// One session's channel of a lane; owned by the session's sender. A packet for which there is no room is lost, and the
// rest of its picture with it.
class InterleavedPort : public PacketPort {
 public:
  InterleavedPort(std::weak_ptr<InterleavedLane> lane, std::uint8_t channel)
      : lane_(std::move(lane)), channel_(channel) {}

  const std::vector<SentPacket>& send(const std::vector<Outgoing>& packets, Hashing hashing) override;
  // On the channel after the stream's.
  void send_control(std::span<const std::uint8_t> packet) override;
  void close() override { lane_.reset(); }

 private:
  [[nodiscard]] bool leaves(InterleavedLane& lane, const Outgoing& packet);

  std::weak_ptr<InterleavedLane> lane_;
  const std::uint8_t channel_;
  std::optional<std::uint64_t> cut_picture_;
  std::vector<SentPacket> records_;
};

}  // namespace vexa::camera

#endif  // VIRTUAL_CAMERA_RTP_INTERLEAVED_LANE_H_
