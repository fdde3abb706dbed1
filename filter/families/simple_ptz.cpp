// Simple PTZ: SD cameras that pan and tilt, with an analog output in PAL or NTSC; the sizes of both standards.
#include "filter/model_family.h"

namespace vexa::filter {
namespace {

constexpr Size kSizes[] = {{768, 576}, {720, 576}, {704, 576}, {720, 480}, {704, 480}, {640, 480},
                           {384, 288}, {352, 288}, {352, 240}, {320, 240}, {160, 120}};

constexpr CodecTable kCodecs[] = {{"JPEG", kSizes, kRatesTo30, kQualities, {}},
                                  {"MPEG4", kSizes, kRatesTo30, {}, kSdBitRates},
                                  {"H.264", kSizes, kRatesTo30, {}, kSdBitRates}};

}  // namespace

const ModelFamily kSimplePtzFamily{"LMX-C", kCodecs, {384, 288}};

}  // namespace vexa::filter
