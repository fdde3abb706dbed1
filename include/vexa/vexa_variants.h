// SPDX-License-Identifier: Apache-2.0
// The model variants of the driver: each replaces a few operations, everything else is CVexaCommon's.
#pragma once

#include "vexa/export.h"
#include "vexa/vexa_common.h"

// Bodies: device/model_variants.cpp

/// Cameras of the Heron family.
class VEXA_API CVexaHeronCommon : public CVexaCommon {
 public:
  ~CVexaHeronCommon() override;

  /// As CVexaCommon's, in three requests at most: after both questions it moves the picture back to the network when an
  /// analog output has it. When that fails, its result is returned and `info` is filled.
  ELibDReturnCode GetCurrentSystemInfo(SLibDSystemInfo& info) override;
  /// LIBD_NOT_SUPPORTED: these cameras choose their exposure themselves.
  ELibDReturnCode SetBrightMode(std::string& mode) override;
};

/// Cameras of the Marlin family.
class VEXA_API CVexaMarlinCommon : public CVexaCommon {
 public:
  ~CVexaMarlinCommon() override;

  /// Sends the exposure for "Full auto" and "Shutter Priority"; LIBD_FAILED for any other mode, and nothing is sent.
  /// LIBD_INVALID_ARGUMENT for an empty one.
  ELibDReturnCode SetBrightMode(std::string& mode) override;
};

/// Simple HD cameras.
class VEXA_API CVexaSimpleHDCommon : public CVexaCommon {
 public:
  ~CVexaSimpleHDCommon() override;

  /// As CVexaCommon's. For a model without an analog output it also moves the picture back to the network, between the
  /// two questions; when that fails, its result is returned and only the fields of the first are filled.
  ELibDReturnCode GetCurrentSystemInfo(SLibDSystemInfo& info) override;
  /// LIBD_NOT_SUPPORTED: these cameras choose their exposure themselves.
  ELibDReturnCode SetBrightMode(std::string& mode) override;
  /// Asks a model with an analog output; LIBD_FAILED when its answer lacks a known mode, and `mode` stays. For any
  /// other model LIB_VIDEO_OUT_IP, and nothing is sent.
  ELibDReturnCode GetVideoOutMode(ELibVideoOutMode& mode) override;

 protected:
  ELibDReturnCode GetCurrentSystemInfo(SLibDSystemInfo& info, bool probe);
};

/// Simple PTZ cameras.
class VEXA_API CVexaSimplePTZCommon : public CVexaCommon {
 public:
  ~CVexaSimplePTZCommon() override;

  /// As CVexaCommon's. For a model without an analog output it also moves the picture back to the network, between the
  /// two questions; when that fails, its result is returned and only the fields of the first are filled.
  ELibDReturnCode GetCurrentSystemInfo(SLibDSystemInfo& info) override;
  /// Asks a model with an analog output; LIBD_FAILED when its answer lacks a known mode, and `mode` stays. For any
  /// other model LIB_VIDEO_OUT_IP, and nothing is sent.
  ELibDReturnCode GetVideoOutMode(ELibVideoOutMode& mode) override;

 protected:
  ELibDReturnCode GetCurrentSystemInfo(SLibDSystemInfo& info, bool probe);
};
