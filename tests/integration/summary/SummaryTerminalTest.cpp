// The trade-summary view end to end: the terminal runs headless on its
// simulated market with a trade summary open on a busy futures contract and
// dumps the view and the market's own summary; they must agree line by line.
#include <gtest/gtest.h>

#include "mvtest/TerminalProcess.h"

#include <QDir>
#include <QFile>
#include <QFileInfo>
#include <QStringList>
#include <QTemporaryDir>
#include <algorithm>
#include <map>
#include <vector>

namespace {

using mvtest::RunResult;
using mvtest::RunTerminal;
using mvtest::TerminalPath;

// The first `count` simulated instruments of an exchange: {product id, code}.
std::vector<std::pair<QString, QString>> PickInstruments(const QString& seed, const QString& exchange, int count) {
  std::vector<std::pair<QString, QString>> out;
  const RunResult list = RunTerminal({"--seed", seed, "--list-instruments"});
  if (list.exitCode != 0) return out;
  for (const QString& line : list.out.split('\n', Qt::SkipEmptyParts)) {
    const QStringList f = line.split('\t');
    if (f.size() >= 3 && f[2] == exchange && int(out.size()) < count) out.push_back({f[0], f[1]});
  }
  return out;
}

// The lines of a TSV file, each split into cells; empty when unreadable.
std::vector<QStringList> ReadTsv(const QString& path, QString* whole = nullptr) {
  std::vector<QStringList> rows;
  QFile file(path);
  if (!file.open(QIODevice::ReadOnly)) return rows;
  const QString text = QString::fromUtf8(file.readAll());
  if (whole) *whole = text;
  for (const QString& line : text.split('\n', Qt::SkipEmptyParts)) rows.push_back(line.split('\t'));
  return rows;
}

// A number as shown: digits with "," between thousands.
long long Whole(const QString& text) {
  QString digits = text;
  digits.remove(',');
  bool ok = false;
  const long long v = digits.toLongLong(&ok);
  EXPECT_TRUE(ok) << "not a number: " << text.toStdString();
  return v;
}

// One view's dump against the market's file of its instrument; returns the
// number of price lines.
std::size_t CheckAgainstMarket(const QString& dump, int instance, const QString& code) {
  SCOPED_TRACE("view " + std::to_string(instance) + " on " + code.toStdString());
  const QString prefix = QString("CTradeSummaryAdv-%1").arg(instance);
  QString viewText;
  std::vector<QStringList> view = ReadTsv(QDir(dump).filePath(prefix + ".tsv"), &viewText);
  std::vector<QStringList> market = ReadTsv(QDir(dump).filePath("market-summary-" + code + ".tsv"));
  EXPECT_FALSE(view.empty()) << "no dump of the view";
  EXPECT_FALSE(market.empty()) << "no market summary";
  if (view.size() < 4 || market.empty()) return 0;
  EXPECT_FALSE(viewText.contains("nan", Qt::CaseInsensitive));
  EXPECT_EQ(view.front(), (QStringList{"Price", "Trades", "Volume", "Bid Vol", "Ask Vol"}));
  EXPECT_EQ(market.front(), (QStringList{"price", "ask_volume", "bid_volume", "block_volume", "total_volume"}));

  // Rows: one per traded price, a blank row, the totals row.
  const QStringList totals = view.back();
  const QStringList blank = view[view.size() - 2];
  EXPECT_EQ(totals.value(0), "Total");
  for (const QString& cell : blank) EXPECT_TRUE(cell.isEmpty()) << "the row above the totals is blank";
  const std::size_t lines = view.size() - 3;
  EXPECT_EQ(lines, market.size() - 1) << "the view shows every traded price";
  if (lines != market.size() - 1) return 0;

  long long trades = 0, volume = 0, bid = 0, ask = 0;
  for (std::size_t i = 0; i < lines; ++i) {
    const QStringList& v = view[i + 1];
    const QStringList& m = market[i + 1];
    SCOPED_TRACE("line " + std::to_string(i + 1) + ": " + v.join(' ').toStdString() + " / " + m.join(' ').toStdString());
    if (v.size() != 5 || m.size() != 5) {
      ADD_FAILURE() << "five cells a line";
      return 0;
    }
    EXPECT_DOUBLE_EQ(v[0].toDouble(), m[0].toDouble()) << "the same prices in the same order";
    EXPECT_EQ(Whole(v[4]), m[1].toLongLong()) << "ask volume";
    EXPECT_EQ(Whole(v[3]), m[2].toLongLong()) << "bid volume";
    EXPECT_EQ(Whole(v[2]), m[4].toLongLong()) << "total volume";
    EXPECT_EQ(m[1].toLongLong() + m[2].toLongLong() + m[3].toLongLong(), m[4].toLongLong());
    EXPECT_GT(Whole(v[1]), 0) << "a traded price has trades";
    trades += Whole(v[1]);
    volume += Whole(v[2]);
    bid += Whole(v[3]);
    ask += Whole(v[4]);
  }
  // The per-price figures add up to the totals line.
  EXPECT_EQ(Whole(totals.value(1)), trades);
  EXPECT_EQ(Whole(totals.value(2)), volume);
  EXPECT_EQ(Whole(totals.value(3)), bid);
  EXPECT_EQ(Whole(totals.value(4)), ask);

  // The chart shows the first ten prices (fewer when there are fewer), with the table's figures.
  std::vector<QStringList> chart = ReadTsv(QDir(dump).filePath(prefix + "-SummaryChart.tsv"));
  EXPECT_EQ(chart.size(), std::min<std::size_t>(10, lines) + 1);
  if (chart.empty()) return lines;
  EXPECT_EQ(chart.front(), (QStringList{"", "Ask", "Bid", "Blocks"}));
  for (std::size_t i = 1; i < chart.size() && i <= lines; ++i) {
    SCOPED_TRACE(chart[i].join(' ').toStdString());
    if (chart[i].size() != 4) {
      ADD_FAILURE() << "a label and three values";
      continue;
    }
    EXPECT_EQ(chart[i][0], view[i][0]);
    EXPECT_EQ(chart[i][1].toLongLong(), Whole(view[i][4]));
    EXPECT_EQ(chart[i][2].toLongLong(), Whole(view[i][3]));
    EXPECT_EQ(chart[i][3].toLongLong(), Whole(view[i][1]));
  }
  return lines;
}

TEST(SummaryTerminal, HeadlessDumpAgreesWithTheMarketLineByLine) {
  ASSERT_FALSE(TerminalPath().isEmpty()) << "no terminal: set MV_BIN";
  ASSERT_TRUE(QFile::exists(TerminalPath())) << TerminalPath().toStdString();
  const QString seed = "4242";
  // Busy futures contracts: their summaries run over several pages.
  const auto instruments = PickInstruments(seed, "SGXDT", 4);
  ASSERT_EQ(instruments.size(), 4u);

  QTemporaryDir dir;
  ASSERT_TRUE(dir.isValid());
  const QString dump = dir.filePath("dump");
  QStringList args{"--headless", "--no-restore", "--seed", seed, "--data-dir", dir.filePath("data")};
  for (const auto& [productId, code] : instruments) args << "--open" << "CTradeSummaryAdv:" + productId + ":" + code;
  // Half a simulated second: the views look at the page count once a second,
  // so later pages arrive only while the views settle before the dump.
  args << "--seconds" << "0.5" << "--dump" << dump;
  const RunResult run = RunTerminal(args);
  ASSERT_EQ(run.exitCode, 0) << run.err.toStdString();

  std::size_t longest = 0;
  for (int k = 0; k < int(instruments.size()); ++k)
    longest = std::max(longest, CheckAgainstMarket(dump, k + 1, instruments[std::size_t(k)].second));
  EXPECT_GT(longest, 40u) << "more than one page: the later pages were asked for and shown";
}

}  // namespace
