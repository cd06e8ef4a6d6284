#include "terminal/app/TerminalApp.h"

#include <QApplication>
#include <QDir>
#include <QEventLoop>
#include <QFile>
#include <QFileDialog>
#include <QMessageBox>
#include <QInputDialog>
#include <QPalette>
#include <QPixmap>
#include <QStatusBar>
#include <QTextStream>
#include <chrono>
#include <cstdio>
#include <ctime>
#include <filesystem>
#include <fstream>
#include <map>
#include <unistd.h>

#include "hostconfig/UserSettings.h"
#include "hostview/MessageIds.h"
#include "hostview/StyleRoles.h"
#include "hostview/Text.h"
#include "platform/Platform.h"
#include "terminal/app/AddonLoader.h"
#include "terminal/app/GridDump.h"
#include "terminal/app/MarketSummaryDump.h"
#include "terminal/app/MarketDump.h"
#include "terminal/host/MarketQuotes.h"
#include "terminal/app/MainWindow.h"
#include "terminal/app/MarketFiles.h"
#include "terminal/app/PlaybackBar.h"
#include "terminal/app/RunFigures.h"
#include "terminal/app/SaveChurn.h"
#include "terminal/app/TerminalApplication.h"
#include "terminal/app/SettingsDialog.h"
#include "terminal/app/TerminalStyle.h"
#include "terminal/host/Services.h"
#include "terminal/host/MarketSource.h"
#include "terminal/host/ReplaySource.h"
#include "terminal/sim/Market.h"
#include "terminal/store/SqliteHostStore.h"
#include "terminal/store/SqliteSettingsStorage.h"
#include "terminal/store/Store.h"
#include "terminal/views/Blotter.h"
#include "terminal/views/TerminalView.h"

namespace term {

namespace fs = std::filesystem;

namespace {

const QStringList kAddonClasses = {"CPriceViewAdv",   "CMarketDepthAdv",   "CTimeAndSalesAdv",
                                   "CTradeSummaryAdv", "CPriceAlertList",  "CNewPriceAlertAdv"};
constexpr int kPumpMs = 50;
constexpr double kDefaultHeadlessSeconds = 10;
// At the end of a timed run the views catch up with a market that stands
// still, so that their dumps and the market's describe the same moment: long
// enough for a page count noticed once a second to be asked for and drawn.
constexpr int kSettleMs = 1500;
constexpr int kAutosaveMs = 60 * 1000;
// --soak-report: memory is sampled every simulated minute; the growth is
// measured from the tenth minute on, once the views' stores have filled.
constexpr double kSoakSampleSeconds = 60;
constexpr double kSoakWarmupSeconds = 600;

std::int64_t WallUs() {
  return std::chrono::duration_cast<std::chrono::microseconds>(std::chrono::steady_clock::now().time_since_epoch())
      .count();
}

std::int64_t ThreadCpuUs() {
  timespec ts{};
  clock_gettime(CLOCK_THREAD_CPUTIME_ID, &ts);
  return static_cast<std::int64_t>(ts.tv_sec) * 1000000 + ts.tv_nsec / 1000;
}

StartParamMap Widen(const std::map<std::string, std::string>& in) {
  StartParamMap out;
  for (const auto& [k, v] : in) out[k] = hv::Widen(v);
  return out;
}

std::map<std::string, std::string> Narrow(const StartParamMap& in) {
  std::map<std::string, std::string> out;
  for (const auto& [k, v] : in) out[k] = hv::Narrow(v);
  return out;
}

std::string JsonEscape(const std::string& s) {
  std::string out;
  for (char c : s) {
    if (c == '"' || c == '\\') { out += '\\'; out += c; }
    else if (static_cast<unsigned char>(c) < 0x20) {
      char buf[8];
      std::snprintf(buf, sizeof buf, "\\u%04x", c);
      out += buf;
    } else out += c;
  }
  return out;
}

}  // namespace

TerminalApp::TerminalApp(const Options& options, AddonLoader& addon, Store* store)
    : m_options(options), m_addon(addon), m_store(store) {}

TerminalApp::~TerminalApp() {
  Shutdown();
  views::SetLinkHandler(nullptr);
  views::SetBlotter(nullptr);
  views::SetRuntime(nullptr);
}

void TerminalApp::Progress(const std::string& line) const { std::fprintf(stderr, "terminal: %s\n", line.c_str()); }

std::vector<MainWindow::ViewClass> TerminalApp::ViewClasses(bool addon) const {
  QStringList classes;
  if (addon) {
    for (const QString& c : kAddonClasses)
      if (m_addon.Find(c.toStdString())) classes << c;
  } else {
    classes = views::ClassNames();
  }
  std::vector<MainWindow::ViewClass> out;
  for (const QString& c : classes)
    out.push_back({c, QString::fromStdWString(ViewName(&m_runtime->Language(), c.toStdString()))});
  return out;
}

const CRuntimeClass* TerminalApp::FindClass(const std::string& className) const {
  if (const CRuntimeClass* rc = m_addon.Find(className)) return rc;
  return views::FindClass(className);
}

bool TerminalApp::Start(std::string& error) {
  HostOptions ho;
  if (m_options.seed) ho.seed = *m_options.seed;
  if (m_options.instruments) ho.instruments = *m_options.instruments;
  if (m_options.rate) ho.fieldUpdatesPerSecond = *m_options.rate;
  if (m_options.pace) ho.pace = *m_options.pace;
  ho.logToStderr = m_options.verbose;
  if (m_store) {
    const fs::path logs = m_store->Path().parent_path() / "logs";
    std::error_code ec;
    fs::create_directories(logs, ec);
    if (!ec) ho.logFile = (logs / "terminal.log").string();
    ho.imageDir = (m_store->Path().parent_path() / "images").string();
    const auto ui = m_store->LoadSettings("ui.");
    if (auto it = ui.find("style"); it != ui.end() && (it->second == "1" || it->second == "2"))
      ho.styleId = std::stoi(it->second);
    m_hostStore = std::make_unique<SqliteHostStore>(*m_store, [this](const std::string& e) {
      m_saveFailed = true;
      Progress("error: " + e);
    });
  }
  if (m_options.style) ho.styleId = *m_options.style;
  m_styleId = ho.styleId;
  std::vector<std::string> marketWarnings;
  if (!PrepareMarketFiles(m_options, ho, marketWarnings, error)) return false;
  for (const std::string& w : marketWarnings) Progress("warning: " + w);
  m_recordFile = m_options.recordFile;
  m_replaySeconds = ReplaySeconds(ho);
  m_runtime = std::make_unique<HostRuntime>(ho, this, m_hostStore.get());
  if (!m_options.traceFile.empty() && !m_runtime->TraceMessages(m_options.traceFile, error)) return false;
  views::SetRuntime(m_runtime.get());
  m_log = m_runtime->LogFactory().CreateLogger();
  m_blotter = std::make_unique<views::Blotter>(m_store, m_runtime->Market().DateText());
  views::SetBlotter(m_blotter.get());
  views::SetLinkHandler([this](std::int64_t productId, const std::string& code, CSuperBaseView* from) {
    LinkInstrument(productId, code, from);
  });

  // Instruments named on the command line must exist: a timed run stops
  // before it starts, a window opens the view without one and says why.
  std::vector<std::string> unknownInstruments(m_options.open.size());
  for (std::size_t k = 0; k < m_options.open.size(); ++k) {
    const OpenRequest& o = m_options.open[k];
    if (o.productId < 0 || m_runtime->Source().Find(o.productId, o.instrumentCode) >= 0) continue;
    unknownInstruments[k] = "unknown instrument " + std::to_string(o.productId) + ":" + o.instrumentCode +
                            " in --open " + o.className + ":" + std::to_string(o.productId) + ":" +
                            o.instrumentCode + " (--list-instruments lists the instruments)";
    if (timed()) {
      error = unknownInstruments[k];
      m_startExitCode = 2;
      return false;
    }
  }
  if (!qobject_cast<TerminalStyle*>(QApplication::style())) QApplication::setStyle(new TerminalStyle);
  ApplyStyleToApplication();

  m_window = std::make_unique<MainWindow>(ViewClasses(true), ViewClasses(false),
                                          std::vector<MainWindow::Style>{{1, "&Light style"}, {2, "&Dark style"}},
                                          m_styleId);
  MainWindow* w = m_window.get();
  connect(w, &MainWindow::openRequested, this, &TerminalApp::OpenFromMenu);
  connect(w, &MainWindow::activationChanged, this, &TerminalApp::OnActivation);
  connect(w, &MainWindow::viewClosing, this, [this](CSuperBaseView* v) {
    if (m_latency) m_latency->RemoveView(v);
    m_runtime->DestroyView(v, false);
  });
  connect(w, &MainWindow::styleRequested, this, &TerminalApp::ChangeStyle);
  connect(w, &MainWindow::languageReloadRequested, this, [this] {
    // Column headings and font-size names come from the language table too.
    CWatchlistSetting watchlist = GetUserSettings().GetWatchlistSetting();
    watchlist.RefreshLanguage(&m_runtime->Language());
    if (!(watchlist == GetUserSettings().GetWatchlistSetting())) GetUserSettings().SetWatchlistSetting(watchlist);
    std::vector<MainWindow::ViewClass> all = ViewClasses(true);
    for (auto& c : ViewClasses(false)) all.push_back(c);
    m_window->SetClassNames(all);
    m_runtime->ApplyLanguage();
  });
  connect(w, &MainWindow::fontSizeRequested, this, &TerminalApp::ShowFontSize);
  connect(w, &MainWindow::settingsRequested, this, &TerminalApp::ShowSettings);
  connect(w, &MainWindow::exportWatchlistsRequested, this, &TerminalApp::ExportWatchlistsFromMenu);
  connect(w, &MainWindow::importWatchlistsRequested, this, &TerminalApp::ImportWatchlistsFromMenu);
  connect(w, &MainWindow::saveLayoutRequested, this, [this] {
    if (SaveLayout()) m_window->ShowNotice("Layout saved.");
  });
  connect(w, &MainWindow::dropRequested, this, &TerminalApp::OnDrop);
  connect(w, &MainWindow::closingWindow, this, [this] { Shutdown(); });
  if (ReplaySource* replay = m_runtime->Replay()) {
    m_playback = new PlaybackBar(*replay, w);
    w->addToolBar(Qt::TopToolBarArea, m_playback);
    w->statusBar()->addPermanentWidget(m_playback->StatusLabel());
    connect(m_playback, &PlaybackBar::notice, w, &MainWindow::ShowNotice);
  }
  for (const std::string& warning : marketWarnings) w->ShowNotice(QString::fromStdString(warning));

  if (!m_options.latencyReport.empty()) m_latency = std::make_unique<LatencyRecorder>();
  int restored = 0;
  if (m_options.restoreLayout) restored = RestoreLayout();
  for (std::size_t k = 0; k < m_options.open.size(); ++k) {
    const OpenRequest& o = m_options.open[k];
    const bool known = o.productId >= 0 && unknownInstruments[k].empty();
    StartParamMap params;
    if (known) {
      params["User_field_product_id"] = std::to_wstring(o.productId);
      params["User_field_save_space"] = L"0";
    }
    for (const auto& [key, value] : o.params) params[key] = hv::Widen(value);
    CSuperBaseView* v = OpenView(o.className, known ? o.productId : -1, known ? o.instrumentCode : std::string(),
                                 params, {}, error);
    if (!v) return false;
    // Start parameters reach the view as a restored layout's do.
    if (!o.params.empty()) m_runtime->DeliverStartLink(v);
    if (known) DeliverLink(v, o.productId, o.instrumentCode);
    if (!unknownInstruments[k].empty()) ReportProblem(QString::fromStdString("The " + unknownInstruments[k]) +
                                                          ". The view opened without an instrument.", true);
  }
  if (restored == 0 && m_options.open.empty()) OpenDefaultLayout();

  if (!virtualClock()) {
    // Real time: move the market along with the monotonic clock.
    connect(&m_pump, &QTimer::timeout, this, [this] { Pump(platform::TickCount()); });
    m_pump.start(kPumpMs);
  }
  if (!timed()) {
    // The layout is also saved now and then, so a crash or a kill loses little of it.
    connect(&m_autosave, &QTimer::timeout, this, [this] { SaveLayout(); });
    m_autosave.start(kAutosaveMs);
  }
  if (m_options.saveChurn) {
    if (!m_store) {
      error = "--save-churn needs the store";
      return false;
    }
    // A run killed inside a generation left some sets at it and the rest one
    // behind: the next run saves that generation again, whole, and goes on.
    m_churnGeneration = std::max<std::int64_t>(0, churn::Inspect(*m_store, m_runtime->Market().Instruments()).Newest());
  }
  if (m_latency) {
    // A view behind another's tab is never drawn: for the measurement every
    // view gets a place of its own.
    std::vector<ViewDock*> placed;
    for (ViewDock* d : m_window->Docks()) {
      if (d->isFloating()) continue;
      bool behind = false;
      for (ViewDock* p : placed)
        if (m_window->tabifiedDockWidgets(p).contains(d)) behind = true;
      if (behind) {
        const Qt::DockWidgetArea area = m_window->dockWidgetArea(d);
        m_window->removeDockWidget(d);
        m_window->addDockWidget(area, d);
        d->show();
      }
      placed.push_back(d);
    }
    // Each side of the window shares its height evenly.
    m_window->resize(m_window->size().expandedTo(QSize(1600, 1200)));
    for (Qt::DockWidgetArea area : {Qt::LeftDockWidgetArea, Qt::RightDockWidgetArea}) {
      QList<QDockWidget*> side;
      QList<int> heights;
      for (ViewDock* d : placed)
        if (!d->isFloating() && m_window->dockWidgetArea(d) == area) {
          side << d;
          heights << 300;
        }
      if (!side.isEmpty()) m_window->resizeDocks(side, heights, Qt::Vertical);
    }
  }
  m_window->show();
  if (m_latency) StartLatency();
  return true;
}

void TerminalApp::Pump(std::uint32_t now) {
  m_runtime->Pump(now);
  if (m_blotter) m_blotter->CheckFills(m_runtime->Market());
  if (m_playback) m_playback->Refresh();
}

void TerminalApp::OpenDefaultLayout() {
  // A first start: the price view and, on the busiest stock, its depth and trades.
  std::string error;
  OpenView("CPriceViewAdv", -1, {}, {}, {}, error);
  // The busiest stock of the simulator, or of the recording when it has not that one.
  const MarketSource& market = m_runtime->Source();
  int stock = -1;
  if (const int liquid = m_runtime->Market().LiquidStock(); liquid >= 0) {
    const auto& ins = m_runtime->Market().Instruments()[static_cast<std::size_t>(liquid)];
    stock = market.Find(ins.productId, ins.instrumentCode);
  }
  if (stock < 0 && !market.Instruments().empty()) stock = 0;
  if (stock >= 0) {
    const auto& first = market.Instruments()[static_cast<std::size_t>(stock)];
    for (const char* cls : {"CMarketDepthAdv", "CTimeAndSalesAdv"}) {
      StartParamMap params{{"User_field_product_id", std::to_wstring(first.productId)},
                           {"User_field_save_space", L"0"}};
      if (CSuperBaseView* v = OpenView(cls, first.productId, first.instrumentCode, params, {}, error))
        DeliverLink(v, first.productId, first.instrumentCode);
    }
  }
  OpenView("CPriceAlertList", -1, {}, {}, {}, error);
}

CSuperBaseView* TerminalApp::OpenView(const std::string& className, std::int64_t productId, const std::string& code,
                                      const StartParamMap& params, const QString& objectName, std::string& error) {
  const CRuntimeClass* rc = FindClass(className);
  if (!rc) {
    error = "unknown view class \"" + className + "\"";
    return nullptr;
  }
  CSuperBaseView* v = m_runtime->CreateView(rc, m_window.get(), productId, code, params);
  if (!v) {
    error = "the view class \"" + className + "\" could not be created";
    return nullptr;
  }
  ViewDock* dock = m_window->AddView(v, QString::fromStdString(className), objectName);
  if (m_latency) m_latency->AddView(v, className);
  // The view gets 2 now; the view it replaces as the active one gets 1.
  m_window->ActivateView(v);
  (void)dock;
  return v;
}

void TerminalApp::DeliverLink(CSuperBaseView* view, std::int64_t productId, const std::string& code) {
  std::string exchange;
  const int index = m_runtime->Source().Find(productId, code);
  if (index >= 0) exchange = m_runtime->Source().Instruments()[static_cast<std::size_t>(index)].exchangeCode;
  const std::string narrow = "{\"type\":\"instrument view\",\"data\":[{\"Field_product_id\":\"" +
                             std::to_string(productId) + "\",\"Field_instrument_code\":\"" + JsonEscape(code) +
                             "\",\"Field_exchange_code\":\"" + JsonEscape(exchange) + "\"}]}";
  const std::wstring link = hv::Widen(narrow);
  ViewLink vl;
  vl.className = hv::Widen(m_runtime->ClassNameOf(view));
  vl.link = &link;
  m_runtime->Deliver(view, hm::LinkData, ToLParam(&vl));
}

void TerminalApp::LinkInstrument(std::int64_t productId, const std::string& code, CSuperBaseView* from) {
  // The add-on's single-instrument views decide themselves whether they follow.
  m_runtime->LinkInstrument(productId, code);
  InstrumentLinked(hv::Widen("{\"type\":\"instrument view\",\"data\":[{\"Field_product_id\":\"" +
                             std::to_string(productId) + "\",\"Field_instrument_code\":\"" + JsonEscape(code) +
                             "\"}]}"),
                   from);
}

void TerminalApp::InstrumentLinked(const std::wstring& linkText, CSuperBaseView* requester) {
  // The terminal's chart, analytics and news follow; a ticket never changes
  // instrument under the user.
  for (ViewDock* d : m_window->Docks()) {
    CSuperBaseView* v = d->View();
    const QString cls = d->ClassName();
    if (v != requester && (cls == "CBranticChartView" || cls == "CStockAnalytics" || cls == "CFNews"))
      v->OnHostMessage(hm::LinkedInstrument, ToLParam(&linkText));
  }
}

void TerminalApp::OnActivation(CSuperBaseView* view, bool active) {
  if (active) {
    m_runtime->Activate(view);
    return;
  }
  // The view losing activation may be the one whose request opened the new
  // view; tell it once it is out of that request.
  QPointer<CSuperBaseView> guard(view);
  QTimer::singleShot(0, this, [this, guard] {
    if (guard && guard != m_window->ActiveView()) m_runtime->Deactivate(guard);
  });
}

void TerminalApp::OpenFromMenu(const QString& className) {
  std::string error;
  if (!OpenView(className.toStdString(), -1, {}, {}, {}, error)) m_window->ShowNotice(QString::fromStdString(error));
}

void TerminalApp::OnDrop(CSuperBaseView* target, const QString& source, const QString& link) {
  // The drop reaches the view as its DoDragDrop with a ViewLink naming the source class.
  const std::wstring text = link.toStdWString();
  ViewLink vl;
  vl.className = source.toStdWString();
  vl.link = &text;
  target->DoDragDrop(hm::LinkData, ToLParam(&vl));
}

void TerminalApp::ChangeStyle(int styleId) {
  m_styleId = styleId;
  m_runtime->ChangeStyle(styleId);
  ApplyStyleToApplication();
  if (m_store) m_store->SaveSetting("ui.style", std::to_string(styleId));
}

void TerminalApp::ApplyStyleToApplication() {
  // The views colour themselves from the style manager; everything else the
  // terminal shows (menus, dock titles and tabs, the status bar, the empty
  // parts of the window, dialogs) takes the same colours from this palette.
  const IStyleManager& st = m_runtime->Styles();
  using namespace hv::style;
  const QColor face = st.Color(kFace), text = st.Color(kText), base = st.Color(kWindow),
               muted = st.Color(kMutedText), border = st.Color(kBorder);
  const bool dark = face.lightness() < 128;
  QPalette pal;
  for (QPalette::ColorGroup g : {QPalette::Active, QPalette::Inactive, QPalette::Disabled}) {
    const bool off = g == QPalette::Disabled;
    pal.setColor(g, QPalette::Window, face);
    pal.setColor(g, QPalette::WindowText, off ? muted : text);
    pal.setColor(g, QPalette::Base, off ? face : base);
    pal.setColor(g, QPalette::AlternateBase, st.Color(107));
    pal.setColor(g, QPalette::Text, off ? muted : text);
    pal.setColor(g, QPalette::Button, face);
    pal.setColor(g, QPalette::ButtonText, off ? muted : text);
    pal.setColor(g, QPalette::BrightText, dark ? QColor(Qt::white) : QColor(Qt::black));
    pal.setColor(g, QPalette::Highlight, st.Color(kSelection));
    pal.setColor(g, QPalette::HighlightedText, st.Color(kSelectionText));
    pal.setColor(g, QPalette::ToolTipBase, face);
    pal.setColor(g, QPalette::ToolTipText, text);
    pal.setColor(g, QPalette::PlaceholderText, muted);
    pal.setColor(g, QPalette::Link, st.Color(kLinkText));
    pal.setColor(g, QPalette::LinkVisited, st.Color(kLinkText));
    pal.setColor(g, QPalette::Light, dark ? face.lighter(130) : QColor(Qt::white));
    pal.setColor(g, QPalette::Midlight, dark ? face.lighter(115) : face.lighter(105));
    pal.setColor(g, QPalette::Mid, border);
    pal.setColor(g, QPalette::Dark, dark ? face.darker(140) : border.darker(115));
    pal.setColor(g, QPalette::Shadow, dark ? QColor(0, 0, 0) : border.darker(160));
  }
  QApplication::setPalette(pal);
}

void TerminalApp::ReportProblem(const QString& text, bool dialog) {
  const std::string line = text.toStdString();
  if (m_log) m_log->Log(4, "%s", line.c_str());
  Progress("warning: " + line);
  if (!m_window) return;
  m_window->ShowNotice(text);
  if (!dialog || timed()) return;
  // After the window is up, so that the box has it as its parent.
  QTimer::singleShot(0, m_window.get(), [this, text] {
    platform::Dialogs().MessageBox(m_window.get(), m_window->windowTitle(), text, platform::Icon::Warning,
                                   platform::Buttons::Ok);
  });
}

void TerminalApp::ShowFontSize() {
  // 616 goes to the price views: the active one when a price view is active, else all.
  CSuperBaseView* active = m_window->ActiveView();
  if (active && m_runtime->ClassNameOf(active) == "CPriceViewAdv") {
    m_runtime->ShowFontSizeMenu(active);
    return;
  }
  bool any = false;
  for (CSuperBaseView* v : m_runtime->Views())
    if (m_runtime->ClassNameOf(v) == "CPriceViewAdv") { m_runtime->ShowFontSizeMenu(v); any = true; }
  if (!any) m_window->ShowNotice("Open a price view to change its font size.");
}

bool TerminalApp::ExportWatchlists(const QString& path, QString* error) {
  QFile f(path);
  if (!f.open(QIODevice::WriteOnly | QIODevice::Truncate | QIODevice::Text) ||
      f.write(QByteArray::fromStdString(m_runtime->ExportWatchlists())) < 0 || !f.flush()) {
    if (error) *error = QString("Cannot write %1: %2").arg(path, f.errorString());
    return false;
  }
  return true;
}

QStringList TerminalApp::ImportWatchlists(const QString& path) {
  QFile f(path);
  if (!f.open(QIODevice::ReadOnly | QIODevice::Text))
    return {QString("Cannot read %1: %2").arg(path, f.errorString())};
  QStringList problems;
  for (const std::string& p : m_runtime->ImportWatchlists(f.readAll().toStdString()))
    problems << QString::fromStdString(p);
  return problems;
}

void TerminalApp::ExportWatchlistsFromMenu() {
  const QString path =
      QFileDialog::getSaveFileName(m_window.get(), "Export watchlists", "watchlists.txt", "Text files (*.txt)");
  if (path.isEmpty()) return;
  QString error;
  if (ExportWatchlists(path, &error)) m_window->ShowNotice("Watchlists exported to " + path + ".");
  else QMessageBox::warning(m_window.get(), "Export watchlists", error);
}

void TerminalApp::ImportWatchlistsFromMenu() {
  const QString path = QFileDialog::getOpenFileName(m_window.get(), "Import watchlists", QString(),
                                                    "Text files (*.txt);;All files (*)");
  if (path.isEmpty()) return;
  const QStringList problems = ImportWatchlists(path);
  if (problems.isEmpty()) {
    m_window->ShowNotice("Watchlists imported from " + path + ".");
    return;
  }
  QMessageBox box(QMessageBox::Warning, "Import watchlists",
                  "Nothing was imported: the file breaks the watchlist rules.", QMessageBox::Ok, m_window.get());
  box.setDetailedText(problems.join('\n'));
  box.exec();
}

void TerminalApp::ShowSettings() {
  SettingsDialog dialog(&m_runtime->Language(), m_window.get());
  if (dialog.exec() != QDialog::Accepted) return;
  std::string problem;
  if (!dialog.Apply(GetUserSettings(), problem)) m_window->ShowNotice(QString::fromStdString(problem));
  m_runtime->BroadcastSettingsChanged();
}

// ---- Layout -----------------------------------------------------------------

bool TerminalApp::SaveLayout() {
  if (!m_store || !m_window) return false;
  if (!m_store->SaveLayout(CurrentLayout())) {
    Progress("error: cannot save the layout: " + m_store->LastError());
    return false;
  }
  return true;
}

SavedLayout TerminalApp::CurrentLayout() const {
  SavedLayout layout;
  for (ViewDock* d : m_window->Docks()) {
    CSuperBaseView* v = d->View();
    SavedView sv;
    sv.className = d->ClassName().toStdString();
    sv.objectName = d->objectName().toStdString();
    sv.productId = v->GetStartProductId();
    sv.instrumentCode = v->GetStartInstrumentCode();
    sv.params = Narrow(v->GetStartParams());
    layout.views.push_back(std::move(sv));
  }
  const QByteArray geometry = m_window->saveGeometry();
  const QByteArray state = m_window->saveState();
  layout.windowGeometry.assign(geometry.constData(), static_cast<std::size_t>(geometry.size()));
  layout.windowState.assign(state.constData(), static_cast<std::size_t>(state.size()));
  if (ViewDock* active = m_window->DockOf(m_window->ActiveView())) layout.activeView = active->objectName().toStdString();
  return layout;
}

int TerminalApp::RestoreLayout() {
  if (!m_store) return 0;
  const SavedLayout layout = m_store->LoadLayout();
  int restored = 0;
  std::vector<CSuperBaseView*> opened;
  for (const auto& sv : layout.views) {
    std::string error;
    CSuperBaseView* v = OpenView(sv.className, sv.productId, sv.instrumentCode, Widen(sv.params),
                                 QString::fromStdString(sv.objectName), error);
    if (!v) {
      // A view the add-on no longer offers: the rest of the layout still comes back.
      ReportProblem(QString::fromStdString("The saved view " + sv.className + " was not restored: " + error + "."),
                    false);
      continue;
    }
    opened.push_back(v);
    ++restored;
  }
  if (!layout.windowGeometry.empty())
    m_window->restoreGeometry(QByteArray(layout.windowGeometry.data(), static_cast<qsizetype>(layout.windowGeometry.size())));
  if (!layout.windowState.empty())
    m_window->restoreState(QByteArray(layout.windowState.data(), static_cast<qsizetype>(layout.windowState.size())));
  // Each view gets its start parameters back as a link.
  for (CSuperBaseView* v : opened)
    if (m_window->DockOf(v)) m_runtime->DeliverStartLink(v);
  for (ViewDock* d : m_window->Docks())
    if (d->objectName().toStdString() == layout.activeView) m_window->ActivateView(d->View());
  return restored;
}

// ---- Timed runs ---------------------------------------------------------------

bool TerminalApp::FinishRecording() {
  if (m_recordFile.empty()) return true;
  std::string error;
  const bool ok = m_runtime->FinishRecording(&error);
  if (!ok) Progress("error: " + error);
  else Progress("recorded the market to " + m_recordFile);
  m_recordFile.clear();
  return ok;
}

int TerminalApp::RunTimed() {
  // A replay runs to the end of its recording unless told otherwise.
  const double seconds =
      m_options.seconds.value_or(m_runtime->Replay() ? m_replaySeconds : kDefaultHeadlessSeconds);
  if (m_options.realTime) return RunRealTime(seconds);
  auto& clock = platform::UseVirtualClock();
  const auto steps = static_cast<long long>(seconds * 1000.0 / kPumpMs + 0.5);
  const ReplaySource* replay = m_runtime->Replay();
  Progress((replay ? "replaying " + replay->Path() + " (" + replay->Session().date + ") for " : std::string("running ")) +
           QString::number(seconds).toStdString() + " simulated seconds with " +
           std::to_string(m_window->Docks().size()) + " views");
  if (!m_options.soakReport.empty()) {
    m_soak = std::make_unique<SoakFigures>();
    m_soak->SampleRss(0, ReadRssKb(), static_cast<std::int64_t>(m_runtime->Market().TapeBytes() / 1024), ReadHeapKb());
  }
  const long long sampleEvery = static_cast<long long>(kSoakSampleSeconds * 1000 / kPumpMs);
  for (long long i = 0; i < steps && !m_shutDown && !m_stopRequested; ++i) {
    // One turn: what the event loop runs for one step of simulated time.
    const std::int64_t wall0 = m_soak ? WallUs() : 0, cpu0 = m_soak ? ThreadCpuUs() : 0;
    clock.Advance(kPumpMs);
    Pump(clock.Now());
    platform::ProcessPosted();
    QCoreApplication::processEvents();
    if (m_soak) {
      m_soak->Turn(WallUs() - wall0, ThreadCpuUs() - cpu0);
      if ((i + 1) % sampleEvery == 0)
        m_soak->SampleRss(static_cast<double>(i + 1) * kPumpMs / 1000.0, ReadRssKb(),
                          static_cast<std::int64_t>(m_runtime->Market().TapeBytes() / 1024), ReadHeapKb());
    }
    if (m_options.saveChurn && !ChurnStep()) return 1;
  }
  if (m_soak) {
    m_soak->SetPushes(m_runtime->Stats().pushes, seconds);
    m_soak->SetSubscriptions(m_runtime->Stats().subscriptions);
    if (!WriteSoakReport(kSoakWarmupSeconds)) return 1;
  }
  SettleViews();
  return FinishTimedRun();
}

int TerminalApp::RunRealTime(double seconds) {
  Progress("running " + QString::number(seconds).toStdString() + " seconds on the real clock with " +
           std::to_string(m_window->Docks().size()) + " views");
  // A loop of its own: quitting the application would close the window and its views first.
  QEventLoop loop;
  m_realTimeLoop = &loop;
  QTimer::singleShot(static_cast<int>(seconds * 1000.0), &loop, &QEventLoop::quit);
  if (!m_stopRequested) loop.exec();
  m_realTimeLoop = nullptr;
  Progress(std::to_string(m_runtime->Stats().pushes) + " values pushed to the views");
  return FinishTimedRun();
}

int TerminalApp::FinishTimedRun() {
  int code = 0;
  // What was measured ends where the run does, before the dumps and snapshots.
  if (!WriteLatencyReport()) code = 1;
  if (!FinishRecording()) code = 1;
  if (!SaveLayout()) code = 1;
  std::string error;
  if (!m_options.dumpDir.empty()) {
    const int n = DumpGrids(m_options.dumpDir, error);
    if (n < 0) { Progress("error: " + error); code = 1; }
    else Progress("wrote " + std::to_string(n) + (n == 1 ? " grid dump to " : " grid dumps to ") + m_options.dumpDir);
    // The market files are the simulator's: in a replay they are not the market played.
    if (!m_runtime->Replay()) {
      if (WriteMarketTradeDumps(*m_window, *m_runtime, m_options.dumpDir, error) < 0) { Progress("error: " + error); code = 1; }
      if (WriteMarketSummaryDumps(*m_window, *m_runtime, m_options.dumpDir, error) < 0) { Progress("error: " + error); code = 1; }
      const std::string quotes = (fs::path(m_options.dumpDir) / "market-quotes.tsv").string();
      if (!WriteMarketQuotes(quotes, m_runtime->Market(), m_runtime->QuoteInstruments(), error)) {
        Progress("error: " + error);
        code = 1;
      }
    }
  }
  if (!m_options.snapshotDir.empty()) {
    const int n = Snapshot(m_options.snapshotDir, error);
    if (n < 0) { Progress("error: " + error); code = 1; }
    else Progress("wrote " + std::to_string(n) + (n == 1 ? " snapshot to " : " snapshots to ") + m_options.snapshotDir);
  }
  Shutdown();
  return code;
}

bool TerminalApp::ChurnStep() {
  const std::int64_t g = m_churnGeneration;
  const auto& instruments = m_runtime->Market().Instruments();
  m_saveFailed = false;
  // Each save is one transaction, in a fixed order, as the terminal makes them.
  m_hostStore->SaveWatchlists(StoredWatchlist::User, churn::Watchlists(g, instruments));
  m_hostStore->SaveAlerts(churn::Alerts(g, instruments));
  m_hostStore->SaveSetting(churn::kSettingKey, churn::HostSetting(g));
  const bool user = SqliteSettingsStorage(*m_store).Write(churn::kSettingKey, churn::UserSetting(g));
  SavedLayout layout = CurrentLayout();
  churn::StampLayout(layout, g);
  const bool saved = m_store->SaveLayout(layout);
  if (m_saveFailed || !user || !saved) {
    Progress("error: generation " + std::to_string(g) + " of the churn was not saved: " + m_store->LastError());
    return false;
  }
  // Straight to the descriptor: the line must be out before the next save starts.
  const std::string line = "churn: committed " + std::to_string(g) + "\n";
  if (write(STDOUT_FILENO, line.data(), line.size()) < 0) return false;
  ++m_churnGeneration;
  return true;
}

void TerminalApp::StartLatency() {
  m_runtime->SetPushObserver([this](CSuperBaseView* v) { m_latency->Pushed(v, WallUs()); });
  auto* app = dynamic_cast<TerminalApplication*>(QCoreApplication::instance());
  if (!app) return;
  app->afterPaint = [this](QWidget* w) {
    // The view whose window this widget belongs to.
    for (QWidget* p = w; p; p = p->parentWidget())
      if (m_latency->Watches(p)) {
        m_latency->Painted(p, WallUs());
        return;
      }
  };
}

bool TerminalApp::WriteLatencyReport() {
  if (!m_latency) return true;
  m_runtime->SetPushObserver({});
  if (auto* app = dynamic_cast<TerminalApplication*>(QCoreApplication::instance())) app->afterPaint = {};
  const std::string rate = std::to_string(m_options.rate.value_or(HostOptions().fieldUpdatesPerSecond));
  const std::string text = m_latency->Report("feed-to-pixel latency, pace " + QString::number(m_options.pace.value_or(1.0)).toStdString() +
                                             ", at most " + rate + " field updates per second, " +
                                             std::to_string(m_runtime->Stats().pushes) + " values pushed");
  m_latency.reset();
  std::fputs(text.c_str(), stdout);
  std::fflush(stdout);
  return WriteReport(m_options.latencyReport, text, "latency");
}

bool TerminalApp::WriteSoakReport(double warmupSeconds) {
  return WriteReport(m_options.soakReport, m_soak->Report(warmupSeconds, kPumpMs), "soak");
}

bool TerminalApp::WriteReport(const std::string& path, const std::string& text, const char* kind) {
  std::ofstream f(path, std::ios::trunc);
  if (!(f << text) || !f.flush()) {
    Progress("error: cannot write " + path);
    return false;
  }
  Progress(std::string("wrote the ") + kind + " report to " + path);
  return true;
}

void TerminalApp::SettleViews() {
  auto& clock = platform::UseVirtualClock();
  const std::uint32_t marketTick = clock.Now();
  for (int waited = 0; waited < kSettleMs && !m_shutDown && !m_stopRequested; waited += kPumpMs) {
    clock.Advance(kPumpMs);
    m_runtime->Pump(marketTick);  // answers and pushes, but no market step
    platform::ProcessPosted();
    QCoreApplication::processEvents();
  }
}

int TerminalApp::DumpGrids(const std::string& dir, std::string& error) {
  std::error_code ec;
  fs::create_directories(dir, ec);
  if (ec) { error = "cannot create " + dir + ": " + ec.message(); return -1; }
  int files = 0;
  for (ViewDock* d : m_window->Docks()) {
    const QString base = QString("%1-%2").arg(d->ClassName()).arg(d->Instance());
    for (const auto& g : term::DumpGrids(d->View())) {
      const QString path = QDir(QString::fromStdString(dir)).filePath(base + g.suffix + ".tsv");
      QFile f(path);
      if (!f.open(QIODevice::WriteOnly | QIODevice::Truncate)) {
        error = "cannot write " + path.toStdString() + ": " + f.errorString().toStdString();
        return -1;
      }
      f.write(g.tsv.toUtf8());
      ++files;
    }
  }
  return files;
}

int TerminalApp::Snapshot(const std::string& dir, std::string& error) {
  std::error_code ec;
  fs::create_directories(dir, ec);
  if (ec) { error = "cannot create " + dir + ": " + ec.message(); return -1; }
  const QDir out(QString::fromStdString(dir));
  int files = 0;
  auto save = [&](QWidget* w, const QString& name) -> bool {
    const QString path = out.filePath(name + ".png");
    QPixmap pixmap = w->grab();
    if (pixmap.isNull()) {
      // A view squeezed to nothing by the layout is drawn at a readable size on its own.
      const QSize size = w->size();
      w->resize(w->size().expandedTo(QSize(640, 400)));
      pixmap = w->grab();
      w->resize(size);
    }
    if (!pixmap.save(path, "PNG")) {
      error = "cannot write " + path.toStdString();
      return false;
    }
    ++files;
    return true;
  };
  QCoreApplication::processEvents();
  if (!save(m_window.get(), "terminal")) return -1;
  for (ViewDock* d : m_window->Docks()) {
    d->raise();  // a tabbed view is drawn only while its tab is current
    QCoreApplication::processEvents();
    if (!save(d->View(), QString("%1-%2").arg(d->ClassName()).arg(d->Instance()))) return -1;
  }
  return files;
}

void TerminalApp::RequestStop() {
  if (m_stopRequested) return;
  m_stopRequested = true;
  Progress("stopping");
  if (m_realTimeLoop) m_realTimeLoop->quit();
  else if (!timed()) QCoreApplication::quit();
}

void TerminalApp::Shutdown() {
  if (m_shutDown || !m_window || !m_runtime) return;
  m_shutDown = true;
  m_pump.stop();
  m_autosave.stop();
  if (!timed()) SaveLayout();
  WriteLatencyReport();
  FinishRecording();
  m_window->CloseAllViews();
}

// ---- IHostShell -----------------------------------------------------------------

CSuperBaseView* TerminalApp::OpenView(const std::wstring& className, CSuperBaseView* requester) {
  const std::string cls = hv::Narrow(className);
  if (!FindClass(cls)) return nullptr;
  // Bring up the newest view of that class when there is one; else open one.
  CSuperBaseView* existing = nullptr;
  for (ViewDock* d : m_window->Docks())
    if (d->ClassName().toStdString() == cls && d->View() != requester) existing = d->View();
  if (existing) {
    m_window->ActivateView(existing);
    return existing;
  }
  std::string error;
  CSuperBaseView* v = OpenView(cls, -1, {}, {}, {}, error);
  if (!v) m_window->ShowNotice(QString::fromStdString(error));
  return v;
}

void TerminalApp::ForeignLink(const std::wstring& className, const std::wstring& linkText, CSuperBaseView* requester) {
  const QString from = requester ? m_window->NameOf(QString::fromStdString(m_runtime->ClassNameOf(requester))) : QString();
  ReportProblem(QString("%1 asked for a view of class %2, which this terminal does not have.")
                    .arg(from.isEmpty() ? QString("A view") : from, QString::fromStdWString(className)),
                false);
}

void TerminalApp::ShowNotice(const std::wstring& title, const std::wstring& text) {
  const QString line = title.empty() ? QString::fromStdWString(text)
                                     : QString::fromStdWString(title) + ": " + QString::fromStdWString(text);
  m_window->ShowNotice(line);
  if (m_options.verbose) Progress("notice: " + line.toStdString());
}

void TerminalApp::ViewTitleChanged(CSuperBaseView* view, const std::wstring& title) {
  m_window->SetViewTitle(view, QString::fromStdWString(title));
}

void TerminalApp::ViewSizeRequested(CSuperBaseView* view, int width, int height) {
  ViewDock* d = m_window->DockOf(view);
  if (!d || width <= 0 || height <= 0) return;
  if (d->isFloating()) d->resize(width, height);
  else m_window->resizeDocks({d}, {width}, Qt::Horizontal);
}

}  // namespace term
