#include <gtest/gtest.h>
#include <signal.h>
#include <sqlite3.h>
#include <sys/wait.h>
#include <unistd.h>

#include <cstdlib>
#include <fstream>
#include <iterator>
#include <sstream>

#include "terminal/store/Store.h"

namespace fs = std::filesystem;
using term::Store;
using term::StoreOpenReport;
using Outcome = term::StoreOpenReport::Outcome;

namespace {

struct TempDir {
  fs::path path;
  TempDir() {
    std::string tmpl = (fs::temp_directory_path() / "term_store_XXXXXX").string();
    path = mkdtemp(tmpl.data());
  }
  ~TempDir() { fs::remove_all(path); }
};

std::unique_ptr<Store> OpenOk(const fs::path& dir, StoreOpenReport& report) {
  std::string error;
  auto store = Store::Open(dir, report, error);
  EXPECT_TRUE(store) << error;
  return store;
}

std::string ReadFile(const fs::path& p) {
  std::ifstream in(p, std::ios::binary);
  return {std::istreambuf_iterator<char>(in), {}};
}

void WriteFile(const fs::path& p, const std::string& bytes) {
  std::ofstream out(p, std::ios::binary | std::ios::trunc);
  out << bytes;
}

void RunSql(const fs::path& db, const char* sql) {
  sqlite3* h = nullptr;
  ASSERT_EQ(sqlite3_open(db.c_str(), &h), SQLITE_OK);
  ASSERT_EQ(sqlite3_exec(h, sql, nullptr, nullptr, nullptr), SQLITE_OK) << sqlite3_errmsg(h);
  sqlite3_close(h);
}

term::SavedLayout SampleLayout() {
  term::SavedLayout layout;
  layout.views.push_back({"CPriceViewAdv", "dock-CPriceViewAdv-1", -1, "", {{"User_field_display_mode", "1"}}});
  layout.views.push_back({"CMarketDepthAdv", "dock-CMarketDepthAdv-1", 7, "D05 \"q\"\\",
                          {{"User_field_product_id", "7"}, {"User_field_save_space", "0"}}});
  layout.views.push_back({"CTradeView", "dock-CTradeView-1", 3, "ÄÖ-é", {}});
  layout.windowGeometry = std::string("\x01\x00\xff geometry", 12);
  layout.windowState = std::string("state\x00with nul", 14);
  layout.activeView = "dock-CMarketDepthAdv-1";
  return layout;
}

}  // namespace

TEST(Store, RoundTrip_EverythingSavedComesBackAfterReopen) {
  TempDir dir;
  const auto layout = SampleLayout();
  {
    StoreOpenReport report;
    auto store = OpenOk(dir.path, report);
    EXPECT_EQ(report.outcome, Outcome::Created);
    EXPECT_TRUE(report.message.empty());
    ASSERT_TRUE(store->SaveSettings({{"font.size", "12"}, {"shortcut.trade", "F2"}}));
    ASSERT_TRUE(store->SaveWatchlists(0, {{0, 9, "Tech & \"Friends\"", "<wl a=\"1\"/>"}, {0, 3, "Banks", "<wl/>"}}));
    ASSERT_TRUE(store->SaveWatchlists(2, {{2, 1, "Brand <1>", "<b/>"}}));
    ASSERT_TRUE(store->SaveAlerts({{5, "alert five"}, {2, "alert two"}}));
    ASSERT_TRUE(store->SaveLayout(layout));
  }
  StoreOpenReport report;
  auto store = OpenOk(dir.path, report);
  EXPECT_EQ(report.outcome, Outcome::Opened);
  EXPECT_EQ(store->LoadSettings(), (std::map<std::string, std::string>{{"font.size", "12"}, {"shortcut.trade", "F2"}}));

  const auto user = store->LoadWatchlists(0);
  ASSERT_EQ(user.size(), 2u);  // saved order, not id order
  EXPECT_EQ(user[0].id, 9);
  EXPECT_EQ(user[0].name, "Tech & \"Friends\"");
  EXPECT_EQ(user[0].body, "<wl a=\"1\"/>");
  EXPECT_EQ(user[1].name, "Banks");
  const auto brand = store->LoadWatchlists(2);
  ASSERT_EQ(brand.size(), 1u);
  EXPECT_EQ(brand[0].name, "Brand <1>");

  const auto alerts = store->LoadAlerts();
  ASSERT_EQ(alerts.size(), 2u);
  EXPECT_EQ(alerts[0].id, 2);
  EXPECT_EQ(alerts[1].body, "alert five");

  const auto back = store->LoadLayout();
  ASSERT_EQ(back.views.size(), layout.views.size());
  for (std::size_t i = 0; i < back.views.size(); ++i) {
    EXPECT_EQ(back.views[i].className, layout.views[i].className);
    EXPECT_EQ(back.views[i].objectName, layout.views[i].objectName);
    EXPECT_EQ(back.views[i].productId, layout.views[i].productId);
    EXPECT_EQ(back.views[i].instrumentCode, layout.views[i].instrumentCode);
    EXPECT_EQ(back.views[i].params, layout.views[i].params);
  }
  EXPECT_EQ(back.windowGeometry, layout.windowGeometry);
  EXPECT_EQ(back.windowState, layout.windowState);
  EXPECT_EQ(back.activeView, layout.activeView);
}

TEST(Store, Save_ReplacesOnlyWhatItSaves) {
  TempDir dir;
  StoreOpenReport report;
  auto store = OpenOk(dir.path, report);
  ASSERT_TRUE(store->SaveWatchlists(0, {{0, 1, "a", ""}, {0, 2, "b", ""}}));
  ASSERT_TRUE(store->SaveWatchlists(2, {{2, 1, "brand", ""}}));
  ASSERT_TRUE(store->SaveWatchlists(0, {{0, 2, "b2", ""}}));
  ASSERT_TRUE(store->SaveLayout(SampleLayout()));
  ASSERT_TRUE(store->SaveLayout({}));

  const auto user = store->LoadWatchlists(0);
  ASSERT_EQ(user.size(), 1u);
  EXPECT_EQ(user[0].name, "b2");
  EXPECT_EQ(store->LoadWatchlists(2).size(), 1u);
  EXPECT_TRUE(store->LoadLayout().empty());
}

TEST(Store, Open_EmptyFileBecomesANewDatabase) {
  TempDir dir;
  WriteFile(dir.path / Store::kFileName, "");
  StoreOpenReport report;
  auto store = OpenOk(dir.path, report);
  EXPECT_EQ(report.outcome, Outcome::Created);
  EXPECT_TRUE(store->SaveSettings({{"k", "v"}}));
}

// The database is killed between saves again and again; after the kill every
// save the child reported as done is there and the two tables agree.
TEST(Store, Kill_NothingSavedIsLostWhenKilledBetweenSaves) {
  TempDir dir;
  const fs::path child = fs::read_symlink("/proc/self/exe").parent_path() / "term_store_kill_child";
  ASSERT_TRUE(fs::exists(child)) << child;

  for (long killAfter : {1L, 25L, 120L}) {
    int out[2];
    ASSERT_EQ(pipe(out), 0);
    const pid_t pid = fork();
    ASSERT_GE(pid, 0);
    if (pid == 0) {
      dup2(out[1], STDOUT_FILENO);
      close(out[0]);
      close(out[1]);
      execl(child.c_str(), child.c_str(), dir.path.c_str(), static_cast<char*>(nullptr));
      _exit(127);
    }
    close(out[1]);
    long acknowledged = 0;
    std::string pending;
    char buf[256];
    bool killed = false;
    for (;;) {
      const ssize_t n = read(out[0], buf, sizeof buf);
      if (n <= 0) break;
      pending.append(buf, static_cast<std::size_t>(n));
      for (std::size_t nl; (nl = pending.find('\n')) != std::string::npos; pending.erase(0, nl + 1))
        acknowledged = std::stol(pending.substr(0, nl));
      if (!killed && acknowledged >= killAfter) {
        kill(pid, SIGKILL);  // the child is somewhere in its next save
        killed = true;
      }
    }
    close(out[0]);
    int status = 0;
    ASSERT_EQ(waitpid(pid, &status, 0), pid);
    ASSERT_TRUE(WIFSIGNALED(status) && WTERMSIG(status) == SIGKILL) << "child ended on its own: " << status;

    StoreOpenReport report;
    auto store = OpenOk(dir.path, report);
    ASSERT_EQ(report.outcome, Outcome::Opened) << report.message;
    const auto settings = store->LoadSettings();
    ASSERT_TRUE(settings.count("counter"));
    const long counter = std::stol(settings.at("counter"));
    EXPECT_GE(counter, acknowledged);
    EXPECT_LE(counter, acknowledged + 1);
    // The watchlists are from the last settings save or from the one after it.
    const auto lists = store->LoadWatchlists(0);
    ASSERT_FALSE(lists.empty());
    const long listSave = std::stol(lists[0].body.substr(3));
    ASSERT_TRUE(listSave == counter || listSave == counter + 1) << listSave << " vs " << counter;
    EXPECT_EQ(static_cast<long>(lists.size()), listSave % 50 + 1);
    for (const auto& l : lists) EXPECT_EQ(l.body, lists[0].body);
  }
}

class StoreSetAside : public ::testing::Test {
 protected:
  TempDir dir;
  fs::path db() const { return dir.path / Store::kFileName; }

  // Opens, expects the old file to be moved aside byte for byte, and a usable new store.
  void ExpectSetAside(Outcome expected, const std::string& wording) {
    const std::string before = ReadFile(db());
    StoreOpenReport report;
    auto store = OpenOk(dir.path, report);
    ASSERT_TRUE(store);
    EXPECT_EQ(report.outcome, expected);
    ASSERT_FALSE(report.setAsidePath.empty());
    EXPECT_EQ(report.setAsidePath.parent_path(), dir.path);
    EXPECT_EQ(ReadFile(report.setAsidePath), before) << "the old database must be kept unchanged";
    EXPECT_NE(report.message.find(report.setAsidePath.string()), std::string::npos) << report.message;
    EXPECT_NE(report.message.find(wording), std::string::npos) << report.message;
    EXPECT_TRUE(store->LoadSettings().empty());
    EXPECT_TRUE(store->SaveSettings({{"fresh", "1"}}));

    // A second start uses the new database and sets nothing aside again.
    store.reset();
    StoreOpenReport again;
    auto reopened = OpenOk(dir.path, again);
    EXPECT_EQ(again.outcome, Outcome::Opened);
    EXPECT_EQ(reopened->LoadSettings().count("fresh"), 1u);
  }
};

TEST_F(StoreSetAside, Corrupt_GarbageFileIsKeptAndReported) {
  WriteFile(db(), std::string(8192, 'x'));
  ExpectSetAside(Outcome::ReplacedCorrupt, "cannot be read");
}

TEST_F(StoreSetAside, Corrupt_DamagedPagesAreKeptAndReported) {
  {
    StoreOpenReport report;
    auto store = OpenOk(dir.path, report);
    std::vector<term::WatchlistRow> lists;
    for (int i = 0; i < 400; ++i) lists.push_back({0, i, "list " + std::to_string(i), std::string(200, 'w')});
    ASSERT_TRUE(store->SaveWatchlists(0, lists));
  }
  // Checkpointed on close; now scribble over the pages after the header page.
  std::string bytes = ReadFile(db());
  ASSERT_GT(bytes.size(), 20000u);
  for (std::size_t i = 4096; i < 20000; ++i) bytes[i] = static_cast<char>(i * 31);
  WriteFile(db(), bytes);
  ExpectSetAside(Outcome::ReplacedCorrupt, "cannot be read");
}

TEST_F(StoreSetAside, Corrupt_AnotherProgramsDatabaseIsNotTouched) {
  RunSql(db(), "CREATE TABLE notes(x TEXT); INSERT INTO notes VALUES('mine');");
  ExpectSetAside(Outcome::ReplacedCorrupt, "not a terminal database");
}

TEST_F(StoreSetAside, Newer_DatabaseFromANewerTerminalIsKeptAndReported) {
  {
    StoreOpenReport report;
    auto store = OpenOk(dir.path, report);
    ASSERT_TRUE(store->SaveSettings({{"old", "1"}}));
  }
  RunSql(db(), "PRAGMA user_version=7");
  ExpectSetAside(Outcome::ReplacedNewer, "newer terminal");
}

// A database of the first format (before the blotter) opens in place, keeps
// everything and gains the orders table.
TEST(Store, Upgrade_OlderDatabaseKeepsItsDataAndGainsTheBlotter) {
  TempDir dir;
  const auto layout = SampleLayout();
  {
    StoreOpenReport report;
    auto store = OpenOk(dir.path, report);
    ASSERT_TRUE(store->SaveSettings({{"ui.style", "2"}}));
    ASSERT_TRUE(store->SaveWatchlists(0, {{0, 9, "Banks", "<wl/>"}}));
    ASSERT_TRUE(store->SaveAlerts({{5, "alert five"}}));
    ASSERT_TRUE(store->SaveLayout(layout));
  }
  // What a terminal of the first format left behind.
  RunSql(dir.path / Store::kFileName, "DROP TABLE orders; DROP TABLE alert_firings; PRAGMA user_version=1;");
  StoreOpenReport report;
  auto store = OpenOk(dir.path, report);
  ASSERT_TRUE(store);
  EXPECT_EQ(report.outcome, Outcome::Opened);
  EXPECT_EQ(report.upgradedFrom, 1);
  EXPECT_TRUE(report.setAsidePath.empty());
  EXPECT_EQ(store->LoadSettings().at("ui.style"), "2");
  ASSERT_EQ(store->LoadWatchlists(0).size(), 1u);
  EXPECT_EQ(store->LoadAlerts().at(0).body, "alert five");
  EXPECT_EQ(store->LoadLayout().views.size(), layout.views.size());
  EXPECT_EQ(store->LastOrderNumber(), 0);
  term::OrderRow order{7, "2026-12-07", "10:31:02", "Buy", 101, "D05", 300, 12.345, "Limit", "Day", "-", "Working"};
  ASSERT_TRUE(store->SaveOrder(order)) << store->LastError();
  order.status = "Filled";
  ASSERT_TRUE(store->SaveOrder(order));
  store.reset();

  auto again = OpenOk(dir.path, report);
  EXPECT_EQ(report.upgradedFrom, 0) << "brought up to date once";
  const auto orders = again->LoadOrders("2026-12-07");
  ASSERT_EQ(orders.size(), 1u);
  EXPECT_EQ(orders[0].status, "Filled");
  EXPECT_DOUBLE_EQ(orders[0].price, 12.345);
  EXPECT_EQ(orders[0].instrumentCode, "D05");
  EXPECT_TRUE(again->LoadOrders("2026-12-08").empty()) << "another day's blotter is empty";
  EXPECT_EQ(again->LastOrderNumber(), 7);
}

TEST(Store, Open_UnusableFolderIsAnError) {
  TempDir dir;
  WriteFile(dir.path / "file", "x");
  StoreOpenReport report;
  std::string error;
  EXPECT_FALSE(Store::Open(dir.path / "file", report, error));
  EXPECT_NE(error.find("data folder"), std::string::npos) << error;
}

// A database another program holds locked is left alone: the terminal does
// not start, and nothing is set aside for damaged.
TEST(Store, Open_DatabaseLockedByAnotherProgramIsRefusedAndKept) {
  TempDir dir;
  {
    StoreOpenReport report;
    auto store = OpenOk(dir.path, report);
    ASSERT_TRUE(store->SaveSettings({{"kept", "1"}}));
  }
  sqlite3* other = nullptr;
  ASSERT_EQ(sqlite3_open((dir.path / Store::kFileName).c_str(), &other), SQLITE_OK);
  ASSERT_EQ(sqlite3_exec(other, "PRAGMA locking_mode=EXCLUSIVE; BEGIN EXCLUSIVE; CREATE TABLE hold(x);", nullptr,
                         nullptr, nullptr),
            SQLITE_OK);
  StoreOpenReport report;
  std::string error;
  EXPECT_FALSE(Store::Open(dir.path, report, error, 0));
  EXPECT_NE(error.find("locked by another program"), std::string::npos) << error;
  EXPECT_TRUE(report.setAsidePath.empty());
  std::size_t files = 0;
  for ([[maybe_unused]] const auto& entry : fs::directory_iterator(dir.path)) ++files;
  EXPECT_LE(files, 3u) << "the database and its -wal and -shm, nothing moved aside";

  ASSERT_EQ(sqlite3_exec(other, "ROLLBACK", nullptr, nullptr, nullptr), SQLITE_OK);
  sqlite3_close(other);
  auto again = OpenOk(dir.path, report);
  EXPECT_EQ(report.outcome, Outcome::Opened);
  EXPECT_EQ(again->LoadSettings().count("kept"), 1u);
}

TEST(Store, DefaultDataDir_FollowsXdgDataHome) {
  setenv("XDG_DATA_HOME", "/tmp/xdg-here", 1);
  EXPECT_EQ(Store::DefaultDataDir(), fs::path("/tmp/xdg-here/marketviews-terminal"));
  setenv("XDG_DATA_HOME", "relative", 1);  // ignored, as the XDG rules say
  setenv("HOME", "/home/someone", 1);
  EXPECT_EQ(Store::DefaultDataDir(), fs::path("/home/someone/.local/share/marketviews-terminal"));
}

// ---- The host runtime's store on SQLite --------------------------------------

#include "terminal/store/SqliteHostStore.h"

TEST(SqliteHostStore, RoundTrip_WatchlistsAlertsAndSettingsSurviveReopen) {
  TempDir dir;
  PriceAlertItem alert;
  alert.alertId = 4;
  alert.productId = 12;
  alert.exchangeCode = "SGX";
  alert.instrumentCode = "D05 \"x\"";
  alert.triggerOnce = false;
  alert.validUntil = "2026-12-31";
  alert.priceField = "BID";
  alert.comparator = "<=";
  alert.triggerValue = 31.25;
  alert.viaEmail = true;
  alert.status = "Triggered";
  alert.hostTextA = "2026-12-07 10:31:00";
  alert.hostNumber = 2;
  {
    StoreOpenReport report;
    auto store = OpenOk(dir.path, report);
    term::SqliteHostStore host(*store);
    std::vector<term::StoredWatchlist> loaded;
    EXPECT_FALSE(host.LoadWatchlists(loaded)) << "nothing saved yet";
    std::vector<PriceAlertItem> alerts;
    EXPECT_FALSE(host.LoadAlerts(alerts));

    term::StoredWatchlist user;
    user.id = 7;
    user.name = "Banks & <Co>";
    user.items = {{1, "D05"}, {2, "O39 \\ odd"}};
    term::StoredWatchlist brand;
    brand.id = 1;
    brand.kind = term::StoredWatchlist::Brand;
    brand.name = "Brand";
    brand.items = {{3, "[KELDO]X1"}};
    host.SaveWatchlists(term::StoredWatchlist::User, {user});
    host.SaveWatchlists(term::StoredWatchlist::Brand, {brand});
    host.SaveAlerts({alert});
    host.SaveSetting("MAXWL", "300");
    host.SaveSetting("WLNOT", "1");
    host.SaveSetting("WLNOT", "");  // removed
    ASSERT_TRUE(store->SaveSetting("ui.style", "2"));  // another part of the terminal
  }
  StoreOpenReport report;
  auto store = OpenOk(dir.path, report);
  term::SqliteHostStore host(*store);
  std::vector<term::StoredWatchlist> lists;
  ASSERT_TRUE(host.LoadWatchlists(lists));
  ASSERT_EQ(lists.size(), 2u);
  EXPECT_EQ(lists[0].name, "Banks & <Co>");
  EXPECT_EQ(lists[0].kind, term::StoredWatchlist::User);
  ASSERT_EQ(lists[0].items.size(), 2u);
  EXPECT_EQ(lists[0].items[1].instrumentCode, "O39 \\ odd");
  EXPECT_EQ(lists[1].kind, term::StoredWatchlist::Brand);
  EXPECT_EQ(lists[1].items[0].instrumentCode, "[KELDO]X1");

  std::vector<PriceAlertItem> alerts;
  ASSERT_TRUE(host.LoadAlerts(alerts));
  ASSERT_EQ(alerts.size(), 1u);
  EXPECT_EQ(alerts[0].instrumentCode, alert.instrumentCode);
  EXPECT_EQ(alerts[0].triggerOnce, false);
  EXPECT_EQ(alerts[0].comparator, "<=");
  EXPECT_DOUBLE_EQ(alerts[0].triggerValue, 31.25);
  EXPECT_EQ(alerts[0].status, "Triggered");
  EXPECT_DOUBLE_EQ(alerts[0].hostNumber, 2);

  EXPECT_EQ(host.LoadSettings(), (std::map<std::string, std::string>{{"MAXWL", "300"}}));
}

TEST(SqliteHostStore, Load_EmptySavedSetIsNotNothingSaved) {
  TempDir dir;
  StoreOpenReport report;
  auto store = OpenOk(dir.path, report);
  term::SqliteHostStore host(*store);
  host.SaveWatchlists(term::StoredWatchlist::User, {});
  host.SaveAlerts({});
  std::vector<term::StoredWatchlist> lists;
  std::vector<PriceAlertItem> alerts;
  EXPECT_TRUE(host.LoadWatchlists(lists));  // the user deleted them all: no starter lists again
  EXPECT_TRUE(lists.empty());
  EXPECT_TRUE(host.LoadAlerts(alerts));
}
