// The store-feed vocabulary on stores of its own (no process-wide state):
// registering interest, taking what is pending, reading without creating,
// change stamps.
#include <gtest/gtest.h>

#include <set>

#include "addon/Feeds.h"

namespace {

int TwoDecimals(const InstrumentKey&) { return 2; }

const InstrumentKey kD05{1, L"D05"};
const InstrumentKey kZ74{1, L"Z74"};
const InstrumentKey kC6L{2, L"C6L"};

TEST(StoreFeed_Register, MakesTheRecordsTheAnswersNeedAndQueuesEachInterestOnce) {
  DepthStore store(&TwoDecimals);
  addon::DepthFeed feed(store);
  feed.Register(kD05, 5, 0);
  EXPECT_EQ(store.Size(), 5u);
  EXPECT_EQ(store.PendingCount(), 0u);  // the feed asks, not the store's own list
  feed.Register(kD05, 5, 0);
  EXPECT_EQ(feed.PendingCount(), 1u);
  feed.Register(kD05, 250, 0);  // at most 99 levels
  feed.Register(InstrumentKey{1, L""}, 5, 0);  // no code: nothing
  EXPECT_EQ(store.Size(), 99u);
  const auto pending = feed.TakePending();
  ASSERT_EQ(pending.size(), 2u);
  EXPECT_EQ(pending[0].key, kD05);
  EXPECT_EQ(pending[0].params, 5);
  EXPECT_EQ(pending[1].params, 99);
  EXPECT_EQ(feed.PendingCount(), 0u);
  // An update lands only in a record that exists.
  EXPECT_TRUE(store.Update(DepthKey{1, L"D05", 99}, L"BUY", L"9.5", 10));
  EXPECT_FALSE(store.Update(DepthKey{1, L"D05", 100}, L"BUY", L"9.5", 10));
}

TEST(StoreFeed_TakePending, ShownSetTakesOnlyItsInstrumentsAndAskingAgainQueuesAgain) {
  QuoteStore store(&TwoDecimals);
  addon::QuoteFeed feed(store);
  for (const auto& key : {kD05, kZ74, kC6L}) feed.Register(key, {}, 0);
  const std::set<InstrumentKey> shown{kZ74};
  const auto taken = feed.TakePending(shown);
  ASSERT_EQ(taken.size(), 1u);
  EXPECT_EQ(taken[0].key, kZ74);
  EXPECT_EQ(feed.PendingCount(), 2u);  // the others wait for their rows to show
  feed.TakePending();
  // A silent instrument registered again is asked again; its record stays.
  feed.Register(kZ74, {}, 0);
  ASSERT_EQ(feed.PendingCount(), 1u);
  EXPECT_EQ(store.Size(), 3u);
}

TEST(StoreFeed_Read, NeverCreatesAndStampsGrowWithEveryChange) {
  DepthStore store(&TwoDecimals);
  addon::DepthFeed feed(store);
  DepthRecord record;
  QuoteCell cell;
  EXPECT_FALSE(feed.Read(DepthKey{1, L"D05", 1}, record));
  EXPECT_FALSE(feed.ReadCell(DepthKey{1, L"D05", 1}, DepthLayout::Buy, cell));
  EXPECT_EQ(feed.NewestStamp(addon::DepthLevels(kD05, 1, 99)), 0u);
  EXPECT_EQ(store.Size(), 0u);

  feed.Register(kD05, 3, 0);
  const std::uint64_t registered = feed.NewestStamp(addon::DepthLevels(kD05, 1, 3));
  store.Update(DepthKey{1, L"D05", 1}, L"BUY", L"9.5", 5);
  store.Update(DepthKey{1, L"D05", 2}, L"BUY", L"9.4", 6);
  const std::uint64_t second = feed.NewestStamp(addon::DepthLevels(kD05, 1, 3));
  EXPECT_GT(second, registered);
  ASSERT_TRUE(feed.ReadCell(DepthKey{1, L"D05", 2}, DepthLayout::Buy, cell));
  EXPECT_EQ(cell.text, L"9.40");
  EXPECT_FALSE(feed.ReadCell(DepthKey{1, L"D05", 2}, 6, cell));  // no such field

  // A run stops at the first record the test refuses (level 3 has no price)
  // or that does not exist.
  const auto run = feed.LeadingRun(addon::DepthLevels(kD05, 1, 99),
                                   [](const DepthRecord& r) { return !r[DepthLayout::Buy].text.empty(); });
  EXPECT_EQ(run.count, 2);
  EXPECT_EQ(run.newestStamp, second);
  EXPECT_EQ(store.Size(), 3u);
}

}  // namespace
