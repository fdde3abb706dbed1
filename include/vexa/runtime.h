// SPDX-License-Identifier: Apache-2.0
// The Windows-style system interface the driver and its host are written against, on POSIX.
//
// Every free function has C linkage under exactly its Windows name. Unless a function says otherwise: BOOL results are
// int, 1 for success and 0 for failure; handles are typedHandle pointers, null for failure; no function throws, and
// none keeps a last-error value. Results that Windows calls DWORD stay below 2^32 on every word size. Texts are
// NUL-terminated and, like every other pointer, must not be null unless the function says so. Any thread may call any
// function; a handle must not be used again once a call has closed it. Descriptors are close-on-exec.
#pragma once

#include <pthread.h>

#include <cstddef>
#include <cstdint>

#include "vexa/export.h"
#include "vexa/real_time.h"

/// What each handle points to: the front of a record of the library's own, whose type `kind` names.
struct typedHandle {
  std::int32_t kind;  ///< one of HANDLE_TYPE_...
};

constexpr std::int32_t HANDLE_TYPE_EVENT = 0;   ///< made by CreateEvent
constexpr std::int32_t HANDLE_TYPE_THREAD = 1;  ///< made by _beginthreadex
constexpr std::int32_t HANDLE_TYPE_FILE = 2;    ///< made by CreateFile
constexpr std::int32_t HANDLE_TYPE_FIND = 3;    ///< made by FindFirstFile

// Kept: WAIT_TIMEOUT is not the Windows number; hosts compare with this one.
constexpr unsigned long INFINITE = 0xFFFFFFFFUL;      ///< a time-out without limit
constexpr unsigned long WAIT_TIMEOUT = 0xFFFFFFFEUL;  ///< a wait's result: nothing was signalled in time
constexpr unsigned long WAIT_FAILED = 0xFFFFFFFFUL;   ///< a wait's result: it could not wait
constexpr unsigned int STILL_ACTIVE = 259;            ///< the exit code of a thread that has not ended

constexpr std::uint32_t VER_PLATFORM_WIN32_NT = 2;  ///< what GetVersionEx reports

// File attributes. These are this layer's own values, not the Windows numbers.
constexpr std::uint32_t FILE_ATTRIBUTE_DIRECTORY = 0x8;
constexpr std::uint32_t FILE_ATTRIBUTE_NORMAL = 0x40;     ///< a file the caller may write
constexpr std::uint32_t FILE_ATTRIBUTE_READONLY = 0x200;  ///< a file or directory the caller may not write

// Access values of CreateFile, this layer's own. Read and write together are 3; nothing else is accepted.
constexpr unsigned long GENERIC_READ = 1;
constexpr unsigned long GENERIC_WRITE = 2;

// Sharing values of CreateFile. They are ignored: every file is shared.
constexpr unsigned long FILE_SHARE_READ = 1;
constexpr unsigned long FILE_SHARE_WRITE = 2;

// Creation values of CreateFile, this layer's own. Exactly one of them must be given.
constexpr unsigned long CREATE_ALWAYS = 1;       ///< create when missing, empty when present
constexpr unsigned long CREATE_NEW = 2;          ///< create; fail when present
constexpr unsigned long OPEN_ALWAYS = 4;         ///< create when missing, keep the contents when present
constexpr unsigned long OPEN_EXISTING = 8;       ///< fail when missing
constexpr unsigned long TRUNCATE_EXISTING = 16;  ///< fail when missing, empty when present

// Where SetFilePointer counts from.
constexpr unsigned long FILE_BEGIN = 0;
constexpr unsigned long FILE_CURRENT = 1;
constexpr unsigned long FILE_END = 2;

// The failure results of the three functions whose success is a 32-bit number.
constexpr std::uint32_t INVALID_FILE_ATTRIBUTES = 0xFFFFFFFFU;
constexpr std::uint32_t INVALID_FILE_SIZE = 0xFFFFFFFFU;
constexpr std::uint32_t INVALID_SET_FILE_POINTER = 0xFFFFFFFFU;

// Flags of pathglob.
constexpr int PATHGLOB_ERR = 0x04;      ///< end with PATHGLOB_ABORTED at the first directory that cannot be read
constexpr int PATHGLOB_MARK = 0x08;     ///< append "/" to matches that are directories
constexpr int PATHGLOB_NOCHECK = 0x10;  ///< without a match, return the pattern itself
constexpr int PATHGLOB_NOSORT = 0x20;   ///< leave the matches in the order in which they were found

// Failure results of pathglob.
constexpr int PATHGLOB_NOSPACE = -1;  ///< out of memory
constexpr int PATHGLOB_ABORTED = -2;  ///< stopped by PATHGLOB_ERR or by the error callback
constexpr int PATHGLOB_NOMATCH = -3;  ///< nothing matches

/// Windows' description of access rights. No function supports one: the only accepted argument is null.
struct _SECURITY_ATTRIBUTES {
  std::uint32_t nLength;
  void* lpSecurityDescriptor;
  std::int32_t bInheritHandle;
};

/// Windows' description of an asynchronous transfer. No function supports one: the only accepted argument is null.
struct _OVERLAPPED {
  std::uintptr_t Internal;
  std::uintptr_t InternalHigh;
  std::uint32_t Offset;
  std::uint32_t OffsetHigh;
  typedHandle* hEvent;
};

/// What GetVersionEx fills.
struct _OSVERSIONINFO {
  std::uint32_t dwOSVersionInfoSize;
  std::uint32_t dwMajorVersion;
  std::uint32_t dwMinorVersion;
  std::uint32_t dwBuildNumber;
  std::uint32_t dwPlatformId;  ///< the only field that is set
  char szCSDVersion[128];
};

/// A 64-bit unsigned number, whole or in halves.
union ULARGE_INTEGER {
  __extension__ struct {
    std::uint32_t LowPart;
    std::uint32_t HighPart;
  };
  std::uint64_t QuadPart;
};

/// What GetFileAttributesEx fills.
struct WIN32_FILE_ATTRIBUTE_DATA {
  std::uint32_t dwFileAttributes;  ///< FILE_ATTRIBUTE_...
  _FILETIME ftCreationTime;        ///< always 0
  _FILETIME ftLastAccessTime;
  _FILETIME ftLastWriteTime;
  std::uint32_t nFileSizeHigh;  ///< always 0
  std::uint32_t nFileSizeLow;   ///< the low 32 bits of the size in bytes
};

/// What FindFirstFile and FindNextFile fill.
struct _WIN32_FIND_DATA {
  std::uint32_t dwFileAttributes;  ///< FILE_ATTRIBUTE_...
  _FILETIME ftCreationTime;        ///< always 0
  _FILETIME ftLastAccessTime;
  _FILETIME ftLastWriteTime;
  std::uint32_t nFileSizeHigh;  ///< always 0
  std::uint32_t nFileSizeLow;   ///< the low 32 bits of the size in bytes
  std::uint32_t dwReserved0;    ///< not written
  std::uint32_t dwReserved1;    ///< not written
  char cFileName[4096];         ///< the name without its directory
  char cAlternateFileName[14];  ///< always "xxxxxxxx.xxx"
};

/// Which record GetFileAttributesEx is to fill.
enum _GET_FILEEX_INFO_LEVELS : std::int32_t {
  GetFileExInfoStandard = 0  ///< WIN32_FILE_ATTRIBUTE_DATA, the only level there is
};

/// The matches of a pattern. pathglob fills it, pathglobfree releases it; in between it is the caller's to read.
struct pathglob_t {
  std::size_t matchCount;  ///< number of paths
  char** paths;            ///< matchCount NUL-terminated paths and a null pointer; null without a match
};

extern "C" {

// ---- Handles -------------------------------------------------------------------------------------------------------

/// Closes an event, thread or file handle as CloseEventHandle, CloseThreadHandle and CloseFileHandle do.
/// @return their result; 0 for null and for any other kind (a search is closed by FindClose).
VEXA_API int CloseHandle(typedHandle* h);

/// Reads the identifier of an open thread handle.
/// @return true when `id` was stored; false, leaving it, for null, another kind and a closed handle.
VEXA_API bool threadId(typedHandle* h, unsigned long& id);

/// Reads the descriptor of an event that becomes readable when the event is signalled. It stays the event's: the caller
/// may poll it, and must neither read from it nor close it.
/// @return true when `fd` was stored; false, leaving it, for null and another kind.
VEXA_API bool eventFd(typedHandle* h, int& fd);

// ---- Events --------------------------------------------------------------------------------------------------------

/// Makes a manual-reset event, non-signalled. The caller owns it and closes it with CloseHandle.
/// @param attrs null.  @param manualReset 1.  @param initialState ignored.  @param name null.
/// @return the event, or null when an argument is another one or the system has no descriptors or memory left.
VEXA_API typedHandle* CreateEvent(_SECURITY_ATTRIBUTES* attrs, int manualReset, int initialState, const char* name);

/// Signals an event until ResetEvent; all waits on it end. Never blocks, however often an event is set.
/// @return 1 when the event is signalled; 0 for null, another kind and a broken event.
VEXA_API int SetEvent(typedHandle* h);

/// Ends an event's signal, however often it was set.
/// @return 1 when the event was drained; 0 for null, another kind and a broken event.
VEXA_API int ResetEvent(typedHandle* h);

/// Closes an event. No thread may be waiting on it.
/// @return 1 on success; 0 for null, another kind, and when the system reports an error in closing.
VEXA_API int CloseEventHandle(typedHandle* h);

/// Waits until one of `count` events is signalled. The signal stays. A signal handler that runs in the waiting thread
/// ends the wait early, as WAIT_TIMEOUT. Null entries count as positions and are otherwise skipped; without any event
/// the call is a sleep.
/// @param handles `count` handles, all of them null or events.  @param waitAll 0.
/// @param timeoutMs milliseconds; 0 only looks, from 0x80000000 on (INFINITE) there is no limit.
/// @return the lowest index of a signalled event; WAIT_TIMEOUT when there is none; WAIT_FAILED, without waiting, when
/// `waitAll` is not 0, an entry is a handle of another kind, or memory is short.
VEXA_API unsigned long WaitForMultipleObjects(unsigned long count, typedHandle* const* handles, int waitAll,
                                              unsigned long timeoutMs);

/// WaitForMultipleObjects of one handle. @return 0 when it is signalled, else WAIT_TIMEOUT or WAIT_FAILED as there.
VEXA_API unsigned long WaitForSingleObject(typedHandle* h, unsigned long timeoutMs);

// ---- Threads -------------------------------------------------------------------------------------------------------

/// Starts a thread that runs `start(arg)`; the routine's result becomes its exit code. The caller owns the handle and
/// closes it with CloseHandle, before or after the thread ends.
/// @param security null.  @param stackSize bytes; 0, or less than the platform's minimum, means 524288.
/// @param initFlag ignored: the thread runs at once.  @param threadIdOut receives the low 32 bits of the thread's
/// identifier; may be null.
/// @return the handle, or null when `security` is not null, `start` is null or the thread could not be made.
VEXA_API typedHandle* _beginthreadex(void* security, unsigned int stackSize, unsigned int (*start)(void*), void* arg,
                                     unsigned int initFlag, unsigned int* threadIdOut);

/// Ends the calling thread with `code` as its exit code, as if its start routine had returned it. Does not return.
[[noreturn]] VEXA_API void _endthreadex(unsigned int code);

/// Reads a thread's exit code: STILL_ACTIVE until its start routine has returned or called _endthreadex.
/// @return 1 when `*code` was stored; 0, leaving it, for null, another kind, a closed handle and a null `code`.
VEXA_API int GetExitCodeThread(typedHandle* h, unsigned long* code);

/// Closes a thread handle. A thread that has ended is joined; a running one goes on, and cleans up after itself.
/// @return 1; 0 for null, another kind and a handle that is closed already.
VEXA_API int CloseThreadHandle(typedHandle* h);

/// Records `code` as the calling thread's exit code and, when its handle is closed, frees that handle. The routine of
/// every thread ends in this call; a host has no need of it. A thread that _beginthreadex did not start is left alone.
VEXA_API void cleanup_thread_internal(unsigned int code);

/// The routine given to the system for every thread. Takes over and frees `startBlock`, as made by _beginthreadex.
/// @return null, at once when `startBlock` is null.
VEXA_API void* thread_func_internal(void* startBlock);

/// Makes `m` a recursive mutex. Enter, leave and delete it with pthread_mutex_lock, _unlock and _destroy. On failure,
/// which includes a null `m`, prints "pthread_mutex_init" and the reason to standard error.
VEXA_API void InitializeCriticalSection(pthread_mutex_t* m);

// ---- Small helpers -------------------------------------------------------------------------------------------------

/// @return the smaller of two numbers.
VEXA_API int min(int a, int b);
/// @return the larger of two numbers.
VEXA_API int max(int a, int b);

/// Sets `dwPlatformId` to VER_PLATFORM_WIN32_NT and nothing else. @return 1; 0 for null.
VEXA_API int GetVersionEx(_OSVERSIONINFO* info);

/// Tells whether `pos` lies inside a character of the EUC-JP text that begins at `start`. Reads only from `start` up to
/// the byte before `pos`.
/// @return -1 when `pos` is a second or third byte, or lies before `start`; 0 when a character begins there.
VEXA_API int _ismbstrail(const unsigned char* start, const unsigned char* pos);

/// Loads a shared library, binding its functions when they are first called.
/// @param path as for dlopen; null means the program itself.
/// @return the library, to be given back with FreeLibrary; null on failure.
VEXA_API void* LoadLibrary(const char* path);

/// @return the address of `name` in `module`, null when there is none. A null `module` means the whole program.
VEXA_API void* GetProcAddress(void* module, const char* name);

/// Gives back a library. @return 0 on success, as dlclose and unlike Windows; another value on failure, for null -1.
VEXA_API int FreeLibrary(void* module);

/// Compares two texts without regard to case. @return below, equal to or above 0.
VEXA_API int stricmp(const char* a, const char* b);
/// Compares at most `count` bytes of two texts without regard to case. @return below, equal to or above 0.
VEXA_API int strnicmp(const char* a, const char* b, std::size_t count);

/// @return not 0 when `c` is a letter or a digit in the current locale, as isalnum has it.
VEXA_API int IsCharAlphaNumeric(char c);

/// Writes `text` and, unless it ends in one, a line feed to standard error. A null `text` writes nothing.
VEXA_API void OutputDebugString(const char* text);
/// The same as OutputDebugString.
VEXA_API void OutputDebugStringA(const char* text);

/// @return 0, "unknown drive type", for every argument.
VEXA_API unsigned int GetDriveType(const char* root);

// ---- Directories and paths -----------------------------------------------------------------------------------------
// From here on, each failure writes one line with its reason to standard error, except where it is "silent".

/// Copies the path of the working directory to `buf`, `len` bytes large.
/// @return the path's length; when path and terminator do not fit, the room they need, with `buf` untouched; 0 on
/// failure.
VEXA_API unsigned long GetCurrentDirectory(unsigned long len, char* buf);

/// Joins the pieces of a path: drive letter and ":", directory and "/", name, "." and extension. Null and empty pieces
/// add nothing; the "/" and "." are added only where they are missing. Silent.
/// @param path room for 4096 bytes. A piece that does not fit ends the call with what was written so far.
VEXA_API void _makepath(char* path, const char* drive, const char* dir, const char* fname, const char* ext);

/// Splits a path into drive ("c:"), directory (up to its last "/"), name, and extension (from its last "."). A null
/// output is skipped. Silent.
/// The pieces are copied whatever their length: each output needs room for the whole of `path`.
VEXA_API void _splitpath(const char* path, char* drive, char* dir, char* fname, char* ext);

/// Reads the space of the file system that holds `path` ("." when null), in bytes. Null outputs are skipped.
/// @return 1; 0 on failure, with errno telling why.
VEXA_API int GetDiskFreeSpaceEx(const char* path, ULARGE_INTEGER* freeToCaller, ULARGE_INTEGER* total,
                                ULARGE_INTEGER* totalFree);

/// @return the FILE_ATTRIBUTE_... of `path`, INVALID_FILE_ATTRIBUTES on failure; a path that does not exist is silent.
VEXA_API std::uint32_t GetFileAttributes(const char* path);

/// Fills a WIN32_FILE_ATTRIBUTE_DATA. @param level GetFileExInfoStandard. @return 1; 0 on failure.
VEXA_API int GetFileAttributesEx(const char* path, _GET_FILEEX_INFO_LEVELS level, void* data);

/// Removes an empty directory. @return 1; 0 on failure.
VEXA_API int RemoveDirectory(const char* path);

/// Makes a directory of mode 0755. @param sa null. @return 1; 0 on failure.
VEXA_API int CreateDirectory(const char* path, _SECURITY_ATTRIBUTES* sa);

/// Renames a file or directory, replacing a file at `to`. @return 1; 0 on failure.
VEXA_API int MoveFile(const char* from, const char* to);

/// Removes a file. @return 1; 0 on failure.
VEXA_API int DeleteFile(const char* path);

// ---- Directory search ----------------------------------------------------------------------------------------------

/// Finds the paths that match `pattern` (see pathglob) and describes the first in `data`.
/// @return the search, which the caller owns and closes with FindClose; null on failure, silently when nothing matches.
/// A first match that cannot be read any more still gives the search, with `data` untouched.
VEXA_API typedHandle* FindFirstFile(const char* pattern, _WIN32_FIND_DATA* data);

/// Describes the next match in `data`. @return 1; 0 past the last one (silent) and on failure.
VEXA_API int FindNextFile(typedHandle* h, _WIN32_FIND_DATA* data);

/// Ends a search. @return 1; 0 for null and another kind.
VEXA_API int FindClose(typedHandle* h);

/// Finds the paths that match `pattern`, in strcoll order. "*", "?", "[...]", "[!...]" and ranges match within one
/// component; a leading "~" or "~name" stands for a home directory; every other character, "\" too, is itself. Silent.
/// @param flags PATHGLOB_..., or 0.
/// @param errfunc called with path and errno for a directory that cannot be read; not 0 from it ends the search. May be
/// null.
/// @param result filled in every case; to be released with pathglobfree.
/// @return 0, or PATHGLOB_NOSPACE, PATHGLOB_ABORTED or PATHGLOB_NOMATCH.
VEXA_API int pathglob(const char* pattern, int flags, int (*errfunc)(const char* path, int code), pathglob_t* result);

/// Releases what pathglob has put into `result` and empties it. Null and empty results are accepted.
VEXA_API void pathglobfree(pathglob_t* result);

// ---- Files ---------------------------------------------------------------------------------------------------------
// Each function that takes a file handle refuses null and other kinds, with a line on standard error, before it sets
// anything. Transfers are not buffered.

/// Opens a file; a new one gets mode 0644. The caller owns the handle and closes it with CloseHandle.
/// @param access GENERIC_READ, GENERIC_WRITE or both.  @param creation CREATE_ALWAYS ... TRUNCATE_EXISTING.
/// `share`, `sa`, `flags` and `templ` are ignored.
/// @return the file; null on failure, silently for another access or creation value.
VEXA_API typedHandle* CreateFile(const char* path, unsigned long access, unsigned long share, _SECURITY_ATTRIBUTES* sa,
                                 unsigned long creation, unsigned long flags, typedHandle* templ);

/// Closes a file. @return 1; 0 for a handle that is refused, and when the system reports an error in closing: the
/// handle is closed in that case too.
VEXA_API int CloseFileHandle(typedHandle* h);

/// @param high receives 0; may be null. @return the low 32 bits of the size in bytes, INVALID_FILE_SIZE on failure.
VEXA_API std::uint32_t GetFileSize(typedHandle* h, unsigned long* high);

/// Moves a file's position to `offset` bytes from where `method` (FILE_BEGIN, FILE_CURRENT, FILE_END) says.
/// @param high null: 64-bit positions are not supported.
/// @return the low 32 bits of the new position, INVALID_SET_FILE_POINTER on failure.
VEXA_API std::uint32_t SetFilePointer(typedHandle* h, long offset, long* high, unsigned long method);

/// Waits until everything written is on the disk. @return 1; 0 on failure.
VEXA_API int FlushFileBuffers(typedHandle* h);

/// Writes `len` bytes with one call of the system.
/// @param written receives the number of bytes written; 0xFFFFFFFF when writing failed, which is silent.  @param ov
/// null.
/// @return 1, also when writing failed: check `*written`; 0 for a handle or an `ov` that is refused.
VEXA_API int WriteFile(typedHandle* h, const void* buf, unsigned long len, unsigned long* written, _OVERLAPPED* ov);

/// Reads at most `len` bytes with one call of the system; 0 bytes mean the end of the file.
/// @param read receives the number of bytes read; 0xFFFFFFFF when reading failed, which is silent.  @param ov null.
/// @return 1, also when reading failed: check `*read`; 0 for a handle or an `ov` that is refused.
VEXA_API int ReadFile(typedHandle* h, void* buf, unsigned long len, unsigned long* read, _OVERLAPPED* ov);

}  // extern "C"
