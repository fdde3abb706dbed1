// SPDX-License-Identifier: Apache-2.0
// The driver object: its construction and end, its latest error, and members that belong to no family.
#include "vexa/vexa_common.h"

#include "device/driver_state.h"
#include "runtime/base/result.h"
#include "runtime/base/wipe.h"
#include "vexa/runtime.h"

namespace {

/// Room for what a camera commonly lists, so that filling a record does not allocate again.
constexpr std::size_t kListRoom = 32;

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

CVexaCommon::CVexaCommon() : m_InquirySizes(kInquirySizes), m_State(std::make_unique<vexa::DriverState>(*this)) {
  reserve_lists(m_FixedCameraInfo.codecs, m_FixedCameraInfo.reserved2, m_FixedCameraInfo.reserved4);
  reserve_lists(m_FixedAudioInfo.inputCodecs, m_FixedAudioInfo.outputCodecs, m_FixedAudioInfo.reserved3,
                m_FixedAudioInfo.reserved4);
  reserve_lists(m_FixedPTZControlInfo.reserved1, m_FixedPTZControlInfo.zoomSteps, m_FixedPTZControlInfo.brightModes,
                m_FixedPTZControlInfo.dayNightModes);
  reserve_lists(m_IoBoxInfo.pins, m_IoBoxInfo.detections1, m_IoBoxInfo.detections2);
  m_StopVideoEvent = CreateEvent(nullptr, 1, 0, nullptr);
}

CVexaCommon::~CVexaCommon() {
  CVexaCommon::StopVideoStreaming();
  CVexaCommon::StopAudioStreaming();
  CVexaCommon::StopIoStreaming();
  // Kept: the motion-metadata stream is the host's to stop; a driver's end leaves it open.
  ReleaseRtpPacketsPtr();
  m_State->release_stream_buffer();
  m_State->clear_frame_queue();  // a model class may have queued frames without a stream
  CloseHandle(m_StopVideoEvent);
  // Safe: credentials do not stay in memory that is given back.
  const vexa::Guard guard(m_ConnectionLock);
  vexa::wipe(m_ConnectionInfo.password);
  vexa::wipe(m_BasicCredentials, sizeof m_BasicCredentials);
}

// Running out of memory is not recorded here: it would replace the text that was asked for.
ELibDReturnCode CVexaCommon::GetLatestErrorText(std::string& text) {
  return vexa::within_memory([&] { text = m_State->errors.text(); }) ? LIBD_OK : LIBD_FAILED;
}

ELibDReturnCode CVexaCommon::GetCameraType(ELibCameraType type) {
  return (m_CameraType & static_cast<std::uint32_t>(type)) != 0 ? LIBD_OK : LIBD_FAILED;
}

ELibDReturnCode CVexaCommon::SetCameraInfoFromID(unsigned int id) {
  vexa::Operation operation(*m_State, __func__);
  {
    const vexa::Guard guard(m_ConnectionLock);
    if (m_FixedCameraInfo.streamCount1 < 2 && m_FixedCameraInfo.streamCount2 < 2) return LIBD_OK;
  }
  return m_State->camera.send("/command/camera.cgi?ImageCodec%d=off", static_cast<int>(id));
}

ELibDReturnCode CVexaCommon::InitializeFixedVideoParams(ELibDVideoStandard, int, int) { return LIBD_OK; }
