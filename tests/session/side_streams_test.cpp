// SPDX-License-Identifier: Apache-2.0
// What a session follows beside video: sound and metadata.
#include <string>

#include "tests/session/session_camera.h"

namespace vexa {
namespace {

using camera::CameraOptions;
using camera::HttpStreamFault;
using camera::RequestFault;

class SideStreams : public SessionWithCamera {
 protected:
  static CameraOptions model() {
    CameraOptions options;
    options.profile_path = VEXA_SOURCE_DIR "/models/profiles/LMX-P200.json";
    options.sound_path = VEXA_CLIPS "/tone";
    return options;
  }
  SessionOptions following(std::uint32_t streams) const {
    SessionOptions options = patient_options();
    options.streams = streams;
    options.connection.timeout = 3000;  // the driver reports a stream's end after that much silence
    return options;
  }
  std::size_t asked_for(const std::string& text) { return camera().journal().count(text); }
  bool is_asked_for_again(const std::string& text) {
    return camera().journal().wait_for_count(text, 2, SessionHost::kLongest);
  }

  SessionHost host_;
  SessionGroup group_;
};

TEST_F(SideStreams, SoundComesBesideVideo) {
  start_camera(model());
  ASSERT_TRUE(group_.Open(following(kVideoStream | kAudioStream), host_.callbacks()));
  ASSERT_TRUE(host_.wait_for_frames(1));
  ASSERT_TRUE(host_.wait_for_side([](const auto& side) { return side.sound_bytes > 1000; }));
  EXPECT_EQ(host_.side().sound_codec, 10);  // G.711
}

TEST_F(SideStreams, MetadataComesBesideVideo) {
  start_camera(model());
  ASSERT_TRUE(group_.Open(following(kVideoStream | kMetadataStream), host_.callbacks()));
  ASSERT_TRUE(host_.wait_for_frames(1));
  ASSERT_TRUE(host_.wait_for_side([](const auto& side) { return side.metadata > 1; }));
}

TEST_F(SideStreams, SoundThatTheCameraClosesIsStartedAgainWhileVideoGoesOn) {
  CameraOptions closing = model();
  closing.stream_faults = {{3, HttpStreamFault::Action::kClose, "", 0, {}}};
  start_camera(closing);
  ASSERT_TRUE(group_.Open(following(kVideoStream | kAudioStream), host_.callbacks()));
  ASSERT_TRUE(is_asked_for_again("/audio "));
  const std::size_t bytes = host_.side().sound_bytes;
  ASSERT_TRUE(host_.wait_for_side([&](const auto& side) { return side.sound_bytes > bytes; }));
  EXPECT_EQ(asked_for("PLAY "), 1U);
  EXPECT_EQ(host_.states().back().state, SessionState::kLive);
}

TEST_F(SideStreams, SoundThatTheCameraRefusesForAWhileIsAskedForAgain) {
  CameraOptions closing = model();
  closing.stream_faults = {{3, HttpStreamFault::Action::kClose, "", 0, {}}};
  start_camera(closing);
  camera().add_request_fault(RequestFault::status("/audio ", "503 Service Unavailable").nth(2));
  ASSERT_TRUE(group_.Open(following(kVideoStream | kAudioStream), host_.callbacks()));
  ASSERT_TRUE(camera().journal().wait_for_count("/audio ", 3, SessionHost::kLongest));
  EXPECT_EQ(asked_for("PLAY "), 1U);
}

TEST_F(SideStreams, MetadataThatTheCameraClosesIsStartedAgainWhileVideoGoesOn) {
  start_camera(model());
  camera().add_request_fault(RequestFault::cut_after("/mddata.cgi", 3000).nth(1));
  ASSERT_TRUE(group_.Open(following(kVideoStream | kMetadataStream), host_.callbacks()));
  ASSERT_TRUE(is_asked_for_again("/mddata.cgi"));
  EXPECT_EQ(asked_for("PLAY "), 1U);
}

TEST_F(SideStreams, AProfileThatIsNotThereIsRefusedAndNamed) {
  start_camera(model());
  SessionOptions options = following(kVideoStream);
  options.profile = "no-such-model";
  ASSERT_TRUE(group_.Open(options, host_.callbacks()));
  ASSERT_TRUE(host_.wait_for_state(SessionState::kRefused, SessionCause::kProfile));
  EXPECT_THAT(host_.states().back().why, testing::HasSubstr("no-such-model"));
}

}  // namespace
}  // namespace vexa
