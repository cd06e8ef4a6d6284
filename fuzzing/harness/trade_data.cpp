// "TRADEDATA" page texts into the trade tape: every valid item is stored and
// reads back as the last item of its number gave it, however its text is kept.
// Bytes from 0x80 up become characters beyond ASCII (and negative ones), so
// both ways the tape keeps a trade are reached.
#include <cstddef>
#include <cstdint>
#include <map>
#include <string>

#include "data/TradeTape.h"

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  std::wstring text;
  text.reserve(size);
  for (std::size_t i = 0; i < size; ++i) {
    const std::uint8_t b = data[i];
    text.push_back(b < 0xF0 ? static_cast<wchar_t>(b) : b < 0xF8 ? static_cast<wchar_t>(0x4E00 + b) : static_cast<wchar_t>(-b));
  }
  std::map<std::int32_t, TradeRecord> last;
  int count = mvd::ParseTradeData(text, [&](TradeRecord&& r) {
    if (r.number <= 0) __builtin_trap();
    last[r.number] = r;
  });
  const std::int32_t first = mvd::FirstTradeNumber(text);
  const std::int32_t newest = mvd::NewestTradeNumber(text);
  if ((count == 0) != (first == 0) || newest < first) __builtin_trap();

  // Stored twice, as the live page repeats itself.
  static TradeTape& tape = *new TradeTape;
  tape.ResetForTests();
  const InstrumentKey key{1, L"X"};
  if (tape.StorePage(key, text) != count || tape.StorePage(key, text) != count) __builtin_trap();
  if (tape.Count(key) != last.size()) __builtin_trap();
  for (const auto& [number, want] : last) {
    TradeRecord got;
    if (!tape.Get(key, number, got) || got.number != number || got.time != want.time || got.price != want.price ||
        got.volume != want.volume || got.side != want.side)
      __builtin_trap();
  }
  return 0;
}
