// SPDX-License-Identifier: Apache-2.0
// A driver class with everything in reach that model classes reach.
#pragma once

#include "vexa/vexa_common.h"

namespace vexa_test {

template <typename Driver>
class Reach : public Driver {
 public:
  using Driver::AddUrlEncoding, Driver::CheckAmountOfBrightness, Driver::CheckCurrentBrightMode,
      Driver::CheckDetectionParamDetectionArea, Driver::CheckDetectionParamSensitivity,
      Driver::CheckEdgeStorageFreeSize, Driver::ConverObjectWidthValueToString, Driver::GetCommonNetworkInfo,
      Driver::GetCommonSystemInfo, Driver::GetCurrentFrameData, Driver::GetCurrentH264FrameData,
      Driver::GetCurrentIoStatusDetail, Driver::GetCurrentJPEGFrameData, Driver::GetCurrentMPEGFrameData,
      Driver::GetDirectionFromPanTiltSpeed, Driver::GetIrisPositionFromCameraData, Driver::GetIrisPositionFromIrisList,
      Driver::GetRtpCurrentVideoFrame, Driver::GetRtpCurrentVideoFrameH264, Driver::GetRtpCurrentVideoFrameJPEG,
      Driver::GetRtpCurrentVideoFrameMPEG4, Driver::GetShutterAndIrisMode, Driver::GetShutterSpeedFromCameraData,
      Driver::GetShutterSpeedFromShutterSpeedList, Driver::GetTextByTourSequenceList, Driver::GetTourSequenceListByText,
      Driver::GetUrlParameter, Driver::GetUserDataFromStream, Driver::GetViewingAngles,
      Driver::InitEdgeStorageKeepAlivePeriod, Driver::KeepAlive, Driver::Log,
      Driver::ParseImageMaxSizeFromCameraProperty, Driver::ParseSolidPTZFromCameraProperty,
      Driver::ParseVideoCapSizeFromCameraProperty, Driver::ParseVideoStandardFromCameraProperty,
      Driver::ProcessCurrentFrameData, Driver::PropulateFrameInfoList, Driver::RTPJpegToJIF,
      Driver::ReleaseRtpPacketsPtr, Driver::SendInqCommand, Driver::SendPTZCommandForCenterDirection,
      Driver::SendPTZCommands, Driver::SetCurrentFrameRate, Driver::SetCurrentQualityBitrate,
      Driver::SetCurrentResolution, Driver::SetCurrentStreamMode, Driver::SetObjectDetectionParameter,
      Driver::StreamingThread, Driver::_ld_is_leap_year, Driver::_ld_mkgmtime, Driver::base64Decode,
      Driver::base64Encode, Driver::find_start_code_h264, Driver::find_start_code_mpeg4, Driver::http_close,
      Driver::http_header_recv, Driver::http_multipart_input_recv, Driver::http_multipart_jpeg_recv,
      Driver::http_multipart_mddata_recv, Driver::http_open, Driver::http_recv, Driver::http_recvn,
      Driver::http_stream_recv, Driver::parse_clock, Driver::rtp_over_tcp_close, Driver::rtp_over_tcp_header_recv,
      Driver::rtp_over_tcp_open, Driver::rtp_over_tcp_payload_recv, Driver::rtp_over_tcp_recvn,
      Driver::rtp_over_udp_close, Driver::rtp_over_udp_open, Driver::rtp_over_udp_payload_recv,
      Driver::rtp_over_udp_payload_recv_h264, Driver::rtp_over_udp_recvn, Driver::rtp_stream_socket_close_all;
  using Driver::m_AudioInfo, Driver::m_AudioLock, Driver::m_AudioSocket, Driver::m_BasicCredentials,
      Driver::m_CGILogEnabled, Driver::m_CGILogPath, Driver::m_CGILogger, Driver::m_CamPosLock, Driver::m_CamPosText,
      Driver::m_CameraInfo, Driver::m_CameraInquiryLock, Driver::m_CameraType, Driver::m_ChannelId,
      Driver::m_ConnectionInfo, Driver::m_ConnectionLock, Driver::m_ContinuousPTZ, Driver::m_EdgeStoragePlayback,
      Driver::m_EdgeStorageSupported, Driver::m_FirstPlaybackFrame, Driver::m_FixedAudioInfo, Driver::m_FixedCameraInfo,
      Driver::m_FixedCameraInfoAvailable, Driver::m_FixedConnectionInfo, Driver::m_FixedIoBoxInfo,
      Driver::m_FixedIoBoxInfoAvailable, Driver::m_FixedPTZControlInfo, Driver::m_FixedPTZControlInfoAvailable,
      Driver::m_FixedSystemInfo, Driver::m_FrameQueue, Driver::m_FrameQueueLock, Driver::m_InquirySizes,
      Driver::m_IoBoxInfo, Driver::m_IoStreamLock, Driver::m_IoStreamSocket, Driver::m_KeepAlivePeriod,
      Driver::m_LargeFrameBuffers, Driver::m_LastAudioTime, Driver::m_LastFrameTime, Driver::m_LastIoDataTime,
      Driver::m_LastKeepAliveTime, Driver::m_LastMdDataTime, Driver::m_LatestErrorCode, Driver::m_LodDetection,
      Driver::m_MdStreamSocket, Driver::m_NoTearDown, Driver::m_PTZControlInfo, Driver::m_PendingPins,
      Driver::m_PlaybackBaseTimestamp, Driver::m_PlaybackScale, Driver::m_RangeClockMicros, Driver::m_RangeClockSeconds,
      Driver::m_ResolutionFilter, Driver::m_RtpClockRate, Driver::m_RtpLiveMode, Driver::m_RtpPacketBuffer,
      Driver::m_RtpPackets, Driver::m_RtspCSeq, Driver::m_RtspSession, Driver::m_RtspSocket, Driver::m_RtspUrl,
      Driver::m_SavedTimeout, Driver::m_StagingBuffer, Driver::m_StagingBufferSize, Driver::m_StopVideoEvent,
      Driver::m_StopVideoRequested, Driver::m_StreamBuffer, Driver::m_StreamBufferSize, Driver::m_StreamFrameStart,
      Driver::m_StreamSearchPos, Driver::m_StreamSocket, Driver::m_StreamWaitMs, Driver::m_StreamWriteEnd,
      Driver::m_StreamingThread, Driver::m_TamperingActiveSince, Driver::m_UseMotionDetection, Driver::m_VideoStateLock,
      Driver::m_VideoTimedOut, Driver::m_ZoomRatios;
};

}  // namespace vexa_test
