#pragma once
// The process-wide reference stores. Each is created on first use by its
// accessor and lives until the library unloads. UI thread only.
#include <algorithm>
#include <cstdint>
#include <string>

#include "data/Keys.h"
#include "data/ProcessState.h"
#include "data/RecManger.h"
#include "hostview/Records.h"

struct ProductKeyOf {
  std::int64_t operator()(const JProduct& p) const { return p.productId; }
};
struct ExchangeKeyOf {
  std::string operator()(const JExchangeList& e) const { return e.exchangeCode; }
};
struct InstrumentKeyFn {
  InstrumentKey operator()(const JInstrumentUnderlying& i) const { return InstrumentKeyOf(i); }
};
struct SymbolKeyFn {
  SymbolKey operator()(const JInstrumentUnderlying& i) const { return SymbolKeyOf(i); }
};

using ProductStore = KeyedRecManger<std::int64_t, JProduct, ProductKeyOf>;
using ExchangeStore = KeyedRecManger<std::string, JExchangeList, ExchangeKeyOf>;
using InstrumentStore = KeyedRecManger<InstrumentKey, JInstrumentUnderlying, InstrumentKeyFn>;
using InstrumentStore_ReadOnly = KeyedRecManger_ReadOnly<InstrumentKey, JInstrumentUnderlying, InstrumentKeyFn>;
using SymbolStore_ReadOnly = KeyedRecManger_ReadOnly<SymbolKey, JInstrumentUnderlying, SymbolKeyFn>;

// Products by id (filled from 505).
ProductStore& ProductMgr();
// Exchanges by narrow code (filled from 503).
ExchangeStore& ExchangeMgr();
// Indexes the terminal's instrument list in place (filled from 500).
InstrumentStore_ReadOnly& InstrumentMgr_ReadOnly();
// Indexes the same list by symbol; re-indexed on first use after each fill of
// InstrumentMgr_ReadOnly.
SymbolStore_ReadOnly& SymbolMgr_ReadOnly();
// Instruments the price view adds one at a time.
InstrumentStore& InstrumentMgr();

// Decimals of an instrument from InstrumentMgr_ReadOnly, else InstrumentMgr;
// -1 when neither knows it.
int InstrumentDecimals(const InstrumentKey& key);

// ---- Watchlists and alerts ---------------------------------------------
// Their record types (WatchListDetail, PriceAlertItem) belong to the price and
// alert views, so the stores are templates over the record: the views
// instantiate them with their record, e.g.
//   auto& user = WatchlistMgr<WatchListDetail>(WatchlistFamily::User);
//   auto& alerts = PriceAlertMgr<PriceAlertItem>();
// A watchlist is keyed by its wide name: `RecordKey(r)` when such a function
// exists for the record (found by argument-dependent lookup), else `r.name`.
// An alert is keyed by `RecordKey(r)` if it exists, else `r.alertId`.

enum class WatchlistFamily : int { User = 0, Top30 = 1, Keldo = 2, WorldIndex = 3 };

template <class R>
struct WatchlistKeyOf {
  std::wstring operator()(const R& r) const {
    if constexpr (requires { RecordKey(r); }) return RecordKey(r);
    else return r.name;
  }
};
template <class R>
struct AlertKeyOf {
  std::int32_t operator()(const R& r) const {
    if constexpr (requires { RecordKey(r); }) return RecordKey(r);
    else return r.alertId;
  }
};

template <class R>
using WatchlistStore = KeyedRecManger<std::wstring, R, WatchlistKeyOf<R>>;
template <class R>
using PriceAlertStore = KeyedRecManger<std::int32_t, R, AlertKeyOf<R>>;

// One of the four watchlist stores (user, TOP30, KELDO, world indices).
template <class R>
WatchlistStore<R>& WatchlistMgr(WatchlistFamily family) {
  static WatchlistStore<R> stores[4];
  static const bool hook = mvd::OnResetForTests([] {
    for (auto& s : stores) s.ResetForTests();
  });
  (void)hook;
  return stores[std::clamp(static_cast<int>(family), 0, 3)];
}

template <class R>
PriceAlertStore<R>& PriceAlertMgr() {
  static PriceAlertStore<R> store;
  static const bool hook = mvd::OnResetForTests([] { store.ResetForTests(); });
  (void)hook;
  return store;
}
