// SPDX-License-Identifier: Apache-2.0
// What vexactl makes of texts from outside: recordings in tables, JSON and file names, moments, and secrets that are
// hidden wherever they stand.
#include <algorithm>
#include <string>

#include "device/cgi/storage_text.h"
#include "fuzz/check.h"
#include "host/access/redactor.h"
#include "host/base/number_text.h"
#include "host/words/stored_recordings.h"
#include "host/words/utc_time.h"

namespace {

using vexa_fuzz::check;
namespace host = vexa::host;

void show_recordings(const std::string& text) {
  const auto records = vexa::read_recordings(text);
  static_cast<void>(host::json_of(records));
  const std::string table = host::table_of(records);
  check(static_cast<std::size_t>(std::count(table.begin(), table.end(), '\n')) >= records.size());
}

void name_file(const std::string& text) {
  const std::string name = host::file_name_of(text, ".h264");
  check(name.size() > 5 && name[0] != '.' && name.find('/') == std::string::npos &&
        name.find('\0') == std::string::npos);
}

void read_moment(const std::string& text) {
  const auto moment = host::utc_moment(text);
  if (!moment) return;
  const std::string written = host::utc_text(*moment);
  check(written == text || written == text + "Z");
}

void hide_secrets(const std::string& text) {
  const std::size_t cut = text.empty() ? 0 : static_cast<unsigned char>(text[0]) % text.size();
  const std::string secret = text.substr(0, cut);
  const host::Redactor redactor({"admin", secret});
  const std::string shown = redactor(text);
  if (secret.size() > 3 && secret.find('*') == std::string::npos) check(shown.find(secret) == std::string::npos);
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  const std::string text(vexa_fuzz::text_of(data, size));
  show_recordings(text);
  name_file(text);
  read_moment(text);
  hide_secrets(text);
  if (const auto number = host::number_text(text)) check(std::to_string(*number).size() <= text.size());
  return 0;
}
