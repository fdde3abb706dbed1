// SPDX-License-Identifier: Apache-2.0
// The card in the camera's slot, and the recordings on it.
#ifndef VIRTUAL_CAMERA_CARD_CARD_H_
#define VIRTUAL_CAMERA_CARD_CARD_H_

#include <chrono>
#include <cstddef>
#include <cstdint>
#include <memory>
#include <mutex>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "virtual_camera/codec/image_clip.h"
#include "virtual_camera/wire/message.h"

namespace vexa::camera {

// What a recording is of.
struct RecordingHead {
  Codec codec = Codec::kH264;
  std::string size = "640,480";  // "width,height"
  int frame_rate = 25;
  int bit_rate = 0;  // kbit/s; JPEG has its quality instead
  int quality = 0;
  std::chrono::microseconds start{0};  // since 1970-01-01 UTC
};

// A coded picture and its moment after the recording's start. Moments are whole tenths of a millisecond, which RTP's
// clock of 90 kHz expresses exactly.
struct StoredPicture {
  std::shared_ptr<const std::string> bytes;
  bool key = false;
  std::chrono::microseconds at{0};
};

struct Recording {
  std::string name;
  RecordingHead head;
  std::vector<StoredPicture> pictures;
  std::uint64_t bytes = 0;
  bool finished = false;

  [[nodiscard]] std::chrono::microseconds end() const {
    return head.start + (pictures.empty() ? std::chrono::microseconds(0) : pictures.back().at);
  }
};

[[nodiscard]] std::chrono::microseconds in_tenths_of_milliseconds(std::chrono::nanoseconds time);
// "20240131T235959".
[[nodiscard]] std::string second_text(std::chrono::microseconds moment);
// The clock of the session description (RFC 2326, 3.7): "20240131T235959.2500Z-20240201T000100.0000Z".
[[nodiscard]] std::string clock_range(const Recording& recording);
// One line of the search answer.
[[nodiscard]] std::string search_line(const Recording& recording);

enum class CardHealth { kGood, kMissing, kFailing };

// The recordings of one camera, in memory. Owned by the camera's state; thread-safe. One recording is made at a time,
// and what is full stays full until a recording is deleted.
class Card {
 public:
  // 0 bytes: the slot is empty.
  explicit Card(std::uint64_t capacity);

  // A missing card neither records nor lists; a failing one lists what it holds and does neither write nor
  // delete.
  void set_health(CardHealth health);
  [[nodiscard]] CardHealth health() const;
  [[nodiscard]] std::uint64_t free_bytes() const;

  // Begins a recording and returns its name, which no other has had; empty when the card takes none.
  [[nodiscard]] std::string begin(RecordingHead head);
  // Adds to the recording begun. False when it cannot, or the recording was deleted: it has ended.
  [[nodiscard]] bool add(StoredPicture picture);
  void finish();

  // A line for each recording; none when there is no card.
  enum class Order { kOldest, kNewest };
  [[nodiscard]] std::optional<std::string> search(Order order) const;
  // The free space as the inquiry reports it.
  [[nodiscard]] std::string space_text() const;

  // From the oldest to the newest; none when there is no card.
  [[nodiscard]] std::optional<std::vector<Recording>> recordings() const;
  [[nodiscard]] std::optional<Recording> find(std::string_view name) const;
  [[nodiscard]] bool holds(std::string_view name) const;
  // False for a recording that is not there, and for a card that does not delete.
  bool erase(std::string_view name);
  bool erase_all();

 private:
  [[nodiscard]] std::uint64_t free_locked() const;
  [[nodiscard]] const Recording* find_locked(std::string_view name) const;

  mutable std::mutex mutex_;
  const std::uint64_t capacity_;
  CardHealth health_;
  std::vector<Recording> recordings_;  // the one being made is last, while it is not finished
  std::uint64_t made_ = 0;
};

// "/command/search?Order=oldest", and "/command/edgestorage.cgi?delete=all" or "?DeletebyName=NAME"; none for any
// other request.
[[nodiscard]] std::optional<Answer> answer_card(const RequestHead& request, Card& card);

}  // namespace vexa::camera

#endif  // VIRTUAL_CAMERA_CARD_CARD_H_
