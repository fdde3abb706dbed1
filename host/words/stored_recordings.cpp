// SPDX-License-Identifier: Apache-2.0
#include "host/words/stored_recordings.h"

#include <fmt/format.h>

#include <nlohmann/json.hpp>

#include "host/base/printable.h"
#include "host/words/utc_time.h"

namespace vexa::host {
namespace {

using Json = nlohmann::ordered_json;

constexpr char kRow[] = "{:<20}  {:>7}  {:<6}  {:>9}  {}\n";

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

std::chrono::seconds start_of(const SLibDEdgeStorageRecord& record) { return std::chrono::seconds(record.start); }

std::chrono::seconds end_of(const SLibDEdgeStorageRecord& record) { return std::chrono::seconds(record.end); }

std::string table_of(const StoredRecordings& records) {
  std::string table = fmt::format(kRow, "start", "seconds", "codec", "KB", "name");
  for (const SLibDEdgeStorageRecord& record : records) {
    table += fmt::format(kRow, utc_text(start_of(record)), record.end - record.start, printable(record.imageCodec),
                         record.size, printable(record.streamName));
  }
  return table;
}

std::string json_of(const StoredRecordings& records) {
  Json list = Json::array();
  for (const SLibDEdgeStorageRecord& record : records) list.push_back(object_of(record));
  return to_text(list);
}

}  // namespace vexa::host
