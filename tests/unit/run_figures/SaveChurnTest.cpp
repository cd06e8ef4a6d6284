// The crash-safety check of a store written by --save-churn: a store killed
// between or inside saves holds, per set, one whole generation; anything
// else (a set half-written, emptied, or older than what was committed) is
// reported.
#include <gtest/gtest.h>

#include <filesystem>
#include <random>

#include "hostview/Records.h"
#include "terminal/app/SaveChurn.h"
#include "terminal/store/SqliteHostStore.h"
#include "terminal/store/SqliteSettingsStorage.h"

namespace term {
namespace {

namespace fs = std::filesystem;

struct TempDir {
  fs::path path;
  TempDir() {
    path = fs::temp_directory_path() / ("mv-churn-" + std::to_string(std::random_device{}()));
    fs::create_directories(path);
  }
  ~TempDir() {
    std::error_code ec;
    fs::remove_all(path, ec);
  }
};

std::vector<JInstrumentUnderlying> Instruments() {
  std::vector<JInstrumentUnderlying> out;
  for (int i = 0; i < 30; ++i) {
    JInstrumentUnderlying ins;
    ins.exchangeCode = i % 2 ? "SGX" : "HKEX";
    ins.instrumentCode = "C" + std::to_string(i);
    ins.productId = 101;
    out.push_back(ins);
  }
  return out;
}

SavedLayout Layout(int views) {
  SavedLayout l;
  for (int i = 0; i < views; ++i) l.views.push_back({"CPriceAlertList", "dock-CPriceAlertList-" + std::to_string(i + 1), -1, "", {}});
  l.windowGeometry = "geometry";
  l.windowState = "state";
  return l;
}

// The saves of one generation in the terminal's order; `upTo` of them (1 to 5).
void Save(Store& store, std::int64_t g, int upTo = 5) {
  SqliteHostStore host(store);
  const auto instruments = Instruments();
  if (upTo >= 1) host.SaveWatchlists(StoredWatchlist::User, churn::Watchlists(g, instruments));
  if (upTo >= 2) host.SaveAlerts(churn::Alerts(g, instruments));
  if (upTo >= 3) host.SaveSetting(churn::kSettingKey, churn::HostSetting(g));
  if (upTo >= 4) {
    ASSERT_TRUE(SqliteSettingsStorage(store).Write(churn::kSettingKey, churn::UserSetting(g)));
  }
  if (upTo >= 5) {
    SavedLayout layout = Layout(3);
    churn::StampLayout(layout, g);
    ASSERT_TRUE(store.SaveLayout(layout));
  }
}

std::unique_ptr<Store> Open(const fs::path& dir) {
  StoreOpenReport report;
  std::string error;
  auto store = Store::Open(dir, report, error);
  EXPECT_TRUE(store) << error;
  return store;
}

TEST(SaveChurn, AStoreBetweenOrInsideAGenerationHoldsOldOrNewSetsAndPasses) {
  TempDir dir;
  auto store = Open(dir.path);
  const auto instruments = Instruments();
  // A fresh store: nothing churned yet, nothing committed.
  churn::Found f = churn::Inspect(*store, instruments);
  EXPECT_EQ(f.Newest(), -1);
  EXPECT_TRUE(churn::Verdict(f, 0).empty());

  for (std::int64_t g = 0; g <= 7; ++g) Save(*store, g);
  f = churn::Inspect(*store, instruments);
  EXPECT_EQ(f.watchlists, 7);
  EXPECT_EQ(f.layout, 7);
  EXPECT_TRUE(churn::Verdict(f, 7).empty());

  // Killed inside generation 8 after each of its saves: every set is 7 or 8.
  for (int upTo = 1; upTo <= 4; ++upTo) {
    Save(*store, 8, upTo);
    f = churn::Inspect(*store, instruments);
    EXPECT_EQ(f.watchlists, 8);
    EXPECT_EQ(f.layout, 7);
    EXPECT_TRUE(churn::Verdict(f, 7).empty()) << upTo;
  }
}

TEST(SaveChurn, HalfWrittenEmptiedOrOlderSetsAreReported) {
  TempDir dir;
  auto store = Open(dir.path);
  const auto instruments = Instruments();
  for (std::int64_t g = 0; g <= 4; ++g) Save(*store, g);

  // Generation 4 was committed, but the store shows 3: a save went missing.
  Save(*store, 3);
  auto problems = churn::Verdict(churn::Inspect(*store, instruments), 4);
  EXPECT_EQ(problems.size(), 5u);

  // The watchlists of generation 5 with the items of 4: half-written.
  Save(*store, 5);
  auto lists = churn::Watchlists(5, instruments);
  lists[0].items = churn::Watchlists(4, instruments)[0].items;
  SqliteHostStore(*store).SaveWatchlists(StoredWatchlist::User, lists);
  auto f = churn::Inspect(*store, instruments);
  EXPECT_EQ(f.watchlists, -1);
  ASSERT_FALSE(f.problems.empty());
  EXPECT_NE(f.problems[0].find("not whole generation 5"), std::string::npos) << f.problems[0];

  // Emptied sets, a cut setting, a layout of two generations.
  Save(*store, 6);
  SqliteHostStore(*store).SaveWatchlists(StoredWatchlist::User, {});
  SqliteHostStore(*store).SaveAlerts({});
  ASSERT_TRUE(store->SaveSetting("host.churn", churn::HostSetting(6).substr(0, 20)));
  SavedLayout layout = Layout(2);
  churn::StampLayout(layout, 6);
  layout.views[1].params[churn::kLayoutParam] = "5";
  ASSERT_TRUE(store->SaveLayout(layout));
  f = churn::Inspect(*store, instruments);
  EXPECT_EQ(f.problems.size(), 4u);  // watchlists, alerts, the host setting, the layout
  problems = churn::Verdict(f, 6);
  EXPECT_GE(problems.size(), 6u);

  // Sets newer than the ones saved before them cannot come from saves in order.
  Save(*store, 7);
  Save(*store, 8, 4);
  ASSERT_TRUE(SqliteSettingsStorage(*store).Write(churn::kSettingKey, churn::UserSetting(9)));
  problems = churn::Verdict(churn::Inspect(*store, instruments), 7);
  ASSERT_EQ(problems.size(), 1u);
  EXPECT_NE(problems[0].find("newer than"), std::string::npos) << problems[0];
}

}  // namespace
}  // namespace term
