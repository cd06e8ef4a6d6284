#pragma once
// The simulated market the terminal plays when it has no exchange connection.
//
// Reference data (products, exchanges, instruments, price-step tables, sectors)
// is generated once from the seed. Prices follow a seeded random walk per
// instrument; quotes, a 99-level book, the trade tape and the trade summary
// stay coherent with each other. The book changes as real ones do: most
// updates change the size at one of the top levels, the best price moves now
// and then, and trades take liquidity at the best price. Indices tick a value
// and have no book. Time moves only through AdvanceTo(tick), in
// fixed steps of `kStepMs`, so the same seed and the same sequence of ticks
// (and of interest changes) give the same market.
//
// Now and then (about once a minute of market time, from a stream of its own,
// so the prices are the same with or without) a company changes its name or
// its exchange remark: half the time one that someone watches. The reference
// records stay as they were; "INSTRNAME" and "REMARKS" give the current texts.
//
// Plain C++, no Qt, single-threaded.
#include <cstdint>
#include <deque>
#include <memory_resource>
#include <functional>
#include <memory>
#include <string>
#include <string_view>
#include <vector>

#include "hostview/HostLists.h"
#include "hostview/Records.h"

namespace sim {

struct MarketConfig {
  std::uint64_t seed = 20261207;
  int instruments = 3000;            // clamped to 60 .. 500000
  int fieldUpdatesPerSecond = 4000;  // target over the instruments of interest
  // Each watched instrument trades and quotes this many times as often (a
  // heavier feed for soak and latency runs); 1 is the market as it is.
  double pace = 1.0;
  std::string sessionDate = "2026-12-07";
  int sessionStartSeconds = 10 * 3600 + 30 * 60;  // time of day at `startTick`
  std::uint32_t startTick = 0;
  // Mean market time between name or remark changes; 0: none.
  std::uint32_t corporateEventEveryMs = 60000;
};

// One trade of the tape. Trade numbers start at 1 and are the position + 1.
struct Trade {
  std::uint32_t timeMs = 0;  // milliseconds since midnight of the session date
  std::int32_t volume = 0;
  double price = 0.0;
  std::uint8_t side = 1;     // 0 married deal, 1 at the ask (buy), 2 at the bid (sell), 3 auction
};

// An instrument's trades of the day, oldest first. Grown in fixed chunks, so a
// long tape never needs a second copy of itself while it grows.
using Tape = std::pmr::deque<Trade>;

// One line of the trade summary (traded volume at one price).
struct SummaryLine {
  double price = 0.0;
  std::int64_t trades = 0;
  std::int64_t volume = 0;
  std::int64_t bidVolume = 0;  // traded on the bid (side 2)
  std::int64_t askVolume = 0;  // traded on the ask (side 1)
};

// Current quote of one instrument.
struct Quote {
  double bid = 0, ask = 0, last = 0, open = 0, high = 0, low = 0, close = 0;  // close: previous close
  std::int64_t bidVolume = 0, askVolume = 0, volume = 0;
  double turnover = 0;
  std::int32_t trades = 0;
  std::string remarks;     // exchange remark code, often empty
  std::string cfdStatus;   // "L/S", "L/-", "-/S", "-/-", "Call" or empty
  std::string dmaStatus;
  std::string month, year; // futures contract month ("DEC") and year ("2026")
};

// One book level.
struct DepthLevel {
  double bid = 0, ask = 0;      // 0: no price at this level
  std::int64_t bidVolume = 0, askVolume = 0;
  std::int32_t bidOrders = 0, askOrders = 0;
};

// A user watchlist the terminal offers on first start.
struct StarterWatchlist {
  std::string name;
  std::vector<int> instruments;  // instrument indices
};

// A brand (KELDO) watchlist.
struct BrandWatchlist {
  std::int32_t id = 0;
  std::string name;
  std::vector<int> instruments;
};

class Market {
 public:
  static constexpr std::uint32_t kStepMs = 50;
  static constexpr int kTradePageSize = 100;
  static constexpr int kLivePage = 99998;
  static constexpr int kHeaderParam = 99999;
  static constexpr int kSummaryPageSize = 40;
  static constexpr int kDepthLevels = 99;

  explicit Market(const MarketConfig& config);
  ~Market();
  Market(const Market&) = delete;
  Market& operator=(const Market&) = delete;

  const MarketConfig& Config() const;

  // ---- Reference data (stable for the life of the market) --------------------
  const std::vector<JProduct>& Products() const;
  const std::vector<JExchangeList>& Exchanges() const;
  const std::vector<JInstrumentUnderlying>& Instruments() const;
  // The bytes of the trades the day's tapes hold (they grow with every trade:
  // the simulated exchange keeps the day), for memory figures.
  std::size_t TapeBytes() const;
  const std::vector<TickBand>& TickBands() const;
  const std::vector<JSector>& Sectors() const;
  const std::vector<JRemarkMessage>& RemarkMessages() const;
  // -1 when unknown.
  int Find(std::int64_t productId, std::string_view code) const;
  int FindByCode(std::string_view code) const;       // first instrument with that code
  // The first instrument with `code` whose exchange code, without surrounding
  // blanks, is `exchange`.
  int FindOnExchange(std::string_view exchange, std::string_view code) const;
  int FindByChartCode(std::string_view chartCode) const;
  const JExchangeList* FindExchange(std::string_view code) const;
  const JProduct* FindProduct(std::int64_t productId) const;
  JMarketInfo MarketInfo(std::string_view exchangeCode) const;
  // The busiest tradeable stock of the home exchange (what a first start shows).
  int LiquidStock() const;
  // The step at `price` in `tableId` (table 0 when the table has no band there).
  double StepAt(std::int32_t tableId, double price, bool up = true) const;

  // ---- Time ----------------------------------------------------------------------
  // Runs every whole step up to `now` (unsigned tick difference from the last);
  // what is left of a partial step counts towards the next call.
  void AdvanceTo(std::uint32_t now);
  std::uint32_t Now() const;
  // Session clock: "YYYY-MM-DD", "HH:MM:SS", milliseconds since midnight.
  std::string DateText() const;
  std::string TimeText() const;
  std::uint32_t TimeOfDayMs() const;

  // ---- Interest --------------------------------------------------------------------
  // Instruments someone watches get the configured update rate; the rest move
  // slowly in the background. Counted: Add twice needs Remove twice.
  void AddInterest(int index);
  void RemoveInterest(int index);
  int InterestCount() const;

  // What changed about an instrument: its book (bid, ask, sizes, levels) or
  // its trades (last, day figures, tape, summary; a trade moves the book too).
  // A name change moves "INSTRNAME", a remark change "REMARKS" (of the
  // instrument and of the twins that share its market).
  enum ChangeBits : std::uint32_t { kBookChanged = 1, kTradeChanged = 2, kNameChanged = 4, kRemarksChanged = 8 };
  // Instruments whose values changed since the last call, sorted, each once.
  std::vector<int> TakeChanged();
  // The same with what changed about each.
  std::vector<std::pair<int, std::uint32_t>> TakeChangedWithBits();

  // ---- Price watch -------------------------------------------------------------------
  // The instrument whose prices an instrument shows (a brand twin shows its
  // original's); `index` itself for most.
  int BaseOf(int index) const;
  // Called inside AdvanceTo after every event that may move the bid, ask or
  // last price of a watched instrument, with its base index; the market time
  // is the time of the change. Counted: Watch twice needs Unwatch twice.
  using PriceListener = std::function<void(int baseIndex)>;
  void SetPriceListener(PriceListener listener);
  void WatchPrices(int index);
  void UnwatchPrices(int index);

  // ---- Values ---------------------------------------------------------------------
  Quote QuoteOf(int index);
  DepthLevel Depth(int index, int level);   // level 1..99
  // Levels 1..`levels` in one pass (what a depth subscription reads).
  std::vector<DepthLevel> Book(int index, int levels);
  const Tape& Trades(int index);
  std::vector<SummaryLine> Summary(int index);  // by price, highest first

  // The current name of an instrument (the reference record's until it changed).
  const std::string& NameOf(int index) const;
  // Name and remark changes so far.
  int CorporateEvents() const;

  // The value text of a field as the views receive it (410/412), "" when none.
  // kind 0: quote fields (and depth fields at level 1); kind 1: depth fields at
  // level `param`; kind 2: time-and-sales header (param 0/99999) or "TRADEDATA"
  // of page `param`; kind 3: trade-summary header fields or "TRADEDATA" of
  // summary page `param`.
  std::string FieldValue(int index, std::string_view field, int param, int kind);
  // A depth field ("BUY", "SELL", "BVOL", "SVOL", "ORDS_BVOL", "ORDS_SVOL") of
  // one book level of instrument `index`; "" for an empty side or another
  // field. FieldValue and the host's depth pushes both format through here.
  std::string DepthFieldValue(int index, const DepthLevel& level, std::string_view field) const;

  // Text layouts.
  std::string TradePageText(int index, int page);    // "TRADEDATA" of a page (1..999, 99998)
  int TradePageCount(int index);
  std::string SummaryPageText(int index, int page);  // 40 lines + a "TOTALS:" item
  int SummaryPageCount(int index);
  std::string FormatPrice(int index, double price) const;

  // ---- Lists -------------------------------------------------------------------------
  // Gainers, losers and most active per exchange, computed from the current quotes.
  std::vector<JTop30Group> Top30();
  const std::vector<BrandWatchlist>& BrandWatchlists() const;
  std::vector<int> WorldIndices() const;
  const std::vector<StarterWatchlist>& StarterWatchlists() const;

  struct Impl;

 private:
  std::unique_ptr<Impl> d;
};

}  // namespace sim
