// The terminal in-process as a user meets it, with its own views (no add-on):
// the names on menus, docks and the status bar, the dark style of the whole
// window, the trade ticket and the blotter across a restart, links and drops
// between views, the chart's axes, and problems shown in the window.
#include <gtest/gtest.h>

#include <QApplication>
#include <QChart>
#include <QChartView>
#include <QDateTime>
#include <QDateTimeAxis>
#include <QDropEvent>
#include <QLabel>
#include <QLineEdit>
#include <QListWidget>
#include <QMenu>
#include <QMenuBar>
#include <QMimeData>
#include <QStatusBar>
#include <QTableWidget>
#include <QValueAxis>
#include <cmath>
#include <filesystem>
#include <fstream>
#include <iterator>

#include "hostview/MessageIds.h"
#include "hostview/Text.h"
#include "platform/Platform.h"
#include "terminal/app/AddonLoader.h"
#include "terminal/app/MainWindow.h"
#include "terminal/app/SettingsDialog.h"
#include "terminal/app/TerminalApp.h"
#include "terminal/host/HostRuntime.h"
#include "terminal/sim/Market.h"
#include "terminal/store/Store.h"
#include "terminal/views/OwnViews.h"

namespace fs = std::filesystem;

namespace {

// Never destroyed: input devices Qt registers while windows are shown live in
// a list that static destruction may take down before a static application.
QApplication& App() {
  static int argc = 1;
  static char name[] = "test";
  static char* argv[] = {name, nullptr};
  static QApplication* app = new QApplication(argc, argv);
  return *app;
}

struct TempDir {
  fs::path path;
  TempDir() {
    std::string tmpl = (fs::temp_directory_path() / "term_use_XXXXXX").string();
    path = mkdtemp(tmpl.data());
  }
  ~TempDir() { fs::remove_all(path); }
};

term::Options SmallRun() {
  term::Options o;
  o.headless = true;
  o.seconds = 1;
  o.instruments = 200;
  o.seed = 5;
  return o;
}

std::unique_ptr<term::Store> OpenStore(const fs::path& dir) {
  term::StoreOpenReport report;
  std::string error;
  auto store = term::Store::Open(dir, report, error);
  EXPECT_TRUE(store) << error;
  return store;
}

std::string ReadFile(const fs::path& p) {
  std::ifstream in(p, std::ios::binary);
  return {std::istreambuf_iterator<char>(in), {}};
}

// Plays `ms` of market time through the application's pump.
void Play(term::TerminalApp& app, std::uint32_t ms) {
  auto& clock = platform::UseVirtualClock();
  for (std::uint32_t t = 0; t < ms; t += 50) {
    clock.Advance(50);
    app.Pump(clock.Now());
    platform::ProcessPosted();
  }
  QCoreApplication::processEvents();
}

// Sends a JSON link to a view as the host does (310).
void SendLink(CSuperBaseView* view, const std::string& json) {
  const std::wstring text = hv::Widen(json);
  ViewLink link;
  link.className = L"CTradeView";
  link.link = &text;
  view->OnHostMessage(hm::LinkData, ToLParam(&link));
}

QMenu* MenuNamed(QMainWindow& w, const QString& title) {
  for (QAction* a : w.menuBar()->actions())
    if (a->menu() && a->text() == title) return a->menu();
  return nullptr;
}

int IndexOf(sim::Market& m, const std::string& code) {
  for (int i = 0; i < int(m.Instruments().size()); ++i)
    if (m.Instruments()[std::size_t(i)].instrumentCode == code) return i;
  return -1;
}

}  // namespace

TEST(TerminalNames, MenusDocksAndStatusBarReadAsNamesNotClasses) {
  App();
  platform::UseVirtualClock();
  TempDir dir;
  term::AddonLoader noAddon;
  auto store = OpenStore(dir.path);
  term::TerminalApp app(SmallRun(), noAddon, store.get());
  std::string error;
  ASSERT_TRUE(app.Start(error)) << error;
  term::MainWindow& w = app.Window();

  // The View menu names views as a person reads them.
  QStringList offered;
  for (QAction* a : MenuNamed(w, "&View")->actions())
    if (!a->isSeparator()) offered << a->text();
  EXPECT_EQ(offered, (QStringList{"Trade Ticket", "Chart", "Instrument Explorer", "Stock Analytics", "News"}));

  // Repeated views are numbered; titles follow the instrument.
  sim::Market& m = app.Runtime().Market();
  const int spx = IndexOf(m, "SPX");
  ASSERT_GE(spx, 0);
  const auto& index = m.Instruments()[std::size_t(spx)];
  CSuperBaseView* chart1 = app.OpenView("CBranticChartView", -1, {}, {}, {}, error);
  CSuperBaseView* chart2 = app.OpenView("CBranticChartView", -1, {}, {}, {}, error);
  CSuperBaseView* news = app.OpenView("CFNews", -1, {}, {}, {}, error);
  ASSERT_TRUE(chart1 && chart2 && news) << error;
  Play(app, 100);
  EXPECT_EQ(w.DockOf(chart1)->windowTitle(), "Chart");
  EXPECT_EQ(w.DockOf(chart2)->windowTitle(), "Chart 2");
  EXPECT_EQ(w.DockOf(news)->windowTitle(), "News");

  w.ActivateView(news);
  auto* status = w.statusBar()->findChild<QLabel*>("active-view-title");
  ASSERT_TRUE(status);
  EXPECT_EQ(status->text(), "News");
  SendLink(news, "{\"type\":\"x\",\"data\":[{\"Field_product_id\":\"" + std::to_string(index.productId) +
                     "\",\"Field_instrument_code\":\"SPX\"}]}");
  const QString title = w.DockOf(news)->windowTitle();
  EXPECT_TRUE(title.startsWith("News - ") && title.contains("S&P 500")) << title.toStdString();
  EXPECT_EQ(status->text(), title) << "the status bar follows the active view's title";

  // Closing the first chart makes the second one "Chart".
  w.DockOf(chart1)->close();
  QCoreApplication::processEvents();
  EXPECT_EQ(w.DockOf(chart2)->windowTitle(), "Chart");

  // The Window menu shows "&" as itself.
  QMenu* window = MenuNamed(w, "&Window");
  ASSERT_TRUE(window);
  emit window->aboutToShow();
  QStringList entries;
  for (QAction* a : window->actions()) entries << a->text();
  EXPECT_TRUE(entries.contains(QString(title).replace("&", "&&"))) << entries.join(" | ").toStdString();

  // The settings dialog names the quote columns by their headings.
  term::SettingsDialog settings(&app.Runtime().Language());
  auto* columns = settings.findChild<QListWidget*>("columns");
  ASSERT_TRUE(columns);
  ASSERT_GT(columns->count(), 10);
  QStringList names;
  for (int i = 0; i < columns->count(); ++i) names << columns->item(i)->text();
  for (const QString& n : names) EXPECT_FALSE(n.startsWith("col")) << n.toStdString();
  EXPECT_TRUE(names.contains("% Change") && names.contains("Product icon")) << names.join(", ").toStdString();
  app.Shutdown();
}

TEST(TerminalStyle, TheWholeWindowFollowsTheDarkStyle) {
  App();
  platform::UseVirtualClock();
  TempDir dir;
  term::AddonLoader noAddon;
  auto store = OpenStore(dir.path);
  term::TerminalApp app(SmallRun(), noAddon, store.get());
  std::string error;
  ASSERT_TRUE(app.Start(error)) << error;
  term::MainWindow& w = app.Window();
  CSuperBaseView* explorer = app.OpenView("CInsExpViewEx", -1, {}, {}, {}, error);
  ASSERT_TRUE(explorer) << error;
  w.resize(900, 600);
  w.show();
  QCoreApplication::processEvents();

  // What the terminal owns around the views: menu bar, status bar, dock titles, the empty window.
  auto owned = [&]() -> std::vector<QWidget*> { return {&w, w.menuBar(), w.statusBar(), w.DockOf(explorer)}; };
  auto search = explorer->findChild<QLineEdit*>("search");
  ASSERT_TRUE(search);
  auto check = [&](bool dark) {
    for (QWidget* widget : owned()) {
      const QPalette p = widget->palette();
      const int window = p.color(QPalette::Window).lightness(), text = p.color(QPalette::WindowText).lightness();
      if (dark) {
        EXPECT_LT(window, 80) << widget->metaObject()->className();
        EXPECT_GT(text, 170) << widget->metaObject()->className();
      } else {
        EXPECT_GT(window, 200) << widget->metaObject()->className();
        EXPECT_LT(text, 80) << widget->metaObject()->className();
      }
    }
    // Drawn, not only set: the status bar as the user sees it.
    const QImage bar = w.statusBar()->grab().toImage();
    ASSERT_FALSE(bar.isNull());
    const int shown = QColor(bar.pixel(bar.width() / 2, bar.height() / 2)).lightness();
    EXPECT_TRUE(dark ? shown < 80 : shown > 200) << shown;
    // The search hint reads against its field.
    const QPalette sp = search->palette();
    EXPECT_GT(std::abs(sp.color(QPalette::PlaceholderText).lightness() - sp.color(QPalette::Base).lightness()), 60);
  };
  check(false);
  emit w.styleRequested(2);
  QCoreApplication::processEvents();
  check(true);
  emit w.styleRequested(1);
  QCoreApplication::processEvents();
  check(false);
  app.Shutdown();
}

TEST(TerminalTicket, KeepsTheClickedPriceShowsTheLiveQuoteAndTheBlotterSurvivesARestart) {
  App();
  platform::UseVirtualClock();
  TempDir dir;
  term::AddonLoader noAddon;
  std::string error;
  std::string code;
  std::int64_t pid = 0;
  {
    auto store = OpenStore(dir.path);
    term::TerminalApp app(SmallRun(), noAddon, store.get());
    ASSERT_TRUE(app.Start(error)) << error;
    sim::Market& m = app.Runtime().Market();
    const int stock = m.LiquidStock();
    ASSERT_GE(stock, 0);
    code = m.Instruments()[std::size_t(stock)].instrumentCode;
    pid = m.Instruments()[std::size_t(stock)].productId;
    auto* ticket = qobject_cast<term::views::CTradeView*>(app.OpenView("CTradeView", -1, {}, {}, {}, error));
    ASSERT_TRUE(ticket) << error;
    Play(app, 100);
    // A click on a price far below the market: a sell there fills at once,
    // a buy there waits. The price is kept to the instrument's decimals.
    const double bid = m.QuoteOf(stock).bid;
    const double clicked = std::round((bid * 0.9) * 1000) / 1000;
    char priceText[32];
    std::snprintf(priceText, sizeof priceText, "%.3f", clicked);
    SendLink(ticket, "{\"type\":\"trade view\",\"data\":[{\"Field_product_id\":\"" + std::to_string(pid) +
                         "\",\"Field_instrument_code\":\"" + code + "\",\"Field_side\":\"Sell\",\"Field_Trade_price\":\"" +
                         priceText + "\"}]}");
    EXPECT_EQ(ticket->side(), "Sell");
    EXPECT_NEAR(ticket->price(), clicked, 1e-9);
    Play(app, 20000);
    EXPECT_NEAR(ticket->price(), clicked, 1e-9) << "the market moving does not move the ticket's price";
    const QString live = ticket->liveQuote();
    EXPECT_TRUE(live.contains("Bid " + QString::fromStdString(m.FormatPrice(stock, m.QuoteOf(stock).bid))))
        << live.toStdString();
    EXPECT_TRUE(live.contains("Ask " + QString::fromStdString(m.FormatPrice(stock, m.QuoteOf(stock).ask))))
        << live.toStdString();
    ticket->placeOrder();  // marketable sell: filled at the bid
    SendLink(ticket, "{\"type\":\"trade view\",\"data\":[{\"Field_product_id\":\"" + std::to_string(pid) +
                         "\",\"Field_instrument_code\":\"" + code + "\",\"Field_side\":\"Buy\",\"Field_Trade_price\":\"" +
                         priceText + "\"}]}");
    ticket->placeOrder();  // a buy far below: working
    auto* blotter = ticket->findChild<QTableWidget*>("blotter");
    ASSERT_TRUE(blotter);
    ASSERT_EQ(blotter->rowCount(), 2);
    EXPECT_EQ(blotter->item(0, 8)->text(), "Working");
    EXPECT_EQ(blotter->item(1, 8)->text(), "Filled");
    app.Shutdown();
  }
  {
    // The next day's start... of the same session: the orders are back, the ticket's side is the last one.
    auto store = OpenStore(dir.path);
    term::TerminalApp app(SmallRun(), noAddon, store.get());
    ASSERT_TRUE(app.Start(error)) << error;
    auto* ticket = qobject_cast<term::views::CTradeView*>(app.OpenView("CTradeView", -1, {}, {}, {}, error));
    ASSERT_TRUE(ticket) << error;
    Play(app, 100);
    EXPECT_EQ(ticket->side(), "Buy");
    auto* blotter = ticket->findChild<QTableWidget*>("blotter");
    ASSERT_EQ(blotter->rowCount(), 2) << "the day's orders survive a restart";
    EXPECT_EQ(blotter->item(0, 0)->text(), "2");
    EXPECT_EQ(blotter->item(0, 3)->text(), QString::fromStdString(code));
    EXPECT_EQ(blotter->item(1, 8)->text(), "Filled");
    // A new order continues the numbering.
    SendLink(ticket, "{\"type\":\"trade view\",\"data\":[{\"Field_product_id\":\"" + std::to_string(pid) +
                         "\",\"Field_instrument_code\":\"" + code + "\"}]}");
    ticket->placeOrder();
    EXPECT_EQ(blotter->item(0, 0)->text(), "3");
    app.Shutdown();
  }
  auto store = OpenStore(dir.path);
  sim::MarketConfig config;
  config.seed = 5;
  config.instruments = 200;
  sim::Market m(config);
  const auto orders = store->LoadOrders(m.DateText());
  ASSERT_EQ(orders.size(), 3u);
  EXPECT_EQ(orders[0].side, "Sell");
  EXPECT_EQ(orders[0].productId, pid);
  EXPECT_EQ(orders[1].status, "Working");
}

TEST(TerminalLinks, ExplorerDoubleClickLinksAndDropsOpenTheInstrumentWithReadableAxes) {
  App();
  platform::UseVirtualClock();
  TempDir dir;
  term::AddonLoader noAddon;
  auto store = OpenStore(dir.path);
  term::TerminalApp app(SmallRun(), noAddon, store.get());
  std::string error;
  ASSERT_TRUE(app.Start(error)) << error;
  term::MainWindow& w = app.Window();
  sim::Market& m = app.Runtime().Market();
  auto* explorer = qobject_cast<term::views::CExplorerView*>(app.OpenView("CInsExpViewEx", -1, {}, {}, {}, error));
  auto* chart = qobject_cast<term::views::CChartView*>(app.OpenView("CBranticChartView", -1, {}, {}, {}, error));
  CSuperBaseView* analytics = app.OpenView("CStockAnalytics", -1, {}, {}, {}, error);
  CSuperBaseView* news = app.OpenView("CFNews", -1, {}, {}, {}, error);
  CSuperBaseView* ticket = app.OpenView("CTradeView", -1, {}, {}, {}, error);
  ASSERT_TRUE(explorer && chart && analytics && news && ticket) << error;
  Play(app, 100);

  // Indices are typed as such.
  explorer->search("STI");
  ASSERT_GE(explorer->resultCount(), 1);
  const int stock = m.LiquidStock();
  const auto& ins = m.Instruments()[std::size_t(stock)];
  explorer->search(QString::fromStdString(ins.instrumentCode));
  ASSERT_GE(explorer->resultCount(), 1);
  explorer->linkRow(0);
  for (CSuperBaseView* v : {static_cast<CSuperBaseView*>(chart), analytics, news})
    EXPECT_EQ(v->GetStartInstrumentCode(), ins.instrumentCode) << w.DockOf(v)->windowTitle().toStdString();
  EXPECT_EQ(ticket->GetStartInstrumentCode(), "") << "a ticket does not change instrument under the user";

  // A view of the add-on that changes the linked instrument (a price-view row,
  // an instrument box) takes them along the same way.
  const auto& other = m.Instruments()[std::size_t(IndexOf(m, "SPX"))];
  const std::wstring linked = L"{\"type\":\"trade view\",\"data\":[{\"Field_instrument_code\":\"SPX\","
                              L"\"Field_product_id\":\"" + std::to_wstring(other.productId) + L"\"}]}";
  ViewLink request;
  request.link = &linked;
  app.Runtime().OnChildFeedback(ticket, hm::LinkedInstrument, ToLParam(&request));
  for (CSuperBaseView* v : {static_cast<CSuperBaseView*>(chart), analytics, news})
    EXPECT_EQ(v->GetStartInstrumentCode(), "SPX") << w.DockOf(v)->windowTitle().toStdString();
  EXPECT_EQ(ticket->GetStartInstrumentCode(), "");

  // A drag from a price-view row onto the chart opens that instrument there.
  const int spx = IndexOf(m, "SPX");
  const auto& index = m.Instruments()[std::size_t(spx)];
  QMimeData mime;
  mime.setData(term::kLinkMimeType, QByteArray("{\"type\":\"instrument view\",\"data\":[{\"Field_product_id\":\"") +
                                        QByteArray::number(qlonglong(index.productId)) +
                                        "\",\"Field_instrument_code\":\"SPX\",\"Field_exchange_code\":\"WIDX\"}]}");
  mime.setData(term::kSourceMimeType, "price view");
  term::ViewDock* chartDock = w.DockOf(chart);
  QDragEnterEvent enter(QPoint(5, 5), Qt::CopyAction, &mime, Qt::LeftButton, Qt::NoModifier);
  QApplication::sendEvent(chartDock, &enter);
  EXPECT_TRUE(enter.isAccepted());
  QDropEvent drop(QPointF(5, 5), Qt::CopyAction, &mime, Qt::LeftButton, Qt::NoModifier);
  QApplication::sendEvent(chartDock, &drop);
  EXPECT_EQ(chart->GetStartInstrumentCode(), "SPX");
  // The explorer takes no drops.
  QDragEnterEvent refused(QPoint(5, 5), Qt::CopyAction, &mime, Qt::LeftButton, Qt::NoModifier);
  QApplication::sendEvent(w.DockOf(explorer), &refused);
  EXPECT_FALSE(refused.isAccepted());

  // The chart reads as time of day and round prices.
  Play(app, 60000);
  auto* view = chart->findChild<QChartView*>();
  ASSERT_TRUE(view);
  QDateTimeAxis* time = nullptr;
  QValueAxis* price = nullptr;
  for (QAbstractAxis* a : view->chart()->axes()) {
    if (auto* t = qobject_cast<QDateTimeAxis*>(a)) time = t;
    if (auto* p = qobject_cast<QValueAxis*>(a)) price = p;
  }
  ASSERT_TRUE(time && price);
  EXPECT_EQ(time->format(), "HH:mm");
  const QTime now = QTime::fromString(QString::fromStdString(m.TimeText()), "HH:mm:ss");
  EXPECT_LE(std::abs(time->max().time().secsTo(now)), 2) << "the axis runs to the market's time";
  EXPECT_LE(time->min().time(), QTime(9, 0)) << "from the open";
  const double step = price->tickInterval();
  ASSERT_GT(step, 0);
  const double mantissa = step / std::pow(10.0, std::floor(std::log10(step) + 1e-9));
  EXPECT_TRUE(std::abs(mantissa - 1) < 1e-6 || std::abs(mantissa - 2) < 1e-6 || std::abs(mantissa - 2.5) < 1e-6 ||
              std::abs(mantissa - 5) < 1e-6)
      << step;
  EXPECT_NEAR(std::remainder(price->tickAnchor(), step), 0, step * 1e-6) << "labels on round prices";
  EXPECT_LE(price->min(), m.QuoteOf(spx).last);
  EXPECT_GE(price->max(), m.QuoteOf(spx).last);
  app.Shutdown();
}

TEST(TerminalProblems, AreShownInTheWindowAndLogged) {
  App();
  platform::UseVirtualClock();
  auto dialogs = std::make_unique<platform::RecordingDialogService>();
  platform::RecordingDialogService* shown = dialogs.get();
  platform::SetDialogService(std::move(dialogs));
  TempDir dir;
  term::AddonLoader noAddon;
  {
    // A saved layout naming a view this terminal no longer has.
    auto store = OpenStore(dir.path);
    term::SavedLayout layout;
    layout.views.push_back({"CGoneView", "dock-CGoneView-1", -1, "", {}});
    layout.views.push_back({"CFNews", "dock-CFNews-1", -1, "", {}});
    ASSERT_TRUE(store->SaveLayout(layout));
  }
  std::string error;
  {
    auto store = OpenStore(dir.path);
    // A window session (not timed) asked to open a chart on an instrument that does not exist.
    term::Options o = SmallRun();
    o.headless = false;
    o.seconds.reset();
    o.open.push_back({"CBranticChartView", 101, "NOSUCH"});
    term::TerminalApp app(o, noAddon, store.get());
    ASSERT_TRUE(app.Start(error)) << error;
    QCoreApplication::processEvents();
    term::MainWindow& w = app.Window();
    ASSERT_EQ(w.Docks().size(), 2u) << "the rest of the layout and the chart open";
    EXPECT_EQ(w.Docks()[1]->View()->GetStartInstrumentCode(), "");
    EXPECT_TRUE(w.statusBar()->currentMessage().contains("NOSUCH")) << w.statusBar()->currentMessage().toStdString();
    ASSERT_EQ(shown->shown.size(), 1u) << "the unknown instrument is told in a message box";
    EXPECT_TRUE(shown->shown[0].text.contains("101:NOSUCH")) << shown->shown[0].text.toStdString();

    // A view asking for a view class the terminal does not have.
    app.ForeignLink(L"COrderStatusViewNew", L"{}", w.Docks()[0]->View());
    EXPECT_TRUE(w.statusBar()->currentMessage().contains("COrderStatusViewNew"));
    app.Shutdown();
  }
  platform::SetDialogService(nullptr);
  const std::string log = ReadFile(dir.path / "logs" / "terminal.log");
  EXPECT_NE(log.find("CGoneView was not restored"), std::string::npos) << log;
  EXPECT_NE(log.find("unknown instrument 101:NOSUCH"), std::string::npos) << log;
  EXPECT_NE(log.find("COrderStatusViewNew"), std::string::npos) << log;
}
