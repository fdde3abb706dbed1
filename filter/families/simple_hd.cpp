// Simple HD: fixed cameras with a 720-line sensor, some with an analog output beside the network, whose sizes they also
// send.
#include "filter/model_family.h"

namespace vexa::filter {
namespace {

constexpr Size kSizes[] = {{1280, 1024}, {1280, 960}, {1280, 720}, {1024, 768}, {800, 600}, {720, 576}, {720, 480},
                           {640, 480},   {640, 368},  {384, 288},  {320, 240},  {320, 192}, {160, 120}};
constexpr Size kMpeg4Sizes[] = {{720, 576}, {720, 480}, {640, 480}, {640, 368},
                                {384, 288}, {320, 240}, {320, 192}, {160, 120}};

constexpr CodecTable kCodecs[] = {{"JPEG", kSizes, kRatesTo30, kQualities, {}},
                                  {"MPEG4", kMpeg4Sizes, kRatesTo30, {}, kSdBitRates},
                                  {"H.264", kSizes, kRatesTo30, {}, kHdBitRates}};

}  // namespace

const ModelFamily kSimpleHdFamily{"LMX-A", kCodecs, {640, 480}};

}  // namespace vexa::filter
