// SPDX-License-Identifier: Apache-2.0
// vexa-node on its own: the cameras of a file, recorded in segments.
#pragma once

#include <optional>
#include <string>

#include "host/base/problem.h"
#include "node/program/camera_segments.h"
#include "node/segments/retention.h"

namespace vexa::node {

struct StandaloneOptions {
  std::string cameras_file;
  std::string folder;
  bool create = false;
  SegmentTimes times;
  RetentionRules retention;
};

/// Until SIGTERM, SIGHUP or Ctrl-C; then every segment is finished. `environment` as main() received it. Lines about
/// what happens go to standard error.
[[nodiscard]] std::optional<host::Problem> run_standalone(const StandaloneOptions& options,
                                                          const char* const* environment);

}  // namespace vexa::node
