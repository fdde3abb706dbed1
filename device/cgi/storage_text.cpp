// SPDX-License-Identifier: Apache-2.0
#include "device/cgi/storage_text.h"

#include <algorithm>
#include <ctime>
#include <optional>
#include <string>

#include "runtime/base/calendar.h"
#include "runtime/base/text.h"
#include "transport/wire/http_answer.h"

namespace vexa {
namespace {

constexpr std::string_view kNameKey = "StreamName=";
constexpr std::size_t kDateWidth = 8;
constexpr std::size_t kTimeWidth = 6;

bool ends_value(char c) { return c == ',' || static_cast<unsigned char>(c) < ' '; }

/// Reads the items of a record forward. A key that is not there, or an item that no further one can follow,
/// fails it for good.
class RecordItems {
 public:
  explicit RecordItems(std::string_view text) : rest_(text) {}

  bool ok() const { return ok_; }
  std::string_view rest() const { return rest_; }
  bool next_is(std::string_view key) const { return rest_.starts_with(key); }

  /// The value after the key, from which another item follows.
  std::string_view take(std::string_view key) {
    const std::string_view value = take_last(key);
    if (!rest_.starts_with(',')) ok_ = false;
    if (ok_) rest_.remove_prefix(1);
    return value;
  }

  std::string take_text(std::string_view key) { return std::string(take(key)); }
  int take_number(std::string_view key) { return leading_int(take_text(key)); }

  /// The value after the key, whatever ends it.
  std::string_view take_last(std::string_view key) {
    if (!rest_.starts_with(key)) ok_ = false;
    if (!ok_) return {};
    rest_.remove_prefix(key.size());
    const auto end = std::find_if(rest_.begin(), rest_.end(), ends_value);
    const std::string_view value = rest_.substr(0, static_cast<std::size_t>(end - rest_.begin()));
    rest_.remove_prefix(value.size());
    return value;
  }

 private:
  std::string_view rest_;
  bool ok_ = true;
};

/// As scanf's "%d" with a width takes a number.
std::optional<int> take_within(std::string_view& text, std::size_t width) {
  text.remove_prefix(std::min(text.find_first_not_of(" \t\n\v\f\r"), text.size()));
  std::string_view number = text.substr(0, width);
  const std::size_t room = number.size();
  const std::optional<int> value = take_int(number);
  text.remove_prefix(room - number.size());
  return value;
}

/// 20240131T235959; 0 when it is not so.
std::int64_t moment_in(std::string_view text) {
  const std::optional<int> date = take_within(text, kDateWidth);
  if (!date || !text.starts_with('T')) return 0;
  text.remove_prefix(1);
  const std::optional<int> clock = take_within(text, kTimeWidth);
  if (!clock) return 0;
  std::tm time{};
  set_date(time, *date);
  set_clock(time, *clock);
  return utc_seconds(time);
}

SLibDEdgeStorageRecord take_record(RecordItems& items) {
  SLibDEdgeStorageRecord record;
  record.streamName = items.take_text(kNameKey);
  record.start = moment_in(items.take("Start="));
  record.end = moment_in(items.take("End="));
  record.imageCodec = items.take_text("ImageCodec=");
  record.imageSize = items.take_text("ImageSize=") + ",";
  record.imageSize += items.take("");
  record.frameRate = items.take_number("FrameRate=");
  const bool has_quality = items.next_is("Quality=");
  std::int32_t& rate_or_quality = has_quality ? record.quality : record.bitRate;
  rate_or_quality = items.take_number(has_quality ? "Quality=" : "BitRate=");
  record.audioCodec = items.take_text("AudioCodec=");
  record.size = items.take_number("Size=");
  record.status = items.take_last("Status=");
  return record;
}

}  // namespace

std::vector<SLibDEdgeStorageRecord> read_recordings(std::string_view answer) {
  std::vector<SLibDEdgeStorageRecord> records;
  for (std::size_t at = answer.find(kNameKey); at != std::string_view::npos; at = answer.find(kNameKey)) {
    RecordItems items(answer.substr(at));
    SLibDEdgeStorageRecord record = take_record(items);
    if (!items.ok()) break;
    records.push_back(std::move(record));
    answer = items.rest();
  }
  return records;
}

int free_kilobytes(std::string_view answer) {
  std::optional<std::string_view> size = cgi_value(answer, "ASlot=Free space : ");
  // Kept: the unit is ignored; cameras report kilobytes.
  return size ? std::max(take_int(*size).value_or(0), 0) : 0;
}

}  // namespace vexa
