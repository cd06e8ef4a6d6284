// The watchlist model: replies into the four stores, the three texts handed to
// the host for saving (read back by the terminal's own reader), the editing
// rules.
#include <gtest/gtest.h>

#include "PriceFixture.h"
#include "terminal/host/WatchlistXml.h"

namespace pricetest {
namespace {

struct WatchlistModel : ::testing::Test {
  std::vector<JInstrumentUnderlying> instruments{
      Instrument(1, "D05", "SGX"), Instrument(1, "O39", "SGX"), Instrument(1, "[KELDO]C6L", "SGX"),
      Instrument(1, "0005", "HKEX"), Instrument(1, "HSI", "WIDX"), Instrument(1, "DJI", " WIDX ")};
  std::vector<JExchangeList> exchanges{{"SGX", "Singapore", "Singapore Exchange", 1}};

  void SetUp() override {
    ResetPriceState();
    instruments[2].displayCode = "C6L-D";
    instruments[0].displayCode = "D05.SI";
    InstrumentMgr_ReadOnly().Fill(&instruments);
    ExchangeMgr().Fill(exchanges);
  }
  void TearDown() override { InstrumentMgr_ReadOnly().Fill(nullptr); }

  static std::vector<std::wstring> Names(const WatchlistStoreT& store) {
    std::vector<std::wstring> out;
    for (const auto& w : store.Records()) out.push_back(w.name);
    return out;
  }
};

TEST_F(WatchlistModel, UserRows_GroupByNameFirstIdWinsAndCutAtTheLimit) {
  std::vector<JWatchlistRow> rows;
  for (int i = 0; i < 600; ++i) rows.push_back(Row(7, "Big", 1, "C" + std::to_string(i)));
  rows.push_back(Row(8, "Small", -5, "NEG"));
  rows.push_back(Row(99, "Small", 1, "X"));  // a later id of the same name is ignored
  rows.push_back(Row(9, "Empty", 0, ""));     // a watchlist without items
  watchlist::ApplyUserRows(rows, 500);

  const auto& lists = UserWatchlistStore().Records();
  ASSERT_EQ(Names(UserWatchlistStore()), (std::vector<std::wstring>{L"Big", L"Small", L"Empty"}));
  EXPECT_EQ(lists[0].items.size(), 500u);
  EXPECT_EQ(lists[0].items.back().InstrumentCode, L"C499");
  EXPECT_EQ(lists[1].WatchlistID, 8);
  EXPECT_EQ(lists[1].items.front().ProductID, -5);  // widened with its sign
  EXPECT_EQ(lists[1].items.size(), 2u);
  EXPECT_TRUE(lists[2].items.empty());
  // A second reply replaces everything.
  watchlist::ApplyUserRows({Row(1, "Only", 1, "D05")}, 500);
  EXPECT_EQ(Names(UserWatchlistStore()), (std::vector<std::wstring>{L"Only"}));
}

TEST_F(WatchlistModel, AcknowledgedIds_FillOnlyWatchlistsWithoutOne) {
  watchlist::ApplyUserRows({Row(5, "Kept", 1, "D05")}, 500);
  UserWatchlistStore().Put(WatchListDetail{0, L"New", {}});
  watchlist::ApplyAcknowledgedIds({{77, "Kept"}, {78, "New"}, {79, "Unknown"}});
  EXPECT_EQ(UserWatchlistStore().FindPtr(L"Kept")->WatchlistID, 5);
  EXPECT_EQ(UserWatchlistStore().FindPtr(L"New")->WatchlistID, 78);
  EXPECT_EQ(UserWatchlistStore().Records().size(), 2u);
}

TEST_F(WatchlistModel, Top30_NamesIdsTranslationAndUnknownInstrumentsLeftOut) {
  addon::SettingTextTable::Instance().Set("MKTEX", L"Top Gainers=TOPGAIN, GAIN;bad entry;A=B=C");
  JTop30Group sgx{"SGX", {{"TOPGAIN", {{1, "D05", "SGX"}, {1, "NOPE", "SGX"}}}, {"GAIN", {}}, {"TOPVOL", {}}}};
  JTop30Group hk{"HKEX", {{"TOPGAIN", {{1, "0005", "HKEX"}}}}};
  watchlist::ApplyTop30Groups({sgx, hk});
  const auto& lists = Top30WatchlistStore().Records();
  ASSERT_EQ(lists.size(), 4u);
  EXPECT_EQ(lists[0].name, L"SGX - Top Gainers");
  EXPECT_EQ(lists[0].WatchlistID, 0);
  EXPECT_EQ(lists[0].items, (std::vector<InstrumentKey>{{1, L"D05"}}));
  EXPECT_EQ(lists[2].name, L"SGX - TOPVOL");  // no translation: the key itself
  EXPECT_EQ(lists[2].WatchlistID, 2);
  EXPECT_EQ(lists[3].name, L"HKEX - Top Gainers");
  EXPECT_EQ(lists[3].WatchlistID, 1000);
  EXPECT_EQ(watchlist::TranslateListName(L"A"), L"");
}

TEST_F(WatchlistModel, KeldoRowsAndWorldIndices) {
  watchlist::ApplyKeldoRows({{501, "Brand", 1, "[KELDO]C6L", "SGX", 1}, {999, "Brand", 1, "D05", "SGX", 2},
                             {502, "Other", 0, "", "", 0}});
  ASSERT_EQ(Names(KeldoWatchlistStore()), (std::vector<std::wstring>{L"Brand", L"Other"}));
  EXPECT_EQ(KeldoWatchlistStore().Records()[0].WatchlistID, 501);
  EXPECT_EQ(KeldoWatchlistStore().Records()[0].items.size(), 2u);
  EXPECT_EQ(watchlist::KeldoReply().size(), 3u);

  watchlist::BuildWorldIndexList(instruments);
  const WatchListDetail* w = WorldIndexStore().FindPtr(L"STATIC_INDEX");
  ASSERT_NE(w, nullptr);
  EXPECT_EQ(w->WatchlistID, 1);
  EXPECT_EQ(w->items, (std::vector<InstrumentKey>{{1, L"HSI"}, {1, L"DJI"}}));
  // A list without indices leaves the store alone.
  watchlist::BuildWorldIndexList({Instrument(1, "D05", "SGX")});
  EXPECT_EQ(WorldIndexStore().FindPtr(L"STATIC_INDEX")->items.size(), 2u);
}

TEST_F(WatchlistModel, NamesText_SeqFromZeroAndEscapedNamesReadBackUnchanged) {
  const std::wstring odd = L"Fish & \"Chips\" <Asia> 'n' more";
  UserWatchlistStore().Fill(std::vector<WatchListDetail>{{11, L"First", {}}, {0, odd, {}}});
  const std::wstring text = watchlist::WatchlistNamesText(UserWatchlistStore());
  const std::wstring first =
      L"<watchlistmain><watchlistname WatchlistID=\"11\" WatchlistName=\"First\" SeqID=\"0\" /><watchlistname ";
  EXPECT_EQ(text.substr(0, first.size()), first);
  EXPECT_NE(text.find(L"SeqID=\"1\" /></watchlistmain>"), std::wstring::npos);
  std::vector<term::NameEntry> read;
  std::string error;
  ASSERT_TRUE(term::ParseWatchlistNames(text, read, error)) << error;
  ASSERT_EQ(read.size(), 2u);
  EXPECT_EQ(read[0].name, "First");
  EXPECT_EQ(read[0].seq, 0);
  EXPECT_EQ(hv::Widen(read[1].name), odd);
  EXPECT_EQ(read[1].seq, 1);
  EXPECT_EQ(read[1].id, 0);
}

TEST_F(WatchlistModel, UserItemText_SkipsItemsWithoutProductOrCodeLeavingSeqGaps) {
  const std::vector<InstrumentKey> items{{1, L"D05"}, {0, L"BAD"}, {1, L"A&B<\"C\">"}, {1, L""}};
  const std::wstring text = watchlist::UserItemText(items);
  EXPECT_EQ(text,
            L"<watchlistnames><watchlistname ProductID=\"1\" InstrumentCode=\"D05\" SeqID=\"1\" />"
            L"<watchlistname ProductID=\"1\" InstrumentCode=\"A&amp;B&lt;&quot;C&quot;&gt;\" SeqID=\"3\" />"
            L"</watchlistnames>");
  std::vector<term::ItemEntry> read;
  std::string error;
  ASSERT_TRUE(term::ParseUserItems(text, read, error)) << error;
  ASSERT_EQ(read.size(), 2u);
  EXPECT_EQ(read[1].instrumentCode, "A&B<\"C\">");
  EXPECT_EQ(read[1].seq, 3);
}

TEST_F(WatchlistModel, KeldoItemText_BrandCodeLosesItsTagOthersUseTheDisplayCode) {
  const std::vector<InstrumentKey> items{{1, L"[KELDO]C6L"}, {1, L"UNKNOWN"}, {1, L"D05"}, {1, L"0005"}};
  const std::wstring text = watchlist::KeldoItemText(items);
  EXPECT_EQ(text,
            L"<watchlistnames>"
            L"<watchlistname InstrumentCode=\"C6L\" Symbol=\"[KELDO]C6L\" Market=\"Singapore\" Exchange=\"SGX\" "
            L"SeqID=\"1\" ProductID=\"1\" />"
            L"<watchlistname InstrumentCode=\"D05.SI\" Symbol=\"D05\" Market=\"Singapore\" Exchange=\"SGX\" "
            L"SeqID=\"3\" ProductID=\"1\" />"
            L"<watchlistname InstrumentCode=\"0005\" Symbol=\"0005\" Market=\"\" Exchange=\"HKEX\" "
            L"SeqID=\"4\" ProductID=\"1\" />"
            L"</watchlistnames>");
  std::vector<term::ItemEntry> read;
  std::string error;
  EXPECT_TRUE(term::ParseBrandItems(text, read, error)) << error;
}

TEST_F(WatchlistModel, XmlEscape_EveryTextParsesWhateverTheName) {
  for (const std::wstring& name : {std::wstring(L"a&b"), std::wstring(L"<>"), std::wstring(L"\"'"),
                                  std::wstring(L"tab\there"), std::wstring(L"ctl\x01x"), std::wstring(L"\u00e9\u4e2d")}) {
    UserWatchlistStore().Fill(std::vector<WatchListDetail>{{1, name, {}}});
    std::vector<term::NameEntry> read;
    std::string error;
    ASSERT_TRUE(term::ParseWatchlistNames(watchlist::WatchlistNamesText(UserWatchlistStore()), read, error)) << error;
    ASSERT_EQ(read.size(), 1u);
    if (name.find(L'\x01') == std::wstring::npos) EXPECT_EQ(hv::Widen(read[0].name), name);
    else EXPECT_EQ(read[0].name, "ctl x");  // XML cannot carry it: a blank
  }
}

TEST_F(WatchlistModel, EditingRules) {
  UserWatchlistStore().Fill(std::vector<WatchListDetail>{
      {1, L"NewWatchlist1", {}}, {2, L"NewWatchlist3", {}}, {3, L"Banks", {{1, L"D05"}}}});
  EXPECT_EQ(watchlist::NextNewWatchlistName(UserWatchlistStore()), L"NewWatchlist2");

  using RC = watchlist::RenameCheck;
  EXPECT_EQ(watchlist::CheckRename(UserWatchlistStore(), 2, watchlist::Trim(L"  Banks ")), RC::Unchanged);
  EXPECT_EQ(watchlist::CheckRename(UserWatchlistStore(), 2, watchlist::Trim(L" NewWatchlist1\t")), RC::Duplicate);
  EXPECT_EQ(watchlist::CheckRename(UserWatchlistStore(), 2, watchlist::Trim(L" \t ")), RC::Empty);
  EXPECT_EQ(watchlist::CheckRename(UserWatchlistStore(), 2, L"banks"), RC::Accepted);  // case matters

  ASSERT_TRUE(watchlist::RenameAt(UserWatchlistStore(), 2, L"Lenders"));
  EXPECT_EQ(UserWatchlistStore().Records()[2].WatchlistID, 3);
  EXPECT_EQ(UserWatchlistStore().Records()[2].items.size(), 1u);
  EXPECT_EQ(UserWatchlistStore().IndexOf(L"Banks"), -1);

  watchlist::Reorder(UserWatchlistStore(), {L"Lenders", L"NewWatchlist1", L"gone"});
  EXPECT_EQ(Names(UserWatchlistStore()), (std::vector<std::wstring>{L"Lenders", L"NewWatchlist1", L"NewWatchlist3"}));
  ASSERT_TRUE(watchlist::RemoveAt(UserWatchlistStore(), 0));
  EXPECT_EQ(Names(UserWatchlistStore()), (std::vector<std::wstring>{L"NewWatchlist1", L"NewWatchlist3"}));

  std::wstring refusal;
  EXPECT_TRUE(watchlist::IsKeldoRefused(L"TSE,NYSE,Not here.", L"NYSE", &refusal));
  EXPECT_EQ(refusal, L"Not here.");
  EXPECT_FALSE(watchlist::IsKeldoRefused(L"TSE,NYSE,Not here.", L"SGX", nullptr));
  EXPECT_FALSE(watchlist::IsKeldoRefused(L"", L"TSE", nullptr));
}

}  // namespace
}  // namespace pricetest
