// The terminal answers the time-and-sales fields from the simulated tape:
// contiguous trade numbers from 1, pages of 100, the newest page live; full
// history pages are not pushed again; the dump lists the same tape.
#include <gtest/gtest.h>

#include <QDir>
#include <QFile>
#include <QTemporaryDir>

#include "RecordingView.h"
#include "TapeParsing.h"
#include "terminal/host/TradePages.h"

namespace {

using term::tape::MayHaveMoved;

TEST(TradePages, OnlyACompletedHistoryPageSentWholeStaysQuiet) {
  const std::string whole = "d|1|1|1||200;d|1|1|1||199";
  const std::string filling = "d|1|1|1||150;d|1|1|1||149";
  EXPECT_FALSE(MayHaveMoved("TRADEDATA", 2, 250, whole));
  EXPECT_TRUE(MayHaveMoved("TRADEDATA", 2, 250, filling)) << "sent while filling: the whole page is still due";
  EXPECT_TRUE(MayHaveMoved("TRADEDATA", 2, 250, ""));
  EXPECT_TRUE(MayHaveMoved("TRADEDATA", 3, 250, "d|1|1|1||250")) << "the last page still fills";
  EXPECT_TRUE(MayHaveMoved("TRADEDATA", 99998, 250, "d|1|1|1||250")) << "the live page moves with every trade";
  EXPECT_TRUE(MayHaveMoved("LAST", 99999, 250, "1.0"));
  EXPECT_EQ(term::tape::NewestTradeOfPage("x|y|1|1||1234;a|b|c|d||1"), 1234);
  EXPECT_EQ(term::tape::NewestTradeOfPage("no bars"), 0);
  EXPECT_EQ(term::tape::NewestTradeOfPage(""), 0);
  EXPECT_EQ(term::tape::NewestTradeOfPage("a|b||99999999999999"), 0);
}

TEST(TradePages, PagesJoinUpToTheTapeAndOnlyLivingPagesArePushed) {
  Harness h;
  RecordingView& v = h.View("CTimeAndSalesAdv");
  const int i = h.Busy();
  const auto& ins = h.Ins(i);
  sim::Market& m = h.runtime->Market();
  const int n = m.QuoteOf(i).trades;
  ASSERT_GT(n, 250) << "the busiest share has a history";
  const int pages = (n + 99) / 100;
  // Every history page and the live page, each in its own batch.
  for (int page = 1; page <= pages; ++page) {
    v.Field(hm::RequestField, ins.productId, ins.instrumentCode, "TRADEDATA", page, 2);
    v.Field(hm::RequestField, ins.productId, ins.instrumentCode, "PMP_Submit", page, 2);
  }
  v.Field(hm::RequestField, ins.productId, ins.instrumentCode, "TRADEDATA", 99998, 2);
  v.Field(hm::RequestField, ins.productId, ins.instrumentCode, "PMP_Submit", 99998, 2);
  std::map<int, tape::ParsedTrade> all;
  int liveNewest = 0;
  for (const auto* a : v.Of(hm::RequestField)) {
    int first = 0;
    const auto items = tape::ParseTradePage(a->update.value, &first);
    if (a->update.param == 99998) {
      liveNewest = first;
      EXPECT_EQ(items.size(), 100u);
      continue;
    }
    // Page p: trades (p-1)*100+1 .. p*100, newest first.
    ASSERT_FALSE(items.empty()) << "page " << a->update.param;
    EXPECT_EQ(items.begin()->first, (a->update.param - 1) * 100 + 1);
    EXPECT_EQ(first, std::min(n, a->update.param * 100));
    for (const auto& [num, t] : items) EXPECT_TRUE(all.emplace(num, t).second) << "trade " << num << " twice";
  }
  EXPECT_EQ(liveNewest, n);
  ASSERT_EQ(int(all.size()), n);
  EXPECT_EQ(all.begin()->first, 1);
  EXPECT_EQ(all.rbegin()->first, n) << "contiguous from 1";

  // New trades: the live page and the last, filling page are pushed; full pages never.
  v.Clear();
  h.Pump(20000);
  std::set<int> pushed;
  for (const auto* p : v.Of(hm::FieldValue)) pushed.insert(p->update.param);
  EXPECT_TRUE(pushed.count(99998));
  const int grown = m.QuoteOf(i).trades;
  ASSERT_GT(grown, n);
  for (int page : pushed)
    if (page != 99998) {
      EXPECT_GE(page * 100, n) << "a full page was pushed: " << page;
    }
}

TEST(TradePages, DumpListsTheTapeNewestFirstAndOneFilePerCode) {
  Harness h;
  sim::Market& m = h.runtime->Market();
  const int i = h.Busy();
  const auto& ins = h.Ins(i);
  const std::string tsv = term::tape::TapeTsv(m, i, {"Bought", "Sold"});
  const auto lines = tape::Split(tsv, '\n');
  ASSERT_GE(lines.size(), 3u);
  EXPECT_EQ(lines[0], "trade\ttime\tprice\tvolume\tside");
  EXPECT_EQ(lines.back(), "") << "every line ends with a line feed";
  const int n = int(m.Trades(i).size());
  ASSERT_EQ(int(lines.size()), n + 2);
  // The newest trade first, as the live page lists it.
  int first = 0;
  const auto live = tape::ParseTradePage(m.TradePageText(i, 99998), &first);
  const auto row = tape::Split(lines[1], '\t');
  ASSERT_EQ(row.size(), 5u);
  EXPECT_EQ(row[0], std::to_string(n));
  EXPECT_EQ(row[1], live.at(n).time.substr(8));
  EXPECT_EQ(row[2], live.at(n).price);
  EXPECT_EQ(row[3], live.at(n).volume);
  const std::map<std::string, std::string> words{{"0", "Married Deal"}, {"1", "Bought"}, {"2", "Sold"}, {"3", "Auction"}};
  EXPECT_EQ(row[4], words.at(live.at(n).side));
  EXPECT_EQ(tape::Split(lines[std::size_t(n)], '\t')[0], "1");

  QTemporaryDir dir;
  ASSERT_TRUE(dir.isValid());
  const std::string out = dir.filePath("dump/sub").toStdString();
  std::string error;
  const int files = term::tape::WriteTapeDumps(
      m, {{ins.productId, ins.instrumentCode}, {ins.productId, ins.instrumentCode}, {-5, "NOPE"}}, out, {}, error);
  EXPECT_EQ(files, 1) << error;
  QFile f(QDir(QString::fromStdString(out)).filePath(QString::fromStdString("market-trades-" + ins.instrumentCode + ".tsv")));
  ASSERT_TRUE(f.open(QIODevice::ReadOnly));
  EXPECT_EQ(f.readAll().count('\n'), n + 1);
  // A folder that cannot be made is reported.
  EXPECT_EQ(term::tape::WriteTapeDumps(m, {{ins.productId, ins.instrumentCode}}, "/proc/no/such", {}, error), -1);
  EXPECT_FALSE(error.empty());
}

}  // namespace
