#pragma once
// Whether a process-wide reference store has been loaded, so that the first
// PrepareBasicData of a view class asks the host only for what is missing.
// The product, exchange and instrument stores of data/ are probed by default;
// the owner of a watchlist store installs its probe (the price view). A store
// without a probe counts as not loaded.
#include "hostview/Types.h"

namespace addon {

enum class RefStore {
  Products,         // request 505
  Exchanges,        // request 503
  Instruments,      // request 500 (the read-only instrument store)
  UserWatchlists,   // request 610
  KeldoWatchlists,  // request 522
  Top30Watchlists,  // request 521
};

// The request that asks the host for the store's content.
UINT RequestFor(RefStore store);

using StoreProbe = bool (*)();
void SetStoreProbe(RefStore store, StoreProbe probe);
bool IsStoreLoaded(RefStore store);

}  // namespace addon
