// SPDX-License-Identifier: Apache-2.0
// What is wrong with a profile is named with its file, line and key, and nothing of it is taken.
#include <gtest/gtest.h>

#include <initializer_list>
#include <string>
#include <utility>

#include "tests/models/profile_text.h"
#include "tests/support/temporary_folder.h"
#include "vexa/models.h"

namespace vexa_test {
namespace {

std::string refusal_of(const std::string& text) {
  vexa::Profile profile;
  profile.model = "as it was";
  vexa::ProfileError error;
  if (vexa::ParseProfile(text, "p.json", profile, error)) return "taken";
  EXPECT_EQ(profile.model, "as it was");
  EXPECT_TRUE(profile.camera.codecs.empty());
  return error.Message();
}

struct ProfileChange {
  const char* from;
  const char* to;
  const char* message;
};

void expect_refusals(std::initializer_list<ProfileChange> changes) {
  for (const ProfileChange& change : changes) {
    EXPECT_EQ(refusal_of(changed_profile(change.from, change.to)), change.message);
  }
}

TEST(ProfileRefusal, TheSmallProfileItselfIsTaken) { EXPECT_EQ(refusal_of(kSmallProfile), "taken"); }

TEST(ProfileRefusal, NamesWhatTheSchemaForbids) {
  expect_refusals({
      {"\"model\": \"T-1\"", "\"model\": 1", "p.json:4: model: must be a text"},
      {"\"model\": \"T-1\"", "\"model\": null", "p.json:4: model: must be a text"},
      {"\"T-1\"", "\"\"", "p.json:4: model: must have 1 to 64 characters"},
      {"\"model\": \"T-1\",", "", "p.json:1: model: is missing"},
      {"\"common\"", "\"Common\"",
       "p.json:3: driver: must be one of \"common\", \"heron\", \"marlin\", \"simple-hd\", \"simple-ptz\""},
      {"[\"fixed\"]", "[]", "p.json:5: cameraTypes: must have at least 1 items"},
      {"[\"fixed\"]", "[\"fixed\", \"fixed\"]", "p.json:5: cameraTypes[1]: occurs twice in its list"},
      {"[\"fixed\"]", "\"fixed\"", "p.json:5: cameraTypes: must be a list"},
      {"\"frameRate\": 25,", "\"frameRate\": \"25\",", "p.json:7: video.streams[0].frameRate: must be a whole number"},
      {"\"frameRate\": 25,", "\"frameRate\": 25.0,", "p.json:7: video.streams[0].frameRate: must be a whole number"},
      {"\"frameRate\": 25,", "\"frameRate\": 0,", "p.json:7: video.streams[0].frameRate: must be from 1 to 60"},
      {"\"frameRate\": 25,", "\"frameRate\": 61,", "p.json:7: video.streams[0].frameRate: must be from 1 to 60"},
      {"\"frameRate\": 25,", "", "p.json:7: video.streams[0].frameRate: is missing"},
      {"[1, 25], \"bitRates\"", "[], \"bitRates\"", "p.json:10: video.codecs[1].frameRates: must have 1 to 32 items"},
      {"[1, 25], \"bitRates\"", "25, \"bitRates\"", "p.json:10: video.codecs[1].frameRates: must be a list"},
      {"[1, 25], \"bitRates\"", "[25,\n 1], \"bitRates\"",
       "p.json:11: video.codecs[1].frameRates[1]: must be above the one before it"},
      {"\"640x480\", \"320x240\"", "\"640x480\", \"640x480\"",
       "p.json:10: video.codecs[1].sizes[1]: occurs twice in its list"},
      {"\"inputs\": 1", "\"inputs\": 17", "p.json:18: io.inputs: must be from 0 to 16"},
      {"\"inputs\": 1", "\"inputs\": 18446744073709551615", "p.json:18: too large"},
      {"\"inputs\": 1", "\"inputs\": true", "p.json:18: io.inputs: must be a whole number"},
      {"\"inputs\": 1", "\"inputs\": 1.0", "p.json:18: io.inputs: must be a whole number"},
      {"\"inputs\": 1, \"outputs\": 0", "\"inputs\": 1,\n \"outputs\": 0,\n \"audioDetection\":\n 1",
       "p.json:20: io.audioDetection: must be true or false"},
      {"\"outputs\": 0", "\"inputs\": 1", "p.json:18: inputs: occurs twice"},
      {"\"io\"", "\"oi\"",
       "p.json:18: oi: is not known here; known are: $schema, description, driver, model, cameraTypes, video, image, "
       "ptz, audio, io, edgeStorage"},
      {"\"inputs\": 1,", "\"inputs\": 1, \"imputs\": 1,",
       "p.json:18: io.imputs: is not known here; known are: inputs, outputs, videoDetection, tamperingDetection, "
       "audioDetection"},
      {"\"inputs\": 1, ", "", "p.json:18: io.inputs: is missing"},
      {"\"io\": {\"inputs\": 1, \"outputs\": 0}", "\"edgeStorage\": \"no\"",
       "p.json:18: edgeStorage: must be true or false"},
      {"{\"inputs\": 1, \"outputs\": 0}", "[]", "p.json:18: io: must be an object"},
  });
}

TEST(ProfileRefusal, NamesWhatTheSchemaCannotSay) {
  expect_refusals({
      {"\"640x480\", \"320x240\"", "\"640*480\"",
       "p.json:10: video.codecs[1].sizes[0]: must be WIDTHxHEIGHT in pixels, for instance \"640x480\""},
      {"\"size\": \"640x480\"", "\"size\": \"640*480\"",
       "p.json:7: video.streams[0].size: must be WIDTHxHEIGHT in pixels, for instance \"640x480\""},
      {"\"name\": \"H.264\"", "\"name\": \"JPEG\"", "p.json:10: video.codecs[1].qualities: is missing: JPEG needs it"},
      {"\"qualities\": [1, 5]", "\"bitRates\": [1, 5]",
       "p.json:9: video.codecs[0].qualities: is missing: JPEG needs it"},
      {"\"qualities\": [1, 5]", "\"qualities\": [1, 5], \"bitRates\": [1]",
       "p.json:9: video.codecs[0].bitRates: is not for JPEG"},
      {"\"bitRates\": [512, 2000]", "\"qualities\": [1]", "p.json:10: video.codecs[1].bitRates: is missing"},
      {"\"bitRates\": [512, 2000]", "\"bitRates\": [512, 2000], \"qualities\": [1]",
       "p.json:10: video.codecs[1].qualities: is for JPEG only"},
      {"[512, 2000]", "[2000, 512]", "p.json:10: video.codecs[1].bitRates[1]: must be above the one before it"},
      {"[512, 2000]", "[2000, 2000]", "p.json:10: video.codecs[1].bitRates[1]: must be above the one before it"},
      {"\"codec\": \"H.264\"", "\"codec\": \"MPEG4\"",
       "p.json:7: video.streams[0].codec: is not one of the camera's codecs"},
      {"\"size\": \"640x480\"", "\"size\": \"800x600\"",
       "p.json:7: video.streams[0].size: is not one of those that the codec offers"},
      {"\"frameRate\": 25", "\"frameRate\": 24",
       "p.json:7: video.streams[0].frameRate: is not one of those that the codec offers"},
      {"\"bitRate\": 2000", "\"bitRate\": 1000",
       "p.json:7: video.streams[0].bitRate: is not one of those that the codec offers"},
      {"\"bitRate\": 2000", "\"quality\": 5", "p.json:7: video.streams[0].bitRate: is missing"},
      {"\"codecs\": [", "\"captureSizes\": [\"x\"], \"codecs\": [",
       "p.json:8: video.captureSizes[0]: must be WIDTHxHEIGHT in pixels, for instance \"640x480\""},
      {"\"codecs\": [", "\"captureSizes\": [\"640x480\"], \"maxImageSizes\": [\"640x480\"], \"codecs\": [", "taken"},
      {"\"codecs\": [", "\"captureSizes\": [\"639x480\", \"640x480\"], \"codecs\": [",
       "p.json:7: video.streams[0].size: cannot be cut out of the first of captureSizes"},
      {"\"codecs\": [", "\"captureSizes\": [\"640x479\"], \"codecs\": [",
       "p.json:7: video.streams[0].size: cannot be cut out of the first of captureSizes"},
      {"\"codecs\": [", "\"captureSizes\": [\"800x501\"], \"codecs\": [", "taken"},
      {"\"codecs\": [", "\"captureSizes\": [\"800x500\"], \"codecs\": [",
       "p.json:7: video.streams[0].size: cannot be cut out of the first of captureSizes"},
      {"\"codecs\": [", "\"maxImageSizes\": [\"639x480\", \"640x480\"], \"codecs\": [",
       "p.json:7: video.streams[0].size: is above the first of maxImageSizes"},
      {"\"codecs\": [", "\"maxImageSizes\": [\"640x479\"], \"codecs\": [",
       "p.json:7: video.streams[0].size: is above the first of maxImageSizes"},
      {"\"codecs\": [", "\"outputs\": [\"ip\", \"pal\"], \"codecs\": [",
       "p.json:8: video.outputs: is for the drivers \"simple-hd\" and \"simple-ptz\" only"},
      {"\"value\": 2", "\"value\": 1",
       "p.json:15: image.exposure[0].shutter[1].value: must be above the one before it"},
      {"\"common\"", "\"heron\"", "p.json:14: image.exposure: is not for the drivers \"heron\" and \"simple-hd\""},
      {"\"common\"", "\"simple-hd\"", "p.json:14: image.exposure: is not for the drivers \"heron\" and \"simple-hd\""},
      {"\"Shutter Priority\"", "\"Full auto\"", "p.json:15: image.exposure[0].shutter: is not for this mode"},
      {"\"Shutter Priority\"", "\"Iris Priority\"", "p.json:15: image.exposure[0].shutter: is not for this mode"},
      {"\"exposure\": [", "\"exposure\": [{\"mode\": \"Iris Priority\"},",
       "p.json:14: image.exposure[0].iris: is missing: the mode steps through it"},
      {"\"exposure\": [", "\"exposure\": [{\"mode\": \"Full auto\"}, {\"mode\": \"Full auto\"},",
       "p.json:14: image.exposure[1].mode: occurs twice among the exposure modes"},
      {"[\"fixed\"]", "[\"ptz\"]",
       "p.json:5: cameraTypes: must name \"ptz\" exactly when the profile has a part \"ptz\""},
      {"[\"fixed\"]", "[\"audio\"]",
       "p.json:5: cameraTypes: must name \"audio\" exactly when the profile has a part \"audio\""},
      {"\"outputs\": 0", "\"outputs\": 0, \"videoDetection\": \"lod\"",
       "p.json:5: cameraTypes: must name \"lod-detection\" exactly when \"io.videoDetection\" is \"lod\""},
      {"\"io\"", "\"edgeStorage\": true, \"io\"",
       "p.json:5: cameraTypes: must name \"edge-storage\" exactly when \"edgeStorage\" is true"},
  });
}

TEST(ProfileRefusal, NamesTheIrisThatMarlinDoesNotSet) {
  const auto with_driver = [](const std::string& driver, const std::string& mode, const std::string& steps) {
    std::string text = changed_profile("\"Shutter Priority\", \"shutter\"", "\"" + mode + "\", \"" + steps + "\"");
    return text.replace(text.find("common"), 6, driver);
  };
  EXPECT_EQ(refusal_of(with_driver("marlin", "Iris Priority", "iris")),
            "p.json:15: image.exposure[0].mode: is not for the driver \"marlin\"");
  EXPECT_EQ(refusal_of(with_driver("marlin", "Shutter Priority", "shutter")), "taken");
  EXPECT_EQ(refusal_of(with_driver("simple-ptz", "Iris Priority", "iris")), "taken");
}

TEST(ProfileRefusal, NamesAWrongSizeAtBothEdges) {
  for (const char* size : {"", "x", "640", "640x", "x480", "0x480", "640x0", "0640x480", "640x480 ", " 640x480",
                           "-1x480", "10000x480", "640x10000", "640X480", "640x480x"}) {
    EXPECT_EQ(refusal_of(changed_profile("\"640x480\"], \"frameRates\": [1, 25], \"qualities\"",
                                         "\"" + std::string(size) + "\"], \"frameRates\": [1, 25], \"qualities\"")),
              "p.json:9: video.codecs[0].sizes[0]: must be WIDTHxHEIGHT in pixels, for instance \"640x480\"")
        << size;
  }
  EXPECT_EQ(refusal_of(changed_profile("\"320x240\"", "\"9999x1\"")), "taken");
}

TEST(ProfileRefusal, ChecksTheMotorsAndTheZoomCurve) {
  const std::string ptz = R"("ptz": {"dialect": "move",
    "pan": {"maxSpeed": 1, "span": PANSPAN, "angleRange": 1, "origin": 0, "wideAngle": 1, "travelTime": PANTIME},
    "tilt": {"maxSpeed": 1, "span": TILTSPAN, "angleRange": 1, "origin": TILTORIGIN, "wideAngle": 1, "offset": 0},
    "zoom": {"minSpeed": 2, "maxSpeed": MAXSPEED, "minPosition": 5, "maxPosition": MAXPOSITION,
      "ratios": [{"ratio": FIRSTRATIO, "position": 0}, {"ratio": SECONDRATIO, "position": SECONDPLACE}]}}, "io")";
  const struct {
    const char* from;
    const char* to;
    const char* message;
  } cases[] = {
      {"", "", "taken"},
      {"MAXSPEED", "1", "p.json:21: ptz.zoom.maxSpeed: must not be below minSpeed"},
      {"MAXPOSITION", "4", "p.json:21: ptz.zoom.maxPosition: must not be below minPosition"},
      {"SECONDPLACE", "0", "p.json:22: ptz.zoom.ratios[1].position: must be above the one before it"},
      {"SECONDRATIO", "0", "p.json:22: ptz.zoom.ratios[1].ratio: must be from 1 to 1000"},
      {"FIRSTRATIO", "3", "p.json:22: ptz.zoom.ratios[1].ratio: must not be below the one before it"},
      {"FIRSTRATIO", "2", "taken"},
      {"PANSPAN", "0", "p.json:19: ptz.pan.span: must not be 0: angles are computed with it"},
      {"TILTSPAN", "0", "p.json:20: ptz.tilt.span: must not be 0: angles are computed with it"},
      {"PANSPAN", "131072", "p.json:19: ptz.pan.origin: must keep both ends within -32768 to 32767"},
      {"PANSPAN", "131073", "p.json:19: ptz.pan.span: must be from -131072 to 131072"},
      {"PANSPAN", "65534", "taken"},
      {"PANSPAN", "65536", "p.json:19: ptz.pan.origin: must keep both ends within -32768 to 32767"},
      {"PANSPAN", "-65536", "taken"},
      {"TILTORIGIN", "-32769", "p.json:20: ptz.tilt.origin: must keep both ends within -32768 to 32767"},
      {"TILTORIGIN", "-32768", "taken"},
      {"PANTIME", "0", "p.json:19: ptz.pan.travelTime: must be from 1 to 600000"},
  };
  for (const auto& c : cases) {
    std::string text = changed_profile("[\"fixed\"]", "[\"ptz\"]");
    const auto replace = [&text](const std::string& from, const std::string& to) {
      const std::size_t at = text.find(from);
      if (at != std::string::npos) text.replace(at, from.size(), to);
    };
    replace("\"io\"", ptz);
    if (*c.from != '\0') replace(c.from, c.to);
    for (const auto& [name, usual] : {std::pair("MAXSPEED", "2"),
                                      {"MAXPOSITION", "5"},
                                      {"SECONDPLACE", "1"},
                                      {"SECONDRATIO", "2"},
                                      {"FIRSTRATIO", "1"},
                                      {"PANSPAN", "1"},
                                      {"TILTSPAN", "1"},
                                      {"TILTORIGIN", "0"},
                                      {"PANTIME", "1"}}) {
      replace(name, usual);
    }
    EXPECT_EQ(refusal_of(text), c.message) << c.from << " " << c.to;
  }
}

TEST(ProfileRefusal, NamesTheLineOfAMistakeInJson) {
  EXPECT_EQ(refusal_of(changed_profile("\"model\": \"T-1\",", "\"model\": \"T-1\"")),
            "p.json:5: not JSON: something is missing, too many or misspelt here");
  EXPECT_EQ(refusal_of(changed_profile("\"io\": {", "\"io\": [")),
            "p.json:18: not JSON: something is missing, too many or misspelt here");
  EXPECT_EQ(refusal_of(changed_profile("\"model\"", "\"driver\"")), "p.json:4: driver: occurs twice");
  EXPECT_EQ(refusal_of("[]"), "p.json:1: must be an object");
  EXPECT_EQ(refusal_of(std::string(16, '[') + std::string(16, ']')), "p.json:1: must be an object");
  EXPECT_EQ(refusal_of(std::string(17, '[') + std::string(17, ']')), "p.json:1: nested too deeply");
}

TEST(ProfileRefusal, CutAnywhereIsRefusedWhole) {
  const std::string whole = kSmallProfile.substr(0, kSmallProfile.rfind('}') + 1);
  for (std::size_t length = 0; length < whole.size(); ++length) {
    EXPECT_NE(refusal_of(whole.substr(0, length)), "taken") << length;
  }
}

TEST(ProfileRefusal, NamesAFileThatCannotBeRead) {
  vexa::Profile profile;
  vexa::ProfileError error;
  const TemporaryFolder folder;
  const std::string missing = folder / "missing.json";
  EXPECT_FALSE(vexa::LoadProfile(missing, profile, error));
  EXPECT_EQ(error.Message(), missing + ": cannot be read: No such file or directory");
  EXPECT_FALSE(vexa::LoadProfile(folder.path() + "/", profile, error));
  EXPECT_EQ(error.Message(), folder.path() + "/: cannot be read: Is a directory");
  EXPECT_FALSE(vexa::LoadProfile("no-such-model", profile, error));
  EXPECT_EQ(error.Message(), vexa::ProfileFolder() + "/no-such-model.json: cannot be read: No such file or directory");
}

TEST(ProfileRefusal, AFileAbove1MiBIsNotRead) {
  const TemporaryFolder folder;
  vexa::Profile profile;
  vexa::ProfileError error;
  const std::string padding(std::size_t{1} << 20, ' ');
  const std::string fits =
      folder.make_file("fits.json", kSmallProfile + padding.substr(0, padding.size() - kSmallProfile.size()));
  EXPECT_TRUE(vexa::LoadProfile(fits, profile, error)) << error.Message();
  EXPECT_EQ(profile.name, "fits");
  const std::string large = folder.make_file("large.json", kSmallProfile + padding);
  EXPECT_FALSE(vexa::LoadProfile(large, profile, error));
  EXPECT_EQ(error.Message(), large + ": is larger than 1 MiB");
}

}  // namespace
}  // namespace vexa_test
