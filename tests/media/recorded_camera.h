// A virtual camera with a recording of its clip on its card.
#pragma once

#include <chrono>
#include <cstdint>
#include <memory>
#include <string>

#include "tests/media/live_camera.h"

namespace vexa_test {

class RecordedCamera : public LiveCamera {
 public:
  static constexpr std::int64_t kStart = 1706745599;  // 2024-01-31 23:59:59 UTC, and a quarter of a second
  static constexpr int kStartMicros = 250000;
  static constexpr int kInterval = 33300;  // microseconds between two pictures

  explicit RecordedCamera(const vexa::camera::CameraOptions& options, std::uint64_t pictures = 60)
      : LiveCamera(with_card(options)), name_(record(pictures)) {}

  const std::string& name() const { return name_; }

  SLibDEdgeStorageStreamingInfo recording(int scale = 1) {
    SLibDEdgeStorageStreamingInfo info;
    info.streamName = name_;
    info.codecName = codec_name();
    info.scale = scale;
    return info;
  }

  /// Microseconds since 1970 at which picture `index` was stored.
  static std::int64_t stored_at(std::uint64_t index) {
    return kStart * 1000000 + kStartMicros + static_cast<std::int64_t>(index) * kInterval;
  }

 private:
  static vexa::camera::CameraOptions with_card(vexa::camera::CameraOptions options) {
    options.card_bytes = 64U << 20U;
    return options;
  }

  std::string record(std::uint64_t pictures) {
    if ((*this)->clip() == nullptr) return {};  // the failure has been reported
    vexa::camera::Card& card = (*this)->card();
    vexa::camera::RecordingHead head;
    head.codec = (*this)->clip()->codec();
    head.frame_rate = 30;
    head.start = std::chrono::seconds(kStart) + std::chrono::microseconds(kStartMicros);
    const std::string name = card.begin(head);
    for (std::uint64_t i = 0; i < pictures; ++i) {
      EXPECT_TRUE(card.add({std::make_shared<const std::string>(picture(i)), is_key(i),
                            std::chrono::microseconds(i * static_cast<std::uint64_t>(kInterval))}));
    }
    card.finish();
    return name;
  }

  std::string name_;
};

}  // namespace vexa_test
