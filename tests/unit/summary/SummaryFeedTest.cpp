// The page feed on its own: "TRADEDATA" texts into lines, header fields,
// registrations, and the recount with its page-count limit.
#include <gtest/gtest.h>

#include "SummaryFixture.h"

namespace summarytest {
namespace {

struct SummaryFeedTest : ::testing::Test {
  mvtest::ScriptedHost host;  // application and virtual clock
  const JInstrumentUnderlying ins = Instrument(1, FreshCode("FEED"), "SGX");
  const InstrumentKey key = InstrumentKey{1, hv::Widen(ins.instrumentCode)};

  // The instrument is wanted (its header record exists); the queue starts empty.
  void SetUp() override {
    summary::RegisterPage(key, 1, host.clock.Now());
    addon::SummaryPageFeed::Instance().Reset();
  }
  void TearDown() override { addon::SummaryPageFeed::Instance().Reset(); }

  summary::Applied Apply(const std::string& field, const std::string& value, int param = 1) {
    FieldUpdate u{ins.productId, ins.instrumentCode, field, value, param, 3};
    return summary::ApplyUpdate(u, host.clock.Now());
  }
  SummaryLineRecord Line(int line) {
    SummaryLineRecord r;
    EXPECT_TRUE(summary::ReadLine(key, line, r)) << "line " << line;
    return r;
  }
};

TEST_F(SummaryFeedTest, Parse_ItemsLandOnTheirLinesTotalsFirstOrLast) {
  // Page 2 opening with the totals: the second item is line 42, not 41.
  auto items = summary::ParsePage(L"TOTALS:|5|500|200||300;10.50|2|200|100|x|100;10.40|3|300|100||200", 2);
  ASSERT_EQ(items.size(), 3u);
  EXPECT_EQ(items[0].line, summary::kTotalsLine);
  EXPECT_EQ(items[0].price, L"");
  EXPECT_EQ(items[1].line, 42);
  EXPECT_EQ(items[1].price, L"10.50");
  EXPECT_EQ(items[1].trades, L"2");
  EXPECT_EQ(items[1].volume, L"200");
  EXPECT_EQ(items[1].bid, L"100");
  EXPECT_EQ(items[1].ask, L"100") << "field 4 is not used";
  EXPECT_EQ(items[2].line, 43);

  // An empty price is the totals too; a short item is dropped but keeps its place.
  items = summary::ParsePage(L"9.9|1|2;9.8|1|100|50||50;|7|700|300||400", 1);
  ASSERT_EQ(items.size(), 2u);
  EXPECT_EQ(items[0].line, 2);
  EXPECT_EQ(items[1].line, summary::kTotalsLine);
  EXPECT_EQ(items[1].ask, L"400");

  EXPECT_TRUE(summary::ParsePage(L"", 1).empty());
  EXPECT_TRUE(summary::ParsePage(L"garbage", 3).empty());
}

TEST_F(SummaryFeedTest, Apply_LinesAndTotalsIntoTheStoreHeaderFieldsApart) {
  EXPECT_EQ(Apply("TRADEDATA", "TOTALS:|5|500|200||300;10.5|2|200|100||100", 2), summary::Applied::Lines);
  const SummaryLineRecord line = Line(42);
  EXPECT_EQ(line[SummaryLineLayout::Price].text, L"10.500");
  EXPECT_EQ(line[SummaryLineLayout::Vol].value, 200.0);
  const SummaryLineRecord totals = Line(summary::kTotalsLine);
  EXPECT_EQ(totals[SummaryLineLayout::Price].text, L"") << "the totals line has no price";
  EXPECT_EQ(totals[SummaryLineLayout::Tradable].value, 5.0);
  EXPECT_EQ(totals[SummaryLineLayout::Ask].value, 300.0);
  SummaryLineRecord none;
  EXPECT_FALSE(summary::ReadLine(key, 41, none));
  EXPECT_EQ(SummaryLineStore::Instance().PendingCount(), 0u) << "created lines are not requests";

  EXPECT_EQ(Apply("PAGECOUNT", "2.00"), summary::Applied::Header);
  EXPECT_EQ(summary::PageCount(key), 2);
  EXPECT_EQ(Apply("QUOTE_LIST", "17"), summary::Applied::Nothing);
  EXPECT_EQ(Apply("NOSUCHFIELD", "1"), summary::Applied::Nothing);
  // Values of an instrument nobody registered are dropped, as in every store.
  const FieldUpdate stranger{1, FreshCode("NONE"), "TRADEDATA", Item("1.0", 1, 1, 1, 0), 1, 3};
  EXPECT_EQ(summary::ApplyUpdate(stranger, host.clock.Now()), summary::Applied::Nothing);
  SummaryLineRecord none2;
  EXPECT_FALSE(summary::ReadLine(InstrumentKey{1, hv::Widen(stranger.instrumentCode)}, 1, none2));
  // Lines of a page outside 1..99 are not stored.
  EXPECT_EQ(Apply("TRADEDATA", "9.0|1|1|1||1", 100), summary::Applied::Nothing);
  EXPECT_EQ(SummaryHeaderStore::Instance().PendingCount(), 0u);
}

TEST_F(SummaryFeedTest, Apply_AnOversizedPageKeepsNoLineBeyondTheLast) {
  // 200,000 items on page 99, whose first line (3921) is past the last one shown (999);
  // before, each became a line record, and item 96,079 wrote into the totals (line 99999).
  std::vector<std::string> items(200000, Item("1.5", 1, 1, 1, 0));
  const std::size_t before = SummaryLineStore::Instance().Size();
  EXPECT_EQ(Apply("TRADEDATA", Join(items), 99), summary::Applied::Nothing);
  EXPECT_EQ(SummaryLineStore::Instance().Size(), before);
  // Item 96,079 of page 99 would be line 99999, the totals' number: not the totals.
  SummaryLineRecord none;
  EXPECT_FALSE(summary::ReadLine(key, summary::kTotalsLine, none));
  // 2,000 items and the totals on page 1: lines 1..999, the totals, nothing past them.
  items.resize(2000);
  items.push_back("TOTALS:|9|9|9||9");
  EXPECT_EQ(Apply("TRADEDATA", Join(items), 1), summary::Applied::Lines);
  EXPECT_EQ(SummaryLineStore::Instance().Size(), before + summary::kMaxLines + 1);
  EXPECT_EQ(Line(summary::kTotalsLine)[SummaryLineLayout::Tradable].value, 9.0);
  SummaryLineRecord beyond;
  EXPECT_TRUE(summary::ReadLine(key, summary::kMaxLines, beyond));
  EXPECT_FALSE(summary::ReadLine(key, summary::kMaxLines + 1, beyond));
}

TEST_F(SummaryFeedTest, Apply_UnchangedLinesKeepTheirMarksChangedOnesAreMarked) {
  Apply("TRADEDATA", Join({Item("10.5", 2, 200, 100, 100), Item("10.4", 1, 50, 0, 50)}));
  host.clock.Advance(100);
  // A new trade at 10.4: the page arrives whole again.
  Apply("TRADEDATA", Join({Item("10.5", 2, 200, 100, 100), Item("10.4", 2, 150, 100, 50)}));
  EXPECT_EQ(Line(2)[SummaryLineLayout::Vol].mark, kMarkUp);
  EXPECT_EQ(Line(2)[SummaryLineLayout::Ask].mark, kMarkNone);
  const std::uint64_t version = Line(1).version;
  host.clock.Advance(500);
  // The same page once more: nothing moves, the mark of line 2 stays.
  EXPECT_EQ(Apply("TRADEDATA", Join({Item("10.5", 2, 200, 100, 100), Item("10.4", 2, 150, 100, 50)})),
            summary::Applied::Nothing);
  EXPECT_EQ(Line(1).version, version);
  EXPECT_EQ(Line(2)[SummaryLineLayout::Vol].mark, kMarkUp);
  SummaryLineStore::Instance().ExpireMarks(host.clock.Now() + 1500);
  EXPECT_EQ(Line(2)[SummaryLineLayout::Vol].mark, kMarkNone);
}

TEST_F(SummaryFeedTest, Recount_StopsAtTheGapAndAtThePageCountLimit) {
  EXPECT_EQ(summary::Recount(InstrumentKey{1, L""}).filled, 0);
  summary::Extent e = summary::Recount(key);
  EXPECT_EQ(e.filled, 0);
  EXPECT_GT(e.newestStamp, 0u) << "the header exists";

  // 85 lines over three pages, no header yet: limit 999.
  Apply("TRADEDATA", Lines(1, 40), 1);
  Apply("TRADEDATA", Lines(41, 80), 2);
  Apply("TRADEDATA", Lines(81, 85), 3);
  e = summary::Recount(key);
  EXPECT_EQ(e.filled, 85);
  EXPECT_EQ(summary::LineLimit(key), 999);
  // A page count of 2 limits to 80 lines although more are stored.
  Apply("PAGECOUNT", "2");
  const summary::Extent limited = summary::Recount(key);
  EXPECT_EQ(limited.filled, 80);
  EXPECT_NE(limited.newestStamp, e.newestStamp) << "the header changed";
  Apply("PAGECOUNT", "3");
  EXPECT_EQ(summary::Recount(key).filled, 85);
}

TEST_F(SummaryFeedTest, Recount_AMissingLineEndsTheCount) {
  // Page 1 with a short (dropped) third item: lines 1, 2 and 4 are stored.
  Apply("TRADEDATA", Join({Item("9.9", 1, 1, 1, 0), Item("9.8", 1, 1, 0, 1), "9.7|1", Item("9.6", 1, 1, 1, 0)}));
  EXPECT_EQ(summary::Recount(key).filled, 2);
  SummaryLineRecord fourth;
  EXPECT_TRUE(summary::ReadLine(key, 4, fourth));
}

TEST_F(SummaryFeedTest, Register_QueuesEachPageOnceAndCreatesTheHeader) {
  const InstrumentKey key{1, hv::Widen(FreshCode("REG"))};
  SummaryHeaderRecord header;
  EXPECT_FALSE(SummaryHeaderStore::Instance().Peek(key, header));
  summary::RegisterPage(key, 1, host.clock.Now());
  summary::RegisterPage(key, 1, host.clock.Now());
  summary::RegisterPage(key, 2, host.clock.Now());
  summary::RegisterPage(key, 0, host.clock.Now());
  summary::RegisterPage(key, 100, host.clock.Now());
  summary::RegisterPage(InstrumentKey{1, L""}, 1, host.clock.Now());
  const auto pending = addon::SummaryPageFeed::Instance().TakePending();
  ASSERT_EQ(pending.size(), 2u);
  EXPECT_EQ(pending[0], (addon::SummaryPageFeed::Pending{key, 1}));
  EXPECT_EQ(pending[1], (addon::SummaryPageFeed::Pending{key, 2}));
  EXPECT_EQ(addon::SummaryPageFeed::Instance().PendingCount(), 0u);
  EXPECT_TRUE(SummaryHeaderStore::Instance().Peek(key, header));
  EXPECT_EQ(SummaryHeaderStore::Instance().PendingCount(), 0u);

  EXPECT_TRUE(summary::IsSummaryParam(3, 1));
  EXPECT_TRUE(summary::IsSummaryParam(3, 99));
  EXPECT_TRUE(summary::IsSummaryParam(3, 99999));
  EXPECT_FALSE(summary::IsSummaryParam(3, 0));
  EXPECT_FALSE(summary::IsSummaryParam(3, 100));
  EXPECT_FALSE(summary::IsSummaryParam(2, 1));
}

}  // namespace
}  // namespace summarytest
