// SPDX-License-Identifier: Apache-2.0
#include <algorithm>
#include <array>
#include <optional>
#include <string_view>

#include "runtime/base/scanned_number.h"
#include "vexa/real_time.h"

namespace vexa {
namespace {

/// How far ahead a number is looked for.
constexpr std::size_t kReach = 256;
constexpr std::size_t kAnyWidth = kReach;

/// One letter: how it is read, its range, and the member it sets to `base` + number * `scale`.
struct ScanField {
  char letter;
  std::size_t width;
  std::uint32_t first;
  std::uint32_t last;
  std::uint16_t _SYSTEMTIME::*member;
  std::uint16_t scale = 1;
  std::uint16_t base = 0;
};

constexpr std::array kScanFields = {
    ScanField{'D', 2, 1, 31, &_SYSTEMTIME::wDay},
    ScanField{'d', kAnyWidth, 1, 31, &_SYSTEMTIME::wDay},
    ScanField{'O', 2, 1, 12, &_SYSTEMTIME::wMonth},
    ScanField{'o', kAnyWidth, 1, 12, &_SYSTEMTIME::wMonth},
    ScanField{'H', 2, 0, 23, &_SYSTEMTIME::wHour},
    ScanField{'h', kAnyWidth, 0, 23, &_SYSTEMTIME::wHour},
    ScanField{'M', 2, 0, 59, &_SYSTEMTIME::wMinute},
    ScanField{'m', kAnyWidth, 0, 59, &_SYSTEMTIME::wMinute},
    ScanField{'S', 2, 0, 59, &_SYSTEMTIME::wSecond},
    ScanField{'s', kAnyWidth, 0, 59, &_SYSTEMTIME::wSecond},
    ScanField{'L', kAnyWidth, 0, 999, &_SYSTEMTIME::wMilliseconds},
    ScanField{'l', 2, 0, 999, &_SYSTEMTIME::wMilliseconds, 10},
    ScanField{'Y', 4, 0, 9999, &_SYSTEMTIME::wYear},
    ScanField{'y', 2, 0, 99, &_SYSTEMTIME::wYear, 1, 2000},
};

/// The text under `Scan`: literals move on in it, numbers do not.
class ScannedText {
 public:
  explicit ScannedText(std::string_view text) : rest_(text) {}

  void skip_past(char literal) {
    const std::size_t at = rest_.find(literal);
    // Kept: a character that is not there leaves reading at the text's end, so no later number is read.
    rest_.remove_prefix(at == std::string_view::npos ? rest_.size() : at + 1);
  }

  // Kept: reading does not move on; directives without a character between them read the same number.
  std::optional<std::uint32_t> number(std::size_t width) const {
    // Safe: many directives over one long run of spaces or zeros would each walk all of it.
    const auto number = scan_number(rest_.substr(0, kReach), width);
    return number ? std::make_optional(number->value) : std::nullopt;
  }

 private:
  std::string_view rest_;
};

enum class FieldResult { kRead, kMissing, kOutOfRange };

FieldResult read_field(const ScanField& field, const ScannedText& text, _SYSTEMTIME& fields) {
  const auto number = text.number(field.width);
  if (!number) return FieldResult::kMissing;
  if (*number < field.first || *number > field.last) return FieldResult::kOutOfRange;
  fields.*field.member = static_cast<std::uint16_t>(field.base + *number * field.scale);
  return FieldResult::kRead;
}

/// Takes flags and letter of a directive from the front of `format`; null for a letter that reads no number.
const ScanField* take_field(std::string_view& format) {
  format.remove_prefix(std::min(format.find_first_not_of("#-.0123456789"), format.size()));
  if (format.empty()) return nullptr;
  const char letter = format.front();
  format.remove_prefix(1);
  const auto* field = std::find_if(kScanFields.begin(), kScanFields.end(),
                                   [letter](const ScanField& known) { return known.letter == letter; });
  return field == kScanFields.end() ? nullptr : field;
}

/// Fills `fields` and returns how many numbers were read, or -1 when one is out of its range.
int scan_fields(std::string_view all, std::string_view format, _SYSTEMTIME& fields) {
  ScannedText text(all);
  int count = 0;
  while (!format.empty()) {
    const char next = format.front();
    format.remove_prefix(1);
    if (next != '%') {
      text.skip_past(next);
      continue;
    }
    const ScanField* field = take_field(format);
    if (field == nullptr) continue;
    const FieldResult result = read_field(*field, text, fields);
    if (result == FieldResult::kOutOfRange) return -1;
    if (result == FieldResult::kMissing) break;
    ++count;
  }
  return count;
}

}  // namespace
}  // namespace vexa

int CRealTime::Scan(const char* text, const char* format, bool utc) {
  if (text == nullptr || format == nullptr) return 0;
  _SYSTEMTIME fields{};
  const int count = vexa::scan_fields(text, format, fields);
  if (count <= 0) return count;
  *this = CRealTime(fields.wYear, fields.wMonth, fields.wDay, fields.wHour, fields.wMinute, fields.wSecond,
                    fields.wMilliseconds, 0, utc);
  return count;
}
