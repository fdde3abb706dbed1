// SPDX-License-Identifier: Apache-2.0
// Every operation while memory is short: a call that fails throws nothing and has changed nothing, but for what its row
// names, as its contract does.
#include <gtest/gtest.h>

#include <functional>
#include <initializer_list>
#include <memory>
#include <string>
#include <vector>

#include "tests/media/live_camera.h"
#include "tests/support/failing_new.h"
#include "tests/support/process_state.h"
#include "tests/support/temporary_folder.h"
#include "vexa/failure.h"
#include "vexa/stream_choice.h"

namespace vexa_test {
namespace {

using vexa::camera::RequestFault;

// Longer than what a text holds by itself.
const std::string kLong(40, 'l');

std::string joined(std::initializer_list<std::string> parts) {
  std::string text;
  for (const std::string& part : parts) text += part + "|";
  return text;
}

std::string text_of(int number) { return std::to_string(number); }
std::string text_of(const SLibDFixedSystemInfo& info) { return joined({info.modelName, info.version, info.maker}); }
std::string text_of(const SLibDFixedConnectionInfo& info) { return info.text; }
std::string text_of(const SLibDSystemInfo& info) {
  return joined({info.maker, info.modelName, info.softwareVersion, info.serialNumber, info.macAddress});
}
std::string text_of(const SLibDConnectionInfo& info) {
  return joined({info.host, text_of(info.port), text_of(info.timeout), info.userName, info.password});
}
std::string text_of(const SLibDCameraInfo& info) {
  return joined({info.codecName, text_of(info.streamNumber), info.imageSizeText, text_of(info.imageWidth),
                 info.frameRateText, info.qualityText, info.bitRateText});
}
std::string text_of(const std::vector<SLibDVideoCodecInfo>& codecs) {
  std::string text;
  for (const SLibDVideoCodecInfo& codec : codecs) text += joined({codec.name, text_of(int(codec.resolutions.size()))});
  return text;
}
std::string text_of(const SLibDFixedCameraInfo& info) { return text_of(info.codecs); }
std::string text_of(const SLibDAudioInfo& info) {
  return joined({info.codec, info.bitRateLabel, info.samplingRateLabel});
}
std::string text_of(const SLibDFixedAudioInfo& info) { return text_of(int(info.inputCodecs.size())); }
std::string text_of(const SLibDPTZControlInfo& info) { return info.brightMode; }
std::string text_of(const SLibDFixedPTZControlInfo& info) { return text_of(int(info.zoomSteps.size())); }
std::string text_of(const SLibDEdgeStorageMode& mode) { return mode.watchAddress; }
std::string text_of(const SLibDEdgeStorageRecordList& list) { return text_of(int(list.records.size())); }
std::string text_of(const SLibDCameraTourInfo& info) { return text_of(info.resumeTime); }
std::string text_of(const SLibDShadowTourInfo& info) { return text_of(info.resumeTime); }
std::string text_of(const SLibDIoBoxInfo& info) {
  return joined({text_of(int(info.pins.size())), text_of(info.vmdType)});
}
std::string text_of(const SLibDPresetInfo& preset) { return preset.name; }
template <typename Item>
std::string text_of(const std::vector<Item>& items) {
  return text_of(int(items.size()));
}

/// A driver with something to lose in each of its records.
class ShortDriver : public MediaDriver {
 public:
  ShortDriver() {
    m_FixedSystemInfo.modelName = m_FixedSystemInfo.version = m_FixedSystemInfo.maker = kLong;
    m_FixedSystemInfo.capability3 = 1;
    m_ConnectionInfo.proxyHost = kLong;
    m_FixedConnectionInfo.text = kLong;
    m_FixedCameraInfoAvailable = m_FixedPTZControlInfoAvailable = m_EdgeStorageSupported = true;
    m_FixedCameraInfo.codecs.resize(3);
    m_FixedCameraInfo.codecs[0].name = kLong;
    m_FixedAudioInfo.inputCodecs.resize(2);
    m_FixedPTZControlInfo.zoomSteps.resize(2);
    m_FixedPTZControlInfo.presetCount = m_FixedPTZControlInfo.tourCount = m_FixedPTZControlInfo.shadowTourCount = 2;
    m_FixedIoBoxInfo.inputCount = 2;
    m_FixedIoBoxInfo.tamperingDetection = m_FixedIoBoxInfo.audioDetection = true;
    m_CameraInfo.imageSizeText = m_CameraInfo.frameRateText = kLong;
    m_AudioInfo.codec = m_AudioInfo.bitRateLabel = kLong;
    m_PTZControlInfo.brightMode = "Shutter Priority";
    m_EdgeStorageMode.watchAddress = kLong;
    m_IoBoxInfo.pins.resize(4);
  }

  std::string state_text() {
    return joined({text_of(m_ConnectionInfo), text_of(m_SavedTimeout), text_of(m_CameraInfo),
                   text_of(m_FixedCameraInfo), text_of(m_AudioInfo), text_of(m_PTZControlInfo),
                   text_of(m_EdgeStorageMode), text_of(m_IoBoxInfo), text_of(m_StreamSocket), text_of(m_RtspSocket),
                   text_of(m_AudioSocket), text_of(m_IoStreamSocket)});
  }
};

/// A call with a record of the host's: what is in the record afterwards.
struct Attempt {
  std::function<ELibDReturnCode(ShortDriver&)> call;
  std::function<std::string()> record;
};

// What a failed call may have changed all the same.
enum Changes { kNothing = 0, kRecord = 1, kDriver = 2 };

struct Row {
  const char* name;
  int changes;
  std::function<Attempt()> attempt;
};

template <typename Record>
Row with(const char* name, ELibDReturnCode (CVexaCommon::*operation)(Record&), Record record, int changes = kNothing) {
  return {name, changes, [operation, record] {
            auto kept = std::make_shared<Record>(record);
            return Attempt{[operation, kept](ShortDriver& driver) { return (driver.*operation)(*kept); },
                           [kept] { return text_of(*kept); }};
          }};
}

Row does(const char* name, std::function<ELibDReturnCode(ShortDriver&)> call, int changes = kNothing) {
  return {name, changes, [call] { return Attempt{call, [] { return std::string(); }}; }};
}

std::vector<Row> rows() {
  using D = CVexaCommon;
  SLibDSystemInfo system;
  system.modelName = system.macAddress = kLong;
  SLibDConnectionInfo connection;
  connection.host = connection.userName = kLong;
  SLibDCameraInfo camera;
  camera.imageSizeText = kLong;
  SLibDAudioInfo audio;
  audio.codec = kLong;
  SLibDPTZControlInfo control;
  control.brightMode = kLong;
  SLibDPresetInfo preset;
  preset.name = kLong;
  SLibDEdgeStorageMode mode;
  mode.watchAddress = kLong;
  const std::vector<SLibDPresetInfo> presets(7);
  const std::vector<SLibDDetectionParam> settings(7);
  SLibDEdgeStorageStreamingInfo recording;
  recording.streamName = kLong;
  recording.codecName = "H.264";
  SLibDCameraTourInfo tours;
  tours.resumeTime = 77;
  SLibDShadowTourInfo shadows;
  shadows.resumeTime = 77;
  return {
      with<SLibDFixedSystemInfo>("GetFixedSystemInfo", &D::GetFixedSystemInfo, {}),
      with<SLibDFixedConnectionInfo>("GetFixedConnectionInfo", &D::GetFixedConnectionInfo, {}),
      with("GetCurrentSystemInfo", &D::GetCurrentSystemInfo, system, kRecord),
      with<SLibDConnectionInfo>("GetCurrentConnectionInfo", &D::GetCurrentConnectionInfo, connection),
      with<SLibDConnectionInfo>("SetCurrentConnectionInfo", &D::SetCurrentConnectionInfo, connection),
      with<SLibDFixedCameraInfo>("GetFixedCameraInfo", &D::GetFixedCameraInfo, {}),
      with("GetCameraInfo", &D::GetCameraInfo, camera),
      with("SetCameraInfo", &D::SetCameraInfo, camera),
      does("SetVidCapSize", [](ShortDriver& d) { return d.SetVidCapSize(1280, 720); }),
      does("SetSolidPTZState", [](ShortDriver& d) { return d.SetSolidPTZState(true); }),
      does("SetImageMaxSize", [](ShortDriver& d) { return d.SetImageMaxSize(640, 480, LIBD_VIDEO_PAL); }),
      does("SelectStream", [](ShortDriver& d) { return vexa::SelectStream(d, 1); }),
      does("Bright", [](ShortDriver& d) { return d.Bright(1); }),
      does("SetXdnrMode", [](ShortDriver& d) { return d.SetXdnrMode(LIBD_XDNR_LOW); }),
      with<SLibDFixedAudioInfo>("GetFixedAudioInfo", &D::GetFixedAudioInfo, {}),
      with("GetAudioInfo", &D::GetAudioInfo, audio),
      with("SetAudioInfo", &D::SetAudioInfo, audio),
      with<SLibDPTZControlInfo>("GetPTZControlInfo", &D::GetPTZControlInfo, control),
      with("SetPTZControlInfo", &D::SetPTZControlInfo, control),
      with<SLibDFixedPTZControlInfo>("GetFixedPTZControlInfo", &D::GetFixedPTZControlInfo, {}),
      with("GetPresets", &D::GetPresets, presets, kRecord),
      with("SetPreset", &D::SetPreset, preset),
      with("GetCameraTourInfo", &D::GetCameraTourInfo, tours),
      with("GetShadowTourInfo", &D::GetShadowTourInfo, shadows),
      with<SLibDIoBoxInfo>("GetIoBoxInfo", &D::GetIoBoxInfo, {}, kRecord),
      does("StartAudioStreaming", [](ShortDriver& d) { return d.StartAudioStreaming(); }),
      does("StartModRawData", [](ShortDriver& d) { return d.StartModRawData(); }),
      {"GetObjectDetectionSetting", kNothing,
       [settings] {
         auto kept = std::make_shared<std::vector<SLibDDetectionParam>>(settings);
         return Attempt{[kept](ShortDriver& d) {
                          auto position = LIBD_POSITION_PRESET;
                          return d.GetObjectDetectionSetting(*kept, position);
                        },
                        [kept] { return text_of(*kept); }};
       }},
      does("SetTamperingAlarm", [](ShortDriver& d) { return d.SetTamperingAlarm(true, LIBD_TAMPER_LOW); }),
      with<SLibDEdgeStorageMode>("GetEdgeStorageMode", &D::GetEdgeStorageMode, mode),
      with("GetEdgeStorageRecordList", &D::GetEdgeStorageRecordList, SLibDEdgeStorageRecordList{}),
      does("SetEdgeStorageMode", [mode](ShortDriver& d) { return d.SetEdgeStorageMode(mode); }),
      does("StartVideoStreaming", [](ShortDriver& d) { return d.StartVideoStreaming(); }),
      does("StartEdgeStorageVideoStreaming",
           [recording](ShortDriver& d) { return d.StartEdgeStorageVideoStreaming(recording); }),
  };
}

void answer_at_length(LiveCamera& camera) {
  const std::string head = "HTTP/1.0 200 OK\r\n\r\n";
  const std::string system = "ModelName=" + kLong + "&Serial=" + kLong + "&TamperingFunc=on&TamperingLevel=high";
  camera->add_request_fault(RequestFault::raw("inq=system", head + system));
  camera->add_request_fault(RequestFault::raw("inq=network", head + "MacAddress=" + kLong));
  camera->add_request_fault(RequestFault::raw(
      "inq=camera", head + "VideoStd=ntsc&VidCapSize=1280,960,and,so,on,and,on&ImageMaxSize=1024,768,and,so,on&"
                           "ImageCodec1=h264&ImageSize1=1280,720,and,so,on&FrameRate1=0000000000000000025&"
                           "BitRate1=0000000000000002000&AudInCodec=g711_64&Shutter=5"));
  camera->add_request_fault(
      RequestFault::raw("inq=objectdetection", head + "PositionMode=current&Od1Mode=a&Od2Mode=b"));
}

/// Makes a call while an allocation of it fails: what the row does not name has not changed.
void expect_no_change(const Row& row, LiveCamera& camera, const std::string& log_path, Shortage& shortage) {
  ShortDriver driver;
  camera.introduce(driver);
  driver.SetCGILogPath(log_path.c_str());
  driver.state().teardown_timeout = 0;
  const Attempt attempt = row.attempt();
  const std::string record = attempt.record();
  const std::string state = driver.state_text();
  const ELibDReturnCode code = shortage.run([&] { return attempt.call(driver); });
  if (code != LIBD_OK && (row.changes & kRecord) == 0) {
    EXPECT_EQ(attempt.record(), record);
  }
  if (code != LIBD_OK && (row.changes & kDriver) == 0) {
    EXPECT_EQ(driver.state_text(), state);
  }
  if (code != LIBD_OK) {
    EXPECT_EQ(vexa::LastFailure(driver).operation, row.name);
  }
  driver.StopVideoStreaming();
  driver.StopModRawData();
}

TEST(ShortOfMemory, AFailedCallHasChangedNothing) {
  LiveCamera camera(camera_options());
  answer_at_length(camera);
  const std::size_t descriptors = open_descriptors();
  for (const Row& row : rows()) {
    SCOPED_TRACE(row.name);
    const TemporaryFolder folder;
    fails_at_every_allocation([&](Shortage& shortage) { expect_no_change(row, camera, folder / "cgi.log", shortage); });
  }
  EXPECT_TRUE(
      eventually([&] { return open_descriptors() == descriptors; }));  // the camera closes its own a moment later
}

TEST(ShortOfMemory, ADriversEndThrowsNothing) {
  fails_at_every_allocation([](Shortage& shortage) {
    auto driver = std::make_unique<ShortDriver>();
    SLibDConnectionInfo connection;
    const TemporaryFolder folder;
    driver->SetCGILogPath((folder / "cgi.log").c_str());
    driver->SetCurrentConnectionInfo(connection);
    shortage.run([&] { driver.reset(); });
  });
}

TEST(ShortOfMemory, AStreamingDriversEndThrowsNothing) {
  LiveCamera camera(camera_options());
  fails_at_every_allocation([&](Shortage& shortage) {
    auto driver = std::make_unique<ShortDriver>();
    camera.play(*driver);
    driver->state().teardown_timeout = 0;
    shortage.run([&] { driver.reset(); });
  });
}

}  // namespace
}  // namespace vexa_test
