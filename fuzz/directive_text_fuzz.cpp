// SPDX-License-Identifier: Apache-2.0
// Fields of formats as printf writes them. The input is eight bytes of a number, flags up to a NUL, and a text.
#include <array>
#include <cstdio>
#include <string>

#include "fuzz/check.h"
#include "runtime/base/bytes.h"
#include "runtime/base/directive.h"
#include "runtime/base/text.h"

namespace {

using vexa_fuzz::check;

constexpr std::size_t kMostFlags = 12;

template <typename Value>
std::string printed(const std::string& format, Value value) {
  std::array<char, vexa::kDirectiveTextLimit + 1> room{};
#pragma clang diagnostic push
#pragma clang diagnostic ignored "-Wformat-nonliteral"
  std::snprintf(room.data(), room.size(), format.c_str(), value);
#pragma clang diagnostic pop
  return room.data();
}

void write_fields(std::string_view flags, long long number, const std::string& text) {
  const auto parsed = vexa::parse_field_flags(flags);
  if (!parsed) return;
  // "#" changes neither; for a text printf leaves "0" open.
  const std::string format = "%" + std::string(flags);
  if (parsed->width > 10000 || parsed->precision.value_or(0) > 10000) {
    static_cast<void>(vexa::number_field(number, *parsed));
    static_cast<void>(vexa::text_field(text, *parsed));
    return;
  }
  if (flags.find('#') == std::string_view::npos)
    check(vexa::number_field(number, *parsed) == printed(format + "lld", number));
  if (flags.find_first_of("#0") == std::string_view::npos) {
    check(vexa::text_field(text, *parsed) == printed(format + "s", text.c_str()));
  }
}

void expand(const std::string& format) {
  const std::string text = vexa::expand_directives(
      format.c_str(), [](char letter, const vexa::FieldFlags& flags) -> std::optional<std::string> {
        if (letter == 'd') return vexa::number_field(-7, flags);
        if (letter == 's') return vexa::text_field("text", flags);
        return std::nullopt;
      });
  check(text.size() <= vexa::kDirectiveTextLimit + vexa::kDirectiveTextFull);
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  vexa::ByteReader in({data, size});
  const auto number = static_cast<long long>(std::uint64_t{in.u32()} << 32 | in.u32());
  if (!in.ok()) return 0;
  const std::string_view rest = vexa_fuzz::text_of(in.rest().data(), in.rest().size());
  const std::string_view flags = vexa::before_nul(rest);
  const std::string text(vexa::before_nul(rest.substr(std::min(rest.size(), flags.size() + 1))));
  if (flags.size() <= kMostFlags) write_fields(flags, number, text);
  expand(text);
  return 0;
}
