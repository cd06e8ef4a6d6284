#pragma once
// The depth, time-and-sales and trade-summary stores. Same mechanics as the
// quote store (CellStore.h); only the cells differ.
//
// Recount pattern (one lock for a whole tape, no copies):
//   if (store.Version() == seen) return;            // nothing moved anywhere
//   store.Read([&](const SalesPageStore::Reader& rd) {
//     PageKey k{pid, code, 0};
//     for (int i = 0; i < 1000; ++i) { k.Page = i ? i : 99998; if (auto* r = rd.Find(k)) ... }
//   });
#include <array>

#include "data/CellStore.h"
#include "hostview/Records.h"
#include "hostview/Text.h"

namespace mvd {
constexpr CellSpec PriceCell(std::wstring_view n, int decimals = 3) {
  return CellSpec{n, CellKind::Fixed, MarkRule::Direction, static_cast<std::int8_t>(decimals), false, false, L""};
}
constexpr CellSpec CountCell(std::wstring_view n, int decimals = 2) {
  return CellSpec{n, CellKind::Fixed, MarkRule::Change, static_cast<std::int8_t>(decimals), false, false, L""};
}
constexpr CellSpec TextCell(std::wstring_view n) {
  return CellSpec{n, CellKind::Text, MarkRule::Change, 0, false, false, L""};
}
}  // namespace mvd

// Depth levels: prices in the instrument's format, counts and volumes whole.
// An empty value blanks the level's price text and marks the record changed.
struct DepthLayout {
  using Key = DepthKey;
  enum Field : int { OrdsBVol, BVol, Buy, Sell, SVol, OrdsSVol };
  static constexpr std::array<CellSpec, 6> kCells{{
      CellSpec{L"ORDS_BVOL", CellKind::Whole, MarkRule::Change, 0, false, false, L""},
      CellSpec{L"BVOL", CellKind::Whole, MarkRule::Change, 0, false, false, L""},
      CellSpec{L"BUY", CellKind::Price, MarkRule::Direction, 3, false, true, L""},
      CellSpec{L"SELL", CellKind::Price, MarkRule::Direction, 3, false, true, L""},
      CellSpec{L"SVOL", CellKind::Whole, MarkRule::Change, 0, false, false, L""},
      CellSpec{L"ORDS_SVOL", CellKind::Whole, MarkRule::Change, 0, false, false, L""},
  }};
  static constexpr bool kInstrumentDecimals = true;
  static constexpr bool kEmptyValueTouches = true;
  static InstrumentKey InstrumentOf(const Key& k) { return InstrumentKey{k.ProductID, k.InstrumentCode}; }
};

// Time-and-sales header of an instrument (the 99999 fields).
struct SalesSummaryLayout {
  using Key = InstrumentKey;
  enum Field : int { DTime, High, Low, NetChange, Last, TotalValue, TotalVolume, PageCount };
  static constexpr std::array<CellSpec, 8> kCells{{
      mvd::TextCell(L"DTIME"),
      mvd::PriceCell(L"HIGH"),
      mvd::PriceCell(L"LOW"),
      mvd::PriceCell(L"NETCHANGE"),
      mvd::PriceCell(L"LAST"),
      mvd::PriceCell(L"TOTALVALUE", 0),
      mvd::CountCell(L"TOTAL_VOLUME"),
      mvd::CountCell(L"PAGECOUNT"),
  }};
  static constexpr bool kInstrumentDecimals = false;
  static constexpr bool kEmptyValueTouches = false;
  static const InstrumentKey& InstrumentOf(const Key& k) { return k; }
};

// One page of the trade tape: the raw "TRADEDATA" text.
struct SalesPageLayout {
  using Key = PageKey;
  enum Field : int { TradeData };
  static constexpr std::array<CellSpec, 1> kCells{{mvd::TextCell(L"TRADEDATA")}};
  static constexpr bool kInstrumentDecimals = false;
  static constexpr bool kEmptyValueTouches = false;
  static InstrumentKey InstrumentOf(const Key& k) { return InstrumentKey{k.ProductID, k.InstrumentCode}; }
};

// Trade-summary header of an instrument. "QUOTE_LIST" is not kept.
struct SummaryHeaderLayout {
  using Key = InstrumentKey;
  enum Field : int { Time, WeightedAvg, Last, Ratio, AvgTradeSize, Count, PageCount };
  static constexpr std::array<CellSpec, 7> kCells{{
      mvd::TextCell(L"TIME"),
      mvd::PriceCell(L"WEIGHTED_AVG", 4),
      mvd::PriceCell(L"LAST"),
      mvd::PriceCell(L"RATIO", 4),
      mvd::PriceCell(L"AVG_TRADE_SIZE"),
      CellSpec{L"COUNT", CellKind::Whole, MarkRule::Direction, 0, false, false, L""},
      mvd::CountCell(L"PAGECOUNT"),
  }};
  static constexpr bool kInstrumentDecimals = false;
  static constexpr bool kEmptyValueTouches = false;
  static const InstrumentKey& InstrumentOf(const Key& k) { return k; }
};

// One trade-summary line (one traded price; line 99999 holds the totals).
struct SummaryLineLayout {
  using Key = LineKey;
  enum Field : int { Price, Tradable, Vol, Bid, Ask };
  static constexpr std::array<CellSpec, 5> kCells{{
      mvd::PriceCell(L"PRICE"),
      mvd::PriceCell(L"TRADABLE"),
      mvd::PriceCell(L"VOL"),
      mvd::PriceCell(L"BID"),
      mvd::PriceCell(L"ASK"),
  }};
  static constexpr bool kInstrumentDecimals = false;
  static constexpr bool kEmptyValueTouches = false;
  static InstrumentKey InstrumentOf(const Key& k) { return InstrumentKey{k.ProductID, k.InstrumentCode}; }
};

using DepthRecord = CellRecord<DepthLayout>;
using SalesSummaryRecord = CellRecord<SalesSummaryLayout>;
using SalesPageRecord = CellRecord<SalesPageLayout>;
using SummaryHeaderRecord = CellRecord<SummaryHeaderLayout>;
using SummaryLineRecord = CellRecord<SummaryLineLayout>;

using DepthStore = CellStore<DepthLayout>;
using SalesSummaryStore = CellStore<SalesSummaryLayout>;
using SalesPageStore = CellStore<SalesPageLayout>;
using SummaryHeaderStore = CellStore<SummaryHeaderLayout>;
using SummaryLineStore = CellStore<SummaryLineLayout>;

extern template class CellStore<DepthLayout>;
extern template class CellStore<SalesSummaryLayout>;
extern template class CellStore<SalesPageLayout>;
extern template class CellStore<SummaryHeaderLayout>;
extern template class CellStore<SummaryLineLayout>;

// Terminal field values (410/412) into the stores, texts widened. The caller
// checks kind, level and page first.
inline bool ApplyFieldUpdate(DepthStore& store, const FieldUpdate& u, std::uint32_t now) {
  return store.Update(DepthKey{u.productId, hv::Widen(u.instrumentCode), u.param}, hv::Widen(u.fieldName), hv::Widen(u.value), now);
}
