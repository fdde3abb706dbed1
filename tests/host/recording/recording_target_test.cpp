// SPDX-License-Identifier: Apache-2.0
#include "host/recording/recording_target.h"

#include <gtest/gtest.h>
#include <unistd.h>

namespace vexa::host {
namespace {

std::optional<ContainerFormat> container_of(const char* out) { return RecordingTarget(out, STDOUT_FILENO).container(); }

TEST(RecordingTarget, ContainerGoesByTheEndOfTheName) {
  EXPECT_EQ(container_of("a.mkv"), ContainerFormat::kMatroska);
  EXPECT_EQ(container_of("a.MP4"), ContainerFormat::kMp4);
  for (const char* other : {"a.h264", "mkv", ".mkv", "-", ""}) EXPECT_EQ(container_of(other), std::nullopt) << other;
}

}  // namespace
}  // namespace vexa::host
