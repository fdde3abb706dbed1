// SPDX-License-Identifier: Apache-2.0
#include "device/driver_state.h"

#include "media/frame_chronicle.h"
#include "runtime/base/moment.h"
#include "transport/socket.h"
#include "vexa/runtime.h"

namespace vexa {

DriverState::DriverState(CVexaCommon& owner)
    : driver(owner),
      errors(owner.m_LatestErrorCode, owner.m_LatestErrorText),
      connection(owner.m_ConnectionInfo, owner.m_SavedTimeout, owner.m_ConnectionLock),
      recorder(connection),
      echo(recorder),
      log(owner.m_CGILogger, owner.m_CGILogEnabled, recorder),
      camera(connection, log, errors, exchanges, owner.m_InquirySizes),
      readiness(&owner, now),
      audio({owner.m_AudioLock, owner.m_AudioSocket, owner.m_LastAudioTime}, {readiness, kAudioStream}),
      alarms({owner.m_IoStreamLock, owner.m_IoStreamSocket, owner.m_LastIoDataTime}, {readiness, kAlarmStream}),
      metadata({owner.m_MdStreamLock, owner.m_MdStreamSocket, owner.m_LastMdDataTime}, {readiness, kMetadataStream}),
      chronicle(std::make_unique<FrameChronicle>(ledger)),
      created(nanoseconds_since_1970()) {}

DriverState::~DriverState() = default;

std::string DriverState::bright_mode() {
  const Guard guard(driver.m_ConnectionLock);
  return driver.m_PTZControlInfo.brightMode;
}

std::string DriverState::codec_name() {
  const Guard guard(driver.m_ConnectionLock);
  return driver.m_CameraInfo.codecName;
}

int DriverState::rotation() {
  const Guard guard(driver.m_ConnectionLock);
  return driver.m_CameraInfo.rotation;
}

int DriverState::rtsp_port() {
  const Guard guard(driver.m_ConnectionLock);
  return driver.m_CameraInfo.rtspPort;
}

void DriverState::store_rtsp_port(int port) {
  const Guard guard(driver.m_ConnectionLock);
  driver.m_CameraInfo.rtspPort = port;
}

int DriverState::vmd_type() {
  const Guard guard(driver.m_ConnectionLock);
  return driver.m_IoBoxInfo.vmdType;
}

ELibDVideoStandard DriverState::video_standard() {
  const Guard guard(driver.m_ConnectionLock);
  return static_cast<ELibDVideoStandard>(driver.m_CameraInfo.videoStandard);
}

bool DriverState::takes_continuous_ptz() {
  const Guard guard(driver.m_ConnectionLock);
  return driver.m_ContinuousPTZ;
}

bool DriverState::takes_electronic_flip() {
  const Guard guard(driver.m_ConnectionLock);
  return driver.m_FixedCameraInfo.electronicFlip != 0;
}

bool DriverState::stop_is_requested() {
  const Guard guard(driver.m_VideoStateLock);
  return driver.m_StopVideoRequested;
}

bool DriverState::wants_teardown() {
  const Guard guard(driver.m_VideoStateLock);
  return !driver.m_NoTearDown;
}

int DriverState::stream_socket() {
  const Guard guard(driver.m_VideoStateLock);
  return driver.m_StreamSocket;
}

void DriverState::set_stream_socket(int socket) {
  const Guard guard(driver.m_VideoStateLock);
  driver.m_StreamSocket = socket;
}

void DriverState::close_media() {
  shutdown_and_close(stream_socket());
  set_stream_socket(-1);
  chronicle->end_stream();
}

StoppableSocket DriverState::stream_source() {
  StoppableSocket source{stream_socket(), -1};
  eventFd(driver.m_StopVideoEvent, source.stop);
  return source;
}

}  // namespace vexa
