// SPDX-License-Identifier: Apache-2.0
#include "filter/model_family.h"

namespace vexa::filter {
namespace {

// The MPEG-4 encoder of the SD generation stops at 640 pixels across.
constexpr Size kSdMpeg4Sizes[] = {{640, 480}, {640, 368}, {320, 240}, {320, 192}, {160, 120}};

// Heron: fixed HD cameras with a 16:9 sensor and the MPEG-4 encoder of the SD generation; half the sensor's width
// remains for a picture that moves without a motor.
constexpr Size kHeronSizes[] = {{1920, 1080}, {1280, 960}, {1280, 720}, {1024, 768}, {800, 600},
                                {640, 480},   {640, 368},  {320, 240},  {320, 192},  {160, 120}};

constexpr CodecTable kHeronCodecs[] = {{"JPEG", kHeronSizes, kRatesTo30, kQualities, {}},
                                       {"MPEG4", kSdMpeg4Sizes, kRatesTo30, {}, kSdBitRates},
                                       {"H.264", kHeronSizes, kRatesTo30, {}, kHdBitRates}};

constexpr ModelFamily kHeronFamily{"LMX-H", kHeronCodecs, {960, 768}};

// Marlin: box cameras with an exchangeable iris lens and a 5:4 megapixel sensor. 16:9 pictures are cut out of it.
constexpr Size kMarlinSizes[] = {{1280, 1024}, {1280, 960}, {1280, 720}, {1024, 768}, {800, 600},
                                 {640, 480},   {640, 368},  {320, 240},  {320, 192},  {160, 120}};

constexpr CodecTable kMarlinCodecs[] = {{"JPEG", kMarlinSizes, kRatesTo30, kQualities, {}},
                                        {"MPEG4", kSdMpeg4Sizes, kRatesTo30, {}, kSdBitRates},
                                        {"H.264", kMarlinSizes, kRatesTo30, {}, kHdBitRates}};

constexpr ModelFamily kMarlinFamily{"LMX-M", kMarlinCodecs, {640, 512}};

// PTZ: HD dome cameras that pan, tilt and zoom by motor. They send no MPEG-4. Their picture stays solid at 720 lines
// while it moves; the margin around it takes up the motion.
constexpr Size kPtzSizes[] = {{1920, 1080}, {1280, 960}, {1280, 720}, {1024, 768}, {800, 600},
                              {640, 480},   {640, 368},  {320, 240},  {320, 192}};

constexpr CodecTable kPtzCodecs[] = {{"JPEG", kPtzSizes, kRatesTo30, kQualities, {}},
                                     {"H.264", kPtzSizes, kRatesTo30, {}, kHdBitRates}};

constexpr ModelFamily kPtzFamily{"LMX-P", kPtzCodecs, {1280, 720}};

// Simple HD: fixed cameras with a 720-line sensor, some with an analog output beside the network, whose sizes they also
// send.
constexpr Size kSimpleHdSizes[] = {{1280, 1024}, {1280, 960}, {1280, 720}, {1024, 768}, {800, 600},
                                   {720, 576},   {720, 480},  {640, 480},  {640, 368},  {384, 288},
                                   {320, 240},   {320, 192},  {160, 120}};
constexpr Size kSimpleHdMpeg4Sizes[] = {{720, 576}, {720, 480}, {640, 480}, {640, 368},
                                        {384, 288}, {320, 240}, {320, 192}, {160, 120}};

constexpr CodecTable kSimpleHdCodecs[] = {{"JPEG", kSimpleHdSizes, kRatesTo30, kQualities, {}},
                                          {"MPEG4", kSimpleHdMpeg4Sizes, kRatesTo30, {}, kSdBitRates},
                                          {"H.264", kSimpleHdSizes, kRatesTo30, {}, kHdBitRates}};

constexpr ModelFamily kSimpleHdFamily{"LMX-A", kSimpleHdCodecs, {640, 480}};

// Simple PTZ: SD cameras that pan and tilt, with an analog output in PAL or NTSC; the sizes of both standards.
constexpr Size kSimplePtzSizes[] = {{768, 576}, {720, 576}, {704, 576}, {720, 480}, {704, 480}, {640, 480},
                                    {384, 288}, {352, 288}, {352, 240}, {320, 240}, {160, 120}};

constexpr CodecTable kSimplePtzCodecs[] = {{"JPEG", kSimplePtzSizes, kRatesTo30, kQualities, {}},
                                           {"MPEG4", kSimplePtzSizes, kRatesTo30, {}, kSdBitRates},
                                           {"H.264", kSimplePtzSizes, kRatesTo30, {}, kSdBitRates}};

constexpr ModelFamily kSimplePtzFamily{"LMX-C", kSimplePtzCodecs, {384, 288}};

// Any model that no family claims: all that cameras of this kind are known to send, so that nothing a camera can do is
// withheld; what it reports of itself narrows the rest.
constexpr Size kGeneralSizes[] = {{1920, 1080}, {1280, 1024}, {1280, 960}, {1280, 800}, {1280, 720},
                                  {1024, 768},  {800, 600},   {768, 576},  {720, 576},  {704, 576},
                                  {720, 480},   {704, 480},   {640, 480},  {640, 368},  {384, 288},
                                  {352, 288},   {352, 240},   {320, 240},  {320, 192},  {160, 120}};

constexpr CodecTable kGeneralCodecs[] = {{"JPEG", kGeneralSizes, kRatesTo30, kQualities, {}},
                                         {"MPEG4", kGeneralSizes, kRatesTo30, {}, kHdBitRates},
                                         {"H.264", kGeneralSizes, kRatesTo30, {}, kHdBitRates}};

constexpr ModelFamily kGeneralFamily{"", kGeneralCodecs, {1280, 960}};

constexpr const ModelFamily* kFamilies[] = {&kHeronFamily, &kMarlinFamily, &kPtzFamily, &kSimpleHdFamily,
                                            &kSimplePtzFamily};

}  // namespace

const ModelFamily& family_of(std::string_view model) {
  for (const ModelFamily* family : kFamilies) {
    if (model.substr(0, family->prefix.size()) == family->prefix) return *family;
  }
  return kGeneralFamily;
}

}  // namespace vexa::filter
