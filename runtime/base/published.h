// SPDX-License-Identifier: Apache-2.0
// A record that one thread writes and any thread reads, without a lock.
#pragma once

#include <atomic>
#include <chrono>
#include <cstddef>
#include <cstdint>
#include <cstring>
#include <thread>
#include <type_traits>

namespace vexa {

/// A sequence lock: the writer never waits; a reader tries again while a write goes on. Of several writers only one may
/// publish at a time, which is their lock's to ensure. Words are as wide as the machine stores whole, so on 32 bits a
/// 64-bit member goes in two halves, which the version keeps together.
template <typename Record>
class Published {
  using Word = std::uintptr_t;
  static_assert(std::is_trivially_copyable_v<Record>);
  static_assert(sizeof(Record) % sizeof(Word) == 0, "pad the record to whole words");

 public:
  void publish(const Record& record) {
    const std::uint32_t writing = version_.load(std::memory_order_relaxed) + 1;
    version_.store(writing, std::memory_order_relaxed);
    const auto* bytes = reinterpret_cast<const unsigned char*>(&record);
    for (std::size_t i = 0; i < kWords; ++i) {
      Word word;
      std::memcpy(&word, bytes + i * sizeof word, sizeof word);
      // Release: who sees this word sees the odd version too. A fence would do, but ThreadSanitizer knows none.
      words_[i].store(word, std::memory_order_release);
    }
    version_.store(writing + 1, std::memory_order_release);
  }

  /// The record published last, or one that replaced it meanwhile.
  Record read() const {
    Record record;
    for (unsigned tries = 0; !try_read(record); ++tries) {
      // The writer may have been put aside in the middle: let it run, also below this thread's priority.
      if (tries < kEagerTries) {
        std::this_thread::yield();
      } else {
        std::this_thread::sleep_for(kPause);
      }
    }
    return record;
  }

  /// One try, for a reader that must not wait; false when a write goes on.
  bool try_read(Record& record) const {
    const std::uint32_t before = version_.load(std::memory_order_acquire);
    if (before % 2 != 0) return false;
    auto* bytes = reinterpret_cast<unsigned char*>(&record);
    for (std::size_t i = 0; i < kWords; ++i) {
      const Word word = words_[i].load(std::memory_order_acquire);
      std::memcpy(bytes + i * sizeof word, &word, sizeof word);
    }
    return version_.load(std::memory_order_relaxed) == before;
  }

  /// How often it was published, modulo 2^31.
  std::uint32_t version() const { return version_.load(std::memory_order_acquire) / 2; }

 private:
  static constexpr std::size_t kWords = sizeof(Record) / sizeof(Word);
  static constexpr unsigned kEagerTries = 16;
  static constexpr std::chrono::microseconds kPause{50};

  std::atomic<std::uint32_t> version_{0};
  std::atomic<Word> words_[kWords]{};
};

}  // namespace vexa
