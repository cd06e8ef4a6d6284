// The terminal's pieces in-process: the grid dump convention, the command line
// and the add-on loader's refusals.
#include <gtest/gtest.h>

#include <QApplication>
#include <QStandardItemModel>
#include <QTableView>
#include <QVBoxLayout>
#include <filesystem>

#include "hostview/SuperBaseView.h"
#include "platform/Platform.h"
#include "terminal/app/AddonLoader.h"
#include "terminal/app/GridDump.h"
#include "terminal/app/MainWindow.h"
#include "terminal/app/Options.h"
#include "terminal/app/TerminalApp.h"
#include "terminal/host/HostRuntime.h"
#include "terminal/sim/Market.h"
#include "terminal/store/Store.h"

namespace {

QApplication& App() {
  static int argc = 1;
  static char name[] = "test";
  static char* argv[] = {name, nullptr};
  static QApplication app(argc, argv);
  return app;
}

// A grid that answers for itself, as the add-on's grids do.
class FakeGrid : public QWidget {
  Q_OBJECT
 public:
  explicit FakeGrid(QString text, QWidget* parent = nullptr) : QWidget(parent), m_text(std::move(text)) {}
  Q_INVOKABLE QString dumpTsv() const { return m_text; }

 private:
  QString m_text;
};

term::Options Parse(std::vector<std::string> args, bool& ok, std::string& error) {
  args.insert(args.begin(), "terminal");
  std::vector<char*> argv;
  for (auto& a : args) argv.push_back(a.data());
  term::Options o;
  ok = term::ParseOptions(static_cast<int>(argv.size()), argv.data(), o, error);
  return o;
}

}  // namespace

TEST(GridDump, ViewsAnswerThroughDumpTsvAndTablesThroughTheirModel) {
  App();
  QWidget view;
  auto* layout = new QVBoxLayout(&view);
  auto* first = new FakeGrid("A\tB\n1\t2", &view);  // no final newline: the terminal adds it
  auto* hidden = new FakeGrid("hidden\n", &view);
  hidden->hide();
  auto* holder = new QWidget(&view);
  auto* table = new QTableView(holder);
  table->setObjectName("blotter");
  QStandardItemModel model(2, 3);
  model.setHorizontalHeaderLabels({"Code", "Secret", "Name"});
  model.setItem(0, 0, new QStandardItem("D05"));
  model.setItem(0, 2, new QStandardItem("Tab\there"));
  model.setItem(1, 0, new QStandardItem("O39"));
  table->setModel(&model);
  table->setColumnHidden(1, true);
  layout->addWidget(first);
  layout->addWidget(hidden);
  layout->addWidget(holder);

  const auto dumps = term::DumpGrids(&view);
  ASSERT_EQ(dumps.size(), 2u);
  EXPECT_EQ(dumps[0].suffix, "");
  EXPECT_EQ(dumps[0].tsv, "A\tB\n1\t2\n");
  EXPECT_EQ(dumps[1].suffix, "-blotter");
  EXPECT_EQ(dumps[1].tsv, "Code\tName\nD05\tTab here\nO39\t\n");

  // A view that dumps itself is asked alone.
  FakeGrid self("X\n");
  new FakeGrid("inner\n", &self);
  const auto selfDump = term::DumpGrids(&self);
  ASSERT_EQ(selfDump.size(), 1u);
  EXPECT_EQ(selfDump[0].tsv, "X\n");
}

TEST(Options, CommandLineIsReadAsAUserWritesIt) {
  bool ok = false;
  std::string error;
  auto o = Parse({"--headless", "--seconds", "2.5", "--seed=9", "--open", "CPriceViewAdv", "--open",
                  "CMarketDepthAdv:12:A:B", "--list-instruments", "--dump", "d"},
                 ok, error);
  ASSERT_TRUE(ok) << error;
  EXPECT_TRUE(o.headless);
  EXPECT_DOUBLE_EQ(*o.seconds, 2.5);
  EXPECT_EQ(*o.seed, 9u);
  ASSERT_EQ(o.open.size(), 2u);
  EXPECT_EQ(o.open[0].productId, -1);
  EXPECT_EQ(o.open[1].className, "CMarketDepthAdv");
  EXPECT_EQ(o.open[1].productId, 12);
  EXPECT_EQ(o.open[1].instrumentCode, "A:B");  // codes may hold ':'
  EXPECT_EQ(*o.listInstruments, 0);            // no count: all
  EXPECT_EQ(o.dumpDir, "d");

  // Measured runs: the real clock headless, a heavier feed, the reports.
  o = Parse({"--headless", "--real-time", "--seconds", "60", "--pace", "10", "--latency-report", "lat.tsv"}, ok, error);
  ASSERT_TRUE(ok) << error;
  EXPECT_TRUE(o.realTime);
  EXPECT_DOUBLE_EQ(*o.pace, 10.0);
  EXPECT_EQ(o.latencyReport, "lat.tsv");
  o = Parse({"--latency-report", "lat.tsv"}, ok, error);  // a window runs on the real clock anyway
  ASSERT_TRUE(ok) << error;
  o = Parse({"--headless", "--soak-report", "soak.txt", "--save-churn"}, ok, error);
  ASSERT_TRUE(ok) << error;
  EXPECT_EQ(o.soakReport, "soak.txt");
  EXPECT_TRUE(o.saveChurn);
  o = Parse({"--check-churn", "17"}, ok, error);
  ASSERT_TRUE(ok) << error;
  EXPECT_EQ(*o.checkChurn, 17);

  o = Parse({"--list-instruments", "4"}, ok, error);
  ASSERT_TRUE(ok);
  EXPECT_EQ(*o.listInstruments, 4);

  o = Parse({"--trace-messages", "t.bin"}, ok, error);
  ASSERT_TRUE(ok) << error;
  EXPECT_EQ(o.traceFile, "t.bin");
  Parse({"--trace-messages="}, ok, error);
  EXPECT_FALSE(ok);
  EXPECT_EQ(error, "--trace-messages needs a file name");

  // Start parameters belong to the --open before them; a value may hold '='.
  o = Parse({"--open", "CPriceViewAdv", "--param", "User_field_display_mode=Board", "--open", "CTradeView",
             "--param=Key=a=b"},
            ok, error);
  ASSERT_TRUE(ok) << error;
  EXPECT_EQ(o.open[0].params, (std::map<std::string, std::string>{{"User_field_display_mode", "Board"}}));
  EXPECT_EQ(o.open[1].params, (std::map<std::string, std::string>{{"Key", "a=b"}}));

  struct Bad {
    std::vector<std::string> args;
    const char* says;
  };
  for (const Bad& bad : std::vector<Bad>{{{"--instruments", "0"}, "--instruments"},
                                         {{"--instruments", "600000"}, "--instruments"},
                                         {{"--rate", "-1"}, "--rate"},
                                         {{"--seconds"}, "needs a value"},
                                         {{"--open", ":1:X"}, "class name"},
                                         {{"--open", "CTradeView:1"}, "CLASS:PRODUCTID:CODE"},
                                         {{"--open", "CTradeView:1:"}, "instrument code"},
                                         {{"--dump", "x"}, "--seconds"},
                                         {{"--param", "A=B"}, "after the --open"},
                                         {{"--open", "CTradeView", "--param", "AB"}, "KEY=VALUE"},
                                         {{"--frobnicate"}, "unknown option"},
                                         {{"--real-time"}, "headless or --seconds"},
                                         {{"--headless", "--real-time", "--soak-report", "f"}, "virtual clock"},
                                         {{"--soak-report", "f"}, "virtual clock"},
                                         {{"--headless", "--latency-report", "f"}, "--real-time"},
                                         {{"--seconds", "5", "--real-time", "--save-churn"}, "virtual clock"},
                                         {{"--pace", "0"}, "--pace"},
                                         {{"--check-churn", "-1"}, "--check-churn"}}) {
    Parse(bad.args, ok, error);
    EXPECT_FALSE(ok) << bad.args[0];
    EXPECT_NE(error.find(bad.says), std::string::npos) << error;
  }
}

TEST(AddonLoader, RefusesWhatIsNotAnAddon) {
  term::AddonLoader loader;
  std::string error;
  EXPECT_FALSE(loader.Load("/no/such/libmarketviews.so", error));
  EXPECT_NE(error.find("/no/such/libmarketviews.so"), std::string::npos);
  EXPECT_FALSE(loader.IsLoaded());
  EXPECT_EQ(loader.Find("CPriceViewAdv"), nullptr);

  // MV_ADDON when the test runner sets it, else the build's lib folder beside tests/.
  const char* env = std::getenv("MV_ADDON");
  const std::string addonPath =
      env ? std::string(env)
          : (std::filesystem::read_symlink("/proc/self/exe").parent_path().parent_path() / "lib" / "libmarketviews.so")
                .string();
  const char* addon = addonPath.c_str();
  const std::string platformLib = (std::filesystem::path(addon).parent_path() / "libplatform.so").string();
  EXPECT_FALSE(loader.Load(platformLib, error));
  EXPECT_NE(error.find("GetBaseViewPointer"), std::string::npos) << error;

  if (!std::filesystem::exists(addon)) GTEST_SKIP() << "add-on not built";
  ASSERT_TRUE(loader.Load(addon, error)) << error;
  EXPECT_NE(loader.Find("CPriceViewAdv"), nullptr);
  EXPECT_EQ(loader.Find("cpriceviewadv"), nullptr);
  EXPECT_EQ(loader.Find(""), nullptr);
}

// ---- The application in-process, with the terminal's own views only ----------

namespace {

struct TempDir {
  std::filesystem::path path;
  TempDir() {
    std::string tmpl = (std::filesystem::temp_directory_path() / "term_app_XXXXXX").string();
    path = mkdtemp(tmpl.data());
  }
  ~TempDir() { std::filesystem::remove_all(path); }
};

term::Options SmallRun() {
  term::Options o;
  o.headless = true;
  o.seconds = 1;
  o.instruments = 100;
  o.seed = 5;
  return o;
}

std::unique_ptr<term::Store> OpenStore(const std::filesystem::path& dir) {
  term::StoreOpenReport report;
  std::string error;
  auto store = term::Store::Open(dir, report, error);
  EXPECT_TRUE(store) << error;
  return store;
}

}  // namespace

TEST(TerminalLayout, DocksTabsFloatingAndStartParametersComeBack) {
  App();
  platform::UseVirtualClock();
  TempDir dir;
  term::AddonLoader noAddon;  // not loaded: only the terminal's own classes exist
  std::string error;
  std::string code;
  std::int64_t pid = 0;
  {
    auto store = OpenStore(dir.path);
    term::TerminalApp app(SmallRun(), noAddon, store.get());
    term::Options o = SmallRun();
    ASSERT_TRUE(app.Start(error)) << error;
    const auto& ins = app.Runtime().Market().Instruments().at(3);
    pid = ins.productId;
    code = ins.instrumentCode;
    CSuperBaseView* news = app.OpenView("CFNews", pid, code, {}, {}, error);
    CSuperBaseView* trade1 = app.OpenView("CTradeView", -1, {}, {}, {}, error);
    CSuperBaseView* trade2 = app.OpenView("CTradeView", -1, {}, {}, {}, error);
    CSuperBaseView* explorer = app.OpenView("CInsExpViewEx", -1, {}, {}, {}, error);
    ASSERT_TRUE(news && trade1 && trade2 && explorer) << error;
    EXPECT_EQ(app.OpenView("CNoSuchView", -1, {}, {}, {}, error), nullptr);
    EXPECT_NE(error.find("CNoSuchView"), std::string::npos);

    term::MainWindow& w = app.Window();
    // Same class: tabbed together. Then one floats.
    EXPECT_TRUE(w.tabifiedDockWidgets(w.DockOf(trade1)).contains(w.DockOf(trade2)));
    w.DockOf(explorer)->setFloating(true);
    EXPECT_EQ(w.DockOf(trade2)->objectName(), "dock-CTradeView-2");
    w.ActivateView(news);
    EXPECT_EQ(w.ActiveView(), news);
    ASSERT_TRUE(app.SaveLayout());
    app.Shutdown();
    EXPECT_TRUE(w.Docks().empty());
  }
  {
    auto store = OpenStore(dir.path);
    term::TerminalApp app(SmallRun(), noAddon, store.get());
    ASSERT_TRUE(app.Start(error)) << error;
    term::MainWindow& w = app.Window();
    const auto docks = w.Docks();
    std::vector<std::string> names;
    for (auto* d : docks) names.push_back(d->objectName().toStdString());
    EXPECT_EQ(names, (std::vector<std::string>{"dock-CFNews-1", "dock-CTradeView-1", "dock-CTradeView-2",
                                               "dock-CInsExpViewEx-1"}));
    ASSERT_EQ(docks.size(), 4u);
    EXPECT_TRUE(docks[3]->isFloating());
    EXPECT_FALSE(docks[1]->isFloating());
    EXPECT_TRUE(w.tabifiedDockWidgets(docks[1]).contains(docks[2]));
    EXPECT_EQ(w.ActiveView(), docks[0]->View());
    // The news view is back on its instrument, and says so in its title.
    EXPECT_EQ(docks[0]->View()->GetStartProductId(), pid);
    EXPECT_EQ(docks[0]->View()->GetStartInstrumentCode(), code);
    EXPECT_TRUE(docks[0]->windowTitle().startsWith("News - ")) << docks[0]->windowTitle().toStdString();

    // Re-docking a floating view.
    docks[3]->setFloating(false);
    EXPECT_FALSE(docks[3]->isFloating());
    app.Shutdown();
  }
}

TEST(TerminalLayout, StyleChoiceIsKeptForTheNextStart) {
  App();
  platform::UseVirtualClock();
  TempDir dir;
  term::AddonLoader noAddon;
  std::string error;
  {
    auto store = OpenStore(dir.path);
    term::TerminalApp app(SmallRun(), noAddon, store.get());
    ASSERT_TRUE(app.Start(error)) << error;
    CSuperBaseView* v = app.OpenView("CStockAnalytics", -1, {}, {}, {}, error);
    ASSERT_TRUE(v);
    const QColor light = v->palette().color(QPalette::Window);
    emit app.Window().styleRequested(2);
    EXPECT_EQ(v->GetStyleID(), 2);
    EXPECT_NE(v->palette().color(QPalette::Window), light) << "the view takes the dark style's colours";
    app.Shutdown();
  }
  auto store = OpenStore(dir.path);
  EXPECT_EQ(store->LoadSettings("ui.").at("style"), "2");
  term::TerminalApp app(SmallRun(), noAddon, store.get());
  ASSERT_TRUE(app.Start(error)) << error;
  EXPECT_EQ(app.Runtime().Styles().GetStyleID(), 2);
  app.Shutdown();
}

#include "TerminalAppTest.moc"
