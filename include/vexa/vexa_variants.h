// The model variants of the driver: each replaces a few operations, everything else is CVexaCommon's.
#pragma once

#include "vexa/export.h"
#include "vexa/vexa_common.h"

// Bodies: device/model_variants.cpp

/// Cameras of the Heron family.
class VEXA_API CVexaHeronCommon : public CVexaCommon {
 public:
  ~CVexaHeronCommon() override;

  /// Puts the camera's picture back onto the network when an analog output has it, after both inquiries.
  ELibDReturnCode GetCurrentSystemInfo(SLibDSystemInfo& info) override;
  /// LIBD_NOT_SUPPORTED: these cameras choose their exposure themselves.
  ELibDReturnCode SetBrightMode(std::string& mode) override;
};

/// Cameras of the Marlin family.
class VEXA_API CVexaMarlinCommon : public CVexaCommon {
 public:
  ~CVexaMarlinCommon() override;

  /// Sets the exposure for "Full auto" and "Shutter Priority"; LIBD_FAILED for any other mode, and nothing is sent.
  ELibDReturnCode SetBrightMode(std::string& mode) override;
};

/// Simple HD cameras.
class VEXA_API CVexaSimpleHDCommon : public CVexaCommon {
 public:
  ~CVexaSimpleHDCommon() override;

  /// Puts the camera's picture back onto the network when an analog output has it, unless the model has such an output.
  ELibDReturnCode GetCurrentSystemInfo(SLibDSystemInfo& info) override;
  /// LIBD_NOT_SUPPORTED: these cameras choose their exposure themselves.
  ELibDReturnCode SetBrightMode(std::string& mode) override;
  /// Asks a model with an analog output; LIB_VIDEO_OUT_IP for any other model.
  ELibDReturnCode GetVideoOutMode(ELibVideoOutMode& mode) override;

 protected:
  ELibDReturnCode GetCurrentSystemInfo(SLibDSystemInfo& info, bool probe);
};

/// Simple PTZ cameras.
class VEXA_API CVexaSimplePTZCommon : public CVexaCommon {
 public:
  ~CVexaSimplePTZCommon() override;

  /// Puts the camera's picture back onto the network when an analog output has it, unless the model has such an output.
  ELibDReturnCode GetCurrentSystemInfo(SLibDSystemInfo& info) override;
  /// Asks a model with an analog output; LIB_VIDEO_OUT_IP for any other model.
  ELibDReturnCode GetVideoOutMode(ELibVideoOutMode& mode) override;

 protected:
  ELibDReturnCode GetCurrentSystemInfo(SLibDSystemInfo& info, bool probe);
};
