#pragma once
// A crash-safety test of the terminal's store: --save-churn saves the user's
// data again and again, each set stamped with a generation g (watchlists, then
// alerts, then two settings, then the layout, each one transaction), and says
// "churn: committed g" once all of g is saved. --check-churn MIN reads a store
// after a kill: every set must be exactly the content of one generation (never
// lost, empty or half-written), none older than MIN (the last one said to be
// committed), and in saving order (watchlists >= alerts >= settings >= layout
// >= watchlists - 1). A run starts by saving the newest generation in the
// store again (a killed run may have saved only part of it).
#include <cstdint>
#include <string>
#include <vector>

#include "terminal/host/HostStore.h"
#include "terminal/store/Store.h"

struct JInstrumentUnderlying;

namespace term {

class SqliteHostStore;

namespace churn {

constexpr const char* kSettingKey = "churn";            // host.churn and user.churn
constexpr const char* kLayoutParam = "Churn_generation";  // a start parameter of every saved view
constexpr const char* kLayoutCount = "Churn_views";       // how many views that layout has

// The content of generation g. `instruments` picks the watchlist items and
// alert instruments (the market's first ones).
std::vector<StoredWatchlist> Watchlists(std::int64_t g, const std::vector<JInstrumentUnderlying>& instruments);
std::vector<PriceAlertItem> Alerts(std::int64_t g, const std::vector<JInstrumentUnderlying>& instruments);
std::string HostSetting(std::int64_t g);
std::string UserSetting(std::int64_t g);
// Stamps every view of `layout` (the window's own) with g and the view count.
void StampLayout(SavedLayout& layout, std::int64_t g);

// The generations found in a store; -1: that set holds no churn generation
// (nothing saved by a churn yet).
struct Found {
  std::int64_t watchlists = -1, alerts = -1, hostSetting = -1, userSetting = -1, layout = -1;
  std::vector<std::string> problems;  // each set that is not exactly one generation
  std::int64_t Newest() const;
};
Found Inspect(Store& store, const std::vector<JInstrumentUnderlying>& instruments);
// Problems of `found` against the last committed generation `min` (empty: sound).
std::vector<std::string> Verdict(const Found& found, std::int64_t min);

}  // namespace churn
}  // namespace term

namespace term {
struct Options;
// --check-churn: opens the store of --data-dir as the terminal does, checks it
// and prints the verdict. 0 when sound, 3 when not, 1 when it cannot be read.
int CheckChurn(const Options& options);
}  // namespace term
