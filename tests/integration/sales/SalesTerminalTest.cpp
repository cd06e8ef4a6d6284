// The time-and-sales view end to end: the terminal runs headless on its
// simulated market long enough for background paging to fetch the history,
// then dumps the view and the market's tape; both must list the same trades.
#include <gtest/gtest.h>

#include "mvtest/TerminalProcess.h"

#include <QDir>
#include <QFile>
#include <QFileInfo>
#include <QStringList>
#include <QTemporaryDir>

namespace {

constexpr int kProcessTimeoutMs = 180000;  // a guard against a hung terminal, not a wait
const QString kSeed = "4242";

using mvtest::RunResult;
using mvtest::TerminalPath;

RunResult RunTerminal(const QStringList& args) { return mvtest::RunTerminal(args, kProcessTimeoutMs); }

// Lines of a TSV file without the final line feed; empty when unreadable.
QStringList ReadLines(const QString& path) {
  QFile f(path);
  if (!f.open(QIODevice::ReadOnly)) return {};
  QStringList lines = QString::fromUtf8(f.readAll()).split('\n');
  if (!lines.isEmpty() && lines.last().isEmpty()) lines.removeLast();
  return lines;
}

struct Pick {
  QString productId, code;
  int trades = 0;
};

// The SGX share among the first listed ones with the longest tape that still
// pages in well under a minute (several pages, not hundreds): one short run
// with a view on each, whose market dumps tell the tape lengths.
bool PickInstrument(const QString& dir, Pick* pick) {
  const RunResult list = RunTerminal({"--seed", kSeed, "--list-instruments"});
  if (list.exitCode != 0) return false;
  QStringList args{"--headless", "--no-restore", "--seed", kSeed, "--seconds", "1",
                   "--data-dir", dir + "/pick-data", "--dump", dir + "/pick"};
  QMap<QString, QString> products;
  for (const QString& line : list.out.split('\n', Qt::SkipEmptyParts)) {
    const QStringList f = line.split('\t');
    if (f.size() < 3 || f[2] != "SGX" || products.size() >= 30) continue;
    products[f[1]] = f[0];
    args << "--open" << "CTimeAndSalesAdv:" + f[0] + ":" + f[1];
  }
  if (RunTerminal(args).exitCode != 0) return false;
  for (auto it = products.begin(); it != products.end(); ++it) {
    const int trades = int(ReadLines(dir + "/pick/market-trades-" + it.key() + ".tsv").size()) - 1;
    if (trades > pick->trades && trades <= 1500) *pick = Pick{it.value(), it.key(), trades};
  }
  return pick->trades > 300;
}

// A volume as shown: digits with "," between thousands.
QString Plain(QString text) { return text.remove(','); }

TEST(SalesTerminal, PagedHistoryMatchesTheMarketTapeRowForRow) {
  ASSERT_FALSE(TerminalPath().isEmpty()) << "no terminal: set MV_BIN";
  ASSERT_TRUE(QFile::exists(TerminalPath())) << TerminalPath().toStdString();
  QTemporaryDir dir;
  ASSERT_TRUE(dir.isValid());
  Pick pick;
  ASSERT_TRUE(PickInstrument(dir.path(), &pick)) << "no SGX share with a few pages of trades";

  // Seven pages per batch, a batch every 10 s: enough simulated time for the
  // whole history, with room to spare.
  const int pages = (pick.trades + 99) / 100;
  const int seconds = 10 * ((pages + 6) / 7 + 3);
  const QString dump = dir.filePath("dump");
  const RunResult run = RunTerminal({"--headless", "--no-restore", "--seed", kSeed, "--data-dir", dir.filePath("data"),
                                     "--open", "CTimeAndSalesAdv:" + pick.productId + ":" + pick.code, "--seconds",
                                     QString::number(seconds), "--dump", dump});
  ASSERT_EQ(run.exitCode, 0) << run.err.toStdString();

  const QStringList view = ReadLines(QDir(dump).filePath("CTimeAndSalesAdv-1.tsv"));
  const QStringList market = ReadLines(QDir(dump).filePath("market-trades-" + pick.code + ".tsv"));
  ASSERT_FALSE(view.isEmpty()) << "no dump of the view; stderr: " << run.err.toStdString();
  ASSERT_FALSE(market.isEmpty()) << "no dump of the market's tape";
  EXPECT_EQ(view[0], "Time\tPrice\tVolume\tSide");
  EXPECT_EQ(market[0], "trade\ttime\tprice\tvolume\tside");
  ASSERT_EQ(view.size(), market.size()) << "one row per trade";
  const int n = int(market.size()) - 1;
  EXPECT_GE(n, pick.trades) << "the tape only grows";

  int empty = 0;
  for (int row = 1; row <= n; ++row) {
    SCOPED_TRACE("row " + std::to_string(row) + ": " + view[row].toStdString() + " | " + market[row].toStdString());
    const QStringList v = view[row].split('\t');
    const QStringList m = market[row].split('\t');
    ASSERT_EQ(v.size(), 4);
    ASSERT_EQ(m.size(), 5);
    EXPECT_EQ(m[0].toInt(), n - row + 1) << "trade numbers contiguous, newest first";
    if (v[0].isEmpty() && v[1].isEmpty() && v[2].isEmpty()) {
      ++empty;
      continue;
    }
    EXPECT_EQ(v[0], m[1]) << "time";
    EXPECT_EQ(v[1], m[2]) << "price";
    EXPECT_EQ(Plain(v[2]), m[3]) << "volume";
    EXPECT_EQ(v[3], m[4]) << "side";
  }
  EXPECT_EQ(empty, 0) << "rows still waiting for their page after paging";
}

}  // namespace
