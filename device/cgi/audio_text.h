// SPDX-License-Identifier: Apache-2.0
// The camera's words for the codec of its audio input.
#pragma once

#include <cstdint>
#include <string>
#include <string_view>

#include "vexa/audio_info.h"

namespace vexa {

/// Puts codec, bit rate and frame size of an "AudInCodec=" value into the record; an unknown one leaves the record as
/// it is.
void take_audio_codec(std::string_view value, SLibDAudioInfo& info);

/// The "AudInCodec=" value that asks for the record's codec. Whatever is not "G726" asks for G.711.
std::string audio_codec_word(const SLibDAudioInfo& info);

/// The codec type of audio frames: 10 G.711, 20 G.726, -1 any other.
std::int32_t audio_codec_type(std::string_view codec);

}  // namespace vexa
