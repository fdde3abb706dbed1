// PTZ: HD dome cameras that pan, tilt and zoom by motor. They send no MPEG-4. Their picture stays solid at 720 lines
// while it moves; the margin around it takes up the motion.
#include "filter/model_family.h"

namespace vexa::filter {
namespace {

constexpr Size kSizes[] = {{1920, 1080}, {1280, 960}, {1280, 720}, {1024, 768}, {800, 600},
                           {640, 480},   {640, 368},  {320, 240},  {320, 192}};

constexpr CodecTable kCodecs[] = {{"JPEG", kSizes, kRatesTo30, kQualities, {}},
                                  {"H.264", kSizes, kRatesTo30, {}, kHdBitRates}};

}  // namespace

const ModelFamily kPtzFamily{"LMX-P", kCodecs, {1280, 720}};

}  // namespace vexa::filter
