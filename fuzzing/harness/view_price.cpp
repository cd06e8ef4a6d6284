// OnHostMessage of the price view (see ViewHarness.h): the base's messages,
// the watchlist replies, remarks, sectors, the relayed field update (414) and
// the numbers it receives but leaves alone (413, 553, 606, 622).
#include "ViewHarness.h"

MV_VIEW_HARNESS("CPriceViewAdv", {hm::WatchlistsLoaded, hm::InstrumentFieldUpdate, hm::WatchlistList, hm::SaveWatchlistNames,
                                   hm::WatchlistGroups520, hm::WatchlistGroups521, hm::WatchlistRows522,
                                   hm::RemarkMessages, hm::FontSizeMenu, hm::Sectors, hm::CompactLayout,
                                   hm::PriceViewRequest413, hm::PriceViewRequest553, hm::Watchlist606,
                                   hm::Watchlist622})
