#include <gtest/gtest.h>

#include "RecordingView.h"
#include "terminal/host/WatchlistXml.h"

namespace {

// The texts as the price view writes them: attribute values escaped.
std::wstring Esc(const std::string& s) {
  std::wstring out;
  for (wchar_t c : hv::Widen(s)) {
    if (c == L'&') out += L"&amp;";
    else if (c == L'"') out += L"&quot;";
    else if (c == L'<') out += L"&lt;";
    else if (c == L'>') out += L"&gt;";
    else out.push_back(c);
  }
  return out;
}

std::wstring NamesText(const std::vector<std::pair<int, std::string>>& lists) {
  std::wstring s = L"<watchlistmain>";
  for (std::size_t i = 0; i < lists.size(); ++i)
    s += L"<watchlistname WatchlistID=\"" + std::to_wstring(lists[i].first) + L"\" WatchlistName=\"" + Esc(lists[i].second) +
         L"\" SeqID=\"" + std::to_wstring(i) + L"\" />";
  return s + L"</watchlistmain>";
}

std::wstring ItemsText(const std::vector<std::pair<std::int64_t, std::string>>& items) {
  std::wstring s = L"<watchlistnames>";
  for (std::size_t i = 0; i < items.size(); ++i)
    s += L"<watchlistname ProductID=\"" + std::to_wstring(items[i].first) + L"\" InstrumentCode=\"" + Esc(items[i].second) +
         L"\" SeqID=\"" + std::to_wstring(i + 1) + L"\" />";
  return s + L"</watchlistnames>";
}

std::vector<std::pair<int, std::string>> Current(RecordingView& v) {
  v.Send(hm::WatchlistList);
  std::vector<std::pair<int, std::string>> out;
  for (const auto& r : v.notes.back().rows610)
    if (out.empty() || out.back().first != r.watchlistId) out.push_back({r.watchlistId, r.watchlistName});
  return out;
}

}  // namespace

TEST(HostWatchlists, RoundTripThroughTheXmlTextsKeepsNamesWithQuotesAndAmpersands) {
  term::MemoryHostStore store;
  const std::string odd = "Fish & \"Chips\" <Asia>";
  std::int32_t newId = 0;
  std::vector<std::pair<std::int64_t, std::string>> items;
  {
    Harness h(42, &store);
    RecordingView& v = h.View("CPriceViewAdv");
    RecordingView& other = h.View("CPriceViewAdv");
    auto lists = Current(v);
    ASSERT_EQ(lists.size(), 3u);
    // Create (id 0), rename the second, drop the third, reorder.
    std::vector<std::pair<int, std::string>> next = {{0, odd}, lists[0], {lists[1].first, "Renamed"}};
    WatchlistFeedback names{0, NamesText(next)};
    v.Send(hm::SaveWatchlistNames, ToLParam(&names));
    const auto acks = v.Of(hm::SaveWatchlistNames);
    ASSERT_EQ(acks.size(), 1u) << "611 answered with the ids";
    ASSERT_EQ(acks[0]->rows611.size(), 3u);
    EXPECT_EQ(acks[0]->rows611[0].watchlistName, odd);
    newId = acks[0]->rows611[0].watchlistId;
    EXPECT_GT(newId, 0);
    EXPECT_NE(newId, lists[0].first);
    EXPECT_EQ(acks[0]->rows611[2].watchlistId, lists[1].first) << "a rename keeps the id";
    EXPECT_EQ(other.Of(hm::WatchlistsLoaded).size(), 1u) << "the other price views reload";
    EXPECT_TRUE(v.Of(hm::WatchlistsLoaded).empty());

    for (int k : {5, 3, 9}) items.push_back({h.Ins(100 + k).productId, h.Ins(100 + k).instrumentCode});
    WatchlistFeedback save{newId, ItemsText(items)};
    v.Send(hm::SaveUserWatchlist, ToLParam(&save));
    EXPECT_EQ(h.runtime->Stats().malformedTexts, 0u);
  }
  // A new terminal on the same store delivers the same lists.
  Harness h(42, &store);
  RecordingView& v = h.View("CPriceViewAdv");
  v.Send(hm::WatchlistList);
  const auto rows = v.notes.back().rows610;
  std::vector<std::string> names;
  std::vector<std::pair<std::int64_t, std::string>> got;
  for (const auto& r : rows) {
    if (names.empty() || names.back() != r.watchlistName) names.push_back(r.watchlistName);
    if (r.watchlistId == newId && !r.instrumentCode.empty()) got.push_back({r.productId, r.instrumentCode});
  }
  EXPECT_EQ(names, (std::vector<std::string>{odd, "My Watchlist", "Renamed"}));
  EXPECT_EQ(got, items);
}

TEST(HostWatchlists, MalformedTextsAreLoggedAndLoseNothing) {
  Harness h;
  RecordingView& v = h.View("CPriceViewAdv");
  const auto before = h.runtime->Watchlists(term::StoredWatchlist::User);
  const int saves = h.store.saveCount;
  const std::vector<std::wstring> bad = {
      L"<watchlistmain><watchlistname WatchlistID=\"0\" WatchlistName=\"Fish & Chips\" SeqID=\"0\" /></watchlistmain>",
      L"<watchlistmain><watchlistname WatchlistID=\"1\" WatchlistName=\"A\" SeqID=\"0\" />",
      L"<watchlistnames></watchlistnames>",
      L"<watchlistmain><watchlistname WatchlistID=\"x\" WatchlistName=\"A\" SeqID=\"0\" /></watchlistmain>",
      L"",
  };
  for (const auto& text : bad) {
    WatchlistFeedback f{0, text};
    v.Send(hm::SaveWatchlistNames, ToLParam(&f));
  }
  WatchlistFeedback items{before[0].id, L"<watchlistnames><watchlistname ProductID=\"101\" InstrumentCode=\"D05\""};
  v.Send(hm::SaveUserWatchlist, ToLParam(&items));
  WatchlistFeedback unknown{999999, ItemsText({{101, "D05"}})};
  v.Send(hm::SaveUserWatchlist, ToLParam(&unknown));
  EXPECT_EQ(h.runtime->Stats().malformedTexts, bad.size() + 2);
  EXPECT_TRUE(v.Of(hm::SaveWatchlistNames).empty());
  EXPECT_EQ(h.store.saveCount, saves);
  const auto after = h.runtime->Watchlists(term::StoredWatchlist::User);
  ASSERT_EQ(after.size(), before.size());
  for (std::size_t k = 0; k < after.size(); ++k) {
    EXPECT_EQ(after[k].name, before[k].name);
    EXPECT_EQ(after[k].items.size(), before[k].items.size());
  }
  EXPECT_FALSE(h.shell.notices.empty());
}

TEST(HostWatchlists, UserItemsFollowTheLimitAndSkipDuplicates) {
  Harness h;
  h.runtime->Settings().Set("MAXWL", "3");
  RecordingView& v = h.View("CPriceViewAdv");
  const auto lists = h.runtime->Watchlists(term::StoredWatchlist::User);
  std::vector<std::pair<std::int64_t, std::string>> items;
  for (int k : {1, 2, 2, 3, 4}) items.push_back({h.Ins(200 + k).productId, h.Ins(200 + k).instrumentCode});
  WatchlistFeedback f{lists[0].id, ItemsText(items)};
  v.Send(hm::SaveUserWatchlist, ToLParam(&f));
  const auto saved = h.runtime->Watchlists(term::StoredWatchlist::User)[0].items;
  ASSERT_EQ(saved.size(), 3u);
  EXPECT_EQ(saved[1].instrumentCode, h.Ins(202).instrumentCode);
  EXPECT_EQ(saved[2].instrumentCode, h.Ins(203).instrumentCode);
}

TEST(HostWatchlists, BrandListsAreRenamedAndSavedFromTheirTexts) {
  Harness h;
  RecordingView& v = h.View("CPriceViewAdv");
  RecordingView& other = h.View("CPriceViewAdv");
  auto brands = h.runtime->Watchlists(term::StoredWatchlist::Brand);
  ASSERT_FALSE(brands.empty());
  WatchlistFeedback rename{brands[0].id, L"  Picks & \"Pans\"  "};
  v.Send(hm::RenameWatchlist, ToLParam(&rename));
  EXPECT_EQ(h.runtime->Watchlists(term::StoredWatchlist::Brand)[0].name, "Picks & \"Pans\"");
  ASSERT_EQ(other.Of(hm::WatchlistsLoaded).size(), 1u);
  EXPECT_EQ(other.Of(hm::WatchlistsLoaded)[0]->word, 2);
  // The brand item text names brand codes without their prefix.
  const auto& first = brands[1].items[0];
  const int idx = h.runtime->Market().Find(first.productId, first.instrumentCode);
  ASSERT_GE(idx, 0);
  const auto& ins = h.Ins(idx);
  std::wstring text = L"<watchlistnames><watchlistname InstrumentCode=\"" + hv::Widen(ins.instrumentCode.substr(7)) +
                      L"\" Symbol=\"" + hv::Widen(ins.symbol) + L"\" Market=\"x\" Exchange=\"" + hv::Widen(ins.exchangeCode) +
                      L"\" SeqID=\"1\" ProductID=\"" + std::to_wstring(ins.productId) + L"\" /></watchlistnames>";
  WatchlistFeedback save{brands[0].id, text};
  v.Send(hm::SaveKeldoWatchlist, ToLParam(&save));
  const auto saved = h.runtime->Watchlists(term::StoredWatchlist::Brand)[0].items;
  ASSERT_EQ(saved.size(), 1u);
  EXPECT_EQ(saved[0].instrumentCode, ins.instrumentCode);
  v.Send(hm::WatchlistRows522);
  const auto rows = v.notes.back().rows522;
  EXPECT_EQ(rows[0].watchlistName, "Picks & \"Pans\"");
  EXPECT_EQ(rows[0].instrumentCode, ins.instrumentCode);
}

TEST(HostWatchlists, XmlReaderOrdersBySeqIdAndDecodesEntities) {
  std::vector<term::NameEntry> names;
  std::string error;
  ASSERT_TRUE(term::ParseWatchlistNames(
      L"<watchlistmain><watchlistname WatchlistID=\"7\" WatchlistName=\"B &amp; &#233;\" SeqID=\"1\" />"
      L"<watchlistname WatchlistID=\"3\" WatchlistName=\"A\" SeqID=\"0\" /></watchlistmain>",
      names, error))
      << error;
  ASSERT_EQ(names.size(), 2u);
  EXPECT_EQ(names[0].name, "A");
  EXPECT_EQ(names[1].name, "B & \xC3\xA9");
  EXPECT_EQ(names[1].id, 7);
  std::vector<term::ItemEntry> items;
  EXPECT_TRUE(term::ParseUserItems(term::WriteUserItems({{101, "A&B", "", "", "", 2}, {102, "C\"D", "", "", "", 1}}), items, error));
  ASSERT_EQ(items.size(), 2u);
  EXPECT_EQ(items[0].instrumentCode, "C\"D");
  EXPECT_FALSE(term::ParseUserItems(L"<watchlistnames><other /></watchlistnames>", items, error));
  EXPECT_NE(error.find("other"), std::string::npos);
}
