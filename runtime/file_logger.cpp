#include "vexa/file_logger.h"

#include <array>
#include <cstdio>
#include <cstring>
#include <memory>
#include <string_view>
#include <utility>

#include "runtime/base/result.h"
#include "runtime/base/sync.h"
#include "vexa/real_time.h"
#include "vexa/runtime.h"

namespace {

/// Made when the library loads, before other statics, and never destroyed.
template <typename T>
struct Undying {
  union {
    T value;
  };
  Undying() : value() {}
  Undying(const Undying&) = delete;
  Undying& operator=(const Undying&) = delete;
  ~Undying() {}
};

constexpr std::size_t kBannerRule = 103;
constexpr std::int64_t kBytesPerKilobyte = 1024;

std::string local_time(const char* format) { return CRealTime::GetTheCurrentTime().Format(format, false); }

bool write_text(typedHandle* file, std::string_view text) {
  if (file == nullptr) return false;
  unsigned long written = 0;
  return WriteFile(file, text.data(), text.size(), &written, nullptr) == 1 && written == text.size();
}

struct LogCloser {
  void operator()(typedHandle* file) const { CloseHandle(file); }
};
using OpenLog = std::unique_ptr<typedHandle, LogCloser>;

/// The file, at its end, behind an opening banner; null when it cannot be opened.
OpenLog open_log(const std::string& name) {
  OpenLog file(
      CreateFile(name.c_str(), GENERIC_WRITE, FILE_SHARE_WRITE, nullptr, OPEN_ALWAYS, FILE_ATTRIBUTE_NORMAL, nullptr));
  if (file == nullptr) return nullptr;
  SetFilePointer(file.get(), 0, nullptr, FILE_END);
  write_text(file.get(),
             "\n" + std::string(kBannerRule, '-') + local_time("\n%D-%O-%Y %H:%M:%S.%03L LogFile Opened. "));
  FlushFileBuffers(file.get());
  return file;
}

// Safe: a logger's end needs memory for its banner alone, which is left out when there is none.
void close_log(typedHandle* file) {
  if (file == nullptr) return;
  const OpenLog closing(file);
  (void)vexa::within_memory([&] {
    write_text(file, local_time("\n%D-%O-%Y %H:%M:%S.%03L\tLogFile Closed\n") + std::string(kBannerRule, '-') + "\n");
  });
}

/// The name of copy `number` of a file: "dir/Log.txt" and 2 give "dir/Log2.txt"; copy 0 is the file itself.
std::string copy_name(const std::string& file, int number) {
  if (number == 0) return file;
  const std::size_t room = file.size() + 1;
  std::string drive(room, '\0');
  std::string folder(room, '\0');
  std::string base(room, '\0');
  std::string extension(room, '\0');
  _splitpath(file.c_str(), drive.data(), folder.data(), base.data(), extension.data());
  std::array<char, 256> numbered{};
  std::snprintf(numbered.data(), numbered.size(), "%s%d", base.c_str(), number);
  std::array<char, 4096> path{};
  _makepath(path.data(), drive.c_str(), folder.c_str(), numbered.data(), extension.c_str());
  return path.data();
}

bool exists(const std::string& path) { return GetFileAttributes(path.c_str()) != INVALID_FILE_ATTRIBUTES; }

/// Moves copy `number - 1` of a file to copy `number`. False when it is there and could not be moved.
bool move_up(const std::string& file, int number) {
  const std::string target = copy_name(file, number);
  const std::string source = copy_name(file, number - 1);
  // Safe: a base name that leaves no room for the number is its own target; it is not deleted.
  if (target == source) return false;
  if (exists(target)) DeleteFile(target.c_str());
  return !exists(source) || MoveFile(source.c_str(), target.c_str()) == 1;
}

// Their priority puts them before every other static, a logger among them.
Undying<CSimpleLock> file_list_lock __attribute__((init_priority(101)));
Undying<std::map<long long, CFileLogger::FileInfo>> file_list __attribute__((init_priority(101)));

}  // namespace

constinit CSimpleLock& CFileLogger::m_FileListLock = file_list_lock.value;
constinit std::int64_t CFileLogger::m_FileHandleSeed = 0;
constinit std::map<long long, CFileLogger::FileInfo>& CFileLogger::m_FileInfoList = file_list.value;

CFileLogger::CFileLogger() : m_FileName("Log.txt"), m_MaxSize(1024), m_CopyCount(1), m_FileId(0) {}

CFileLogger::~CFileLogger() { CloseFile(); }

void CFileLogger::SetFileName(const char* name) {
  if (name == nullptr || *name == '\0') return;
  // Without memory the name stays, as everything does that a logger cannot do.
  (void)vexa::within_memory([&] {
    const vexa::Guard guard(m_FileListLock);
    m_FileName = name;
  });
}

// Safe: the lock is held from leaving the old file to having the new one, so that a thread that logs or opens meanwhile
// neither loses its line nor leaves a share behind.
void CFileLogger::OpenFile() {
  (void)vexa::within_memory([this] {
    const vexa::Guard guard(m_FileListLock);
    CloseFile();
    if (JoinFile()) return;
    OpenLog file = open_log(m_FileName);
    if (file == nullptr) return;
    m_FileInfoList.insert_or_assign(m_FileHandleSeed + 1, FileInfo{m_FileName, file.get(), 1});
    m_FileId = ++m_FileHandleSeed;
    (void)file.release();  // the list's
  });
}

bool CFileLogger::JoinFile() {
  for (auto& [id, entry] : m_FileInfoList) {
    if (entry.fileName != m_FileName) continue;
    ++entry.referenceCount;
    m_FileId = id;
    return true;
  }
  return false;
}

void CFileLogger::CloseFile() {
  const vexa::Guard guard(m_FileListLock);
  FileInfo* entry = FindEntry();
  if (entry != nullptr && --entry->referenceCount < 1) {
    typedHandle* file = entry->fileHandle;
    m_FileInfoList.erase(m_FileId);
    close_log(file);
  }
  m_FileId = 0;
}

void CFileLogger::Log(const char* text) {
  if (text == nullptr) return;
  const vexa::Guard guard(m_FileListLock);
  const FileInfo* entry = FindEntry();
  if (entry == nullptr || !write_text(entry->fileHandle, text)) return;
  FlushFileBuffers(entry->fileHandle);
  CycleFiles();
}

void CFileLogger::CycleFiles() {
  const vexa::Guard guard(m_FileListLock);
  if (m_MaxSize == 0 && m_CopyCount == 0) return;
  const FileInfo* entry = FindEntry();
  if (entry == nullptr || entry->fileHandle == nullptr) return;
  const std::uint32_t size = GetFileSize(entry->fileHandle, nullptr);
  if (size == INVALID_FILE_SIZE || size < m_MaxSize * kBytesPerKilobyte) return;
  CycleCloseFile();
  (void)vexa::within_memory([this, entry] {
    // Kept: without copies the same file is opened again and grows on; every later line rotates again.
    int number = m_CopyCount;
    while (number >= 1 && move_up(entry->fileName, number)) --number;
  });
  CycleOpenFile();
}

void CFileLogger::CycleCloseFile() {
  const vexa::Guard guard(m_FileListLock);
  FileInfo* entry = FindEntry();
  if (entry == nullptr) return;
  // Safe: nothing uses the closed handle again.
  close_log(std::exchange(entry->fileHandle, nullptr));
}

void CFileLogger::CycleOpenFile() {
  const vexa::Guard guard(m_FileListLock);
  FileInfo* entry = FindEntry();
  if (entry == nullptr || entry->fileHandle != nullptr) return;
  (void)vexa::within_memory([entry] { entry->fileHandle = open_log(entry->fileName).release(); });
}

CFileLogger::FileInfo* CFileLogger::FindEntry() {
  const auto found = m_FileInfoList.find(m_FileId);
  return found == m_FileInfoList.end() ? nullptr : &found->second;
}
