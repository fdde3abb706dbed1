// SPDX-License-Identifier: Apache-2.0
// Calls that wait for a camera which does not answer, and their cancels.
#include "vexa/cancel.h"

#include <gtest/gtest.h>

#include <atomic>
#include <chrono>
#include <csignal>
#include <functional>
#include <future>
#include <memory>
#include <string>
#include <thread>
#include <vector>

#include "tests/media/live_camera.h"
#include "tests/support/process_state.h"
#include "tests/support/scripted_camera.h"
#include "vexa/failure.h"

namespace vexa_test {
namespace {

using vexa::camera::RequestFault;
using namespace std::chrono_literals;

constexpr int kEndless = 600000;  // milliseconds
// A call that a cancel ends returns within 100 ms; a machine under load gets more, and still no call reaches its end.
constexpr auto kSoon = 20s;

/// A driver of a camera that has everything.
class CancelDriver : public MediaDriver {
 public:
  CancelDriver() {
    m_EdgeStorageSupported = true;
    m_FixedPTZControlInfo.presetCount = m_FixedPTZControlInfo.tourCount = m_FixedPTZControlInfo.shadowTourCount = 2;
    m_FixedIoBoxInfo.tamperingDetection = m_FixedIoBoxInfo.audioDetection = true;
    m_PTZControlInfo.brightMode = "Shutter Priority";
    m_State->teardown_timeout = kEndless;
  }
};

using Call = std::function<ELibDReturnCode(CancelDriver&)>;

struct CallRow {
  const char* name;
  Call call;
};

template <typename Record>
Call reads(ELibDReturnCode (CVexaCommon::*read)(Record&)) {
  return [read](CancelDriver& driver) {
    Record record{};
    return (driver.*read)(record);
  };
}

template <typename Value>
Call sets(ELibDReturnCode (CVexaCommon::*set)(Value), Value value) {
  return [set, value](CancelDriver& driver) { return (driver.*set)(value); };
}

Call does(ELibDReturnCode (CVexaCommon::*act)()) {
  return [act](CancelDriver& driver) { return (driver.*act)(); };
}

std::vector<CallRow> calls() {
  using D = CVexaCommon;
  return {
      {"GetCurrentSystemInfo", reads<SLibDSystemInfo>(&D::GetCurrentSystemInfo)},
      {"GetCameraInfo", reads<SLibDCameraInfo>(&D::GetCameraInfo)},
      {"SetCameraInfo", reads<SLibDCameraInfo>(&D::SetCameraInfo)},
      {"SetBackLightCompMode", sets<bool>(&D::SetBackLightCompMode, true)},
      {"Bright", sets<int>(&D::Bright, 1)},
      {"GetDayNightMode", reads<ELibDDayNightType>(&D::GetDayNightMode)},
      {"SetDayNightMode", sets<ELibDDayNightType>(&D::SetDayNightMode, LIBD_DAYNIGHT_AUTO)},
      {"GetXdnrMode", reads<ELibDXdnrType>(&D::GetXdnrMode)},
      {"SetXdnrMode", sets<ELibDXdnrType>(&D::SetXdnrMode, LIBD_XDNR_LOW)},
      {"SetViewDR", sets<ELibDViewDRMode>(&D::SetViewDR, LIBD_VIEWDR_ON)},
      {"Zoom", sets<int>(&D::Zoom, 0)},
      {"SetFocusMode", sets<bool>(&D::SetFocusMode, true)},
      {"GetPresets", reads<std::vector<SLibDPresetInfo>>(&D::GetPresets)},
      {"RecallPreset", sets<int>(&D::RecallPreset, 1)},
      {"GetCameraTourInfo", reads<SLibDCameraTourInfo>(&D::GetCameraTourInfo)},
      {"GetShadowTourInfo", reads<SLibDShadowTourInfo>(&D::GetShadowTourInfo)},
      {"StopShadowTour", does(&D::StopShadowTour)},
      {"GetIoBoxInfo", reads<SLibDIoBoxInfo>(&D::GetIoBoxInfo)},
      {"SetOutput", reads<SLibDPinInfo>(&D::SetOutput)},
      {"StartIoStreaming", does(&D::StartIoStreaming)},
      {"StartAudioStreaming", does(&D::StartAudioStreaming)},
      {"StartModRawData", does(&D::StartModRawData)},
      {"GetObjectDetectionSetting",
       [](CancelDriver& driver) {
         std::vector<SLibDDetectionParam> settings;
         auto mode = LIBD_POSITION_PRESET;
         return driver.GetObjectDetectionSetting(settings, mode);
       }},
      {"SetTamperingAlarm", [](CancelDriver& driver) { return driver.SetTamperingAlarm(true, LIBD_TAMPER_LOW); }},
      {"SetAudioDetection", sets<bool>(&D::SetAudioDetection, true)},
      {"SetEdgeStorageMode",
       [](CancelDriver& driver) {
         SLibDEdgeStorageMode mode;
         mode.enabled = true;
         return driver.SetEdgeStorageMode(mode);
       }},
      {"GetEdgeStorageRecordList", reads<SLibDEdgeStorageRecordList>(&D::GetEdgeStorageRecordList)},
      {"DeleteAllEdgeStorageRecord", does(&D::DeleteAllEdgeStorageRecord)},
      {"StartVideoStreaming", does(&D::StartVideoStreaming)},
      {"StartEdgeStorageVideoStreaming",
       [](CancelDriver& driver) {
         SLibDEdgeStorageStreamingInfo recording;
         recording.streamName = "video1";
         recording.codecName = "H.264";
         return driver.StartEdgeStorageVideoStreaming(recording);
       }},
  };
}

std::size_t requests(LiveCamera& camera) { return camera->journal().snapshot().size(); }

bool was_asked(LiveCamera& camera, const std::string& text) { return camera->journal().wait_for_count(text, 1, 30s); }

/// Whether a call ended before `kSoon`; when it did not, the camera is made to answer by its end.
template <typename Result>
bool ended(LiveCamera& camera, std::future<Result>& call) {
  if (call.wait_for(kSoon) == std::future_status::ready) return true;
  camera->stop();
  call.wait();
  return false;
}

/// Cancels the call at its request number `step`, from 1. False when the call makes fewer.
bool cancel_at(LiveCamera& camera, const CallRow& row, std::uint32_t step) {
  CancelDriver driver;
  camera.introduce(driver, kEndless);
  camera->clear_request_faults();
  camera->add_request_fault(RequestFault::no_answer("").nth(step));
  const std::size_t before = requests(camera);
  auto call = std::async(std::launch::async, [&] { return row.call(driver); });
  const auto is_over = [&] { return call.wait_for(0s) == std::future_status::ready; };
  EXPECT_TRUE(eventually([&] { return requests(camera) >= before + step || is_over(); }));
  const bool reached = !is_over();
  vexa::Cancel(driver);
  EXPECT_TRUE(ended(camera, call)) << row.name << " at request " << step;
  const ELibDReturnCode code = call.get();
  camera->clear_request_faults();
  if (reached && code != LIBD_OK) {
    const vexa::FailureReport failure = vexa::LastFailure(driver);
    EXPECT_TRUE(failure.cancelled) << row.name << " at request " << step;
    EXPECT_EQ(failure.operation, row.name) << " at request " << step;
    EXPECT_EQ(failure.code, code) << row.name << " at request " << step;
  }
  driver.state().teardown_timeout = 0;
  return reached;
}

using Cancel = LiveVideo<CancelDriver>;
using CancelToken = Cancel;
using GonePeer = Cancel;

/// The same, and the camera has seen the TEARDOWN of what was started: it would count as the next call's first request.
bool cancel_alone_at(LiveCamera& camera, const CallRow& row, std::uint32_t step) {
  const bool reached = cancel_at(camera, row, step);
  EXPECT_TRUE(eventually([&] { return camera->sessions() == 0; }));
  return reached;
}

TEST_F(Cancel, EndsEachOperationAtEachOfItsRequests) {
  for (const CallRow& row : calls()) {
    std::uint32_t step = 1;
    while (cancel_alone_at(camera(), row, step) && step < 20) ++step;
    EXPECT_GT(step, 1u) << row.name << " asks nothing";
    EXPECT_LT(step, 20u) << row.name;
  }
}

TEST_F(Cancel, LeavesNoDescriptorBehind) {
  const FullListener camera;
  driver_.use(camera.host(), camera.port(), kEndless);
  const std::size_t descriptors = open_descriptors();
  const CallRow inquiry = calls().front();
  auto call = std::async(std::launch::async, [&] { return inquiry.call(driver_); });
  ASSERT_TRUE(eventually([&] { return open_descriptors() > descriptors + 1; }));
  vexa::Cancel(driver_);
  ASSERT_EQ(call.wait_for(kSoon), std::future_status::ready);
  EXPECT_EQ(call.get(), LIBD_TIMEOUT);
  EXPECT_EQ(driver_.LatestErrorText(), "Connection timed out");
  EXPECT_EQ(open_descriptors(), descriptors);
}

TEST_F(Cancel, ReturnsTheCodeOfACameraThatDoesNotAnswer) {
  introduce(kEndless);
  camera()->add_request_fault(RequestFault::no_answer("DESCRIBE"));
  auto start = std::async(std::launch::async, [&] { return driver_.StartVideoStreaming(); });
  ASSERT_TRUE(was_asked(camera(), "DESCRIBE"));
  vexa::Cancel(driver_);
  ASSERT_TRUE(ended(camera(), start));
  EXPECT_EQ(start.get(), LIBD_STREAM_OPEN_FAILED);
  const vexa::FailureReport failure = vexa::LastFailure(driver_);
  EXPECT_EQ(failure.code, LIBD_STREAM_OPEN_FAILED);
  EXPECT_EQ(failure.text, "Receive timed out");
  EXPECT_EQ(failure.operation, "StartVideoStreaming");
  EXPECT_EQ(failure.camera, camera()->address() + ":" + std::to_string(camera()->http_port()));
  EXPECT_TRUE(failure.cancelled);
  EXPECT_EQ(driver_.ConnectionTimeout(), kEndless);
  EXPECT_EQ(driver_.m_RtspSocket, -1);
}

TEST_F(Cancel, OfAStartOfAlarmsLeavesTheTimeOut) {
  introduce(kEndless);
  camera()->add_request_fault(RequestFault::no_answer("alarmdata.cgi"));
  auto start = std::async(std::launch::async, [&] { return driver_.StartIoStreaming(); });
  ASSERT_TRUE(was_asked(camera(), "alarmdata.cgi"));
  vexa::Cancel(driver_);
  ASSERT_TRUE(ended(camera(), start));
  EXPECT_NE(start.get(), LIBD_OK);
  EXPECT_TRUE(vexa::LastFailure(driver_).cancelled);
  EXPECT_EQ(driver_.ConnectionTimeout(), kEndless);
}

TEST_F(Cancel, DoesNotTouchWhatBeginsAfterwards) {
  introduce();
  vexa::Cancel(driver_);
  SLibDCameraInfo info;
  EXPECT_EQ(driver_.GetCameraInfo(info), LIBD_OK);
  EXPECT_EQ(vexa::LastFailure(driver_).code, LIBD_OK);
}

TEST_F(Cancel, LeavesVideoThatPlays) {
  play();
  vexa::Cancel(driver_);
  EXPECT_EQ(FrameTaker().take_all(driver_, 3).size(), 3u);
  driver_.state().teardown_timeout = 15000;
  EXPECT_EQ(driver_.StopVideoStreaming(), LIBD_OK);
}

TEST_F(Cancel, OfAStopSendsTearDownAndDoesNotWait) {
  play();
  camera()->add_request_fault(RequestFault::no_answer("TEARDOWN"));
  auto stop = std::async(std::launch::async, [&] { return driver_.StopVideoStreaming(); });
  ASSERT_TRUE(was_asked(camera(), "TEARDOWN"));
  vexa::Cancel(driver_);
  ASSERT_TRUE(ended(camera(), stop));
  EXPECT_EQ(stop.get(), LIBD_OK);
  const vexa::FailureReport failure = vexa::LastFailure(driver_);
  EXPECT_TRUE(failure.cancelled);
  EXPECT_EQ(failure.code, LIBD_TIMEOUT);
  EXPECT_EQ(failure.operation, "StopVideoStreaming");
  EXPECT_EQ(driver_.m_RtspSocket, -1);
}

TEST_F(Cancel, EndsTheCallsOfAllThreadsAtOnce) {
  introduce(kEndless);
  camera()->add_request_fault(RequestFault::no_answer(""));
  std::vector<std::future<ELibDReturnCode>> waiting;
  waiting.push_back(std::async(std::launch::async, [&] { return driver_.StartVideoStreaming(); }));
  waiting.push_back(std::async(std::launch::async, [&] { return driver_.StartAudioStreaming(); }));
  waiting.push_back(std::async(std::launch::async, [&] { return driver_.StartIoStreaming(); }));
  for (int i = 0; i < 3; ++i) {
    waiting.push_back(std::async(std::launch::async, [&] {
      SLibDSystemInfo info;
      return driver_.GetCurrentSystemInfo(info);
    }));
  }
  ASSERT_TRUE(eventually([&] { return requests(camera()) == waiting.size(); }));
  vexa::Cancel(driver_);
  for (auto& call : waiting) {
    EXPECT_TRUE(ended(camera(), call));
    EXPECT_NE(call.get(), LIBD_OK);
  }
}

TEST_F(Cancel, EndsAStopThatWaitsForAStart) {
  introduce(kEndless);
  camera()->add_request_fault(RequestFault::no_answer("DESCRIBE"));
  auto start = std::async(std::launch::async, [&] { return driver_.StartVideoStreaming(); });
  ASSERT_TRUE(was_asked(camera(), "DESCRIBE"));
  std::atomic<long> stopper{0};
  auto stop = std::async(std::launch::async, [&] {
    stopper = kernel_thread_id();
    return driver_.StopVideoStreaming();
  });
  EXPECT_TRUE(eventually([&] { return stopper != 0 && is_sleeping(stopper); }));
  vexa::Cancel(driver_);
  EXPECT_TRUE(ended(camera(), start));
  EXPECT_TRUE(ended(camera(), stop));
  EXPECT_EQ(stop.get(), LIBD_OK);
}

TEST_F(Cancel, FromManyThreadsWhileCallsComeAndGo) {
  introduce(kEndless);
  std::atomic<bool> over{false};
  std::vector<std::thread> cancellers;
  for (int i = 0; i < 3; ++i) {
    cancellers.emplace_back([&] {
      while (!over) {
        vexa::Cancel(driver_);
        std::this_thread::sleep_for(1ms);
      }
    });
  }
  std::vector<std::thread> callers;
  for (int i = 0; i < 3; ++i) {
    callers.emplace_back([&] {
      for (int call = 0; call < 20; ++call) {
        SLibDCameraInfo info;
        const ELibDReturnCode code = driver_.GetCameraInfo(info);
        EXPECT_TRUE(code == LIBD_OK || code == LIBD_TIMEOUT || code == LIBD_FAILED) << code;
        static_cast<void>(vexa::LastFailure(driver_));
      }
    });
  }
  for (std::thread& caller : callers) caller.join();
  over = true;
  for (std::thread& canceller : cancellers) canceller.join();
}

TEST_F(CancelToken, EndsWhatWaitsAndWhatBeginsUntilItIsReset) {
  introduce(kEndless);
  vexa::CancelToken token;
  vexa::SetCancelToken(driver_, token);
  camera()->add_request_fault(RequestFault::no_answer("inq=camera"));
  SLibDCameraInfo info;
  auto inquiry = std::async(std::launch::async, [&] { return driver_.GetCameraInfo(info); });
  ASSERT_TRUE(was_asked(camera(), "inq=camera"));
  token.Cancel();
  EXPECT_TRUE(token.IsCancelled());
  ASSERT_TRUE(ended(camera(), inquiry));
  EXPECT_NE(inquiry.get(), LIBD_OK);
  const std::size_t asked = requests(camera());
  for (const CallRow& row : calls()) {
    EXPECT_NE(row.call(driver_), LIBD_OK) << row.name;
    EXPECT_TRUE(vexa::LastFailure(driver_).cancelled) << row.name;
    EXPECT_EQ(vexa::LastFailure(driver_).operation, row.name);
  }
  EXPECT_EQ(requests(camera()), asked);
  token.Reset();
  EXPECT_FALSE(token.IsCancelled());
  camera()->clear_request_faults();
  EXPECT_EQ(driver_.GetCameraInfo(info), LIBD_OK);
}

TEST_F(CancelToken, IsOneForManyDriversAndMayEndBeforeThem) {
  std::vector<std::unique_ptr<CancelDriver>> drivers;
  auto token = std::make_unique<vexa::CancelToken>();
  for (int i = 0; i < 5; ++i) {
    drivers.push_back(std::make_unique<CancelDriver>());
    camera().introduce(*drivers.back());
    vexa::SetCancelToken(*drivers.back(), *token);
  }
  token->Cancel();
  token.reset();
  SLibDCameraInfo info;
  for (const auto& driver : drivers) {
    EXPECT_NE(driver->GetCameraInfo(info), LIBD_OK);
    vexa::RemoveCancelToken(*driver);
    EXPECT_EQ(driver->GetCameraInfo(info), LIBD_OK);
    vexa::RemoveCancelToken(*driver);
  }
}

vexa::CancelToken* handled = nullptr;

TEST_F(CancelToken, IsCancelledByASignalHandler) {
  introduce();
  vexa::CancelToken token;
  vexa::SetCancelToken(driver_, token);
  handled = &token;
  struct sigaction before {};
  struct sigaction action {};
  action.sa_handler = [](int) { handled->Cancel(); };
  sigaction(SIGUSR1, &action, &before);
  raise(SIGUSR1);
  SLibDCameraInfo info;
  EXPECT_NE(driver_.GetCameraInfo(info), LIBD_OK);
  EXPECT_TRUE(vexa::LastFailure(driver_).cancelled);
  sigaction(SIGUSR1, &before, nullptr);
}

TEST_F(CancelToken, LetsAStopSendTearDown) {
  vexa::CancelToken token;
  vexa::SetCancelToken(driver_, token);
  play();
  camera()->add_request_fault(RequestFault::no_answer("TEARDOWN"));
  token.Cancel();
  EXPECT_EQ(driver_.StopVideoStreaming(), LIBD_OK);
  EXPECT_TRUE(was_asked(camera(), "TEARDOWN"));
}

// ---- Peers that have gone ----

TEST_F(GonePeer, EndsAStopAtOnce) {
  play();
  camera()->stop();
  auto stop = std::async(std::launch::async, [&] { return driver_.StopVideoStreaming(); });
  ASSERT_EQ(stop.wait_for(kSoon), std::future_status::ready);
  EXPECT_EQ(stop.get(), LIBD_OK);
  EXPECT_FALSE(vexa::LastFailure(driver_).cancelled);
}

TEST_F(GonePeer, EndsAStartWithTheCodeAndTextOfSilence) {
  for (const char* request : {"DESCRIBE", "SETUP", "PLAY"}) {
    LiveCamera camera(camera_options());
    CancelDriver driver;
    camera.introduce(driver, kEndless);
    camera->add_request_fault(RequestFault::cut_after(request, 10));
    auto start = std::async(std::launch::async, [&] { return driver.StartVideoStreaming(); });
    ASSERT_TRUE(ended(camera, start)) << request;
    EXPECT_EQ(start.get(), LIBD_STREAM_OPEN_FAILED) << request;
    EXPECT_EQ(driver.LatestErrorText(), "Receive timed out") << request;
    EXPECT_FALSE(vexa::LastFailure(driver).cancelled);
  }
}

}  // namespace
}  // namespace vexa_test
