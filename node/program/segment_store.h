// SPDX-License-Identifier: Apache-2.0
// The folder of all cameras' segments.
#pragma once

#include <cstdint>
#include <functional>
#include <string>
#include <vector>

#include "host/base/problem.h"
#include "node/segments/disk_calls.h"
#include "node/segments/retention.h"
#include "node/segments/segment_folder.h"

namespace vexa::node {

/// Holds a folder for each camera, and the file ".vexa-segments" with the version of this form: it shows that the right
/// disk is mounted.
class SegmentStore {
 public:
  /// With `create` a folder that is there and has no such file gets one.
  [[nodiscard]] static host::Result<SegmentStore> open(std::string path, bool create, DiskCalls& calls);

  [[nodiscard]] host::Result<SegmentFolder> folder_of(const std::string& camera) const;
  /// The folders there are, of cameras that are recorded or were.
  [[nodiscard]] host::Result<std::vector<SegmentFolder>> folders() const;
  /// Removes what the rules let go; how many.
  [[nodiscard]] host::Result<std::size_t> retain(const RetentionRules& rules, std::chrono::milliseconds now) const;

 private:
  SegmentStore(std::string path, DiskCalls& calls) : path_(std::move(path)), calls_(&calls) {}

  std::string path_;
  DiskCalls* calls_;
};

/// One line for each folder of the store and for each segment that is not whole; their number in `damaged`.
[[nodiscard]] host::Result<std::string> audit(const SegmentStore& store, std::size_t& damaged);

}  // namespace vexa::node
