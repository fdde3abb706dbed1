// SPDX-License-Identifier: Apache-2.0
// The folder of one camera's segments.
#pragma once

#include <cstdint>
#include <string>
#include <vector>

#include "host/base/problem.h"
#include "host/base/unique_fd.h"
#include "node/segments/disk_calls.h"
#include "node/segments/segment_name.h"

namespace vexa::node {

struct ListedSegment {
  SegmentName name;
  std::uint64_t bytes = 0;
};

/// What a start found of segments that were being written.
struct Recovery {
  std::uint64_t recovered = 0;  ///< cut to the last whole fragment, and kept
  std::uint64_t empty = 0;      ///< without a whole fragment: removed
  std::uint64_t cut_bytes = 0;  ///< in all
};

/// A segment that is being written, as a file that did not exist before.
struct OpenSegment {
  SegmentName name;
  host::UniqueFd file;
};

/// A segment is durable up to its latest flush(), and whole with its final name when finish() has returned no problem.
/// Used by one thread; nobody else writes to the folder. `calls` outlives it.
class SegmentFolder {
 public:
  /// Makes the folder where there is none, in a folder that exists.
  [[nodiscard]] static host::Result<SegmentFolder> open(std::string path, DiskCalls& calls);

  /// Repairs what was being written when a program or a machine stopped. Nothing may be open.
  [[nodiscard]] host::Result<Recovery> recover();
  [[nodiscard]] host::Result<std::vector<ListedSegment>> list() const;

  /// `name.state` is kWriting from here on.
  [[nodiscard]] host::Result<OpenSegment> begin(SegmentName name);
  /// After an error the segment is not to be written any more: what the disk has of it is not known.
  [[nodiscard]] std::optional<host::Problem> flush(const OpenSegment& segment);
  /// Closes it. After an error it keeps the name that recover() looks for.
  [[nodiscard]] std::optional<host::Problem> finish(OpenSegment&& segment);
  /// Of a segment that is not open.
  [[nodiscard]] std::optional<host::Problem> remove(const SegmentName& name);

  [[nodiscard]] const std::string& path() const { return path_; }

 private:
  SegmentFolder(std::string path, host::UniqueFd folder, DiskCalls& calls)
      : path_(std::move(path)), folder_(std::move(folder)), calls_(&calls) {}

  [[nodiscard]] host::Problem problem(const std::string& name, int error) const;
  [[nodiscard]] std::optional<host::Problem> keep(int file, SegmentName name, SegmentName::State state);
  [[nodiscard]] std::optional<host::Problem> repair(const SegmentName& name, Recovery& recovery);

  std::string path_;
  host::UniqueFd folder_;
  DiskCalls* calls_;
};

}  // namespace vexa::node
