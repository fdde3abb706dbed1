// SPDX-License-Identifier: Apache-2.0
// The matcher of directory search: usual patterns, and those that are meant to be slow.
#include <benchmark/benchmark.h>

#include <string>

#include "runtime/base/glob_pattern.h"

namespace {

std::string repeated(const std::string& text, int times) {
  std::string all;
  for (int i = 0; i < times; ++i) all += text;
  return all;
}

void match(benchmark::State& state, const std::string& pattern, const std::string& name) {
  const vexa::GlobPattern compiled(pattern);
  for (auto _ : state) {
    bool matches = compiled.matches(name);
    benchmark::DoNotOptimize(matches);
  }
}

void usual_name(benchmark::State& state) { match(state, "Log[0-9]*.txt", "Log12.txt"); }
BENCHMARK(usual_name);

void thirty_stars_200_characters(benchmark::State& state) {
  match(state, repeated("*", 30) + "b", std::string(200, 'a'));
}
BENCHMARK(thirty_stars_200_characters);

void thirty_stars_between_letters_200_characters(benchmark::State& state) {
  match(state, repeated("*a", 30) + "b", std::string(200, 'a'));
}
BENCHMARK(thirty_stars_between_letters_200_characters);

void thirty_stars_between_sets_200_characters(benchmark::State& state) {
  match(state, repeated("*[a-z]", 30) + "b", std::string(200, 'a'));
}
BENCHMARK(thirty_stars_between_sets_200_characters);

void compiling_a_pattern(benchmark::State& state) {
  const std::string pattern = repeated("*[a-z]", 30) + "b";
  for (auto _ : state) {
    vexa::GlobPattern compiled(pattern);
    benchmark::DoNotOptimize(compiled);
  }
}
BENCHMARK(compiling_a_pattern);

}  // namespace
