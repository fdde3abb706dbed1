// SPDX-License-Identifier: Apache-2.0
// The list of recordings: whatever a camera answers is read, and what was read, written again, reads the same.
#include <cstdint>
#include <cstdlib>
#include <string>
#include <vector>

#include "device/cgi/storage_text.h"

namespace {

void check(bool holds) {
  if (!holds) std::abort();
}

bool is_value(const std::string& text, int commas) {
  for (const char c : text) {
    commas -= c == ',' ? 1 : 0;
    if (static_cast<unsigned char>(c) < ' ') return false;
  }
  return commas == 0;
}

// Times are left out: a text has many ways to name one moment.
std::string written(const SLibDEdgeStorageRecord& record) {
  const bool quality = record.quality != 0;
  return "StreamName=" + record.streamName + ",Start=,End=,ImageCodec=" + record.imageCodec +
         ",ImageSize=" + record.imageSize + ",FrameRate=" + std::to_string(record.frameRate) +
         (quality ? ",Quality=" : ",BitRate=") + std::to_string(quality ? record.quality : record.bitRate) +
         ",AudioCodec=" + record.audioCodec + ",Size=" + std::to_string(record.size) + ",Status=" + record.status +
         "\r\n";
}

bool same(const SLibDEdgeStorageRecord& a, const SLibDEdgeStorageRecord& b) {
  return a.streamName == b.streamName && a.imageCodec == b.imageCodec && a.imageSize == b.imageSize &&
         a.frameRate == b.frameRate && a.bitRate == b.bitRate && a.quality == b.quality &&
         a.audioCodec == b.audioCodec && a.size == b.size && a.status == b.status;
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  const std::string answer(reinterpret_cast<const char*>(data), size);
  const std::vector<SLibDEdgeStorageRecord> records = vexa::read_recordings(answer);
  std::string again;
  for (const SLibDEdgeStorageRecord& record : records) {
    check(is_value(record.streamName, 0) && is_value(record.imageCodec, 0) && is_value(record.imageSize, 1));
    check(is_value(record.audioCodec, 0) && is_value(record.status, 0));
    check(record.bitRate == 0 || record.quality == 0);
    again += written(record);
  }
  const std::vector<SLibDEdgeStorageRecord> reread = vexa::read_recordings(again);
  check(reread.size() == records.size());
  for (std::size_t i = 0; i < records.size(); ++i) check(same(records[i], reread[i]));
  check(vexa::free_kilobytes(answer) >= 0);
  return 0;
}
