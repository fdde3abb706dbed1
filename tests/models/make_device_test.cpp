// SPDX-License-Identifier: Apache-2.0
// The driver of a model, and what it answers before any camera is asked.
#include <gtest/gtest.h>

#include <memory>
#include <string>

#include "tests/models/profile_text.h"
#include "vexa/models.h"
#include "vexa/vexa_variants.h"

namespace vexa_test {
namespace {

std::unique_ptr<CLibraryDevice> device_of(const std::string& name) { return vexa::MakeDevice(installed_profile(name)); }

template <typename Driver>
bool is_a(const std::string& name) {
  return dynamic_cast<Driver*>(device_of(name).get()) != nullptr;
}

TEST(MakeDevice, GivesTheDriverClassOfTheModel) {
  EXPECT_TRUE(is_a<CVexaHeronCommon>("LMX-H100"));
  EXPECT_TRUE(is_a<CVexaMarlinCommon>("LMX-M300"));
  EXPECT_TRUE(is_a<CVexaSimpleHDCommon>("LMX-A100"));
  EXPECT_TRUE(is_a<CVexaSimplePTZCommon>("LMX-C100"));
  for (const char* common : {"LMX-P100", "LMX-P200", "VX-2000"}) {
    EXPECT_TRUE(is_a<CVexaCommon>(common));
    EXPECT_FALSE(is_a<CVexaHeronCommon>(common) || is_a<CVexaMarlinCommon>(common) ||
                 is_a<CVexaSimpleHDCommon>(common) || is_a<CVexaSimplePTZCommon>(common));
  }
}

TEST(MakeDevice, RefusesADriverClassOutsideItsRange) {
  vexa::Profile profile;
  profile.driver = static_cast<vexa::DriverClass>(5);
  EXPECT_EQ(vexa::MakeDevice(profile), nullptr);
  profile.driver = static_cast<vexa::DriverClass>(-1);
  EXPECT_EQ(vexa::MakeDevice(profile), nullptr);
}

TEST(MakeDevice, HandsOutTheFixedRecords) {
  const auto device = device_of("LMX-P200");
  SLibDFixedSystemInfo system;
  ASSERT_EQ(device->GetFixedSystemInfo(system), LIBD_OK);
  EXPECT_EQ(system.modelName, "LMX-P200");
  EXPECT_EQ(system.capability3, 1);
  EXPECT_EQ(system.capability4, 1);
  SLibDFixedCameraInfo camera;
  ASSERT_EQ(device->GetFixedCameraInfo(camera), LIBD_OK);
  ASSERT_EQ(camera.codecs.size(), 2U);
  EXPECT_EQ(camera.codecs[1].name, "H.264");
  EXPECT_EQ(camera.streamCount1, 3);
}

TEST(MakeDevice, AnswersForTheBitsOfItsCameraType) {
  const auto device = device_of("LMX-C100");
  const auto type = [](std::uint32_t bits) { return static_cast<ELibCameraType>(bits); };
  EXPECT_EQ(device->GetCameraType(type(vexa::kPtzCamera)), 1);
  EXPECT_EQ(device->GetCameraType(type(vexa::kSdCamera | vexa::kAudioCamera)), 1);
  EXPECT_EQ(device->GetCameraType(type(vexa::kFixedCamera)), 0);
  EXPECT_EQ(device->GetCameraType(type(vexa::kAudioCamera | vexa::kHdCamera)), 0);
}

/// A driver class through which a test sees a model's flags: a model's own class has no name outside.
class ModelFlags : public CVexaCommon {
 public:
  static bool continuous(const CLibraryDevice& device) { return seen(device).*(&ModelFlags::m_ContinuousPTZ); }
  static bool motion(const CLibraryDevice& device) { return seen(device).*(&ModelFlags::m_UseMotionDetection); }
  static bool lod(const CLibraryDevice& device) { return seen(device).*(&ModelFlags::m_LodDetection); }
  static bool card(const CLibraryDevice& device) { return seen(device).*(&ModelFlags::m_EdgeStorageSupported); }
  static bool control(const CLibraryDevice& device) {
    return seen(device).*(&ModelFlags::m_FixedPTZControlInfoAvailable);
  }
  static bool io(const CLibraryDevice& device) { return seen(device).*(&ModelFlags::m_FixedIoBoxInfoAvailable); }
  static const std::vector<SLibDZoomRatioInt>& zoom(const CLibraryDevice& device) {
    return seen(device).*(&ModelFlags::m_ZoomRatios);
  }
  static const SLibDFixedPTZControlInfo& control_record(const CLibraryDevice& device) {
    return seen(device).*(&ModelFlags::m_FixedPTZControlInfo);
  }
  static const SLibDFixedAudioInfo& audio(const CLibraryDevice& device) {
    return seen(device).*(&ModelFlags::m_FixedAudioInfo);
  }
  static const SLibDFixedIoBoxInfo& io_record(const CLibraryDevice& device) {
    return seen(device).*(&ModelFlags::m_FixedIoBoxInfo);
  }

 private:
  static const CVexaCommon& seen(const CLibraryDevice& device) { return dynamic_cast<const CVexaCommon&>(device); }
};

TEST(MakeDevice, SetsTheFlagsOfTheModel) {
  const struct {
    const char* name;
    bool continuous, motion, lod, card, control, io;
  } cases[] = {
      {"LMX-A100", false, true, false, false, true, true}, {"LMX-C100", false, false, false, false, true, true},
      {"LMX-H100", false, true, false, false, true, true}, {"LMX-M300", false, false, true, false, true, true},
      {"LMX-P100", false, true, false, false, true, true}, {"LMX-P200", true, false, false, true, true, true},
      {"VX-2000", false, true, false, true, true, true}};
  for (const auto& c : cases) {
    SCOPED_TRACE(c.name);
    const auto device = device_of(c.name);
    EXPECT_EQ(ModelFlags::continuous(*device), c.continuous);
    EXPECT_EQ(ModelFlags::motion(*device), c.motion);
    EXPECT_EQ(ModelFlags::lod(*device), c.lod);
    EXPECT_EQ(ModelFlags::card(*device), c.card);
    EXPECT_EQ(ModelFlags::control(*device), c.control);
    EXPECT_EQ(ModelFlags::io(*device), c.io);
  }
}

TEST(MakeDevice, FillsTheRecordsOfPtzAudioAndIo) {
  const auto device = device_of("LMX-P200");
  EXPECT_EQ(ModelFlags::zoom(*device).size(), 7U);
  EXPECT_EQ(ModelFlags::control_record(*device).brightModes.size(), 3U);
  EXPECT_EQ(ModelFlags::control_record(*device).panTilt.panSpan, 115200);
  EXPECT_EQ(ModelFlags::audio(*device).inputCodecs.size(), 2U);
  EXPECT_EQ(ModelFlags::io_record(*device).inputCount, 4);
}

TEST(MakeDevice, WithoutAPartLeavesItsRecordUnavailable) {
  vexa::Profile profile;
  vexa::ProfileError error;
  const std::string plain = R"({"description": "plain", "driver": "common", "model": "T", "cameraTypes": ["fixed"],
    "video": {"streams": [{"codec": "JPEG", "size": "8x8", "frameRate": 1, "quality": 1}],
              "codecs": [{"name": "JPEG", "sizes": ["8x8"], "frameRates": [1], "qualities": [1]}]}})";
  ASSERT_TRUE(vexa::ParseProfile(plain, "plain", profile, error)) << error.Message();
  const auto device = vexa::MakeDevice(profile);
  EXPECT_FALSE(ModelFlags::control(*device));
  EXPECT_FALSE(ModelFlags::io(*device));
  SLibDFixedSystemInfo system;
  device->GetFixedSystemInfo(system);
  EXPECT_EQ(system.capability3, 0);
  EXPECT_EQ(system.capability4, 0);
}

TEST(MakeDevice, TakesChangesThatTheHostMadeToTheProfile) {
  vexa::Profile profile;
  vexa::ProfileError error;
  ASSERT_TRUE(vexa::ParseProfile(kSmallProfile, "small", profile, error)) << error.Message();
  profile.camera.electronicFlip = 1;
  SLibDFixedCameraInfo camera;
  ASSERT_EQ(vexa::MakeDevice(profile)->GetFixedCameraInfo(camera), LIBD_OK);
  EXPECT_EQ(camera.electronicFlip, 1);
}

}  // namespace
}  // namespace vexa_test
