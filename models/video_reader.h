// The "video" part of a profile.
#ifndef MODELS_VIDEO_READER_H_
#define MODELS_VIDEO_READER_H_

#include "models/reading.h"
#include "vexa/models.h"

namespace vexa::models {

/// Fills codecs, streams, counts, flip and outputs.
void read_video(const Part& video, Profile& profile, Complaints& complaints);

}  // namespace vexa::models

#endif  // MODELS_VIDEO_READER_H_
