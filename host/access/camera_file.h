// SPDX-License-Identifier: Apache-2.0
// A file of cameras, which serves every command: {"cameras": [{"name": "gate", "address": "192.168.0.100"}, ...]}
#ifndef HOST_ACCESS_CAMERA_FILE_H_
#define HOST_ACCESS_CAMERA_FILE_H_

#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "host/access/camera_address.h"
#include "host/access/credentials.h"
#include "host/base/problem.h"

namespace vexa::host {

// One camera of the file. A password is never in the file itself: it is in a file or an environment variable that the
// camera names.
struct FileCamera {
  std::string name;                                   // "name", unique in the file, up to 64 printable characters
  CameraAddress address;                              // "address", HOST or HOST:PORT
  std::optional<std::string> profile = {};            // "profile", a name or a file; else that of the reported model
  std::optional<int> tile_stream = {};                // "tileStream", 1 to 16: of JPEG, which the page's tiles show
  std::optional<std::string> credentials_file = {};   // "credentials", from the folder of the file of cameras
  std::optional<std::string> user_variable = {};      // "userVariable"; with it "passwordVariable"
  std::optional<std::string> password_variable = {};  // "passwordVariable"
  int line = 0;                                       // where the camera begins in the file
};

// Read whole or refused whole: what cannot be used is reported with its line and key, and without its value, which may
// be a secret. Immutable.
class CameraFile {
 public:
  [[nodiscard]] static Result<CameraFile> read(const std::string& path);
  // The same of a text; `path` names it in refusals, and relative file names are those of its folder.
  [[nodiscard]] static Result<CameraFile> parse(std::string_view text, const std::string& path);

  [[nodiscard]] const std::string& path() const { return path_; }
  // At least one, in the file's order.
  [[nodiscard]] const std::vector<FileCamera>& cameras() const { return cameras_; }
  [[nodiscard]] Result<FileCamera> find(std::string_view name) const;

  // The camera's own credentials, read now; those of `otherwise` where the camera names none. `environment` as main()
  // received it.
  [[nodiscard]] Result<Credentials> credentials_of(const FileCamera& camera, const CredentialSources& otherwise,
                                                   const char* const* environment) const;

 private:
  CameraFile(std::string path, std::vector<FileCamera> cameras)
      : path_(std::move(path)), cameras_(std::move(cameras)) {}

  std::string path_;
  std::vector<FileCamera> cameras_;
};

}  // namespace vexa::host

#endif  // HOST_ACCESS_CAMERA_FILE_H_
