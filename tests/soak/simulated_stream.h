// SPDX-License-Identifier: Apache-2.0
// The stream of a camera in simulated time, and all that a driver keeps of it: its packets' list, which of them are
// missing, the camera's clock.
#pragma once

#include <cstdint>
#include <optional>
#include <random>
#include <vector>

#include "media/assembly/packet_collector.h"
#include "transport/wire/sender_clock.h"
#include "transport/wire/sequence_ledger.h"

namespace vexa_test {

/// Pictures of three packets, five a second, one in fifty of them a key picture. Of ten thousand packets one is lost
/// and one comes twice. What is counted is checked at every second.
class SimulatedStream {
 public:
  explicit SimulatedStream(std::uint32_t seed) : random_(seed) {}

  /// The camera begins at any sequence number and timestamp.
  void begin();
  /// A second of the stream, which begins `now` milliseconds after the start of the simulation; `camera_clock` is in
  /// nanoseconds since 1970. Why it is wrong; null when it is not.
  [[nodiscard]] const char* second(std::int64_t now, std::int64_t camera_clock);
  void end();

  [[nodiscard]] std::uint64_t packets() const { return sent_; }
  [[nodiscard]] std::uint64_t pictures() const { return shown_; }
  [[nodiscard]] std::uint64_t wraps() const { return wraps_; }

 private:
  using Instant = vexa::PacketCollector::Instant;

  void send_picture(Instant now);
  void receive(SPacketInfo packet, Instant now);
  void show(Instant now);
  void report(std::int64_t now, std::int64_t camera_clock);
  [[nodiscard]] const char* complaint() const;

  std::mt19937 random_;
  std::vector<SPacketInfo> packets_;
  vexa::CollectionCounts counts_;
  std::optional<vexa::PacketCollector> collector_;
  vexa::SequenceLedger ledger_;
  vexa::SenderClock clock_;
  std::uint16_t sequence_ = 0;
  std::uint32_t timestamp_ = 0;
  std::optional<std::uint32_t> latest_;  ///< timestamp of the picture shown last
  std::uint64_t picture_ = 0;            ///< of this connection
  std::uint64_t sent_ = 0;
  std::uint64_t lost_ = 0;
  std::uint64_t arrived_ = 0;
  std::uint64_t wraps_ = 0;
  std::uint64_t shown_ = 0;
  std::uint64_t made_ = 0;         ///< pictures sent
  std::uint64_t connections_ = 0;  ///< begun
  bool in_order_ = true;
};

}  // namespace vexa_test
