// SPDX-License-Identifier: Apache-2.0
#include "vexa/library_device.h"

CLibraryDevice::~CLibraryDevice() = default;

// System, connection and video: what a camera is and can do

ELibDReturnCode CLibraryDevice::GetFixedSystemInfo(SLibDFixedSystemInfo&) { return LIBD_NOT_SUPPORTED; }

ELibDReturnCode CLibraryDevice::GetFixedConnectionInfo(SLibDFixedConnectionInfo&) { return LIBD_NOT_SUPPORTED; }

ELibDReturnCode CLibraryDevice::GetFixedCameraInfo(SLibDFixedCameraInfo&) { return LIBD_NOT_SUPPORTED; }

ELibDReturnCode CLibraryDevice::ClearFixedCameraInfo(SLibDFixedCameraInfo& info) {
  info.codecs.clear();
  info.reserved2.clear();
  info.reserved4.clear();
  return LIBD_OK;
}

ELibDReturnCode CLibraryDevice::SetVideoStandard(ELibDVideoStandard) { return LIBD_NOT_SUPPORTED; }

ELibDReturnCode CLibraryDevice::SetVidCapSize(int, int) { return LIBD_NOT_SUPPORTED; }

ELibDReturnCode CLibraryDevice::SetSolidPTZState(bool) { return LIBD_NOT_SUPPORTED; }

ELibDReturnCode CLibraryDevice::SetImageMaxSize(int, int, ELibDVideoStandard) { return LIBD_NOT_SUPPORTED; }

ELibDReturnCode CLibraryDevice::GetFixedAudioInfo(SLibDFixedAudioInfo&) { return LIBD_NOT_SUPPORTED; }

ELibDReturnCode CLibraryDevice::ClearFixedAudioInfo(SLibDFixedAudioInfo& info) {
  info.inputCodecs.clear();
  info.outputCodecs.clear();
  info.reserved3.clear();
  info.reserved4.clear();
  return LIBD_OK;
}

ELibDReturnCode CLibraryDevice::GetFixedIoboxInfo(SLibDFixedIoBoxInfo&) { return LIBD_NOT_SUPPORTED; }

ELibDReturnCode CLibraryDevice::GetFixedPTZControlInfo(SLibDFixedPTZControlInfo&) { return LIBD_NOT_SUPPORTED; }

ELibDReturnCode CLibraryDevice::ClearFixedPTZControlInfo(SLibDFixedPTZControlInfo& info) {
  info.reserved1.clear();
  info.zoomSteps.clear();
  info.brightModes.clear();
  info.dayNightModes.clear();
  return LIBD_OK;
}

// Current settings

ELibDReturnCode CLibraryDevice::GetCurrentSystemInfo(SLibDSystemInfo&) { return LIBD_NOT_SUPPORTED; }

ELibDReturnCode CLibraryDevice::GetCurrentConnectionInfo(SLibDConnectionInfo&) { return LIBD_NOT_SUPPORTED; }

ELibDReturnCode CLibraryDevice::GetCameraInfo(SLibDCameraInfo&) { return LIBD_NOT_SUPPORTED; }

ELibDReturnCode CLibraryDevice::GetAudioInfo(SLibDAudioInfo&) { return LIBD_NOT_SUPPORTED; }

ELibDReturnCode CLibraryDevice::GetIoBoxInfo(SLibDIoBoxInfo&) { return LIBD_NOT_SUPPORTED; }

ELibDReturnCode CLibraryDevice::GetPTZControlInfo(SLibDPTZControlInfo&) { return LIBD_NOT_SUPPORTED; }

ELibDReturnCode CLibraryDevice::GetCameraTourInfo(SLibDCameraTourInfo&) { return LIBD_NOT_SUPPORTED; }

ELibDReturnCode CLibraryDevice::ClearCameraTourInfo(SLibDCameraTourInfo& info) {
  info.tours.clear();
  return LIBD_OK;
}

ELibDReturnCode CLibraryDevice::GetShadowTourInfo(SLibDShadowTourInfo&) { return LIBD_NOT_SUPPORTED; }

ELibDReturnCode CLibraryDevice::ClearShadowTourInfo(SLibDShadowTourInfo& info) {
  info.tours.clear();
  return LIBD_OK;
}

ELibDReturnCode CLibraryDevice::SetCurrentSystemInfo(SLibDSystemInfo&) { return LIBD_NOT_SUPPORTED; }

ELibDReturnCode CLibraryDevice::SetCurrentConnectionInfo(SLibDConnectionInfo&) { return LIBD_NOT_SUPPORTED; }

ELibDReturnCode CLibraryDevice::SetCameraInfo(SLibDCameraInfo&) { return LIBD_NOT_SUPPORTED; }

ELibDReturnCode CLibraryDevice::SetAudioInfo(SLibDAudioInfo&) { return LIBD_NOT_SUPPORTED; }

ELibDReturnCode CLibraryDevice::SetIoBoxInfo(SLibDIoBoxInfo&) { return LIBD_NOT_SUPPORTED; }

ELibDReturnCode CLibraryDevice::SetPTZControlInfo(SLibDPTZControlInfo&) { return LIBD_NOT_SUPPORTED; }

ELibDReturnCode CLibraryDevice::SetCameraTourInfo(SLibDCameraTourInfo&) { return LIBD_NOT_SUPPORTED; }

ELibDReturnCode CLibraryDevice::SetCameraInfoFromID(unsigned int) { return LIBD_NOT_SUPPORTED; }

ELibDReturnCode CLibraryDevice::SetShadowTourInfo(SLibDShadowTourInfo&) { return LIBD_NOT_SUPPORTED; }

// Live video

ELibDReturnCode CLibraryDevice::StartVideoStreaming() { return LIBD_NOT_SUPPORTED; }

ELibDReturnCode CLibraryDevice::StopVideoStreaming() { return LIBD_NOT_SUPPORTED; }

ELibDReturnCode CLibraryDevice::GetCurrentVideoFrame(SLibDVideoFrameInfo&) { return LIBD_NOT_SUPPORTED; }

// Audio

ELibDReturnCode CLibraryDevice::StartAudioStreaming() { return LIBD_NOT_SUPPORTED; }

ELibDReturnCode CLibraryDevice::StopAudioStreaming() { return LIBD_NOT_SUPPORTED; }

ELibDReturnCode CLibraryDevice::GetCurrentAudioFrame(SLibDAudioFrameInfo&) { return LIBD_NOT_SUPPORTED; }

ELibDReturnCode CLibraryDevice::StartAudioUpLoad() { return LIBD_NOT_SUPPORTED; }

ELibDReturnCode CLibraryDevice::StopAudioUpload() { return LIBD_NOT_SUPPORTED; }

ELibDReturnCode CLibraryDevice::SetAudioUploadFrame(SLibDAudioFrameInfo&) { return LIBD_NOT_SUPPORTED; }

// Alarm pins

ELibDReturnCode CLibraryDevice::StartIoStreaming() { return LIBD_NOT_SUPPORTED; }

ELibDReturnCode CLibraryDevice::StopIoStreaming() { return LIBD_NOT_SUPPORTED; }

ELibDReturnCode CLibraryDevice::GetCurrentIoStatus(std::vector<SLibDPinInfo>&) { return LIBD_NOT_SUPPORTED; }

ELibDReturnCode CLibraryDevice::SetOutput(SLibDPinInfo&) { return LIBD_NOT_SUPPORTED; }

// Pan, tilt, zoom and focus

ELibDReturnCode CLibraryDevice::GetCurrentPosition(SLibDPTZStatus&) { return LIBD_NOT_SUPPORTED; }

ELibDReturnCode CLibraryDevice::PanTilt(int, int) { return LIBD_NOT_SUPPORTED; }

ELibDReturnCode CLibraryDevice::PanTiltAbsolute(int, int) { return LIBD_NOT_SUPPORTED; }

ELibDReturnCode CLibraryDevice::PanTiltDirect(int, int, const SLibDResolutionInfo&) { return LIBD_NOT_SUPPORTED; }

ELibDReturnCode CLibraryDevice::Zoom(int) { return LIBD_NOT_SUPPORTED; }

ELibDReturnCode CLibraryDevice::ZoomAbsolute(int) { return LIBD_NOT_SUPPORTED; }

ELibDReturnCode CLibraryDevice::ZoomRelative(int) { return LIBD_NOT_SUPPORTED; }

ELibDReturnCode CLibraryDevice::ZoomArea(int, int, int, int, const SLibDResolutionInfo&) { return LIBD_NOT_SUPPORTED; }

ELibDReturnCode CLibraryDevice::SetFocusMode(bool) { return LIBD_NOT_SUPPORTED; }

ELibDReturnCode CLibraryDevice::Focus(int) { return LIBD_NOT_SUPPORTED; }

ELibDReturnCode CLibraryDevice::FocusAbsolute(int) { return LIBD_NOT_SUPPORTED; }

// Exposure

ELibDReturnCode CLibraryDevice::SetBrightMode(std::string&) { return LIBD_NOT_SUPPORTED; }

ELibDReturnCode CLibraryDevice::SetBackLightCompMode(bool) { return LIBD_NOT_SUPPORTED; }

ELibDReturnCode CLibraryDevice::Bright(int) { return LIBD_NOT_SUPPORTED; }

ELibDReturnCode CLibraryDevice::BrightAbsolute(int) { return LIBD_NOT_SUPPORTED; }

// Presets

ELibDReturnCode CLibraryDevice::GetPresets(std::vector<SLibDPresetInfo>&) { return LIBD_NOT_SUPPORTED; }

ELibDReturnCode CLibraryDevice::ClearCachedPresets(std::vector<SLibDPresetInfo>& presets) {
  presets.clear();
  return LIBD_OK;
}

ELibDReturnCode CLibraryDevice::ClearPreset(int) { return LIBD_NOT_SUPPORTED; }

ELibDReturnCode CLibraryDevice::SetPreset(SLibDPresetInfo&) { return LIBD_NOT_SUPPORTED; }

ELibDReturnCode CLibraryDevice::RecallPreset(int) { return LIBD_NOT_SUPPORTED; }

// Image controls

ELibDReturnCode CLibraryDevice::GetDayNightMode(ELibDDayNightType&) { return LIBD_NOT_SUPPORTED; }

ELibDReturnCode CLibraryDevice::SetDayNightMode(ELibDDayNightType) { return LIBD_NOT_SUPPORTED; }

ELibDReturnCode CLibraryDevice::GetVisibilityEnhancerMode(ELibDVisibilityEnhancerType&) { return LIBD_NOT_SUPPORTED; }

ELibDReturnCode CLibraryDevice::SetVisibilityEnhancerMode(ELibDVisibilityEnhancerType) { return LIBD_NOT_SUPPORTED; }

ELibDReturnCode CLibraryDevice::GetXdnrMode(ELibDXdnrType&) { return LIBD_NOT_SUPPORTED; }

ELibDReturnCode CLibraryDevice::SetXdnrMode(ELibDXdnrType) { return LIBD_NOT_SUPPORTED; }

ELibDReturnCode CLibraryDevice::GetViewDR(ELibDViewDRMode&) { return LIBD_NOT_SUPPORTED; }

ELibDReturnCode CLibraryDevice::SetViewDR(ELibDViewDRMode) { return LIBD_NOT_SUPPORTED; }

ELibDReturnCode CLibraryDevice::GetIRIlluminator(ELibIRIlluminatorMode&, int&) { return LIBD_NOT_SUPPORTED; }

ELibDReturnCode CLibraryDevice::SetIRIlluminator(ELibIRIlluminatorMode, int) { return LIBD_NOT_SUPPORTED; }

// Shadow tours

ELibDReturnCode CLibraryDevice::StartShadowTour(int) { return LIBD_NOT_SUPPORTED; }

ELibDReturnCode CLibraryDevice::StopShadowTour() { return LIBD_NOT_SUPPORTED; }

ELibDReturnCode CLibraryDevice::StartRecordShadowTour(int) { return LIBD_NOT_SUPPORTED; }

ELibDReturnCode CLibraryDevice::StopRecordShadowTour() { return LIBD_NOT_SUPPORTED; }

ELibDReturnCode CLibraryDevice::StartPreviewShadowTour(int) { return LIBD_NOT_SUPPORTED; }

ELibDReturnCode CLibraryDevice::StopPreviewShadowTour() { return LIBD_NOT_SUPPORTED; }

// Detection and motion metadata

ELibDReturnCode CLibraryDevice::GetObjectDetectionSetting(std::vector<SLibDDetectionParam>&, ELibDPositionMode&) {
  return LIBD_NOT_SUPPORTED;
}

ELibDReturnCode CLibraryDevice::ClearCachedObjectDetectionSetting(std::vector<SLibDDetectionParam>& params) {
  params.clear();
  return LIBD_OK;
}

ELibDReturnCode CLibraryDevice::SetDetectionParam(SLibDDetectionParam&) { return LIBD_NOT_SUPPORTED; }

ELibDReturnCode CLibraryDevice::ClearDetectionParam(SLibDDetectionParam& param) {
  for (SLibDDetectionWindow& window : param.windows) window.area.clear();
  return LIBD_OK;
}

ELibDReturnCode CLibraryDevice::SetPositionMode(ELibDPositionMode) { return LIBD_NOT_SUPPORTED; }

ELibDReturnCode CLibraryDevice::StartModRawData() { return LIBD_NOT_SUPPORTED; }

ELibDReturnCode CLibraryDevice::GetCurrentPosition(SLibDRawMDFrameInfo&) { return LIBD_NOT_SUPPORTED; }

ELibDReturnCode CLibraryDevice::StopModRawData() { return LIBD_NOT_SUPPORTED; }

ELibDReturnCode CLibraryDevice::SetTamperingAlarm(bool, ELibDTamperLevel) { return LIBD_NOT_SUPPORTED; }

ELibDReturnCode CLibraryDevice::SetAudioDetection(bool) { return LIBD_NOT_SUPPORTED; }

ELibDReturnCode CLibraryDevice::SetVMDtype(ELibDVMDType) { return LIBD_NOT_SUPPORTED; }

// Driver

ELibDReturnCode CLibraryDevice::GetLatestErrorText(std::string&) { return LIBD_NOT_SUPPORTED; }

ELibDReturnCode CLibraryDevice::GetVideoStatus(int) { return LIBD_NOT_SUPPORTED; }

bool CLibraryDevice::GetAnalogDeviceInitializedStatus() { return false; }

ELibDReturnCode CLibraryDevice::GetVideoOutMode(ELibVideoOutMode&) { return LIBD_NOT_SUPPORTED; }

ELibDReturnCode CLibraryDevice::GetCameraType(ELibCameraType) { return LIBD_NOT_SUPPORTED; }

ELibDReturnCode CLibraryDevice::ImportCapabilities(const std::string&) { return LIBD_NOT_SUPPORTED; }

ELibDReturnCode CLibraryDevice::ExportCapabilities(std::string&) { return LIBD_NOT_SUPPORTED; }

ELibDReturnCode CLibraryDevice::SetCGILogLevel(bool) { return LIBD_NOT_SUPPORTED; }

ELibDReturnCode CLibraryDevice::SetCGILogPath(const char*) { return LIBD_NOT_SUPPORTED; }

ELibDReturnCode CLibraryDevice::InitializeEncoderDevice() { return LIBD_OK; }

ELibDReturnCode CLibraryDevice::CloseEncoderDevice() { return LIBD_OK; }

// Recordings on the camera's card

ELibDReturnCode CLibraryDevice::GetEdgeStorageMode(SLibDEdgeStorageMode&) { return LIBD_NOT_SUPPORTED; }

ELibDReturnCode CLibraryDevice::SetEdgeStorageMode(const SLibDEdgeStorageMode&) { return LIBD_NOT_SUPPORTED; }

ELibDReturnCode CLibraryDevice::StartEdgeStorageVideoStreaming(const SLibDEdgeStorageStreamingInfo&) {
  return LIBD_NOT_SUPPORTED;
}

ELibDReturnCode CLibraryDevice::GetEdgeStorageRecordList(SLibDEdgeStorageRecordList&) { return LIBD_NOT_SUPPORTED; }

ELibDReturnCode CLibraryDevice::ClearEdgeStorageRecordList(SLibDEdgeStorageRecordList& list) {
  list.records.clear();
  return LIBD_OK;
}

ELibDReturnCode CLibraryDevice::DeleteAllEdgeStorageRecord() { return LIBD_NOT_SUPPORTED; }

ELibDReturnCode CLibraryDevice::DeleteEdgeStorageRecordByName(const SLibDEdgeStorageStreamingInfo&) {
  return LIBD_NOT_SUPPORTED;
}

ELibDReturnCode CLibraryDevice::SetEdgeStorageNoTearDown(bool) { return LIBD_NOT_SUPPORTED; }
