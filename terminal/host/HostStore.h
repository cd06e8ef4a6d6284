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

// One firing of a price alert as the terminal told the user; kept with the
// alert so that its history survives a restart.
struct AlertFiring {
  std::int32_t alertId = 0;
  std::string firedAt;     // session time, "YYYY-MM-DD HH:MM:SS"
  std::string priceField;  // "ASK", "BID", "LDONE" (as stored on the alert)
  std::string comparator;  // "<=" or ">="
  double threshold = 0.0;
  double value = 0.0;      // the price that met the condition
  std::string valueText;   // the same in the instrument's format
  std::string notice;      // the notice shown and logged
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

  // Appends one firing to the alert's history. Default: not kept.
  virtual void SaveAlertFiring(const AlertFiring& firing) {}
  // The history of one alert, oldest first.
  virtual std::vector<AlertFiring> LoadAlertFirings(std::int32_t alertId) { return {}; }

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
  void SaveAlertFiring(const AlertFiring& firing) override;
  std::vector<AlertFiring> LoadAlertFirings(std::int32_t alertId) override;
  std::map<std::string, std::string> LoadSettings() override;
  void SaveSetting(const std::string& key, const std::string& value) override;

  // Inspection for tests.
  std::vector<StoredWatchlist> watchlists;
  bool watchlistsSaved = false;
  std::vector<PriceAlertItem> alerts;
  bool alertsSaved = false;
  std::vector<AlertFiring> firings;
  std::map<std::string, std::string> settings;
  int saveCount = 0;
};

}  // namespace term
