// SPDX-License-Identifier: Apache-2.0
// The program as a service runs it, against a virtual camera.
#include <gtest/gtest.h>

#include <chrono>
#include <filesystem>
#include <fstream>
#include <functional>
#include <map>
#include <thread>

#include "node/segments/fragment_scan.h"
#include "node/segments/segment_name.h"
#include "tests/host/camera_fixture.h"

namespace vexa::node {
namespace {

using vexa_test::ProgramResult;
using vexa_test::ProgramRun;
using State = SegmentName::State;

class VexaNode : public vexa_test::WithCamera {
 protected:
  void SetUp() override {
    std::ofstream(folder() / "cameras.json");
    std::filesystem::create_directory(store_);
  }
  std::vector<std::string> standalone(std::vector<std::string> more = {}) {
    std::ofstream(folder() / "cameras.json") << R"({"cameras": [{"name": "gate", "address": ")" << place() << R"("}]})";
    std::vector<std::string> arguments = {
        VEXA_BINARY_DIR "/bin/vexa-node", "--standalone", "--cameras-file", "cameras.json", "--folder", store_};
    arguments.insert(arguments.end(), more.begin(), more.end());
    return arguments;
  }
  ProgramResult check() { return ProgramRun(folder(), {VEXA_BINARY_DIR "/bin/vexa-node", "check", store_}).wait(); }
  std::map<std::string, std::uintmax_t> files(State state) const {
    std::map<std::string, std::uintmax_t> found;
    std::error_code error;
    for (std::filesystem::directory_iterator file(store_ + "/gate", error), end; !error && file != end;
         file.increment(error)) {
      const auto name = segment_of(file->path().filename().string());
      if (name && name->state == state) found[file->path().filename()] = file->file_size(error);
    }
    return found;
  }
  std::uint64_t fragments_being_written() const {
    const auto writing = files(State::kWriting);
    if (writing.empty()) return 0;
    std::ifstream file(store_ + "/gate/" + writing.begin()->first, std::ios::binary);
    const std::string bytes{std::istreambuf_iterator<char>(file), {}};
    const auto read = [&bytes](std::uint64_t at, unsigned char* to, std::size_t length) {
      return at <= bytes.size() && bytes.copy(reinterpret_cast<char*>(to), length, at) == length;
    };
    return scan_fragments(read, bytes.size()).fragments;
  }
  static bool comes(const std::function<bool()>& what) {
    const auto end = std::chrono::steady_clock::now() + std::chrono::seconds(60);
    while (!what()) {
      if (std::chrono::steady_clock::now() > end) return false;
      std::this_thread::sleep_for(std::chrono::milliseconds(20));
    }
    return true;
  }

  const std::string store_ = folder() / "store";
};

#ifdef VEXA_WITH_FFMPEG

TEST_F(VexaNode, FinishesEverySegmentWhenItIsStopped) {
  start_camera(four_times_faster());
  ProgramRun node(folder(), standalone({"--create", "--segment", "1"}), vexa_test::kCredentials);
  ASSERT_TRUE(comes([&] { return files(State::kWhole).size() >= 1; }));
  node.signal(SIGTERM);
  const ProgramResult result = node.wait();
  EXPECT_EQ(result.exit_code, 0) << result.err;
  EXPECT_TRUE(files(State::kWriting).empty());
  vexa_test::expect_no_password(result);
  for (const auto& [name, bytes] : files(State::kWhole)) {
    EXPECT_FALSE(vexa_test::probed("stream=codec_name", store_ + "/gate/" + name).empty()) << name;
  }
  const ProgramResult checked = check();
  EXPECT_EQ(checked.exit_code, 0) << checked.out;
}

TEST_F(VexaNode, AfterAKillTheNextStartRecoversWhatWasWritten) {
  start_camera(four_times_faster());
  std::map<std::string, std::uintmax_t> whole;
  std::uintmax_t cut = 0;
  {
    ProgramRun node(folder(), standalone({"--create"}), vexa_test::kCredentials);
    ASSERT_TRUE(comes([&] { return fragments_being_written() >= 1; }));
    node.signal(SIGKILL);
    EXPECT_EQ(node.wait().exit_code, 128 + SIGKILL);
    cut = files(State::kWriting).begin()->second;
  }
  ProgramRun node(folder(), standalone({"--segment", "1"}), vexa_test::kCredentials);
  ASSERT_TRUE(comes([&] { return files(State::kWhole).size() >= 1; }));
  node.signal(SIGTERM);
  const ProgramResult result = node.wait();
  EXPECT_EQ(result.exit_code, 0) << result.err;
  EXPECT_NE(result.err.find("gate: 1 segments recovered, 0 without a whole fragment removed"), std::string::npos)
      << result.err;
  const auto recovered = files(State::kRecovered);
  ASSERT_EQ(recovered.size(), 1U);
  EXPECT_GT(recovered.begin()->second, 0U);
  EXPECT_LE(recovered.begin()->second, cut);
  EXPECT_FALSE(vexa_test::probed("stream=codec_name", store_ + "/gate/" + recovered.begin()->first).empty());
  EXPECT_EQ(check().exit_code, 0);
}

TEST_F(VexaNode, RemovesTheOldestSegmentsAboveTheGivenBytes) {
  start_camera(four_times_faster());
  std::filesystem::create_directories(store_ + "/yard");
  std::ofstream(store_ + "/.vexa-segments") << "vexa segments 1\n";
  const std::string old = store_ + "/yard/20200101T000000000Z_yard_0_1.mp4";
  std::ofstream(old) << std::string(1000, 'x');
  ProgramRun node(folder(), standalone({"--keep-bytes", "999"}), vexa_test::kCredentials);
  EXPECT_TRUE(comes([&] { return !std::filesystem::exists(old); }));
  node.signal(SIGTERM);
  EXPECT_EQ(node.wait().exit_code, 0);
}

TEST_F(VexaNode, AFolderWithoutItsMarkIsNotWrittenTo) {
  start_camera();
  const ProgramResult result = ProgramRun(folder(), standalone()).wait();
  EXPECT_EQ(result.exit_code, 1);
  EXPECT_EQ(result.err, "vexa-node: " + store_ + " is no folder of segments: it has no file .vexa-segments\n" +
                            "  Is its disk mounted? For a new one: vexa-node --standalone --create.\n");
  EXPECT_TRUE(std::filesystem::is_empty(store_));
}

TEST_F(VexaNode, SegmentsOfAnotherVersionAreLeftAlone) {
  start_camera();
  std::ofstream(store_ + "/.vexa-segments") << "vexa segments 2\n";
  const ProgramResult result = ProgramRun(folder(), standalone({"--create"})).wait();
  EXPECT_EQ(result.exit_code, 1);
  EXPECT_EQ(result.err.find("vexa-node: the segments in " + store_ + " are of another version\n"), 0U) << result.err;
}

#else

TEST_F(VexaNode, WithoutFfmpegItRefusesToRecord) {
  start_camera();
  EXPECT_EQ(ProgramRun(folder(), standalone({"--create"})).wait().exit_code, 1);
  EXPECT_TRUE(std::filesystem::is_empty(store_));
}

#endif

TEST_F(VexaNode, CheckListsWhatIsNotWhole) {
  std::filesystem::create_directories(store_ + "/gate");
  std::ofstream(store_ + "/.vexa-segments") << "vexa segments 1\n";
  const std::string name = store_ + "/gate/20260131T235959250Z_gate_0_1.mp4";
  std::ofstream(name) << "no video";
  const ProgramResult result = check();
  EXPECT_EQ(result.exit_code, 6);
  EXPECT_EQ(result.out,
            name + ": 0 of 8 bytes are whole\n" + store_ + "/gate: 1 segments, 0 of them being written, 8 bytes\n");
}

TEST_F(VexaNode, WhatItNeedsIsAskedFor) {
  const ProgramResult result = ProgramRun(folder(), {VEXA_BINARY_DIR "/bin/vexa-node", "--standalone"}).wait();
  EXPECT_EQ(result.exit_code, 1);
  EXPECT_EQ(result.err, "vexa-node: --standalone, --cameras-file and --folder are needed\n  See vexa-node --help.\n");
}

}  // namespace
}  // namespace vexa::node
