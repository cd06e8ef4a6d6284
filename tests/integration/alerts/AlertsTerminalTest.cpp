// Price alerts end to end: the terminal runs headless on its simulated market
// with the add-on loaded as it always is; an alert is made through the
// new-alert form, the market runs until the alert fires, and the alert list,
// the database and a restarted terminal all tell the same story.
#include <gtest/gtest.h>
#include <unistd.h>

#include <QAbstractButton>
#include <QApplication>
#include <QComboBox>
#include <QDir>
#include <QFile>
#include <QLineEdit>
#include <QProcess>
#include <QTemporaryDir>
#include <cstdio>

#include "hostconfig/UserSettings.h"
#include "hostview/SuperBaseView.h"
#include "platform/Platform.h"
#include "terminal/app/AddonLoader.h"
#include "terminal/app/MainWindow.h"
#include "terminal/app/Options.h"
#include "terminal/app/TerminalApp.h"
#include "terminal/host/HostRuntime.h"
#include "terminal/sim/Market.h"
#include "terminal/store/SqliteHostStore.h"
#include "terminal/store/SqliteSettingsStorage.h"
#include "terminal/store/Store.h"

namespace {

constexpr int kProcessTimeoutMs = 120000;  // a guard against a hung terminal, not a wait
constexpr std::uint32_t kStepMs = 50;
constexpr std::uint32_t kMaxWaitMs = 30u * 60u * 1000u;  // simulated

QApplication& App() {
  static int argc = 1;
  static char name[] = "alerts_terminal_tests";
  static char* argv[] = {name, nullptr};
  static QApplication* app = [] {
    qputenv("QT_QPA_PLATFORM", "offscreen");
    return new QApplication(argc, argv);
  }();
  return *app;
}

QString BinDir() {
  char exe[4096];
  const ssize_t n = readlink("/proc/self/exe", exe, sizeof exe - 1);
  if (n <= 0) return QString();
  exe[n] = '\0';
  QDir dir = QFileInfo(QString::fromLocal8Bit(exe)).dir();
  return dir.cdUp() ? dir.filePath("bin") : QString();
}

QString ReadText(const QString& path) {
  QFile f(path);
  return f.open(QIODevice::ReadOnly) ? QString::fromUtf8(f.readAll()) : QString();
}

// The dump line of the alert list that names `code`.
QStringList AlertLine(const QString& tsv, const QString& code) {
  for (const QString& line : tsv.split('\n', Qt::SkipEmptyParts)) {
    const QStringList cells = line.split('\t');
    if (cells.contains(code)) return cells;
  }
  return {};
}

// The busiest share of SGX the user may see and trade.
int BusyShare(sim::Market& market) {
  int best = -1, trades = -1;
  for (int i = 0; i < int(market.Instruments().size()); ++i) {
    const auto& r = market.Instruments()[std::size_t(i)];
    if (r.exchangeCode != "SGX" || r.productType != "ES" || r.accessStatus != 3) continue;
    const int t = market.QuoteOf(i).trades;
    if (t > trades) {
      trades = t;
      best = i;
    }
  }
  return best;
}

struct Terminal {
  QTemporaryDir data;
  platform::VirtualClock& clock = platform::UseVirtualClock();
  term::AddonLoader addon;
  std::unique_ptr<term::Store> store;
  std::unique_ptr<term::TerminalApp> app;

  Terminal() {
    App();
    platform::SetDialogService(std::make_unique<platform::RecordingDialogService>());
  }
  ~Terminal() { Stop(); }

  bool Start(const std::vector<term::OpenRequest>& open, std::string& error) {
    if (!addon.IsLoaded() && !addon.Load(term::AddonLoader::DefaultPath(), error)) return false;
    term::StoreOpenReport report;
    store = term::Store::Open(data.path().toStdString(), report, error);
    if (!store) return false;
    GetUserSettings().SetStorage(std::make_shared<term::SqliteSettingsStorage>(*store));
    term::Options options;
    options.headless = true;
    options.seconds = 1;
    options.open = open;
    app = std::make_unique<term::TerminalApp>(options, addon, store.get());
    return app->Start(error);
  }
  void Stop() {
    if (app) {
      app->SaveLayout();
      app->Shutdown();
      app.reset();
    }
    GetUserSettings().SetStorage(nullptr);
    store.reset();
  }
  // One step of the headless run.
  void Step() {
    clock.Advance(kStepMs);
    app->Runtime().Pump(clock.Now());
    platform::ProcessPosted();
    QCoreApplication::processEvents();
  }
  void Run(std::uint32_t ms) {
    for (std::uint32_t t = 0; t < ms; t += kStepMs) Step();
  }
};

TEST(AlertsTerminal, AnAlertMadeInTheFormFiresIsListedStoredAndSurvivesARestart) {
  Terminal t;
  std::string error;
  ASSERT_TRUE(t.Start({{"CPriceAlertList"}}, error)) << error;
  sim::Market& market = t.app->Runtime().Market();
  const int index = BusyShare(market);
  ASSERT_GE(index, 0);
  const JInstrumentUnderlying ins = market.Instruments()[std::size_t(index)];

  // The form, opened on the instrument as the terminal opens a view on one.
  CSuperBaseView* form = t.app->OpenView("CNewPriceAlertAdv", ins.productId, ins.instrumentCode, {}, {}, error);
  ASSERT_NE(form, nullptr) << error;
  t.app->Runtime().DeliverStartLink(form);
  t.Run(500);

  // Last done at least one tick above the current price.
  const double last = market.QuoteOf(index).last;
  const double threshold = last + market.StepAt(ins.priceStepTableId, last, true);
  auto* field = form->findChild<QComboBox*>("FieldList");
  auto* comparator = form->findChild<QComboBox*>("ComparatorList");
  auto* price = form->findChild<QLineEdit*>("PriceEdit");
  auto* submit = form->findChild<QAbstractButton*>("SubmitButton");
  ASSERT_TRUE(field && comparator && price && submit);
  field->setCurrentIndex(2);
  comparator->setCurrentIndex(1);
  price->setText(QString::fromStdString(market.FormatPrice(index, threshold)));
  submit->click();

  auto alerts = t.app->Runtime().Alerts();
  ASSERT_EQ(alerts.size(), 1u) << "the form's alert reached the terminal";
  const std::int32_t id = alerts[0].alertId;
  EXPECT_EQ(alerts[0].instrumentCode, ins.instrumentCode);
  EXPECT_EQ(alerts[0].priceField, "LDONE");
  EXPECT_EQ(alerts[0].comparator, ">=");
  EXPECT_EQ(alerts[0].status, "Active");

  // The market runs until the alert fires.
  std::uint32_t waited = 0;
  while (t.app->Runtime().Alerts()[0].status != "Triggered" && waited < kMaxWaitMs) {
    t.Step();
    waited += kStepMs;
  }
  alerts = t.app->Runtime().Alerts();
  ASSERT_EQ(alerts[0].status, "Triggered") << "not fired in " << waited / 1000 << " simulated seconds";
  t.Run(1000);  // the list hears of it and redraws

  const QDir dumps(t.data.filePath("dump1"));
  ASSERT_GT(t.app->DumpGrids(dumps.path().toStdString(), error), 0) << error;
  const QStringList row = AlertLine(ReadText(dumps.filePath("CPriceAlertList-1.tsv")), QString::fromStdString(ins.instrumentCode));
  ASSERT_FALSE(row.isEmpty());
  EXPECT_EQ(row.back(), "Triggered");

  // The stored record: when and at what value it fired, and the notice.
  PriceAlertItem stored;
  const auto rows = t.store->LoadAlerts();
  ASSERT_EQ(rows.size(), 1u);
  ASSERT_TRUE(term::DecodeAlert(rows[0].body, stored));
  EXPECT_EQ(stored.status, "Triggered");
  EXPECT_EQ(stored.hostTextA.rfind("2026-12-07 ", 0), 0u) << stored.hostTextA;
  const auto history = t.store->LoadAlertFirings(id);
  ASSERT_EQ(history.size(), 1u);
  EXPECT_EQ(history[0].firedAt, stored.hostTextA);
  EXPECT_EQ(history[0].valueText, stored.hostTextB);
  EXPECT_GE(history[0].value, threshold - 1e-9);
  EXPECT_NE(history[0].notice.find(ins.instrumentCode), std::string::npos);
  EXPECT_NE(history[0].notice.find(history[0].firedAt), std::string::npos);
  const std::string firedAt = stored.hostTextA;
  t.Stop();

  // A new terminal on the same data folder: the list comes back with the alert.
  QProcess terminal;
  QProcessEnvironment env = QProcessEnvironment::systemEnvironment();
  env.insert("QT_QPA_PLATFORM", "offscreen");
  terminal.setProcessEnvironment(env);
  const QString dump2 = t.data.filePath("dump2");
  terminal.start(QDir(BinDir()).filePath("terminal"),
                 {"--headless", "--seconds", "2", "--data-dir", t.data.path(), "--dump", dump2});
  ASSERT_TRUE(terminal.waitForFinished(kProcessTimeoutMs));
  ASSERT_EQ(terminal.exitCode(), 0) << terminal.readAllStandardError().toStdString();
  const QStringList again = AlertLine(ReadText(QDir(dump2).filePath("CPriceAlertList-1.tsv")),
                                      QString::fromStdString(ins.instrumentCode));
  ASSERT_FALSE(again.isEmpty());
  EXPECT_EQ(again.back(), "Triggered");
  term::StoreOpenReport report;
  auto reopened = term::Store::Open(t.data.path().toStdString(), report, error);
  ASSERT_TRUE(reopened) << error;
  ASSERT_EQ(reopened->LoadAlertFirings(id).size(), 1u);
  EXPECT_EQ(reopened->LoadAlertFirings(id)[0].firedAt, firedAt);
}

}  // namespace
