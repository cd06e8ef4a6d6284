#pragma once
// Market delay texts by (product id, exchange code), filled from the
// terminal's market information (601). Process-wide; guarded by a lock because
// tile drawing may read it from under the board's drawing lock.
#include <cstdint>
#include <mutex>
#include <string>
#include <string_view>
#include <unordered_map>

#include "data/Keys.h"

class MarketDelayCache {
 public:
  static MarketDelayCache& Instance();

  // The delay text, or an empty text on a miss.
  std::wstring Lookup(std::int64_t productId, std::wstring_view exchangeCode) const;
  // True on a hit (the text may be empty: no delay). Lets a caller ask the
  // terminal once per key instead of on every miss-looking empty text.
  bool Find(std::int64_t productId, std::wstring_view exchangeCode, std::wstring& text) const;
  // Sets or replaces an entry.
  void Set(std::int64_t productId, std::wstring_view exchangeCode, std::wstring text);
  // Entry from the first market-information record: "%d" of the delay, or an
  // empty text when the delay is 0.
  void SetDelay(std::int64_t productId, std::wstring_view exchangeCode, std::int32_t delay);
  void Clear();

 private:
  mutable std::mutex mu_;
  // Keyed like an instrument: the exchange code stands in the code's place.
  std::unordered_map<InstrumentKey, std::wstring> map_;
};
