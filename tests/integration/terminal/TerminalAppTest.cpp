// The terminal's pieces in-process: the grid dump convention, the command line
// and the add-on loader's refusals.
#include <gtest/gtest.h>

#include <QApplication>
#include <QStandardItemModel>
#include <QTableView>
#include <QVBoxLayout>
#include <filesystem>

#include "terminal/app/AddonLoader.h"
#include "terminal/app/GridDump.h"
#include "terminal/app/Options.h"

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

  o = Parse({"--list-instruments", "4"}, ok, error);
  ASSERT_TRUE(ok);
  EXPECT_EQ(*o.listInstruments, 4);

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
                                         {{"--frobnicate"}, "unknown option"}}) {
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

#include "TerminalAppTest.moc"
