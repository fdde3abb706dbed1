// SPDX-License-Identifier: Apache-2.0
// A fuzz input made of records, for targets that play a dialogue: two bytes of length before each. The mutator keeps
// that form: it changes, inserts, repeats, removes and exchanges records, so that the fuzzer finds the later steps of a
// dialogue.
#pragma once

#include <algorithm>
#include <cstddef>
#include <cstdint>
#include <optional>
#include <random>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

#include "fuzz/check.h"
#include "runtime/base/bytes.h"

extern "C" std::size_t LLVMFuzzerMutate(std::uint8_t* data, std::size_t size, std::size_t most);

namespace vexa_fuzz {

/// Reads the records one after the other. The last one may be cut short.
class Records {
 public:
  explicit Records(vexa::Bytes input) : left_(input) {}

  std::optional<vexa::Bytes> next() {
    if (left_.size() < kPrefix) return std::nullopt;
    const auto announced = static_cast<std::size_t>(left_[0] << 8 | left_[1]);
    left_ = left_.subspan(kPrefix);
    const vexa::Bytes record = left_.first(std::min(announced, left_.size()));
    left_ = left_.subspan(record.size());
    return record;
  }
  /// Whether next() has none left.
  bool is_empty() const { return left_.size() < kPrefix; }

 private:
  static constexpr std::size_t kPrefix = 2;

  vexa::Bytes left_;
};

inline std::string_view text_of(vexa::Bytes bytes) { return text_of(bytes.data(), bytes.size()); }

/// The records of one input, changed in one or more places.
class RecordMutator {
 public:
  RecordMutator(vexa::Bytes input, std::size_t most, unsigned int seed) : most_(most), random_(seed) {
    Records records(input);
    while (const auto record = records.next()) records_.emplace_back(record->begin(), record->end());
  }

  /// The changed input, at most as long as the constructor was given.
  std::vector<std::uint8_t> mutated() {
    for (std::size_t changes = 1 + below(3); changes > 0; --changes) change();
    std::vector<std::uint8_t> bytes;
    for (const Record& record : records_) {
      const std::size_t length = std::min<std::size_t>(record.size(), 0xffff);
      if (bytes.size() + 2 + length > most_) break;
      bytes.push_back(static_cast<std::uint8_t>(length >> 8));
      bytes.push_back(static_cast<std::uint8_t>(length));
      bytes.insert(bytes.end(), record.begin(), record.begin() + static_cast<std::ptrdiff_t>(length));
    }
    return bytes;
  }

 private:
  using Record = std::vector<std::uint8_t>;

  std::size_t below(std::size_t bound) { return random_() % bound; }
  Record& any() { return records_[below(records_.size())]; }
  std::ptrdiff_t place() { return static_cast<std::ptrdiff_t>(below(records_.size() + 1)); }

  void change() {
    if (records_.empty()) {
      records_.emplace_back(1 + below(8));
      return;
    }
    switch (below(8)) {
      case 0: {
        const Record copy = any();
        records_.insert(records_.begin() + place(), copy);
        return;
      }
      case 1:
        records_.erase(records_.begin() + static_cast<std::ptrdiff_t>(below(records_.size())));
        return;
      case 2:
        std::swap(any(), any());
        return;
      case 3:
        cut(any());
        return;
      case 4:
        change_number(any());
        return;
      default:
        change_bytes(any());
    }
  }

  /// In two records, or to its front alone.
  void cut(Record& record) {
    if (record.empty()) return;
    const auto at = static_cast<std::ptrdiff_t>(below(record.size()));
    Record rest(record.begin() + at, record.end());
    record.resize(static_cast<std::size_t>(at));
    if (below(2) == 0) records_.insert(records_.begin() + place(), std::move(rest));
  }

  /// Another number in the place of one that is written in decimal digits.
  void change_number(Record& record) {
    static constexpr std::string_view kNumbers[] = {
        "0",          "-1",         "1",          "255",         "65535",
        "2147483647", "4294967295", "4294967296", "-2147483648", "99999999999999999999"};
    const auto is_digit = [](std::uint8_t byte) { return byte >= '0' && byte <= '9'; };
    const auto from = record.begin() + static_cast<std::ptrdiff_t>(record.empty() ? 0 : below(record.size()));
    const auto first = std::find_if(from, record.end(), is_digit);
    const auto last = std::find_if_not(first, record.end(), is_digit);
    if (first == last) return change_bytes(record);
    const std::string_view number = kNumbers[below(std::size(kNumbers))];
    record.insert(record.erase(first, last), number.begin(), number.end());
  }

  void change_bytes(Record& record) {
    const std::size_t length = record.size();
    record.resize(length + 64);
    record.resize(LLVMFuzzerMutate(record.data(), length, record.size()));
  }

  const std::size_t most_;
  std::minstd_rand random_;
  std::vector<Record> records_;
};

}  // namespace vexa_fuzz

// libFuzzer's hook: a target that includes this header reads records.
extern "C" std::size_t LLVMFuzzerCustomMutator(std::uint8_t* data, std::size_t size, std::size_t most,
                                               unsigned int seed) {
  const std::vector<std::uint8_t> bytes = vexa_fuzz::RecordMutator({data, size}, most, seed).mutated();
  std::copy(bytes.begin(), bytes.end(), data);
  return bytes.size();
}
