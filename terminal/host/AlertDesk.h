#pragma once
// The terminal's price alerts: it keeps them, checks each one on every price
// change of its instrument in the simulated market, moves them to "Triggered"
// (when the condition holds) and "Expired" (after the last valid day), and
// words the notice of each firing.
//
//   AlertDesk desk(market);            // listens to the market's price changes
//   desk.Load(stored);
//   market.AdvanceTo(now);             // crossings are caught as they happen
//   bool changed; for (auto& f : desk.Collect(&changed)) ...;   // notices, store
//
// An alert watches its field from the moment it is created or changed: a
// condition that already holds fires at the next Collect. A repeating alert
// (trigger once off) fires again each time its condition turns true again.
// While an alert is live its instrument counts as watched, so the market moves
// it at the pace of the instruments on screen.
//
// Single-threaded; the market's listener runs inside Market::AdvanceTo.
#include <cstdint>
#include <string>
#include <vector>

#include "hostview/AlertRecords.h"
#include "terminal/host/HostStore.h"

namespace sim {
class Market;
}

namespace term {

class AlertDesk {
 public:
  explicit AlertDesk(sim::Market& market);
  ~AlertDesk();
  AlertDesk(const AlertDesk&) = delete;
  AlertDesk& operator=(const AlertDesk&) = delete;

  // Replaces all alerts (loaded from the store); the next id follows the highest.
  void Load(std::vector<PriceAlertItem> alerts);
  // Returns the new id; the status becomes "Active" and the terminal's own
  // fields start empty.
  std::int32_t Create(PriceAlertItem item);
  // False when the id is unknown. The changed alert is "Active" again and
  // keeps its firing history.
  bool Update(const PriceAlertItem& item);
  // Number of alerts removed.
  int Remove(const std::vector<std::int32_t>& ids);
  std::vector<PriceAlertItem> All() const;
  const PriceAlertItem* Find(std::int32_t id) const;

  // Expires what is past its last day, checks new and changed alerts against
  // the current prices, and returns every firing since the last call in the
  // order they happened. `changed` tells whether any status moved.
  std::vector<AlertFiring> Collect(bool* changed);

  // The notice of a firing: which alert, instrument, field, condition,
  // threshold, the value that met it and when.
  static std::string NoticeText(const PriceAlertItem& alert, const std::string& instrumentName,
                                const std::string& valueText, const std::string& thresholdText,
                                const std::string& firedAt);
  static const char* FieldName(const std::string& priceField);

 private:
  struct Entry {
    PriceAlertItem alert;
    int index = -1;         // instrument in the market; -1 unknown
    int base = -1;          // whose prices it shows
    bool wasTrue = false;   // the condition held at the last check
    bool armed = true;      // to be checked against the current prices
    bool watching = false;  // counted in the market's watch and interest
  };

  static bool IsLive(const PriceAlertItem& a);
  void Bind(Entry& e);
  void SetWatching(Entry& e, bool on);
  void OnPriceChange(int base);
  void Check(Entry& e);
  void Fire(Entry& e, double value);

  sim::Market& m_market;
  std::vector<Entry> m_entries;
  std::vector<AlertFiring> m_fired;
  bool m_changed = false;
  std::int32_t m_nextId = 1;
};

}  // namespace term
