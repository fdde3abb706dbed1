#include "transport/wire/sequence_ledger.h"

namespace vexa {
namespace {

constexpr std::uint64_t kNumbersOfACycle = 65536;

}  // namespace

void SequenceLedger::open_run(std::uint16_t sequence) {
  expected_before_ = expected();
  // The next cycle, so that extended numbers never go back.
  base_ = runs_ == 0 ? sequence : (highest_ / kNumbersOfACycle + 1) * kNumbersOfACycle + sequence;
  highest_ = base_;
  ++runs_;
  running_ = true;
  jump_.reset();
  seen_.fill(0);
  mark(highest_);
}

SequenceLedger::Arrival SequenceLedger::out_of_order(std::uint16_t sequence) {
  if (!running_) {
    open_run(sequence);
    return Arrival::kNew;
  }
  const auto ahead = static_cast<std::uint16_t>(sequence - highest_);
  if (ahead != 0 && ahead <= kWindow) {
    jump_.reset();
    for (std::uint64_t number = highest_ + 1; number < highest_ + ahead; ++number) word(number) &= ~bit(number);
    missing_ += ahead - 1U;
    highest_ += ahead;
    mark(highest_);
    return Arrival::kNew;
  }
  const auto behind = static_cast<std::uint16_t>(highest_ - sequence);
  if (behind >= kWindow || behind > highest_) return take_jump(sequence);
  const std::uint64_t number = highest_ - behind;
  if (number < base_) return before_base(number);
  if ((word(number) & bit(number)) != 0) return Arrival::kDuplicate;
  mark(number);
  --missing_;
  ++late_;
  return Arrival::kLate;
}

// The first packet to come was not the first sent.
SequenceLedger::Arrival SequenceLedger::before_base(std::uint64_t number) {
  missing_ += base_ - number - 1;
  base_ = number;
  mark(number);
  return Arrival::kLate;
}

SequenceLedger::Arrival SequenceLedger::take_jump(std::uint16_t sequence) {
  if (!jump_ || sequence != static_cast<std::uint16_t>(*jump_ + 1)) {
    jump_ = sequence;
    return Arrival::kUnplaced;
  }
  open_run(*jump_);
  ++highest_;
  mark(highest_);
  return Arrival::kNew;
}

}  // namespace vexa
