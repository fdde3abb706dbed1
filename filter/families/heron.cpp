// Heron: fixed HD cameras with a 16:9 sensor. Their MPEG-4 encoder is the one of the SD generation and stops at 640
// pixels across; half the sensor's width remains for a picture that moves without a motor.
#include "filter/model_family.h"

namespace vexa::filter {
namespace {

constexpr Size kSizes[] = {{1920, 1080}, {1280, 960}, {1280, 720}, {1024, 768}, {800, 600},
                           {640, 480},   {640, 368},  {320, 240},  {320, 192},  {160, 120}};
constexpr Size kMpeg4Sizes[] = {{640, 480}, {640, 368}, {320, 240}, {320, 192}, {160, 120}};

constexpr CodecTable kCodecs[] = {{"JPEG", kSizes, kRatesTo30, kQualities, {}},
                                  {"MPEG4", kMpeg4Sizes, kRatesTo30, {}, kSdBitRates},
                                  {"H.264", kSizes, kRatesTo30, {}, kHdBitRates}};

}  // namespace

const ModelFamily kHeronFamily{"LMX-H", kCodecs, {960, 768}};

}  // namespace vexa::filter
