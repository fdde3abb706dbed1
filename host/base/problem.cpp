// SPDX-License-Identifier: Apache-2.0
#include "host/base/problem.h"

#include <fmt/format.h>

#include <system_error>
#include <utility>

namespace vexa::host {

Problem usage(std::string text, std::string advice) { return {ExitCode::kUsage, std::move(text), std::move(advice)}; }

Problem unreadable(const std::string& path, int error) {
  return {ExitCode::kUsage, fmt::format("cannot read {}: {}", path, std::generic_category().message(error)),
          "Check the file's name and that you may read it."};
}

}  // namespace vexa::host
