// The market's own trade-summary table (--dump's market-summary-<code>.tsv).
#include <gtest/gtest.h>

#include <QDir>
#include <QFile>
#include <QStringList>
#include <QTemporaryDir>

#include "terminal/app/MarketSummaryDump.h"
#include "terminal/sim/Market.h"

namespace {

sim::MarketConfig Config() {
  sim::MarketConfig c;
  c.seed = 77;
  c.instruments = 200;
  return c;
}

// The first instrument with at least `lines` traded prices.
int BusyInstrument(sim::Market& m, std::size_t lines) {
  for (int i = 0; i < int(m.Instruments().size()); ++i)
    if (m.Summary(i).size() >= lines) return i;
  return -1;
}

TEST(MarketSummaryDump, SidesAddUpToTheTotalLineByLineInPagingOrder) {
  sim::Market m(Config());
  m.AdvanceTo(5000);
  const int index = BusyInstrument(m, 3);
  ASSERT_GE(index, 0);
  const auto lines = m.Summary(index);
  QStringList rows = QString::fromStdString(term::MarketSummaryTsv(m, index)).split('\n');
  ASSERT_EQ(rows.takeLast(), "") << "every line ends in a line feed";
  ASSERT_EQ(rows.takeFirst(), "price\task_volume\tbid_volume\tblock_volume\ttotal_volume");
  ASSERT_EQ(rows.size(), int(lines.size()));
  long long blocks = 0;
  for (int r = 0; r < rows.size(); ++r) {
    SCOPED_TRACE(rows[r].toStdString());
    const QStringList f = rows[r].split('\t');
    ASSERT_EQ(f.size(), 5);
    EXPECT_EQ(f[0].toStdString(), m.FormatPrice(index, lines[std::size_t(r)].price)) << "the order the views page";
    EXPECT_EQ(f[1].toLongLong(), lines[std::size_t(r)].askVolume);
    EXPECT_EQ(f[2].toLongLong(), lines[std::size_t(r)].bidVolume);
    EXPECT_GE(f[3].toLongLong(), 0);
    EXPECT_EQ(f[1].toLongLong() + f[2].toLongLong() + f[3].toLongLong(), f[4].toLongLong());
    if (r) {
      EXPECT_LT(f[0].toDouble(), rows[r - 1].split('\t')[0].toDouble()) << "highest price first";
    }
    blocks += f[3].toLongLong();
  }
  EXPECT_GT(blocks, 0) << "the opening auction trades off the book sides";
  EXPECT_EQ(term::MarketSummaryTsv(m, -1), "price\task_volume\tbid_volume\tblock_volume\ttotal_volume\n");
}

TEST(MarketSummaryDump, OneFilePerInstrumentUnknownOnesSkippedNamesMadeSafe) {
  sim::Market m(Config());
  m.AdvanceTo(1000);
  const JInstrumentUnderlying& ins = m.Instruments()[20];
  QTemporaryDir dir;
  ASSERT_TRUE(dir.isValid());
  std::string error;
  const int files = term::WriteMarketSummaryDumps(
      dir.path().toStdString(), m, {{ins.productId, ins.instrumentCode}, {ins.productId, ins.instrumentCode}, {999, "NONE"}},
      error);
  EXPECT_EQ(files, 1) << error;
  QFile file(QDir(dir.path()).filePath(QString::fromStdString("market-summary-" + ins.instrumentCode + ".tsv")));
  ASSERT_TRUE(file.open(QIODevice::ReadOnly));
  EXPECT_EQ(file.readAll().toStdString(), term::MarketSummaryTsv(m, 20));
  EXPECT_EQ(term::MarketSummaryFileName("A/B 1.x"), "market-summary-A_B_1.x.tsv");

  EXPECT_EQ(term::WriteMarketSummaryDumps(dir.filePath("missing").toStdString(), m, {{ins.productId, ins.instrumentCode}},
                                          error),
            -1);
  EXPECT_NE(error.find("cannot write"), std::string::npos);
}

}  // namespace
