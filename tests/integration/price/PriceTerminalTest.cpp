// The price view end to end: the terminal runs headless with a price view on
// the simulated watchlists and dumps the grid and the market's current quote
// values of what the views show (market-quotes.tsv). The market stops before
// the dump, so both describe the same moment: every row's last, bid and ask
// must be the market's, formatted with the instrument's decimals.
#include <gtest/gtest.h>

#include "mvtest/TerminalProcess.h"

#include <QDir>
#include <QFile>
#include <QFileInfo>
#include <QMap>
#include <QSet>
#include <QStringList>
#include <QTemporaryDir>

namespace {

using mvtest::RunResult;
using mvtest::RunTerminal;
using mvtest::TerminalPath;

// A TSV file as rows of cells; the first row holds the headings.
std::vector<QStringList> ReadTsv(const QString& path) {
  std::vector<QStringList> rows;
  QFile f(path);
  if (!f.open(QIODevice::ReadOnly)) return rows;
  for (const QString& line : QString::fromUtf8(f.readAll()).split('\n', Qt::SkipEmptyParts)) rows.push_back(line.split('\t'));
  return rows;
}

struct MarketRow {
  QString productId, code, name, exchange;
  QMap<QString, QString> values;  // field name -> value as sent
};

TEST(PriceTerminal, HeadlessDumpShowsTheMarketsQuotesWithTheInstrumentsDecimals) {
  QTemporaryDir data, dump;
  ASSERT_TRUE(data.isValid() && dump.isValid());
  const QString seed = "4242";
  const RunResult run = RunTerminal({"--headless", "--seconds", "8", "--seed", seed, "--no-restore", "--data-dir",
                                     data.path(), "--dump", dump.path(), "--open", "CPriceViewAdv"});
  ASSERT_EQ(run.exitCode, 0) << run.err.toStdString();

  // Names and exchanges of the instruments, to join the grid's rows.
  const RunResult list = RunTerminal({"--seed", seed, "--list-instruments"});
  ASSERT_EQ(list.exitCode, 0);
  QMap<QString, std::pair<QString, QString>> nameOf;  // "pid\tcode" -> (name, exchange)
  for (const QString& line : list.out.split('\n', Qt::SkipEmptyParts)) {
    const QStringList f = line.split('\t');
    if (f.size() >= 4) nameOf[f[0] + "\t" + f[1]] = {f[3].trimmed(), f[2].trimmed()};
  }

  const auto market = ReadTsv(QDir(dump.path()).filePath("market-quotes.tsv"));
  ASSERT_GE(market.size(), 2u);
  const QStringList heads = market[0];
  ASSERT_GE(heads.size(), 20);
  EXPECT_EQ(heads[0], "product_id");
  EXPECT_EQ(heads[1], "code");
  EXPECT_EQ(heads.mid(2), (QStringList{"BID", "ASK", "BVOL", "SVOL", "LAST", "CHANGE", "PCHANGE", "OPEN", "HIGH",
                                       "LOW", "CLOSE", "VOL", "REMARKS", "CFD_STATUS", "DMA_STATUS", "MONTH", "YEAR",
                                       "TAC"}));
  std::vector<MarketRow> rows;
  for (std::size_t i = 1; i < market.size(); ++i) {
    MarketRow r;
    r.productId = market[i].value(0);
    r.code = market[i].value(1);
    const auto named = nameOf.value(r.productId + "\t" + r.code);
    r.name = named.first;
    r.exchange = named.second;
    for (int c = 2; c < heads.size(); ++c) r.values[heads[c]] = market[i].value(c);
    rows.push_back(r);
  }

  const auto grid = ReadTsv(QDir(dump.path()).filePath("CPriceViewAdv-1.tsv"));
  ASSERT_GE(grid.size(), 6u) << "a newcomer sees a full list at once";
  const QStringList& h = grid[0];
  const int name = h.indexOf("Name"), exchange = h.indexOf("Exchange"), last = h.indexOf("Last"), bid = h.indexOf("Bid"),
            ask = h.indexOf("Ask");
  ASSERT_TRUE(name >= 0 && exchange >= 0 && last >= 0 && bid >= 0 && ask >= 0) << h.join(',').toStdString();
  for (std::size_t i = 1; i < grid.size(); ++i) {
    const QStringList& g = grid[i];
    SCOPED_TRACE(g.join(" | ").toStdString());
    bool matched = false;
    int candidates = 0;
    for (const MarketRow& m : rows) {
      if (m.name != g.value(name) || m.exchange != g.value(exchange)) continue;
      ++candidates;
      matched = matched || (m.values["LAST"] == g.value(last) && m.values["BID"] == g.value(bid) &&
                            m.values["ASK"] == g.value(ask));
    }
    EXPECT_GE(candidates, 1) << "the market file names every shown instrument";
    EXPECT_TRUE(matched);
  }
  for (const auto& file : {QString("market-quotes.tsv"), QString("CPriceViewAdv-1.tsv")}) {
    QFile f(QDir(dump.path()).filePath(file));
    ASSERT_TRUE(f.open(QIODevice::ReadOnly));
    const QString text = QString::fromUtf8(f.readAll()).toLower();
    EXPECT_FALSE(text.contains("nan") || text.contains("inf")) << file.toStdString();
  }
}

// Ten minutes of the simulated market rename a few companies; the ones the
// price view shows carry their new names in the grid (told by the terminal as
// 414 to the leading price view).
TEST(PriceTerminal, RenamedCompaniesShowTheirNewNamesInTheGrid) {
  QTemporaryDir data, dump;
  ASSERT_TRUE(data.isValid() && dump.isValid());
  const RunResult run = RunTerminal({"--headless", "--seconds", "600", "--no-restore", "--data-dir", data.path(),
                                     "--dump", dump.path(), "--open", "CPriceViewAdv"});
  ASSERT_EQ(run.exitCode, 0) << run.err.toStdString();
  const RunResult list = RunTerminal({"--list-instruments"});
  ASSERT_EQ(list.exitCode, 0);
  QMap<QString, QString> nameOf;  // "code\texchange" of the shares (product 101) -> reference name
  QSet<QString> referenceNames;
  for (const QString& line : list.out.split('\n', Qt::SkipEmptyParts)) {
    const QStringList f = line.split('\t');
    if (f.size() < 4) continue;
    referenceNames.insert(f[3].trimmed());
    if (f[0] == "101") nameOf[f[1] + "\t" + f[2].trimmed()] = f[3].trimmed();
  }
  const auto grid = ReadTsv(QDir(dump.path()).filePath("CPriceViewAdv-1.tsv"));
  ASSERT_GE(grid.size(), 6u);
  const int symbol = grid[0].indexOf("Symbol"), name = grid[0].indexOf("Name"), exchange = grid[0].indexOf("Exchange");
  ASSERT_TRUE(symbol >= 0 && name >= 0 && exchange >= 0);
  int renamed = 0;
  for (std::size_t i = 1; i < grid.size(); ++i) {
    const QStringList& g = grid[i];
    const QString key = g.value(symbol) + "\t" + g.value(exchange);
    ASSERT_TRUE(nameOf.contains(key)) << key.toStdString();
    if (g.value(name) == nameOf[key]) continue;
    ++renamed;
    EXPECT_FALSE(g.value(name).isEmpty());
    EXPECT_FALSE(referenceNames.contains(g.value(name))) << "a new name: " << g.value(name).toStdString();
  }
  EXPECT_GE(renamed, 1) << "ten minutes of this market rename a shown company";
}

}  // namespace
