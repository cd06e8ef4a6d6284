#pragma once
// The process-wide quote store: eighteen quote fields per instrument with
// display text, number, change mark and change time.
//
//   auto& qs = QuoteStore::Instance();
//   auto rec = qs.Get(key, platform::TickCount());   // queues unknown keys
//   qs.Update(key, L"LAST", L"12.5", platform::TickCount());
//   rec[QuoteLayout::Last].text, rec[QuoteLayout::Last].mark
#include <array>

#include "data/CellStore.h"
#include "hostview/Records.h"
#include "hostview/Text.h"

namespace mvd {
constexpr CellSpec QuotePrice(std::wstring_view n, std::wstring_view def = L"0.000", bool raw = false) {
  return CellSpec{n, CellKind::Price, MarkRule::Direction, 3, raw, false, def};
}
constexpr CellSpec QuoteVolume(std::wstring_view n, std::wstring_view def) {
  return CellSpec{n, CellKind::Fixed, MarkRule::Change, 2, false, false, def};
}
constexpr CellSpec QuoteText(std::wstring_view n) {
  return CellSpec{n, CellKind::Text, MarkRule::Change, 0, false, false, L""};
}
}  // namespace mvd

struct QuoteLayout {
  using Key = InstrumentKey;
  enum Field : int {
    Bid, Ask, BVol, SVol, Last, Change, PChange, Vol, Open, High, Low, Close,
    Remarks, CfdStatus, DmaStatus, Month, Year, Tac,
  };
  static constexpr std::array<CellSpec, 18> kCells{{
      mvd::QuotePrice(L"BID"),
      mvd::QuotePrice(L"ASK"),
      mvd::QuoteVolume(L"BVOL", L"0.00"),
      mvd::QuoteVolume(L"SVOL", L"0.00"),
      mvd::QuotePrice(L"LAST"),
      mvd::QuotePrice(L"CHANGE", L"0.000", true),
      CellSpec{L"PCHANGE", CellKind::Fixed, MarkRule::Direction, 3, true, false, L""},
      mvd::QuoteVolume(L"VOL", L""),
      mvd::QuotePrice(L"OPEN"),
      mvd::QuotePrice(L"HIGH"),
      mvd::QuotePrice(L"LOW"),
      mvd::QuotePrice(L"CLOSE"),
      mvd::QuoteText(L"REMARKS"),
      mvd::QuoteText(L"CFD_STATUS"),
      mvd::QuoteText(L"DMA_STATUS"),
      mvd::QuoteText(L"MONTH"),
      mvd::QuoteText(L"YEAR"),
      mvd::QuotePrice(L"TAC", L""),
  }};
  static constexpr bool kInstrumentDecimals = true;
  static constexpr bool kEmptyValueTouches = false;
  static const InstrumentKey& InstrumentOf(const Key& k) { return k; }
};

using QuoteRecord = CellRecord<QuoteLayout>;
using QuoteStore = CellStore<QuoteLayout>;

extern template class CellStore<QuoteLayout>;

// Writes a terminal field value (410/412) into `store`: code, name and value
// widened (invalid UTF-8 becomes U+FFFD). Which updates belong to the view
// (kind, param, page) is the caller's check.
inline bool ApplyFieldUpdate(QuoteStore& store, const FieldUpdate& u, std::uint32_t now) {
  return store.Update(InstrumentKey{u.productId, hv::Widen(u.instrumentCode)}, hv::Widen(u.fieldName), hv::Widen(u.value), now);
}
