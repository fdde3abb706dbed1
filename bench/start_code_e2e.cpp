// SPDX-License-Identifier: Apache-2.0
// The search for start codes beside other ways through the same memory: 64 MB of real H.264, GB a second.
//   start_code_e2e [CLIP]
#include <dlfcn.h>
#include <time.h>

#include <algorithm>
#include <cstdint>
#include <cstdio>
#include <cstring>
#include <fstream>
#include <functional>
#include <iterator>
#include <limits>
#include <vector>

#include "media/assembly/start_code.h"

namespace {

using Stream = std::vector<unsigned char>;

constexpr std::size_t kBytes = std::size_t{64} << 20;
constexpr int kRounds = 7;
constexpr unsigned char kCodeH264[] = {0, 0, 0, 1};

Stream stream_of(const char* path) {
  std::ifstream file(path, std::ios::binary);
  const std::vector<char> clip((std::istreambuf_iterator<char>(file)), std::istreambuf_iterator<char>());
  Stream stream;
  stream.reserve(kBytes);
  while (!clip.empty() && stream.size() < kBytes) {
    const std::size_t part = std::min(clip.size(), kBytes - stream.size());
    stream.insert(stream.end(), clip.begin(), clip.begin() + static_cast<std::ptrdiff_t>(part));
  }
  return stream;
}

/// Of this thread: what else the machine does counts little.
double cpu_seconds() {
  timespec now{};
  clock_gettime(CLOCK_THREAD_CPUTIME_ID, &now);
  return static_cast<double>(now.tv_sec) + static_cast<double>(now.tv_nsec) / 1e9;
}

/// The best of some rounds; `pass` goes once through all bytes.
double gigabytes_a_second(const std::function<std::uint64_t()>& pass, std::uint64_t& result) {
  double best = 0;
  for (int round = 0; round < kRounds; ++round) {
    const double begin = cpu_seconds();
    result = pass();
    best = std::max(best, static_cast<double>(kBytes) / (cpu_seconds() - begin) / 1e9);
  }
  return best;
}

double report(const char* name, const std::function<std::uint64_t()>& pass) {
  std::uint64_t result = 0;
  const double speed = gigabytes_a_second(pass, result);
  std::printf("%-28s %7.2f GB/s   (%llu)\n", name, speed, static_cast<unsigned long long>(result));
  return speed;
}

/// Counts the codes, from each on to the next.
template <typename Find>
std::uint64_t count_codes(const Stream& stream, std::size_t code_length, Find find) {
  std::uint64_t codes = 0;
  const unsigned char* place = stream.data();
  const unsigned char* end = place + stream.size();
  while (const unsigned char* found = find(place, static_cast<std::size_t>(end - place))) {
    ++codes;
    place = found + code_length;
  }
  return codes;
}

std::uint64_t read_alone(const Stream& stream) {
  std::uint64_t sums[8] = {};
  for (std::size_t i = 0; i + sizeof sums <= stream.size(); i += sizeof sums) {
    std::uint64_t words[8];
    std::memcpy(words, stream.data() + i, sizeof words);
    for (std::size_t k = 0; k < 8; ++k) sums[k] += words[k];
  }
  std::uint64_t sum = 0;
  for (const std::uint64_t part : sums) sum += part;
  return sum;
}

using FfmpegSearch = const std::uint8_t* (*)(const std::uint8_t*, const std::uint8_t*, std::uint32_t*);

/// FFmpeg's own, where its library is there; it returns the byte after 00 00 01 and what follows.
FfmpegSearch ffmpeg_search() {
  void* library = dlopen("libavcodec.so.59", RTLD_NOW);
  if (library == nullptr) return nullptr;
  return reinterpret_cast<FfmpegSearch>(dlsym(library, "avpriv_find_start_code"));
}

std::uint64_t count_with_ffmpeg(const Stream& stream, FfmpegSearch search) {
  std::uint64_t codes = 0;
  std::uint32_t state = 0xffffffff;
  const std::uint8_t* place = stream.data();
  const std::uint8_t* end = place + stream.size();
  while (place < end) {
    place = search(place, end, &state);
    if ((state & 0xffffff00U) == 0x100) ++codes;
  }
  return codes;
}

}  // namespace

int main(int argc, char** argv) {
  const Stream stream = stream_of(argc > 1 ? argv[1] : VEXA_CLIPS "/hd.h264");
  if (stream.size() != kBytes) {
    std::fprintf(stderr, "no clip; scripts/make_clips makes it\n");
    return 1;
  }
  const auto length = [](std::size_t size) { return static_cast<unsigned int>(size); };
  Stream copy(kBytes);
  std::printf("%zu-bit, %zu MB\n", 8 * sizeof(void*), kBytes >> 20);
  const double memory = report("reading memory alone", [&] { return read_alone(stream); });
  report("memcpy", [&] {
    std::memcpy(copy.data(), stream.data(), stream.size());
    return std::uint64_t{copy[stream.size() / 2]};
  });
  report("memmem 00 00 00 01", [&] {
    return count_codes(stream, 4, [](const unsigned char* place, std::size_t size) {
      return static_cast<const unsigned char*>(memmem(place, size, kCodeH264, sizeof kCodeH264));
    });
  });
  if (const FfmpegSearch search = ffmpeg_search()) {
    report("FFmpeg's search 00 00 01", [&] { return count_with_ffmpeg(stream, search); });
  } else {
    std::printf("FFmpeg's library for this word size is not there\n");
  }
  const double bytewise = report("byte by byte", [&] {
    return count_codes(stream, 4, [](const unsigned char* place, std::size_t size) {
      return vexa::find_start_code_bytewise({place, size}, 4);
    });
  });
  double slowest = std::numeric_limits<double>::max();
  const auto report_finder = [&](const char* name, std::size_t code_length, auto find) {
    const double speed = report(name, [&] {
      return count_codes(stream, code_length,
                         [&](const unsigned char* place, std::size_t size) { return find(place, length(size)); });
    });
    slowest = std::min(slowest, speed);
  };
  report_finder("find_start_code_h264", 4, vexa::find_start_code_h264);
  report_finder("find_start_code_mpeg4", 3, vexa::find_start_code_mpeg4);
  const bool fast = slowest >= 8 * bytewise && slowest >= memory / 2;
  std::printf("%.1f times a byte loop, %.2f of reading alone: %s\n", slowest / bytewise, slowest / memory,
              fast ? "as wanted" : "TOO SLOW");
  return fast ? 0 : 1;
}
