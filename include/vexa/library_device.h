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

/// One camera, as a host drives it. A host creates a driver, tells it the connection, calls operations from any of its
/// threads, stops what it started and destroys the driver.
///
/// The order of the virtual operations is the contract with hosts built elsewhere: operations are never moved, only
/// added at the end. This class answers for what a driver does not offer: LIBD_NOT_SUPPORTED, unless a line says
/// otherwise. Records passed by reference are the caller's; no driver keeps a pointer to them. An operation that fails
/// in the transport returns LIBD_FAILED, LIBD_TIMEOUT or LIBD_UNAUTHORIZED and leaves the reason in GetLatestErrorText;
/// an argument out of its range gives LIBD_INVALID_ARGUMENT before anything is sent.
///
/// An operation that fails has changed neither the driver nor the caller's record, but for what its line names; memory
/// that runs out is such a failure, and nothing is thrown. Whether the camera has carried out a request that was sent
/// is not known then.
class VEXA_API CLibraryDevice {
 public:
  CLibraryDevice() = default;
  CLibraryDevice(const CLibraryDevice&) = default;
  CLibraryDevice& operator=(const CLibraryDevice&) = default;
  virtual ~CLibraryDevice();

  // System, connection and video: what a camera is and can do
  /// Hands out what the model class says of the camera. LIBD_OK.
  virtual ELibDReturnCode GetFixedSystemInfo(SLibDFixedSystemInfo& info);
  /// Hands out the fixed description of the connection. LIBD_OK.
  virtual ELibDReturnCode GetFixedConnectionInfo(SLibDFixedConnectionInfo& info);
  /// Hands out what the camera's video can do; LIBD_NOT_SUPPORTED until a model class has said so.
  virtual ELibDReturnCode GetFixedCameraInfo(SLibDFixedCameraInfo& info);
  /// Empties the record's lists; the other fields stay. LIBD_OK.
  virtual ELibDReturnCode ClearFixedCameraInfo(SLibDFixedCameraInfo& info);
  /// Tells the driver the standard of the video it will offer; no camera is contacted. LIBD_OK.
  virtual ELibDReturnCode SetVideoStandard(ELibDVideoStandard standard);
  /// Offers what is left under this capture size (pixels; -1: none given); no camera is contacted. LIBD_OK.
  virtual ELibDReturnCode SetVidCapSize(int width, int height);
  /// Offers what is left under this solid-PTZ state; no camera is contacted. LIBD_OK.
  virtual ELibDReturnCode SetSolidPTZState(bool on);
  /// Offers what is left under this largest size (pixels; -1: none given); no camera is contacted. LIBD_OK.
  virtual ELibDReturnCode SetImageMaxSize(int width, int height, ELibDVideoStandard standard);
  /// Hands out what the camera's audio can do; LIBD_NOT_SUPPORTED for a camera without audio.
  virtual ELibDReturnCode GetFixedAudioInfo(SLibDFixedAudioInfo& info);
  /// Empties the record's lists; the other fields stay. LIBD_OK.
  virtual ELibDReturnCode ClearFixedAudioInfo(SLibDFixedAudioInfo& info);
  /// Hands out what the camera's I/O can do; LIBD_NOT_SUPPORTED until a model class has said so.
  virtual ELibDReturnCode GetFixedIoboxInfo(SLibDFixedIoBoxInfo& info);
  /// Hands out what the camera's PTZ can do; LIBD_NOT_SUPPORTED until a model class has said so.
  virtual ELibDReturnCode GetFixedPTZControlInfo(SLibDFixedPTZControlInfo& info);
  /// Empties the record's lists; the other fields stay. LIBD_OK.
  virtual ELibDReturnCode ClearFixedPTZControlInfo(SLibDFixedPTZControlInfo& info);

  // Current settings
  /// Asks the camera what it is; fields it does not name stay. What was read before a failure stays filled.
  virtual ELibDReturnCode GetCurrentSystemInfo(SLibDSystemInfo& info);
  /// Hands out the connection record, the password included. LIBD_OK.
  virtual ELibDReturnCode GetCurrentConnectionInfo(SLibDConnectionInfo& info);
  /// Asks the camera for the settings of the video stream named by `info.streamNumber`. A failure drops the answer that
  /// the image controls read, and may have taken the video standard, the capture size and the like.
  virtual ELibDReturnCode GetCameraInfo(SLibDCameraInfo& info);
  /// Asks the camera for its audio input.
  virtual ELibDReturnCode GetAudioInfo(SLibDAudioInfo& info);
  /// Appends the camera's pins to `info.pins` (which is not cleared) and reads the detectors' states. What was appended
  /// before a failure stays.
  virtual ELibDReturnCode GetIoBoxInfo(SLibDIoBoxInfo& info);
  /// Hands out the stored control settings. LIBD_OK.
  virtual ELibDReturnCode GetPTZControlInfo(SLibDPTZControlInfo& info);
  /// Asks the camera for its tours.
  virtual ELibDReturnCode GetCameraTourInfo(SLibDCameraTourInfo& info);
  /// Empties the record's map; the other fields stay. LIBD_OK.
  virtual ELibDReturnCode ClearCameraTourInfo(SLibDCameraTourInfo& info);
  /// Asks the camera for its shadow tours; LIBD_NOT_SUPPORTED for a camera without any.
  virtual ELibDReturnCode GetShadowTourInfo(SLibDShadowTourInfo& info);
  /// Empties the record's map; the other fields stay. LIBD_OK.
  virtual ELibDReturnCode ClearShadowTourInfo(SLibDShadowTourInfo& info);
  /// Not offered by the driver: LIBD_NOT_SUPPORTED.
  virtual ELibDReturnCode SetCurrentSystemInfo(SLibDSystemInfo& info);
  /// Takes over where the camera is and opens the CGI log. Contacts no camera; call while nothing streams. LIBD_OK.
  virtual ELibDReturnCode SetCurrentConnectionInfo(SLibDConnectionInfo& info);
  /// Sets codec, size, rate and quality in one request; the driver's own record changes on success alone.
  virtual ELibDReturnCode SetCameraInfo(SLibDCameraInfo& info);
  /// Sets the codec of the audio input and switches the input on.
  virtual ELibDReturnCode SetAudioInfo(SLibDAudioInfo& info);
  /// Not offered by the driver: LIBD_NOT_SUPPORTED.
  virtual ELibDReturnCode SetIoBoxInfo(SLibDIoBoxInfo& info);
  /// Stores the control settings; no camera is contacted. LIBD_OK.
  virtual ELibDReturnCode SetPTZControlInfo(SLibDPTZControlInfo& info);
  /// Sets all tours at once; exactly as many entries as the camera has tours, at most one on.
  virtual ELibDReturnCode SetCameraTourInfo(SLibDCameraTourInfo& info);
  /// Switches the video stream numbered `id` off; on a single-stream camera LIBD_OK and nothing is sent.
  virtual ELibDReturnCode SetCameraInfoFromID(unsigned int id);
  /// Sets all shadow tours at once; exactly as many entries as the camera has, at most one on.
  virtual ELibDReturnCode SetShadowTourInfo(SLibDShadowTourInfo& info);

  // Live video
  /// Stops a running stream, opens a new one and starts its thread. LIBD_FAILED while a stop is in progress. A
  /// failure leaves no stream open.
  virtual ELibDReturnCode StartVideoStreaming();
  /// Ends the stream and its thread. LIBD_OK also when nothing streams; LIBD_FAILED while another stop is in progress.
  virtual ELibDReturnCode StopVideoStreaming();
  /// Hands the oldest waiting frame to `frame.sink`. LIBD_NO_FRAME when none waits; LIBD_TIMEOUT, once, after longer
  /// silence than the time-out.
  virtual ELibDReturnCode GetCurrentVideoFrame(SLibDVideoFrameInfo& frame);

  // Audio
  /// Stops a running audio stream and opens a new one. A failure leaves none open.
  virtual ELibDReturnCode StartAudioStreaming();
  /// Closes the audio stream; waits for a poll in progress. LIBD_OK.
  virtual ELibDReturnCode StopAudioStreaming();
  /// Reads what audio has come, at most `frame.capacity` bytes, waiting up to a second.
  virtual ELibDReturnCode GetCurrentAudioFrame(SLibDAudioFrameInfo& frame);
  /// Not offered by the driver: LIBD_NOT_SUPPORTED.
  virtual ELibDReturnCode StartAudioUpLoad();
  /// Not offered by the driver: LIBD_NOT_SUPPORTED.
  virtual ELibDReturnCode StopAudioUpload();
  /// Not offered by the driver: LIBD_NOT_SUPPORTED.
  virtual ELibDReturnCode SetAudioUploadFrame(SLibDAudioFrameInfo& frame);

  // Alarm pins
  /// Stops a running alarm stream, switches the camera's alarm data on and opens a new stream. A failure leaves none
  /// open; the camera's alarm data may stay on.
  virtual ELibDReturnCode StartIoStreaming();
  /// Closes the alarm stream and switches the camera's alarm data off; waits for a poll in progress. The stream is
  /// closed whatever the camera answers.
  virtual ELibDReturnCode StopIoStreaming();
  /// Reads the pins that changed; clears a tampering alarm on the camera after a minute. The pins stay read when the
  /// clearing fails.
  virtual ELibDReturnCode GetCurrentIoStatus(std::vector<SLibDPinInfo>& pins);
  /// Switches the alarm output `pin.number` on (`pin.state` not 0) or off.
  virtual ELibDReturnCode SetOutput(SLibDPinInfo& pin);

  // Pan, tilt, zoom and focus
  /// Says where the camera looks, as its latest picture told. LIBD_FAILED before any did, and when no angles are known,
  /// `status.moving` set all the same.
  virtual ELibDReturnCode GetCurrentPosition(SLibDPTZStatus& status);
  /// Moves at the speeds given, each -10000 to 10000; both 0 stops.
  virtual ELibDReturnCode PanTilt(int pan, int tilt);
  /// Moves to a position, each coordinate 0 to 10000 of the range.
  virtual ELibDReturnCode PanTiltAbsolute(int x, int y);
  /// Centres the picture on a point, 0 to 10000 of its width and height.
  virtual ELibDReturnCode PanTiltDirect(int x, int y, const SLibDResolutionInfo& size);
  /// Zooms at the speed given, -10000 (wide) to 10000 (tele); 0 stops.
  virtual ELibDReturnCode Zoom(int speed);
  /// Zooms to a position, 0 to 10000 of the range.
  virtual ELibDReturnCode ZoomAbsolute(int position);
  /// Zooms by a step, -100 to 100.
  virtual ELibDReturnCode ZoomRelative(int step);
  /// Fills the picture with an area: its centre and its size, 0 to 10000 of the picture's.
  virtual ELibDReturnCode ZoomArea(int x, int y, int width, int height, const SLibDResolutionInfo& size);
  /// Switches between automatic and manual focus.
  virtual ELibDReturnCode SetFocusMode(bool automatic);
  /// Focuses at the speed given, -10000 (far) to 10000 (near); 0 stops.
  virtual ELibDReturnCode Focus(int speed);
  /// Focuses to a position, 0 to 10000 of the range.
  virtual ELibDReturnCode FocusAbsolute(int position);

  // Exposure
  /// Sets the exposure mode: "Full auto", "Shutter Priority" or "Iris Priority".
  virtual ELibDReturnCode SetBrightMode(std::string& mode);
  /// Switches back-light compensation.
  virtual ELibDReturnCode SetBackLightCompMode(bool on);
  /// Takes one step along the shutter or iris list, brighter or darker by the sign of -10000 to 10000.
  virtual ELibDReturnCode Bright(int step);
  /// Sets shutter or iris to a level, 0 to 10000 of its list.
  virtual ELibDReturnCode BrightAbsolute(int level);

  // Presets
  /// Fills `presets` with one entry a preset, named as the camera says; a failure leaves them without names.
  virtual ELibDReturnCode GetPresets(std::vector<SLibDPresetInfo>& presets);
  /// Empties the list and all it holds. LIBD_OK.
  virtual ELibDReturnCode ClearCachedPresets(std::vector<SLibDPresetInfo>& presets);
  /// Forgets the preset `index`, counted from 0.
  virtual ELibDReturnCode ClearPreset(int index);
  /// Stores the present position under `preset.index`, counted from 0, and `preset.name`.
  virtual ELibDReturnCode SetPreset(SLibDPresetInfo& preset);
  /// Moves to the preset `index`, counted from 0.
  virtual ELibDReturnCode RecallPreset(int index);

  // Image controls
  /// Reads the day/night mode, from the last answer about the camera if there is one.
  virtual ELibDReturnCode GetDayNightMode(ELibDDayNightType& mode);
  /// Sets the day/night mode.
  virtual ELibDReturnCode SetDayNightMode(ELibDDayNightType mode);
  /// Reads the visibility enhancer, from the last answer about the camera if there is one.
  virtual ELibDReturnCode GetVisibilityEnhancerMode(ELibDVisibilityEnhancerType& mode);
  /// Sets the visibility enhancer.
  virtual ELibDReturnCode SetVisibilityEnhancerMode(ELibDVisibilityEnhancerType mode);
  /// Reads the noise reduction, from the last answer about the camera if there is one.
  virtual ELibDReturnCode GetXdnrMode(ELibDXdnrType& mode);
  /// Sets the noise reduction.
  virtual ELibDReturnCode SetXdnrMode(ELibDXdnrType mode);
  /// Reads the dynamic range, from the last answer about the camera if there is one.
  virtual ELibDReturnCode GetViewDR(ELibDViewDRMode& mode);
  /// Sets the dynamic range.
  virtual ELibDReturnCode SetViewDR(ELibDViewDRMode mode);
  /// Reads the infrared illuminator, from the last answer about the camera if there is one. An answer without a
  /// strength fails and has set the mode.
  virtual ELibDReturnCode GetIRIlluminator(ELibIRIlluminatorMode& mode, int& strength);
  /// Sets the infrared illuminator; the strength is sent unchanged.
  virtual ELibDReturnCode SetIRIlluminator(ELibIRIlluminatorMode mode, int strength);

  // Shadow tours
  /// Plays the shadow tour `number`, counted from 1.
  virtual ELibDReturnCode StartShadowTour(int number);
  /// Stops playing shadow tours.
  virtual ELibDReturnCode StopShadowTour();
  /// Records the shadow tour `number`, counted from 1.
  virtual ELibDReturnCode StartRecordShadowTour(int number);
  /// Ends the recording.
  virtual ELibDReturnCode StopRecordShadowTour();
  /// Previews the shadow tour `number`, counted from 1.
  virtual ELibDReturnCode StartPreviewShadowTour(int number);
  /// Ends the preview.
  virtual ELibDReturnCode StopPreviewShadowTour();

  // Detection and motion metadata
  /// Asks the camera for its detection settings.
  virtual ELibDReturnCode GetObjectDetectionSetting(std::vector<SLibDDetectionParam>& params, ELibDPositionMode& mode);
  /// Empties the list and all it holds. LIBD_OK.
  virtual ELibDReturnCode ClearCachedObjectDetectionSetting(std::vector<SLibDDetectionParam>& params);
  /// Sends one detection setting.
  virtual ELibDReturnCode SetDetectionParam(SLibDDetectionParam& param);
  /// Empties each window's area; the other fields stay. LIBD_OK.
  virtual ELibDReturnCode ClearDetectionParam(SLibDDetectionParam& param);
  /// Chooses whether detection follows the presets or the current view.
  virtual ELibDReturnCode SetPositionMode(ELibDPositionMode mode);
  /// Closes a running metadata stream and opens a new one.
  virtual ELibDReturnCode StartModRawData();
  /// Reads one frame of motion metadata.
  virtual ELibDReturnCode GetCurrentPosition(SLibDRawMDFrameInfo& frame);
  /// Closes the metadata stream; waits for a poll in progress. LIBD_OK.
  virtual ELibDReturnCode StopModRawData();
  /// Switches the tampering detector and sets its level. The driver keeps the level also when the camera refuses it.
  virtual ELibDReturnCode SetTamperingAlarm(bool on, ELibDTamperLevel level);
  /// Switches the audio detector; LIBD_NOT_SUPPORTED for a camera without one.
  virtual ELibDReturnCode SetAudioDetection(bool on);
  /// Tells the driver how the alarm stream reports detection; no camera is contacted.
  virtual ELibDReturnCode SetVMDtype(ELibDVMDType type);

  // Driver
  /// Hands out the text of the latest failure; empty before the first. LIBD_OK.
  virtual ELibDReturnCode GetLatestErrorText(std::string& text);
  /// Not offered by the driver: LIBD_NOT_SUPPORTED.
  virtual ELibDReturnCode GetVideoStatus(int channel);
  /// Of analog devices: false.
  virtual bool GetAnalogDeviceInitializedStatus();
  /// Reads where the camera puts its picture; some variants offer it.
  virtual ELibDReturnCode GetVideoOutMode(ELibVideoOutMode& mode);
  /// 1 when the camera has a bit of `type`, else 0.
  virtual ELibDReturnCode GetCameraType(ELibCameraType type);
  /// Not offered by the driver: LIBD_NOT_SUPPORTED.
  virtual ELibDReturnCode ImportCapabilities(const std::string& capabilities);
  /// Not offered by the driver: LIBD_NOT_SUPPORTED.
  virtual ELibDReturnCode ExportCapabilities(std::string& capabilities);
  /// Switches the CGI log. LIBD_OK.
  virtual ELibDReturnCode SetCGILogLevel(bool on);
  /// Names the CGI log; the next SetCurrentConnectionInfo opens it. LIBD_OK.
  virtual ELibDReturnCode SetCGILogPath(const char* path);
  /// Of encoder devices: LIBD_OK.
  virtual ELibDReturnCode InitializeEncoderDevice();
  /// Of encoder devices: LIBD_OK.
  virtual ELibDReturnCode CloseEncoderDevice();

  // Recordings on the camera's card
  /// Hands out the recording mode last set; LIBD_NOT_SUPPORTED for a camera without a card.
  virtual ELibDReturnCode GetEdgeStorageMode(SLibDEdgeStorageMode& mode);
  /// Sets the recording mode; LIBD_TIMEOUT when the request fails, LIBD_NO_FRAME when the card is full.
  virtual ELibDReturnCode SetEdgeStorageMode(const SLibDEdgeStorageMode& mode);
  /// Stops a running stream and plays a recording in its place.
  virtual ELibDReturnCode StartEdgeStorageVideoStreaming(const SLibDEdgeStorageStreamingInfo& info);
  /// Asks the camera for its recordings, oldest first.
  virtual ELibDReturnCode GetEdgeStorageRecordList(SLibDEdgeStorageRecordList& list);
  /// Empties the list and all it holds. LIBD_OK.
  virtual ELibDReturnCode ClearEdgeStorageRecordList(SLibDEdgeStorageRecordList& list);
  /// Deletes every recording.
  virtual ELibDReturnCode DeleteAllEdgeStorageRecord();
  /// Deletes the recording `info.streamName`; LIBD_FAILED for an empty name.
  virtual ELibDReturnCode DeleteEdgeStorageRecordByName(const SLibDEdgeStorageStreamingInfo& info);
  /// Lets sessions end without a TEARDOWN; LIBD_NOT_SUPPORTED for a camera without a card.
  virtual ELibDReturnCode SetEdgeStorageNoTearDown(bool noTearDown);
};
