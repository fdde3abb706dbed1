// SPDX-License-Identifier: Apache-2.0
// All fields of a camera-info record, for comparing whole records.
#pragma once

#include <ostream>
#include <tuple>

#include "vexa/video_info.h"

inline auto all_fields(const SLibDCameraInfo& info) {
  return std::tie(info.codecType, info.codecName, info.streamNumber, info.imageSizeText, info.imageWidth,
                  info.imageHeight, info.reserved7, info.frameRateText, info.frameRate, info.qualityText, info.quality,
                  info.bitRateText, info.bitRate, info.reserved14, info.reserved15, info.reserved16, info.rotation,
                  info.videoStandard, info.reserved19, info.captureWidth, info.captureHeight, info.unicastVideoPort,
                  info.unicastVideoPort1, info.unicastVideoPort2, info.rtspPort, info.solidPtz, info.maxImageWidth,
                  info.maxImageHeight);
}

inline bool operator==(const SLibDCameraInfo& a, const SLibDCameraInfo& b) { return all_fields(a) == all_fields(b); }

inline void PrintTo(const SLibDCameraInfo& info, std::ostream* out) {
  const char* separator = "{";
  std::apply([&](const auto&... fields) { ((*out << separator << fields, separator = ", "), ...); }, all_fields(info));
  *out << "}";
}

/// A record in which every field differs from its default and from the records of other marks.
inline SLibDCameraInfo marked_camera_info(int mark) {
  const std::string text = std::to_string(mark);
  SLibDCameraInfo info;
  std::apply(
      [&](auto&... fields) {
        int place = 0;
        const auto fill = [&](auto& field) {
          using Field = std::decay_t<decltype(field)>;
          ++place;
          if constexpr (std::is_same_v<Field, std::string>) {
            field = "text " + text + "." + std::to_string(place);
          } else if constexpr (std::is_same_v<Field, bool>) {
            field = mark % 2 != 0;
          } else {
            field = mark * 100 + place;
          }
        };
        (fill(const_cast<std::decay_t<decltype(fields)>&>(fields)), ...);
      },
      all_fields(info));
  return info;
}
