// The contract between a video-management host and a device driver.
#pragma once

#include <string>
#include <vector>

#include "vexa/audio_info.h"
#include "vexa/common_types.h"
#include "vexa/edge_storage_info.h"
#include "vexa/export.h"
#include "vexa/image_info.h"
#include "vexa/io_info.h"
#include "vexa/ptz_info.h"
#include "vexa/return_codes.h"
#include "vexa/system_info.h"
#include "vexa/video_info.h"

/// One camera, as a host drives it. A host creates a driver, sets its connection, calls operations from any of its
/// threads, stops what it started and destroys the driver.
///
/// **Slots.** The order of the virtual operations is the contract with hosts built elsewhere: operations are never
/// moved, only added at the end. This class is what a driver does not override: LIBD_NOT_SUPPORTED, unless a line gives
/// another result.
///
/// **Threads.** Any thread may call any operation at any time, with three exceptions: SetCurrentConnectionInfo is
/// called while no stream and no other operation is running, one record is not passed to two threads at once, and a
/// driver is destroyed when no other thread uses it. No operation may be called from CDataSink::Write.
///
/// **Records** that are passed by reference are the caller's; no driver keeps a pointer to them.
///
/// **Results.** LIBD_OK on success. An operation that sends a request may return
/// - LIBD_TIMEOUT: the camera could not be connected to, or did not finish its answer, within the time-out;
/// - LIBD_UNAUTHORIZED: the camera answered 401;
/// - LIBD_FAILED: any other failure: the camera's refusal, an error of the system, out of memory, an answer that never
///   began, or an answer without the value that was asked for. The last two leave no text of their own.
///
/// "Sends" or "asks" below stands for these three results besides LIBD_OK; further results are named.
/// GetLatestErrorText returns the reason. LIBD_INVALID_ARGUMENT and LIBD_NOT_SUPPORTED are returned before anything is
/// sent. On failure a record is left as it was, and so are the driver's own settings, unless a line says otherwise.
/// What the camera has done is not known after a time-out: its answer may have been lost, not the request.
///
/// **Blocking.** An operation that sends nothing waits for locks alone, and these are held for microseconds; the sink
/// of another thread, while it copies a frame, and the polls of the same stream are the exceptions. "Time-out" is
/// SLibDConnectionInfo::timeout. A request waits for the time-out up to three times: for the connection, for the first
/// byte of the answer, and for the rest of its header; a question to the camera waits once more, for the answer's body.
/// A host name is resolved before, which takes as long as the system's resolver does; a dotted address takes no time.
/// Where a line names another time-out, it replaces the connection's, for requests of other threads too, until the
/// operation returns.
class VEXA_API CLibraryDevice {
 public:
  CLibraryDevice() = default;
  CLibraryDevice(const CLibraryDevice&) = default;
  CLibraryDevice& operator=(const CLibraryDevice&) = default;
  virtual ~CLibraryDevice();

  // System, connection and video: what a camera is and can do
  /// Copies what the model class states about the camera into `info`. Sends nothing. LIBD_OK.
  virtual ELibDReturnCode GetFixedSystemInfo(SLibDFixedSystemInfo& info);
  /// Copies the fixed description of the connection into `info`. Sends nothing. LIBD_OK.
  virtual ELibDReturnCode GetFixedConnectionInfo(SLibDFixedConnectionInfo& info);
  /// Copies what the camera's video can do into `info`. Sends nothing. LIBD_OK; LIBD_NOT_SUPPORTED until a model class
  /// has filled it.
  virtual ELibDReturnCode GetFixedCameraInfo(SLibDFixedCameraInfo& info);
  /// Empties the record's lists; the other fields stay. LIBD_OK.
  virtual ELibDReturnCode ClearFixedCameraInfo(SLibDFixedCameraInfo& info);
  /// Passes the standard that the host shows to the model class; what is offered stays until the camera reports its
  /// standard. Sends nothing, unless the model class does. LIBD_OK.
  virtual ELibDReturnCode SetVideoStandard(ELibDVideoStandard standard);
  /// Narrows the offered sizes to those that this capture size (pixels; not above 0: no size is given) leaves. It
  /// replaces the property that the host set before. Sends nothing, unless the model class does. LIBD_OK; LIBD_FAILED
  /// when out of memory.
  virtual ELibDReturnCode SetVidCapSize(int width, int height);
  /// The same for the state of solid PTZ.
  virtual ELibDReturnCode SetSolidPTZState(bool on);
  /// The same for the largest size (pixels; not above 0: no size is given).
  virtual ELibDReturnCode SetImageMaxSize(int width, int height, ELibDVideoStandard standard);
  /// Copies what the camera's audio can do into `info`. Sends nothing. LIBD_OK; LIBD_NOT_SUPPORTED for a camera without
  /// audio.
  virtual ELibDReturnCode GetFixedAudioInfo(SLibDFixedAudioInfo& info);
  /// Empties the record's lists; the other fields stay. LIBD_OK.
  virtual ELibDReturnCode ClearFixedAudioInfo(SLibDFixedAudioInfo& info);
  /// Copies what the camera's I/O can do into `info`. Sends nothing. LIBD_OK; LIBD_NOT_SUPPORTED until a model class
  /// has filled it.
  virtual ELibDReturnCode GetFixedIoboxInfo(SLibDFixedIoBoxInfo& info);
  /// Copies what the camera's PTZ can do into `info`. Sends nothing. LIBD_OK; LIBD_NOT_SUPPORTED until a model class
  /// has filled it.
  virtual ELibDReturnCode GetFixedPTZControlInfo(SLibDFixedPTZControlInfo& info);
  /// Empties the record's lists; the other fields stay. LIBD_OK.
  virtual ELibDReturnCode ClearFixedPTZControlInfo(SLibDFixedPTZControlInfo& info);

  // Current settings
  /// Asks the camera what it is, in two questions. Fields that the camera does not name stay; when the second question
  /// fails, those of the first are filled. Some variants also move the picture to the network (see vexa_variants.h).
  virtual ELibDReturnCode GetCurrentSystemInfo(SLibDSystemInfo& info);
  /// Copies the connection into `info`, the password included. Sends nothing. LIBD_OK.
  virtual ELibDReturnCode GetCurrentConnectionInfo(SLibDConnectionInfo& info);
  /// Asks the camera for the settings of the video stream `info.streamNumber`, and narrows what is offered by what it
  /// reports. Fills the whole record, the stream number too: set it before each call. A failure also forgets the answer
  /// that the getters of image controls read from, and may have taken the video standard, the capture size and the
  /// like.
  virtual ELibDReturnCode GetCameraInfo(SLibDCameraInfo& info);
  /// Asks the camera for the codec of its audio input. The other fields are those last set; a codec that is not known
  /// leaves the codec last set.
  virtual ELibDReturnCode GetAudioInfo(SLibDAudioInfo& info);
  /// Appends the camera's pins to `info.pins`, which is not emptied, and asks for the states of its detectors. A camera
  /// without detectors is not asked. On failure the pins appended so far stay in the list.
  virtual ELibDReturnCode GetIoBoxInfo(SLibDIoBoxInfo& info);
  /// Copies the control settings that SetPTZControlInfo stored. Sends nothing. LIBD_OK.
  virtual ELibDReturnCode GetPTZControlInfo(SLibDPTZControlInfo& info);
  /// Asks the camera for its tours: an entry for each of SLibDFixedPTZControlInfo::tourCount, at most five.
  virtual ELibDReturnCode GetCameraTourInfo(SLibDCameraTourInfo& info);
  /// Empties the record's map; the other fields stay. LIBD_OK.
  virtual ELibDReturnCode ClearCameraTourInfo(SLibDCameraTourInfo& info);
  /// Asks the camera for its shadow tours, at most five. LIBD_NOT_SUPPORTED for a camera without any.
  virtual ELibDReturnCode GetShadowTourInfo(SLibDShadowTourInfo& info);
  /// Empties the record's map; the other fields stay. LIBD_OK.
  virtual ELibDReturnCode ClearShadowTourInfo(SLibDShadowTourInfo& info);
  /// Not offered by the driver: LIBD_NOT_SUPPORTED.
  virtual ELibDReturnCode SetCurrentSystemInfo(SLibDSystemInfo& info);
  /// Stores where the camera is and opens the CGI log that SetCGILogPath named. Sends nothing. LIBD_OK, also when the
  /// log cannot be opened; LIBD_FAILED when out of memory.
  virtual ELibDReturnCode SetCurrentConnectionInfo(SLibDConnectionInfo& info);
  /// Sets codec, size, rate and quality, or bit rate, of the stream `info.streamNumber` in one request; for cameras
  /// with an electronic flip the rotation too. Nothing is checked here: the camera refuses what it does not offer. The
  /// driver's own record, and so the stream and codec that StartVideoStreaming opens, changes on success alone.
  virtual ELibDReturnCode SetCameraInfo(SLibDCameraInfo& info);
  /// Sends the codec of the audio input ("G726", with its bit rate; any other is "G711") and switches the input on. The
  /// driver's own record changes on success alone.
  virtual ELibDReturnCode SetAudioInfo(SLibDAudioInfo& info);
  /// Not offered by the driver: LIBD_NOT_SUPPORTED.
  virtual ELibDReturnCode SetIoBoxInfo(SLibDIoBoxInfo& info);
  /// Stores the control settings; brightMode decides what Bright and BrightAbsolute set. Sends nothing. LIBD_OK.
  virtual ELibDReturnCode SetPTZControlInfo(SLibDPTZControlInfo& info);
  /// Sends all tours at once. LIBD_INVALID_ARGUMENT unless there is one entry for each tour of the camera (at most
  /// five), each with a sequence, and at most one is on.
  virtual ELibDReturnCode SetCameraTourInfo(SLibDCameraTourInfo& info);
  /// Sends that the video stream numbered `id` is off. For a camera with a single stream: LIBD_OK, and nothing is sent.
  virtual ELibDReturnCode SetCameraInfoFromID(unsigned int id);
  /// Sends all shadow tours at once. LIBD_INVALID_ARGUMENT unless there is one entry for each (at most five) and at
  /// most one is on; LIBD_NOT_SUPPORTED for a camera without any.
  virtual ELibDReturnCode SetShadowTourInfo(SLibDShadowTourInfo& info);

  // Live video
  /// Stops a running stream, opens a new one by the stored settings and starts the thread that receives it.
  /// LIBD_FAILED, without a text, while a stop is in progress; LIBD_STREAM_OPEN_FAILED when the RTSP session cannot be
  /// opened. After a failure nothing streams. Blocks as StopVideoStreaming, then for one request (HTTP), or for three
  /// requests and the steps of an RTSP session, which may each wait for 40 s. The camera is reached on port 554 for
  /// RTSP.
  virtual ELibDReturnCode StartVideoStreaming();
  /// Ends the stream and its thread, and drops the frames that wait. LIBD_OK, also when nothing streams; LIBD_FAILED
  /// while another stop is in progress. Blocks until the thread's present read has ended, and over RTSP up to 15 s more
  /// for the camera's answer to TEARDOWN. A start in another thread is let finish first.
  virtual ELibDReturnCode StopVideoStreaming();
  /// Hands the oldest waiting frame to `frame.sink` and fills the other fields. Never waits for the camera.
  /// LIBD_NO_FRAME when no frame waits: ask again. LIBD_TIMEOUT, once, when the stream has been silent for longer than
  /// the time-out. Neither leaves a text, and both leave `frame` as it was. One thread at a time gets each frame.
  virtual ELibDReturnCode GetCurrentVideoFrame(SLibDVideoFrameInfo& frame);

  // Audio
  /// Stops a running audio stream and opens a new one. After a failure the stream is closed. Waits for a poll in
  /// progress.
  virtual ELibDReturnCode StartAudioStreaming();
  /// Closes the audio stream; waits for a poll in progress. Sends nothing. LIBD_OK.
  virtual ELibDReturnCode StopAudioStreaming();
  /// Reads what audio has come, at most `frame.capacity` bytes, and waits for it up to 1 s whatever the time-out. It
  /// need not begin or end with a frame. LIBD_NO_FRAME when none has come, LIBD_TIMEOUT once none has for longer than
  /// the time-out: both leave `frame.length`. LIBD_FAILED when the stream is closed.
  virtual ELibDReturnCode GetCurrentAudioFrame(SLibDAudioFrameInfo& frame);
  /// Not offered by the driver: LIBD_NOT_SUPPORTED.
  virtual ELibDReturnCode StartAudioUpLoad();
  /// Not offered by the driver: LIBD_NOT_SUPPORTED.
  virtual ELibDReturnCode StopAudioUpload();
  /// Not offered by the driver: LIBD_NOT_SUPPORTED.
  virtual ELibDReturnCode SetAudioUploadFrame(SLibDAudioFrameInfo& frame);

  // Alarm pins
  /// Stops a running alarm stream, switches the camera's alarm data on, opens a new stream and asks for the inputs'
  /// present states, which the next poll returns. Time-out of the requests: 10 s. Blocks for 100 ms more. After a
  /// failure the stream is closed; when the camera refused the stream, the connection's time-out is 3 s until
  /// SetCurrentConnectionInfo.
  virtual ELibDReturnCode StartIoStreaming();
  /// Closes the alarm stream and, if it was open, sends that the camera's alarm data are off; waits for a poll in
  /// progress. The stream is closed whatever the result.
  virtual ELibDReturnCode StopIoStreaming();
  /// Reads the pins whose states changed into `pins`, waiting up to twice the time-out. An empty list is handed in:
  /// states that the camera sends are appended, the first ones after a start replace it. LIBD_NO_FRAME when none has
  /// come, LIBD_TIMEOUT once none has for 15 s longer than the time-out. LIBD_FAILED when the stream is closed. A
  /// tampering alarm of a minute is cleared by a request (time-out 10 s), whose failure is returned although `pins` is
  /// filled.
  virtual ELibDReturnCode GetCurrentIoStatus(std::vector<SLibDPinInfo>& pins);
  /// Sends that the alarm output `pin.number`, counted from 1, is on (`pin.state` not 0) or off. The number is not
  /// checked.
  virtual ELibDReturnCode SetOutput(SLibDPinInfo& pin);

  // Pan, tilt, zoom and focus
  /// Fills `status` with where the camera's latest picture was taken. Sends nothing, so it needs a running video
  /// stream. `status.moving` is set and never cleared. LIBD_FAILED, without a text, before any picture gave a position,
  /// and when the model class gave no zoom ratios or viewing angles; the other fields then stay.
  virtual ELibDReturnCode GetCurrentPosition(SLibDPTZStatus& status);
  /// Sends a motion at these speeds, each -10000 to 10000 of the camera's greatest: right and up are above 0. Both 0,
  /// or both rounded to 0 in the camera's units, stop the camera. It moves until the next motion or stop.
  virtual ELibDReturnCode PanTilt(int pan, int tilt);
  /// Sends a motion to a position, each coordinate 0 (left end, low end) to 10000 (right end, high end).
  virtual ELibDReturnCode PanTiltAbsolute(int x, int y);
  /// Sends a motion that centres the picture on a point: 0 (left, top) to 10000 (right, bottom) of its width and
  /// height. `size` is the picture's, in pixels; LIBD_INVALID_ARGUMENT unless both sides are above 0.
  virtual ELibDReturnCode PanTiltDirect(int x, int y, const SLibDResolutionInfo& size);
  /// Sends a zoom at this speed, -10000 (wide) to 10000 (tele) of the camera's greatest; 0 stops it.
  virtual ELibDReturnCode Zoom(int speed);
  /// Sends a zoom to a position, 0 (wide end) to 10000 (tele end).
  virtual ELibDReturnCode ZoomAbsolute(int position);
  /// Sends a zoom by a step, -100 to 100 percent of the camera's whole step; above 0 is towards tele.
  virtual ELibDReturnCode ZoomRelative(int step);
  /// Sends a motion that fills the picture with an area: the point (x, y) is its *centre*; all four are 0 to 10000 of
  /// the picture's sides. `size` as for PanTiltDirect.
  virtual ELibDReturnCode ZoomArea(int x, int y, int width, int height, const SLibDResolutionInfo& size);
  /// Sends automatic or manual focus.
  virtual ELibDReturnCode SetFocusMode(bool automatic);
  /// Sends a change of focus at this speed, -10000 (far) to 10000 (near) of the camera's greatest; 0 stops it.
  virtual ELibDReturnCode Focus(int speed);
  /// Sends a change of focus to a position, 0 to 10000 from the model's least to its greatest.
  virtual ELibDReturnCode FocusAbsolute(int position);

  // Exposure
  /// Sends the exposure mode: "Full auto", "Shutter Priority" or "Iris Priority". LIBD_INVALID_ARGUMENT for an empty
  /// text; LIBD_FAILED for another one, and nothing is sent. The stored mode stays: store it with SetPTZControlInfo.
  virtual ELibDReturnCode SetBrightMode(std::string& mode);
  /// Sends that back-light compensation is on or off.
  virtual ELibDReturnCode SetBackLightCompMode(bool on);
  /// Asks for the present shutter or iris value, by the stored exposure mode, and sends the next larger one of the
  /// model's list (`step` above 0) or the next smaller one (below 0). LIBD_OK, and nothing is sent, at the end of the
  /// list. LIBD_INVALID_ARGUMENT for 0 and outside -10000 to 10000; LIBD_INVALID_MODE unless the stored mode is
  /// "Shutter Priority" or "Iris Priority".
  virtual ELibDReturnCode Bright(int step);
  /// Sends the shutter or iris value at a level of 0 to 10000 of the largest in the model's list. LIBD_OK, and nothing
  /// is sent, without a list. LIBD_INVALID_MODE as Bright.
  virtual ELibDReturnCode BrightAbsolute(int level);

  // Presets
  /// Asks the camera for the names of its presets: one entry for each that the model has. `presets` is replaced before
  /// the camera is asked: on failure it holds the entries without, or with some of, their names.
  virtual ELibDReturnCode GetPresets(std::vector<SLibDPresetInfo>& presets);
  /// Empties the list and all it holds. LIBD_OK.
  virtual ELibDReturnCode ClearCachedPresets(std::vector<SLibDPresetInfo>& presets);
  /// Sends that the preset `index`, counted from 0, is deleted. LIBD_INVALID_ARGUMENT beyond the model's number of
  /// presets.
  virtual ELibDReturnCode ClearPreset(int index);
  /// Sends that the present position is stored as `preset.index`, counted from 0, under `preset.name`. Time-out: 10 s.
  /// LIBD_INVALID_ARGUMENT for an empty name, and beyond the model's number of presets.
  virtual ELibDReturnCode SetPreset(SLibDPresetInfo& preset);
  /// Sends a motion to the preset `index`, counted from 0. LIBD_INVALID_ARGUMENT beyond the model's number of presets.
  virtual ELibDReturnCode RecallPreset(int index);

  // Image controls
  /// Reads the day/night mode from the camera's answer to the last GetCameraInfo; asks the camera when there is none. A
  /// mode set since then does not show. LIBD_FAILED when the answer lacks it, or names another (`mode` is then
  /// LIBD_DAYNIGHT_UNKNOWN).
  virtual ELibDReturnCode GetDayNightMode(ELibDDayNightType& mode);
  /// Sends the day/night mode. LIBD_INVALID_ARGUMENT for a value that is none to set.
  virtual ELibDReturnCode SetDayNightMode(ELibDDayNightType mode);
  /// Reads the visibility enhancer, from the same answer as GetDayNightMode. LIBD_FAILED when the answer lacks it.
  virtual ELibDReturnCode GetVisibilityEnhancerMode(ELibDVisibilityEnhancerType& mode);
  /// Sends the level of the visibility enhancer. LIBD_INVALID_ARGUMENT for an unknown one.
  virtual ELibDReturnCode SetVisibilityEnhancerMode(ELibDVisibilityEnhancerType mode);
  /// Reads the level of noise reduction, from the same answer as GetDayNightMode. LIBD_FAILED when the answer lacks it.
  virtual ELibDReturnCode GetXdnrMode(ELibDXdnrType& mode);
  /// Sends the level of noise reduction. LIBD_INVALID_ARGUMENT for an unknown one.
  virtual ELibDReturnCode SetXdnrMode(ELibDXdnrType mode);
  /// Reads whether wide dynamic range is on, from the same answer as GetDayNightMode. LIBD_FAILED when the answer lacks
  /// it.
  virtual ELibDReturnCode GetViewDR(ELibDViewDRMode& mode);
  /// Sends that wide dynamic range is on or off. LIBD_INVALID_ARGUMENT for an unknown value.
  virtual ELibDReturnCode SetViewDR(ELibDViewDRMode mode);
  /// Reads the infrared illuminator, from the same answer as GetDayNightMode. LIBD_FAILED when the answer lacks either
  /// value; `mode` may then be filled.
  virtual ELibDReturnCode GetIRIlluminator(ELibIRIlluminatorMode& mode, int& strength);
  /// Sends the mode of the infrared illuminator (any but LIB_IR_DAYNIGHT is off) and its greatest strength, in the
  /// camera's unit and not checked.
  virtual ELibDReturnCode SetIRIlluminator(ELibIRIlluminatorMode mode, int strength);

  // Shadow tours
  /// Sends that the shadow tour `number`, counted from 1, plays and all others are off. LIBD_INVALID_ARGUMENT beyond
  /// the model's number, of which five can be named.
  virtual ELibDReturnCode StartShadowTour(int number);
  /// Sends that no shadow tour plays.
  virtual ELibDReturnCode StopShadowTour();
  /// Sends that the camera records its movements as the shadow tour `number`. LIBD_INVALID_ARGUMENT as StartShadowTour.
  virtual ELibDReturnCode StartRecordShadowTour(int number);
  /// Sends the end of the recording.
  virtual ELibDReturnCode StopRecordShadowTour();
  /// Sends that the shadow tour `number` plays once. LIBD_INVALID_ARGUMENT as StartShadowTour.
  virtual ELibDReturnCode StartPreviewShadowTour(int number);
  /// Sends the end of the preview.
  virtual ELibDReturnCode StopPreviewShadowTour();

  // Detection and motion metadata
  /// Asks the camera for its detection settings (time-out 10 s, for an LOD camera the connection's) and replaces
  /// `params`. `mode` is filled where the answer names it. LIBD_FAILED, and an empty list, when an LOD camera's answer
  /// lacks a value.
  virtual ELibDReturnCode GetObjectDetectionSetting(std::vector<SLibDDetectionParam>& params, ELibDPositionMode& mode);
  /// Empties the list and all it holds. LIBD_OK.
  virtual ELibDReturnCode ClearCachedObjectDetectionSetting(std::vector<SLibDDetectionParam>& params);
  /// Sends one detection setting in three requests (time-out 10 s), for an LOD camera in one. LIBD_INVALID_ARGUMENT
  /// unless each window's area has two points; for an LOD camera, unless size class (0 to 2) and sensitivity (1 to 100)
  /// are right. When one request fails, those before it have taken effect.
  virtual ELibDReturnCode SetDetectionParam(SLibDDetectionParam& param);
  /// Empties each window's area; the other fields stay. LIBD_OK.
  virtual ELibDReturnCode ClearDetectionParam(SLibDDetectionParam& param);
  /// Sends whether detection settings belong to the presets (LIBD_POSITION_PRESET) or to the current view (any other
  /// value).
  virtual ELibDReturnCode SetPositionMode(ELibDPositionMode mode);
  /// Closes a running metadata stream and opens a new one. After a failure the stream is closed. Waits for a poll in
  /// progress.
  virtual ELibDReturnCode StartModRawData();
  /// Reads one frame of motion metadata; waits up to 2 s for its header and up to the time-out for its body.
  /// LIBD_NO_FRAME when none has come, LIBD_TIMEOUT once none has for longer than the time-out. LIBD_FAILED when the
  /// stream is closed.
  virtual ELibDReturnCode GetCurrentPosition(SLibDRawMDFrameInfo& frame);
  /// Closes the metadata stream; waits for a poll in progress. Sends nothing. LIBD_OK. The driver's end does not do it.
  virtual ELibDReturnCode StopModRawData();
  /// Sends that the tampering detector is on or off, and its level. The driver's own record takes the level also when
  /// the camera refuses. LIBD_INVALID_ARGUMENT for an unknown level.
  virtual ELibDReturnCode SetTamperingAlarm(bool on, ELibDTamperLevel level);
  /// Sends that the audio detector is on or off. LIBD_NOT_SUPPORTED for a camera without one.
  virtual ELibDReturnCode SetAudioDetection(bool on);
  /// Chooses how the driver reads detection in the alarm stream. Sends nothing. LIBD_OK; LIBD_INVALID_ARGUMENT for an
  /// unknown value.
  virtual ELibDReturnCode SetVMDtype(ELibDVMDType type);

  // Driver
  /// Copies the text of the driver's latest failure, in whichever thread it was; empty before the first. A success
  /// leaves it. Sends nothing. LIBD_OK; LIBD_FAILED, and the text stays, when out of memory.
  virtual ELibDReturnCode GetLatestErrorText(std::string& text);
  /// Not offered by the driver: LIBD_NOT_SUPPORTED.
  virtual ELibDReturnCode GetVideoStatus(int channel);
  /// For drivers of analog devices; false in all others.
  virtual bool GetAnalogDeviceInitializedStatus();
  /// Asks where the camera sends its picture. LIBD_NOT_SUPPORTED but for the variants that override it.
  virtual ELibDReturnCode GetVideoOutMode(ELibVideoOutMode& mode);
  /// Whether the camera has one of the bits of `type`: LIBD_OK or LIBD_FAILED. Sends nothing.
  virtual ELibDReturnCode GetCameraType(ELibCameraType type);
  /// Not offered by the driver: LIBD_NOT_SUPPORTED.
  virtual ELibDReturnCode ImportCapabilities(const std::string& capabilities);
  /// Not offered by the driver: LIBD_NOT_SUPPORTED.
  virtual ELibDReturnCode ExportCapabilities(std::string& capabilities);
  /// Switches the CGI log on or off at once. Sends nothing. LIBD_OK.
  virtual ELibDReturnCode SetCGILogLevel(bool on);
  /// Names the file of the CGI log, at most 1023 bytes (the rest is cut); the next SetCurrentConnectionInfo opens it.
  /// Null leaves the name. Sends nothing. LIBD_OK.
  virtual ELibDReturnCode SetCGILogPath(const char* path);
  /// For drivers of encoder devices; LIBD_OK in all others.
  virtual ELibDReturnCode InitializeEncoderDevice();
  /// For drivers of encoder devices; LIBD_OK in all others.
  virtual ELibDReturnCode CloseEncoderDevice();

  // Recordings on the camera's card
  /// Copies the recording mode that SetEdgeStorageMode last set. Sends nothing. LIBD_OK; LIBD_NOT_SUPPORTED for a
  /// camera without a card.
  virtual ELibDReturnCode GetEdgeStorageMode(SLibDEdgeStorageMode& mode);
  /// Sends the recording mode. LIBD_TIMEOUT whenever the camera does not take it, whatever the reason: the stored mode
  /// stays. When recording goes on, the camera is asked for its free space: LIBD_NO_FRAME when the card is full, and
  /// the mode is stored. LIBD_NOT_SUPPORTED for a camera without a card.
  virtual ELibDReturnCode SetEdgeStorageMode(const SLibDEdgeStorageMode& mode);
  /// Stops a running stream and plays the recording `info.streamName` in its place. Results and blocking are those of
  /// StartVideoStreaming over RTSP.
  virtual ELibDReturnCode StartEdgeStorageVideoStreaming(const SLibDEdgeStorageStreamingInfo& info);
  /// Asks the camera for its recordings, oldest first, and replaces the list. Time-out: 10 s.
  virtual ELibDReturnCode GetEdgeStorageRecordList(SLibDEdgeStorageRecordList& list);
  /// Empties the list and all it holds. LIBD_OK.
  virtual ELibDReturnCode ClearEdgeStorageRecordList(SLibDEdgeStorageRecordList& list);
  /// Sends that every recording is deleted. Time-out: 20 s.
  virtual ELibDReturnCode DeleteAllEdgeStorageRecord();
  /// Sends that the recording `info.streamName` is deleted. Time-out: 10 s. LIBD_FAILED for an empty name, and nothing
  /// is sent.
  virtual ELibDReturnCode DeleteEdgeStorageRecordByName(const SLibDEdgeStorageStreamingInfo& info);
  /// Chooses whether sessions end without a TEARDOWN, live ones too. Sends nothing. LIBD_OK; LIBD_NOT_SUPPORTED for a
  /// camera without a card.
  virtual ELibDReturnCode SetEdgeStorageNoTearDown(bool noTearDown);
};
