#include "vexa/vexa_common.h"

#include <cerrno>
#include <cstring>
#include <new>

#include "device/driver_state.h"
#include "runtime/base/sync.h"
#include "transport/failure.h"
#include "vexa/runtime.h"

namespace {

/// Room for what a camera commonly lists, so that filling a record does not allocate again.
constexpr std::size_t kListRoom = 32;

/// The code of the exchange that this thread is in. What other threads do with the same driver meanwhile (the streaming
/// thread always does something) must not change the result of this one's operation.
struct OwnCode {
  unsigned driver = 0;
  ELibDReturnCode code = LIBD_FAILED;
};
thread_local OwnCode own_code;

/// Room for every text of an error, so that recording one does not allocate.
constexpr std::size_t kErrorRoom = 1024;

template <typename... Lists>
void reserve_lists(Lists&... lists) {
  (lists.reserve(kListRoom), ...);
}

/// Bytes set aside for a camera's answer, by the name of the inquiry.
const std::map<std::string, int> kInquirySizes = {
    {"system", 10240},           {"network", 10240}, {"camera", 8192},
    {"presetposition", 131072},  {"sensor", 512},    {"lod", 1024},
    {"objectdetection", 524288}, {"a-slot", 512},    {"edgestorage", 1024},
    {"audiodetection", 512}};

}  // namespace

CVexaCommon::CVexaCommon() : m_InquirySizes(kInquirySizes), m_State(std::make_unique<vexa::DriverState>()) {
  reserve_lists(m_FixedCameraInfo.codecs, m_FixedCameraInfo.reserved2, m_FixedCameraInfo.reserved4);
  reserve_lists(m_FixedAudioInfo.inputCodecs, m_FixedAudioInfo.outputCodecs, m_FixedAudioInfo.reserved3,
                m_FixedAudioInfo.reserved4);
  reserve_lists(m_FixedPTZControlInfo.reserved1, m_FixedPTZControlInfo.zoomSteps, m_FixedPTZControlInfo.brightModes,
                m_FixedPTZControlInfo.dayNightModes);
  reserve_lists(m_IoBoxInfo.pins, m_IoBoxInfo.detections1, m_IoBoxInfo.detections2);
  m_LatestErrorText.reserve(kErrorRoom);
  m_StopVideoEvent = CreateEvent(nullptr, 1, 0, nullptr);
}

CVexaCommon::~CVexaCommon() {
  CVexaCommon::StopVideoStreaming();
  CVexaCommon::StopAudioStreaming();
  CVexaCommon::StopIoStreaming();
  // Kept: the motion-metadata stream is the host's to stop; a driver's end leaves it open.
  ReleaseRtpPacketsPtr();
  ReleaseStreamBuffer();
  delete[] m_StagingBuffer;
  CloseHandle(m_StopVideoEvent);
}

// Safe: a text that memory does not hold is a failure and not an exception, and stays the latest one.
ELibDReturnCode CVexaCommon::GetLatestErrorText(std::string& text) try {
  text = LatestErrorText();
  return LIBD_OK;
} catch (const std::bad_alloc&) {
  return LIBD_FAILED;
}

ELibDReturnCode CVexaCommon::GetCameraType(ELibCameraType type) {
  return (m_CameraType & static_cast<std::uint32_t>(type)) != 0 ? LIBD_OK : LIBD_FAILED;
}

ELibDReturnCode CVexaCommon::SetCameraInfoFromID(unsigned int id) {
  if (m_FixedCameraInfo.streamCount1 < 2 && m_FixedCameraInfo.streamCount2 < 2) return LIBD_OK;
  return SendCommand("/command/camera.cgi?ImageCodec%d=off", static_cast<int>(id));
}

ELibDReturnCode CVexaCommon::InitializeFixedVideoParams(ELibDVideoStandard, int, int) { return LIBD_OK; }

int CVexaCommon::Fail(const vexa::Failure& failure) {
  const vexa::Guard guard(m_State->error_lock);
  if (failure.code != LIBD_FAILED) {
    m_LatestErrorCode = failure.code;
    own_code = {m_State->number, failure.code};
  }
  m_LatestErrorText = failure.text;
  return -1;
}

int CVexaCommon::FailSystem() { return FailSystem(errno); }

int CVexaCommon::FailSystem(int error) {
  char text[256];
  // The GNU form: answers where the text is.
  return Fail({LIBD_FAILED, strerror_r(error, text, sizeof text)});
}

ELibDReturnCode CVexaCommon::FailMemory() {
  ClearLatestError();
  FailSystem(ENOMEM);
  return LIBD_FAILED;
}

int CVexaCommon::FailWait(int answer, const vexa::Failure& expired) {
  if (answer == 0) return Fail(expired);
  if (answer == -1) return FailSystem();
  return Fail(vexa::kStrangeStatus);
}

void CVexaCommon::ClearLatestError() {
  const vexa::Guard guard(m_State->error_lock);
  m_LatestErrorCode = LIBD_FAILED;
  own_code = {m_State->number, LIBD_FAILED};
}

// The calling thread's own; the latest of all threads when it has had no exchange with this driver.
ELibDReturnCode CVexaCommon::LatestErrorCode() {
  if (own_code.driver == m_State->number) return own_code.code;
  const vexa::Guard guard(m_State->error_lock);
  return m_LatestErrorCode;
}

std::string CVexaCommon::LatestErrorText() {
  const vexa::Guard guard(m_State->error_lock);
  return m_LatestErrorText;
}

SLibDConnectionInfo CVexaCommon::ConnectionInfo() {
  const vexa::Guard guard(m_ConnectionLock);
  return m_ConnectionInfo;
}

int CVexaCommon::ConnectionTimeout() {
  const vexa::Guard guard(m_ConnectionLock);
  return m_ConnectionInfo.timeout;
}
