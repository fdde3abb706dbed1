// Which sequence numbers of an RTP source have come (RFC 3550, A.1 and A.3).
#pragma once

#include <array>
#include <cstddef>
#include <cstdint>
#include <optional>

namespace vexa {

/// Counts what a source must have sent by its sequence numbers. At any time `expected()` is `received_once()` and
/// `missing()` together; a packet that comes late is no longer missing, once. A plain value.
class SequenceLedger {
 public:
  /// How far apart two packets of one run may be; a packet farther off is a restart if another follows it.
  static constexpr std::uint16_t kWindow = 8192;

  enum class Arrival {
    kNew,        ///< ahead of all others
    kLate,       ///< was missing until now
    kDuplicate,  ///< has come before
    kUnplaced    ///< too far from the others, and not counted as expected unless the next one follows it
  };

  Arrival arrived(std::uint16_t sequence) {
    if (running_ && sequence == static_cast<std::uint16_t>(highest_ + 1)) {
      ++highest_;
      mark(highest_);
      jump_.reset();
      return Arrival::kNew;
    }
    return out_of_order(sequence);
  }

  /// Another source, or another start: the next packet begins a run of its own. What is missing stays missing.
  void begin_run() {
    running_ = false;
    jump_.reset();
  }

  /// The number without its wraps; of the numbers near the highest. Ascends across runs.
  std::uint64_t extended(std::uint16_t sequence) const {
    const auto behind = static_cast<std::uint16_t>(highest_ - sequence);
    return behind <= 32767 ? highest_ - behind : highest_ + static_cast<std::uint16_t>(sequence - highest_);
  }

  std::uint64_t expected() const { return runs_ == 0 ? 0 : expected_before_ + (highest_ - base_ + 1); }
  std::uint64_t received_once() const { return expected() - missing_; }
  std::uint64_t missing() const { return missing_; }
  std::uint64_t late() const { return late_; }
  std::uint64_t highest() const { return highest_; }
  /// Raised by every restart of the sequence and every begin_run().
  std::uint64_t runs() const { return runs_; }

 private:
  static constexpr std::size_t kWordBits = 32;

  Arrival out_of_order(std::uint16_t sequence);
  Arrival before_base(std::uint64_t number);
  Arrival take_jump(std::uint16_t sequence);
  void open_run(std::uint16_t sequence);

  std::uint32_t& word(std::uint64_t number) { return seen_[number % kWindow / kWordBits]; }
  static std::uint32_t bit(std::uint64_t number) { return std::uint32_t{1} << (number % kWordBits); }
  void mark(std::uint64_t number) { word(number) |= bit(number); }

  std::array<std::uint32_t, kWindow / kWordBits> seen_{};  // by extended number, modulo the window
  std::uint64_t base_ = 0;                                 // first number of the run
  std::uint64_t highest_ = 0;
  std::uint64_t expected_before_ = 0;  // in earlier runs
  std::uint64_t missing_ = 0;
  std::uint64_t late_ = 0;
  std::uint64_t runs_ = 0;
  bool running_ = false;
  std::optional<std::uint16_t> jump_;  // the number of an unplaced packet
};

}  // namespace vexa
