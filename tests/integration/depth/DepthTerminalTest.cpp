// The market-depth view end to end: the terminal runs headless on its
// simulated market with a depth view open on one instrument and dumps the
// grid; the book must look like a book.
#include <gtest/gtest.h>

#include "mvtest/TerminalProcess.h"

#include <QCoreApplication>
#include <QDir>
#include <QFile>
#include <QStringList>
#include <QTemporaryDir>
#include <QFileInfo>

namespace {

using mvtest::RunResult;
using mvtest::RunTerminal;
using mvtest::TerminalPath;

// The first simulated share that trades on an exchange (not an index list).
bool PickInstrument(const QString& seed, QString* productId, QString* code) {
  const RunResult list = RunTerminal({"--seed", seed, "--list-instruments"});
  if (list.exitCode != 0) return false;
  for (const QString& line : list.out.split('\n', Qt::SkipEmptyParts)) {
    const QStringList f = line.split('\t');
    if (f.size() >= 3 && f[2] == "SGX") {
      *productId = f[0];
      *code = f[1];
      return true;
    }
  }
  return false;
}

// A volume as shown: digits with "," between thousands.
bool ReadVolume(const QString& text, long long* value) {
  QString digits = text;
  digits.remove(',');
  bool ok = false;
  *value = digits.toLongLong(&ok);
  return ok;
}

TEST(DepthTerminal, HeadlessDumpShowsAGrownOrderedBook) {
  ASSERT_FALSE(TerminalPath().isEmpty()) << "no terminal: set MV_BIN";
  ASSERT_TRUE(QFile::exists(TerminalPath())) << TerminalPath().toStdString();
  const QString seed = "4242";
  QString productId, code;
  ASSERT_TRUE(PickInstrument(seed, &productId, &code));

  QTemporaryDir dir;
  ASSERT_TRUE(dir.isValid());
  const QString dump = dir.filePath("dump");
  const RunResult run = RunTerminal({"--headless", "--no-restore", "--seed", seed, "--data-dir", dir.filePath("data"),
                               "--open", "CMarketDepthAdv:" + productId + ":" + code, "--seconds", "6", "--dump",
                               dump});
  ASSERT_EQ(run.exitCode, 0) << run.err.toStdString();

  QFile file(QDir(dump).filePath("CMarketDepthAdv-1.tsv"));
  ASSERT_TRUE(file.open(QIODevice::ReadOnly)) << "no dump of the depth view; stderr: " << run.err.toStdString();
  const QString tsv = QString::fromUtf8(file.readAll());
  EXPECT_FALSE(tsv.contains("nan", Qt::CaseInsensitive));
  QStringList lines = tsv.split('\n');
  ASSERT_EQ(lines.takeLast(), "") << "every line ends in a line feed";
  ASSERT_FALSE(lines.isEmpty());
  const QStringList headings = lines.takeFirst().split('\t');
  ASSERT_EQ(headings.size(), 4) << "order counts are hidden by default";

  // More than the first five levels: the book grew.
  EXPECT_GT(lines.size(), 5);
  double lastBuy = 0, lastSell = 0;
  int buys = 0, sells = 0;
  for (int row = 0; row < lines.size(); ++row) {
    SCOPED_TRACE("row " + std::to_string(row + 1) + ": " + lines[row].toStdString());
    const QStringList cells = lines[row].split('\t');
    ASSERT_EQ(cells.size(), 4);
    for (int col : {0, 3}) {
      if (cells[col].isEmpty()) continue;
      long long volume = -1;
      ASSERT_TRUE(ReadVolume(cells[col], &volume));
      EXPECT_GE(volume, 0);
    }
    if (!cells[1].isEmpty()) {
      const double buy = cells[1].toDouble();
      if (buys++) { EXPECT_LT(buy, lastBuy) << "buy prices fall level by level"; }
      lastBuy = buy;
    }
    if (!cells[2].isEmpty()) {
      const double sell = cells[2].toDouble();
      if (sells++) { EXPECT_GT(sell, lastSell) << "sell prices rise level by level"; }
      lastSell = sell;
    }
    EXPECT_TRUE(!cells[1].isEmpty() || !cells[2].isEmpty()) << "a shown level has a price";
  }
  EXPECT_GT(buys, 5);
  EXPECT_GT(sells, 5);
}

}  // namespace
