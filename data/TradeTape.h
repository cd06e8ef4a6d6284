#pragma once
// The trade tape: every trade of an instrument that arrived in a "TRADEDATA"
// page text, by trade number (1 for the first trade of the day). Shared by all
// time-and-sales views; one lock per operation.
//
// "TRADEDATA" text: items separated by ";", each of exactly six fields
// separated by "|":
//   time | price | volume | side code | (unused) | trade number
// An item with another number of fields, or whose trade number is not a whole
// number above 0, is dropped; the rest of the page is still stored. A later
// item with the same number replaces the earlier record, so a trade is never
// held twice.
//
// Trades are kept in blocks of one page (trades (p-1)*100+1 .. p*100 form
// block p), so looking a trade up costs the same however long the tape is,
// and a page's completeness is one count. A view keeps every trade of the day
// it has shown, so a block holds its trades' texts packed as bytes, the date
// and hour their times share written once (about 24 bytes a trade instead of
// about 280 as four wide strings); a trade whose text is not plain ASCII, or
// has a field longer than 255, is kept as it came.
#include <array>
#include <atomic>
#include <bitset>
#include <cstdint>
#include <functional>
#include <memory>
#include <mutex>
#include <string>
#include <string_view>
#include <unordered_map>

#include "data/Keys.h"

// One trade as the page text gave it.
struct TradeRecord {
  std::int32_t number = 0;  // 0: no such trade
  std::wstring time;        // as received
  std::wstring price;       // as received
  std::wstring volume;      // as received
  std::wstring side;        // side code: "0", "1", "2", "3" (others shown as nothing)
};

namespace mvd {

inline constexpr int kTradesPerPage = 100;

// Calls `f(TradeRecord&&)` for every valid item of a page text, in text order;
// returns the number of valid items.
int ParseTradeData(std::wstring_view text, const std::function<void(TradeRecord&&)>& f);
// The trade number of the first valid item; 0 when there is none.
std::int32_t FirstTradeNumber(std::wstring_view text);
// The highest trade number among the valid items; 0 when there is none.
std::int32_t NewestTradeNumber(std::wstring_view text);

// The page that holds trade `number` (number >= 1).
constexpr int PageOfTrade(std::int32_t number) { return (number - 1) / kTradesPerPage + 1; }
// The first trade number of history page `page` (page >= 1).
constexpr std::int32_t FirstTradeOfPage(int page) { return (page - 1) * kTradesPerPage + 1; }

}  // namespace mvd

class TradeTape {
 public:
  // The process-wide tape, created on first use.
  static TradeTape& Instance();

  TradeTape() = default;
  TradeTape(const TradeTape&) = delete;
  TradeTape& operator=(const TradeTape&) = delete;

  // Stores every valid item of a "TRADEDATA" text under `key`; returns the
  // number stored.
  int StorePage(const InstrumentKey& key, std::wstring_view text);
  // Stores one trade (number > 0); false otherwise.
  bool Store(const InstrumentKey& key, TradeRecord trade);

  // The trade, or false (out untouched) when it has not arrived.
  bool Get(const InstrumentKey& key, std::int32_t number, TradeRecord& out) const;
  bool Has(const InstrumentKey& key, std::int32_t number) const;
  // Runs f(const TradeRecord&) under the lock when the trade is held; returns
  // whether it was. The record lives until f returns. Do not call the tape
  // from f.
  template <class F>
  bool Read(const InstrumentKey& key, std::int32_t number, F&& f) const {
    std::lock_guard lock(mu_);
    const TradeRecord* r = FindLocked(key, number);
    if (!r) return false;
    f(*r);
    return true;
  }

  // How many trades of history page `page` (1..) are held.
  int CountInPage(const InstrumentKey& key, int page) const;
  // How many of the trades numbered from..to are held.
  int CountRange(const InstrumentKey& key, std::int32_t from, std::int32_t to) const;
  // Every trade held for the instrument.
  std::size_t Count(const InstrumentKey& key) const;

  // Bumped by every stored trade; lock-free.
  std::uint64_t Version() const noexcept;

  // Empty, as when first made (tests; see data/ProcessState.h).
  void ResetForTests();

 private:
  // Where a held trade's four fields lie in its block's text, back to back.
  struct Slot {
    std::uint16_t at = 0;
    std::array<std::uint8_t, 4> length{};
  };
  struct Block {
    std::string text;                                 // at most 65535 bytes
    std::string timePrefix;                           // the start of the first packed trade's time
    std::array<Slot, mvd::kTradesPerPage> places{};  // not "slots": a Qt keyword
    std::bitset<mvd::kTradesPerPage> held;
    std::bitset<mvd::kTradesPerPage> prefixed;  // the time is timePrefix + its text
    std::unordered_map<int, TradeRecord> unpacked;  // by slot: text that does not pack
    int count = 0;
  };
  struct Tape {
    std::unordered_map<int, std::unique_ptr<Block>> blocks;  // by page
    std::size_t count = 0;
  };
  const Block* BlockLocked(const InstrumentKey& key, std::int32_t number) const;
  // The trade, unpacked into scratch_ when packed; null when not held.
  const TradeRecord* FindLocked(const InstrumentKey& key, std::int32_t number) const;
  bool StoreLocked(Tape& tape, TradeRecord&& trade);
  static bool Packs(const Block& block, const TradeRecord& trade);
  static bool SameAsPacked(const Block& block, int slot, const TradeRecord& trade);
  static void Repack(Block& block);

  mutable std::mutex mu_;
  std::unordered_map<InstrumentKey, Tape> tapes_;
  std::atomic<std::uint64_t> version_{0};
  mutable TradeRecord scratch_;  // under mu_
};
