// Board mode and the advance filter end to end: the terminal runs headless
// with price views opened on start parameters (board mode, an advance filter)
// and dumps what they show. The board names the instruments the list shows on
// the same market; every row of a filter is of the chosen product and exchange.
#include <gtest/gtest.h>

#include "mvtest/TerminalProcess.h"

#include <QDir>
#include <QFile>
#include <QFileInfo>
#include <QMap>
#include <QStringList>
#include <QTemporaryDir>

namespace {

const QString kSeed = "5151";

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

// The (name, exchange) pairs of a dump's rows, in order.
std::vector<std::pair<QString, QString>> NamesOf(const std::vector<QStringList>& dump) {
  std::vector<std::pair<QString, QString>> out;
  if (dump.empty()) return out;
  const int name = dump[0].indexOf("Name"), exchange = dump[0].indexOf("Exchange");
  EXPECT_TRUE(name >= 0 && exchange >= 0) << dump[0].join(',').toStdString();
  for (std::size_t i = 1; i < dump.size(); ++i) out.emplace_back(dump[i].value(name), dump[i].value(exchange));
  return out;
}

struct Instrument {
  QString productId, code, exchange;
};

TEST(BoardTerminal, BoardNamesTheListsInstrumentsAndFiltersKeepToTheirChoice) {
  QTemporaryDir boardData, listData, boardDump, listDump;
  ASSERT_TRUE(boardData.isValid() && listData.isValid() && boardDump.isValid() && listDump.isValid());
  const RunResult board = RunTerminal(
      {"--headless", "--seconds", "6", "--seed", kSeed, "--no-restore", "--data-dir", boardData.path(), "--dump",
       boardDump.path(), "--open", "CPriceViewAdv", "--param", "User_field_display_mode=Board", "--open",
       "CPriceViewAdv", "--param", "User_field_advance_filter=101|SEHK|***|ALL", "--open", "CPriceViewAdv", "--param",
       "User_field_display_mode=Board", "--param", "User_field_advance_filter=101|SGX|***|A"});
  ASSERT_EQ(board.exitCode, 0) << board.err.toStdString();
  const RunResult list = RunTerminal({"--headless", "--seconds", "6", "--seed", kSeed, "--no-restore", "--data-dir",
                                      listData.path(), "--dump", listDump.path(), "--open", "CPriceViewAdv"});
  ASSERT_EQ(list.exitCode, 0) << list.err.toStdString();

  // The board's tiles name the instruments of the list, in the list's order.
  const auto tiles = ReadTsv(QDir(boardDump.path()).filePath("CPriceViewAdv-1.tsv"));
  const auto rows = ReadTsv(QDir(listDump.path()).filePath("CPriceViewAdv-1.tsv"));
  ASSERT_GE(tiles.size(), 4u);
  ASSERT_EQ(tiles[0].mid(0, 2), (QStringList{"Row", "Column"})) << "a board, not a list";
  ASSERT_NE(rows[0].value(0), "Row") << "a list, not a board";
  EXPECT_EQ(NamesOf(tiles), NamesOf(rows));
  // Tiles fill rows of at least three columns, in index order.
  const int rowCol = tiles[0].indexOf("Row"), colCol = tiles[0].indexOf("Column");
  int columns = 0;
  for (std::size_t i = 1; i < tiles.size(); ++i) columns = std::max(columns, tiles[i].value(colCol).toInt() + 1);
  EXPECT_GE(columns, 3);
  for (std::size_t i = 1; i < tiles.size(); ++i) {
    EXPECT_EQ(tiles[i].value(rowCol).toInt(), int(i - 1) / columns);
    EXPECT_EQ(tiles[i].value(colCol).toInt(), int(i - 1) % columns);
    EXPECT_FALSE(tiles[i].value(tiles[0].indexOf("Last")).isEmpty()) << "live values on every tile";
  }

  // The market's instruments, to check the filters' rows.
  const RunResult listed = RunTerminal({"--seed", kSeed, "--list-instruments"});
  ASSERT_EQ(listed.exitCode, 0);
  QMultiMap<QString, Instrument> byName;  // "name\texchange"; twins of other products share it
  QMap<QString, Instrument> byCode;  // "pid\tcode"
  for (const QString& line : listed.out.split('\n', Qt::SkipEmptyParts)) {
    const QStringList f = line.split('\t');
    if (f.size() < 4) continue;
    const Instrument ins{f[0], f[1], f[2].trimmed()};
    byName.insert(f[3].trimmed() + "\t" + ins.exchange, ins);
    byCode[f[0] + "\t" + f[1]] = ins;
  }

  // A list-mode filter: Equities (101) of SEHK, every sector and letter.
  const auto sehk = ReadTsv(QDir(boardDump.path()).filePath("CPriceViewAdv-2.tsv"));
  ASSERT_GE(sehk.size(), 11u) << "the simulated market lists SEHK equities";
  EXPECT_LE(sehk.size(), 201u) << "the terminal's ADVFT limit";
  // The list shows the product's type in its first column: equities are "ES".
  for (std::size_t i = 1; i < sehk.size(); ++i) EXPECT_EQ(sehk[i].value(0), "ES") << sehk[i].join(" | ").toStdString();
  for (const auto& [name, exchange] : NamesOf(sehk)) {
    SCOPED_TRACE(name.toStdString());
    EXPECT_EQ(exchange, "SEHK");
    bool equity = false;
    for (const Instrument& ins : byName.values(name + "\t" + exchange)) equity = equity || ins.productId == "101";
    EXPECT_TRUE(equity) << "an equity of SEHK has this name";
  }
  // A board-mode filter: Equities of SGX whose codes start with "A".
  const auto sgxA = ReadTsv(QDir(boardDump.path()).filePath("CPriceViewAdv-3.tsv"));
  ASSERT_GE(sgxA.size(), 2u);
  const int code = sgxA[0].indexOf("Code");
  ASSERT_GE(code, 0);
  for (std::size_t i = 1; i < sgxA.size(); ++i) {
    SCOPED_TRACE(sgxA[i].join(" | ").toStdString());
    ASSERT_TRUE(byCode.contains("101\t" + sgxA[i].value(code)));
    EXPECT_EQ(byCode["101\t" + sgxA[i].value(code)].exchange, "SGX");
    EXPECT_TRUE(sgxA[i].value(code).startsWith('A'));
  }
}

}  // namespace
