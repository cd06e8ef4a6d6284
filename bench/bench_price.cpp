// One 200 ms tick of the price view in list mode: 500 rows x 27 columns,
// 1,000 quote updates since the last tick (written into the quote store),
// the resort on "LAST" and the repaint of the visible part at 1920x1080,
// against the way a Qt developer would build it by default: a
// QStandardItemModel behind a QSortFilterProxyModel (dynamic sort on the
// "LAST" column) in a QTableView, the same texts, the same updates through
// setData, the same sort and the same repaint.
//
// Prints the median and worst tick of each (CPU time: the machine is shared),
// whether a tick with nothing changed repaints, and
// "RATIO price_tick <project median / baseline median>".
//
//   build/bin/bench_price [ticks]
//   BENCH_DETAIL=1         each tick's parts (store writes, counter, sort, paint) on stderr
//   BENCH_PROJECT_ONLY=1   the price view alone (for profiling)
//
// bench-links: mv_addon_objects Qt6::Widgets
#include <time.h>

#include <QApplication>
#include <QHeaderView>
#include <QImage>
#include <QPainter>
#include <QSortFilterProxyModel>
#include <QStandardItemModel>
#include <QTableView>
#include <algorithm>
#include <cstdio>
#include <cstdlib>
#include <random>
#include <string>
#include <vector>

#include "addon/Feeds.h"
#include "data/QuoteStore.h"
#include "data/ReferenceStores.h"
#include "hostconfig/UserSettings.h"
#include "views/price/PriceColumns.h"
#include "views/price/PriceGrid.h"
#include "views/price/Watchlists.h"

namespace {

constexpr int kRows = 500;
constexpr int kUpdatesPerTick = 1000;
constexpr int kWidth = 1920;
constexpr int kHeight = 1080;
constexpr std::uint32_t kTickMs = 200;

double CpuMs() {
  timespec ts{};
  clock_gettime(CLOCK_PROCESS_CPUTIME_ID, &ts);
  return double(ts.tv_sec) * 1e3 + double(ts.tv_nsec) / 1e6;
}

// The fields that move, and how.
struct Moving {
  const char* name;
  int quoteField;
  bool volume;
};
const Moving kMoving[] = {
    {"LAST", QuoteLayout::Last, false},     {"BID", QuoteLayout::Bid, false},  {"ASK", QuoteLayout::Ask, false},
    {"BVOL", QuoteLayout::BVol, true},      {"SVOL", QuoteLayout::SVol, true}, {"VOL", QuoteLayout::Vol, true},
    {"CHANGE", QuoteLayout::Change, false}, {"HIGH", QuoteLayout::High, false}, {"LOW", QuoteLayout::Low, false},
};

// One update: instrument row, moving field, the value as the terminal sends it.
struct Update {
  int row;
  int moving;
  double value;
  std::string text;
};

// The same market for both sides: a random walk per instrument.
class Feed {
 public:
  explicit Feed(unsigned seed) : m_rng(seed), m_price(kRows) {
    for (int r = 0; r < kRows; ++r) m_price[std::size_t(r)] = 1.0 + 99.0 * Uniform();
  }
  std::vector<Update> Next(int count) {
    std::vector<Update> out;
    out.reserve(std::size_t(count));
    for (int i = 0; i < count; ++i) {
      Update u;
      u.row = int(m_rng() % kRows);
      u.moving = int(m_rng() % std::size(kMoving));
      double& p = m_price[std::size_t(u.row)];
      if (kMoving[u.moving].volume) {
        u.value = double(100 * (1 + m_rng() % 5000));
        u.text = std::to_string(static_cast<long long>(u.value));
      } else {
        p = std::max(0.01, p + (Uniform() - 0.5) * 0.1);
        u.value = p;
        char buf[32];
        std::snprintf(buf, sizeof buf, "%.2f", p);
        u.text = buf;
      }
      out.push_back(std::move(u));
    }
    return out;
  }

 private:
  double Uniform() { return double(m_rng() % 1000000) / 1e6; }
  std::mt19937 m_rng;
  std::vector<double> m_price;
};

std::vector<JInstrumentUnderlying> MakeInstruments() {
  std::vector<JInstrumentUnderlying> list;
  for (int r = 0; r < kRows; ++r) {
    JInstrumentUnderlying i;
    i.productId = 101;
    i.instrumentCode = "C" + std::to_string(1000 + r);
    i.exchangeCode = "SGX";
    i.symbol = "SYM" + std::to_string(r);
    i.instrumentName = "Instrument " + std::to_string(r) + " Holdings";
    i.decimals = 2;
    i.currency = "SGD";
    i.productType = "ES";
    list.push_back(std::move(i));
  }
  return list;
}

struct Stats {
  double median = 0, worst = 0;
  int repaints = 0;
};
Stats Summarise(std::vector<double> times, int repaints) {
  std::sort(times.begin(), times.end());
  return Stats{times[times.size() / 2], times.back(), repaints};
}

// ---- The price view's path ------------------------------------------------------

class ProjectTick {
 public:
  explicit ProjectTick(const std::vector<JInstrumentUnderlying>& instruments) {
    CWatchlistSetting s = GetUserSettings().GetWatchlistSetting();
    ColumnSettingInfo info;
    s.GetSettingInfo(pricecol::LayoutIdOf(s), info);
    for (auto& item : info.items) item.visible = true;
    s.SetSettingInfo(info.id, info);
    GetUserSettings().SetWatchlistSetting(s);
    for (const auto& i : instruments) m_keys.push_back(InstrumentKeyOf(i));
    m_grid.resize(kWidth, kHeight);
    m_grid.ApplyColumns();
    m_grid.LoadItems(kUserWatchlists, L"Bench", m_keys);
    m_grid.show();
    m_grid.SortOnColumn(m_grid.ColumnOf(pricecol::Col::Last));
    m_seen = m_grid.UpdateCounter();
  }
  int Columns() const { return m_grid.GetNumberCols(); }

  // One tick; returns whether it repainted.
  bool Tick(const std::vector<Update>& updates, std::uint32_t now) {
    const double tstart = CpuMs();
    QuoteStore& store = QuoteStore::Instance();
    const double tw = CpuMs();
    for (const Update& u : updates) {
      // What the view does with a 410: widen and write into the store.
      store.Update(m_keys[std::size_t(u.row)], kMoving[u.moving].quoteField, hv::Widen(u.text), now);
    }
    store.ExpireMarks(now);
    const double t0 = CpuMs();
    m_writeMs = t0 - tw;
    const std::uint64_t counter = m_grid.UpdateCounter();
    if (counter == m_seen) return false;
    m_seen = counter;
    const double t1 = CpuMs();
    m_grid.ApplySort();
    const double t2 = CpuMs();
    QPainter p(&m_image);
    m_grid.render(&p);
    p.end();
    const double t3 = CpuMs();
    if (std::getenv("BENCH_DETAIL")) std::fprintf(stderr, "pre %.3f writes %.3f counter %.3f sort %.3f paint %.3f\n", tw - tstart, m_writeMs, t1 - t0, t2 - t1, t3 - t2);
    return true;
  }
  QString Cell(int row) { return m_grid.CellText(m_grid.ColumnOf(pricecol::Col::Last), row); }

 private:
  std::vector<InstrumentKey> m_keys;
  PriceGrid m_grid;
  QImage m_image{kWidth, kHeight, QImage::Format_ARGB32_Premultiplied};
  std::uint64_t m_seen = 0;
  double m_writeMs = 0;
};

// ---- The default Qt way ----------------------------------------------------------

class BaselineTick {
 public:
  static constexpr int kSortRole = Qt::UserRole + 1;

  BaselineTick(const std::vector<JInstrumentUnderlying>& instruments, int columns)
      : m_model(kRows, columns), m_columns(columns) {
    // The same column order as the grid: the fields of the moving quotes sit
    // where the grid shows them.
    for (int c = 0; c < columns; ++c) m_model.setHeaderData(c, Qt::Horizontal, QStringLiteral("Column %1").arg(c));
    for (int r = 0; r < kRows; ++r) {
      const auto& ins = instruments[std::size_t(r)];
      for (int c = 0; c < columns; ++c) {
        auto* item = new QStandardItem;
        if (c == kSymbolCol) item->setText(QString::fromStdString(ins.symbol));
        else if (c == kNameCol) item->setText(QString::fromStdString(ins.instrumentName));
        else if (c == kExchangeCol) item->setText(QStringLiteral("SGX"));
        else item->setText(QStringLiteral("0.000"));
        item->setTextAlignment(c > kExchangeCol ? Qt::AlignRight | Qt::AlignVCenter : Qt::AlignLeft | Qt::AlignVCenter);
        m_model.setItem(r, c, item);
      }
    }
    m_proxy.setSourceModel(&m_model);
    m_proxy.setSortRole(kSortRole);
    m_proxy.setDynamicSortFilter(true);
    m_proxy.sort(ColumnOf(0), Qt::AscendingOrder);
    m_view.setModel(&m_proxy);
    m_view.setSortingEnabled(true);
    m_view.sortByColumn(ColumnOf(0), Qt::AscendingOrder);
    m_view.setAlternatingRowColors(true);
    m_view.verticalHeader()->hide();
    m_view.verticalHeader()->setDefaultSectionSize(20);
    m_view.horizontalHeader()->setDefaultSectionSize(70);
    m_view.resize(kWidth, kHeight);
    m_view.show();
  }

  void Tick(const std::vector<Update>& updates) {
    for (const Update& u : updates) {
      const QModelIndex index = m_model.index(u.row, ColumnOf(u.moving));
      const QString text = kMoving[u.moving].volume ? QString::number(u.value, 'f', 2) : QString::fromStdString(u.text);
      m_model.setData(index, text, Qt::DisplayRole);
      m_model.setData(index, u.value, kSortRole);
    }
    QPainter p(&m_image);
    m_view.render(&p);
  }

 private:
  static constexpr int kSymbolCol = 2, kNameCol = 3, kExchangeCol = 4;
  // A column per moving field, after the instrument columns.
  int ColumnOf(int moving) const { return std::min(m_columns - 1, kExchangeCol + 1 + moving); }

  QStandardItemModel m_model;
  QSortFilterProxyModel m_proxy;
  QTableView m_view;
  int m_columns;
  QImage m_image{kWidth, kHeight, QImage::Format_ARGB32_Premultiplied};
};

}  // namespace

int main(int argc, char** argv) {
  if (qEnvironmentVariableIsEmpty("QT_QPA_PLATFORM")) qputenv("QT_QPA_PLATFORM", "offscreen");
  QApplication app(argc, argv);
  const int ticks = argc > 1 ? std::max(10, std::atoi(argv[1])) : 150;

  const std::vector<JInstrumentUnderlying> instruments = MakeInstruments();
  InstrumentMgr_ReadOnly().Fill(&instruments);
  ProjectTick project(instruments);
  BaselineTick baseline(instruments, project.Columns());

  // Every instrument has a value before timing starts.
  Feed warmProject(7), warmBaseline(7);
  std::uint32_t now = 1000;
  for (int i = 0; i < 5; ++i) {
    project.Tick(warmProject.Next(kRows * 4), now += kTickMs);
    baseline.Tick(warmBaseline.Next(kRows * 4));
  }

  Feed projectFeed(11), baselineFeed(11);
  std::vector<double> projectTimes, baselineTimes;
  int projectRepaints = 0;
  for (int t = 0; t < ticks; ++t) {
    // The updates are prepared outside the timing: the terminal hands them in.
    const std::vector<Update> a = projectFeed.Next(kUpdatesPerTick);
    const std::vector<Update> b = baselineFeed.Next(kUpdatesPerTick);
    now += kTickMs;
    double start = CpuMs();
    projectRepaints += project.Tick(a, now) ? 1 : 0;
    projectTimes.push_back(CpuMs() - start);
    start = CpuMs();
    if (!std::getenv("BENCH_PROJECT_ONLY")) baseline.Tick(b);
    baselineTimes.push_back(CpuMs() - start);
  }
  // A tick with nothing changed (marks long expired) must not repaint.
  now += 5000;
  project.Tick({}, now);
  const bool idleRepaint = project.Tick({}, now += kTickMs);

  const Stats p = Summarise(projectTimes, projectRepaints);
  const Stats b = Summarise(baselineTimes, ticks);
  std::printf("ticks: %d of %d updates over %d rows x %d columns, repaint at %dx%d\n", ticks, kUpdatesPerTick, kRows,
              project.Columns(), kWidth, kHeight);
  std::printf("price view tick: median %.3f ms, worst %.3f ms CPU (%d repaints)\n", p.median, p.worst, p.repaints);
  std::printf("QStandardItemModel+QSortFilterProxyModel+QTableView tick: median %.3f ms, worst %.3f ms CPU\n", b.median,
              b.worst);
  std::printf("tick with nothing changed repaints: %s\n", idleRepaint ? "yes" : "no");
  std::printf("RATIO price_tick %.3f\n", b.median > 0 ? p.median / b.median : 0.0);
  std::fflush(stdout);
  return idleRepaint ? 1 : 0;
}
