#include <gtest/gtest.h>

#include "data/MarketDelayCache.h"
#include "data/MarketStores.h"
#include "data/ReferenceStores.h"

namespace {

class DepthStoreTest : public ::testing::Test {
 protected:
  void SetUp() override {
    JInstrumentUnderlying a;
    a.productId = 4;
    a.instrumentCode = "DDD";
    a.decimals = 2;
    list_ = {a};
    InstrumentMgr_ReadOnly().Fill(&list_);
  }
  std::vector<JInstrumentUnderlying> list_;
  DepthStore store_;
};

}  // namespace

TEST_F(DepthStoreTest, Update_PricesInInstrumentFormatCountsWhole) {
  const DepthKey lvl1{4, L"DDD", 1};
  const DepthKey lvl99{4, L"DDD", 99};
  store_.Get(lvl1, 0);
  store_.Get(lvl99, 0);
  store_.Update(lvl1, L"BUY", L"1,001.5", 10);
  store_.Update(lvl1, L"ORDS_BVOL", L"12", 10);
  store_.Update(lvl99, L"SELL", L"7", 10);
  DepthRecord r = store_.Get(lvl1, 20);
  EXPECT_EQ(r[DepthLayout::Buy].text, L"1001.50");
  EXPECT_EQ(r[DepthLayout::OrdsBVol].text, L"12");
  EXPECT_EQ(store_.Get(lvl99, 20)[DepthLayout::Sell].text, L"7.00");
  // Unknown instruments fall back to three decimals.
  const DepthKey other{4, L"ZZZ", 1};
  store_.Get(other, 0);
  store_.Update(other, L"BUY", L"2", 1);
  EXPECT_EQ(store_.Get(other, 1)[DepthLayout::Buy].text, L"2.000");

  store_.Update(lvl1, L"ORDS_BVOL", L"13", 100);
  r = store_.Get(lvl1, 100);
  EXPECT_EQ(r[DepthLayout::OrdsBVol].mark, kMarkChanged);
  store_.ExpireMarks(1599);
  EXPECT_EQ(store_.Get(lvl1, 1599)[DepthLayout::OrdsBVol].mark, kMarkChanged);
  store_.ExpireMarks(1600);
  EXPECT_EQ(store_.Get(lvl1, 1600)[DepthLayout::OrdsBVol].mark, kMarkNone);

  store_.Update(lvl1, L"BUY", L"1001.4", 2000);
  EXPECT_EQ(store_.Get(lvl1, 2000)[DepthLayout::Buy].mark, kMarkDown);
}

TEST_F(DepthStoreTest, Update_EmptyValueBlanksPriceAndMarksChanged) {
  const DepthKey k{4, L"DDD", 3};
  store_.Get(k, 0);
  store_.Update(k, L"BUY", L"10", 5);
  store_.Update(k, L"BVOL", L"300", 5);
  store_.ClearChanged();
  EXPECT_TRUE(store_.Update(k, L"BUY", L"", 50));
  DepthRecord r = store_.Get(k, 60);
  EXPECT_EQ(r[DepthLayout::Buy].text, L"");
  EXPECT_TRUE(r.changed);
  EXPECT_EQ(r.updatedAt, 50u);
  // An empty volume keeps its text but still tells the view to repaint.
  store_.ClearChanged();
  EXPECT_TRUE(store_.Update(k, L"BVOL", L"", 70));
  r = store_.Get(k, 80);
  EXPECT_EQ(r[DepthLayout::BVol].text, L"300");
  EXPECT_TRUE(r.changed);
  // The next price after a blank is a first value again: no mark.
  store_.Update(k, L"BUY", L"11", 90);
  r = store_.Get(k, 90);
  EXPECT_EQ(r[DepthLayout::Buy].text, L"11.00");
  EXPECT_EQ(r[DepthLayout::Buy].mark, kMarkNone);
  // Blanks only are an empty value too.
  EXPECT_TRUE(store_.Update(k, L"BUY", L" ", 92));
  EXPECT_EQ(store_.Get(k, 92)[DepthLayout::Buy].text, L"");
  // Non-finite text is not an empty value: nothing happens.
  store_.ClearChanged();
  EXPECT_FALSE(store_.Update(k, L"BUY", L"nan", 95));
  EXPECT_FALSE(store_.Get(k, 96).changed);
}

TEST(SalesSummaryStore_Formats, TotalValueWithoutDecimals) {
  SalesSummaryStore s;
  const InstrumentKey k{1, L"T"};
  s.Get(k, 0);
  s.Update(k, L"TOTALVALUE", L"1,234.56", 1);
  s.Update(k, L"HIGH", L"9.87654", 1);
  s.Update(k, L"TOTAL_VOLUME", L"500", 1);
  s.Update(k, L"PAGECOUNT", L"3", 1);
  s.Update(k, L"DTIME", L"20261206 10:00:00", 1);
  const auto r = s.Get(k, 2);
  EXPECT_EQ(r[SalesSummaryLayout::TotalValue].text, L"1235");
  EXPECT_EQ(r[SalesSummaryLayout::High].text, L"9.877");
  EXPECT_EQ(r[SalesSummaryLayout::TotalVolume].text, L"500.00");
  EXPECT_EQ(r[SalesSummaryLayout::PageCount].text, L"3.00");
  EXPECT_EQ(r[SalesSummaryLayout::DTime].text, L"20261206 10:00:00");
}

TEST(SummaryHeaderStore_Formats, CountIsAWholeNumber) {
  SummaryHeaderStore s;
  const InstrumentKey k{1, L"T"};
  s.Get(k, 0);
  s.Update(k, L"COUNT", L"1,250.9", 1);
  s.Update(k, L"WEIGHTED_AVG", L"10.123456", 1);
  s.Update(k, L"RATIO", L"0.5", 1);
  s.Update(k, L"LAST", L"10", 1);
  s.Update(k, L"AVG_TRADE_SIZE", L"99.5", 1);
  s.Update(k, L"PAGECOUNT", L"2", 1);
  EXPECT_FALSE(s.Update(k, L"QUOTE_LIST", L"1|2|3", 1));
  auto r = s.Get(k, 2);
  EXPECT_EQ(r[SummaryHeaderLayout::Count].text, L"1250");
  EXPECT_EQ(r[SummaryHeaderLayout::WeightedAvg].text, L"10.1235");
  EXPECT_EQ(r[SummaryHeaderLayout::Ratio].text, L"0.5000");
  EXPECT_EQ(r[SummaryHeaderLayout::Last].text, L"10.000");
  EXPECT_EQ(r[SummaryHeaderLayout::AvgTradeSize].text, L"99.500");
  EXPECT_EQ(r[SummaryHeaderLayout::PageCount].text, L"2.00");
  s.Update(k, L"COUNT", L"1251", 3);
  EXPECT_EQ(s.Get(k, 3)[SummaryHeaderLayout::Count].mark, kMarkUp);
  EXPECT_FALSE(s.Update(k, L"COUNT", L"1e30", 4));  // no whole number to show
  EXPECT_EQ(s.Get(k, 4)[SummaryHeaderLayout::Count].text, L"1251");
}

TEST(SummaryLineStore_Formats, ThreeDecimalsAndPriceMarks) {
  SummaryLineStore s;
  const LineKey k{1, L"T", 99999};
  s.Get(k, 0);
  s.Update(k, L"VOL", L"1,000", 1);
  s.Update(k, L"VOL", L"900", 2);
  const auto r = s.Get(k, 2);
  EXPECT_EQ(r[SummaryLineLayout::Vol].text, L"900.000");
  EXPECT_EQ(r[SummaryLineLayout::Vol].mark, kMarkDown);
  // A withdrawn value reads as 0.
  EXPECT_TRUE(s.Update(k, L"VOL", L"", 3));
  EXPECT_EQ(s.Get(k, 3)[SummaryLineLayout::Vol].text, L"0.000");
}

TEST(SalesPageStore_Recount, OneLockScanSeesFilledPagesAndNewestVersion) {
  SalesPageStore s;
  const std::wstring code = L"T";
  for (int p : {99998, 1, 2, 3}) s.Get(PageKey{1, code, p}, 0);
  s.Update(PageKey{1, code, 99998}, L"TRADEDATA", L"t|1.0|100|1|x|3;t|1.0|100|1|x|2", 10);
  s.Update(PageKey{1, code, 1}, L"TRADEDATA", L"t|1.0|100|1|x|1", 11);
  const auto seen = s.Version();
  struct Result {
    int last = -1;
    std::uint64_t newest = 0;
  };
  auto recount = [&] {
    return s.Read([&](const SalesPageStore::Reader& rd) {
      Result res;
      PageKey k{1, code, 0};
      for (int i = 0; i < 1000; ++i) {
        k.Page = i == 0 ? 99998 : i;
        if (const auto* r = rd.Find(k); r && !r->cells[0].text.empty()) {
          res.last = i;
          res.newest = std::max(res.newest, r->version);
        }
      }
      return res;
    });
  };
  Result r = recount();
  EXPECT_EQ(r.last, 1);
  EXPECT_EQ(r.newest, seen);
  EXPECT_EQ(s.PendingCount(), 4u);  // scanning queued nothing
  s.Update(PageKey{1, code, 3}, L"TRADEDATA", L"x", 12);
  EXPECT_GT(s.Version(), seen);
  r = recount();
  EXPECT_EQ(r.last, 3);
  EXPECT_GT(r.newest, seen);
  SalesPageRecord copy;
  EXPECT_FALSE(s.Peek(PageKey{1, code, 500}, copy));
  EXPECT_EQ(s.PendingCount(), 4u);
}

TEST(MarketDelayCache_Lookup, MissIsEmptyAndZeroDelayIsAnEmptyHit) {
  auto& c = MarketDelayCache::Instance();
  std::wstring t = L"stale";
  EXPECT_FALSE(c.Find(1, L"XSES", t));
  EXPECT_EQ(t, L"");
  EXPECT_EQ(c.Lookup(1, L"XSES"), L"");
  c.SetDelay(1, L"XSES", 15);
  EXPECT_EQ(c.Lookup(1, L"XSES"), L"15");
  EXPECT_EQ(c.Lookup(2, L"XSES"), L"");
  c.SetDelay(1, L"XSES", 0);
  EXPECT_TRUE(c.Find(1, L"XSES", t));
  EXPECT_EQ(t, L"");
  c.Set(1, L"XSES", L"20 min");
  EXPECT_EQ(c.Lookup(1, L"XSES"), L"20 min");
}

TEST_F(DepthStoreTest, ApplyFieldUpdate_LevelFromParamAndInvalidUtf8Code) {
  const std::string code("D\xffX", 3);
  const DepthKey k{4, L"D\uFFFDX", 7};
  store_.Get(k, 0);
  FieldUpdate u;
  u.productId = 4;
  u.instrumentCode = code;
  u.fieldName = "SVOL";
  u.value = "1,500";
  u.param = 7;
  u.kind = 1;
  EXPECT_TRUE(ApplyFieldUpdate(store_, u, 3));
  EXPECT_EQ(store_.Get(k, 4)[DepthLayout::SVol].text, L"1500");
}
