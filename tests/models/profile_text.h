// SPDX-License-Identifier: Apache-2.0
// A small profile that is right, and changes to it.
#pragma once

#include <gtest/gtest.h>

#include <string>

#include "vexa/models.h"

namespace vexa_test {

inline const std::string kSmallProfile = R"({
  "description": "a test's camera",
  "driver": "common",
  "model": "T-1",
  "cameraTypes": ["fixed"],
  "video": {
    "streams": [{"codec": "H.264", "size": "640x480", "frameRate": 25, "bitRate": 2000}],
    "codecs": [
      {"name": "JPEG", "sizes": ["640x480"], "frameRates": [1, 25], "qualities": [1, 5]},
      {"name": "H.264", "sizes": ["640x480", "320x240"], "frameRates": [1, 25], "bitRates": [512, 2000]}
    ]
  },
  "image": {
    "exposure": [
      {"mode": "Shutter Priority", "shutter": [{"label": "a", "value": 1}, {"label": "b", "value": 2}]}
    ]
  },
  "io": {"inputs": 1, "outputs": 0}
}
)";

/// A profile that is installed.
inline vexa::Profile installed_profile(const std::string& name) {
  vexa::Profile profile;
  vexa::ProfileError error;
  EXPECT_TRUE(vexa::LoadProfile(name, profile, error)) << error.Message();
  return profile;
}

/// The small profile with `from`, which occurs in it, replaced by `to`, once.
inline std::string changed_profile(const std::string& from, const std::string& to) {
  std::string text = kSmallProfile;
  const std::size_t at = text.find(from);
  EXPECT_NE(at, std::string::npos) << from;
  return at == std::string::npos ? text : text.replace(at, from.size(), to);
}

}  // namespace vexa_test
