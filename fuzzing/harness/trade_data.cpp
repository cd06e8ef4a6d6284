// "TRADEDATA" page texts into the trade tape.
#include <cstddef>
#include <cstdint>
#include <string>

#include "data/TradeTape.h"

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  std::wstring text;
  text.reserve(size);
  for (std::size_t i = 0; i < size; ++i) text.push_back(static_cast<wchar_t>(data[i]));
  int count = mvd::ParseTradeData(text, [](TradeRecord&& r) {
    if (r.number <= 0) __builtin_trap();
  });
  const std::int32_t first = mvd::FirstTradeNumber(text);
  const std::int32_t newest = mvd::NewestTradeNumber(text);
  if ((count == 0) != (first == 0) || newest < first) __builtin_trap();
  return 0;
}
