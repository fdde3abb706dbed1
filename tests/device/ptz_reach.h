// SPDX-License-Identifier: Apache-2.0
// The driver's pan, tilt and zoom in reach, a camera's units for it, and requests played in a row.
#pragma once

#include <gtest/gtest.h>

#include <functional>
#include <string>
#include <utility>
#include <vector>

#include "tests/device/settings_exchange.h"

namespace vexa_test {

/// The driver with everything of its motion in reach.
class PtzReach : public CVexaCommon {
 public:
  void tell_position(const std::string& text) {
    const vexa::Guard guard(m_CamPosLock);
    m_CamPosText = text;
  }
};

using PtzDriver = Settings<PtzReach>;
using PtzPlay = Played<PtzReach>;

/// An operation and the path that it must send.
struct SentRow {
  std::function<ELibDReturnCode(PtzDriver&)> call;
  std::string path;
};

/// Runs the rows in order against one camera: each succeeds and sends its path, byte for byte.
inline void expect_sent(const std::vector<SentRow>& rows, const std::function<void(PtzDriver&)>& prepare) {
  Script script;
  for (const SentRow& row : rows) script.push_back(command(row.path));
  PtzPlay play(std::move(script));
  prepare(play.driver);
  for (const SentRow& row : rows) {
    const ELibDReturnCode result = row.call(play.driver);
    EXPECT_EQ(result, LIBD_OK) << row.path;
    if (result != LIBD_OK) break;
  }
}

/// Runs the call against a camera that refuses its request.
inline void expect_refusal_told(const SentRow& row, const std::function<void(PtzDriver&)>& prepare) {
  PtzPlay play({refusal(row.path)});
  prepare(play.driver);
  EXPECT_EQ(row.call(play.driver), LIBD_UNAUTHORIZED) << row.path;
  EXPECT_EQ(text_of_latest_error(play.driver), "Unauthorized");
}

using PtzUnsent = Unsent<PtzDriver>;

}  // namespace vexa_test
