// Any model that no family claims: all that cameras of this kind are known to send, so that nothing a camera can do is
// withheld; what it reports of itself narrows the rest.
#include "filter/model_family.h"

namespace vexa::filter {
namespace {

constexpr Size kSizes[] = {{1920, 1080}, {1280, 1024}, {1280, 960}, {1280, 800}, {1280, 720}, {1024, 768}, {800, 600},
                           {768, 576},   {720, 576},   {704, 576},  {720, 480},  {704, 480},  {640, 480},  {640, 368},
                           {384, 288},   {352, 288},   {352, 240},  {320, 240},  {320, 192},  {160, 120}};

constexpr CodecTable kCodecs[] = {{"JPEG", kSizes, kRatesTo30, kQualities, {}},
                                  {"MPEG4", kSizes, kRatesTo30, {}, kHdBitRates},
                                  {"H.264", kSizes, kRatesTo30, {}, kHdBitRates}};

}  // namespace

const ModelFamily kGeneralFamily{"", kCodecs, {1280, 960}};

}  // namespace vexa::filter
