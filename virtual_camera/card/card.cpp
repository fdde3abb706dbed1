// SPDX-License-Identifier: Apache-2.0
#include "virtual_camera/card/card.h"

#include <fmt/format.h>

#include <algorithm>
#include <ctime>
#include <string>
#include <string_view>
#include <utility>

#include "virtual_camera/wire/message.h"

namespace vexa::camera {
namespace {

using std::chrono::microseconds;

constexpr std::chrono::microseconds kTenth{100};
constexpr std::uint64_t kKilobyte = 1024;

std::string clock_text(microseconds moment) {
  const auto tenths = moment % std::chrono::seconds(1) / kTenth;
  return fmt::format("{}.{:04}Z", second_text(moment), tenths);
}

constexpr std::string_view kDeleteByName = "DeletebyName=";

Answer search(std::string_view query, const Card& card) {
  if (query != "Order=oldest" && query != "Order=newest") return http_answer("400 Bad Request", "");
  const std::optional<std::string> lines =
      card.search(query == "Order=oldest" ? Card::Order::kOldest : Card::Order::kNewest);
  return lines ? http_answer("200 OK", *lines) : http_answer("503 Service Unavailable", "");
}

Answer deleted(bool done) { return done ? no_content() : http_answer("400 Bad Request", ""); }

}  // namespace

microseconds in_tenths_of_milliseconds(std::chrono::nanoseconds time) { return (time + kTenth / 2) / kTenth * kTenth; }

std::string second_text(microseconds moment) {
  const auto seconds = static_cast<std::time_t>(std::chrono::floor<std::chrono::seconds>(moment).count());
  std::tm time{};
  gmtime_r(&seconds, &time);
  return fmt::format("{:04}{:02}{:02}T{:02}{:02}{:02}", time.tm_year + 1900, time.tm_mon + 1, time.tm_mday,
                     time.tm_hour, time.tm_min, time.tm_sec);
}

std::string clock_range(const Recording& recording) {
  return clock_text(recording.head.start) + "-" + clock_text(recording.end());
}

std::string search_line(const Recording& recording) {
  const RecordingHead& head = recording.head;
  const bool jpeg = head.codec == Codec::kJpeg;
  return fmt::format(
      "StreamName={},Start={},End={},ImageCodec={},ImageSize={},FrameRate={},{}={},AudioCodec=none,Size={},Status={}"
      "\r\n",
      recording.name, second_text(head.start), second_text(recording.end()), codec_word(head.codec), head.size,
      head.frame_rate, jpeg ? "Quality" : "BitRate", jpeg ? head.quality : head.bit_rate,
      (recording.bytes + kKilobyte - 1) / kKilobyte, recording.finished ? "normal" : "recording");
}

Card::Card(std::uint64_t capacity)
    : capacity_(capacity), health_(capacity == 0 ? CardHealth::kMissing : CardHealth::kGood) {}

void Card::set_health(CardHealth health) {
  const std::lock_guard<std::mutex> lock(mutex_);
  health_ = health;
}

CardHealth Card::health() const {
  const std::lock_guard<std::mutex> lock(mutex_);
  return health_;
}

std::uint64_t Card::free_locked() const {
  if (health_ != CardHealth::kGood) return 0;
  std::uint64_t used = 0;
  for (const Recording& recording : recordings_) used += recording.bytes;
  return capacity_ - std::min(used, capacity_);
}

std::uint64_t Card::free_bytes() const {
  const std::lock_guard<std::mutex> lock(mutex_);
  return free_locked();
}

std::string Card::begin(RecordingHead head) {
  const std::lock_guard<std::mutex> lock(mutex_);
  if (!recordings_.empty()) recordings_.back().finished = true;
  if (free_locked() == 0) return {};
  Recording& recording = recordings_.emplace_back();
  recording.name = fmt::format("rec{}_{}", ++made_, second_text(head.start));
  recording.head = std::move(head);
  return recording.name;
}

bool Card::add(StoredPicture picture) {
  const std::lock_guard<std::mutex> lock(mutex_);
  if (recordings_.empty() || recordings_.back().finished) return false;
  if (free_locked() < picture.bytes->size()) return false;
  recordings_.back().bytes += picture.bytes->size();
  recordings_.back().pictures.push_back(std::move(picture));
  return true;
}

void Card::finish() {
  const std::lock_guard<std::mutex> lock(mutex_);
  if (!recordings_.empty()) recordings_.back().finished = true;
}

std::optional<std::string> Card::search(Order order) const {
  const std::lock_guard<std::mutex> lock(mutex_);
  if (health_ == CardHealth::kMissing) return std::nullopt;
  std::string lines;
  for (std::size_t i = 0; i < recordings_.size(); ++i) {
    lines += search_line(recordings_[order == Order::kOldest ? i : recordings_.size() - 1 - i]);
  }
  return lines;
}

std::string Card::space_text() const {
  const std::lock_guard<std::mutex> lock(mutex_);
  switch (health_) {
    case CardHealth::kMissing:
      return "none";
    case CardHealth::kFailing:
      return "error";
    case CardHealth::kGood:
      break;
  }
  return fmt::format("Free space : {}Kbyte", free_locked() / kKilobyte);
}

std::optional<std::vector<Recording>> Card::recordings() const {
  const std::lock_guard<std::mutex> lock(mutex_);
  if (health_ == CardHealth::kMissing) return std::nullopt;
  return recordings_;
}

const Recording* Card::find_locked(std::string_view name) const {
  if (health_ == CardHealth::kMissing) return nullptr;
  const auto found = std::find_if(recordings_.begin(), recordings_.end(),
                                  [name](const Recording& recording) { return recording.name == name; });
  return found == recordings_.end() ? nullptr : &*found;
}

std::optional<Recording> Card::find(std::string_view name) const {
  const std::lock_guard<std::mutex> lock(mutex_);
  const Recording* found = find_locked(name);
  return found == nullptr ? std::nullopt : std::optional<Recording>(*found);
}

bool Card::holds(std::string_view name) const {
  const std::lock_guard<std::mutex> lock(mutex_);
  return find_locked(name) != nullptr;
}

bool Card::erase(std::string_view name) {
  const std::lock_guard<std::mutex> lock(mutex_);
  if (health_ != CardHealth::kGood || find_locked(name) == nullptr) return false;
  std::erase_if(recordings_, [name](const Recording& recording) { return recording.name == name; });
  return true;
}

bool Card::erase_all() {
  const std::lock_guard<std::mutex> lock(mutex_);
  if (health_ != CardHealth::kGood) return false;
  recordings_.clear();
  return true;
}

std::optional<Answer> answer_card(const RequestHead& request, Card& card) {
  if (request.method != "GET") return std::nullopt;
  if (request.path == "/command/search") return search(request.query, card);
  if (request.path != "/command/edgestorage.cgi") return std::nullopt;
  const std::string_view query = request.query;
  if (query == "delete=all") return deleted(card.erase_all());
  if (!query.starts_with(kDeleteByName)) return std::nullopt;
  const std::optional<std::string> name = percent_decoded(query.substr(kDeleteByName.size()));
  return deleted(name && card.erase(*name));
}

}  // namespace vexa::camera
