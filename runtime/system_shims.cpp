// SPDX-License-Identifier: Apache-2.0
// Windows calls that are one call of the C library, or a constant.
#include <dlfcn.h>
#include <pthread.h>
#include <strings.h>

#include <cctype>
#include <cerrno>
#include <cstddef>
#include <cstdio>
#include <cstring>

#include "vexa/runtime.h"

int min(int a, int b) { return a < b ? a : b; }

int max(int a, int b) { return a > b ? a : b; }

int GetVersionEx(_OSVERSIONINFO* info) {
  if (info == nullptr) return 0;
  info->dwPlatformId = VER_PLATFORM_WIN32_NT;
  return 1;
}

namespace {

constexpr unsigned char kLastSingleByte = 0x80;
constexpr unsigned char kThreeByteLead = 0x8F;
constexpr unsigned char kLastNonTrail = 0xA0;

// Length of the EUC-JP character at the head of `left` readable bytes, at least one.
std::ptrdiff_t euc_length(const unsigned char* character, std::ptrdiff_t left) {
  if (character[0] <= kLastSingleByte) return 1;
  // Safe: no byte after the last readable one is read; two or three bytes both step over the position asked for.
  const bool three = character[0] == kThreeByteLead && left > 1 && character[1] > kLastNonTrail;
  return three ? 3 : 2;
}

}  // namespace

int _ismbstrail(const unsigned char* start, const unsigned char* pos) {
  const std::ptrdiff_t end = pos - start;
  std::ptrdiff_t at = 0;
  while (at < end) at += euc_length(start + at, end - at);
  return at == end ? 0 : -1;
}

void* LoadLibrary(const char* path) { return dlopen(path, RTLD_LAZY); }

void* GetProcAddress(void* module, const char* name) { return dlsym(module, name); }

// Kept: 0 is success here, the opposite of Windows; hosts compare with dlclose's result.
int FreeLibrary(void* module) { return module != nullptr ? dlclose(module) : -1; }

int stricmp(const char* a, const char* b) { return strcasecmp(a, b); }

int strnicmp(const char* a, const char* b, std::size_t count) { return strncasecmp(a, b, count); }

int IsCharAlphaNumeric(char c) { return std::isalnum(static_cast<unsigned char>(c)); }

void OutputDebugString(const char* text) {
  if (text == nullptr) return;
  const std::size_t length = std::strlen(text);
  const bool ends_line = length > 0 && text[length - 1] == '\n';
  std::fprintf(stderr, ends_line ? "%s" : "%s\n", text);
}

void OutputDebugStringA(const char* text) { OutputDebugString(text); }

unsigned int GetDriveType(const char*) { return 0; }

void InitializeCriticalSection(pthread_mutex_t* m) {
  int code = EINVAL;
  if (m != nullptr) {
    pthread_mutexattr_t attributes;
    pthread_mutexattr_init(&attributes);
    pthread_mutexattr_settype(&attributes, PTHREAD_MUTEX_RECURSIVE);
    code = pthread_mutex_init(m, &attributes);
    pthread_mutexattr_destroy(&attributes);
  }
  if (code == 0) return;
  errno = code;
  std::perror("pthread_mutex_init");
}
