#include "transport/wire/stream_window.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <string>
#include <vector>

#include "media/assembly/start_code.h"

namespace vexa {
namespace {

constexpr StartCode kH264Code = {find_start_code_h264, 4};
constexpr StartCode kMpeg4Code = {find_start_code_mpeg4, 3};
constexpr std::size_t kRoomLeft = 65536;  // below it the frame under work is moved

class WindowUnderTest {
 public:
  explicit WindowUnderTest(std::size_t size)
      : buffer_(size, 0xee), start_(buffer_.data()), search_(start_), end_(start_) {}
  WindowUnderTest(std::size_t size, std::size_t first_part) : WindowUnderTest(size) { part_ = first_part; }

  /// Takes as much of `bytes` as there is room for.
  std::size_t receive(const std::string& bytes) {
    const auto room = view().free_room();
    const std::size_t count = std::min(room.size(), bytes.size());
    std::copy_n(bytes.begin(), count, room.begin());
    view().received(count);
    return count;
  }
  /// "frame BYTES", "none" or "too long".
  std::string cut(StartCode code = kH264Code, std::size_t capacity = 1000) {
    std::vector<unsigned char> frame(capacity);
    std::size_t length = 99;
    switch (view().cut_frame(code, frame, length)) {
      case StreamWindow::Cut::kFrame:
        return "frame " + std::string(frame.begin(), frame.begin() + static_cast<std::ptrdiff_t>(length));
      case StreamWindow::Cut::kTooLong:
        return "too long";
      case StreamWindow::Cut::kNoneYet:
        return "none";
    }
    return "";
  }
  void make_room(StartCode code = kH264Code) { view().make_room(code); }

  std::ptrdiff_t frame_start() const { return start_ - buffer_.data(); }
  std::ptrdiff_t search() const { return search_ - buffer_.data(); }
  std::ptrdiff_t write_end() const { return end_ - buffer_.data(); }

 private:
  StreamWindow view() { return {buffer_, {start_, search_, end_}, part_ == 0 ? nullptr : &part_}; }

  std::vector<unsigned char> buffer_;
  unsigned char* start_;
  unsigned char* search_;
  unsigned char* end_;
  std::size_t part_ = 0;
};

std::string code4() { return std::string("\0\0\0\1", 4); }
std::string code3() { return std::string("\0\0\1", 3); }

TEST(StreamWindow, CutsFromOneStartCodeToTheNext) {
  WindowUnderTest window(kRoomLeft * 2);
  window.receive(code4() + "one" + code4() + "two" + code4() + "x");
  EXPECT_EQ(window.cut(), "frame ");  // in front of the first
  EXPECT_EQ(window.cut(), "frame " + code4() + "one");
  EXPECT_EQ(window.cut(), "frame " + code4() + "two");
  EXPECT_EQ(window.cut(), "none");
  EXPECT_EQ(window.frame_start(), 14);
}

TEST(StreamWindow, TakesThreeByteStartCodesToo) {
  WindowUnderTest window(kRoomLeft * 2);
  window.receive("garbage" + code3() + "one" + code3() + "x");
  EXPECT_EQ(window.cut(kMpeg4Code), "frame garbage");
  EXPECT_EQ(window.cut(kMpeg4Code), "frame " + code3() + "one");
}

TEST(StreamWindow, SearchesOnlyMoreThanAStartCodesLength) {
  WindowUnderTest window(kRoomLeft * 2);
  window.receive(code4());
  EXPECT_EQ(window.cut(), "none");
  EXPECT_EQ(window.search(), 0);
  window.receive("x");
  EXPECT_EQ(window.cut(), "frame ");
}

TEST(StreamWindow, FindsAStartCodeThatCameInPieces) {
  for (std::size_t cut = 0; cut < 4; ++cut) {
    WindowUnderTest window(kRoomLeft * 2);
    window.receive(code4() + "first frame" + code4().substr(0, cut));
    EXPECT_EQ(window.cut(), "frame ");
    EXPECT_EQ(window.cut(), "none");
    window.receive(code4().substr(cut) + "xxxx");
    EXPECT_EQ(window.cut(), "frame " + code4() + "first frame") << cut;
  }
}

TEST(StreamWindow, KeepsThePlacesAfterAFailedSearch) {
  WindowUnderTest window(kRoomLeft * 2);
  window.receive("0123456789");
  EXPECT_EQ(window.cut(), "none");
  EXPECT_EQ(window.search(), 10 - 4 + 1);
  EXPECT_EQ(window.cut(), "none");
  EXPECT_EQ(window.search(), 10 - 4 + 1);
}

TEST(StreamWindow, GivesTheSameFramesHoweverTheBytesCome) {
  std::string stream;
  std::vector<std::string> frames;
  for (int i = 0; i < 20; ++i) {
    frames.push_back(code4() + std::string(static_cast<std::size_t>(i * 3), static_cast<char>('a' + i)));
    stream += frames.back();
  }
  for (std::size_t piece = 1; piece <= stream.size(); ++piece) {
    WindowUnderTest window(kRoomLeft * 2);
    std::vector<std::string> cut;
    for (std::size_t at = 0; at < stream.size(); at += piece) {
      window.receive(stream.substr(at, piece));
      for (std::string got = window.cut(); got != "none"; got = window.cut()) cut.push_back(got.substr(6));
    }
    ASSERT_EQ(cut.size(), frames.size()) << piece;
    EXPECT_EQ(cut[0], "");
    EXPECT_TRUE(std::equal(cut.begin() + 1, cut.end(), frames.begin())) << piece;
  }
}

TEST(StreamWindow, LeavesAFrameThatIsLongerThanTheRoom) {
  WindowUnderTest window(kRoomLeft * 2);
  window.receive(code4() + "12345" + code4() + "x");
  EXPECT_EQ(window.cut(), "frame ");
  for (int i = 0; i < 3; ++i) EXPECT_EQ(window.cut(kH264Code, 8), "too long");
  EXPECT_EQ(window.frame_start(), 0);
  EXPECT_EQ(window.cut(kH264Code, 9), "frame " + code4() + "12345");
}

TEST(StreamWindow, MovesTheFrameWhenLessThan65536BytesAreFree) {
  for (const std::size_t free : {kRoomLeft, kRoomLeft - 1}) {
    WindowUnderTest window(kRoomLeft + 100);
    const std::string unfinished = code4() + "unfinished";
    const std::size_t before = kRoomLeft + 100 - free - unfinished.size();
    window.receive(std::string(before, 'x') + unfinished);
    EXPECT_EQ(window.cut(), "frame " + std::string(before, 'x'));
    window.make_room();
    const bool moved = free < kRoomLeft;
    EXPECT_EQ(window.frame_start(), moved ? 0 : static_cast<std::ptrdiff_t>(before));
    EXPECT_EQ(window.search(), window.frame_start() + 4);
    EXPECT_EQ(window.write_end(), window.frame_start() + static_cast<std::ptrdiff_t>(unfinished.size()));
    window.receive(code4() + "x");
    EXPECT_EQ(window.cut(), "frame " + unfinished);
  }
}

TEST(StreamWindow, SearchesAMovedFrameAgain) {
  WindowUnderTest window(kRoomLeft);
  window.receive(code4() + "0123456789");
  EXPECT_EQ(window.cut(), "frame ");
  EXPECT_EQ(window.cut(), "none");
  EXPECT_EQ(window.search(), 14 - 4 + 1);
  window.make_room();
  EXPECT_EQ(window.search(), 4);
}

TEST(StreamWindow, SmallFramesStayInThePartThatIsInUse) {
  WindowUnderTest window(1 << 22, 3 * kRoomLeft);
  for (int i = 0; i < 1000; ++i) {
    ASSERT_EQ(window.receive(code4() + std::string(900, 'x')), 904U);
    ASSERT_EQ(window.cut(), i == 0 ? "frame " : "frame " + code4() + std::string(900, 'x'));
    ASSERT_LE(window.write_end(), static_cast<std::ptrdiff_t>(3 * kRoomLeft));
    window.make_room();
  }
}

TEST(StreamWindow, ThePartInUseGrowsWithTheFrameUntilTheBufferIsFull) {
  WindowUnderTest window(10 * kRoomLeft, 2 * kRoomLeft);
  std::size_t taken = window.receive(code4() + std::string(20 * kRoomLeft, 'x'));
  EXPECT_EQ(taken, 2 * kRoomLeft);
  for (const std::size_t part : {4U, 8U, 10U, 10U}) {
    window.make_room();
    taken += window.receive(std::string(20 * kRoomLeft, 'x'));
    EXPECT_EQ(taken, part * kRoomLeft);
  }
}

TEST(StreamWindow, AFullBufferTakesNothingMore) {
  WindowUnderTest window(100);
  EXPECT_EQ(window.receive(std::string(150, 'x')), 100U);
  for (int i = 0; i < 3; ++i) {
    EXPECT_EQ(window.cut(), "none");
    window.make_room();
    EXPECT_EQ(window.receive("more"), 0U);
  }
  EXPECT_EQ(window.write_end(), 100);
}

TEST(StreamWindow, WithoutABufferHasNoFrameAndNoRoom) {
  WindowUnderTest window(0);
  window.make_room();
  EXPECT_EQ(window.cut(), "none");
  EXPECT_EQ(window.receive("x"), 0U);
}

}  // namespace
}  // namespace vexa
