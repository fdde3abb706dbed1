// SPDX-License-Identifier: Apache-2.0
#include <fcntl.h>
#include <gtest/gtest.h>
#include <sys/resource.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
#include <csignal>
#include <memory>
#include <string>

#include "runtime/handle.h"
#include "tests/support/failing_new.h"
#include "tests/support/in_child.h"
#include "tests/support/process_state.h"
#include "tests/support/temporary_folder.h"
#include "vexa/runtime.h"

namespace vexa_test {
namespace {

constexpr char kInvalidHandle[] = "checkFileHandle : called with invalid handle\n";
constexpr std::uint32_t kNoSize = 0xFFFFFFFF;

typedHandle* open_file(const std::string& path, unsigned long access, unsigned long creation) {
  return CreateFile(path.c_str(), access, 0, nullptr, creation, 0, nullptr);
}

int descriptor_of(typedHandle* h) { return vexa::record_of<vexa::FileHandle>(h)->fd; }

/// A file handle whose descriptor is closed, and so high that nothing else gets its number.
class BrokenFile {
 public:
  BrokenFile() : record_(vexa::new_record<vexa::FileHandle>()) {
    const int low = open("/dev/null", O_RDWR | O_CLOEXEC);
    record_->fd = fcntl(low, F_DUPFD_CLOEXEC, 700);
    close(record_->fd);
    close(low);
  }

  typedHandle* handle() const { return record_.get(); }

 private:
  std::unique_ptr<vexa::FileHandle> record_;
};

TEST(CreateFile, TakesThreeAccessValues) {
  EXPECT_EQ(GENERIC_READ, 1UL);
  EXPECT_EQ(GENERIC_WRITE, 2UL);
  const TemporaryFolder folder;
  const std::string path = folder.make_file("file");
  const int modes[] = {O_RDONLY, O_WRONLY, O_RDWR};
  for (unsigned long access = 1; access <= 3; ++access) {
    typedHandle* file = open_file(path, access, OPEN_EXISTING);
    ASSERT_NE(file, nullptr);
    EXPECT_EQ(file->kind, HANDLE_TYPE_FILE);
    EXPECT_EQ(fcntl(descriptor_of(file), F_GETFL) & O_ACCMODE, modes[access - 1]);
    EXPECT_EQ(CloseHandle(file), 1);
  }
}

TEST(CreateFile, RefusesOtherAccessSilently) {
  const TemporaryFolder folder;
  for (const unsigned long access : {0UL, 4UL, 5UL, 0x80000000UL, 0x40000000UL, 0xC0000000UL, 0xFFFFFFFFUL}) {
    EXPECT_EQ(stderr_of([&] { EXPECT_EQ(open_file(folder / "new", access, CREATE_ALWAYS), nullptr); }), "");
  }
  EXPECT_EQ(access((folder / "new").c_str(), F_OK), -1);
}

TEST(CreateFile, RefusesOtherCreationSilently) {
  const TemporaryFolder folder;
  for (const unsigned long creation : {0UL, 3UL, 5UL, 6UL, 7UL, 9UL, 17UL, 31UL, 32UL, 0xFFFFFFFFUL}) {
    EXPECT_EQ(stderr_of([&] { EXPECT_EQ(open_file(folder / "new", 3, creation), nullptr); }), "");
  }
  EXPECT_EQ(access((folder / "new").c_str(), F_OK), -1);
}

TEST(CreateFile, CreationDecidesOnMissingAndPresentFiles) {
  EXPECT_EQ(CREATE_ALWAYS, 1UL);
  EXPECT_EQ(CREATE_NEW, 2UL);
  EXPECT_EQ(OPEN_ALWAYS, 4UL);
  EXPECT_EQ(OPEN_EXISTING, 8UL);
  EXPECT_EQ(TRUNCATE_EXISTING, 16UL);
  const struct {
    unsigned long creation;
    const char* missing;  // the error, empty when the file is made
    const char* present;
    const char* contents;  // of a file that held "old"
  } cases[] = {{1, "", "", ""},
               {2, "", "File exists", "old"},
               {4, "", "", "old"},
               {8, "No such file or directory", "", "old"},
               {16, "No such file or directory", "", ""}};
  for (const auto& c : cases) {
    const TemporaryFolder folder;
    const std::string missing = folder / "missing";
    const std::string present = folder.make_file("present", "old");
    const auto expect_opening = [&](const std::string& path, const std::string& error) {
      typedHandle* file = nullptr;
      EXPECT_EQ(stderr_of([&] { file = open_file(path, 2, c.creation); }),
                error.empty() ? "" : "CreateFile fopen " + path + ": " + error + "\n");
      EXPECT_EQ(file == nullptr, !error.empty());
      EXPECT_EQ(CloseHandle(file), error.empty() ? 1 : 0);
    };
    expect_opening(missing, c.missing);
    expect_opening(present, c.present);
    EXPECT_EQ(contents_of(present), c.contents);
  }
}

TEST(CreateFile, MakesFilesOfMode0644) {
  const TemporaryFolder folder;
  const std::string report = in_child([&] {
    umask(0);
    typedHandle* file = open_file(folder / "new", 2, CREATE_NEW);
    struct stat status {};
    fstat(descriptor_of(file), &status);
    return std::to_string(status.st_mode & 07777);
  });
  EXPECT_EQ(report, std::to_string(0644));
}

TEST(CreateFile, OpensCloseOnExec) {
  typedHandle* file = open_file("/dev/null", 3, OPEN_EXISTING);
  EXPECT_EQ(fcntl(descriptor_of(file), F_GETFD) & FD_CLOEXEC, FD_CLOEXEC);
  EXPECT_EQ(CloseHandle(file), 1);
}

TEST(CreateFile, IgnoresWhatItDoesNotKnow) {
  _SECURITY_ATTRIBUTES rights = {};
  typedHandle* event = CreateEvent(nullptr, 1, 0, nullptr);
  typedHandle* file = CreateFile("/dev/null", 1, 0xFFFFFFFF, &rights, OPEN_EXISTING, 0xFFFFFFFF, event);
  EXPECT_NE(file, nullptr);
  EXPECT_EQ(CloseHandle(file), 1);
  EXPECT_EQ(CloseHandle(event), 1);
}

TEST(CreateFile, ReportsWhyItFailsAndKeepsNoDescriptor) {
  const std::size_t before = open_descriptors();
  const std::string long_name(4096, 'n');
  const struct {
    std::string path, error;
  } cases[] = {{"/gone/%n%s", "No such file or directory"},
               {"/dev/null/x", "Not a directory"},
               {"/", "Is a directory"},
               {"", "No such file or directory"},
               {long_name, "File name too long"}};
  for (const auto& c : cases) {
    EXPECT_EQ(stderr_of([&] { EXPECT_EQ(open_file(c.path, 2, OPEN_ALWAYS), nullptr); }),
              "CreateFile fopen " + c.path + ": " + c.error + "\n");
  }
  EXPECT_EQ(stderr_of([] { EXPECT_EQ(CreateFile(nullptr, 1, 0, nullptr, OPEN_EXISTING, 0, nullptr), nullptr); }),
            "CreateFile fopen : No such file or directory\n");
  EXPECT_EQ(open_descriptors(), before);
}

TEST(CreateFile, ReportsThatAFileIsReadOnly) {
  const TemporaryFolder folder;
  ASSERT_EQ(chmod(folder.path().c_str(), 0755), 0);
  const std::string path = folder.make_file("file");
  ASSERT_EQ(chmod(path.c_str(), 0444), 0);
  EXPECT_EQ(in_child([&] {
              if (!become_unprivileged()) return std::string("still privileged");
              return stderr_of([&] { open_file(path, 2, OPEN_EXISTING); });
            }),
            "CreateFile fopen " + path + ": Permission denied\n");
}

TEST(CreateFile, ReportsThatMemoryIsShort) {
  typedHandle* file = nullptr;
  EXPECT_EQ(stderr_of([&] {
              errno = ENOMEM;
              const AllocationFailure failure(0);
              file = CreateFile("/dev/null", 1, 0, nullptr, OPEN_EXISTING, 0, nullptr);
            }),
            "CreateFile new: Cannot allocate memory\n");
  EXPECT_EQ(file, nullptr);
}

TEST(File, HandlesThatAreNoFilesAreRefusedBeforeAnythingIsSet) {
  typedHandle* event = CreateEvent(nullptr, 1, 0, nullptr);
  _WIN32_FIND_DATA data;
  typedHandle* search = FindFirstFile("/tmp", &data);
  _OVERLAPPED overlapped = {};
  for (typedHandle* h : {static_cast<typedHandle*>(nullptr), event, search}) {
    unsigned long count = 42;
    long high = 42;
    char byte = '#';
    EXPECT_EQ(stderr_of([&] { EXPECT_EQ(GetFileSize(h, &count), kNoSize); }), kInvalidHandle);
    EXPECT_EQ(stderr_of([&] { EXPECT_EQ(SetFilePointer(h, 0, &high, 0), kNoSize); }), kInvalidHandle);
    EXPECT_EQ(stderr_of([&] { EXPECT_EQ(FlushFileBuffers(h), 0); }), kInvalidHandle);
    EXPECT_EQ(stderr_of([&] { EXPECT_EQ(WriteFile(h, &byte, 1, &count, &overlapped), 0); }), kInvalidHandle);
    EXPECT_EQ(stderr_of([&] { EXPECT_EQ(ReadFile(h, &byte, 1, &count, &overlapped), 0); }), kInvalidHandle);
    EXPECT_EQ(stderr_of([&] { EXPECT_EQ(CloseFileHandle(h), 0); }), kInvalidHandle);
    EXPECT_EQ(count, 42UL);
    EXPECT_EQ(high, 42);
    EXPECT_EQ(byte, '#');
  }
  EXPECT_EQ(CloseHandle(event), 1);
  EXPECT_EQ(FindClose(search), 1);
}

TEST(GetFileSize, ReportsTheSizeAndAZeroHighHalf) {
  const TemporaryFolder folder;
  typedHandle* file = open_file(folder.make_file("file", "twelve bytes"), 1, OPEN_EXISTING);
  unsigned long high = 42;
  EXPECT_EQ(GetFileSize(file, &high), 12U);
  EXPECT_EQ(high, 0UL);
  EXPECT_EQ(GetFileSize(file, nullptr), 12U);
  EXPECT_EQ(CloseHandle(file), 1);
}

TEST(GetFileSize, CutsALargeSizeToItsLowHalf) {
  const TemporaryFolder folder;
  const std::string path = folder.make_file("large");
  ASSERT_EQ(truncate64(path.c_str(), (off64_t{5} << 32) + 7), 0);
  typedHandle* file = open_file(path, 1, OPEN_EXISTING);
  unsigned long high = 42;
  EXPECT_EQ(GetFileSize(file, &high), 7U);
  EXPECT_EQ(high, 0UL);
  EXPECT_EQ(CloseHandle(file), 1);
}

TEST(GetFileSize, ReportsItsFailure) {
  const BrokenFile broken;
  unsigned long high = 42;
  EXPECT_EQ(stderr_of([&] { EXPECT_EQ(GetFileSize(broken.handle(), &high), kNoSize); }),
            "GetFileSize fstat: Bad file descriptor\n");
  EXPECT_EQ(high, 42UL);
}

TEST(SetFilePointer, CountsFromTheGivenPlace) {
  const TemporaryFolder folder;
  typedHandle* file = open_file(folder.make_file("file", "0123456789"), 1, OPEN_EXISTING);
  EXPECT_EQ(SetFilePointer(file, 4, nullptr, FILE_BEGIN), 4U);
  EXPECT_EQ(SetFilePointer(file, 3, nullptr, FILE_CURRENT), 7U);
  EXPECT_EQ(SetFilePointer(file, -2, nullptr, FILE_CURRENT), 5U);
  EXPECT_EQ(SetFilePointer(file, -1, nullptr, FILE_END), 9U);
  char byte = '#';
  unsigned long read = 0;
  EXPECT_EQ(ReadFile(file, &byte, 1, &read, nullptr), 1);
  EXPECT_EQ(byte, '9');
  EXPECT_EQ(SetFilePointer(file, 5, nullptr, FILE_END), 15U);
  EXPECT_EQ(CloseHandle(file), 1);
}

TEST(SetFilePointer, RefusesAHighHalf) {
  typedHandle* file = open_file("/dev/null", 1, OPEN_EXISTING);
  long high = 0;
  EXPECT_EQ(stderr_of([&] { EXPECT_EQ(SetFilePointer(file, 0, &high, FILE_BEGIN), kNoSize); }),
            "SetFilePointer : no support for 64 bit positions\n");
  EXPECT_EQ(CloseHandle(file), 1);
}

TEST(SetFilePointer, ReportsItsFailure) {
  const TemporaryFolder folder;
  typedHandle* file = open_file(folder.make_file("file"), 1, OPEN_EXISTING);
  EXPECT_EQ(stderr_of([&] { EXPECT_EQ(SetFilePointer(file, -1, nullptr, FILE_BEGIN), kNoSize); }),
            "SetFilePointer fseek: Invalid argument\n");
  EXPECT_EQ(stderr_of([&] { EXPECT_EQ(SetFilePointer(file, 0, nullptr, 99), kNoSize); }),
            "SetFilePointer fseek: Invalid argument\n");
  EXPECT_EQ(CloseHandle(file), 1);
}

TEST(FlushFileBuffers, ReportsItsResult) {
  const TemporaryFolder folder;
  typedHandle* file = open_file(folder.make_file("file"), 2, OPEN_EXISTING);
  EXPECT_EQ(FlushFileBuffers(file), 1);
  EXPECT_EQ(CloseHandle(file), 1);
  const BrokenFile broken;
  EXPECT_EQ(stderr_of([&] { EXPECT_EQ(FlushFileBuffers(broken.handle()), 0); }),
            "FlushFileBuffers fflush: Bad file descriptor\n");
}

TEST(WriteFile, WritesAndCounts) {
  const TemporaryFolder folder;
  typedHandle* file = open_file(folder / "new", 2, CREATE_NEW);
  unsigned long written = 42;
  EXPECT_EQ(WriteFile(file, "%n%s\0x", 6, &written, nullptr), 1);
  EXPECT_EQ(written, 6UL);
  EXPECT_EQ(WriteFile(file, nullptr, 0, &written, nullptr), 1);
  EXPECT_EQ(written, 0UL);
  EXPECT_EQ(WriteFile(file, "!", 1, nullptr, nullptr), 1);
  EXPECT_EQ(CloseHandle(file), 1);
  EXPECT_EQ(contents_of(folder / "new"), std::string("%n%s\0x!", 7));
}

TEST(WriteFile, FailureIsASuccessOfMinusOneBytes) {
  const BrokenFile broken;
  typedHandle* read_only = open_file("/dev/null", 1, OPEN_EXISTING);
  typedHandle* full = open_file("/dev/full", 2, OPEN_EXISTING);
  ASSERT_NE(full, nullptr);
  for (typedHandle* file : {broken.handle(), read_only, full}) {
    unsigned long written = 42;
    EXPECT_EQ(stderr_of([&] { EXPECT_EQ(WriteFile(file, "x", 1, &written, nullptr), 1); }), "");
    EXPECT_EQ(written, 0xFFFFFFFFUL);
  }
  EXPECT_EQ(CloseHandle(read_only), 1);
  EXPECT_EQ(CloseHandle(full), 1);
}

TEST(WriteFile, CountsWhatAFullDiskTook) {
  const TemporaryFolder folder;
  EXPECT_EQ(in_child([&] {
              std::signal(SIGXFSZ, SIG_IGN);
              const rlimit limit = {5, 5};
              if (setrlimit(RLIMIT_FSIZE, &limit) != 0) return std::string("no limit");
              typedHandle* file = open_file(folder / "new", 2, CREATE_NEW);
              unsigned long first = 0, second = 0;
              const int results =
                  WriteFile(file, "12345678", 8, &first, nullptr) + WriteFile(file, "12345678", 8, &second, nullptr);
              return std::to_string(results) + " " + std::to_string(first) + " " + std::to_string(second);
            }),
            "2 5 4294967295");
}

TEST(WriteFile, RefusesAnOverlappedTransfer) {
  typedHandle* file = open_file("/dev/null", 2, OPEN_EXISTING);
  _OVERLAPPED overlapped = {};
  unsigned long written = 42;
  EXPECT_EQ(stderr_of([&] { EXPECT_EQ(WriteFile(file, "x", 1, &written, &overlapped), 0); }),
            "WriteFile : no support for overlapped write yet\n");
  EXPECT_EQ(written, 0UL);
  EXPECT_EQ(CloseHandle(file), 1);
}

TEST(ReadFile, ReadsAndCountsUpToTheEnd) {
  const TemporaryFolder folder;
  typedHandle* file = open_file(folder.make_file("file", "01234"), 1, OPEN_EXISTING);
  char buffer[8] = "#######";
  unsigned long read = 42;
  EXPECT_EQ(ReadFile(file, buffer, 3, &read, nullptr), 1);
  EXPECT_EQ(read, 3UL);
  EXPECT_STREQ(buffer, "012####");
  EXPECT_EQ(ReadFile(file, buffer, 7, &read, nullptr), 1);
  EXPECT_EQ(read, 2UL);
  EXPECT_STREQ(buffer, "342####");
  EXPECT_EQ(ReadFile(file, buffer, 7, &read, nullptr), 1);
  EXPECT_EQ(read, 0UL);
  EXPECT_EQ(ReadFile(file, buffer, 7, nullptr, nullptr), 1);
  EXPECT_EQ(CloseHandle(file), 1);
}

TEST(ReadFile, FailureIsASuccessOfMinusOneBytes) {
  const BrokenFile broken;
  typedHandle* write_only = open_file("/dev/null", 2, OPEN_EXISTING);
  for (typedHandle* file : {broken.handle(), write_only}) {
    char byte = '#';
    unsigned long read = 42;
    EXPECT_EQ(stderr_of([&] { EXPECT_EQ(ReadFile(file, &byte, 1, &read, nullptr), 1); }), "");
    EXPECT_EQ(read, 0xFFFFFFFFUL);
    EXPECT_EQ(byte, '#');
  }
  EXPECT_EQ(CloseHandle(write_only), 1);
}

TEST(ReadFile, RefusesAnOverlappedTransfer) {
  typedHandle* file = open_file("/dev/null", 1, OPEN_EXISTING);
  _OVERLAPPED overlapped = {};
  char byte = '#';
  unsigned long read = 42;
  EXPECT_EQ(stderr_of([&] { EXPECT_EQ(ReadFile(file, &byte, 1, &read, &overlapped), 0); }),
            "ReadFile : no support for overlapped read yet\n");
  EXPECT_EQ(read, 0UL);
  EXPECT_EQ(CloseHandle(file), 1);
}

}  // namespace
}  // namespace vexa_test
