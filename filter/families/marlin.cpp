// Marlin: box cameras with an exchangeable iris lens and a 5:4 megapixel sensor. 16:9 pictures are cut out of it.
#include "filter/model_family.h"

namespace vexa::filter {
namespace {

constexpr Size kSizes[] = {{1280, 1024}, {1280, 960}, {1280, 720}, {1024, 768}, {800, 600},
                           {640, 480},   {640, 368},  {320, 240},  {320, 192},  {160, 120}};
constexpr Size kMpeg4Sizes[] = {{640, 480}, {640, 368}, {320, 240}, {320, 192}, {160, 120}};

constexpr CodecTable kCodecs[] = {{"JPEG", kSizes, kRatesTo30, kQualities, {}},
                                  {"MPEG4", kMpeg4Sizes, kRatesTo30, {}, kSdBitRates},
                                  {"H.264", kSizes, kRatesTo30, {}, kHdBitRates}};

}  // namespace

const ModelFamily kMarlinFamily{"LMX-M", kCodecs, {640, 512}};

}  // namespace vexa::filter
