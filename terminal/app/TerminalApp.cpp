#include "terminal/app/TerminalApp.h"

#include <QApplication>
#include <QDir>
#include <QFile>
#include <QInputDialog>
#include <QPixmap>
#include <QTextStream>
#include <cstdio>
#include <filesystem>
#include <map>

#include "hostconfig/UserSettings.h"
#include "hostview/MessageIds.h"
#include "hostview/Text.h"
#include "platform/Platform.h"
#include "terminal/app/AddonLoader.h"
#include "terminal/app/GridDump.h"
#include "terminal/host/MarketQuotes.h"
#include "terminal/app/MainWindow.h"
#include "terminal/app/SettingsDialog.h"
#include "terminal/sim/Market.h"
#include "terminal/store/SqliteHostStore.h"
#include "terminal/store/Store.h"
#include "terminal/views/TerminalView.h"

namespace term {

namespace fs = std::filesystem;

namespace {

const QStringList kAddonClasses = {"CPriceViewAdv",   "CMarketDepthAdv",   "CTimeAndSalesAdv",
                                   "CTradeSummaryAdv", "CPriceAlertList",  "CNewPriceAlertAdv"};
constexpr int kPumpMs = 50;
constexpr double kDefaultHeadlessSeconds = 10;
// After the market stops: long enough for every view's refresh timer to fire.
constexpr std::uint32_t kFinalRefreshMs = 1000;
constexpr int kAutosaveMs = 60 * 1000;

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
  views::SetRuntime(nullptr);
}

void TerminalApp::Progress(const std::string& line) const { std::fprintf(stderr, "terminal: %s\n", line.c_str()); }

const CRuntimeClass* TerminalApp::FindClass(const std::string& className) const {
  if (const CRuntimeClass* rc = m_addon.Find(className)) return rc;
  return views::FindClass(className);
}

bool TerminalApp::Start(std::string& error) {
  HostOptions ho;
  if (m_options.seed) ho.seed = *m_options.seed;
  if (m_options.instruments) ho.instruments = *m_options.instruments;
  if (m_options.rate) ho.fieldUpdatesPerSecond = *m_options.rate;
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
    m_hostStore = std::make_unique<SqliteHostStore>(
        *m_store, [this](const std::string& e) { Progress("error: " + e); });
  }
  m_styleId = ho.styleId;
  m_runtime = std::make_unique<HostRuntime>(ho, this, m_hostStore.get());
  views::SetRuntime(m_runtime.get());

  QStringList addonClasses;
  for (const QString& c : kAddonClasses)
    if (m_addon.Find(c.toStdString())) addonClasses << c;
  m_window = std::make_unique<MainWindow>(addonClasses, views::ClassNames(),
                                          std::vector<MainWindow::Style>{{1, "&Light style"}, {2, "&Dark style"}},
                                          m_styleId);
  MainWindow* w = m_window.get();
  connect(w, &MainWindow::openRequested, this, &TerminalApp::OpenFromMenu);
  connect(w, &MainWindow::activationChanged, this, &TerminalApp::OnActivation);
  connect(w, &MainWindow::viewClosing, this, [this](CSuperBaseView* v) { m_runtime->DestroyView(v, false); });
  connect(w, &MainWindow::styleRequested, this, &TerminalApp::ChangeStyle);
  connect(w, &MainWindow::languageReloadRequested, this, [this] {
    // Column headings and font-size names come from the language table too.
    CWatchlistSetting watchlist = GetUserSettings().GetWatchlistSetting();
    watchlist.RefreshLanguage(&m_runtime->Language());
    if (!(watchlist == GetUserSettings().GetWatchlistSetting())) GetUserSettings().SetWatchlistSetting(watchlist);
    m_runtime->ApplyLanguage();
  });
  connect(w, &MainWindow::fontSizeRequested, this, &TerminalApp::ShowFontSize);
  connect(w, &MainWindow::settingsRequested, this, &TerminalApp::ShowSettings);
  connect(w, &MainWindow::saveLayoutRequested, this, [this] {
    if (SaveLayout()) m_window->ShowNotice("Layout saved.");
  });
  connect(w, &MainWindow::dropRequested, this, &TerminalApp::OnDrop);
  connect(w, &MainWindow::closingWindow, this, [this] { Shutdown(); });

  int restored = 0;
  if (m_options.restoreLayout) restored = RestoreLayout();
  for (const auto& o : m_options.open) {
    StartParamMap params;
    if (o.productId >= 0) {
      params["User_field_product_id"] = std::to_wstring(o.productId);
      params["User_field_save_space"] = L"0";
    }
    for (const auto& [key, value] : o.params) params[key] = hv::Widen(value);
    CSuperBaseView* v = OpenView(o.className, o.productId, o.instrumentCode, params, {}, error);
    if (!v) return false;
    // Start parameters reach the view as a restored layout's do.
    if (!o.params.empty()) m_runtime->DeliverStartLink(v);
    if (o.productId >= 0) DeliverLink(v, o.productId, o.instrumentCode);
  }
  if (restored == 0 && m_options.open.empty()) OpenDefaultLayout();

  if (!m_options.seconds && !m_options.headless) {
    // Real time: move the market along with the monotonic clock.
    connect(&m_pump, &QTimer::timeout, this, [this] { m_runtime->PumpNow(); });
    m_pump.start(kPumpMs);
    // The layout is also saved now and then, so a crash or a kill loses little of it.
    connect(&m_autosave, &QTimer::timeout, this, [this] { SaveLayout(); });
    m_autosave.start(kAutosaveMs);
  }
  m_window->show();
  return true;
}

void TerminalApp::OpenDefaultLayout() {
  // A first start: the price view and, on the first instrument, its depth and trades.
  std::string error;
  OpenView("CPriceViewAdv", -1, {}, {}, {}, error);
  const auto& instruments = m_runtime->Market().Instruments();
  if (!instruments.empty()) {
    const auto& first = instruments.front();
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
  // The view gets 2 now; the view it replaces as the active one gets 1.
  m_window->ActivateView(v);
  (void)dock;
  return v;
}

void TerminalApp::DeliverLink(CSuperBaseView* view, std::int64_t productId, const std::string& code) {
  std::string exchange;
  const int index = m_runtime->Market().Find(productId, code);
  if (index >= 0) exchange = m_runtime->Market().Instruments()[static_cast<std::size_t>(index)].exchangeCode;
  const std::string narrow = "{\"type\":\"instrument view\",\"data\":[{\"Field_product_id\":\"" +
                             std::to_string(productId) + "\",\"Field_instrument_code\":\"" + JsonEscape(code) +
                             "\",\"Field_exchange_code\":\"" + JsonEscape(exchange) + "\"}]}";
  const std::wstring link = hv::Widen(narrow);
  ViewLink vl;
  vl.className = hv::Widen(m_runtime->ClassNameOf(view));
  vl.link = &link;
  view->OnHostMessage(hm::LinkData, ToLParam(&vl));
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
  if (m_store) m_store->SaveSetting("ui.style", std::to_string(styleId));
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

void TerminalApp::ShowSettings() {
  SettingsDialog dialog(m_window.get());
  if (dialog.exec() != QDialog::Accepted) return;
  std::string problem;
  if (!dialog.Apply(GetUserSettings(), problem)) m_window->ShowNotice(QString::fromStdString(problem));
  m_runtime->BroadcastSettingsChanged();
}

// ---- Layout -----------------------------------------------------------------

bool TerminalApp::SaveLayout() {
  if (!m_store || !m_window) return false;
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
  if (!m_store->SaveLayout(layout)) {
    Progress("error: cannot save the layout: " + m_store->LastError());
    return false;
  }
  return true;
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
      Progress("warning: saved view " + sv.className + " not restored: " + error);
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

int TerminalApp::RunTimed() {
  const double seconds = m_options.seconds.value_or(kDefaultHeadlessSeconds);
  auto& clock = platform::UseVirtualClock();
  const auto steps = static_cast<long long>(seconds * 1000.0 / kPumpMs + 0.5);
  Progress("running " + QString::number(seconds).toStdString() + " simulated seconds with " +
           std::to_string(m_window->Docks().size()) + " views");
  for (long long i = 0; i < steps && !m_shutDown && !m_stopRequested; ++i) {
    clock.Advance(kPumpMs);
    m_runtime->Pump(clock.Now());
    platform::ProcessPosted();
    QCoreApplication::processEvents();
  }
  // The market stops here; every view refreshes once more from what it was
  // sent, so that the dumps and the market's files describe one moment.
  clock.Advance(kFinalRefreshMs);
  platform::ProcessPosted();
  QCoreApplication::processEvents();
  int code = 0;
  if (!SaveLayout()) code = 1;
  std::string error;
  if (!m_options.dumpDir.empty()) {
    const int n = DumpGrids(m_options.dumpDir, error);
    if (n < 0) { Progress("error: " + error); code = 1; }
    else Progress("wrote " + std::to_string(n) + (n == 1 ? " grid dump to " : " grid dumps to ") + m_options.dumpDir);
    const std::string quotes = (fs::path(m_options.dumpDir) / "market-quotes.tsv").string();
    if (!WriteMarketQuotes(quotes, m_runtime->Market(), m_runtime->QuoteInstruments(), error)) {
      Progress("error: " + error);
      code = 1;
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
  if (!m_options.seconds && !m_options.headless) QCoreApplication::quit();
}

void TerminalApp::Shutdown() {
  if (m_shutDown || !m_window || !m_runtime) return;
  m_shutDown = true;
  m_pump.stop();
  m_autosave.stop();
  if (!m_options.seconds && !m_options.headless) SaveLayout();
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

void TerminalApp::ForeignLink(const std::wstring& className, const std::wstring& linkText, CSuperBaseView*) {
  m_window->ShowNotice(QString("No view of class %1 in this terminal.").arg(QString::fromStdWString(className)));
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
