// SPDX-License-Identifier: Apache-2.0
// vexactl record, snapshot and listen: every codec, by every transport, into every kind of file.
#include <cstdio>
#include <filesystem>
#include <nlohmann/json.hpp>

#include "tests/host/camera_fixture.h"
#include "tests/host/program_run.h"
#include "tests/support/decoder.h"
#include "virtual_camera/codec/image_clip.h"

namespace vexa_test {
namespace {

using vexa::camera::CameraOptions;

struct VideoCodec {
  const char* name;
  const char* word;  // in the camera's settings
  const char* clip;
  const char* end;  // of the name of a file with its pictures
  const char* format;
};

constexpr VideoCodec kVideoCodecs[] = {{"H.264", "h264", VEXA_CLIPS "/small.h264", "h264", "h264"},
                                       {"MPEG4", "mpeg4", VEXA_CLIPS "/small.m4v", "m4v", "m4v"},
                                       {"JPEG", "jpeg", VEXA_CLIPS "/plain.mjpeg", "mjpeg", "mjpeg"}};

class VideoCommands : public WithCamera {
 protected:
  void start(const VideoCodec& codec) {
    CameraOptions options;
    options.clip_path = options.image_path = codec.clip;
    options.sound_path = VEXA_CLIPS "/tone";
    options.speed = 2;
    start_camera(options);
    camera().settings().set("camera", "ImageCodec1", codec.word);
  }
  std::string pictures_of(const VideoCodec& codec, std::size_t count) {
    const auto clip = vexa::camera::ImageClip::load(codec.clip);
    std::string bytes;
    for (std::size_t i = 0; clip && i < count; ++i) bytes += clip->pictures()[i];
    return bytes;
  }
  std::size_t size_of(const char* file) const { return contents_of(folder() / file).size(); }
};

TEST_F(VideoCommands, RecordKeepsThePicturesOfEveryCodecByEveryTransport) {
  for (const VideoCodec& codec : kVideoCodecs) {
    start(codec);
    for (const char* transport : {"udp", "http"}) {
      SCOPED_TRACE(std::string(codec.name) + " " + transport);
      const std::string file = std::string("live.") + codec.end;
      const ProgramResult result =
          run({"record", place(), "--frames", "20", "--transport", transport, "--out", file, "--json"});
      EXPECT_EQ(result.exit_code, 0) << result.err;
      const auto json = nlohmann::json::parse(result.out, nullptr, false);
      EXPECT_EQ(json["codec"], codec.name);
      EXPECT_EQ(json["frames"], 20);
      const Decoded decoded = decode(folder() / file, codec.format);
      EXPECT_TRUE(decoded.flawless);
      EXPECT_EQ(decoded.frames, 20U);
      EXPECT_EQ(decoded.size, "320x240");
    }
    EXPECT_EQ(camera().journal().count("/image1"), 1U);
    EXPECT_EQ(camera().journal().count("PLAY"), 1U);
  }
}

TEST_F(VideoCommands, AnyOtherNameNeedsAFormat) {
  start(kVideoCodecs[1]);
  EXPECT_EQ(run({"record", place(), "--frames", "5", "--out", "video"}).exit_code, 1);
  EXPECT_FALSE(std::filesystem::exists(folder() / "video"));
  const ProgramResult result = run({"record", place(), "--frames", "5", "--out", "video", "--format", "m4v"});
  EXPECT_EQ(result.exit_code, 0) << result.err;
  EXPECT_TRUE(contents_of(folder() / "video") == pictures_of(kVideoCodecs[1], 5));
}

TEST_F(VideoCommands, AFormatOfAnotherCodecIsRefused) {
  start(kVideoCodecs[1]);
  EXPECT_EQ(run({"record", place(), "--out", "live.m4v", "--format", "h264"}).exit_code, 4);
  EXPECT_FALSE(std::filesystem::exists(folder() / "live.m4v"));
}

TEST_F(VideoCommands, ANameOfAnotherCodecIsRefused) {
  start(kVideoCodecs[1]);
  const ProgramResult result = run({"record", place(), "--out", "live.mjpeg"});
  EXPECT_EQ(result.exit_code, 4);
  EXPECT_EQ(result.err,
            "vexactl: video stream 1 of the camera is set to MPEG4\n"
            "  Set it to JPEG on the camera, choose another with --stream, or end --out in .m4v or .mkv.\n");
  EXPECT_FALSE(std::filesystem::exists(folder() / "live.mjpeg"));
}

TEST_F(VideoCommands, ASnapshotOfJpegVideoIsThePictureAsItCame) {
  start(kVideoCodecs[2]);
  const ProgramResult result = run({"snapshot", place(), "--transport", "http", "--out", "live.jpg"});
  EXPECT_EQ(result.exit_code, 0) << result.err;
  const std::string picture = pictures_of(kVideoCodecs[2], 1);
  EXPECT_TRUE(contents_of(folder() / "live.jpg") == picture);
  EXPECT_EQ(result.out, "live.jpg: " + std::to_string(picture.size()) + " bytes, from JPEG video\n");
}

TEST_F(VideoCommands, WhatIsNoPictureFileIsRefused) {
  for (const char* out : {"live.h264", "live", ""}) {
    const ProgramResult result = run({"snapshot", "127.0.0.1", "--out", out});
    EXPECT_EQ(result.exit_code, 1);
    EXPECT_EQ(result.err, "vexactl: --out names no picture\n  For instance: --out live.jpg, or live.png.\n") << out;
  }
}

TEST_F(VideoCommands, ASnapshotGoesToStandardOutputAlone) {
  start(kVideoCodecs[2]);
  const ProgramResult result = run({"snapshot", place(), "--transport", "http", "--out", "-"});
  EXPECT_EQ(result.exit_code, 0) << result.err;
  const std::string picture = pictures_of(kVideoCodecs[2], 1);
  EXPECT_TRUE(result.out == picture);
  EXPECT_EQ(result.err, "-: " + std::to_string(picture.size()) + " bytes, from JPEG video\n");
}

TEST_F(VideoCommands, SoundOfAModelWithoutAudioIsRefusedWithAdviceThatFits) {
  CameraOptions options;
  options.profile_path = VEXA_SOURCE_DIR "/models/profiles/LMX-C100.json";
  start_camera(options);
  const ProgramResult result = run({"listen", place(), "--out", "live.wav"});
  EXPECT_EQ(result.exit_code, 1);
  EXPECT_EQ(result.err,
            "vexactl: cameras of model LMX-C100 have no audio\n"
            "  vexactl profile show LMX-C100 lists what the model has.\n");
}

TEST_F(VideoCommands, ACameraWithoutVideoGivesNoSnapshot) {
  start(kVideoCodecs[0]);
  camera().add_request_fault(vexa::camera::RequestFault::status("/image1", "404 Not Found"));
  const ProgramResult result = run({"snapshot", place(), "--transport", "http", "--out", "live.png"});
  EXPECT_NE(result.exit_code, 0);
  EXPECT_FALSE(std::filesystem::exists(folder() / "live.png"));
}

TEST_F(VideoCommands, SoundGoesIntoAWaveFileOrIsKeptAsItComes) {
  start(kVideoCodecs[0]);
  const std::string tone = contents_of(VEXA_CLIPS "/tone.g711_64").substr(0, 4000);
  ProgramResult result = run({"listen", place(), "--seconds", "0.5", "--codec", "g711_64", "--out", "live.wav"});
  EXPECT_EQ(result.exit_code, 0) << result.err;
  EXPECT_EQ(camera().journal().count("AudInCodec=g711_64&AudioIn=on"), 1U);
  EXPECT_EQ(result.out, "live.wav: 0.50 s of G711 at 64 Kbps, 4000 bytes\n");
  EXPECT_TRUE(contents_of(folder() / "live.wav").substr(58) == tone);
  EXPECT_EQ(probed("stream=codec_name,sample_rate,channels,duration", folder() / "live.wav"),
            (std::vector<std::string>{"pcm_mulaw,8000,1,0.500000"}));
  result = run({"listen", place(), "--seconds", "0.5", "--out", "-", "--json"});
  EXPECT_EQ(result.exit_code, 0) << result.err;
  EXPECT_TRUE(result.out == tone);
  EXPECT_EQ(nlohmann::json::parse(result.err, nullptr, false)["bytes"], 4000);
}

TEST_F(VideoCommands, SoundOfOtherCodecsIsKeptRawOnly) {
  start(kVideoCodecs[0]);
  camera().settings().set("camera", "AudInCodec", "g726_32");
  ProgramResult result = run({"listen", place(), "--seconds", "0.5", "--out", "live.g726"});
  EXPECT_EQ(result.exit_code, 0) << result.err;
  EXPECT_TRUE(contents_of(folder() / "live.g726") == contents_of(VEXA_CLIPS "/tone.g726_32").substr(0, 2000));
  result = run({"listen", place(), "--out", "live.wav"});
  EXPECT_EQ(result.exit_code, 1);
  EXPECT_EQ(result.err,
            "vexactl: the camera's sound is G726, which vexactl does not write to .wav\n"
            "  Give --out another extension for the sound as received, or switch to --codec g711_64.\n");
}

TEST_F(VideoCommands, SoundThatIsOffEndsWithFour) {
  start(kVideoCodecs[0]);
  const ProgramResult result = run({"listen", place(), "--out", "live.g711"});
  EXPECT_EQ(result.exit_code, 4);
  EXPECT_EQ(result.err, "vexactl: the camera's sound is off\n  Switch it on, for instance with --codec g711_64.\n");
  EXPECT_EQ(camera().journal().count("/audio"), 0U);
}

TEST_F(VideoCommands, SoundThatStopsEndsWithFour) {
  CameraOptions options;
  options.sound_path = VEXA_CLIPS "/tone";
  options.loop = false;
  options.speed = 8;
  start_camera(options);
  camera().settings().set("camera", "AudInCodec", "g711_64");
  const ProgramResult result = run({"listen", place(), "--timeout", "1000", "--out", "live.g711"});
  EXPECT_EQ(result.exit_code, 4);
  EXPECT_EQ(result.err,
            "vexactl: the camera has stopped sending sound\n"
            "  Check its network and that its audio input is on.\n");
  EXPECT_TRUE(contents_of(folder() / "live.g711") == contents_of(VEXA_CLIPS "/tone.g711_64"));
}

TEST_F(VideoCommands, SoundThatBreaksOffReportsWhyAndKeepsWhatCame) {
  start(kVideoCodecs[0]);
  ProgramRun listen(folder(), vexactl({"listen", place(), "--codec", "g711_64", "--out", "live.g711"}), kCredentials);
  ASSERT_TRUE(eventually([&] { return size_of("live.g711") > 0; }));
  camera().unplug();
  const ProgramResult result = listen.wait();
  EXPECT_EQ(result.exit_code, 4);
  EXPECT_EQ(result.err, "vexactl: the sound has broken off: the camera " + place() +
                            " cannot be used: Connection reset by peer\n"
                            "  Check that address and HTTP port are the camera's.\n");
  EXPECT_GT(size_of("live.g711"), 0U);
}

#ifdef VEXA_WITH_FFMPEG

TEST_F(VideoCommands, RecordFillsContainersWithEveryCodecByEveryTransport) {
  for (const VideoCodec& codec : kVideoCodecs) {
    start(codec);
    for (const char* transport : {"udp", "http"}) {
      SCOPED_TRACE(std::string(codec.name) + " " + transport);
      const char* file = transport[0] == 'u' ? "live.mkv" : "live.mp4";
      const char* format = transport[0] == 'u' ? "matroska" : "mp4";
      const ProgramResult result = run({"record", place(), "--frames", "20", "--transport", transport, "--out", file});
      EXPECT_EQ(result.exit_code, 0) << result.err;
      const Decoded decoded = decode(folder() / file, format);
      EXPECT_TRUE(decoded.flawless);
      EXPECT_EQ(decoded.size, "320x240");
      std::vector<double> times;
      for (const std::string& time : probed("packet=pts_time", folder() / file)) times.push_back(std::stod(time));
      ASSERT_EQ(times.size(), 20U);
      EXPECT_EQ(times.front(), 0);
      EXPECT_LT(times.back(), 60);
      for (std::size_t i = 1; i < times.size(); ++i) EXPECT_GT(times[i], times[i - 1]) << i;
    }
  }
}

// The pictures of a file that may still be written, whatever their distances.
std::size_t pictures_in(const std::string& path) {
  const std::string command = "ffmpeg -v quiet -nostdin -i '" + path + "' -an -fps_mode passthrough -f framemd5 - 2>&1";
  std::FILE* output = popen(command.c_str(), "r");
  std::size_t count = 0;
  char line[512];
  while (output != nullptr && std::fgets(line, sizeof line, output) != nullptr) count += line[0] == '0' ? 1 : 0;
  if (output != nullptr) pclose(output);
  return count;
}

TEST_F(VideoCommands, ARecordingThatIsKilledPlaysUpToItsLastSecond) {
  start(kVideoCodecs[0]);
  for (const char* file : {"killed.mkv", "killed.mp4"}) {
    ProgramRun record(folder(), vexactl({"record", place(), "--out", file}), kCredentials);
    ASSERT_TRUE(eventually([&] { return pictures_in(folder() / file) >= 50; })) << file;
    record.signal(SIGKILL);
    EXPECT_EQ(record.wait().exit_code, 128 + SIGKILL);
    EXPECT_GE(pictures_in(folder() / file), 50U) << file;
  }
}

TEST_F(VideoCommands, AContainerGoesThroughAPipe) {
  start(kVideoCodecs[0]);
  for (const char* format : {"mkv", "mp4"}) {
    ProgramResult result = run({"record", place(), "--frames", "20", "--out", "-", "--format", format});
    EXPECT_EQ(result.exit_code, 0) << result.err;
    ReadRun piped(folder(), vexactl({"record", place(), "--frames", "20", "--out", "-", "--format", format}),
                  kCredentials, ReadRun::Reader::kPipe);
    folder().make_file("piped", piped.read_lines());
    EXPECT_EQ(piped.program().wait().exit_code, 0);
    const Decoded decoded = decode(folder() / "piped", std::string(format) == "mkv" ? "matroska" : "mp4");
    EXPECT_TRUE(decoded.flawless) << format;
    EXPECT_EQ(pictures_in(folder() / "piped"), 20U) << format;
  }
}

TEST_F(VideoCommands, SnapshotsOfEveryCodecAreDecoded) {
  for (const VideoCodec& codec : kVideoCodecs) {
    start(codec);
    for (const char* file : {"live.png", "live.jpg"}) {
      SCOPED_TRACE(std::string(codec.name) + " " + file);
      const ProgramResult result = run({"snapshot", place(), "--out", file, "--json"});
      EXPECT_EQ(result.exit_code, 0) << result.err;
      const auto json = nlohmann::json::parse(result.out, nullptr, false);
      EXPECT_EQ(json["codec"], codec.name);
      EXPECT_EQ(json["bytes"], size_of(file));
      EXPECT_EQ(decode(folder() / file, "image2").size, "320x240");
    }
  }
}

#else

TEST_F(VideoCommands, WhatNeedsFfmpegsLibrariesIsRefusedBeforeAnythingIsAsked) {
  start(kVideoCodecs[0]);
  EXPECT_EQ(run({"record", place(), "--out", "live.mkv"}).exit_code, 1);
  EXPECT_TRUE(camera().journal().snapshot().empty());
  const ProgramResult result = run({"snapshot", place(), "--out", "live.jpg"});
  EXPECT_EQ(result.exit_code, 1);
  EXPECT_EQ(result.err,
            "vexactl: this vexactl was built without FFmpeg's libraries; a picture of H.264 video needs them\n"
            "  Use a build that has them, or record the video and decode it with ffmpeg.\n");
  EXPECT_EQ(camera().journal().count("PLAY"), 0U);
}

#endif

}  // namespace
}  // namespace vexa_test
