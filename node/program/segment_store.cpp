// SPDX-License-Identifier: Apache-2.0
#include "node/program/segment_store.h"

#include <fcntl.h>
#include <fmt/format.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <filesystem>
#include <fstream>
#include <iterator>
#include <system_error>
#include <utility>

#include "node/segments/fragment_scan.h"

namespace vexa::node {
namespace {

using host::ExitCode;
using host::Problem;
using host::Result;

constexpr char kMarker[] = "/.vexa-segments";
constexpr char kVersion[] = "vexa segments 1\n";

Problem unusable(const std::string& path, int error) {
  return {ExitCode::kUsage, fmt::format("{}: {}", path, std::generic_category().message(error)),
          "Give --folder a folder that exists and that the program may write to."};
}

std::optional<Problem> write_marker(const std::string& path, DiskCalls& calls) {
  const host::UniqueFd file(open((path + kMarker).c_str(), O_WRONLY | O_CREAT | O_EXCL | O_CLOEXEC, 0640));
  const host::UniqueFd folder(open(path.c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC));
  if (!file.valid() || !folder.valid()) return unusable(path, errno);
  int error = host::write_all(file.get(), kVersion, sizeof kVersion - 1);
  if (error == 0) error = calls.sync(file.get());
  if (error == 0) error = calls.sync(folder.get());
  if (error != 0) return unusable(path, error);
  return std::nullopt;
}

}  // namespace

Result<SegmentStore> SegmentStore::open(std::string path, bool create, DiskCalls& calls) {
  const bool is_marked = access((path + kMarker).c_str(), F_OK) == 0;
  if (!is_marked && !create) {
    return host::fail({ExitCode::kUsage,
                       fmt::format("{} is no folder of segments: it has no file .vexa-segments", path),
                       "Is its disk mounted? For a new one: vexa-node --standalone --create."});
  }
  if (!is_marked) {
    if (auto failed = write_marker(path, calls)) return host::fail(*failed);
  }
  std::ifstream file(path + kMarker, std::ios::binary);
  const std::string version{std::istreambuf_iterator<char>(file), {}};
  if (version != kVersion) {
    return host::fail({ExitCode::kUsage, fmt::format("the segments in {} are of another version", path),
                       "Use the version of vexa-node that made them, or another folder."});
  }
  return SegmentStore(std::move(path), calls);
}

Result<SegmentFolder> SegmentStore::folder_of(const std::string& camera) const {
  return SegmentFolder::open(path_ + "/" + escaped_camera(camera), *calls_);
}

Result<std::vector<SegmentFolder>> SegmentStore::folders() const {
  std::error_code error;
  std::vector<std::string> names;
  for (std::filesystem::directory_iterator entry(path_, error), end; !error && entry != end; entry.increment(error)) {
    if (entry->is_directory(error)) names.push_back(entry->path());
  }
  if (error) return host::fail(unusable(path_, error.value()));
  std::sort(names.begin(), names.end());
  std::vector<SegmentFolder> folders;
  for (std::string& name : names) {
    auto folder = SegmentFolder::open(std::move(name), *calls_);
    if (!folder) return host::fail(folder.error());
    folders.push_back(std::move(*folder));
  }
  return folders;
}

Result<std::size_t> SegmentStore::retain(const RetentionRules& rules, std::chrono::milliseconds now) const {
  auto all = folders();
  if (!all) return host::fail(all.error());
  std::vector<StoredSegment> stored;
  std::vector<std::pair<SegmentFolder*, SegmentName>> places;
  for (SegmentFolder& folder : *all) {
    const auto segments = folder.list();
    if (!segments) return host::fail(segments.error());
    for (const ListedSegment& segment : *segments) {
      stored.push_back({segment.name.start, segment.bytes, segment.name.state == SegmentName::State::kWriting});
      places.emplace_back(&folder, segment.name);
    }
  }
  const std::vector<std::size_t> removed = segments_to_remove(stored, rules, now);
  for (const std::size_t i : removed) {
    if (auto failed = places[i].first->remove(places[i].second)) return host::fail(*failed);
  }
  return removed.size();
}

Result<std::string> audit(const SegmentStore& store, std::size_t& damaged) {
  const auto folders = store.folders();
  if (!folders) return host::fail(folders.error());
  std::string text;
  damaged = 0;
  for (const SegmentFolder& folder : *folders) {
    const auto segments = folder.list();
    if (!segments) return host::fail(segments.error());
    std::uint64_t bytes = 0, writing = 0;
    for (const ListedSegment& segment : *segments) {
      bytes += segment.bytes;
      if (segment.name.state == SegmentName::State::kWriting) {
        ++writing;
        continue;
      }
      const std::string path = folder.path() + "/" + file_name_of(segment.name);
      std::ifstream file(path, std::ios::binary);
      const auto read = [&file](std::uint64_t at, unsigned char* to, std::size_t length) {
        file.seekg(static_cast<std::streamoff>(at));
        return static_cast<bool>(file.read(reinterpret_cast<char*>(to), static_cast<std::streamsize>(length)));
      };
      const FragmentScan scan = scan_fragments(read, segment.bytes);
      if (scan.fragments > 0 && scan.whole == segment.bytes) continue;
      ++damaged;
      text += fmt::format("{}: {} of {} bytes are whole\n", path, scan.whole, segment.bytes);
    }
    text += fmt::format("{}: {} segments, {} of them being written, {} bytes\n", folder.path(), segments->size(),
                        writing, bytes);
  }
  return text;
}

}  // namespace vexa::node
