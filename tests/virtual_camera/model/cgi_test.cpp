#include "virtual_camera/model/cgi.h"

#include <gtest/gtest.h>

namespace vexa::camera {
namespace {

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
