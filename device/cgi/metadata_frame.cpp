#include "device/cgi/metadata_frame.h"

#include "runtime/base/text.h"

namespace vexa {
namespace {

void take_window(std::string_view body, std::string_view key, std::int32_t& value) {
  auto text = text_after(body, key);
  if (!text) return;
  if (const auto number = take_int(*text)) value = *number;
}

}  // namespace

void take_metadata(std::string_view body, SLibDRawMDFrameInfo& frame) {
  const std::string_view text = before_nul(body);
  take_window(text, "Window1=", frame.window1);
  take_window(text, "Window2=", frame.window2);
  take_window(text, "Window3=", frame.window3);
  take_window(text, "Window4=", frame.window4);
}

}  // namespace vexa
