// SPDX-License-Identifier: Apache-2.0
// The camera's words of exposure and image control, and the steps along its exposure lists.
#pragma once

#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "device/cgi/words.h"
#include "vexa/common_types.h"
#include "vexa/image_info.h"
#include "vexa/video_info.h"

namespace vexa {

inline constexpr Word<ELibDXdnrType> kXdnrWords[] = {
    {LIBD_XDNR_HIGH, "high"}, {LIBD_XDNR_MIDDLE, "mid"}, {LIBD_XDNR_LOW, "low"}, {LIBD_XDNR_OFF, "off"}};

inline constexpr Word<ELibDVisibilityEnhancerType> kVisibilityWords[] = {{LIBD_VISIBILITY_HIGH, "high"},
                                                                         {LIBD_VISIBILITY_MIDDLE, "mid"},
                                                                         {LIBD_VISIBILITY_LOW, "low"},
                                                                         {LIBD_VISIBILITY_OFF, "off"}};

inline constexpr Word<ELibDViewDRMode> kViewDrWords[] = {{LIBD_VIEWDR_OFF, "off"}, {LIBD_VIEWDR_ON, "on"}};

inline constexpr Word<ELibIRIlluminatorMode> kIlluminatorWords[] = {{LIB_IR_OFF, "off"}, {LIB_IR_DAYNIGHT, "daynight"}};

/// The text after "DayNightMode=" that sets a day/night mode.
inline constexpr Word<ELibDDayNightType> kDayNightRequests[] = {{LIBD_DAYNIGHT_AUTO, "auto"},
                                                                {LIBD_DAYNIGHT_DAY, "manual&DayNight=off"},
                                                                {LIBD_DAYNIGHT_NIGHT, "manual&DayNight=on"}};

inline constexpr Word<ELibVideoOutMode> kVideoOutWords[] = {
    {LIB_VIDEO_OUT_IP, "ip"}, {LIB_VIDEO_OUT_PAL, "pal"}, {LIB_VIDEO_OUT_NTSC, "ntsc"}};

/// The day/night mode in an answer: LIBD_DAYNIGHT_UNKNOWN for unknown words, nullopt when the answer lacks it.
std::optional<ELibDDayNightType> day_night_of(std::string_view answer);

/// The host's names of the exposure modes.
inline constexpr char kFullAuto[] = "Full auto";
inline constexpr char kShutterPriority[] = "Shutter Priority";
inline constexpr char kIrisPriority[] = "Iris Priority";

/// The camera's word of an exposure mode; null for an unknown one.
const char* exposure_word_of(std::string_view mode);

/// What sets the brightness in an exposure mode.
enum class ExposureControl { kShutter, kIris };

/// The control of the exposure mode; nullopt when the mode leaves none to the host.
std::optional<ExposureControl> exposure_control_of(std::string_view mode);

using ExposureModes = std::vector<SLibDBrightModeInfo>;
using ExposureSteps = std::vector<SLibDCommonParameterInt>;

/// Place of the first entry named `name`; -1 when there is none.
int exposure_entry(const ExposureModes& modes, std::string_view name);

/// The value for a level of 0 to 10000 under the largest value, rounded half up, within 0 to 10000.
int exposure_value(int level, int largest);

/// The value one step from `current`, up for `step` above 0, else down; nullopt at the end of the list or when the
/// list does not hold the value.
std::optional<int> next_exposure_value(const ExposureSteps& steps, int current, int step);

}  // namespace vexa
