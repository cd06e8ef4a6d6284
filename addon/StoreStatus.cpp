#include "addon/StoreStatus.h"

#include <array>

#include "data/ReferenceStores.h"
#include "hostview/MessageIds.h"

namespace addon {
namespace {
// The stores of data/ that need no view record type are probed from here; the
// watchlist stores are templates over the price view's record, so the price
// view installs their probes.
std::array<StoreProbe, 6>& Probes() {
  static std::array<StoreProbe, 6> probes{
      [] { return ProductMgr().IsLoaded(); },
      [] { return ExchangeMgr().IsLoaded(); },
      [] { return InstrumentMgr_ReadOnly().IsLoaded(); },
      nullptr,
      nullptr,
      nullptr,
  };
  return probes;
}
}  // namespace

UINT RequestFor(RefStore store) {
  switch (store) {
    case RefStore::Products: return hm::ProductList;
    case RefStore::Exchanges: return hm::ExchangeList;
    case RefStore::Instruments: return hm::InstrumentList;
    case RefStore::UserWatchlists: return hm::WatchlistList;
    case RefStore::KeldoWatchlists: return hm::WatchlistRows522;
    case RefStore::Top30Watchlists: return hm::WatchlistGroups521;
  }
  return 0;
}

void SetStoreProbe(RefStore store, StoreProbe probe) { Probes()[static_cast<std::size_t>(store)] = probe; }

bool IsStoreLoaded(RefStore store) {
  const StoreProbe probe = Probes()[static_cast<std::size_t>(store)];
  return probe && probe();
}

}  // namespace addon
