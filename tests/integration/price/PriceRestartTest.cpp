// The price view inside the terminal, in-process with the add-on loaded as the
// terminal loads it: what a user changes in the view (watchlists created,
// renamed, deleted; instruments dropped in and removed; the font size) is
// saved by the terminal and comes back from its store after a restart.
#include <gtest/gtest.h>

#include <QAbstractScrollArea>
#include <QApplication>
#include <QLineEdit>
#include <QMouseEvent>
#include <filesystem>

#include "hostconfig/UserSettings.h"
#include "hostview/CustomTabCtrl.h"
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

QApplication& App() {
  static int argc = 1;
  static char name[] = "price-restart-test";
  static char* argv[] = {name, nullptr};
  // Lives for the process: the add-on stays loaded to the end and keeps Qt objects.
  static QApplication* app = new QApplication(argc, argv);
  return *app;
}

struct TempDir {
  std::filesystem::path path;
  TempDir() {
    std::string tmpl = (std::filesystem::temp_directory_path() / "price_restart_XXXXXX").string();
    path = mkdtemp(tmpl.data());
  }
  ~TempDir() { std::filesystem::remove_all(path); }
};

std::string AddonPath() {
  if (const char* env = std::getenv("MV_ADDON")) return env;
  return (std::filesystem::read_symlink("/proc/self/exe").parent_path().parent_path() / "lib" / "libmarketviews.so")
      .string();
}

term::Options SmallMarket() {
  term::Options o;
  o.headless = true;
  o.seconds = 1;
  o.instruments = 300;
  o.seed = 77;
  return o;
}

std::unique_ptr<term::Store> OpenStore(const std::filesystem::path& dir) {
  term::StoreOpenReport report;
  std::string error;
  auto store = term::Store::Open(dir, report, error);
  EXPECT_TRUE(store) << error;
  return store;
}

void Click(QWidget* w, QPoint at, Qt::MouseButton button = Qt::LeftButton) {
  QMouseEvent press(QEvent::MouseButtonPress, QPointF(at), QPointF(w->mapToGlobal(at)), button, button, Qt::NoModifier);
  QApplication::sendEvent(w, &press);
  QMouseEvent release(QEvent::MouseButtonRelease, QPointF(at), QPointF(w->mapToGlobal(at)), button, Qt::NoButton,
                      Qt::NoModifier);
  QApplication::sendEvent(w, &release);
}

std::vector<std::string> Names(const std::vector<term::StoredWatchlist>& lists) {
  std::vector<std::string> out;
  for (const auto& w : lists) out.push_back(w.name);
  return out;
}

}  // namespace

TEST(PriceRestart, WatchlistEditsAndFontSizeComeBackFromTheStore) {
  App();
  auto& clock = platform::UseVirtualClock();
  auto dialogs = std::make_unique<platform::RecordingDialogService>();
  platform::RecordingDialogService* recorded = dialogs.get();
  platform::SetDialogService(std::move(dialogs));
  TempDir dir;
  term::AddonLoader addon;
  std::string error;
  if (!std::filesystem::exists(AddonPath())) GTEST_SKIP() << "add-on not built";
  ASSERT_TRUE(addon.Load(AddonPath(), error)) << error;

  std::vector<term::StoredWatchlist> before;
  std::string dropped;
  {
    auto store = OpenStore(dir.path);
    ASSERT_TRUE(GetUserSettings().SetStorage(std::make_shared<term::SqliteSettingsStorage>(*store)));
    term::TerminalApp app(SmallMarket(), addon, store.get());
    ASSERT_TRUE(app.Start(error)) << error;
    CSuperBaseView* view = app.OpenView("CPriceViewAdv", -1, {}, {}, {}, error);
    ASSERT_NE(view, nullptr) << error;
    app.Window().ActivateView(view);
    view->resize(1000, 600);
    for (int i = 0; i < 10; ++i) {
      clock.Advance(200);
      app.Runtime().Pump(clock.Now());
      QCoreApplication::processEvents();
    }
    before = app.Runtime().Watchlists(term::StoredWatchlist::User);
    ASSERT_GE(before.size(), 2u);
    ASSERT_GE(before[0].items.size(), 2u);
    auto* tabs = view->findChild<CCustomTabCtrl*>("UserWatchlistTabs");
    ASSERT_NE(tabs, nullptr);
    ASSERT_EQ(tabs->GetItemCount(), int(before.size()));

    // The first instrument of the list on screen leaves it (context menu, "remove").
    auto* grid = view->findChild<QAbstractScrollArea*>("PriceGrid");
    ASSERT_NE(grid, nullptr);
    recorded->menuAnswers = {1200};
    Click(grid->viewport(), QPoint(150, 28), Qt::RightButton);
    // An instrument is dropped in from a trade view.
    const auto& market = app.Runtime().Market().Instruments();
    for (const auto& ins : market) {
      bool shown = false;
      for (const auto& w : before) for (const auto& it : w.items) shown = shown || it.instrumentCode == ins.instrumentCode;
      if (shown || ins.accessStatus != 3 || ins.exchangeCode != "SGX") continue;
      dropped = ins.instrumentCode;
      emit app.Window().dropRequested(view, "CTradeView",
                                      QString("{\"type\":\"trade view\",\"data\":[{\"Field_instrument_code\":\"%1\","
                                              "\"Field_product_id\":\"%2\"}]}")
                                          .arg(QString::fromStdString(ins.instrumentCode))
                                          .arg(ins.productId));
      break;
    }
    ASSERT_FALSE(dropped.empty());
    // A new watchlist, renamed; the second list deleted from its tab.
    Click(tabs, tabs->GetAddButtonRect().center());
    ASSERT_EQ(tabs->GetItemCount(), int(before.size()) + 1);
    ASSERT_TRUE(tabs->EditLabel(tabs->GetItemCount() - 1));
    tabs->findChild<QLineEdit*>()->setText("Mine & \"Yours\"");
    tabs->CommitEdit();
    Click(tabs, tabs->GetItemRect(1).center());
    ASSERT_EQ(tabs->GetCurSel(), 1);
    Click(tabs, tabs->GetCloseButtonRect().center());  // the question is answered Yes
    // The font size menu (616): the third size.
    recorded->menuAnswers = {192};
    app.Runtime().ShowFontSizeMenu(view);
    app.Shutdown();
  }
  GetUserSettings().SetStorage(nullptr);
  EXPECT_EQ(GetUserSettings().GetWatchlistSetting().GetFontSize(), 1);  // a fresh in-memory default

  // What the next start reads. (The add-on stays loaded in this process and
  // its stores would still hold the first run's lists: the store is read
  // directly, as a restarted terminal reads it.)
  auto store = OpenStore(dir.path);
  ASSERT_TRUE(GetUserSettings().SetStorage(std::make_shared<term::SqliteSettingsStorage>(*store)));
  EXPECT_EQ(GetUserSettings().GetWatchlistSetting().GetFontSize(), 2);
  GetUserSettings().SetStorage(nullptr);
  term::SqliteHostStore hostStore(*store);
  std::vector<term::StoredWatchlist> stored;
  ASSERT_TRUE(hostStore.LoadWatchlists(stored));
  std::vector<term::StoredWatchlist> after;
  for (auto& w : stored)
    if (w.kind == term::StoredWatchlist::User) after.push_back(w);
  std::vector<std::string> expected = Names(before);
  expected.erase(expected.begin() + 1);
  expected.push_back("Mine & \"Yours\"");
  EXPECT_EQ(Names(after), expected);
  ASSERT_FALSE(after.empty());
  // The first list: its first instrument gone, the dropped one at its end.
  std::vector<std::string> codes;
  for (const auto& it : after[0].items) codes.push_back(it.instrumentCode);
  std::vector<std::string> was;
  for (const auto& it : before[0].items) was.push_back(it.instrumentCode);
  was.erase(was.begin());
  was.push_back(dropped);
  EXPECT_EQ(codes, was);
}
