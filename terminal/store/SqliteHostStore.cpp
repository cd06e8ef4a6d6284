#include "terminal/store/SqliteHostStore.h"

#include <json/json.h>

#include <memory>

namespace term {

namespace {

std::string Write(const Json::Value& v) {
  Json::StreamWriterBuilder w;
  w["indentation"] = "";
  return Json::writeString(w, v);
}

bool Read(const std::string& text, Json::Value& root) {
  Json::CharReaderBuilder b;
  std::unique_ptr<Json::CharReader> reader(b.newCharReader());
  std::string errors;
  return reader->parse(text.data(), text.data() + text.size(), &root, &errors);
}

}  // namespace

std::string EncodeWatchItems(const std::vector<StoredWatchItem>& items) {
  Json::Value arr(Json::arrayValue);
  for (const auto& i : items) {
    Json::Value pair(Json::arrayValue);
    pair.append(Json::Int64(i.productId));
    pair.append(i.instrumentCode);
    arr.append(pair);
  }
  return Write(arr);
}

bool DecodeWatchItems(const std::string& text, std::vector<StoredWatchItem>& items) {
  Json::Value root;
  if (!Read(text, root) || !root.isArray()) return false;
  items.clear();
  for (const auto& pair : root) {
    if (!pair.isArray() || pair.size() != 2 || !pair[0].isIntegral() || !pair[1].isString()) return false;
    items.push_back({pair[0].asInt64(), pair[1].asString()});
  }
  return true;
}

std::string EncodeAlert(const PriceAlertItem& a) {
  Json::Value v(Json::objectValue);
  v["alertId"] = a.alertId;
  v["productId"] = Json::Int64(a.productId);
  v["exchangeCode"] = a.exchangeCode;
  v["instrumentCode"] = a.instrumentCode;
  v["triggerOnce"] = a.triggerOnce;
  v["validUntil"] = a.validUntil;
  v["priceField"] = a.priceField;
  v["comparator"] = a.comparator;
  v["triggerValue"] = a.triggerValue;
  v["viaApp"] = a.viaApp;
  v["viaEmail"] = a.viaEmail;
  v["viaSms"] = a.viaSms;
  v["status"] = a.status;
  v["hostTextA"] = a.hostTextA;
  v["hostTextB"] = a.hostTextB;
  v["hostNumber"] = a.hostNumber;
  return Write(v);
}

bool DecodeAlert(const std::string& text, PriceAlertItem& a) {
  Json::Value v;
  if (!Read(text, v) || !v.isObject() || !v["alertId"].isIntegral()) return false;
  a = {};
  a.alertId = v["alertId"].asInt();
  a.productId = v.get("productId", -1).asInt64();
  a.exchangeCode = v.get("exchangeCode", "").asString();
  a.instrumentCode = v.get("instrumentCode", "").asString();
  a.triggerOnce = v.get("triggerOnce", true).asBool();
  a.validUntil = v.get("validUntil", "").asString();
  a.priceField = v.get("priceField", "").asString();
  a.comparator = v.get("comparator", "").asString();
  a.triggerValue = v.get("triggerValue", 0.0).asDouble();
  a.viaApp = v.get("viaApp", true).asBool();
  a.viaEmail = v.get("viaEmail", false).asBool();
  a.viaSms = v.get("viaSms", false).asBool();
  a.status = v.get("status", "").asString();
  a.hostTextA = v.get("hostTextA", "").asString();
  a.hostTextB = v.get("hostTextB", "").asString();
  a.hostNumber = v.get("hostNumber", 0.0).asDouble();
  return true;
}

SqliteHostStore::SqliteHostStore(Store& store, std::function<void(const std::string&)> onError)
    : m_store(store), m_onError(std::move(onError)) {}

void SqliteHostStore::Report(const char* what) {
  if (m_onError) m_onError(std::string(what) + " failed: " + m_store.LastError());
}

bool SqliteHostStore::LoadWatchlists(std::vector<StoredWatchlist>& out) {
  out.clear();
  bool any = false;
  for (const auto kind : {StoredWatchlist::User, StoredWatchlist::Brand}) {
    if (!m_store.HasSavedWatchlists(kind)) continue;
    any = true;
    for (const auto& row : m_store.LoadWatchlists(kind)) {
      StoredWatchlist w;
      w.id = static_cast<std::int32_t>(row.id);
      w.kind = kind;
      w.name = row.name;
      // A damaged item text loses that list's items, not the list.
      DecodeWatchItems(row.body, w.items);
      out.push_back(std::move(w));
    }
  }
  return any;
}

void SqliteHostStore::SaveWatchlists(StoredWatchlist::Kind kind, const std::vector<StoredWatchlist>& lists) {
  std::vector<WatchlistRow> rows;
  rows.reserve(lists.size());
  for (const auto& w : lists) rows.push_back({kind, w.id, w.name, EncodeWatchItems(w.items)});
  if (!m_store.SaveWatchlists(kind, rows)) Report("saving the watchlists");
}

bool SqliteHostStore::LoadAlerts(std::vector<PriceAlertItem>& out) {
  out.clear();
  if (!m_store.HasSavedAlerts()) return false;
  for (const auto& row : m_store.LoadAlerts()) {
    PriceAlertItem a;
    if (DecodeAlert(row.body, a)) out.push_back(std::move(a));
  }
  return true;
}

void SqliteHostStore::SaveAlerts(const std::vector<PriceAlertItem>& alerts) {
  std::vector<AlertRow> rows;
  rows.reserve(alerts.size());
  for (const auto& a : alerts) rows.push_back({a.alertId, EncodeAlert(a)});
  if (!m_store.SaveAlerts(rows)) Report("saving the alerts");
}

void SqliteHostStore::SaveAlertFiring(const AlertFiring& f) {
  const AlertFiringRow row{f.alertId, f.firedAt, f.priceField, f.comparator, f.threshold, f.value, f.valueText, f.notice};
  if (!m_store.AddAlertFiring(row)) Report("saving an alert firing");
}

std::vector<AlertFiring> SqliteHostStore::LoadAlertFirings(std::int32_t alertId) {
  std::vector<AlertFiring> out;
  for (const AlertFiringRow& r : m_store.LoadAlertFirings(alertId))
    out.push_back({static_cast<std::int32_t>(r.alertId), r.firedAt, r.priceField, r.comparator, r.threshold, r.value,
                   r.valueText, r.notice});
  return out;
}

std::map<std::string, std::string> SqliteHostStore::LoadSettings() { return m_store.LoadSettings(kSettingPrefix); }

void SqliteHostStore::SaveSetting(const std::string& key, const std::string& value) {
  if (!m_store.SaveSetting(kSettingPrefix + key, value)) Report("saving a setting");
}

}  // namespace term
