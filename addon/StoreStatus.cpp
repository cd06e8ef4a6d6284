#include "addon/StoreStatus.h"

#include <array>

#include "hostview/MessageIds.h"

namespace addon {
namespace {
std::array<StoreProbe, 6>& Probes() {
  static std::array<StoreProbe, 6> probes{};
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
