#include "virtual_camera/rtp/interleaved_lane.h"

#include <algorithm>
#include <asio/buffer.hpp>
#include <span>
#include <utility>

namespace vexa::camera {
namespace {

// A host that does not read costs the camera no more than twice this.
constexpr std::size_t kMostWaiting = 1 << 20;
constexpr std::size_t kMostPacket = 65535;
constexpr std::size_t kPrefix = 4;

void append_piece(std::string& text, std::span<const std::uint8_t> bytes) { text.append(bytes.begin(), bytes.end()); }

}  // namespace

InterleavedLane::InterleavedLane(std::weak_ptr<void> owner, std::function<void()> reset, asio::ip::tcp::socket& socket,
                                 std::chrono::milliseconds patience)
    : owner_(std::move(owner)),
      reset_(std::move(reset)),
      socket_(socket),
      patience_(patience),
      stalled_(socket.get_executor()) {}

bool InterleavedLane::offer(std::uint8_t channel, const Outgoing& packet) {
  const std::span<const std::uint8_t> payload = packet.payload_to_send();
  const std::size_t size = packet.header.size() + payload.size();
  if (closed_ || size > kMostPacket || waiting_.size() + kPrefix + size > kMostWaiting) return false;
  const std::uint8_t prefix[kPrefix] = {'$', channel, static_cast<std::uint8_t>(size >> 8U),
                                        static_cast<std::uint8_t>(size)};
  append_piece(waiting_, prefix);
  append_piece(waiting_, packet.header);
  append_piece(waiting_, payload);
  return true;
}

void InterleavedLane::flush() {
  if (writing_ || claimed_ || closed_ || waiting_.empty()) return;
  leaving_.swap(waiting_);
  waiting_.clear();
  left_ = 0;
  write_rest();
}

void InterleavedLane::write_rest() {
  const std::shared_ptr<void> owner = owner_.lock();
  if (!owner) return;
  writing_ = true;
  watch();
  const auto write = [self = shared_from_this(), owner](asio::error_code error, std::size_t size) {
    if (self->closed_) return;
    if (error) return self->reset_();
    self->left_ += size;
    self->left_ < self->leaving_.size() ? self->write_rest() : self->written();
  };
  socket_.async_write_some(asio::buffer(leaving_.data() + left_, leaving_.size() - left_), write);
}

void InterleavedLane::watch() {
  stalled_.expires_after(patience_);
  stalled_.async_wait([self = shared_from_this()](asio::error_code error) {
    // A handler already on its way when the packets moved on comes without an error.
    const bool moved = self->stalled_.expiry() > std::chrono::steady_clock::now();
    if (error || moved || !self->writing_ || self->closed_) return;
    if (const std::shared_ptr<void> stuck = self->owner_.lock()) self->reset_();
  });
}

void InterleavedLane::written() {
  writing_ = false;
  stalled_.cancel();
  if (const std::function<void()> ready = std::exchange(ready_, nullptr)) return ready();
  flush();
}

void InterleavedLane::claim(std::function<void()> ready) {
  claimed_ = true;
  if (!writing_) return ready();
  ready_ = std::move(ready);
}

void InterleavedLane::release() {
  claimed_ = false;
  flush();
}

void InterleavedLane::close() {
  closed_ = true;
  ready_ = nullptr;
  stalled_.cancel();
}

bool InterleavedPort::leaves(InterleavedLane& lane, const Outgoing& packet) {
  if (cut_picture_ == packet.record.picture) return false;
  if (lane.offer(channel_, packet)) return true;
  cut_picture_ = packet.record.picture;
  return false;
}

void InterleavedPort::send_control(std::span<const std::uint8_t> packet) {
  const std::shared_ptr<InterleavedLane> lane = lane_.lock();
  if (!lane) return;
  Outgoing outgoing;
  const auto payload = packet.subspan(outgoing.header.size());
  std::copy_n(packet.begin(), outgoing.header.size(), outgoing.header.begin());
  outgoing.changed_payload.assign(payload.begin(), payload.end());
  if (lane->offer(static_cast<std::uint8_t>(channel_ + 1), outgoing)) lane->flush();
}

const std::vector<SentPacket>& InterleavedPort::send(const std::vector<Outgoing>& packets, Hashing hashing) {
  records_.clear();
  const auto now = std::chrono::steady_clock::now();
  const std::shared_ptr<InterleavedLane> lane = lane_.lock();
  for (const Outgoing& packet : packets) {
    SentPacket& record = records_.emplace_back(record_of(packet, now, hashing));
    if (!record.lost) record.lost = !lane || !leaves(*lane, packet);
  }
  if (lane) lane->flush();
  return records_;
}

}  // namespace vexa::camera
