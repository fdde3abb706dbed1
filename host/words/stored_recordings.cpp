#include "host/words/stored_recordings.h"

#include <fmt/format.h>
#include <time.h>

#include <nlohmann/json.hpp>

#include "host/base/json_text.h"
#include "host/base/printable.h"

namespace vexa::host {
namespace {

using Json = nlohmann::ordered_json;

constexpr char kMomentForm[] = "%Y-%m-%dT%H:%M:%S";
constexpr char kRecordingRow[] = "{:<20}  {:>7}  {:<6}  {:>9}  {}\n";

Json object_of(const SLibDEdgeStorageRecord& record) {
  return {{"name", record.streamName},       {"start", utc_text(start_of(record))},
          {"end", utc_text(end_of(record))}, {"seconds", record.end - record.start},
          {"codec", record.imageCodec},      {"imageSize", record.imageSize},
          {"frameRate", record.frameRate},   {"bitRate", record.bitRate},
          {"quality", record.quality},       {"audioCodec", record.audioCodec},
          {"kilobytes", record.size},        {"status", record.status}};
}

bool fits_a_file_name(char letter) {
  const auto byte = static_cast<unsigned char>(letter);
  return byte > ' ' && byte != 0x7f && letter != '/' && letter != '%';
}

}  // namespace

std::string file_name_of(const std::string& recording, const std::string& end) {
  std::string name;
  for (const char letter : recording) {
    const bool hides = name.empty() && letter == '.';
    name += fits_a_file_name(letter) && !hides ? std::string(1, letter)
                                               : fmt::format("%{:02X}", static_cast<unsigned char>(letter));
  }
  return (name.empty() ? "%" : name) + end;
}

std::string utc_text(std::chrono::seconds since_1970) {
  const auto moment = static_cast<std::time_t>(since_1970.count());
  std::tm fields{};
  gmtime_r(&moment, &fields);
  return fmt::format("{:04}-{:02}-{:02}T{:02}:{:02}:{:02}Z", fields.tm_year + 1900, fields.tm_mon + 1, fields.tm_mday,
                     fields.tm_hour, fields.tm_min, fields.tm_sec);
}

std::optional<std::chrono::seconds> utc_moment(const std::string& text) {
  std::tm fields{};
  const char* rest = strptime(text.c_str(), kMomentForm, &fields);
  if (rest == nullptr) return std::nullopt;
  const std::chrono::seconds moment(timegm(&fields));
  // Days such as 30 February become others, and short forms such as 2024-1-31 longer ones.
  const std::string whole = utc_text(moment);
  if (text != whole && text + "Z" != whole) return std::nullopt;
  return moment;
}

std::chrono::seconds start_of(const SLibDEdgeStorageRecord& record) { return std::chrono::seconds(record.start); }

std::chrono::seconds end_of(const SLibDEdgeStorageRecord& record) { return std::chrono::seconds(record.end); }

std::string table_of(const StoredRecordings& records) {
  std::string table = fmt::format(kRecordingRow, "start", "seconds", "codec", "KB", "name");
  for (const SLibDEdgeStorageRecord& record : records) {
    table += fmt::format(kRecordingRow, utc_text(start_of(record)), record.end - record.start,
                         printable(record.imageCodec), record.size, printable(record.streamName));
  }
  return table;
}

std::string json_of(const StoredRecordings& records) {
  Json list = Json::array();
  for (const SLibDEdgeStorageRecord& record : records) list.push_back(object_of(record));
  return to_text(list);
}

}  // namespace vexa::host
