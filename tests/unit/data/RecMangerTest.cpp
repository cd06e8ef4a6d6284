#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "data/ReferenceStores.h"

namespace {

JInstrumentUnderlying Ins(std::int64_t pid, const char* code, const char* name = "n", int decimals = 2) {
  JInstrumentUnderlying r;
  r.productId = pid;
  r.instrumentCode = code;
  r.instrumentName = name;
  r.symbol = std::string("S") + code;
  r.exchangeCode = "XSES";
  r.decimals = decimals;
  return r;
}

JProduct Product(std::int64_t id, const char* type) {
  JProduct p;
  p.productId = id;
  p.productType = type;
  return p;
}

// Stand-ins for the records the price and alert views bring.
struct TestWatchlist {
  std::int32_t WatchlistID = 0;
  std::wstring name;
  std::vector<InstrumentKey> items;
};
struct TestAlert {
  std::int32_t alertId = -1;
  double threshold = 0;
};
struct NamedByKey {
  std::wstring title;
};
std::wstring RecordKey(const NamedByKey& r) { return L"k:" + r.title; }

}  // namespace

TEST(RecManger_Find, FalseBeforeAnyFill) {
  JProduct out;
  EXPECT_FALSE(ProductMgr().Find(1, out));
  EXPECT_FALSE(ProductMgr().IsLoaded());
  EXPECT_EQ(ProductMgr().Version(), 0);
  JInstrumentUnderlying ins;
  EXPECT_FALSE(InstrumentMgr_ReadOnly().Find(InstrumentKey{1, L"A"}, ins));
  EXPECT_FALSE(SymbolMgr_ReadOnly().IsLoaded());
}

TEST(RecManger_Fill, DuplicateKeysKeepBothRecordsAndIndexTheLater) {
  auto& pm = ProductMgr();
  pm.Fill({Product(1, "ES"), Product(2, "CFD"), Product(1, "FUT")});
  EXPECT_TRUE(pm.IsLoaded());
  EXPECT_EQ(pm.Version(), 1);
  ASSERT_EQ(pm.Records().size(), 3u);
  JProduct out;
  ASSERT_TRUE(pm.Find(1, out));
  EXPECT_EQ(out.productType, "FUT");
  EXPECT_EQ(pm.IndexOf(1), 2);
  EXPECT_EQ(pm.Records()[0].productType, "ES");
}

TEST(RecManger_Put, ExistingKeyOverwritesInPlace) {
  auto& em = ExchangeMgr();
  JExchangeList a{"XSES", "SG", "Singapore", 1};
  JExchangeList b{"XHKG", "HK", "Hong Kong", 1};
  EXPECT_TRUE(em.Put(a));
  EXPECT_TRUE(em.Put(b));
  a.marketName = "SGX";
  EXPECT_FALSE(em.Put(a));
  ASSERT_EQ(em.Records().size(), 2u);
  EXPECT_EQ(em.Records()[0].marketName, "SGX");
  EXPECT_EQ(em.IndexOf("XSES"), 0);
  EXPECT_EQ(em.IndexOf("XHKG"), 1);
  EXPECT_FALSE(em.IsLoaded());  // only a fill loads a store
}

TEST(RecManger_Fill, ShorterSecondFillDropsOldRecordsAndKeys) {
  auto& im = InstrumentMgr();
  im.Fill({Ins(1, "A"), Ins(1, "B"), Ins(2, "C")});
  im.Fill({Ins(2, "C", "again")});
  EXPECT_EQ(im.Version(), 2);
  ASSERT_EQ(im.Records().size(), 1u);
  JInstrumentUnderlying out;
  EXPECT_FALSE(im.Find(InstrumentKey{1, L"A"}, out));
  EXPECT_FALSE(im.Find(InstrumentKey{1, L"B"}, out));
  ASSERT_TRUE(im.Find(InstrumentKey{2, L"C"}, out));
  EXPECT_EQ(out.instrumentName, "again");
}

TEST(RecManger_Erase, KeepsOrderAndIndex) {
  auto& im = InstrumentMgr();
  im.Fill({Ins(1, "A"), Ins(1, "B"), Ins(1, "C")});
  EXPECT_TRUE(im.Erase(InstrumentKey{1, L"A"}));
  EXPECT_FALSE(im.Erase(InstrumentKey{1, L"A"}));
  ASSERT_EQ(im.Records().size(), 2u);
  EXPECT_EQ(im.IndexOf(InstrumentKey{1, L"C"}), 1);
}

TEST(RecManger_ReadOnly, IndexesTheOwnersListWithoutCopy) {
  std::vector<JInstrumentUnderlying> host{Ins(1, "A"), Ins(1, "B"), Ins(2, "A")};
  auto& ro = InstrumentMgr_ReadOnly();
  ro.Fill(&host);
  EXPECT_EQ(&ro.Records(), &host);
  EXPECT_EQ(ro.FindPtr(InstrumentKey{2, L"A"}), &host[2]);
  // A later, shorter list from the terminal replaces the index.
  std::vector<JInstrumentUnderlying> next{Ins(3, "Z")};
  ro.Fill(&next);
  EXPECT_EQ(ro.Version(), 2);
  EXPECT_EQ(ro.FindPtr(InstrumentKey{1, L"A"}), nullptr);
  EXPECT_NE(ro.FindPtr(InstrumentKey{3, L"Z"}), nullptr);
  ro.Fill(nullptr);
  EXPECT_TRUE(ro.Records().empty());
}

TEST(SymbolMgr_ReadOnly, FollowsEachInstrumentFill) {
  std::vector<JInstrumentUnderlying> host{Ins(1, "A"), Ins(1, "B")};
  InstrumentMgr_ReadOnly().Fill(&host);
  JInstrumentUnderlying out;
  ASSERT_TRUE(SymbolMgr_ReadOnly().Find(SymbolKey{1, L"SB", L"XSES"}, out));
  EXPECT_EQ(out.instrumentCode, "B");
  std::vector<JInstrumentUnderlying> next{Ins(1, "C")};
  InstrumentMgr_ReadOnly().Fill(&next);
  EXPECT_FALSE(SymbolMgr_ReadOnly().Find(SymbolKey{1, L"SB", L"XSES"}, out));
  EXPECT_TRUE(SymbolMgr_ReadOnly().Find(SymbolKey{1, L"SC", L"XSES"}, out));
}

TEST(InstrumentDecimals_Lookup, ReadOnlyListFirstThenAddedInstruments) {
  std::vector<JInstrumentUnderlying> host{Ins(1, "A", "n", 4)};
  InstrumentMgr_ReadOnly().Fill(&host);
  InstrumentMgr().Put(Ins(1, "B", "n", 1));
  EXPECT_EQ(InstrumentDecimals(InstrumentKey{1, L"A"}), 4);
  EXPECT_EQ(InstrumentDecimals(InstrumentKey{1, L"B"}), 1);
  EXPECT_EQ(InstrumentDecimals(InstrumentKey{1, L"C"}), -1);
}

TEST(WatchlistMgr_Generic, FourSeparateStoresKeyedByName) {
  auto& user = WatchlistMgr<TestWatchlist>(WatchlistFamily::User);
  auto& world = WatchlistMgr<TestWatchlist>(WatchlistFamily::WorldIndex);
  EXPECT_NE(&user, &world);
  EXPECT_EQ(&user, &WatchlistMgr<TestWatchlist>(WatchlistFamily::User));
  user.Fill({TestWatchlist{1, L"Tech", {}}, TestWatchlist{2, L"Banks", {InstrumentKey{1, L"A"}}}});
  TestWatchlist out;
  ASSERT_TRUE(user.Find(L"Banks", out));
  EXPECT_EQ(out.WatchlistID, 2);
  EXPECT_FALSE(world.Find(L"Banks", out));

  auto& named = WatchlistMgr<NamedByKey>(WatchlistFamily::Keldo);
  named.Put(NamedByKey{L"x"});
  EXPECT_EQ(named.IndexOf(L"k:x"), 0);

  auto& alerts = PriceAlertMgr<TestAlert>();
  alerts.Fill({TestAlert{7, 1.5}, TestAlert{9, 2.5}});
  TestAlert a;
  ASSERT_TRUE(alerts.Find(9, a));
  EXPECT_EQ(a.threshold, 2.5);
}
