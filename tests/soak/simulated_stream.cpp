// SPDX-License-Identifier: Apache-2.0
#include "tests/soak/simulated_stream.h"

#include <chrono>

#include "media/assembly/rtp_pictures.h"
#include "transport/wire/packet_order.h"

namespace vexa_test {
namespace {

constexpr int kClockRate = 90000;
constexpr int kPicturesASecond = 5;
constexpr int kPacketsAPicture = 3;
constexpr std::uint64_t kKeyInterval = 50;
constexpr unsigned kOneIn = 10000;  // packets is lost, and one comes twice
constexpr std::int64_t kReportInterval = 5000;

// Datagrams of a header and the first bytes of a fragment: of a key picture and of another, by its place in the
// picture.
unsigned char datagrams[2][kPacketsAPicture][16] = {};

void make_datagrams() {
  for (const int key : {0, 1}) {
    for (int place = 0; place < kPacketsAPicture; ++place) {
      const int edges = (place == 0 ? 0x80 : 0) | (place == kPacketsAPicture - 1 ? 0x40 : 0);
      datagrams[key][place][12] = 0x7c;
      datagrams[key][place][13] = static_cast<unsigned char>(edges | (key == 1 ? 5 : 1));
      datagrams[key][place][14] = 0x80;
    }
  }
}

}  // namespace

void SimulatedStream::begin() {
  if (datagrams[0][0][12] == 0) make_datagrams();
  packets_.clear();
  collector_.emplace(packets_, vexa::kH264Rules, counts_);
  ledger_.begin_run();
  clock_.forget();
  sequence_ = static_cast<std::uint16_t>(random_());
  timestamp_ = static_cast<std::uint32_t>(random_());
  latest_.reset();
  picture_ = 0;
  ++connections_;
}

void SimulatedStream::end() {
  if (!collector_) return;
  collector_->discard_all();
  collector_.reset();
}

const char* SimulatedStream::second(std::int64_t now, std::int64_t camera_clock) {
  const Instant begin{std::chrono::milliseconds(now)};
  for (int picture = 0; picture < kPicturesASecond; ++picture) {
    const Instant moment = begin + std::chrono::milliseconds(picture * 1000 / kPicturesASecond);
    send_picture(moment);
    show(moment);
  }
  if (now % kReportInterval < 1000) report(now, camera_clock);
  return complaint();
}

void SimulatedStream::send_picture(Instant now) {
  const bool key = picture_++ % kKeyInterval == 0;
  for (int place = 0; place < kPacketsAPicture; ++place) {
    SPacketInfo packet;
    packet.data = datagrams[key ? 1 : 0][place];
    packet.length = sizeof datagrams[0][0];
    packet.received = true;
    packet.marker = place == kPacketsAPicture - 1;
    packet.payloadType = 96;
    packet.sequence = sequence_++;
    packet.timestamp = timestamp_;
    wraps_ += packet.sequence == 65535 ? 1 : 0;
    ++sent_;
    const unsigned fate = static_cast<unsigned>(random_()) % kOneIn;
    // The first and the last packets of a run are those that its sequence numbers do not show to be missing.
    if (fate == 0 && picture_ > 1) {
      ++lost_;
      continue;
    }
    receive(packet, now);
    if (fate == 1) receive(packet, now);
  }
  ++made_;
  const std::uint32_t before = timestamp_;
  timestamp_ += kClockRate / kPicturesASecond;
  wraps_ += timestamp_ < before ? 1 : 0;
}

void SimulatedStream::receive(SPacketInfo packet, Instant now) {
  ++arrived_;
  collector_->add(packet, kClockRate, now, ledger_.arrived(packet.sequence));
}

void SimulatedStream::show(Instant now) {
  while (const auto run = collector_->next_picture(now)) {
    const std::uint32_t timestamp = collector_->packets(*run).front().timestamp;
    in_order_ = in_order_ && (!latest_ || vexa::timestamp_is_after(timestamp, *latest_));
    latest_ = timestamp;
    ++shown_;
    collector_->use(*run);
  }
}

void SimulatedStream::report(std::int64_t now, std::int64_t camera_clock) {
  constexpr std::int64_t kSecondsTo1970 = 2208988800;
  constexpr std::int64_t kNanoseconds = 1000000000;
  const std::int64_t seconds = camera_clock / kNanoseconds + kSecondsTo1970;
  vexa::SenderReport report;
  report.ssrc = static_cast<std::uint32_t>(connections_);
  report.ntp = static_cast<std::uint64_t>(seconds) << 32 |
               static_cast<std::uint64_t>((camera_clock % kNanoseconds << 32) / kNanoseconds);
  report.rtp_time = timestamp_;
  clock_.report(report, {camera_clock, now * 1000000}, kClockRate);
}

const char* SimulatedStream::complaint() const {
  const vexa::CollectionCounts& c = counts_;
  if (!in_order_) return "a picture was shown out of order";
  if (arrived_ != c.used + c.duplicated + c.late + c.given_up + c.overwritten + c.stopped + c.held) {
    return "the packets' counts do not balance";
  }
  if (c.pictures_begun != c.pictures_assembled + c.pictures_incomplete + c.pictures_damaged + c.pictures_without_key +
                              c.pictures_too_large + c.pictures_stopped + c.pictures_held) {
    return "the pictures' counts do not balance";
  }
  if (ledger_.expected() != ledger_.received_once() + ledger_.missing()) return "the ledger does not balance";
  if (ledger_.missing() > lost_) return "packets are missing that were not lost";
  // A lost packet costs its picture, and all that refer to it up to the next key picture.
  if (shown_ + (lost_ + connections_) * (kKeyInterval + 1) < made_) return "whole pictures were not shown";
  if (packets_.size() > kPacketsAPicture * kKeyInterval) return "the list of packets grows";
  if (clock_.state() == vexa::SenderClock::State::kFrozen) return "the camera's clock counts as frozen";
  return nullptr;
}

}  // namespace vexa_test
