// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>
#include <limits.h>
#include <pthread.h>
#include <sys/mman.h>
#include <unistd.h>

#include <cstddef>
#include <cstring>
#include <string>

#include "vexa/runtime.h"

namespace {

using testing::internal::CaptureStderr;
using testing::internal::GetCapturedStderr;

TEST(MinMax, CompareSigned) {
  const struct {
    int a, b, least, most;
  } cases[] = {{1, 2, 1, 2}, {2, 1, 1, 2}, {-1, 1, -1, 1}, {INT_MIN, INT_MAX, INT_MIN, INT_MAX}, {5, 5, 5, 5}};
  for (const auto& c : cases) {
    EXPECT_EQ(::min(c.a, c.b), c.least);
    EXPECT_EQ(::max(c.a, c.b), c.most);
  }
}

TEST(GetVersionEx, SetsThePlatformAndNothingElse) {
  static_assert(offsetof(_OSVERSIONINFO, dwPlatformId) == 16, "the fifth 32-bit field");
  _OSVERSIONINFO info;
  _OSVERSIONINFO expected;
  std::memset(&info, 0x5A, sizeof info);
  std::memset(&expected, 0x5A, sizeof expected);
  expected.dwPlatformId = 2;
  EXPECT_EQ(GetVersionEx(&info), 1);
  EXPECT_EQ(std::memcmp(&info, &expected, sizeof info), 0);
}

TEST(GetVersionEx, RefusesNull) { EXPECT_EQ(GetVersionEx(nullptr), 0); }

int is_trail(const std::string& text, int position) {
  const auto* start = reinterpret_cast<const unsigned char*>(text.data());
  return _ismbstrail(start, start + position);
}

TEST(Ismbstrail, WalksCharactersOfOneTwoAndThreeBytes) {
  const struct {
    const char* text;
    int position;
    int result;
  } cases[] = {
      {"ab", 0, 0},
      {"ab", 1, 0},
      {"ab", 2, 0},
      {"\xA4\xA2", 0, 0},
      {"\xA4\xA2", 1, -1},
      {"\xA4\xA2", 2, 0},
      {"a\xA4\xA2z", 2, -1},
      {"a\xA4\xA2z", 3, 0},
      {"\x80\xA2", 1, 0},           // 0x80 stands alone
      {"\x81\x20", 1, -1},          // 0x81 begins two bytes, whatever the second is
      {"\xFF\xFF\xFF", 2, 0},       // two and the beginning of the next
      {"\x8F\xA1\xA1z", 1, -1},     // three bytes: 0x8F and one above 0xA0
      {"\x8F\xA1\xA1z", 2, -1},     //
      {"\x8F\xA1\xA1z", 3, 0},      //
      {"\x8F\xA0zz", 1, -1},        // 0xA0 is not above 0xA0: two bytes
      {"\x8F\xA0zz", 2, 0},         //
      {"\x8E\xB1z", 1, -1},         //
      {"\x8E\xB1z", 2, 0},          //
      {"\xA4\xA2\xA4\xA4", 3, -1},  //
      {"\xA4\xA2\xA4\xA4", 4, 0},   //
  };
  for (const auto& c : cases) EXPECT_EQ(is_trail(c.text, c.position), c.result) << c.text << " at " << c.position;
}

TEST(Ismbstrail, APositionBeforeTheStartIsNoBoundary) {
  const unsigned char text[] = "ab";
  EXPECT_EQ(_ismbstrail(text + 1, text), -1);
}

TEST(Ismbstrail, ReadsNothingAtOrAfterThePosition) {
  const auto page = static_cast<std::size_t>(sysconf(_SC_PAGESIZE));
  void* pages = mmap(nullptr, 2 * page, PROT_READ | PROT_WRITE, MAP_PRIVATE | MAP_ANONYMOUS, -1, 0);
  ASSERT_NE(pages, MAP_FAILED);
  auto* end = static_cast<unsigned char*>(pages) + page;
  ASSERT_EQ(mprotect(end, page, PROT_NONE), 0);
  for (const int last : {0x8F, 0xA4}) {
    end[-1] = static_cast<unsigned char>(last);
    EXPECT_EQ(_ismbstrail(end - 1, end), -1);
  }
  end[-1] = 'a';
  EXPECT_EQ(_ismbstrail(end - 1, end), 0);
  munmap(pages, 2 * page);
}

TEST(LoadLibrary, FindsALibraryAndItsFunctions) {
  void* module = LoadLibrary("libm.so.6");
  ASSERT_NE(module, nullptr);
  EXPECT_NE(GetProcAddress(module, "cos"), nullptr);
  EXPECT_EQ(GetProcAddress(module, "no_such_function_here"), nullptr);
  EXPECT_EQ(FreeLibrary(module), 0);
}

TEST(LoadLibrary, GivesNullForAMissingLibrary) { EXPECT_EQ(LoadLibrary("libno_such_library.so.9"), nullptr); }

TEST(LoadLibrary, OfNullIsTheProgram) {
  void* program = LoadLibrary(nullptr);
  ASSERT_NE(program, nullptr);
  EXPECT_EQ(GetProcAddress(program, "getpid"), GetProcAddress(nullptr, "getpid"));
  EXPECT_EQ(FreeLibrary(program), 0);
}

TEST(FreeLibrary, ReturnsZeroForSuccess) {
  void* module = LoadLibrary("libm.so.6");
  ASSERT_NE(module, nullptr);
  EXPECT_EQ(FreeLibrary(module), 0);
  EXPECT_EQ(FreeLibrary(nullptr), -1);
}

int sign(int number) { return (number > 0) - (number < 0); }

TEST(Stricmp, ComparesWithoutCase) {
  const struct {
    const char* a;
    const char* b;
    int result;
  } cases[] = {{"Vexa", "vEXA", 0}, {"a", "B", -1}, {"B", "a", 1}, {"", "", 0}, {"ab", "abc", -1}, {"abc", "AB", 1}};
  for (const auto& c : cases) EXPECT_EQ(sign(stricmp(c.a, c.b)), c.result) << c.a << " " << c.b;
}

TEST(Strnicmp, ComparesTheFirstBytesWithoutCase) {
  const struct {
    const char* a;
    const char* b;
    std::size_t count;
    int result;
  } cases[] = {{"Vexa1", "vEXA2", 4, 0}, {"Vexa1", "vEXA2", 5, -1}, {"x", "y", 0, 0}, {"a", "A", 100, 0}};
  for (const auto& c : cases) EXPECT_EQ(sign(strnicmp(c.a, c.b, c.count)), c.result) << c.a << " " << c.b;
}

TEST(IsCharAlphaNumeric, KnowsEveryByte) {
  const std::string wanted = "0123456789ABCDEFGHIJKLMNOPQRSTUVWXYZabcdefghijklmnopqrstuvwxyz";
  for (int byte = CHAR_MIN; byte <= CHAR_MAX; ++byte) {
    const char c = static_cast<char>(byte);
    EXPECT_EQ(IsCharAlphaNumeric(c) != 0, wanted.find(c) != std::string::npos) << byte;
  }
}

TEST(OutputDebugString, EndsEveryTextInOneLineFeed) {
  const std::string long_text(100000, 'x');
  const struct {
    std::string text;
    std::string written;
  } cases[] = {
      {"text", "text\n"}, {"text\n", "text\n"},   {"text\n\n", "text\n\n"}, {"", "\n"},
      {"\n", "\n"},       {"%s%n%d", "%s%n%d\n"}, {"%s\n", "%s\n"},         {long_text, long_text + "\n"},
  };
  for (const auto& c : cases) {
    CaptureStderr();
    OutputDebugString(c.text.c_str());
    EXPECT_EQ(GetCapturedStderr(), c.written);
    CaptureStderr();
    OutputDebugStringA(c.text.c_str());
    EXPECT_EQ(GetCapturedStderr(), c.written);
  }
}

TEST(OutputDebugString, WritesNothingForNull) {
  CaptureStderr();
  OutputDebugString(nullptr);
  EXPECT_EQ(GetCapturedStderr(), "");
}

TEST(GetDriveType, IsAlwaysUnknown) {
  for (const char* root : {"/", "c:\\", "", static_cast<const char*>(nullptr)}) EXPECT_EQ(GetDriveType(root), 0U);
}

TEST(InitializeCriticalSection, MakesARecursiveMutex) {
  pthread_mutex_t mutex;
  CaptureStderr();
  InitializeCriticalSection(&mutex);
  EXPECT_EQ(GetCapturedStderr(), "");
  EXPECT_EQ(pthread_mutex_trylock(&mutex), 0);
  EXPECT_EQ(pthread_mutex_trylock(&mutex), 0);
  EXPECT_EQ(pthread_mutex_unlock(&mutex), 0);
  EXPECT_EQ(pthread_mutex_unlock(&mutex), 0);
  EXPECT_EQ(pthread_mutex_destroy(&mutex), 0);
}

TEST(InitializeCriticalSection, ReportsWhyItFailed) {
  CaptureStderr();
  InitializeCriticalSection(nullptr);
  EXPECT_EQ(GetCapturedStderr(), "pthread_mutex_init: Invalid argument\n");
}

}  // namespace
