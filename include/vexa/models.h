// SPDX-License-Identifier: Apache-2.0
// Camera models: profiles of what a model can do, and the driver of a model. Of the library libVexaModels.
#pragma once

#include <cstdint>
#include <memory>
#include <string>
#include <vector>

#include "vexa/audio_info.h"
#include "vexa/export.h"
#include "vexa/io_info.h"
#include "vexa/library_device.h"
#include "vexa/ptz_info.h"
#include "vexa/video_info.h"

namespace vexa {

/// Which driver class serves a model.
enum class DriverClass : std::int32_t { kCommon, kHeron, kMarlin, kSimpleHD, kSimplePTZ };

/// Bits that GetCameraType knows, once MakeDevice has made the driver.
enum CameraTypeBits : std::uint32_t {
  kFixedCamera = 1U << 0,
  kPtzCamera = 1U << 1,
  kSdCamera = 1U << 2,
  kHdCamera = 1U << 3,
  kAudioCamera = 1U << 4,
  kEdgeStorageCamera = 1U << 5,
  kAnalogOutputCamera = 1U << 6,
  kLodDetectionCamera = 1U << 7
};

/// What a camera model can do, as MakeDevice fills it into the driver. A host may change a profile before that.
struct Profile {
  std::string name;         ///< the profile's file without folder and ".json"
  std::string description;  ///< one line for people
  std::string model;        ///< as the camera reports it
  DriverClass driver = DriverClass::kCommon;
  std::uint32_t cameraTypes = 0;  ///< CameraTypeBits

  /// All codecs and sizes of the model, handed out until the camera has first reported its settings; from then on the
  /// list is the resolution filter's. Both stream counts are the number of streams.
  SLibDFixedCameraInfo camera;
  std::vector<SLibDCameraInfo> streams;         ///< the streams' settings as they leave the factory
  std::vector<ELibVideoOutMode> videoOutModes;  ///< empty: the network alone
  SLibDFixedPTZControlInfo control;             ///< also what a fixed camera's exposure and day/night offer
  std::vector<SLibDZoomRatioInt> zoomRatios;    ///< ascending by position
  SLibDFixedAudioInfo audio;                    ///< available: 1 when the camera has audio
  SLibDFixedIoBoxInfo ioBox;
  bool hasControl = false;       ///< GetFixedPTZControlInfo returns LIBD_OK
  bool hasIoBox = false;         ///< GetFixedIoboxInfo returns LIBD_OK
  bool continuousPtz = false;    ///< motion by signed speeds, also before the camera has been asked
  bool motionDetection = false;  ///< detection windows report motion
  bool lodDetection = false;     ///< detection is set by one object size and one sensitivity
  bool edgeStorage = false;      ///< the camera has a card
};

/// Why a profile was refused.
struct ProfileError {
  std::string file;  ///< as given, or the path that was tried
  int line = 0;      ///< counted from 1; 0: the file as a whole
  std::string key;   ///< for instance "video.codecs[1].sizes[0]"; empty: no particular one
  std::string text;  ///< what is wrong, and what would be right

  /// "FILE:LINE: KEY: TEXT", without the parts that are not known.
  VEXA_API std::string Message() const;
};

/// Reads a profile file. `file` is a path, or the name of an installed profile (without "/" and ".json"), for instance
/// "LMX-P200". A profile that is wrong in any way is refused whole: false, `error` filled, `profile` as it was.
/// Any thread; blocks only to read the file. Files above 1 MiB are refused.
VEXA_API bool LoadProfile(const std::string& file, Profile& profile, ProfileError& error);

/// The same for a text; `name` is used as the file's name. Any thread; never blocks.
VEXA_API bool ParseProfile(const std::string& text, const std::string& name, Profile& profile, ProfileError& error);

/// The folder of the installed profiles, found relative to this library; empty when there is none. Any thread.
VEXA_API std::string ProfileFolder();

/// The names of the installed profiles in alphabetical order; none when the folder cannot be read. Any thread.
VEXA_API std::vector<std::string> ProfileNames();

/// A driver of the model's class with its capability records filled, as if the camera had been identified. It contacts
/// no camera; the host sets its connection next and owns the driver. It is a CVexaCommon, so that static_cast reaches
/// what takes one (vexa/waiting.h). Null when out of memory or for a `profile.driver` that is not a DriverClass. Any
/// thread; never blocks.
VEXA_API std::unique_ptr<CLibraryDevice> MakeDevice(const Profile& profile);

}  // namespace vexa
