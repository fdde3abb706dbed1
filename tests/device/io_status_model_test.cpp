// SPDX-License-Identifier: Apache-2.0
// Every bit of a part and every pin of a status call, against a model of what the camera means: items that stand for
// inputs and detectors, laid out on bits by counting.
#include <gtest/gtest.h>

#include <array>
#include <map>
#include <string>
#include <vector>

#include "tests/device/alarm_driver.h"

namespace vexa_test {
namespace {

/// What a camera reports, and how.
struct Scene {
  int sensors = 0;
  bool vmd_flag = false;  ///< detection as one item
  bool motion = false;    ///< motion windows, else object windows
  int windows = 0;        ///< with the one item: whether there is one
  bool tampering = false;
  bool audio = false;

  int items() const { return sensors + windows + (tampering ? 1 : 0) + (audio ? 1 : 0); }
};

std::vector<Scene> all_scenes() {
  std::vector<Scene> scenes;
  for (int bits = 0; bits < 16; ++bits) {
    Scene scene;
    scene.vmd_flag = (bits & 1) != 0;
    scene.motion = (bits & 2) != 0;
    scene.tampering = (bits & 4) != 0;
    scene.audio = (bits & 8) != 0;
    for (scene.sensors = 0; scene.sensors <= 8; ++scene.sensors) {
      for (scene.windows = 0; scene.windows <= (scene.vmd_flag ? 1 : 4); ++scene.windows) scenes.push_back(scene);
    }
  }
  return scenes;
}

/// The states of a scene's items, in the order in which the part lists them.
using ItemStates = std::vector<int>;

/// All off, all on, and each item on alone.
std::vector<ItemStates> all_states(const Scene& scene) {
  const auto count = static_cast<std::size_t>(scene.items());
  std::vector<ItemStates> all = {ItemStates(count, 0), ItemStates(count, 1)};
  for (std::size_t i = 0; i < count; ++i) {
    all.emplace_back(count, 0);
    all.back()[i] = 1;
  }
  return all;
}

std::string text_of(const Scene& scene, const ItemStates& states) {
  std::vector<std::string> names;
  for (int n = 1; n <= scene.sensors; ++n) names.push_back("Sensor" + std::to_string(n));
  for (int n = 1; n <= scene.windows; ++n) {
    names.push_back(scene.vmd_flag ? "VMF" : (scene.motion ? "MdWin" : "OdWin") + std::to_string(n));
  }
  if (scene.tampering) names.emplace_back("Tampering");
  if (scene.audio) names.emplace_back("Audio");
  std::string text;
  for (std::size_t i = 0; i < names.size(); ++i) {
    text += (i == 0 ? "" : "&") + names[i] + "=" + std::to_string(states[i]);
  }
  return text;
}

/// State by bit. Detection shares the first bit where windows report motion; tampering leaves a place for detection
/// also when there is none.
std::map<int, int> bits_of(const Scene& scene, const ItemStates& states) {
  std::map<int, int> bits;
  std::size_t item = 0;
  for (int bit = 0; bit < scene.sensors; ++bit) bits[bit] = states[item++];
  const int detection_bit = scene.motion ? 0 : scene.sensors;
  for (int n = 0; n < scene.windows; ++n) bits[detection_bit] |= states[item++];
  if (scene.tampering) bits[scene.sensors + 1] = states[item++];
  if (scene.audio) bits[scene.sensors + (scene.tampering ? 2 : 1)] = states[item++];
  return bits;
}

class IoStatusModel : public testing::Test {
 protected:
  IoStatusModel() { driver_.read_alarms_from(pair_, kPatientTimeout); }
  ~IoStatusModel() override { driver_.forget_streams(); }

  void follow(const Scene& scene) {
    ASSERT_EQ(driver_.SetVMDtype(scene.vmd_flag ? LIBD_VMD_VMF : LIBD_VMD_WINDOW), LIBD_OK);
    driver_.m_UseMotionDetection = scene.motion;
  }

  /// What a status call must give: the pins after the inputs are the detectors that the box has, in their order, and
  /// whatever is left over goes to the last.
  std::vector<PinRow> pins_of(const std::map<int, int>& bits) const {
    const SLibDFixedIoBoxInfo& box = driver_.m_FixedIoBoxInfo;
    std::vector<int> types;
    if (box.videoDetection) types.push_back(2);
    if (box.tamperingDetection) types.push_back(4);
    types.insert(types.end(), 32, box.audioDetection ? 5 : 0);
    std::vector<PinRow> pins;
    auto type = types.begin();
    for (const auto& [bit, state] : bits) pins.push_back({bit + 1, bit < box.inputCount ? 0 : *type++, 1, state});
    return pins;
  }

  StreamPair pair_;
  AlarmDriver driver_;
};

TEST_F(IoStatusModel, AgreesOnEveryBitOfAPart) {
  for (const Scene& scene : all_scenes()) {
    follow(scene);
    for (const ItemStates& states : all_states(scene)) {
      const std::string text = text_of(scene, states);
      unsigned present = 0;
      unsigned state = 0;
      for (const auto& [bit, value] : bits_of(scene, states)) {
        present |= 1U << bit;
        state |= static_cast<unsigned>(value) << bit;
      }
      unsigned read_present = ~0U;
      unsigned read_state = ~0U;
      pair_.say(alarm_part(text));
      ASSERT_EQ(driver_.http_multipart_input_recv(pair_.driver_end(), read_present, read_state), 1);
      ASSERT_EQ(read_present, present) << text;
      ASSERT_EQ(read_state, state) << text;
    }
  }
}

TEST_F(IoStatusModel, AgreesOnEveryPinUnderEveryCapability) {
  SLibDFixedIoBoxInfo& box = driver_.m_FixedIoBoxInfo;
  for (const Scene& scene : all_scenes()) {
    follow(scene);
    const auto states = all_states(scene).back();
    const std::string text = text_of(scene, states);
    for (int flags = 0; flags < 24; ++flags) {
      box.videoDetection = (flags & 1) != 0;
      box.tamperingDetection = (flags & 2) != 0;
      box.audioDetection = (flags & 4) != 0;
      box.inputCount = std::array<int, 3>{scene.sensors, 0, scene.sensors + 1}[static_cast<std::size_t>(flags / 8)];
      const auto expected = pins_of(bits_of(scene, states));
      std::vector<SLibDPinInfo> pins;
      pair_.say(alarm_part(text));
      ASSERT_EQ(driver_.GetCurrentIoStatusDetail(pins), expected.empty() ? LIBD_NO_FRAME : LIBD_OK) << text;
      ASSERT_EQ(rows_of(pins), expected) << text << " flags " << flags;
    }
  }
}

}  // namespace
}  // namespace vexa_test
