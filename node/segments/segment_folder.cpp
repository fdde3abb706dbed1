// SPDX-License-Identifier: Apache-2.0
#include "node/segments/segment_folder.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <filesystem>
#include <system_error>
#include <utility>

#include "node/segments/fragment_scan.h"

namespace vexa::node {
namespace {

using host::Problem;
using host::Result;
using State = SegmentName::State;

constexpr unsigned kFileMode = 0640;
constexpr unsigned kFolderMode = 0750;

Problem disk_problem(const std::string& path, int error) {
  const char* advice = "See that the disk is mounted and whole, and that the program may write there.";
  if (error == ENOSPC || error == EDQUOT) advice = "Free some room, or keep less.";
  if (error == EROFS) advice = "The disk is mounted read-only: see the system's log for its errors.";
  return {host::ExitCode::kCannotWrite, path + ": " + std::generic_category().message(error), advice};
}

bool read_at(int file, std::uint64_t at, unsigned char* bytes, std::size_t length) {
  for (std::size_t done = 0; done < length;) {
    const ssize_t count = pread(file, bytes + done, length - done, static_cast<off_t>(at + done));
    if (count < 0 && errno == EINTR) continue;
    if (count <= 0) return false;
    done += static_cast<std::size_t>(count);
  }
  return true;
}

}  // namespace

Result<SegmentFolder> SegmentFolder::open(std::string path, DiskCalls& calls) {
  const bool made = mkdir(path.c_str(), kFolderMode) == 0;
  if (!made && errno != EEXIST) return host::fail(disk_problem(path, errno));
  host::UniqueFd folder(::open(path.c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC));
  if (!folder.valid()) return host::fail(disk_problem(path, errno));
  if (made) {
    const host::UniqueFd parent(::open((path + "/..").c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC));
    const int error = parent.valid() ? calls.sync(parent.get()) : errno;
    if (error != 0) return host::fail(disk_problem(path, error));
  }
  return SegmentFolder(std::move(path), std::move(folder), calls);
}

Problem SegmentFolder::problem(const std::string& name, int error) const {
  return disk_problem(path_ + "/" + name, error);
}

Result<std::vector<ListedSegment>> SegmentFolder::list() const {
  std::error_code error;
  std::vector<ListedSegment> segments;
  for (std::filesystem::directory_iterator entry(path_, error), end; !error && entry != end; entry.increment(error)) {
    const std::string text = entry->path().filename();
    const auto name = segment_of(text);
    struct stat status {};
    if (!name || fstatat(folder_.get(), text.c_str(), &status, AT_SYMLINK_NOFOLLOW) != 0) continue;
    if (S_ISREG(status.st_mode)) segments.push_back({*name, static_cast<std::uint64_t>(status.st_size)});
  }
  if (error) return host::fail(disk_problem(path_, error.value()));
  std::sort(segments.begin(), segments.end(), [](const ListedSegment& a, const ListedSegment& b) {
    return std::pair(a.name.start, a.name.counter) < std::pair(b.name.start, b.name.counter);
  });
  return segments;
}

Result<OpenSegment> SegmentFolder::begin(SegmentName name) {
  name.state = State::kWriting;
  const std::string text = file_name_of(name);
  host::UniqueFd file(openat(folder_.get(), text.c_str(), O_RDWR | O_CREAT | O_EXCL | O_CLOEXEC, kFileMode));
  if (!file.valid()) return host::fail(problem(text, errno));
  // Its name as well is to outlast a power cut, or the flushes of its data would be in vain.
  const int error = calls_->sync(folder_.get());
  if (error != 0) return host::fail(problem(text, error));
  return OpenSegment{std::move(name), std::move(file)};
}

std::optional<Problem> SegmentFolder::flush(const OpenSegment& segment) {
  const int error = calls_->sync_data(segment.file.get());
  if (error == 0) return std::nullopt;
  return problem(file_name_of(segment.name), error);
}

std::optional<Problem> SegmentFolder::finish(OpenSegment&& segment) {
  OpenSegment ended = std::move(segment);
  if (auto failed = keep(ended.file.get(), ended.name, State::kWhole)) return failed;
  if (!ended.file.reset()) return problem(file_name_of(ended.name), errno);
  return std::nullopt;
}

// The data first, then the name, then the folder: a name never stands for less than its data.
std::optional<Problem> SegmentFolder::keep(int file, SegmentName name, State state) {
  const std::string from = file_name_of(name);
  name.state = state;
  const std::string to = file_name_of(name);
  int error = calls_->sync(file);
  if (error == 0 && faccessat(folder_.get(), to.c_str(), F_OK, AT_SYMLINK_NOFOLLOW) == 0) error = EEXIST;
  if (error == 0) error = calls_->rename(folder_.get(), from.c_str(), to.c_str());
  if (error == 0) error = calls_->sync(folder_.get());
  if (error == 0) return std::nullopt;
  return problem(from, error);
}

std::optional<Problem> SegmentFolder::remove(const SegmentName& name) {
  const std::string text = file_name_of(name);
  int error = unlinkat(folder_.get(), text.c_str(), 0) == 0 ? 0 : errno;
  if (error == 0) error = calls_->sync(folder_.get());
  if (error == 0) return std::nullopt;
  return problem(text, error);
}

Result<Recovery> SegmentFolder::recover() {
  const auto segments = list();
  if (!segments) return host::fail(segments.error());
  Recovery recovery;
  for (const ListedSegment& segment : *segments) {
    if (segment.name.state != State::kWriting) continue;
    if (auto failed = repair(segment.name, recovery)) return host::fail(*failed);
  }
  return recovery;
}

std::optional<Problem> SegmentFolder::repair(const SegmentName& name, Recovery& recovery) {
  const std::string text = file_name_of(name);
  const host::UniqueFd file(openat(folder_.get(), text.c_str(), O_RDWR | O_CLOEXEC | O_NOFOLLOW));
  struct stat status {};
  if (!file.valid() || fstat(file.get(), &status) != 0) return problem(text, errno);
  const auto size = static_cast<std::uint64_t>(status.st_size);
  const auto read = [&file](std::uint64_t at, unsigned char* bytes, std::size_t length) {
    return read_at(file.get(), at, bytes, length);
  };
  const FragmentScan scan = scan_fragments(read, size);
  if (scan.fragments == 0) {
    ++recovery.empty;
    recovery.cut_bytes += size;
    return remove(name);
  }
  if (scan.whole < size && ftruncate(file.get(), static_cast<off_t>(scan.whole)) != 0) return problem(text, errno);
  recovery.cut_bytes += size - scan.whole;
  ++recovery.recovered;
  return keep(file.get(), name, State::kRecovered);
}

}  // namespace vexa::node
