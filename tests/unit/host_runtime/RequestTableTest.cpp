#include <gtest/gtest.h>

#include <stdexcept>

#include "hostview/MessageIds.h"
#include "terminal/host/HostCore.h"
#include "terminal/host/RequestTable.h"

using term::Request;
using term::RequestTable;

TEST(RequestTable, OneHandlerPerNumberAndASecondOneIsRefused) {
  RequestTable table;
  int first = 0;
  table.On(hm::Title, [&](const Request&) { ++first; });
  EXPECT_THROW(table.On(hm::Title, [](const Request&) {}), std::logic_error);
  EXPECT_THROW(table.Acknowledge({hm::AltStatus, hm::Title}), std::logic_error);
  EXPECT_EQ(table.Find(hm::Sectors), nullptr);
  // The first registration is still the one that runs.
  term::HostCore core;
  const term::RequestHandler* handler = table.Find(hm::Title);
  ASSERT_NE(handler, nullptr);
  (*handler)(Request{core, nullptr, hm::Title, 0});
  EXPECT_EQ(first, 1);
}

TEST(RequestTable, EveryRequestTheTerminalTakesHasItsHandler) {
  RequestTable table;
  ASSERT_NO_THROW(term::RegisterAllRequests(table));
  for (UINT m : {hm::Title, hm::ViewSizeRequest, hm::AlertFrameSize, hm::AlertFrameSize2, hm::OpenAlertForm,
                 hm::OpenView, hm::AlertSubmitted, hm::ShortcutContext, hm::WatchlistsLoaded, hm::LinkData,
                 hm::FetchFields, hm::WithdrawField, hm::RequestField, hm::InstrumentList, hm::ExchangeList,
                 hm::ProductList, hm::RemarkMessages, hm::AlertBoardRequest, hm::TextByKey, hm::MessageText,
                 hm::SystemParameter, hm::NoticeParameter, hm::SaveSetting, hm::DisplayMode, hm::WatchlistGroups520,
                 hm::WatchlistGroups521, hm::WatchlistRows522, hm::WatchlistList, hm::SaveWatchlistNames,
                 hm::SaveUserWatchlist, hm::RenameWatchlist, hm::SaveKeldoWatchlist, hm::LinkedInstrument,
                 hm::LinkModeFlag, hm::PriceViewRequest413, hm::PriceViewRequest553, hm::Watchlist606,
                 hm::Watchlist622, hm::CompactLayout, hm::FindByChartCode, hm::FindByCode, hm::MarketInfo,
                 hm::ExchangeEnabled, hm::Alert701, hm::Alert702, hm::Alert703, hm::Alert704, hm::Alert705,
                 hm::PriceBands, hm::AltStatus, hm::SettingsChanged, hm::TabMoved2700, hm::TabMoved2701,
                 hm::Sectors})
    EXPECT_NE(table.Find(m), nullptr) << "request " << m;
}
