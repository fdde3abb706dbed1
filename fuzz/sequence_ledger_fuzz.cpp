// SPDX-License-Identifier: Apache-2.0
// Sequence numbers in any order: two bytes each. What is expected is what came and what is missing, and while no number
// is far from the others, a list of all numbers gives the same counts.
#include <cstdint>
#include <set>

#include "fuzz/check.h"
#include "runtime/base/bytes.h"
#include "transport/wire/sequence_ledger.h"

namespace {

using vexa_fuzz::check;

/// Numbers of one run, with their wraps counted.
class Reference {
 public:
  /// False when the number is too far off to belong to the run for certain.
  bool take(std::uint16_t sequence) {
    const auto step =
        static_cast<std::int16_t>(static_cast<std::uint16_t>(sequence - static_cast<std::uint16_t>(highest_)));
    if (numbers_.empty()) {
      highest_ = sequence;
    } else if (step > 1000 || step < -1000 || highest_ + step < 0) {
      return false;
    }
    const std::int64_t number = numbers_.empty() ? highest_ : highest_ + step;
    numbers_.insert(number);
    if (number > highest_) highest_ = number;
    return true;
  }
  std::uint64_t expected() const {
    return numbers_.empty() ? 0 : static_cast<std::uint64_t>(*numbers_.rbegin() - *numbers_.begin() + 1);
  }
  std::uint64_t received() const { return numbers_.size(); }

 private:
  std::set<std::int64_t> numbers_;
  std::int64_t highest_ = 0;
};

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  vexa::ByteReader in({data, size});
  vexa::SequenceLedger ledger;
  Reference reference;
  bool comparable = true;
  while (in.rest().size() >= 2) {
    const std::uint16_t sequence = in.u16();
    const std::uint64_t before = ledger.expected();
    const auto arrival = ledger.arrived(sequence);
    comparable = comparable && reference.take(sequence);
    check(ledger.expected() == ledger.received_once() + ledger.missing());
    check(ledger.expected() >= before);
    check(arrival == vexa::SequenceLedger::Arrival::kUnplaced ||
          static_cast<std::uint16_t>(ledger.extended(sequence)) == sequence);
    if (!comparable) continue;
    check(ledger.expected() == reference.expected() && ledger.received_once() == reference.received());
    check(ledger.runs() == 1);
  }
  return 0;
}
