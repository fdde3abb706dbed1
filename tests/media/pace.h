// How many times faster than in life the cameras of tests play. Sanitizers leave hosts little time to spare.
#pragma once

namespace vexa_test {

/// For H.264 and MPEG-4, of which 30 frames wait for the host.
#if defined(__SANITIZE_THREAD__) || defined(__SANITIZE_ADDRESS__)
constexpr double kPace = 1;
#else
constexpr double kPace = 4;
#endif

/// For JPEG, of which nine wait.
#if defined(__SANITIZE_THREAD__) || defined(__SANITIZE_ADDRESS__)
constexpr double kJpegPace = 1;
#else
constexpr double kJpegPace = 2;
#endif

}  // namespace vexa_test
