// SPDX-License-Identifier: Apache-2.0
// The driver of this camera family.
#pragma once

#include <atomic>
#include <cstddef>
#include <cstdint>
#include <ctime>
#include <deque>
#include <map>
#include <memory>
#include <string>
#include <vector>

#include "vexa/export.h"
#include "vexa/file_logger.h"
#include "vexa/library_device.h"
#include "vexa/resolution_filter.h"
#include "vexa/simple_lock.h"

struct typedHandle;

namespace vexa {
struct DriverState;
}  // namespace vexa

/// Drives one camera over HTTP CGI, RTSP/RTP and HTTP streams.
///
/// Construction contacts no camera. Operations may be called from any of the host's threads; one streaming thread runs
/// while video plays. The connection is changed only while no stream and no command is in flight. Destruction stops
/// video, audio and the alarm stream, and may block as their stops do; the host stops the motion-metadata stream
/// itself. Starts and stops of video from several threads take turns, but a start or stop during a stop is refused. A
/// driver may be destroyed only when no other thread uses it.
///
/// Everything that is not an operation of CLibraryDevice is protected: model classes outside the library derive from
/// this class and fill the capability records. The bodies of a block are in the file that it names.
class VEXA_API CVexaCommon : public CLibraryDevice {
 public:
  /// One assembled video frame. The frame queue owns the data of the frames in it.
  struct VideoFrameInfo {
    unsigned char* data = nullptr;  ///< allocated with array new
    unsigned int capacity = 0;      ///< bytes allocated: 1200000, or 2000000 once a frame has not fitted
    unsigned int length = 0;        ///< bytes of frame
    std::int32_t frameType = VIDEO_FRAME_INVALID;
    std::int32_t seconds = 0;
    std::int32_t microseconds = 0;
  };

  CVexaCommon();
  CVexaCommon(const CVexaCommon&) = delete;
  CVexaCommon& operator=(const CVexaCommon&) = delete;
  ~CVexaCommon() override;
  ELibDReturnCode GetLatestErrorText(std::string& text) override;  // device/vexa_common.cpp
  ELibDReturnCode GetCameraType(ELibCameraType type) override;
  ELibDReturnCode SetCameraInfoFromID(unsigned int id) override;
  /// Hook of model classes, called when standard or capture size change (-1: no size is given), by the thread that runs
  /// the operation and with no lock held: it may send commands, and changes m_FixedCameraInfo under m_ConnectionLock.
  /// The result is not used. LIBD_OK.
  virtual ELibDReturnCode InitializeFixedVideoParams(ELibDVideoStandard standard, int width, int height);
  ELibDReturnCode GetFixedSystemInfo(SLibDFixedSystemInfo& info) override;  // device/system_info.cpp
  ELibDReturnCode GetFixedConnectionInfo(SLibDFixedConnectionInfo& info) override;
  ELibDReturnCode GetCurrentSystemInfo(SLibDSystemInfo& info) override;
  ELibDReturnCode GetFixedCameraInfo(SLibDFixedCameraInfo& info) override;  // device/video_settings.cpp
  ELibDReturnCode SetVideoStandard(ELibDVideoStandard standard) override;
  ELibDReturnCode SetVidCapSize(int width, int height) override;
  ELibDReturnCode SetSolidPTZState(bool on) override;
  ELibDReturnCode SetImageMaxSize(int width, int height, ELibDVideoStandard standard) override;
  ELibDReturnCode GetCameraInfo(SLibDCameraInfo& info) override;
  ELibDReturnCode SetCameraInfo(SLibDCameraInfo& info) override;
  ELibDReturnCode SetBrightMode(std::string& mode) override;  // device/image_controls.cpp
  ELibDReturnCode SetBackLightCompMode(bool on) override;
  ELibDReturnCode Bright(int step) override;
  ELibDReturnCode BrightAbsolute(int level) override;
  ELibDReturnCode GetDayNightMode(ELibDDayNightType& mode) override;
  ELibDReturnCode SetDayNightMode(ELibDDayNightType mode) override;
  ELibDReturnCode GetVisibilityEnhancerMode(ELibDVisibilityEnhancerType& mode) override;
  ELibDReturnCode SetVisibilityEnhancerMode(ELibDVisibilityEnhancerType mode) override;
  ELibDReturnCode GetXdnrMode(ELibDXdnrType& mode) override;
  ELibDReturnCode SetXdnrMode(ELibDXdnrType mode) override;
  ELibDReturnCode GetViewDR(ELibDViewDRMode& mode) override;
  ELibDReturnCode SetViewDR(ELibDViewDRMode mode) override;
  ELibDReturnCode GetIRIlluminator(ELibIRIlluminatorMode& mode, int& strength) override;
  ELibDReturnCode SetIRIlluminator(ELibIRIlluminatorMode mode, int strength) override;
  ELibDReturnCode PanTilt(int pan, int tilt) override;  // device/ptz_motion.cpp
  ELibDReturnCode PanTiltAbsolute(int pan, int tilt) override;
  ELibDReturnCode PanTiltDirect(int x, int y, const SLibDResolutionInfo& picture) override;
  ELibDReturnCode Zoom(int speed) override;
  ELibDReturnCode ZoomAbsolute(int position) override;
  ELibDReturnCode ZoomRelative(int step) override;
  ELibDReturnCode ZoomArea(int x, int y, int width, int height, const SLibDResolutionInfo& picture) override;
  ELibDReturnCode SetFocusMode(bool automatic) override;
  ELibDReturnCode Focus(int speed) override;
  ELibDReturnCode FocusAbsolute(int position) override;
  ELibDReturnCode GetCurrentPosition(SLibDPTZStatus& status) override;  // device/ptz_position.cpp
  ELibDReturnCode GetPTZControlInfo(SLibDPTZControlInfo& info) override;
  ELibDReturnCode SetPTZControlInfo(SLibDPTZControlInfo& info) override;
  ELibDReturnCode GetFixedPTZControlInfo(SLibDFixedPTZControlInfo& info) override;
  ELibDReturnCode GetPresets(std::vector<SLibDPresetInfo>& presets) override;  // device/presets.cpp
  ELibDReturnCode ClearPreset(int index) override;
  ELibDReturnCode SetPreset(SLibDPresetInfo& preset) override;
  ELibDReturnCode RecallPreset(int index) override;
  ELibDReturnCode GetCameraTourInfo(SLibDCameraTourInfo& info) override;  // device/camera_tours.cpp
  ELibDReturnCode SetCameraTourInfo(SLibDCameraTourInfo& info) override;
  ELibDReturnCode GetShadowTourInfo(SLibDShadowTourInfo& info) override;  // device/shadow_tours.cpp
  ELibDReturnCode SetShadowTourInfo(SLibDShadowTourInfo& info) override;
  ELibDReturnCode StartShadowTour(int number) override;
  ELibDReturnCode StopShadowTour() override;
  ELibDReturnCode StartRecordShadowTour(int number) override;
  ELibDReturnCode StopRecordShadowTour() override;
  ELibDReturnCode StartPreviewShadowTour(int number) override;
  ELibDReturnCode StopPreviewShadowTour() override;
  ELibDReturnCode GetCurrentConnectionInfo(SLibDConnectionInfo& info) override;  // device/connection.cpp
  ELibDReturnCode SetCurrentConnectionInfo(SLibDConnectionInfo& info) override;
  ELibDReturnCode SetCGILogLevel(bool on) override;
  ELibDReturnCode SetCGILogPath(const char* path) override;
  ELibDReturnCode StartVideoStreaming() override;  // device/video_streaming.cpp
  ELibDReturnCode StartEdgeStorageVideoStreaming(const SLibDEdgeStorageStreamingInfo& info) override;
  ELibDReturnCode StopVideoStreaming() override;
  ELibDReturnCode GetCurrentVideoFrame(SLibDVideoFrameInfo& frame) override;  // device/frame_queue.cpp
  ELibDReturnCode GetFixedAudioInfo(SLibDFixedAudioInfo& info) override;      // device/audio.cpp
  ELibDReturnCode GetAudioInfo(SLibDAudioInfo& info) override;
  ELibDReturnCode SetAudioInfo(SLibDAudioInfo& info) override;
  ELibDReturnCode StartAudioStreaming() override;
  ELibDReturnCode StopAudioStreaming() override;
  ELibDReturnCode GetCurrentAudioFrame(SLibDAudioFrameInfo& frame) override;
  ELibDReturnCode GetFixedIoboxInfo(SLibDFixedIoBoxInfo& info) override;  // device/alarm_io.cpp
  ELibDReturnCode GetIoBoxInfo(SLibDIoBoxInfo& info) override;
  ELibDReturnCode StartIoStreaming() override;
  ELibDReturnCode StopIoStreaming() override;
  ELibDReturnCode GetCurrentIoStatus(std::vector<SLibDPinInfo>& pins) override;
  ELibDReturnCode SetOutput(SLibDPinInfo& pin) override;
  ELibDReturnCode SetPositionMode(ELibDPositionMode mode) override;  // device/detection.cpp
  ELibDReturnCode GetObjectDetectionSetting(std::vector<SLibDDetectionParam>& params, ELibDPositionMode& mode) override;
  ELibDReturnCode SetDetectionParam(SLibDDetectionParam& param) override;
  ELibDReturnCode SetTamperingAlarm(bool on, ELibDTamperLevel level) override;
  ELibDReturnCode SetAudioDetection(bool on) override;
  ELibDReturnCode SetVMDtype(ELibDVMDType type) override;
  ELibDReturnCode StartModRawData() override;  // device/metadata_stream.cpp
  ELibDReturnCode GetCurrentPosition(SLibDRawMDFrameInfo& frame) override;
  ELibDReturnCode StopModRawData() override;
  ELibDReturnCode GetEdgeStorageMode(SLibDEdgeStorageMode& mode) override;  // device/edge_storage.cpp
  ELibDReturnCode SetEdgeStorageMode(const SLibDEdgeStorageMode& mode) override;
  ELibDReturnCode GetEdgeStorageRecordList(SLibDEdgeStorageRecordList& list) override;
  ELibDReturnCode DeleteAllEdgeStorageRecord() override;
  ELibDReturnCode DeleteEdgeStorageRecordByName(const SLibDEdgeStorageStreamingInfo& info) override;
  ELibDReturnCode SetEdgeStorageNoTearDown(bool noTearDown) override;

 protected:
  // The HTTP CGI client and HTTP streams: device/http_client.cpp
  int http_open(const char* format, ...) __attribute__((format(printf, 2, 3)));
  int http_header_recv(int socket, char* buffer, int length, int timeout);
  int http_recv(int socket, char* buffer, int length, int timeout);
  int http_recvn(int socket, char* buffer, int length, int timeout);
  int http_recvn(int socket, std::string& text, int length, int timeout);
  void http_close(int socket);
  std::string AddUrlEncoding(const std::string& text, bool encodeAll);
  bool GetUrlParameter(const std::string& answer, std::string key, std::string& value);
  bool GetUrlParameter(const std::string& answer, std::string key, int& value);
  ELibDReturnCode SendInqCommand(const std::string& name, std::string& answer);
  void base64Encode(const char* text, char* output);
  /// Where the next start code begins in `length` bytes; null when there is none.
  using StartCodeFinder = const unsigned char* (*)(const unsigned char* data, unsigned int length);
  int http_multipart_jpeg_recv(int socket, char* buffer, int capacity, int timeout);
  int http_multipart_mddata_recv(int socket, char* buffer, int capacity, int timeout);
  /// The first byte of the first 00 00 00 01 in the data; null when there is none. Reads no byte outside the data.
  static const unsigned char* find_start_code_h264(const unsigned char* data, unsigned int length);
  /// The same for 00 00 01; of more zeros the last two belong to it.
  static const unsigned char* find_start_code_mpeg4(const unsigned char* data, unsigned int length);
  int http_stream_recv(int socket, char* buffer, int capacity, StartCodeFinder finder, int codeLength, int timeout);
  // RTSP sessions and their packets, over UDP and inside the connection: device/rtsp_session.cpp
  int rtp_over_udp_open(const char* format, ...) __attribute__((format(printf, 2, 3)));
  int rtp_over_tcp_header_recv(int socket, char* buffer, int size, int timeout);
  bool parse_clock(const char* text);
  void rtp_over_udp_close();
  void rtp_stream_socket_close_all();
  unsigned char* base64Decode(const char* text, unsigned int& size, bool trim);
  void KeepAlive();
  bool InitEdgeStorageKeepAlivePeriod();
  int rtp_over_tcp_open(const char* format, ...) __attribute__((format(printf, 2, 3)));
  void rtp_over_tcp_close(int socket);
  int rtp_over_tcp_recvn(int socket, char* buffer, int length, int timeout);
  int rtp_over_tcp_payload_recv(int socket, char* buffer, int size, bool* marker, unsigned char* payloadType,
                                int timeout, unsigned int* timestamp);
  int rtp_over_udp_recvn(int socket, char* buffer, int length, int timeout);
  int rtp_over_udp_payload_recv(int socket, char* buffer, int size, int timeout, SPacketInfo& packet);
  int rtp_over_udp_payload_recv_h264(int socket, char* buffer, int size, int timeout, SPacketInfo& packet);
  int rtp_over_udp_payload_recv(int socket, char* buffer, int size, bool* marker, unsigned char* payloadType,
                                int timeout, unsigned int* timestamp, unsigned short* sequence);
  static unsigned int StreamingThread(void* driver);  // device/video_streaming.cpp
  ELibDReturnCode StopRtpVideoStreaming();
  void ReleaseRtpPacketsPtr();
  // The frame queue: device/frame_queue.cpp
  static void ProcessCurrentFrameData(CVexaCommon* driver, VideoFrameInfo& frame, bool& waitKey, ELibDReturnCode code);
  static void PropulateFrameInfoList(CVexaCommon* driver, VideoFrameInfo& frame, bool& waitKey)
      VEXA_REQUIRES(driver->m_FrameQueueLock);
  // Frames from the HTTP image stream: device/http_frames.cpp
  ELibDReturnCode GetCurrentFrameData(VideoFrameInfo& frame);
  ELibDReturnCode GetCurrentJPEGFrameData(VideoFrameInfo& frame, int& received);
  ELibDReturnCode GetCurrentH264FrameData(VideoFrameInfo& frame, int& received);
  ELibDReturnCode GetCurrentMPEGFrameData(VideoFrameInfo& frame, int& received);
  // Frames from the pictures of an RTP session: device/rtp_frames.cpp
  ELibDReturnCode GetRtpCurrentVideoFrame(const std::string& codec, VideoFrameInfo& frame);
  ELibDReturnCode GetRtpCurrentVideoFrameH264(VideoFrameInfo& frame);
  ELibDReturnCode GetRtpCurrentVideoFrameMPEG4(VideoFrameInfo& frame);
  ELibDReturnCode GetRtpCurrentVideoFrameJPEG(VideoFrameInfo& frame);
  /// `out` has room for 4096 bytes: the JFIF header and the first payload's scan data. False leaves it undefined.
  bool RTPJpegToJIF(unsigned char* out, unsigned int* outLength, unsigned char* payload, unsigned int length);
  /// Looks for the camera's position in the first 256 bytes of user data; true when it is there and stored.
  bool GetUserDataFromStream(const unsigned char* data, unsigned int length);
  // Shared with model classes: device/system_info.cpp
  ELibDReturnCode GetCommonSystemInfo(SLibDSystemInfo& info, const std::string& answer);
  ELibDReturnCode GetCommonNetworkInfo(SLibDSystemInfo& info, const std::string& answer);
  /// Free kilobytes on the card; 0 when the camera names none, -1 when it cannot be asked.
  int CheckEdgeStorageFreeSize();  // device/edge_storage.cpp
  std::int64_t _ld_mkgmtime(std::tm* time);
  bool _ld_is_leap_year(int year);
  // Video settings out of an answer: device/video_settings.cpp
  // Each takes the answer, then in the place of its key and out the end of its value; the flag, where there is one, is
  // set by a change and never cleared.
  void ParseVideoStandardFromCameraProperty(const std::string&, std::size_t&, bool&) VEXA_REQUIRES(m_ConnectionLock);
  void ParseVideoCapSizeFromCameraProperty(const std::string&, std::size_t&, bool&) VEXA_REQUIRES(m_ConnectionLock);
  void ParseSolidPTZFromCameraProperty(const std::string&, std::size_t&, bool&) VEXA_REQUIRES(m_ConnectionLock);
  void ParseImageMaxSizeFromCameraProperty(const std::string&, std::size_t&, bool&) VEXA_REQUIRES(m_ConnectionLock);
  void SetCurrentStreamMode(const std::string& answer, std::size_t& pos, std::int32_t& codecType,
                            const std::string& key) VEXA_REQUIRES(m_ConnectionLock);
  void SetCurrentResolution(const std::string&, std::size_t&, const std::string&) VEXA_REQUIRES(m_ConnectionLock);
  void SetCurrentFrameRate(const std::string&, std::size_t&, const std::string&) VEXA_REQUIRES(m_ConnectionLock);
  void SetCurrentQualityBitrate(const std::string& answer, std::size_t& pos, std::int32_t codecType,
                                const std::string& key) VEXA_REQUIRES(m_ConnectionLock);
  // Exposure and image controls: device/image_controls.cpp
  ELibDReturnCode CheckAmountOfBrightness(int step);
  ELibDReturnCode CheckCurrentBrightMode();
  /// Places of both modes in the exposure lists; -1 for a mode without an entry.
  void GetShutterAndIrisMode(int& shutterEntry, int& irisEntry);
  // False when the answer lacks the value, there is no entry, or no step is left that way.
  bool GetShutterSpeedFromCameraData(const std::string& answer, int& value, unsigned& entry);
  bool GetIrisPositionFromCameraData(std::string& answer, int& value, unsigned& entry);
  bool GetShutterSpeedFromShutterSpeedList(int step, int& value, unsigned entry);
  bool GetIrisPositionFromIrisList(int step, int& value, unsigned entry);
  ELibDReturnCode GetCurrentIoStatusDetail(std::vector<SLibDPinInfo>& pins);  // device/alarm_io.cpp
  int http_multipart_input_recv(int socket, unsigned int& mask, unsigned int& state);
  // Detection settings: device/detection.cpp
  /// Sends what an object-detection camera keeps of a setting; `socket` is set to each request's, which is closed.
  ELibDReturnCode SetObjectDetectionParameter(SLibDDetectionParam& param, int& socket);
  ELibDReturnCode ConverObjectWidthValueToString(SLibDDetectionParam& param, std::string& text);
  ELibDReturnCode CheckDetectionParamSensitivity(SLibDDetectionParam& param);
  ELibDReturnCode CheckDetectionParamDetectionArea(SLibDDetectionParam& param);
  // Motion: device/ptz_motion.cpp
  void GetDirectionFromPanTiltSpeed(int pan, int tilt, ELibDPanTiltDirection& direction);
  // 0, or 1 when the request cannot be opened.
  int SendPTZCommands(int pan, int tilt, const ELibDPanTiltDirection& direction);
  int SendPTZCommandForCenterDirection();
  /// False leaves both angles: no zoom ratios are known, or an angle or ratio is 0.
  bool GetViewingAngles(int zoom, int& horizontal, int& vertical);                      // device/ptz_position.cpp
  bool GetTextByTourSequenceList(const std::vector<int>& sequence, std::string& text);  // device/camera_tours.cpp
  bool GetTourSequenceListByText(std::string text, std::vector<int>& sequence);
  void Log(const char* direction, const char* message);  // device/connection.cpp
  // Identity, capabilities and current settings. What guards what: docs/architecture.md
  SLibDFixedSystemInfo m_FixedSystemInfo;
  SLibDFixedConnectionInfo m_FixedConnectionInfo;
  SLibDFixedCameraInfo m_FixedCameraInfo VEXA_GUARDED_BY(m_ConnectionLock);
  SLibDFixedAudioInfo m_FixedAudioInfo VEXA_GUARDED_BY(m_ConnectionLock);
  SLibDFixedPTZControlInfo m_FixedPTZControlInfo;
  SLibDCameraInfo m_CameraInfo VEXA_GUARDED_BY(m_ConnectionLock);
  CResolutionFilterFacade m_ResolutionFilter VEXA_GUARDED_BY(m_ConnectionLock);
  SLibDAudioInfo m_AudioInfo VEXA_GUARDED_BY(m_ConnectionLock);
  SLibDPTZControlInfo m_PTZControlInfo VEXA_GUARDED_BY(m_ConnectionLock);
  SLibDIoBoxInfo m_IoBoxInfo VEXA_GUARDED_BY(m_ConnectionLock);
  std::string m_LatestErrorText;                                   ///< as vexa::ErrorRecord keeps it
  bool m_ContinuousPTZ VEXA_GUARDED_BY(m_ConnectionLock) = false;  ///< the camera takes signed continuous speeds
  int m_ChannelId VEXA_GUARDED_BY(m_ConnectionLock) = 0;
  SLibDConnectionInfo m_ConnectionInfo VEXA_GUARDED_BY(m_ConnectionLock);
  ELibDReturnCode m_LatestErrorCode = LIBD_FAILED;
  // What the model class states about the camera
  bool m_FixedCameraInfoAvailable = false, m_FixedPTZControlInfoAvailable = false, m_FixedIoBoxInfoAvailable = false;
  bool m_UseMotionDetection = false;            ///< detection windows report as "MdWin"
  bool m_LodDetection = false;                  ///< the camera has LOD detection
  bool m_EdgeStorageSupported = false;          ///< the camera has a card
  std::uint32_t m_CameraType = 0;               ///< bit set asked by GetCameraType
  std::vector<SLibDZoomRatioInt> m_ZoomRatios;  ///< ascending by position
  SLibDFixedIoBoxInfo m_FixedIoBoxInfo;
  // The RTSP session
  int m_SavedTimeout VEXA_GUARDED_BY(m_ConnectionLock) = 0;  ///< milliseconds; put back after a raised time-out
  int m_RtspSocket = -1;
  int m_StreamSocket VEXA_GUARDED_BY(m_VideoStateLock) = -1;  ///< media: RTP over UDP, or the HTTP image stream
  std::string m_RtspUrl;
  int m_RtspSession = 0, m_RtspCSeq = 0;
  char m_BasicCredentials[345] = {};     ///< Base64 of at most 255 characters
  std::int64_t m_RangeClockSeconds = 0;  ///< start of the range clock, seconds since 1970-01-01 UTC
  int m_RangeClockMicros = 0;
  int m_RtpClockRate = 0;  ///< ticks a second
  bool m_EdgeStoragePlayback = false;
  int m_PlaybackScale = 1;
  bool m_NoTearDown VEXA_GUARDED_BY(m_VideoStateLock) = false;
  int m_KeepAlivePeriod = 1;  ///< seconds
  std::time_t m_LastKeepAliveTime = 0;
  bool m_FirstPlaybackFrame = false;
  std::uint32_t m_PlaybackBaseTimestamp = 0;
  std::string m_EdgeStorageCodec;                                            ///< of the playback under way
  SLibDEdgeStorageMode m_EdgeStorageMode VEXA_GUARDED_BY(m_ConnectionLock);  ///< as last sent
  // RTP packets: the streaming thread's
  std::vector<SPacketInfo> m_RtpPackets;       ///< sorted; the data lie in m_RtpPacketBuffer
  unsigned char* m_RtpPacketBuffer = nullptr;  ///< 2097152 bytes from malloc while RTP streams
  // The bytes of an elementary HTTP stream: the streaming thread's
  unsigned char* m_StreamBuffer = nullptr;
  std::size_t m_StreamBufferSize = 0;
  unsigned char* m_StreamFrameStart = nullptr;  ///< first byte of the frame not handed out yet
  unsigned char* m_StreamSearchPos = nullptr;   ///< where the next start code is looked for
  unsigned char* m_StreamWriteEnd = nullptr;    ///< end of the bytes received
  // The streaming thread and the frame queue
  CSimpleLock m_VideoStateLock;
  bool m_StopVideoRequested VEXA_GUARDED_BY(m_VideoStateLock) = false;
  CSimpleLock m_FrameQueueLock;
  std::deque<VideoFrameInfo> m_FrameQueue VEXA_GUARDED_BY(m_FrameQueueLock);
  bool m_VideoTimedOut VEXA_GUARDED_BY(m_FrameQueueLock) = false;
  bool m_LargeFrameBuffers VEXA_GUARDED_BY(m_FrameQueueLock) = false;
  unsigned char* m_StagingBuffer = nullptr;
  std::size_t m_StagingBufferSize = 0;
  std::time_t m_LastFrameTime = 0;
  typedHandle* m_StreamingThread = nullptr;
  typedHandle* m_StopVideoEvent = nullptr;
  int m_StreamWaitMs = 1;  ///< wait for the stop event after a read that did not wait for it itself
  bool m_RtpLiveMode = false;
  CSimpleLock m_CamPosLock;
  std::string m_CamPosText VEXA_GUARDED_BY(m_CamPosLock);
  // The polled streams and the cached camera inquiry
  CSimpleLock m_CameraInquiryLock;
  std::string m_CameraInquiryCache VEXA_GUARDED_BY(m_CameraInquiryLock);
  CSimpleLock m_AudioLock;
  int m_AudioSocket VEXA_GUARDED_BY(m_AudioLock) = -1;
  std::time_t m_LastAudioTime VEXA_GUARDED_BY(m_AudioLock) = 0;  ///< of the last data, or of the opening
  CSimpleLock m_IoStreamLock;
  int m_IoStreamSocket VEXA_GUARDED_BY(m_IoStreamLock) = -1;
  std::vector<SLibDPinInfo> m_PendingPins VEXA_GUARDED_BY(m_IoStreamLock);
  std::time_t m_LastIoDataTime VEXA_GUARDED_BY(m_IoStreamLock) = 0;        ///< when pins were last handed out
  std::time_t m_TamperingActiveSince VEXA_GUARDED_BY(m_IoStreamLock) = 0;  ///< 0 while no tampering is reported
  CSimpleLock m_MdStreamLock;
  int m_MdStreamSocket VEXA_GUARDED_BY(m_MdStreamLock) = -1;
  std::time_t m_LastMdDataTime VEXA_GUARDED_BY(m_MdStreamLock) = 0;  ///< of the last part, or of the opening
  std::map<std::string, int> m_InquirySizes;                         ///< answer buffer in bytes by inquiry name
  CFileLogger m_CGILogger;
  char m_CGILogPath[1024] VEXA_GUARDED_BY(m_ConnectionLock) = {};
  CSimpleLock m_ConnectionLock;
  std::atomic<bool> m_CGILogEnabled{false};

  friend struct vexa::DriverState;
  std::unique_ptr<vexa::DriverState> m_State;  ///< the rest of its state, and the steps that members share
};
