// Full repaint of a 1920x1080 grid of 27 columns over 500 rows: the grid
// engine (cells filled on demand, as the views do) against a QTableView over a
// static model holding the same texts. Ends with "RATIO grid_paint <r>"
// (engine time / QTableView time; below 1 means the engine is faster).
//
//   build-ui/bin/bench_grid
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

#include "grid/GridCtrl.h"

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
  std::fflush(stdout);
  g_fixture.reset();
  benchmark::Shutdown();
  return 0;
}
