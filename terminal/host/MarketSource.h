#pragma once
// The market as the host plays it to the views: the reference data they
// receive (products, exchanges, instruments) and the text of every field value
// the host answers or pushes (quotes, depth levels, trade pages, summaries).
// Three implementations: the simulator (SimSource), a recording being
// replayed (ReplaySource), and a recorder in front of either
// (RecordingSource). The host reads the market only through this seam for
// what it hands to the views; the simulator keeps serving the terminal's own
// extras (price bands, sectors, lists, its own views).
//
// Single-threaded, like the rest of the host.
#include <cstdint>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

#include "hostview/Records.h"

namespace term {

// The trading day a source plays and the simulator settings it came from.
struct SessionInfo {
  std::string date = "2026-12-07";          // "YYYY-MM-DD"
  int startSeconds = 10 * 3600 + 30 * 60;   // time of day when the market time is 0
  std::uint64_t seed = 20261207;
  int instruments = 3000;
  int fieldUpdatesPerSecond = 4000;
};

class MarketSource {
 public:
  // What changed about an instrument (the simulator's bits, same values):
  // its book, its trades, its name ("INSTRNAME"), its remark ("REMARKS").
  enum ChangeBits : std::uint32_t {
    kBookChanged = 1, kTradeChanged = 2, kMarketChanged = 3, kNameChanged = 4, kRemarksChanged = 8
  };

  virtual ~MarketSource() = default;

  // ---- Reference data (stable for the life of the source) ------------------
  virtual const std::vector<JProduct>& Products() const = 0;
  virtual const std::vector<JExchangeList>& Exchanges() const = 0;
  virtual const std::vector<JInstrumentUnderlying>& Instruments() const = 0;
  // Instrument indices; -1 when unknown.
  virtual int Find(std::int64_t productId, std::string_view code) const = 0;
  virtual int FindByCode(std::string_view code) const = 0;
  virtual int FindByChartCode(std::string_view chartCode) const = 0;
  const JProduct* FindProduct(std::int64_t productId) const;
  const JExchangeList* FindExchange(std::string_view code) const;

  // ---- Time --------------------------------------------------------------------
  // Moves the market to tick `now` (platform::TickCount()).
  virtual void AdvanceTo(std::uint32_t now) = 0;
  // Market time: milliseconds since the session started.
  virtual std::uint64_t ElapsedMs() const = 0;
  virtual const SessionInfo& Session() const = 0;
  // Time of day of the market in milliseconds since midnight, and as "HH:MM:SS".
  std::uint32_t TimeOfDayMs() const;
  std::string TimeText() const;

  // ---- Interest ------------------------------------------------------------------
  // Instruments someone watches (counted, like the simulator's).
  virtual void AddInterest(int index) = 0;
  virtual void RemoveInterest(int index) = 0;

  // ---- Values ----------------------------------------------------------------------
  // Instruments whose values changed since the last call, sorted, each once,
  // with ChangeBits.
  virtual std::vector<std::pair<int, std::uint32_t>> TakeChangedWithBits() = 0;
  // The value text of a field as the views receive it (410/412); "" when none.
  // `kind` and `param` as in sim::Market::FieldValue.
  virtual std::string FieldValue(int index, std::string_view field, int param, int kind) = 0;
  // A depth field of levels 1..`levels` (kind 1): `out[level - 1]`, "" for an
  // empty side. The same texts as FieldValue(index, field, level, 1).
  virtual void DepthField(int index, std::string_view field, int levels, std::vector<std::string>& out) = 0;
};

// "HH:MM:SS" of milliseconds since midnight.
std::string ClockText(std::uint32_t msOfDay);

}  // namespace term
