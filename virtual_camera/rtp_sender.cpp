#include "virtual_camera/rtp_sender.h"

#include <algorithm>
#include <cmath>
#include <utility>

#include "virtual_camera/stream_plan.h"

namespace vexa::camera {
namespace {

// A camera that was kept from running this long goes on from here instead of sending the backlog.
constexpr std::chrono::seconds kFarBehind{1};
// Of each datagram on an Ethernet: RTP, UDP and IPv4 headers; preamble, frame header, check sequence and gap.
constexpr std::size_t kWireOverhead = 12 + 8 + 20 + 38;
// Makes the seeds of a camera's sessions differ; the first session has the camera's own.
constexpr std::uint64_t kSeedStep = 0x9E3779B97F4A7C15ULL;

}  // namespace

RtpSender::RtpSender(std::shared_ptr<CameraState> state, std::uint32_t session, int video,
                     std::unique_ptr<PacketPort> port)
    : state_(std::move(state)), session_(session), video_(video), port_(std::move(port)), timer_(state_->context) {}

void RtpSender::play(std::chrono::milliseconds pause) {
  if (stream_ || stopped_) return;
  const auto plan = plan_stream(state_->options, state_->settings, video_);
  if (!plan || !plan->clip) return;
  CameraOptions options = state_->options;
  options.clip = plan->clip;
  options.frames_per_second = plan->frames_per_second;
  frames_per_second_ = plan->frames_per_second;
  const std::uint64_t seed = state_->options.seed + kSeedStep * state_->plays++;
  PacketFaults faults;
  {
    const std::lock_guard<std::mutex> lock(state_->packet_faults_mutex);
    faults = state_->packet_faults;
  }
  stream_.emplace(options, faults, session_, seed);
  lane_.emplace(std::move(faults), seed);
  started_ = Clock::now() + pause;
  load_picture();
  wait_for_next();
}

void RtpSender::stop() {
  stopped_ = true;
  timer_.cancel();
  port_->close();
}

RtpSender::Time RtpSender::picture_time(std::uint64_t picture) const {
  return Time(std::llround(static_cast<double>(picture) * 1e9 / (frames_per_second_ * state_->options.speed)));
}

void RtpSender::load_picture() {
  picture_.clear();
  offered_ = 0;
  offered_bytes_ = 0;
  if (stream_->ended()) return;
  picture_index_ = stream_->next_picture();
  stream_->take_picture(picture_);
}

// The bursts of a picture are spread over the first half of its time; a port sends one datagram behind the other.
std::optional<RtpSender::Time> RtpSender::next_burst() const {
  if (picture_.empty()) return std::nullopt;
  const Time begin = picture_time(picture_index_);
  if (const unsigned rate = state_->options.link_megabits; rate > 0) {
    return begin + std::chrono::duration_cast<Time>(std::chrono::microseconds(offered_bytes_ * 8 / rate));
  }
  const Time half = (picture_time(picture_index_ + 1) - begin) / 2;
  const auto share = static_cast<double>(offered_) / static_cast<double>(picture_.size());
  return begin + Time(std::llround(static_cast<double>(half.count()) * share));
}

std::optional<RtpSender::Time> RtpSender::next_event() const {
  const std::optional<Time> burst = next_burst();
  const std::optional<Time> due = lane_->next_due();
  if (!burst || !due) return burst ? burst : due;
  return std::min(*burst, *due);
}

void RtpSender::wait_for_next() {
  const std::optional<Time> event = next_event();
  if (!event) {
    state_->sent.add_finished_stream();
    return;
  }
  slip_if_far_behind(*event);
  timer_.expires_at(std::max<Clock::time_point>(started_ + *event, not_before_));
  timer_.async_wait([self = shared_from_this()](asio::error_code error) {
    if (!error && !self->stopped_) self->run_event();
  });
}

void RtpSender::slip_if_far_behind(Time event) {
  const Clock::duration late = Clock::now() - (started_ + event);
  if (late > kFarBehind) started_ += late;
}

void RtpSender::offer_burst(Time now) {
  const std::size_t burst = state_->options.link_megabits > 0 ? 1 : state_->options.burst_packets;
  const std::size_t end = std::min(picture_.size(), offered_ + burst);
  for (; offered_ < end; ++offered_) {
    offered_bytes_ += picture_[offered_].payload_to_send().size() + kWireOverhead;
    lane_->offer(std::move(picture_[offered_]), now, leaving_);
  }
  if (offered_ < picture_.size()) return;
  load_picture();
  if (picture_.empty()) lane_->release_held(leaving_);
}

void RtpSender::run_event() {
  leaving_.clear();
  const Time now = *next_event();
  if (lane_->next_due() == now) {
    lane_->release_due(now, leaving_);
  } else {
    offer_burst(now);
    if (state_->options.link_megabits == 0) not_before_ = Clock::now() + state_->options.burst_gap;
  }
  const auto hashing = state_->options.hash_packets ? PacketPort::Hashing::kOn : PacketPort::Hashing::kOff;
  state_->sent.add(port_->send(leaving_, hashing));
  wait_for_next();
}

}  // namespace vexa::camera
