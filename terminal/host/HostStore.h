#pragma once
// Where the terminal keeps what the user owns across runs: watchlists, price
// alerts and setting overrides. The runtime loads them once at start and saves
// after every change; the terminal application plugs in its SQLite store, tests
// and the headless terminal use the in-memory one.
//
// Contract for implementations: every call runs on the UI thread; a failing
// save must not throw (log and keep going: the runtime keeps its own copy and
// saves the whole set again on the next change).
#include <cstdint>
#include <map>
#include <string>
#include <vector>

#include "hostview/AlertRecords.h"

namespace term {

// One instrument of a stored watchlist.
struct StoredWatchItem {
  std::int64_t productId = 0;
  std::string instrumentCode;
};

// One stored watchlist (user or brand).
struct StoredWatchlist {
  enum Kind : int { User = 0, Brand = 2 };
  std::int32_t id = 0;
  Kind kind = User;
  std::string name;                    // UTF-8
  std::vector<StoredWatchItem> items;  // display order
};

class IHostStore {
 public:
  virtual ~IHostStore() = default;

  // False when nothing was stored yet (the runtime then seeds starter lists).
  virtual bool LoadWatchlists(std::vector<StoredWatchlist>& out) = 0;
  // Replaces every stored watchlist of `kind` by `lists` (in that order).
  virtual void SaveWatchlists(StoredWatchlist::Kind kind, const std::vector<StoredWatchlist>& lists) = 0;

  // False when nothing was stored yet.
  virtual bool LoadAlerts(std::vector<PriceAlertItem>& out) = 0;
  // Replaces every stored alert by `alerts`.
  virtual void SaveAlerts(const std::vector<PriceAlertItem>& alerts) = 0;

  // Setting overrides by key ("MAXWL", ...), applied over the config file.
  virtual std::map<std::string, std::string> LoadSettings() = 0;
  virtual void SaveSetting(const std::string& key, const std::string& value) = 0;
};

// Keeps everything in memory; what a test or the headless terminal uses.
class MemoryHostStore : public IHostStore {
 public:
  bool LoadWatchlists(std::vector<StoredWatchlist>& out) override;
  void SaveWatchlists(StoredWatchlist::Kind kind, const std::vector<StoredWatchlist>& lists) override;
  bool LoadAlerts(std::vector<PriceAlertItem>& out) override;
  void SaveAlerts(const std::vector<PriceAlertItem>& alerts) override;
  std::map<std::string, std::string> LoadSettings() override;
  void SaveSetting(const std::string& key, const std::string& value) override;

  // Inspection for tests.
  std::vector<StoredWatchlist> watchlists;
  bool watchlistsSaved = false;
  std::vector<PriceAlertItem> alerts;
  bool alertsSaved = false;
  std::map<std::string, std::string> settings;
  int saveCount = 0;
};

}  // namespace term
