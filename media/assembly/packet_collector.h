// Which received packets form the next picture; which are waited for, and which are given up.
#pragma once

#include <chrono>
#include <cstdint>
#include <optional>
#include <vector>

#include "media/assembly/collection_counts.h"
#include "media/assembly/picture_rules.h"
#include "media/assembly/recent_pictures.h"
#include "transport/wire/packet_ring.h"
#include "transport/wire/sequence_ledger.h"
#include "vexa/video_info.h"

namespace vexa {

/// Where the packets of a complete picture stand in the list.
struct PacketRunPlace {
  std::size_t first = 0;
  std::size_t count = 0;
};

/// Why a complete picture became no frame.
enum class PictureLoss { kDamaged, kTooLarge };

/// Keeps the ordered packet list of one stream and picks pictures from it. docs/packet_list.md tells its rules.
///
/// Holds no clock and no bytes: the caller passes the time, and the packets' data stay in the packet buffer. Used by
/// the streaming thread alone.
class PacketCollector {
 public:
  using Instant = std::chrono::steady_clock::time_point;

  using Run = PacketRunPlace;

  /// `packets` is the list; it must outlive the collector, which alone changes it.
  PacketCollector(std::vector<SPacketInfo>& packets, const PictureRules& rules)
      : PacketCollector(packets, rules, own_counts_) {}
  /// Counts into `counts`, which outlive it.
  PacketCollector(std::vector<SPacketInfo>& packets, const PictureRules& rules, CollectionCounts& counts)
      : packets_(packets), rules_(rules), counts_(counts) {}
  PacketCollector(const PacketCollector&) = delete;
  PacketCollector& operator=(const PacketCollector&) = delete;

  /// Takes a packet of at least 12 bytes; `clock_rate` is the RTP clock's, in ticks a second. True when it is
  /// remembered, so that drop_overwritten must be told when its bytes are gone. `arrival` decides nothing but how a
  /// packet that comes too late is counted.
  bool add(const SPacketInfo& packet, int clock_rate, Instant now,
           SequenceLedger::Arrival arrival = SequenceLedger::Arrival::kNew);

  /// The packets of these slots have been overwritten.
  void drop_overwritten(const std::vector<PacketRing::Slot>& slots);

  /// The picture that is next, when it stands complete; pictures that cannot be shown are dropped on the way.
  std::optional<Run> next_picture(Instant now);

  /// The run was shown: its packets are used and leave the list.
  void use(Run run);
  /// The run could not be assembled: its packets are used, and a key picture must come next.
  void abandon(Run run, PictureLoss loss = PictureLoss::kDamaged);
  /// The stream ends: all that is held is given up, and counted so.
  void discard_all();

  /// When next_picture may have a new answer without a new packet.
  std::optional<Instant> deadline() const;

  PacketRun packets(Run run) const { return PacketRun(packets_).subspan(run.first, run.count); }
  /// No packet's bytes are needed any more.
  bool is_empty() const { return packets_.empty() && strays_.empty(); }
  bool waiting_for_key() const { return waiting_for_key_; }
  const CollectionCounts& counts() const { return counts_; }

 private:
  struct KeyPicture {
    std::uint32_t timestamp;
    Instant complete_since;
    std::optional<std::uint16_t> proven_first;  // its first packet, when the one before it was seen
  };

  void remove_too_old(const SPacketInfo& newest, int clock_rate);
  bool is_listed(const SPacketInfo& packet) const;
  bool follows_last_used(std::uint16_t sequence) const;
  bool is_latecomer(const SPacketInfo& packet, int clock_rate) const;
  void take_stray(const SPacketInfo& packet, Instant now);
  void insert(const SPacketInfo& packet, Instant now);
  void note_key_picture(std::size_t index, Instant now);
  void note_proven_follower(std::size_t index, Instant now);
  Run run_around(std::size_t index) const;
  std::optional<Run> run_of(std::uint32_t timestamp) const;
  bool is_complete(Run run) const;
  bool front_is_proven(Run run) const;
  bool is_trusted_key(Run run) const;
  bool still_stands(const KeyPicture& key, Run run) const;
  std::optional<Run> expected_run() const;
  std::optional<Run> first_standing_key(Instant now);
  void mark_used(Run run);
  void remove_passed_by();
  void forget_sequence();
  void drop_strays();
  void count_inserted(std::size_t index);
  void count_given_up(std::size_t listed_before);
  std::uint64_t pictures_listed() const;

  std::vector<SPacketInfo>& packets_;
  const PictureRules& rules_;
  std::optional<std::uint16_t> last_used_;  // sequence of the last packet used, while one is tracked
  std::uint32_t last_used_timestamp_ = 0;
  bool waiting_for_key_ = true;
  bool preamble_seen_ = false;
  bool changed_ = false;          // something that could complete a picture has happened
  std::uint8_t key_opening_ = 0;  // how the last key picture began whose front was proven; 0: none yet
  std::vector<KeyPicture> standing_keys_;
  std::vector<SPacketInfo> strays_;  // consecutive packets that are not ahead: a restart, if they go on
  RecentPictures recent_;
  CollectionCounts own_counts_;
  CollectionCounts& counts_;
};

}  // namespace vexa
