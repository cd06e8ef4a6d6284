// The alert history of the store, and the step that brings a database of the
// first format to the current one without losing what the user had.
#include <gtest/gtest.h>
#include <sqlite3.h>
#include <unistd.h>

#include "terminal/store/SqliteHostStore.h"
#include "terminal/store/Store.h"

namespace fs = std::filesystem;
using term::Store;
using term::StoreOpenReport;

namespace {

struct TempDir {
  fs::path path;
  TempDir() {
    std::string tmpl = (fs::temp_directory_path() / "term_firings_XXXXXX").string();
    path = mkdtemp(tmpl.data());
  }
  ~TempDir() { fs::remove_all(path); }
};

std::unique_ptr<Store> Open(const fs::path& dir, StoreOpenReport& report) {
  std::string error;
  auto store = Store::Open(dir, report, error);
  EXPECT_TRUE(store) << error;
  return store;
}

std::int64_t Scalar(const fs::path& db, const char* sql) {
  sqlite3* h = nullptr;
  EXPECT_EQ(sqlite3_open(db.c_str(), &h), SQLITE_OK);
  sqlite3_stmt* s = nullptr;
  std::int64_t out = -1;
  if (sqlite3_prepare_v2(h, sql, -1, &s, nullptr) == SQLITE_OK && sqlite3_step(s) == SQLITE_ROW)
    out = sqlite3_column_int64(s, 0);
  sqlite3_finalize(s);
  sqlite3_close(h);
  return out;
}

void RunSql(const fs::path& db, const char* sql) {
  sqlite3* h = nullptr;
  ASSERT_EQ(sqlite3_open(db.c_str(), &h), SQLITE_OK);
  ASSERT_EQ(sqlite3_exec(h, sql, nullptr, nullptr, nullptr), SQLITE_OK) << sqlite3_errmsg(h);
  sqlite3_close(h);
}

term::AlertFiringRow Firing(std::int64_t id, const char* at, double value) {
  return {id, at, "LDONE", ">=", 10.0, value, std::to_string(value).substr(0, 5), std::string("fired at ") + at};
}

}  // namespace

TEST(StoreAlertFirings, FirstFormatDatabaseIsBroughtUpKeepingItsData) {
  TempDir dir;
  const fs::path db = dir.path / Store::kFileName;
  {
    StoreOpenReport report;
    auto store = Open(dir.path, report);
    ASSERT_TRUE(store->SaveAlerts({{3, "alert three"}}));
    ASSERT_TRUE(store->SaveSettings({{"ui.style", "2"}}));
  }
  // What the first format looked like: no alert history, format 1.
  RunSql(db, "DROP TABLE alert_firings; DROP TABLE orders; PRAGMA user_version=1;");
  ASSERT_EQ(Scalar(db, "PRAGMA user_version"), 1);

  StoreOpenReport report;
  auto store = Open(dir.path, report);
  EXPECT_EQ(report.outcome, StoreOpenReport::Outcome::Opened);
  EXPECT_TRUE(report.message.empty());
  EXPECT_FALSE(fs::exists(report.setAsidePath)) << "nothing set aside";
  ASSERT_EQ(store->LoadAlerts().size(), 1u);
  EXPECT_EQ(store->LoadAlerts()[0].body, "alert three");
  EXPECT_EQ(store->LoadSettings().at("ui.style"), "2");
  EXPECT_TRUE(store->AddAlertFiring(Firing(3, "2026-12-07 10:31:05", 10.05)));
  store.reset();
  EXPECT_EQ(Scalar(db, "PRAGMA user_version"), Store::kSchemaVersion);
}

TEST(StoreAlertFirings, HistoryComesBackInOrderAndGoesWithItsAlert) {
  TempDir dir;
  {
    StoreOpenReport report;
    auto store = Open(dir.path, report);
    ASSERT_TRUE(store->SaveAlerts({{1, "one"}, {2, "two"}}));
    ASSERT_TRUE(store->AddAlertFiring(Firing(1, "2026-12-07 10:31:05", 10.05)));
    ASSERT_TRUE(store->AddAlertFiring(Firing(2, "2026-12-07 10:32:00", 11.5)));
    ASSERT_TRUE(store->AddAlertFiring(Firing(1, "2026-12-07 10:40:10", 10.2)));
  }
  StoreOpenReport report;
  auto store = Open(dir.path, report);
  const auto history = store->LoadAlertFirings(1);
  ASSERT_EQ(history.size(), 2u);
  EXPECT_EQ(history[0].firedAt, "2026-12-07 10:31:05");
  EXPECT_DOUBLE_EQ(history[0].value, 10.05);
  EXPECT_EQ(history[0].notice, "fired at 2026-12-07 10:31:05");
  EXPECT_EQ(history[1].firedAt, "2026-12-07 10:40:10");
  EXPECT_EQ(store->LoadAlertFirings(2).size(), 1u);
  // Saving the alerts without alert 1 drops its history, not the others'.
  ASSERT_TRUE(store->SaveAlerts({{2, "two"}}));
  EXPECT_TRUE(store->LoadAlertFirings(1).empty());
  EXPECT_EQ(store->LoadAlertFirings(2).size(), 1u);
}

TEST(StoreAlertFirings, TheHostStoreKeepsFiringsOfTheRuntime) {
  TempDir dir;
  StoreOpenReport report;
  auto store = Open(dir.path, report);
  std::vector<std::string> errors;
  term::SqliteHostStore host(*store, [&](const std::string& e) { errors.push_back(e); });
  PriceAlertItem a;
  a.alertId = 4;
  a.status = "Triggered";
  a.hostTextA = "2026-12-07 11:00:00";
  a.hostTextB = "9.95";
  host.SaveAlerts({a});
  term::AlertFiring f;
  f.alertId = 4;
  f.firedAt = a.hostTextA;
  f.priceField = "BID";
  f.comparator = "<=";
  f.threshold = 10.0;
  f.value = 9.95;
  f.valueText = "9.95";
  f.notice = "Price alert 4 fired";
  host.SaveAlertFiring(f);
  const auto back = host.LoadAlertFirings(4);
  ASSERT_EQ(back.size(), 1u);
  EXPECT_EQ(back[0].alertId, 4);
  EXPECT_EQ(back[0].priceField, "BID");
  EXPECT_EQ(back[0].valueText, "9.95");
  EXPECT_EQ(back[0].notice, "Price alert 4 fired");
  std::vector<PriceAlertItem> alerts;
  ASSERT_TRUE(host.LoadAlerts(alerts));
  ASSERT_EQ(alerts.size(), 1u);
  EXPECT_EQ(alerts[0].hostTextA, "2026-12-07 11:00:00") << "when and at what value it fired";
  EXPECT_EQ(alerts[0].hostTextB, "9.95");
  EXPECT_TRUE(errors.empty());
}
