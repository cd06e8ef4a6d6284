// The watchlists as a text file: export, and import with the rules of the
// price view's instrument box; a refused file changes nothing.
#include <gtest/gtest.h>

#include "RecordingView.h"
#include "terminal/host/WatchlistTransfer.h"

namespace {

// "<exchange>:<code>" of a market instrument.
std::string Line(Harness& h, int i) { return h.Ins(i).exchangeCode + ":" + h.Ins(i).instrumentCode; }

// The first instruments of the market that pass (or fail) the viewability rule.
std::vector<int> Pick(Harness& h, bool viewable, std::size_t count) {
  std::vector<int> out;
  const auto& list = h.runtime->Market().Instruments();
  for (int i = 0; i < int(list.size()) && out.size() < count; ++i) {
    const int s = list[std::size_t(i)].accessStatus;
    const bool ok = s != 0 && s != 2;
    if (ok != viewable || list[std::size_t(i)].exchangeCode.find(' ') != std::string::npos) continue;
    // One whose line imports on its own (the first instrument of that exchange and code).
    if (term::ReadWatchlistsText("x\n" + list[std::size_t(i)].exchangeCode + ":" + list[std::size_t(i)].instrumentCode,
                                 {}, h.runtime->Market(), h.runtime->Settings())
                .lists.empty() && viewable)
      continue;
    out.push_back(i);
  }
  return out;
}

TEST(WatchlistTransfer, ExportThenImportGivesTheSameListsUnderFreeNames) {
  Harness h;
  RecordingView& price = h.View("CPriceViewAdv");
  const auto before = h.runtime->Watchlists(term::StoredWatchlist::User);
  ASSERT_FALSE(before.empty());
  const std::string text = h.runtime->ExportWatchlists();
  // One block per list: the name, then one "exchange:code" a line.
  EXPECT_EQ(text.substr(0, before[0].name.size() + 1), before[0].name + "\n");
  EXPECT_NE(text.find("\n\n" + before[1].name + "\n"), std::string::npos);

  price.Clear();
  EXPECT_TRUE(h.runtime->ImportWatchlists(text).empty());
  const auto after = h.runtime->Watchlists(term::StoredWatchlist::User);
  ASSERT_EQ(after.size(), 2 * before.size());
  for (std::size_t i = 0; i < before.size(); ++i) {
    const auto& copy = after[before.size() + i];
    EXPECT_EQ(copy.name, before[i].name + " (2)");
    EXPECT_NE(copy.id, before[i].id);
    ASSERT_EQ(copy.items.size(), before[i].items.size());
    for (std::size_t k = 0; k < copy.items.size(); ++k)
      EXPECT_EQ(copy.items[k].instrumentCode, before[i].items[k].instrumentCode);
  }
  // Stored, and the price views are handed the new lists (610).
  EXPECT_EQ(h.store.watchlists.size(), after.size() + h.runtime->Watchlists(term::StoredWatchlist::Brand).size());
  ASSERT_EQ(price.Of(hm::WatchlistList).size(), 1u);
  EXPECT_EQ(price.Of(hm::WatchlistList)[0]->rows610.back().watchlistName, after.back().name);
}

TEST(WatchlistTransfer, ABrokenFileIsRefusedWholeWithEveryProblemByLine) {
  Harness h;
  const auto viewable = Pick(h, true, 3);
  const auto hidden = Pick(h, false, 1);
  ASSERT_EQ(viewable.size(), 3u);
  ASSERT_EQ(hidden.size(), 1u);
  const std::string text = "Good list\n" + Line(h, viewable[0]) + "\n" + Line(h, viewable[1]) +
                           "\n\n"                                         // line 4: blank
                           "Bad list\n" +                                  // line 5
                           Line(h, viewable[2]) + "\n" +                  // 6
                           "NOWHERE:XYZ\n" +                              // 7: unknown
                           "no colon here\n" +                            // 8: not exchange:code
                           Line(h, hidden[0]) + "\n" +                    // 9: not viewable
                           Line(h, viewable[2]) + "\n";                   // 10: twice
  const std::size_t lists = h.runtime->Watchlists(term::StoredWatchlist::User).size();
  const auto problems = h.runtime->ImportWatchlists(text);
  ASSERT_EQ(problems.size(), 4u);
  EXPECT_EQ(problems[0], "line 7: NOWHERE:XYZ is not a known instrument");
  EXPECT_EQ(problems[1], "line 8: \"no colon here\" is not <exchange>:<code>");
  EXPECT_EQ(problems[2], "line 9: " + Line(h, hidden[0]) + ": Counter is not Viewable.");
  EXPECT_EQ(problems[3], "line 10: " + Line(h, viewable[2]) + ": Instrument already exist in the list.");
  EXPECT_EQ(h.runtime->Watchlists(term::StoredWatchlist::User).size(), lists);  // nothing half-imported
}

TEST(WatchlistTransfer, LimitsOfTheSettings) {
  Harness h;
  const auto viewable = Pick(h, true, 3);
  ASSERT_EQ(viewable.size(), 3u);
  h.runtime->Settings().Set("MAXWL", "2");
  const std::string three = "Three\n" + Line(h, viewable[0]) + "\n" + Line(h, viewable[1]) + "\n" + Line(h, viewable[2]);
  auto problems = h.runtime->ImportWatchlists(three);
  ASSERT_EQ(problems.size(), 1u);
  EXPECT_EQ(problems[0], "line 1: \"Three\": Number of priceview items is limited to 2");

  const std::size_t lists = h.runtime->Watchlists(term::StoredWatchlist::User).size();
  h.runtime->Settings().Set("MAXWT", std::to_string(lists + 1));
  problems = h.runtime->ImportWatchlists("One\n" + Line(h, viewable[0]) + "\n\nTwo\n" + Line(h, viewable[1]));
  ASSERT_EQ(problems.size(), 1u);
  EXPECT_EQ(problems[0].rfind("Number of watchlist is limited to " + std::to_string(lists + 1), 0), 0u);
  EXPECT_TRUE(h.runtime->ImportWatchlists("One\n" + Line(h, viewable[0])).empty());
  EXPECT_EQ(h.runtime->ImportWatchlists("").front(), "the file holds no watchlist");
}

}  // namespace
