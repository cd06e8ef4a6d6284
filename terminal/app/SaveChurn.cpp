#include "terminal/app/SaveChurn.h"

#include <algorithm>

#include "hostview/Records.h"
#include "terminal/store/SqliteHostStore.h"
#include "terminal/store/SqliteSettingsStorage.h"

namespace term::churn {

namespace {

const JInstrumentUnderlying& Pick(const std::vector<JInstrumentUnderlying>& instruments, std::int64_t n) {
  const auto size = static_cast<std::int64_t>(std::min<std::size_t>(instruments.size(), 200));
  return instruments[static_cast<std::size_t>(n % size)];
}

// The generation in a text written as "<prefix><g>..."; -1 when it is not one.
std::int64_t GenerationIn(const std::string& text, const std::string& prefix) {
  if (text.compare(0, prefix.size(), prefix) != 0) return -1;
  std::int64_t g = 0;
  std::size_t i = prefix.size();
  if (i >= text.size() || text[i] < '0' || text[i] > '9') return -1;
  for (; i < text.size() && text[i] >= '0' && text[i] <= '9'; ++i) g = g * 10 + (text[i] - '0');
  return g;
}

bool SameLists(const std::vector<StoredWatchlist>& a, const std::vector<StoredWatchlist>& b) {
  if (a.size() != b.size()) return false;
  for (std::size_t i = 0; i < a.size(); ++i) {
    if (a[i].id != b[i].id || a[i].name != b[i].name || a[i].items.size() != b[i].items.size()) return false;
    for (std::size_t j = 0; j < a[i].items.size(); ++j)
      if (a[i].items[j].productId != b[i].items[j].productId ||
          a[i].items[j].instrumentCode != b[i].items[j].instrumentCode)
        return false;
  }
  return true;
}

bool SameAlerts(const std::vector<PriceAlertItem>& a, const std::vector<PriceAlertItem>& b) {
  if (a.size() != b.size()) return false;
  for (std::size_t i = 0; i < a.size(); ++i)
    if (EncodeAlert(a[i]) != EncodeAlert(b[i])) return false;
  return true;
}

}  // namespace

std::vector<StoredWatchlist> Watchlists(std::int64_t g, const std::vector<JInstrumentUnderlying>& instruments) {
  std::vector<StoredWatchlist> out;
  const int lists = 1 + static_cast<int>(g % 5);
  for (int i = 0; i < lists; ++i) {
    StoredWatchlist w;
    w.id = 5001 + i;
    w.kind = StoredWatchlist::User;
    w.name = "Churn " + std::to_string(g) + "." + std::to_string(i);
    const int items = 1 + static_cast<int>((g + i) % 9);
    for (int j = 0; j < items; ++j) {
      const auto& ins = Pick(instruments, g * 7 + i * 13 + j);
      w.items.push_back({ins.productId, ins.instrumentCode});
    }
    out.push_back(std::move(w));
  }
  return out;
}

std::vector<PriceAlertItem> Alerts(std::int64_t g, const std::vector<JInstrumentUnderlying>& instruments) {
  std::vector<PriceAlertItem> out;
  const int count = 1 + static_cast<int>(g % 4);
  for (int i = 0; i < count; ++i) {
    const auto& ins = Pick(instruments, g * 3 + i);
    PriceAlertItem a;
    a.alertId = 7001 + i;
    a.productId = ins.productId;
    a.exchangeCode = ins.exchangeCode;
    a.instrumentCode = ins.instrumentCode;
    a.triggerOnce = true;
    a.priceField = "LDONE";
    a.comparator = ">=";
    a.triggerValue = 1e12 + static_cast<double>(g);  // never met: only the churn changes these alerts
    a.status = "Active";
    a.hostTextB = "churn " + std::to_string(g) + "." + std::to_string(i);
    out.push_back(std::move(a));
  }
  return out;
}

std::string HostSetting(std::int64_t g) { return "g" + std::to_string(g) + ":" + std::string(64 + g % 200, 'h'); }
std::string UserSetting(std::int64_t g) {
  return "{\"g\":" + std::to_string(g) + ",\"pad\":\"" + std::string(512 + g % 1000, 'u') + "\"}";
}

void StampLayout(SavedLayout& layout, std::int64_t g) {
  for (SavedView& v : layout.views) {
    v.params[kLayoutParam] = std::to_string(g);
    v.params[kLayoutCount] = std::to_string(layout.views.size());
  }
}

std::int64_t Found::Newest() const {
  return std::max({watchlists, alerts, hostSetting, userSetting, layout});
}

Found Inspect(Store& store, const std::vector<JInstrumentUnderlying>& instruments) {
  Found f;
  SqliteHostStore host(store);
  // Watchlists: the user lists as the terminal loads them.
  std::vector<StoredWatchlist> lists;
  host.LoadWatchlists(lists);
  std::vector<StoredWatchlist> user;
  for (auto& w : lists)
    if (w.kind == StoredWatchlist::User) user.push_back(w);
  if (!user.empty()) {
    const std::string name = user.front().name;
    const std::int64_t g = GenerationIn(name, "Churn ");
    if (g >= 0) {
      if (SameLists(user, Watchlists(g, instruments))) f.watchlists = g;
      else f.problems.push_back("the watchlists are not whole generation " + std::to_string(g) + " (" +
                                std::to_string(user.size()) + " lists, the first \"" + name + "\")");
    }
  } else if (store.HasSavedWatchlists(StoredWatchlist::User)) {
    f.problems.push_back("the user watchlists were saved but are empty");
  }
  // Alerts.
  std::vector<PriceAlertItem> alerts;
  const bool alertsSaved = host.LoadAlerts(alerts);
  if (!alerts.empty()) {
    const std::int64_t g = GenerationIn(alerts.front().hostTextB, "churn ");
    if (g >= 0 && SameAlerts(alerts, Alerts(g, instruments))) f.alerts = g;
    else f.problems.push_back("the alerts are not one whole generation (" + std::to_string(alerts.size()) +
                              " alerts, the first \"" + alerts.front().hostTextB + "\")");
  } else if (alertsSaved) {
    f.problems.push_back("the alerts were saved but are empty");
  }
  // Settings.
  const auto hostSettings = host.LoadSettings();
  if (auto it = hostSettings.find(kSettingKey); it != hostSettings.end()) {
    const std::int64_t g = GenerationIn(it->second, "g");
    if (g >= 0 && it->second == HostSetting(g)) f.hostSetting = g;
    else f.problems.push_back("the setting host." + std::string(kSettingKey) + " is half-written: " +
                              it->second.substr(0, 40));
  }
  SqliteSettingsStorage userStorage(store);
  if (auto text = userStorage.Read(kSettingKey)) {
    const std::int64_t g = GenerationIn(*text, "{\"g\":");
    if (g >= 0 && *text == UserSetting(g)) f.userSetting = g;
    else f.problems.push_back("the setting user." + std::string(kSettingKey) + " is half-written: " + text->substr(0, 40));
  }
  // Layout.
  const SavedLayout layout = store.LoadLayout();
  std::int64_t lg = -2;
  for (const SavedView& v : layout.views) {
    auto it = v.params.find(kLayoutParam);
    auto count = v.params.find(kLayoutCount);
    const std::int64_t g = it == v.params.end() ? -1 : GenerationIn(it->second, "");
    if (count == v.params.end() || count->second != std::to_string(layout.views.size()) || g < 0 ||
        (lg != -2 && g != lg)) {
      lg = -3;
      break;
    }
    lg = g;
  }
  if (lg == -3) f.problems.push_back("the layout is not one whole generation (" + std::to_string(layout.views.size()) + " views)");
  else if (lg >= 0 && (layout.windowState.empty() || layout.windowGeometry.empty()))
    f.problems.push_back("the layout of generation " + std::to_string(lg) + " lost its window state");
  else if (lg >= 0) f.layout = lg;
  return f;
}

std::vector<std::string> Verdict(const Found& f, std::int64_t min) {
  std::vector<std::string> out = f.problems;
  const std::pair<const char*, std::int64_t> sets[] = {{"watchlists", f.watchlists}, {"alerts", f.alerts},
                                                       {"host setting", f.hostSetting}, {"user setting", f.userSetting},
                                                       {"layout", f.layout}};
  if (min > 0)
    for (const auto& [name, g] : sets)
      if (g < min)
        out.push_back(std::string("the ") + name + " went back to generation " + std::to_string(g) +
                      " after generation " + std::to_string(min) + " was committed");
  // Saved in this order, so a later set is never newer than an earlier one
  // and never more than one generation behind the first.
  for (std::size_t k = 1; k < std::size(sets); ++k)
    if (sets[k].second > sets[k - 1].second)
      out.push_back(std::string("the ") + sets[k].first + " (generation " + std::to_string(sets[k].second) +
                    ") are newer than the " + sets[k - 1].first + " (" + std::to_string(sets[k - 1].second) + ")");
  if (f.layout >= 0 && f.watchlists - f.layout > 1)
    out.push_back("the layout is " + std::to_string(f.watchlists - f.layout) + " generations behind the watchlists");
  return out;
}

}  // namespace term::churn

#include <cstdio>

#include "terminal/app/Options.h"
#include "terminal/sim/Market.h"

namespace term {

int CheckChurn(const Options& o) {
  const std::filesystem::path dir = o.dataDir.empty() ? Store::DefaultDataDir() : std::filesystem::path(o.dataDir);
  StoreOpenReport report;
  std::string error;
  auto store = Store::Open(dir, report, error);
  if (!store) {
    std::fprintf(stderr, "terminal: %s\n", error.c_str());
    return 1;
  }
  sim::MarketConfig config;
  if (o.seed) config.seed = *o.seed;
  if (o.instruments) config.instruments = *o.instruments;
  const sim::Market market(config);
  const std::int64_t min = *o.checkChurn;
  std::vector<std::string> problems;
  if (report.outcome == StoreOpenReport::Outcome::ReplacedCorrupt ||
      report.outcome == StoreOpenReport::Outcome::ReplacedNewer)
    problems.push_back(report.message);
  else if (report.outcome == StoreOpenReport::Outcome::Created && min > 0)
    problems.push_back("the database is gone: a new one was created");
  const churn::Found found = churn::Inspect(*store, market.Instruments());
  for (auto& p : churn::Verdict(found, min)) problems.push_back(std::move(p));
  std::printf("check-churn: watchlists %lld, alerts %lld, settings %lld/%lld, layout %lld (at least %lld): %s\n",
              static_cast<long long>(found.watchlists), static_cast<long long>(found.alerts),
              static_cast<long long>(found.hostSetting), static_cast<long long>(found.userSetting),
              static_cast<long long>(found.layout), static_cast<long long>(min), problems.empty() ? "ok" : "FAILED");
  for (const auto& p : problems) std::printf("check-churn: %s\n", p.c_str());
  return problems.empty() ? 0 : 3;
}

}  // namespace term
