// Full repaint of a 1920x1080 grid of 27 columns over 500 rows: the grid
// engine (cells filled on demand, as the views do) against a QTableView over a
// static model holding the same texts. Ends with "RATIO grid_paint <r>"
// (engine time / QTableView time; below 1 means the engine is faster).
//
// The price view's board repainting a full 1920x1080 board after every tile's
// quote changed, against the price view's list grid repainting the same
// instruments after the same changes: "RATIO board_paint <r>" (board time /
// list time; tiles draw more than rows, so somewhat above 1 is expected).
//
// The time-and-sales grid painting its visible rows after scrolling to the
// middle of a 99,900-trade tape, against the same grid over a 100-trade tape:
// "RATIO tape_scroll <r>" (about 1 when the cost does not grow with the tape).
//
//   build-ui/bin/bench_grid
// bench-links: mv_addon_objects mv_ui mv_data HostView HostConfig HostTitle platform Qt6::Widgets
#include <benchmark/benchmark.h>

#include <QApplication>
#include <QHeaderView>
#include <QImage>
#include <QPainter>
#include <QStandardItemModel>
#include <QTableView>
#include <cstdio>
#include <map>
#include <memory>
#include <string>
#include <vector>

#include "data/MarketStores.h"
#include "data/QuoteStore.h"
#include "data/ReferenceStores.h"
#include "data/TradeTape.h"
#include "grid/GridCtrl.h"
#include "platform/Platform.h"
#include "views/instrument/SalesFeed.h"
#include "views/instrument/TimeASGrid.h"
#include "views/price/BoardGrid.h"
#include "views/price/PriceGrid.h"
#include "views/price/Watchlists.h"

namespace {

constexpr int kRows = 500;
constexpr int kCols = 27;
constexpr int kWidth = 1920;
constexpr int kHeight = 1080;
constexpr int kRowHeight = 21;

// The texts of a quote table: codes and names at the left, prices after.
const std::vector<std::vector<QString>>& Texts() {
  static const auto texts = [] {
    std::vector<std::vector<QString>> t(kRows, std::vector<QString>(kCols));
    for (int r = 0; r < kRows; ++r)
      for (int c = 0; c < kCols; ++c) {
        if (c == 0) t[r][c] = QStringLiteral("%1").arg(1000 + r);
        else if (c == 1) t[r][c] = QStringLiteral("Instrument %1 Holdings").arg(r);
        else if (c < 5) t[r][c] = QStringLiteral("HKEX");
        else t[r][c] = QString::number(12.345 + r * 0.01 + c, 'f', 3);
      }
    return t;
  }();
  return texts;
}

int Align(int col) { return col < 5 ? int(Qt::AlignLeft | Qt::AlignVCenter) : int(Qt::AlignRight | Qt::AlignVCenter); }

class BenchGrid : public CGridCtrl {
 public:
  BenchGrid() {
    SetNumberCols(kCols);
    SetNumberRows(kRows);
    SetDefRowHeight(kRowHeight);
    SetTH_Height(kRowHeight);
    for (int c = 0; c < kCols; ++c) SetColWidth(c, kWidth / kCols);
    resize(kWidth, kHeight);
  }

 protected:
  void OnGetCell(int col, int row, CGridCell& cell) override {
    if (row < 0) { cell.text = QStringLiteral("Column %1").arg(col); return; }
    cell.text = Texts()[std::size_t(row)][std::size_t(col)];
    cell.alignment = Align(col);
    cell.backColor = (row & 1) ? QColor(240, 240, 240) : QColor(255, 255, 255);
  }
};

struct Fixture {
  BenchGrid grid;
  QStandardItemModel model{kRows, kCols};
  QTableView table;
  QImage image{kWidth, kHeight, QImage::Format_ARGB32_Premultiplied};
  Fixture() {
    for (int r = 0; r < kRows; ++r)
      for (int c = 0; c < kCols; ++c) {
        auto* item = new QStandardItem(Texts()[std::size_t(r)][std::size_t(c)]);
        item->setTextAlignment(Qt::Alignment(Align(c)));
        model.setItem(r, c, item);
      }
    for (int c = 0; c < kCols; ++c) model.setHeaderData(c, Qt::Horizontal, QStringLiteral("Column %1").arg(c));
    table.setModel(&model);
    table.setAlternatingRowColors(true);
    table.verticalHeader()->hide();
    table.verticalHeader()->setDefaultSectionSize(kRowHeight);
    table.horizontalHeader()->setDefaultSectionSize(kWidth / kCols);
    table.resize(kWidth, kHeight);
    grid.show();
    table.show();
  }
};

// Made on first use, destroyed in main while the application still exists.
std::unique_ptr<Fixture> g_fixture;
Fixture& F() {
  if (!g_fixture) g_fixture = std::make_unique<Fixture>();
  return *g_fixture;
}

void BM_GridEnginePaint(benchmark::State& state) {
  auto& f = F();
  for (auto _ : state) {
    QPainter p(&f.image);
    f.grid.render(&p);
    p.end();
    benchmark::DoNotOptimize(f.image.constBits());
  }
  state.SetItemsProcessed(state.iterations());
}

void BM_QTableViewPaint(benchmark::State& state) {
  auto& f = F();
  for (auto _ : state) {
    QPainter p(&f.image);
    f.table.render(&p);
    p.end();
    benchmark::DoNotOptimize(f.image.constBits());
  }
  state.SetItemsProcessed(state.iterations());
}

BENCHMARK(BM_GridEnginePaint)->Unit(benchmark::kMillisecond)->MinTime(1.0);
BENCHMARK(BM_QTableViewPaint)->Unit(benchmark::kMillisecond)->MinTime(1.0);

// ---- board against list -------------------------------------------------------

constexpr int kBoardInstruments = 64;  // 8 columns x 8 rows of tiles fill 1920x1080

struct QuoteBoardFixture {
  std::vector<JInstrumentUnderlying> instruments;
  std::vector<InstrumentKey> keys;
  BoardGrid board;
  PriceGrid list;
  QImage image{kWidth, kHeight, QImage::Format_ARGB32_Premultiplied};
  int step = 0;
  QuoteBoardFixture() {
    for (int n = 0; n < kBoardInstruments; ++n) {
      JInstrumentUnderlying i;
      i.productId = 101;
      i.instrumentCode = "B" + std::to_string(100 + n);
      i.symbol = i.displayCode = i.instrumentCode;
      i.instrumentName = "Board Instrument " + std::to_string(n) + " Holdings";
      i.exchangeCode = "SGX";
      i.decimals = 3;
      i.lotSize = 100;
      i.productType = "ES";
      instruments.push_back(i);
      keys.push_back(InstrumentKeyOf(i));
    }
    InstrumentMgr_ReadOnly().Fill(&instruments);
    for (CGridCtrl* g : {static_cast<CGridCtrl*>(&board), static_cast<CGridCtrl*>(&list)}) {
      g->resize(kWidth, kHeight);
      g->show();
    }
    board.LoadItems(kUserWatchlists, L"Bench", keys);
    list.LoadItems(kUserWatchlists, L"Bench", keys);
    ChangeEveryQuote();
  }
  // New last, change, bid, ask, volumes for every instrument (marks up or down).
  void ChangeEveryQuote() {
    ++step;
    QuoteStore& store = QuoteStore::Instance();
    const std::uint32_t now = platform::TickCount();
    for (int n = 0; n < kBoardInstruments; ++n) {
      const double last = 10.0 + n * 0.25 + ((step + n) % 2 ? 0.005 : -0.005) * (step % 7);
      const auto& key = keys[std::size_t(n)];
      store.Update(key, L"LAST", std::to_wstring(last), now);
      store.Update(key, L"CHANGE", std::to_wstring(last - 10.0 - n * 0.25), now);
      store.Update(key, L"PCHANGE", std::to_wstring((last - 10.0 - n * 0.25) / 10.0 * 100), now);
      store.Update(key, L"BID", std::to_wstring(last - 0.005), now);
      store.Update(key, L"ASK", std::to_wstring(last + 0.005), now);
      store.Update(key, L"BVOL", std::to_wstring(1000 * (1 + (step + n) % 9)), now);
      store.Update(key, L"SVOL", std::to_wstring(1000 * (1 + (step + 2 * n) % 9)), now);
      store.Update(key, L"VOL", std::to_wstring(100000 + step * 100 + n), now);
      store.Update(key, L"HIGH", std::to_wstring(last + 0.1), now);
      store.Update(key, L"LOW", std::to_wstring(last - 0.1), now);
    }
  }
};

std::unique_ptr<QuoteBoardFixture> g_board;
QuoteBoardFixture& B() {
  if (!g_board) g_board = std::make_unique<QuoteBoardFixture>();
  return *g_board;
}

template <class Grid>
void PaintAfterChange(benchmark::State& state, Grid& grid) {
  auto& f = B();
  for (auto _ : state) {
    state.PauseTiming();
    f.ChangeEveryQuote();
    state.ResumeTiming();
    // What the view's timer does: the counter, then one full repaint.
    grid.UpdateCounter();
    QPainter p(&f.image);
    grid.render(&p);
    p.end();
    benchmark::DoNotOptimize(f.image.constBits());
  }
  state.SetItemsProcessed(state.iterations());
}

// ---- trade tape ----------------------------------------------------------------

constexpr int kLongTape = 99900;  // 999 full pages
constexpr int kShortTape = 100;   // the live page alone
constexpr int kTapeWidth = 420;
constexpr int kTapeHeight = 640;  // about 30 visible rows

// A tape of `trades` trades in the shared stores, as the view receives it: the
// live page text (for the row count) and every trade parsed into TradeTape.
void FillTape(const InstrumentKey& key, int trades) {
  TradeTape& tape = TradeTape::Instance();
  for (int n = 1; n <= trades; ++n) {
    TradeRecord t;
    t.number = n;
    t.time = L"20261207" + std::wstring(n % 2 ? L"10:31:07" : L"10:31:08");
    t.price = std::to_wstring(12 + n % 50) + L".345";
    t.volume = std::to_wstring(100 * (1 + n % 37));
    t.side = std::to_wstring(n % 4);
    tape.Store(key, std::move(t));
  }
  std::wstring live;
  for (int n = trades; n > std::max(0, trades - 100); --n)
    live += (live.empty() ? L"" : L";") + std::wstring(L"2026120710:31:07|12.345|100|1||") + std::to_wstring(n);
  const PageKey page{key.ProductID, key.InstrumentCode, sales::kLivePage};
  SalesPageStore::Instance().Get(page, 0);
  SalesPageStore::Instance().Update(page, SalesPageLayout::TradeData, live, 1);
}

struct TapeFixture {
  TimeASGrid longGrid;
  TimeASGrid shortGrid;
  QImage image{kTapeWidth, kTapeHeight, QImage::Format_ARGB32_Premultiplied};
  TapeFixture() {
    const InstrumentKey longKey{3, L"LONGTAPE"};
    const InstrumentKey shortKey{3, L"SHORTTAPE"};
    FillTape(longKey, kLongTape);
    FillTape(shortKey, kShortTape);
    for (auto [grid, key] : {std::pair{&longGrid, longKey}, std::pair{&shortGrid, shortKey}}) {
      grid->resize(kTapeWidth, kTapeHeight);
      grid->SetInstrument(key);
      grid->NewestStamp();  // the recount sizes the rows
      grid->show();
    }
    // The middle of the long tape; the short one shows its first rows.
    longGrid.SetTopRow(longGrid.GetNumberRows() / 2);
  }
};

std::unique_ptr<TapeFixture> g_tape;
TapeFixture& T() {
  if (!g_tape) g_tape = std::make_unique<TapeFixture>();
  return *g_tape;
}

void PaintTape(benchmark::State& state, TimeASGrid& grid, int expectedRows) {
  auto& f = T();
  if (grid.GetNumberRows() != expectedRows) {
    state.SkipWithError("the tape was not counted");
    return;
  }
  for (auto _ : state) {
    QPainter p(&f.image);
    grid.render(&p);
    p.end();
    benchmark::DoNotOptimize(f.image.constBits());
  }
  state.SetItemsProcessed(state.iterations());
}

void BM_BoardPaint(benchmark::State& state) { PaintAfterChange(state, B().board); }
void BM_ListPaintSameInstruments(benchmark::State& state) { PaintAfterChange(state, B().list); }

BENCHMARK(BM_BoardPaint)->Unit(benchmark::kMillisecond)->MinTime(1.0);
BENCHMARK(BM_ListPaintSameInstruments)->Unit(benchmark::kMillisecond)->MinTime(1.0);

void BM_TapeScrollLong(benchmark::State& state) { PaintTape(state, T().longGrid, kLongTape); }
void BM_TapeScrollShort(benchmark::State& state) { PaintTape(state, T().shortGrid, kShortTape); }

BENCHMARK(BM_TapeScrollLong)->Unit(benchmark::kMicrosecond)->MinTime(1.0);
BENCHMARK(BM_TapeScrollShort)->Unit(benchmark::kMicrosecond)->MinTime(1.0);

// Keeps the time per iteration of every run for the RATIO lines.
class RatioReporter : public benchmark::ConsoleReporter {
 public:
  // CPU time per iteration in ns, by function name: the machine is shared,
  // and wall time would count other processes.
  std::map<std::string, double> perIteration;
  void ReportRuns(const std::vector<Run>& runs) override {
    for (const auto& r : runs)
      if (r.run_type == Run::RT_Iteration && r.iterations > 0)
        perIteration[r.run_name.function_name] = r.cpu_accumulated_time * 1e9 / double(r.iterations);
    ConsoleReporter::ReportRuns(runs);
  }
};

}  // namespace

int main(int argc, char** argv) {
  if (qEnvironmentVariableIsEmpty("QT_QPA_PLATFORM")) qputenv("QT_QPA_PLATFORM", "offscreen");
  QApplication app(argc, argv);
  benchmark::Initialize(&argc, argv);
  RatioReporter reporter;
  benchmark::RunSpecifiedBenchmarks(&reporter);
  const auto& t = reporter.perIteration;
  auto engine = t.find("BM_GridEnginePaint");
  auto table = t.find("BM_QTableViewPaint");
  if (engine != t.end() && table != t.end() && table->second > 0) {
    std::printf("grid engine full repaint: %.3f ms CPU, QTableView: %.3f ms CPU\n", engine->second / 1e6, table->second / 1e6);
    std::printf("RATIO grid_paint %.3f\n", engine->second / table->second);
  }
  auto boardPaint = t.find("BM_BoardPaint");
  auto listPaint = t.find("BM_ListPaintSameInstruments");
  if (boardPaint != t.end() && listPaint != t.end() && listPaint->second > 0) {
    std::printf("repaint after every quote changed: board of %d tiles %.3f ms CPU, list %.3f ms CPU\n",
                kBoardInstruments, boardPaint->second / 1e6, listPaint->second / 1e6);
    std::printf("RATIO board_paint %.3f\n", boardPaint->second / listPaint->second);
  }
  auto longTape = t.find("BM_TapeScrollLong");
  auto shortTape = t.find("BM_TapeScrollShort");
  if (longTape != t.end() && shortTape != t.end() && shortTape->second > 0) {
    std::printf("tape paint after scrolling: %d trades %.3f ms CPU, %d trades %.3f ms CPU\n", kLongTape,
                longTape->second / 1e6, kShortTape, shortTape->second / 1e6);
    std::printf("RATIO tape_scroll %.3f\n", longTape->second / shortTape->second);
  }
  std::fflush(stdout);
  g_board.reset();
  g_tape.reset();
  g_fixture.reset();
  benchmark::Shutdown();
  return 0;
}
