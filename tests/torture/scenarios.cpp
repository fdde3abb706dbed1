// SPDX-License-Identifier: Apache-2.0
#include "tests/torture/scenarios.h"

#include <poll.h>

#include <chrono>
#include <string>
#include <vector>

#include "vexa/file_logger.h"
#include "vexa/runtime.h"
#include "vexa/statistics.h"
#include "vexa/vexa_common.h"
#include "vexa/waiting.h"

namespace vexa::torture {

void Run::expect(const char* step, ELibDReturnCode code) {
  if (code == LIBD_OK || outcome_.unstated) return;
  switch (code) {
    case LIBD_OK:
      return;
    case LIBD_FAILED:
    case LIBD_STREAM_OPEN_FAILED:
    case LIBD_TIMEOUT:
    case LIBD_UNAUTHORIZED:
    case LIBD_NO_FRAME:
    case LIBD_FRAME_DAMAGED:
    case LIBD_BUFFER_TOO_SMALL:
      break;
    case LIBD_NOT_SUPPORTED:
    case LIBD_INVALID_ARGUMENT:
    case LIBD_INVALID_MODE:
      outcome_.unstated = true;
      break;
  }
  if (outcome_.step == nullptr || outcome_.unstated) {
    outcome_.step = step;
    outcome_.code = code;
  }
}

namespace {

using Clock = std::chrono::steady_clock;

constexpr std::chrono::seconds kLongestWait{3};
constexpr unsigned long kStillActive = 259;
constexpr int kCameraTimeout = 1000;  // milliseconds
constexpr int kFrames = 3;            // of each stream
constexpr int kTours = 5;             // of each kind that the camera has

// Records of the host. Each is made once, while no call fails: what the host itself lacks is not the library's fault.
template <typename Record>
Record& host_record() {
  static Record record;
  return record;
}

struct Operation {
  const char* name;
  ELibDReturnCode (*call)(CLibraryDevice&);
};

template <typename Record, ELibDReturnCode (CLibraryDevice::*kOperation)(Record&)>
ELibDReturnCode with(CLibraryDevice& driver) {
  return (driver.*kOperation)(host_record<Record>());
}

template <ELibDReturnCode (CLibraryDevice::*kOperation)()>
ELibDReturnCode plain(CLibraryDevice& driver) {
  return (driver.*kOperation)();
}

template <std::size_t kCount>
void run_all(Run& run, CLibraryDevice& driver, const Operation (&operations)[kCount]) {
  for (const Operation& operation : operations) run.expect(operation.name, operation.call(driver));
}

void connect_to(Run& run, CLibraryDevice& driver, const char* host, int transport) {
  SLibDConnectionInfo& connection = host_record<SLibDConnectionInfo>();
  connection.host = host;
  connection.port = 80;
  connection.streamTransport = transport;
  connection.timeout = kCameraTimeout;
  connection.userName = connection.password = "admin";
  run.expect("SetCurrentConnectionInfo", driver.SetCurrentConnectionInfo(connection));
}

void connect(Run& run, CLibraryDevice& driver) { connect_to(run, driver, kCamera, 1); }

using D = CLibraryDevice;

constexpr Operation kInquiries[] = {
    {"GetFixedSystemInfo", with<SLibDFixedSystemInfo, &D::GetFixedSystemInfo>},
    {"GetFixedConnectionInfo", with<SLibDFixedConnectionInfo, &D::GetFixedConnectionInfo>},
    {"GetFixedCameraInfo", with<SLibDFixedCameraInfo, &D::GetFixedCameraInfo>},
    {"ClearFixedCameraInfo", with<SLibDFixedCameraInfo, &D::ClearFixedCameraInfo>},
    {"GetFixedAudioInfo", with<SLibDFixedAudioInfo, &D::GetFixedAudioInfo>},
    {"ClearFixedAudioInfo", with<SLibDFixedAudioInfo, &D::ClearFixedAudioInfo>},
    {"GetFixedIoboxInfo", with<SLibDFixedIoBoxInfo, &D::GetFixedIoboxInfo>},
    {"GetFixedPTZControlInfo", with<SLibDFixedPTZControlInfo, &D::GetFixedPTZControlInfo>},
    {"ClearFixedPTZControlInfo", with<SLibDFixedPTZControlInfo, &D::ClearFixedPTZControlInfo>},
    {"GetCurrentSystemInfo", with<SLibDSystemInfo, &D::GetCurrentSystemInfo>},
    {"GetCurrentConnectionInfo", with<SLibDConnectionInfo, &D::GetCurrentConnectionInfo>},
    {"GetCameraInfo", with<SLibDCameraInfo, &D::GetCameraInfo>},
    {"GetAudioInfo", with<SLibDAudioInfo, &D::GetAudioInfo>},
    {"GetIoBoxInfo", with<SLibDIoBoxInfo, &D::GetIoBoxInfo>},
    {"GetPTZControlInfo", with<SLibDPTZControlInfo, &D::GetPTZControlInfo>},
    {"GetCameraTourInfo", with<SLibDCameraTourInfo, &D::GetCameraTourInfo>},
    {"ClearCameraTourInfo", with<SLibDCameraTourInfo, &D::ClearCameraTourInfo>},
    {"GetShadowTourInfo", with<SLibDShadowTourInfo, &D::GetShadowTourInfo>},
    {"ClearShadowTourInfo", with<SLibDShadowTourInfo, &D::ClearShadowTourInfo>},
    {"GetPresets", with<std::vector<SLibDPresetInfo>, &D::GetPresets>},
    {"ClearCachedPresets", with<std::vector<SLibDPresetInfo>, &D::ClearCachedPresets>},
    {"GetDayNightMode", with<ELibDDayNightType, &D::GetDayNightMode>},
    {"GetVisibilityEnhancerMode", with<ELibDVisibilityEnhancerType, &D::GetVisibilityEnhancerMode>},
    {"GetXdnrMode", with<ELibDXdnrType, &D::GetXdnrMode>},
    {"GetViewDR", with<ELibDViewDRMode, &D::GetViewDR>},
    {"GetIRIlluminator",
     [](D& driver) {
       int strength = 0;
       return driver.GetIRIlluminator(host_record<ELibIRIlluminatorMode>(), strength);
     }},
    {"GetObjectDetectionSetting",
     [](D& driver) {
       return driver.GetObjectDetectionSetting(host_record<std::vector<SLibDDetectionParam>>(),
                                               host_record<ELibDPositionMode>());
     }},
    {"GetEdgeStorageMode", with<SLibDEdgeStorageMode, &D::GetEdgeStorageMode>},
    {"GetEdgeStorageRecordList", with<SLibDEdgeStorageRecordList, &D::GetEdgeStorageRecordList>},
    {"ClearEdgeStorageRecordList", with<SLibDEdgeStorageRecordList, &D::ClearEdgeStorageRecordList>},
};

SLibDPresetInfo& preset() {
  static SLibDPresetInfo gate{0, "gate"};
  return gate;
}

void inquire(Run& run, CLibraryDevice& driver) {
  connect(run, driver);
  run.expect("SetPreset", driver.SetPreset(preset()));  // without a name there is no list of names
  run_all(run, driver, kInquiries);
}

void named(Run& run, CLibraryDevice& driver) {
  connect_to(run, driver, "localhost", 1);
  run.expect("GetCurrentSystemInfo", driver.GetCurrentSystemInfo(host_record<SLibDSystemInfo>()));
}

SLibDCameraTourInfo& tours() {
  static SLibDCameraTourInfo info = [] {
    SLibDCameraTourInfo all;
    for (int tour = 1; tour <= kTours; ++tour) all.tours[tour].sequence = {1, 2};
    return all;
  }();
  return info;
}

SLibDShadowTourInfo& shadow_tours() {
  static SLibDShadowTourInfo info = [] {
    SLibDShadowTourInfo all;
    for (int tour = 1; tour <= kTours; ++tour) all.tours[tour] = {};
    return all;
  }();
  return info;
}

SLibDEdgeStorageMode& recording_mode() {
  static SLibDEdgeStorageMode mode{true, 1, 0, 0, "10.0.0.1"};
  return mode;
}

SLibDDetectionParam& detection() {
  static SLibDDetectionParam setting = [] {
    SLibDDetectionParam whole;
    whole.number = 1;
    for (SLibDDetectionWindow& window : whole.windows) {
      window.area = {{0, 0}, {320, 192}};
      window.enabled = 1;
      window.mode = 0;
      window.minObjectWidth = window.minObjectHeight = 10;
      window.maxObjectWidth = window.maxObjectHeight = 100;
      window.sensitivity = 50;
    }
    return whole;
  }();
  return setting;
}

SLibDPinInfo& output() {
  static SLibDPinInfo pin{1, PIN_TYPE_SENSOR_INPUT, true, 1, 0, false};
  return pin;
}

constexpr Operation kSettings[] = {
    {"SetVideoStandard", [](D& driver) { return driver.SetVideoStandard(LIBD_VIDEO_NTSC); }},
    {"SetSolidPTZState", [](D& driver) { return driver.SetSolidPTZState(true); }},
    {"SetImageMaxSize", [](D& driver) { return driver.SetImageMaxSize(1280, 720, LIBD_VIDEO_NTSC); }},
    {"SetVMDtype", [](D& driver) { return driver.SetVMDtype(LIBD_VMD_WINDOW); }},
    {"SetOutput", [](D& driver) { return driver.SetOutput(output()); }},
    {"SetDetectionParam", [](D& driver) { return driver.SetDetectionParam(detection()); }},
    {"SetEdgeStorageMode", [](D& driver) { return driver.SetEdgeStorageMode(recording_mode()); }},
    {"SetEdgeStorageNoTearDown", [](D& driver) { return driver.SetEdgeStorageNoTearDown(false); }},
    {"DeleteAllEdgeStorageRecord", plain<&D::DeleteAllEdgeStorageRecord>},
    {"SetCameraInfo", with<SLibDCameraInfo, &D::SetCameraInfo>},
    {"SetAudioInfo", with<SLibDAudioInfo, &D::SetAudioInfo>},
    {"SetPTZControlInfo", with<SLibDPTZControlInfo, &D::SetPTZControlInfo>},
    {"SetCameraTourInfo", [](D& driver) { return driver.SetCameraTourInfo(tours()); }},
    {"SetShadowTourInfo", [](D& driver) { return driver.SetShadowTourInfo(shadow_tours()); }},
    {"SetVidCapSize", [](D& driver) { return driver.SetVidCapSize(1920, 1080); }},
    {"SetDayNightMode", [](D& driver) { return driver.SetDayNightMode(LIBD_DAYNIGHT_AUTO); }},
    {"SetVisibilityEnhancerMode",
     [](D& driver) { return driver.SetVisibilityEnhancerMode(host_record<ELibDVisibilityEnhancerType>()); }},
    {"SetXdnrMode", [](D& driver) { return driver.SetXdnrMode(LIBD_XDNR_LOW); }},
    {"SetViewDR", [](D& driver) { return driver.SetViewDR(LIBD_VIEWDR_ON); }},
    {"SetIRIlluminator", [](D& driver) { return driver.SetIRIlluminator(LIB_IR_DAYNIGHT, 50); }},
    {"SetBackLightCompMode", [](D& driver) { return driver.SetBackLightCompMode(true); }},
    {"SetFocusMode", [](D& driver) { return driver.SetFocusMode(true); }},
    {"SetPositionMode", [](D& driver) { return driver.SetPositionMode(LIBD_POSITION_CURRENT); }},
    {"SetTamperingAlarm", [](D& driver) { return driver.SetTamperingAlarm(true, LIBD_TAMPER_LOW); }},
    {"SetAudioDetection", [](D& driver) { return driver.SetAudioDetection(true); }},
};

void set(Run& run, CLibraryDevice& driver) {
  connect(run, driver);
  run.expect("GetCameraInfo", driver.GetCameraInfo(host_record<SLibDCameraInfo>()));
  run.expect("GetAudioInfo", driver.GetAudioInfo(host_record<SLibDAudioInfo>()));
  run_all(run, driver, kSettings);
}

SLibDPTZControlInfo& by_shutter() {
  static SLibDPTZControlInfo control = [] {
    SLibDPTZControlInfo shutter;
    shutter.brightMode = "Shutter Priority";
    return shutter;
  }();
  return control;
}

const SLibDResolutionInfo kPicture{"1280x720", 1280, 720};

constexpr Operation kMoves[] = {
    {"PanTilt", [](D& driver) { return driver.PanTilt(2000, 0); }},
    {"PanTilt to a stop", [](D& driver) { return driver.PanTilt(0, 0); }},
    {"PanTiltAbsolute", [](D& driver) { return driver.PanTiltAbsolute(100, 100); }},
    {"Zoom", [](D& driver) { return driver.Zoom(0); }},
    {"ZoomAbsolute", [](D& driver) { return driver.ZoomAbsolute(100); }},
    {"Focus", [](D& driver) { return driver.Focus(0); }},
    {"PanTiltDirect", [](D& driver) { return driver.PanTiltDirect(5000, 5000, kPicture); }},
    {"ZoomRelative", [](D& driver) { return driver.ZoomRelative(10); }},
    {"ZoomArea", [](D& driver) { return driver.ZoomArea(5000, 5000, 1000, 1000, kPicture); }},
    {"FocusAbsolute", [](D& driver) { return driver.FocusAbsolute(100); }},
    {"SetBrightMode", [](D& driver) { return driver.SetBrightMode(by_shutter().brightMode); }},
    {"Bright",
     [](D& driver) {
       const ELibDReturnCode stored = driver.SetPTZControlInfo(by_shutter());
       return stored == LIBD_OK ? driver.Bright(1) : stored;
     }},
    {"BrightAbsolute",
     [](D& driver) {
       const ELibDReturnCode stored = driver.SetPTZControlInfo(by_shutter());
       return stored == LIBD_OK ? driver.BrightAbsolute(5000) : stored;
     }},
    {"SetPreset", [](D& driver) { return driver.SetPreset(preset()); }},
    {"RecallPreset", [](D& driver) { return driver.RecallPreset(0); }},
    {"ClearPreset", [](D& driver) { return driver.ClearPreset(0); }},
    {"StartRecordShadowTour", [](D& driver) { return driver.StartRecordShadowTour(1); }},
    {"StopRecordShadowTour", plain<&D::StopRecordShadowTour>},
    {"StartShadowTour", [](D& driver) { return driver.StartShadowTour(1); }},
    {"StopShadowTour", plain<&D::StopShadowTour>},
    {"StartPreviewShadowTour", [](D& driver) { return driver.StartPreviewShadowTour(1); }},
    {"StopPreviewShadowTour", plain<&D::StopPreviewShadowTour>},
};

void move(Run& run, CLibraryDevice& driver) {
  connect(run, driver);
  run_all(run, driver, kMoves);
}

struct CountingSink : CDataSink {
  void Write(const unsigned char*, unsigned int) override { ++frames; }
  int frames = 0;
};

// Takes frames until enough have come or the stream ends.
void take_frames(Run& run, CLibraryDevice& driver) {
  CountingSink sink;
  SLibDVideoFrameInfo frame;
  frame.sink = &sink;
  const auto deadline = Clock::now() + kLongestWait;
  ELibDReturnCode code = LIBD_NO_FRAME;
  while (sink.frames < kFrames && Clock::now() < deadline && (code == LIBD_OK || code == LIBD_NO_FRAME)) {
    code = driver.GetCurrentVideoFrame(frame);
    if (code == LIBD_NO_FRAME) poll(nullptr, 0, 3);
  }
  run.expect("GetCurrentVideoFrame", sink.frames >= kFrames ? LIBD_OK : code);
}

void begin_video(Run& run, CLibraryDevice& driver, int transport) {
  connect_to(run, driver, kCamera, transport);
  run.expect("GetCameraInfo", driver.GetCameraInfo(host_record<SLibDCameraInfo>()));
  const ELibDReturnCode started = driver.StartVideoStreaming();
  run.expect("StartVideoStreaming", started);
  if (started == LIBD_OK) take_frames(run, driver);
}

void rtp(Run& run, CLibraryDevice& driver) {
  begin_video(run, driver, 1);
  run.expect("StopVideoStreaming", driver.StopVideoStreaming());
}

void http(Run& run, CLibraryDevice& driver) {
  begin_video(run, driver, 0);
  run.expect("StopVideoStreaming", driver.StopVideoStreaming());
}

// The driver is destroyed while it streams.
void abandoned(Run& run, CLibraryDevice& driver) { begin_video(run, driver, 1); }

// A host that waits for frames instead of polling.
void waiting(Run& run, CLibraryDevice& device) {
  auto& driver = dynamic_cast<CVexaCommon&>(device);
  connect(run, driver);
  run.expect("GetCameraInfo", driver.GetCameraInfo(host_record<SLibDCameraInfo>()));
  SetPromptFrames(driver, true);
  {
    WaitSet set;
    run.expect_true("WaitSet::Add", set.Add(driver));
    run.expect_true("WaitSet::Descriptor", set.Descriptor() >= 0);
    run.expect_true("VideoFrameDescriptor", VideoFrameDescriptor(driver) >= 0);
    const ELibDReturnCode started = driver.StartVideoStreaming();
    run.expect("StartVideoStreaming", started);
    if (started == LIBD_OK) {
      auto& ready = host_record<std::vector<ReadyDriver>>();
      ready.reserve(4);
      run.expect_true("WaitSet::Wait", set.Wait(ready, 1000) >= 0);
      WaitForVideoFrame(driver, 1000);
      take_frames(run, driver);
      GetStreamStatistics(driver, host_record<StreamStatistics>());
    }
    run.expect("StopVideoStreaming", driver.StopVideoStreaming());
  }
  SetPromptFrames(driver, false);
}

void playback(Run& run, CLibraryDevice& driver) {
  connect(run, driver);
  auto& list = host_record<SLibDEdgeStorageRecordList>();
  run.expect("GetEdgeStorageRecordList", driver.GetEdgeStorageRecordList(list));
  if (list.records.empty()) return run.expect("recordings", LIBD_FAILED);
  auto& recording = host_record<SLibDEdgeStorageStreamingInfo>();
  recording.streamName = list.records.front().streamName;
  recording.codecName = "H.264";
  const ELibDReturnCode started = driver.StartEdgeStorageVideoStreaming(recording);
  run.expect("StartEdgeStorageVideoStreaming", started);
  if (started == LIBD_OK) take_frames(run, driver);
  run.expect("StopVideoStreaming", driver.StopVideoStreaming());
}

void audio(Run& run, CLibraryDevice& driver) {
  connect(run, driver);
  run.expect("GetAudioInfo", driver.GetAudioInfo(host_record<SLibDAudioInfo>()));
  run.expect("StartAudioStreaming", driver.StartAudioStreaming());
  unsigned char bytes[4096];
  SLibDAudioFrameInfo frame;
  frame.data = bytes;
  frame.capacity = sizeof(bytes);
  const ELibDReturnCode code = driver.GetCurrentAudioFrame(frame);
  run.expect("GetCurrentAudioFrame", code == LIBD_NO_FRAME ? LIBD_OK : code);
  run.expect("StopAudioStreaming", driver.StopAudioStreaming());
}

void polled(Run& run, CLibraryDevice& driver) {
  connect(run, driver);
  run.expect("StartIoStreaming", driver.StartIoStreaming());
  const ELibDReturnCode status = driver.GetCurrentIoStatus(host_record<std::vector<SLibDPinInfo>>());
  run.expect("GetCurrentIoStatus", status == LIBD_NO_FRAME ? LIBD_OK : status);
  run.expect("StopIoStreaming", driver.StopIoStreaming());
  run.expect("StartModRawData", driver.StartModRawData());
  const ELibDReturnCode motion = driver.GetCurrentPosition(host_record<SLibDRawMDFrameInfo>());
  run.expect("GetCurrentPosition", motion == LIBD_NO_FRAME ? LIBD_OK : motion);
  run.expect("StopModRawData", driver.StopModRawData());
}

void use_thread(Run& run) {
  typedHandle* const thread = _beginthreadex(
      nullptr, 0, [](void*) -> unsigned { return 7; }, nullptr, 0, nullptr);
  run.expect_true("_beginthreadex", thread != nullptr);
  if (thread == nullptr) return;
  unsigned long code = kStillActive;
  const auto deadline = Clock::now() + kLongestWait;
  while (code == kStillActive && Clock::now() < deadline && GetExitCodeThread(thread, &code) != 0) poll(nullptr, 0, 1);
  run.expect_true("GetExitCodeThread", code == 7);
  CloseHandle(thread);
}

void use_event(Run& run) {
  typedHandle* const event = CreateEvent(nullptr, 1, 0, nullptr);
  run.expect_true("CreateEvent", event != nullptr);
  if (event == nullptr) return;
  run.expect_true("SetEvent", SetEvent(event) != 0);
  run.expect_true("WaitForSingleObject", WaitForSingleObject(event, 100) == 0);
  run.expect_true("ResetEvent", ResetEvent(event) != 0);
  CloseHandle(event);
}

void use_files(Run& run) {
  typedHandle* const file =
      CreateFile("torture.tmp", GENERIC_READ | GENERIC_WRITE, 0, nullptr, CREATE_ALWAYS, 0, nullptr);
  run.expect_true("CreateFile", file != nullptr);
  if (file != nullptr) {
    unsigned long count = 0;
    run.expect_true("WriteFile", WriteFile(file, "text", 4, &count, nullptr) != 0 && count == 4);
    run.expect_true("FlushFileBuffers", FlushFileBuffers(file) != 0);
    SetFilePointer(file, 0, nullptr, FILE_BEGIN);
    char text[4] = {};
    run.expect_true("ReadFile", ReadFile(file, text, 4, &count, nullptr) != 0 && count == 4);
    CloseHandle(file);
  }
  run.expect_true("MoveFile", MoveFile("torture.tmp", "torture.moved") != 0);
  auto& found = host_record<_WIN32_FIND_DATA>();
  typedHandle* const search = FindFirstFile("torture.m*", &found);
  run.expect_true("FindFirstFile", search != nullptr);
  if (search != nullptr) FindClose(search);
  run.expect_true("DeleteFile", DeleteFile("torture.moved") != 0 || DeleteFile("torture.tmp") != 0);
}

void runtime_layer(Run& run, CLibraryDevice&) {
  use_event(run);
  use_thread(run);
  use_files(run);
}

void logger(Run& run, CLibraryDevice& driver) {
  run.expect("SetCGILogPath", driver.SetCGILogPath("torture.log"));
  run.expect("SetCGILogLevel", driver.SetCGILogLevel(true));
  connect(run, driver);
  run.expect("GetCurrentSystemInfo", driver.GetCurrentSystemInfo(host_record<SLibDSystemInfo>()));
  run.expect("SetCGILogLevel off", driver.SetCGILogLevel(false));
}

}  // namespace

const std::vector<Scenario>& usual_scenarios() {
  static const std::vector<Scenario> scenarios = {
      {"inquire", inquire},   {"set", set},     {"move", move},       {"named", named},
      {"rtp", rtp},           {"http", http},   {"waiting", waiting}, {"abandoned", abandoned},
      {"playback", playback}, {"audio", audio}, {"polled", polled},   {"runtime", runtime_layer},
      {"logger", logger},
  };
  return scenarios;
}

}  // namespace vexa::torture
