#pragma once
// The store feeds of the views (see addon/StoreFeed.h for the vocabulary).
//
//   DepthFeed   DepthStore; params: the number of levels (1..99); records:
//               levels 1..count of the instrument. The depth view sends the
//               three depth batches for each pending interest.
//   QuoteFeed   QuoteStore; no params; record: the instrument's quote record.
//               The price view and the alert views register what they show
//               and send the quote batches for what TakePending(shown) hands out;
//               registering a shown instrument again asks for it again.
//   SalesHeaderFeed, SalesPageFeed  the time-and-sales header and pages (below).
//   SummaryPageFeed  SummaryHeaderStore; params: a trade-summary page (1..99);
//               record: the instrument's summary header. The trade-summary
//               view sends the page request for each pending interest.
//   SummaryLineFeed  SummaryLineStore, read only: how many lines there are is
//               known only when they arrive, so nothing is registered; the
//               trade-summary view makes their records as pages arrive.
#include <cstdint>
#include <vector>

#include "addon/StoreFeed.h"
#include "data/MarketStores.h"
#include "data/QuoteStore.h"

namespace addon {

struct DepthFeedTraits {
  using Store = DepthStore;
  using Params = int;  // levels wanted
  static constexpr int kMinLevels = 1;
  static constexpr int kMaxLevels = 99;
  static int Normalise(int levels);
  static std::vector<DepthKey> RecordKeys(const InstrumentKey& key, int levels);
};
using DepthFeed = StoreFeed<DepthFeedTraits>;

// Levels first..last (clamped to 1..99) of an instrument, in order.
std::vector<DepthKey> DepthLevels(const InstrumentKey& key, int first, int last);

struct QuoteFeedTraits {
  using Store = QuoteStore;
  using Params = NoParams;
  static std::vector<InstrumentKey> RecordKeys(const InstrumentKey& key, NoParams) { return {key}; }
};
using QuoteFeed = StoreFeed<QuoteFeedTraits>;

// Time and sales: the header of an instrument (the 99999 fields), and its
// pages (params: history page 1..999 or the live page 99998; any other page
// has no record). The view sends the header batch and one request per page.
struct SalesHeaderFeedTraits {
  using Store = SalesSummaryStore;
  using Params = NoParams;
  static std::vector<InstrumentKey> RecordKeys(const InstrumentKey& key, NoParams) { return {key}; }
};
using SalesHeaderFeed = StoreFeed<SalesHeaderFeedTraits>;

struct SalesPageFeedTraits {
  using Store = SalesPageStore;
  using Params = std::int32_t;  // the page
  static constexpr std::int32_t kLivePage = 99998;
  static constexpr std::int32_t kLastHistoryPage = 999;
  static bool IsPage(std::int32_t page) { return (page >= 1 && page <= kLastHistoryPage) || page == kLivePage; }
  static std::vector<PageKey> RecordKeys(const InstrumentKey& key, std::int32_t page);
};
using SalesPageFeed = StoreFeed<SalesPageFeedTraits>;

struct SummaryPageFeedTraits {
  using Store = SummaryHeaderStore;
  using Params = int;  // the page
  static std::vector<InstrumentKey> RecordKeys(const InstrumentKey& key, int) { return {key}; }
};
using SummaryPageFeed = StoreFeed<SummaryPageFeedTraits>;

struct SummaryLineFeedTraits {
  using Store = SummaryLineStore;
  using Params = NoParams;
  static std::vector<LineKey> RecordKeys(const InstrumentKey&, NoParams) { return {}; }
};
using SummaryLineFeed = StoreFeed<SummaryLineFeedTraits>;

}  // namespace addon
