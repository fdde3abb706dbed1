// SPDX-License-Identifier: Apache-2.0
// Settings on the wire: scripts of commands and inquiries, and a driver whose settings are in reach.
#pragma once

#include <gtest/gtest.h>

#include <string>
#include <utility>
#include <vector>

#include "tests/support/scripted_camera.h"
#include "tests/support/test_driver.h"

namespace vexa_test {

constexpr int kPatientTimeout = 20000;  // milliseconds; far more than any answer needs

/// Everything that a request for `path` sends.
inline std::string request_for(const std::string& path) {
  return "GET http://{host}:{port}" + path + " HTTP/1.0\r\nAuthorization: Basic YWRtaW46c2VjcmV0\r\n\r\n";
}

inline ScriptStep answered(const std::string& path, const std::string& answer) {
  ScriptStep step;
  step.new_connection = true;
  step.expected = request_for(path);
  step.answer = answer;
  return step;
}

/// A command that the camera takes.
inline ScriptStep command(const std::string& path) { return answered(path, "HTTP/1.0 204 No Content\r\n\r\n"); }

/// A request that the camera refuses.
inline ScriptStep refusal(const std::string& path) { return answered(path, "HTTP/1.0 401 Unauthorized\r\n\r\n"); }

inline ScriptStep inquiry(const std::string& name, const std::string& body) {
  return answered("/command/inquiry.cgi?inq=" + name, "HTTP/1.0 200 OK\r\n\r\n" + body);
}

inline std::string text_of_latest_error(CLibraryDevice& driver) {
  std::string text;
  driver.GetLatestErrorText(text);
  return text;
}

/// A driver class, its settings in reach, that connects to `host` as "admin" with the password "secret".
template <typename Driver>
class Settings : public Reach<Driver> {
 public:
  /// What an operation passes to the model class about the video it will offer.
  struct VideoParams {
    int standard;
    int width;
    int height;
    bool operator==(const VideoParams&) const = default;
  };

  void use(const std::string& host, int port) {
    this->m_ConnectionInfo.host = host;
    this->m_ConnectionInfo.port = port;
    this->m_ConnectionInfo.timeout = kPatientTimeout;
    this->m_ConnectionInfo.userName = "admin";
    this->m_ConnectionInfo.password = "secret";
  }

  /// Points to where nobody listens and leaves an error that any exchange would clear.
  void expect_no_exchange() {
    use(own_loopback(0), refusing_port());
    this->m_State->errors.record({LIBD_BUFFER_TOO_SMALL, "from before"});
  }

  /// True when no exchange began since expect_no_exchange.
  bool had_no_exchange() { return LatestErrorCode() == LIBD_BUFFER_TOO_SMALL && LatestErrorText() == "from before"; }

  ELibDReturnCode LatestErrorCode() { return this->m_State->errors.code(); }
  std::string LatestErrorText() { return this->m_State->errors.text(); }

  std::string cached_inquiry() {
    const vexa::Guard guard(this->m_CameraInquiryLock);
    return this->m_CameraInquiryCache;
  }

  void cache_inquiry(const std::string& answer) {
    const vexa::Guard guard(this->m_CameraInquiryLock);
    this->m_CameraInquiryCache = answer;
  }

  ELibDReturnCode InitializeFixedVideoParams(ELibDVideoStandard standard, int width, int height) override {
    told.push_back({standard, width, height});
    return LIBD_OK;
  }

  std::vector<VideoParams> told;
};

using SettingsDriver = Settings<CVexaCommon>;

enum class Ends { kPlayed, kAnywhere };

/// A camera that plays a script for a driver, and a test that fails unless all of it is played.
template <typename Driver>
class Played {
 public:
  explicit Played(Script script, Ends ends = Ends::kPlayed) : camera_(std::move(script)), ends_(ends) {
    driver.use(camera_.host(), camera_.port());
  }
  ~Played() {
    if (ends_ == Ends::kPlayed) {
      EXPECT_EQ(complaints(), "");
    }
  }
  Played(const Played&) = delete;
  Played& operator=(const Played&) = delete;

  /// Whether every request has been made and every connection closed.
  bool played() const { return camera_.played(); }
  /// What was not as written; ends the play.
  std::string complaints() { return camera_.finish(); }

  Settings<Driver> driver;

 private:
  ScriptedCamera camera_;
  const Ends ends_;
};

/// A driver in reach of no camera; the test fails when it turns to one.
template <typename Driver>
class Unsent : public testing::Test {
 protected:
  Unsent() { driver_.expect_no_exchange(); }
  ~Unsent() override { EXPECT_TRUE(driver_.had_no_exchange()); }

  Driver driver_;
};

/// What `call` returns while a camera plays `script` for the driver, whole.
template <typename Driver, typename Call>
ELibDReturnCode with_script(Driver& driver, Script script, Call call) {
  ScriptedCamera camera(std::move(script));
  driver.use(camera.host(), camera.port(), kPatientTimeout);
  const ELibDReturnCode result = call();
  EXPECT_EQ(camera.finish(), "");
  return result;
}

/// The driver's edge storage, as a model with a card sets it up.
class EdgeStorageReach : public CVexaCommon {
 public:
  EdgeStorageReach() {
    m_EdgeStorageSupported = true;
    m_SavedTimeout = kPatientTimeout;
  }
};

using EdgeDriver = Settings<EdgeStorageReach>;
using EdgePlay = Played<EdgeStorageReach>;

}  // namespace vexa_test
