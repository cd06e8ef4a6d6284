// The JSON link reader: any bytes, narrow and wide.
#include <cstddef>
#include <cstdint>
#include <string>

#include "addon/LinkText.h"

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  const std::string_view text(reinterpret_cast<const char*>(data), size);
  (void)addon::ReadLinkText(text);
  std::wstring wide(text.begin(), text.end());
  (void)addon::ReadLinkText(wide);
  (void)addon::JsonEscape(text);
  return 0;
}
