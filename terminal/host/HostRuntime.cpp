#include "terminal/host/HostRuntime.h"

#include <QDir>
#include <QFile>
#include <QObject>
#include <QPointer>
#include <QStandardPaths>
#include <QTextStream>
#include <algorithm>
#include <map>
#include <set>
#include <unordered_map>
#include <unordered_set>

#include "hostview/MessageIds.h"
#include "hostview/Text.h"
#include "platform/Platform.h"
#include "terminal/host/Services.h"
#include "terminal/host/TradePages.h"
#include "terminal/host/WatchlistXml.h"
#include "terminal/sim/Market.h"

namespace term {
namespace {

const char* const kPriceView = "CPriceViewAdv";
const char* const kNewAlertView = "CNewPriceAlertAdv";
bool IsSingleInstrumentView(const std::string& cls) {
  return cls == "CMarketDepthAdv" || cls == "CTimeAndSalesAdv" || cls == "CTradeSummaryAdv";
}

std::string JsonEscape(const std::string& s) {
  std::string out;
  for (char c : s) {
    switch (c) {
      case '"': out += "\\\""; break;
      case '\\': out += "\\\\"; break;
      case '\n': out += "\\n"; break;
      case '\r': out += "\\r"; break;
      case '\t': out += "\\t"; break;
      default:
        if (static_cast<unsigned char>(c) < 0x20) {
          char buf[8];
          std::snprintf(buf, sizeof buf, "\\u%04x", c);
          out += buf;
        } else {
          out.push_back(c);
        }
    }
  }
  return out;
}

std::string Trim(std::string s) {
  while (!s.empty() && (s.back() == ' ' || s.back() == '\t' || s.back() == '\r')) s.pop_back();
  std::size_t k = 0;
  while (k < s.size() && (s[k] == ' ' || s[k] == '\t')) ++k;
  return s.substr(k);
}

}  // namespace

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
}
std::map<std::string, std::string> MemoryHostStore::LoadSettings() { return settings; }
void MemoryHostStore::SaveSetting(const std::string& key, const std::string& value) {
  settings[key] = value;
  ++saveCount;
}

// ---- Runtime internals -------------------------------------------------------

struct HostRuntime::Impl {
  HostRuntime* self = nullptr;
  HostOptions options;
  IHostShell* shell = nullptr;
  IHostShell noShell;
  MemoryHostStore memoryStore;
  IHostStore* store = nullptr;
  HostSettings settings;
  std::unique_ptr<sim::Market> market;
  sim::AlertBook alerts;
  std::unique_ptr<LanguageTable> language;
  std::unique_ptr<StyleManager> styles;
  std::unique_ptr<::term::LogFactory> log;
  MenuManager menus;
  MessageTexts messages;
  HostStats stats;

  struct ViewRec {
    CSuperBaseView* view = nullptr;
    std::string className;
    bool active = false;
    bool activatedOnce = false;
    // The view opened by this view's last 200, waiting for its 310 (or 705).
    QPointer<CSuperBaseView> linkTarget;
    std::wstring linkClass;
    bool linkPending = false;
    std::vector<FieldRequest> pending412, pending401;
    QMetaObject::Connection destroyed;
  };
  std::vector<ViewRec> views;

  struct Sub {
    CSuperBaseView* view = nullptr;
    int instrument = -1;
    std::int64_t productId = 0;
    std::string code, field;
    std::int32_t param = 0, kind = 0;
    std::vector<std::string> last;  // last value sent; one per level for depth
    std::uint32_t dependsOn = 0;    // market change bits that can move this value
    bool alive = true;
  };
  std::vector<Sub> subs;
  std::vector<std::size_t> freeSubs;
  // Which market changes can move a field, so that a quote move does not
  // re-format the day figures of every subscription.
  static std::uint32_t DependsOn(const std::string& f, std::int32_t kind) {
    using M = sim::Market;
    if (kind == 1) return M::kBookChanged;
    if (kind != 0) return M::kTradeChanged | M::kBookChanged;
    if (f == "BID" || f == "ASK" || f == "BVOL" || f == "SVOL" || f == "BUY" || f == "SELL" || f == "ORDS_BVOL" ||
        f == "ORDS_SVOL")
      return M::kBookChanged;
    if (f == "CLOSE" || f == "REMARKS" || f == "CFD_STATUS" || f == "DMA_STATUS" || f == "MONTH" || f == "YEAR" ||
        f == "INSTRNAME")
      return 0;  // fixed for the session
    return M::kTradeChanged;
  }
  using SubKey = std::tuple<CSuperBaseView*, int, std::string, std::int32_t, std::int32_t>;
  std::map<SubKey, std::size_t> subIndex;
  std::unordered_map<int, std::vector<std::size_t>> subsByInstrument;

  struct Fetch {
    CSuperBaseView* view;
    FieldRequest request;
  };
  std::vector<Fetch> fetches;
  std::set<std::pair<std::int64_t, std::string>> unknownLogged;

  std::vector<StoredWatchlist> userLists, brandLists;
  std::int32_t nextWatchlistId = 1001;
  bool relaying300 = false;
  std::uint32_t lastAlertCheck = 0;
  bool pumped = false;

  // ---- views ----
  ViewRec* Find(const CSuperBaseView* v) {
    for (auto& r : views) if (r.view == v) return &r;
    return nullptr;
  }
  bool Live(const CSuperBaseView* v) const {
    for (const auto& r : views) if (r.view == v) return true;
    return false;
  }
  std::uint32_t Deliver(CSuperBaseView* v, UINT msg, LPARAM data) {
    if (!v || !Live(v)) return 0;
    return v->OnHostMessage(msg, data);
  }
  std::vector<CSuperBaseView*> ViewsOf(const char* cls) const {
    std::vector<CSuperBaseView*> out;
    for (const auto& r : views) if (!cls || r.className == cls) out.push_back(r.view);
    return out;
  }
  void Broadcast(const std::vector<CSuperBaseView*>& targets, UINT msg, LPARAM data, CSuperBaseView* except = nullptr) {
    for (CSuperBaseView* v : targets) if (v != except) Deliver(v, msg, data);
  }
  void DropView(CSuperBaseView* v);

  // ---- subscriptions ----
  void Subscribe(CSuperBaseView* v, const FieldRequest& r, int idx, std::vector<std::pair<CSuperBaseView*, FieldUpdate>>& answers,
                 std::set<std::tuple<int, std::string, std::int32_t, std::int32_t>>& answered);
  void Unsubscribe(CSuperBaseView* v, const FieldRequest& r);
  void RemoveSub(std::size_t k);
  void SubmitPending412(ViewRec& rec);
  void HandleField(CSuperBaseView* v, UINT msg, const FieldRequest* r);
  void CollectPushes(std::vector<std::pair<CSuperBaseView*, FieldUpdate>>& out);
  void DeliverUpdates(std::vector<std::pair<CSuperBaseView*, FieldUpdate>>& list, UINT msg);
  int InstrumentOf(const FieldRequest& r) const { return market->Find(r.productId, r.instrumentCode); }

  // ---- watchlists ----
  void LoadUserData();
  void SaveLists(StoredWatchlist::Kind kind) {
    try {
      store->SaveWatchlists(kind, kind == StoredWatchlist::User ? userLists : brandLists);
    } catch (const std::exception& e) {
      log->Error(std::string("saving watchlists failed: ") + e.what());
    }
  }
  void SaveAlerts() {
    try {
      store->SaveAlerts(alerts.All());
    } catch (const std::exception& e) {
      log->Error(std::string("saving alerts failed: ") + e.what());
    }
  }
  std::vector<JWatchlistRow> UserRows() const;
  std::vector<JKeldoWatchlistRow> BrandRows() const;
  void OnSaveNames(CSuperBaseView* v, const WatchlistFeedback& f);
  void OnSaveUserItems(CSuperBaseView* v, const WatchlistFeedback& f);
  void OnRenameBrand(CSuperBaseView* v, const WatchlistFeedback& f);
  void OnSaveBrandItems(CSuperBaseView* v, const WatchlistFeedback& f);
  void Refused(const char* what, const std::string& why, const WatchlistFeedback& f) {
    ++stats.malformedTexts;
    std::string excerpt = hv::Narrow(f.text).substr(0, 200);
    log->Error(std::string(what) + " of watchlist " + std::to_string(f.WatchlistID) + " refused: " + why +
               "; text: " + excerpt + "; the stored lists are unchanged");
    shell->ShowNotice(options.appTitle, L"A watchlist change could not be saved: the terminal received an unreadable text.");
  }
  void Notify300(int family, CSuperBaseView* except) {
    if (relaying300) return;
    relaying300 = true;
    Broadcast(ViewsOf(kPriceView), hm::WatchlistsLoaded, family, except);
    relaying300 = false;
  }
  int MaxItems() const {
    const int n = settings.GetInt("MAXWL", 500);
    return n > 0 ? n : 500;
  }

  // ---- alerts ----
  void AlertsChanged(UINT msg, CSuperBaseView* except = nullptr) {
    SaveAlerts();
    Broadcast(ViewsOf(nullptr), msg, 0, except);
  }
  void CheckAlerts();

  std::string StartLinkText(const CSuperBaseView* v) const;
};

void HostRuntime::Impl::DropView(CSuperBaseView* v) {
  for (std::size_t k = 0; k < subs.size(); ++k)
    if (subs[k].alive && subs[k].view == v) RemoveSub(k);
  fetches.erase(std::remove_if(fetches.begin(), fetches.end(), [&](const Fetch& f) { return f.view == v; }), fetches.end());
  for (auto it = views.begin(); it != views.end(); ++it) {
    if (it->view != v) continue;
    QObject::disconnect(it->destroyed);
    views.erase(it);
    break;
  }
  for (auto& r : views)
    if (r.linkTarget == v) r.linkTarget = nullptr;
  stats.subscriptions = subIndex.size();
}

void HostRuntime::Impl::RemoveSub(std::size_t k) {
  Sub& s = subs[k];
  if (!s.alive) return;
  subIndex.erase(SubKey{s.view, s.instrument, s.field, s.param, s.kind});
  auto& list = subsByInstrument[s.instrument];
  list.erase(std::remove(list.begin(), list.end(), k), list.end());
  if (list.empty()) subsByInstrument.erase(s.instrument);
  market->RemoveInterest(s.instrument);
  s = Sub{};
  s.alive = false;
  freeSubs.push_back(k);
}

void HostRuntime::Impl::Subscribe(CSuperBaseView* v, const FieldRequest& r, int idx,
                                  std::vector<std::pair<CSuperBaseView*, FieldUpdate>>& answers,
                                  std::set<std::tuple<int, std::string, std::int32_t, std::int32_t>>& answered) {
  const SubKey key{v, idx, r.fieldName, r.param, r.kind};
  std::size_t k;
  auto it = subIndex.find(key);
  if (it == subIndex.end()) {
    if (!freeSubs.empty()) { k = freeSubs.back(); freeSubs.pop_back(); }
    else { k = subs.size(); subs.emplace_back(); }
    Sub& s = subs[k];
    s = Sub{};
    s.view = v; s.instrument = idx; s.productId = r.productId; s.code = r.instrumentCode;
    s.field = r.fieldName; s.param = r.param; s.kind = r.kind;
    s.dependsOn = DependsOn(r.fieldName, r.kind);
    subIndex.emplace(key, k);
    subsByInstrument[idx].push_back(k);
    market->AddInterest(idx);
  } else {
    k = it->second;
  }
  // Answer with the current value, once per field of the batch.
  if (!answered.insert({idx, r.fieldName, r.param, r.kind}).second) return;
  Sub& s = subs[k];
  if (s.kind == 1) {
    // Depth: one answer per level up to the requested count.
    const int levels = std::clamp(s.param, 1, int(sim::Market::kDepthLevels));
    const std::vector<sim::DepthLevel> book = market->Book(idx, levels);
    s.last.assign(std::size_t(levels), std::string());
    for (int level = 1; level <= levels; ++level) {
      FieldUpdate u{r.productId, r.instrumentCode, r.fieldName, market->FieldValue(idx, r.fieldName, level, 1), level, 1};
      s.last[std::size_t(level - 1)] = u.value;
      answers.emplace_back(v, std::move(u));
    }
    return;
  }
  FieldUpdate u{r.productId, r.instrumentCode, r.fieldName, market->FieldValue(idx, r.fieldName, r.param, r.kind), r.param, r.kind};
  s.last.assign(1, u.value);
  answers.emplace_back(v, std::move(u));
}

void HostRuntime::Impl::Unsubscribe(CSuperBaseView* v, const FieldRequest& r) {
  const int idx = InstrumentOf(r);
  if (idx < 0) return;
  auto it = subsByInstrument.find(idx);
  if (it == subsByInstrument.end()) return;
  const std::vector<std::size_t> list = it->second;
  for (std::size_t k : list) {
    const Sub& s = subs[k];
    if (!s.alive || s.view != v) continue;
    bool match;
    if (r.fieldName == "TIMESALES_DATA") match = s.kind == 2 && s.param == r.param;  // a finished page fetch
    else if (r.kind == 0 || r.kind == 1) match = s.field == r.fieldName && (s.kind == 0 || s.kind == 1);
    else match = s.field == r.fieldName && s.kind == r.kind && s.param == r.param;
    if (match) RemoveSub(k);
  }
}

void HostRuntime::Impl::SubmitPending412(ViewRec& rec) {
  CSuperBaseView* v = rec.view;
  std::vector<FieldRequest> batch;
  batch.swap(rec.pending412);
  std::vector<std::pair<CSuperBaseView*, FieldUpdate>> answers;
  std::set<std::tuple<int, std::string, std::int32_t, std::int32_t>> answered;
  for (const FieldRequest& r : batch) {
    const int idx = InstrumentOf(r);
    if (idx < 0) {
      // Once per instrument: a stale watchlist item would otherwise log on every batch.
      if (unknownLogged.insert({r.productId, r.instrumentCode}).second)
        log->Warn("field request for an unknown instrument " + std::to_string(r.productId) + "/" + r.instrumentCode);
      continue;
    }
    Subscribe(v, r, idx, answers, answered);
  }
  stats.subscriptions = subIndex.size();
  DeliverUpdates(answers, hm::RequestField);
}

void HostRuntime::Impl::DeliverUpdates(std::vector<std::pair<CSuperBaseView*, FieldUpdate>>& list, UINT msg) {
  for (auto& [v, u] : list) {
    if (!Live(v)) continue;
    if (msg == hm::FieldValue) ++stats.pushes; else ++stats.answers;
    v->OnHostMessage(msg, ToLParam(&u));
  }
}

void HostRuntime::Impl::HandleField(CSuperBaseView* v, UINT msg, const FieldRequest* r) {
  ViewRec* rec = Find(v);
  if (!rec || !r) return;
  const bool submit = r->fieldName == "PMP_Submit";
  if (msg == hm::WithdrawField) {
    if (!submit) { rec->pending401.push_back(*r); return; }
    std::vector<FieldRequest> batch;
    batch.swap(rec->pending401);
    for (const FieldRequest& w : batch) Unsubscribe(v, w);
    stats.subscriptions = subIndex.size();
    return;
  }
  if (msg == hm::RequestField) {
    if (!submit) { rec->pending412.push_back(*r); return; }
    SubmitPending412(*rec);
    return;
  }
  // 400: fetch the listed fields; answered on the next pump, as a terminal that
  // asks its server would. Empty values are not answered (the views re-ask on
  // empty answers, which would otherwise loop).
  std::string names = r->fieldName;
  std::size_t start = 0;
  while (start <= names.size()) {
    const std::size_t comma = names.find(',', start);
    const std::string name = Trim(names.substr(start, comma == std::string::npos ? std::string::npos : comma - start));
    if (!name.empty() && name != "PMP_Submit") {
      FieldRequest one = *r;
      one.fieldName = name;
      fetches.push_back({v, std::move(one)});
    }
    if (comma == std::string::npos) break;
    start = comma + 1;
  }
}

void HostRuntime::Impl::CollectPushes(std::vector<std::pair<CSuperBaseView*, FieldUpdate>>& out) {
  const auto changed = market->TakeChangedWithBits();
  for (const auto& [idx, bits] : changed) {
    auto it = subsByInstrument.find(idx);
    if (it == subsByInstrument.end()) continue;
    std::vector<sim::DepthLevel> book;  // computed once per instrument and tick
    int bookLevels = 0;
    for (std::size_t k : it->second) {
      Sub& s = subs[k];
      if (!s.alive || !(s.dependsOn & bits)) continue;
      if (s.kind == 1) {
        const int levels = std::clamp(s.param, 1, int(sim::Market::kDepthLevels));
        if (levels > bookLevels) { book = market->Book(idx, levels); bookLevels = levels; }
        s.last.resize(std::size_t(levels));
        for (int level = 1; level <= levels; ++level) {
          const sim::DepthLevel& L = book[std::size_t(level - 1)];
          std::string value;
          if (s.field == "BUY") value = L.bid > 0 ? market->FormatPrice(idx, L.bid) : std::string();
          else if (s.field == "SELL") value = L.ask > 0 ? market->FormatPrice(idx, L.ask) : std::string();
          else if (s.field == "BVOL") value = L.bid > 0 ? std::to_string(L.bidVolume) : std::string();
          else if (s.field == "SVOL") value = L.ask > 0 ? std::to_string(L.askVolume) : std::string();
          else if (s.field == "ORDS_BVOL") value = L.bid > 0 ? std::to_string(L.bidOrders) : std::string();
          else if (s.field == "ORDS_SVOL") value = L.ask > 0 ? std::to_string(L.askOrders) : std::string();
          std::string& last = s.last[std::size_t(level - 1)];
          if (value == last) continue;
          last = value;
          out.emplace_back(s.view, FieldUpdate{s.productId, s.code, s.field, value, level, 1});
        }
        continue;
      }
      if (s.last.empty()) s.last.resize(1);
      // Full history pages of the tape never change: not formatted again.
      if (s.kind == 2 && !tape::MayHaveMoved(s.field, s.param, int(market->Trades(idx).size()), s.last[0])) continue;
      std::string value = market->FieldValue(idx, s.field, s.param, s.kind);
      if (value == s.last[0]) continue;
      s.last[0] = value;
      out.emplace_back(s.view, FieldUpdate{s.productId, s.code, s.field, std::move(value), s.param, s.kind});
    }
  }
}

void HostRuntime::Impl::LoadUserData() {
  std::vector<StoredWatchlist> stored;
  bool had = false;
  try {
    had = store->LoadWatchlists(stored);
  } catch (const std::exception& e) {
    log->Error(std::string("loading watchlists failed: ") + e.what());
  }
  for (auto& w : stored) {
    (w.kind == StoredWatchlist::Brand ? brandLists : userLists).push_back(w);
    nextWatchlistId = std::max(nextWatchlistId, w.id + 1);
  }
  if (!had) {
    // First start: a few lists so that the price view is not empty.
    for (const sim::StarterWatchlist& s : market->StarterWatchlists()) {
      StoredWatchlist w;
      w.id = nextWatchlistId++;
      w.kind = StoredWatchlist::User;
      w.name = s.name;
      for (int i : s.instruments) w.items.push_back({market->Instruments()[i].productId, market->Instruments()[i].instrumentCode});
      userLists.push_back(std::move(w));
    }
    SaveLists(StoredWatchlist::User);
  }
  if (brandLists.empty()) {
    for (const sim::BrandWatchlist& b : market->BrandWatchlists()) {
      StoredWatchlist w;
      w.id = b.id;
      w.kind = StoredWatchlist::Brand;
      w.name = b.name;
      for (int i : b.instruments) w.items.push_back({market->Instruments()[i].productId, market->Instruments()[i].instrumentCode});
      brandLists.push_back(std::move(w));
    }
    SaveLists(StoredWatchlist::Brand);
  }
  std::vector<PriceAlertItem> stored2;
  try {
    store->LoadAlerts(stored2);
  } catch (const std::exception& e) {
    log->Error(std::string("loading alerts failed: ") + e.what());
  }
  alerts.Load(std::move(stored2));
}

std::vector<JWatchlistRow> HostRuntime::Impl::UserRows() const {
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

std::vector<JKeldoWatchlistRow> HostRuntime::Impl::BrandRows() const {
  std::vector<JKeldoWatchlistRow> rows;
  for (const StoredWatchlist& w : brandLists) {
    if (w.items.empty()) {
      rows.push_back({w.id, w.name, 0, "", "", 0});
      continue;
    }
    std::int32_t seq = 1;
    for (const StoredWatchItem& it : w.items) {
      const int idx = market->Find(it.productId, it.instrumentCode);
      rows.push_back({w.id, w.name, it.productId, it.instrumentCode,
                      idx >= 0 ? market->Instruments()[std::size_t(idx)].exchangeCode : std::string(), seq++});
    }
  }
  return rows;
}

void HostRuntime::Impl::OnSaveNames(CSuperBaseView* v, const WatchlistFeedback& f) {
  std::vector<NameEntry> entries;
  std::string error;
  if (!ParseWatchlistNames(f.text, entries, error)) return Refused("names", error, f);
  const int maxLists = std::max(1, settings.GetInt("MAXWT", 50));
  std::vector<StoredWatchlist> next;
  std::set<std::int32_t> usedIds;
  std::set<std::string> usedNames;
  for (const NameEntry& e : entries) {
    if (e.name.empty() || usedNames.count(e.name)) {
      log->Warn("watchlist names: skipped an empty or repeated name \"" + e.name + "\"");
      continue;
    }
    if (int(next.size()) >= maxLists) {
      log->Warn("watchlist names: more than " + std::to_string(maxLists) + " watchlists; \"" + e.name + "\" not kept");
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
      w.id = e.id != 0 && !usedIds.count(e.id) ? e.id : nextWatchlistId++;
      w.kind = StoredWatchlist::User;
    }
    nextWatchlistId = std::max(nextWatchlistId, w.id + 1);
    w.name = e.name;
    usedIds.insert(w.id);
    usedNames.insert(w.name);
    next.push_back(std::move(w));
  }
  userLists = std::move(next);
  SaveLists(StoredWatchlist::User);
  std::vector<JWatchlistIdRow> rows;
  for (const auto& w : userLists) rows.push_back({w.id, w.name});
  Deliver(v, hm::SaveWatchlistNames, ToLParam(&rows));
  Notify300(0, v);
}

void HostRuntime::Impl::OnSaveUserItems(CSuperBaseView* v, const WatchlistFeedback& f) {
  std::vector<ItemEntry> items;
  std::string error;
  if (!ParseUserItems(f.text, items, error)) return Refused("items", error, f);
  StoredWatchlist* w = nullptr;
  for (auto& o : userLists) if (o.id == f.WatchlistID) w = &o;
  if (!w) {
    ++stats.malformedTexts;
    log->Error("items for unknown watchlist id " + std::to_string(f.WatchlistID) + " refused; the stored lists are unchanged");
    return;
  }
  std::vector<StoredWatchItem> next;
  for (const ItemEntry& e : items) {
    if (e.productId == 0 || e.instrumentCode.empty()) continue;
    if (int(next.size()) >= MaxItems()) {
      log->Warn("watchlist \"" + w->name + "\": more than " + std::to_string(MaxItems()) + " items, the rest not kept");
      break;
    }
    if (market->Find(e.productId, e.instrumentCode) < 0)
      log->Warn("watchlist \"" + w->name + "\": unknown instrument " + std::to_string(e.productId) + "/" + e.instrumentCode + " kept");
    bool dup = false;
    for (const auto& n : next) dup = dup || (n.productId == e.productId && n.instrumentCode == e.instrumentCode);
    if (!dup) next.push_back({e.productId, e.instrumentCode});
  }
  w->items = std::move(next);
  SaveLists(StoredWatchlist::User);
  Notify300(0, v);
}

void HostRuntime::Impl::OnRenameBrand(CSuperBaseView* v, const WatchlistFeedback& f) {
  const std::string name = Trim(hv::Narrow(f.text));
  StoredWatchlist* w = nullptr;
  for (auto& o : brandLists) if (o.id == f.WatchlistID) w = &o;
  if (!w || name.empty()) {
    ++stats.malformedTexts;
    log->Error("rename of brand watchlist " + std::to_string(f.WatchlistID) + " refused: " +
               (w ? "empty name" : "unknown id") + "; the stored lists are unchanged");
    return;
  }
  for (const auto& o : brandLists)
    if (&o != w && o.name == name) {
      log->Error("rename of brand watchlist " + std::to_string(f.WatchlistID) + " refused: \"" + name + "\" exists");
      return;
    }
  w->name = name;
  SaveLists(StoredWatchlist::Brand);
  Notify300(2, v);
}

void HostRuntime::Impl::OnSaveBrandItems(CSuperBaseView* v, const WatchlistFeedback& f) {
  std::vector<ItemEntry> items;
  std::string error;
  if (!ParseBrandItems(f.text, items, error)) return Refused("brand items", error, f);
  StoredWatchlist* w = nullptr;
  for (auto& o : brandLists) if (o.id == f.WatchlistID) w = &o;
  if (!w) {
    ++stats.malformedTexts;
    log->Error("items for unknown brand watchlist id " + std::to_string(f.WatchlistID) + " refused");
    return;
  }
  std::vector<StoredWatchItem> next;
  for (const ItemEntry& e : items) {
    if (int(next.size()) >= MaxItems()) break;
    // The text carries brand codes without their "[KELDO]" prefix, other
    // instruments by their display code.
    int idx = market->Find(e.productId, "[KELDO]" + e.instrumentCode);
    if (idx < 0) idx = market->Find(e.productId, e.instrumentCode);
    if (idx < 0) {
      for (std::size_t k = 0; k < market->Instruments().size(); ++k) {
        const auto& ins = market->Instruments()[k];
        if (ins.productId == e.productId && ins.displayCode == e.instrumentCode && ins.exchangeCode == e.exchange) {
          idx = int(k);
          break;
        }
      }
    }
    if (idx < 0) {
      log->Warn("brand watchlist \"" + w->name + "\": unknown instrument " + e.instrumentCode + " on " + e.exchange + " dropped");
      continue;
    }
    const auto& ins = market->Instruments()[std::size_t(idx)];
    bool dup = false;
    for (const auto& n : next) dup = dup || (n.productId == ins.productId && n.instrumentCode == ins.instrumentCode);
    if (!dup) next.push_back({ins.productId, ins.instrumentCode});
  }
  w->items = std::move(next);
  SaveLists(StoredWatchlist::Brand);
  Notify300(2, v);
}

void HostRuntime::Impl::CheckAlerts() {
  bool changed = false;
  const auto fired = alerts.Evaluate(*market, &changed);
  for (const auto& f : fired) {
    ++stats.alertsFired;
    const int idx = market->Find(f.alert.productId, f.alert.instrumentCode);
    const std::string name = idx >= 0 ? market->Instruments()[std::size_t(idx)].instrumentName : f.alert.instrumentCode;
    const std::string field = f.alert.priceField == "ASK" ? "Ask" : f.alert.priceField == "BID" ? "Bid" : "Last done";
    const std::string text = "Price alert: " + name + " (" + f.alert.instrumentCode + ") " + field + " " +
                             f.alert.hostTextB + " " + (f.alert.comparator == "<=" ? "<=" : ">=") + " " +
                             market->FormatPrice(idx, f.alert.triggerValue);
    log->Info(text);
    if (f.alert.viaApp) shell->ShowNotice(options.appTitle, hv::Widen(text));
    if (f.alert.viaEmail) log->Info("alert " + std::to_string(f.alert.alertId) + ": e-mail notice queued");
    if (f.alert.viaSms) log->Info("alert " + std::to_string(f.alert.alertId) + ": SMS notice queued");
  }
  if (changed) AlertsChanged(hm::Alert703);
}

std::string HostRuntime::Impl::StartLinkText(const CSuperBaseView* v) const {
  std::string data = "\"Field_instrument_code\":\"" + JsonEscape(v->GetStartInstrumentCode()) + "\",\"Field_product_id\":\"" +
                     std::to_string(v->GetStartProductId()) + "\"";
  for (const auto& [key, value] : v->GetStartParams())
    data += ",\"" + JsonEscape(key) + "\":\"" + JsonEscape(hv::Narrow(value)) + "\"";
  return "{\"type\":\"start\",\"data\":[{" + data + "}]}";
}

// ---- HostRuntime -------------------------------------------------------------

HostRuntime::HostRuntime(const HostOptions& options, IHostShell* shell, IHostStore* store)
    : d(std::make_unique<Impl>()) {
  d->self = this;
  d->options = options;
  d->shell = shell ? shell : &d->noShell;
  d->store = store ? store : &d->memoryStore;
  d->log = std::make_unique<::term::LogFactory>(options.logFile, options.logToStderr);
  if (!options.configFile.empty()) {
    std::string error;
    if (!d->settings.LoadFile(options.configFile, &error)) d->log->Warn("settings file: " + error);
    else if (!error.empty()) d->log->Warn("settings file: " + error);
  }
  try {
    for (const auto& [k, v] : d->store->LoadSettings()) d->settings.Set(k, v);
  } catch (const std::exception& e) {
    d->log->Error(std::string("loading settings failed: ") + e.what());
  }
  sim::MarketConfig config;
  config.seed = options.seed;
  config.instruments = options.instruments;
  config.fieldUpdatesPerSecond = options.fieldUpdatesPerSecond;
  config.sessionDate = options.sessionDate;
  config.sessionStartSeconds = options.sessionStartSeconds;
  config.startTick = platform::TickCount();
  d->market = std::make_unique<sim::Market>(config);
  d->language = std::make_unique<LanguageTable>();
  std::string imageDir = options.imageDir;
  if (imageDir.empty()) imageDir = QDir::tempPath().toStdString() + "/terminal-images";
  d->styles = std::make_unique<StyleManager>(imageDir, options.styleId);
  d->styles->DrawAll(StyleManager::kLight);
  d->styles->DrawAll(StyleManager::kDark);
  d->LoadUserData();
  d->log->Info("market: " + std::to_string(d->market->Instruments().size()) + " instruments, seed " +
               std::to_string(options.seed) + ", session " + d->market->DateText() + " " + d->market->TimeText());
}

HostRuntime::~HostRuntime() {
  for (auto& r : d->views) QObject::disconnect(r.destroyed);
  d->log->Flush();
}

void HostRuntime::SetShell(IHostShell* shell) { d->shell = shell ? shell : &d->noShell; }

CSuperBaseView* HostRuntime::CreateView(const CRuntimeClass* descriptor, QWidget* parent, std::int64_t startProductId,
                                        const std::string& startCode, const StartParamMap& startParams) {
  if (!descriptor) return nullptr;
  CSuperBaseView* v = descriptor->CreateObject();
  if (!v) {
    d->log->Error(std::string("class ") + (descriptor->m_lpszClassName ? descriptor->m_lpszClassName : "?") +
                  " created no view");
    return nullptr;
  }
  if (parent) v->setParent(parent);
  AttachView(v);
  if (Impl::ViewRec* rec = d->Find(v); rec && descriptor->m_lpszClassName) rec->className = descriptor->m_lpszClassName;
  v->SetStartParam(startProductId, startCode, startParams);
  v->Create();
  // Texts and title come from the language table; a view that only sends its
  // title from ApplyLanguage would otherwise stay untitled until a reload.
  v->ApplyLanguage();
  return v;
}

void HostRuntime::AttachView(CSuperBaseView* v) {
  if (!v || d->Live(v)) return;
  Impl::ViewRec rec;
  rec.view = v;
  const CRuntimeClass* rc = v->GetRuntimeClass();
  rec.className = rc && rc->m_lpszClassName ? rc->m_lpszClassName : "";
  // A view deleted without DestroyView must not leave dangling entries.
  rec.destroyed = QObject::connect(v, &QObject::destroyed, [this, v] { d->DropView(v); });
  d->views.push_back(std::move(rec));
  v->SetHost(this);
  v->SetStyleManager(d->styles.get());
  v->SetStyleID(d->styles->GetStyleID());
  v->SetAppTitle(d->options.appTitle);
  v->SetMenuManager(&d->menus);
  v->SetLanguage(d->language.get());
  v->SetLog(d->log.get());
}

void HostRuntime::DestroyView(CSuperBaseView* view, bool deleteIt) {
  if (!view) return;
  d->DropView(view);
  if (deleteIt) delete view;
}

void HostRuntime::Activate(CSuperBaseView* view) {
  Impl::ViewRec* rec = d->Find(view);
  if (!rec) return;
  rec->active = true;
  const bool first = !rec->activatedOnce;
  rec->activatedOnce = true;
  d->Deliver(view, hm::Activate, 0);
  if (first && d->options.linkMode) d->Deliver(view, hm::LinkModeFlag, 1);
}

void HostRuntime::Deactivate(CSuperBaseView* view) {
  Impl::ViewRec* rec = d->Find(view);
  if (!rec) return;
  rec->active = false;
  d->Deliver(view, hm::Deactivate, 0);
}

void HostRuntime::DeliverStartLink(CSuperBaseView* view) {
  if (!view || !d->Live(view)) return;
  const std::wstring text = hv::Widen(d->StartLinkText(view));
  ViewLink link;
  link.className = hv::Widen(ClassNameOf(view));
  link.link = &text;
  d->Deliver(view, hm::LinkData, ToLParam(&link));
}

std::vector<CSuperBaseView*> HostRuntime::Views() const { return d->ViewsOf(nullptr); }

std::string HostRuntime::ClassNameOf(const CSuperBaseView* view) const {
  for (const auto& r : d->views) if (r.view == view) return r.className;
  return {};
}

void HostRuntime::Pump(std::uint32_t now) {
  d->market->AdvanceTo(now);
  // Requests left open by a batch without its end marker count as submitted.
  for (std::size_t k = 0; k < d->views.size(); ++k)
    if (!d->views[k].pending412.empty()) d->SubmitPending412(d->views[k]);
  // Fetches asked with 400.
  std::vector<Impl::Fetch> fetches;
  fetches.swap(d->fetches);
  std::vector<std::pair<CSuperBaseView*, FieldUpdate>> answers;
  std::set<std::tuple<CSuperBaseView*, int, std::string, std::int32_t, std::int32_t>> seen;
  for (const auto& f : fetches) {
    const int idx = d->InstrumentOf(f.request);
    if (idx < 0 || !seen.insert({f.view, idx, f.request.fieldName, f.request.param, f.request.kind}).second) continue;
    if (f.request.kind == 1) {
      const int levels = std::clamp(f.request.param, 1, int(sim::Market::kDepthLevels));
      for (int level = 1; level <= levels; ++level) {
        std::string value = d->market->FieldValue(idx, f.request.fieldName, level, 1);
        if (!value.empty()) answers.emplace_back(f.view, FieldUpdate{f.request.productId, f.request.instrumentCode, f.request.fieldName, value, level, 1});
      }
      continue;
    }
    std::string value = d->market->FieldValue(idx, f.request.fieldName, f.request.param, f.request.kind);
    if (value.empty()) continue;
    answers.emplace_back(f.view, FieldUpdate{f.request.productId, f.request.instrumentCode, f.request.fieldName,
                                             std::move(value), f.request.param, f.request.kind});
  }
  d->DeliverUpdates(answers, hm::RequestField);
  // Changes since the last pump, one push per subscription and field.
  std::vector<std::pair<CSuperBaseView*, FieldUpdate>> pushes;
  d->CollectPushes(pushes);
  d->DeliverUpdates(pushes, hm::FieldValue);
  // Alerts, twice a second.
  if (!d->pumped || now - d->lastAlertCheck >= 500) {
    d->lastAlertCheck = now;
    d->CheckAlerts();
  }
  d->pumped = true;
}

void HostRuntime::PumpNow() { Pump(platform::TickCount()); }

void HostRuntime::ChangeStyle(int styleId) {
  d->styles->SetStyleID(styleId);
  d->styles->DrawAll(d->styles->GetStyleID());
  for (CSuperBaseView* v : d->ViewsOf(nullptr)) {
    if (!d->Live(v)) continue;
    v->SetStyleID(d->styles->GetStyleID());
    v->ChangeStyle(d->styles->GetStyleID());
  }
}

void HostRuntime::ApplyLanguage() {
  for (CSuperBaseView* v : d->ViewsOf(nullptr)) if (d->Live(v)) v->ApplyLanguage();
}

void HostRuntime::BroadcastSettingsChanged(CSuperBaseView* except) {
  d->Broadcast(d->ViewsOf(nullptr), hm::SettingsChanged, 0, except);
}

void HostRuntime::SetLinkMode(bool on) {
  d->options.linkMode = on ? 1 : 0;
  d->Broadcast(d->ViewsOf(nullptr), hm::LinkModeFlag, on ? 1 : 0);
}

void HostRuntime::LinkInstrument(std::int64_t productId, const std::string& code) {
  const std::wstring text = hv::Widen("{\"type\":\"trade view\",\"data\":[{\"Field_instrument_code\":\"" + JsonEscape(code) +
                                      "\",\"Field_product_id\":\"" + std::to_string(productId) + "\"}]}");
  for (CSuperBaseView* v : d->ViewsOf(nullptr))
    if (IsSingleInstrumentView(ClassNameOf(v))) d->Deliver(v, hm::LinkedInstrument, ToLParam(&text));
}

void HostRuntime::ShowFontSizeMenu(CSuperBaseView* view) { d->Deliver(view, hm::FontSizeMenu, 0); }

ILanguage& HostRuntime::Language() { return *d->language; }
IStyleManager& HostRuntime::Styles() { return *d->styles; }
ILogFactory& HostRuntime::LogFactory() { return *d->log; }
IMenuManager& HostRuntime::Menus() { return d->menus; }
HostSettings& HostRuntime::Settings() { return d->settings; }

void HostRuntime::SaveSetting(const std::string& key, const std::string& value) {
  d->settings.Set(key, value);
  try {
    d->store->SaveSetting(key, value);
  } catch (const std::exception& e) {
    d->log->Error(std::string("saving a setting failed: ") + e.what());
  }
  BroadcastSettingsChanged();
}

sim::Market& HostRuntime::Market() { return *d->market; }

std::wstring HostRuntime::MessageText(const std::string& code) const {
  long long number = 0;
  MessageTexts::CodeOf(code, &number);
  const JProduct* p = d->market->FindProduct(number);
  return d->messages.Lookup(code, p ? hv::Widen(p->productName) : std::wstring());
}

void HostRuntime::LogInfo(const std::string& line) { d->log->Info(line); }
std::string HostRuntime::ImageDir() const { return d->styles->ImageDir(); }

std::vector<StoredWatchlist> HostRuntime::Watchlists(StoredWatchlist::Kind kind) const {
  return kind == StoredWatchlist::Brand ? d->brandLists : d->userLists;
}
std::vector<PriceAlertItem> HostRuntime::Alerts() const { return d->alerts.All(); }
HostStats HostRuntime::Stats() const { return d->stats; }

void HostRuntime::OnChildFeedback(CSuperBaseView* v, UINT msg, LPARAM data) {
  Impl::ViewRec* rec = d->Find(v);
  if (!rec) {
    d->log->Warn("request " + std::to_string(msg) + " from a view the terminal does not know; ignored");
    return;
  }
  ++d->stats.requests;
  IHostShell* shell = d->shell;
  auto str = [&]() -> const std::string* { return FromLParam<const std::string>(data); };
  auto wstr = [&]() -> const std::wstring* { return FromLParam<const std::wstring>(data); };
  switch (msg) {
    case hm::Title:
      if (data) shell->ViewTitleChanged(v, *wstr());
      return;
    case hm::ViewSizeRequest:
    case hm::AlertFrameSize:
    case hm::AlertFrameSize2:
      if (data) shell->ViewSizeRequested(v, FromLParam<const ViewSize>(data)->width, FromLParam<const ViewSize>(data)->height);
      return;
    case hm::OpenAlertForm:
      if (data) {
        const auto* r = FromLParam<const ViewOpenRequest>(data);
        shell->OpenSizeRequested(r->className, r->width, r->height);
      }
      return;
    case hm::OpenView: {
      if (!data) return;
      // Both forms start with the class name (a ViewLink's first member).
      const std::wstring cls = *wstr();
      QPointer<CSuperBaseView> target = shell->OpenView(cls, v);
      if (!(rec = d->Find(v))) return;  // the shell may have closed the requester
      rec->linkTarget = target;
      rec->linkClass = cls;
      rec->linkPending = true;
      return;
    }
    case hm::AlertSubmitted:
      shell->AlertFormSubmitted(v);
      return;
    case hm::ShortcutContext:
      if (data) shell->ShortcutContext(v, *wstr());
      return;
    case hm::WatchlistsLoaded:
      d->Notify300(int(data), nullptr);
      return;
    case hm::LinkData: {
      if (!data) return;
      const auto* link = FromLParam<const ViewLink>(data);
      const std::wstring text = link->link ? *link->link : std::wstring();
      CSuperBaseView* target = rec->linkPending ? rec->linkTarget.data() : nullptr;
      const std::wstring cls = rec->linkPending ? rec->linkClass : link->className;
      rec->linkPending = false;
      if (target && d->Live(target)) {
        ViewLink copy;
        copy.className = cls;
        copy.flag = link->flag;
        copy.link = &text;
        d->Deliver(target, hm::LinkData, ToLParam(&copy));
      } else {
        shell->ForeignLink(cls, text, v);
      }
      return;
    }
    case hm::FetchFields:
    case hm::WithdrawField:
    case hm::RequestField:
      d->HandleField(v, msg, FromLParam<const FieldRequest>(data));
      return;
    case hm::InstrumentList: {
      JInstrumentListMsg m{std::intptr_t(d->market->Instruments().size()), 0, &d->market->Instruments()};
      d->Deliver(v, hm::InstrumentList, ToLParam(&m));
      return;
    }
    case hm::ExchangeList: {
      JExchangeListMsg m{std::intptr_t(d->market->Exchanges().size()), 0, &d->market->Exchanges()};
      d->Deliver(v, hm::ExchangeList, ToLParam(&m));
      return;
    }
    case hm::ProductList: {
      JProductListMsg m{std::intptr_t(d->market->Products().size()), &d->market->Products()};
      d->Deliver(v, hm::ProductList, ToLParam(&m));
      return;
    }
    case hm::RemarkMessages: {
      const std::vector<JRemarkMessage> list = d->market->RemarkMessages();
      d->Deliver(v, hm::RemarkMessages, ToLParam(&list));
      return;
    }
    case hm::AlertBoardRequest: {
      if (!data) return;
      const auto* r = FromLParam<const JPriceInfoRequest>(data);
      JPriceInformation info;
      info.referencePrice = r->referencePrice;
      info.tickSize = d->market->StepAt(r->priceStepTableId, r->referencePrice > 0 ? r->referencePrice : 1.0);
      if (r->referencePrice > 0) {
        info.lowerLimit = std::max(info.tickSize, r->referencePrice * 0.7);
        info.upperLimit = r->referencePrice * 1.3;
      }
      d->Deliver(v, hm::AlertBoardRequest, ToLParam(&info));
      return;
    }
    case hm::TextByKey:
    case hm::MessageText: {
      const std::wstring text = data ? MessageText(*str()) : std::wstring();
      d->Deliver(v, msg, ToLParam(&text));
      return;
    }
    case hm::SystemParameter:
    case hm::NoticeParameter: {
      const std::string value = data ? d->settings.Get(*str()) : std::string();
      d->Deliver(v, msg, ToLParam(&value));
      return;
    }
    case hm::SaveSetting:
      if (data) {
        const auto* s = FromLParam<const JSettingSave>(data);
        try {
          d->store->SaveSetting("view." + s->key, s->value);
        } catch (const std::exception& e) {
          d->log->Error(std::string("saving a view setting failed: ") + e.what());
        }
      }
      return;
    case hm::DisplayMode:
      d->Deliver(v, hm::DisplayMode, d->options.displayMode);
      return;
    case hm::WatchlistGroups520:
    case hm::WatchlistGroups521: {
      const std::vector<JTop30Group> groups = d->market->Top30();
      d->Deliver(v, msg, ToLParam(&groups));
      return;
    }
    case hm::WatchlistRows522: {
      const std::vector<JKeldoWatchlistRow> rows = d->BrandRows();
      d->Deliver(v, hm::WatchlistRows522, ToLParam(&rows));
      return;
    }
    case hm::WatchlistList: {
      const std::vector<JWatchlistRow> rows = d->UserRows();
      d->Deliver(v, hm::WatchlistList, ToLParam(&rows));
      return;
    }
    case hm::SaveWatchlistNames:
      if (data) d->OnSaveNames(v, *FromLParam<const WatchlistFeedback>(data));
      return;
    case hm::SaveUserWatchlist:
      if (data) d->OnSaveUserItems(v, *FromLParam<const WatchlistFeedback>(data));
      return;
    case hm::RenameWatchlist:
      if (data) d->OnRenameBrand(v, *FromLParam<const WatchlistFeedback>(data));
      return;
    case hm::SaveKeldoWatchlist:
      if (data) d->OnSaveBrandItems(v, *FromLParam<const WatchlistFeedback>(data));
      return;
    case hm::LinkedInstrument: {
      // A view changed the linked instrument: the single-instrument views
      // follow (when their link flag is on), foreign views through the shell.
      if (!data) return;
      const auto* link = FromLParam<const ViewLink>(data);
      const std::wstring text = link->link ? *link->link : std::wstring();
      for (CSuperBaseView* t : d->ViewsOf(nullptr))
        if (t != v && IsSingleInstrumentView(ClassNameOf(t))) d->Deliver(t, hm::LinkedInstrument, ToLParam(&text));
      if (!link->className.empty()) shell->ForeignLink(link->className, text, v);
      return;
    }
    case hm::LinkModeFlag:
    case hm::PriceViewRequest413:
    case hm::PriceViewRequest553:
    case hm::Watchlist606:
    case hm::Watchlist622:
      return;  // acknowledged; nothing for the terminal to do
    case hm::CompactLayout:
      shell->CompactLayoutChanged(v, data == 1);
      return;
    case hm::FindByChartCode:
    case hm::FindByCode: {
      const JInstrumentUnderlying* found = nullptr;
      if (data) {
        const auto* r = FromLParam<const JInstrumentLink>(data);
        int idx = msg == hm::FindByChartCode ? d->market->FindByChartCode(r->text) : -1;
        if (msg == hm::FindByCode) {
          idx = r->productId > 0 ? d->market->Find(r->productId, r->text) : -1;
          if (idx < 0) idx = d->market->FindByCode(r->text);
        }
        if (idx >= 0) found = &d->market->Instruments()[std::size_t(idx)];
      }
      d->Deliver(v, msg, ToLParam(found));
      return;
    }
    case hm::MarketInfo: {
      std::vector<JMarketInfo> list;
      if (data) {
        const auto* r = FromLParam<const JMarketInfoRequest>(data);
        JMarketInfo mi = d->market->MarketInfo(r->exchangeCode);
        if (!mi.exchangeCode.empty()) {
          mi.productId = r->productId;  // the key the asker files the answer under
          list.push_back(std::move(mi));
        }
      }
      d->Deliver(v, hm::MarketInfo, ToLParam(&list));
      return;
    }
    case hm::ExchangeEnabled: {
      int enabled = 0;
      if (data) {
        const std::string code = FromLParam<const JExchangeList>(data)->exchangeCode;
        const std::string off = "," + d->settings.Get("EXOFF") + ",";
        enabled = d->market->FindExchange(code) && off.find("," + code + ",") == std::string::npos ? 1 : 0;
      }
      d->Deliver(v, hm::ExchangeEnabled, enabled);
      return;
    }
    case hm::Alert701: {
      const std::vector<PriceAlertItem> list = d->alerts.All();
      d->Deliver(v, hm::Alert701, ToLParam(&list));
      return;
    }
    case hm::Alert702: {
      if (!data) return;
      PriceAlertItem item = *FromLParam<const PriceAlertItem>(data);
      if (item.productId < 0 || item.instrumentCode.empty()) {
        d->log->Warn("alert without an instrument refused");
        return;
      }
      const std::int32_t id = d->alerts.Create(item);
      d->log->Info("alert " + std::to_string(id) + " created for " + item.instrumentCode);
      d->AlertsChanged(hm::Alert702);
      return;
    }
    case hm::Alert703: {
      if (!data) return;
      const PriceAlertItem& item = *FromLParam<const PriceAlertItem>(data);
      if (!d->alerts.Update(item)) {
        d->log->Warn("change of unknown alert " + std::to_string(item.alertId) + " ignored");
        return;
      }
      d->AlertsChanged(hm::Alert703);
      return;
    }
    case hm::Alert704: {
      if (!data) return;
      const int n = d->alerts.Remove(*FromLParam<const std::vector<std::int32_t>>(data));
      if (n > 0) d->AlertsChanged(hm::Alert704);
      return;
    }
    case hm::Alert705: {
      if (!data) return;
      // Goes to the new-alert view the requester just opened, else to any.
      PriceAlertItem item = *FromLParam<const PriceAlertItem>(data);
      CSuperBaseView* target = rec->linkTarget.data();
      if (!target || !d->Live(target) || ClassNameOf(target) != kNewAlertView) {
        target = nullptr;
        for (CSuperBaseView* t : d->ViewsOf(kNewAlertView)) target = t;
      }
      if (target) d->Deliver(target, hm::Alert705, ToLParam(&item));
      return;
    }
    case hm::PriceBands: {
      JTickBandList m{std::int32_t(d->market->TickBands().size()), &d->market->TickBands()};
      d->Deliver(v, hm::PriceBands, ToLParam(&m));
      return;
    }
    case hm::AltStatus:
      d->Deliver(v, hm::AltStatus, d->settings.GetInt("ALTST", 0));
      return;
    case hm::SettingsChanged:
      BroadcastSettingsChanged(v);
      return;
    case hm::TabMoved2700:
    case hm::TabMoved2701:
      shell->TabMoved(v, msg, data);
      return;
    case hm::Sectors: {
      const std::vector<JSector> list = d->market->Sectors();
      d->Deliver(v, hm::Sectors, ToLParam(&list));
      return;
    }
    default:
      d->log->Warn("request " + std::to_string(msg) + " from " + rec->className + " is not one the terminal knows");
      return;
  }
}

}  // namespace term
