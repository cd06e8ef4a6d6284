#pragma once
// The host runtime's persistence (watchlists, alerts, setting overrides) on the
// terminal's SQLite store. Host settings live under the "host." key prefix.
#include <functional>

#include "terminal/host/HostStore.h"
#include "terminal/store/Store.h"

namespace term {

class SqliteHostStore : public IHostStore {
 public:
  // `store` must outlive this object. `onError` (optional) hears every failed save.
  explicit SqliteHostStore(Store& store, std::function<void(const std::string&)> onError = {});

  bool LoadWatchlists(std::vector<StoredWatchlist>& out) override;
  void SaveWatchlists(StoredWatchlist::Kind kind, const std::vector<StoredWatchlist>& lists) override;
  bool LoadAlerts(std::vector<PriceAlertItem>& out) override;
  void SaveAlerts(const std::vector<PriceAlertItem>& alerts) override;
  void SaveAlertFiring(const AlertFiring& firing) override;
  std::vector<AlertFiring> LoadAlertFirings(std::int32_t alertId) override;
  std::map<std::string, std::string> LoadSettings() override;
  void SaveSetting(const std::string& key, const std::string& value) override;

  static constexpr const char* kSettingPrefix = "host.";

 private:
  void Report(const char* what);
  Store& m_store;
  std::function<void(const std::string&)> m_onError;
};

// The stored texts of one watchlist's items and one alert (JSON).
std::string EncodeWatchItems(const std::vector<StoredWatchItem>& items);
bool DecodeWatchItems(const std::string& text, std::vector<StoredWatchItem>& items);
std::string EncodeAlert(const PriceAlertItem& alert);
bool DecodeAlert(const std::string& text, PriceAlertItem& alert);

}  // namespace term
