// SPDX-License-Identifier: Apache-2.0
// A log file that several loggers of a process share, rotated by size.
#pragma once

#include <cstdint>
#include <map>
#include <string>

#include "vexa/export.h"
#include "vexa/simple_lock.h"

struct typedHandle;

/// Appends texts to a log file. Loggers that name the same file share one open file. When the file reaches the size
/// limit it is moved aside ("Log.txt" to "Log1.txt", that to "Log2.txt", …) and begun anew.
///
/// Any thread may call any operation; one lock serves all log files of the process. Nothing is reported: a logger whose
/// file cannot be opened or written is silent, and its owner goes on.
class VEXA_API CFileLogger {
 public:
  /// An open file, and who shares it.
  struct FileInfo {
    std::string fileName;
    typedHandle* fileHandle = nullptr;  ///< owned; null after a reopening that failed
    int referenceCount = 0;             ///< loggers that have the file open
  };

  /// A closed logger named "Log.txt", of 1024 KB and one copy.
  CFileLogger();
  /// Closes the logger's share of the file.
  virtual ~CFileLogger();
  CFileLogger(const CFileLogger&) = delete;
  CFileLogger& operator=(const CFileLogger&) = delete;

  /// Names the file that the next OpenFile opens. Null and the empty text leave the name as it was.
  virtual void SetFileName(const char* name);

  /// Leaves the present file, then opens the named one, or joins the loggers that have it open.
  void OpenFile();
  /// Leaves the file; the last logger to leave writes the closing banner and closes it.
  void CloseFile();
  /// Appends `text` as it is (no line break is added), then rotates the file if it has reached the limit.
  void Log(const char* text);

 protected:
  // The steps of a rotation. All three take the lock themselves.
  /// Rotates the file when it has reached the limit.
  void CycleFiles();
  /// Ends the file with the closing banner; the entry stays.
  void CycleCloseFile();
  /// Opens the entry's file again. On failure nothing more is written until every logger has left the file.
  void CycleOpenFile();

  // The logger's own state; m_FileListLock guards it as soon as threads share the logger.
  std::string m_FileName;
  int m_MaxSize;          ///< kilobytes; with m_CopyCount 0 too, 0 means that there is no limit
  int m_CopyCount;        ///< copies kept besides the file itself; below 1 the file is closed, reopened and grows on
  std::int64_t m_FileId;  ///< key in m_FileInfoList; 0 while no file is open

  // These are never destroyed, so that a logger in a host's static object may outlive the library's other statics.
  static CSimpleLock& m_FileListLock;                                                    ///< held for each write
  static std::int64_t m_FileHandleSeed VEXA_GUARDED_BY(m_FileListLock);                  ///< last id handed out
  static std::map<long long, FileInfo>& m_FileInfoList VEXA_GUARDED_BY(m_FileListLock);  ///< open files by id

 private:
  FileInfo* FindEntry() VEXA_REQUIRES(m_FileListLock);
  bool JoinFile() VEXA_REQUIRES(m_FileListLock);
};
