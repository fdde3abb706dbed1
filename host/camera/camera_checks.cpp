// SPDX-License-Identifier: Apache-2.0
#include "host/camera/camera_checks.h"

#include <fmt/format.h>

#include <algorithm>
#include <memory>
#include <set>
#include <utility>

#include "host/base/codec.h"
#include "host/camera/live_pictures.h"
#include "host/console/interrupt.h"
#include "vexa/failure.h"
#include "vexa/frame_facts.h"
#include "vexa/statistics.h"
#include "vexa/stream_choice.h"

namespace vexa::host {
namespace {

using Clock = std::chrono::steady_clock;
using Json = nlohmann::ordered_json;
using std::chrono::milliseconds;

constexpr int kMostStreams = 4;

// The sections that the driver inquires. A camera without the part need not have the section.
struct Section {
  const char* name;
  bool needed;
};
constexpr Section kSections[] = {{"system", true},           {"network", true}, {"camera", true},
                                 {"sensor", false},          {"ptzf", false},   {"presetposition", false},
                                 {"objectdetection", false}, {"lod", false},    {"audiodetection", false},
                                 {"edgestorage", false},     {"a-slot", false}};

Check named(std::string name) {
  Check check;
  check.name = std::move(name);
  return check;
}

class Stopwatch {
 public:
  [[nodiscard]] long spent() const {
    return static_cast<long>(std::chrono::duration_cast<milliseconds>(Clock::now() - began_).count());
  }

 private:
  const Clock::time_point began_ = Clock::now();
};

// The code, and nothing of the failure's text: it may repeat what the camera sent.
void take_failure(Check& check, ELibDReturnCode code) {
  check.verdict = Verdict::kFails;
  check.evidence.emplace_back("code", CodeName(code));
  if (code == LIBD_UNAUTHORIZED) {
    check.code = ExitCode::kUnauthorized;
    check.remedy = "The camera refuses user name and password.";
  } else if (code == LIBD_TIMEOUT) {
    check.remedy = "No answer in time; a slow camera needs a longer --timeout.";
  }
}

std::string size_of(const SLibDCameraInfo& video) { return fmt::format("{}x{}", video.imageWidth, video.imageHeight); }

const SLibDVideoCodecInfo* offer_of(const Profile& profile, const SLibDCameraInfo& video) {
  for (const SLibDVideoCodecInfo& codec : profile.camera.codecs) {
    if (codec.name == video.codecName) return &codec;
  }
  return nullptr;
}

bool is_offered(const Profile& profile, const SLibDCameraInfo& video) {
  const SLibDVideoCodecInfo* codec = offer_of(profile, video);
  if (codec == nullptr) return false;
  const auto of_size = [&](const SLibDResolutionInfo& size) {
    return size.width == video.imageWidth && size.height == video.imageHeight;
  };
  return std::any_of(codec->resolutions.begin(), codec->resolutions.end(), of_size);
}

}  // namespace

Check CameraChecks::credentials() {
  const Stopwatch time;
  Check check = named("credentials");
  LiveCamera camera(connection_);
  const ELibDReturnCode code = camera.GetCurrentSystemInfo(system_);
  usable_ = code == LIBD_OK;
  const bool refused = code != LIBD_OK && camera.explain(code).code == ExitCode::kUnauthorized;
  check.verdict = refused ? Verdict::kFails : code == LIBD_OK ? Verdict::kWorks : Verdict::kUntried;
  if (refused) {
    check.code = ExitCode::kUnauthorized;
    check.evidence = {{"code", CodeName(LIBD_UNAUTHORIZED)}};
    check.remedy = fmt::format("Give them with --user and --password-file, --credentials FILE, or {} and {}.",
                               kUserVariable, kPasswordVariable);
  }
  check.milliseconds = time.spent();
  return check;
}

Check CameraChecks::system() {
  const Stopwatch time;
  Check check = named("system");
  LiveCamera camera(connection_);
  const ELibDReturnCode code = camera.GetCurrentSystemInfo(system_);
  if (code == LIBD_OK) {
    usable_ = true;
    check.verdict = system_.modelName.empty() ? Verdict::kPartly : Verdict::kWorks;
    check.evidence = {{"model", system_.modelName}, {"software", system_.softwareVersion}};
    if (system_.modelName.empty()) check.remedy = "The camera names no model; give commands its --profile.";
  } else {
    take_failure(check, code);
  }
  check.milliseconds = time.spent();
  return check;
}

std::vector<SLibDCameraInfo> CameraChecks::reported_streams() {
  std::vector<SLibDCameraInfo> streams;
  for (int number = 1; number <= kMostStreams; ++number) {
    LiveCamera camera(connection_);
    if (SelectStream(camera, number) != LIBD_OK) break;
    SLibDCameraInfo video;
    video.streamNumber = number;
    if (camera.GetCameraInfo(video) != LIBD_OK) break;
    video.streamNumber = number;
    streams.push_back(video);
  }
  return streams;
}

Check CameraChecks::profile() {
  const Stopwatch time;
  Check check = named("profile");
  const auto names = ProfileNames();
  const bool installed = std::find(names.begin(), names.end(), system_.modelName) != names.end();
  Profile profile;
  ProfileError error;
  if (!installed) {
    check.verdict = Verdict::kPartly;
    check.remedy = "No installed profile is of this model: the common driver serves it. --write-profile proposes one.";
  } else if (!LoadProfile(system_.modelName, profile, error)) {
    check.verdict = Verdict::kFails;
    check.code = ExitCode::kUsage;
    check.remedy = "The installed profile cannot be read: vexactl profile check reports why.";
  } else {
    check.evidence = {{"profile", profile.name}};
    const auto streams = reported_streams();
    const bool fits = !streams.empty() && std::all_of(streams.begin(), streams.end(),
                                                      [&](const auto& video) { return is_offered(profile, video); });
    check.verdict = fits ? Verdict::kWorks : Verdict::kPartly;
    if (!fits)
      check.remedy = "A stream is set to a codec or size that the profile lacks. --write-profile proposes another.";
  }
  check.milliseconds = time.spent();
  return check;
}

std::vector<Check> CameraChecks::inquiries() {
  std::vector<Check> checks;
  for (const Section& section : kSections) {
    const Stopwatch time;
    Check& check = checks.emplace_back(named(fmt::format("inquiry {}", section.name)));
    LiveCamera camera(connection_);
    const Result<std::size_t> answered = camera.inquire(section.name);
    if (answered) {
      check.verdict = *answered > 0 ? Verdict::kWorks : Verdict::kPartly;
      check.evidence = {{"bytes", *answered}};
    } else if (!section.needed && LastFailure(camera).code == LIBD_FAILED) {
      check.verdict = Verdict::kLacking;
    } else {
      take_failure(check, LastFailure(camera).code);
      check.code = answered.error().code;
    }
    check.milliseconds = time.spent();
  }
  return checks;
}

// A key picture within twice the time-out: an encoder's interval may be long.
Check CameraChecks::stream(int number, VideoTransport transport) {
  const Stopwatch time;
  const bool rtp = transport == VideoTransport::kUdp;
  Check check = named(fmt::format("stream {} by {}", number, rtp ? "rtp" : "http"));
  check.code = ExitCode::kNoVideo;
  CameraConnection connection = connection_;
  connection.transport = transport;
  LiveCamera camera(connection);
  SLibDCameraInfo video;
  video.streamNumber = number;
  ELibDReturnCode code = SelectStream(camera, number);
  if (code == LIBD_OK) code = camera.GetCameraInfo(video);
  if (code == LIBD_OK) {
    check.evidence = {{"codec", video.codecName}, {"size", size_of(video)}};
    code = camera.StartVideoStreaming();
  }
  if (code != LIBD_OK) {
    take_failure(check, code);
    if (check.remedy.empty()) {
      check.remedy = rtp ? "Check that its port 554 can be reached, and how many viewers it serves at once."
                         : "Not every camera streams this codec over HTTP; use RTP.";
    }
    check.milliseconds = time.spent();
    return check;
  }
  LivePictures pictures(camera);
  const auto give_up = Clock::now() + 2 * milliseconds(connection_.timeout_ms);
  LivePictures::Polled polled = LivePictures::Polled::kNone;
  while (!pictures.has_picture() && polled != LivePictures::Polled::kSilent && Clock::now() < give_up) {
    polled = pictures.poll();
  }
  check.milliseconds = time.spent();
  const bool came = pictures.has_picture();
  check.verdict = came ? Verdict::kWorks : Verdict::kFails;
  check.evidence.emplace_back("keyPicture", came);
  if (!came) {
    check.remedy = rtp ? "The session opens and no whole picture comes: check firewalls for UDP on the way."
                       : "The stream opens and no whole picture comes: check the camera's encoder settings.";
  }
  return check;
}

std::vector<Check> CameraChecks::streams() {
  std::vector<Check> checks;
  const auto reported = reported_streams();
  std::set<std::string> codecs;
  for (const SLibDCameraInfo& video : reported) {
    codecs.insert(video.codecName);
    for (const VideoTransport transport : {VideoTransport::kUdp, VideoTransport::kHttp}) {
      checks.push_back(stream(video.streamNumber, transport));
    }
  }
  // Setting a stream to another codec would change the camera.
  for (const char* codec : {"H.264", "MPEG4", "JPEG"}) {
    if (codecs.count(codec) > 0) continue;
    Check& check = checks.emplace_back(named(fmt::format("codec {}", codec)));
    check.remedy = "No stream is set to it; vexactl set CAMERA codec=... changes that.";
  }
  return checks;
}

std::vector<Check> CameraChecks::reception(double seconds) {
  const Stopwatch time;
  std::vector<Check> checks = {named("reception"), named("clock")};
  Check& received = checks[0];
  Check& clock = checks[1];
  received.code = ExitCode::kNoVideo;
  LiveCamera camera(connection_);
  ELibDReturnCode code = SelectStream(camera, 1);
  if (code == LIBD_OK) code = camera.StartVideoStreaming();
  if (code != LIBD_OK) {
    take_failure(received, code);
    received.milliseconds = time.spent();
    return checks;
  }
  FrameFacts facts;
  FrameFacts latest;
  std::uint64_t pictures = 0;
  struct Sink final : CDataSink {
    void Write(const unsigned char*, unsigned int) override {}
  } sink;
  // The first picture has the time that an answer has; the length counts from it.
  auto end = Clock::now() + milliseconds(connection_.timeout_ms);
  while (Clock::now() < end && code != LIBD_TIMEOUT) {
    SLibDVideoFrameInfo frame;
    frame.sink = &sink;
    code = GetCurrentVideoFrame(camera, frame, facts);
    if (code == LIBD_NO_FRAME) Interrupt::wait(kPollPause);
    if (code != LIBD_OK) continue;
    if (pictures++ == 0) {
      end = Clock::now() + std::chrono::duration_cast<Clock::duration>(std::chrono::duration<double>(seconds));
    }
    if ((facts.valid & FRAME_FACTS_CAMERA_CLOCK) != 0) latest = facts;
  }
  StreamStatistics counted;
  GetStreamStatistics(camera, counted);
  camera.StopVideoStreaming();
  const std::uint64_t lost = counted.packetsMissing + counted.packetsMissingInCamera;
  const bool whole = lost == 0 && counted.framesDroppedIncomplete == 0 && counted.framesDroppedDamaged == 0;
  received.verdict = pictures == 0 ? Verdict::kFails : whole ? Verdict::kWorks : Verdict::kPartly;
  received.evidence = {{"seconds", seconds},
                       {"pictures", pictures},
                       {"pictureLosses", counted.framesDroppedIncomplete + counted.framesDroppedDamaged},
                       {"expected", counted.packetsExpected},
                       {"lost", lost},
                       {"jitterMilliseconds", static_cast<double>(counted.jitter) / 1000},
                       {"longestGapMilliseconds", counted.longestGap / 1000}};
  if (!whole) received.remedy = "Packets are lost on the way: check cables, switches and Wi-Fi, or lower the bit rate.";
  if (pictures == 0) received.remedy = "No picture came: see the checks of the streams.";
  received.milliseconds = time.spent();
  if ((latest.valid & FRAME_FACTS_CAMERA_CLOCK) == 0) {
    clock.verdict = pictures > 0 ? Verdict::kLacking : Verdict::kUntried;
    clock.remedy = pictures > 0 ? "The camera sends no reports of its clock." : "";
    return checks;
  }
  constexpr std::int64_t kMillisecond = 1000000;
  constexpr std::int64_t kFarOff = 1000;  // milliseconds
  const std::int64_t offset = latest.cameraClockOffset / kMillisecond;
  const bool right = offset > -kFarOff && offset < kFarOff && latest.cameraClockState == FRAME_CAMERA_CLOCK_RUNNING;
  clock.verdict = right ? Verdict::kWorks : Verdict::kPartly;
  clock.evidence = {{"clockOffsetMilliseconds", offset}};
  if (!right) clock.remedy = "Set the camera's clock, or give it a time server.";
  return checks;
}

Check CameraChecks::card() {
  const Stopwatch time;
  Check check = named("card");
  LiveCamera camera(connection_);
  const Result<CardMode> mode = camera.card_mode();
  if (!mode) {
    check.verdict = left_a_reason(camera) ? Verdict::kLacking : Verdict::kFails;
  } else {
    const bool there = mode->free_kilobytes > 0;
    check.verdict = there ? Verdict::kWorks : Verdict::kLacking;
    check.evidence = {{"freeKilobytes", mode->free_kilobytes}, {"mode", mode->recording.enabled ? "on" : "off"}};
    if (!there && mode->recording.enabled) {
      check.verdict = Verdict::kFails;
      check.remedy = "The camera is to record on its card, and has none, or a full or failing one.";
    }
  }
  check.milliseconds = time.spent();
  return check;
}

Result<std::string> CameraChecks::proposed_profile() {
  const auto streams = reported_streams();
  if (streams.empty() || system_.modelName.empty()) {
    return fail({ExitCode::kUnreachable, "the camera reports neither model nor streams",
                 "A profile can be proposed once its system and camera inquiries work."});
  }
  Json reported = Json::array();
  std::vector<std::string> names;
  bool hd = false;
  for (const SLibDCameraInfo& video : streams) {
    Json stream = {{"codec", video.codecName}, {"size", size_of(video)}, {"frameRate", video.frameRate}};
    const bool jpeg = codec_named(video.codecName) == Codec::kJpeg;
    stream[jpeg ? "quality" : "bitRate"] = jpeg ? video.quality : video.bitRate;
    reported.push_back(std::move(stream));
    if (std::find(names.begin(), names.end(), video.codecName) == names.end()) names.push_back(video.codecName);
    hd = hd || video.imageWidth >= 1280;
  }
  Json codecs = Json::array();
  for (const std::string& name : names) {
    const bool jpeg = codec_named(name) == Codec::kJpeg;
    std::vector<std::pair<int, std::string>> sizes;
    std::set<int> rates;
    std::set<int> qualities;
    for (const SLibDCameraInfo& video : streams) {
      if (video.codecName != name) continue;
      sizes.emplace_back(-video.imageWidth * video.imageHeight, size_of(video));
      rates.insert(video.frameRate);
      qualities.insert(jpeg ? video.quality : video.bitRate);
    }
    std::sort(sizes.begin(), sizes.end());
    sizes.erase(std::unique(sizes.begin(), sizes.end()), sizes.end());
    Json texts = Json::array();
    for (const auto& [area, size] : sizes) texts.push_back(size);
    codecs.push_back({{"name", name}, {"sizes", texts}, {"frameRates", rates}});
    codecs.back()[jpeg ? "qualities" : "bitRates"] = qualities;
  }
  const Json profile = {{"description", "Proposed from the camera's answers: add what else it offers"},
                        {"driver", "common"},
                        {"model", system_.modelName},
                        {"cameraTypes", Json::array({"fixed", hd ? "hd" : "sd"})},
                        {"video", {{"streams", reported}, {"codecs", codecs}}}};
  std::string text = profile.dump(2, ' ', false, Json::error_handler_t::replace) + "\n";
  Profile checked;
  ProfileError error;
  if (ParseProfile(text, "proposal", checked, error)) return text;
  return fail({ExitCode::kUnreachable, "what the camera reports makes no profile: " + error.Message(),
               "Write one by hand, after docs/camera_models.md."});
}

}  // namespace vexa::host
