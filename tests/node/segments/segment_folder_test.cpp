// SPDX-License-Identifier: Apache-2.0
#include "node/segments/segment_folder.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <cerrno>
#include <filesystem>
#include <fstream>
#include <functional>
#include <map>

#include "tests/node/segments/boxes.h"
#include "tests/support/temporary_folder.h"

namespace vexa::node {
namespace {

using vexa_test::fragment;
using vexa_test::header;
using State = SegmentName::State;

std::string contents(const std::string& path) {
  std::ifstream file(path, std::ios::binary);
  return {std::istreambuf_iterator<char>(file), {}};
}

SegmentName name_of(std::uint64_t counter) {
  return {std::chrono::milliseconds(1000 * counter), "gate", 0, counter, State::kWhole};
}

class SegmentFolderTest : public testing::Test {
 protected:
  SegmentFolder open(DiskCalls& calls) {
    auto folder = SegmentFolder::open(temporary_ / "gate", calls);
    EXPECT_TRUE(folder);
    return std::move(*folder);
  }
  static void write(const OpenSegment& segment, const std::string& bytes) {
    EXPECT_EQ(host::write_all(segment.file.get(), bytes.data(), bytes.size()), 0);
  }
  [[nodiscard]] std::string path(const std::string& name) const { return temporary_ / "gate/" + name; }

  vexa_test::TemporaryFolder temporary_{vexa_test::memory_folder()};
  DiskCalls calls_;
};

TEST_F(SegmentFolderTest, ASegmentHasItsFinalNameWhenItIsFinished) {
  SegmentFolder folder = open(calls_);
  auto segment = folder.begin(name_of(1));
  ASSERT_TRUE(segment);
  EXPECT_TRUE(std::filesystem::exists(path("19700101T000001000Z_gate_0_1.part")));
  write(*segment, "abc");
  EXPECT_FALSE(folder.flush(*segment));
  EXPECT_FALSE(folder.finish(std::move(*segment)));
  EXPECT_EQ(contents(path("19700101T000001000Z_gate_0_1.mp4")), "abc");
  ASSERT_EQ(folder.list()->size(), 1U);
  EXPECT_EQ(folder.list()->front().name, name_of(1));
  EXPECT_EQ(folder.list()->front().bytes, 3U);
}

TEST_F(SegmentFolderTest, ANameThatIsThereIsNotWrittenOver) {
  SegmentFolder folder = open(calls_);
  const auto first = folder.begin(name_of(1));
  ASSERT_TRUE(first);
  const auto second = folder.begin(name_of(1));
  ASSERT_FALSE(second);
  EXPECT_EQ(second.error().text, path("19700101T000001000Z_gate_0_1.part") + ": File exists");
}

TEST_F(SegmentFolderTest, AFinishedSegmentIsNotReplaced) {
  SegmentFolder folder = open(calls_);
  auto segment = folder.begin(name_of(1));
  std::ofstream(path("19700101T000001000Z_gate_0_1.mp4")) << "old";
  EXPECT_TRUE(folder.finish(std::move(*segment)));
  EXPECT_EQ(contents(path("19700101T000001000Z_gate_0_1.mp4")), "old");
}

TEST_F(SegmentFolderTest, RecoveryCutsToTheLastWholeFragment) {
  SegmentFolder folder = open(calls_);
  const std::string whole = header() + fragment(10) + fragment(20);
  write(*folder.begin(name_of(1)), whole + fragment(30).substr(0, 50));
  write(*folder.begin(name_of(2)), header());
  write(*folder.begin(name_of(3)), whole);
  const auto recovery = folder.recover();
  ASSERT_TRUE(recovery);
  EXPECT_EQ(recovery->recovered, 2U);
  EXPECT_EQ(recovery->empty, 1U);
  EXPECT_EQ(recovery->cut_bytes, 50U + header().size());
  EXPECT_EQ(contents(path("19700101T000001000Z_gate_0_1.recovered.mp4")), whole);
  EXPECT_EQ(contents(path("19700101T000003000Z_gate_0_3.recovered.mp4")), whole);
  EXPECT_EQ(folder.list()->size(), 2U);
}

TEST_F(SegmentFolderTest, RecoveryLeavesOtherFilesAlone) {
  SegmentFolder folder = open(calls_);
  for (const char* name : {"19700101T000001000Z_gate_0_1.mp4", "film.part", ".part"}) std::ofstream(path(name)) << "x";
  EXPECT_TRUE(folder.recover());
  for (const char* name : {"19700101T000001000Z_gate_0_1.mp4", "film.part", ".part"}) {
    EXPECT_EQ(contents(path(name)), "x") << name;
  }
}

// The call of one kind fails that is the `failing_`th.
class FailingDisk final : public DiskCalls {
 public:
  explicit FailingDisk(int failing) : failing_(failing) {}
  int sync_data(int file) override { return fails() ? EIO : DiskCalls::sync_data(file); }
  int sync(int file) override { return fails() ? EIO : DiskCalls::sync(file); }
  int rename(int folder, const char* from, const char* to) override {
    return fails() ? EROFS : DiskCalls::rename(folder, from, to);
  }
  [[nodiscard]] int calls() const { return calls_; }

 private:
  bool fails() { return ++calls_ == failing_; }
  const int failing_;
  int calls_ = 0;
};

// One segment from its beginning to its end: what stopped it.
std::optional<host::Problem> record(DiskCalls& disk, const std::string& path) {
  auto folder = SegmentFolder::open(path, disk);
  if (!folder) return folder.error();
  auto segment = folder->begin(name_of(1));
  if (!segment) return segment.error();
  const std::string bytes = header() + fragment(10);
  EXPECT_EQ(host::write_all(segment->file.get(), bytes.data(), bytes.size()), 0);
  if (auto failed = folder->flush(*segment)) return failed;
  return folder->finish(std::move(*segment));
}

TEST_F(SegmentFolderTest, EachCallThatFailsIsReportedAndNoWholeFragmentIsLost) {
  FailingDisk sound(0);
  ASSERT_FALSE(record(sound, temporary_ / "sound"));
  ASSERT_EQ(sound.calls(), 6);  // folder, name, flush, data, rename, folder
  for (int failing = 1; failing <= sound.calls(); ++failing) {
    FailingDisk disk(failing);
    const std::string where = temporary_ / std::to_string(failing);
    const auto failed = record(disk, where);
    ASSERT_TRUE(failed) << failing;
    EXPECT_NE(failed->text.find(failing == 5 ? "Read-only file system" : "Input/output error"), std::string::npos);
    auto folder = SegmentFolder::open(where, calls_);
    ASSERT_TRUE(folder->recover());
    const auto left = folder->list();
    if (failing <= 2) continue;  // nothing had been written
    ASSERT_EQ(left->size(), 1U) << failing;
    EXPECT_EQ(left->front().bytes, (header() + fragment(10)).size());
  }
}

// A disk that keeps a log of what is written and synced, to make of each beginning of it what a power cut would leave:
// the data of a file up to its latest sync, names as of the folder's latest one.
class LoggedDisk final : public DiskCalls {
 public:
  explicit LoggedDisk(std::string folder) : folder_(std::move(folder)) {}

  int sync_data(int file) override { return sync(file); }
  int sync(int file) override {
    struct stat status {};
    if (fstat(file, &status) != 0) return errno;
    if (S_ISDIR(status.st_mode)) {
      durable_.clear();
      for (const auto& entry : std::filesystem::directory_iterator(folder_)) {
        durable_[entry.path().filename()] = inode_of(entry.path());
      }
    } else {
      const std::string now = contents("/proc/self/fd/" + std::to_string(file));
      synced_[status.st_ino] = now;
    }
    note();
    return 0;
  }
  int rename(int folder, const char* from, const char* to) override {
    const int error = DiskCalls::rename(folder, from, to);
    note();
    return error;
  }
  // After each write as well.
  void note() { states_.push_back({durable_, synced_, whole_}); }
  void is_whole(const std::string& name) { whole_.push_back(name); }

  struct State {
    std::map<std::string, ino_t> names;
    std::map<ino_t, std::string> data;
    std::vector<std::string> whole;  // what the program holds for finished
  };
  [[nodiscard]] const std::vector<State>& states() const { return states_; }

 private:
  static ino_t inode_of(const std::string& path) {
    struct stat status {};
    return stat(path.c_str(), &status) == 0 ? status.st_ino : 0;
  }

  const std::string folder_;
  std::map<std::string, ino_t> durable_;
  std::map<ino_t, std::string> synced_;
  std::vector<std::string> whole_;
  std::vector<State> states_;
};

// kill -9 proves nothing here: the system keeps what a killed program has written.
TEST_F(SegmentFolderTest, APowerCutAfterAnyCallLosesNothingThatWasFlushed) {
  LoggedDisk disk(temporary_ / "gate");
  SegmentFolder folder = open(disk);
  const std::string flushed = header() + fragment(10);
  const std::string all = flushed + fragment(20);
  for (const std::uint64_t counter : {1U, 2U, 3U}) {
    auto segment = folder.begin(name_of(counter));
    ASSERT_TRUE(segment);
    write(*segment, flushed);
    disk.note();
    ASSERT_FALSE(folder.flush(*segment));
    write(*segment, fragment(20));
    disk.note();
    ASSERT_FALSE(folder.finish(std::move(*segment)));
    disk.is_whole(file_name_of(name_of(counter)));
    disk.note();
  }
  int cut = 0;
  for (const LoggedDisk::State& state : disk.states()) {
    const std::string after = temporary_ / "after" + std::to_string(++cut);
    std::filesystem::create_directory(after);
    std::size_t with_data = 0;
    for (const auto& [name, inode] : state.names) {
      const auto data = state.data.find(inode);
      const bool has_data = data != state.data.end();
      with_data += has_data ? 1U : 0U;
      std::ofstream(after + "/" + name, std::ios::binary) << (has_data ? data->second : "");
    }
    auto left = SegmentFolder::open(after, calls_);
    ASSERT_TRUE(left->recover()) << cut;
    const auto segments = left->list();
    EXPECT_EQ(segments->size(), with_data) << cut;
    for (const ListedSegment& segment : *segments) {
      EXPECT_NE(segment.name.state, State::kWriting);
      EXPECT_GE(segment.bytes, flushed.size()) << cut;
    }
    for (const std::string& name : state.whole) EXPECT_EQ(contents(after + "/" + name), all) << cut << " " << name;
  }
  EXPECT_EQ(cut, 25);
}

}  // namespace
}  // namespace vexa::node
