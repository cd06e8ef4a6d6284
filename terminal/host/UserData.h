#pragma once
// What the user owns: settings (built-in, config file, stored overrides),
// user and brand watchlists, and price alerts. Loaded from the store once and
// saved after every change; a failing save is logged and the runtime keeps its
// copy (the next change saves the whole set again).
#include <cstdint>
#include <memory>
#include <string>
#include <vector>

#include "hostview/AlertRecords.h"
#include "hostview/HostLists.h"
#include "hostview/Records.h"
#include "terminal/host/AlertDesk.h"
#include "terminal/host/HostRuntime.h"
#include "terminal/host/HostStore.h"
#include "terminal/host/MarketSource.h"
#include "terminal/sim/Market.h"

namespace term {

class LogFactory;

class UserData {
 public:
  UserData(IHostStore& store, LogFactory& log, HostStats& stats);
  UserData(const UserData&) = delete;
  UserData& operator=(const UserData&) = delete;

  // Settings: the config file (may be empty), then the store's overrides.
  void LoadSettings(const std::string& configFile);
  // Watchlists (starter and brand lists on first start) and alerts.
  // The alerts are checked against `market` from then on.
  void LoadListsAndAlerts(sim::Market& market);

  HostSettings settings;
  std::unique_ptr<AlertDesk> alerts;  // made by LoadListsAndAlerts
  std::vector<StoredWatchlist> userLists, brandLists;

  // Changes a setting and stores it.
  void SaveSetting(const std::string& key, const std::string& value);
  // Stores a view's own setting ("view." + key); not one the runtime reads.
  void SaveViewSetting(const std::string& key, const std::string& value);
  void SaveLists(StoredWatchlist::Kind kind);
  // Appends user watchlists (imported ones) with new ids and stores them.
  void AddUserLists(std::vector<StoredWatchlist> lists);
  void SaveAlerts();

  // 2813 and 522 rows.
  std::vector<JWatchlistRow> UserRows() const;
  std::vector<JKeldoWatchlistRow> BrandRows(const MarketSource& market) const;

  // The price view's watchlist texts. Saved: the lists changed and are
  // stored. Unreadable: the text could not be read (the user should be told).
  // Refused: a readable change that cannot apply (logged). Nothing changes
  // unless Saved.
  enum class Edit { Saved, Unreadable, Refused };
  Edit SaveNames(const WatchlistFeedback& f);
  Edit SaveUserItems(const WatchlistFeedback& f, const MarketSource& market);
  Edit RenameBrand(const WatchlistFeedback& f);
  Edit SaveBrandItems(const WatchlistFeedback& f, const MarketSource& market);

 private:
  Edit Unreadable(const char* what, const std::string& why, const WatchlistFeedback& f);
  int MaxItems() const;

  IHostStore& store_;
  LogFactory& log_;
  HostStats& stats_;
  std::int32_t nextWatchlistId_ = 1001;
};

}  // namespace term
