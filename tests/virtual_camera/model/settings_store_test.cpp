// SPDX-License-Identifier: Apache-2.0
#include "virtual_camera/model/settings_store.h"

#include <gtest/gtest.h>

namespace vexa::camera {
namespace {

TEST(SettingsStore, KeysKeepTheOrderInWhichTheyWereFirstSet) {
  SettingsStore store;
  store.set("own", "B", "1");
  store.set("own", "A", "2");
  store.set("own", "B", "3");
  EXPECT_EQ(store.answer("own"), "B=3&A=2");
}

TEST(SettingsStore, CommandsChangeAndAddKeysWithoutDecoding) {
  const struct {
    const char* query;
    const char* answer;
  } cases[] = {{"A=2", "A=2"},
               {"A=%20", "A=%20"},
               {"B=1,2", "A=1&B=1,2"},
               {"B=x=y", "A=1&B=x=y"},
               {"B=", "A=1&B="},
               {"B", "A=1"},
               {"=x", "A=1"},
               {"&&B=1&", "A=1&B=1"},
               {"A=2&A=3", "A=3"},
               {"", "A=1"},
               {"B=1&C=2", "A=1&B=1&C=2"}};
  for (const auto& c : cases) {
    SettingsStore store;
    store.set("own", "A", "1");
    EXPECT_TRUE(store.apply("own", c.query));
    EXPECT_EQ(store.answer("own"), c.answer) << c.query;
  }
}

TEST(SettingsStore, GetAndEraseSeeWhatWasSet) {
  SettingsStore store;
  store.set("own", "A", "1");
  EXPECT_EQ(store.get("own", "A"), "1");
  EXPECT_EQ(store.get("own", "B"), std::nullopt);
  EXPECT_EQ(store.get("none", "A"), std::nullopt);
  store.erase("own", "A");
  store.erase("none", "A");
  EXPECT_EQ(store.get("own", "A"), std::nullopt);
  EXPECT_EQ(store.answer("own"), "");
  store.erase_section("own");
  EXPECT_EQ(store.answer("own"), std::nullopt);
}

TEST(SettingsStore, AnAnswerOfItsOwnHidesTheKeysUntilTakenBack) {
  SettingsStore store;
  store.set("own", "A", "1");
  store.set_answer("own", "anything&at=all");
  EXPECT_EQ(store.answer("own"), "anything&at=all");
  EXPECT_EQ(store.get("own", "A"), "1");
  store.set_answer("own", std::nullopt);
  EXPECT_EQ(store.answer("own"), "A=1");
}

TEST(SettingsStore, DefaultsAreThoseOfAPlausibleCamera) {
  const struct {
    const char* section;
    const char* key;
    const char* value;
  } cases[] = {{"system", "ModelName", "VX-2000"},
               {"system", "SoftVersion", "1.02.00"},
               {"system", "Serial", "100001"},
               {"system", "ContinuousPanTiltZoomFunc", "1"},
               {"system", "ChannelId", "1"},
               {"system", "TamperingFunc", "off"},
               {"network", "MacAddress", "02:00:00:00:00:01"},
               {"camera", "VideoStd", "pal"},
               {"camera", "ImageCodec1", "h264"},
               {"camera", "ImageSize1", "1920,1080"},
               {"camera", "FrameRate1", "25"},
               {"camera", "BitRate1", "8000"},
               {"camera", "RTSPPort", "554"},
               {"edgestorage", "EsRTSPRec1Timeout", "60"}};
  const SettingsStore store;
  for (const auto& c : cases) EXPECT_EQ(store.get(c.section, c.key), c.value) << c.key;
}

TEST(SettingsStore, EveryInquiryOfTheDriverHasASection) {
  const SettingsStore store;
  for (const char* name : {"system", "network", "camera", "presetposition", "sensor", "lod", "objectdetection",
                           "a-slot", "edgestorage", "audiodetection"}) {
    EXPECT_TRUE(store.answer(name)) << name;
  }
}

std::string bytes_for(const std::string& request_line, SettingsStore& settings) {
  const auto head = parse_head(request_line + "\r\n\r\n");
  return head ? answer_command(*head, settings).bytes : "no head";
}

std::string empty_answer(const std::string& status) {
  return "HTTP/1.0 " + status + "\r\nContent-Type: text/plain\r\nContent-Length: 0\r\n\r\n";
}

TEST(Cgi, InquiryAnswersTheSection) {
  SettingsStore settings;
  settings.set_answer("own", "A=1&B=2");
  EXPECT_EQ(bytes_for("GET /command/inquiry.cgi?inq=own HTTP/1.0", settings),
            "HTTP/1.0 200 OK\r\nContent-Type: text/plain\r\nContent-Length: 7\r\n\r\nA=1&B=2");
}

TEST(Cgi, CommandChangesWhatTheInquiryOfItsNameAnswers) {
  SettingsStore settings;
  EXPECT_EQ(bytes_for("GET /command/camera.cgi?RTSPTimeout=30 HTTP/1.0", settings), "HTTP/1.0 204 No Content\r\n\r\n");
  EXPECT_EQ(bytes_for("GET /command/edgestorage.cgi?EsRTSPRec1Timeout=90&New=1 HTTP/1.0", settings),
            "HTTP/1.0 204 No Content\r\n\r\n");
  EXPECT_EQ(settings.get("camera", "RTSPTimeout"), "30");
  EXPECT_EQ(settings.answer("edgestorage"), "Edgestorage=off&EsRTSPRec1Timeout=90&New=1");
}

TEST(Cgi, WhatItCannotServeIsRefused) {
  const struct {
    const char* line;
    const char* status;
  } cases[] = {{"GET /nowhere HTTP/1.0", "404 Not Found"},
               {"GET / HTTP/1.0", "404 Not Found"},
               {"GET /command/ HTTP/1.0", "404 Not Found"},
               {"GET /command/.cgi HTTP/1.0", "404 Not Found"},
               {"GET /command/a/b.cgi?A=1 HTTP/1.0", "404 Not Found"},
               {"GET /command/inquiry.cgi?inq=unknown HTTP/1.0", "404 Not Found"},
               {"GET /command/inquiry.cgi HTTP/1.0", "400 Bad Request"},
               {"GET /command/inquiry.cgi?inq= HTTP/1.0", "400 Bad Request"},
               {"GET /command/inquiry.cgi?name=system HTTP/1.0", "400 Bad Request"},
               {"GET /command/camera.cgi HTTP/1.0", "400 Bad Request"},
               {"GET /command/camera.cgi?nothing HTTP/1.0", "400 Bad Request"},
               {"POST /command/camera.cgi?A=1 HTTP/1.0", "501 Not Implemented"},
               {"GET /command/camera.cgi?A=1 RTSP/1.0", "400 Bad Request"}};
  for (const auto& c : cases) {
    SettingsStore settings;
    EXPECT_EQ(bytes_for(c.line, settings), empty_answer(c.status)) << c.line;
  }
}

TEST(Cgi, Status401CarriesAChallenge) {
  EXPECT_EQ(http_answer("401 Unauthorized", "").bytes,
            "HTTP/1.0 401 Unauthorized\r\nWWW-Authenticate: Basic realm=\"camera\"\r\nContent-Type: text/plain\r\n"
            "Content-Length: 0\r\n\r\n");
  EXPECT_EQ(http_answer("401 Unauthorized", "").status, 401);
}

}  // namespace
}  // namespace vexa::camera
