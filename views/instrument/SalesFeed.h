#pragma once
// The time-and-sales views' side of the process-wide stores: which headers
// and pages are wanted, and how a field value from the terminal lands.
//
//   SalesSummaryStore  the header of an instrument (param 0 or 99999);
//   SalesPageStore     the raw "TRADEDATA" text of a page (1..999, 99998 live);
//   TradeTape          every trade parsed from the pages, by number.
//
// Two store feeds (addon/Feeds.h) carry what the views want:
//   SalesHeaderFeed  SalesSummaryStore; no params; the instrument's header;
//   SalesPageFeed    SalesPageStore; params: the page; that page's record.
// The current view of the class sends the requests of both feeds (header
// batch with 99999, one page request per page).
//
// UI thread only (the stores take their own locks).
#include <cstdint>
#include <string>
#include <vector>

#include "addon/Channel.h"
#include "addon/Feeds.h"
#include "data/Keys.h"
#include "data/MarketStores.h"
#include "data/TradeTape.h"
#include "hostview/Records.h"

namespace sales {

inline constexpr std::int32_t kKind = 2;             // kind of every time-and-sales field
inline constexpr std::int32_t kLivePage = 99998;     // the page with the newest trades
inline constexpr std::int32_t kHeaderParam = 99999;  // the header fields
inline constexpr int kMaxHistoryPage = 999;

// History page 1..999 or the live page.
constexpr bool IsPage(std::int32_t param) { return (param >= 1 && param <= kMaxHistoryPage) || param == kLivePage; }
constexpr bool IsHeader(std::int32_t param) { return param == 0 || param == kHeaderParam; }

using addon::SalesHeaderFeed;
using addon::SalesPageFeed;

// Registers in the feeds above; a page that is neither a history page nor the
// live page is ignored.
void RegisterHeader(const InstrumentKey& key, std::uint32_t now);
void RegisterPage(const InstrumentKey& key, std::int32_t page, std::uint32_t now);
// Sends the requests of everything queued in both feeds (headers first); the
// queues empty.
void SendPending(const addon::FeedbackSender& send);
// Drops every queued interest (tests).
void ClearPending();

// The header of `key` as last stored; false when it has no record.
bool ReadHeader(const InstrumentKey& key, SalesSummaryRecord& out);

// What a field value (410/412) did.
enum class Applied {
  Ignored,  // not kind 2, or a param that is neither header nor page
  Header,   // stored in SalesSummaryStore
  Page,     // stored in SalesPageStore (and a "TRADEDATA" text parsed into TradeTape)
};
// Stores one value; the caller has checked who applies it and that the value
// is not empty. A history page's answer counts for its instrument's batch.
Applied ApplyUpdate(const FieldUpdate& update, std::uint32_t now);

}  // namespace sales
