// SPDX-License-Identifier: Apache-2.0
#include "virtual_camera/rtp/rtp_sender.h"

#include <algorithm>
#include <asio/io_context.hpp>
#include <asio/post.hpp>
#include <cmath>
#include <utility>

namespace vexa::camera {
namespace {

// A camera that was kept from running this long goes on from here instead of sending the backlog.
constexpr std::chrono::seconds kFarBehind{1};
// How long a picture is held before it is asked for again.
constexpr std::chrono::milliseconds kHold{1};
// Of each datagram on an Ethernet: RTP, UDP and IPv4 headers; preamble, frame header, check sequence and gap.
constexpr std::size_t kWireOverhead = 12 + 8 + 20 + 38;

}  // namespace

RtpSender::RtpSender(asio::io_context& context, std::shared_ptr<const CameraOptions> options,
                     std::shared_ptr<SentLog> sent, std::uint32_t session, std::unique_ptr<PacketPort> port)
    : context_(context),
      options_(std::move(options)),
      sent_(std::move(sent)),
      session_(session),
      port_(std::move(port)),
      timer_(context) {}

void RtpSender::play(Play play) {
  if (!may_play()) return;
  user_data_ = std::move(play.user_data);
  stream_.emplace(std::move(play.source), *options_, play.faults, RtpStream::Identity{session_, play.seed});
  impairment_.emplace(std::move(play.faults), play.seed);
  started_ = Clock::now() + play.pause;
  reports_.emplace(options_->sender_reports, play.now.time_since_epoch() + play.pause);
  wait_for_next();
}

void RtpSender::change_faults(PacketFaults faults) {
  if (impairment_) impairment_->change(std::move(faults));
}

void RtpSender::stop() {
  stopped_ = true;
  timer_.cancel();
  stream_.reset();
  port_->close();
}

RtpSender::Time RtpSender::paced(std::chrono::nanoseconds time) const {
  return Time(std::llround(static_cast<double>(time.count()) / options_->speed));
}

// The bursts of a picture are spread over the first half of its time; a port sends one datagram after the other.
std::optional<RtpSender::Time> RtpSender::next_burst() const {
  if (picture_.empty()) return std::nullopt;
  if (const unsigned rate = options_->link_megabits; rate > 0) {
    return picture_began_ + std::chrono::duration_cast<Time>(std::chrono::microseconds(offered_bytes_ * 8 / rate));
  }
  const Time half = paced(steady_time(1, stream_->format().frames_per_second)) / 2;
  const auto share = static_cast<double>(offered_) / static_cast<double>(picture_.size());
  return picture_began_ + Time(std::llround(static_cast<double>(half.count()) * share));
}

std::optional<RtpSender::Time> RtpSender::next_event() {
  std::optional<Time> burst = next_burst();
  if (!burst && stream_->load()) burst = paced(stream_->loaded().due);
  const std::optional<Time> due = impairment_->next_due();
  if (!burst || !due) return burst ? burst : due;
  return std::min(*burst, *due);
}

void RtpSender::wait_for_next() {
  const std::optional<Time> event = next_event();
  if (picture_.empty() && !stream_->load() && !stream_->ended()) wait_for_source();
  if (!event) {
    if (stream_->ended() && !std::exchange(finished_, true)) sent_->add_finished_stream();
    return;
  }
  slip_if_far_behind(*event);
  timer_.expires_at(std::max<Clock::time_point>(started_ + *event, not_before_));
  timer_.async_wait([self = shared_from_this()](asio::error_code error) {
    if (!error && !self->stopped_) self->run_event();
  });
}

void RtpSender::wait_for_source() {
  if (std::exchange(waits_for_source_, true)) return;
  stream_->wait([weak = weak_from_this(), &context = context_] {
    asio::post(context, [weak] {
      const std::shared_ptr<RtpSender> self = weak.lock();
      if (!self || self->stopped_) return;
      self->waits_for_source_ = false;
      self->wait_for_next();
    });
  });
}

void RtpSender::slip_if_far_behind(Time event) {
  const Clock::duration late = Clock::now() - (started_ + event);
  if (late > kFarBehind) started_ += late;
}

// Whether the picture that is due stays. One that leaves late takes the schedule with it: pictures do not catch up with
// each other where somebody watches over their pace.
bool RtpSender::holds(Time event) {
  if (!options_->hold_pictures || !picture_.empty() || impairment_->next_due() == event) return false;
  const bool held = options_->hold_pictures();
  started_ = std::max(started_, Clock::now() + (held ? kHold : Clock::duration::zero()) - event);
  return held;
}

std::string RtpSender::user_data_of(const SourcePicture& picture) const {
  if (!stream_->format().takes_user_data) return {};
  const bool of_key_pictures = !options_->user_data.empty();
  return of_key_pictures && !picture.key ? "" : user_data_();
}

void RtpSender::begin_picture(Time now) {
  picture_.clear();
  picture_began_ = now;
  offered_ = 0;
  offered_bytes_ = 0;
  const std::chrono::nanoseconds due = stream_->loaded().due;
  stream_->take_picture(picture_, user_data_of(stream_->loaded()));
  report(due);
}

void RtpSender::report(std::chrono::nanoseconds picture_time) {
  if (picture_.empty() || !reports_->due(picture_.front().record.picture)) return;
  port_->send_control(reports_->write(picture_.front(), picture_time));
  sent_->add_heard(port_->take_heard());
}

void RtpSender::offer_burst(Time now) {
  if (picture_.empty()) begin_picture(now);
  const std::size_t burst = options_->link_megabits > 0 ? 1 : options_->burst_packets;
  const std::size_t end = std::min(picture_.size(), offered_ + burst);
  for (; offered_ < end; ++offered_) {
    offered_bytes_ += picture_[offered_].payload_to_send().size() + kWireOverhead;
    impairment_->offer(std::move(picture_[offered_]), now, leaving_);
  }
  if (offered_ < picture_.size()) return;
  picture_.clear();
  if (!stream_->load() && stream_->ended()) impairment_->release_held(leaving_);
}

void RtpSender::run_event() {
  const std::optional<Time> now = next_event();
  if (!now || holds(*now)) return wait_for_next();
  leaving_.clear();
  if (impairment_->next_due() == now) {
    impairment_->release_due(*now, leaving_);
  } else {
    offer_burst(*now);
    if (options_->link_megabits == 0) not_before_ = Clock::now() + options_->burst_gap;
  }
  const auto hashing = options_->hash_packets ? PacketPort::Hashing::kOn : PacketPort::Hashing::kOff;
  sent_->add(port_->send(leaving_, hashing));
  if (!stopped_) wait_for_next();
}

}  // namespace vexa::camera
