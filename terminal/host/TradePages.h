#pragma once
// The terminal's side of the time-and-sales fields (kind 2) on the simulated
// tape: trade numbers run from 1 without gaps; history page p holds trades
// (p-1)*100+1 .. p*100, the live page (99998) the newest 100; every page lists
// its trades newest first. The texts themselves come from sim::Market
// (FieldValue); this says when a subscribed value can have moved, so that a
// new trade re-sends the live page and the header but not the full history
// pages a view holds while it fetches the past.
//
// Also writes the simulated tape of an instrument as a table (the headless
// run's "--dump"), so that a view's dump can be checked against the market.
#include <cstdint>
#include <string>
#include <vector>

namespace sim {
class Market;
}  // namespace sim

namespace term::tape {

inline constexpr int kLivePage = 99998;
inline constexpr int kHeaderParam = 99999;
inline constexpr int kPageSize = 100;

// A history page (1..999) every one of whose trades exists: its text can no
// longer change.
bool IsCompletePage(int page, int tradeCount);

// The trade number of a page text's first item (its newest trade); 0 when
// the text has none.
int NewestTradeOfPage(const std::string& text);

// Whether the pushed value of a kind-2 subscription can differ from `lastSent`
// now that the instrument has `tradeCount` trades. A complete history page
// whose complete text was sent does not; everything else may.
bool MayHaveMoved(const std::string& field, int param, int tradeCount, const std::string& lastSent);

// One instrument a view shows.
struct ShownInstrument {
  std::int64_t productId = 0;
  std::string code;
};

// Side words of the dump (the terminal's language texts 614 and 615).
struct SideWords {
  std::string buy = "Buy";
  std::string sell = "Sell";
};

// The tape of `index` as TSV: headings "trade", "time", "price", "volume",
// "side", then one line per trade, newest first. Time "HH:MM:SS", price as the
// pages print it, volume a plain integer, side in words.
std::string TapeTsv(sim::Market& market, int index, const SideWords& words = {});

// Writes <dir>/market-trades-<code>.tsv for each instrument (once per code;
// unknown instruments are skipped). Returns the number of files, or -1 with
// `error` set.
int WriteTapeDumps(sim::Market& market, const std::vector<ShownInstrument>& shown, const std::string& dir,
                   const SideWords& words, std::string& error);

}  // namespace term::tape
