// SPDX-License-Identifier: Apache-2.0
#include "virtual_camera/server/journal.h"

#include <gtest/gtest.h>

#include <thread>

#include "virtual_camera/program/journal_file.h"
#include "virtual_camera/rtp/sent_log.h"

namespace vexa::camera {
namespace {

using std::chrono::milliseconds;

Request request_of(const std::string& bytes) {
  Request request;
  request.bytes = bytes;
  return request;
}

TEST(Journal, KeepsTheNewestRequestsInOrder) {
  Journal journal(2);
  for (const char* text : {"A", "B", "C"}) journal.add(request_of(text));
  const std::vector<Request> requests = journal.snapshot();
  ASSERT_EQ(requests.size(), 2U);
  EXPECT_EQ(requests[0].bytes, "B");
  EXPECT_EQ(requests[1].bytes, "C");
  EXPECT_EQ(journal.count("C"), 1U);
  EXPECT_EQ(journal.count("A"), 0U);
  journal.clear();
  EXPECT_TRUE(journal.snapshot().empty());
}

TEST(Journal, WaitsUntilARequestComesFromAnotherThread) {
  Journal journal(10);
  std::thread other([&journal] { journal.add(request_of("PLAY")); });
  EXPECT_TRUE(journal.wait_for_count("PLAY", 1, milliseconds(20000)));
  other.join();
  EXPECT_FALSE(journal.wait_for_count("PLAY", 2, milliseconds(1)));
}

TEST(Journal, ObserverSeesEveryRequestOnce) {
  Journal journal(1);
  std::string seen;
  journal.observe([&seen](const Request& request) { seen += request.bytes; });
  journal.add(request_of("A"));
  journal.add(request_of("B"));
  EXPECT_EQ(seen, "AB");
}

TEST(JournalFile, ALineHoldsEveryByteOfTheRequest) {
  Request request = request_of(std::string("a\0\"\r\n\x80\xff", 7));
  request.kind = RequestKind::kRtsp;
  request.peer = "127.0.0.1:4";
  request.status = 400;
  request.answer = "RTSP/1.0 400 Bad Request\r\n\r\n";
  EXPECT_EQ(journal_line("127.0.0.2", request),
            R"({"camera":"127.0.0.2","kind":"rtsp","peer":"127.0.0.1:4","time":0.0,"status":400,)"
            "\"request\":\"a\\u0000\\\"\\r\\n\xc2\x80\xc3\xbf\","
            R"("answer":"RTSP/1.0 400 Bad Request\r\n\r\n"})");
}

TEST(JournalFile, APathThatCannotBeWrittenIsReported) { EXPECT_FALSE(JournalFile("/nowhere/journal").good()); }

TEST(SentLog, CountsWhatLeftAndKeepsTheNewest) {
  SentLog log(2);
  std::vector<SentPacket> packets(3);
  for (std::size_t i = 0; i < packets.size(); ++i) packets[i].packet = i;
  packets[1].lost = true;
  log.add(packets);
  EXPECT_EQ(log.sent(), 2U);
  const std::vector<SentPacket> kept = log.snapshot();
  ASSERT_EQ(kept.size(), 2U);
  EXPECT_EQ(kept[0].packet, 1U);
  EXPECT_EQ(kept[1].packet, 2U);
  log.clear();
  EXPECT_TRUE(log.snapshot().empty());
}

TEST(SentLog, ALimitOfZeroOnlyCounts) {
  SentLog log(0);
  log.add(std::vector<SentPacket>(3));
  EXPECT_EQ(log.sent(), 3U);
  EXPECT_TRUE(log.snapshot().empty());
}

TEST(SentLog, WaitsForPacketsAndForTheEndOfAStream) {
  SentLog log(10);
  EXPECT_FALSE(log.wait_for_finished(1, milliseconds(1)));
  std::thread other([&log] {
    log.add(std::vector<SentPacket>(2));
    log.add_finished_stream();
  });
  EXPECT_TRUE(
      log.wait_for([](const std::deque<SentPacket>& packets) { return packets.size() == 2; }, milliseconds(20000)));
  EXPECT_TRUE(log.wait_for_finished(1, milliseconds(20000)));
  EXPECT_EQ(log.finished_streams(), 1U);
  other.join();
}

}  // namespace
}  // namespace vexa::camera
