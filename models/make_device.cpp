// SPDX-License-Identifier: Apache-2.0
// Drivers that know their model.
#include <mutex>
#include <new>

#include "vexa/models.h"
#include "vexa/vexa_variants.h"

namespace vexa {
namespace {

// The model class: a driver of the given kind with its capability records filled.
template <typename Driver>
class Model final : public Driver {
 public:
  explicit Model(const Profile& profile) {
    this->m_FixedSystemInfo.modelName = profile.model;
    // The driver does not define which of the two is which: here the first is sound from the camera, the second to it.
    this->m_FixedSystemInfo.capability3 = profile.audio.inputCodecs.empty() ? 0 : 1;
    this->m_FixedSystemInfo.capability4 = profile.audio.outputCodecs.empty() ? 0 : 1;
    this->m_FixedCameraInfo = profile.camera;
    this->m_FixedCameraInfoAvailable = true;
    this->m_FixedPTZControlInfo = profile.control;
    this->m_FixedPTZControlInfoAvailable = profile.hasControl;
    this->m_ZoomRatios = profile.zoomRatios;
    this->m_FixedAudioInfo = profile.audio;
    this->m_FixedIoBoxInfo = profile.ioBox;
    this->m_FixedIoBoxInfoAvailable = profile.hasIoBox;
    this->m_UseMotionDetection = profile.motionDetection;
    this->m_LodDetection = profile.lodDetection;
    this->m_EdgeStorageSupported = profile.edgeStorage;
    this->m_CameraType = profile.cameraTypes;
    const std::lock_guard<CSimpleLock> guard(this->m_ConnectionLock);
    this->m_ContinuousPTZ = profile.continuousPtz;
  }
};

std::unique_ptr<CLibraryDevice> make_device(const Profile& profile) {
  switch (profile.driver) {
    case DriverClass::kCommon:
      return std::make_unique<Model<CVexaCommon>>(profile);
    case DriverClass::kHeron:
      return std::make_unique<Model<CVexaHeronCommon>>(profile);
    case DriverClass::kMarlin:
      return std::make_unique<Model<CVexaMarlinCommon>>(profile);
    case DriverClass::kSimpleHD:
      return std::make_unique<Model<CVexaSimpleHDCommon>>(profile);
    case DriverClass::kSimplePTZ:
      return std::make_unique<Model<CVexaSimplePTZCommon>>(profile);
  }
  return nullptr;
}

}  // namespace

std::unique_ptr<CLibraryDevice> MakeDevice(const Profile& profile) {
  try {
    return make_device(profile);
  } catch (const std::bad_alloc&) {
    return nullptr;
  }
}

}  // namespace vexa
