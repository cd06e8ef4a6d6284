#include "terminal/host/UserData.h"

#include <QFile>
#include <QTextStream>
#include <algorithm>
#include <set>

#include "hostview/Text.h"
#include "terminal/host/Services.h"
#include "terminal/host/TextUtil.h"
#include "terminal/host/WatchlistXml.h"

namespace term {

// ---- Settings ----------------------------------------------------------------

HostSettings::HostSettings() {
  values_ = {
      {"MAXWL", "500"},
      {"MAXWT", "50"},
      {"WLNOT", "TSE,NYSE,NASDAQ,Instruments of this exchange cannot be added to a Brantic list."},
      {"OLDWL", "Brantic Lists"},
      {"ADVFT", "200"},
      {"MKTEX", "Top Gainers=TOPGAIN;Top Losers=TOPLOSE;Most Active=TOPVOL;Top Turnover=TOPVAL"},
      {"MAXPA", "30"},
      {"ALEML", "1"},
      {"ALSMS", "1"},
      {"EXCPA", "SGX,SEHK,ASX,TSE,NYSE,NASDAQ,SGXDT,HKFE"},
      {"MODSA", "0"},
      // Exchanges whose market data the user is not entitled to (604 answers 0).
      {"EXOFF", "LSE"},
      // 2310: 1 or 2 makes the views use the alternate access status.
      {"ALTST", "0"},
  };
}

bool HostSettings::LoadFile(const std::string& path, std::string* error) {
  QFile file(QString::fromStdString(path));
  if (!file.open(QIODevice::ReadOnly | QIODevice::Text)) {
    if (error) *error = "cannot open " + path + ": " + file.errorString().toStdString();
    return false;
  }
  QTextStream in(&file);
  int lineNo = 0;
  while (!in.atEnd()) {
    ++lineNo;
    std::string line = Trim(in.readLine().toStdString());
    if (line.empty() || line[0] == '#') continue;
    const std::size_t eq = line.find('=');
    if (eq == std::string::npos || eq == 0) {
      if (error) *error += path + ":" + std::to_string(lineNo) + ": not a KEY=VALUE line\n";
      continue;
    }
    // Only the first "=" separates: "MKTEX" values contain "=" themselves.
    values_[Trim(line.substr(0, eq))] = Trim(line.substr(eq + 1));
  }
  return true;
}

void HostSettings::Set(const std::string& key, const std::string& value) { values_[key] = value; }

std::string HostSettings::Get(const std::string& key) const {
  auto it = values_.find(key);
  return it == values_.end() ? std::string() : it->second;
}

bool HostSettings::Has(const std::string& key) const { return values_.count(key) != 0; }

int HostSettings::GetInt(const std::string& key, int fallback) const {
  const std::string v = Get(key);
  if (v.empty()) return fallback;
  try {
    std::size_t used = 0;
    const int n = std::stoi(v, &used);
    return used == v.size() ? n : fallback;
  } catch (...) {
    return fallback;
  }
}

// ---- Memory store ----------------------------------------------------------

bool MemoryHostStore::LoadWatchlists(std::vector<StoredWatchlist>& out) {
  out = watchlists;
  return watchlistsSaved;
}
void MemoryHostStore::SaveWatchlists(StoredWatchlist::Kind kind, const std::vector<StoredWatchlist>& lists) {
  std::vector<StoredWatchlist> kept;
  for (auto& w : watchlists) if (w.kind != kind) kept.push_back(w);
  for (auto w : lists) { w.kind = kind; kept.push_back(std::move(w)); }
  watchlists = std::move(kept);
  watchlistsSaved = true;
  ++saveCount;
}
bool MemoryHostStore::LoadAlerts(std::vector<PriceAlertItem>& out) {
  out = alerts;
  return alertsSaved;
}
void MemoryHostStore::SaveAlerts(const std::vector<PriceAlertItem>& a) {
  alerts = a;
  alertsSaved = true;
  ++saveCount;
  // The history goes with its alert.
  std::erase_if(firings, [&](const AlertFiring& f) {
    return std::none_of(a.begin(), a.end(), [&](const PriceAlertItem& x) { return x.alertId == f.alertId; });
  });
}
void MemoryHostStore::SaveAlertFiring(const AlertFiring& firing) {
  firings.push_back(firing);
  ++saveCount;
}
std::vector<AlertFiring> MemoryHostStore::LoadAlertFirings(std::int32_t alertId) {
  std::vector<AlertFiring> out;
  for (const AlertFiring& f : firings)
    if (f.alertId == alertId) out.push_back(f);
  return out;
}
std::map<std::string, std::string> MemoryHostStore::LoadSettings() { return settings; }
void MemoryHostStore::SaveSetting(const std::string& key, const std::string& value) {
  settings[key] = value;
  ++saveCount;
}

// ---- User data ----------------------------------------------------------------

UserData::UserData(IHostStore& store, LogFactory& log, HostStats& stats) : store_(store), log_(log), stats_(stats) {}

void UserData::LoadSettings(const std::string& configFile) {
  if (!configFile.empty()) {
    std::string error;
    if (!settings.LoadFile(configFile, &error)) log_.Warn("settings file: " + error);
    else if (!error.empty()) log_.Warn("settings file: " + error);
  }
  try {
    for (const auto& [k, v] : store_.LoadSettings()) settings.Set(k, v);
  } catch (const std::exception& e) {
    log_.Error(std::string("loading settings failed: ") + e.what());
  }
}

void UserData::SaveSetting(const std::string& key, const std::string& value) {
  settings.Set(key, value);
  try {
    store_.SaveSetting(key, value);
  } catch (const std::exception& e) {
    log_.Error(std::string("saving a setting failed: ") + e.what());
  }
}

void UserData::SaveViewSetting(const std::string& key, const std::string& value) {
  try {
    store_.SaveSetting("view." + key, value);
  } catch (const std::exception& e) {
    log_.Error(std::string("saving a view setting failed: ") + e.what());
  }
}

void UserData::SaveLists(StoredWatchlist::Kind kind) {
  try {
    store_.SaveWatchlists(kind, kind == StoredWatchlist::User ? userLists : brandLists);
  } catch (const std::exception& e) {
    log_.Error(std::string("saving watchlists failed: ") + e.what());
  }
}

void UserData::SaveAlerts() {
  try {
    store_.SaveAlerts(alerts->All());
  } catch (const std::exception& e) {
    log_.Error(std::string("saving alerts failed: ") + e.what());
  }
}

int UserData::MaxItems() const {
  const int n = settings.GetInt("MAXWL", 500);
  return n > 0 ? n : 500;
}

UserData::Edit UserData::Unreadable(const char* what, const std::string& why, const WatchlistFeedback& f) {
  ++stats_.malformedTexts;
  std::string excerpt = hv::Narrow(f.text).substr(0, 200);
  log_.Error(std::string(what) + " of watchlist " + std::to_string(f.WatchlistID) + " refused: " + why +
             "; text: " + excerpt + "; the stored lists are unchanged");
  return Edit::Unreadable;
}

void UserData::LoadListsAndAlerts(sim::Market& market) {
  std::vector<StoredWatchlist> stored;
  bool had = false;
  try {
    had = store_.LoadWatchlists(stored);
  } catch (const std::exception& e) {
    log_.Error(std::string("loading watchlists failed: ") + e.what());
  }
  for (auto& w : stored) {
    (w.kind == StoredWatchlist::Brand ? brandLists : userLists).push_back(w);
    nextWatchlistId_ = std::max(nextWatchlistId_, w.id + 1);
  }
  if (!had) {
    // First start: a few lists so that the price view is not empty.
    for (const sim::StarterWatchlist& s : market.StarterWatchlists()) {
      StoredWatchlist w;
      w.id = nextWatchlistId_++;
      w.kind = StoredWatchlist::User;
      w.name = s.name;
      for (int i : s.instruments) w.items.push_back({market.Instruments()[i].productId, market.Instruments()[i].instrumentCode});
      userLists.push_back(std::move(w));
    }
    SaveLists(StoredWatchlist::User);
  }
  if (brandLists.empty()) {
    for (const sim::BrandWatchlist& b : market.BrandWatchlists()) {
      StoredWatchlist w;
      w.id = b.id;
      w.kind = StoredWatchlist::Brand;
      w.name = b.name;
      for (int i : b.instruments) w.items.push_back({market.Instruments()[i].productId, market.Instruments()[i].instrumentCode});
      brandLists.push_back(std::move(w));
    }
    SaveLists(StoredWatchlist::Brand);
  }
  std::vector<PriceAlertItem> stored2;
  try {
    store_.LoadAlerts(stored2);
  } catch (const std::exception& e) {
    log_.Error(std::string("loading alerts failed: ") + e.what());
  }
  alerts = std::make_unique<AlertDesk>(market);
  alerts->Load(std::move(stored2));
}

std::vector<JWatchlistRow> UserData::UserRows() const {
  std::vector<JWatchlistRow> rows;
  for (std::size_t n = 0; n < userLists.size(); ++n) {
    const StoredWatchlist& w = userLists[n];
    if (w.items.empty()) {
      rows.push_back({w.id, 0, w.name, "", 0, std::int32_t(n)});
      continue;
    }
    std::int32_t seq = 1;
    for (const StoredWatchItem& it : w.items) {
      rows.push_back({w.id, std::int32_t(it.productId), w.name, it.instrumentCode, seq++, std::int32_t(n)});
    }
  }
  return rows;
}

std::vector<JKeldoWatchlistRow> UserData::BrandRows(const MarketSource& market) const {
  std::vector<JKeldoWatchlistRow> rows;
  for (const StoredWatchlist& w : brandLists) {
    if (w.items.empty()) {
      rows.push_back({w.id, w.name, 0, "", "", 0});
      continue;
    }
    std::int32_t seq = 1;
    for (const StoredWatchItem& it : w.items) {
      const int idx = market.Find(it.productId, it.instrumentCode);
      rows.push_back({w.id, w.name, it.productId, it.instrumentCode,
                      idx >= 0 ? market.Instruments()[std::size_t(idx)].exchangeCode : std::string(), seq++});
    }
  }
  return rows;
}

UserData::Edit UserData::SaveNames(const WatchlistFeedback& f) {
  std::vector<NameEntry> entries;
  std::string error;
  if (!ParseWatchlistNames(f.text, entries, error)) return Unreadable("names", error, f);
  const int maxLists = std::max(1, settings.GetInt("MAXWT", 50));
  std::vector<StoredWatchlist> next;
  std::set<std::int32_t> usedIds;
  std::set<std::string> usedNames;
  for (const NameEntry& e : entries) {
    if (e.name.empty() || usedNames.count(e.name)) {
      log_.Warn("watchlist names: skipped an empty or repeated name \"" + e.name + "\"");
      continue;
    }
    if (int(next.size()) >= maxLists) {
      log_.Warn("watchlist names: more than " + std::to_string(maxLists) + " watchlists; \"" + e.name + "\" not kept");
      continue;
    }
    StoredWatchlist w;
    const StoredWatchlist* old = nullptr;
    if (e.id != 0)
      for (const auto& o : userLists) if (o.id == e.id) old = &o;
    if (!old && e.id == 0)
      for (const auto& o : userLists) if (o.name == e.name && !usedIds.count(o.id)) old = &o;
    if (old) {
      w = *old;
    } else {
      w.id = e.id != 0 && !usedIds.count(e.id) ? e.id : nextWatchlistId_++;
      w.kind = StoredWatchlist::User;
    }
    nextWatchlistId_ = std::max(nextWatchlistId_, w.id + 1);
    w.name = e.name;
    usedIds.insert(w.id);
    usedNames.insert(w.name);
    next.push_back(std::move(w));
  }
  userLists = std::move(next);
  SaveLists(StoredWatchlist::User);
  return Edit::Saved;
}

UserData::Edit UserData::SaveUserItems(const WatchlistFeedback& f, const MarketSource& market) {
  std::vector<ItemEntry> items;
  std::string error;
  if (!ParseUserItems(f.text, items, error)) return Unreadable("items", error, f);
  StoredWatchlist* w = nullptr;
  for (auto& o : userLists) if (o.id == f.WatchlistID) w = &o;
  if (!w) {
    ++stats_.malformedTexts;
    log_.Error("items for unknown watchlist id " + std::to_string(f.WatchlistID) + " refused; the stored lists are unchanged");
    return Edit::Refused;
  }
  std::vector<StoredWatchItem> next;
  for (const ItemEntry& e : items) {
    if (e.productId == 0 || e.instrumentCode.empty()) continue;
    if (int(next.size()) >= MaxItems()) {
      log_.Warn("watchlist \"" + w->name + "\": more than " + std::to_string(MaxItems()) + " items, the rest not kept");
      break;
    }
    if (market.Find(e.productId, e.instrumentCode) < 0)
      log_.Warn("watchlist \"" + w->name + "\": unknown instrument " + std::to_string(e.productId) + "/" + e.instrumentCode + " kept");
    bool dup = false;
    for (const auto& n : next) dup = dup || (n.productId == e.productId && n.instrumentCode == e.instrumentCode);
    if (!dup) next.push_back({e.productId, e.instrumentCode});
  }
  w->items = std::move(next);
  SaveLists(StoredWatchlist::User);
  return Edit::Saved;
}

UserData::Edit UserData::RenameBrand(const WatchlistFeedback& f) {
  const std::string name = Trim(hv::Narrow(f.text));
  StoredWatchlist* w = nullptr;
  for (auto& o : brandLists) if (o.id == f.WatchlistID) w = &o;
  if (!w || name.empty()) {
    ++stats_.malformedTexts;
    log_.Error("rename of brand watchlist " + std::to_string(f.WatchlistID) + " refused: " +
               (w ? "empty name" : "unknown id") + "; the stored lists are unchanged");
    return Edit::Refused;
  }
  for (const auto& o : brandLists)
    if (&o != w && o.name == name) {
      log_.Error("rename of brand watchlist " + std::to_string(f.WatchlistID) + " refused: \"" + name + "\" exists");
      return Edit::Refused;
    }
  w->name = name;
  SaveLists(StoredWatchlist::Brand);
  return Edit::Saved;
}

UserData::Edit UserData::SaveBrandItems(const WatchlistFeedback& f, const MarketSource& market) {
  std::vector<ItemEntry> items;
  std::string error;
  if (!ParseBrandItems(f.text, items, error)) return Unreadable("brand items", error, f);
  StoredWatchlist* w = nullptr;
  for (auto& o : brandLists) if (o.id == f.WatchlistID) w = &o;
  if (!w) {
    ++stats_.malformedTexts;
    log_.Error("items for unknown brand watchlist id " + std::to_string(f.WatchlistID) + " refused");
    return Edit::Refused;
  }
  std::vector<StoredWatchItem> next;
  for (const ItemEntry& e : items) {
    if (int(next.size()) >= MaxItems()) break;
    // The text carries brand codes without their "[KELDO]" prefix, other
    // instruments by their display code.
    int idx = market.Find(e.productId, "[KELDO]" + e.instrumentCode);
    if (idx < 0) idx = market.Find(e.productId, e.instrumentCode);
    if (idx < 0) {
      for (std::size_t k = 0; k < market.Instruments().size(); ++k) {
        const auto& ins = market.Instruments()[k];
        if (ins.productId == e.productId && ins.displayCode == e.instrumentCode && ins.exchangeCode == e.exchange) {
          idx = int(k);
          break;
        }
      }
    }
    if (idx < 0) {
      log_.Warn("brand watchlist \"" + w->name + "\": unknown instrument " + e.instrumentCode + " on " + e.exchange + " dropped");
      continue;
    }
    const auto& ins = market.Instruments()[std::size_t(idx)];
    bool dup = false;
    for (const auto& n : next) dup = dup || (n.productId == ins.productId && n.instrumentCode == ins.instrumentCode);
    if (!dup) next.push_back({ins.productId, ins.instrumentCode});
  }
  w->items = std::move(next);
  SaveLists(StoredWatchlist::Brand);
  return Edit::Saved;
}

void UserData::AddUserLists(std::vector<StoredWatchlist> lists) {
  for (StoredWatchlist& w : lists) {
    w.id = nextWatchlistId_++;
    w.kind = StoredWatchlist::User;
    userLists.push_back(std::move(w));
  }
  SaveLists(StoredWatchlist::User);
}

}  // namespace term
